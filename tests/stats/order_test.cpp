// Sort orders, NaN safety of the sort, the median, the histogram's edges, and the peak search with its refinements.
#include "stats_support.hpp"

#include <algorithm>

using namespace vlxtest;

VLX_TYPED_SUITE(Order);

// Complex by clamped power, then re, then im; real ascending, checked with NaN among the samples.
TYPED_TEST(Order, Sort) {
    using T = real_of<TypeParam>;
    constexpr T b = bound_of<TypeParam>();
    // Huge parts count as +bound in the power, the raw real part breaks that tie; equal powers 25 go by re, then im.
    Vec<TypeParam> c({10 * b, 0, -10 * b, 0, 3, 4, 4, 3, 0, 5, 3, -4, 1, 1, 0, 0}, true);
    ASSERT_EQ(t_sort(c.get()), 0);
    const std::vector<T> expected{0, 0, 1, 1, 0, 5, 3, -4, 3, 4, 4, 3, -10 * b, 0, 10 * b, 0};
    EXPECT_EQ(c.values(), expected);

    Vec<TypeParam> empty;
    empty->points = -2;
    EXPECT_EQ(t_sort(empty.get()), 0);
    // With NaN (equal to everything) the sort stays inside the vector, keeps every sample and still orders the others.
    auto multiset = [](std::vector<T> s) {  // NaN counted as +inf
        for (auto& e : s) e = std::isnan(e) ? std::numeric_limits<T>::infinity() : e;
        std::sort(s.begin(), s.end());
        return s;
    };
    for (const bool is_complex : {false, true})
        for (const int n : {1, 2, 17, 100, 4000})
            for (const size_t every : {1, 2, 3, 7}) {
                auto x = random_values<T>(static_cast<size_t>(is_complex ? 2 * n : n), uint32_t(n + every));
                for (size_t i = 0; i < x.size(); i += every) x[i] = std::numeric_limits<T>::quiet_NaN();
                Vec<TypeParam> v(x, is_complex);
                ASSERT_EQ(t_sort(v.get()), 0);
                auto y = v.values();
                EXPECT_EQ(multiset(y), multiset(x)) << "samples lost, n=" << n;
                y.erase(std::remove_if(y.begin(), y.end(), [](T e) { return std::isnan(e); }), y.end());
                EXPECT_TRUE(is_complex || std::is_sorted(y.begin(), y.end()));
            }
}

TYPED_TEST(Order, Median) {
    using T = real_of<TypeParam>;
    struct Row { std::vector<T> in; bool complex; T re, im; };
    const Row rows[] = {
        {{5, 1, 4}, false, 4, 0}, {{5, 1, 4, 2}, false, 3, 0}, {{7}, false, 7, 0}, {{3, 0, 0, 1}, true, 1.5, 0.5},
        {{0, 9, 1, 0, 2, 2}, true, 2, 2},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> src(row.in, row.complex);
        const auto r = STAT(t_median)(src);
        EXPECT_TRUE(r.complex == (row.complex ? 1 : 0) && r.re == row.re && r.im == row.im);
    }
    // in place, and the source is not reordered otherwise
    auto x = random_values<T>(1000, 9);
    Vec<TypeParam> src(x, false);
    const auto r = STAT(t_median)(src);
    EXPECT_EQ(src.values(), x);
    std::sort(x.begin(), x.end());
    EXPECT_TRUE(r.re == (x[499] + x[500]) * T(0.5) && t_median(src.get(), src.get()) == 0 && src->points == 1 && src[0] == r.re);
}

TYPED_TEST(Order, HistogramEdges) {
    using T = real_of<TypeParam>;
    constexpr T b = bound_of<TypeParam>();
    const T nan = std::numeric_limits<T>::quiet_NaN();
    const T eps = std::numeric_limits<T>::epsilon();
    struct Row { const char* what; std::vector<T> in; bool complex; T origin, width; int32_t bins; std::vector<T> counts; };
    const Row rows[] = {
        {"lower edges included", {0, 1, 2, 3, 0.5, 3.999f}, false, 0, 1, 4, {2, 1, 1, 2}},
        {"top edge lands in the top bin", {4}, false, 0, 1, 4, {0, 0, 0, 1}},
        {"a rounding error above the top", {4 * (1 + 4 * eps)}, false, 0, 1, 4, {0, 0, 0, 1}},
        {"beyond the tolerance", {4 * (1 + 32 * eps), 4.5}, false, 0, 1, 4, {0, 0, 0, 0}},
        {"below origin though k is 0", {-0.1f, nan}, false, 0, 1, 4, {0, 0, 0, 0}},
        {"origin and width", {-1, -0.5, 0.9f, 1}, false, -1, 0.5, 4, {1, 1, 0, 2}},
        {"width 0 keeps the origin only", {2, 2.5, 2, nan}, false, 2, 0, 3, {2, 0, 0}},
        {"complex by magnitude", {3, 4, 0, 1, 10 * b, 0}, true, 0, 2, 3, {1, 0, 1}},
        {"no bins", {1, 2}, false, 0, 1, 0, {}},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> src(row.in, row.complex), dst;
        ASSERT_EQ(t_hist(src.get(), dst.get(), row.origin, row.width, row.bins), 0) << row.what;
        EXPECT_TRUE(dst->complex == 0 && dst->delta == row.width && dst.values() == row.counts) << row.what;
    }
    // delta becomes the width also for an empty source; in place works
    Vec<TypeParam> empty, dst, v{0.5, 1.5, 1.7f};
    ASSERT_TRUE(t_hist(empty.get(), dst.get(), T(0), T(0.25), 2) == 0 && t_hist(v.get(), v.get(), T(0), T(1), 2) == 0);
    EXPECT_TRUE(dst->delta == T(0.25) && dst.values() == (std::vector<T>{0, 0}));
    EXPECT_TRUE(v->delta == T(1) && v.values() == (std::vector<T>{1, 2}));
    // a million bins: the float tolerance spans more than one bin (there 1000001 counts), yet never writes past the top
    Vec<TypeParam> big{1000000, 1000001};
    ASSERT_EQ(t_hist(big.get(), dst.get(), T(0), T(1), 1000000), 0);
    EXPECT_EQ(dst[999999], T(is_double<TypeParam> ? 1 : 2));
}

