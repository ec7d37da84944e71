// Layout operations: where the samples of a vector stand.
#include "elementwise/elementwise.hpp"
#include "core/precise_math.hpp"

#include <cmath>
#include <cstring>
#include <limits>
#include <numeric>
#include <type_traits>
#include <utility>

namespace vlx {
namespace {

// Bits 0-1 of the padding flags: the scale mode; bits 8-10: the layout.
constexpr int32_t kScaleMask = 0x3;
constexpr int32_t kScaleRatio = 0;
constexpr int32_t kScaleSqrt = 1;
constexpr int32_t kScaleNone = 2;
constexpr int32_t kLayoutMask = 0x700;
constexpr int32_t kHead = 0x000;
constexpr int32_t kCentre = 0x100;
constexpr int32_t kTail = 0x200;
constexpr int32_t kSplit = 0x300;

template <class T>
struct PadScale {
    bool valid;
    bool on;
    T factor;
};

// The scale of a padding step from `from` to `to` points: the length ratio,
// its square root or nothing.  No scale when the ratio would divide by 0.
template <VlxVector V>
PadScale<real_t<V>> decide_scale(int32_t flags, int32_t from, int32_t to) {
    using T = real_t<V>;
    const int32_t mode = flags & kScaleMask;
    const int32_t layout = flags & kLayoutMask;
    if (mode == 3 || layout > kSplit) return {false, false, T(0)};
    if (mode == kScaleNone || from == 0) return {true, false, T(1)};
    // The ratio is formed in the vector's own precision.
    const T ratio = static_cast<T>(to) / static_cast<T>(from);
    if (mode == kScaleRatio) return {true, true, ratio};
    static_assert(kScaleSqrt == 1);
    return {true, true, own_sqrt<T>(ratio)};
}

template <class T>
void zero_scalars(T* d, int64_t from, int64_t to) {
    for (int64_t i = from; i < to; ++i) d[i] = T(0);
}

// Moves `count` scalars from `from` up to `to` (to > from), scaled: a
// backward walk, so that the ranges may overlap.
template <class T>
void move_up_scaled(T* d, int64_t from, int64_t to, int64_t count, T s) {
    for (int64_t i = count - 1; i >= 0; --i) d[to + i] = d[from + i] * s;
}

// Moves `count` scalars from `from` down to `to` (to < from), scaled: a
// forward walk, safe in place.
template <class T>
void move_down_scaled(T* d, int64_t from, int64_t to, int64_t count, T s) {
    for (int64_t i = 0; i < count; ++i) d[to + i] = d[from + i] * s;
}

template <class T>
void move_plain(T* d, int64_t from, int64_t to, int64_t count) {
    if (count > 0 && from != to) std::memmove(d + to, d + from, static_cast<size_t>(count) * sizeof(T));
}

// Scales the first `points` samples through vlxi_scale, restoring `points`.
template <VlxVector V>
int32_t scale_leading(V* v, int32_t points, real_t<V> s) {
    const int32_t keep = v->points;
    v->points = points;
    const int32_t r = scale(v, s);
    v->points = keep;
    return r;
}

// Rotates left by r samples in place: one cycle-leader walk per cycle,
// holding one sample (or pair) aside, each sample moved once.
template <class T>
void rotate_left(T* d, int64_t n, int64_t r, int64_t width) {
    if (n < 2 || r % n == 0) return;
    const int64_t cycles = std::gcd(n, r);
    for (int64_t start = 0; start < cycles; ++start) {
        T held[2];
        for (int64_t c = 0; c < width; ++c) held[c] = d[start * width + c];
        int64_t j = start;
        for (;;) {
            int64_t from = j + r;
            if (from >= n) from -= n;
            if (from == start) break;
            for (int64_t c = 0; c < width; ++c) d[j * width + c] = d[from * width + c];
            j = from;
        }
        for (int64_t c = 0; c < width; ++c) d[j * width + c] = held[c];
    }
}

// For even n both rotations swap the halves, pair by pair.
template <class T>
void swap_equal_halves(T* d, int64_t n, int64_t width) {
    const int64_t half = width * (n / 2);
    for (int64_t i = 0; i < half; ++i) std::swap(d[i], d[half + i]);
}

template <VlxVector V>
int32_t rotate(V* v, int64_t r) {
    const int64_t n = v->points;
    if (n < 1) return 0;
    const int64_t width = v->complex ? 2 : 1;
    if (n % 2 == 0)
        swap_equal_halves(v->data, n, width);
    else
        rotate_left(v->data, n, r, width);
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t real_part(V* v) {
    if (!v->complex) return 0;
    v->complex = 0;
    real_t<V>* d = v->data;
    // forward walk: sample k takes scalar 2k
    for (int64_t k = 0; k < v->points; ++k) d[k] = d[2 * k];
    return 0;
}

template <VlxVector V>
int32_t imag_part(V* v) {
    real_t<V>* d = v->data;
    if (v->complex) {
        v->complex = 0;
        for (int64_t k = 0; k < v->points; ++k) d[k] = d[2 * k + 1];
    } else {
        // the imaginary part of a real signal
        for (int64_t k = 0; k < v->points; ++k) d[k] = real_t<V>(0);
    }
    return 0;
}

template <VlxVector V>
int32_t rev(V* v) {
    const int64_t n = v->points;
    real_t<V>* d = v->data;
    if (v->complex) {
        for (int64_t k = 0; k < n / 2; ++k) {
            std::swap(d[2 * k], d[2 * (n - 1 - k)]);
            std::swap(d[2 * k + 1], d[2 * (n - 1 - k) + 1]);
        }
    } else {
        for (int64_t k = 0; k < n / 2; ++k) std::swap(d[k], d[n - 1 - k]);
    }
    return 0;
}

template <VlxVector V>
int32_t shift(V* v, int32_t k) {
    // n - k saturates: any count beyond the vector is clamped alike
    int64_t count = static_cast<int64_t>(v->points) - k;
    if (count > std::numeric_limits<int32_t>::max()) count = std::numeric_limits<int32_t>::max();
    if (count < 0) count = 0;
    return subvec(v, v, k, static_cast<int32_t>(count));
}

template <VlxVector V>
int32_t swap_halves(V* v) {
    const int64_t n = v->points;
    return rotate(v, n - n / 2);
}

template <VlxVector V>
int32_t swap_halves2(V* v) {
    return rotate(v, static_cast<int64_t>(v->points) / 2);
}

template <VlxVector V>
int32_t zpad2(V* v, int32_t new_n, int32_t flags) {
    using T = real_t<V>;
    const int32_t old = v->points < 0 ? 0 : v->points;
    if (old >= new_n) return 0;
    v->points = new_n;
    if (realloc(v, old, v->complex) != 0) return -1;
    // Invalid flags are seen only now, with the vector already grown and its
    // new samples unset: callers rely on this order.
    const PadScale<T> s = decide_scale<V>(flags, old, new_n);
    if (!s.valid) return -1;

    T* d = v->data;
    const int64_t w = v->complex ? 2 : 1;
    const int64_t o = w * old;
    const int64_t n = w * new_n;
    switch (flags & kLayoutMask) {
    case kHead:
        if (s.on && scale_leading(v, old, s.factor) != 0) return -1;
        zero_scalars(d, o, n);
        break;
    case kCentre: {
        // one more lead sample for an even target and an odd source keeps
        // the centre sample on n/2, so that unpadding is the exact inverse
        int64_t lead = (new_n - old) / 2;
        if (new_n % 2 == 0 && old % 2 == 1) ++lead;
        lead *= w;
        if (s.on)
            move_up_scaled(d, 0, lead, o, s.factor);
        else
            move_plain(d, 0, lead, o);
        zero_scalars(d, int64_t(0), lead);
        zero_scalars(d, lead + o, n);
        break;
    }
    case kTail:
        if (s.on)
            move_up_scaled(d, 0, n - o, o, s.factor);
        else
            move_plain(d, 0, n - o, o);
        zero_scalars(d, int64_t(0), n - o);
        break;
    default: {  // split: the first half keeps the odd sample
        const int64_t a = w * ((old + 1) / 2);
        const int64_t b = w * (old / 2);
        if (s.on) {
            move_up_scaled(d, a, n - b, b, s.factor);
            if (scale_leading(v, (old + 1) / 2, s.factor) != 0) return -1;
        } else {
            move_plain(d, a, n - b, b);
        }
        zero_scalars(d, a, n - b);
        break;
    }
    }
    return 0;
}

template <VlxVector V>
int32_t unzpad(V* v, int32_t new_n, int32_t flags) {
    using T = real_t<V>;
    if (new_n < 0) new_n = 0;
    const int32_t old = v->points < 0 ? 0 : v->points;
    if (old <= new_n) return 0;
    const PadScale<T> s = decide_scale<V>(flags, old, new_n);
    if (!s.valid) return -1;
    const bool on = s.on && new_n > 0;

    T* d = v->data;
    const int64_t w = v->complex ? 2 : 1;
    const int64_t o = w * old;
    const int64_t n = w * new_n;
    switch (flags & kLayoutMask) {
    case kHead:
        v->points = new_n;
        if (on && scale(v, s.factor) != 0) return -1;
        break;
    case kCentre: {
        int64_t lead = (old - new_n) / 2;
        if (old % 2 == 0 && new_n % 2 == 1) ++lead;
        lead *= w;
        v->points = new_n;
        if (on)
            move_down_scaled(d, lead, 0, n, s.factor);
        else
            move_plain(d, lead, 0, n);
        break;
    }
    case kTail:
        v->points = new_n;
        if (on)
            move_down_scaled(d, o - n, 0, n, s.factor);
        else
            move_plain(d, o - n, 0, n);
        break;
    default: {  // split
        const int32_t b_points = new_n / 2;
        const int64_t a = w * ((new_n + 1) / 2);
        const int64_t b = w * b_points;
        if (on) {
            // Scales the discarded middle too: one vlxi_scale pass over the
            // front, then the tail half scaled as it moves.
            v->points = old - b_points;
            if (scale(v, s.factor) != 0) return -1;
            move_down_scaled(d, o - b, a, b, s.factor);
        } else {
            move_plain(d, o - b, a, b);
        }
        v->points = new_n;
        break;
    }
    }
    return 0;
}

template <VlxVector V>
int32_t zinter_to(V* src, V* dst, real_t<V> scale_by) {
    using T = real_t<V>;
    const int32_t n = src->points;
    const int64_t doubled = 2 * static_cast<int64_t>(n);
    if (doubled > std::numeric_limits<int32_t>::max()) return -1;
    const bool same_data = dst->data == src->data;
    const int32_t is_complex = src->complex;
    dst->delta = src->delta * T(0.5);
    dst->complex = is_complex;
    dst->points = static_cast<int32_t>(doubled);
    const T* from = src->data;
    if (same_data) {
        const int32_t r = realloc(dst, n, is_complex);
        if (r != 0) return r;
        // the old samples now stand at the start of dst's block
        from = dst->data;
    } else {
        const int32_t r = alloc(dst);
        if (r != 0) return r;
    }
    T* to = dst->data;
    // backward, so that dst may be src
    if (is_complex) {
        for (int64_t k = static_cast<int64_t>(n) - 1; k >= 0; --k) {
            const T re = from[2 * k] * scale_by;
            const T im = from[2 * k + 1] * scale_by;
            to[4 * k + 2] = T(0);
            to[4 * k + 3] = T(0);
            to[4 * k] = re;
            to[4 * k + 1] = im;
        }
    } else {
        for (int64_t k = static_cast<int64_t>(n) - 1; k >= 0; --k) {
            const T x = from[k] * scale_by;
            to[2 * k + 1] = T(0);
            to[2 * k] = x;
        }
    }
    return 0;
}

template <VlxVector V>
int32_t zinter(V* v) {
    return zinter_to(v, v, real_t<V>(1));
}

#define VLX_INSTANTIATE(V)                                        \
    template int32_t real_part<V>(V*);                            \
    template int32_t imag_part<V>(V*);                            \
    template int32_t rev<V>(V*);                                  \
    template int32_t shift<V>(V*, int32_t);                       \
    template int32_t swap_halves<V>(V*);                          \
    template int32_t swap_halves2<V>(V*);                         \
    template int32_t zpad2<V>(V*, int32_t, int32_t);              \
    template int32_t unzpad<V>(V*, int32_t, int32_t);             \
    template int32_t zinter<V>(V*);                               \
    template int32_t zinter_to<V>(V*, V*, real_t<V>);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_real(vlx_t* v) { return vlx::real_part(v); }
VLX_API int32_t vlxfi_real(vlxf_t* v) { return vlx::real_part(v); }
VLX_API int32_t vlxi_imag(vlx_t* v) { return vlx::imag_part(v); }
VLX_API int32_t vlxfi_imag(vlxf_t* v) { return vlx::imag_part(v); }
VLX_API int32_t vlxi_rev(vlx_t* v) { return vlx::rev(v); }
VLX_API int32_t vlxfi_rev(vlxf_t* v) { return vlx::rev(v); }
VLX_API int32_t vlxi_shift(vlx_t* v, int32_t k) { return vlx::shift(v, k); }
VLX_API int32_t vlxfi_shift(vlxf_t* v, int32_t k) { return vlx::shift(v, k); }
VLX_API int32_t vlxi_swap_halves(vlx_t* v) { return vlx::swap_halves(v); }
VLX_API int32_t vlxfi_swap_halves(vlxf_t* v) { return vlx::swap_halves(v); }
VLX_API int32_t vlxi_swap_halves2(vlx_t* v) { return vlx::swap_halves2(v); }
VLX_API int32_t vlxfi_swap_halves2(vlxf_t* v) { return vlx::swap_halves2(v); }
VLX_API int32_t vlxi_zpad2(vlx_t* v, int32_t new_n, int32_t flags) { return vlx::zpad2(v, new_n, flags); }
VLX_API int32_t vlxfi_zpad2(vlxf_t* v, int32_t new_n, int32_t flags) { return vlx::zpad2(v, new_n, flags); }
VLX_API int32_t vlxi_unzpad(vlx_t* v, int32_t new_n, int32_t flags) { return vlx::unzpad(v, new_n, flags); }
VLX_API int32_t vlxfi_unzpad(vlxf_t* v, int32_t new_n, int32_t flags) { return vlx::unzpad(v, new_n, flags); }
VLX_API int32_t vlxi_zinter(vlx_t* v) { return vlx::zinter(v); }
VLX_API int32_t vlxfi_zinter(vlxf_t* v) { return vlx::zinter(v); }
VLX_API int32_t vlxu_zinter(vlx_t* src, vlx_t* dst, double s) { return vlx::zinter_to(src, dst, s); }
VLX_API int32_t vlxfu_zinter(vlxf_t* src, vlxf_t* dst, float s) { return vlx::zinter_to(src, dst, s); }
}
