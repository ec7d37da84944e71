// Moments (long double, block order bit for bit, degenerate, huge and NaN inputs); regression against least squares.
#include "stats_support.hpp"

#include <functional>
#include <string>

using namespace vlxtest;

VLX_TYPED_SUITE(Moments);

namespace {

constexpr int64_t kBlock = 2048;

// The defined order: each block of 2048 summed from 0 in index order, the block sums added to a total in block order.
template <class T, class Term>
T blockwise(int64_t n, Term term) {
    T total = T(0);
    for (int64_t start = 0; start < n; start += kBlock) {
        T partial = T(0);
        for (int64_t i = start; i < std::min(n, start + kBlock); ++i) partial += term(i);
        total += partial;
    }
    return total;
}

template <class T>
T saturated(T x, T b) { return x > b ? b : (x < -b ? -b : x); }

}  // namespace

// 2 sqrt(adds per block) + 8 ulps (excess in ulps of m4/m2^2): a wrong divisor or a lost block is off by far more.
TYPED_TEST(Moments, AgreeWithLongDoubleReference) {
    using T = real_of<TypeParam>;
    for (const int64_t n : {int64_t(7), int64_t(1000), int64_t(5000), int64_t(2 * 8 * kBlock + 700)}) {
        std::vector<T> x = random_values<T>(static_cast<size_t>(n), 11u + static_cast<uint32_t>(n), -1.0, 1.0);
        for (auto& v : x) v = static_cast<T>(std::exp(static_cast<double>(v)));  // skewed, positive
        Vec<TypeParam> src(x, false);
        long double s1 = 0, s2 = 0, s3 = 0, s4 = 0, inv = 0, logs = 0;
        for (T v : x) s1 += v;
        const long double m = s1 / n;
        for (T v : x) {
            const long double d = v - m;
            s2 += d * d, s3 += d * d * d, s4 += d * d * d * d, inv += 1.0L / v, logs += std::log((long double)v);
        }
        const long double var = s2 / n;
        // name, statistic, expected, what the ulps are counted in if not the result
        struct Row { const char* name; StatFn<TypeParam> fn; long double expected, scale = 0; };
        const Row rows[] = {
            {"samp_var", STAT(t_samp_var), s2 / (n - 1)}, {"pop_stddev", STAT(t_pop_stddev), std::sqrt(var)},
            {"samp_stddev", STAT(t_samp_stddev), std::sqrt(s2 / (n - 1))},
            {"skew", STAT(t_skew), (s3 / n) / (var * std::sqrt(var))},
            {"excess", STAT(t_excess), (s4 / n) / (var * var) - 3, (s4 / n) / (var * var)},
            {"gmean", STAT(t_gmean), std::exp(logs / n)}, {"hmean", STAT(t_hmean), n / inv},
        };
        const double tolerance = 8.0 + 2.0 * std::sqrt(static_cast<double>(std::min<int64_t>(n, kBlock)));
        for (const Row& row : rows) {
            // the plain running product may overflow on long vectors, as intended
            if (std::string(row.name) == "gmean" && n > 1000) continue;
            const auto r = row.fn(src);
            ASSERT_EQ(r.status, 0) << row.name;
            const long double scale = row.scale != 0 ? row.scale : std::fabs(row.expected);
            const long double ulp = scale * std::numeric_limits<T>::epsilon();
            EXPECT_TRUE(near(r.re, row.expected, tolerance * ulp)) << row.name << " n=" << n;
        }
    }
}