VLX_TYPED_SUITE(Peak);

namespace {

template <class V>
struct PeakResult { int32_t status; real_of<V> value, position; };

template <class V>
PeakResult<V> run_peak(Vec<V>& src, int32_t flags, int32_t index = 0) {
    Vec<V> dst;
    const int32_t status = t_peak(src.get(), dst.get(), flags, index);
    EXPECT_TRUE(has_shape(dst.get(), 2, 0, 1));
    return {status, dst[0], dst[1]};
}

}  // namespace

TYPED_TEST(Peak, FixedCases) {
    using T = real_of<TypeParam>;
    constexpr T b = bound_of<TypeParam>();
    const T nan = std::numeric_limits<T>::quiet_NaN();
    const T big = is_double<TypeParam> ? T(1e60) : T(1e10);  // power above the bound
    const T h = is_double<TypeParam> ? T(0.315563649157834) : T(0.31556365f);
    struct Row { const char* what; std::vector<T> in; bool complex; int32_t flags, index, status; T value, position; };
    const std::vector<T> ten{1, 2, 3, 4, 5, 6, 7, 8, 9, 10};
    const Row rows[] = {
        {"empty, invalid refinement", {}, false, 0x700, 0, 0, 0, 0},
        {"empty, parabola", {}, true, VLX_PEAK_PARABOLA, 0, 0, 0, 0},
        {"one point, log ratio", {5}, false, VLX_PEAK_LOG_RATIO, 0, 0, 5, 0},
        {"index below 0", ten, false, VLX_PEAK_AT_INDEX, -3, 0, 1, 0},
        {"index beyond the end", ten, false, VLX_PEAK_AT_INDEX, 1000, 0, 10, 9},
        {"at index wins over min", ten, false, VLX_PEAK_AT_INDEX | VLX_PEAK_MIN, 4, 0, 5, 4},
        {"max at the last sample: parabola unrefined", {1, 2, 3, 4}, false, VLX_PEAK_PARABOLA, 0, 0, 4, 3},
        {"first of equal maxima", {1, 5, 2, 5, 1}, false, VLX_PEAK_SAMPLE, 0, 0, 5, 1},
        {"first of equal minima", {3, 1, 2, 1}, false, VLX_PEAK_MIN, 0, 0, 1, 1},
        {"NaN never taken", {nan, 1, nan}, false, VLX_PEAK_SAMPLE, 0, 0, 1, 1},
        {"all at or below -bound", {-2 * b, -b}, false, VLX_PEAK_SAMPLE, 0, 0, -2 * b, 0},
        {"complex by power", {1, 0, 3, 4, 0, 1}, true, VLX_PEAK_SAMPLE, 0, 0, 25, 1},
        {"huge component ranks at the bound", {10 * b, 0, big, 0}, true, VLX_PEAK_SAMPLE, 0, 0, big * big, 1},
        {"invalid refinement", {1, 2, 1}, false, 0x400, 0, -1, 0, 0},
        {"offset above its range", {T(1e-6), 1, T(1e-7)}, false, VLX_PEAK_LOG_RATIO, 0, -1,
         std::exp(h * T(1.5) * T(1.5)) * T(1e-6), 1.5},
        {"offset below its range", {1, T(1e-6), 0}, false, VLX_PEAK_LOG_RATIO, 0, -1,
         std::exp(h * T(-0.5) * T(-0.5)), -0.5},
        {"equal pair", {2, 2}, false, VLX_PEAK_LOG_RATIO, 0, 0, std::exp(h * T(0.5) * T(0.5)) * 2, 0.5},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> src(row.in, row.complex);
        const auto r = run_peak(src, row.flags, row.index);
        ASSERT_EQ(r.status, row.status) << row.what;
        if (row.flags == 0x400) continue;  // values unset
        EXPECT_TRUE(near(r.value, row.value, std::fabs(row.value) * 8 * std::numeric_limits<T>::epsilon()))
            << row.what << ": " << r.value;
        EXPECT_EQ(r.position, row.position) << row.what;
    }
    // three equal samples: the parabola divides by zero, yet succeeds; a last maximum uses the last pair
    Vec<TypeParam> flat{1, 1, 1}, rising{1, 2, 3, 4};
    const auto r = run_peak(flat, VLX_PEAK_PARABOLA | VLX_PEAK_AT_INDEX, 1), lr = run_peak(rising, VLX_PEAK_LOG_RATIO);
    EXPECT_TRUE(r.status == 0 && std::isnan(r.position));
    EXPECT_TRUE(lr.status == 0 && lr.position > T(2.5) && lr.position < T(3));
    // in place (-1: the log ratio's warning) a complex source gives two real points, delta 1; dst apart keeps delta
    Vec<TypeParam> v({1, 0, 1e-3f, 0, 0, 2}, true);
    v->delta = T(0.5);
    EXPECT_EQ(t_peak(v.get(), v.get(), VLX_PEAK_LOG_RATIO | VLX_PEAK_AT_INDEX, 0), -1);
    EXPECT_TRUE(has_shape(v.get(), 2, 0, 1) && v[1] == T(-0.5));

    Vec<TypeParam> src{1, 3, 2}, dst{9, 9, 9};
    dst->delta = T(0.125);
    ASSERT_EQ(t_peak(src.get(), dst.get(), VLX_PEAK_SAMPLE, 0), 0);
    EXPECT_TRUE(dst->delta == T(0.125) && dst.values() == (std::vector<T>{3, 1}));
}

