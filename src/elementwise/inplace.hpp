// Shared pieces of the in-place math family: math-library calls under names
// that say their precision, and the loops that walk a vector's samples.
#pragma once

#include "core/core.hpp"
#include "core/precise_math.hpp"

#include <cmath>
#include <type_traits>

namespace vlx::inplace {

template <class T>
struct Cx {
    T re, im;
};

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
