// Cosine transform: against its definition in long double, bit for bit
// against the reordering and rotation written out on the library's real
// transform, round trips, and the edges of length and flags.
#include "fft_reference.hpp"

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_dct, vlxi_dct, vlxfi_dct)
VLX_TEST_TWIN(t_rdft, vlxi_rdft, vlxfi_rdft)
VLX_TEST_TWIN(t_irdft, vlxi_irdft, vlxfi_irdft)

template <class V>
class DctTest : public ::testing::Test {};
TYPED_TEST_SUITE(DctTest, Families);

// (cos k e, sin k e), k = 1 .. (n-1)/2, e = pi/(2n): recurrence restarted in
// double every 256 entries.
template <class T>
std::vector<T> literal_table(int32_t n) {
    constexpr bool dbl = std::is_same_v<T, double>;
    const T e = dbl ? T(3.141592653589793 / (2.0 * n)) : 3.1415927f / float(2 * n);
    const T c1 = dbl ? T(std::cos(double(e))) : std::cos(float(e));
    const T s1 = dbl ? T(std::sin(double(e))) : std::sin(float(e));
    std::vector<T> t;
    T c = c1, s = s1;
    for (int32_t k = 1; k <= (n - 1) / 2; ++k) {
        if (k > 1 && (k - 1) % 256 == 0) c = T(std::cos(double(T(k) * e))), s = T(std::sin(double(T(k) * e)));
        t.push_back(c), t.push_back(s);
        const T cn = c1 * c - s1 * s, sn = s * c1 + s1 * c;
        c = cn, s = sn;
    }
    return t;
}

template <class V>
std::vector<real_of<V>> literal_dct(const std::vector<real_of<V>>& x, uint32_t flags) {
    using T = real_of<V>;
    const T r = is_double<V> ? T(0.7071067811865476) : T(0.70710677f);
    const T r2 = is_double<V> ? T(1.4142135623730951) : T(1.4142135f);
    const int32_t n = int32_t(x.size()), h = (n + 1) / 2;
    const std::vector<T> t = literal_table<T>(n);
    std::vector<T> out(n);
    if (!(flags & 1)) {
        std::vector<T> y(n);
        for (int32_t i = 0; i < h; ++i) y[i] = x[2 * i];
        for (int32_t i = 0; 2 * i + 1 < n; ++i) y[n - 1 - i] = x[2 * i + 1];
        Vec<V> s(y, false);
        t_rdft(&s);
        out[0] = s[0];
        for (int32_t k = 1; k < h; ++k) {
            const T a = s[2 * k], b = s[2 * k + 1], c = t[2 * k - 2], sn = t[2 * k - 1];
            out[k] = a * c + b * sn, out[n - k] = a * sn - b * c;
        }
        if (n % 2 == 0) out[h] = (s[2 * h] + s[2 * h + 1]) * r;
        if (flags & 2) {
            for (auto& e : out) e = e * T(2);
            out[0] = out[0] * r;
        }
        return out;
    }
    std::vector<T> d(x);
    if (flags & 2) {
        for (auto& e : d) e = e * T(0.5);
        d[0] = d[0] * r2;
    }
    std::vector<T> w(2 * (n / 2 + 1), T(0));
    w[0] = d[0];
    for (int32_t k = 1; k <= (n - 1) / 2; ++k) {
        const T a = d[k], b = d[n - k], c = t[2 * k - 2], sn = t[2 * k - 1];
        w[2 * k] = a * c + b * sn, w[2 * k + 1] = a * sn - b * c;
    }
    if (n % 2 == 0) w[n] = d[n / 2] * r2;
    Vec<V> s(w, true);
    t_irdft(&s, n & 1);
    for (int32_t i = 0; i < h; ++i) out[2 * i] = s[i];
    for (int32_t i = 0; 2 * i + 1 < n; ++i) out[2 * i + 1] = s[n - 1 - i];
    return out;
}

}  // namespace

