// Layout operations, and the phase and time operations, through the public interface, both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <climits>
#include <functional>

using namespace vlxtest;

namespace {

VLX_TWIN(i, real) VLX_TWIN(i, imag) VLX_TWIN(i, rev) VLX_TWIN(i, shift) VLX_TWIN(i, zpad2) VLX_TWIN(i, unzpad)
VLX_TWIN(i, zinter) VLX_TEST_TWIN(t_swap, vlxi_swap_halves, vlxfi_swap_halves)
VLX_TEST_TWIN(t_swap2, vlxi_swap_halves2, vlxfi_swap_halves2) VLX_TEST_TWIN(t_uzinter, vlxu_zinter, vlxfu_zinter)

VLX_TWIN(i, unwrap) VLX_TWIN(i, unwrap_wnd) VLX_TWIN(i, differ) VLX_TWIN(i, integ) VLX_TWIN(i, edge)
VLX_TWIN(i, limit) VLX_TWIN(i, pdiffer) VLX_TWIN(i, phase) VLX_TWIN(i, rtop)

// Sample k of a vector as (re, im); im is 0 for a real vector.
template <class V>
std::pair<real_of<V>, real_of<V>> sample(Vec<V>& v, int64_t k) {
    if (v->complex) return {v[2 * k], v[2 * k + 1]};
    return {v[k], real_of<V>(0)};
}

VLX_TYPED_SUITE(Layout);

TYPED_TEST(Layout, PartsAndZeroInterleave) {
    using V = TypeParam; using T = real_of<V>; using R = std::vector<T>;
    Vec<TypeParam> c({1, -2, 3, -4, 5, -6}, true), d({1, -2, 3, -4, 5, -6}, true), r({7, 8, 9}), q({7, 8, 9});
    ASSERT_TRUE(t_real(&c) == 0 && t_imag(&d) == 0 && t_real(&r) == 0 && t_imag(&q) == 0);
    EXPECT_TRUE(c.values() == (R{1, 3, 5}) && c->alloc == 6 && d.values() == (R{-2, -4, -6}) && d->complex == 0);
    EXPECT_TRUE(r.values() == (R{7, 8, 9}) && q.values() == (R{0, 0, 0}));  // the imaginary part of a real signal is 0
    // zeros between the samples halve delta; the complex form scales, into itself or into another vector
    Vec<V> zr({1, 2}), zc({1, 2, 3, 4}, true), zd;
    zr->delta = 3;
    ASSERT_TRUE(t_zinter(&zr) == 0 && t_uzinter(&zc, &zd, T(2)) == 0 && t_uzinter(&zc, &zc, T(2)) == 0);
    EXPECT_TRUE(zr.values() == (R{1, 0, 2, 0}) && zr->delta == T(1.5));
    const R want{2, 4, 0, 0, 6, 8, 0, 0};
    EXPECT_TRUE(zc.values() == want && zd.values() == want && zd->complex == 1);
}

// Reversal, half rotations and shift against their index formulas, both parities, lengths past the vector widths.
TYPED_TEST(Layout, PermutationsAndShiftMatchIndexFormulas) {
    using V = TypeParam;
    struct Case { const char* name; int32_t (*op)(V*); int64_t (*from)(int64_t j, int64_t n); };  // from: j's source
    const Case cases[] = {
        {"rev", [](V* v) { return t_rev(v); }, [](int64_t j, int64_t n) { return n - 1 - j; }},
        {"swap_halves2", [](V* v) { return t_swap2(v); }, [](int64_t j, int64_t n) { return (j + n / 2) % n; }},
        {"swap_halves", [](V* v) { return t_swap(v); }, [](int64_t j, int64_t n) { return (j + n - n / 2) % n; }},
    };
    for (bool cx : {false, true})
        for (int32_t n : {0, 1, 2, 3, 4, 5, 6, 7, 15, 16, 63, 64, 1001}) {
            const auto x = random_values<real_of<V>>(size_t(n) * (cx ? 2 : 1), uint32_t(n + 7));
            Vec<V> ref(x, cx);
            for (const Case& c : cases) {
                Vec<V> v(x, cx);
                ASSERT_EQ(c.op(&v), 0);
                for (int64_t j = 0; j < n; ++j) ASSERT_EQ(sample(v, j), sample(ref, c.from(j, n))) << c.name << " n=" << n;
            }
            for (int32_t k : {INT_MIN, -1, 0, 1, n - 1, n, n + 1, INT_MAX}) {
                Vec<V> s(x, cx);
                const int32_t drop = k < 0 ? 0 : std::min(k, n);
                ASSERT_TRUE(t_shift(&s, k) == 0 && s->points == n - drop) << "n=" << n << " k=" << k;
                for (int64_t j = 0; j < s->points; ++j) ASSERT_EQ(sample(s, j), sample(ref, j + drop));
            }
        }
}

// Padding puts the samples where a spectrum or a centred record expects them, unpadding restores them; all modes.
TYPED_TEST(Layout, PadAndUnpad) {
    using V = TypeParam; using T = real_of<V>;
    for (bool cx : {false, true})
        for (int32_t mode : {VLX_PAD_SCALE_RATIO, VLX_PAD_SCALE_SQRT, VLX_PAD_SCALE_NONE})
            for (int32_t layout : {VLX_PAD_HEAD, VLX_PAD_CENTRE, VLX_PAD_TAIL, VLX_PAD_SPLIT})
                for (int32_t old_n : {0, 1, 2, 3, 4, 5, 8, 9, 16, 17})
                    for (int32_t extra : {1, 2, 3, 8, 31}) {
                        const int32_t n = old_n + extra;
                        const auto x = random_values<T>(size_t(old_n) * (cx ? 2 : 1), uint32_t(n * 3 + old_n));
                        Vec<V> ref(x, cx), v(x, cx);
                        SCOPED_TRACE(::testing::Message() << "cx " << cx << " flags " << (mode | layout) << " " << old_n);
                        ASSERT_TRUE(t_zpad2(&v, n, mode | layout) == 0 && v->points == n);
                        long double s = mode != VLX_PAD_SCALE_NONE && old_n > 0 ? (long double)n / old_n : 1;
                        if (mode == VLX_PAD_SCALE_SQRT) s = std::sqrt(s);
                        // where old sample k landed; every other sample is 0
                        const int64_t shift = layout == VLX_PAD_HEAD ? 0 : layout == VLX_PAD_TAIL ? n - old_n : n / 2 - old_n / 2;
                        std::vector<std::pair<T, T>> want(size_t(n), {T(0), T(0)});
                        for (int64_t k = 0; k < old_n; ++k) {
                            const int64_t at = layout != VLX_PAD_SPLIT ? k + shift : k < (old_n + 1) / 2 ? k : n - (old_n - k);
                            want[size_t(at)] = {T(sample(ref, k).first * s), T(sample(ref, k).second * s)};
                        }
                        for (int64_t j = 0; j < n; ++j)
                            EXPECT_TRUE(ulp_distance(sample(v, j).first, want[j].first) <= 1.0 &&
                                        ulp_distance(sample(v, j).second, want[j].second) <= 1.0) << j;
                        ASSERT_TRUE(t_unzpad(&v, old_n, mode | layout) == 0 && v->points == old_n);
                        EXPECT_TRUE(same_scalars(v.values(), x, mode == VLX_PAD_SCALE_NONE ? 0 : 4));
                    }
    // invalid flags are seen after growing and before unpadding
    for (int32_t flags : {3, VLX_PAD_SPLIT | 3, 0x400, 0x500, 0x600, 0x700 | VLX_PAD_SCALE_NONE}) {
        Vec<V> v({1, 2, 3});
        EXPECT_EQ(t_zpad2(&v, 3, flags), 0);  // nothing to do comes first
        EXPECT_TRUE(t_unzpad(&v, 3, flags) == 0 && v->points == 3 && t_zpad2(&v, 5, flags) == -1);
        EXPECT_TRUE(v->points == 5 && v->alloc >= 5 && (std::vector<T>{v[0], v[1], v[2]}) == (std::vector<T>{1, 2, 3}));  // grown
        const auto before = v.values();
        EXPECT_TRUE(t_unzpad(&v, 2, flags) == -1 && v->points == 5 && v.values() == before);
    }
}


}  // namespace

// A wrapped ramp comes back whole (less the turns putting its start within pi of 0), plain and by windows.
TYPED_TEST(Layout, UnwrapRestoresRamp) {
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

// Fixed results, bit for bit.
TYPED_TEST(Layout, PhaseFixedCases) {
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
        {"edge, rising", [](auto* v) { return t_edge(v, 1, T(1)); }, {0, 2, 1, 2}, false, 0.5, {0.25, 1}, 2, 0, 1},
        {"edge, falling", [](auto* v) { return t_edge(v, 2, T(1)); }, {0, 2, 1, 1, 0}, false, 0.5, {1.5}, 1, 0, 1},
        {"edge, both", [](auto* v) { return t_edge(v, 3, T(1)); }, {0, 2, 1, 1, 0}, false, 0.5, {0.25, 1.5}, 2, 0, 1},
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
}
