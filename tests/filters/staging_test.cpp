// Filter staging, the decimator and the tolerant point counts, both families.
#include "vlx_test.hpp"

#include <climits>

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_deci, vlxd_deci, vlxfd_deci) VLX_TEST_TWIN(t_stage, vlx_stage_io, vlxf_stage_io)
VLX_TEST_TWIN(t_unstage, vlx_unstage_io, vlxf_unstage_io)

VLX_TYPED_SUITE(Staging);

// Blocks fed one after another give one long call's samples exactly, whatever the split: every factor-th sample.
TYPED_TEST(Staging, BlockFedDecimationEqualsOneCall) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t total = 97;
    for (bool cx : {false, true})
        for (int32_t factor : {-2, 0, 1, 2, 3, 4, 7, 16, 100})
            for (uint32_t split_seed = 0; split_seed < 12; ++split_seed) {
                const int64_t w = cx ? 2 : 1;
                const auto x = random_values<T>(size_t(total * w), 42);
                const int32_t f = factor < 1 ? 1 : factor;
                std::vector<T> want;
                for (int64_t k = 0; k < total; k += f)
                    for (int64_t c = 0; c < w; ++c) want.push_back(x[size_t(k * w + c)]);
                Vec<V> hist;  // empty: starts from silence; odd blocks decimate in place
                const auto got = in_blocks<V>(x, cx, split_seed, [&](V* in, V* out) {
                    in->delta = T(0.5);
                    const int32_t r = t_deci(in, out, factor, hist.get());
                    EXPECT_TRUE(out->complex == (cx ? 1 : 0) && out->delta == (T(f) * T(0.5)));
                    return r;
                }, true, 23);
                EXPECT_EQ(got, want) << "factor " << factor << " split " << split_seed << " cx " << cx;
                EXPECT_EQ(hist->complex, cx ? 1 : 0);
            }
}

// The stored count still to drop, on blocks of 0, 1, 2, ...; without a history each block starts at its first sample.
TYPED_TEST(Staging, DecimationSkipCount) {
    using V = TypeParam; using T = real_of<V>;
    struct Case { T stored; int32_t n, factor, points; T first, next; };
    const Case cases[] = {
        {7, 5, 3, 0, -1, 2},  // the whole block is still to be dropped
        {0, 10, 4, 3, 0, 2}, {0, 0, 4, 0, -1, 0},
        {-3, 4, 2, 2, 0, 0},  // a negative count is 0
        {1.4f, 6, 2, 3, 1, 1}, {1.5f, 6, 2, 2, 2, 0},  // counts round to nearest
    };
    for (const Case& c : cases) {
        std::vector<T> x(size_t(c.n));
        for (int32_t i = 0; i < c.n; ++i) x[size_t(i)] = T(i);
        Vec<V> in(x, false), out, hist({c.stored});
        ASSERT_EQ(t_deci(in.get(), out.get(), c.factor, hist.get()), 0);
        EXPECT_TRUE(out->points == c.points && (c.points == 0 || out[0] == c.first) && hist[0] == c.next) << c.stored << " " << c.n;
    }
    Vec<V> in({1, 2, 3, 4, 5}), dst;
    ASSERT_EQ(t_deci(in.get(), in.get(), 2, static_cast<V*>(nullptr)), 0);
    EXPECT_EQ(in.values(), (std::vector<T>{1, 3, 5}));
    FailingAlloc<V> failing;  // a failed destination is left empty
    EXPECT_TRUE(t_deci(in.get(), dst.get(), 1, static_cast<V*>(nullptr)) == -1 && dst->points == 0);
}

