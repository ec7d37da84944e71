// Cosine transform: its definition in long double, the literal recipe bit for bit, round trips, edges.
#include "fft_reference.hpp"

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_dct, vlxi_dct, vlxfi_dct) VLX_TEST_TWIN(t_rdft, vlxi_rdft, vlxfi_rdft)
VLX_TEST_TWIN(t_irdft, vlxi_irdft, vlxfi_irdft)

VLX_TYPED_SUITE(DctTest);

template <class V>
std::vector<real_of<V>> literal_dct(std::vector<real_of<V>> d, uint32_t flags) {
    using T = real_of<V>;
    constexpr bool dbl = is_double<V>;
    const T r = dbl ? T(0.7071067811865476) : T(0.70710677f), r2 = dbl ? T(1.4142135623730951) : T(1.4142135f);
    const int32_t n = int32_t(d.size()), h = (n + 1) / 2;
    // (cos k e, sin k e), e = pi/(2n): recurrence restarted in double every 256
    const T e = dbl ? T(3.141592653589793 / (2.0 * n)) : 3.1415927f / float(2 * n);
    const T c1 = dbl ? T(std::cos(double(e))) : std::cos(float(e)), s1 = dbl ? T(std::sin(double(e))) : std::sin(float(e));
    std::vector<T> t(2);
    for (int32_t k = 1; k <= (n - 1) / 2; ++k) {
        T c = k == 1 ? c1 : c1 * t[2 * k - 2] - s1 * t[2 * k - 1], s = k == 1 ? s1 : t[2 * k - 1] * c1 + s1 * t[2 * k - 2];
        if ((k - 1) % 256 == 0 && k > 1) c = T(std::cos(double(T(k) * e))), s = T(std::sin(double(T(k) * e)));
        t.push_back(c), t.push_back(s);
    }
    std::vector<T> out(n);
    if (!(flags & 1)) {
        for (int32_t i = 0; i < n; ++i) out[i % 2 ? n - 1 - i / 2 : i / 2] = d[i];
        Vec<V> y(out, false);
        t_rdft(&y);
        out[0] = y[0];
        for (int32_t k = 1; k < h; ++k)
            out[k] = y[2 * k] * t[2 * k] + y[2 * k + 1] * t[2 * k + 1], out[n - k] = y[2 * k] * t[2 * k + 1] - y[2 * k + 1] * t[2 * k];
        if (n % 2 == 0) out[h] = (y[2 * h] + y[2 * h + 1]) * r;
        if (flags & 2) {
            for (auto& x : out) x = x * T(2);
            out[0] = out[0] * r;
        }
        return out;
    }
    if (flags & 2) {
        for (auto& x : d) x = x * T(0.5);
        d[0] = d[0] * r2;
    }
    std::vector<T> w(2 * (n / 2 + 1), T(0));
    w[0] = d[0];
    for (int32_t k = 1; k <= (n - 1) / 2; ++k)
        w[2 * k] = d[k] * t[2 * k] + d[n - k] * t[2 * k + 1], w[2 * k + 1] = d[k] * t[2 * k + 1] - d[n - k] * t[2 * k];
    if (n % 2 == 0) w[n] = d[n / 2] * r2;
    Vec<V> y(w, true);
    t_irdft(&y, n & 1);
    for (int32_t i = 0; i < n; ++i) out[i] = y[i % 2 ? n - 1 - i / 2 : i / 2];
    return out;
}

}  // namespace

// Against the definition (1/N sum x[n] cos(pi k (2n+1) / 2N); the scaled form doubled, bin 0 times sqrt(1/2)): one
// real transform plus a rotation, so the bound of the transform of any length applies (dft_test.cpp).  Bit for bit
// against the literal recipe both ways; the inverse restores samples and delta.
TYPED_TEST(DctTest, ForwardAndInverseForAnyLength) {
    using T = real_of<TypeParam>;
    for (int32_t n : {1, 2, 3, 6, 7, 8, 17, 64, 600, 1201}) {
        int m = 2;
        while ((int64_t(1) << m) < 2 * int64_t(n)) ++m;
        const double tol = 2 * fftref::transform_tolerance(std::numeric_limits<T>::epsilon(), m);
        for (uint32_t flags : {0u, 2u}) {
            const std::vector<T> x = random_values<T>(size_t(n), 5u * n);
            Vec<TypeParam> v(x, false);
            v->delta = T(0.25);
            ASSERT_TRUE(t_dct(&v, flags) == 0 && v->points == n && v->complex == 0);
            long double num = 0, den = 0;
            for (int32_t k = 0; k < n; ++k) {
                long double want = 0;
                for (int32_t i = 0; i < n; ++i) want += x[i] * std::cos(3.141592653589793238462643L * k * (2 * i + 1) / (2.0L * n));
                want = want / n * ((flags & 2) ? (k == 0 ? std::sqrt(2.0L) : 2.0L) : 1.0L);
                num += (v[k] - want) * (v[k] - want), den += want * want;
            }
            EXPECT_LE(double(std::sqrt(num / den)), tol) << n;
            const std::vector<T> d = v.values(), lit = literal_dct<TypeParam>(x, flags);
            for (int32_t k = 0; k < n; ++k) ASSERT_TRUE(same_bits(v[k], lit[k])) << n << " forward at " << k;
            ASSERT_EQ(t_dct(&v, flags | 1u), 0);
            const std::vector<T> back = literal_dct<TypeParam>(d, flags | 1u);
            for (int32_t k = 0; k < n; ++k) {
                ASSERT_TRUE(same_bits(v[k], back[k])) << n << " inverse at " << k;
                ASSERT_TRUE(near(v[k], x[k], tol)) << n << " round trip at " << k;
            }
            EXPECT_TRUE(near(v->delta, 0.25, tol));
        }
    }
}

// No points: delta still follows (the fallback for 0); complex input is refused.
TYPED_TEST(DctTest, Edges) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> empty, c({1, 2}, true);
    empty->delta = T(4);
    EXPECT_TRUE(t_dct(&empty, 1u) == 0 && same_bits(empty->delta, T(0.125)));
    empty->delta = T(0);
    EXPECT_TRUE(t_dct(&empty, 0u) == 0 && same_bits(empty->delta, bound_of<TypeParam>()) && t_dct(&c, 0u) == -1);
}
