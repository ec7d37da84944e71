// Interpolation: splines reproduce a cubic, the lower methods their own polynomials, failures leave what they should.
#include "stats_support.hpp"

using namespace vlxtest;

namespace {
VLX_TEST_TWIN(t_interp, vlx_interp, vlxf_interp) VLX_TEST_TWIN(t_cspline, vlx_cspline, vlxf_cspline)
VLX_TEST_TWIN(t_cspline_2d, vlxb_cspline_2d, vlxfb_cspline_2d)

using LD = long double;
LD cubic(LD x) { return ((0.5L * x - 2) * x + 1) * x + 3; }
LD cubic_d1(LD x) { return (1.5L * x - 4) * x + 1; }
LD cubic_d2(LD x) { return 3 * x - 4; }

template <class V, class F>
Vec<V> table(const std::vector<LD>& xs, F f) {
    std::vector<real_of<V>> v;
    for (LD x : xs) v.push_back(static_cast<real_of<V>>(f(x)));
    return Vec<V>(v, false);
}
}  // namespace

VLX_TYPED_SUITE(Interp);

// Second derivatives and values of a cubic, in and beyond the table, for the four-point closed form and the
// tridiagonal path; y comes back unchanged.
TYPED_TEST(Interp, SplineReproducesCubic) {
    using T = real_of<TypeParam>;
    const LD tol = is_double<TypeParam> ? 1e-11L : 2e-4L;
    const std::vector<LD> four{-1.5L, -0.25L, 0.5L, 2}, nine{-2, -1.75L, -1, 0, 0.25L, 1, 1.5L, 2.5L, 3};
    std::vector<T> q;  // in and beyond the tables
    for (LD v = -3; v <= 4; v += 0.125L) q.push_back(T(v));
    struct Row { const std::vector<LD>* xs; int32_t end0, endn; };
    for (const Row& row : {Row{&four, 0, 0}, Row{&four, 1, 2}, Row{&nine, 0, 0}, Row{&nine, 1, 1}, Row{&nine, 2, 0},
                           Row{&nine, 0, 2}, Row{&nine, 2, 1}}) {
        const auto& xs = *row.xs;
        auto x = table<TypeParam>(xs, [](LD v) { return v; }), y = table<TypeParam>(xs, cubic);
        Vec<TypeParam> y2;
        auto end_value = [](int32_t cond, LD at) { return T(cond == 1 ? cubic_d1(at) : cubic_d2(at)); };
        ASSERT_EQ(t_cspline_2d(x.get(), y.get(), y2.get(), end_value(row.end0, xs.front()),
                               end_value(row.endn, xs.back()), row.end0, row.endn), 0);
        ASSERT_TRUE(same_scalars(y.values(), table<TypeParam>(xs, cubic).values()) && has_shape(y2.get(), int32_t(xs.size()), 0, 1.0));
        for (size_t i = 0; i < xs.size(); ++i)
            EXPECT_TRUE(near(y2[i], cubic_d2(xs[i]), 10 * tol)) << xs.size() << " points, knot " << i;
        Vec<TypeParam> xi(q, false), yi;
        xi->delta = T(0.125);
        ASSERT_EQ(t_cspline(x.get(), y.get(), y2.get(), xi.get(), yi.get()), 0);
        ASSERT_TRUE(has_shape(yi.get(), int32_t(q.size()), 0, 0.125));
        for (size_t j = 0; j < q.size(); ++j) EXPECT_TRUE(near(yi[j], cubic(q[j]), tol * 50)) << "query " << q[j];
    }
    // no second derivatives given: not-a-knot, made on the spot; yi may be xi
    auto x = table<TypeParam>(nine, [](LD v) { return v; }), y = table<TypeParam>(nine, cubic);
    Vec<TypeParam> xi(std::vector<T>(x.values()), false);
    ASSERT_EQ(t_cspline(x.get(), y.get(), nullptr, xi.get(), xi.get()), 0);
    EXPECT_TRUE(same_scalars(xi.values(), y.values(), is_double<TypeParam> ? 64 : 16));
}

