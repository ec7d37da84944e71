// Twin shorthands, a synthesised window as a plain vector, mean and rms.
#pragma once

#include "vlx_test.hpp"

#include <cmath>
#include <numeric>
#include <vector>

namespace vlxtest {

VLX_TWIN(i, window2) VLX_TWIN(i, window) VLX_TWIN(i, window_cos) VLX_TWIN(i, window_kaiser) VLX_TWIN(i, window_gauss)
VLX_TWIN(i, window_sinc) VLX_TWIN(i, window_tukey) VLX_TWIN(i, window_fir) VLX_TWIN(i, swap_halves2)
VLX_TEST_TWIN(t_synth, vlx_window_synth, vlxf_window_synth)
VLX_TEST_TWIN(t_cos_sum, vlx_window_cos_sum, vlxf_window_cos_sum)

// The metrics take a scalar out pointer; these route by its type.
#define VLX_METRIC_TWIN(name)                                                                  \
    inline int32_t t_##name(double* out, auto... a) { return vlx_##name(out, a...); }          \
    inline int32_t t_##name(float* out, auto... a) { return vlxf_##name(out, a...); }
VLX_METRIC_TWIN(window2_scale)
VLX_METRIC_TWIN(window_scale)
VLX_METRIC_TWIN(window_metric)
#undef VLX_METRIC_TWIN

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

// The mean a mean-normalised window keeps: c0, just below 1 for the flat tops (ids 8 to 13).
inline double c0_of(int32_t id) {
    const double flat[6] = {0.9994484, 0.9996403, 0.999760855, 0.999820406, 0.99974762, 0.999813874};
    return id >= 8 && id <= 13 ? flat[id - 8] : 1.0;
}

template <class T>
long double mean_of(const std::vector<T>& x) { return std::accumulate(x.begin(), x.end(), 0.0L) / x.size(); }

template <class T>
long double rms_of(const std::vector<T>& x) {
    return std::sqrt(std::inner_product(x.begin(), x.end(), x.begin(), 0.0L) / x.size());
}

}  // namespace vlxtest
