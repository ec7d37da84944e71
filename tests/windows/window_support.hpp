// Shared support of the window suites: twin shorthands, a window computed
// into a plain vector, and the cosine-sum tables as the catalogue lists them.
#pragma once

#include "vlx_test.hpp"

#include <cmath>
#include <vector>

namespace vlxtest {

VLX_TWIN(i, window2)
VLX_TWIN(i, window)
VLX_TWIN(i, window_cos)
VLX_TWIN(i, window_kaiser)
VLX_TWIN(i, window_gauss)
VLX_TWIN(i, window_sinc)
VLX_TWIN(i, window_tukey)
VLX_TWIN(i, window_fir)
VLX_TWIN(i, swap_halves2)
VLX_TEST_TWIN(t_synth, vlx_window_synth, vlxf_window_synth)
VLX_TEST_TWIN(t_cos_sum, vlx_window_cos_sum, vlxf_window_cos_sum)

// The metrics take a scalar out pointer; these route by its type.
#define VLX_METRIC_TWIN(name)                                                          \
    template <class... A>                                                              \
    inline int32_t t_##name(double* out, A... a) { return vlx_##name(out, a...); }     \
    template <class... A>                                                              \
    inline int32_t t_##name(float* out, A... a) { return vlxf_##name(out, a...); }
VLX_METRIC_TWIN(window2_scale)
VLX_METRIC_TWIN(window_scale)
VLX_METRIC_TWIN(window2_enbw)
VLX_METRIC_TWIN(window_enbw)
VLX_METRIC_TWIN(window_metric)
#undef VLX_METRIC_TWIN

template <class V>
inline int32_t t_free_internal() {
    return is_double<V> ? vlx_free_internal() : vlxf_free_internal();
}

// Window id with flags on n points, through the synthesis engine.
template <class V>
std::vector<real_of<V>> synth(int32_t id, int32_t flags, int32_t n, double width = 0.0, int32_t* status = nullptr) {
    Vec<V> w;
    w->points = n;
    EXPECT_EQ(t_alloc(w.get()), 0);
    const int32_t st = t_synth(w.get(), id, flags, static_cast<real_of<V>>(width));
    if (status != nullptr) *status = st;
    else EXPECT_EQ(st, 0) << "id " << id << " flags " << flags << " n " << n;
    return w.values();
}

template <class T>
long double mean_of(const std::vector<T>& x) {
    long double s = 0;
    for (T v : x) s += v;
    return s / static_cast<long double>(x.size());
}

template <class T>
long double rms_of(const std::vector<T>& x) {
    long double s = 0;
    for (T v : x) s += static_cast<long double>(v) * v;
    return std::sqrt(s / static_cast<long double>(x.size()));
}

// Peak tables of the cosine sums, by id (count 0: not a cosine sum).
struct PeakTable {
    int32_t count;
    double c[7];
};
inline const PeakTable& peak_table(int32_t id) {
    static const PeakTable t[32] = {
        {1, {1.0}}, {0, {}}, {2, {0.5, 0.5}}, {2, {0.54, 0.46}}, {3, {0.42, 0.5, 0.08}},
        {3, {0.424383190860823, 0.497339753968089, 0.078277055171088}},
        {4, {0.355768, 0.487396, 0.144232, 0.012604}},
        {5, {0.3232153788877343, 0.471492143957626, 0.1755341299601972, 0.02849699010614994, 0.001261357088292677}},
        {4, {0.239523981482822, 0.458092235226179, 0.258487878813733, 0.0438959044772663}},
        {5, {0.213283237831627, 0.414006058783449, 0.279055911943774, 0.0861666667911267, 0.00748812465002295}},
        {6, {0.191847568346755, 0.375972989750395, 0.28442588877861, 0.122742011293553, 0.0237265428747444,
             0.00128499895594193}},
        {7, {0.177865709213752, 0.350267506494545, 0.281638382006947, 0.144775183509154, 0.0403343233670632,
             0.00495730999606168, 0.000161585412477099}},
        {6, {0.194193773561842, 0.380170365312055, 0.284064801584131, 0.118766633064811, 0.0217289855238924,
             0.00107544095326841}},
        {7, {0.179324203849725, 0.352952756714861, 0.281965299769994, 0.142511435204976, 0.0385717630030842,
             0.0045365638065367, 0.00013797765082358}},
        {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}},
        {6, {0.2935578950102797, 0.4519357723474506, 0.2014164714263962, 0.04792610922105837, 0.005026196426859393,
             0.0001375555679558877}},
        {7, {0.2712203605850388, 0.4334446123274422, 0.2180041228929303, 0.06578534329560609, 0.01076186730534183,
             0.0007700127105808265, 1.368088305992921e-05}},
        {4, {0.3635819, 0.4891775, 0.1365995, 0.0106411}},
        {4, {0.35875, 0.48829, 0.14128, 0.01168}},
        {0, {}}, {0, {}},
    };
    return t[id];
}

// c0 + c1 cos(x) + c2 cos(2x) + ... in long double.
inline long double cos_sum_ld(const PeakTable& t, long double x) {
    long double s = 0;
    for (int k = 0; k < t.count; ++k) s += t.c[k] * std::cos(k * x);
    return s;
}

}  // namespace vlxtest
