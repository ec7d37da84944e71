// Real transforms, half spectra and their reconstruction.
#include "fft_reference.hpp"

using namespace vlxtest;
using namespace fftref;

namespace {

VLX_TYPED_SUITE(RealFft);

// The vectorised engine against the literal recipe, bit for bit.
TYPED_TEST(RealFft, MatchesLiteralEngineBitForBit) {
    using T = real_of<TypeParam>;
    for (int m = 2; m <= 16; ++m) {
        const std::vector<T> in = random_values<T>(size_t(1) << m, 300 + m);
        const std::vector<T> want = literal_rfft(in);
        Vec<TypeParam> v(in, false);
        ASSERT_TRUE(t_rfft(&v) == 0 && v.scalars() == int64_t(want.size()));
        size_t mismatches = 0;
        for (size_t i = 0; i < want.size(); ++i) mismatches += !same_bits(v[int64_t(i)], want[i]);
        EXPECT_EQ(mismatches, 0u) << "n = " << in.size();
    }
}

TYPED_TEST(RealFft, ExactSmallLengths) {
    using T = real_of<TypeParam>;
    struct Case { std::vector<T> in; std::vector<T> out; };
    const Case cases[] = {
        {{1, 3}, {2, 0, -1, 0}}, {{1, 2, 3, 4}, {2.5, 0, -0.5, 0.5, -0.5, 0}},
        {{1, 1, 1, 1, 1, 1, 1, 1}, {1, 0, 0, 0, 0, 0, 0, 0, 0, 0}},
        {{8, 0, 0, 0, 0, 0, 0, 0}, {1, 0, 1, 0, 1, 0, 1, 0, 1, 0}},
    };
    for (const Case& c : cases) {
        Vec<TypeParam> v(c.in, false);
        v->delta = T(0);
        ASSERT_EQ(t_rfft(&v), 0);
        EXPECT_TRUE((v->complex == 1 && v.values() == c.out) && v->delta == bound_of<TypeParam>());
    }
    // A vector with room for its 8 real samples grows to the 16 scalars the transform works in, although only 5
    // points remain.
    Vec<TypeParam> v(random_values<T>(8, 2), false);
    ASSERT_TRUE(v->alloc == 8 && t_rfft(&v) == 0);
    EXPECT_TRUE(v->alloc == 16 && v->points == 5);
}

TYPED_TEST(RealFft, Reconstruction) {
    using T = real_of<TypeParam>;
    struct Case { std::vector<T> in; bool cplx; int odd; std::vector<T> out; };
    const Case cases[] = {
        {{1, 2, 3, 4}, true, 0, {1, 2, 3, 4}},                  // 2 points: nothing to mirror
        {{1, 2, 3, 4}, true, 1, {1, 2, 3, 4, 3, -4}},           // odd: point 1 mirrored
        {{7, 0}, true, 1, {7, 0}},                               // a single point stays
        {{0, 0, 1, 1, 2, 2, 3, 3, 4, 0}, true, 0, {0, 0, 1, 1, 2, 2, 3, 3, 4, 0, 3, -3, 2, -2, 1, -1}},
        {{0, 0, 1, 1, 2, 2}, true, 1, {0, 0, 1, 1, 2, 2, 2, -2, 1, -1}},
        {{0, 1, 2, 3}, false, 0, {0, 1, 2, 3, 2, 1}},           // real: mirrored as is
        {{0, 1, 2}, false, 1, {0, 1, 2, 2, 1}},
    };
    for (const Case& c : cases) {
        Vec<TypeParam> v(c.in, c.cplx);
        v->delta = T(2);
        ASSERT_EQ(t_orecon(&v, c.odd), 0);
        EXPECT_EQ(v.values(), c.out) << c.in.size() << " scalars, odd " << c.odd;
        EXPECT_EQ(v->delta, T(2));
        if (c.odd == 0) {
            Vec<TypeParam> w(c.in, c.cplx);
            ASSERT_EQ(t_recon(&w), 0);
            EXPECT_EQ(w.values(), c.out);
        }
    }
}

}  // namespace
