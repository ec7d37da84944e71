// Bit reversal of a vector from cached index lists, plain and scaled by 1/N.
#include "core/frame.hpp"
#include "transforms/fft_simd.hpp"
#include "transforms/transforms.hpp"

#include <cstdlib>
#include <cstring>

namespace vlx {
namespace {

// One list of one length, keyed by bits = log2 N.
struct ListRecord {
    uint32_t* list;
    int32_t bits;
};

struct ListCache {
    ListRecord* records = nullptr;
    int32_t count = 0;
};

// Swap lists (pairs ended by 0: point 0 never moves) and fixed-point lists
// (ended by fixed_end: point 0 is always a member).
template <VlxVector V>
struct BitrevState {
    ListCache swaps;
    ListCache fixed;
};

template <VlxVector V>
BitrevState<V> bitrev_state;

constexpr uint32_t fixed_end = 0x12345678u;

uint32_t reverse_bits(uint32_t x, int32_t bits) {
    uint32_t r = 0;
    for (int32_t i = 0; i < bits; ++i, x >>= 1) r = (r << 1) | (x & 1u);
    return r;
}

// Index = high half, low half; its reversal is reversed low half, reversed
// high half.  With an odd count the middle bit stays in place.
void build_swaps(uint32_t* list, int32_t m) {
    const int32_t h = m / 2;
    const uint32_t r = 1u << h;
    size_t w = 0;
    for (uint32_t a = 0; a < r; ++a) {
        for (uint32_t b = a + 1; b < r; ++b) {
            if (m % 2 == 0) {
                list[w++] = a * r + reverse_bits(b, h);
                list[w++] = b * r + reverse_bits(a, h);
            } else {
                const uint32_t u = a * 2 * r + reverse_bits(b, h);
                const uint32_t v = b * 2 * r + reverse_bits(a, h);
                list[w++] = u;
                list[w++] = v;
                list[w++] = u + r;
                list[w++] = v + r;
            }
        }
    }
    list[w] = 0;
}

void build_fixed(uint32_t* list, int32_t m) {
    const int32_t h = m / 2;
    const uint32_t r = 1u << h;
    size_t w = 0;
    for (uint32_t a = 0; a < r; ++a) {
        if (m % 2 == 0) {
            list[w++] = reverse_bits(a, h) * r + a;
        } else {
            const uint32_t v = reverse_bits(a, h) * 2 * r + a;
            list[w++] = v;
            list[w++] = v + r;
        }
    }
    list[w] = fixed_end;
}

void free_lists(ListCache& cache) {
    for (int32_t i = 0; i < cache.count; ++i) std::free(cache.records[i].list);
    std::free(cache.records);
    cache.records = nullptr;
    cache.count = 0;
}

template <VlxVector V>
int32_t bitrev_lists_free() {
    lib_lock(0);
    lib_active_wait();
    free_lists(bitrev_state<V>.swaps);
    free_lists(bitrev_state<V>.fixed);
    lib_unlock(0);
    return 0;
}

// Finds the list of m bits or builds it; lock 0 is held.  The record array
// grows by exactly one record, and a record counts only once its list exists.
template <VlxVector V>
const uint32_t* find_or_build(ListCache& cache, int32_t m, size_t words, void (*build)(uint32_t*, int32_t)) {
    for (int32_t i = 0; i < cache.count; ++i)
        if (cache.records[i].list != nullptr && cache.records[i].bits == m) return cache.records[i].list;
    auto* grown = static_cast<ListRecord*>(std::realloc(cache.records, (cache.count + 1) * sizeof(ListRecord)));
    if (grown == nullptr) return nullptr;
    cache.records = grown;
    auto* list = static_cast<uint32_t*>(std::malloc(words * sizeof(uint32_t)));
    if (list == nullptr) return nullptr;
    build(list, m);
    cache.records[cache.count] = {list, m};
    ++cache.count;
    register_teardown<V>(TeardownStep::bitrev_lists, &bitrev_lists_free<V>);
    return list;
}

template <VlxVector V>
const uint32_t* swap_list(int32_t m) {
    return find_or_build<V>(bitrev_state<V>.swaps, m, size_t(1) << m, build_swaps);
}

template <VlxVector V>
const uint32_t* fixed_list(int32_t m) {
    return find_or_build<V>(bitrev_state<V>.fixed, m, (size_t(1) << (m / 2 + 1)) + 2, build_fixed);
}

// Point i of W scalars exchanged with point j, each sample times f if Scaled.
template <class T, size_t W, bool Scaled>
inline void exchange(T* p, T* q, T f) {
    for (size_t c = 0; c < W; ++c) {
        const T t = Scaled ? p[c] * f : p[c];
        p[c] = Scaled ? q[c] * f : q[c];
        q[c] = t;
    }
}

template <class T, size_t W, bool Scaled>
inline void scale_point(T* p, T f) {
    if (Scaled)
        for (size_t c = 0; c < W; ++c) p[c] = p[c] * f;
}

// Small lengths: the pairs in list order, then the fixed points.
template <class T, size_t W, bool Scaled>
void by_lists(T* x, const uint32_t* swaps, const uint32_t* fixed, T f) {
    for (const uint32_t* p = swaps; *p != 0; p += 2) exchange<T, W, Scaled>(x + W * p[0], x + W * p[1], f);
    if (Scaled)
        for (const uint32_t* p = fixed; *p != fixed_end; ++p) scale_point<T, W, Scaled>(x + W * *p, f);
}

// From 2^6 points on, the same exchanges by tiles.  With an index of m bits
// read as (a, mid, b), a and b of 3 bits, the points of one mid form a tile of
// 8 rows of 8 consecutive points, and the reversal carries tile mid onto tile
// r(mid) with (a, b) going to (r(b), r(a)).  So a pair of tiles is exchanged
// while its 16 rows stay in cache, instead of meeting each cache line once per
// point; a tile that is its own image exchanges within itself and scales its
// fixed points (b = r(a)).  Every point still moves once and is scaled once.
template <class T, size_t W, bool Scaled>
void by_tiles(T* x, int32_t m, T f) {
    static constexpr size_t r3[8] = {0, 4, 2, 6, 1, 5, 3, 7};
    const int32_t mid_bits = m - 6;
    const size_t rows = size_t(1) << (m - 3);  // points from one row to the next
    size_t down[8];                            // scalars to row r(b)
    for (size_t b = 0; b < 8; ++b) down[b] = W * r3[b] * rows;
    for (size_t mid = 0; mid < (size_t(1) << mid_bits); ++mid) {
        const size_t image = reverse_bits(uint32_t(mid), mid_bits);
        if (image < mid) continue;
        T* tile = x + W * (mid << 3);
        T* other = x + W * (image << 3);
        for (size_t a = 0; a < 8; ++a) {
            T* row = tile + W * a * rows;
            T* column = other + W * r3[a];
            if (image != mid) {
                for (size_t b = 0; b < 8; ++b) exchange<T, W, Scaled>(row + W * b, column + down[b], f);
            } else {
                for (size_t b = 0; b < 8; ++b) {
                    T* p = row + W * b;
                    T* q = column + down[b];
                    if (p < q)
                        exchange<T, W, Scaled>(p, q, f);
                    else if (p == q)
                        scale_point<T, W, Scaled>(p, f);
                }
            }
        }
    }
}

#ifdef VLX_FFT_AVX
// The tile exchange on AVX-512F lanes, for points of 64 bits (complex floats,
// real doubles) and 128 bits (complex doubles).  The image of a tile holds
// at (R, C) the point (r(C), r(R)) of the tile: with the rows loaded in the
// order r(C), it is their transpose with the columns stored in the order
// r(R).  Moves only; each point is multiplied by f once, as in the scalar walk.
#define VLX_TILE512 __attribute__((target("avx512f")))

VLX_TILE512 inline __m512d pick(__m512d a, __m512i index, __m512d b) { return _mm512_permutex2var_pd(a, index, b); }

VLX_TILE512 inline __m512i index8(long long i0, long long i1, long long i2, long long i3, long long i4, long long i5,
                                   long long i6, long long i7) {
    return _mm512_set_epi64(i7, i6, i5, i4, i3, i2, i1, i0);
}

template <class T>
VLX_TILE512 inline __m512d scaled(__m512d v, T f) {
    if constexpr (std::is_same_v<T, float>)
        return _mm512_castps_pd(_mm512_mul_ps(_mm512_castpd_ps(v), _mm512_set1_ps(f)));
    else
        return _mm512_mul_pd(v, _mm512_set1_pd(f));
}

// 8 x 8 points of 64 bits, one row a register: src rows `from` apart (bytes),
// the image written to dst with rows `to` apart.
template <class T, bool Scaled>
VLX_TILE512 void tile_image64(const char* src, size_t from, char* dst, size_t to, T f) {
    static constexpr size_t r3[8] = {0, 4, 2, 6, 1, 5, 3, 7};
    __m512d r[8], column[8];
    for (size_t c = 0; c < 8; ++c) r[c] = _mm512_loadu_pd(src + r3[c] * from);
    fft_simd::transpose8(r, column);
    for (size_t row = 0; row < 8; ++row) {
        const __m512d v = column[r3[row]];
        _mm512_storeu_pd(dst + row * to, Scaled ? scaled(v, f) : v);
    }
}

// 8 x 8 points of 128 bits, a row in two registers: as tile_image64, by
// blocks of 4 x 4 points.
template <bool Scaled>
VLX_TILE512 void tile_image128(const char* src, size_t from, char* dst, size_t to, double f) {
    static constexpr size_t r3[8] = {0, 4, 2, 6, 1, 5, 3, 7};
    __m512d r[8][2];
    for (size_t c = 0; c < 8; ++c) {
        r[c][0] = _mm512_loadu_pd(src + r3[c] * from);
        r[c][1] = _mm512_loadu_pd(src + r3[c] * from + 64);
    }
    const __m512i lo = index8(0, 1, 8, 9, 2, 3, 10, 11), hi = index8(4, 5, 12, 13, 6, 7, 14, 15);
    const __m512i lo4 = index8(0, 1, 2, 3, 8, 9, 10, 11), hi4 = index8(4, 5, 6, 7, 12, 13, 14, 15);
    // column[j][g]: points j of rows 4g .. 4g+3
    __m512d column[8][2];
    for (size_t g = 0; g < 2; ++g) {
        for (size_t half = 0; half < 2; ++half) {
            const __m512d* a0 = r[4 * g];
            const __m512d t0 = pick(a0[half], lo, r[4 * g + 1][half]);
            const __m512d t1 = pick(a0[half], hi, r[4 * g + 1][half]);
            const __m512d t2 = pick(r[4 * g + 2][half], lo, r[4 * g + 3][half]);
            const __m512d t3 = pick(r[4 * g + 2][half], hi, r[4 * g + 3][half]);
            column[4 * half + 0][g] = pick(t0, lo4, t2);
            column[4 * half + 1][g] = pick(t0, hi4, t2);
            column[4 * half + 2][g] = pick(t1, lo4, t3);
            column[4 * half + 3][g] = pick(t1, hi4, t3);
        }
    }
    for (size_t row = 0; row < 8; ++row) {
        for (size_t g = 0; g < 2; ++g) {
            const __m512d v = column[r3[row]][g];
            _mm512_storeu_pd(dst + row * to + 64 * g, Scaled ? scaled(v, f) : v);
        }
    }
}

template <class T, size_t W>
constexpr bool tile_lanes = W * sizeof(T) == 8 || W * sizeof(T) == 16;

template <class T, size_t W, bool Scaled>
VLX_TILE512 void tile_image(const T* src, size_t from, T* dst, size_t to, T f) {
    const auto* s = reinterpret_cast<const char*>(src);
    auto* d = reinterpret_cast<char*>(dst);
    if constexpr (W * sizeof(T) == 16)
        tile_image128<Scaled>(s, from, d, to, double(f));
    else
        tile_image64<T, Scaled>(s, from, d, to, f);
}

// by_tiles on lanes: one tile of a pair is copied aside first, since each
// must be read in full before the other's image lands on it.
template <class T, size_t W, bool Scaled>
VLX_TILE512 void by_tiles_lanes(T* x, int32_t m, T f) {
    const int32_t mid_bits = m - 6;
    const size_t row = (W * sizeof(T)) << (m - 3);  // bytes from one row to the next
    const size_t tile_row = 8 * W * sizeof(T);
    alignas(64) T buffer[64 * W];
    for (size_t mid = 0; mid < (size_t(1) << mid_bits); ++mid) {
        const size_t image = reverse_bits(uint32_t(mid), mid_bits);
        if (image < mid) continue;
        T* tile = x + W * (mid << 3);
        T* other = x + W * (image << 3);
        if (image == mid) {
            tile_image<T, W, Scaled>(tile, row, tile, row, f);
            continue;
        }
        auto* to = reinterpret_cast<char*>(buffer);
        const auto* from = reinterpret_cast<const char*>(tile);
        for (size_t i = 0; i < 8; ++i) std::memcpy(to + i * tile_row, from + i * row, tile_row);
        tile_image<T, W, Scaled>(other, row, tile, row, f);
        tile_image<T, W, Scaled>(buffer, tile_row, other, row, f);
    }
}
#undef VLX_TILE512
#endif

template <class T, size_t W, bool Scaled>
void reorder(T* x, int32_t m, const uint32_t* swaps, const uint32_t* fixed, T f) {
#ifdef VLX_FFT_AVX
    if constexpr (tile_lanes<T, W>) {
        if (m >= 6 && fft_simd::lanes() == 2) return by_tiles_lanes<T, W, Scaled>(x, m, f);
    }
#endif
    if (m >= 6)
        by_tiles<T, W, Scaled>(x, m, f);
    else
        by_lists<T, W, Scaled>(x, swaps, fixed, f);
}

}  // namespace

template <VlxVector V>
int32_t bitrev(V* v) {
    using T = real_t<V>;
    if (!is_power_of_two(v->points)) return -1;
    const int32_t m = log2_of(v->points);
    TableReader reader;
    const uint32_t* swaps = swap_list<V>(m);
    reader.release_lock();
    if (swaps == nullptr) return -1;
    if (v->complex)
        reorder<T, 2, false>(v->data, m, swaps, nullptr, T(1));
    else
        reorder<T, 1, false>(v->data, m, swaps, nullptr, T(1));
    return 0;
}

template <VlxVector V>
int32_t bitrev_scale(V* v) {
    using T = real_t<V>;
    const int32_t n = v->points;
    if (!is_power_of_two(n)) return -1;
    // 1/N is a power of two: one division, then multiplications only.
    const T f = T(1) / static_cast<T>(n);
    const int32_t m = log2_of(n);
    TableReader reader;
    const uint32_t* swaps = swap_list<V>(m);
    const uint32_t* fixed = swaps != nullptr ? fixed_list<V>(m) : nullptr;
    reader.release_lock();
    if (fixed == nullptr) return -1;
    if (v->complex)
        reorder<T, 2, true>(v->data, m, swaps, fixed, f);
    else
        reorder<T, 1, true>(v->data, m, swaps, fixed, f);
    return 0;
}

template <VlxVector V>
int32_t bitrev_lists(int32_t n) {
    const int32_t m = log2_of(n);
    const uint32_t* swaps = swap_list<V>(m);
    return swaps != nullptr && fixed_list<V>(m) != nullptr ? 0 : -1;
}

template int32_t bitrev<vlx_t>(vlx_t*);
template int32_t bitrev<vlxf_t>(vlxf_t*);
template int32_t bitrev_scale<vlx_t>(vlx_t*);
template int32_t bitrev_scale<vlxf_t>(vlxf_t*);
template int32_t bitrev_lists<vlx_t>(int32_t);
template int32_t bitrev_lists<vlxf_t>(int32_t);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_bitrev(vlx_t* v) { return vlx::bitrev(v); }
VLX_API int32_t vlxfi_bitrev(vlxf_t* v) { return vlx::bitrev(v); }
VLX_API int32_t vlxi_bitrev_scale(vlx_t* v) { return vlx::bitrev_scale(v); }
VLX_API int32_t vlxfi_bitrev_scale(vlxf_t* v) { return vlx::bitrev_scale(v); }
}
