// The metrics' fixed values, and the bandwidth table against widths measured numerically on long windows of the
// catalogue's shapes.
#include "window_support.hpp"

#include <complex>

using namespace vlxtest;

VLX_TYPED_SUITE(Metrics);

namespace {

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