// The history takes the source's type and keeps its surplus; a destination sharing the source's storage (two empty
// vectors included) is filled through a temporary that unstaging delivers, and without one the call fails.
TYPED_TEST(Staging, HistoryAndAliasedDestination) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> in({1, 2, 3, 4}, true), out, hist({9, 8, 7, 6, 5}), a, b;
    in->delta = T(0.25);
    V *hp = hist.get(), *op = out.get(), tmp, *saved = nullptr;
    ASSERT_EQ(t_stage(in.get(), &op, nullptr, &hp, 3, 0, nullptr, nullptr, nullptr), 0);
    EXPECT_TRUE(has_shape(hist.get(), 5, 1, 0.25) && hist[2] == T(8) && hist[3] == T(0) && has_shape(out.get(), 2, 1, 0.25));
    Vec<V> v({1, 2, 3});
    v->points = 2, op = v.get();
    int32_t aliased = -7;
    ASSERT_TRUE(t_stage(v.get(), &op, nullptr, nullptr, 0, VLX_STAGE_ALIAS | VLX_STAGE_KEEP_POINTS, &aliased, &tmp, &saved) == 0 &&
                aliased == 1 && saved == v.get() && op == &tmp && tmp.points == 2);
    for (int32_t i = 0; i < 2; ++i) tmp.data[i] = v[i] * T(10);  // the kernel reads the source
    ASSERT_EQ(t_unstage(op, aliased, saved), 0);
    EXPECT_TRUE(tmp.data == nullptr && v->points == 2 && v[0] == T(10) && v[1] == T(20));
    op = b.get();
    ASSERT_EQ(t_stage(a.get(), &op, nullptr, nullptr, 0, VLX_STAGE_ALIAS, nullptr, nullptr, nullptr), -1);
    ASSERT_EQ(t_stage(a.get(), &op, nullptr, nullptr, 0, VLX_STAGE_ALIAS, &aliased, &tmp, &saved), 0);
    EXPECT_TRUE(aliased == 1 && t_unstage(op, 1, static_cast<V*>(nullptr)) == -1 && t_unstage(op, 1, saved) == 0);
    EXPECT_EQ(t_unstage(a.get(), 0, static_cast<V*>(nullptr)), 0);
}

TEST(PointCounts, NearlyEqualCeilAndFloor) {
    const struct { double a, b; int32_t want; } equal[] = {
        {0.0, 1e-310, 1}, {1e-300, 0.0, 0}, {1.0, 1.0 + 4e-15, 1}, {1.0, 1.0 + 5e-15, 0}, {-2.0, -2.0, 1},
        {2.0, -2.0, 0},   {NAN, NAN, 0},    {1.0, NAN, 0},         {4.4e-307, -4.4e-307, 1}};
    for (const auto& c : equal) EXPECT_EQ(vlx_nearly_equal(c.a, c.b), c.want) << c.a << " " << c.b;
    // the float allowance is 7 epsilons
    EXPECT_TRUE(vlxf_nearly_equal(1.0f, 1.0000007f) == 1 && vlxf_nearly_equal(1.0f, 1.000001f) == 0);
    EXPECT_TRUE(vlxf_nearly_equal(0.0f, 2e-37f) == 1 && vlxf_nearly_equal(3e-37f, 0.0f) == 0);
    struct Case { double x; int32_t ceil, floor; };
    const Case cases[] = {
        {2.0000000000000004, 2, 2}, {1.9999999999999998, 2, 2}, {2.01, 3, 2}, {1.99, 2, 1}, {1e-20, 0, 0},
        {0.5, 1, 0}, {-0.1, 0, 0}, {-1e9, 0, 0}, {NAN, 0, 0}, {3e9, INT_MAX, INT_MAX}, {2147483647.0, INT_MAX, INT_MAX}};
    for (const Case& c : cases) EXPECT_TRUE(vlx_ceil_pts(c.x) == c.ceil && vlx_floor_pts(c.x) == c.floor) << c.x;
    const Case fcases[] = {{2.0000002, 2, 2}, {1.9999999, 2, 2}, {20000.004, 20000, 20000}, {20000.02, 20001, 20000},
                           {2147483648.0, INT_MAX, INT_MAX}, {-3.0, 0, 0}, {0.25, 1, 0}};
    for (const Case& c : fcases) EXPECT_TRUE(vlxf_ceil_pts(float(c.x)) == c.ceil && vlxf_floor_pts(float(c.x)) == c.floor) << c.x;
}

}  // namespace
