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
template <VlxVector V> int32_t divide(V* a, V* b, V* dst);
// dst = (a - b) * alpha + b (vlxb_avg_add).
template <VlxVector V> int32_t avg_add(V* a, V* b, V* dst, real_t<V> alpha);
// The larger or smaller sample of each pair, by clamped power once either
// source is complex; ties go to b (vlxb_max, vlxb_min).
template <VlxVector V> int32_t maximum(V* a, V* b, V* dst);
template <VlxVector V> int32_t minimum(V* a, V* b, V* dst);
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
// In place: x + c on the real part (vlxi_offset); times re + j im, making a
// real vector complex (vlxi_cscale); negation, absolute value (real only),
// conjugate, times j (making complex).
template <VlxVector V> int32_t offset(V* v, real_t<V> c);
template <VlxVector V> int32_t cscale(V* v, real_t<V> re, real_t<V> im);
template <VlxVector V> int32_t neg(V* v);
template <VlxVector V> int32_t abs_each(V* v);
template <VlxVector V> int32_t conj(V* v);
template <VlxVector V> int32_t timesi(V* v);
// Magnitude and clamped power, packed to a real vector (vlxi_mag, vlxi_magsq),
// and the same from src into dst (vlxu_mag, vlxu_magsq).
template <VlxVector V> int32_t mag(V* v);
template <VlxVector V> int32_t magsq(V* v);
template <VlxVector V> int32_t mag_to(V* src, V* dst);
template <VlxVector V> int32_t magsq_to(V* src, V* dst);
// Clamped square, reciprocal and square root; sqrt_to is vlxu_sqrt.
template <VlxVector V> int32_t square(V* v);
template <VlxVector V> int32_t recip(V* v);
template <VlxVector V> int32_t sqrt_each(V* v);
template <VlxVector V> int32_t sqrt_to(V* src, V* dst);
// Complex (magnitude, phase) to (re, im) (vlxi_ptor).
template <VlxVector V> int32_t ptor(V* v);
// Adds amp * cos(2 pi freq x + phase), and the sine to the imaginary part of
// a complex vector when flags bit 1 is set (vlxi_addcos).
template <VlxVector V> int32_t addcos(V* v, uint32_t flags, real_t<V> freq, real_t<V> amp, real_t<V> phase);
// The functions of the math library keep a suffix here, so that these
// templates never hide std's functions from code in namespace vlx.
// Exponentials and logarithms with their clamps; db is factor * log10.
template <VlxVector V> int32_t exp_each(V* v);
template <VlxVector V> int32_t exp10(V* v);
template <VlxVector V> int32_t log_each(V* v);
template <VlxVector V> int32_t log10_each(V* v);
template <VlxVector V> int32_t db(V* v, real_t<V> factor);
// Real-only functions of each sample.
template <VlxVector V> int32_t sin_each(V* v);
template <VlxVector V> int32_t cos_each(V* v);
template <VlxVector V> int32_t tan_each(V* v);
template <VlxVector V> int32_t atan_each(V* v);
template <VlxVector V> int32_t tanh_each(V* v);
template <VlxVector V> int32_t acos_each(V* v);
template <VlxVector V> int32_t asin_each(V* v);
template <VlxVector V> int32_t cosh_each(V* v);
template <VlxVector V> int32_t sinh_each(V* v);
template <VlxVector V> int32_t sinc(V* v);
template <VlxVector V> int32_t besi0(V* v);
template <VlxVector V> int32_t besj0(V* v);
template <VlxVector V> int32_t besj1(V* v);
template <VlxVector V> int32_t besy0(V* v);
template <VlxVector V> int32_t besy1(V* v);
// Modified Bessel function I0 of one scalar (vlx_besi0_kernel); the Kaiser
// window uses it too.
template <VlxVector V> real_t<V> besi0_kernel(real_t<V> x);

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

// ---- phase and time operations ----

// Phase unwrapping against the last output (vlxi_unwrap) or the mean of the
// last window outputs (vlxi_unwrap_wnd); real only.
template <VlxVector V> int32_t unwrap(V* v);
template <VlxVector V> int32_t unwrap_wnd(V* v, int32_t window);
// First difference per unit of x and running sum times delta.
template <VlxVector V> int32_t differ(V* v);
template <VlxVector V> int32_t integ(V* v);
// x positions of the level crossings selected by mode (1 rising, 2 falling).
template <VlxVector V> int32_t edge(V* v, int32_t mode, real_t<V> level);
// Clips every scalar to the range of a and b (vlxi_limit without its unused argument).
template <VlxVector V> int32_t limit(V* v, real_t<V> a, real_t<V> b, int32_t* clipped);
// Derivative of the polynomial held lowest power first.
template <VlxVector V> int32_t pdiffer(V* v);
// Phase of each sample (real result), and (magnitude, phase) pairs.
template <VlxVector V> int32_t phase(V* v);
template <VlxVector V> int32_t rtop(V* v);

}  // namespace vlx
