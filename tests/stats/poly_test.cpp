// Polynomial roots (long double residuals, closed forms, single searches); splines and lower interpolation methods.
#include "stats_support.hpp"

#include <algorithm>
#include <complex>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

using namespace vlxtest;

namespace {
VLX_TWIN(s, peval) VLX_TWIN(s, psolve) VLX_TWIN(s, pcsolve) VLX_TWIN(s, proots)
VLX_TWIN(s, root_upper_bound) VLX_TWIN(s, root_lower_bound) VLX_TEST_TWIN(t_pztoc, vlxi_pztoc, vlxfi_pztoc)
VLX_TWIN(s, root_restarts)

using LC = std::complex<long double>;

// vlxi_proots leaves its two work vectors behind by design; that storage is not a leak the sanitizer should report.
template <class V>
int32_t iproots(V* v) {
#if defined(__SANITIZE_ADDRESS__)
    __lsan::ScopedDisabler keep;
#endif
    if constexpr (is_double<V>) return vlxi_proots(v); else return vlxfi_proots(v);
}

// Coefficients (constant first) of lead * prod (x - r), in long double.
std::vector<long double> expand(const std::vector<LC>& roots, long double lead) {
    std::vector<LC> c{LC(lead)};
    for (const LC& r : roots) {
        c.push_back(0);
        for (size_t k = c.size() - 1; k > 0; --k) c[k] = c[k - 1] - r * c[k];
        c[0] = -r * c[0];
    }
    std::vector<long double> out;
    for (const LC& x : c) out.push_back(x.real());
    return out;
}

// |p(z)| over the sum of |a_k| |z|^k: what a backward-stable root can promise.
template <class T>
long double relative_residual(const std::vector<T>& a, LC z) {
    LC p = 0;
    long double scale = 0;
    for (size_t k = a.size(); k-- > 0;) {
        p = p * z + LC(a[k]);
        scale = scale * std::abs(z) + std::fabs(static_cast<long double>(a[k]));
    }
    return std::abs(p) / scale;
}

// Root sets: reals and conjugate pairs apart; with each real doubled 1e-3 away; a triple and a double root; 4 decades.
std::vector<LC> root_set(int kind, int degree, uint32_t seed) {
    std::mt19937 rng(seed);
    std::uniform_real_distribution<double> u(-2, 2);
    std::vector<LC> r;
    for (LC m : {1.25L, 1.25L, 1.25L, -0.5L, -0.5L})
        if (kind == 2 && static_cast<int>(r.size()) < degree) r.push_back(m);
    auto apart = [&](LC z, long double d) {
        return std::none_of(r.begin(), r.end(), [&](const LC& y) { return std::abs(z - y) < d * std::max(1.0L, std::abs(z)); });
    };
    while (static_cast<int>(r.size()) < degree) {
        const bool pair = degree - r.size() >= 2 && rng() % 2 && kind != 3;
        const LC z = kind == 3 ? LC(std::pow(10.0L, u(rng)) * (rng() % 2 ? 1 : -1)) : LC(u(rng), pair ? u(rng) : 0);
        if (!apart(z, 0.25L) || (pair && std::fabs(z.imag()) < 0.125L)) continue;
        r.push_back(z);
        if (pair) r.push_back(std::conj(z));
        if (!pair && kind == 1 && degree - r.size() >= 1) r.push_back(z + 1e-3L);
    }
    return r;
}

// vlxs_pcsolve rebuilt from the exported layers, whose step pointers the library runs without skipping cycles.
template <class V>
int32_t pcsolve_every_round(V* src, V* dst, real_of<V> re, real_of<V> im) {
    using T = real_of<V>;
    const auto [laguerre, newton] = [] {
        if constexpr (is_double<V>) return std::pair(&vlxs_laguerre_step, &vlxs_newton_step);
        else return std::pair(&vlxfs_laguerre_step, &vlxfs_newton_step);
    }();
    dst->points = 1, dst->complex = 1;
    if (t_alloc(dst) < 0) return -1;
    dst->data[0] = dst->data[1] = T(0);
    if (t_root_restarts(src, dst, laguerre, re, im, 0) != 0) return t_root_restarts(src, dst, newton, re, im, 1) ? -1 : 0;
    const int32_t cls = dst->complex;
    const T r = dst->data[0], i = cls ? dst->data[1] : T(0);
    if (t_root_restarts(src, dst, newton, r, i, 0) != 0) dst->data[0] = r, dst->data[1] = i, dst->complex = cls;
    return 0;
}

template <class V>
std::vector<real_of<V>> rounded(const std::vector<long double>& c) {
    return std::vector<real_of<V>>(c.begin(), c.end());
}

}  // namespace