// Bit for bit against the blockwise order (not a running sum's), ending inside a block, on its edge, and far past.
TYPED_TEST(Moments, SumsFollowTheBlockOrderBitForBit) {
    using T = real_of<TypeParam>;
    constexpr T b = bound_of<TypeParam>();
    for (const int64_t n : {int64_t(1), int64_t(kBlock), int64_t(kBlock + 1), int64_t(8 * kBlock),
                            int64_t(19 * kBlock + 333)}) {
        auto x = random_values<T>(static_cast<size_t>(2 * n), 3u + static_cast<uint32_t>(n), -3.0, 5.0);
        x[static_cast<size_t>(n / 2)] = T(2) * b;  // saturated in the square sums
        Vec<TypeParam> re(std::vector<T>(x.begin(), x.begin() + n), false);
        Vec<TypeParam> cx(x, true);
        const T* v = x.data();
        EXPECT_TRUE(same_bits(STAT(t_sum)(re).re, blockwise<T>(n, [v](int64_t i) { return v[i]; })));
        const auto cs = STAT(t_sum)(cx);
        EXPECT_TRUE(same_bits(cs.re, blockwise<T>(n, [v](int64_t i) { return v[2 * i]; })));
        EXPECT_TRUE(same_bits(cs.im, blockwise<T>(n, [v](int64_t i) { return v[2 * i + 1]; })));
        const T r = T(1) / static_cast<T>(n);
        EXPECT_TRUE(same_bits(STAT(t_mean)(re).re, blockwise<T>(n, [v](int64_t i) { return v[i]; }) * r));
        const T sq = blockwise<T>(n, [v, b](int64_t i) { return std::fabs(v[i]) > b ? b : v[i] * v[i]; });
        EXPECT_TRUE(same_bits(STAT(t_magsq_sum)(re).re, sq)) << n;
        EXPECT_TRUE(same_bits(STAT(t_rms)(re).re, std::sqrt(sq / static_cast<T>(n))));
        // variance about the pivot of the first, middle and last samples
        const T third = is_double<TypeParam> ? T(0.3333333333333333) : T(0.33333334f);
        const T p = (v[n / 2] + v[0] + v[n - 1]) * third;
        const T S1 = blockwise<T>(n, [&](int64_t i) { return saturated(v[i] - p, b); });
        const T S2 = blockwise<T>(n, [&](int64_t i) { return saturated(v[i] - p, b) * saturated(v[i] - p, b); });
        EXPECT_TRUE(same_bits(STAT(t_pop_var)(re).re, r * S2 - (r * S1) * (r * S1))) << n;
    }
}

