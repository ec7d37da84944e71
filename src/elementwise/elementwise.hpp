// Element-wise operations as templates, for the library's other layers.
// Each is explicitly instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

namespace vlx {

// ---- two-operand operations ----

// dst = a * b point by point (vlxb_mul).
template <VlxVector V> int32_t mul(V* a, V* b, V* dst);

// ---- arithmetic and math ----

// Every scalar times s (vlxi_scale).
template <VlxVector V> int32_t scale(V* v, real_t<V> s);

// ---- layout operations ----

// Drops the imaginary parts (vlxi_real).
template <VlxVector V> int32_t real_part(V* v);
// Keeps only the imaginary parts; a real vector becomes zeros (vlxi_imag).
template <VlxVector V> int32_t imag_part(V* v);
// Reverses the sample order (vlxi_rev).
template <VlxVector V> int32_t rev(V* v);
// Drops the first k samples (vlxi_shift).
template <VlxVector V> int32_t shift(V* v, int32_t k);
// Rotates left by n - n/2 samples (vlxi_swap_halves), and by n/2
// (vlxi_swap_halves2); each undoes the other.
template <VlxVector V> int32_t swap_halves(V* v);
template <VlxVector V> int32_t swap_halves2(V* v);
// Pads to new_n samples, or removes padding down to new_n, by a layout and a
// scale mode in flags (vlxi_zpad2, vlxi_unzpad).
template <VlxVector V> int32_t zpad2(V* v, int32_t new_n, int32_t flags);
template <VlxVector V> int32_t unzpad(V* v, int32_t new_n, int32_t flags);
// dst = src with a zero behind every sample, each scaled; dst may be src
// (vlxu_zinter).  zinter(v) is zinter_to(v, v, 1) (vlxi_zinter).
template <VlxVector V> int32_t zinter_to(V* src, V* dst, real_t<V> scale_by);
template <VlxVector V> int32_t zinter(V* v);

}  // namespace vlx
