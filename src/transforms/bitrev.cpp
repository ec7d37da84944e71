// Bit reversal of a vector from cached index lists, plain and scaled by 1/N.
#include "core/frame.hpp"
#include "transforms/transforms.hpp"

#include <algorithm>
#include <cstdlib>

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

// From this many bytes of samples on, the list order misses the caches at
// almost every exchange (see swap_pairs).
constexpr size_t tiled_bytes = size_t(1) << 20;

template <class T, bool Scaled>
inline void exchange(T* x, size_t width, uint32_t i, uint32_t j, T f) {
    T* p = x + width * i;
    T* q = x + width * j;
    for (size_t c = 0; c < width; ++c) {
        const T t = Scaled ? p[c] * f : p[c];
        p[c] = Scaled ? q[c] * f : q[c];
        q[c] = t;
    }
}

// Exchanges the points of every pair of the list, each sample times f if
// Scaled.  The pair of high halves (a, b), a < b, exchanges column r(b) of
// row a with column r(a) of row b; rows are a power of two apart, so the list
// order would meet each cache line once per point, in conflicting sets.  The
// walk goes instead by tiles: a whose r(a) fill one cache line, b likewise,
// so a tile uses its lines in full.  Each pair is still read from the list
// and visited exactly once (the tile of (b, a) skips it).
template <class T, bool Scaled>
void swap_pairs(T* x, const uint32_t* list, int32_t m, size_t width, T f) {
    if ((width * sizeof(T)) << m < tiled_bytes) {
        // small enough to stay in cache: the list in its own order
        for (const uint32_t* p = list; *p != 0; p += 2) exchange<T, Scaled>(x, width, p[0], p[1], f);
        return;
    }
    const int32_t h = m / 2;
    const size_t r = size_t(1) << h;
    const size_t words_per_b = m % 2 == 0 ? 2 : 4;
    constexpr size_t max_tile = 16;
    const size_t tile = std::min(r, std::min(max_tile, std::max<size_t>(1, 64 / (width * sizeof(T)))));
    size_t as[max_tile], bs[max_tile];
    for (size_t i = 0; i < r; i += tile) {
        for (size_t t = 0; t < tile; ++t) as[t] = reverse_bits(uint32_t(i + t), h);
        for (size_t j = 0; j < r; j += tile) {
            for (size_t t = 0; t < tile; ++t) bs[t] = reverse_bits(uint32_t(j + t), h);
            for (size_t ta = 0; ta < tile; ++ta) {
                const size_t a = as[ta];
                // the run of a: pairs (a, a+1), (a, a+2), ...
                const uint32_t* run = list + words_per_b * (a * r - a * (a + 1) / 2);
                for (size_t tb = 0; tb < tile; ++tb) {
                    const size_t b = bs[tb];
                    if (b <= a) continue;
                    const uint32_t* e = run + words_per_b * (b - a - 1);
                    exchange<T, Scaled>(x, width, e[0], e[1], f);
                    if (words_per_b == 4) exchange<T, Scaled>(x, width, e[2], e[3], f);
                }
            }
        }
    }
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
        swap_pairs<T, false>(v->data, swaps, m, 2, T(1));
    else
        swap_pairs<T, false>(v->data, swaps, m, 1, T(1));
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
    T* x = v->data;
    if (v->complex) {
        swap_pairs<T, true>(x, swaps, m, 2, f);
        for (const uint32_t* p = fixed; *p != fixed_end; ++p) {
            T* a = x + 2 * size_t(*p);
            a[0] = a[0] * f;
            a[1] = a[1] * f;
        }
    } else {
        swap_pairs<T, true>(x, swaps, m, 1, f);
        for (const uint32_t* p = fixed; *p != fixed_end; ++p) x[*p] = x[*p] * f;
    }
    return 0;
}

template int32_t bitrev<vlx_t>(vlx_t*);
template int32_t bitrev<vlxf_t>(vlxf_t*);
template int32_t bitrev_scale<vlx_t>(vlx_t*);
template int32_t bitrev_scale<vlxf_t>(vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_bitrev(vlx_t* v) { return vlx::bitrev(v); }
VLX_API int32_t vlxfi_bitrev(vlxf_t* v) { return vlx::bitrev(v); }
VLX_API int32_t vlxi_bitrev_scale(vlx_t* v) { return vlx::bitrev_scale(v); }
VLX_API int32_t vlxfi_bitrev_scale(vlxf_t* v) { return vlx::bitrev_scale(v); }
}
