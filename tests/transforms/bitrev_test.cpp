// Reordering into bit-reversed order, plain and scaled by 1/N.
#include "fft_reference.hpp"

using namespace vlxtest;
using namespace fftref;

namespace {

VLX_TYPED_SUITE(Bitrev);

// Every point lands at its reversed index, real and complex alike; the scaled form multiplies each sample by 1/N
// exactly once; twice is identity.
TYPED_TEST(Bitrev, PermutesAndScales) {
    using T = real_of<TypeParam>;
    for (int m = 0; m <= 18; ++m) {  // past 1 MB of samples in every layout
        const size_t n = size_t(1) << m;
        for (int cplx = 0; cplx <= 1; ++cplx) {
            const size_t width = cplx ? 2 : 1;
            const std::vector<T> in = random_values<T>(n * width, 20 + m);
            Vec<TypeParam> plain(in, cplx), scaled(in, cplx);
            plain->delta = T(3);
            ASSERT_TRUE(t_bitrev(&plain) == 0 && t_bitrev_scale(&scaled) == 0);
            EXPECT_TRUE(plain->delta == T(3) && plain->points == int32_t(n) && plain->complex == cplx);
            const T f = T(1) / T(n);
            size_t wrong = 0;
            for (size_t i = 0; i < n; ++i) {
                const size_t r = reverse_index(i, m);
                for (size_t c = 0; c < width; ++c) {
                    wrong += !same_bits(plain[int64_t(r * width + c)], in[i * width + c]);
                    wrong += !same_bits(scaled[int64_t(r * width + c)], T(in[i * width + c] * f));
                }
            }
            EXPECT_EQ(wrong, 0u) << "n = " << n << " complex = " << cplx;
            ASSERT_EQ(t_bitrev(&plain), 0);
            EXPECT_EQ(plain.values(), in);
        }
    }
}

TYPED_TEST(Bitrev, RejectsOtherLengths) {
    using T = real_of<TypeParam>;
    for (int points : {0, 3, 5, 24}) {
        const std::vector<T> in = random_values<T>(size_t(points), 1);
        Vec<TypeParam> a(in, false), b(in, false);
        EXPECT_TRUE(t_bitrev(&a) == -1 && t_bitrev_scale(&b) == -1 && a.values() == in && b.values() == in);
    }
}

}  // namespace
