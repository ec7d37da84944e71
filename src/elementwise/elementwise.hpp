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
// The element loops of vlxb_add and vlxb_sub; need equal points.
template <VlxVector V> int32_t add_equal(V* a, V* b, V* dst);
template <VlxVector V> int32_t sub_equal(V* a, V* b, V* dst);
// dst = a + b and a - b; the shorter source counts as zero-extended.
template <VlxVector V> int32_t add(V* a, V* b, V* dst);
template <VlxVector V> int32_t sub(V* a, V* b, V* dst);
// dst = a * b point by point (vlxb_mul).
template <VlxVector V> int32_t mul(V* a, V* b, V* dst);
// dst = a * conj(b) (vlxb_conj_mul).
template <VlxVector V> int32_t conj_mul(V* a, V* b, V* dst);
// dst = a / b; a division by zero gives the family's bound (vlxb_div).
template <VlxVector V> int32_t div(V* a, V* b, V* dst);
// dst = (a - b) * alpha + b (vlxb_avg_add).
template <VlxVector V> int32_t avg_add(V* a, V* b, V* dst, real_t<V> alpha);
// The larger or smaller sample of each pair, by clamped power once either
// source is complex; ties go to b (vlxb_max, vlxb_min).
template <VlxVector V> int32_t max(V* a, V* b, V* dst);
template <VlxVector V> int32_t min(V* a, V* b, V* dst);
// a[0], b[0], a[1], b[1], ... (vlxb_inter).
template <VlxVector V> int32_t inter(V* a, V* b, V* dst);
// Complex vector from a real and an imaginary part (vlxb_ritoc).
template <VlxVector V> int32_t ritoc(V* re, V* im, V* dst);
// Polynomial product, the full linear convolution (vlxb_pmul).
template <VlxVector V> int32_t pmul(V* a, V* b, V* dst);
// One-point dst = sum of a[i] * b[i], nothing conjugated (vlxbs_dot).
template <VlxVector V> int32_t dot(V* a, V* b, V* dst);

// ---- arithmetic and math ----

// Every scalar times s (vlxi_scale).
template <VlxVector V> int32_t scale(V* v, real_t<V> s);

// ---- layout operations ----

// Drops the imaginary parts (vlxi_real).
template <VlxVector V> int32_t real_part(V* v);
// Reverses the sample order (vlxi_rev).
template <VlxVector V> int32_t rev(V* v);

}  // namespace vlx
