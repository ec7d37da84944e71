// What the processor offers, asked once.  Vector paths are chosen at run time
// and never use FMA, so every path gives the same bits as the scalar order.
#pragma once

namespace vlx::cpu {

#if defined(__x86_64__) && defined(__GNUC__)
// A static library's code may run before the runtime has filled in the
// feature bits, so they are initialised here first.
inline bool has_avx() {
    static const bool avx = (__builtin_cpu_init(), __builtin_cpu_supports("avx") != 0);
    return avx;
}
inline bool has_avx2() {
    static const bool avx2 = (__builtin_cpu_init(), __builtin_cpu_supports("avx2") != 0);
    return avx2;
}
inline bool has_avx512f() {
    static const bool avx512f = (__builtin_cpu_init(), __builtin_cpu_supports("avx512f") != 0);
    return avx512f;
}
#else
inline bool has_avx() { return false; }
inline bool has_avx2() { return false; }
inline bool has_avx512f() { return false; }
#endif

}  // namespace vlx::cpu
