// Element-wise operations as templates, for the library's other layers.
// Each is explicitly instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

namespace vlx {

// ---- two-operand operations ----

// Sizes dst for a two-operand result: -1 if the points differ; delta the
// mean, complex if either is; keeps the samples when dst shares a source's
// data (vlxb_prepare_dest).
template <VlxVector V> int32_t prepare_dest(V* a, V* b, V* dst);
// dst = a * b point by point (vlxb_mul).
template <VlxVector V> int32_t mul(V* a, V* b, V* dst);

// ---- arithmetic and math ----

// Every scalar times s (vlxi_scale).
template <VlxVector V> int32_t scale(V* v, real_t<V> s);

// ---- layout operations ----

// Drops the imaginary parts (vlxi_real).
template <VlxVector V> int32_t real_part(V* v);
// Reverses the sample order (vlxi_rev).
template <VlxVector V> int32_t rev(V* v);

}  // namespace vlx
