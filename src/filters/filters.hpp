// Filters and rate changers as templates, for the library's other layers.
// Each is explicitly instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

#include <cstring>

namespace vlx {

// ---- staging shared by every filter ----

// Brings `*hist_ref` (if any) to the source's complex flag and delta and to at
// least hist_points points; with VLX_STAGE_ALIAS routes a destination that
// shares the source's storage into `tmp` (storing the caller's destination in
// `*saved_out`); then gives the destination its length (unless
// VLX_STAGE_KEEP_POINTS), complex flag (source or `other`), delta and storage
// (vlx_stage_io).  0, or -1 with the source untouched.
template <VlxVector V>
int32_t stage_io(V* in, V** out_ref, V* other, V** hist_ref, int32_t hist_points, int32_t flags,
                 int32_t* aliased, V* tmp, V** saved_out);

// Delivers a result staged into a temporary to the caller's destination and
// destroys the temporary; nothing to do when the call was not aliased
// (vlx_unstage_io).
template <VlxVector V>
int32_t unstage_io(V* out, int32_t aliased, V* saved_out);

// The closing rule of every filter: the kernel's status when unstaging
// succeeds, otherwise the kernel's status if it failed, else -1.  Unstaging
// runs even after a kernel failure, so the caller's destination always gets
// what was computed.
template <VlxVector V>
inline int32_t finish_io(V* out, int32_t aliased, V* saved_out, int32_t kernel_status) {
    const int32_t r = unstage_io(out, aliased, saved_out);
    if (r == 0) return kernel_status;
    return kernel_status != 0 ? kernel_status : -1;
}

// ---- decimation ----

// A skip count kept in a history scalar: plus 0.5, truncated, negative (or
// not a number) as 0.
template <VlxVector V>
int64_t read_skip(real_t<V> stored);

// Points kept from a block of n points with `skip` still to drop, and the
// skip count left for the next block.  factor >= 1, n >= 0.
struct DeciPlan {
    int64_t count;
    int64_t next_skip;
};
inline DeciPlan deci_plan(int64_t skip, int64_t n, int64_t factor) {
    if (skip < n) {
        const int64_t t = factor - skip + n - 1;
        return {t / factor, factor - (t % factor) - 1};
    }
    return {0, skip - n};
}

// Keeps every factor-th sample, phase carried in hist->data[0] (vlxd_deci).
template <VlxVector V>
int32_t deci(V* in, V* out, int32_t factor, V* hist);

// ---- tolerant numbers ----

// 1 when a and b are equal up to a few epsilons of relative noise, both
// being near zero counting as equal (vlx_nearly_equal).
template <VlxVector V>
int32_t nearly_equal(real_t<V> a, real_t<V> b);
// A computed length as a point count, rounded up or down but forgiving
// rounding noise; clamped to [0, 2147483647] (vlx_ceil_pts, vlx_floor_pts).
template <VlxVector V>
int32_t ceil_pts(real_t<V> x);
template <VlxVector V>
int32_t floor_pts(real_t<V> x);

// The last `keep` samples of the stream into hist[0 .. keep-1], oldest
// first, after a block x of n points (w scalars a point): a plain copy when
// the block is long enough, otherwise the old content moves down by n.
template <class T>
inline void push_history(T* hist, const T* x, int64_t n, int64_t keep, int64_t w) {
    if (keep <= 0) return;
    if (n >= keep) {
        std::memmove(hist, x + (n - keep) * w, static_cast<size_t>(keep * w) * sizeof(T));
    } else if (n > 0) {
        std::memmove(hist, hist + n * w, static_cast<size_t>((keep - n) * w) * sizeof(T));
        std::memmove(hist + (keep - n) * w, x, static_cast<size_t>(n * w) * sizeof(T));
    }
}

// ---- FIR engines, hwfilt, resampler ----

// FIR filter over a block, real or complex source and taps, hist holding the
// last m - 1 input samples; long real filters run a cached fast convolution
// under lock 1 (vlxd_fir).
template <VlxVector V>
int32_t fir(V* in, V* out, V* filter, V* hist);
// Linear-phase FIR from the first half of its taps (vlxd_sfir).
template <VlxVector V>
int32_t sfir(V* in, V* out, V* filter, int32_t odd, int32_t anti, V* hist);
// vlxd_sfir followed by vlxd_deci, computing only the kept samples for short
// real filters; the skip count sits at point N - 1 of hist (vlxd_sfir_deci).
template <VlxVector V>
int32_t sfir_deci(V* in, V* out, V* filter, int32_t odd, int32_t anti, int32_t factor, V* hist);
// Four-section low-pass with power-of-two coefficients (vlxd_hwfilt).
template <VlxVector V>
int32_t hwfilt(V* in, V* out, int32_t id, V* hist);
// Polyphase resampler by an arbitrary ratio from a table of T * P + 2 points
// (vlxd_rsmp); out->points preset to the most outputs wanted.
template <VlxVector V>
int32_t rsmp(V* in, V* out, int32_t method, V* coef, real_t<V> ratio, V* hist);
// vlxd_rsmp with a built-in table (design 0 to 4) made for the call (vlxd_rsmp2).
template <VlxVector V>
int32_t rsmp2(V* in, V* out, int32_t method, int32_t design, real_t<V> ratio, V* hist);

}  // namespace vlx
