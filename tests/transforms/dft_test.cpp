// Transforms of any length (long double, chirp path bit for bit through cache turns, delta), cosine, analytic signal.
#include "fft_reference.hpp"

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_dft, vlxi_dft, vlxfi_dft) VLX_TEST_TWIN(t_rdft, vlxi_rdft, vlxfi_rdft)
VLX_TEST_TWIN(t_irdft, vlxi_irdft, vlxfi_irdft) VLX_TEST_TWIN(t_dct, vlxi_dct, vlxfi_dct)
VLX_TEST_TWIN(t_analytic, vlxi_analytic, vlxfi_analytic) VLX_TEST_TWIN(t_hilbert, vlxi_hilbert, vlxfi_hilbert)

VLX_TYPED_SUITE(DftTest);

// v = v * c point by point, in the library's product order; v may be real.
template <class T>
void literal_mul(std::vector<T>& v, bool& cplx, const std::vector<T>& c) {
    std::vector<T> out(c.size());
    for (size_t i = 0; i < c.size() / 2; ++i) {
        const T ar = cplx ? v[2 * i] : v[i], ai = cplx ? v[2 * i + 1] : 0, br = c[2 * i], bi = c[2 * i + 1];
        out[2 * i] = cplx ? br * ar - bi * ai : ar * br, out[2 * i + 1] = cplx ? ai * br + bi * ar : ar * bi;
    }
    v = out, cplx = true;
}

// The chirp-z recipe in the last direction of `dirs`, on a cache built for the first and turned at each change.
template <class T>
std::vector<T> literal_chirp_z(std::vector<T> x, bool cplx, const std::vector<int>& dirs) {
    constexpr bool dbl = std::is_same_v<T, double>;
    const size_t n = cplx ? x.size() / 2 : x.size();
    size_t len = 4;
    while (len < 2 * n - 2) len *= 2;
    auto chirp = [&](bool conj) {  // m runs through i^2 mod 2n
        std::vector<T> c(2 * n);
        for (int64_t i = 0, m = 1; i < int64_t(n); ++i) {
            m = (m + 2 * i - 1) % int64_t(2 * n);
            const T a = (T(m) * (dbl ? T(-3.141592653589793) : T(-3.1415927f))) * (T(1) / T(n));
            c[2 * i] = dbl ? T(std::cos(double(a))) : std::cos(float(a));
            c[2 * i + 1] = (conj ? -1 : 1) * (dbl ? T(std::sin(double(a))) : std::sin(float(a)));
        }
        return c;
    };
    const std::vector<T> c0 = chirp(dirs[0] == 1), c = chirp(dirs.back() == 1);
    std::vector<T> s(2 * len, T(0));
    s[0] = 1;
    for (size_t i = 1; i < n; ++i)
        s[2 * i] = s[2 * (len - i)] = c0[2 * i], s[2 * i + 1] = s[2 * (len - i) + 1] = -c0[2 * i + 1];
    if (dirs[0] == 0)
        for (auto& e : s) e = e * (T(1) / T(n));
    fftref::literal_fft(s, true);
    for (size_t k = 1; k < dirs.size(); ++k) {  // conjugate, reverse 1 .. len-1, move 1/n
        if (dirs[k] == dirs[k - 1]) continue;
        const std::vector<T> t(s);
        const T f = dirs[k] != 0 ? T(n) : T(1) / T(n);
        for (size_t i = 0, j = 0; i < len; ++i, j = len - i)
            s[2 * i] = t[2 * j] * f, s[2 * i + 1] = -t[2 * j + 1] * f;
    }
    literal_mul(x, cplx, c);
    x.resize(2 * len, T(0));
    fftref::literal_fft(x, true);
    literal_mul(x, cplx, s);
    fftref::literal_fft(x, false);
    x.resize(2 * n);
    literal_mul(x, cplx, c);
    return x;
}

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

// Relative L2 error, then the round trip; the chirp path is two transforms of length L < 4N: twice their bound.
TYPED_TEST(DftTest, MatchesLongDoubleSumAndRoundTrips) {
    using T = real_of<TypeParam>;
    for (int32_t n : {1, 2, 3, 4, 5, 6, 7, 8, 12, 17, 31, 33, 60, 64, 97, 127, 129, 255, 257, 360, 1000, 1023, 1024, 1025,
                      2187, 3001, 4096}) {
        const std::vector<T> x = random_values<T>(2 * size_t(n), 7u + n);
        Vec<TypeParam> v(x, true);
        ASSERT_EQ(t_dft(&v, 0), 0) << n;
        std::vector<fftref::cld> in(n);
        for (int32_t i = 0; i < n; ++i) in[i] = fftref::cld(x[2 * i], x[2 * i + 1]);
        const bool pow2 = (n & (n - 1)) == 0;
        const int m = fftref::log2i(pow2 ? size_t(n) : std::max<size_t>(4, 2 * size_t(n) - 2));
        const double tol = fftref::transform_tolerance(std::numeric_limits<T>::epsilon(), m);
        EXPECT_LE(double(fftref::rel_l2(v->data, fftref::exact_dft(in, false), n)), (pow2 ? 1 : 2) * tol) << n;
        ASSERT_EQ(t_dft(&v, 1), 0) << n;
        EXPECT_LE(double(fftref::rel_l2(v->data, in, n)), 2 * tol) << n;
    }
}

