// The signal sources: lines, tones and exponentials with their exact restarts; noise draws, moments and shuffles; the
// resampling tables.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {
VLX_TWIN(c, line) VLX_TWIN(c, cos) VLX_TWIN(c, cexp) VLX_TWIN(c, rand) VLX_TWIN(c, rsmp) VLX_TWIN(i, shuffle)
VLX_TWIN(c, rsmp_cos) VLX_TWIN(c, rsmp_pcos)

VLX_TYPED_SUITE(Generators);

template <class V>  // a creator's vector: points, delta and complex preset by the caller
V* preset(Vec<V>& v, int32_t points, double delta, int32_t cx) {
    return v->points = points, v->delta = real_of<V>(delta), v->complex = cx, v.get();
}

TYPED_TEST(Generators, LineToneAndExponentialFollowTheirReferences) {
    using T = real_of<TypeParam>;
    const T freq = T(0.0123), phase = T(0.7), delta = T(0.5), tol = is_double<TypeParam> ? T(1e-12) : T(1e-4);
    Vec<TypeParam> line, re, cx, ex, ex_real;
    ASSERT_EQ(t_line(preset(line, 1000, delta, 1), T(0.3), T(-2)) | t_cos(preset(re, 1000, delta, 0), freq, phase) |
                  t_cos(preset(cx, 1000, delta, 1), freq, phase) | t_cexp(preset(ex, 1000, delta, 1), freq, phase) |
                  t_cexp(preset(ex_real, 1000, delta, 0), freq, phase), 0);
    EXPECT_TRUE(has_shape(cx.get(), 1000, 1, 0.5) && has_shape(ex_real.get(), 1000, 0, 0.5));
    Vec<TypeParam> e[5];  // creators leave empty vectors empty
    EXPECT_EQ(t_line(preset(e[0], 0, 1, 0), T(1), T(0)) | t_cos(preset(e[1], 0, 1, 0), T(1), T(0)) |
                  t_cexp(preset(e[2], 0, 1, 1), T(1), T(0)) | t_rand(preset(e[3], 0, 1, 0), 1) | t_rsmp(preset(e[4], 0, 1, 0), 0), 0);
    EXPECT_TRUE(same_scalars(ex_real.values(), re.values()));  // a real vector gets the cosine
    T value = T(-2);  // the line is a running sum
    for (int64_t k = 0; k < 1000; ++k, value += delta * T(0.3)) {
        const long double angle = 2 * 3.14159265358979323846L * (long double)freq * k * (long double)delta + phase;
        ASSERT_TRUE(same_bits(line[2 * k], value) && line[2 * k + 1] == T(0)) << k;
        ASSERT_TRUE(near(re[k], cosl(angle), tol) && same_bits(cx[2 * k], re[k]) && cx[2 * k + 1] == T(0)) << k;
        ASSERT_TRUE(near(ex[2 * k], cosl(angle), tol) && near(ex[2 * k + 1], sinl(angle), tol)) << k;
    }
    // Sample 256 restarts at the exact angle, whatever the rotation gathered: the float tone in single precision
    // reduced in double, the float exponential wholly in double.
    const T w = delta * T(2) * static_cast<T>(3.141592653589793) * freq, angle = T(256) * w + phase;
    if constexpr (is_double<TypeParam>)
        EXPECT_TRUE(same_bits(re[256], std::cos(angle)) && same_bits(ex[513], std::sin(angle)));
    else
        EXPECT_TRUE(same_bits(re[256], float(std::cos(std::fmod(double(angle), 6.283185307179586)))) &&
                    same_bits(ex[513], float(std::sin(std::fmod(256.0 * w + double(phase), 6.283185307179586)))));
}

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

VLX_TYPED_SUITE(ResamplingTables);

TYPED_TEST(ResamplingTables, BuiltInKernelsAreSymmetricAndPeakInTheMiddle) {
    // 1024 phases; design 4 gives the 13314-point table of the streaming resampler
    const int32_t taps[] = {8, 13, 8, 10, 13};
    for (int32_t design = 0; design < 5; ++design) {
        const int64_t mid = 1 + taps[design] * 512;
        Vec<TypeParam> v(std::vector<real_of<TypeParam>>(2 * mid), false);
        ASSERT_EQ(t_rsmp(&v, design), 0);
        bool symmetric = true, peak = true;  // and nearly zero at both ends
        for (int64_t i = 1; i < mid; ++i) symmetric &= same_bits(v[mid - i], v[mid + i]), peak &= v[mid] >= v[mid - i];
        EXPECT_TRUE(v[0] == taps[design] && symmetric && peak && std::fabs(v[1]) < 1e-3 * v[mid]) << design;
    }
}

TYPED_TEST(ResamplingTables, ExpansionRulesAgainstLongDoubleAndDegenerateInputs) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> design({T(6), T(0.4), T(-0.3), T(0.2), T(0.05)}), one({T(9)}), pair({T(9), T(0), T(1), T(0)}, true);
    for (bool polynomial : {false, true}) {
        Vec<TypeParam> v(std::vector<T>(66), false), cx(std::vector<T>(132), true);
        auto expand = [polynomial](TypeParam* e, TypeParam* d) { return polynomial ? t_rsmp_pcos(e, d) : t_rsmp_cos(e, d); };
        ASSERT_EQ(expand(v.get(), design.get()) | expand(cx.get(), design.get()), 0);
        EXPECT_TRUE(has_shape(cx.get(), 66, 1, 1.0));
        for (int i = 0; i <= 32; ++i) {
            const long double theta = i * 2 * 3.14159265358979323846L / 64, c = cosl(theta);
            long double want = design[1];
            for (int k = 2; k < 5; ++k) want += design[k] * (polynomial ? powl(c, k - 1) : cosl((k - 1) * theta));
            EXPECT_TRUE(near(v[33 - i], want, is_double<TypeParam> ? 1e-14 : 2e-6) && same_bits(v[33 + i], v[33 - i]));
        }
        for (int64_t k = 0; k < 66; ++k) EXPECT_TRUE(same_bits(cx[2 * k], v[k]) && cx[2 * k + 1] == T(0)) << k;
    }
    Vec<TypeParam> v({0, 0}), odd({0, 0, 0, 0, 0, 0, 0});  // two points: T and the value at theta 0
    ASSERT_EQ(t_rsmp_cos(&v, design.get()), 0);
    EXPECT_TRUE(same_scalars(v.values(), {T(6), T(T(T(T(0.4) + T(-0.3)) + T(0.2)) + T(0.05))}));
    v->points = 10;
    EXPECT_EQ(t_rsmp(&odd, 0) & t_rsmp(&v, 5) & t_rsmp(&v, -1) & t_rsmp_cos(&v, pair.get()), -1);
    ASSERT_EQ(t_rsmp_pcos(&v, one.get()), 0);  // a design of T alone
    EXPECT_TRUE(same_scalars(v.values(), {T(9), 0, 0, 0, 0, 0, 0, 0, 0, 0}));
    v->points = 1;
    EXPECT_TRUE(t_rsmp(&v, 3) == 0 && v[0] == T(10));
}

}  // namespace
