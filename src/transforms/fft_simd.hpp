// Vector lanes for the transform engines: AVX without FMA, chosen at run
// time.  Each lane does the scalar code's own operations in the same order,
// so a vectorised butterfly gives the scalar result bit for bit.
#pragma once

#include <cstddef>
#include <type_traits>

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#define VLX_FFT_AVX 1
#endif

#ifdef VLX_FFT_AVX
namespace vlx {
namespace fft_simd {

inline bool have_avx() {
    static const bool avx = __builtin_cpu_supports("avx");
    return avx;
}


// A vector holds W complex points (2 doubles or 4 floats), k .. k+W-1 of a
// block.
template <class T>
struct Avx;

template <>
struct Avx<double> {
    using scalar = double;
    using reg = __m256d;
    static constexpr size_t width = 2;
    __attribute__((target("avx"))) static reg load(const double* p) { return _mm256_loadu_pd(p); }
    __attribute__((target("avx"))) static void store(double* p, reg v) { _mm256_storeu_pd(p, v); }
    __attribute__((target("avx"))) static reg add(reg a, reg b) { return _mm256_add_pd(a, b); }
    __attribute__((target("avx"))) static reg sub(reg a, reg b) { return _mm256_sub_pd(a, b); }
    __attribute__((target("avx"))) static reg mul(reg a, reg b) { return _mm256_mul_pd(a, b); }
    // (re, im) -> (im, re)
    __attribute__((target("avx"))) static reg swap(reg v) { return _mm256_permute_pd(v, 0x5); }
    // (re, im) -> (re, re)
    __attribute__((target("avx"))) static reg dup_re(reg v) { return _mm256_movedup_pd(v); }
    // real parts from r, imaginary parts from i
    __attribute__((target("avx"))) static reg re_im(reg r, reg i) { return _mm256_blend_pd(r, i, 0xA); }
    // point 0 from a, the others from b
    __attribute__((target("avx"))) static reg first_from(reg a, reg b) { return _mm256_blend_pd(b, a, 0x3); }
    // the points in reverse order
    __attribute__((target("avx"))) static reg reverse(reg v) { return _mm256_permute2f128_pd(v, v, 0x01); }
    // Triples of two points: (c, c) and (a, b) per point, for the first
    // (offset 0) or the second (offset 3) triple of each pair.
    template <int Offset>
    __attribute__((target("avx"))) static void triples(const double* t, size_t step, reg& c, reg& ab) {
        c = _mm256_insertf128_pd(_mm256_castpd128_pd256(_mm_loaddup_pd(t + Offset)), _mm_loaddup_pd(t + step + Offset),
                                 1);
        ab = _mm256_insertf128_pd(_mm256_castpd128_pd256(_mm_loadu_pd(t + Offset + 1)),
                                  _mm_loadu_pd(t + step + Offset + 1), 1);
    }
};

template <>
struct Avx<float> {
    using scalar = float;
    using reg = __m256;
    static constexpr size_t width = 4;
    __attribute__((target("avx"))) static reg load(const float* p) { return _mm256_loadu_ps(p); }
    __attribute__((target("avx"))) static void store(float* p, reg v) { _mm256_storeu_ps(p, v); }
    __attribute__((target("avx"))) static reg add(reg a, reg b) { return _mm256_add_ps(a, b); }
    __attribute__((target("avx"))) static reg sub(reg a, reg b) { return _mm256_sub_ps(a, b); }
    __attribute__((target("avx"))) static reg mul(reg a, reg b) { return _mm256_mul_ps(a, b); }
    __attribute__((target("avx"))) static reg swap(reg v) { return _mm256_permute_ps(v, 0xB1); }
    __attribute__((target("avx"))) static reg dup_re(reg v) { return _mm256_moveldup_ps(v); }
    __attribute__((target("avx"))) static reg re_im(reg r, reg i) { return _mm256_blend_ps(r, i, 0xAA); }
    __attribute__((target("avx"))) static reg first_from(reg a, reg b) { return _mm256_blend_ps(b, a, 0x3); }
    __attribute__((target("avx"))) static reg reverse(reg v) {
        return _mm256_permute_ps(_mm256_permute2f128_ps(v, v, 0x01), 0x4E);
    }
    // Triples of four points: (c, c) and (a, b) per point, for the first
    // (offset 0) or the second (offset 3) triple of each pair.
    template <int Offset>
    __attribute__((target("avx"))) static void triples(const float* t, size_t step, reg& c, reg& ab) {
        // four scalars within the pair: (c, a, b, c3) or (b, c3, a3, b3)
        constexpr int at = Offset == 0 ? 0 : 2;
        const __m128 p0 = _mm_loadu_ps(t + at), p1 = _mm_loadu_ps(t + step + at);
        const __m128 p2 = _mm_loadu_ps(t + 2 * step + at), p3 = _mm_loadu_ps(t + 3 * step + at);
        if constexpr (Offset == 0) {
            c = _mm256_set_m128(_mm_shuffle_ps(p2, p3, 0x00), _mm_shuffle_ps(p0, p1, 0x00));
            ab = _mm256_set_m128(_mm_shuffle_ps(p2, p3, 0x99), _mm_shuffle_ps(p0, p1, 0x99));
        } else {
            c = _mm256_set_m128(_mm_shuffle_ps(p2, p3, 0x55), _mm_shuffle_ps(p0, p1, 0x55));
            ab = _mm256_set_m128(_mm_shuffle_ps(p2, p3, 0xEE), _mm_shuffle_ps(p0, p1, 0xEE));
        }
    }
};

// Two complex floats in 128 bits (VEX-encoded), for blocks of quarter length 2.
struct Floats128 {
    using scalar = float;
    using reg = __m128;
    static constexpr size_t width = 2;
    __attribute__((target("avx"))) static reg load(const float* p) { return _mm_loadu_ps(p); }
    __attribute__((target("avx"))) static void store(float* p, reg v) { _mm_storeu_ps(p, v); }
    __attribute__((target("avx"))) static reg add(reg a, reg b) { return _mm_add_ps(a, b); }
    __attribute__((target("avx"))) static reg sub(reg a, reg b) { return _mm_sub_ps(a, b); }
    __attribute__((target("avx"))) static reg mul(reg a, reg b) { return _mm_mul_ps(a, b); }
    __attribute__((target("avx"))) static reg swap(reg v) { return _mm_permute_ps(v, 0xB1); }
    __attribute__((target("avx"))) static reg dup_re(reg v) { return _mm_moveldup_ps(v); }
    __attribute__((target("avx"))) static reg re_im(reg r, reg i) { return _mm_blend_ps(r, i, 0xA); }
    __attribute__((target("avx"))) static reg first_from(reg a, reg b) { return _mm_blend_ps(b, a, 0x3); }
    __attribute__((target("avx"))) static reg reverse(reg v) { return _mm_permute_ps(v, 0x4E); }
    template <int Offset>
    __attribute__((target("avx"))) static void triples(const float* t, size_t step, reg& c, reg& ab) {
        constexpr int at = Offset == 0 ? 0 : 2;
        const __m128 p0 = _mm_loadu_ps(t + at), p1 = _mm_loadu_ps(t + step + at);
        if constexpr (Offset == 0) {
            c = _mm_shuffle_ps(p0, p1, 0x00);
            ab = _mm_shuffle_ps(p0, p1, 0x99);
        } else {
            c = _mm_shuffle_ps(p0, p1, 0x55);
            ab = _mm_shuffle_ps(p0, p1, 0xEE);
        }
    }
};

// The three-multiply rotation of W points at once: c holds (c, c) per point,
// ab holds (a, b) per point as the table stores them.
template <class S, bool Inverse>
__attribute__((target("avx"))) inline typename S::reg rotate_simd(typename S::reg z, typename S::reg c,
                                                                   typename S::reg ab) {
    // re + im in the real lane, copied: the scalar form uses one m for both parts
    const auto m = S::mul(S::dup_re(S::add(z, S::swap(z))), c);
    // forward: (b im, a re); inverse: (a im, b re)
    const auto coef = Inverse ? ab : S::swap(ab);
    return S::add(m, S::mul(coef, S::swap(z)));
}

}  // namespace fft_simd
}  // namespace vlx
#endif