// Samples of a parabola give back its vertex exactly (dyadic data, so every step of the refinement is exact).
TYPED_TEST(Peak, ParabolaIsExact) {
    using T = real_of<TypeParam>;
    for (int s = -8; s <= 8; ++s) {
        const T x0 = T(10) + T(s) / 16;
        std::vector<T> y(21);
        for (int i = 0; i < 21; ++i) y[i] = T(3) - T(0.25) * (T(i) - x0) * (T(i) - x0);
        Vec<TypeParam> src(y, false);
        const auto r = run_peak(src, VLX_PEAK_PARABOLA);
        EXPECT_TRUE(r.status == 0 && r.position == x0 && r.value == T(3));
    }
}

// Hann window spectrum, amplitude at f bins from the centre.
double hann_lobe(double f) { return std::fabs(f) < 1e-9 ? 1.0 : std::sin(M_PI * f) / (M_PI * f) / (1.0 - f * f); }

// Its own Gaussian lobe (real, or as complex power) exactly placed; on a Hann lobe both forms monotonic and near.
TYPED_TEST(Peak, LogRatioFollowsTheLobe) {
    using T = real_of<TypeParam>;
    const long double width = 0.792233201343665L;
    const double tol = is_double<TypeParam> ? 1e-12 : 2e-5;
    for (int s = 0; s <= 20; ++s) {
        const long double x0 = 15.0L + s / 20.0L;
        std::vector<T> re(64), cx(128);
        for (int i = 0; i < 64; ++i) {
            re[i] = static_cast<T>(std::exp(-(i - x0) * (i - x0) / (2 * width)));
            cx[2 * i] = static_cast<T>(std::sqrt(static_cast<long double>(re[i])) * 0.6L);
            cx[2 * i + 1] = static_cast<T>(std::sqrt(static_cast<long double>(re[i])) * 0.8L);
        }
        Vec<TypeParam> src(re, false), csrc(cx, true);
        const auto r = run_peak(src, VLX_PEAK_LOG_RATIO), c = run_peak(csrc, VLX_PEAK_LOG_RATIO);
        EXPECT_TRUE(r.status == 0 && near(r.position, x0, 16 * tol) && near(c.position, x0, 1e3 * tol)) << x0;
    }
    const double lo = 0.6884180030639514;  // bins per sample: the Hann lobe half a sample out equals the Gaussian's
    for (const int32_t method : {VLX_PEAK_LOG_RATIO, VLX_PEAK_LOG_RATIO_CORRECTED}) {
        T last = -1;
        for (int s = 0; s <= 100; ++s) {
            const double x0 = 20.0 + s / 50.0;
            std::vector<T> y(48);
            for (int i = 0; i < 48; ++i) y[i] = static_cast<T>(hann_lobe(lo * (i - x0)) * hann_lobe(lo * (i - x0)));
            Vec<TypeParam> src(y, false);
            const auto r = run_peak(src, method);
            EXPECT_TRUE(r.status == 0 && r.position > last && near(r.position, x0, 0.1)) << "not monotonic or off at " << x0;
            last = r.position;
        }
    }
}
