// The run of one block of the streaming resampler: an optional interpolate-
// by-2 stage or a cascade of decimate-by-2 stages, then the pre-filter, the
// polyphase stage at twice the target rate and a last decimation by 2.  All
// filter memory and start-up discards live in the caller's state object.
#include "streaming/streaming.hpp"

#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"

namespace vlx {
namespace {

inline bool shares_storage(const void* a, const void* b) { return a != nullptr && a == b; }

// Drops up to `count` start-up samples from the front of v; what a short
// block cannot give stays counted for the next one.
template <VlxVector V>
int32_t discard(V* v, int32_t* count) {
    const int32_t points = v->points > 0 ? v->points : 0;
    const int32_t d = *count < points ? *count : points;
    if (subvec(v, v, d, points - d) < 0) return -1;
    *count -= d;
    return 0;
}

template <VlxVector V>
int32_t full_taps_of(const V* half, int32_t odd) {
    const int32_t m = half->points;
    if (m <= 0) return 1;
    return odd ? 2 * m - 1 : 2 * m;
}

template <VlxVector V>
int32_t run_block(V* in, V* out, V* work, rsmp_coef_t<V>* coef, rsmp_state_t<V>* state) {
    using T = real_t<V>;
    const int32_t limit = out->points;
    const int32_t k = coef->octaves;
    const T r = coef->ratio;
    int32_t status = rsmp_state_alloc<V>(coef, state, in->complex);
    if (status != 0) return status;

    if (k < 0) {
        status = zinter_to(in, work, T(2));
        if (status == 0) status = sfir(work, out, &coef->half_filter, coef->half_odd, 0, &state->stage_hist[0]);
        if (status == 0) status = discard(out, &state->skip_mid);
        if (status != 0) return status;
    }

    if (k >= 1) {
        V* dst = (k == 1 || shares_storage(in->data, work->data)) ? out : work;
        V* other = dst == out ? work : out;
        V* src = in;
        for (int32_t i = 0; i < k; ++i) {
            status = sfir_deci(src, dst, &coef->half_filter, coef->half_odd, 0, 2, &state->stage_hist[i]);
            if (status != 0) return status;
            src = dst;
            dst = other;
            other = src;
        }
        status = discard(src, &state->skip_mid);
        if (status == 0) status = copy(out, src);
        if (status != 0) return status;
    }

    const bool resampled = coef->forced != 0 || nearly_equal<V>(r, T(1)) == 0;
    if (resampled) {
        V* src = k != 0 ? out : in;
        // The skip count of the last decimation, in the manner of its history.
        const int32_t nh = full_taps_of(&coef->half_filter, coef->half_odd);
        int64_t skip = 0;
        V* post = &state->post_hist;
        if (post->points >= nh) skip = read_skip<V>(post->data[(post->complex ? 2 : 1) * int64_t(nh - 1)]);
        // The polyphase output is limited so that the last stage cannot give
        // more than the block may deliver.
        const int64_t wanted = 2 * (int64_t(state->skip_out) + limit) - 1 + skip;
        if (shares_storage(src->data, out->data)) {
            status = copy(work, src);
            if (status != 0) return status;
            src = work;
        }
        status = sfir(src, out, &coef->pre_filter, coef->pre_odd, 0, &state->pre_hist);
        if (status != 0) return status;
        work->points = wanted > 2147483647 ? 2147483647 : wanted < -2147483647 ? -2147483647 : int32_t(wanted);
        status = rsmp(out, work, coef->method, &coef->table, r * T(0.5), &state->rsmp_hist);
        if (status == 0) status = sfir_deci(work, out, &coef->half_filter, coef->half_odd, 0, 2, post);
        if (status == 0) status = discard(out, &state->skip_out);
        if (status != 0) return status;
    } else if (k == 0) {
        // nothing to do: the stream passes through with no delay
        status = copy(out, in);
        if (status != 0) return status;
    }
    if (out->points > limit) out->points = limit;
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t rsmp_stream(V* in, V* out, V* work, rsmp_coef_t<V>* coef, rsmp_state_t<V>* state) {
    V temp_work;
    rsmp_state_t<V> temp_state;
    if (work == nullptr) {
        init(&temp_work);
        work = &temp_work;
    }
    if (state == nullptr) {
        rsmp_state_init<V>(&temp_state);
        state = &temp_state;
    }
    int32_t status = run_block(in, out, work, coef, state);
    // Temporaries go on every path; their failure matters only to a run
    // that succeeded.
    if (work == &temp_work && destroy(&temp_work) != 0 && status == 0) status = -1;
    if (state == &temp_state && rsmp_state_destroy<V>(&temp_state) != 0 && status == 0) status = -1;
    return status;
}

#define VLX_INSTANTIATE(V) template int32_t rsmp_stream<V>(V*, V*, V*, rsmp_coef_t<V>*, rsmp_state_t<V>*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxh_rsmp(vlx_t* in, vlx_t* out, vlx_t* work, vlxh_rsmp_coef_t* coef, vlxh_rsmp_state_t* state) {
    return vlx::rsmp_stream<vlx_t>(in, out, work, coef, state);
}
VLX_API int32_t vlxfh_rsmp(vlxf_t* in, vlxf_t* out, vlxf_t* work, vlxfh_rsmp_coef_t* coef, vlxfh_rsmp_state_t* state) {
    return vlx::rsmp_stream<vlxf_t>(in, out, work, coef, state);
}
}
