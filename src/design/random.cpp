// Noise of four kinds and random permutations, on the C library's rand().
//
// The draws were laid out for a rand() of 15 bits.  glibc's gives 31, which
// would push the widened draw out of [0, 1) and keep the rejection loops
// from ending, so every rand() value counts by its low 15 bits only: on a
// 15-bit generator that changes nothing.
#include "design/design.hpp"

#include "core/frame.hpp"
#include "core/precise_math.hpp"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <type_traits>

namespace vlx {
namespace {

// Both families share the one generator behind rand(), but each seeds it on
// its own first draw.  Guarded by lock 1.
template <VlxVector V>
struct RandomState {
    int32_t seeded = 0;
    uint32_t seed_counter = 0;
};

template <VlxVector V>
RandomState<V> random_state;

// Cheap stack noise.  Reading an uninitialised array would do, but is
// undefined; the words are filled from the array's own address instead,
// which moves with the stack under address-space randomisation.  Read back
// through volatile, so the arithmetic is done and not folded away.
uint32_t stack_noise() {
    volatile uint32_t words[32];
    const uint64_t here = static_cast<uint64_t>(reinterpret_cast<uintptr_t>(&words[0]));
    for (uint32_t i = 0; i < 32; ++i) words[i] = static_cast<uint32_t>(here >> (8 * (i % 5))) ^ (i * 0x9E3779B9u);
    uint32_t s = words[0] ^ 0xEBEBEBEBu;
    for (int i = 1; i < 32; ++i) s += words[i];
    return s;
}

// A seed from whatever the machine offers, all arithmetic modulo 2^32.  No
// caller in the library passes a string.
template <VlxVector V>
uint32_t seed_value(const char* text) {
    uint32_t s = stack_noise();

    // an absent device adds nothing and is no error
    if (std::FILE* f = std::fopen("/dev/urandom", "rb")) {
        unsigned char bytes[4];
        if (std::fread(bytes, sizeof bytes, 1, f) == 1) {
            uint32_t r;
            std::memcpy(&r, bytes, sizeof r);
            s ^= r;
        }
        std::fclose(f);
    }

    // Only the high half of the 64-bit time counts, which is nearly constant
    // for today's dates; that is kept.
    const uint32_t t = static_cast<uint32_t>(static_cast<uint64_t>(static_cast<int64_t>(std::time(nullptr))) >> 32);
    s ^= ((((t & 0xFFu) * 128u + ((t >> 8) & 0xFFu)) * 128u + ((t >> 16) & 0xFFu)) * 128u + (t >> 24)) * 128u;

    const uint32_t c = static_cast<uint32_t>(std::clock());
    s ^= ((((c >> 24) * 64u + ((c >> 16) & 0xFFu)) * 64u + ((c >> 8) & 0xFFu)) * 64u + (c & 0xFFu)) * 64u;

    if (text != nullptr) {
        uint32_t h = 0;
        for (const char* p = text; *p != '\0'; ++p) {
            const uint32_t b = static_cast<uint32_t>(static_cast<int32_t>(static_cast<signed char>(*p)));
            h = (h >> 8) + (b << 24);
        }
        s ^= h;
    }

    RandomState<V>& state = random_state<V>;
    return state.seed_counter++ + s;
}

template <VlxVector V>
void seed_once() {
    RandomState<V>& state = random_state<V>;
    if (state.seeded) return;
    std::srand(seed_value<V>(nullptr));
    state.seeded = 1;
}

inline uint32_t rand15() {
    return static_cast<uint32_t>(std::rand()) & 0x7FFFu;
}

// Uniform in [0, 1): four 15-bit draws in double, two in single precision.
template <VlxVector V>
real_t<V> uniform() {
    seed_once<V>();
    if constexpr (std::is_same_v<V, vlx_t>) {
        double r = rand15();
        for (int i = 0; i < 3; ++i) {
            const double next = rand15();
            r = next + r * 3.0517578125e-05;
        }
        return r * 3.0517578125e-05;
    } else {
        const float r = static_cast<float>(rand15());
        const float next = static_cast<float>(rand15());
        return (next + r * 3.0517578125e-05f) * 3.0517578125e-05f;
    }
}

// 31 bits from three draws: 15 high, 1, 15 low, drawn in that order.
template <VlxVector V>
uint32_t draw31() {
    seed_once<V>();
    const uint32_t high = rand15();
    const uint32_t middle = static_cast<uint32_t>(std::rand()) & 1u;
    const uint32_t low = rand15();
    return (high << 16) | (middle << 15) | low;
}

// log of u held at the smallest normal, so no sample is infinite.
template <VlxVector V>
real_t<V> log_held(real_t<V> u) {
    return own_log(u < family<V>::tiny ? family<V>::tiny : u);
}

}  // namespace

template <VlxVector V>
int32_t rand_fill(V* v, int32_t kind) {
    using T = real_t<V>;
    LockGuard lock(1);
    if (alloc(v) != 0) return -1;
    const int64_t n = v->points < 0 ? 0 : v->points;
    T* d = v->data;
    switch (kind) {
    case 0:
        if (v->complex) {
            for (int64_t k = 0; k < n; ++k) {
                T re, im;
                do {
                    re = uniform<V>() * T(2) - T(1);
                    im = uniform<V>() * T(2) - T(1);
                } while (!(re * re + im * im < T(1)));
                d[2 * k] = re;
                d[2 * k + 1] = im;
            }
        } else {
            for (int64_t k = 0; k < n; ++k) d[k] = uniform<V>() * T(2) - T(1);
        }
        return 0;
    case 1:
        if (v->complex) {
            // Box-Muller here on purpose, where the real form is polar
            for (int64_t k = 0; k < n; ++k) {
                const T g = log_held<V>(uniform<V>());
                const T phi = uniform<V>() * T(2) * family<V>::pi;
                d[2 * k] = own_cos(phi) * own_sqrt(g * T(-2));
                d[2 * k + 1] = own_sin(phi) * own_sqrt(g * T(-2));
            }
        } else {
            for (int64_t k = 0; k < n; k += 2) {
                T a, b, s;
                do {
                    a = uniform<V>() * T(2) - T(1);
                    b = uniform<V>() * T(2) - T(1);
                    s = b * b + a * a;
                } while (!(s < T(1)) || s == T(0));
                const T f = own_sqrt(own_log(s) * T(-2) / s);
                d[k] = f * a;
                // an odd count drops the second of the last pair
                if (k + 1 < n) d[k + 1] = f * b;
            }
        }
        return 0;
    case 2:
        if (v->complex) return -1;
        for (int64_t k = 0; k < n; ++k) d[k] = -log_held<V>(uniform<V>());
        return 0;
    case 3:
        if (v->complex) return -1;
        for (int64_t k = 0; k < n; ++k) {
            // only bit 14 decides the sign; the first two calls just advance
            const uint32_t r = draw31<V>();
            const T e = log_held<V>(uniform<V>());
            d[k] = (r & 0x4000u) ? e : -e;
        }
        return 0;
    default:
        return -1;
    }
}

template <VlxVector V>
int32_t shuffle(V* v) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n < 1) return 0;
    LockGuard lock(1);
    T* d = v->data;
    const bool is_complex = v->complex != 0;
    for (int64_t i = 0; i + 1 < n; ++i) {
        const int64_t j = static_cast<int64_t>(draw31<V>()) % (n - i);
        if (j == 0) continue;
        if (is_complex) {
            const T re = d[2 * i], im = d[2 * i + 1];
            d[2 * i] = d[2 * (i + j)];
            d[2 * i + 1] = d[2 * (i + j) + 1];
            d[2 * (i + j)] = re;
            d[2 * (i + j) + 1] = im;
        } else {
            const T x = d[i];
            d[i] = d[i + j];
            d[i + j] = x;
        }
    }
    return 0;
}

#define VLX_INSTANTIATE(V)                          \
    template int32_t rand_fill<V>(V*, int32_t);     \
    template int32_t shuffle<V>(V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxc_rand(vlx_t* v, int32_t kind) { return vlx::rand_fill(v, kind); }
VLX_API int32_t vlxfc_rand(vlxf_t* v, int32_t kind) { return vlx::rand_fill(v, kind); }
VLX_API int32_t vlxi_shuffle(vlx_t* v) { return vlx::shuffle(v); }
VLX_API int32_t vlxfi_shuffle(vlxf_t* v) { return vlx::shuffle(v); }
}
