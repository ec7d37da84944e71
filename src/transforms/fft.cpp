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
    T* lanes;      // the same values per stage for the vector kernels, or null
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
    for (int32_t i = 0; i < state.count; ++i) {
        std::free(state.records[i].table);
        std::free(state.records[i].lanes);
    }
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

// Copies of the table's triples per stage, in the order the vector kernels
// load them (see fft_kernels.inc): the stage of quarter length q uses pair
// k n/(4q) for its index k.
template <class T>
void fill_lanes(T* lanes, const T* t, size_t n) {
    for (size_t q = n / 4; q >= 2; q /= 2) {
        T* st = lanes + fft_simd::lane_offset(n, q);
        const size_t stride = n / (4 * q);
        for (size_t k = 0; k < q; ++k) {
            const T* pair = t + 6 * k * stride;
            st[2 * k] = st[2 * k + 1] = pair[0];
            st[2 * q + 2 * k] = pair[1];
            st[2 * q + 2 * k + 1] = pair[2];
            st[4 * q + 2 * k] = st[4 * q + 2 * k + 1] = pair[3];
            st[6 * q + 2 * k] = pair[4];
            st[6 * q + 2 * k + 1] = pair[5];
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

// Depth first: a block of len points, then its half and its two quarters.
// Blocks touch disjoint points, so this order does exactly the arithmetic of
// the stage-by-stage walk while keeping small blocks in cache.
template <class T, bool Inverse>
void split_radix(T* x, size_t len, const T* tw, size_t n) {
    if (len <= 8) {
        // the smallest blocks in line: no calls for the leaves
        if (len == 8) {
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
    l_block<T, Inverse>(x, len / 4, tw, n / len);
    split_radix<T, Inverse>(x, len / 2, tw, n);
    split_radix<T, Inverse>(x + len, len / 4, tw, n);
    split_radix<T, Inverse>(x + 3 * len / 2, len / 4, tw, n);
}

#ifdef VLX_FFT_AVX
// The same walk on vector lanes: each block of quarter length 2 or more goes
// to the widest kernel that fits it, with the stage's unit-stride lane table.
template <class T, bool Inverse, bool Wide>
void split_radix_lanes(T* x, size_t len, const T* tw, const T* lanes, size_t n) {
    using namespace fft_simd;
    // subtrees of up to 32 points with four points a register: doubles on
    // AVX-512F, floats on AVX (their block of quarter length 8 on AVX-512F
    // where it is there)
    if (len <= 32 && len >= 4 && (Wide || std::is_same_v<T, float>) && n >= 32) {
        const T* st2 = lanes + lane_offset(n, 2);
        const T* st4 = lanes + lane_offset(n, 4);
        const T* st8 = lanes + lane_offset(n, 8);
        if constexpr (std::is_same_v<T, float> && Wide)
            return lanes512::leaf_lanes<Quad<float>, Avx512<float>, Inverse>(x, len, st2, st4, st8);
        else if constexpr (std::is_same_v<T, float>)
            return lanes256::leaf_lanes<Quad<float>, Quad<float>, Inverse>(x, len, st2, st4, st8);
        else if constexpr (Wide)
            return lanes512::leaf_lanes<Quad<double>, Quad<double>, Inverse>(x, len, st2, st4, st8);
    }
    if (len <= 8) {
        if (len == 8) {
            const T* st = lanes + lane_offset(n, 2);
            if constexpr (std::is_same_v<T, float>)
                lanes256::l_block_lanes<Floats128, Inverse>(x, 2, st);
            else
                lanes256::l_block_lanes<Avx<double>, Inverse>(x, 2, st);
            l_block<T, Inverse>(x, 1, tw, n / 4);
            two_point(x);
            two_point(x + 8);
            two_point(x + 12);
        } else {
            split_radix<T, Inverse>(x, len, tw, n);
        }
        return;
    }
    const size_t q = len / 4;
    const T* st = lanes + lane_offset(n, q);
    if (Wide && q >= Avx512<T>::width)
        lanes512::l_block_lanes<Avx512<T>, Inverse>(x, q, st);
    else if (q >= Avx<T>::width)
        lanes256::l_block_lanes<Avx<T>, Inverse>(x, q, st);
    else if constexpr (std::is_same_v<T, float>)
        lanes256::l_block_lanes<Floats128, Inverse>(x, q, st);
    split_radix_lanes<T, Inverse, Wide>(x, len / 2, tw, lanes, n);
    split_radix_lanes<T, Inverse, Wide>(x + len, len / 4, tw, lanes, n);
    split_radix_lanes<T, Inverse, Wide>(x + 3 * len / 2, len / 4, tw, lanes, n);
}
#endif

template <class T, bool Inverse>
void run_butterflies(T* x, size_t n, const T* tw, const T* lanes) {
#ifdef VLX_FFT_AVX
    const int32_t level = lanes != nullptr ? fft_simd::lanes() : 0;
    if (level == 2) return split_radix_lanes<T, Inverse, true>(x, n, tw, lanes, n);
    if (level == 1) return split_radix_lanes<T, Inverse, false>(x, n, tw, lanes, n);
#else
    (void)lanes;
#endif
    split_radix<T, Inverse>(x, n, tw, n);
}

template <VlxVector V, bool Inverse>
int32_t native_fft(V* v) {
    using T = real_t<V>;
    if (rtoc(v) < 0) return -1;
    const int32_t n = v->points;
    {
        TableReader reader;
        const T* tw = nullptr;
        const T* lanes = nullptr;
        const int32_t status = fft_table<V>(n, &tw, &lanes);
        reader.release_lock();
        if (status < 0) return status;
        run_butterflies<T, Inverse>(v->data, size_t(n), tw, lanes);
    }
    // The reordering takes lock 0 for its lists: the counter must be down first.
    const int32_t status = Inverse ? bitrev(v) : bitrev_scale(v);
    return status < 0 ? -1 : 0;
}

}  // namespace

template <VlxVector V>
int32_t fft_table(int32_t n, const real_t<V>** table_out, const real_t<V>** lanes_out) {
    using T = real_t<V>;
    if (n < 4) return -1;  // pair 0 alone needs length 4
    TwiddleState<V>& state = twiddle_state<V>;
    const int32_t size = 3 * (n / 2);
    for (int32_t i = 0; i < state.count; ++i) {
        if (state.records[i].size == size) {
            *table_out = state.records[i].table;
            if (lanes_out != nullptr) *lanes_out = state.records[i].lanes;
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
    // Without room for the lane copy the scalar path runs, with the same result.
    T* lanes = nullptr;
    if (n >= 8) {
        lanes = static_cast<T*>(std::malloc(fft_simd::lane_table_size(size_t(n)) * sizeof(T)));
        if (lanes != nullptr) fill_lanes(lanes, table, size_t(n));
    }
    state.records[state.count] = {table, size, lanes};
    ++state.count;
    register_teardown<V>(TeardownStep::twiddle_tables, &fft_tables_free<V>);
    *table_out = table;
    if (lanes_out != nullptr) *lanes_out = lanes;
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
    template int32_t fft_table<V>(int32_t, const real_t<V>**, const real_t<V>**);             \
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
VLX_API int32_t vlx_transform_lanes(int32_t lanes) {
    if (lanes >= 0) vlx::fft_simd::lane_cap.store(lanes, std::memory_order_relaxed);
    return vlx::fft_simd::lanes();
}
}
