// Regression: the twenty-number record against least squares in long double, and degenerate vectors.
#include "stats_support.hpp"

using namespace vlxtest;

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

// Real vectors (one crossing the 2048-point block, where x starts again at 0) and a complex scatter far from the
// origin, against the long double fit.
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
