// Operations along a vector: phase unwrapping, differences and running sums,
// level crossings, clipping, the polynomial derivative, and conversion to
// phase or polar form.  All work in place.
#include "elementwise/elementwise.hpp"
#include "core/precise_math.hpp"

#include <cmath>

namespace vlx {
namespace {

// The remainder of d by 2 pi brought into [-pi, pi].  fmod runs in double in
// both twins: the float twin widens d and divides by its own 2 pi widened,
// then rounds; the corrections run in the sample's precision.
template <VlxVector V>
real_t<V> reduce_phase(real_t<V> d) {
    using T = real_t<V>;
    constexpr T pi = family<V>::pi;
    constexpr T two_pi = family<V>::two_pi;
    T u = static_cast<T>(fmod64(static_cast<double>(d), static_cast<double>(two_pi)));
    if (u > pi)
        u -= two_pi;
    else if (-pi > u)
        u += two_pi;
    return u;
}

template <class T>
bool outside_pi(T d, T pi) {
    return d > pi || -pi > d;
}

}  // namespace

template <VlxVector V>
int32_t unwrap(V* v) {
    using T = real_t<V>;
    if (v->complex) return -1;
    constexpr T pi = family<V>::pi;
    T* x = v->data;
    const int64_t n = v->points;
    T p = T(0);  // the first sample is measured from 0 as well
    for (int64_t i = 0; i < n; ++i) {
        const T d = x[i] - p;
        if (outside_pi(d, pi)) x[i] = reduce_phase<V>(d) + p;
        p = x[i];
    }
    return 0;
}

template <VlxVector V>
int32_t unwrap_wnd(V* v, int32_t window) {
    using T = real_t<V>;
    if (v->complex || window < 0) return -1;
    // A window of one is the plain unwrap; the moving sum would round differently.
    if (window == 1) return unwrap(v);
    constexpr T pi = family<V>::pi;
    T* x = v->data;
    const int64_t n = v->points < 0 ? 0 : v->points;
    const int64_t m = window < n ? window : n;
    T s = T(0);
    // Until the window is full the reference is the mean of what came before.
    for (int64_t i = 0; i < m; ++i) {
        const T r = i > 0 ? s / static_cast<T>(i) : T(0);
        const T d = x[i] - r;
        if (outside_pi(d, pi)) x[i] = reduce_phase<V>(d) + r;
        s += x[i];
    }
    // Without a window the reference stays 0 throughout.
    const T w = window > 0 ? T(1) / static_cast<T>(window) : T(0);
    for (int64_t i = m; i < n; ++i) {
        const T r = window > 0 ? w * s : T(0);
        const T d = x[i] - r;
        if (outside_pi(d, pi)) x[i] = reduce_phase<V>(d) + r;
        // the moving sum drops the oldest output after adding the newest
        if (window > 0) s = (x[i] - x[i - window]) + s;
    }
    return 0;
}

template <VlxVector V>
int32_t differ(V* v) {
    using T = real_t<V>;
    const T f = v->delta == T(0) ? family<V>::bound : T(1) / v->delta;
    const int64_t n = v->points;
    const int64_t stride = v->complex ? 2 : 1;
    for (int64_t part = 0; part < stride; ++part) {
        T* x = v->data + part;
        T prev = T(0);
        for (int64_t i = 0; i < n; ++i) {
            const T cur = x[i * stride];
            x[i * stride] = (cur - prev) * f;
            prev = cur;
        }
    }
    return 0;
}

template <VlxVector V>
int32_t integ(V* v) {
    using T = real_t<V>;
    const T delta = v->delta;
    const int64_t n = v->points;
    const int64_t stride = v->complex ? 2 : 1;
    for (int64_t part = 0; part < stride; ++part) {
        T* x = v->data + part;
        T y = T(0);
        for (int64_t i = 0; i < n; ++i) {
            y = y + x[i * stride] * delta;
            x[i * stride] = y;
        }
    }
    return 0;
}

template <VlxVector V>
int32_t edge(V* v, int32_t mode, real_t<V> level) {
    using T = real_t<V>;
    if (v->complex) return -1;
    const int64_t n = v->points;
    if (n < 1) return 0;
    T* x = v->data;
    const T delta = v->delta;
    const bool rising = (mode & 1) != 0;
    const bool falling = (mode & 2) != 0;
    int64_t found = 0;
    // The write position never passes the read position, so this runs in place.
    for (int64_t i = 0; i + 1 < n; ++i) {
        const T a = x[i];
        const T b = x[i + 1];
        if ((rising && level >= a && b > level) || (falling && a >= level && level > b)) {
            const T t = (level - a) / (b - a);
            x[found++] = (t + static_cast<T>(i)) * delta;
        }
    }
    v->points = static_cast<int32_t>(found);
    v->delta = T(1);
    return 0;
}

template <VlxVector V>
int32_t limit(V* v, real_t<V> a, real_t<V> b, int32_t* clipped) {
    using T = real_t<V>;
    const T lo = a > b ? b : a;
    const T hi = a > b ? a : b;
    T* x = v->data;
    const int64_t count = scalar_count(v);
    int32_t changed = 0;
    for (int64_t i = 0; i < count; ++i) {
        if (x[i] > hi) {
            x[i] = hi;
            changed = 1;
        } else if (lo > x[i]) {
            x[i] = lo;
            changed = 1;
        }
    }
    if (clipped != nullptr) *clipped = changed;
    return 0;
}

template <VlxVector V>
int32_t pdiffer(V* v) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n < 1) return 0;
    T* x = v->data;
    if (v->complex) {
        for (int64_t i = 1; i < n; ++i) {
            const T k = static_cast<T>(i);
            x[2 * (i - 1)] = k * x[2 * i];
            x[2 * (i - 1) + 1] = k * x[2 * i + 1];
        }
    } else {
        for (int64_t i = 1; i < n; ++i) x[i - 1] = static_cast<T>(i) * x[i];
    }
    v->points = static_cast<int32_t>(n - 1);
    return 0;
}

