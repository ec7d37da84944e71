// Windows as templates, for the library's other layers: the synthesis engine
// with its cache, the parametric forms and the metrics.  Each is explicitly
// instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

#include <cstdint>

namespace vlx {

// ---- flags (bits of the window flags argument) ----

inline constexpr int32_t wnorm_mask = 3;        // VLX_WNORM_MEAN / _RMS / _PEAK
inline constexpr int32_t wnorm_mean = 0;
inline constexpr int32_t wnorm_rms = 1;
inline constexpr int32_t wnorm_peak = 2;
inline constexpr int32_t wflag_symmetric = 4;
inline constexpr int32_t wflag_width = 8;
inline constexpr int32_t wflag_swap_uniform = 16;
inline constexpr int32_t wflag_no_swap = 32;
// The part of the flags that tells two cached windows apart.
inline constexpr int32_t wflag_key_mask = 15;

// ---- catalogue ----

// The id of a name, case-insensitive on the whole string; -1 and id 0 when
// no name matches (vlx_window_from_str).
int32_t window_from_str(const char* name, int32_t* id);
// The canonical name of id into dst, cut to len - 1 characters (vlx_window_to_str).
int32_t window_to_str(int32_t id, char* dst, int32_t len);

// Coefficient table of a cosine-sum id (0, 2-13, 26-29) in normalisation mode
// 0, 1 or 2; null for any other id or mode.  *count receives K.
template <VlxVector V>
const real_t<V>* window_table(int32_t id, int32_t mode, int32_t* count);

// ---- synthesis ----

// Short-length corrections of a cosine sum c[0..count-1] on n < count (resp.
// n < 2 count - 1) points: the sum of the c[k] whose k is a multiple of n,
// and the true mean square of the rms table's window.
template <class T> T aliased_sum(const T* c, int32_t count, int64_t n);
template <class T> T aliased_mean_square(const T* c, int32_t count, int64_t n);

// Fills the real vector w (points set, storage sized) with window id; no
// multiplication, no rotation (vlx_window_synth).
template <VlxVector V> int32_t window_synth(V* w, int32_t id, int32_t flags, real_t<V> width);
// The cosine-sum filling step alone, coefficients in the real vector coefs
// (vlx_window_cos_sum).
template <VlxVector V> int32_t window_cos_sum(V* w, V* coefs, int32_t flags, real_t<V> width);
// Multiplies v by the cached window of (id, flags, width) and rotates its
// centre to index 0 as the flags say (vlxi_window2); vlxi_window is
// window2 with width 0 and no width flag.
template <VlxVector V> int32_t window2(V* v, int32_t id, int32_t flags, real_t<V> width);
template <VlxVector V> int32_t window(V* v, int32_t id, int32_t flags);
// v times the cosine sum of the user's coefficients, rotated (vlxi_window_cos).
template <VlxVector V> int32_t window_cos(V* v, V* coefs);
// Releases the window cache of the family (teardown step window_cache).
template <VlxVector V> int32_t window_cache_free();

// ---- parametric forms: fill w like window_synth ----

template <VlxVector V> int32_t kaiser_form(V* w, real_t<V> beta, int32_t flags, real_t<V> width);
template <VlxVector V> int32_t gauss_form(V* w, real_t<V> sigma, int32_t flags, real_t<V> width);
template <VlxVector V> int32_t sinc_form(V* w, real_t<V> x, real_t<V> power, int32_t flags);
template <VlxVector V> int32_t tukey_form(V* w, real_t<V> alpha, int32_t flags);
// sin(a)/a raised to p, with the rules for a non-positive base (vlx_sinc_pow).
template <VlxVector V> real_t<V> sinc_pow(real_t<V> a, real_t<V> p);
// The direct operations: v times the form, rotated unless VLX_WFLAG_NO_SWAP.
template <VlxVector V> int32_t window_kaiser(V* v, real_t<V> beta, int32_t flags);
template <VlxVector V> int32_t window_gauss(V* v, real_t<V> sigma, int32_t flags);
template <VlxVector V> int32_t window_sinc(V* v, real_t<V> x, real_t<V> power, int32_t flags);
template <VlxVector V> int32_t window_tukey(V* v, real_t<V> alpha, int32_t flags);
// FIR prototype window: peak 1, mirror-symmetric, unrotated (vlxi_window_fir).
template <VlxVector V> int32_t window_fir(V* v, int32_t id, real_t<V> param);
// The catalogue's fixed parameters: Kaiser beta of ids 14-19 and 30, Gaussian
// sigma of ids 20-22 and 31; 0 for other ids.
template <VlxVector V> real_t<V> catalogue_kaiser_beta(int32_t id);
template <VlxVector V> real_t<V> catalogue_gauss_sigma(int32_t id);

// ---- metrics (out is a scalar of the family) ----

template <VlxVector V> int32_t window2_scale(real_t<V>* out, int32_t id, int32_t flags, int32_t points, real_t<V> width);
template <VlxVector V> int32_t window_scale(real_t<V>* out, int32_t id, int32_t flags, int32_t points);
template <VlxVector V> int32_t window2_enbw(real_t<V>* out, int32_t id, int32_t points, real_t<V> width);
template <VlxVector V> int32_t window_enbw(real_t<V>* out, int32_t id, int32_t points);
// Selector 0: ENBW; 1: 3 dB bandwidth; 2: 6 dB bandwidth, in bins of points
// for a window of that width (vlx_window_metric).
template <VlxVector V> int32_t window_metric(real_t<V>* out, int32_t selector, int32_t id, int32_t points, real_t<V> width);

}  // namespace vlx
