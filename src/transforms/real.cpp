// Real power-of-two transforms and half spectra: the split-radix decimation
// in time for real data, which builds the half spectrum in natural order
// without a complex transform, its inverse through the complex engine, and
// the reconstruction of a full spectrum from a half one.
#include "core/frame.hpp"
#include "elementwise/elementwise.hpp"
#include "transforms/fft_simd.hpp"
#include "transforms/transforms.hpp"

#include <cstring>
#include <limits>

namespace vlx {
namespace {

// The block steps below are written once over the element type: the scalar
// walk uses them on real_t, the leaf lanes on vectors of eight doubles (one
// leaf a lane), so both do the same operations in the same order.
#define VLX_LEAF_STEP __attribute__((always_inline)) inline

// The elements of a block that need no table: the first, and for h >= 2 the
// pi/4 element, which uses only the real parts of the quarter parts' Nyquist
// bins.  They touch points of their own, so they run apart from the others.
template <class T>
VLX_LEAF_STEP void real_edges(T* e, int64_t h, const T& r) {
    T* o1 = e + 4 * h;
    T* o3 = e + 6 * h;
    const T x0 = e[0], x2 = o1[0], x3 = o3[0];
    const T t = x3 + x2;
    e[0] = x0 + t;
    o1[0] = x0 - t;
    e[2 * h + 1] = x3 - x2;
    if (h >= 2) {
        const int64_t j = h;  // scalar index of point h/2
        const T u = -r * o3[j];
        const T v = r * o1[j];
        const T er = e[j], ei = e[j + 1];
        e[j] = er + (u + v);
        e[j + 1] = (u - v) + ei;
        T* mirror = e + 2 * h + j;
        mirror[0] = er - (u + v);
        mirror[1] = (u - v) - ei;
    }
}

// The general element k of a block (0 < k < h/2) with the table pair of k.
template <class T>
VLX_LEAF_STEP void real_element(T* e, int64_t h, int64_t k, const T* pair) {
    const T* o1 = e + 4 * h;
    const T* o3 = e + 6 * h;
    const int64_t j = 2 * k;
    T re = o1[j], im = o1[j + 1];
    T m = (re + im) * pair[0];
    const T w1r = m + pair[2] * im, w1i = m + pair[1] * re;
    re = o3[j], im = o3[j + 1];
    m = (re + im) * pair[3];
    const T w3r = m + pair[5] * im, w3i = m + pair[4] * re;
    const T sr = w1r + w3r, si = w1i + w3i;
    const T dr = w3r - w1r, di = w3i - w1i;
    T* e1 = e + j;
    T* e2 = e + 2 * (h - k);
    const T e1r = e1[0], e1i = e1[1], e2r = e2[0], e2i = e2[1];
    e1[0] = e1r + sr;
    e1[1] = e1i + si;
    T* mirror1 = e + 2 * (2 * h - k);
    mirror1[0] = e1r - sr;
    mirror1[1] = si - e1i;
    e2[0] = e2r + di;
    e2[1] = dr + e2i;
    T* mirror2 = e + 2 * (h + k);
    mirror2[0] = e2r - di;
    mirror2[1] = dr - e2i;
}

// One block of n = 4h points at point p: from the half spectra of its even
// part (p .. p+h), and of its two quarter parts (p+2h .. p+2h+h/2 and
// p+3h .. p+3h+h/2) to its own half spectrum (p .. p+2h).
template <VlxVector V>
void real_block(real_t<V>* x, int64_t p, int64_t h, const real_t<V>* tw, int64_t stride, const real_t<V>* st,
                int32_t level) {
    using T = real_t<V>;
    T* e = x + 2 * p;
    real_edges<T>(e, h, fft_sqrt_half<V>);
    int64_t k = 1;
#ifdef VLX_FFT_AVX
    using namespace fft_simd;
    // (no call where a kernel would find less than one vector of elements)
    if (level == 2 && h / 2 > int64_t(Avx512<T>::width)) return lanes512::real_elements_all_lanes<Avx512<T>>(e, h, st);
    if (level >= 1 && h / 2 - k >= int64_t(Avx<T>::width)) k = lanes256::real_elements_lanes<Avx<T>>(e, h, st, k);
#else
    (void)st;
    (void)level;
#endif
    for (; k < h / 2; ++k) real_element<T>(e, h, k, tw + 6 * k * stride);
}

// The subtrees of 8 points or fewer of a block, whole: the two-point
// butterflies on real parts and the blocks of h = 1 and 2 (table-free), in
// the order the stages give them, with the values in registers.  The real
// samples still stand unspread: a leaf reads its samples at in and writes
// its points in complex form at e, with the zero imaginary parts that the
// spread to complex would give them.  In place (e at twice the offset of
// in), leaves run from the last to the first, so a leaf only overwrites
// samples whose leaves are done.  A leaf of len points writes only its
// len/2 + 1 points of half spectrum: the points past them are never read.
template <class T>
VLX_LEAF_STEP void real_leaf(const T* in, T* e, int64_t len, const T& r) {
    if (len == 8) {
        const T r0 = in[0], r1 = in[1], r2 = in[2], r3 = in[3];
        const T r4 = in[4], r5 = in[5], r6 = in[6], r7 = in[7];
        const T a0 = r0 + r1, a1 = r0 - r1;  // two-point butterflies at 0, 4, 6
        const T b0 = r4 + r5, b1 = r4 - r5;
        const T c0 = r6 + r7, c1 = r6 - r7;
        const T t = r3 + r2;  // block of h = 1
        const T x0 = a0 + t, i1 = r3 - r2;
        const T t2 = c0 + b0;  // block of h = 2
        const T u = -r * c1;
        const T v = r * b1;
        e[0] = x0 + t2;
        e[1] = T{};
        e[2] = a1 + (u + v);
        e[3] = (u - v) + i1;
        e[4] = a0 - t;
        e[5] = c0 - b0;
        e[6] = a1 - (u + v);
        e[7] = (u - v) - i1;
        e[8] = x0 - t2;
        e[9] = T{};
    } else if (len == 4) {
        const T r0 = in[0], r1 = in[1], r2 = in[2], r3 = in[3];
        const T a0 = r0 + r1;
        const T t = r3 + r2;
        e[0] = a0 + t;
        e[2] = r0 - r1;
        e[3] = r3 - r2;
        e[4] = a0 - t;
        e[1] = e[5] = T{};
    } else if (len == 2) {
        const T a = in[0], b = in[1];
        e[0] = a + b;
        e[2] = a - b;
        e[1] = e[3] = T{};
    } else if (len == 1) {
        e[0] = in[0];
        e[1] = T{};
    }
}

// A subtree of 16 points: its leaves, last to first, and its block of h = 4
// (one general element, with pair4 the table pair of n/16).
template <class T>
VLX_LEAF_STEP void real_leaf16(const T* in, T* e, const T* pair4, const T& r) {
    real_leaf<T>(in + 12, e + 24, 4, r);
    real_leaf<T>(in + 8, e + 16, 4, r);
    real_leaf<T>(in, e, 8, r);
    real_edges<T>(e, 4, r);
    real_element<T>(e, 4, 1, pair4);
}

// A subtree of 32 points: two leaves of 8, a subtree of 16, and its block of
// h = 8, whose element k takes the pair at pair8 + 6 (k - 1) stride8.
template <class T>
VLX_LEAF_STEP void real_leaf32(const T* in, T* e, const T* pair4, const T* pair8, int64_t stride8, const T& r) {
    real_leaf<T>(in + 24, e + 48, 8, r);
    real_leaf<T>(in + 16, e + 32, 8, r);
    real_leaf16<T>(in, e, pair4, r);
    real_edges<T>(e, 8, r);
    for (int64_t k = 1; k < 4; ++k) real_element<T>(e, 8, k, pair8 + 6 * (k - 1) * stride8);
}

// Where the leaves of a block of 2^j points lie (j = 2 .. 9), last to first:
// the offset, plus leaf8 for a leaf of 8 points, leaf16 or leaf32 for a
// subtree of 16 or 32 (its leaves and blocks of h = 4, 8), else a leaf of 4.  Worked out once, at
// compile time, so that the leaves need no recursion.
constexpr uint16_t leaf8 = 0x8000, leaf16 = 0x4000, leaf32 = 0xC000, leaf_at = 0x3FFF;
struct LeafPlan {
    uint16_t at[96];  // 85 for 512 points
    int32_t count;
};

constexpr void plan_leaves(LeafPlan& plan, int32_t p, int32_t len) {
    if (len <= 32) {
        plan.at[plan.count++] = uint16_t(p | (len == 32 ? leaf32 : len == 16 ? leaf16 : len == 8 ? leaf8 : 0));
        return;
    }
    plan_leaves(plan, p + 3 * len / 4, len / 4);
    plan_leaves(plan, p + len / 2, len / 4);
    plan_leaves(plan, p, len / 2);
}

constexpr LeafPlan make_plan(int32_t len) {
    LeafPlan plan{};
    plan_leaves(plan, 0, len);
    return plan;
}

inline constexpr LeafPlan leaf_plans[8] = {make_plan(4),  make_plan(8),  make_plan(16),  make_plan(32),
                                           make_plan(64), make_plan(128), make_plan(256), make_plan(512)};

inline const LeafPlan& leaf_plan(int64_t len) { return leaf_plans[log2_of(int32_t(len)) - 2]; }

// The leaves of the plan, last to first.
template <VlxVector V>
void real_leaves(real_t<V>* x, int64_t p0, int64_t len, const real_t<V>* tw, int64_t n) {
    using T = real_t<V>;
    const LeafPlan& plan = leaf_plan(len);
    for (int32_t i = 0; i < plan.count; ++i) {
        const uint16_t a = plan.at[i];
        const int64_t p = p0 + (a & leaf_at);
        if ((a & leaf32) == leaf32)
            real_leaf32<T>(x + p, x + 2 * p, tw + 6 * (n / 16), tw + 6 * (n / 32), n / 32, fft_sqrt_half<V>);
        else if ((a & leaf16) != 0)
            real_leaf16<T>(x + p, x + 2 * p, tw + 6 * (n / 16), fft_sqrt_half<V>);
        else
            real_leaf<T>(x + p, x + 2 * p, (a & leaf8) != 0 ? 8 : 4, fft_sqrt_half<V>);
    }
}

// A block of len points with everything below it: the leaves, then the
// stages from h = 16 up as the levels walk them within the block (its tree is
// that of a transform of len points).  Each stage's stores are then long done
// when the next stage loads them as vectors.
#ifdef VLX_FFT_AVX
// The stage of h = 16 within a block of len points, doubles on AVX-512F, in
// one call: per block its edges and its elements 1 .. 4 and 4 .. 7 (the last
// vector overlapping, as in real_elements_all_lanes).
__attribute__((target("avx512f"))) void real_stage16(double* x, int64_t p0, int64_t len, const double* st) {
    using S = fft_simd::Avx512<double>;
    using Lanes = fft_simd::lanes512::RealLanes<S>;
    for (int64_t pos = 0, spacing = 8, c = (len / 64 + 1) / 2; c > 0;
         pos = 4 * pos + 12, spacing *= 4, c = (c + 2) / 4) {
        for (int64_t i = 0, p = pos; i < c; ++i, p += spacing) {
            double* e = x + 2 * (p0 + 16 * p);
            real_edges<double>(e, 16, fft_sqrt_half<vlx_t>);
            const Lanes tail(e, 16, st, 4);
            Lanes(e, 16, st, 1).store(e, 16, 1);
            tail.store(e, 16, 4);
        }
    }
}
#endif

template <VlxVector V>
void real_levels(real_t<V>* x, int64_t p0, int64_t len, int64_t n, const real_t<V>* tw, const real_t<V>* lanes,
                 int32_t level, bool leaves_done) {
    using T = real_t<V>;
    if (!leaves_done) real_leaves<V>(x, p0, len, tw, n);
    for (int64_t h = 16; 4 * h <= len; h *= 2) {
        const T* st = lanes != nullptr ? lanes + fft_simd::lane_offset(size_t(n), size_t(h)) : nullptr;
#ifdef VLX_FFT_AVX
        if constexpr (std::is_same_v<V, vlx_t>) {
            if (h == 16 && st != nullptr && level == 2) {
                real_stage16(x, p0, len, st);
                continue;
            }
        }
#endif
        for (int64_t pos = 0, spacing = 8, c = (len / (4 * h) + 1) / 2; c > 0;
             pos = 4 * pos + 12, spacing *= 4, c = (c + 2) / 4) {
            for (int64_t i = 0, p = pos; i < c; ++i, p += spacing)
                real_block<V>(x, p0 + p * h, h, tw, n / (4 * h), st, st != nullptr ? level : 0);
        }
    }
}

// Depth first down to blocks that fit the first-level cache: the half and the
// two quarters of a block of len points, then the block.  Blocks touch
// disjoint points and each runs after the blocks it reads, so this is the
// arithmetic of the stage-by-stage walk.
template <VlxVector V>
void real_tree(real_t<V>* x, int64_t p, int64_t len, int64_t n, const real_t<V>* tw, const real_t<V>* lanes,
               int32_t level, bool leaves_done = false) {
    if (len <= 512) return real_levels<V>(x, p, len, n, tw, lanes, level, leaves_done);
    // last to first, for the leaves (see real_leaves)
    real_tree<V>(x, p + 3 * len / 4, len / 4, n, tw, lanes, level, leaves_done);
    real_tree<V>(x, p + len / 2, len / 4, n, tw, lanes, level, leaves_done);
    real_tree<V>(x, p, len / 2, n, tw, lanes, level, leaves_done);
    const int64_t h = len / 4;
    real_block<V>(x, p, h, tw, n / len, lanes != nullptr ? lanes + fft_simd::lane_offset(size_t(n), size_t(h)) : nullptr,
                  lanes != nullptr ? level : 0);
}

// Real samples to complex points with zero imaginary parts, from the last.
template <class T>
void spread(T* x, int64_t n) {
    for (int64_t i = n - 1; i >= 0; --i) {
        x[2 * i] = x[i];
        x[2 * i + 1] = T(0);
    }
}


#ifdef VLX_FFT_AVX
// The reordering, the scaling and the subtrees of 32 points in one pass, one
// subtree a lane of eight: doubles on AVX-512F, floats on AVX.  With N = 32 R,
// the subtree at point p = r(b) 32 (b < R, r the reversal of the index bits)
// reads its sample t at b + r5(t) R, so the rows r5(t) of eight consecutive b
// hold the samples of eight subtrees lane by lane: no transpose on the way
// in.  A subtree of 32 points is either one leaf of 32 or two of 16 (the
// quarters of a block of 64); the lanes run both and keep what each subtree
// is.  The results, transposed back, are the subtrees' points 0 .. 27.
//
// In place, the R b form stripes of 64 scalars a row (all of R below 2048
// points), and the subtrees of stripe s write only into stripe r(s) of the 2N
// scalars: the stripe of a pair (s, r(s)) that is read second is copied aside
// first.
#define VLX_LEAVES512 __attribute__((target("avx512f")))
using lanes8 = double __attribute__((vector_size(64)));

inline int64_t reverse_index(int64_t i, int32_t bits) {
    int64_t r = 0;
    for (int32_t b = 0; b < bits; ++b, i >>= 1) r = (r << 1) | (i & 1);
    return r;
}

// Whether subtree c of the 2^bits subtrees of 32 points holds two leaves of
// 16.  The tree splits a block of subtrees into its half (a digit 0 of c,
// from the top) and its quarters (digits 1x); c holds two leaves when one
// digit 1 is left over, the second quarter of a block of 64 points.  `start`
// says whether a digit begins a split; a walk over the digits above the last.
inline bool starts_after(int64_t c, int32_t from, int32_t to, bool start) {
    for (int32_t j = from; j >= to; --j) start = !start || ((c >> j) & 1) == 0;
    return start;
}

// The subtrees of eight lanes L from their samples s (scaled, in the order of
// the points): a, one leaf of 32, its points 0 .. 16 at scalars 0 .. 33; b,
// two of 16, points 0 .. 8 and 16 .. 24.  The two share the subtree of 16 at
// 0 and the leaf of 8 at 16.  Vectors 3 and 5 of eight scalars (24 .. 31 and
// 40 .. 47) hold points of only one of them; the others are set.
template <class L>
VLX_LEAF_STEP void leaf_pair(const L* s, L* a, L* b, const L* p4, const L* p8, const L& r) {
    real_leaf16<L>(s, a, p4, r);
    real_leaf<L>(s + 16, a + 32, 8, r);
#pragma GCC unroll 18
    for (int j = 0; j < 18; ++j) b[j] = a[j];
#pragma GCC unroll 10
    for (int j = 32; j < 42; ++j) b[j] = a[j];
    real_leaf<L>(s + 24, a + 48, 8, r);
    real_edges<L>(a, 8, r);
    for (int64_t k = 1; k < 4; ++k) real_element<L>(a, 8, k, p8 + 6 * (k - 1));
    real_leaf<L>(s + 28, b + 56, 4, r);
    real_leaf<L>(s + 24, b + 48, 4, r);
    real_edges<L>(b + 32, 4, r);
    real_element<L>(b + 32, 4, 1, p4);
    // (one by one: as a loop GCC makes it a string store, slow to start)
    b[18] = b[19] = b[20] = b[21] = b[22] = b[23] = b[54] = b[55] = L{};
}

static constexpr uint8_t r5[32] = {0, 16, 8, 24, 4, 20, 12, 28, 2, 18, 10, 26, 6, 22, 14, 30,
                                   1, 17, 9, 25, 5, 21, 13, 29, 3, 19, 11, 27, 7, 23, 15, 31};

// Eight subtrees: rows of eight lanes from src, `row` scalars apart, times f;
// to[i] the scalar offset of lane i's subtree, bit i of two16 set if it holds
// two leaves of 16.  Doubles on AVX-512F.
// From s, the scaled samples in the order of the points.
__attribute__((target("avx512f"), always_inline)) inline void leaf_lanes_scaled(const lanes8* s, double* x,
                                                                                const int64_t* to, uint32_t two16,
                                                                                const double* pair4,
                                                                                const double* pair8, int64_t stride8) {
    lanes8 p4[6], p8[18];
    for (int i = 0; i < 6; ++i) p4[i] = _mm512_set1_pd(pair4[i]);
    for (int k = 0; k < 3; ++k)
        for (int i = 0; i < 6; ++i) p8[6 * k + i] = _mm512_set1_pd(pair8[6 * k * stride8 + i]);
    lanes8 a[64], b[64];
    leaf_pair<lanes8>(s, a, b, p4, p8, _mm512_set1_pd(fft_sqrt_half<vlx_t>));
    const __mmask8 mask = __mmask8(two16);
    double* dst[8];
    for (int i = 0; i < 8; ++i) dst[i] = x + to[i];
#pragma GCC unroll 7
    for (int q = 0; q < 7; ++q) {
        __m512d rows[8], column[8];
        for (int j = 0; j < 8; ++j)
            rows[j] = q == 3   ? a[8 * q + j]
                      : q == 5 ? b[8 * q + j]
                               : _mm512_mask_blend_pd(mask, a[8 * q + j], b[8 * q + j]);
        fft_simd::transpose8(rows, column);
        for (int i = 0; i < 8; ++i) _mm512_storeu_pd(dst[i] + 8 * q, column[i]);
    }
}

VLX_LEAVES512 void leaf_lanes(const double* src, int64_t row, double f, double* x, const int64_t* to,
                              uint32_t two16, const double* pair4, const double* pair8, int64_t stride8) {
    const lanes8 scale = _mm512_set1_pd(f);
    lanes8 s[32];
#pragma GCC unroll 32
    for (int t = 0; t < 32; ++t) s[t] = lanes8(_mm512_loadu_pd(src + r5[t] * row)) * scale;
    leaf_lanes_scaled(s, x, to, two16, pair4, pair8, stride8);
}

// The same from samples already scaled and ordered, 32 vectors at pre.
VLX_LEAVES512 void leaf_lanes_pre(const double* pre, double* x, const int64_t* to, uint32_t two16,
                                  const double* pair4, const double* pair8, int64_t stride8) {
    leaf_lanes_scaled(reinterpret_cast<const lanes8*>(pre), x, to, two16, pair4, pair8, stride8);
}

// The samples of a stripe of `groups` groups, scaled, each group's 32
// vectors in the order of the points: the aside copy, with the loads and the
// scaling of its subtrees done on the way.
VLX_LEAVES512 void scale_rows(double* pre, int64_t groups, const double* src, int64_t row, double f) {
    const lanes8 scale = _mm512_set1_pd(f);
    for (int64_t j = 0; j < groups; ++j)
#pragma GCC unroll 32
        for (int t = 0; t < 32; ++t)
            _mm512_store_pd(pre + 256 * j + 8 * t, lanes8(_mm512_loadu_pd(src + r5[t] * row + 8 * j)) * scale);
}


// The same for floats on AVX, eight lanes of 32 bits.
#define VLX_LEAVES256 __attribute__((target("avx")))
using lanes8f = float __attribute__((vector_size(32)));

VLX_LEAVES256 void leaf_lanes(const float* src, int64_t row, float f, float* x, const int64_t* to, uint32_t two16,
                              const float* pair4, const float* pair8, int64_t stride8) {
    const lanes8f scale = _mm256_set1_ps(f);
    lanes8f s[32];
#pragma GCC unroll 32
    for (int t = 0; t < 32; ++t) s[t] = lanes8f(_mm256_loadu_ps(src + r5[t] * row)) * scale;
    lanes8f p4[6], p8[18];
    for (int i = 0; i < 6; ++i) p4[i] = _mm256_set1_ps(pair4[i]);
    for (int k = 0; k < 3; ++k)
        for (int i = 0; i < 6; ++i) p8[6 * k + i] = _mm256_set1_ps(pair8[6 * k * stride8 + i]);
    lanes8f a[64], b[64];
    leaf_pair<lanes8f>(s, a, b, p4, p8, _mm256_set1_ps(fft_sqrt_half<vlxf_t>));
    auto lane = [two16](int i) { return ((two16 >> i) & 1u) != 0 ? -1 : 0; };
    const __m256 mask = _mm256_castsi256_ps(
        _mm256_setr_epi32(lane(0), lane(1), lane(2), lane(3), lane(4), lane(5), lane(6), lane(7)));
    for (int q = 0; q < 7; ++q) {
        __m256 r[8];
        for (int j = 0; j < 8; ++j)
            r[j] = q == 3 ? a[8 * q + j] : q == 5 ? b[8 * q + j] : _mm256_blendv_ps(a[8 * q + j], b[8 * q + j], mask);
        // 8 x 8 transpose: pairs, then quads, then halves
        __m256 t[8], u[8];
        for (int j = 0; j < 8; j += 2) {
            t[j] = _mm256_unpacklo_ps(r[j], r[j + 1]);
            t[j + 1] = _mm256_unpackhi_ps(r[j], r[j + 1]);
        }
        for (int j = 0; j < 8; j += 4) {
            u[j] = _mm256_shuffle_ps(t[j], t[j + 2], 0x44);
            u[j + 1] = _mm256_shuffle_ps(t[j], t[j + 2], 0xEE);
            u[j + 2] = _mm256_shuffle_ps(t[j + 1], t[j + 3], 0x44);
            u[j + 3] = _mm256_shuffle_ps(t[j + 1], t[j + 3], 0xEE);
        }
        for (int i = 0; i < 4; ++i) {
            _mm256_storeu_ps(x + to[i] + 8 * q, _mm256_permute2f128_ps(u[i], u[i + 4], 0x20));
            _mm256_storeu_ps(x + to[i + 4] + 8 * q, _mm256_permute2f128_ps(u[i], u[i + 4], 0x31));
        }
    }
}
// The 32 rows of `width` scalars at src, `row` apart, to dst, by the vectors
// the subtrees load them back with (faster than a copy by bytes here).
VLX_LEAVES256 void copy_rows(float* dst, int64_t width, const float* src, int64_t row) {
    for (int64_t r = 0; r < 32; ++r)
        for (int64_t j = 0; j < width; j += 8) _mm256_store_ps(dst + r * width + j, _mm256_loadu_ps(src + r * row + j));
}
#undef VLX_LEAVES256

// The subtrees of stripe s, their rows at src, `row` scalars apart.  Group g
// holds b = 8g + i, whose subtree is c = r3(i) 2^(bits-3) + r(g).
template <class T>
void stripe_lanes(const T* src, int64_t row, int64_t s, int64_t width, T* x, int64_t n, const T* tw,
                  const T* pre = nullptr) {
    static constexpr int64_t r3[8] = {0, 4, 2, 6, 1, 5, 3, 7};
    const int32_t bits = log2_of(int32_t(n / 32));
    const T f = T(1) / static_cast<T>(n);
    for (int64_t j = 0; j < width / 8; ++j) {
        const int64_t g = s * (width / 8) + j;
        const int64_t low = reverse_index(g, bits - 3);
        // the walk over the digits below the top three, from either state
        const bool after[2] = {starts_after(low, bits - 4, 1, false), starts_after(low, bits - 4, 1, true)};
        int64_t to[8];
        uint32_t two16 = 0;
        for (int i = 0; i < 8; ++i) {
            const int64_t c = (r3[i] << (bits - 3)) | low;
            to[i] = 64 * c;
            const bool start =
                bits > 3 ? after[starts_after(c, bits - 1, bits - 3, true)] : starts_after(c, 2, 1, true);
            if (start && (c & 1) != 0) two16 |= 1u << i;
        }
        if constexpr (std::is_same_v<T, double>) {
            if (pre != nullptr) {
                leaf_lanes_pre(pre + 256 * j, x, to, two16, tw + 6 * (n / 16), tw + 6 * (n / 32), n / 32);
                continue;
            }
        }
        leaf_lanes(src + 8 * j, row, f, x, to, two16, tw + 6 * (n / 16), tw + 6 * (n / 32), n / 32);
    }
}

// The real samples of n >= 256 points at x (2n scalars of room) to the
// points of their subtrees of 32, reordered and scaled on the way.
template <class T>
void real_leaves_lanes(T* x, int64_t n, const T* tw) {
    const int64_t row = n / 32;
    const int64_t width = row < 64 ? row : 64;
    const int64_t stripes = row / width;
    const int32_t bits = log2_of(int32_t(stripes));
    // One group reads all its samples before it writes.
    if (row == 8) return stripe_lanes<T>(x, row, 0, width, x, n, tw);
    alignas(64) T aside[32 * 64];
    for (int64_t s = 0; s < stripes; ++s) {
        const int64_t image = reverse_index(s, bits);
        if (image < s) continue;
        if constexpr (std::is_same_v<T, double>) {
            scale_rows(aside, width / 8, x + image * width, row, T(1) / static_cast<T>(n));
            if (image != s) stripe_lanes<T>(x + s * width, row, s, width, x, n, tw);
            stripe_lanes<T>(x, row, image, width, x, n, tw, aside);
        } else {
            copy_rows(aside, width, x + image * width, row);
            if (image != s) stripe_lanes<T>(x + s * width, row, s, width, x, n, tw);
            stripe_lanes<T>(aside, width, image, width, x, n, tw);
        }
    }
}
#undef VLX_LEAVES512
#endif
}  // namespace

template <VlxVector V>
int32_t fft_real_forward(V* v) {
#ifdef VLX_FFT_AVX
    // On lanes (doubles on AVX-512F, floats on AVX): the reordering, the
    // spread and the leaves in one pass.  The failures leave what the steps below would leave.
    {
        const int32_t level = fft_simd::lanes();
        // (own storage only: lent samples are reordered where they lie first)
        if (v->points >= 256 && v->alloc > 0 && level >= (std::is_same_v<V, vlx_t> ? 2 : 1)) {
            using T = real_t<V>;
            // The reordering's lists and the table under one hold of lock 0.
            const int64_t n = v->points;
            bool grown = false;
            int32_t status = -1;
            {
                TableReader reader;
                const T* tw = nullptr;
                const T* lanes = nullptr;
                if (bitrev_lists<V>(v->points) < 0) return -1;
                status = fft_table<V>(v->points, &tw, &lanes);
                reader.release_lock();
                v->complex = 1;
                grown = realloc(v, v->points, 0) >= 0;
                if (grown && status == 0) {
                    real_leaves_lanes<T>(v->data, n, tw);
                    real_tree<V>(v->data, 0, n, n, tw, lanes, lanes != nullptr ? level : 0, true);
                    v->points = static_cast<int32_t>(n / 2 + 1);
                    return 0;
                }
            }
            v->complex = 0;
            bitrev_scale(v);
            v->complex = 1;
            if (!grown) return -1;
            spread(v->data, n);
            return status;
        }
    }
#endif
    using T = real_t<V>;
    // Reordered and scaled while still real: half the samples to move.  Then
    // complex, as vlxi_rtoc makes it: the spread itself rides on the leaves.
    if (bitrev_scale(v) < 0) return -1;
    v->complex = 1;
    if (realloc(v, v->points, 0) < 0) return -1;
    const int64_t n = v->points;
    TableReader reader;
    const T* tw = nullptr;
    const T* lanes = nullptr;
    const int32_t status = fft_table<V>(v->points, &tw, &lanes);
    reader.release_lock();
    if (status < 0) {
        spread(v->data, n);
        return status;
    }
    real_tree<V>(v->data, 0, n, n, tw, lanes, lanes != nullptr ? fft_simd::lanes() : 0);
    v->points = static_cast<int32_t>(n / 2 + 1);
    return 0;
}

template <VlxVector V>
int32_t rfft(V* v) {
    using T = real_t<V>;
    if (dft_bound_fast<V>()) return dft_fast_transform(v, 0, 0);
    if (v->complex) return -1;
    const int32_t n = v->points;
    if (!is_power_of_two(n)) return -1;
    if (n == 2) {
        if (rtoc(v) < 0) return -1;
        T* x = v->data;
        const T a = x[0], b = x[2];
        x[0] = (a + b) * T(0.5);
        x[1] = 0;
        x[2] = (a - b) * T(0.5);
        x[3] = 0;
    } else if (n > 2) {
        if (fft_real_forward(v) < 0) return -1;
    }
    set_transform_delta(v, n);
    return 0;
}

template <VlxVector V>
int32_t orecon(V* v, int32_t odd) {
    using T = real_t<V>;
    const int32_t p = v->points;
    if (p < 2 || (odd == 0 && p < 3)) return 0;
    const int64_t full = 2 * (int64_t(p) - 1) + (odd != 0 ? 1 : 0);
    if (full > std::numeric_limits<int32_t>::max()) return -1;
    v->points = static_cast<int32_t>(full);
    if (realloc(v, p, v->complex) < 0) return -1;
    T* x = v->data;
    // Odd lengths mirror bins p-1 .. 1; even ones p-2 .. 1 (the Nyquist bin
    // has no mirror).
    int64_t from = odd != 0 ? p - 1 : p - 2;
    if (v->complex) {
        for (int64_t i = p; i < full; ++i, --from) {
            x[2 * i] = x[2 * from];
            x[2 * i + 1] = -x[2 * from + 1];
        }
    } else {
        for (int64_t i = p; i < full; ++i, --from) x[i] = x[from];
    }
    return 0;
}

template <VlxVector V>
int32_t irfft(V* v) {
    // No scaling: the forward side carries 1/N.
    if (orecon(v, 0) < 0 || fft(v, 1) < 0 || real_part(v) < 0) return -1;
    return 0;
}

#define VLX_INSTANTIATE(V)                              \
    template int32_t fft_real_forward<V>(V*);           \
    template int32_t rfft<V>(V*);                       \
    template int32_t irfft<V>(V*);                      \
    template int32_t orecon<V>(V*, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_rfft(vlx_t* v) { return vlx::rfft(v); }
VLX_API int32_t vlxfi_rfft(vlxf_t* v) { return vlx::rfft(v); }
VLX_API int32_t vlxi_irfft(vlx_t* v) { return vlx::irfft(v); }
VLX_API int32_t vlxfi_irfft(vlxf_t* v) { return vlx::irfft(v); }
VLX_API int32_t vlxi_orecon(vlx_t* v, int32_t odd) { return vlx::orecon(v, odd); }
VLX_API int32_t vlxfi_orecon(vlxf_t* v, int32_t odd) { return vlx::orecon(v, odd); }
VLX_API int32_t vlxi_recon(vlx_t* v) { return vlx::orecon(v, 0); }
VLX_API int32_t vlxfi_recon(vlxf_t* v) { return vlx::orecon(v, 0); }
}