VLX_TYPED_SUITE(Poly);

TYPED_TEST(Poly, SearchedRootsSatisfyPolynomialExpandBackAndSkipNoBit) {
    using T = real_of<TypeParam>;
    const long double eps = std::numeric_limits<T>::epsilon();
    for (int kind = 0; kind < 4; ++kind) {
        for (int degree = 1; degree <= 20; ++degree) {
            const long double lead = degree % 2 ? 1e-4L : -3e5L;
            const auto a = rounded<TypeParam>(expand(root_set(kind, degree, 17 * degree + kind), lead));
            Vec<TypeParam> v(a, false), fast, slow;
            for (const T start : {T(0), T(0.7)}) {  // the single-root search skips cycles without changing a bit
                const int32_t status = t_pcsolve(v.get(), fast.get(), start, -start);
                ASSERT_EQ(status, pcsolve_every_round(v.get(), slow.get(), start, -start));
                EXPECT_TRUE(status || (fast->complex == slow->complex && same_scalars(fast.values(), slow.values())));
            }
            ASSERT_EQ(iproots(v.get()), 0) << "kind " << kind << ", degree " << degree;
            ASSERT_TRUE(has_shape(v.get(), degree, 1, 1));
            for (int i = 0; i < degree; ++i) {
                const LC z(v[2 * i], v[2 * i + 1]);
                // deflation rounding adds up from root to root, clusters the most
                EXPECT_LT(relative_residual(a, z), 256 * degree * eps) << "kind " << kind << ", degree " << degree << ", root " << z;
                // sorted by power first
                EXPECT_TRUE(i == 0 || std::norm(LC(v[2 * i - 2], v[2 * i - 1])) <= std::norm(z) * (1 + 4 * eps));
            }
            // Roots back to coefficients: the monic polynomial, to the size of its terms.
            ASSERT_TRUE(t_pztoc(v.get()) == 0 && has_shape(v.get(), degree + 1, 1, 1));
            long double size = 0;
            for (T x : a) size += std::fabs(static_cast<long double>(x / a[degree]));
            for (int k = 0; k <= degree; ++k) {
                EXPECT_TRUE(near(v[2 * k], a[k] / static_cast<long double>(a[degree]), 64 * degree * eps * size));
                EXPECT_TRUE(near(v[2 * k + 1], 0, 64 * degree * eps * size));
            }
        }
    }
}

// Closed forms up to degree 5: real roots exactly real, first and ascending, then the conjugate pairs.
TYPED_TEST(Poly, ClosedFormsKeepRealRootsReal) {
    using T = real_of<TypeParam>;
    const long double eps = std::numeric_limits<T>::epsilon();
    for (int trial = 0; trial < 200; ++trial) {
        const int degree = 1 + trial % 5;
        const std::vector<LC> r = root_set(0, degree, 1000 + trial);
        const bool pairs = std::any_of(r.begin(), r.end(), [](const LC& z) { return z.imag() != 0; });
        std::vector<T> a = rounded<TypeParam>(expand(r, trial % 2 ? 2.5L : -0.75L));
        a.resize(6, T(0));  // leading zeros lower the degree
        Vec<TypeParam> src(a, false), dst;
        ASSERT_TRUE(t_proots(src.get(), dst.get()) == 0 && dst->points == degree);
        ASSERT_EQ(dst->complex, pairs ? 1 : 0) << "trial " << trial;
        const int w = dst->complex ? 2 : 1;
        for (int i = 0; i < degree; ++i) {
            const LC z(dst[w * i], dst->complex ? dst[w * i + 1] : T(0));
            // Ferrari's resolvent (also under the quintic) loses a few digits.
            EXPECT_LT(relative_residual(a, z), (degree <= 3 ? 64 : 4096) * eps) << "trial " << trial << ", root " << z;
            EXPECT_TRUE(i == 0 || (pairs && dst[w * i + 1] != T(0)) || dst[w * (i - 1)] <= dst[w * i]) << "trial " << trial;
        }
        if (pairs) {
            int i = 0;
            while (i < degree && dst[2 * i + 1] == T(0)) ++i;
            EXPECT_EQ((degree - i) % 2, 0) << "trial " << trial;
            for (; i + 1 < degree; i += 2) EXPECT_EQ(dst[2 * i + 1], -dst[2 * i + 3]);
        }
    }
}

