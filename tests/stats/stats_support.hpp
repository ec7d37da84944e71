// Twins of the statistics and small helpers shared by the statistics tests.
#pragma once

#include "vlx_test.hpp"

#include <functional>

namespace vlxtest {

VLX_TEST_TWIN(t_sum, vlxs_sum, vlxfs_sum)
VLX_TEST_TWIN(t_mean, vlxs_mean, vlxfs_mean)
VLX_TEST_TWIN(t_magsq_sum, vlxs_magsq_sum, vlxfs_magsq_sum)
VLX_TEST_TWIN(t_rms, vlxs_rms, vlxfs_rms)
VLX_TEST_TWIN(t_pop_var, vlxs_pop_var, vlxfs_pop_var)
VLX_TEST_TWIN(t_samp_var, vlxs_samp_var, vlxfs_samp_var)
VLX_TEST_TWIN(t_pop_stddev, vlxs_pop_stddev, vlxfs_pop_stddev)
VLX_TEST_TWIN(t_samp_stddev, vlxs_samp_stddev, vlxfs_samp_stddev)
VLX_TEST_TWIN(t_skew, vlxs_skew, vlxfs_skew)
VLX_TEST_TWIN(t_excess, vlxs_excess, vlxfs_excess)
VLX_TEST_TWIN(t_gmean, vlxs_gmean, vlxfs_gmean)
VLX_TEST_TWIN(t_hmean, vlxs_hmean, vlxfs_hmean)
VLX_TEST_TWIN(t_min, vlxs_min, vlxfs_min)
VLX_TEST_TWIN(t_max, vlxs_max, vlxfs_max)
VLX_TEST_TWIN(t_median, vlxs_median, vlxfs_median)
VLX_TEST_TWIN(t_hist, vlxs_hist, vlxfs_hist)
VLX_TEST_TWIN(t_sort, vlxi_sort, vlxfi_sort)
VLX_TEST_TWIN(t_peak, vlxs_peak, vlxfs_peak)

// The family's saturation bound.
template <class V>
constexpr real_of<V> bound_of() {
    if constexpr (is_double<V>)
        return 1e100;
    else
        return 1e15f;
}

// A statistic of src as (status, re, im, complex flag of the result).
template <class V>
struct StatResult {
    int32_t status;
    real_of<V> re, im;
    int32_t complex;
};

template <class V, class Fn>
StatResult<V> stat(Fn fn, Vec<V>& src) {
    Vec<V> dst;
    const int32_t status = fn(src.get(), dst.get());
    StatResult<V> r{status, real_of<V>(0), real_of<V>(0), dst->complex};
    if (status == 0) {
        EXPECT_EQ(dst->points, 1);
        r.re = dst[0];
        if (dst->complex) r.im = dst[1];
    }
    return r;
}

// A statistic as one callable object over both families: STAT(t_sum)(src).
#define STAT(fn) [](auto& v) { return stat([](auto* s, auto* d) { return fn(s, d); }, v); }

template <class V>
using StatFn = std::function<StatResult<V>(Vec<V>&)>;

}  // namespace vlxtest
