// Lines, cosines and complex exponentials on the vector's own x axis.
#include "design/design.hpp"

#include "core/precise_math.hpp"

#include <cstdint>
#include <type_traits>

namespace vlx {
namespace {

// The rotation restarts from the math library every block of this many samples.
constexpr int64_t kBlock = 256;

// Runs the two-term rotation (x, y) -> (x*c - y*s, y*c + x*s) over n samples
// in the precision R, asking start(i) for the exact (x, y) at the first sample
// i of each block and handing every sample to store(k, x, y) before it is
// rotated on.
template <class R, class Start, class Store>
void rotate_blocks(int64_t n, R c, R s, Start start, Store store) {
    for (int64_t i = 0; i < n; i += kBlock) {
        R x, y;
        start(i, x, y);
        const int64_t end = i + kBlock < n ? i + kBlock : n;
        for (int64_t k = i; k < end; ++k) {
            store(k, x, y);
            const R next_x = x * c - y * s;
            y = y * c + x * s;
            x = next_x;
        }
    }
}

}  // namespace

template <VlxVector V>
int32_t line(V* v, real_t<V> slope, real_t<V> offset) {
    using T = real_t<V>;
    if (alloc(v) != 0) return -1;
    const int64_t n = v->points;
    const T step = v->delta * slope;
    T* d = v->data;
    // a running sum, so the rounding is that of repeated addition
    T value = offset;
    if (v->complex) {
        for (int64_t k = 0; k < n; ++k) {
            d[2 * k] = value;
            d[2 * k + 1] = T(0);
            value = value + step;
        }
    } else {
        for (int64_t k = 0; k < n; ++k) {
            d[k] = value;
            value = value + step;
        }
    }
    return 0;
}

template <VlxVector V>
int32_t cos_wave(V* v, real_t<V> freq, real_t<V> phase) {
    using T = real_t<V>;
    if (alloc(v) != 0) return -1;
    const int64_t n = v->points;
    const T w = v->delta * T(2) * family<V>::pi * freq;
    const T c = own_cos(w);
    const T s = own_sin(w);
    T* d = v->data;
    auto start = [w, phase](int64_t i, T& x, T& y) {
        const T theta = static_cast<T>(i) * w + phase;
        if constexpr (std::is_same_v<T, float>) {
            // the float twin restarts through double, reduced to one turn
            const double turn = fmod64(static_cast<double>(theta), 6.283185307179586);
            x = static_cast<float>(cos64(turn));
            y = static_cast<float>(sin64(turn));
        } else {
            x = cos64(theta);
            y = sin64(theta);
        }
    };
    // filled as real scalars; a complex vector is spread out afterwards
    rotate_blocks<T>(n, c, s, start, [d](int64_t k, T x, T) { d[k] = x; });
    if (v->complex) {
        v->complex = 0;
        if (rtoc(v) != 0) return -1;
    }
    return 0;
}

template <VlxVector V>
int32_t cexp_wave(V* v, real_t<V> freq, real_t<V> phase) {
    using T = real_t<V>;
    if (!v->complex) return cos_wave(v, freq, phase);
    if (alloc(v) != 0) return -1;
    const int64_t n = v->points;
    const T w = v->delta * T(2) * family<V>::pi * freq;
    T* d = v->data;
    // Both twins rotate in double; the float twin narrows the rotation's
    // coefficients, each restart and each stored sample to single.
    const double c = static_cast<T>(cos64(static_cast<double>(w)));
    const double s = static_cast<T>(sin64(static_cast<double>(w)));
    auto start = [w, phase](int64_t i, double& x, double& y) {
        double theta = static_cast<double>(i) * static_cast<double>(w) + static_cast<double>(phase);
        if constexpr (std::is_same_v<T, float>) theta = fmod64(theta, 6.283185307179586);
        x = static_cast<T>(cos64(theta));
        y = static_cast<T>(sin64(theta));
    };
    rotate_blocks<double>(n, c, s, start, [d](int64_t k, double x, double y) {
        d[2 * k] = static_cast<T>(x);
        d[2 * k + 1] = static_cast<T>(y);
    });
    return 0;
}

#define VLX_INSTANTIATE(V)                                              \
    template int32_t line<V>(V*, real_t<V>, real_t<V>);                 \
    template int32_t cos_wave<V>(V*, real_t<V>, real_t<V>);             \
    template int32_t cexp_wave<V>(V*, real_t<V>, real_t<V>);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxc_line(vlx_t* v, double slope, double offset) { return vlx::line(v, slope, offset); }
VLX_API int32_t vlxfc_line(vlxf_t* v, float slope, float offset) { return vlx::line(v, slope, offset); }
VLX_API int32_t vlxc_cos(vlx_t* v, double freq, double phase) { return vlx::cos_wave(v, freq, phase); }
VLX_API int32_t vlxfc_cos(vlxf_t* v, float freq, float phase) { return vlx::cos_wave(v, freq, phase); }
VLX_API int32_t vlxc_cexp(vlx_t* v, double freq, double phase) { return vlx::cexp_wave(v, freq, phase); }
VLX_API int32_t vlxfc_cexp(vlxf_t* v, float freq, float phase) { return vlx::cexp_wave(v, freq, phase); }
}
