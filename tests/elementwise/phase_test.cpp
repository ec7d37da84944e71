// Phase and time operations: unwrapping restores ramps, sine crossings land on its zeros, fixed results.
#include "vlx_test.hpp"

#include <functional>

using namespace vlxtest;

namespace {
VLX_TWIN(i, unwrap) VLX_TWIN(i, unwrap_wnd) VLX_TWIN(i, differ) VLX_TWIN(i, integ) VLX_TWIN(i, edge)
VLX_TWIN(i, limit) VLX_TWIN(i, pdiffer) VLX_TWIN(i, phase) VLX_TWIN(i, rtop)
}  // namespace

VLX_TYPED_SUITE(Phase);

// A ramp wrapped into [-pi, pi) comes back whole (plus the turns that bring its first sample within pi of 0), by the
// plain unwrap and by windows.
TYPED_TEST(Phase, UnwrapRestoresRamp) {
    using T = real_of<TypeParam>;
    const long double pi = 3.14159265358979323846L;
    const double tol = is_double<TypeParam> ? 1e-11 : 2e-4;
    for (const long double slope : {0.9L, -2.5L, 0.01L}) {
        auto ramp = [slope](int k) { return 7.0L + slope * k; };
        std::vector<T> wrapped(300);
        for (int k = 0; k < 300; ++k) wrapped[k] = T(ramp(k) - 2 * pi * std::floor((ramp(k) + pi) / (2 * pi)));
        for (const int32_t window : {-2, 1, 3, 500}) {  // -2: the plain unwrap
            // a window's mean lags (window + 1) / 2 samples behind
            if (std::fabs(slope) * ((window > 300 ? 300 : window) + 1) / 2 > 2) continue;
            Vec<TypeParam> v(wrapped, false);
            ASSERT_EQ(window < 0 ? t_unwrap(v.get()) : t_unwrap_wnd(v.get(), window), 0);
            for (int k = 0; k < 300; ++k)
                ASSERT_TRUE(near(v[k], ramp(k) - 2 * pi, tol * (1 + std::fabs(ramp(k)))))
                    << "slope " << double(slope) << " window " << window << " sample " << k;
        }
    }
}

// Crossings of a sine at level 0 sit at its zeros, within the error of the linear interpolation.
TYPED_TEST(Phase, EdgesOfSine) {
    const double delta = 0.01, freq = 3.0;  // 100 samples per unit, zeros every 1/6
    std::vector<real_of<TypeParam>> s(400);
    for (int k = 0; k < 400; ++k) s[k] = real_of<TypeParam>(std::sin(2 * M_PI * freq * (k * delta + 0.013)));
    for (const int32_t mode : {1, 2, 3, 0}) {
        Vec<TypeParam> v(s, false);
        v->delta = static_cast<real_of<TypeParam>>(delta);
        ASSERT_EQ(t_edge(v.get(), mode, real_of<TypeParam>(0)), 0);
        std::vector<double> want;  // zeros at z / 6 - 0.013, rising for even z
        for (int z = 1; z / (2 * freq) - 0.013 < 3.99; ++z)
            if ((z % 2 == 0) ? (mode & 1) : (mode & 2)) want.push_back(z / (2 * freq) - 0.013);
        ASSERT_TRUE(has_shape(v.get(), int32_t(want.size()), 0, 1.0)) << "mode " << mode;
        for (size_t i = 0; i < want.size(); ++i) EXPECT_TRUE(near(v[i], want[i], 2e-4)) << i;
    }
}

