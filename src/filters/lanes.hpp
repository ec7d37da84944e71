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
};


}  // namespace vlx
#endif
