// Dispatch of streaming loops to code compiled for AVX2 (never with FMA,
// which would fuse products and change last bits).  Each loop is one lambda,
// inlined into the variant chosen, so both variants do the same arithmetic in
// the same order; only the width of the compiler's vectors differs.
#pragma once

#include <cstdint>

#define VLX_INLINE_LOOP __attribute__((always_inline))

namespace vlx::simd {

inline bool cpu_has_avx2() {
    static const bool has = __builtin_cpu_supports("avx2");
    return has;
}

template <class Loop>
__attribute__((target("avx2"))) __attribute__((noinline)) void run_avx2(const Loop& loop) {
    loop();
}

template <class Loop>
__attribute__((noinline)) void run_baseline(const Loop& loop) {
    loop();
}

template <class Loop>
inline void dispatch(const Loop& loop) {
    if (cpu_has_avx2())
        run_avx2(loop);
    else
        run_baseline(loop);
}

// Whether [d, d + nd) and [s, s + ns) share any scalar.
template <class T>
inline bool overlaps(const T* d, int64_t nd, const T* s, int64_t ns) {
    const auto da = reinterpret_cast<uintptr_t>(d), sa = reinterpret_cast<uintptr_t>(s);
    return da < sa + static_cast<uintptr_t>(ns) * sizeof(T) && sa < da + static_cast<uintptr_t>(nd) * sizeof(T);
}

}  // namespace vlx::simd
