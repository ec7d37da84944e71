// The FIR engine: direct sums for every mix of real and complex source and
// taps, and for long real filters one fast convolution whose wrapped samples
// are repaired by short direct sums, with the filter's transform kept in a
// one-entry cache per precision and path.
#include "core/cpu.hpp"
#include "core/frame.hpp"
#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"
#include "filters/lanes.hpp"
#include "transforms/transforms.hpp"

#include <algorithm>
#include <cmath>
#include <cstdint>


namespace vlx {
namespace {

// Shortest filters that take the fast convolution.
constexpr int32_t fast_taps_real = 46;
constexpr int32_t fast_taps_complex = 36;

// Five epsilons of the first tap: the cache's tolerance.
template <VlxVector V>
inline constexpr real_t<V> key_tolerance = std::is_same_v<V, vlx_t> ? real_t<V>(1.1102230246251565e-15)
                                                                     : real_t<V>(5.9604645e-7f);

// One key serves both spectra, so a hit on the key with the other path's
// spectrum of the same length reuses that spectrum: settled behaviour.
template <VlxVector V>
struct FirState {
    int32_t key_ready = 0;
    int32_t real_ready = 0;
    int32_t complex_ready = 0;
    V key{};
    V real_spectrum{};
    V complex_spectrum{};
};

template <VlxVector V>
FirState<V> fir_state;

template <VlxVector V>
int32_t fir_free() {
    LockGuard lock(1);
    FirState<V>& state = fir_state<V>;
    int32_t* flags[] = {&state.key_ready, &state.real_ready, &state.complex_ready};
    V* vectors[] = {&state.key, &state.real_spectrum, &state.complex_spectrum};
    for (int i = 0; i < 3; ++i) {
        if (!*flags[i]) continue;
        if (destroy(vectors[i]) < 0) return -1;
        *flags[i] = 0;
    }
    return 0;
}

// ---- direct sums with real taps ----
// A complex source is two interleaved real streams (w = 2) under the same
// taps, so one kernel over scalars serves both: scalar s of the output is the
// sum over i from m-1 down to 0 of h[i] * x[s - w i], from 0, oldest first.

template <class T>
inline T real_taps_at(const T* x, const T* h, int64_t m, int64_t w, int64_t s) {
    T acc = 0;
    const T* xp = x + s - w * (m - 1);
    for (int64_t i = m - 1; i >= 0; --i, xp += w) acc += h[i] * *xp;
    return acc;
}

#ifdef VLX_FILTER_LANES
// Several outputs side by side, one per lane: each lane adds exactly the
// products of the scalar sum in the same order, without FMA (a separate
// multiply and add).  Four registers at a time, then one.  Returns the first
// scalar left over.
template <class T>
__attribute__((target("avx2"))) int64_t real_taps_avx(const T* x, T* y, int64_t s, int64_t end, const T* h,
                                                      int64_t m, int64_t w) {
    using L = Lanes<T>;
    constexpr int64_t n = L::width;
    for (; s + 4 * n <= end; s += 4 * n) {
        typename L::reg a0 = L::zero(), a1 = a0, a2 = a0, a3 = a0;
        const T* xp = x + s - w * (m - 1);
        for (int64_t i = m - 1; i >= 0; --i, xp += w) {
            const typename L::reg c = L::broadcast(h + i);
            a0 = L::add_product(a0, c, L::load(xp));
            a1 = L::add_product(a1, c, L::load(xp + n));
            a2 = L::add_product(a2, c, L::load(xp + 2 * n));
            a3 = L::add_product(a3, c, L::load(xp + 3 * n));
        }
        L::store(y + s, a0);
        L::store(y + s + n, a1);
        L::store(y + s + 2 * n, a2);
        L::store(y + s + 3 * n, a3);
    }
    for (; s + n <= end; s += n) {
        typename L::reg a0 = L::zero();
        const T* xp = x + s - w * (m - 1);
        for (int64_t i = m - 1; i >= 0; --i, xp += w) a0 = L::add_product(a0, L::broadcast(h + i), L::load(xp));
        L::store(y + s, a0);
    }
    return s;
}
#endif

// x has n points of w scalars; hist (or silence when null) the m - 1 before.
template <class T>
void direct_real_taps(const T* x, T* y, int64_t n, const T* h, int64_t m, const T* hist, int64_t w) {
    const int64_t end = n * w;
    const int64_t head = std::min(w * (m - 1), end);
    for (int64_t s = 0; s < head; ++s) {
        T acc = 0;
        for (int64_t i = m - 1; i >= 0; --i) {
            const int64_t at = s - w * i;
            const T v = at >= 0 ? x[at] : (hist != nullptr ? hist[at + w * (m - 1)] : T(0));
            acc += h[i] * v;
        }
        y[s] = acc;
    }
    int64_t s = head;
#ifdef VLX_FILTER_LANES
    if (filter_lanes() > 0) s = real_taps_avx(x, y, s, end, h, m, w);
#endif
    for (; s < end; ++s) y[s] = real_taps_at(x, h, m, w, s);
}

// ---- direct sums with complex taps ----

template <class T>
inline T past_or_zero(const T* hist, int64_t at) {
    return hist != nullptr ? hist[at] : T(0);
}

// Real source: each tap's two parts scale the same sample.
template <class T>
void direct_complex_taps_real_source(const T* x, T* y, int64_t n, const T* h, int64_t m, const T* hist) {
    for (int64_t k = 0; k < n; ++k) {
        T re = 0, im = 0;
        for (int64_t i = m - 1; i >= 0; --i) {
            const int64_t j = k - i;
            const T v = j >= 0 ? x[j] : past_or_zero(hist, m - 1 + j);
            re += h[2 * i] * v;
            im += h[2 * i + 1] * v;
        }
        y[2 * k] = re;
        y[2 * k + 1] = im;
    }
}

// Complex source and taps: each product is formed whole, then added.
template <class T>
void direct_complex_taps(const T* x, T* y, int64_t n, const T* h, int64_t m, const T* hist) {
    for (int64_t k = 0; k < n; ++k) {
        T re = 0, im = 0;
        for (int64_t i = m - 1; i >= 0; --i) {
            const int64_t j = k - i;
            T vr, vi;
            if (j >= 0) {
                vr = x[2 * j], vi = x[2 * j + 1];
            } else {
                vr = past_or_zero(hist, 2 * (m - 1 + j)), vi = past_or_zero(hist, 2 * (m - 1 + j) + 1);
            }
            const T hr = h[2 * i], hi = h[2 * i + 1];
            re += hr * vr - hi * vi;
            im += hr * vi + hi * vr;
        }
        y[2 * k] = re;
        y[2 * k + 1] = im;
    }
}

// ---- fast convolution ----

// Transform length: wide enough for no wrap when the filter is long for the
// block, else as narrow as the block.  The two cost products wrap in 32 bits.
inline int64_t fast_length(int32_t n, int32_t m) {
    int32_t lg = 0;
    while ((int64_t(1) << lg) < n) ++lg;
    const auto filter_cost = static_cast<int32_t>(static_cast<uint32_t>(m) * static_cast<uint32_t>(m));
    const auto block_cost =
        static_cast<int32_t>(uint32_t(9) * static_cast<uint32_t>(lg) * static_cast<uint32_t>(n));
    int64_t length = filter_cost > block_cost ? int64_t(n) + m - 1 : n;
    if (length < m) length = m;
    int64_t nfft = 1;
    while (nfft < length) nfft <<= 1;
    return nfft;
}

// The filter's spectrum of this path: from the cache on a hit, rebuilt on a
// miss (the key first, with no rollback if the rebuild fails).
template <VlxVector V>
int32_t fast_spectrum(V* filter, bool real_path, int64_t nfft, V** spectrum_out) {
    using T = real_t<V>;
    FirState<V>& state = fir_state<V>;
    V* spectrum = real_path ? &state.real_spectrum : &state.complex_spectrum;
    int32_t& ready = real_path ? state.real_ready : state.complex_ready;
    if (!ready) {
        init(spectrum);
        ready = 1;
    }
    if (!state.key_ready) {
        init(&state.key);
        state.key_ready = 1;
    }
    register_teardown<V>(TeardownStep::fir_scratch, &fir_free<V>);
    *spectrum_out = spectrum;

    // The tolerance follows the first tap alone; the comparison includes delta.
    const T tol = std::fabs(filter->data[0] * key_tolerance<V>);
    int32_t order = 1;
    const bool same = cmp(filter, &state.key, tol, &order) == 0 && order == 0;
    const int64_t wanted = real_path ? nfft / 2 + 1 : nfft;
    if (same && spectrum->points == wanted) return 0;

    if (copy(&state.key, filter) < 0 || copy(spectrum, filter) < 0) return -1;
    // The real forward transform divides by nfft and its inverse does not
    // multiply back: the spectrum carries the factor instead.
    if (real_path && scale(spectrum, static_cast<T>(nfft)) < 0) return -1;
    if (zpad(spectrum, static_cast<int32_t>(nfft)) < 0) return -1;
    return (real_path ? rfft(spectrum) : fft(spectrum, 1)) < 0 ? -1 : 0;
}

// out already staged; n >= m - 1 and the taps are real.
template <VlxVector V>
int32_t fir_fast(V* in, V* out, V* filter, V* hist, int32_t n, int32_t m) {
    using T = real_t<V>;
    LockGuard lock(1);
    const bool real_path = in->complex == 0;
    const int64_t nfft = fast_length(n, m);
    if (nfft > (int64_t(1) << 30)) return -1;

    V* spectrum = nullptr;
    if (fast_spectrum(filter, real_path, nfft, &spectrum) < 0) return -1;

    if (copy(out, in) < 0) return -1;
    if (n != nfft && zpad(out, static_cast<int32_t>(nfft)) < 0) return -1;
    if (real_path) {
        if (rfft(out) < 0 || mul(spectrum, out, out) < 0 || irfft(out) < 0) return -1;
    } else {
        if (fft(out, 1) < 0 || mul(spectrum, out, out) < 0 || fft(out, 0) < 0) return -1;
    }
    out->points = n;
    out->delta = in->delta;

    const int64_t w = real_path ? 1 : 2;
    const T* x = in->data;
    const T* h = filter->data;
    T* y = out->data;
    // The first outputs hold energy wrapped from the end: plain partial sums.
    const int64_t wrap = int64_t(n) + m - 1 - nfft;
    for (int64_t k = 0; k < wrap; ++k)
        for (int64_t c = 0; c < w; ++c) {
            T acc = 0;
            for (int64_t j = 0; j <= k; ++j) acc += x[j * w + c] * h[k - j];
            y[k * w + c] = acc;
        }
    // The transform saw the block alone; the past is added here.
    if (hist != nullptr) {
        const T* past = hist->data;
        for (int64_t k = 0; k < m - 1; ++k)
            for (int64_t c = 0; c < w; ++c) {
                T acc = y[k * w + c];
                for (int64_t j = 0; j <= m - 2 - k; ++j) acc += past[(k + j) * w + c] * h[m - 1 - j];
                y[k * w + c] = acc;
            }
        push_history(hist->data, x, n, m - 1, w);
    }
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t fir(V* in, V* out, V* filter, V* hist) {
    const int32_t m = filter->points;
    if (m < 1) return copy(out, in);
    int32_t aliased = 0;
    V tmp{};
    V* saved = nullptr;
    if (stage_io<V>(in, &out, filter, &hist, m - 1, VLX_STAGE_ALIAS, &aliased, &tmp, &saved) != 0) return -1;

    const int32_t n = in->points < 0 ? 0 : in->points;
    const bool fast = filter->complex == 0 && n >= m - 1 && m >= (in->complex ? fast_taps_complex : fast_taps_real);
    int32_t status = 0;
    if (fast) {
        status = fir_fast(in, out, filter, hist, n, m);
    } else {
        const auto* x = in->data;
        const auto* h = filter->data;
        const auto* past = hist != nullptr ? hist->data : nullptr;
        if (!filter->complex)
            direct_real_taps(x, out->data, n, h, m, past, in->complex ? 2 : 1);
        else if (!in->complex)
            direct_complex_taps_real_source(x, out->data, n, h, m, past);
        else
            direct_complex_taps(x, out->data, n, h, m, past);
        if (hist != nullptr) push_history(hist->data, x, n, m - 1, in->complex ? 2 : 1);
    }
    return finish_io<V>(out, aliased, saved, status);
}

template int32_t fir<vlx_t>(vlx_t*, vlx_t*, vlx_t*, vlx_t*);
template int32_t fir<vlxf_t>(vlxf_t*, vlxf_t*, vlxf_t*, vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxd_fir(vlx_t* in, vlx_t* out, vlx_t* filter, vlx_t* hist) { return vlx::fir(in, out, filter, hist); }
VLX_API int32_t vlxfd_fir(vlxf_t* in, vlxf_t* out, vlxf_t* filter, vlxf_t* hist) {
    return vlx::fir(in, out, filter, hist);
}
}
