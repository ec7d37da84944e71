// Transforms as templates, for the library's other layers.  Each is
// explicitly instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

namespace vlx {

// ---- fast transform core, bit reversal, real transforms ----

// 1, 2, 4, ...; a length of 0 or less is not a power of two.
inline bool is_power_of_two(int32_t n) { return n > 0 && (n & (n - 1)) == 0; }
// log2 of a power of two.
inline int32_t log2_of(int32_t n) {
    int32_t m = 0;
    while ((int32_t(1) << m) < n) ++m;
    return m;
}

// cos(pi/4) as the transforms store it: the double value, rounded for floats.
template <VlxVector V>
inline constexpr real_t<V> fft_sqrt_half =
    std::is_same_v<V, vlx_t> ? real_t<V>(0.7071067811865476) : real_t<V>(0.70710677f);

// The optional vendor transform binding (src/core/binding.cpp).
// dft_bound_fast() is the entry check of vlxi_fft and vlxi_rfft: it binds the
// modules on first use and says whether the fast bit is set.
// dft_fast_transform() is the fast path in place: complex_domain 0 is the
// real forward transform to the half spectrum.
template <VlxVector V> bool dft_bound_fast();
template <VlxVector V> int32_t dft_fast_transform(V* v, int32_t inverse, int32_t complex_domain);

// Twiddle table of length n (3n/2 scalars: n/4 pairs of rotation triples),
// found or built; the caller holds lock 0 and keeps the active counter raised
// while it reads the table.  0, or -1 if memory ran out.  lanes_out, if
// given, receives the per-stage copy for the vector kernels, or null.
template <VlxVector V>
int32_t fft_table(int32_t n, const real_t<V>** table_out, const real_t<V>** lanes_out = nullptr);
// Native engines, n >= 4: the complex transform in both directions (forward
// carries 1/N) and the real transform to the half spectrum.
template <VlxVector V> int32_t fft_forward(V* v);
template <VlxVector V> int32_t fft_inverse(V* v);
template <VlxVector V> int32_t fft_real_forward(V* v);

// Complex power-of-two transform in place (vlxi_fft): forward carries 1/N.
template <VlxVector V> int32_t fft(V* v, int32_t inverse);
// Reorder into bit-reversed order (vlxi_bitrev); the same, times 1/N (vlxi_bitrev_scale).
template <VlxVector V> int32_t bitrev(V* v);
template <VlxVector V> int32_t bitrev_scale(V* v);
// Finds or builds the lists of the scaled reordering of n points, so that a
// path reordering by other means fails where the reordering would; lock 0
// held.  0 or -1.
template <VlxVector V> int32_t bitrev_lists(int32_t n);
// Real power-of-two transform to the half spectrum, and back (vlxi_rfft, vlxi_irfft).
template <VlxVector V> int32_t rfft(V* v);
template <VlxVector V> int32_t irfft(V* v);
// Half spectrum to full spectrum (vlxi_orecon).
template <VlxVector V> int32_t orecon(V* v, int32_t odd);

// ---- arbitrary length, real of any length, cosine, analytic ----

// Transform of any length (vlxi_dft).
template <VlxVector V> int32_t dft(V* v, int32_t inverse);
// Real vector of any length to its half spectrum, and back (vlxi_rdft, vlxi_irdft).
template <VlxVector V> int32_t rdft(V* v);
template <VlxVector V> int32_t irdft(V* v, int32_t odd);
// Cosine transform of type II and its inverse, any length (vlxi_dct).
template <VlxVector V> int32_t dct(V* v, uint32_t flags);
// Analytic signal and Hilbert transform, any length (vlxi_analytic, vlxi_hilbert).
template <VlxVector V> int32_t analytic(V* v);
template <VlxVector V> int32_t hilbert(V* v);

}  // namespace vlx
