// Vector lanes for the transform engines: AVX and AVX-512F without FMA,
// chosen at run time.  Each lane does the scalar code's own operations in the
// same order, so a vectorised butterfly gives the scalar result bit for bit.
#pragma once

#include "core/cpu.hpp"

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <type_traits>

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#define VLX_FFT_AVX 1
#endif

namespace vlx {
namespace fft_simd {

// Lane levels: 0 scalar, 1 AVX (256 bits), 2 AVX-512F.  The cap lets the
// tests run every path on one machine; it never changes a result.
inline std::atomic<int32_t> lane_cap{2};

inline int32_t lanes_available() {
#ifdef VLX_FFT_AVX
    if (cpu::has_avx512f()) return 2;
    if (cpu::has_avx()) return 1;
#endif
    return 0;
}

inline int32_t lanes() {
    const int32_t cap = lane_cap.load(std::memory_order_relaxed);
    const int32_t have = lanes_available();
    return cap < have ? cap : have;
}

}  // namespace fft_simd
}  // namespace vlx

#ifdef VLX_FFT_AVX
namespace vlx {
namespace fft_simd {

#define VLX_AVX __attribute__((target("avx"), always_inline))
#define VLX_AVX512 __attribute__((target("avx512f"), always_inline))

// A vector holds W complex points (2 doubles or 4 floats), k .. k+W-1 of a
// block.
template <class T>
struct Avx;

template <>
struct Avx<double> {
    using scalar = double;
    using reg = __m256d;
    static constexpr size_t width = 2;
    VLX_AVX static reg load(const double* p) { return _mm256_loadu_pd(p); }
    VLX_AVX static void store(double* p, reg v) { _mm256_storeu_pd(p, v); }
    VLX_AVX static reg add(reg a, reg b) { return _mm256_add_pd(a, b); }
    VLX_AVX static reg sub(reg a, reg b) { return _mm256_sub_pd(a, b); }
    VLX_AVX static reg mul(reg a, reg b) { return _mm256_mul_pd(a, b); }
    // (re, im) -> (im, re)
    VLX_AVX static reg swap(reg v) { return _mm256_permute_pd(v, 0x5); }
    // real parts from r, imaginary parts from i
    VLX_AVX static reg re_im(reg r, reg i) { return _mm256_blend_pd(r, i, 0xA); }
    // point 0 from a, the others from b
    VLX_AVX static reg first_from(reg a, reg b) { return _mm256_blend_pd(b, a, 0x3); }
    // the points in reverse order
    VLX_AVX static reg reverse(reg v) { return _mm256_permute2f128_pd(v, v, 0x01); }
};

template <>
struct Avx<float> {
    using scalar = float;
    using reg = __m256;
    static constexpr size_t width = 4;
    VLX_AVX static reg load(const float* p) { return _mm256_loadu_ps(p); }
    VLX_AVX static void store(float* p, reg v) { _mm256_storeu_ps(p, v); }
    VLX_AVX static reg add(reg a, reg b) { return _mm256_add_ps(a, b); }
    VLX_AVX static reg sub(reg a, reg b) { return _mm256_sub_ps(a, b); }
    VLX_AVX static reg mul(reg a, reg b) { return _mm256_mul_ps(a, b); }
    VLX_AVX static reg swap(reg v) { return _mm256_permute_ps(v, 0xB1); }
    VLX_AVX static reg re_im(reg r, reg i) { return _mm256_blend_ps(r, i, 0xAA); }
    VLX_AVX static reg first_from(reg a, reg b) { return _mm256_blend_ps(b, a, 0x3); }
    VLX_AVX static reg reverse(reg v) { return _mm256_permute_ps(_mm256_permute2f128_ps(v, v, 0x01), 0x4E); }
};

// Two complex floats in 128 bits (VEX-encoded), for blocks of quarter length 2.
struct Floats128 {
    using scalar = float;
    using reg = __m128;
    static constexpr size_t width = 2;
    VLX_AVX static reg load(const float* p) { return _mm_loadu_ps(p); }
    VLX_AVX static void store(float* p, reg v) { _mm_storeu_ps(p, v); }
    VLX_AVX static reg add(reg a, reg b) { return _mm_add_ps(a, b); }
    VLX_AVX static reg sub(reg a, reg b) { return _mm_sub_ps(a, b); }
    VLX_AVX static reg mul(reg a, reg b) { return _mm_mul_ps(a, b); }
    VLX_AVX static reg swap(reg v) { return _mm_permute_ps(v, 0xB1); }
    VLX_AVX static reg re_im(reg r, reg i) { return _mm_blend_ps(r, i, 0xA); }
    VLX_AVX static reg first_from(reg a, reg b) { return _mm_blend_ps(b, a, 0x3); }
    VLX_AVX static reg reverse(reg v) { return _mm_permute_ps(v, 0x4E); }
};

// 512 bits: 4 complex doubles or 8 complex floats.
template <class T>
struct Avx512;

template <>
struct Avx512<double> {
    using scalar = double;
    using reg = __m512d;
    static constexpr size_t width = 4;
    VLX_AVX512 static reg load(const double* p) { return _mm512_loadu_pd(p); }
    VLX_AVX512 static void store(double* p, reg v) { _mm512_storeu_pd(p, v); }
    VLX_AVX512 static reg add(reg a, reg b) { return _mm512_add_pd(a, b); }
    VLX_AVX512 static reg sub(reg a, reg b) { return _mm512_sub_pd(a, b); }
    VLX_AVX512 static reg mul(reg a, reg b) { return _mm512_mul_pd(a, b); }
    VLX_AVX512 static reg swap(reg v) { return _mm512_shuffle_pd(v, v, 0x55); }
    VLX_AVX512 static reg re_im(reg r, reg i) { return _mm512_mask_blend_pd(0xAA, r, i); }
    VLX_AVX512 static reg first_from(reg a, reg b) { return _mm512_mask_blend_pd(0x03, b, a); }
    VLX_AVX512 static reg reverse(reg v) {
        return _mm512_permutex2var_pd(v, _mm512_set_epi64(1, 0, 3, 2, 5, 4, 7, 6), v);
    }
};

template <>
struct Avx512<float> {
    using scalar = float;
    using reg = __m512;
    static constexpr size_t width = 8;
    VLX_AVX512 static reg load(const float* p) { return _mm512_loadu_ps(p); }
    VLX_AVX512 static void store(float* p, reg v) { _mm512_storeu_ps(p, v); }
    VLX_AVX512 static reg add(reg a, reg b) { return _mm512_add_ps(a, b); }
    VLX_AVX512 static reg sub(reg a, reg b) { return _mm512_sub_ps(a, b); }
    VLX_AVX512 static reg mul(reg a, reg b) { return _mm512_mul_ps(a, b); }
    VLX_AVX512 static reg swap(reg v) { return _mm512_shuffle_ps(v, v, 0xB1); }
    VLX_AVX512 static reg re_im(reg r, reg i) { return _mm512_mask_blend_ps(0xAAAA, r, i); }
    VLX_AVX512 static reg first_from(reg a, reg b) { return _mm512_mask_blend_ps(0x0003, b, a); }
    VLX_AVX512 static reg reverse(reg v) {
        return _mm512_permutex2var_ps(v, _mm512_set_epi32(1, 0, 3, 2, 5, 4, 7, 6, 9, 8, 11, 10, 13, 12, 15, 14), v);
    }
};

// Four complex points in one register, for the leaves of the transform:
// doubles in 512 bits, floats in 256.  Named point permutations.
template <class T>
struct Quad;

template <>
struct Quad<double> : Avx512<double> {
    VLX_AVX512 static reg points(reg a, long long i0, long long i1, long long i2, long long i3) {
        return _mm512_permutex2var_pd(
            a, _mm512_set_epi64(2 * i3 + 1, 2 * i3, 2 * i2 + 1, 2 * i2, 2 * i1 + 1, 2 * i1, 2 * i0 + 1, 2 * i0), a);
    }
    VLX_AVX512 static reg halves_swapped(reg a) { return points(a, 2, 3, 0, 1); }
    VLX_AVX512 static reg neighbours_swapped(reg a) { return points(a, 1, 0, 3, 2); }
    VLX_AVX512 static reg point0(reg a) { return points(a, 0, 0, 0, 0); }
    VLX_AVX512 static reg point1(reg a) { return points(a, 1, 1, 1, 1); }
    VLX_AVX512 static reg low_twice(reg a) { return points(a, 0, 1, 0, 1); }
    VLX_AVX512 static reg high_twice(reg a) { return points(a, 2, 3, 2, 3); }
    VLX_AVX512 static reg low_reversed_twice(reg a) { return points(a, 1, 0, 1, 0); }
    // points 2, 3 twice, real and imaginary parts swapped
    VLX_AVX512 static reg high_twice_swapped(reg a) {
        return _mm512_permutex2var_pd(a, _mm512_set_epi64(6, 7, 4, 5, 6, 7, 4, 5), a);
    }
    // (points 0, 1 of a, points 0, 1 of b)
    VLX_AVX512 static reg lows(reg a, reg b) {
        return _mm512_permutex2var_pd(a, _mm512_set_epi64(11, 10, 9, 8, 3, 2, 1, 0), b);
    }
    // (point 0, point 0, point 2, point 2)
    VLX_AVX512 static reg evens_twice(reg a) { return points(a, 0, 0, 2, 2); }
    // (point 1, point 1, point 3 swapped, point 3 swapped)
    VLX_AVX512 static reg odds_twice_high_swapped(reg a) {
        return _mm512_permutex2var_pd(a, _mm512_set_epi64(6, 7, 6, 7, 3, 2, 3, 2), a);
    }
    template <int Mask>
    VLX_AVX512 static reg blend(reg a, reg b) { return _mm512_mask_blend_pd(Mask, a, b); }
    // scalars 0..3 and 8..11 of t, and 4..7 and 12..15
    VLX_AVX512 static void split_table(const double* t, reg& first, reg& second) {
        const reg lo = _mm512_loadu_pd(t), hi = _mm512_loadu_pd(t + 8);
        first = _mm512_permutex2var_pd(lo, _mm512_set_epi64(11, 10, 9, 8, 3, 2, 1, 0), hi);
        second = _mm512_permutex2var_pd(lo, _mm512_set_epi64(15, 14, 13, 12, 7, 6, 5, 4), hi);
    }
};

template <>
struct Quad<float> : Avx<float> {
    VLX_AVX static reg halves_swapped(reg a) { return _mm256_permute2f128_ps(a, a, 0x01); }
    VLX_AVX static reg neighbours_swapped(reg a) { return _mm256_permute_ps(a, 0x4E); }
    VLX_AVX static reg point0(reg a) {
        const reg p = _mm256_permute_ps(a, 0x44);
        return _mm256_permute2f128_ps(p, p, 0x00);
    }
    VLX_AVX static reg point1(reg a) {
        const reg p = _mm256_permute_ps(a, 0xEE);
        return _mm256_permute2f128_ps(p, p, 0x00);
    }
    VLX_AVX static reg low_twice(reg a) { return _mm256_permute2f128_ps(a, a, 0x00); }
    VLX_AVX static reg high_twice(reg a) { return _mm256_permute2f128_ps(a, a, 0x11); }
    VLX_AVX static reg low_reversed_twice(reg a) { return low_twice(neighbours_swapped(a)); }
    VLX_AVX static reg high_twice_swapped(reg a) { return swap(high_twice(a)); }
    VLX_AVX static reg lows(reg a, reg b) { return _mm256_permute2f128_ps(a, b, 0x20); }
    VLX_AVX static reg evens_twice(reg a) { return _mm256_permute_ps(a, 0x44); }
    VLX_AVX static reg odds_twice_high_swapped(reg a) {
        return _mm256_permutevar_ps(a, _mm256_setr_epi32(2, 3, 2, 3, 3, 2, 3, 2));
    }
    template <int Mask>
    VLX_AVX static reg blend(reg a, reg b) { return _mm256_blend_ps(a, b, Mask); }
    VLX_AVX static void split_table(const float* t, reg& first, reg& second) {
        first = _mm256_set_m128(_mm_loadu_ps(t + 8), _mm_loadu_ps(t));
        second = _mm256_set_m128(_mm_loadu_ps(t + 12), _mm_loadu_ps(t + 4));
    }
};

VLX_AVX512 inline __m512i index(long long i0, long long i1, long long i2, long long i3, long long i4, long long i5,
                                long long i6, long long i7) {
    return _mm512_set_epi64(i7, i6, i5, i4, i3, i2, i1, i0);
}

// 8 x 8 transpose of 64-bit elements: rows r[0..7] in, columns out.
VLX_AVX512 inline void transpose8(const __m512d* r, __m512d* column) {
    const __m512i lo = index(0, 8, 2, 10, 4, 12, 6, 14), hi = index(1, 9, 3, 11, 5, 13, 7, 15);
    const __m512i lo2 = index(0, 1, 8, 9, 4, 5, 12, 13), hi2 = index(2, 3, 10, 11, 6, 7, 14, 15);
    const __m512i lo4 = index(0, 1, 2, 3, 8, 9, 10, 11), hi4 = index(4, 5, 6, 7, 12, 13, 14, 15);
    __m512d t[8], u[8];
    for (int i = 0; i < 8; i += 2) {
        t[i] = _mm512_permutex2var_pd(r[i], lo, r[i + 1]);
        t[i + 1] = _mm512_permutex2var_pd(r[i], hi, r[i + 1]);
    }
    for (int i = 0; i < 8; i += 4) {
        u[i] = _mm512_permutex2var_pd(t[i], lo2, t[i + 2]);          // columns 0 and 4 of these four rows
        u[i + 1] = _mm512_permutex2var_pd(t[i], hi2, t[i + 2]);      // 2 and 6
        u[i + 2] = _mm512_permutex2var_pd(t[i + 1], lo2, t[i + 3]);  // 1 and 5
        u[i + 3] = _mm512_permutex2var_pd(t[i + 1], hi2, t[i + 3]);  // 3 and 7
    }
    column[0] = _mm512_permutex2var_pd(u[0], lo4, u[4]);
    column[4] = _mm512_permutex2var_pd(u[0], hi4, u[4]);
    column[2] = _mm512_permutex2var_pd(u[1], lo4, u[5]);
    column[6] = _mm512_permutex2var_pd(u[1], hi4, u[5]);
    column[1] = _mm512_permutex2var_pd(u[2], lo4, u[6]);
    column[5] = _mm512_permutex2var_pd(u[2], hi4, u[6]);
    column[3] = _mm512_permutex2var_pd(u[3], lo4, u[7]);
    column[7] = _mm512_permutex2var_pd(u[3], hi4, u[7]);
}

#undef VLX_AVX
#undef VLX_AVX512

}  // namespace fft_simd
}  // namespace vlx
#endif

#ifdef VLX_FFT_AVX
namespace vlx::fft_simd {
namespace lanes256 {
#define VLX_LANES_TARGET "avx"
#include "transforms/fft_kernels.inc"
#undef VLX_LANES_TARGET
}  // namespace lanes256
namespace lanes512 {
#define VLX_LANES_TARGET "avx512f"
#include "transforms/fft_kernels.inc"
#undef VLX_LANES_TARGET
}  // namespace lanes512
}  // namespace vlx::fft_simd
#endif

namespace vlx::fft_simd {
// Offset of the lane copy of the stage of quarter length q (q >= 2) in the
// lane table of length n: the stages from q = n/4 down, 8q scalars each.
inline size_t lane_offset(size_t n, size_t q) { return 8 * (n / 2 - 2 * q); }
// Scalars of the lane table of length n (n >= 8).
inline size_t lane_table_size(size_t n) { return 4 * n - 16; }
}  // namespace vlx::fft_simd
