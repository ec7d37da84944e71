// Phase and time operations: unwrapping restores ramps, crossings of a sine
// land on its zeros, and the small operations give their fixed results.
#include "vlx_test.hpp"

#include <algorithm>
#include <functional>

using namespace vlxtest;

namespace {
VLX_TWIN(i, unwrap) VLX_TWIN(i, unwrap_wnd) VLX_TWIN(i, differ) VLX_TWIN(i, integ) VLX_TWIN(i, edge)
VLX_TWIN(i, limit) VLX_TWIN(i, pdiffer) VLX_TWIN(i, phase) VLX_TWIN(i, rtop)
}  // namespace

template <class V>
class Phase : public ::testing::Test {};
TYPED_TEST_SUITE(Phase, Families);

// A ramp wrapped into [-pi, pi) comes back whole (plus the turns that bring
// its first sample within pi of 0), by the plain unwrap and by windows.
TYPED_TEST(Phase, UnwrapRestoresRamp) {
    using T = real_of<TypeParam>;
    const long double pi = 3.14159265358979323846L;
    const double tol = is_double<TypeParam> ? 1e-11 : 2e-4;
    for (const long double slope : {0.9L, -2.5L, 0.01L}) {
        std::vector<T> wrapped(300);
        std::vector<long double> ramp(300);
        for (int k = 0; k < 300; ++k) {
            ramp[k] = 7.0L + slope * k;
            wrapped[k] = static_cast<T>(ramp[k] - 2 * pi * std::floor((ramp[k] + pi) / (2 * pi)));
        }
        for (const int32_t window : {-2, 1, 3, 500}) {  // -2: the plain unwrap
            // a window's mean lags (window + 1) / 2 samples behind
            if (std::fabs(slope) * (std::min(window, 300) + 1) / 2 > 2) continue;
            Vec<TypeParam> v(wrapped, false);
            ASSERT_EQ(window < 0 ? t_unwrap(v.get()) : t_unwrap_wnd(v.get(), window), 0);
            for (int k = 0; k < 300; ++k)
                ASSERT_TRUE(near(v[k], ramp[k] - 2 * pi, tol * (1 + std::fabs(ramp[k]))))
                    << "slope " << double(slope) << " window " << window << " sample " << k;
        }
    }
    Vec<TypeParam> pair{3, -3}, one{4}, cx({1, 2}, true);
    ASSERT_EQ(t_unwrap(pair.get()), 0);
    ASSERT_EQ(t_unwrap(one.get()), 0);
    EXPECT_EQ(pair[1], T(-3) + T(2 * pi));
    EXPECT_EQ(one[0], T(4) - T(2 * pi));
    EXPECT_EQ(t_unwrap(cx.get()), -1);
    EXPECT_EQ(t_unwrap_wnd(cx.get(), 2), -1);
    EXPECT_EQ(t_unwrap_wnd(pair.get(), -1), -1);
    EXPECT_EQ(pair[1], T(-3) + T(2 * pi));
}

// Rising and falling crossings of a sine at level 0 sit at its zeros; the
// linear interpolation errs by far less than a sample here.
TYPED_TEST(Phase, EdgesOfSine) {
    const double delta = 0.01, freq = 3.0;  // 100 samples per unit, zeros every 1/6
    std::vector<real_of<TypeParam>> s(400);
    for (int k = 0; k < 400; ++k) s[k] = static_cast<real_of<TypeParam>>(std::sin(2 * M_PI * freq * (k * delta + 0.013)));
    for (const int32_t mode : {1, 2, 3, 0}) {
        Vec<TypeParam> v(s, false);
        v->delta = static_cast<real_of<TypeParam>>(delta);
        ASSERT_EQ(t_edge(v.get(), mode, real_of<TypeParam>(0)), 0);
        std::vector<double> want;
        for (int z = 1; z < 30; ++z) {
            const double t = z / (2 * freq) - 0.013;
            if (t < 3.99 && ((z % 2 == 0) ? (mode & 1) : (mode & 2))) want.push_back(t);
        }
        ASSERT_TRUE(has_shape(v.get(), int32_t(want.size()), 0, 1.0)) << "mode " << mode;
        for (size_t i = 0; i < want.size(); ++i) EXPECT_TRUE(near(v[i], want[i], 2e-4)) << i;
    }
    Vec<TypeParam> step{0, 2}, single{5};
    step->delta = 0.5;
    ASSERT_EQ(t_edge(step.get(), 1, real_of<TypeParam>(1)), 0);
    EXPECT_EQ(step[0], real_of<TypeParam>(0.25));
    ASSERT_EQ(t_edge(single.get(), 3, real_of<TypeParam>(1)), 0);
    EXPECT_TRUE(has_shape(single.get(), 0, 0, 1.0));
}

// Fixed results, bit for bit.
TYPED_TEST(Phase, FixedCases) {
    using T = real_of<TypeParam>;
    const T pi = is_double<TypeParam> ? T(3.141592653589793) : T(3.1415927f);
    const T b = is_double<TypeParam> ? T(1e100) : T(1e15f);
    const T nan = std::numeric_limits<T>::quiet_NaN();
    int32_t clipped = -5;
    struct Row {
        const char* what;
        std::function<int32_t(TypeParam*)> op;
        std::vector<T> in;
        bool complex;
        T delta;
        std::vector<T> out;
        int32_t points, out_complex;
    };
    const Row rows[] = {
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
        EXPECT_TRUE(has_shape(v.get(), row.points, row.out_complex, row.delta)) << row.what;
        EXPECT_TRUE(same_scalars(v.values(), row.out)) << row.what;
    }
    EXPECT_EQ(clipped, 1);
    Vec<TypeParam> inside{0.5, -1};
    ASSERT_EQ(t_limit(inside.get(), 0, T(-1), T(1), &clipped), 0);
    EXPECT_EQ(clipped, 0);
    Vec<TypeParam> cx({1, 2}, true);
    EXPECT_EQ(t_edge(cx.get(), 1, T(0)), -1);
    Vec<TypeParam> grow{1, 2, 3};
    FailingAlloc<TypeParam> failing;
    EXPECT_EQ(t_rtop(grow.get()), -1);
    EXPECT_EQ(grow->points, 0);
}
