// Transforms of any length.  Powers of two go to the fast engine; every other
// length is a chirp-z (Bluestein) convolution on power-of-two transforms, with
// a one-entry cache of the chirp and its filter spectrum under lock 1.  Also
// the real transform of any length and its inverse.
#include "core/frame.hpp"
#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"
#include "transforms/transforms.hpp"

#include <cmath>
#include <cstdint>
#include <type_traits>

namespace vlx {
namespace {

// The chirp-z cache of one precision.  `chirp.points` is the length it
// stands for; `direction` is the direction the two vectors hold.
template <VlxVector V>
struct ChirpState {
    int32_t ready = 0;
    int32_t direction = 0;
    V chirp{};
    V spectrum{};
};

template <VlxVector V>
ChirpState<V> chirp_state;

// Teardown step.  The direction is left as it is: with the length back at 0
// the next call rebuilds both vectors whatever the direction says.
template <VlxVector V>
int32_t chirp_free() {
    LockGuard lock(1);
    ChirpState<V>& state = chirp_state<V>;
    if (!state.ready) return 0;
    const int32_t a = destroy(&state.chirp);
    const int32_t b = destroy(&state.spectrum);
    state.ready = 0;
    return a < 0 || b < 0 ? -1 : 0;
}

// log2 of the convolution length: 2 - trunc(ln(n - 1.5) * -1/ln 2), the
// smallest power of two of at least 2n - 2.  The float family rounds the
// logarithm to float and multiplies in float, which can overshoot by one
// near powers of two; the result is then merely longer than needed.
template <VlxVector V>
int32_t chirp_exponent(int32_t n) {
    const double ln = log64(static_cast<double>(n) - 1.5);
    if constexpr (std::is_same_v<V, vlx_t>)
        return 2 - static_cast<int32_t>(ln * -1.4426950408889634);
    else
        return 2 - static_cast<int32_t>(static_cast<float>(ln) * -1.442695f);
}

// chirp[i] = exp(-j pi i^2 / n).  i^2 is reduced modulo 2n by exact integer
// steps so that the angle stays below 2 pi whatever the index; the angle is
// (m * -pi) * (1/n) with 1/n rounded first.
template <VlxVector V>
void fill_chirp(V* chirp, int32_t n) {
    using T = real_t<V>;
    T* x = chirp->data;
    const int64_t two_n = 2 * static_cast<int64_t>(n);
    const T inv_n = T(1) / static_cast<T>(n);
    int64_t m = 1;
    for (int64_t i = 0; i < n; ++i) {
        m = (m + 2 * i - 1) % two_n;
        const T angle = (static_cast<T>(m) * -family<V>::pi) * inv_n;
        if constexpr (std::is_same_v<V, vlx_t>) {
            x[2 * i] = cos64(angle);
            x[2 * i + 1] = sin64(angle);
        } else {
            x[2 * i] = cos32(angle);
            x[2 * i + 1] = sin32(angle);
        }
    }
}

// Brings the cache to length n and direction d.  Only the value 1 counts as
// the conjugated (inverse) chirp here, while the forward scaling is skipped
// for any non-zero d: a direction of 2 gets forward chirps without 1/n.
template <VlxVector V>
int32_t update_chirp(ChirpState<V>& state, int32_t n, int32_t d, int32_t length) {
    using T = real_t<V>;
    V* chirp = &state.chirp;
    V* spectrum = &state.spectrum;
    const int32_t old_n = chirp->points;
    if (state.direction == 1 && conj(chirp) < 0) return -1;
    state.direction = d;
    chirp->points = n;
    if (realloc(chirp, old_n, 1) < 0) return -1;
    if (n != old_n) fill_chirp(chirp, n);
    if (d == 1 && conj(chirp) < 0) return -1;

    if (n != old_n) {
        spectrum->points = length;
        if (alloc(spectrum) < 0 || zero(spectrum) < 0) return -1;
        T* s = spectrum->data;
        const T* c = chirp->data;
        s[0] = 1;
        s[1] = 0;
        // the filter is even: the conjugate chirp at i and at length - i
        for (int64_t i = 1; i < n; ++i) {
            const int64_t j = length - i;
            s[2 * i] = c[2 * i];
            s[2 * i + 1] = -c[2 * i + 1];
            s[2 * j] = c[2 * i];
            s[2 * j + 1] = -c[2 * i + 1];
        }
        // the forward 1/n of the whole transform rides on the filter
        if (d == 0 && scale(spectrum, T(1) / static_cast<T>(n)) < 0) return -1;
        if (fft(spectrum, 1) < 0) return -1;
        return 0;
    }

    // Same length, other direction: the spectrum of the conjugate filter is
    // the conjugate of the spectrum with points 1 .. length-1 reversed, so no
    // transform is needed; only the 1/n moves.
    if (conj(spectrum) < 0) return -1;
    V tail = *spectrum;
    tail.data += 2;
    tail.points -= 1;
    if (rev(&tail) < 0) return -1;
    return scale(spectrum, d != 0 ? static_cast<T>(n) : T(1) / static_cast<T>(n));
}

// The chirp-z transform of v, called with lock 1 held.
template <VlxVector V>
int32_t chirp_transform(V* v, int32_t d) {
    ChirpState<V>& state = chirp_state<V>;
    if (!state.ready) {
        init(&state.chirp);
        init(&state.spectrum);
        state.chirp.complex = 1;
        state.spectrum.complex = 1;
        state.ready = 1;
        register_teardown<V>(TeardownStep::chirp, &chirp_free<V>);
    }
    const int32_t n = v->points;
    const int32_t exponent = chirp_exponent<V>(n);
    // beyond this the length is no int32; the vector refuses 2^30 points itself
    if (exponent > 30) return -1;
    const int32_t length = int32_t(1) << exponent;
    if ((n != state.chirp.points || d != state.direction) && update_chirp(state, n, d, length) < 0) return -1;

    // Equal spacings keep v's delta through the products, which average them.
    state.chirp.delta = v->delta;
    if (mul(v, &state.chirp, v) < 0) return -1;
    if (zpad(v, length) < 0) return -1;
    if (fft(v, 1) < 0) return -1;
    state.spectrum.delta = v->delta;
    if (mul(v, &state.spectrum, v) < 0) return -1;
    if (fft(v, 0) < 0) return -1;
    v->points = n;
    if (mul(v, &state.chirp, v) < 0) return -1;
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t dft(V* v, int32_t inverse) {
    const int32_t n = v->points;
    if (n < 2) {
        // 1/delta; no error for 0 points, unlike the fast transform
        set_transform_delta(v, 1);
        return 0;
    }
    if (is_power_of_two(n)) return fft(v, inverse);
    // The inner transforms rewrite delta on the way; the result's spacing
    // comes from the delta at entry, so a delta of 0 ends as the fallback.
    const real_t<V> delta = v->delta;
    int32_t status;
    {
        LockGuard lock(1);
        status = chirp_transform(v, inverse);
    }
    if (status < 0) return status;
    v->delta = delta;
    set_transform_delta(v, n);
    return 0;
}

template <VlxVector V>
int32_t rdft(V* v) {
    if (v->complex) return -1;
    const int32_t n = v->points;
    if (is_power_of_two(n)) return rfft(v);
    if (dft(v, 0) < 0) return -1;
    if (n < 1) return 0;
    v->points = v->points / 2 + 1;
    return 0;
}

template <VlxVector V>
int32_t irdft(V* v, int32_t odd) {
    const int64_t full = 2 * static_cast<int64_t>(v->points) - 2;
    if (odd == 0 && full > 0 && full <= INT32_MAX && is_power_of_two(static_cast<int32_t>(full))) return irfft(v);
    if (orecon(v, odd) < 0 || dft(v, 1) < 0 || real_part(v) < 0) return -1;
    return 0;
}

#define VLX_INSTANTIATE(V)                     \
    template int32_t dft<V>(V*, int32_t);      \
    template int32_t rdft<V>(V*);              \
    template int32_t irdft<V>(V*, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_dft(vlx_t* v, int32_t inverse) { return vlx::dft(v, inverse); }
VLX_API int32_t vlxfi_dft(vlxf_t* v, int32_t inverse) { return vlx::dft(v, inverse); }
VLX_API int32_t vlxi_rdft(vlx_t* v) { return vlx::rdft(v); }
VLX_API int32_t vlxfi_rdft(vlxf_t* v) { return vlx::rdft(v); }
VLX_API int32_t vlxi_irdft(vlx_t* v, int32_t odd) { return vlx::irdft(v, odd); }
VLX_API int32_t vlxfi_irdft(vlxf_t* v, int32_t odd) { return vlx::irdft(v, odd); }
}
