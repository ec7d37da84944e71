// Sort orders, NaN safety of the sort, the median, and the histogram's edges.
#include "stats_support.hpp"

#include <algorithm>

using namespace vlxtest;

VLX_TYPED_SUITE(Order);

// Complex by clamped power, then re, then im (real ascending order is checked with the NaN below).
TYPED_TEST(Order, SortOrders) {
    using T = real_of<TypeParam>;
    constexpr T b = bound_of<TypeParam>();
    // Beyond the bound every component counts as +bound in the power, so the two huge samples tie with each other
    // (and outrank (b, 1)); the raw real part breaks the tie.  Equal powers 25 fall back to re, then im.
    Vec<TypeParam> c({10 * b, 0, -10 * b, 0, 3, 4, 4, 3, 0, 5, 3, -4, 1, 1, 0, 0}, true);
    ASSERT_EQ(t_sort(c.get()), 0);
    const std::vector<T> expected{0, 0, 1, 1, 0, 5, 3, -4, 3, 4, 4, 3, -10 * b, 0, 10 * b, 0};
    EXPECT_EQ(c.values(), expected);

    Vec<TypeParam> empty;
    empty->points = -2;
    EXPECT_EQ(t_sort(empty.get()), 0);
}

// NaN compares equal to everything; the sort must neither crash nor leave the vector (run under the sanitizer), must
// keep every sample, and must still order the samples without NaN.
TYPED_TEST(Order, SortSurvivesNaN) {
    using T = real_of<TypeParam>;
    const T nan = std::numeric_limits<T>::quiet_NaN();
    auto multiset = [](std::vector<T> s) {
        for (auto& e : s) e = std::isnan(e) ? std::numeric_limits<T>::infinity() : e;
        std::sort(s.begin(), s.end());
        return s;
    };
    for (const bool is_complex : {false, true}) {
        for (const int n : {1, 2, 17, 100, 4000}) {
            for (const size_t every : {1, 2, 3, 7}) {
                auto x = random_values<T>(static_cast<size_t>(is_complex ? 2 * n : n), uint32_t(n + every));
                for (size_t i = 0; i < x.size(); i += every) x[i] = nan;
                Vec<TypeParam> v(x, is_complex);
                ASSERT_EQ(t_sort(v.get()), 0);
                EXPECT_EQ(multiset(v.values()), multiset(x)) << "samples lost, n=" << n;
                if (is_complex) continue;
                auto y = v.values();
                y.erase(std::remove_if(y.begin(), y.end(), [](T e) { return std::isnan(e); }), y.end());
                EXPECT_TRUE(std::is_sorted(y.begin(), y.end()));
            }
        }
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
}

// With a million bins the float tolerance spans more than one bin: a value there still goes to the top bin, never
// past the vector.
TEST(OrderFloat, HistogramToleranceNeverWritesPastTheTop) {
    Vec<vlxf_t> src{1000000.0f, 1000001.0f}, dst;
    ASSERT_EQ(vlxfs_hist(src.get(), dst.get(), 0.0f, 1.0f, 1000000), 0);
    EXPECT_EQ(dst[999999], 2.0f);
}
