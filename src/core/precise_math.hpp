// Math-library calls whose names say the precision they run in.  std::cos on
// a float is the single-precision function; several float twins must compute
// a step in double and narrow, and these names keep that visible.
#pragma once

#include <cmath>

namespace vlx {

inline double cos_d(double x) { return std::cos(x); }
inline double sin_d(double x) { return std::sin(x); }
inline double log_d(double x) { return std::log(x); }
inline float cos_f(float x) { return std::cos(x); }
inline float sin_f(float x) { return std::sin(x); }
inline float log_f(float x) { return std::log(x); }

}  // namespace vlx
