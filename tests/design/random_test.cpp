// Noise: the order of the masked rand() draws, moments of a million samples, uniform permutations.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {
VLX_TWIN(c, rand) VLX_TWIN(i, shuffle)

VLX_TYPED_SUITE(Random);

// The widened uniform draw from the low 15 bits of each rand() value.
template <class V>
real_of<V> reference_uniform() {
    real_of<V> r = real_of<V>(std::rand() & 0x7FFF);
    for (int i = 0; i < (is_double<V> ? 3 : 1); ++i) r = real_of<V>(std::rand() & 0x7FFF) + r * real_of<V>(0x1p-15);
    return r * real_of<V>(0x1p-15);
}

TYPED_TEST(Random, SamplesAreTheMaskedDrawsInOrder) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> v({0, 0, 0, 0, 0, 0});
    ASSERT_EQ(t_rand(&v, 0), 0);  // the family seeds here, and never again
    for (int32_t kind : {0, 3}) {
        std::srand(2024);
        ASSERT_EQ(t_rand(&v, kind), 0);
        std::srand(2024);
        for (int k = 0; k < 6; ++k) {
            // Laplace: three draws of which only bit 14 of the last gives the sign
            const bool negative = kind == 3 && (std::rand(), std::rand(), std::rand() & 0x4000) != 0;
            const T u = reference_uniform<TypeParam>(), e = std::log(u);
            EXPECT_TRUE(same_bits(v[k], kind == 0 ? u * T(2) - T(1) : negative ? e : -e)) << kind << " " << k;
        }
    }
}

TYPED_TEST(Random, KindsMomentsAndTheUnitDisc) {
    // per scalar: mean, variance, central fourth moment, all within 5 standard errors
    const struct { int32_t kind, is_complex; double mean = 0, var = 0, mu4 = 0; } table[] = {
        {0, 0, 0, 1.0 / 3, 1.0 / 5}, {0, 1, 0, 0.25, 0.125}, {1, 0, 0, 1, 3}, {1, 1, 0, 1, 3}, {2, 0, 1, 1, 9},
        {3, 0, 0, 2, 24},            {2, 1},                 {3, 1},          {4, 0},          {-1, 0}};
    for (const auto& c : table) {
        Vec<TypeParam> v;
        v->points = 999999, v->complex = c.is_complex;  // odd: the last Gaussian pair keeps one
        const int32_t fails = t_rand(&v, c.kind);
        EXPECT_EQ(fails, c.var == 0 ? -1 : 0) << "kind " << c.kind << " complex " << c.is_complex;
        if (fails) continue;
        const int64_t n = v.scalars();
        long double sum = 0, sq = 0;
        bool in_range = true;
        for (int64_t i = 0; i < n; ++i) {
            sum += v[i], sq += (long double)(v[i] - c.mean) * (v[i] - c.mean);
            in_range &= std::isfinite(v[i]) && (c.kind != 2 || v[i] > 0) &&
                        (c.kind != 0 || (c.is_complex ? i % 2 == 0 || v[i - 1] * v[i - 1] + v[i] * v[i] < 1
                                                      : v[i] >= -1 && v[i] < 1));
        }
        EXPECT_TRUE(in_range && near(sum / n, c.mean, 5 * std::sqrt(c.var / n)) &&
                    near(sq / n, c.var, 5 * std::sqrt((c.mu4 - c.var * c.var) / n)))
            << "kind " << c.kind << " complex " << c.is_complex;
    }
}

TYPED_TEST(Random, ShuffleIsAUniformPermutationKeepingPairs) {
    using T = real_of<TypeParam>;
    constexpr int n = 8, trials = 40000;
    double counts[n][n] = {}, chi2 = 0;
    for (int t = 0; t < trials; ++t) {
        Vec<TypeParam> v({0, -0, 1, -1, 2, -2, 3, -3, 4, -4, 5, -5, 6, -6, 7, -7}, true);
        ASSERT_EQ(t_shuffle(&v), 0);
        int seen = 0;
        for (int pos = 0; pos < n; ++pos) {
            const int k = int(v[2 * pos]);
            seen |= (k == (k & 7) && v[2 * pos + 1] == T(-k)) << (k & 7), counts[pos][k & 7] += 1;
        }
        ASSERT_EQ(seen, 255) << "not a permutation of pairs";
    }
    // chi-square of the positions, 49 degrees of freedom; 110 is past its 1e-6 tail
    for (auto& row : counts)
        for (double c : row) chi2 += (c - trials / n) * (c - trials / n) / (trials / n);
    Vec<TypeParam> one({T(5)});
    EXPECT_TRUE(chi2 < 110 && t_shuffle(&one) == 0 && one[0] == T(5)) << chi2;
}

}  // namespace
