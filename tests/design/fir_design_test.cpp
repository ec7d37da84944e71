// FIR design: closed forms in long double, unit sums, symmetry, worked examples, complex destinations, fixed sets.
#include "vlx_test.hpp"

#include <algorithm>

using namespace vlxtest;

VLX_TWIN(c, fir) VLX_TWIN(c, fir2)

VLX_TYPED_SUITE(FirDesign);

namespace {

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

}  // namespace

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
