// Shared pieces of the in-place math family: math-library calls under names
// that say their precision, and the loops that walk a vector's samples.
#pragma once

#include "core/core.hpp"

#include <cmath>
#include <type_traits>

namespace vlx::inplace {

template <class T>
struct Cx {
    T re, im;
};

// fn64 is the double function, fn32 the float one.  own_fn runs in the
// sample's precision; wide_fn always goes through double and rounds, which is
// what the float twin of a few operations does.
#define VLX_MATH_1(fn)                                                                     \
    inline double fn##64(double x) { return std::fn(x); }                                  \
    inline float fn##32(float x) { return std::fn(x); }                                    \
    template <class T>                                                                     \
    inline T own_##fn(T x) {                                                               \
        if constexpr (std::is_same_v<T, float>) return fn##32(x); else return fn##64(x);   \
    }                                                                                      \
    template <class T>                                                                     \
    inline T wide_##fn(T x) { return static_cast<T>(fn##64(static_cast<double>(x))); }
VLX_MATH_1(sqrt)
VLX_MATH_1(exp)
VLX_MATH_1(log)
VLX_MATH_1(log10)
VLX_MATH_1(sin)
VLX_MATH_1(cos)
VLX_MATH_1(tan)
VLX_MATH_1(atan)
VLX_MATH_1(tanh)
VLX_MATH_1(acos)
VLX_MATH_1(asin)
VLX_MATH_1(cosh)
VLX_MATH_1(sinh)
#undef VLX_MATH_1

inline double atan2_64(double y, double x) { return std::atan2(y, x); }
inline float atan2_32(float y, float x) { return std::atan2(y, x); }
template <class T>
inline T own_atan2(T y, T x) {
    if constexpr (std::is_same_v<T, float>) return atan2_32(y, x); else return atan2_64(y, x);
}
inline double hypot64(double a, double b) { return std::hypot(a, b); }
// Both twins take hypot in double; the float twin rounds the result.
template <class T>
inline T wide_hypot(T a, T b) { return static_cast<T>(hypot64(static_cast<double>(a), static_cast<double>(b))); }

// Real-only operations refuse a complex vector before anything else.
template <VlxVector V, class F>
int32_t map_real(V* v, F f) {
    if (v->complex) return -1;
    const int64_t n = v->points;
    real_t<V>* d = v->data;
    for (int64_t i = 0; i < n; ++i) d[i] = f(d[i]);
    return 0;
}

// Same layout in and out: real samples through fr, complex points through fc.
template <VlxVector V, class FR, class FC>
int32_t map_both(V* v, FR fr, FC fc) {
    const int64_t n = v->points;
    real_t<V>* d = v->data;
    if (!v->complex) {
        for (int64_t i = 0; i < n; ++i) d[i] = fr(d[i]);
    } else {
        for (int64_t i = 0; i < n; ++i) {
            const Cx<real_t<V>> r = fc(d[2 * i], d[2 * i + 1]);
            d[2 * i] = r.re;
            d[2 * i + 1] = r.im;
        }
    }
    return 0;
}

// Part beyond +-limit, the test of the clamps.
template <class T>
inline bool beyond(T x, T limit) {
    return std::fabs(x) > limit;
}

template <class T>
inline T clamp_part(T x, T limit) {
    if (x > limit) return limit;
    if (x < -limit) return -limit;
    return x;
}

}  // namespace vlx::inplace
