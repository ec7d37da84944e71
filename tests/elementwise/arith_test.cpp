// The in-place arithmetic and math family: clamps at and beyond their limits, refusals, aliasing, tone adder, I0 kernel.
#include "vlx_test.hpp"

#include <cmath>
#include <functional>
#include <string>

namespace {

using namespace vlxtest;

VLX_TWIN(i, scale) VLX_TWIN(i, offset) VLX_TWIN(i, cscale) VLX_TWIN(i, neg) VLX_TWIN(i, abs) VLX_TWIN(i, conj)
VLX_TWIN(i, timesi) VLX_TWIN(i, mag) VLX_TWIN(i, magsq) VLX_TWIN(i, square) VLX_TWIN(i, recip) VLX_TWIN(i, sqrt)
VLX_TWIN(i, exp) VLX_TWIN(i, exp10) VLX_TWIN(i, log) VLX_TWIN(i, log10) VLX_TWIN(i, db) VLX_TWIN(i, ptor)
VLX_TWIN(i, addcos) VLX_TWIN(i, sin) VLX_TWIN(i, acos) VLX_TWIN(i, cosh) VLX_TWIN(i, sinh) VLX_TWIN(i, sinc)
VLX_TWIN(i, besi0) VLX_TWIN(i, besj0) VLX_TWIN(i, besy1) VLX_TWIN(i, erf) VLX_TWIN(i, erfc) VLX_TWIN(i, gamma)
VLX_TWIN(i, lgamma) VLX_TEST_TWIN(t_umag, vlxu_mag, vlxfu_mag) VLX_TEST_TWIN(t_umagsq, vlxu_magsq, vlxfu_magsq)
VLX_TEST_TWIN(t_usqrt, vlxu_sqrt, vlxfu_sqrt)

inline double kernel(double x) { return vlx_besi0_kernel(x); }
inline float kernel(float x) { return vlxf_besi0_kernel(x); }

VLX_TYPED_SUITE(Arith);

template <class V>
struct Limits {
    using T = real_of<V>;
    static constexpr T big = bound_of<V>();
    static constexpr T e = is_double<V> ? T(230.25850929940458) : T(34.538776f);
    static constexpr T tiny = is_double<V> ? T(2.2250738585072014e-308) : T(1.1754944e-38f);
    static constexpr T exp10_max = is_double<V> ? T(100) : T(15);
};

template <class T>
T above(T x) { return std::nextafter(x, std::numeric_limits<T>::infinity()); }

// An operation, its input, the expected scalars within ulps (0: bit for bit), the complex flag after (-1: as before).
template <class V>
struct Row { std::string name; std::function<int32_t(V*)> op; std::vector<real_of<V>> in; bool is_complex;
             std::vector<real_of<V>> want; double ulps; int want_complex = -1; };

// Builds a one-vector operation from a call on v.
#define OP(call) std::function<int32_t(V*)>([](V* v) { return call; })

TYPED_TEST(Arith, ClampsAndFixedValues) {
    using V = TypeParam; using T = real_of<V>;
    using L = Limits<V>;
    const T B = L::big, E = L::e, ten = T(2.302585092994046);
    const T ln_t = std::log(L::tiny), log10_t = std::log10(L::tiny);
    const T nan = std::numeric_limits<T>::quiet_NaN();
    const T log10e = is_double<V> ? T(0.4342944819032518) : T(0.4342945f);
    const std::vector<Row<V>> rows = {
        {"exp at E", OP(t_exp(v)), {E, above(E), T(-1000), nan}, false, {std::exp(E), B, 0, nan}, 0},
        {"exp complex", OP(t_exp(v)), {above(E), 0, 0, T(M_PI / 2)}, true, {B, 0, std::cos(T(M_PI / 2)), 1}, 0},
        {"exp10 stops below -B", OP(t_exp10(v)), {2, L::exp10_max, above(L::exp10_max), -B, -above(B), 3}, false,
         {std::exp(T(2) * ten), std::exp(L::exp10_max * ten), B, 0, -above(B), 3}, 0},
        {"exp10 complex lower clamp is negative", OP(t_exp10(v)), {-above(B), 0}, true, {-B, T(-0.0)}, 0},
        {"log below T", OP(t_log(v)), {0, -1, L::tiny, nan}, false, {ln_t, ln_t, ln_t, nan}, 0},
        {"log complex", OP(t_log(v)), {0, 0, 0, 1, above(B), 1}, true,
         {ln_t, 0, 0, T(M_PI / 2), std::log(B) * T(0.5), std::atan2(T(1), above(B))}, 0},
        {"log10 complex clamps parts", OP(t_log10(v)), {-above(B), 0}, true,
         {std::log10(B * B) * T(0.5), std::atan2(T(0), -B) * log10e}, 0},
        {"db real", OP(t_db(v, T(20))), {T(0.1), 0}, false, {-20, T(20) * log10_t}, 2},
        {"db complex", OP(t_db(v, T(20))), {1, 1, 0, 0}, true,
         {T(10 * std::log10(2.0L)), T(M_PI / 4 * 20 * 0.43429448190325182765L), T(20) * log10_t, 0}, 2},
        {"recip", OP(t_recip(v)), {0, 4, T(-0.0)}, false, {B, T(0.25), B}, 0},
        {"recip complex", OP(t_recip(v)), {0, 0, 0, 2, above(B), 0}, true,
         {0, T(-0.0), 0, T(-0.5), above(B) * (T(1) / B), T(-0.0)}, 0},
        {"sqrt", OP(t_sqrt(v)), {-4, 4, T(-0.0)}, false, {0, 2, T(-0.0)}, 0},
        {"sqrt complex", OP(t_sqrt(v)), {-4, 0, 0, 0}, true, {T(2) * std::cos(T(M_PI / 2)), 2, 0, 0}, 0},
        {"magsq", OP(t_magsq(v)), {B, above(B), -above(B), 3}, false, {B * B, B, B, 9}, 0, 0},
        {"magsq complex", OP(t_magsq(v)), {above(B), 0, 3, 4}, true, {B, 25}, 0, 0},
        {"mag complex", OP(t_mag(v)), {3, 4, -1, 0}, true, {5, 1}, 0, 0},
        {"square", OP(t_square(v)), {above(B), -3}, false, {B, 9}, 0},
        {"square complex clamps parts", OP(t_square(v)), {above(B), 0, 1, 2}, true, {B * B, 0, -3, 4}, 0},
        {"timesi", OP(t_timesi(v)), {2, -1}, false, {0, 2, 0, -1}, 0, 1},
        {"timesi complex", OP(t_timesi(v)), {1, 2}, true, {-2, 1}, 0},
        {"cscale", OP(t_cscale(v, T(2), T(3))), {1, 2}, false, {2, 3, 4, 6}, 0, 1},
        {"scale complex", OP(t_scale(v, T(0.5))), {3, -1}, true, {1.5, -0.5}, 0},
        {"cscale complex", OP(t_cscale(v, T(2), T(3))), {1, 1}, true, {-1, 5}, 0},
        {"offset complex", OP(t_offset(v, T(5))), {1, 1}, true, {6, 1}, 0},
        {"conj", OP(t_conj(v)), {1, 0, 2, -3}, true, {1, T(-0.0), 2, 3}, 0},
        {"conj real", OP(t_conj(v)), {1, -2}, false, {1, -2}, 0},
        {"ptor real", OP(t_ptor(v)), {1, -2}, false, {1, -2}, 0},
        {"ptor", OP(t_ptor(v)), {2, T(M_PI / 3)}, true, {T(2) * std::cos(T(M_PI / 3)), T(2) * std::sin(T(M_PI / 3))}, 0},
        {"neg", OP(t_neg(v)), {0, 1}, true, {T(-0.0), -1}, 0},
        {"acos", OP(t_acos(v)), {T(1.5), 1, above(T(1)), -1}, false, {0, 0, 0, T(M_PI)}, 1},
        {"cosh", OP(t_cosh(v)), {-above(E), 0}, false, {B, 1}, 0},
        {"sinh", OP(t_sinh(v)), {above(E), -above(E), 0}, false, {B, -B, 0}, 0},
        {"sinc", OP(t_sinc(v)), {0, T(M_PI / 2)}, false, {1, T(2 / M_PI)}, 1},
        {"besi0", OP(t_besi0(v)), {above(E), -above(E), 0}, false, {B, B, 1}, 0},
        {"besy1", OP(t_besy1(v)), {0, -1}, false, {0, 0}, 0},
    };
    for (const Row<V>& r : rows) {
        Vec<V> v(r.in, r.is_complex);
        ASSERT_EQ(r.op(v.get()), 0) << r.name;
        EXPECT_EQ(v->complex, r.want_complex < 0 ? int(r.is_complex) : r.want_complex) << r.name;
        EXPECT_TRUE(same_scalars(v.values(), r.want, r.ulps)) << r.name;
    }
}

// Real-only operations refuse complex input, even empty; stubs always fail; empty mag, magsq, cscale, timesi are real.
TYPED_TEST(Arith, RefusalsAndEmptyVectors) {
    using V = TypeParam; using T = real_of<V>;
    const std::vector<std::pair<bool, std::function<int32_t(V*)>>> refusing = {
        {true, OP(t_abs(v))},    {true, OP(t_sin(v))},     {true, OP(t_acos(v))},  {true, OP(t_cosh(v))},
        {true, OP(t_sinh(v))},   {true, OP(t_sinc(v))},    {true, OP(t_besi0(v))}, {true, OP(t_besj0(v))},
        {true, OP(t_besy1(v))},  {false, OP(t_erf(v))},    {false, OP(t_erfc(v))}, {false, OP(t_gamma(v))},
        {false, OP(t_lgamma(v))},
    };
    for (const auto& [cx, op] : refusing) {
        Vec<V> v({1, 2}, cx), empty({}, cx);
        EXPECT_TRUE(op(v.get()) == -1 && op(empty.get()) == -1);
        EXPECT_EQ(v.values(), (std::vector<T>{1, 2}));
    }
    const std::vector<std::pair<bool, std::function<int32_t(V*)>>> empty_ok = {
        {true, OP(t_mag(v))}, {true, OP(t_magsq(v))}, {false, OP(t_cscale(v, T(1), T(2)))}, {false, OP(t_timesi(v))}};
    for (const auto& [cx, op] : empty_ok) {
        Vec<V> empty({}, cx);
        EXPECT_TRUE(op(empty.get()) == 0 && empty->complex == 0);
    }
}

// vlxu_ forms into a third vector (vector loops), src, or a vector sharing src's data: the in-place bits, clamps too.
TYPED_TEST(Arith, OneSourceFormsWithEveryAliasing) {
    using V = TypeParam; using T = real_of<V>;
    using Ops = std::pair<std::function<int32_t(V*, V*)>, std::function<int32_t(V*)>>;
    const std::vector<Ops> ops = {{[](V* s, V* d) { return t_umag(s, d); }, OP(t_mag(v))},
                                  {[](V* s, V* d) { return t_umagsq(s, d); }, OP(t_magsq(v))},
                                  {[](V* s, V* d) { return t_usqrt(s, d); }, OP(t_sqrt(v))}};
    for (size_t k = 0; k < ops.size(); ++k) {
        for (bool cplx : {false, true}) {
            std::vector<T> in = random_values<T>(cplx ? 202 : 101, 9 + k, -4, 4);
            in[60] = above(Limits<V>::big), in[81] = -above(Limits<V>::big);  // parts beyond the bound, either one
            Vec<V> expected(in, cplx);
            expected->delta = T(0.25);
            ASSERT_EQ(ops[k].second(expected.get()), 0);
            for (int alias = 0; alias < 3; ++alias) {
                SCOPED_TRACE(::testing::Message() << "op " << k << " complex " << cplx << " alias " << alias);
                Vec<V> src(in, cplx), third;
                src->delta = T(0.25);
                V shared = *src.get();  // lends src's data
                shared.alloc = 0;
                V* dst = alias == 0 ? third.get() : alias == 1 ? src.get() : &shared;
                ASSERT_TRUE(ops[k].first(src.get(), dst) == 0 && has_shape(dst, expected->points, expected->complex, 0.25));
                EXPECT_TRUE(same_scalars(std::vector<T>(dst->data, dst->data + expected.scalars()), expected.values()));
                EXPECT_TRUE(alias == 1 || src.values() == in);
                if (alias == 2) t_destroy(&shared);
            }
        }
    }
}

// The float twin takes cosh, sinh, the Bessel functions and hypot in double.
TEST(ArithFloat, FunctionsThroughDouble) {
    const std::vector<float> xs = random_values<float>(64, 17, 0.1, 30);
    struct Case { int32_t (*op)(vlxf_t*); double (*ref)(double); };
    const Case cases[] = {{vlxfi_cosh, [](double x) { return std::cosh(x); }}, {vlxfi_sinh, [](double x) { return std::sinh(x); }},
                          {vlxfi_besj0, [](double x) { return j0(x); }}, {vlxfi_besy1, [](double x) { return y1(x); }}};
    for (const Case& c : cases) {
        Vec<vlxf_t> v(xs, false);
        ASSERT_EQ(c.op(v.get()), 0);
        for (size_t i = 0; i < xs.size(); ++i) EXPECT_TRUE(same_bits(v[i], static_cast<float>(c.ref(xs[i])))) << i;
    }
    Vec<vlxf_t> z(xs, true);
    ASSERT_EQ(vlxfi_mag(z.get()), 0);
    for (size_t i = 0; i < xs.size() / 2; ++i)
        EXPECT_TRUE(same_bits(z[i], static_cast<float>(std::hypot(double(xs[2 * i]), double(xs[2 * i + 1])))));
}

// The rotation recurrence, restarted every 256 samples (float: through double, one turn), bit for bit; flag 1: sine.
TYPED_TEST(Arith, AddcosFollowsTheRecurrence) {
    using V = TypeParam; using T = real_of<V>;
    const int n = 1000;
    const T freq = T(0.0123), amp = T(1.5), phase = T(0.4), delta = T(0.5);
    const T step = delta * T(2) * T(M_PI) * freq, cs = std::cos(step), sn = std::sin(step);
    for (uint32_t flags : {0u, 1u})
        for (bool cplx : {false, true}) {
            Vec<V> v(std::vector<T>(cplx ? 2 * n : n, T(1)), cplx);
            v->delta = delta;
            ASSERT_EQ(t_addcos(v.get(), flags, freq, amp, phase), 0);
            T c = 0, s = 0;
            for (int k = 0; k < n; ++k) {
                if (k % 256 == 0) {
                    const T angle = T(k) * step + phase;
                    const double a = is_double<V> ? double(angle) : std::fmod(double(angle), 6.283185307179586);
                    c = T(std::cos(a)), s = T(std::sin(a));
                }
                const T re = cplx ? v[2 * k] : v[k], im = cplx ? v[2 * k + 1] : T(1);
                ASSERT_TRUE(same_bits(re, T(1) + amp * c) && same_bits(im, flags && cplx ? T(1) + amp * s : T(1))) << k;
                const T c2 = c * cs - s * sn;
                s = s * cs + c * sn, c = c2;
            }
        }
    Vec<V> flat({1, 2, 3});
    EXPECT_TRUE(t_addcos(flat.get(), 0u, T(0), T(1), T(0)) == 0 && flat.values() == (std::vector<T>{2, 3, 4}));
}

// I0 by its power series summed in long double to convergence.
long double besi0_reference(long double x) {
    const long double u = x * x / 4;
    long double term = 1, sum = 1;
    for (int k = 1; k < 500 && term > sum * 1e-22L; ++k) term *= u / ((long double)k * k), sum += term;
    return sum;
}

TYPED_TEST(Arith, Besi0KernelAgainstLongDoubleSeries) {
    using V = TypeParam; using T = real_of<V>;
    const T edge = is_double<V> ? T(20) : T(16);
    std::vector<T> xs = {0, T(0.5), 1, 5, T(-7.25), edge, above(edge), T(25), T(34.5), Limits<V>::e};
    for (T x : random_values<T>(200, 4, 0, double(Limits<V>::e))) xs.push_back(x);
    for (T x : xs) EXPECT_LE(ulp_distance(kernel(x), T(besi0_reference(std::fabs((long double)x)))), 8.0) << x;
    EXPECT_TRUE(same_bits(kernel(T(0)), T(1)) && std::isnan(kernel(std::numeric_limits<T>::quiet_NaN())));
}

}  // namespace
