// Block sums of real double vectors with one block per AVX lane.
//
// A lane of a 256-bit register follows one block from its first sample to its
// last, doing exactly the scalar adds of that block in the same order, so the
// partials are bit-identical to the plain blockwise loop; only the blocks run
// side by side (two quads of blocks, to hide the latency of the adds).  The
// partials are then added to the totals in block order.  Plain AVX: no FMA,
// which would fuse d * d into the add and change the last bits.
#pragma once

#include "core/cpu.hpp"
#include "stats/stats.hpp"

#if defined(__x86_64__) && defined(__GNUC__)
#define VLX_STATS_AVX 1
#include <immintrin.h>

namespace vlx::stats::avx {

inline bool available() { return cpu::has_avx(); }

// Samples j and j + 1 of the four blocks starting at p, as two registers
// [b0, b1, b2, b3].
__attribute__((target("avx"))) inline void load_quad(const double* p, __m256d& lo, __m256d& hi) {
    const __m256d a = _mm256_insertf128_pd(_mm256_castpd128_pd256(_mm_loadu_pd(p)), _mm_loadu_pd(p + 2 * block), 1);
    const __m256d b = _mm256_insertf128_pd(_mm256_castpd128_pd256(_mm_loadu_pd(p + block)), _mm_loadu_pd(p + 3 * block), 1);
    lo = _mm256_unpacklo_pd(a, b);
    hi = _mm256_unpackhi_pd(a, b);
}

// Adds the lanes of the registers to the totals, block after block.
template <int R>
__attribute__((target("avx"))) inline void add_lanes(double (&total)[R], const __m256d (&acc)[2][R]) {
    for (int q = 0; q < 2; ++q) {
        alignas(32) double lane[R][4];
        for (int k = 0; k < R; ++k) _mm256_store_pd(lane[k], acc[q][k]);
        for (int b = 0; b < 4; ++b)
            for (int k = 0; k < R; ++k) total[k] += lane[k][b];
    }
}

// x saturated to [-bound, bound]; a NaN passes (min and max return their
// second operand when unordered).
__attribute__((target("avx"))) inline __m256d saturate(__m256d x, __m256d bound, __m256d neg_bound) {
    return _mm256_max_pd(neg_bound, _mm256_min_pd(bound, x));
}

// Sum of d and d * d with d = x - pivot saturated, over whole groups of eight
// blocks; returns where the groups end.
__attribute__((target("avx"))) inline int64_t pivot_sums(const double* x, int64_t n, double pivot, double bound,
                                                         double (&total)[2]) {
    const __m256d p = _mm256_set1_pd(pivot), hi_b = _mm256_set1_pd(bound), lo_b = _mm256_set1_pd(-bound);
    int64_t start = 0;
    for (; start + 8 * block <= n; start += 8 * block) {
        __m256d acc[2][2] = {{_mm256_setzero_pd(), _mm256_setzero_pd()}, {_mm256_setzero_pd(), _mm256_setzero_pd()}};
        for (int64_t j = 0; j < block; j += 2) {
            for (int q = 0; q < 2; ++q) {
                __m256d s0, s1;
                load_quad(x + start + q * 4 * block + j, s0, s1);
                const __m256d d0 = saturate(_mm256_sub_pd(s0, p), hi_b, lo_b);
                acc[q][0] = _mm256_add_pd(acc[q][0], d0);
                acc[q][1] = _mm256_add_pd(acc[q][1], _mm256_mul_pd(d0, d0));
                const __m256d d1 = saturate(_mm256_sub_pd(s1, p), hi_b, lo_b);
                acc[q][0] = _mm256_add_pd(acc[q][0], d1);
                acc[q][1] = _mm256_add_pd(acc[q][1], _mm256_mul_pd(d1, d1));
            }
        }
        add_lanes(total, acc);
    }
    return start;
}

// x * x, or exactly the bound where x lies beyond it: |x| > bound is
// x > bound or x < -bound, and false for a NaN as both of those are.
__attribute__((target("avx"))) inline __m256d square_term(__m256d x, __m256d bound, __m256d abs_mask) {
    const __m256d out = _mm256_cmp_pd(_mm256_and_pd(x, abs_mask), bound, _CMP_GT_OQ);
    // a plain select: GCC turns blendv here into branches per lane
    return _mm256_or_pd(_mm256_and_pd(out, bound), _mm256_andnot_pd(out, _mm256_mul_pd(x, x)));
}

// Sum of x * x, or exactly the bound for a sample beyond it, over whole
// groups of eight blocks; returns where the groups end.
__attribute__((target("avx"))) inline int64_t square_sums(const double* x, int64_t n, double bound,
                                                          double (&total)[1]) {
    const __m256d hi_b = _mm256_set1_pd(bound);
    const __m256d abs_mask = _mm256_castsi256_pd(_mm256_set1_epi64x(0x7fffffffffffffffLL));
    int64_t start = 0;
    for (; start + 8 * block <= n; start += 8 * block) {
        __m256d acc[2][1] = {{_mm256_setzero_pd()}, {_mm256_setzero_pd()}};
        for (int64_t j = 0; j < block; j += 2) {
            for (int q = 0; q < 2; ++q) {
                __m256d s0, s1;
                load_quad(x + start + q * 4 * block + j, s0, s1);
                acc[q][0] = _mm256_add_pd(acc[q][0], square_term(s0, hi_b, abs_mask));
                acc[q][0] = _mm256_add_pd(acc[q][0], square_term(s1, hi_b, abs_mask));
            }
        }
        add_lanes(total, acc);
    }
    return start;
}

}  // namespace vlx::stats::avx
#endif
