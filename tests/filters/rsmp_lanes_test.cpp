// The resampler's vector lanes against its scalar route, bit for bit.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_rsmp, vlxd_rsmp, vlxfd_rsmp) VLX_TEST_TWIN(t_table, vlxc_rsmp, vlxfc_rsmp)

VLX_TYPED_SUITE(ResampleLanes);

// Random ratios both ways, both methods, real and complex, blocks of random length carried by the history (short
// ones stay in it), and output counts cut short: every output and history scalar matches.
TYPED_TEST(ResampleLanes, SameBitsAsScalar) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> table;
    table->points = 13314;  // 13 taps: windows end inside a register
    ASSERT_EQ(t_table(table.get(), 4), 0);
    std::mt19937 rng(7);
    for (int trial = 0; trial < 24; ++trial) {
        const bool cx = trial % 3 == 2;
        const int32_t method = cx ? 1 : trial % 2, cap = int32_t(rng() % 50);
        const T ratio = T(std::uniform_real_distribution<double>(trial % 4 ? 0.3 : 0.999, 2.5)(rng));
        const auto x = random_values<T>(size_t(3000 * (cx ? 2 : 1)), uint32_t(trial));
        std::vector<T> got[2], past[2];
        for (int32_t lanes : {0, 1}) {
            EXPECT_LE(vlx_filter_lanes(lanes), lanes);
            Vec<V> hist;
            got[lanes] = in_blocks<V>(x, cx, uint32_t(trial), [&](V* in, V* out) {
                out->points = trial % 5 ? 100000 : cap;
                return t_rsmp(in, out, method, table.get(), ratio, hist.get());
            }, false, 400);
            past[lanes] = hist.values();
        }
        EXPECT_TRUE(same_scalars(got[1], got[0]) && same_scalars(past[1], past[0])) << "trial " << trial;
    }
    vlx_filter_lanes(1);
}

}  // namespace
