// The power-of-two transforms, complex and real, the reorderings and the reconstruction of half spectra.
#include "fft_reference.hpp"

using namespace vlxtest;
using namespace fftref;

namespace {

VLX_TYPED_SUITE(Fft);

// The vectorised engines do the literal recipes' arithmetic bit for bit, also where the tables restart (n/8 > 257).
TYPED_TEST(Fft, MatchesLiteralEnginesBitForBit) {
    using T = real_of<TypeParam>;
    for (int m = 2; m <= 16; ++m) {
        const size_t n = size_t(1) << m;
        for (int inverse = 0; inverse <= 1; ++inverse) {
            const std::vector<T> input = random_values<T>(2 * n, 100 + m);
            std::vector<T> want = input;
            literal_fft(want, inverse != 0);
            Vec<TypeParam> v(input, true);
            ASSERT_EQ(t_fft(&v, inverse), 0);
            EXPECT_TRUE(same_scalars(v.values(), want)) << "n = " << n << " inverse = " << inverse;
        }
        const std::vector<T> in = random_values<T>(n, 300 + m);
        Vec<TypeParam> v(in, false);
        ASSERT_EQ(t_rfft(&v), 0);
        EXPECT_TRUE(same_scalars(v.values(), literal_rfft(in))) << "real, n = " << n;
    }
}

// Exact in both precisions; the real transform keeps N/2 + 1 bins (one point stays real), delta 0 takes the fallback.
TYPED_TEST(Fft, ExactSmallLengths) {
    using T = real_of<TypeParam>;
    struct Case { std::vector<T> in; bool in_complex; int inverse; std::vector<T> out; bool out_complex; };
    const Case cases[] = {
        {{5}, false, 0, {5}, false},                     // one real point stays real
        {{5, -2}, true, 1, {5, -2}, true},               // one complex point unchanged
        {{1, 3}, false, 0, {2, 0, -1, 0}, true},         // halved, then sum and difference
        {{2, 0, -1, 0}, true, 1, {1, 0, 3, 0}, true},
        {{1, 1, 1, 1, 1, 1, 1, 1}, false, 0, {1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0}, true},
        {{8, 0, 0, 0, 0, 0, 0, 0}, false, 0, {1, 0, 1, 0, 1, 0, 1, 0, 1, 0, 1, 0, 1, 0, 1, 0}, true},
    };
    for (const Case& c : cases) {
        Vec<TypeParam> v(c.in, c.in_complex), r(c.in, false);
        ASSERT_EQ(t_fft(&v, c.inverse), 0);
        EXPECT_TRUE((v->complex != 0) == c.out_complex && v.values() == c.out) << "input of " << c.in.size() << " scalars";
        if (c.in_complex) continue;
        r->delta = T(0);
        const size_t half = c.in.size() > 1 ? c.in.size() + 2 : 1;
        ASSERT_TRUE(t_rfft(&r) == 0 && r->complex == (half > 1 ? 1 : 0) && r->delta == bound_of<TypeParam>());
        EXPECT_EQ(r.values(), std::vector<T>(c.out.begin(), c.out.begin() + half)) << "real input of " << c.in.size();
    }
    // With room for 8 real samples, both grow to the 16 scalars they work in, although the real one keeps 5 points.
    Vec<TypeParam> r(random_values<T>(8, 2), false), f(random_values<T>(8, 2), false);
    ASSERT_TRUE(r->alloc == 8 && t_rfft(&r) == 0 && t_fft(&f, 0) == 0);
    EXPECT_TRUE(r->alloc == 16 && r->points == 5 && f->alloc == 16 && f->points == 8);
}

// Not a power of two: -1 and the vector untouched, for transforms and reorderings; rfft also refuses complex input.
TYPED_TEST(Fft, RejectsOtherLengths) {
    using T = real_of<TypeParam>;
    for (int points : {0, 3, 6, 12, 1000}) {
        for (int cplx = 0; cplx <= 1; ++cplx) {
            const std::vector<T> in = random_values<T>(size_t(points) * (cplx + 1), 5);
            Vec<TypeParam> v(in, cplx != 0), r(in, cplx != 0), b(in, cplx != 0), s(in, cplx != 0);
            v->delta = T(0.25);
            EXPECT_TRUE(t_fft(&v, 0) == -1 && (has_shape(v.get(), points, cplx, 0.25) && v.values() == in));
            EXPECT_TRUE(t_rfft(&r) == -1 && has_shape(r.get(), points, cplx, 1) && r.values() == in);
            EXPECT_TRUE(t_bitrev(&b) == -1 && t_bitrev_scale(&s) == -1 && b.values() == in && s.values() == in);
        }
    }
    Vec<TypeParam> v, c(random_values<T>(8, 4), true);
    v->points = -4;
    EXPECT_TRUE(t_fft(&v, 1) == -1 && t_rfft(&c) == -1 && c->points == 4 && c->complex == 1);
}

// Reversed indices, real and complex, past 1 MB of samples; the scaled form multiplies by 1/N once; twice is identity.
TYPED_TEST(Fft, BitrevPermutesAndScales) {
    using T = real_of<TypeParam>;
    for (int m = 0; m <= 18; ++m)
        for (int cplx = 0; cplx <= 1; ++cplx) {
            const size_t n = size_t(1) << m, w = cplx ? 2 : 1;
            const std::vector<T> in = random_values<T>(n * w, 20 + m);
            std::vector<T> want(in.size()), scaled(in.size());
            for (size_t i = 0; i < n * w; ++i) {
                want[reverse_index(i / w, m) * w + i % w] = in[i];
                scaled[reverse_index(i / w, m) * w + i % w] = in[i] * (T(1) / T(n));
            }
            Vec<TypeParam> plain(in, cplx), s(in, cplx);
            plain->delta = T(3);
            ASSERT_TRUE(t_bitrev(&plain) == 0 && t_bitrev_scale(&s) == 0 && has_shape(plain.get(), int32_t(n), cplx, 3));
            EXPECT_TRUE(same_scalars(plain.values(), want) && same_scalars(s.values(), scaled)) << n << " " << cplx;
            EXPECT_TRUE(t_bitrev(&plain) == 0 && plain.values() == in);
        }
}

TYPED_TEST(Fft, RealReconstruction) {
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
        ASSERT_EQ(c.odd ? t_orecon(&v, 1) : t_recon(&v), 0);  // recon is the even form
        EXPECT_TRUE(v.values() == c.out && v->delta == T(2)) << c.in.size() << " scalars, odd " << c.odd;
    }
}

}  // namespace