TYPED_TEST(Poly, FixedCases) {
    using T = real_of<TypeParam>;
    struct Row { const char* what; std::vector<T> coefficients, roots; int32_t status, complex; };
    const Row rows[] = {
        {"double root below the zero tail", {1, 2, 1, 0, 0, 0}, {-1, -1}, 0, 0}, {"constant", {5}, {}, 0, 0},
        {"empty", {}, {}, 0, 0}, {"zero polynomial", {0, 0, 0}, {}, 0, 0},
        {"seven coefficients", {1, 2, 3, 4, 5, 6, 7}, {}, -1, 0},
        {"x^2 + 1, negative imaginary part first", {1, 0, 1}, {-0.0, -1, -0.0, 1}, 0, 1},
        {"root at zero", {0, 3, 2}, {-1.5, -0.0}, 0, 0}, {"exact quadratic", {2, -3, 1}, {1, 2}, 0, 0},
        {"linear", {3, -4}, {0.75}, 0, 0},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> src(row.coefficients, false), dst;
        ASSERT_EQ(t_proots(src.get(), dst.get()), row.status) << row.what;
        if (row.status) continue;
        EXPECT_TRUE(dst->complex == row.complex && same_scalars(dst.values(), row.roots)) << row.what;
        // the same in place
        EXPECT_EQ(t_proots(src.get(), src.get()), 0);
        EXPECT_TRUE(same_scalars(src.values(), row.roots)) << row.what;
    }
    Vec<TypeParam> cx({1, 0, 1, 0}, true), out, constant{4, 0, 0}, list{1, 2}, none;
    EXPECT_TRUE(t_proots(cx.get(), out.get()) == -1 && iproots(cx.get()) == -1);
    EXPECT_TRUE(iproots(constant.get()) == 0 && constant->points == 0);
    ASSERT_TRUE(t_pztoc(list.get()) == 0 && t_pztoc(none.get()) == 0);
    EXPECT_TRUE(same_scalars(list.values(), {2, -3, 1}) && same_scalars(none.values(), {1}));
}

TYPED_TEST(Poly, SingleRootSearches) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> empty, constant{5}, zero{0}, unit_circle{1, 0, 1}, origin{0, 1, 1}, dst;
    EXPECT_TRUE(t_peval(empty.get(), dst.get(), T(3)) == 0 && same_scalars(dst.values(), {0}));
    EXPECT_TRUE(t_psolve(empty.get(), dst.get(), T(3)) == 0 && same_scalars(dst.values(), {0}));
    EXPECT_TRUE(t_pcsolve(empty.get(), dst.get(), T(3), T(1)) == 0 && dst->complex == 0 && dst[0] == T(0));
    EXPECT_TRUE(t_psolve(constant.get(), dst.get(), T(0)) == -1 && t_pcsolve(constant.get(), dst.get(), T(0), T(0)) == -1);
    // the zero polynomial passes at once, from the start moved onto the bound 1
    EXPECT_TRUE(t_psolve(zero.get(), dst.get(), T(7)) == 0 && dst[0] == T(1));
    EXPECT_EQ(t_psolve(unit_circle.get(), dst.get(), T(0)), -1);
    ASSERT_EQ(t_pcsolve(unit_circle.get(), dst.get(), T(0), T(0)), 0);
    const T e4 = 4 * std::numeric_limits<T>::epsilon();
    EXPECT_TRUE(dst->complex == 1 && near(std::fabs(dst[1]), 1, e4) && near(dst[0], 0, e4));
    // constant term 0: always classed real
    EXPECT_TRUE(t_pcsolve(origin.get(), dst.get(), T(0.3), T(0.7)) == 0 && dst->complex == 0);
    // in place, on odd degrees with a real root somewhere in the bounds
    const long double eps = std::numeric_limits<T>::epsilon();
    for (int degree = 1; degree <= 19; degree += 2) {
        const auto a = rounded<TypeParam>(expand(root_set(0, degree, degree), 1));
        Vec<TypeParam> v(a, false);
        const T lo = t_root_lower_bound(v.get()), hi = t_root_upper_bound(v.get());
        for (const LC& z : root_set(0, degree, degree))
            EXPECT_TRUE(z.imag() != 0 || (lo <= z.real() && z.real() <= hi)) << z;
        ASSERT_TRUE(t_psolve(v.get(), v.get(), T(0.25)) == 0 && has_shape(v.get(), 1, 0, 1)) << degree;
        EXPECT_TRUE(relative_residual(a, LC(v[0])) < (64 * degree * eps) && (v[0] >= lo && v[0] <= hi));
    }
}

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

// A cubic's second derivatives and values in and beyond the table, four-point and tridiagonal paths; y unchanged.
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