// Fixed results, bit for bit.
TYPED_TEST(Phase, FixedCases) {
    using T = real_of<TypeParam>;
    const T pi = is_double<TypeParam> ? T(3.141592653589793) : T(3.1415927f);
    const T b = bound_of<TypeParam>();
    const T nan = std::numeric_limits<T>::quiet_NaN();
    int32_t clipped = -5;
    struct Row { const char* what; std::function<int32_t(TypeParam*)> op; std::vector<T> in; bool complex; T delta;
                 std::vector<T> out; int32_t points, out_complex; T out_delta = -1; };  // out_delta -1: the input's
    const T two_pi = T(6.283185307179586);
    const Row rows[] = {
        {"unwrap", [](auto* v) { return t_unwrap(v); }, {3, -3}, false, 1, {3, T(-3) + two_pi}, 2, 0},
        {"unwrap from 0", [](auto* v) { return t_unwrap(v); }, {4}, false, 1, {T(4) - two_pi}, 1, 0},
        {"unwrap_wnd from 0", [](auto* v) { return t_unwrap_wnd(v, 2); }, {4}, false, 1, {T(4) - two_pi}, 1, 0},
        {"edge", [](auto* v) { return t_edge(v, 1, T(1)); }, {0, 2}, false, 0.5, {0.25}, 1, 0, 1},
        {"edge, one point", [](auto* v) { return t_edge(v, 3, T(1)); }, {5}, false, 0.5, {}, 0, 0, 1},
        {"differ", [](auto* v) { return t_differ(v); }, {1, 3, 6}, false, 0.5, {2, 4, 6}, 3, 0},
        {"differ, delta 0", [](auto* v) { return t_differ(v); }, {1, 0, 3, 1}, true, 0, {b, 0, 2 * b, b}, 2, 1},
        {"integ", [](auto* v) { return t_integ(v); }, {1, 1, 1}, false, 0.5, {0.5, 1, 1.5}, 3, 0},
        {"integ, complex", [](auto* v) { return t_integ(v); }, {1, -2, 3, 4}, true, 2, {2, -4, 8, 4}, 2, 1},
        {"pdiffer", [](auto* v) { return t_pdiffer(v); }, {5, 4, 3}, false, 1, {4, 6}, 2, 0},
        {"pdiffer, complex", [](auto* v) { return t_pdiffer(v); }, {5, 5, 1, 2, 3, 4}, true, 1, {1, 2, 6, 8}, 2, 1},
        {"pdiffer, one point", [](auto* v) { return t_pdiffer(v); }, {5}, false, 1, {}, 0, 0},
        {"limit, bounds reversed", [&](auto* v) { return t_limit(v, 7, T(1), T(-1), &clipped); },
         {-3, 0.5, nan, 2}, false, 1, {-1, 0.5, nan, 1}, 4, 0},
        {"phase, real", [](auto* v) { return t_phase(v); }, {-1, 0, nan, 2}, false, 1, {pi, 0, 0, 0}, 4, 0},
        {"phase, complex", [](auto* v) { return t_phase(v); }, {0, 0, -1, -0.0, 0, -2}, true, 1,
         {0, static_cast<T>(std::atan2(-0.0, -1.0)), static_cast<T>(-M_PI / 2)}, 3, 0},
        {"rtop, real", [](auto* v) { return t_rtop(v); }, {-2, 3}, false, 1, {2, pi, 3, 0}, 2, 1},
        {"rtop, complex", [](auto* v) { return t_rtop(v); }, {3, 4, -0.0, 0}, true, 1,
         {5, static_cast<T>(std::atan2(4.0, 3.0)), 0, 0}, 2, 1},
    };
    for (const Row& row : rows) {
        Vec<TypeParam> v(row.in, row.complex);
        v->delta = row.delta;
        ASSERT_EQ(row.op(v.get()), 0) << row.what;
        EXPECT_TRUE(has_shape(v.get(), row.points, row.out_complex, row.out_delta < 0 ? row.delta : row.out_delta))
            << row.what;
        EXPECT_TRUE(same_scalars(v.values(), row.out)) << row.what;
    }
    Vec<TypeParam> inside{0.5, -1};  // after a clipping row set it to 1
    EXPECT_TRUE(clipped == 1 && t_limit(inside.get(), 0, T(-1), T(1), &clipped) == 0 && clipped == 0);
    Vec<TypeParam> cx({1, 2}, true);
    EXPECT_TRUE(t_edge(cx.get(), 1, T(0)) == -1 && t_unwrap(cx.get()) == -1 && t_unwrap_wnd(cx.get(), 2) == -1);
    EXPECT_TRUE(t_unwrap_wnd(inside.get(), -1) == -1 && same_scalars(inside.values(), {0.5, -1}));
    Vec<TypeParam> grow{1, 2, 3};
    FailingAlloc<TypeParam> failing;
    EXPECT_TRUE(t_rtop(grow.get()) == -1 && grow->points == 0);
}
