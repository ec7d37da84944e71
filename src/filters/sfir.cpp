// Linear-phase FIR from half of its taps: a kernel that adds the two samples
// of each tap pair before multiplying, the same kernel computing only the kept
// samples of a decimation, and the expansion to the full filter for the cases
// the kernel does not take.
#include "core/frame.hpp"
#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"
#include "filters/lanes.hpp"

#include <cstdint>
#include <limits>

namespace vlx {
namespace {

// Longest full filters of the symmetric kernel, plain and decimating.
constexpr int64_t sym_taps_limit = 61;
constexpr int64_t deci_span_limit = 121;

// The expanded filter, rewritten on every expansion; not a cache.
template <VlxVector V>
struct SfirState {
    int32_t ready = 0;
    V expanded{};
};

template <VlxVector V>
SfirState<V> sfir_state;

template <VlxVector V>
int32_t sfir_free() {
    LockGuard lock(1);
    SfirState<V>& state = sfir_state<V>;
    if (!state.ready) return 0;
    const int32_t r = destroy(&state.expanded);
    state.ready = 0;
    return r < 0 ? -1 : 0;
}

inline int64_t full_taps(int64_t m, int32_t odd) { return odd ? 2 * m - 1 : 2 * m; }

template <class T>
struct HalfFilter {
    const T* h;
    int64_t m;  // half taps
    int64_t N;  // full taps
    int64_t p;  // tap pairs
    bool odd;
    bool anti;
};

// Output k of one real stream (scalars w apart) of the symmetric kernel; x[j]
// for negative j is hist[N - 1 + j].  Each of the three ranges has its own
// order of operations, equal to the plain sum only in exact arithmetic.
template <int64_t w, class T>
inline T sym_output(const HalfFilter<T>& f, const T* x, const T* hist, int64_t k) {
    const T* h = f.h;
    const int64_t m = f.m, p = f.p;
    T acc = 0;
    if (k < p) {
        // the oldest p taps all fall on the history
        if (hist != nullptr) {
            for (int64_t j = 0; j < p; ++j) acc += h[j] * hist[(k + j) * w];
            if (f.anti) acc = -acc;
            for (int64_t j = 0; j <= m - 2 - k; ++j) acc += h[m - 1 - j] * hist[(k + p + j) * w];
        }
        for (int64_t j = 0; j <= k; ++j) acc += h[k - j] * x[j * w];
    } else if (k < f.N - 1) {
        // the block reaches the mirrored half
        const int64_t t = k - p;
        if (hist != nullptr)
            for (int64_t j = 0; j <= m - 2 - t; ++j) acc += h[j] * hist[(p + t + j) * w];
        for (int64_t j = 0; j <= t; ++j) acc += h[m - 1 - t + j] * x[j * w];
        if (f.anti) {
            acc = -acc;
            // the centre tap keeps its positive sign
            if (f.odd) acc += T(2) * h[m - 1] * x[t * w];
        }
        for (int64_t j = 0; j < p; ++j) acc += h[p - 1 - j] * x[(t + 1 + j) * w];
    } else {
        const T* newest = x + k * w;
        const T* oldest = x + (k - f.N + 1) * w;
        if (f.anti) {
            for (int64_t j = 0; j < p; ++j) acc += h[j] * (newest[-j * w] - oldest[j * w]);
        } else {
            for (int64_t j = 0; j < p; ++j) acc += h[j] * (newest[-j * w] + oldest[j * w]);
        }
        if (f.odd) acc += h[m - 1] * x[(k - m + 1) * w];
    }
    return acc;
}

// Outputs i = from .. to-1 at k = first + i * step, of each of the w streams
// (w a constant, so that the strides fold into the addressing).
template <int64_t w, class T>
void sym_outputs(const HalfFilter<T>& f, const T* x, const T* hist, T* y, int64_t from, int64_t to, int64_t first,
                 int64_t step) {
    for (int64_t c = 0; c < w; ++c)
        for (int64_t i = from; i < to; ++i)
            y[i * w + c] = sym_output<w>(f, x + c, hist != nullptr ? hist + c : nullptr, first + i * step);
}

#ifdef VLX_FILTER_LANES
// Most tap pairs the lanes take (the decimating kernel's limit gives 60).
constexpr int64_t lane_pairs_max = 64;

template <bool anti, class L>
__attribute__((target("avx2"))) inline typename L::reg pair_of(typename L::reg newer, typename L::reg older) {
    if constexpr (anti)
        return L::sub(newer, older);
    else
        return L::add(newer, older);
}

// Third-range outputs side by side, one scalar per lane: lane q starts from 0
// and adds, pair by pair in order, h[j] times the sum (or difference) of
// newest[j][q] and oldest[j][q], then h[m-1] times centre[q] if odd; the
// scalar order, with a separate multiply and add.  Four registers at a time,
// then one.  Returns the first scalar left over.
template <bool anti, class T>
__attribute__((target("avx2"))) int64_t pair_lanes(const HalfFilter<T>& f, const T* const* newest,
                                                   const T* const* oldest, const T* centre, T* y, int64_t end) {
    using L = Lanes<T>;
    using R = typename L::reg;
    constexpr int64_t n = L::width;
    const T* h = f.h;
    const int64_t p = f.p;
    int64_t q = 0;
    for (; q + 4 * n <= end; q += 4 * n) {
        R a0 = L::zero(), a1 = a0, a2 = a0, a3 = a0;
        for (int64_t j = 0; j < p; ++j) {
            const R c = L::broadcast(h + j);
            const T* u = newest[j] + q;
            const T* v = oldest[j] + q;
            a0 = L::add_product(a0, c, pair_of<anti, L>(L::load(u), L::load(v)));
            a1 = L::add_product(a1, c, pair_of<anti, L>(L::load(u + n), L::load(v + n)));
            a2 = L::add_product(a2, c, pair_of<anti, L>(L::load(u + 2 * n), L::load(v + 2 * n)));
            a3 = L::add_product(a3, c, pair_of<anti, L>(L::load(u + 3 * n), L::load(v + 3 * n)));
        }
        if (f.odd) {
            const R c = L::broadcast(h + f.m - 1);
            const T* u = centre + q;
            a0 = L::add_product(a0, c, L::load(u));
            a1 = L::add_product(a1, c, L::load(u + n));
            a2 = L::add_product(a2, c, L::load(u + 2 * n));
            a3 = L::add_product(a3, c, L::load(u + 3 * n));
        }
        L::store(y + q, a0);
        L::store(y + q + n, a1);
        L::store(y + q + 2 * n, a2);
        L::store(y + q + 3 * n, a3);
    }
    for (; q + n <= end; q += n) {
        R a0 = L::zero();
        for (int64_t j = 0; j < p; ++j)
            a0 = L::add_product(a0, L::broadcast(h + j), pair_of<anti, L>(L::load(newest[j] + q), L::load(oldest[j] + q)));
        if (f.odd) a0 = L::add_product(a0, L::broadcast(h + f.m - 1), L::load(centre + q));
        L::store(y + q, a0);
    }
    return q;
}

// Outputs i .. count-1, all in the third range, through the lanes; returns
// the first output left to the scalar sums.  Without decimation the lanes
// read the source in place.  With it, the source is dealt chunk by chunk
// into one array per phase of k on the stack, so that the samples of
// consecutive kept outputs lie side by side.
template <class T>
int64_t third_range_lanes(const HalfFilter<T>& f, int64_t w, const T* x, T* y, int64_t i, int64_t count,
                          int64_t first, int64_t step) {
    const int64_t N = f.N;
    if (f.p > lane_pairs_max || i >= count) return i;
    const T* newest[lane_pairs_max];
    const T* oldest[lane_pairs_max];
    const T* centre = nullptr;
    // t counts points from the oldest sample of an output's window
    const auto point = [&](const T* base, int64_t t, int64_t stride) {
        return base + (t % step) * stride + (t / step) * w;
    };
    const auto run = [&](const T* base, int64_t stride, T* out, int64_t scalars) {
        for (int64_t j = 0; j < f.p; ++j) {
            newest[j] = point(base, N - 1 - j, stride);
            oldest[j] = point(base, j, stride);
        }
        centre = point(base, N - f.m, stride);
        return f.anti ? pair_lanes<true>(f, newest, oldest, centre, out, scalars)
                      : pair_lanes<false>(f, newest, oldest, centre, out, scalars);
    };
    if (step == 1) return i + run(x + (first + i - N + 1) * w, 0, y + i * w, (count - i) * w) / w;

    constexpr int64_t room = 2048;  // scalars
    T deal[room];
    const int64_t reach = (N - 1) / step + 1;  // points of a phase array beyond the chunk's outputs
    // a multiple of 32 outputs fills whole registers in either precision
    const int64_t chunk = (room / w / step - reach) / 32 * 32;
    if (chunk <= 0) return i;
    while (i < count) {
        const int64_t c = count - i < chunk ? count - i : chunk;
        const int64_t k = first + i * step;
        const int64_t stride = (c + reach) * w;
        const int64_t last = k + step * (c - 1);
        int64_t dealt = 0;  // points of each phase already in place
        if (step == 2)
            dealt = deal_pairs(x + (k - N + 1) * w, deal, deal + stride, (last - k + N) / 2, w * int64_t(sizeof(T)));
        for (int64_t phase = 0; phase < step; ++phase) {
            T* d = deal + phase * stride + dealt * w;
            if (w == 1) {
                for (int64_t at = k - N + 1 + phase + dealt * step; at <= last; at += step) *d++ = x[at];
            } else {
                for (int64_t at = k - N + 1 + phase + dealt * step; at <= last; at += step, d += 2)
                    d[0] = x[2 * at], d[1] = x[2 * at + 1];
            }
        }
        const int64_t done = run(deal, stride, y + i * w, c * w) / w;
        i += done;
        if (done < c) break;
    }
    return i;
}
#endif

template <class T>
void sym_outputs(const HalfFilter<T>& f, int64_t w, const T* x, const T* hist, T* y, int64_t count, int64_t first,
                 int64_t step) {
    // outputs before mid reach into the history
    int64_t mid = first >= f.N - 1 ? 0 : (f.N - 1 - first + step - 1) / step;
    if (mid > count) mid = count;
    int64_t done = mid;
#ifdef VLX_FILTER_LANES
    if (filter_lanes() > 0) done = third_range_lanes(f, w, x, y, mid, count, first, step);
#endif
    if (w == 2) {
        sym_outputs<2>(f, x, hist, y, 0, mid, first, step);
        sym_outputs<2>(f, x, hist, y, done, count, first, step);
    } else {
        sym_outputs<1>(f, x, hist, y, 0, mid, first, step);
        sym_outputs<1>(f, x, hist, y, done, count, first, step);
    }
}

template <class T>
HalfFilter<T> half_filter(const T* h, int64_t m, int32_t odd, int32_t anti) {
    const int64_t N = full_taps(m, odd);
    return {h, m, N, odd ? m - 1 : m, odd != 0, anti != 0};
}

// Real taps, n >= N - 1: stage, run the kernel, keep the last N - 1 inputs.
template <VlxVector V>
int32_t sym_kernel(V* in, V* out, V* filter, int32_t odd, int32_t anti, V* hist) {
    using T = real_t<V>;
    const HalfFilter<T> f = half_filter(filter->data, filter->points, odd, anti);
    int32_t aliased = 0;
    V tmp{};
    V* saved = nullptr;
    if (stage_io<V>(in, &out, filter, &hist, static_cast<int32_t>(f.N - 1), VLX_STAGE_ALIAS, &aliased, &tmp,
                    &saved) != 0)
        return -1;
    const int64_t n = in->points;
    const int64_t w = in->complex ? 2 : 1;
    const T* x = in->data;
    const T* past = hist != nullptr ? hist->data : nullptr;
    T* y = out->data;
    sym_outputs(f, w, x, past, y, n, 0, 1);
    if (hist != nullptr) push_history(hist->data, x, n, f.N - 1, w);
    return finish_io<V>(out, aliased, saved, 0);
}

// The full filter into the process-wide vector, then the FIR engine; lock 1
// throughout (the engine takes it again for its fast path).
template <VlxVector V>
int32_t expanded_fir(V* in, V* out, V* filter, int32_t odd, int32_t anti, V* hist) {
    using T = real_t<V>;
    const int64_t m = filter->points;
    const int64_t N = full_taps(m, odd);
    if (N > std::numeric_limits<int32_t>::max() / 2) return -1;
    LockGuard lock(1);
    SfirState<V>& state = sfir_state<V>;
    if (!state.ready) {
        init(&state.expanded);
        state.ready = 1;
        register_teardown<V>(TeardownStep::sfir_scratch, &sfir_free<V>);
    }
    V* full = &state.expanded;
    full->points = static_cast<int32_t>(N);
    full->complex = filter->complex;
    if (alloc(full) < 0 || copy(full, filter) < 0) return -1;
    full->points = static_cast<int32_t>(N);

    const int64_t w = filter->complex ? 2 : 1;
    const T sign = anti ? T(-1) : T(1);
    T* F = full->data;
    const int64_t mirrored = odd ? m - 1 : m;
    const int64_t from = odd ? m - 2 : m - 1;
    for (int64_t i = 0; i < mirrored; ++i)
        for (int64_t c = 0; c < w; ++c) F[(m + i) * w + c] = sign * F[(from - i) * w + c];
    return fir(in, out, full, hist);
}

// Decimating kernel: real taps, n >= N - 1, N - 1 below the limit.
template <VlxVector V>
int32_t deci_kernel(V* in, V* out, V* filter, int32_t odd, int32_t anti, int32_t factor, V* hist) {
    using T = real_t<V>;
    const HalfFilter<T> f = half_filter(filter->data, filter->points, odd, anti);
    const int64_t N = f.N;
    int64_t skip = 0;
    if (hist != nullptr && hist->points >= N && hist->data != nullptr)
        skip = read_skip<V>(hist->data[(N - 1) * (hist->complex ? 2 : 1)]);
    const int64_t n = in->points < 0 ? 0 : in->points;
    const DeciPlan plan = deci_plan(skip, n, factor);
    V* const caller_out = out;
    const int32_t old_points = out->points;
    if (out != in) out->points = static_cast<int32_t>(plan.count);

    int32_t aliased = 0;
    V tmp{};
    V* saved = nullptr;
    if (stage_io<V>(in, &out, filter, &hist, static_cast<int32_t>(N), VLX_STAGE_ALIAS | VLX_STAGE_KEEP_POINTS,
                    &aliased, &tmp, &saved) != 0) {
        // A failed history leaves out as it was; a failed allocation has left it empty.
        caller_out->points = caller_out->data != nullptr ? old_points : 0;
        return -1;
    }
    out->delta = static_cast<T>(factor) * in->delta;
    const int64_t w = in->complex ? 2 : 1;
    // written before the kernel, which reads only points 0 .. N-2
    if (hist != nullptr) hist->data[(N - 1) * w] = static_cast<T>(plan.next_skip);

    const T* x = in->data;
    const T* past = hist != nullptr ? hist->data : nullptr;
    T* y = out->data;
    sym_outputs(f, w, x, past, y, plan.count, skip, factor);
    if (hist != nullptr) push_history(hist->data, x, n, N - 1, w);
    out->points = static_cast<int32_t>(plan.count);
    return finish_io<V>(out, aliased, saved, 0);
}

}  // namespace

template <VlxVector V>
int32_t sfir(V* in, V* out, V* filter, int32_t odd, int32_t anti, V* hist) {
    const int64_t m = filter->points;
    if (m <= 0) return copy(out, in);
    const int64_t N = full_taps(m, odd);
    if (filter->complex == 0 && N < sym_taps_limit && in->points >= N - 1)
        return sym_kernel(in, out, filter, odd, anti, hist);
    return expanded_fir(in, out, filter, odd, anti, hist);
}

template <VlxVector V>
int32_t sfir_deci(V* in, V* out, V* filter, int32_t odd, int32_t anti, int32_t factor, V* hist) {
    if (factor < 1) factor = 1;
    const int64_t m = filter->points;
    const int64_t N = m > 0 ? full_taps(m, odd) : 1;
    if (filter->complex == 0 && m > 0 && in->points >= N - 1 && N - 1 < deci_span_limit)
        return deci_kernel(in, out, filter, odd, anti, factor, hist);

    // Two stages: the skip count waits at point N - 1 while the plain filter
    // uses the points before it.
    if (hist != nullptr) {
        if (N + 1 > std::numeric_limits<int32_t>::max()) return -1;
        const bool was_short = hist->points <= N;
        hist->delta = in->delta;
        if ((hist->complex != 0) != (in->complex != 0)) {
            if ((in->complex ? rtoc(hist) : real_part(hist)) != 0) return -1;
        }
        // capacity for a complex view of that point even on a real history
        if (zpad(hist, static_cast<int32_t>(N + 1)) != 0) return -1;
        if (was_short) hist->points = static_cast<int32_t>(N);
    }
    if (sfir(in, out, filter, odd, anti, hist) != 0) return -1;
    V view{};
    V* skip_ref = nullptr;
    if (hist != nullptr) {
        view.delta = hist->delta;
        view.alloc = hist->alloc;
        view.data = hist->data + (N - 1) * (hist->complex ? 2 : 1);
        view.points = 1;
        view.complex = out->complex;
        skip_ref = &view;
    }
    return deci(out, out, factor, skip_ref) == 0 ? 0 : -1;
}

#define VLX_INSTANTIATE(V)                                                        \
    template int32_t sfir<V>(V*, V*, V*, int32_t, int32_t, V*);                   \
    template int32_t sfir_deci<V>(V*, V*, V*, int32_t, int32_t, int32_t, V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxd_sfir(vlx_t* in, vlx_t* out, vlx_t* filter, int32_t odd, int32_t anti, vlx_t* hist) {
    return vlx::sfir(in, out, filter, odd, anti, hist);
}
VLX_API int32_t vlxfd_sfir(vlxf_t* in, vlxf_t* out, vlxf_t* filter, int32_t odd, int32_t anti, vlxf_t* hist) {
    return vlx::sfir(in, out, filter, odd, anti, hist);
}
VLX_API int32_t vlxd_sfir_deci(vlx_t* in, vlx_t* out, vlx_t* filter, int32_t odd, int32_t anti, int32_t factor,
                               vlx_t* hist) {
    return vlx::sfir_deci(in, out, filter, odd, anti, factor, hist);
}
VLX_API int32_t vlxfd_sfir_deci(vlxf_t* in, vlxf_t* out, vlxf_t* filter, int32_t odd, int32_t anti, int32_t factor,
                                vlxf_t* hist) {
    return vlx::sfir_deci(in, out, filter, odd, anti, factor, hist);
}
VLX_API int32_t vlx_filter_lanes(int32_t lanes) {
    if (lanes >= 0) vlx::filter_lane_cap.store(lanes, std::memory_order_relaxed);
    return vlx::filter_lanes();
}
}
