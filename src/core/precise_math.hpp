// Math-library calls whose names say the precision they run in.  std::cos on
// a float is the single-precision function; several float twins must compute
// a step in double and narrow, and these names keep that visible.
#pragma once

#include <cmath>
#include <type_traits>

namespace vlx {

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
VLX_MATH_1(ceil)
VLX_MATH_1(floor)
#undef VLX_MATH_1

inline double atan2_64(double y, double x) { return std::atan2(y, x); }
inline float atan2_32(float y, float x) { return std::atan2(y, x); }
template <class T>
inline T own_atan2(T y, T x) {
    if constexpr (std::is_same_v<T, float>) return atan2_32(y, x); else return atan2_64(y, x);
}
inline double hypot64(double a, double b) { return std::hypot(a, b); }
inline double fmod64(double x, double y) { return std::fmod(x, y); }
inline double pow64(double x, double y) { return std::pow(x, y); }
// Both twins take hypot in double; the float twin rounds the result.
template <class T>
inline T wide_hypot(T a, T b) { return static_cast<T>(hypot64(static_cast<double>(a), static_cast<double>(b))); }
// Phase conversions take atan2 in double in both twins as well.
template <class T>
inline T wide_atan2(T y, T x) { return static_cast<T>(atan2_64(static_cast<double>(y), static_cast<double>(x))); }

}  // namespace vlx
