// Ordering statistics: the in-place sort, the median that rests on it, and
// the histogram.
#include "stats/stats.hpp"

#include <algorithm>
#include <complex>

namespace vlx {
namespace {

using stats::beyond;

// Complex order: by power, then the real part, then the imaginary part.  The
// power is taken on components in which anything beyond the bound counts as
// +bound, also a negative one; the ties compare the raw components.
template <class T>
struct ComplexLess {
    T bound;
    T power(const std::complex<T>& z) const {
        const T re = beyond(z.real(), bound) ? bound : z.real();
        const T im = beyond(z.imag(), bound) ? bound : z.imag();
        return re * re + im * im;
    }
    bool operator()(const std::complex<T>& a, const std::complex<T>& b) const {
        const T pa = power(a), pb = power(b);
        if (pa != pb) return pa < pb;
        if (a.real() != b.real()) return a.real() < b.real();
        return a.imag() < b.imag();
    }
};

}  // namespace

// A NaN compares equal to everything, which is no strict weak order: sorting
// with it as it stands could run a partition past the ends.  Any placement of
// a NaN is consistent with "equal", so NaN samples (a NaN in either component
// for complex ones) are moved to the end first, and the rest, on which the
// order is strict and weak, is sorted normally.
template <VlxVector V>
int32_t sort(V* v) {
    using T = real_t<V>;
    if (v->points < 1) return 0;
    const int64_t n = v->points;
    if (v->complex) {
        auto* z = reinterpret_cast<std::complex<T>*>(v->data);
        auto* end = std::partition(z, z + n, [](const std::complex<T>& s) {
            return !std::isnan(s.real()) && !std::isnan(s.imag());
        });
        std::sort(z, end, ComplexLess<T>{family<V>::bound});
    } else {
        T* x = v->data;
        T* end = std::partition(x, x + n, [](T s) { return !std::isnan(s); });
        std::sort(x, end);
    }
    return 0;
}

template <VlxVector V>
int32_t median(const V* src, V* dst) {
    using T = real_t<V>;
    TempVector<V> local;
    if (copy(local.get(), const_cast<V*>(src)) < 0) return -1;
    if (sort(local.get()) < 0) return -1;
    const int64_t n = local->points;
    const bool is_complex = src->complex != 0;
    dst->points = 1;
    dst->complex = is_complex ? 1 : 0;
    if (alloc(dst) < 0) return -1;
    const T* x = local->data;
    const int width = is_complex ? 2 : 1;
    for (int c = 0; c < width; ++c) {
        T m = T(0);
        if (n > 0 && n % 2 == 1)
            m = x[width * (n / 2) + c];
        else if (n > 0)
            m = (x[width * (n / 2 - 1) + c] + x[width * (n / 2) + c]) * T(0.5);
        dst->data[c] = m;
    }
    return 0;
}

namespace {

template <VlxVector V>
struct hist_consts;
template <>
struct hist_consts<vlx_t> {
    // a value a rounding error above the top edge still counts in the top bin
    static constexpr double top_tolerance = 1.0000000000000022;
};
template <>
struct hist_consts<vlxf_t> {
    static constexpr float top_tolerance = 1.0000011920928955f;
};

template <VlxVector V>
int32_t hist_core(const V* src, V* dst, real_t<V> origin, real_t<V> width, int32_t bins) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    dst->complex = 0;
    dst->points = bins;
    dst->delta = width;
    if (zero(dst) < 0) return -1;
    const int64_t n = src->points > 0 ? src->points : 0;
    if (n == 0 || bins < 1) return 0;
    const T* x = src->data;
    T* count = dst->data;
    const T tbins = static_cast<T>(bins);
    const T top = tbins * hist_consts<V>::top_tolerance;
    for (int64_t i = 0; i < n; ++i) {
        T value;
        if (src->complex) {
            const T re = x[2 * i], im = x[2 * i + 1];
            value = (beyond(re, bound) || beyond(im, bound)) ? bound : own_sqrt(re * re + im * im);
        } else {
            value = x[i];
        }
        T t = value - origin;
        if (width != T(0))
            t = t / width;
        else if (t != T(0))
            t = bound;  // NaN too
        // Truncation toward zero; only taken for t inside the histogram's
        // reach, where it fits in 32 bits.
        if (t >= T(0) && t < tbins) {
            int64_t k = static_cast<int64_t>(t);
            if (k > bins - 1) k = bins - 1;
            count[k] += T(1);
        } else if (t >= tbins && t < top) {
            // In single precision the tolerance spans whole bins once bins
            // pass about 840000; such values still go to the top bin.
            int64_t k = static_cast<int64_t>(t) - 1;
            if (k > bins - 1) k = bins - 1;
            count[k] += T(1);
        }
    }
    return 0;
}

}  // namespace

// Bins are half-open, lower edge included; values below the origin or above
// the top edge are dropped without notice.
template <VlxVector V>
int32_t hist(const V* src, V* dst, real_t<V> origin, real_t<V> width, int32_t bins) {
    if (src != dst) return hist_core(src, dst, origin, width, bins);
    TempVector<V> local;
    const int32_t status = hist_core(src, local.get(), origin, width, bins);
    if (copy(dst, local.get()) < 0) return -1;
    return status;
}

#define VLX_INSTANTIATE(V)                                                          \
    template int32_t sort<V>(V*);                                                   \
    template int32_t median<V>(const V*, V*);                                       \
    template int32_t hist<V>(const V*, V*, real_t<V>, real_t<V>, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_sort(vlx_t* v) { return vlx::sort(v); }
VLX_API int32_t vlxfi_sort(vlxf_t* v) { return vlx::sort(v); }
VLX_API int32_t vlxs_median(const vlx_t* s, vlx_t* d) { return vlx::median(s, d); }
VLX_API int32_t vlxfs_median(const vlxf_t* s, vlxf_t* d) { return vlx::median(s, d); }
VLX_API int32_t vlxs_hist(const vlx_t* s, vlx_t* d, double origin, double width, int32_t bins) {
    return vlx::hist(s, d, origin, width, bins);
}
VLX_API int32_t vlxfs_hist(const vlxf_t* s, vlxf_t* d, float origin, float width, int32_t bins) {
    return vlx::hist(s, d, origin, width, bins);
}
}
