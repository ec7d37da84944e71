// Parametric windows against closed forms, the direct operations and FIR prototypes; metrics, fixed and measured.
#include "window_support.hpp"

#include <complex>

using namespace vlxtest;

VLX_TYPED_SUITE(Parametric);
VLX_TYPED_SUITE(Metrics);

namespace {

long double bessel_i0(long double x) {
    long double term = 1, sum = 1;
    for (int k = 1; k < 200 && term > 1e-30L * sum; ++k) sum += term *= (x / (2 * k)) * (x / (2 * k));
    return sum;
}


// Full width in bins at which |W(f)| / W(0) of a periodic window first falls to level.
double width_at(const std::vector<double>& w, double level) {
    const double n = double(w.size()), sum = std::accumulate(w.begin(), w.end(), 0.0);
    auto response = [&](double f) {
        std::complex<double> z = 0;
        for (size_t i = 0; i < w.size(); ++i) z += w[i] * std::polar(1.0, 2 * M_PI * f * (double(i) - std::floor(n / 2)) / n);
        return std::abs(z) / sum;
    };
    double lo = 0, hi = 0.05;
    while (response(hi) > level) lo = hi, hi += 0.05;
    for (int k = 0; k < 40; ++k) (response(0.5 * (lo + hi)) > level ? lo : hi) = 0.5 * (lo + hi);
    return lo + hi;
}
}  // namespace

TYPED_TEST(Parametric, ClosedForms) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 2e-13L : 2e-5L;
    for (int32_t n : {2, 3, 4, 5, 16, 101, 1000}) {
        for (bool sym : {false, true}) {
            const int32_t flags = VLX_WNORM_PEAK | (sym ? VLX_WFLAG_SYMMETRIC : 0);
            const long double len = sym ? n - 1 : n;
            const std::vector<T> kaiser = synth<TypeParam>(16, flags, n), gauss = synth<TypeParam>(21, flags, n),
                                 tukey = synth<TypeParam>(24, flags, n), sinc = synth<TypeParam>(23, flags, n);
            const long double beta = static_cast<T>(12.014077292090791), sigma = static_cast<T>(0.1442161);
            // distance from the centre, n/2 or (n - 1)/2 if symmetric
            auto distance = [n](int32_t i, bool s) { return std::fabs(s ? i - (n - 1) / 2.0L : (long double)(i - n / 2)); };
            for (int32_t i = 0; i < n; ++i) {
                // Gaussian and Tukey keep the periodic form for an odd symmetric n
                const long double d = distance(i, sym), dp = distance(i, sym && n % 2 == 0);
                const long double u = std::max(0.0L, 1 - 4 * d * d / (len * len));
                ASSERT_TRUE(near(kaiser[i], bessel_i0(beta * std::sqrt(u)) / bessel_i0(beta), tol)) << n << sym << i;
                ASSERT_TRUE(near(gauss[i], std::exp(-0.5L * std::pow(dp / (n * sigma), 2)), tol)) << n << sym << i;
                const long double flat = 0.75L * n * 0.5L, a = M_PIl * 2 * dp / n;
                const long double g = dp <= flat ? 1 : 0.5L * (1 + std::cos(2 * M_PIl * (dp - flat) / (0.25L * n)));
                ASSERT_TRUE(near(tukey[i], g, tol)) << n << sym << i;
                ASSERT_TRUE(near(sinc[i], a == 0 ? 1 : std::sin(a) / a, tol)) << n << sym << i;
            }
        }
    }
}

