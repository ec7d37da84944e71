// Vector lanes for the filter kernels: one AVX register of samples, with the
// product and the add kept apart (no FMA), so a lane rounds as the scalar
// expression does.
#pragma once

#if defined(__x86_64__) && defined(__GNUC__)
#define VLX_FILTER_LANES 1
#include <immintrin.h>

#include <cstdint>

namespace vlx {

template <class T>
struct Lanes;
template <>
struct Lanes<double> {
    using reg = __m256d;
    static constexpr int64_t width = 4;
    __attribute__((target("avx2"))) static reg zero() { return _mm256_setzero_pd(); }
    __attribute__((target("avx2"))) static reg broadcast(const double* p) { return _mm256_broadcast_sd(p); }
    __attribute__((target("avx2"))) static reg load(const double* p) { return _mm256_loadu_pd(p); }
    __attribute__((target("avx2"))) static void store(double* p, reg v) { _mm256_storeu_pd(p, v); }
    __attribute__((target("avx2"))) static reg add_product(reg acc, reg c, reg x) {
        return _mm256_add_pd(acc, _mm256_mul_pd(c, x));
    }
    // Per-lane table reads: lane k takes base[i[k]].
    using index = __m128i;
    __attribute__((target("avx2"))) static index load_index(const int32_t* p) {
        return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
    }
    __attribute__((target("avx2"))) static index step(index i, int32_t by) {
        return _mm_add_epi32(i, _mm_set1_epi32(by));
    }
    __attribute__((target("avx2"))) static reg gather(const double* base, index i) {
        // the masked form: the plain one trips a false uninitialised warning
        return _mm256_mask_i32gather_pd(_mm256_setzero_pd(), base, i, _mm256_castsi256_pd(_mm256_set1_epi64x(-1)), 8);
    }
    __attribute__((target("avx2"))) static reg sub(reg a, reg b) { return _mm256_sub_pd(a, b); }
    __attribute__((target("avx2"))) static reg mul(reg a, reg b) { return _mm256_mul_pd(a, b); }
    __attribute__((target("avx2"))) static reg add(reg a, reg b) { return _mm256_add_pd(a, b); }
};
template <>
struct Lanes<float> {
    using reg = __m256;
    static constexpr int64_t width = 8;
    __attribute__((target("avx2"))) static reg zero() { return _mm256_setzero_ps(); }
    __attribute__((target("avx2"))) static reg broadcast(const float* p) { return _mm256_broadcast_ss(p); }
    __attribute__((target("avx2"))) static reg load(const float* p) { return _mm256_loadu_ps(p); }
    __attribute__((target("avx2"))) static void store(float* p, reg v) { _mm256_storeu_ps(p, v); }
    __attribute__((target("avx2"))) static reg add_product(reg acc, reg c, reg x) {
        return _mm256_add_ps(acc, _mm256_mul_ps(c, x));
    }
    using index = __m256i;
    __attribute__((target("avx2"))) static index load_index(const int32_t* p) {
        return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p));
    }
    __attribute__((target("avx2"))) static index step(index i, int32_t by) {
        return _mm256_add_epi32(i, _mm256_set1_epi32(by));
    }
    __attribute__((target("avx2"))) static reg gather(const float* base, index i) {
        return _mm256_mask_i32gather_ps(_mm256_setzero_ps(), base, i, _mm256_castsi256_ps(_mm256_set1_epi32(-1)), 4);
    }
    __attribute__((target("avx2"))) static reg sub(reg a, reg b) { return _mm256_sub_ps(a, b); }
    __attribute__((target("avx2"))) static reg mul(reg a, reg b) { return _mm256_mul_ps(a, b); }
    __attribute__((target("avx2"))) static reg add(reg a, reg b) { return _mm256_add_ps(a, b); }
};


}  // namespace vlx
#endif
