// The polyphase resampler: each output takes its T taps from the table phase
// nearest below its position between input samples, or interpolated between
// that phase and the next, and the window position and fractional time travel
// in the history from block to block.
#include "design/design.hpp"
#include "filters/filters.hpp"

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
    while (produced < wanted) {
        if (!advance(mu, pos)) return -1;
        T phase_real = -(phases * mu);
        int64_t phase = 0;
        // phase_real >= 0 here; a NaN takes the overflow branch too
        if (!(phase_real < phases)) {
            // rounding, or mu so close to -1: the output lies on the sample before
            if (pos == -taps) return -1;
            --pos;
            mu = 0;
            phase_real = 0;
        } else {
            phase = static_cast<int64_t>(phase_real);
        }
        if (pos > last) break;
        const T f = phase_real - static_cast<T>(phase);
        for (int64_t c = 0; c < w; ++c)
            y[produced * w + c] = window_sum<T, Method>(table, P, phase, f, taps, x + c,
                                                        past != nullptr ? past + c : nullptr, pos, w);
        mu += ratio;
        ++produced;
    }
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