// Each lower method on its own polynomial, with and without held ends, and the method values without a formula.
TYPED_TEST(Interp, LowerMethods) {
    using T = real_of<TypeParam>;
    const std::vector<LD> xs{0, 1, 2.5L, 3, 5};
    auto x = table<TypeParam>(xs, [](LD v) { return v; }), line = table<TypeParam>(xs, [](LD v) { return 2 * v - 1; }),
         parabola = table<TypeParam>(xs, [](LD v) { return v * v - 3 * v; });
    const std::vector<T> q{-2, -0.5, 0, 0.75, 1, 2.5, 2.75, 4.5, 5, 6};
    Vec<TypeParam> xi(q, false), yi;
    auto run_on = [&](Vec<TypeParam>& at, Vec<TypeParam>& y, int32_t flags, TypeParam* y2 = nullptr) {
        EXPECT_EQ(t_interp(at.get(), y.get(), y2, xi.get(), yi.get(), flags), 0);
        return yi.values();
    };
    const T tol = is_double<TypeParam> ? T(1e-13) : T(2e-5);
    for (const bool hold : {false, true}) {
        const int32_t h = hold ? VLX_INTERP_HOLD_ENDS : 0;
        const auto lin = run_on(x, line, VLX_INTERP_LINEAR | h);
        const auto par = run_on(x, parabola, VLX_INTERP_QUADRATIC | h);
        const auto stp = run_on(x, line, VLX_INTERP_STEP | h);
        for (size_t j = 0; j < q.size(); ++j) {
            const T c = hold ? std::min(std::max(q[j], T(0)), T(5)) : q[j];
            EXPECT_TRUE(near(lin[j], 2 * c - 1, tol * 8)) << "linear at " << q[j];
            EXPECT_TRUE(near(par[j], c * c - 3 * c, tol * 64)) << "quadratic at " << q[j];
            size_t k = 0;  // the last abscissa at or below the query, the first one below the table
            while (k + 1 < xs.size() && T(xs[k + 1]) <= q[j]) ++k;
            EXPECT_EQ(stp[j], line[k]) << "step at " << q[j];
        }
    }
    // values 2, 4, 6, 7: the first query's segment end for every query
    for (const int32_t method : {2, 4, 6, 7})
        EXPECT_TRUE(same_scalars(run_on(x, line, method), std::vector<T>(q.size(), line[1])));
    EXPECT_TRUE(same_scalars(run_on(x, line, 2 | VLX_INTERP_HOLD_ENDS), {-1, -1, 1, 1, 1, 1, 1, 1, 1, 1}));
    // a parabola needs three points, so two give the line
    Vec<TypeParam> x2{0, 2}, y2v{1, 5}, x1{1}, y1{4}, d2{2};
    EXPECT_TRUE(same_scalars(run_on(x2, y2v, VLX_INTERP_QUADRATIC | 8), run_on(x2, y2v, VLX_INTERP_LINEAR)));
    // one point: a constant, or the parabola of its second derivative
    EXPECT_TRUE(same_scalars(run_on(x1, y1, VLX_INTERP_LINEAR), std::vector<T>(q.size(), T(4))));
    EXPECT_EQ(run_on(x1, y1, VLX_INTERP_SPLINE, d2.get())[0], T(13));
}

TYPED_TEST(Interp, Failures) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> x{0, 1, 1, 2, 3}, y{5, 6, 7, 8, 9}, xi{0.5, 0.75, 1.5}, yi, y2;
    // equal abscissas met on the way: the earlier values stay
    ASSERT_EQ(t_interp(x.get(), y.get(), nullptr, xi.get(), yi.get(), VLX_INTERP_LINEAR), -1);
    EXPECT_TRUE(yi[0] == T(5.5) && yi[1] == T(5.75));
    Vec<TypeParam> rising{0, 1, 2, 4, 5}, cx({0, 1, 2, 3}, true), short_y{1, 2};
    const std::vector<T> before = y.values();
    // x not rising, or a bad end0: y untouched
    EXPECT_TRUE(t_cspline_2d(x.get(), y.get(), y2.get(), T(0), T(0), 0, 0) == -1 && same_scalars(y.values(), before));
    EXPECT_TRUE(t_cspline_2d(rising.get(), y.get(), y2.get(), T(0), T(0), 4, 0) == -1 && same_scalars(y.values(), before));
    // a bad endn leaves the start's change of y: settled
    EXPECT_TRUE(t_cspline_2d(rising.get(), y.get(), y2.get(), T(0), T(0), 0, 4) == -1 && y[1] == y[0]);
    const int32_t refused[] = {
        t_cspline_2d(cx.get(), y.get(), y2.get(), T(0), T(0), 3, 3),
        t_cspline_2d(short_y.get(), short_y.get(), y2.get(), T(0), T(0), 3, 3),
        t_cspline(short_y.get(), short_y.get(), nullptr, xi.get(), yi.get()),
        t_interp(rising.get(), short_y.get(), nullptr, xi.get(), yi.get(), 1),
        t_interp(rising.get(), y.get(), short_y.get(), xi.get(), yi.get(), VLX_INTERP_SPLINE),
        t_interp(rising.get(), y.get(), nullptr, cx.get(), yi.get(), 1)};
    for (const int32_t status : refused) EXPECT_EQ(status, -1);
    Vec<TypeParam> empty;  // no table: zeros
    EXPECT_TRUE(t_interp(empty.get(), empty.get(), nullptr, xi.get(), yi.get(), 1) == 0 && same_scalars(yi.values(), {0, 0, 0}));
    // natural ends hold their second derivatives at exactly 0
    ASSERT_EQ(t_cspline_2d(rising.get(), y.get(), y2.get(), T(5), T(5), VLX_SPLINE_NATURAL, VLX_SPLINE_NATURAL), 0);
    EXPECT_TRUE(y2[0] == T(0) && y2[4] == T(0) && y2[2] != T(0));
}
