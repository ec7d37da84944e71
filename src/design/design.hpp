// Generators, random sources and resampling tables as templates, for the
// library's other layers.  Each is explicitly instantiated for vlx_t and
// vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

#include <cstdint>

namespace vlx {

// ---- generators ----

// v[k] = offset + k*delta*slope by running sum; a complex v gets zero
// imaginary parts (vlxc_line).
template <VlxVector V> int32_t line(V* v, real_t<V> slope, real_t<V> offset);
// v[k] = cos(2 pi freq k delta + phase) by a rotation restarted every 256
// samples; a complex v gets zero imaginary parts (vlxc_cos).
template <VlxVector V> int32_t cos_wave(V* v, real_t<V> freq, real_t<V> phase);
// v[k] = exp(j (2 pi freq k delta + phase)); a real v gets the cosine
// (vlxc_cexp).
template <VlxVector V> int32_t cexp_wave(V* v, real_t<V> freq, real_t<V> phase);

// ---- random sources ----

// Fills v with noise of a kind 0 to 3: uniform, Gaussian, exponential,
// Laplace (vlxc_rand).
template <VlxVector V> int32_t rand_fill(V* v, int32_t kind);
// Random permutation of the samples, in place (vlxi_shuffle).
template <VlxVector V> int32_t shuffle(V* v);

// ---- resampling tables ----

// Expands a design d (T, then shape coefficients) into the table v of
// v->points scalars, by cosine sum (vlxc_rsmp_cos) or by polynomial in the
// cosine (vlxc_rsmp_pcos).
template <VlxVector V> int32_t rsmp_cos(V* v, const V* d);
template <VlxVector V> int32_t rsmp_pcos(V* v, const V* d);
// Expands built-in design 0 to 4 (vlxc_rsmp).
template <VlxVector V> int32_t rsmp(V* v, int32_t design);

// ---- FIR design ----

// Ideal impulse response of filter type 0 to 10 into v->points taps (vlxc_fir).
template <VlxVector V> int32_t fir_design(V* v, int32_t type, real_t<V> arg1, real_t<V> arg2);
// Fixed half-filter coefficient set 100 to 104 (vlxc_fir2).
template <VlxVector V> int32_t fir_design_set(V* v, int32_t set);

}  // namespace vlx
