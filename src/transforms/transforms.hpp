// Transforms as templates, for the library's other layers.  Each is
// explicitly instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

namespace vlx {

// ---- fast transform core, bit reversal, real transforms ----

// Complex power-of-two transform in place (vlxi_fft): forward carries 1/N.
template <VlxVector V> int32_t fft(V* v, int32_t inverse);
// Reorder into bit-reversed order (vlxi_bitrev); the same, times 1/N (vlxi_bitrev_scale).
template <VlxVector V> int32_t bitrev(V* v);
template <VlxVector V> int32_t bitrev_scale(V* v);
// Real power-of-two transform to the half spectrum, and back (vlxi_rfft, vlxi_irfft).
template <VlxVector V> int32_t rfft(V* v);
template <VlxVector V> int32_t irfft(V* v);
// Half spectrum to full spectrum (vlxi_orecon).
template <VlxVector V> int32_t orecon(V* v, int32_t odd);

// ---- arbitrary length, real of any length, cosine, analytic ----

// Transform of any length (vlxi_dft).
template <VlxVector V> int32_t dft(V* v, int32_t inverse);

}  // namespace vlx
