// The polyphase resampler: each output takes its T taps from the table phase
// nearest below its position between input samples, or interpolated between
// that phase and the next, and the window position and fractional time travel
// in the history from block to block.
#include "core/cpu.hpp"
#include "design/design.hpp"
#include "filters/filters.hpp"
#include "filters/lanes.hpp"

#include <cstdint>
#include <limits>

namespace vlx {
namespace {

// Normalises mu to (-1, 0] by advancing the window.  False if mu is so large
// (or infinite) that subtracting 1 no longer changes it.
template <class T>
inline bool advance(T& mu, int64_t& pos) {
    while (mu > T(0)) {
        const T next = mu - T(1);
        if (next == mu) return false;
        mu = next;
        ++pos;
    }
    return true;
}

template <class T, int Method>
inline T tap_coefficient(const T* table, int64_t at, T f) {
    if constexpr (Method == 0) {
        (void)f;
        return table[at];
    } else {
        const T a = table[at], b = table[at + 1];
        return (b - a) * f + a;
    }
}

// One output of one stream (scalars w apart) from the window at pos; x[i]
// for negative i is past[i + taps], or silence.
template <class T, int Method>
inline T window_sum(const T* table, int64_t P, int64_t phase, T f, int64_t taps, const T* x, const T* past,
                    int64_t pos, int64_t w) {
    T acc = 0;
    int64_t j = 0;
    for (; j < taps && pos + j < 0; ++j) {
        const T v = past != nullptr ? past[(pos + j + taps) * w] : T(0);
        acc += tap_coefficient<T, Method>(table, phase + j * P, f) * v;
    }
    if (j == taps) return acc;
    const T* xp = x + (pos + j) * w;
    for (; j < taps; ++j, xp += w) acc += tap_coefficient<T, Method>(table, phase + j * P, f) * *xp;
    return acc;
}

// Outputs whose windows lie wholly inside the block, gathered by the
// sequential position walk and summed afterwards, one output per lane.
template <class T>
struct Batch {
    static constexpr int64_t size = 64;
    int32_t start[size];  // scalar index of the window's first sample
    int32_t phase[size];
    T f[size];
    T sums[2 * size];
    int64_t count = 0;
    int64_t first = 0;  // output index of entry 0
};

#ifdef VLX_FILTER_LANES
// Each lane adds exactly the products of its own scalar sum, in the same
// order and without FMA, and forms its coefficients as the scalar route does.
// A lane reads its coefficient pairs straight from the table, and its window
// as a row that a transpose turns into one column per scalar; so every
// window is read up to a whole number of registers (see lane_reach).  Whole
// registers of outputs only: the caller pads the batch.
template <class T, int Method, int64_t W>
__attribute__((target("avx2"))) void batch_sums_avx(Batch<T>& b, const T* table, int64_t P, int64_t taps,
                                                   const T* x) {
    using L = Lanes<T>;
    using reg = typename L::reg;
    constexpr int64_t n = L::width;
    // two registers of outputs at a time, to keep more independent sums in flight
    for (int64_t k = 0; k < b.count; k += 2 * n) {
        const int32_t* phase0 = b.phase + k;
        const int32_t* phase1 = phase0 + n;
        const reg f0 = L::load(b.f + k), f1 = L::load(b.f + k + n);
        reg re0 = L::zero(), im0 = re0, re1 = re0, im1 = re0;
        int32_t start[2 * n];
        for (int64_t l = 0; l < 2 * n; ++l) start[l] = b.start[k + l];
        for (int64_t j0 = 0; j0 < taps; j0 += n / W) {
            reg col0[n], col1[n];
            L::columns(x, start, col0);
            L::columns(x, start + n, col1);
#pragma GCC unroll 8
            for (int64_t s = 0; s < n; s += W) {
                const int64_t j = j0 + s / W;
                if (j >= taps) break;
                reg c0, next0, c1, next1;
                L::pairs(table + j * P, phase0, c0, next0);
                L::pairs(table + j * P, phase1, c1, next1);
                if constexpr (Method == 1) {
                    c0 = L::add(L::mul(L::sub(next0, c0), f0), c0);
                    c1 = L::add(L::mul(L::sub(next1, c1), f1), c1);
                }
                re0 = L::add_product(re0, c0, col0[s]);
                re1 = L::add_product(re1, c1, col1[s]);
                if constexpr (W == 2) {
                    im0 = L::add_product(im0, c0, col0[s + 1]);
                    im1 = L::add_product(im1, c1, col1[s + 1]);
                }
            }
            for (int64_t l = 0; l < 2 * n; ++l) start[l] += static_cast<int32_t>(n);
        }
        if constexpr (W == 1) {
            L::store(b.sums + k, re0);
            L::store(b.sums + k + n, re1);
        } else {
            T r[2 * n], i[2 * n];
            L::store(r, re0), L::store(r + n, re1);
            L::store(i, im0), L::store(i + n, im1);
            for (int64_t l = 0; l < 2 * n; ++l) b.sums[2 * (k + l)] = r[l], b.sums[2 * (k + l) + 1] = i[l];
        }
    }
}

// Scalars a lane reads from its window's start: the window rounded up to
// whole registers.
template <class T>
int64_t lane_reach(int64_t taps, int64_t w) {
    const int64_t n = Lanes<T>::width;
    return (taps * w + n - 1) / n * n;
}
#endif

// Sums the batch into y and empties it.
template <class T, int Method>
void flush(Batch<T>& b, const T* table, int64_t P, int64_t taps, const T* x, int64_t w, T* y) {
    const int64_t n = b.count;
    if (n == 0) return;
#ifdef VLX_FILTER_LANES
    // pad to whole registers with copies of the last entry
    const int64_t width = 2 * Lanes<T>::width;
    for (; b.count % width != 0; ++b.count) {
        b.start[b.count] = b.start[n - 1];
        b.phase[b.count] = b.phase[n - 1];
        b.f[b.count] = b.f[n - 1];
    }
    if (w == 1)
        batch_sums_avx<T, Method, 1>(b, table, P, taps, x);
    else
        batch_sums_avx<T, Method, 2>(b, table, P, taps, x);
#endif
    std::memcpy(y + b.first * w, b.sums, static_cast<size_t>(n * w) * sizeof(T));
    b.count = 0;
}

template <VlxVector V, int Method>
int32_t rsmp_kernel(V* in, V* out, V* coef, real_t<V> ratio, V* hist, int64_t taps) {
    using T = real_t<V>;
    const int64_t w = in->complex ? 2 : 1;
    T mu = 0;
    if (hist != nullptr) {
        mu = hist->data[taps * w];
        if (mu <= T(-1)) return -1;
    }
    const int64_t total = int64_t(coef->points) - 2;
    const int64_t P = total / taps;
    if (P * taps != total) return -1;

    const int64_t n = in->points < 0 ? 0 : in->points;
    const int64_t last = n - taps;
    int64_t pos = -taps;
    int64_t produced = 0;
    const int64_t wanted = out->points;
    const T* table = coef->data + 1;  // tap j of phase q at table[q + j * P]
    const T* x = in->data;
    const T* past = hist != nullptr ? hist->data : nullptr;
    T* y = out->data;
    const T phases = static_cast<T>(P);
    // The lanes index the block with 32-bit integers, and take only windows
    // whose rounded-up reach stays inside the block.
    const bool lanes = filter_lanes() > 0 && n * w <= std::numeric_limits<int32_t>::max();
    int64_t reach = 0;
#ifdef VLX_FILTER_LANES
    reach = lane_reach<T>(taps, w);
#endif
    Batch<T> batch;
    while (produced < wanted) {
        if (!advance(mu, pos)) {
            flush<T, Method>(batch, table, P, taps, x, w, y);
            return -1;
        }
        T phase_real = -(phases * mu);
        int64_t phase = 0;
        // phase_real >= 0 here; a NaN takes the overflow branch too
        if (!(phase_real < phases)) {
            // rounding, or mu so close to -1: the output lies on the sample before
            if (pos == -taps) {
                flush<T, Method>(batch, table, P, taps, x, w, y);
                return -1;
            }
            --pos;
            mu = 0;
            phase_real = 0;
        } else {
            phase = static_cast<int64_t>(phase_real);
        }
        if (pos > last) break;
        const T f = phase_real - static_cast<T>(phase);
        if (lanes && pos >= 0 && (pos * w + reach <= n * w)) {
            if (batch.count == 0) batch.first = produced;
            batch.start[batch.count] = static_cast<int32_t>(pos * w);
            batch.phase[batch.count] = static_cast<int32_t>(phase);
            batch.f[batch.count] = f;
            if (++batch.count == Batch<T>::size) flush<T, Method>(batch, table, P, taps, x, w, y);
        } else {
            if (batch.count != 0) flush<T, Method>(batch, table, P, taps, x, w, y);
            for (int64_t c = 0; c < w; ++c)
                y[produced * w + c] = window_sum<T, Method>(table, P, phase, f, taps, x + c,
                                                            past != nullptr ? past + c : nullptr, pos, w);
        }
        mu += ratio;
        ++produced;
    }
    flush<T, Method>(batch, table, P, taps, x, w, y);
    out->points = static_cast<int32_t>(produced);
    if (hist == nullptr) return 0;

    if (!advance(mu, pos)) return -1;
    if (pos > last) {
        // the saved window never lies beyond the block; mu keeps the time to go
        const int64_t excess = pos - last;
        pos = last;
        mu = mu + static_cast<T>(excess);
    }
    T* s = hist->data;
    if (pos < 0) {
        std::memmove(s, s + (taps + pos) * w, static_cast<size_t>(-pos * w) * sizeof(T));
        if (taps + pos > 0) std::memmove(s + (-pos) * w, x, static_cast<size_t>((taps + pos) * w) * sizeof(T));
    } else {
        std::memmove(s, x + pos * w, static_cast<size_t>(taps * w) * sizeof(T));
    }
    s[taps * w] = mu;
    s[(taps + 1) * w] = static_cast<T>(taps + pos);
    if (w == 2) {
        s[taps * w + 1] = 0;
        s[(taps + 1) * w + 1] = 0;
    }
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t rsmp(V* in, V* out, int32_t method, V* coef, real_t<V> ratio, V* hist) {
    using T = real_t<V>;
    if (ratio < T(0)) return -1;
    if (coef->points < 2) return copy(out, in);
    const T rounded = coef->data[0] + T(0.5);
    if (!(rounded >= T(1)) || coef->complex) return -1;
    // beyond this the history could not hold T + 2 points
    if (!(rounded < T(std::numeric_limits<int32_t>::max() - 2))) return -1;
    const auto taps = static_cast<int64_t>(rounded);

    int32_t aliased = 0;
    V tmp{};
    V* saved = nullptr;
    if (stage_io<V>(in, &out, coef, &hist, static_cast<int32_t>(taps + 2), VLX_STAGE_ALIAS | VLX_STAGE_KEEP_POINTS,
                    &aliased, &tmp, &saved) != 0)
        return -1;
    out->delta = in->delta * ratio;
    if (hist != nullptr) hist->delta = in->delta;

    int32_t status = -1;
    if (method == 0 && !in->complex)
        status = rsmp_kernel<V, 0>(in, out, coef, ratio, hist, taps);
    else if (method == 1)
        status = rsmp_kernel<V, 1>(in, out, coef, ratio, hist, taps);
    return finish_io<V>(out, aliased, saved, status);
}

template <VlxVector V>
int32_t rsmp2(V* in, V* out, int32_t method, int32_t design, real_t<V> ratio, V* hist) {
    static constexpr int32_t table_points[5] = {8194, 13314, 2050, 10242, 13314};
    if (design < 0 || design > 4) return -1;
    V coef;
    init(&coef);
    coef.points = table_points[design];
    if (rsmp<V>(&coef, design) != 0) {
        destroy(&coef);
        return -1;
    }
    // A failed run leaves the table allocated: settled behaviour, the memory
    // is lost until the process ends.
    if (rsmp(in, out, method, &coef, ratio, hist) != 0) return -1;
    return destroy(&coef) == 0 ? 0 : -1;
}

template int32_t rsmp<vlx_t>(vlx_t*, vlx_t*, int32_t, vlx_t*, double, vlx_t*);
template int32_t rsmp<vlxf_t>(vlxf_t*, vlxf_t*, int32_t, vlxf_t*, float, vlxf_t*);
template int32_t rsmp2<vlx_t>(vlx_t*, vlx_t*, int32_t, int32_t, double, vlx_t*);
template int32_t rsmp2<vlxf_t>(vlxf_t*, vlxf_t*, int32_t, int32_t, float, vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxd_rsmp(vlx_t* in, vlx_t* out, int32_t method, vlx_t* coef, double ratio, vlx_t* hist) {
    return vlx::rsmp(in, out, method, coef, ratio, hist);
}
VLX_API int32_t vlxfd_rsmp(vlxf_t* in, vlxf_t* out, int32_t method, vlxf_t* coef, float ratio, vlxf_t* hist) {
    return vlx::rsmp(in, out, method, coef, ratio, hist);
}
VLX_API int32_t vlxd_rsmp2(vlx_t* in, vlx_t* out, int32_t method, int32_t design, double ratio, vlx_t* hist) {
    return vlx::rsmp2(in, out, method, design, ratio, hist);
}
VLX_API int32_t vlxfd_rsmp2(vlxf_t* in, vlxf_t* out, int32_t method, int32_t design, float ratio, vlxf_t* hist) {
    return vlx::rsmp2(in, out, method, design, ratio, hist);
}
}
