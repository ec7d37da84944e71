// The sweep averager: folds one record into the caller's accumulator, the
// sweep number being the caller's counter, so no state lives here.
#include "streaming/streaming.hpp"

#include "elementwise/elementwise.hpp"

namespace vlx {
namespace {

constexpr int32_t conversions = VLX_AVG_POWER | VLX_AVG_MAG | VLX_AVG_LOG;

// Weight of modes 1, 4 and 5: a fixed weight, or the running mean's 1/count,
// which with VLX_AVG_LIMITED stops falling at 1/limit.
template <VlxVector V>
real_t<V> sweep_weight(int32_t mode, int32_t count, real_t<V> weight, real_t<V> limit) {
    using T = real_t<V>;
    if (weight >= T(0)) return weight;
    T d = static_cast<T>(count);
    if ((mode & VLX_AVG_LIMITED) && !(limit <= T(0) || limit > d)) d = limit;
    if (d == T(0)) d = T(1);
    return T(1) / d;
}

}  // namespace

template <VlxVector V>
int32_t avg(V* in, V* acc, V* work, int32_t mode, int32_t count, int32_t period, real_t<V> weight, real_t<V> limit) {
    V temp;
    bool have_temp = false;
    // A failing step does not end the call; it only decides the result.
    bool failed = false;
    auto step = [&failed](int32_t r) { failed = failed || r < 0; };
    auto need_work = [&]() {
        if (work == nullptr) {
            init(&temp);
            have_temp = true;
            work = &temp;
        }
    };
    if (mode & conversions) need_work();

    V* s = in;
    if (mode & VLX_AVG_POWER) {
        step(magsq_to(s, work));
        s = work;
    }
    if (mode & VLX_AVG_MAG) {
        step(mag_to(s, work));
        s = work;
    }
    if (mode & VLX_AVG_LOG) {
        step(copy(work, s));
        step(log_each(work));
        s = work;
    }

    const int32_t kind = mode & 15;
    if (count <= 1) {
        step(copy(acc, s));
    } else if (kind == VLX_AVG_LAST) {
        step(copy(acc, s));
    } else if (kind == VLX_AVG_LINEAR) {
        step(avg_add(s, acc, acc, sweep_weight<V>(mode, count, weight, limit)));
    } else if (kind == VLX_AVG_MAX) {
        step(maximum(s, acc, acc));
    } else if (kind == VLX_AVG_MIN) {
        step(minimum(s, acc, acc));
    } else if (kind == VLX_AVG_HARMONIC || kind == VLX_AVG_GEOMETRIC) {
        const bool harmonic = kind == VLX_AVG_HARMONIC;
        auto into_domain = [harmonic](V* v) { return harmonic ? recip(v) : log_each(v); };
        need_work();
        step(copy(work, s));
        step(into_domain(work));
        if (acc != work) step(into_domain(acc));
        step(avg_add(work, acc, acc, sweep_weight<V>(mode, count, weight, limit)));
        step(harmonic ? recip(acc) : exp_each(acc));
    } else if (kind == VLX_AVG_SAMPLE) {
        // the sweep after each whole period is taken and held
        if ((period > 0 && count % period == 1) || period == 1) step(copy(acc, s));
    }

    if (have_temp) step(destroy(&temp));
    return failed ? -1 : 0;
}

#define VLX_INSTANTIATE(V) \
    template int32_t avg<V>(V*, V*, V*, int32_t, int32_t, int32_t, real_t<V>, real_t<V>);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxh_avg(vlx_t* in, vlx_t* acc, vlx_t* work, int32_t mode, int32_t count, int32_t period, double weight,
                         double limit) {
    return vlx::avg(in, acc, work, mode, count, period, weight, limit);
}
VLX_API int32_t vlxfh_avg(vlxf_t* in, vlxf_t* acc, vlxf_t* work, int32_t mode, int32_t count, int32_t period,
                          float weight, float limit) {
    return vlx::avg(in, acc, work, mode, count, period, weight, limit);
}
}