// Empty, constant, bound and NaN samples; in place, the statistic is read before the vector becomes one point.
TYPED_TEST(Moments, FixedResultsAndInPlace) {
    using T = real_of<TypeParam>;
    constexpr T b = bound_of<TypeParam>();
    const T nan = std::numeric_limits<T>::quiet_NaN();
    using Fn = StatFn<TypeParam>;
    struct Row { const char* what; Fn fn; std::vector<T> in; bool complex; T re, im; };
    const Row rows[] = {
        {"empty sum", STAT(t_sum), {}, true, 0, 0}, {"empty mean", STAT(t_mean), {}, false, 0, 0},
        {"empty variance", STAT(t_pop_var), {}, false, 0, 0}, {"empty skew", STAT(t_skew), {}, false, 0, 0},
        {"empty excess", STAT(t_excess), {}, false, -3, 0}, {"empty gmean", STAT(t_gmean), {}, true, 0, 0},
        {"empty hmean", STAT(t_hmean), {}, true, 0, 0}, {"empty min", STAT(t_min), {}, false, 0, 0},
        {"empty max", STAT(t_max), {}, true, 0, 0}, {"empty median", STAT(t_median), {}, false, 0, 0},
        {"constant skew", STAT(t_skew), {2.5, 2.5, 2.5, 2.5}, false, 0, 0},
        {"constant excess", STAT(t_excess), {2.5, 2.5, 2.5, 2.5}, false, -3, 0},
        {"one-point sample variance", STAT(t_samp_var), {7}, false, 0, 0},
        {"one negative factor", STAT(t_gmean), {-2, 8}, false, 0, 0},
        {"two negative factors", STAT(t_gmean), {-2, -8}, false, 4, 0},
        {"a zero sample", STAT(t_hmean), {1, 0, 2}, false, 0, 0},
        {"cancelling reciprocals", STAT(t_hmean), {1, -1}, false, b, 0},
        {"complex zero is not special", STAT(t_hmean), {0, 0}, true, 0, 0},
        {"huge complex squares", STAT(t_magsq_sum), {10 * b, 0, 10 * b, 0}, true, 2 * b, 0},
        {"huge complex max keeps the first", STAT(t_max), {10 * b, 1, 10 * b, 2}, true, 10 * b, 1},
        {"real max at or below -bound", STAT(t_max), {-2 * b, -b, nan}, false, -b, 0},
        {"real min passes NaN", STAT(t_min), {nan, 3, -1, nan}, false, -1, 0},
        {"complex max takes a huge sample", STAT(t_max), {nan, 0, 10 * b, 0}, true, 10 * b, 0},
        {"complex max of NaN only", STAT(t_max), {nan, 0, 1, nan}, true, 0, 0},
        {"complex min of huge or NaN", STAT(t_min), {nan, 0, 10 * b, 0}, true, b, b},
        {"complex min: first of equal power", STAT(t_min), {0, 2, 2, 0, -2, 0, 3, 3}, true, 0, 2},
        {"complex max: first of equal power", STAT(t_max), {0, -2, 1, 1, 2, 0}, true, 0, -2},
        {"complex gmean of 2i and 8i", STAT(t_gmean), {0, 2, 0, 8}, true, 0, 4},
        {"complex hmean of 1+i and 1-i", STAT(t_hmean), {1, 1, 1, -1}, true, 2, 0},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> src(row.in, row.complex);
        const auto r = row.fn(src);
        ASSERT_EQ(r.status, 0) << row.what;
        EXPECT_TRUE(near(r.re, row.re, std::fabs(row.re) * 4 * std::numeric_limits<T>::epsilon() + 1e-6 * (row.re == 0)))
            << row.what << ": " << r.re;
        if (row.complex) {
            EXPECT_TRUE(near(r.im, row.im, std::fabs(row.im) * 4 * std::numeric_limits<T>::epsilon() + 1e-6))
                << row.what << ": " << r.im;
        }
    }
    // A NaN flows through the sums.
    Vec<TypeParam> with_nan{1, nan, 3};
    EXPECT_TRUE(std::isnan(STAT(t_mean)(with_nan).re) && std::isnan(STAT(t_pop_var)(with_nan).re));
    // Complex input to skew and excess is refused, dst untouched.
    Vec<TypeParam> cx({1, 2, 3, 4}, true), dst{42};
    EXPECT_TRUE(t_skew(cx.get(), dst.get()) == -1 && t_excess(cx.get(), dst.get()) == -1 && dst->points == 1 && dst[0] == T(42));
    Vec<TypeParam> v({1, 2, 3, 4, 5, 6}, true);
    v->delta = T(0.25);
    ASSERT_TRUE(t_mean(v.get(), v.get()) == 0 && has_shape(v.get(), 1, 1, 0.25));
    EXPECT_EQ(v.values(), (std::vector<T>{3, 4}));
    // complex variance is that of re plus that of im; the result is real
    Vec<TypeParam> c({1, 10, 3, 10, 5, 40}, true);
    const auto r = STAT(t_pop_var)(c);
    EXPECT_TRUE(r.complex == 0 && near(r.re, T(8) / 3 + T(200), 1e-4));
}

namespace {
VLX_TWIN(s, lin_regres) VLX_TWIN(s, lin_regres2)

using LD = long double;

LD clamp1(LD v) { return v > 1 ? 1 : v < -1 ? -1 : v; }

// The record from its definitions, with means and moments taken directly.
std::vector<LD> reference(const std::vector<LD>& x, const std::vector<LD>& y) {
    const LD n = x.size();
    LD mx = 0, my = 0, vx = 0, vy = 0, c = 0;
    for (size_t i = 0; i < x.size(); ++i) mx += x[i] / n, my += y[i] / n;
    for (size_t i = 0; i < x.size(); ++i)
        vx += (x[i] - mx) * (x[i] - mx) / n, vy += (y[i] - my) * (y[i] - my) / n, c += (x[i] - mx) * (y[i] - my) / n;
    const LD rho = clamp1(c / std::sqrt(vx * vy)), f = n / (n - 2), h = n / (n - 1);
    std::vector<LD> r(20);  // y on x, then x on y, then the sample statistics
    auto one_way = [&](LD* o, LD ma, LD mb, LD va, LD vb) {
        const LD resid = (1 - rho * rho) * vb, g = resid / (n * va), e = ma * ma + va;
        o[0] = c / va, o[1] = mb - c * ma / va, o[2] = resid * f, o[3] = g * f, o[4] = g * e * f, o[5] = -g * ma * f;
        o[6] = clamp1(-ma / std::sqrt(e));
    };
    one_way(&r[0], mx, my, vx, vy);
    one_way(&r[7], my, mx, vy, vx);
    r[14] = mx, r[15] = my, r[16] = h * vx, r[17] = h * vy, r[18] = h * c, r[19] = rho;
    return r;
}

}  // namespace

