// The spectrum pipeline: copy the record, window it, scale it so that a
// sine's peak reads its amplitude, rotate a centred record's time origin to
// index 0, zero-pad, transform and centre; and the way back.
#include "streaming/streaming.hpp"

#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"
#include "transforms/transforms.hpp"
#include "windows/windows.hpp"

namespace vlx {
namespace {

// Pad layouts of the zero-padding: at the end, or split about a rotated
// record's origin, scaled by the length ratio or not.
constexpr int32_t pad_end_unscaled = VLX_PAD_HEAD | VLX_PAD_SCALE_NONE;        // 2
constexpr int32_t pad_split_unscaled = VLX_PAD_SPLIT | VLX_PAD_SCALE_NONE;     // 770
constexpr int32_t pad_split_scaled = VLX_PAD_SPLIT | VLX_PAD_SCALE_RATIO;      // 768
constexpr int32_t pad_end_scaled = VLX_PAD_HEAD | VLX_PAD_SCALE_RATIO;         // 0

// Transform lengths stop doubling beyond this.
constexpr int32_t longest_half = 1073741823;

inline bool has(int32_t flags, int32_t bit) { return (flags & bit) != 0; }

// Whether the record's time origin lies in its middle, so that the forward
// path rotated it and the way back must rotate it again.
inline bool centred(int32_t window, int32_t flags) {
    return window != 0 || has(flags, VLX_SPEC_SUM | VLX_SPEC_CENTRED);
}

// Window flags formed by the pipeline: mean normalisation, and the uniform
// window rotated too when the origin is to be in the middle.
inline int32_t window_flags(int32_t flags) {
    return has(flags, VLX_SPEC_SUM | VLX_SPEC_CENTRED) ? wflag_swap_uniform : 0;
}

// The closing scale of both inverse paths: 1/points for a plain sum, else the
// 0.5 that undoes the forward factor 2 (none for a two-sided spectrum).
template <VlxVector V>
int32_t inverse_scale(V* out, int32_t flags) {
    using T = real_t<V>;
    if (has(flags, VLX_SPEC_SUM)) {
        if (out->points < 1) return 0;
        return scale(out, T(1) / static_cast<T>(out->points));
    }
    if (has(flags, VLX_SPEC_TWO_SIDED)) return 0;
    return scale(out, T(0.5));
}

template <VlxVector V>
int32_t dft_forward(V* in, V* out, int32_t window, int32_t flags) {
    using T = real_t<V>;
    const bool real_record = in->complex == 0;
    if (copy(out, in) < 0) return -1;
    if (has(flags, VLX_SPEC_RAW)) return dft(out, 0) < 0 ? -1 : 0;
    if (!has(flags, VLX_SPEC_NO_WINDOW)) {
        if (vlx::window(out, window, window_flags(flags)) < 0) return -1;
    } else if (centred(window, flags)) {
        if (swap_halves2(out) < 0) return -1;
    }
    if (has(flags, VLX_SPEC_SUM)) {
        if (out->points > 0 && scale(out, static_cast<T>(out->points)) < 0) return -1;
    } else if (!has(flags, VLX_SPEC_TWO_SIDED)) {
        // the transform divides by the length: a one-sided peak then reads
        // the sine's amplitude (applied to complex records all the same)
        if (scale(out, T(2)) < 0) return -1;
    }
    if (!has(flags, VLX_SPEC_TWO_SIDED) && real_record) return rdft(out) < 0 ? -1 : 0;
    if (dft(out, 0) < 0 || swap_halves(out) < 0) return -1;
    return 0;
}

template <VlxVector V>
int32_t dft_inverse(V* in, V* out, int32_t window, int32_t flags) {
    if (copy(out, in) < 0) return -1;
    if (has(flags, VLX_SPEC_RAW)) return dft(out, 1) < 0 ? -1 : 0;
    if (has(flags, VLX_SPEC_TWO_SIDED | VLX_SPEC_TWO_SIDED_IN)) {
        if (swap_halves2(out) < 0 || dft(out, 1) < 0) return -1;
    } else if (irdft(out, has(flags, VLX_SPEC_ODD) ? 1 : 0) < 0) {
        return -1;
    }
    if (centred(window, flags) && swap_halves(out) < 0) return -1;
    // the window is not divided out
    return inverse_scale(out, flags) < 0 ? -1 : 0;
}

template <VlxVector V>
int32_t fft_forward_path(V* in, V* out, int32_t length, real_t<V> f, int32_t window, int32_t flags) {
    using T = real_t<V>;
    const bool real_record = in->complex == 0;
    // The record is the first rec samples, rounded up; the window's width is
    // rec itself.
    T rec = static_cast<T>(length) * f;
    if (static_cast<T>(in->points) < rec) rec = static_cast<T>(in->points);
    if (subvec(in, out, 0, ceil_pts<V>(rec)) < 0) return -1;
    if (!has(flags, VLX_SPEC_RAW)) {
        if (!has(flags, VLX_SPEC_NO_WINDOW)) {
            if (window2(out, window, wflag_width | window_flags(flags), rec) < 0) return -1;
        } else if (window > 0 || has(flags, VLX_SPEC_SUM | VLX_SPEC_CENTRED)) {
            if (swap_halves2(out) < 0) return -1;
        }
        if (has(flags, VLX_SPEC_SUM)) {
            if (out->points > 0 && scale(out, static_cast<T>(length)) < 0) return -1;
        } else if (!has(flags, VLX_SPEC_TWO_SIDED)) {
            if (scale(out, T(2)) < 0) return -1;
        }
    }
    // Padding in the middle keeps a rotated record's origin at index 0; the
    // length-ratio scaling keeps a sine's peak level across the padding.
    int32_t pad = pad_end_scaled;
    if (has(flags, VLX_SPEC_RAW)) pad = pad_end_unscaled;
    else if (has(flags, VLX_SPEC_SUM)) pad = pad_split_unscaled;
    else if (has(flags, VLX_SPEC_CENTRED) || window != 0) pad = pad_split_scaled;
    if (zpad2(out, length, pad) < 0) return -1;
    if (has(flags, VLX_SPEC_RAW)) return fft(out, 0) < 0 ? -1 : 0;
    if (!has(flags, VLX_SPEC_TWO_SIDED) && real_record) return rfft(out) < 0 ? -1 : 0;
    if (fft(out, 0) < 0 || swap_halves(out) < 0) return -1;
    return 0;
}

template <VlxVector V>
int32_t fft_inverse_path(V* in, V* out, int32_t length, real_t<V> f, int32_t window, int32_t flags) {
    using T = real_t<V>;
    const int32_t keep = ceil_pts<V>(static_cast<T>(length) * f);
    if (has(flags, VLX_SPEC_RAW)) {
        if (subvec(in, out, 0, length) < 0 || zpad(out, length) < 0 || fft(out, 1) < 0) return -1;
        return 0;
    }
    if (has(flags, VLX_SPEC_TWO_SIDED | VLX_SPEC_TWO_SIDED_IN)) {
        if (copy(out, in) < 0 || swap_halves2(out) < 0) return -1;
        const int32_t r = out->points > length ? unzpad(out, length, pad_split_unscaled)
                                               : zpad2(out, length, pad_split_unscaled);
        if (r < 0 || fft(out, 1) < 0) return -1;
    } else {
        const int32_t half = length / 2 + 1;
        if (subvec(in, out, 0, half) < 0 || zpad(out, half) < 0 || irfft(out) < 0) return -1;
    }
    int32_t pad = pad_end_scaled;
    if (has(flags, VLX_SPEC_SUM)) pad = pad_split_unscaled;
    else if (has(flags, VLX_SPEC_CENTRED) || window != 0) pad = pad_split_scaled;
    if (unzpad(out, keep, pad) < 0) return -1;
    if (centred(window, flags) && swap_halves(out) < 0) return -1;
    return inverse_scale(out, flags) < 0 ? -1 : 0;
}

}  // namespace

template <VlxVector V>
int32_t spectrum_dft(V* in, V* out, int32_t window, int32_t flags) {
    if (in == nullptr || out == nullptr) return -1;
    return has(flags, VLX_SPEC_INVERSE) ? dft_inverse(in, out, window, flags) : dft_forward(in, out, window, flags);
}

template <VlxVector V>
int32_t spectrum_fft(V* in, V* out, int32_t nfft, real_t<V> fraction, int32_t window, int32_t flags) {
    using T = real_t<V>;
    if (in == nullptr || out == nullptr) return -1;
    const bool inverse = has(flags, VLX_SPEC_INVERSE);
    int32_t len_arg = nfft;
    T f = fraction;
    if (f <= T(0) || f > T(1)) f = T(1);
    // these read the whole record at its own length
    if (has(flags, VLX_SPEC_SUM | VLX_SPEC_CENTRED | VLX_SPEC_RAW)) {
        len_arg = 0;
        f = T(1);
    }
    if (len_arg < 1) {
        len_arg = in->points;
        if (inverse && !has(flags, VLX_SPEC_TWO_SIDED | VLX_SPEC_TWO_SIDED_IN | VLX_SPEC_RAW))
            len_arg = 2 * in->points - 2;
    }
    int32_t length = 1;
    while (length < len_arg && length <= longest_half) length *= 2;
    return inverse ? fft_inverse_path(in, out, length, f, window, flags)
                   : fft_forward_path(in, out, length, f, window, flags);
}

#define VLX_INSTANTIATE(V)                                                        \
    template int32_t spectrum_dft<V>(V*, V*, int32_t, int32_t);                   \
    template int32_t spectrum_fft<V>(V*, V*, int32_t, real_t<V>, int32_t, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxh_dft(vlx_t* in, vlx_t* out, int32_t window, int32_t flags) {
    return vlx::spectrum_dft(in, out, window, flags);
}
VLX_API int32_t vlxfh_dft(vlxf_t* in, vlxf_t* out, int32_t window, int32_t flags) {
    return vlx::spectrum_dft(in, out, window, flags);
}
VLX_API int32_t vlxh_fft(vlx_t* in, vlx_t* out, int32_t nfft, double fraction, int32_t window, int32_t flags) {
    return vlx::spectrum_fft(in, out, nfft, fraction, window, flags);
}
VLX_API int32_t vlxfh_fft(vlxf_t* in, vlxf_t* out, int32_t nfft, float fraction, int32_t window, int32_t flags) {
    return vlx::spectrum_fft(in, out, nfft, fraction, window, flags);
}
}
