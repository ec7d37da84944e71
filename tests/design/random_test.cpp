// Noise: the exact order of the masked rand() draws, moments of a million
// samples within their confidence bounds, and uniform permutations.
#include "vlx_test.hpp"

#include <algorithm>

using namespace vlxtest;

namespace {
VLX_TWIN(c, rand)
VLX_TWIN(i, shuffle)

template <class V>
class Random : public ::testing::Test {};
TYPED_TEST_SUITE(Random, Families);

// The widened uniform draw from the low 15 bits of each rand() value.
template <class V>
real_of<V> reference_uniform() {
    if constexpr (is_double<V>) {
        double r = std::rand() & 0x7FFF;
        for (int i = 0; i < 3; ++i) r = double(std::rand() & 0x7FFF) + r * 0x1p-15;
        return r * 0x1p-15;
    } else {
        const float r = float(std::rand() & 0x7FFF);
        return (float(std::rand() & 0x7FFF) + r * 0x1p-15f) * 0x1p-15f;
    }
}

TYPED_TEST(Random, SamplesAreTheMaskedDrawsInOrder) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> v;
    v->points = 1;
    ASSERT_EQ(t_rand(&v, 0), 0);  // the family seeds here, and never again
    v->points = 6;
    std::srand(2024);
    ASSERT_EQ(t_rand(&v, 0), 0);
    std::srand(2024);
    for (int k = 0; k < 6; ++k) EXPECT_TRUE(same_bits(v[k], reference_uniform<TypeParam>() * T(2) - T(1))) << k;
    // Laplace: three draws of which only bit 14 of the last gives the sign
    std::srand(77);
    ASSERT_EQ(t_rand(&v, 3), 0);
    std::srand(77);
    for (int k = 0; k < 6; ++k) {
        std::rand(), std::rand();
        const bool negative = (std::rand() & 0x4000) != 0;
        const T e = std::log(reference_uniform<TypeParam>());
        EXPECT_TRUE(same_bits(v[k], negative ? e : -e)) << k;
    }
}

TYPED_TEST(Random, MomentsOfAMillionSamplesAndTheUnitDisc) {
    // per scalar: mean, variance and central fourth moment of the kind
    const struct { int32_t kind, is_complex; double mean, var, mu4; } table[] = {
        {0, 0, 0, 1.0 / 3, 1.0 / 5}, {0, 1, 0, 0.25, 0.125}, {1, 0, 0, 1, 3},
        {1, 1, 0, 1, 3},             {2, 0, 1, 1, 9},        {3, 0, 0, 2, 24}};
    for (const auto& c : table) {
        Vec<TypeParam> v;
        v->points = 1000000, v->complex = c.is_complex;
        ASSERT_EQ(t_rand(&v, c.kind), 0);
        const int64_t n = v.scalars();
        long double sum = 0, sq = 0;
        bool in_range = true;
        for (int64_t i = 0; i < n; ++i) {
            sum += v[i], sq += (long double)(v[i] - c.mean) * (v[i] - c.mean);
            in_range &= std::isfinite(v[i]) && (c.kind != 2 || v[i] > 0) &&
                        (c.kind != 0 || (c.is_complex ? i % 2 == 0 || v[i - 1] * v[i - 1] + v[i] * v[i] < 1
                                                      : v[i] >= -1 && v[i] < 1));
        }
        EXPECT_TRUE(in_range) << "kind " << c.kind;
        // five standard errors either side
        EXPECT_TRUE(near(sum / n, c.mean, 5 * std::sqrt(c.var / n))) << "kind " << c.kind;
        EXPECT_TRUE(near(sq / n, c.var, 5 * std::sqrt((c.mu4 - c.var * c.var) / n))) << "kind " << c.kind;
    }
}

TYPED_TEST(Random, KindsAndShapesThatFail) {
    Vec<TypeParam> v;
    v->points = 1;
    ASSERT_EQ(t_rand(&v, 1), 0);  // an odd Gaussian count keeps the first of the pair
    EXPECT_TRUE(std::isfinite(v[0]));
    EXPECT_EQ(t_rand(&v, 4) & t_rand(&v, -1), -1);
    v->complex = 1, v->points = 3;
    EXPECT_EQ(t_rand(&v, 2) & t_rand(&v, 3), -1);
    EXPECT_EQ(v->points, 3);
    v->complex = 0, v->points = 0;
    for (int32_t kind = 0; kind < 4; ++kind) EXPECT_EQ(t_rand(&v, kind), 0);
    FailingAlloc<TypeParam> failing;
    Vec<TypeParam> w;
    w->points = 5;
    EXPECT_EQ(t_rand(&w, 0), -1);
}

TYPED_TEST(Random, ShuffleIsAUniformPermutationKeepingPairs) {
    using T = real_of<TypeParam>;
    constexpr int n = 8, trials = 40000;
    long double counts[n][n] = {};
    for (int t = 0; t < trials; ++t) {
        std::vector<T> pairs;
        for (int k = 0; k < n; ++k) pairs.insert(pairs.end(), {T(k), T(-k)});
        Vec<TypeParam> v(pairs, true);
        ASSERT_EQ(t_shuffle(&v), 0);
        std::vector<bool> seen(n);
        for (int pos = 0; pos < n; ++pos) {
            const int k = int(v[2 * pos]);
            ASSERT_TRUE(k >= 0 && k < n && !seen[k] && v[2 * pos + 1] == T(-k));
            seen[k] = true, counts[pos][k] += 1;
        }
    }
    // chi-square of the 8 x 8 position table, 49 degrees of freedom; 110 is
    // beyond its 1e-6 tail
    long double chi2 = 0;
    for (auto& row : counts)
        for (long double c : row) chi2 += (c - trials / n) * (c - trials / n) / (trials / n);
    EXPECT_LT(chi2, 110);
    Vec<TypeParam> one({T(5)});
    EXPECT_EQ(t_shuffle(&one), 0);
    EXPECT_EQ(one[0], T(5));
}

}  // namespace
