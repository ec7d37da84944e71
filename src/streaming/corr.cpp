// Correlation of a short template with a longer signal by one transform
// length: both zero-padded to a power of two, multiplied as spectra with the
// template conjugated, and transformed back.
#include "streaming/streaming.hpp"

#include "elementwise/elementwise.hpp"
#include "transforms/transforms.hpp"

namespace vlx {
namespace {

template <VlxVector V>
int32_t forward(V* v, bool complex_domain) {
    return complex_domain ? fft(v, 0) : rfft(v);
}

template <VlxVector V>
int32_t correlate(V* ref, V* sig, V* out, V* work, int32_t m, int32_t halve) {
    using T = real_t<V>;
    if (copy(work, sig) < 0) return -1;
    const int32_t n = sig->points;
    int32_t length = 1;
    while (length < n && length < (int32_t(1) << 30)) length *= 2;

    // Only measured: ref's shape at the signal's length decides out's.
    V ref_view = *ref;
    ref_view.points = n;
    if (prepare_dest(sig, &ref_view, out) < 0) return -1;
    const T delta = out->delta;

    // The first m template points, copied through a view: out takes the
    // template's complex flag, so a real template with a complex signal
    // meets a complex work in the real transform, which refuses it.
    V head = *ref;
    head.points = m;
    if (copy(out, &head) < 0) return -1;
    // The length-ratio scaling L/m, with the transforms' 1/L, divides the
    // sums by m.
    if (zpad2(out, length, VLX_PAD_SCALE_RATIO | VLX_PAD_HEAD) < 0) return -1;
    // out's complex flag chooses the transforms of both, not work's own
    const bool complex_domain = out->complex != 0;
    if (forward(out, complex_domain) < 0) return -1;
    if (zpad(work, length) < 0) return -1;
    if (forward(work, complex_domain) < 0) return -1;
    if (conj_mul(work, out, out) < 0) return -1;
    if ((complex_domain ? fft(out, 1) : irfft(out)) < 0) return -1;

    out->delta = delta;
    out->points = n - m + 1;
    if (halve != 0 && scale(out, T(0.5)) < 0) return -1;
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t corr(V* ref, V* sig, V* out, V* work, int32_t lags_pts, int32_t halve) {
    const int32_t m = lags_pts;
    if (!(m > 0 && m <= ref->points && m <= sig->points)) return -1;
    // A work vector that is ref or out would overwrite what is still to be read.
    if (work != nullptr && work != ref && work != out) return correlate(ref, sig, out, work, m, halve);
    V temp;
    init(&temp);
    const int32_t r = correlate(ref, sig, out, &temp, m, halve);
    return destroy(&temp) < 0 ? -1 : r;
}

#define VLX_INSTANTIATE(V) template int32_t corr<V>(V*, V*, V*, V*, int32_t, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxh_corr(vlx_t* ref, vlx_t* sig, vlx_t* out, vlx_t* work, int32_t lags_pts, int32_t halve) {
    return vlx::corr(ref, sig, out, work, lags_pts, halve);
}
VLX_API int32_t vlxfh_corr(vlxf_t* ref, vlxf_t* sig, vlxf_t* out, vlxf_t* work, int32_t lags_pts, int32_t halve) {
    return vlx::corr(ref, sig, out, work, lags_pts, halve);
}
VLX_API int32_t vlxb_corr(vlx_t* ref, vlx_t* sig, vlx_t* out, vlx_t* work, int32_t lags_pts) {
    return vlx::corr(ref, sig, out, work, lags_pts, 0);
}
VLX_API int32_t vlxfb_corr(vlxf_t* ref, vlxf_t* sig, vlxf_t* out, vlxf_t* work, int32_t lags_pts) {
    return vlx::corr(ref, sig, out, work, lags_pts, 0);
}
}
