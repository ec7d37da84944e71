// Real power-of-two transforms and half spectra: the split-radix decimation
// in time for real data, which builds the half spectrum in natural order
// without a complex transform, its inverse through the complex engine, and
// the reconstruction of a full spectrum from a half one.
#include "core/frame.hpp"
#include "elementwise/elementwise.hpp"
#include "transforms/fft_simd.hpp"
#include "transforms/transforms.hpp"

#include <limits>

namespace vlx {
namespace {

// The elements of a block that need no table: the first, and for h >= 2 the
// pi/4 element, which uses only the real parts of the quarter parts' Nyquist
// bins.  They touch points of their own, so they run apart from the others.
template <VlxVector V>
inline void real_edges(real_t<V>* e, int64_t h) {
    using T = real_t<V>;
    T* o1 = e + 4 * h;
    T* o3 = e + 6 * h;
    const T x0 = e[0], x2 = o1[0], x3 = o3[0];
    const T t = x3 + x2;
    e[0] = x0 + t;
    o1[0] = x0 - t;
    e[2 * h + 1] = x3 - x2;
    if (h >= 2) {
        const int64_t j = h;  // scalar index of point h/2
        const T r = fft_sqrt_half<V>;
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
template <VlxVector V>
inline void real_element(real_t<V>* e, int64_t h, int64_t k, const real_t<V>* pair) {
    using T = real_t<V>;
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
    real_edges<V>(e, h);
    int64_t k = 1;
#ifdef VLX_FFT_AVX
    using namespace fft_simd;
    // (no call where a kernel would find less than one vector of elements)
    if (level == 2 && h / 2 > int64_t(Avx512<T>::width)) k = lanes512::real_elements_lanes<Avx512<T>>(e, h, st, k);
    if (level >= 1 && h / 2 - k >= int64_t(Avx<T>::width)) k = lanes256::real_elements_lanes<Avx<T>>(e, h, st, k);
#else
    (void)st;
    (void)level;
#endif
    for (; k < h / 2; ++k) real_element<V>(e, h, k, tw + 6 * k * stride);
}

// The subtrees of 8 points or fewer of a block, whole: the two-point
// butterflies on real parts and the blocks of h = 1 and 2 (table-free), in
// the order the stages give them, with the values in registers.  The real
// samples still stand unspread (sample i at scalar i): a leaf reads its own
// and writes its points in complex form with the zero imaginary parts that
// the spread to complex would give them.  Leaves run from the last to the
// first, so a leaf only overwrites samples whose leaves are done.
template <VlxVector V>
inline void real_leaf(real_t<V>* x, int64_t p, int64_t len) {
    using T = real_t<V>;
    const T* in = x + p;
    T* e = x + 2 * p;
    if (len == 8) {
        const T r0 = in[0], r1 = in[1], r2 = in[2], r3 = in[3];
        const T r4 = in[4], r5 = in[5], r6 = in[6], r7 = in[7];
        const T a0 = r0 + r1, a1 = r0 - r1;  // two-point butterflies at 0, 4, 6
        const T b0 = r4 + r5, b1 = r4 - r5;
        const T c0 = r6 + r7, c1 = r6 - r7;
        const T t = r3 + r2;  // block of h = 1
        const T x0 = a0 + t, i1 = r3 - r2;
        const T t2 = c0 + b0;  // block of h = 2
        const T r = fft_sqrt_half<V>;
        const T u = -r * c1;
        const T v = r * b1;
        e[0] = x0 + t2;
        e[1] = 0;
        e[2] = a1 + (u + v);
        e[3] = (u - v) + i1;
        e[4] = a0 - t;
        e[5] = c0 - b0;
        e[6] = a1 - (u + v);
        e[7] = (u - v) - i1;
        e[8] = x0 - t2;
        e[10] = b1;
        e[12] = c0;
        e[14] = c1;
        e[9] = e[11] = e[13] = e[15] = 0;
    } else if (len == 4) {
        const T r0 = in[0], r1 = in[1], r2 = in[2], r3 = in[3];
        const T a0 = r0 + r1;
        const T t = r3 + r2;
        e[0] = a0 + t;
        e[2] = r0 - r1;
        e[3] = r3 - r2;
        e[4] = a0 - t;
        e[6] = r3;
        e[1] = e[5] = e[7] = 0;
    } else if (len == 2) {
        const T a = in[0], b = in[1];
        e[0] = a + b;
        e[2] = a - b;
        e[1] = e[3] = 0;
    } else if (len == 1) {
        e[0] = in[0];
        e[1] = 0;
    }
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

// The leaves of the plan; a subtree of 16 also runs its block of h = 4 (one
// general element, pair stride of it), with its leaves last to first.
template <VlxVector V>
inline void real_leaf16(real_t<V>* x, int64_t p, const real_t<V>* tw, int64_t n) {
    real_leaf<V>(x, p + 12, 4);
    real_leaf<V>(x, p + 8, 4);
    real_leaf<V>(x, p, 8);
    real_edges<V>(x + 2 * p, 4);
    real_element<V>(x + 2 * p, 4, 1, tw + 6 * (n / 16));
}

template <VlxVector V>
void real_leaves(real_t<V>* x, int64_t p0, int64_t len, const real_t<V>* tw, int64_t n) {
    const LeafPlan& plan = leaf_plan(len);
    for (int32_t i = 0; i < plan.count; ++i) {
        const uint16_t a = plan.at[i];
        const int64_t p = p0 + (a & leaf_at);
        if ((a & leaf32) == leaf32) {
            real_leaf<V>(x, p + 24, 8);
            real_leaf<V>(x, p + 16, 8);
            real_leaf16<V>(x, p, tw, n);
            real_edges<V>(x + 2 * p, 8);
            for (int64_t k = 1; k < 4; ++k) real_element<V>(x + 2 * p, 8, k, tw + 6 * k * (n / 32));
        } else if ((a & leaf16) != 0) {
            real_leaf16<V>(x, p, tw, n);
        } else {
            real_leaf<V>(x, p, (a & leaf8) != 0 ? 8 : 4);
        }
    }
}

// A block of len points with everything below it: the leaves, then the
// stages from h = 16 up as the levels walk them within the block (its tree is
// that of a transform of len points).  Each stage's stores are then long done
// when the next stage loads them as vectors.
template <VlxVector V>
void real_levels(real_t<V>* x, int64_t p0, int64_t len, int64_t n, const real_t<V>* tw, const real_t<V>* lanes,
                 int32_t level) {
    using T = real_t<V>;
    real_leaves<V>(x, p0, len, tw, n);
    for (int64_t h = 16; 4 * h <= len; h *= 2) {
        const T* st = lanes != nullptr ? lanes + fft_simd::lane_offset(size_t(n), size_t(h)) : nullptr;
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
               int32_t level) {
    if (len <= 512) return real_levels<V>(x, p, len, n, tw, lanes, level);
    // last to first, for the leaves (see real_leaves)
    real_tree<V>(x, p + 3 * len / 4, len / 4, n, tw, lanes, level);
    real_tree<V>(x, p + len / 2, len / 4, n, tw, lanes, level);
    real_tree<V>(x, p, len / 2, n, tw, lanes, level);
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

}  // namespace

template <VlxVector V>
int32_t fft_real_forward(V* v) {
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
