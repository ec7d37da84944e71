// Twins of the statistics and small helpers shared by the statistics tests.
#pragma once

#include "vlx_test.hpp"

#include <functional>

namespace vlxtest {

VLX_TWIN(s, sum) VLX_TWIN(s, mean) VLX_TWIN(s, magsq_sum) VLX_TWIN(s, rms) VLX_TWIN(s, pop_var) VLX_TWIN(s, samp_var)
VLX_TWIN(s, pop_stddev) VLX_TWIN(s, samp_stddev) VLX_TWIN(s, skew) VLX_TWIN(s, excess) VLX_TWIN(s, gmean)
VLX_TWIN(s, hmean) VLX_TWIN(s, min) VLX_TWIN(s, max) VLX_TWIN(s, median) VLX_TWIN(s, hist) VLX_TWIN(s, peak)
VLX_TEST_TWIN(t_sort, vlxi_sort, vlxfi_sort)

// A statistic of src as (status, re, im, complex flag of the result).
template <class V>
struct StatResult { int32_t status; real_of<V> re, im; int32_t complex; };

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
