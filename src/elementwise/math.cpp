// Exponentials, logarithms, trigonometric, hyperbolic and Bessel functions
// on vectors, in place.  Nothing reports a domain error: each clamp gives a
// finite value instead, and a NaN passes the clamps into the function.
#include "elementwise/elementwise.hpp"
#include "elementwise/inplace.hpp"

#include <math.h>  // j0, j1, y0, y1

namespace vlx {

using inplace::beyond;
using inplace::Cx;

namespace {

// Limits and constants of the family: the single-precision values are the
// double ones rounded to nearest.
template <VlxVector V>
struct limits {
    using T = real_t<V>;
    static constexpr T big = family<V>::bound;        // B
    static constexpr T exp_max = family<V>::exp_limit;  // E = ln B
    static constexpr T tiny = family<V>::tiny;         // T
    static constexpr T ln10 = T(2.302585092994046);
    static constexpr T log10e = T(0.4342944819032518);
    static constexpr T exp10_max = std::is_same_v<T, float> ? T(15) : T(100);
};

// The Bessel functions come from the C library in double; the float twin
// widens the sample and rounds the result.
inline double j0_64(double x) { return ::j0(x); }
inline double j1_64(double x) { return ::j1(x); }
inline double y0_64(double x) { return ::y0(x); }
inline double y1_64(double x) { return ::y1(x); }

}  // namespace

template <VlxVector V>
int32_t exp_each(V* v) {
    using T = real_t<V>;
    using L = limits<V>;
    return inplace::map_both(
        v, [](T x) { return x > L::exp_max ? L::big : own_exp(x); },
        [](T a, T b) {
            const T e = a > L::exp_max ? L::big : own_exp(a);
            return Cx<T>{e * own_cos(b), e * own_sin(b)};
        });
}

template <VlxVector V>
int32_t exp10(V* v) {
    using T = real_t<V>;
    using L = limits<V>;
    const int64_t n = v->points;
    T* d = v->data;
    if (v->complex) {
        for (int64_t i = 0; i < n; ++i) {
            const T a = d[2 * i];
            const T b = d[2 * i + 1];
            // The lower clamp is negative on purpose, and kept.
            T e;
            if (a > L::exp10_max)
                e = L::big;
            else if (a < -L::big)
                e = -L::big;
            else
                e = own_exp(a * L::ln10);
            const T p = b * L::ln10;
            d[2 * i] = e * own_cos(p);
            d[2 * i + 1] = e * own_sin(p);
        }
        return 0;
    }
    for (int64_t i = 0; i < n; ++i) {
        const T x = d[i];
        // The first sample below -B ends the walk: it and every later sample
        // stay as they are.  Settled behaviour, kept.
        if (x < -L::big) break;
        d[i] = x > L::exp10_max ? L::big : own_exp(x * L::ln10);
    }
    return 0;
}

template <VlxVector V>
int32_t log_each(V* v) {
    using T = real_t<V>;
    using L = limits<V>;
    const T log_tiny = own_log(L::tiny);
    return inplace::map_both(
        v, [log_tiny](T x) { return x < L::tiny ? log_tiny : own_log(x); },
        [log_tiny](T a, T b) {
            T m;
            if (beyond(a, L::big) || beyond(b, L::big)) {
                // the phase below still takes the unclamped parts
                m = L::big;
            } else {
                m = b * b + a * a;
                if (m < L::tiny) return Cx<T>{log_tiny, T(0)};
            }
            return Cx<T>{own_log(m) * T(0.5), own_atan2(b, a)};
        });
}

namespace {

// log10 and dB share the complex form; factor 1 is plain log10.  The product
// order (log10(m) * factor) * 0.5 and (phase * factor) * log10 e is kept.
template <VlxVector V>
int32_t log10_scaled(V* v, real_t<V> factor, bool scaled) {
    using T = real_t<V>;
    using L = limits<V>;
    const T log10_tiny = own_log10(L::tiny);
    return inplace::map_both(
        v,
        [=](T x) {
            const T l = x < L::tiny ? log10_tiny : own_log10(x);
            return scaled ? factor * l : l;
        },
        [=](T a, T b) {
            a = inplace::clamp_part(a, L::big);
            b = inplace::clamp_part(b, L::big);
            const T m = b * b + a * a;
            if (m < L::tiny) return Cx<T>{scaled ? factor * log10_tiny : log10_tiny, T(0)};
            const T phase = own_atan2(b, a);
            if (!scaled) return Cx<T>{own_log10(m) * T(0.5), phase * L::log10e};
            return Cx<T>{own_log10(m) * factor * T(0.5), phase * factor * L::log10e};
        });
}

}  // namespace

template <VlxVector V>
int32_t log10_each(V* v) {
    return log10_scaled(v, real_t<V>(1), false);
}

template <VlxVector V>
int32_t db(V* v, real_t<V> factor) {
    return log10_scaled(v, factor, true);
}

#define VLX_REAL_FN(name, expr)                                          \
    template <VlxVector V>                                               \
    int32_t name(V* v) {                                                 \
        using T = real_t<V>;                                             \
        using L [[maybe_unused]] = limits<V>;                            \
        return inplace::map_real(v, [](T x) -> T { return expr; });      \
    }
VLX_REAL_FN(sin_each, own_sin(x))
VLX_REAL_FN(cos_each, own_cos(x))
VLX_REAL_FN(tan_each, own_tan(x))
VLX_REAL_FN(atan_each, own_atan(x))
VLX_REAL_FN(tanh_each, own_tanh(x))
VLX_REAL_FN(acos_each, beyond(x, T(1)) ? T(0) : own_acos(x))
VLX_REAL_FN(asin_each, beyond(x, T(1)) ? T(0) : own_asin(x))
// cosh and sinh go through double in the float twin too.
VLX_REAL_FN(cosh_each, beyond(x, L::exp_max) ? L::big : wide_cosh(x))
VLX_REAL_FN(sinh_each, x > L::exp_max ? L::big : x < -L::exp_max ? -L::big : wide_sinh(x))
// no factor of pi
VLX_REAL_FN(sinc, x == T(0) ? T(1) : own_sin(x) / x)
VLX_REAL_FN(besi0, beyond(x, L::exp_max) ? L::big : besi0_kernel<V>(x))
VLX_REAL_FN(besj0, static_cast<T>(j0_64(x)))
VLX_REAL_FN(besj1, static_cast<T>(j1_64(x)))
VLX_REAL_FN(besy0, x <= T(0) ? T(0) : static_cast<T>(y0_64(x)))
VLX_REAL_FN(besy1, x <= T(0) ? T(0) : static_cast<T>(y1_64(x)))
#undef VLX_REAL_FN

namespace {

// 1/(k!)^2, each the nearest double, for the series of I0.
constexpr double besi0_series[34] = {
    1.0, 1.0, 0.25, 0.027777777777777776, 0.001736111111111111, 6.944444444444444e-05,
    1.9290123456790124e-06, 3.936759889140842e-08, 6.151187326782565e-10, 7.594058428126624e-12,
    7.594058428126623e-14, 6.276081345559193e-16, 4.358389823304995e-18, 2.5789288895295828e-20,
    1.3157800456783586e-22, 5.8479113141260385e-25, 2.2843403570804838e-27, 7.904291893012054e-30,
    2.4395962632753253e-32, 6.757884385804225e-35, 1.6894710964510564e-37, 3.8310002187098785e-40,
    7.915289708078262e-43, 1.4962740468957016e-45, 2.5976979980828152e-48, 4.156316796932504e-51,
    6.14839762859838e-54, 8.434015951438106e-57, 1.0757673407446564e-59, 1.2791526049282477e-62,
    1.4212806721424974e-65, 1.4789601166935458e-68, 1.4442969889585408e-71, 1.3262598613026087e-74,
};

// Asymptotic coefficients a[k] = a[k-1] * (2k-1)^2 / k, a[0] = 1, in double.
struct AsymptoticTable {
    double a[22];
    constexpr AsymptoticTable() : a{} {
        a[0] = 1.0;
        for (int k = 1; k < 22; ++k) a[k] = a[k - 1] * double((2 * k - 1) * (2 * k - 1)) / double(k);
    }
};
constexpr AsymptoticTable besi0_asymptotic{};

template <class T>
struct Besi0Shape;
template <>
struct Besi0Shape<double> {
    static constexpr double series_max = 20.0;
    static constexpr int series_terms = 34;
    static constexpr int asymptotic_terms = 22;
};
template <>
struct Besi0Shape<float> {
    static constexpr float series_max = 16.0f;
    static constexpr int series_terms = 21;
    static constexpr int asymptotic_terms = 6;
};

}  // namespace

template <VlxVector V>
real_t<V> besi0_kernel(real_t<V> x) {
    using T = real_t<V>;
    using S = Besi0Shape<T>;
    x = std::fabs(x);
    if (!(x > S::series_max)) {
        const T half = x / T(2);
        const T u = half * half;
        T sum = static_cast<T>(besi0_series[S::series_terms - 1]);
        for (int k = S::series_terms - 2; k >= 0; --k) sum = sum * u + static_cast<T>(besi0_series[k]);
        return sum;
    }
    const T w = T(0.125) / x;
    T p = static_cast<T>(besi0_asymptotic.a[S::asymptotic_terms - 1]);
    for (int k = S::asymptotic_terms - 2; k >= 0; --k) p = p * w + static_cast<T>(besi0_asymptotic.a[k]);
    return own_exp(x) * p / own_sqrt(x * T(2) * family<V>::pi);
}

#define VLX_INSTANTIATE(V)                                 \
    template int32_t exp_each<V>(V*);                         \
    template int32_t exp10<V>(V*);                       \
    template int32_t log_each<V>(V*);                         \
    template int32_t log10_each<V>(V*);                       \
    template int32_t db<V>(V*, real_t<V>);               \
    template int32_t sin_each<V>(V*);                         \
    template int32_t cos_each<V>(V*);                         \
    template int32_t tan_each<V>(V*);                         \
    template int32_t atan_each<V>(V*);                        \
    template int32_t tanh_each<V>(V*);                        \
    template int32_t acos_each<V>(V*);                        \
    template int32_t asin_each<V>(V*);                        \
    template int32_t cosh_each<V>(V*);                        \
    template int32_t sinh_each<V>(V*);                        \
    template int32_t sinc<V>(V*);                        \
    template int32_t besi0<V>(V*);                       \
    template int32_t besj0<V>(V*);                       \
    template int32_t besj1<V>(V*);                       \
    template int32_t besy0<V>(V*);                       \
    template int32_t besy1<V>(V*);                       \
    template real_t<V> besi0_kernel<V>(real_t<V>);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
#define VLX_EXPORT_1(name, fn)                                           \
    VLX_API int32_t vlxi_##name(vlx_t* v) { return vlx::fn(v); }        \
    VLX_API int32_t vlxfi_##name(vlxf_t* v) { return vlx::fn(v); }
VLX_EXPORT_1(exp, exp_each)
VLX_EXPORT_1(exp10, exp10)
VLX_EXPORT_1(log, log_each)
VLX_EXPORT_1(log10, log10_each)
VLX_EXPORT_1(sin, sin_each)
VLX_EXPORT_1(cos, cos_each)
VLX_EXPORT_1(tan, tan_each)
VLX_EXPORT_1(atan, atan_each)
VLX_EXPORT_1(tanh, tanh_each)
VLX_EXPORT_1(acos, acos_each)
VLX_EXPORT_1(asin, asin_each)
VLX_EXPORT_1(cosh, cosh_each)
VLX_EXPORT_1(sinh, sinh_each)
VLX_EXPORT_1(sinc, sinc)
VLX_EXPORT_1(besi0, besi0)
VLX_EXPORT_1(besj0, besj0)
VLX_EXPORT_1(besj1, besj1)
VLX_EXPORT_1(besy0, besy0)
VLX_EXPORT_1(besy1, besy1)
#undef VLX_EXPORT_1
VLX_API int32_t vlxi_db(vlx_t* v, double factor) { return vlx::db(v, factor); }
VLX_API int32_t vlxfi_db(vlxf_t* v, float factor) { return vlx::db(v, factor); }
VLX_API double vlx_besi0_kernel(double x) { return vlx::besi0_kernel<vlx_t>(x); }
VLX_API float vlxf_besi0_kernel(float x) { return vlx::besi0_kernel<vlxf_t>(x); }
}