TYPED_TEST(Parametric, WorkedExamples) {
    using T = real_of<TypeParam>;
    const T eps = std::numeric_limits<T>::epsilon();
    auto kaiser = [](double beta, int32_t flags, int32_t n) {
        Vec<TypeParam> v(std::vector<T>(n, T(1)), false);
        EXPECT_EQ(t_window_kaiser(v.get(), static_cast<T>(beta), flags | VLX_WFLAG_NO_SWAP), 0);
        return v.values();
    };
    EXPECT_EQ(kaiser(0, VLX_WNORM_PEAK, 9), std::vector<T>(9, T(1)));
    for (int32_t flags : {0, 1, 2, 3, 4, 12}) EXPECT_EQ(kaiser(7, flags, 1), std::vector<T>{T(1)}) << flags;
    const T limit = is_double<TypeParam> ? T(460.51701859880916) : T(69.07755f);  // beta is clamped both ways
    for (double beta : {500, -500}) EXPECT_TRUE(same_scalars(kaiser(beta, VLX_WNORM_MEAN, 33), kaiser(limit, VLX_WNORM_MEAN, 33)));
    // symmetric, even n, odd width 5: pairs at 0.5, 1.5, one more at 2.5, then zeros
    Vec<TypeParam> w(std::vector<T>(8), false);
    ASSERT_EQ(t_synth(w.get(), 15, VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_WIDTH, T(5)), 0);
    const long double b15 = static_cast<T>(10.751776690564654), p15 = bessel_i0(b15);
    const long double k05 = bessel_i0(b15 * std::sqrt(1 - 0.0625L)) / p15, k15 = bessel_i0(b15 * std::sqrt(1 - 0.5625L)) / p15;
    const long double want[8] = {0, 1 / p15, k15, k05, k05, k15, 1 / p15, 0};
    for (int i = 0; i < 8; ++i) EXPECT_TRUE(near(w[i], want[i], 8 * eps)) << i;
    EXPECT_EQ(t_synth(w.get(), 15, VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_WIDTH, T(0.5)), -1);

    // Gaussian of sigma 0, even symmetric: two ones in the middle; mode 3 of the direct Gaussian leaves the scale at 0
    Vec<TypeParam> g(std::vector<T>(6, T(1)), false);
    ASSERT_EQ(t_window_gauss(g.get(), T(0), VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_NO_SWAP), 0);
    EXPECT_EQ(g.values(), (std::vector<T>{0, 0, 1, 1, 0, 0}));
    ASSERT_EQ(t_window_gauss(g.get(), T(0.2), 3), 0);
    EXPECT_EQ(g.values(), std::vector<T>(6, T(0)));
    // Tukey alpha 0: ones, the end sample of an even n included
    Vec<TypeParam> t0(std::vector<T>(10, T(1)), false), empty;
    EXPECT_TRUE(t_window_tukey(t0.get(), T(0), VLX_WNORM_PEAK) == 0 && t0.values() == std::vector<T>(10, T(1)));
    EXPECT_EQ(t_window_sinc(empty.get(), T(1), T(1), VLX_WFLAG_WIDTH) + t_window_tukey(empty.get(), T(1), VLX_WFLAG_WIDTH), -2);
    auto sp = [](double a, double p) { return is_double<TypeParam> ? T(vlx_sinc_pow(a, p)) : vlxf_sinc_pow(T(a), T(p)); };
    const double q = std::sin(4.0) / 4;  // negative: only powers 0, 1 and 2 have a value
    const double cases[][3] = {{0, 3.5, 1}, {M_PI / 2, 2, 4 / (M_PI * M_PI)}, {4, 1, q}, {4, 2, q * q}, {4, 0, 1}, {4, 1.5, 0}};
    for (const auto& c : cases) EXPECT_NEAR(sp(c[0], c[1]), c[2], is_double<TypeParam> ? 1e-15 : 1e-6) << c[0] << " " << c[1];
}

// Direct operations multiply the catalogue's forms in and rotate; the FIR prototypes are symmetric and unrotated.
TYPED_TEST(Parametric, DirectFrameAndPrototypes) {
    using T = real_of<TypeParam>;
    const std::vector<T> x = random_values<T>(2 * 37, 3u);
    Vec<TypeParam> direct(x, true), cached(x, true);
    direct->delta = cached->delta = T(0.5);
    ASSERT_EQ(t_window_kaiser(direct.get(), static_cast<T>(9.473960131326246), VLX_WNORM_RMS) + t_window(cached.get(), 14, VLX_WNORM_RMS), 0);
    EXPECT_TRUE(same_scalars(direct.values(), cached.values()) && has_shape(direct.get(), 37, 1, 0.5));

    for (int32_t n : {31, 32}) {
        for (const auto& [id, param] : std::vector<std::pair<int32_t, double>>{{100, 0.1}, {101, 0.05}, {102, 0.1}, {103, 0.1}, {103, 0.0}, {14, 0}, {31, 0}}) {
            Vec<TypeParam> v(std::vector<T>(n, T(1)), false);
            ASSERT_EQ(t_window_fir(v.get(), id, static_cast<T>(param)), 0) << id;
            for (int i = 0; i < n; ++i) EXPECT_EQ(v[i], v[n - 1 - i]) << id << " " << i;
            // no centre sample for an even n: the middle pair stands at 0.5
            EXPECT_TRUE((n % 2 == 0 || v[n / 2] == T(1)) && ((param == 0 && id >= 100) || v[0] < T(0.9))) << id;
        }
    }
    Vec<TypeParam> v(x, false);
    EXPECT_EQ(t_window_fir(v.get(), 2, T(0)), -1);  // cosine sums reject the symmetric flag
    // id 0, bandwidth 0, and A = 7.95 < 21 (beta 0, ones) change nothing
    EXPECT_EQ(t_window_fir(v.get(), 0, T(0)) + t_window_fir(v.get(), 100, T(0)) + t_window_fir(v.get(), 101, T(0)), 0);
    EXPECT_EQ(v.values(), x);
}