// Against the definition (1/N sum x[n] cos(pi k (2n+1) / 2N), the scaled form
// doubled with bin 0 times sqrt(1/2)): one real transform plus a rotation, so
// the bound of the transform of any length applies (see dft_test.cpp).  Then bit for bit against
// the literal recipe in both directions, and the inverse restores the samples
// and delta.
TYPED_TEST(DctTest, ForwardAndInverseForAnyLength) {
    using T = real_of<TypeParam>;
    const double eps = std::numeric_limits<T>::epsilon();
    for (int32_t n : {1, 2, 3, 6, 7, 8, 17, 64, 600, 1201}) {
        for (uint32_t flags : {0u, 2u}) {
            const std::vector<T> x = random_values<T>(size_t(n), 5u * n);
            int m = 2;  // the inner transform: chirp length, at most 4N
            while ((int64_t(1) << m) < 2 * int64_t(n)) ++m;
            const double tol = 2 * fftref::transform_tolerance(eps, m);
            Vec<TypeParam> v(x, false);
            v->delta = T(0.25);
            ASSERT_EQ(t_dct(&v, flags), 0);
            ASSERT_EQ(v->points, n);
            ASSERT_EQ(v->complex, 0);
            long double num = 0, den = 0;
            for (int32_t k = 0; k < n; ++k) {
                long double want = 0;
                for (int32_t i = 0; i < n; ++i)
                    want += x[i] * std::cos(3.141592653589793238462643L * k * (2 * i + 1) / (2.0L * n));
                want /= n;
                if (flags & 2) want *= k == 0 ? std::sqrt(2.0L) : 2.0L;
                num += (v[k] - want) * (v[k] - want), den += want * want;
            }
            EXPECT_LE(double(std::sqrt(num / den)), tol) << n;

            const std::vector<T> lit = literal_dct<TypeParam>(x, flags);
            for (int32_t k = 0; k < n; ++k) ASSERT_TRUE(same_bits(v[k], lit[k])) << n << " forward at " << k;
            const std::vector<T> d = v.values();
            ASSERT_EQ(t_dct(&v, flags | 1u), 0);
            const std::vector<T> back = literal_dct<TypeParam>(d, flags | 1u);
            for (int32_t k = 0; k < n; ++k) {
                ASSERT_TRUE(same_bits(v[k], back[k])) << n << " inverse at " << k;
                ASSERT_TRUE(near(v[k], x[k], tol)) << n << " round trip at " << k << " flags " << flags;
            }
            EXPECT_TRUE(near(v->delta, 0.25, 4 * eps));
        }
    }
}

TYPED_TEST(DctTest, Edges) {
    using T = real_of<TypeParam>;
    const T r = is_double<TypeParam> ? T(0.7071067811865476) : T(0.70710677f);
    Vec<TypeParam> two({1, 3});
    ASSERT_EQ(t_dct(two.get(), 0u), 0);
    EXPECT_TRUE(same_bits(two[0], T(2)));
    EXPECT_TRUE(same_bits(two[1], -r));
    for (int32_t n : {1, 4, 6, 9}) {  // constant 1, scaled: D[0] = sqrt(2), the rest 0
        Vec<TypeParam> v(std::vector<T>(n, T(1)), false);
        ASSERT_EQ(t_dct(&v, 2u), 0);
        EXPECT_TRUE(near(v[0], std::sqrt(2.0L), 8 * std::numeric_limits<T>::epsilon())) << n;
    }
    Vec<TypeParam> empty;
    empty->delta = T(4);
    EXPECT_EQ(t_dct(&empty, 1u), 0);
    EXPECT_TRUE(same_bits(empty->delta, T(0.125)));
    empty->delta = T(0);
    EXPECT_EQ(t_dct(&empty, 0u), 0);
    EXPECT_TRUE(same_bits(empty->delta, is_double<TypeParam> ? T(1e100) : T(999999986991104.0f)));
    Vec<TypeParam> c({1, 2}, true);
    EXPECT_EQ(t_dct(&c, 0u), -1);
}
