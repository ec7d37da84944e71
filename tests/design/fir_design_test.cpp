// FIR design: every response type against its closed form in long double,
// the unit sum of the smoothers, symmetry, the worked examples, complex
// destinations, the fixed sets, and allocation failure.
#include "vlx_test.hpp"

#include <functional>

using namespace vlxtest;

VLX_TWIN(c, fir)
VLX_TWIN(c, fir2)

template <class V>
class FirDesign : public ::testing::Test {};
TYPED_TEST_SUITE(FirDesign, Families);

namespace {

constexpr long double pi = 3.141592653589793238462643383279502884L;

long double sinc(long double a) { return a == 0 ? 1 : std::sin(a) / a; }

// The length under test, for the forms whose shape depends on it.
long double& cur_n() {
    static long double n = 0;
    return n;
}

// The closed form of a type at signed distance t from the middle (high side
// positive); normalised types are compared after dividing by their sum.
struct Form {
    int32_t type;
    double arg1, arg2;
    bool unit_sum;
    std::function<long double(long double)> tap;
};

}  // namespace

TYPED_TEST(FirDesign, ResponsesMatchClosedForms) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 1e-13L : 3e-6L;
    const long double fc = static_cast<T>(0.1), bw = static_cast<T>(0.08), d = static_cast<T>(0.3);
    const long double a9 = static_cast<T>(7.0);
    const Form forms[] = {
        {0, 0.1, 0.08, false, [&](long double t) { return bw * sinc(pi * bw * t) * std::cos(2 * pi * fc * t) * 2; }},
        {1, 0.1, 0.08, false, [&](long double t) { return (t == 0) - bw * sinc(pi * bw * t) * std::cos(2 * pi * fc * t) * 2; }},
        {2, 0.1, 0, false, [&](long double t) { return (t == 0) - 2 * fc * sinc(2 * pi * fc * t); }},
        {3, 0.1, 0, false, [&](long double t) { return 2 * fc * sinc(2 * pi * fc * t); }},
        {4, 7.0, 0, true, [&](long double t) {
             const long double c = t * a9 * 4, x = a9 * a9 - c * c * 0.25L / ((cur_n() + 1) * (cur_n() + 1));
             return x <= 0 ? std::sin(std::sqrt(-x)) : std::sinh(std::sqrt(x)); }},
        {5, 0.1, 0.3, true, [&](long double t) { return sinc(2 * pi * fc * (t - d)) * 2 * fc; }},
        {6, 0.1, 0, false, [&](long double t) {
             const long double s = 2 * pi * fc, a = s * t;
             return t == 0 ? 0 : (std::cos(a) - std::sin(a) / a) / a * s * 2 * fc; }},
        {7, 0.1, 0, true, [&](long double t) {
             const long double sigma = std::sqrt(std::log(2.0L)) / (cur_n() * 2 * pi * fc);
             return std::exp(-0.5L * std::pow(t / (cur_n() * sigma), 2)); }},
        {8, 0.1, 0, false, [&](long double t) { return t == 0 ? 0 : (std::cos(2 * pi * fc * t) - 1) / (pi * t); }},
        {9, 7.0, 0, true, [&](long double t) {
             const long double c = t * std::sqrt(a9 * a9 + pi * pi) * 4 / (cur_n() + 1), x = a9 * a9 - c * c * 0.25L;
             return x <= 0 ? sinc(std::sqrt(-x)) : std::sinh(std::sqrt(x)) / std::sqrt(x); }},
        {10, 0.1, 0, false, [&](long double t) {
             const long double b = 2 * fc, a = pi * b * t;
             return t == 0 ? b * b * 0.5L : ((std::cos(a) - 1) / (a * a) + sinc(a)) * b * b; }},
    };
    for (const Form& f : forms) {
        for (int32_t n : {5, 31, 32, 64}) {
            if ((f.type == 1 || f.type == 2) && n % 2 == 0) continue;
            cur_n() = n;
            Vec<TypeParam> v;
            v->points = n;
            ASSERT_EQ(t_fir(v.get(), f.type, static_cast<T>(f.arg1), static_cast<T>(f.arg2)), 0);
            std::vector<long double> want(n);
            long double sum = 0;
            for (int32_t k = 0; k < n; ++k) sum += want[k] = f.tap(k - (n - 1) / 2.0L);
            const long double peak = *std::max_element(want.begin(), want.end());
            for (int32_t k = 0; k < n; ++k) {
                const long double w = f.unit_sum ? want[k] / sum : want[k];
                ASSERT_TRUE(near(v[k], w, tol * (f.unit_sum ? peak / sum : 1))) << f.type << " n " << n << " k " << k;
            }
        }
    }
}

