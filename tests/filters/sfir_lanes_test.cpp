// The symmetric kernels' vector lanes against their scalar sums, both families.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {

VLX_TWIN(d, sfir) VLX_TWIN(d, sfir_deci)

VLX_TYPED_SUITE(SfirLanes);

// Streams in random blocks (some shorter than the filter, some in place), with and without history, every odd/anti
// pairing, real and complex sources, plain and decimating by 1, 2, 3 and 7: outputs and the final history keep the
// scalar bits with the lanes on.
TYPED_TEST(SfirLanes, LanesKeepScalarBits) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t widest = vlx_filter_lanes(-1);
    const auto stream = [](int32_t lanes, int32_t m, int kind, int32_t factor) {
        EXPECT_EQ(vlx_filter_lanes(lanes), lanes);
        const bool odd = kind & 1, anti = kind & 2, xc = kind & 4;
        const auto x = random_values<T>(size_t(1500 * (xc ? 2 : 1)), uint32_t(m * 8 + kind));
        Vec<V> filter(random_values<T>(size_t(m), uint32_t(m)), false), hist;
        V* past = (m + factor) % 2 ? hist.get() : nullptr;
        auto got = in_blocks<V>(x, xc, uint32_t(kind + factor), [&](V* in, V* out) {
            return factor ? t_sfir_deci(in, out, &filter, odd, anti, factor, past) : t_sfir(in, out, &filter, odd, anti, past);
        }, true, 400);
        const auto kept = hist.values();
        got.insert(got.end(), kept.begin(), kept.end());
        return got;
    };
    for (int32_t m : {1, 2, 12, 20, 31, 60})
        for (int kind = 0; kind < 8; ++kind)
            for (int32_t factor : {0, 1, 2, 3, 7})
                EXPECT_TRUE(same_scalars(stream(widest, m, kind, factor), stream(0, m, kind, factor)))
                    << "m " << m << " kind " << kind << " factor " << factor;
    vlx_filter_lanes(widest);
}

}  // namespace
