// Layout operations through the public interface, both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <climits>

using namespace vlxtest;

namespace {

VLX_TWIN(i, real) VLX_TWIN(i, imag) VLX_TWIN(i, rev) VLX_TWIN(i, shift) VLX_TWIN(i, zpad2) VLX_TWIN(i, unzpad)
VLX_TWIN(i, zinter) VLX_TEST_TWIN(t_swap, vlxi_swap_halves, vlxfi_swap_halves)
VLX_TEST_TWIN(t_swap2, vlxi_swap_halves2, vlxfi_swap_halves2) VLX_TEST_TWIN(t_uzinter, vlxu_zinter, vlxfu_zinter)

// Sample k of a vector as (re, im); im is 0 for a real vector.
template <class V>
std::pair<real_of<V>, real_of<V>> sample(Vec<V>& v, int64_t k) {
    if (v->complex) return {v[2 * k], v[2 * k + 1]};
    return {v[k], real_of<V>(0)};
}

VLX_TYPED_SUITE(Layout);

TYPED_TEST(Layout, RealAndImaginaryParts) {
    using R = std::vector<real_of<TypeParam>>;
    Vec<TypeParam> c({1, -2, 3, -4, 5, -6}, true), d({1, -2, 3, -4, 5, -6}, true), r({7, 8, 9}), q({7, 8, 9});
    ASSERT_TRUE(t_real(&c) == 0 && t_imag(&d) == 0 && t_real(&r) == 0 && t_imag(&q) == 0);
    EXPECT_TRUE(c.values() == (R{1, 3, 5}) && c->alloc == 6 && d.values() == (R{-2, -4, -6}) && d->complex == 0);
    EXPECT_TRUE(r.values() == (R{7, 8, 9}) && q.values() == (R{0, 0, 0}));  // the imaginary part of a real signal is 0
}

// Reversal, the two half rotations and the shift against their index formulas, on both parities and lengths past the
// vector loops' widths.
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

// Padding then unpadding restores the input for every layout, scale mode and a grid of lengths; on the way the padded
// samples sit where a spectrum or a centred record expects them.
TYPED_TEST(Layout, PadAndUnpadAreInverse) {
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
}

TYPED_TEST(Layout, InvalidFlagsAreSeenAfterGrowingAndBeforeUnpadding) {
    using V = TypeParam; using T = real_of<V>;
    for (int32_t flags : {3, VLX_PAD_SPLIT | 3, 0x400, 0x500, 0x600, 0x700 | VLX_PAD_SCALE_NONE}) {
        Vec<V> v({1, 2, 3});
        EXPECT_EQ(t_zpad2(&v, 3, flags), 0);  // nothing to do comes first
        EXPECT_TRUE(t_unzpad(&v, 3, flags) == 0 && v->points == 3 && t_zpad2(&v, 5, flags) == -1);
        EXPECT_EQ(v->points, 5);  // grown, new samples unset
        EXPECT_GE(v->alloc, 5);
        EXPECT_EQ((std::vector<T>{v[0], v[1], v[2]}), (std::vector<T>{1, 2, 3}));
        const auto before = v.values();
        EXPECT_TRUE(t_unzpad(&v, 2, flags) == -1 && v->points == 5 && v.values() == before);
    }
}

// Zeros between the samples halve delta; the complex form scales, into itself or into another vector.
TYPED_TEST(Layout, ZeroInterleave) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> r({1, 2}), c({1, 2, 3, 4}, true), d;
    r->delta = 3;
    ASSERT_TRUE(t_zinter(&r) == 0 && t_uzinter(&c, &d, T(2)) == 0 && t_uzinter(&c, &c, T(2)) == 0);
    EXPECT_TRUE(r.values() == (std::vector<T>{1, 0, 2, 0}) && r->delta == T(1.5));
    const std::vector<T> want{2, 4, 0, 0, 6, 8, 0, 0};
    EXPECT_TRUE(c.values() == want && d.values() == want && d->complex == 1);
}

}  // namespace