TYPED_TEST(FirDesign, WorkedExamplesAndShapes) {
    using T = real_of<TypeParam>;
    const T eps = std::numeric_limits<T>::epsilon();
    auto taps = [](int32_t type, int32_t n, double a1, double a2 = 0, int32_t* st = nullptr) {
        Vec<TypeParam> v;
        v->points = n;
        const int32_t r = t_fir(v.get(), type, static_cast<T>(a1), static_cast<T>(a2));
        if (st != nullptr) *st = r;
        else EXPECT_EQ(r, 0) << type;
        EXPECT_EQ(v->complex, 0);
        return v.values();
    };
    const std::vector<T> lp = taps(3, 5, 0.25);
    const std::vector<double> lp_want = {0, 1 / M_PI, 0.5, 1 / M_PI, 0};
    const std::vector<T> hp = taps(2, 5, 0.25);
    for (int k = 0; k < 5; ++k) {
        EXPECT_NEAR(lp[k], lp_want[k], 2 * eps) << k;
        EXPECT_EQ(hp[k], k == 2 ? T(1) - lp[k] : -lp[k]) << k;
    }
    int32_t st = 0;
    for (int32_t type : {1, 2, 11, -1}) {
        taps(type, 6, 0.25, 0.1, &st);
        EXPECT_EQ(st, -1) << type;
    }
    const std::vector<T> smooth5 = taps(4, 5, 0);
    const std::vector<T> want5 = {T(0.0782793) * T(0.5), T(0.4973406) * T(0.5), T(0.4243801), T(0.4973406) * T(0.5),
                                  T(0.0782793) * T(0.5)};
    EXPECT_EQ(smooth5, want5);
    // default shapes from the length: 10 pi/2 + 1.4 for n = 10, 16 pi/2 for n = 15
    EXPECT_TRUE(same_scalars(taps(4, 10, 0), taps(4, 10, static_cast<T>(10 * 1.5707963267948966) + T(1.4)), 0));
    EXPECT_TRUE(same_scalars(taps(4, 15, 0), taps(4, 15, static_cast<T>(16) * static_cast<T>(1.5707963267948966)), 0));
    for (int32_t type : {4, 5, 7, 9}) {
        for (int32_t n : {1, 2, 3, 7, 9, 11, 13, 40}) {
            long double sum = 0;
            for (T x : taps(type, n, type == 5 || type == 7 ? 0.2 : 0)) sum += x;
            EXPECT_TRUE(near(sum, 1, 8 * eps)) << type << " " << n;
        }
    }
    // pairs get one value each, so the symmetry is exact; the delayed low
    // pass walks from one end and is symmetric only up to rounding
    for (int32_t type : {0, 3, 5, 6, 8, 10}) {
        const std::vector<T> x = taps(type, 33, 0.15, type == 5 ? 0.0 : 0.08);
        for (int k = 0; k < 33; ++k) {
            if (type == 5) EXPECT_NEAR(x[k], x[32 - k], 16 * eps) << k;
            else EXPECT_EQ(x[k], type == 6 || type == 8 ? -x[32 - k] : x[32 - k]) << type << " " << k;
        }
    }
    EXPECT_EQ(taps(8, 33, 0.15)[16], T(0));
    EXPECT_EQ(taps(6, 33, 0.15)[16], T(0));
    // the Hilbert kernel near a = 0 takes its limit instead of dividing
    const std::vector<T> tiny = taps(8, 4, 1e-12);
    for (T x : tiny) EXPECT_TRUE(std::isfinite(x) && std::fabs(x) < T(1e-20));
}

TYPED_TEST(FirDesign, ComplexDestinationsFixedSetsAndFailures) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> real, cplx({9, 9, 9, 9, 9, 9}, true);
    real->points = 3;
    ASSERT_EQ(t_fir(real.get(), 9, T(0), T(0)), 0);
    ASSERT_EQ(t_fir(cplx.get(), 9, T(0), T(0)), 0);
    EXPECT_EQ(cplx.values(), (std::vector<T>{real[0], 0, real[1], 0, real[2], 0}));

    const struct { int32_t set, points; double first, last; } sets[] = {
        {100, 12, 0.000652614993819046, 0.494746834127881}, {101, 20, 0.000368132791542899, 0.480803804305858},
        {102, 5, 0.002115989672005283, 1.155032543014937},  {103, 38, 3.4966046308112134e-05, 0.5},
        {104, 61, 3.6454487960244565e-05, 0.45817297763908715},
    };
    for (const auto& s : sets) {
        Vec<TypeParam> v({1, 2}, true);
        ASSERT_EQ(t_fir2(v.get(), s.set), 0);
        EXPECT_TRUE(has_shape(v.get(), s.points, 1, 1.0));
        EXPECT_EQ(v[0], static_cast<T>(s.first));
        EXPECT_EQ(v[1], T(0));
        EXPECT_EQ(v[2 * s.points - 2], static_cast<T>(s.last));
    }
    Vec<TypeParam> v({1, 2, 3});
    EXPECT_EQ(t_fir2(v.get(), 105), -1);
    EXPECT_EQ(t_fir2(v.get(), 99), -1);
    EXPECT_EQ(v.values(), (std::vector<T>{1, 2, 3}));
    {
        FailingAlloc<TypeParam> fail;
        Vec<TypeParam> w;
        w->points = 8;
        EXPECT_EQ(t_fir(w.get(), 3, T(0.1), T(0)), -1);
        EXPECT_EQ(w->points, 0);
        EXPECT_EQ(t_fir2(w.get(), 100), -1);
        EXPECT_EQ(w->alloc, 0);
    }
}
