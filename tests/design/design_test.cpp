// The signal sources: lines, tones and exponentials with their exact restarts; noise draws, moments and shuffles; the
// resampling tables. FIR design: closed forms, unit sums, symmetry, worked examples, complex destinations, fixed sets.
#include "vlx_test.hpp"

#include <algorithm>

using namespace vlxtest;

namespace {

VLX_TWIN(c, line) VLX_TWIN(c, cos) VLX_TWIN(c, cexp) VLX_TWIN(c, rand) VLX_TWIN(c, rsmp) VLX_TWIN(i, shuffle)
VLX_TWIN(c, rsmp_cos) VLX_TWIN(c, rsmp_pcos) VLX_TWIN(c, fir) VLX_TWIN(c, fir2)

constexpr long double pi = 3.141592653589793238462643383279502884L;

long double sinc(long double a) { return a == 0 ? 1 : std::sin(a) / a; }

// Tap at signed distance t from the middle on n taps; types 4, 5, 7 and 9 before their scaling to a sum of 1.
long double closed_form(int32_t type, long double t, long double n, long double fc, long double bw, long double d,
                        long double sh) {
    const long double b = 2 * fc, a = pi * b * t, band = bw * sinc(pi * bw * t) * std::cos(2 * pi * fc * t) * 2;
    switch (type) {
    case 0: return band;
    case 1: return (t == 0) - band;
    case 2: return (t == 0) - b * sinc(a);
    case 3: return b * sinc(a);
    case 4: {
        const long double c = t * sh * 4 / (n + 1), x = sh * sh - c * c * 0.25L;
        return x <= 0 ? std::sin(std::sqrt(-x)) : std::sinh(std::sqrt(x));
    }
    case 5: return sinc(2 * pi * fc * (t - d)) * b;
    case 6: return t == 0 ? 0 : (std::cos(a) - std::sin(a) / a) / a * pi * b * b;
    case 7: return std::exp(-0.5L * std::pow(t * 2 * pi * fc, 2) / std::log(2.0L));
    case 8: return t == 0 ? 0 : (std::cos(a) - 1) / (pi * t);
    case 9: {
        const long double c = t * std::sqrt(sh * sh + pi * pi) * 4 / (n + 1), x = sh * sh - c * c * 0.25L;
        return x <= 0 ? sinc(std::sqrt(-x)) : std::sinh(std::sqrt(x)) / std::sqrt(x);
    }
    default: return t == 0 ? b * b * 0.5L : ((std::cos(a) - 1) / (a * a) + sinc(a)) * b * b;
    }
}

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
    // Sample 256 restarts at the exact angle: the float tone in single precision reduced in double, its exponential in double.
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

VLX_TYPED_SUITE(FirDesign);

// Closed forms to rounding, exact unit sums, and one value per pair: exact symmetry, a centre of 0 when antisymmetric.
TYPED_TEST(FirDesign, ResponsesMatchClosedForms) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 1e-13L : 3e-6L;
    const T fc = T(0.1), bw = T(0.08), d = T(0.3), sh = T(7);
    for (int32_t type = 0; type <= 10; ++type) {
        const bool unit_sum = type == 4 || type == 5 || type == 7 || type == 9, anti = type == 6 || type == 8;
        const bool paired = anti || type == 0 || type == 3 || type == 10;
        for (int32_t n : {1, 2, 3, 5, 13, 31, 32, 33, 64}) {
            if ((type == 1 || type == 2) && n % 2 == 0) continue;
            Vec<TypeParam> v;
            v->points = n;
            ASSERT_EQ(t_fir(v.get(), type, type == 4 || type == 9 ? sh : fc, type == 0 || type == 1 ? bw : d), 0);
            std::vector<long double> want(n);
            long double sum = 0;
            for (int32_t k = 0; k < n; ++k) sum += want[k] = closed_form(type, k - (n - 1) / 2.0L, n, fc, bw, d, sh);
            const long double scale = unit_sum ? sum : 1;
            const long double peak = *std::max_element(want.begin(), want.end()) / scale;
            long double got = 0;
            for (int32_t k = 0; k < n; ++k) {
                ASSERT_TRUE(near(v[k], want[k] / scale, tol * std::max(peak, 1.0L))) << type << " n " << n << " k " << k;
                ASSERT_TRUE(!paired || v[k] == (anti ? -v[n - 1 - k] : v[n - 1 - k])) << type << " n " << n << " k " << k;
                got += v[k];
            }
            EXPECT_TRUE(!unit_sum || near(got, 1, 8 * std::numeric_limits<T>::epsilon())) << type << " n " << n;
        }
    }
}