template <VlxVector V>
int32_t phase(V* v) {
    using T = real_t<V>;
    T* x = v->data;
    const int64_t n = v->points;
    if (!v->complex) {
        // the sign as a phase; NaN is not below 0 and gets 0
        for (int64_t i = 0; i < n; ++i) x[i] = x[i] < T(0) ? family<V>::pi : T(0);
        return 0;
    }
    v->complex = 0;
    // Packed from the front: point i is read before scalar i is written.
    for (int64_t i = 0; i < n; ++i) {
        const T re = x[2 * i];
        const T im = x[2 * i + 1];
        x[i] = (re == T(0) && im == T(0)) ? T(0) : wide_atan2(im, re);
    }
    return 0;
}

template <VlxVector V>
int32_t rtop(V* v) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (!v->complex) {
        v->complex = 1;
        if (realloc(v, v->points, 0) < 0) return -1;
        T* x = v->data;
        // from the last point down, so that the spread is safe in place
        for (int64_t i = n - 1; i >= 0; --i) {
            const T s = x[i];
            x[2 * i] = std::fabs(s);
            x[2 * i + 1] = s < T(0) ? family<V>::pi : T(0);
        }
        return 0;
    }
    T* x = v->data;
    for (int64_t i = 0; i < n; ++i) {
        const T re = x[2 * i];
        const T im = x[2 * i + 1];
        x[2 * i] = wide_hypot(re, im);
        x[2 * i + 1] = (re == T(0) && im == T(0)) ? T(0) : wide_atan2(im, re);
    }
    return 0;
}

#define VLX_INSTANTIATE(V)                                                    \
    template int32_t unwrap<V>(V*);                                           \
    template int32_t unwrap_wnd<V>(V*, int32_t);                              \
    template int32_t differ<V>(V*);                                           \
    template int32_t integ<V>(V*);                                            \
    template int32_t edge<V>(V*, int32_t, real_t<V>);                         \
    template int32_t limit<V>(V*, real_t<V>, real_t<V>, int32_t*);            \
    template int32_t pdiffer<V>(V*);                                          \
    template int32_t phase<V>(V*);                                            \
    template int32_t rtop<V>(V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_unwrap(vlx_t* v) { return vlx::unwrap(v); }
VLX_API int32_t vlxfi_unwrap(vlxf_t* v) { return vlx::unwrap(v); }
VLX_API int32_t vlxi_unwrap_wnd(vlx_t* v, int32_t window) { return vlx::unwrap_wnd(v, window); }
VLX_API int32_t vlxfi_unwrap_wnd(vlxf_t* v, int32_t window) { return vlx::unwrap_wnd(v, window); }
VLX_API int32_t vlxi_differ(vlx_t* v) { return vlx::differ(v); }
VLX_API int32_t vlxfi_differ(vlxf_t* v) { return vlx::differ(v); }
VLX_API int32_t vlxi_integ(vlx_t* v) { return vlx::integ(v); }
VLX_API int32_t vlxfi_integ(vlxf_t* v) { return vlx::integ(v); }
VLX_API int32_t vlxi_edge(vlx_t* v, int32_t mode, double level) { return vlx::edge(v, mode, level); }
VLX_API int32_t vlxfi_edge(vlxf_t* v, int32_t mode, float level) { return vlx::edge(v, mode, level); }
// The second argument is part of the interface and unused.
VLX_API int32_t vlxi_limit(vlx_t* v, int32_t, double a, double b, int32_t* clipped) {
    return vlx::limit(v, a, b, clipped);
}
VLX_API int32_t vlxfi_limit(vlxf_t* v, int32_t, float a, float b, int32_t* clipped) {
    return vlx::limit(v, a, b, clipped);
}
VLX_API int32_t vlxi_pdiffer(vlx_t* v) { return vlx::pdiffer(v); }
VLX_API int32_t vlxfi_pdiffer(vlxf_t* v) { return vlx::pdiffer(v); }
VLX_API int32_t vlxi_phase(vlx_t* v) { return vlx::phase(v); }
VLX_API int32_t vlxfi_phase(vlxf_t* v) { return vlx::phase(v); }
VLX_API int32_t vlxi_rtop(vlx_t* v) { return vlx::rtop(v); }
VLX_API int32_t vlxfi_rtop(vlxf_t* v) { return vlx::rtop(v); }
}
