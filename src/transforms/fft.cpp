// The complex power-of-two transform: split-radix decimation in frequency on
// interleaved data, with a shared cache of twiddle tables.
#include "core/frame.hpp"
#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"
#include "transforms/transforms.hpp"

#include "transforms/fft_simd.hpp"

#include <cmath>
#include <cstdlib>

namespace vlx {
namespace {

template <class T>
struct TwiddleRecord {
    T* table;
    int32_t size;  // scalars, 3N/2: the key
};

template <VlxVector V>
struct TwiddleState {
    TwiddleRecord<real_t<V>>* records = nullptr;
    int32_t count = 0;
};

template <VlxVector V>
TwiddleState<V> twiddle_state;

template <VlxVector V>
int32_t fft_tables_free() {
    lib_lock(0);
    lib_active_wait();
    TwiddleState<V>& state = twiddle_state<V>;
    for (int32_t i = 0; i < state.count; ++i) std::free(state.records[i].table);
    std::free(state.records);
    state.records = nullptr;
    state.count = 0;
    lib_unlock(0);
    return 0;
}

// First triple of a pair from cos and sin of its angle: the three-multiply
// rotation needs cos, -(cos + sin) and sin - cos.
template <class T>
inline void put_triple(T* at, T c, T s) {
    at[0] = c;
    at[1] = -(c + s);
    at[2] = s - c;
}

// Pairs k = 0 .. n/4 - 1 of (triple of 2 pi k / n, triple of 3 times that).
template <VlxVector V>
void fill_twiddles(real_t<V>* t, int32_t n) {
    using T = real_t<V>;
    const int32_t quarter = n / 4;
    t[0] = 1, t[1] = -1, t[2] = -1, t[3] = 1, t[4] = -1, t[5] = -1;

    const T e = family<V>::two_pi / static_cast<T>(n);
    T c1, s1;
    if constexpr (std::is_same_v<V, vlx_t>) {
        c1 = cos64(e);
        s1 = sin64(e);
    } else {
        c1 = cos32(e);
        s1 = sin32(e);
    }
    // Angles up to pi/4 by recurrence, each also giving its reflection about
    // pi/4.  Runs of at most 256 entries keep the rounding from piling up;
    // each run restarts from the math library (in double, also for floats).
    T c = c1, s = s1;
    int32_t run = 0;
    for (int32_t k = 1; k < n / 8; ++k) {
        if (run == 256) {
            const T angle = static_cast<T>(k) * e;
            c = static_cast<T>(cos64(static_cast<double>(angle)));
            s = static_cast<T>(sin64(static_cast<double>(angle)));
            run = 0;
        }
        put_triple(t + 6 * size_t(k), c, s);
        put_triple(t + 6 * size_t(quarter - k), s, c);
        ++run;
        const T cn = c1 * c - s1 * s;
        const T sn = s * c1 + s1 * c;
        c = cn;
        s = sn;
    }
    if (n > 4) {
        T* at = t + 6 * size_t(n / 8);
        at[0] = fft_sqrt_half<V>;
        at[1] = std::is_same_v<V, vlx_t> ? T(-1.4142135623730951) : T(-1.4142135f);
        at[2] = 0;
    }
    // Triples of 3 theta are reflections of first triples, never computed:
    // exact negations keep them consistent with the first triples.
    for (int32_t k = 1; k < quarter; ++k) {
        const int32_t i = 3 * k;
        T* to = t + 6 * size_t(k) + 3;
        if (i < quarter) {
            const T* from = t + 6 * size_t(i);
            to[0] = from[0], to[1] = from[1], to[2] = from[2];
        } else if (i <= n / 2) {
            const T* from = t + 6 * size_t(n / 2 - i);  // pi - angle
            to[0] = -from[0], to[1] = -from[2], to[2] = -from[1];
        } else {
            const T* from = t + 6 * size_t(i - n / 2);  // pi + angle
            to[0] = -from[0], to[1] = -from[1], to[2] = -from[2];
        }
    }
}

// Rotation by the triple (c, a, b) of angle theta, three multiplications:
// by exp(-j theta) forward, exp(+j theta) inverse.
template <class T, bool Inverse>
inline void rotate(T& re, T& im, const T* tri) {
    const T m = (re + im) * tri[0];
    const T r = Inverse ? m + tri[1] * im : m + tri[2] * im;
    const T i = Inverse ? m + tri[2] * re : m + tri[1] * re;
    re = r;
    im = i;
}

// One L-shaped butterfly block of quarter length q at x (scalars), with
// twiddle pair k * stride for index k.
template <class T, bool Inverse>
void l_block(T* x, size_t q, const T* tw, size_t stride) {
    T* x1 = x + 2 * q;
    T* x2 = x + 4 * q;
    T* x3 = x + 6 * q;
    for (size_t k = 0; k < q; ++k) {
        const size_t j = 2 * k;
        const T ur = x[j] - x2[j], ui = x[j + 1] - x2[j + 1];
        const T wr = x1[j] - x3[j], wi = x1[j + 1] - x3[j + 1];
        x[j] = x[j] + x2[j];
        x[j + 1] = x[j + 1] + x2[j + 1];
        x1[j] = x1[j] + x3[j];
        x1[j + 1] = x1[j + 1] + x3[j + 1];
        // forward z1 = u - jw, z3 = u + jw; inverse the other way round
        T z1r = Inverse ? ur - wi : ur + wi;
        T z1i = Inverse ? ui + wr : ui - wr;
        T z3r = Inverse ? ur + wi : ur - wi;
        T z3i = Inverse ? ui - wr : ui + wr;
        if (k != 0) {
            const T* pair = tw + 6 * k * stride;
            rotate<T, Inverse>(z1r, z1i, pair);
            rotate<T, Inverse>(z3r, z3i, pair + 3);
        }
        x2[j] = z1r;
        x2[j + 1] = z1i;
        x3[j] = z3r;
        x3[j + 1] = z3i;
    }
}

template <class T>
inline void two_point(T* x) {
    const T r = x[0], i = x[1];
    x[0] = r + x[2];
    x[1] = i + x[3];
    x[2] = r - x[2];
    x[3] = i - x[3];
}

#ifdef VLX_FFT_AVX
using fft_simd::Avx;
using fft_simd::Floats128;
using fft_simd::have_avx;
using fft_simd::rotate_simd;

template <class S, bool Inverse>
__attribute__((target("avx"))) void l_block_simd(typename S::scalar* x, size_t q, const typename S::scalar* tw,
                                                  size_t stride) {
    using T = typename S::scalar;
    T* x1 = x + 2 * q;
    T* x2 = x + 4 * q;
    T* x3 = x + 6 * q;
    const size_t step = 6 * stride;
    for (size_t k = 0; k < q; k += S::width) {
        const size_t j = 2 * k;
        const auto a0 = S::load(x + j), a1 = S::load(x1 + j), a2 = S::load(x2 + j), a3 = S::load(x3 + j);
        const auto u = S::sub(a0, a2);
        const auto w = S::swap(S::sub(a1, a3));
        S::store(x + j, S::add(a0, a2));
        S::store(x1 + j, S::add(a1, a3));
        const auto plus = S::add(u, w);   // (ur + wi, ui + wr)
        const auto minus = S::sub(u, w);  // (ur - wi, ui - wr)
        auto z1 = Inverse ? S::re_im(minus, plus) : S::re_im(plus, minus);
        auto z3 = Inverse ? S::re_im(plus, minus) : S::re_im(minus, plus);
        const T* pair = tw + k * step;
        typename S::reg c1, ab1, c3, ab3;
        S::template triples<0>(pair, step, c1, ab1);
        S::template triples<3>(pair, step, c3, ab3);
        const auto r1 = rotate_simd<S, Inverse>(z1, c1, ab1);
        const auto r3 = rotate_simd<S, Inverse>(z3, c3, ab3);
        // index 0 is stored unrotated
        z1 = k == 0 ? S::first_from(z1, r1) : r1;
        z3 = k == 0 ? S::first_from(z3, r3) : r3;
        S::store(x2 + j, z1);
        S::store(x3 + j, z3);
    }
}

// Quarter length 2: one AVX vector of doubles, or 128 bits of floats.
template <class T, bool Inverse>
void l_block_of_two(T* x, const T* tw, size_t stride) {
    if constexpr (std::is_same_v<T, float>)
        l_block_simd<Floats128, Inverse>(x, 2, tw, stride);
    else
        l_block_simd<Avx<double>, Inverse>(x, 2, tw, stride);
}

#endif

// Depth first: a block of len points, then its half and its two quarters.
// Blocks touch disjoint points, so this order does exactly the arithmetic of
// the stage-by-stage walk while keeping small blocks in cache.
template <class T, bool Inverse, bool Vector>
void split_radix(T* x, size_t len, const T* tw, size_t n) {
    if (len <= 8) {
        // the smallest blocks in line: no calls for the leaves
        if (len == 8) {
#ifdef VLX_FFT_AVX
            if (Vector)
                l_block_of_two<T, Inverse>(x, tw, n / 8);
            else
#endif
                l_block<T, Inverse>(x, 2, tw, n / 8);
            l_block<T, Inverse>(x, 1, tw, n / 4);
            two_point(x);
            two_point(x + 8);
            two_point(x + 12);
        } else if (len == 4) {
            l_block<T, Inverse>(x, 1, tw, n / 4);
            two_point(x);
        } else if (len == 2) {
            two_point(x);
        }
        return;
    }
#ifdef VLX_FFT_AVX
    if (Vector && len / 4 >= Avx<T>::width)
        l_block_simd<Avx<T>, Inverse>(x, len / 4, tw, n / len);
    else
#endif
        l_block<T, Inverse>(x, len / 4, tw, n / len);
    split_radix<T, Inverse, Vector>(x, len / 2, tw, n);
    split_radix<T, Inverse, Vector>(x + len, len / 4, tw, n);
    split_radix<T, Inverse, Vector>(x + 3 * len / 2, len / 4, tw, n);
}

template <class T, bool Inverse>
void run_butterflies(T* x, size_t n, const T* tw) {
#ifdef VLX_FFT_AVX
    if (have_avx()) {
        split_radix<T, Inverse, true>(x, n, tw, n);
        return;
    }
#endif
    split_radix<T, Inverse, false>(x, n, tw, n);
}

template <VlxVector V, bool Inverse>
int32_t native_fft(V* v) {
    using T = real_t<V>;
    if (rtoc(v) < 0) return -1;
    const int32_t n = v->points;
    {
        TableReader reader;
        const T* tw = nullptr;
        const int32_t status = fft_table<V>(n, &tw);
        reader.release_lock();
        if (status < 0) return status;
        run_butterflies<T, Inverse>(v->data, size_t(n), tw);
    }
    // The reordering takes lock 0 for its lists: the counter must be down first.
    const int32_t status = Inverse ? bitrev(v) : bitrev_scale(v);
    return status < 0 ? -1 : 0;
}

}  // namespace

template <VlxVector V>
int32_t fft_table(int32_t n, const real_t<V>** table_out) {
    using T = real_t<V>;
    if (n < 4) return -1;  // pair 0 alone needs length 4
    TwiddleState<V>& state = twiddle_state<V>;
    const int32_t size = 3 * (n / 2);
    for (int32_t i = 0; i < state.count; ++i) {
        if (state.records[i].size == size) {
            *table_out = state.records[i].table;
            return 0;
        }
    }
    auto* grown = static_cast<TwiddleRecord<T>*>(
        std::realloc(state.records, (state.count + 1) * sizeof(TwiddleRecord<T>)));
    if (grown == nullptr) return -1;
    state.records = grown;
    auto* table = static_cast<T*>(std::malloc(size_t(size) * sizeof(T)));
    if (table == nullptr) return -1;
    fill_twiddles<V>(table, n);
    state.records[state.count] = {table, size};
    ++state.count;
    register_teardown<V>(TeardownStep::twiddle_tables, &fft_tables_free<V>);
    *table_out = table;
    return 0;
}

template <VlxVector V>
int32_t fft_forward(V* v) {
    return native_fft<V, false>(v);
}

template <VlxVector V>
int32_t fft_inverse(V* v) {
    return native_fft<V, true>(v);
}

template <VlxVector V>
int32_t fft(V* v, int32_t inverse) {
    using T = real_t<V>;
    if (dft_bound_fast<V>()) return dft_fast_transform(v, inverse, 1);
    const int32_t n = v->points;
    if (!is_power_of_two(n)) return -1;
    if (n == 2) {
        // the forward 1/N of this length, before the sums
        if (!inverse && scale(v, T(0.5)) < 0) return -1;
        if (rtoc(v) < 0) return -1;
        two_point(v->data);
    } else if (n > 2) {
        if ((inverse ? fft_inverse(v) : fft_forward(v)) < 0) return -1;
    }
    set_transform_delta(v, n);
    return 0;
}

#define VLX_INSTANTIATE(V)                                                   \
    template int32_t fft_table<V>(int32_t, const real_t<V>**);               \
    template int32_t fft_forward<V>(V*);                                     \
    template int32_t fft_inverse<V>(V*);                                     \
    template int32_t fft<V>(V*, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_fft(vlx_t* v, int32_t inverse) { return vlx::fft(v, inverse); }
VLX_API int32_t vlxfi_fft(vlxf_t* v, int32_t inverse) { return vlx::fft(v, inverse); }
}