// Refusals, fixed taps, default shapes, the Hilbert kernel's limit.
TYPED_TEST(FirDesign, WorkedExamplesAndShapes) {
    using T = real_of<TypeParam>;
    auto taps = [](int32_t type, int32_t n, double a1, double a2 = 0, int32_t want = 0) {
        Vec<TypeParam> v(std::vector<T>(n), false);
        EXPECT_TRUE(t_fir(v.get(), type, static_cast<T>(a1), static_cast<T>(a2)) == want && v->complex == 0) << type;
        return v.values();
    };
    for (int32_t type : {1, 2, 11, -1}) taps(type, 6, 0.25, 0.1, -1);  // even lengths have no high-pass or band-stop
    const T c1 = T(0.4973406) * T(0.5), c2 = T(0.0782793) * T(0.5);
    EXPECT_EQ(taps(4, 5, 0), (std::vector<T>{c2, c1, T(0.4243801), c1, c2}));
    // default shapes from the length: 10 pi/2 + 1.4 for n = 10, 16 pi/2 for n = 15
    EXPECT_TRUE(same_scalars(taps(4, 10, 0), taps(4, 10, static_cast<T>(10 * 1.5707963267948966) + T(1.4))));
    EXPECT_TRUE(same_scalars(taps(4, 15, 0), taps(4, 15, static_cast<T>(16) * static_cast<T>(1.5707963267948966))));
    // the Hilbert kernel near a = 0 takes its limit instead of dividing
    for (T x : taps(8, 4, 1e-12)) EXPECT_TRUE(std::isfinite(x) && std::fabs(x) < T(1e-20));
}

TYPED_TEST(FirDesign, ComplexDestinationsAndFixedSets) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> real(std::vector<T>(3), false), cplx({9, 9, 9, 9, 9, 9}, true);
    ASSERT_EQ(t_fir(real.get(), 9, T(0), T(0)) + t_fir(cplx.get(), 9, T(0), T(0)), 0);
    EXPECT_EQ(cplx.values(), (std::vector<T>{real[0], 0, real[1], 0, real[2], 0}));
    const struct { int32_t set, points; double first, last; } sets[] = {
        {100, 12, 0.000652614993819046, 0.494746834127881}, {101, 20, 0.000368132791542899, 0.480803804305858},
        {102, 5, 0.002115989672005283, 1.155032543014937},  {103, 38, 3.4966046308112134e-05, 0.5},
        {104, 61, 3.6454487960244565e-05, 0.45817297763908715},
    };
    for (const auto& s : sets) {
        Vec<TypeParam> v({1, 2}, true);
        ASSERT_EQ(t_fir2(v.get(), s.set), 0);
        EXPECT_TRUE(has_shape(v.get(), s.points, 1, 1.0) && v[0] == static_cast<T>(s.first) && v[1] == T(0) &&
                    v[2 * s.points - 2] == static_cast<T>(s.last)) << s.set;
    }
    Vec<TypeParam> v({1, 2, 3});
    EXPECT_TRUE(t_fir2(v.get(), 105) + t_fir2(v.get(), 99) == -2 && v.values() == (std::vector<T>{1, 2, 3}));
}

}  // namespace
