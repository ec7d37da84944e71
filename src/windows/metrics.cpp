// Window metrics: the factor between normalisations, the equivalent noise
// bandwidth, and the 3 dB and 6 dB bandwidths in bins.
#include "windows/windows.hpp"

#include "core/precise_math.hpp"
#include "filters/filters.hpp"
#include "stats/stats.hpp"

#include <type_traits>

namespace vlx {
namespace {

// Bandwidth of each window in bins of its own length: 3 dB, 6 dB.  Constants
// of the library, not derived at run time; the float twin rounds them.
constexpr double bandwidths[32][2] = {
    {0.88589294138, 1.2067091288},  {1.27566692, 1.77178606},      {1.4405825801, 2.0},
    {1.3029820808, 1.8152249389},   {1.6436816754, 2.2987998349},  {1.6188281686, 2.2674865394},
    {1.9154649452, 2.688890864},    {2.0949221525, 2.9461157068},  {3.3864158851, 4.1386740482},
    {3.7707320044, 4.6286264126},   {4.1724748602, 5.1355776611},  {4.4834429446, 5.5294491097},
    {4.1199479354, 5.0714667125},   {4.4457419234, 5.4832672655},  {1.70932308, 2.39496139},
    {1.81024343, 2.53918025},       {1.90492599, 2.67430589},      {1.99442933, 2.80190887},
    {2.07954165, 2.9231524},        {2.16086827, 3.03892592},      {1.68229772, 2.37242015},
    {1.84091909, 2.60035952},       {1.99654136, 2.82227408},      {1.25148331, 1.73053923},
    {1.00741288, 1.37327054},       {1.18896489, 1.63940813},      {2.299045019, 3.2362074355},
    {2.482514267, 3.4968465256},    {1.8719062032, 2.6286807069},  {1.8994454352, 2.6664293285},
    {1.89655628, 2.66236723},       {1.89971828, 2.68436724},
};

bool measured_id(int32_t id) { return (id >= 14 && id <= 25) || id == 30 || id == 31; }

// Peak-normalised window of the caller's width and symmetry, measured.
template <VlxVector V>
int32_t measured_scale(real_t<V>* out, int32_t id, int32_t flags, int32_t points, real_t<V> width) {
    using T = real_t<V>;
    const int32_t mode = flags & wnorm_mask;
    V w, r;
    // a temporary that fails returns at once, leaving what exists
    if (init(&w) != 0 || init(&r) != 0) return -1;
    w.points = points;
    if (alloc(&w) != 0) return -1;
    if (window_synth(&w, id, (flags & (wflag_width | wflag_symmetric)) | wnorm_peak, width) != 0 ||
        (mode == wnorm_mean ? mean(&w, &r) : rms(&w, &r)) != 0) {
        destroy(&w);
        destroy(&r);
        return -1;
    }
    T m = r.data[0];
    // the flat tops come out relative to their mean table's c0
    if (mode == wnorm_mean && id >= 8 && id <= 13) {
        int32_t count = 0;
        m = m / window_table<V>(id, wnorm_mean, &count)[0];
    }
    *out = m == T(0) ? T(0) : T(1) / m;
    const int32_t a = destroy(&w);
    const int32_t b = destroy(&r);
    return (a < 0 || b < 0) ? -1 : 0;
}

}  // namespace

template <VlxVector V>
int32_t window2_scale(real_t<V>* out, int32_t id, int32_t flags, int32_t points, real_t<V> width) {
    using T = real_t<V>;
    const int32_t mode = flags & wnorm_mask;
    if (mode == wnorm_peak || points < 1) {
        *out = T(1);
        return 0;
    }
    if (mode == 3) return -1;
    const bool has_width = (flags & wflag_width) != 0;
    if (id == 1 && !has_width) {
        const T nn = static_cast<T>(points);
        if (mode == wnorm_rms)
            *out = own_sqrt(nn * T(3) * nn / (nn * nn + T(2)));
        else
            *out = points % 2 == 0 ? T(2) : nn * nn / (nn * nn + T(1)) * T(2);
        return 0;
    }
    if (has_width || measured_id(id)) return measured_scale<V>(out, id, flags, points, width);

    // Table path: no window is built, and a short vector gets the same
    // correction that synthesis applies to it.
    int32_t count = 0, peak_count = 0;
    const T* t = window_table<V>(id, mode, &count);
    const T* p = window_table<V>(id, wnorm_peak, &peak_count);
    if (t == nullptr || p == nullptr) return -1;
    T result = t[0] * (T(1) / p[0]);
    if (mode == wnorm_mean && points < count)
        result = result * (t[0] / aliased_sum(t, count, points));
    else if (mode == wnorm_rms && points < 2 * count - 1)
        result = result / own_sqrt(aliased_mean_square(t, count, points));
    *out = result;
    return 0;
}

template <VlxVector V>
int32_t window_scale(real_t<V>* out, int32_t id, int32_t flags, int32_t points) {
    if (flags & wflag_width) return -1;
    return window2_scale<V>(out, id, flags, points, real_t<V>(0));
}

template <VlxVector V>
int32_t window_enbw(real_t<V>* out, int32_t id, int32_t points) {
    using T = real_t<V>;
    if (out == nullptr) return -1;
    T s0, s1;
    if (window_scale<V>(&s0, id, wnorm_mean, points) != 0) return -1;
    if (window_scale<V>(&s1, id, wnorm_rms, points) != 0) return -1;
    const T q = s0 / s1;
    *out = q * q;
    return 0;
}

template <VlxVector V>
int32_t window2_enbw(real_t<V>* out, int32_t id, int32_t points, real_t<V> width) {
    using T = real_t<V>;
    if (out == nullptr) return -1;
    T s0, s1;
    if (window2_scale<V>(&s0, id, wflag_width | wnorm_mean, points, width) != 0) return -1;
    if (window2_scale<V>(&s1, id, wflag_width | wnorm_rms, points, width) != 0) return -1;
    const T q = s0 / s1;
    *out = q * q;
    return 0;
}

template <VlxVector V>
int32_t window_metric(real_t<V>* out, int32_t selector, int32_t id, int32_t points, real_t<V> width) {
    using T = real_t<V>;
    if (selector == 0) {
        if (nearly_equal<V>(static_cast<T>(points), width)) return window_enbw<V>(out, id, points);
        return window2_enbw<V>(out, id, points, width);
    }
    if (out == nullptr || (selector != 1 && selector != 2) || static_cast<uint32_t>(id) > 31u) return -1;
    const T b = static_cast<T>(bandwidths[id][selector - 1]);
    if (!(width > T(0))) {
        *out = family<V>::bound;
        return 0;
    }
    *out = static_cast<T>(points) * b / width;
    return 0;
}

#define VLX_METRIC_INSTANCES(V)                                                                          \
    template int32_t window2_scale<V>(real_t<V>*, int32_t, int32_t, int32_t, real_t<V>);                \
    template int32_t window_scale<V>(real_t<V>*, int32_t, int32_t, int32_t);                            \
    template int32_t window2_enbw<V>(real_t<V>*, int32_t, int32_t, real_t<V>);                          \
    template int32_t window_enbw<V>(real_t<V>*, int32_t, int32_t);                                      \
    template int32_t window_metric<V>(real_t<V>*, int32_t, int32_t, int32_t, real_t<V>);
VLX_METRIC_INSTANCES(vlx_t)
VLX_METRIC_INSTANCES(vlxf_t)
#undef VLX_METRIC_INSTANCES

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_window2_scale(double* out, int32_t id, int32_t flags, int32_t points, double width) { return vlx::window2_scale<vlx_t>(out, id, flags, points, width); }
VLX_API int32_t vlxf_window2_scale(float* out, int32_t id, int32_t flags, int32_t points, float width) { return vlx::window2_scale<vlxf_t>(out, id, flags, points, width); }
VLX_API int32_t vlx_window_scale(double* out, int32_t id, int32_t flags, int32_t points) { return vlx::window_scale<vlx_t>(out, id, flags, points); }
VLX_API int32_t vlxf_window_scale(float* out, int32_t id, int32_t flags, int32_t points) { return vlx::window_scale<vlxf_t>(out, id, flags, points); }
VLX_API int32_t vlx_window2_enbw(double* out, int32_t id, int32_t points, double width) { return vlx::window2_enbw<vlx_t>(out, id, points, width); }
VLX_API int32_t vlxf_window2_enbw(float* out, int32_t id, int32_t points, float width) { return vlx::window2_enbw<vlxf_t>(out, id, points, width); }
VLX_API int32_t vlx_window_enbw(double* out, int32_t id, int32_t points) { return vlx::window_enbw<vlx_t>(out, id, points); }
VLX_API int32_t vlxf_window_enbw(float* out, int32_t id, int32_t points) { return vlx::window_enbw<vlxf_t>(out, id, points); }
VLX_API int32_t vlx_window_metric(double* out, int32_t selector, int32_t id, int32_t points, double width) { return vlx::window_metric<vlx_t>(out, selector, id, points, width); }
VLX_API int32_t vlxf_window_metric(float* out, int32_t selector, int32_t id, int32_t points, float width) { return vlx::window_metric<vlxf_t>(out, selector, id, points, width); }
}
