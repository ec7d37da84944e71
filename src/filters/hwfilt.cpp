// The multiplier-free low-pass: four identical recursive sections whose
// coefficients are powers of two, so every product is exact and only the
// order of the sums decides the rounding.
#include "filters/filters.hpp"

#include <cstdint>

namespace vlx {

template <VlxVector V>
int32_t hwfilt(V* in, V* out, int32_t id, V* hist) {
    using T = real_t<V>;
    if (id != 0) return -1;
    V temp{};
    const bool own_hist = hist == nullptr;
    if (own_hist) {
        init(&temp);
        hist = &temp;
    }
    // A sample is read before its place is written, so out may share in's
    // storage without a temporary.
    const T* x = in->data;
    if (stage_io<V>(in, &out, nullptr, &hist, 12, 0, nullptr, nullptr, nullptr) != 0) {
        if (own_hist) destroy(&temp);
        return -1;
    }
    const int64_t n = in->points < 0 ? 0 : in->points;
    const int64_t w = in->complex ? 2 : 1;
    T* y = out->data;
    T* s = hist->data;
    // A complex source is two real streams, each with its own history.
    for (int64_t c = 0; c < w; ++c) {
        T a1 = s[0 * w + c], a2 = s[1 * w + c], a3 = s[2 * w + c];
        T b1 = s[3 * w + c], b2 = s[4 * w + c], b3 = s[5 * w + c];
        T c1 = s[6 * w + c], c2 = s[7 * w + c], c3 = s[8 * w + c];
        T d1 = s[9 * w + c], d2 = s[10 * w + c], d3 = s[11 * w + c];
        const T half = T(0.5), quarter = T(0.25);
        for (int64_t t = 0; t < n; ++t) {
            // the first section's denominator comes ahead of the numerators
            const T a = x[t * w + c] - half * a2;
            const T b = half * a1 + quarter * a + half * a2 + quarter * a3 - half * b2;
            const T cc = half * b1 + quarter * b + half * b2 + quarter * b3 - half * c2;
            const T d = half * c1 + quarter * cc + half * c2 + quarter * c3 - half * d2;
            y[t * w + c] = half * d1 + quarter * d + half * d2 + quarter * d3;
            a3 = a2, a2 = a1, a1 = a;
            b3 = b2, b2 = b1, b1 = b;
            c3 = c2, c2 = c1, c1 = cc;
            d3 = d2, d2 = d1, d1 = d;
        }
        s[0 * w + c] = a1, s[1 * w + c] = a2, s[2 * w + c] = a3;
        s[3 * w + c] = b1, s[4 * w + c] = b2, s[5 * w + c] = b3;
        s[6 * w + c] = c1, s[7 * w + c] = c2, s[8 * w + c] = c3;
        s[9 * w + c] = d1, s[10 * w + c] = d2, s[11 * w + c] = d3;
    }
    int32_t status = finish_io<V>(out, 0, nullptr, 0);
    if (own_hist && destroy(&temp) != 0) status = -1;
    return status;
}

template int32_t hwfilt<vlx_t>(vlx_t*, vlx_t*, int32_t, vlx_t*);
template int32_t hwfilt<vlxf_t>(vlxf_t*, vlxf_t*, int32_t, vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxd_hwfilt(vlx_t* in, vlx_t* out, int32_t id, vlx_t* hist) { return vlx::hwfilt(in, out, id, hist); }
VLX_API int32_t vlxfd_hwfilt(vlxf_t* in, vlxf_t* out, int32_t id, vlxf_t* hist) {
    return vlx::hwfilt(in, out, id, hist);
}
VLX_API int32_t vlxi_hwfilt(vlx_t* v, int32_t id) { return vlx::hwfilt(v, v, id, static_cast<vlx_t*>(nullptr)); }
VLX_API int32_t vlxfi_hwfilt(vlxf_t* v, int32_t id) { return vlx::hwfilt(v, v, id, static_cast<vlxf_t*>(nullptr)); }
}
