// The analytic signal and the Hilbert transform, for any length: both shape
// the spectrum of vlxi_dft and transform back.  Each transform takes lock 1
// for itself on lengths that are not powers of two; nothing is held between.
#include "elementwise/elementwise.hpp"
#include "transforms/transforms.hpp"

#include <cstdint>

namespace vlx {

template <VlxVector V>
int32_t analytic(V* v) {
    using T = real_t<V>;
    const int32_t n = v->points;
    if (n < 1) return 0;
    if (dft(v, 0) < 0) return -1;
    // Positive frequencies doubled; DC and, for even n, Nyquist kept once.
    T* x = v->data;
    for (int64_t k = 1; k <= (n - 1) / 2; ++k) {
        x[2 * k] = x[2 * k] * T(2);
        x[2 * k + 1] = x[2 * k + 1] * T(2);
    }
    v->points = n / 2 + 1;
    if (zpad(v, n) < 0) return -1;
    return dft(v, 1) < 0 ? -1 : 0;
}

template <VlxVector V>
int32_t hilbert(V* v) {
    const int32_t n = v->points;
    if (n < 1) return 0;
    const bool was_real = !v->complex;
    if (dft(v, 0) < 0) return -1;
    real_t<V>* x = v->data;
    // One point stays real through the transform and has room for one
    // scalar only: its single value becomes 0 either way.
    x[0] = 0;
    if (v->complex) x[1] = 0;
    // -j on the positive frequencies, +j on the negative ones, 0 at DC and
    // Nyquist.
    const int64_t h = (n + 1) / 2;
    for (int64_t k = 1; k < h; ++k) {
        const real_t<V> re = x[2 * k], im = x[2 * k + 1];
        x[2 * k] = im;
        x[2 * k + 1] = -re;
    }
    int64_t k = h;
    if (n % 2 == 0) {
        x[2 * k] = 0;
        x[2 * k + 1] = 0;
        ++k;
    }
    for (; k < n; ++k) {
        const real_t<V> re = x[2 * k], im = x[2 * k + 1];
        x[2 * k] = -im;
        x[2 * k + 1] = re;
    }
    if (dft(v, 1) < 0) return -1;
    if (was_real && real_part(v) < 0) return -1;
    return 0;
}

template int32_t analytic<vlx_t>(vlx_t*);
template int32_t analytic<vlxf_t>(vlxf_t*);
template int32_t hilbert<vlx_t>(vlx_t*);
template int32_t hilbert<vlxf_t>(vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_analytic(vlx_t* v) { return vlx::analytic(v); }
VLX_API int32_t vlxfi_analytic(vlxf_t* v) { return vlx::analytic(v); }
VLX_API int32_t vlxi_hilbert(vlx_t* v) { return vlx::hilbert(v); }
VLX_API int32_t vlxfi_hilbert(vlxf_t* v) { return vlx::hilbert(v); }
}