// Real and complex input, fresh and turned caches; direction 2: forward chirps without 1/N, turns without conjugation.
TYPED_TEST(DftTest, ChirpPathIsBitExactThroughCacheTurns) {
    using T = real_of<TypeParam>;
    const std::vector<std::vector<int>> runs = {{0}, {1}, {2}, {0, 1}, {1, 0}, {0, 2}, {2, 0}, {0, 1, 0}};
    for (int32_t n : {3, 5, 6, 9, 10, 100, 1025}) {
        for (bool cplx : {true, false}) {
            const std::vector<T> x = random_values<T>(cplx ? 2 * size_t(n) : size_t(n), 3u * n);
            for (const auto& dirs : runs) {
                ASSERT_EQ(t_free_internal<TypeParam>(), 0);
                Vec<TypeParam> v;
                for (int d : dirs) {
                    v.assign(x, cplx);
                    ASSERT_EQ(t_dft(&v, d), 0);
                }
                ASSERT_TRUE(same_scalars(v.values(), literal_chirp_z(x, cplx, dirs))) << n << ", run of " << dirs.size();
            }
        }
    }
}

// delta becomes 1/(N delta) either way, the fallback for a zero of either sign, 1/delta below 2 points.
TYPED_TEST(DftTest, DeltaFollowsTheEntryValue) {
    using T = real_of<TypeParam>;
    for (int32_t n : {0, 1, 2, 6, 7, 8})
        for (int inverse = 0; inverse <= 1; ++inverse)
            for (T delta : {T(0), T(-0.0), T(0.3), T(-2), std::numeric_limits<T>::quiet_NaN()}) {
                Vec<TypeParam> v(random_values<T>(size_t(n), n), false);
                v->delta = delta;
                ASSERT_EQ(t_dft(&v, inverse), 0);
                const T want = delta == 0 ? bound_of<TypeParam>() : T(1) / (T(n > 1 ? n : 1) * delta);
                EXPECT_TRUE(same_scalars<T>({v->delta}, {want})) << n << " " << delta << ": " << v->delta;
                EXPECT_EQ(v->complex, n > 1 ? 1 : 0);
            }
}

// The definition within the real transform's bound, the literal recipe bit for bit both ways, the round trip.
TYPED_TEST(DftTest, DctForwardAndInverseForAnyLength) {
    using T = real_of<TypeParam>;
    for (int32_t n : {1, 2, 3, 6, 7, 8, 17, 64, 600, 1201}) {
        const double tol = 2 * fftref::transform_tolerance(std::numeric_limits<T>::epsilon(), fftref::log2i(std::max(4, 2 * n)));
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
            const std::vector<T> d = v.values();
            ASSERT_TRUE(same_scalars(d, literal_dct<TypeParam>(x, flags))) << n << " forward";
            ASSERT_TRUE(t_dct(&v, flags | 1u) == 0 && same_scalars(v.values(), literal_dct<TypeParam>(d, flags | 1u))) << n;
            for (int32_t k = 0; k < n; ++k) ASSERT_TRUE(near(v[k], x[k], tol)) << n << " round trip at " << k;
            EXPECT_TRUE(near(v->delta, 0.25, tol));
        }
    }
}

// No points: delta still follows; complex refused.  One real sample: the analytic signal keeps it, Hilbert zeroes it.
TYPED_TEST(DftTest, DctAndAnalyticShortLengths) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> empty, c({1, 2}, true);
    empty->delta = T(4);
    EXPECT_TRUE(t_dct(&empty, 1u) == 0 && same_bits(empty->delta, T(0.125)));
    empty->delta = T(0);
    EXPECT_TRUE(t_dct(&empty, 0u) == 0 && same_bits(empty->delta, bound_of<TypeParam>()) && t_dct(&c, 0u) == -1 && t_rdft(&c) == -1);
    Vec<TypeParam> two({3, -1}), one({5}), zero({5});
    one->delta = T(4);
    ASSERT_TRUE(t_analytic(&two) == 0 && t_analytic(&one) == 0 && t_hilbert(&zero) == 0);
    EXPECT_TRUE(same_scalars(two.values(), {3, 0, -1, 0}, 2));
    EXPECT_TRUE(one->complex == 0 && same_bits(one[0], T(5)) && same_bits(one->delta, T(4)));
    EXPECT_TRUE(zero->complex == 0 && same_bits(zero[0], T(0)));
}

// x = a cos(w i) + DC + Nyquist, real or complex: analytic x + j a sin(w i), Hilbert a sin(w i), within the bound.
TYPED_TEST(DftTest, AnalyticTonesAndEdgeBins) {
    using T = real_of<TypeParam>;
    const double tol = 2 * fftref::transform_tolerance(std::numeric_limits<T>::epsilon(), 10);
    for (int32_t n : {3, 4, 7, 8, 10, 64, 99, 360}) {
        for (int32_t bin : {1, (n - 1) / 2}) {
            std::vector<T> x(n), c(2 * size_t(n), T(0));
            std::vector<long double> s(n);
            for (int32_t i = 0; i < n; ++i) {
                const long double w = 6.283185307179586476925286766559L * bin * i / n;
                c[2 * i] = x[i] = T(0.75L * std::cos(w) + 0.5L + (n % 2 ? 0 : (i % 2 ? -0.25L : 0.25L)));
                s[i] = 0.75L * std::sin(w);
            }
            for (bool cplx : {false, true}) {
                Vec<TypeParam> a(cplx ? c : x, cplx), h(cplx ? c : x, cplx);
                ASSERT_TRUE(t_analytic(&a) == 0 && t_hilbert(&h) == 0 && a->complex == 1 && h->complex == (cplx ? 1 : 0));
                for (int32_t i = 0; i < n; ++i) {
                    ASSERT_TRUE(near(a[2 * i], x[i], tol) && near(a[2 * i + 1], s[i], tol)) << n << " " << bin << " " << i;
                    ASSERT_TRUE(near(h[cplx ? 2 * i : i], s[i], tol) && (!cplx || near(h[2 * i + 1], 0, tol))) << n << " " << i;
                }
            }
        }
    }
}
