// Every vector path of the power-of-two engines gives the scalar path's bits.
#include "fft_reference.hpp"

using namespace vlxtest;
using namespace fftref;

namespace {

VLX_TYPED_SUITE(Lanes);

// Complex transforms in both directions, the real transform, and the plain
// and scaled reorderings, at the given lane level.
template <class V>
std::vector<std::vector<real_of<V>>> run_all(int32_t level, const std::vector<real_of<V>>& in) {
    EXPECT_EQ(vlx_transform_lanes(level), level);
    std::vector<std::vector<real_of<V>>> out;
    for (int inverse = 0; inverse <= 1; ++inverse) {
        Vec<V> c(in, true);
        EXPECT_EQ(t_fft(&c, inverse), 0);
        out.push_back(c.values());
    }
    Vec<V> r(std::vector<real_of<V>>(in.begin(), in.begin() + in.size() / 2), false);
    EXPECT_EQ(t_rfft(&r), 0);
    out.push_back(r.values());
    Vec<V> b(in, true), s(in, true);
    EXPECT_EQ(t_bitrev(&b), 0);
    EXPECT_EQ(t_bitrev_scale(&s), 0);
    out.push_back(b.values());
    out.push_back(s.values());
    return out;
}

TYPED_TEST(Lanes, EveryPathMatchesScalarBitForBit) {
    using T = real_of<TypeParam>;
    const int32_t widest = vlx_transform_lanes(2);
    for (int m = 2; m <= 20; ++m) {
        const size_t n = size_t(1) << m;
        std::vector<T> in = random_values<T>(2 * n, 500 + m);
        in[3] = T(-0.0);  // signed zeros and a subnormal travel too
        in[5] = std::numeric_limits<T>::denorm_min();
        const auto want = run_all<TypeParam>(0, in);
        for (int32_t level = 1; level <= widest; ++level) {
            const auto got = run_all<TypeParam>(level, in);
            for (size_t i = 0; i < want.size(); ++i)
                EXPECT_TRUE(same_scalars(got[i], want[i])) << "n = " << n << ", lanes " << level << ", case " << i;
        }
    }
    vlx_transform_lanes(2);
}

// The real transform's one-pass leaves take the vector's storage in another
// order than the scalar path (grown first, reordered on the way): lent
// samples and a failed enlargement must still end as the scalar path leaves them.
TYPED_TEST(Lanes, RealTransformLeavesStorageAsScalarPathDoes) {
    using T = real_of<TypeParam>;
    const int32_t widest = vlx_transform_lanes(2);
    const std::vector<T> in = random_values<T>(512, 77);
    auto run = [&](int32_t level) {
        vlx_transform_lanes(level);
        std::vector<T> lent = in, out;
        TypeParam v;
        t_init(&v);
        v.data = lent.data(), v.points = 512, v.complex = 0, v.alloc = 0;
        const int32_t status = t_rfft(&v);
        out.assign(v.data, v.data + 2 * v.points);
        t_destroy(&v);
        Vec<TypeParam> failing(in, false);
        int32_t failed;
        {
            FailingAlloc<TypeParam> no_storage;
            failed = t_rfft(&failing);
        }
        out.insert(out.end(), lent.begin(), lent.end());
        out.insert(out.end(), {T(status), T(failed), T(failing->points), T(failing->complex)});
        return out;
    };
    const auto want = run(0);
    for (int32_t level = 1; level <= widest; ++level) {
        const auto got = run(level);
        EXPECT_TRUE(got.size() == want.size() && std::memcmp(got.data(), want.data(), want.size() * sizeof(T)) == 0)
            << "lanes " << level;
    }
    vlx_transform_lanes(2);
}

}  // namespace
