// FIR prototype windows: a designer's bandwidth or transition width turned
// into the parameter of a parametric window, applied peak 1, mirror-symmetric
// and unrotated.
#include "windows/windows.hpp"

#include "core/precise_math.hpp"

namespace vlx {
namespace {

// VLX_WNORM_PEAK + VLX_WFLAG_SYMMETRIC + VLX_WFLAG_NO_SWAP
constexpr int32_t prototype_flags = 38;

}  // namespace

template <VlxVector V>
int32_t window_fir(V* v, int32_t id, real_t<V> param) {
    using T = real_t<V>;
    const int32_t n = v->points;
    constexpr T pi = family<V>::pi;
    switch (id) {
    case 100: {
        if (n < 1 || param == T(0)) return 0;
        const T sigma = T(1) / (static_cast<T>(n) * pi * param);
        return window_gauss(v, sigma, prototype_flags);
    }
    case 101: {
        if (n < 1) return 0;
        // attenuation in dB from the transition width, then Kaiser's beta
        const T a = static_cast<T>(n - 1) * T(14.36) * param + T(7.95);
        T beta;
        if (a < T(21))
            beta = T(0);
        else if (a <= T(50))
            beta = T(0.5842) * own_exp(own_log(a - T(21)) * T(0.4)) + T(0.07886) * (a - T(21));
        else
            beta = T(0.1102) * (a - T(8.7));
        return window_kaiser(v, beta, prototype_flags);
    }
    case 102: {
        const T q = static_cast<T>(n) * param;
        const T e = T(0.62);
        return window_sinc(v, (pi / T(2)) / e, e * q, prototype_flags);
    }
    case 103: {
        const T q = static_cast<T>(n) * param * T(1.12);
        T e;
        if (q == T(0))
            e = family<V>::bound;
        else if (q <= T(1.25))
            e = T(0.386) / q + T(0.453);
        else if (q < T(5))
            e = T(0.774) - q * T(0.0251);
        else
            e = T(0.648);
        return window_sinc(v, (pi / T(2)) / e, e * q, prototype_flags);
    }
    default:
        // reaches id 0 and the parametric ids; the other forms reject flag 4
        return window(v, id, prototype_flags);
    }
}

template int32_t window_fir<vlx_t>(vlx_t*, int32_t, double);
template int32_t window_fir<vlxf_t>(vlxf_t*, int32_t, float);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_window_fir(vlx_t* v, int32_t id, double param) { return vlx::window_fir(v, id, param); }
VLX_API int32_t vlxfi_window_fir(vlxf_t* v, int32_t id, float param) { return vlx::window_fir(v, id, param); }
}
