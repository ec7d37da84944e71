// The streaming resampler: its coefficient object (a ratio split into a power
// of two and a remainder near 1, with the filters of each stage), its state
// object (one per stream), the arithmetic that tells an application how many
// points go in and come out, and the run of one block.
#include "streaming/streaming.hpp"

#include "core/precise_math.hpp"
#include "design/design.hpp"
#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"

#include <cstdint>
#include <cstdlib>
#include <initializer_list>
#include <limits>
#include <type_traits>

namespace vlx {

namespace {

// Remainder ratios at or above this use the shorter interpolation filter.
constexpr double wide_split = 1.5625;
// Below this the remainder is doubled once and an interpolate-by-2 stage runs.
constexpr double low_split = 0.9765625;

// Fixed filter sets and the polyphase design of the cascade.
constexpr int32_t set_pre = 100;
constexpr int32_t set_octave = 101;
constexpr int32_t set_interp_wide = 103;
constexpr int32_t set_interp_narrow = 104;
constexpr int32_t table_design = 4;
constexpr int32_t table_points = 13314;

// Allowances of the point counts: a computed count within rounding noise of a
// whole number is not rounded past it.
template <VlxVector V>
struct count_tolerance;
template <>
struct count_tolerance<vlx_t> {
    static constexpr double high = 1.0000000000000044;
    static constexpr double low = 0.9999999999999956;
    static constexpr double max_points = 2147483647.0;
};
template <>
struct count_tolerance<vlxf_t> {
    static constexpr float high = 1.0000005f;
    static constexpr float low = 0.9999995f;
    // 2147483647 is not a float
    static constexpr float max_points = 2147483648.0f;
};

// A whole number from ceil or floor as a count: above the family's limit the
// largest i32, below 0 (or not a number) 0.
template <VlxVector V>
int64_t clamp_count(real_t<V> whole) {
    using T = real_t<V>;
    if (whole >= count_tolerance<V>::max_points) return std::numeric_limits<int32_t>::max();
    if (!(whole >= T(0))) return 0;
    return static_cast<int64_t>(whole);
}

inline int32_t to_i32(int64_t n) {
    if (n > std::numeric_limits<int32_t>::max()) return std::numeric_limits<int32_t>::max();
    if (n < std::numeric_limits<int32_t>::min()) return std::numeric_limits<int32_t>::min();
    return static_cast<int32_t>(n);
}

// Full tap count of a half filter: 2m - 1 with odd, 2m without, 1 for none.
template <VlxVector V>
int32_t full_taps(const V* half, int32_t odd) {
    const int32_t m = half->points;
    if (m <= 0) return 1;
    return odd ? 2 * m - 1 : 2 * m;
}

template <VlxVector V>
bool needs_resampling(const rsmp_coef_t<V>* coef) {
    using T = real_t<V>;
    return coef->forced != 0 || nearly_equal<V>(coef->ratio, T(1)) == 0;
}

// 2^k as a whole count for the octave stages; 1 for k below 1.
inline int64_t octave_span(int32_t k) {
    if (k < 1) return 1;
    return int64_t(1) << (k < 62 ? k : 62);
}

// The rate factor of the octave stages: 0.5 for the interpolate stage, else 2^k.
template <VlxVector V>
real_t<V> octave_factor(int32_t k) {
    using T = real_t<V>;
    if (k < 0) return T(0.5);
    T s = T(1);
    for (int32_t i = 0; i < k; ++i) s = s * T(2);
    return s;
}

template <VlxVector V>
bool wide_interp(real_t<V> r) {
    return static_cast<double>(r) >= wide_split;
}

// The fixed sets and the polyphase table come from the design layer.
template <VlxVector V>
int32_t load_set(V* v, int32_t set) {
    return fir_design_set(v, set);
}
template <VlxVector V>
int32_t load_table(V* v, int32_t design) {
    return rsmp(v, design);
}

// Brings a history to the stream's sample type and to at least `points`.
template <VlxVector V>
int32_t shape_history(V* hist, int32_t complex, int32_t points) {
    const int32_t r = complex ? rtoc(hist) : real_part(hist);
    if (r < 0) return r;
    return zpad(hist, points);
}

}  // namespace

// ---- coefficient object ----

template <VlxVector V>
int32_t rsmp_coef_init(rsmp_coef_t<V>* coef) {
    if (coef == nullptr) return 0;
    init(&coef->half_filter);
    init(&coef->pre_filter);
    init(&coef->table);
    coef->half_odd = 0;
    coef->pre_odd = 0;
    coef->method = 0;
    coef->ratio = 0;
    coef->octaves = 0;
    coef->forced = 0;
    coef->skip_mid = 0;
    coef->skip_out = 0;
    return 0;
}

template <VlxVector V>
int32_t rsmp_coef_alloc(rsmp_coef_t<V>* coef, int32_t kind) {
    if (kind != 0) return -1;
    int32_t r = load_set(&coef->half_filter, set_octave);
    if (r != 0) return r;
    coef->half_odd = 1;
    r = load_set(&coef->pre_filter, set_pre);
    if (r != 0) return r;
    coef->pre_odd = 1;
    coef->table.points = table_points;
    coef->table.complex = 0;
    coef->table.delta = 1;
    r = load_table(&coef->table, table_design);
    if (r != 0) return r;
    coef->method = 1;
    return 0;
}

template <VlxVector V>
int32_t rsmp_coef_setup(rsmp_coef_t<V>* coef, real_t<V> ratio, int32_t forced, int32_t reserved) {
    using T = real_t<V>;
    // An infinite ratio would halve for ever: refused before anything is stored.
    if (ratio > std::numeric_limits<T>::max()) return -1;
    T r = ratio;
    if (r <= T(0)) r = T(1);
    int32_t k = 0;
    while (r >= T(2)) {
        r = r * T(0.5);
        ++k;
    }
    // One doubling only: a ratio far below one half keeps a small remainder.
    if (static_cast<double>(r) < low_split) {
        r = r * T(2);
        k = -1;
    }
    if (reserved != 0) return -1;

    const int32_t k0 = coef->octaves;
    const T r0 = coef->ratio;
    const int32_t interp_set = wide_interp<V>(r) ? set_interp_wide : set_interp_narrow;
    int32_t load = 0;
    if (k0 < 0 && k >= 0) load = set_octave;
    else if (k0 >= 0 && k < 0) load = interp_set;
    else if (k0 < 0 && k < 0 && wide_interp<V>(r) != wide_interp<V>(r0)) load = interp_set;
    if (load != 0) {
        const int32_t status = load_set(&coef->half_filter, load);
        if (status != 0) return status;
    }

    coef->ratio = r;
    coef->octaves = k;
    coef->forced = forced;
    if (k >= 1) coef->skip_mid = 33;
    else if (k == 0) coef->skip_mid = 0;
    else coef->skip_mid = wide_interp<V>(r) ? 74 : 120;

    if (forced == 0 && nearly_equal<V>(r, T(1))) {
        coef->skip_out = 0;
        return 0;
    }
    const int32_t c = ceil_pts<V>(T(35) / r);
    const int32_t extra = k >= 0 ? 19 : wide_interp<V>(r) ? 37 : 60;
    // A tiny ratio saturates the count as vlx_ceil_pts does, rather than wrap.
    coef->skip_out = c > std::numeric_limits<int32_t>::max() - extra ? std::numeric_limits<int32_t>::max() : c + extra;
    return 0;
}

template <VlxVector V>
int32_t rsmp_coef_destroy(rsmp_coef_t<V>* coef) {
    if (coef == nullptr) return 0;
    destroy(&coef->half_filter);
    destroy(&coef->pre_filter);
    destroy(&coef->table);
    return rsmp_coef_init<V>(coef);
}

// ---- state object ----

template <VlxVector V>
int32_t rsmp_state_init(rsmp_state_t<V>* state) {
    if (state == nullptr) return 0;
    state->stages = 0;
    state->stage_hist = nullptr;
    state->reserved = 0;
    state->skip_mid = 0;
    init(&state->pre_hist);
    init(&state->rsmp_hist);
    init(&state->post_hist);
    init(&state->spare);
    state->skip_out = 0;
    return 0;
}

template <VlxVector V>
int32_t rsmp_state_alloc(rsmp_coef_t<V>* coef, rsmp_state_t<V>* state, int32_t complex) {
    using T = real_t<V>;
    if (state == nullptr) return 0;
    const int32_t wanted = coef->octaves < 0 ? 1 : coef->octaves;
    if (state->stages != wanted) {
        for (int32_t i = 0; i < state->stages; ++i) destroy(&state->stage_hist[i]);
        std::free(state->stage_hist);
        state->stages = 0;
        state->stage_hist = nullptr;
        if (wanted > 0) {
            V* hists = static_cast<V*>(std::malloc(sizeof(V) * static_cast<size_t>(wanted)));
            if (hists == nullptr) return -1;
            for (int32_t i = 0; i < wanted; ++i) init(&hists[i]);
            state->stage_hist = hists;
        }
        state->stages = wanted;
    }
    const int32_t nh = full_taps(&coef->half_filter, coef->half_odd);
    const int32_t np = full_taps(&coef->pre_filter, coef->pre_odd);
    for (int32_t i = 0; i < state->stages; ++i) {
        const int32_t r = shape_history(&state->stage_hist[i], complex, nh);
        if (r != 0) return r;
    }
    int32_t r = shape_history(&state->pre_hist, complex, np - 1 > 0 ? np - 1 : 0);
    if (r != 0) return r;
    // the window, mu and position of the polyphase stage; none without a table
    int32_t window = 0;
    if (coef->table.points > 0) window = static_cast<int32_t>(coef->table.data[0] + T(0.5)) + 2;
    r = shape_history(&state->rsmp_hist, complex, window);
    if (r != 0) return r;
    return shape_history(&state->post_hist, complex, nh);
}

template <VlxVector V>
int32_t rsmp_state_reset(rsmp_coef_t<V>* coef, rsmp_state_t<V>* state) {
    if (state == nullptr) return 0;
    for (int32_t i = 0; i < state->stages; ++i) {
        const int32_t r = zero(&state->stage_hist[i]);
        if (r != 0) return r;
    }
    for (V* h : {&state->pre_hist, &state->rsmp_hist, &state->post_hist}) {
        const int32_t r = zero(h);
        if (r != 0) return r;
    }
    state->skip_mid = coef->skip_mid;
    state->skip_out = coef->skip_out;
    return 0;
}

template <VlxVector V>
int32_t rsmp_state_destroy(rsmp_state_t<V>* state) {
    if (state == nullptr) return 0;
    for (int32_t i = 0; i < state->stages; ++i) {
        const int32_t r = destroy(&state->stage_hist[i]);
        if (r != 0) return r;
    }
    std::free(state->stage_hist);
    state->stage_hist = nullptr;
    state->stages = 0;
    for (V* h : {&state->pre_hist, &state->rsmp_hist, &state->post_hist, &state->spare}) {
        const int32_t r = destroy(h);
        if (r != 0) return r;
    }
    state->skip_mid = 0;
    state->skip_out = 0;
    return 0;
}

// ---- point counts, delay and start-up ----

template <VlxVector V>
int32_t rsmp_get_in_pts(int32_t* result, rsmp_coef_t<V>* coef, int32_t out_points, int32_t settled) {
    using T = real_t<V>;
    if (coef == nullptr) return -1;
    if (result == nullptr) return 0;
    const int32_t k = coef->octaves;
    const int64_t s = octave_span(k);
    int64_t n = out_points > 0 ? out_points : 0;
    if (needs_resampling<V>(coef)) {
        if (settled && n >= 1) n += coef->skip_out;
        int64_t a = 2 * n;
        if (settled && a >= 1) {
            a = 2 * n - 1;
            if (a > 0) a = 2 * n - 2;
        }
        // in the order written: a * r, then the half, then the allowance
        n = clamp_count<V>(own_ceil<T>(static_cast<T>(a) * coef->ratio * T(0.5) * count_tolerance<V>::high));
    }
    if (k != 0) {
        if (settled && n >= 1) n += coef->skip_mid;
        if (k >= 1) {
            // saturated: the result is clamped to 32 bits below anyway
            const int64_t cap = int64_t(1) << 62;
            n = n > cap / s ? cap : n * s;
            if (settled) n = n < s - 1 ? 0 : n + 1 - s;
        } else {
            n = (n + 1) / 2;
        }
    }
    *result = to_i32(n);
    return 0;
}

template <VlxVector V>
int32_t rsmp_get_out_pts(int32_t* result, rsmp_coef_t<V>* coef, int32_t in_points, int32_t settled,
                         int32_t at_least) {
    using T = real_t<V>;
    if (coef == nullptr) return -1;
    if (result == nullptr) return 0;
    const int32_t k = coef->octaves;
    const int64_t s = octave_span(k);
    // the largest count possible, unless only a certain one is asked for
    const bool largest = settled != 0 || at_least == 0;
    int64_t n = in_points > 0 ? in_points : 0;
    if (k >= 1) {
        if (largest) n = n - 1 + s;
        n = n / s;
    }
    if (k == -1) n = 2 * static_cast<int64_t>(in_points > 0 ? in_points : 0);
    if (k != 0 && settled) n = n - coef->skip_mid > 0 ? n - coef->skip_mid : 0;
    if (!needs_resampling<V>(coef)) {
        *result = to_i32(n);
        return 0;
    }
    const T h = coef->ratio * T(0.5);
    if (h > T(0)) {
        const T x = static_cast<T>(n) * (at_least ? count_tolerance<V>::low : count_tolerance<V>::high);
        n = clamp_count<V>(own_floor<T>(x / h));
        if (largest) n += 1;
    }
    if (largest) n += 1;
    n = n / 2;
    if (settled) n = n - coef->skip_out > 0 ? n - coef->skip_out : 0;
    *result = to_i32(n);
    return 0;
}

template <VlxVector V>
int32_t rsmp_get_delay_pts(real_t<V>* result, rsmp_coef_t<V>* coef, int32_t in_output_units) {
    using T = real_t<V>;
    const int32_t k = coef->octaves;
    const T r = coef->ratio;
    const T s = octave_factor<V>(k);
    const T total = r > T(0) ? r * s : s;
    const bool resampled = needs_resampling<V>(coef);
    T delay;
    if (k >= 0) {
        // each octave stage: 19 samples of the 39-tap filter at its lower rate
        T d = T(0);
        for (int32_t i = 0; i < k; ++i) d = (d + T(9.5)) * T(2);
        delay = resampled ? (T(9.5) * r + T(17.5)) * s + d : d;
    } else {
        // 37 or 60 samples of the 75- or 121-tap filter at the doubled rate
        const T c = wide_interp<V>(r) ? T(18.5) : T(30);
        delay = resampled ? (r * c + T(17.5)) * s + c : c;
    }
    if (in_output_units && total != T(0)) delay = delay / total;
    *result = delay;
    return 0;
}

template <VlxVector V>
int32_t rsmp_get_settle_pts(real_t<V>* result, rsmp_coef_t<V>* coef, int32_t in_output_units) {
    using T = real_t<V>;
    if (coef == nullptr) return -1;
    if (result == nullptr) return 0;
    const T r = coef->ratio;
    T s = octave_factor<V>(coef->octaves);
    // the discards behind the octave stages count whether armed or not
    T b = static_cast<T>(coef->skip_mid);
    if (r > T(0)) {
        s = s * r;
        b = b / r;
    }
    const T v = static_cast<T>(coef->skip_out) + b;
    *result = in_output_units ? v : v * s;
    return 0;
}

#define VLX_INSTANTIATE(V)                                                                           \
    template int32_t rsmp_coef_init<V>(rsmp_coef_t<V>*);                                             \
    template int32_t rsmp_coef_alloc<V>(rsmp_coef_t<V>*, int32_t);                                   \
    template int32_t rsmp_coef_setup<V>(rsmp_coef_t<V>*, real_t<V>, int32_t, int32_t);               \
    template int32_t rsmp_coef_destroy<V>(rsmp_coef_t<V>*);                                          \
    template int32_t rsmp_state_init<V>(rsmp_state_t<V>*);                                           \
    template int32_t rsmp_state_alloc<V>(rsmp_coef_t<V>*, rsmp_state_t<V>*, int32_t);                \
    template int32_t rsmp_state_reset<V>(rsmp_coef_t<V>*, rsmp_state_t<V>*);                         \
    template int32_t rsmp_state_destroy<V>(rsmp_state_t<V>*);                                        \
    template int32_t rsmp_get_in_pts<V>(int32_t*, rsmp_coef_t<V>*, int32_t, int32_t);                \
    template int32_t rsmp_get_out_pts<V>(int32_t*, rsmp_coef_t<V>*, int32_t, int32_t, int32_t);      \
    template int32_t rsmp_get_delay_pts<V>(real_t<V>*, rsmp_coef_t<V>*, int32_t);                    \
    template int32_t rsmp_get_settle_pts<V>(real_t<V>*, rsmp_coef_t<V>*, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

using CoefD = vlxh_rsmp_coef_t;
using CoefF = vlxfh_rsmp_coef_t;
using StateD = vlxh_rsmp_state_t;
using StateF = vlxfh_rsmp_state_t;

extern "C" {
VLX_API int32_t vlxh_rsmp_coef_init(CoefD* coef) { return vlx::rsmp_coef_init<vlx_t>(coef); }
VLX_API int32_t vlxfh_rsmp_coef_init(CoefF* coef) { return vlx::rsmp_coef_init<vlxf_t>(coef); }
VLX_API int32_t vlxh_rsmp_coef_alloc(CoefD* coef, int32_t kind) { return vlx::rsmp_coef_alloc<vlx_t>(coef, kind); }
VLX_API int32_t vlxfh_rsmp_coef_alloc(CoefF* coef, int32_t kind) { return vlx::rsmp_coef_alloc<vlxf_t>(coef, kind); }
VLX_API int32_t vlxh_rsmp_coef_setup(CoefD* coef, double ratio, int32_t forced, int32_t reserved) {
    return vlx::rsmp_coef_setup<vlx_t>(coef, ratio, forced, reserved);
}
VLX_API int32_t vlxfh_rsmp_coef_setup(CoefF* coef, float ratio, int32_t forced, int32_t reserved) {
    return vlx::rsmp_coef_setup<vlxf_t>(coef, ratio, forced, reserved);
}
VLX_API int32_t vlxh_rsmp_coef_destroy(CoefD* coef) { return vlx::rsmp_coef_destroy<vlx_t>(coef); }
VLX_API int32_t vlxfh_rsmp_coef_destroy(CoefF* coef) { return vlx::rsmp_coef_destroy<vlxf_t>(coef); }
VLX_API int32_t vlxh_rsmp_state_init(StateD* state) { return vlx::rsmp_state_init<vlx_t>(state); }
VLX_API int32_t vlxfh_rsmp_state_init(StateF* state) { return vlx::rsmp_state_init<vlxf_t>(state); }
VLX_API int32_t vlxh_rsmp_state_alloc(CoefD* coef, StateD* state, int32_t complex) {
    return vlx::rsmp_state_alloc<vlx_t>(coef, state, complex);
}
VLX_API int32_t vlxfh_rsmp_state_alloc(CoefF* coef, StateF* state, int32_t complex) {
    return vlx::rsmp_state_alloc<vlxf_t>(coef, state, complex);
}
VLX_API int32_t vlxh_rsmp_state_reset(CoefD* coef, StateD* state) { return vlx::rsmp_state_reset<vlx_t>(coef, state); }
VLX_API int32_t vlxfh_rsmp_state_reset(CoefF* coef, StateF* state) { return vlx::rsmp_state_reset<vlxf_t>(coef, state); }
VLX_API int32_t vlxh_rsmp_state_destroy(StateD* state) { return vlx::rsmp_state_destroy<vlx_t>(state); }
VLX_API int32_t vlxfh_rsmp_state_destroy(StateF* state) { return vlx::rsmp_state_destroy<vlxf_t>(state); }
VLX_API int32_t vlxh_rsmp_get_in_pts(int32_t* result, CoefD* coef, int32_t out_points, int32_t settled) {
    return vlx::rsmp_get_in_pts<vlx_t>(result, coef, out_points, settled);
}
VLX_API int32_t vlxfh_rsmp_get_in_pts(int32_t* result, CoefF* coef, int32_t out_points, int32_t settled) {
    return vlx::rsmp_get_in_pts<vlxf_t>(result, coef, out_points, settled);
}
VLX_API int32_t vlxh_rsmp_get_out_pts(int32_t* result, CoefD* coef, int32_t in_points, int32_t settled,
                                      int32_t at_least) {
    return vlx::rsmp_get_out_pts<vlx_t>(result, coef, in_points, settled, at_least);
}
VLX_API int32_t vlxfh_rsmp_get_out_pts(int32_t* result, CoefF* coef, int32_t in_points, int32_t settled,
                                       int32_t at_least) {
    return vlx::rsmp_get_out_pts<vlxf_t>(result, coef, in_points, settled, at_least);
}
VLX_API int32_t vlxh_rsmp_get_delay_pts(double* result, CoefD* coef, int32_t in_output_units) {
    return vlx::rsmp_get_delay_pts<vlx_t>(result, coef, in_output_units);
}
VLX_API int32_t vlxfh_rsmp_get_delay_pts(float* result, CoefF* coef, int32_t in_output_units) {
    return vlx::rsmp_get_delay_pts<vlxf_t>(result, coef, in_output_units);
}
VLX_API int32_t vlxh_rsmp_get_settle_pts(double* result, CoefD* coef, int32_t in_output_units) {
    return vlx::rsmp_get_settle_pts<vlx_t>(result, coef, in_output_units);
}
VLX_API int32_t vlxfh_rsmp_get_settle_pts(float* result, CoefF* coef, int32_t in_output_units) {
    return vlx::rsmp_get_settle_pts<vlxf_t>(result, coef, in_output_units);
}
}
