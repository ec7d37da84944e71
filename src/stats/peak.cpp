// Peak search: the largest or smallest sample, or the sample at an index,
// with its value and a fractional position refined between samples.
#include "stats/stats.hpp"

namespace vlx {
namespace {

using stats::beyond;

template <VlxVector V>
struct peak_consts;

template <>
struct peak_consts<vlx_t> {
    static constexpr double ratio_scale = 0.792233201343665;
    static constexpr double cubic = 0.02036;
    static constexpr double height = 0.315563649157834;
};

template <>
struct peak_consts<vlxf_t> {
    static constexpr float ratio_scale = 0.7922332f;
    static constexpr float cubic = 0.02036f;
    static constexpr float height = 0.31556365f;
};

// Search's comparison value: the sample itself, or for a complex sample its
// power, which is exactly the bound once a component lies beyond the bound.
// That clamp is not monotonic (a finite sample of power above the bound
// outranks it), and it stays so.
template <VlxVector V>
inline real_t<V> rank(const V* v, int64_t i) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    if (!v->complex) return v->data[i];
    const T re = v->data[2 * i], im = v->data[2 * i + 1];
    return (beyond(re, bound) || beyond(im, bound)) ? bound : re * re + im * im;
}

// The value refinement works on: power of a complex sample, the plain sample
// of a real one (not squared, not made absolute).
template <VlxVector V>
inline real_t<V> power(const V* v, int64_t i) {
    if (!v->complex) return v->data[i];
    const real_t<V> re = v->data[2 * i], im = v->data[2 * i + 1];
    return re * re + im * im;
}

// First of equal samples wins; a NaN is never taken.
template <VlxVector V>
int64_t search(const V* src, bool for_min) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = src->points;
    int64_t best_i = 0;
    if (!src->complex) {
        const T* x = src->data;
        T best = for_min ? bound : -bound;
        if (for_min) {
            for (int64_t i = 0; i < n; ++i)
                if (x[i] < best) best = x[i], best_i = i;
        } else {
            for (int64_t i = 0; i < n; ++i)
                if (x[i] > best) best = x[i], best_i = i;
        }
        return best_i;
    }
    T best = for_min ? bound : -bound;
    for (int64_t i = 0; i < n; ++i) {
        const T c = rank(src, i);
        if (for_min ? c < best : c > best) best = c, best_i = i;
    }
    return best_i;
}

template <VlxVector V>
int32_t peak_core(const V* src, V* dst, int32_t flags, int32_t index) {
    using T = real_t<V>;
    using K = peak_consts<V>;
    dst->points = 2;
    dst->complex = 0;
    if (alloc(dst) < 0) return -1;
    const int64_t n = src->points;
    int64_t i;
    if (flags & VLX_PEAK_AT_INDEX) {
        i = index < 0 ? 0 : index;
        if (i >= n) i = n - 1;
    } else {
        i = search(src, (flags & VLX_PEAK_MIN) != 0);
    }
    T* out = dst->data;
    if (n < 1) {
        out[0] = T(0);
        out[1] = T(0);
        return 0;
    }
    const int32_t method = flags & 0x700;
    const bool at_edge = i == 0 || i == n - 1;
    if (method == VLX_PEAK_SAMPLE || (method == VLX_PEAK_PARABOLA && at_edge) ||
        ((method == VLX_PEAK_LOG_RATIO || method == VLX_PEAK_LOG_RATIO_CORRECTED) && n < 2)) {
        out[0] = power(src, i);
        out[1] = static_cast<T>(i);
        return 0;
    }
    if (method == VLX_PEAK_PARABOLA) {
        // No guard against q = 0: three equal samples divide by zero, and the
        // IEEE result stands.
        const T a = power(src, i - 1), b = power(src, i), c = power(src, i + 1);
        const T p = (c - a) * T(0.5);
        const T q = (c - T(2) * b + a) * T(0.5);
        out[0] = b - p * p / (T(4) * q);
        out[1] = static_cast<T>(i) - p / (T(2) * q);
        return 0;
    }
    if (method != VLX_PEAK_LOG_RATIO && method != VLX_PEAK_LOG_RATIO_CORRECTED) return -1;
    // Left sample of the pair that brackets the peak; a tie goes right.
    int64_t k = i;
    if (i == n - 1 || (i > 0 && power(src, i - 1) > power(src, i + 1))) k = i - 1;
    const T y0 = power(src, k), y1 = power(src, k + 1);
    T d = K::ratio_scale * own_log(y1 / y0);
    if (method == VLX_PEAK_LOG_RATIO_CORRECTED) d = d * (T(1) - (d * d - T(0.25)) * K::cubic);
    d = d + T(0.5);
    // An offset outside its range means the two samples are not on one lobe:
    // the result is still filled, and -1 serves as a warning.  NaN passes.
    int32_t status = 0;
    if (d < T(-0.5)) {
        d = T(-0.5);
        status = -1;
    } else if (d > T(1.5)) {
        d = T(1.5);
        status = -1;
    }
    out[0] = own_exp(K::height * d * d) * y0;
    out[1] = static_cast<T>(k) + d;
    return status;
}

}  // namespace

template <VlxVector V>
int32_t peak(const V* src, V* dst, int32_t flags, int32_t index) {
    if (src != dst) return peak_core(src, dst, flags, index);
    // In place: the result goes through a fresh vector, whose delta of 1 the
    // copy carries over to dst.
    V local;
    init(&local);
    const int32_t status = peak_core(src, &local, flags, index);
    const int32_t copied = copy(dst, &local);
    destroy(&local);
    return copied < 0 ? -1 : status;
}

template int32_t peak<vlx_t>(const vlx_t*, vlx_t*, int32_t, int32_t);
template int32_t peak<vlxf_t>(const vlxf_t*, vlxf_t*, int32_t, int32_t);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxs_peak(const vlx_t* s, vlx_t* d, int32_t flags, int32_t index) {
    return vlx::peak(s, d, flags, index);
}
VLX_API int32_t vlxfs_peak(const vlxf_t* s, vlxf_t* d, int32_t flags, int32_t index) {
    return vlx::peak(s, d, flags, index);
}
}