VLX_TYPED_SUITE(Regression);

// Real vectors (one crossing the 2048-point block, x restarting at 0) and a complex scatter far from the origin.
TYPED_TEST(Regression, MatchesLeastSquares) {
    using T = real_of<TypeParam>;
    const LD tol = is_double<TypeParam> ? 1e-9L : 3e-3L;
    for (const int n : {600, 2500, -777}) {
        const bool cx = n < 0;  // a negative count marks the complex scatter
        const int pts = cx ? -n : n;
        const auto noise = random_values<T>(2 * pts, 17 + pts, -3.0, 3.0);
        std::vector<T> in;
        std::vector<LD> xs, ys;
        for (int i = 0; i < pts; ++i) {
            const T x = cx ? T(100) + noise[2 * i] : T((i % 2048) * 0.25);
            // a moderate correlation, so that float's rounding of rho is not magnified in 1 - rho^2
            const T y = T(5) - (cx ? T(0.7) : T(0.02)) * x + noise[2 * i + 1];
            if (cx) in.push_back(x);
            in.push_back(y);
            xs.push_back(x), ys.push_back(y);
        }
        Vec<TypeParam> src(in, cx), dst;
        src->delta = T(0.25);  // the record's x comes from delta
        ASSERT_TRUE(t_lin_regres2(src.get(), dst.get()) == 0 && has_shape(dst.get(), 20, 0, 1.0));
        const std::vector<LD> want = reference(xs, ys);
        for (int k = 0; k < 20; ++k)
            EXPECT_TRUE(near(dst[k], want[k], tol * (std::fabs(want[k]) + 1e-3L))) << "n " << n << " entry " << k;
        EXPECT_TRUE(t_lin_regres(src.get(), dst.get()) == 0 && dst->points == 2 &&
                    near(dst[1], want[1], tol * std::fabs(want[1])));
    }
}

TYPED_TEST(Regression, DegenerateVectors) {
    using T = real_of<TypeParam>;
    const T b = bound_of<TypeParam>();
    struct Row { const char* what; std::vector<T> in; T delta; std::vector<std::pair<int, T>> entries; };
    const Row rows[] = {
        {"line, delta 0 taken as 1", {1, 3, 5}, 0, {{0, 2}, {1, 1}, {2, 0}, {19, 1}, {14, 1}, {15, 3}}},
        {"constant", {4, 4, 4, 4}, 1, {{0, 0}, {1, 4}, {7, b}, {8, b}, {10, 2 * b}, {19, 0}}},
        {"two points: f is 0", {1, 5}, 1, {{0, 4}, {2, 0}, {3, 0}, {4, 0}, {5, 0}, {9, 0}, {12, 0}, {16, 0.5}}},
        {"one point", {7}, 1, {{0, 0}, {1, 7}, {15, 7}, {8, 0}, {14, 0}, {19, 0}, {2, 0}}},
        {"empty", {}, 1, {{0, 0}, {1, 0}, {8, 0}, {14, 0}, {15, 0}, {19, 0}}},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> v(row.in, false);
        v->delta = row.delta;
        // dst may be src
        ASSERT_TRUE(t_lin_regres2(v.get(), v.get()) == 0 && has_shape(v.get(), 20, 0, 1.0)) << row.what;
        for (const auto& [k, want] : row.entries)
            EXPECT_TRUE(near(v[k], want, 4 * std::numeric_limits<T>::epsilon() * std::fabs(want)))
                << row.what << ": entry " << k << " is " << v[k];
    }
}
