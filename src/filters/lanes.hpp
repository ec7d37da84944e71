// Vector lanes for the filter kernels: one AVX register of samples, with the
// product and the add kept apart (no FMA), so a lane rounds as the scalar
// expression does.
#pragma once

#include "core/cpu.hpp"

#include <atomic>
#include <cstdint>

#if defined(__x86_64__) && defined(__GNUC__)
#define VLX_FILTER_LANES 1
#include <immintrin.h>

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
    __attribute__((target("avx2"))) static reg sub(reg a, reg b) { return _mm256_sub_pd(a, b); }
    __attribute__((target("avx2"))) static reg mul(reg a, reg b) { return _mm256_mul_pd(a, b); }
    __attribute__((target("avx2"))) static reg add(reg a, reg b) { return _mm256_add_pd(a, b); }
    // Lane k gets t[at[k]] in a and t[at[k] + 1] in b, read as pairs.
    __attribute__((target("avx2"))) static void pairs(const double* t, const int32_t* at, reg& a, reg& b) {
        const reg p = _mm256_loadu2_m128d(t + at[2], t + at[0]), q = _mm256_loadu2_m128d(t + at[3], t + at[1]);
        a = _mm256_unpacklo_pd(p, q);
        b = _mm256_unpackhi_pd(p, q);
    }
    // col[s] lane k = x[at[k] + s] for s below width: four rows turned into columns.
    __attribute__((target("avx2"))) static void columns(const double* x, const int32_t* at, reg* col) {
        const reg r0 = load(x + at[0]), r1 = load(x + at[1]), r2 = load(x + at[2]), r3 = load(x + at[3]);
        const reg t0 = _mm256_unpacklo_pd(r0, r1), t1 = _mm256_unpackhi_pd(r0, r1);
        const reg t2 = _mm256_unpacklo_pd(r2, r3), t3 = _mm256_unpackhi_pd(r2, r3);
        col[0] = _mm256_permute2f128_pd(t0, t2, 0x20);
        col[1] = _mm256_permute2f128_pd(t1, t3, 0x20);
        col[2] = _mm256_permute2f128_pd(t0, t2, 0x31);
        col[3] = _mm256_permute2f128_pd(t1, t3, 0x31);
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
    __attribute__((target("avx2"))) static reg sub(reg a, reg b) { return _mm256_sub_ps(a, b); }
    __attribute__((target("avx2"))) static reg mul(reg a, reg b) { return _mm256_mul_ps(a, b); }
    __attribute__((target("avx2"))) static reg add(reg a, reg b) { return _mm256_add_ps(a, b); }
    __attribute__((target("avx2"))) static __m128 pair2(const float* p, const float* q) {
        const __m128 lo = _mm_loadl_pi(_mm_setzero_ps(), reinterpret_cast<const __m64*>(p));
        return _mm_loadh_pi(lo, reinterpret_cast<const __m64*>(q));
    }
    __attribute__((target("avx2"))) static void pairs(const float* t, const int32_t* at, reg& a, reg& b) {
        const reg p = _mm256_insertf128_ps(_mm256_castps128_ps256(pair2(t + at[0], t + at[1])),
                                           pair2(t + at[4], t + at[5]), 1);
        const reg q = _mm256_insertf128_ps(_mm256_castps128_ps256(pair2(t + at[2], t + at[3])),
                                           pair2(t + at[6], t + at[7]), 1);
        a = _mm256_shuffle_ps(p, q, 0x88);
        b = _mm256_shuffle_ps(p, q, 0xDD);
    }
    __attribute__((target("avx2"))) static void columns(const float* x, const int32_t* at, reg* col) {
        reg t[8], u[8];
        for (int k = 0; k < 8; k += 2) {
            const reg r0 = load(x + at[k]), r1 = load(x + at[k + 1]);
            t[k] = _mm256_unpacklo_ps(r0, r1);
            t[k + 1] = _mm256_unpackhi_ps(r0, r1);
        }
        for (int k = 0; k < 8; k += 4) {
            u[k] = _mm256_shuffle_ps(t[k], t[k + 2], 0x44);
            u[k + 1] = _mm256_shuffle_ps(t[k], t[k + 2], 0xEE);
            u[k + 2] = _mm256_shuffle_ps(t[k + 1], t[k + 3], 0x44);
            u[k + 3] = _mm256_shuffle_ps(t[k + 1], t[k + 3], 0xEE);
        }
        for (int s = 0; s < 4; ++s) {
            col[s] = _mm256_permute2f128_ps(u[s], u[s + 4], 0x20);
            col[s + 4] = _mm256_permute2f128_ps(u[s], u[s + 4], 0x31);
        }
    }
};

