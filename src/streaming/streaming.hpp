// Streaming processors and measurement-level operations as templates: the
// streaming resampler, the sweep averager, correlation and the spectrum
// pipeline.  Each is explicitly instantiated for vlx_t and vlxf_t where it is
// defined.
#pragma once

#include "core/core.hpp"

namespace vlx {

// The coefficient and state objects of the streaming resampler by family.
template <VlxVector V>
struct rsmp_objects;
template <>
struct rsmp_objects<vlx_t> {
    using coef = vlxh_rsmp_coef_t;
    using state = vlxh_rsmp_state_t;
};
template <>
struct rsmp_objects<vlxf_t> {
    using coef = vlxfh_rsmp_coef_t;
    using state = vlxfh_rsmp_state_t;
};
template <VlxVector V>
using rsmp_coef_t = typename rsmp_objects<V>::coef;
template <VlxVector V>
using rsmp_state_t = typename rsmp_objects<V>::state;

// ---- streaming resampler: objects and arithmetic ----

template <VlxVector V> int32_t rsmp_coef_init(rsmp_coef_t<V>* coef);
template <VlxVector V> int32_t rsmp_coef_alloc(rsmp_coef_t<V>* coef, int32_t kind);
template <VlxVector V> int32_t rsmp_coef_setup(rsmp_coef_t<V>* coef, real_t<V> ratio, int32_t forced, int32_t reserved);
template <VlxVector V> int32_t rsmp_coef_destroy(rsmp_coef_t<V>* coef);
template <VlxVector V> int32_t rsmp_state_init(rsmp_state_t<V>* state);
template <VlxVector V> int32_t rsmp_state_alloc(rsmp_coef_t<V>* coef, rsmp_state_t<V>* state, int32_t complex);
template <VlxVector V> int32_t rsmp_state_reset(rsmp_coef_t<V>* coef, rsmp_state_t<V>* state);
template <VlxVector V> int32_t rsmp_state_destroy(rsmp_state_t<V>* state);
template <VlxVector V> int32_t rsmp_get_in_pts(int32_t* result, rsmp_coef_t<V>* coef, int32_t out_points, int32_t settled);
template <VlxVector V>
int32_t rsmp_get_out_pts(int32_t* result, rsmp_coef_t<V>* coef, int32_t in_points, int32_t settled, int32_t at_least);
template <VlxVector V> int32_t rsmp_get_delay_pts(real_t<V>* result, rsmp_coef_t<V>* coef, int32_t in_output_units);
template <VlxVector V> int32_t rsmp_get_settle_pts(real_t<V>* result, rsmp_coef_t<V>* coef, int32_t in_output_units);

// ---- streaming resampler: run of one block ----

template <VlxVector V> int32_t rsmp_stream(V* in, V* out, V* work, rsmp_coef_t<V>* coef, rsmp_state_t<V>* state);

// ---- averaging, correlation ----

template <VlxVector V>
int32_t avg(V* in, V* acc, V* work, int32_t mode, int32_t count, int32_t period, real_t<V> weight, real_t<V> limit);
template <VlxVector V> int32_t corr(V* ref, V* sig, V* out, V* work, int32_t lags_pts, int32_t halve);

// ---- spectrum pipeline ----

template <VlxVector V> int32_t spectrum_dft(V* in, V* out, int32_t window, int32_t flags);
template <VlxVector V>
int32_t spectrum_fft(V* in, V* out, int32_t nfft, real_t<V> fraction, int32_t window, int32_t flags);

}  // namespace vlx