TYPED_TEST(Metrics, FixedValues) {
    using T = real_of<TypeParam>;
    T out = 0;
    const T flat4 = static_cast<T>(0.9994484) * (T(1) / static_cast<T>(0.239523981482822));
    const struct { int32_t id, flags, points; double width; int32_t result; T want; } scale[] = {
        {99, VLX_WNORM_PEAK, 8, 0, 0, T(1)}, {2, VLX_WNORM_RMS, 0, 0, 0, T(1)}, {2, 3, 8, 0, -1, T(0)},
        {2, VLX_WNORM_MEAN, 64, 0, 0, T(2)}, {8, VLX_WNORM_MEAN, 64, 0, 0, flat4},
        {2, VLX_WNORM_RMS, 64, 0, 0, static_cast<T>(0.816496580927726) * T(2)},
        {1, VLX_WNORM_MEAN, 5, 0, 0, T(25) / T(26) * T(2)}, {1, VLX_WNORM_RMS, 5, 0, 0, std::sqrt(T(75) / T(27))},
        {1, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, 8, 8, -1, T(0)}, {32, VLX_WNORM_MEAN, 8, 0, -1, T(0)},
        {2, VLX_WNORM_MEAN | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_WIDTH, 8, 8, -1, T(0)},
    };
    for (const auto& c : scale) {
        out = 0;
        EXPECT_EQ(t_window2_scale(&out, c.id, c.flags, c.points, static_cast<T>(c.width)), c.result) << c.id;
        EXPECT_TRUE(c.result != 0 || same_bits(out, c.want)) << c.id << " " << out << " " << c.want;
    }
    EXPECT_EQ(t_window_scale(&out, 2, VLX_WFLAG_WIDTH, 8), -1);
    const T b = static_cast<T>(3.7707320044);  // Flattop, 3 dB
    const struct { int32_t selector, id, points; double width; int32_t result; T want; } metric[] = {
        {1, 9, 1000, 1000, 0, T(1000) * b / T(1000)}, {1, 9, 1000, 500, 0, T(1000) * b / T(500)},
        {2, 9, 1000, 0, 0, bound_of<TypeParam>()}, {3, 9, 1000, 1000, -1, 0},
        {1, 32, 1000, 1000, -1, 0}, {1, -1, 1000, 1000, -1, 0}, {0, 0, 7, 7, 0, T(1)}, {0, 0, 1000, 1000, 0, T(1)},
        {0, 2, 64, 64, 0, T(1.5)}, {0, 2, 64, 32, 0, T(3)}};  // 1.5 bins of its own width
    for (const auto& c : metric) {
        out = 0;
        EXPECT_EQ(t_window_metric(&out, c.selector, c.id, c.points, static_cast<T>(c.width)), c.result) << c.id;
        EXPECT_NEAR(out, c.want, (is_double<TypeParam> ? 1e-13 : 1e-5) * c.want) << c.selector << " " << c.id;
    }
    EXPECT_EQ(t_window_metric(static_cast<T*>(nullptr), 0, 2, 8, T(8)), -1);
}

// ENBW, 3 dB (half power) and 6 dB (half amplitude) widths: a few parts in 1e4.
TEST(MetricTable, AgreesWithMeasuredBandwidths) {
    constexpr int32_t n = 4096;
    for (int32_t id = 0; id < 32; ++id) {
        const std::vector<double> w = synth<vlx_t>(id, VLX_WNORM_PEAK, n);
        double enbw = 0, b3 = 0, b6 = 0;  // the flat tops' mean scale is relative to their c0
        ASSERT_TRUE(vlx_window_enbw(&enbw, id, n) == 0 && vlx_window_metric(&b3, 1, id, n, n) == 0 &&
                    vlx_window_metric(&b6, 2, id, n, n) == 0);
        EXPECT_NEAR(enbw, c0_of(id) * c0_of(id) * rms_of(w) * rms_of(w) / (mean_of(w) * mean_of(w)), 1e-9 * enbw) << id;
        EXPECT_NEAR(width_at(w, std::sqrt(0.5)), b3, 5e-4 * b3) << id;
        EXPECT_NEAR(width_at(w, 0.5), b6, 5e-4 * b6) << id;
    }
}