// Splits pairs of elements of `bytes` bytes each (4, 8 or 16) into the even
// and the odd ones, each side by side; plain moves, so every bit passes
// unchanged.  Returns the pairs done: whole registers only.
__attribute__((target("avx2"))) inline int64_t deal_pairs(const void* from, void* even, void* odd, int64_t pairs,
                                                          int64_t bytes) {
    const auto* x = static_cast<const char*>(from);
    auto* e = static_cast<char*>(even);
    auto* o = static_cast<char*>(odd);
    const int64_t per = 32 / bytes;  // pairs of one step: two registers in, one out to each side
    int64_t i = 0;
    for (; i + per <= pairs; i += per, x += 64, e += 32, o += 32) {
        if (bytes == 4) {
            const __m256 a = _mm256_loadu_ps(reinterpret_cast<const float*>(x));
            const __m256 b = _mm256_loadu_ps(reinterpret_cast<const float*>(x + 32));
            // 0 2 | 8 10 | 4 6 | 12 14, then the middle quarters exchanged
            const __m256d ev = _mm256_castps_pd(_mm256_shuffle_ps(a, b, 0x88));
            const __m256d od = _mm256_castps_pd(_mm256_shuffle_ps(a, b, 0xDD));
            _mm256_storeu_pd(reinterpret_cast<double*>(e), _mm256_permute4x64_pd(ev, 0xD8));
            _mm256_storeu_pd(reinterpret_cast<double*>(o), _mm256_permute4x64_pd(od, 0xD8));
        } else if (bytes == 8) {
            const __m256d a = _mm256_loadu_pd(reinterpret_cast<const double*>(x));
            const __m256d b = _mm256_loadu_pd(reinterpret_cast<const double*>(x + 32));
            _mm256_storeu_pd(reinterpret_cast<double*>(e), _mm256_permute4x64_pd(_mm256_unpacklo_pd(a, b), 0xD8));
            _mm256_storeu_pd(reinterpret_cast<double*>(o), _mm256_permute4x64_pd(_mm256_unpackhi_pd(a, b), 0xD8));
        } else {
            const __m256d a = _mm256_loadu_pd(reinterpret_cast<const double*>(x));
            const __m256d b = _mm256_loadu_pd(reinterpret_cast<const double*>(x + 32));
            _mm256_storeu_pd(reinterpret_cast<double*>(e), _mm256_permute2f128_pd(a, b, 0x20));
            _mm256_storeu_pd(reinterpret_cast<double*>(o), _mm256_permute2f128_pd(a, b, 0x31));
        }
    }
    return i;
}

}  // namespace vlx
#endif

namespace vlx {

// Cap on the filter kernels' lanes: 0 scalar, 1 AVX2 where the processor has
// it.  The tests lower it to run the scalar sums on the same machine; it never
// changes a result.
inline std::atomic<int32_t> filter_lane_cap{1};

inline int32_t filter_lanes() {
#ifdef VLX_FILTER_LANES
    const int32_t have = cpu::has_avx2() ? 1 : 0;
#else
    const int32_t have = 0;
#endif
    const int32_t cap = filter_lane_cap.load(std::memory_order_relaxed);
    return cap < have ? cap : have;
}

}  // namespace vlx
