// Statistics as templates, for the library's other layers, and the pieces
// shared by the statistics' own files: block summation and the math calls of
// each precision.  Each operation is explicitly instantiated for vlx_t and
// vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"
#include "core/precise_math.hpp"

#include <cmath>
#include <cstdint>
#include <type_traits>

namespace vlx {

// ---- moments, histogram, sort and median (dst becomes one point) ----

template <VlxVector V> int32_t sum(const V* src, V* dst);
template <VlxVector V> int32_t mean(const V* src, V* dst);
template <VlxVector V> int32_t magsq_sum(const V* src, V* dst);
template <VlxVector V> int32_t rms(const V* src, V* dst);
template <VlxVector V> int32_t pop_var(const V* src, V* dst);
template <VlxVector V> int32_t samp_var(const V* src, V* dst);
template <VlxVector V> int32_t pop_stddev(const V* src, V* dst);
template <VlxVector V> int32_t samp_stddev(const V* src, V* dst);
template <VlxVector V> int32_t skew(const V* src, V* dst);
template <VlxVector V> int32_t excess(const V* src, V* dst);
template <VlxVector V> int32_t gmean(const V* src, V* dst);
template <VlxVector V> int32_t hmean(const V* src, V* dst);
template <VlxVector V> int32_t min(const V* src, V* dst);
template <VlxVector V> int32_t max(const V* src, V* dst);
template <VlxVector V> int32_t median(const V* src, V* dst);
template <VlxVector V> int32_t hist(const V* src, V* dst, real_t<V> origin, real_t<V> width, int32_t bins);
template <VlxVector V> int32_t sort(V* v);

// ---- peak search (dst becomes two real points: value, fractional index) ----

template <VlxVector V> int32_t peak(const V* src, V* dst, int32_t flags, int32_t index);

// ---- polynomials (data[k] the coefficient of x^k) and their roots ----

// One real point: the polynomial at x by Horner's rule (vlxs_peval).
template <VlxVector V> int32_t peval(const V* src, V* dst, real_t<V> x);
// One root from a start: real (vlxs_psolve), or real or complex with the
// class in dst's complex flag (vlxs_pcsolve).  dst may be src.
template <VlxVector V> int32_t psolve(const V* src, V* dst, real_t<V> x);
template <VlxVector V> int32_t pcsolve(const V* src, V* dst, real_t<V> re, real_t<V> im);
// All roots up to degree 5 in closed form (vlxs_proots), of any degree by
// search and deflation (vlxi_proots), and roots back to the monic
// polynomial (vlxi_pztoc).
template <VlxVector V> int32_t proots(const V* src, V* dst);
template <VlxVector V> int32_t proots_inplace(V* v);
template <VlxVector V> int32_t pztoc(V* v);

// The layers of the root searches, exported for tests.  A real step gives dx
// (next point x - dx); a complex step writes dz to dz[0], dz[1].
template <VlxVector V> using real_step_fn = real_t<V> (*)(const V*, real_t<V>);
template <VlxVector V> using complex_step_fn = int32_t (*)(const V*, real_t<V>, real_t<V>, real_t<V>*);
template <VlxVector V> real_t<V> coef_spread(const V* p);
template <VlxVector V> real_t<V> laguerre_step_real(const V* p, real_t<V> x);
template <VlxVector V> real_t<V> newton_step_real(const V* p, real_t<V> x);
template <VlxVector V>
int32_t root_iterate_real(const V* p, real_t<V>* result, real_step_fn<V> step, real_t<V> x, real_t<V> lo, real_t<V> hi);
template <VlxVector V> real_t<V> root_upper_bound(const V* p);
template <VlxVector V> real_t<V> root_lower_bound(const V* p);
template <VlxVector V> int32_t newton_step(const V* p, real_t<V> re, real_t<V> im, real_t<V>* dz);
template <VlxVector V> int32_t laguerre_step(const V* p, real_t<V> re, real_t<V> im, real_t<V>* dz);
template <VlxVector V>
int32_t root_iterate(const V* p, V* dst, complex_step_fn<V> step, real_t<V> re, real_t<V> im, int32_t relaxed);
template <VlxVector V>
int32_t root_restarts(const V* p, V* dst, complex_step_fn<V> step, real_t<V> re, real_t<V> im, int32_t relaxed);

// ---- regression and interpolation ----

// Straight-line fit: slope and intercept (vlxs_lin_regres), or the record of
// twenty numbers (vlxs_lin_regres2).
template <VlxVector V> int32_t lin_regres(const V* src, V* dst);
template <VlxVector V> int32_t lin_regres2(const V* src, V* dst);
// Table y(x) at the queries xi into yi by the method and flags of vlx_interp;
// y2 holds spline second derivatives or is null.
template <VlxVector V> int32_t interp(const V* x, V* y, const V* y2, const V* xi, V* yi, int32_t flags);
// Spline second derivatives with the end conditions end0, endn (vlxb_cspline_2d).
template <VlxVector V> int32_t cspline_2d(const V* x, V* y, V* y2, real_t<V> d0, real_t<V> dn, int32_t end0, int32_t endn);
// Tridiagonal system of m rows, eliminated from the bottom up (vlxb_tridiagonal_solve).
template <VlxVector V>
int32_t tridiagonal_solve(real_t<V>* lower, real_t<V>* diag, real_t<V>* upper, real_t<V>* rhs, real_t<V>* out, int32_t m);

namespace stats {

// Every sum over samples runs in blocks of this many samples (points).
inline constexpr int64_t block = 2048;

// Block summation of K running sums.  Each block's partials start at 0 and
// take the samples in index order; at the end of a block they are added to
// the totals, in block order.  The totals are never updated per sample.
//
// Blocks are independent chains, so L of them advance side by side: the
// adds of one block still happen in its own order, which keeps the result
// bit-identical to summing the blocks one after another, while the processor
// overlaps L dependency chains instead of waiting on one.
//
// step(i, acc) adds the terms of sample i into acc[0..K-1].  This form goes on
// from sample `start`, a block boundary, adding to the totals as they are.
template <int K, int L, class T, class Step>
inline void block_sums_from(int64_t start, int64_t n, T (&total)[K], Step step) {
    for (; start + L * block <= n; start += L * block) {
        T acc[L][K];
        for (int b = 0; b < L; ++b)
            for (int k = 0; k < K; ++k) acc[b][k] = T(0);
        for (int64_t j = 0; j < block; ++j)
            for (int b = 0; b < L; ++b) step(start + b * block + j, acc[b]);
        for (int b = 0; b < L; ++b)
            for (int k = 0; k < K; ++k) total[k] += acc[b][k];
    }
    for (; start < n; start += block) {
        const int64_t end = start + block < n ? start + block : n;
        T acc[K];
        for (int k = 0; k < K; ++k) acc[k] = T(0);
        for (int64_t i = start; i < end; ++i) step(i, acc);
        for (int k = 0; k < K; ++k) total[k] += acc[k];
    }
}

template <int K, int L, class T, class Step>
inline void block_sums(int64_t n, T (&total)[K], Step step) {
    for (int k = 0; k < K; ++k) total[k] = T(0);
    block_sums_from<K, L>(0, n, total, step);
}

// x limited to [-bound, bound]; a NaN passes unchanged.
template <class T>
inline T saturate(T x, T bound) {
    if (x > bound) return bound;
    if (x < -bound) return -bound;
    return x;
}

template <class T>
inline bool beyond(T x, T bound) {
    return x > bound || x < -bound;
}

static_assert(std::is_same_v<decltype(std::sqrt(1.0f)), float>, "float overloads expected");

}  // namespace stats
}  // namespace vlx
