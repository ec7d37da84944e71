// Staging shared by every filter, the plain decimator, and the tolerant
// number helpers that turn computed quantities into point counts.
#include "filters/filters.hpp"

#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"

#include <cmath>
#include <cstdint>
#include <limits>

namespace vlx {
namespace {

// Tolerances of the number helpers.  The single-precision allowances are 7
// float epsilons, not 20: that is settled behaviour, not a rounding of the
// double values.
template <VlxVector V>
struct tolerance;

template <>
struct tolerance<vlx_t> {
    static constexpr double tiny = 4.450147717014403e-307;  // 20 smallest normals
    static constexpr double ratio_low = 0.9999999999999956;
    static constexpr double ratio_high = 1.0000000000000044;
    static constexpr double noise = 4.440892098500626e-15;  // 20 epsilons
    static constexpr double max_points = 2147483647.0;
};

template <>
struct tolerance<vlxf_t> {
    static constexpr float tiny = 2.3509887e-37f;
    static constexpr float ratio_low = 0.99999917f;
    static constexpr float ratio_high = 1.0000008f;
    static constexpr float noise = 8.34465e-7f;
    // compared in float, where 2147483647 is not representable
    static constexpr float max_points = 2147483648.0f;
};

// Whole-number result to i32; a float just below 2^31 can round up to 2^31.
inline int32_t to_points(double whole) {
    if (whole >= 2147483647.0) return std::numeric_limits<int32_t>::max();
    if (whole <= 0.0) return 0;
    return static_cast<int32_t>(whole);
}

// Whether the relative allowance still applies; the single-precision product
// is formed in float and compared in double.
template <VlxVector V>
bool relative_noise(real_t<V> x) {
    return static_cast<double>(x * tolerance<V>::noise) <= 0.01;
}

}  // namespace

template <VlxVector V>
int32_t stage_io(V* in, V** out_ref, V* other, V** hist_ref, int32_t hist_points, int32_t flags,
                 int32_t* aliased, V* tmp, V** saved_out) {
    if (hist_ref != nullptr && *hist_ref != nullptr) {
        V* hist = *hist_ref;
        hist->delta = in->delta;
        if ((hist->complex != 0) != (in->complex != 0)) {
            const int32_t r = in->complex ? rtoc(hist) : real_part(hist);
            if (r != 0) return -1;
        }
        // grows a short history, never shortens a long one; one that claims
        // samples without storage starts from silence
        if (hist->data == nullptr && hist->points > 0 && zero(hist) != 0) return -1;
        if (zpad(hist, hist_points) != 0) return -1;
    }

    const bool is_aliased = (flags & VLX_STAGE_ALIAS) != 0 && in->data == (*out_ref)->data;
    const bool can_route = aliased != nullptr && tmp != nullptr && saved_out != nullptr;
    if (is_aliased && !can_route) return -1;
    if (can_route) {
        *aliased = is_aliased ? 1 : 0;
        if (is_aliased) {
            init(tmp);
            *saved_out = *out_ref;
            if (flags & VLX_STAGE_KEEP_POINTS) tmp->points = (*out_ref)->points;
            *out_ref = tmp;
        }
    }

    V* out = *out_ref;
    // Read everything from `in` before writing: out may be in.
    const int32_t points = in->points;
    const int32_t is_complex = (in->complex != 0 || (other != nullptr && other->complex != 0)) ? 1 : 0;
    const real_t<V> delta = in->delta;
    if (!(flags & VLX_STAGE_KEEP_POINTS)) out->points = points;
    out->complex = is_complex;
    out->delta = delta;
    if (alloc(out) != 0) {
        if (is_aliased) destroy(tmp);
        return -1;
    }
    return 0;
}

template <VlxVector V>
int32_t unstage_io(V* out, int32_t aliased, V* saved_out) {
    if (aliased == 0) return 0;
    if (saved_out == nullptr) return -1;
    const int32_t r = copy(saved_out, out);
    if (destroy(out) != 0 && r == 0) return -1;
    return r;
}

template <VlxVector V>
int64_t read_skip(real_t<V> stored) {
    using T = real_t<V>;
    const T rounded = stored + T(0.5);
    // "not above 0" also catches a NaN
    if (!(rounded > T(0))) return 0;
    // far beyond any block length; keeps the conversion defined
    if (rounded >= T(4611686018427387904.0)) return int64_t(1) << 62;
    return static_cast<int64_t>(rounded);
}

template <VlxVector V>
int32_t deci(V* in, V* out, int32_t factor, V* hist) {
    using T = real_t<V>;
    if (factor < 1) factor = 1;
    // A history without storage starts from silence, as an empty one does.
    const bool has_skip = hist != nullptr && hist->points >= 1 && hist->data != nullptr;
    const int64_t skip = has_skip ? read_skip<V>(hist->data[0]) : 0;
    const int64_t n = in->points < 0 ? 0 : in->points;
    const DeciPlan plan = deci_plan(skip, n, factor);

    // Taken before staging: an out that is in but lends its storage gets a
    // block of its own there, and the samples are still read from here.
    const T* src = in->data;
    const int64_t width = in->complex ? 2 : 1;
    const T in_delta = in->delta;

    // A forward selection within one vector is safe, so no aliasing check.
    const int32_t old_points = out->points;
    out->points = static_cast<int32_t>(plan.count);
    if (stage_io<V>(in, &out, nullptr, hist != nullptr ? &hist : nullptr, 1, VLX_STAGE_KEEP_POINTS,
                    nullptr, nullptr, nullptr) != 0) {
        // A failed history leaves out (which may be in) as it was; a failed
        // allocation has left it empty.
        out->points = out->data != nullptr ? old_points : 0;
        return -1;
    }
    out->delta = static_cast<T>(factor) * in_delta;

    T* dst = out->data;
    if (width == 1) {
        for (int64_t i = 0; i < plan.count; ++i) dst[i] = src[skip + i * factor];
    } else {
        for (int64_t i = 0; i < plan.count; ++i) {
            const int64_t k = 2 * (skip + i * factor);
            dst[2 * i] = src[k];
            dst[2 * i + 1] = src[k + 1];
        }
    }
    if (hist != nullptr) hist->data[0] = static_cast<T>(plan.next_skip);
    return finish_io<V>(out, 0, nullptr, 0);
}

template <VlxVector V>
int32_t nearly_equal(real_t<V> a, real_t<V> b) {
    using T = real_t<V>;
    using tol = tolerance<V>;
    if (a == b) return 1;
    if (a >= -tol::tiny && a <= tol::tiny) return (b >= -tol::tiny && b <= tol::tiny) ? 1 : 0;
    const T r = b / a;  // a NaN fails both bounds
    return (r >= tol::ratio_low && r <= tol::ratio_high) ? 1 : 0;
}

template <VlxVector V>
int32_t ceil_pts(real_t<V> x) {
    using T = real_t<V>;
    using tol = tolerance<V>;
    if (x > tol::max_points) return std::numeric_limits<int32_t>::max();
    if (!(x >= T(0))) return 0;  // negative, or not a number
    if (x <= T(0.5)) return to_points(own_ceil<T>(x - tol::noise));
    if (relative_noise<V>(x)) return to_points(own_ceil<T>(x * tol::ratio_low));
    // the absolute allowance is formed in double in both families
    return to_points(ceil64(static_cast<double>(x) - 0.01));
}

template <VlxVector V>
int32_t floor_pts(real_t<V> x) {
    using T = real_t<V>;
    using tol = tolerance<V>;
    if (x > tol::max_points) return std::numeric_limits<int32_t>::max();
    if (!(x >= T(0))) return 0;
    if (x <= T(0.5)) return to_points(own_floor<T>(x + tol::noise));
    if (relative_noise<V>(x)) return to_points(own_floor<T>(x * tol::ratio_high));
    return to_points(floor64(static_cast<double>(x) + 0.01));
}

#define VLX_INSTANTIATE(V)                                                                         \
    template int32_t stage_io<V>(V*, V**, V*, V**, int32_t, int32_t, int32_t*, V*, V**);          \
    template int32_t unstage_io<V>(V*, int32_t, V*);                                               \
    template int64_t read_skip<V>(real_t<V>);                                                      \
    template int32_t deci<V>(V*, V*, int32_t, V*);                                                 \
    template int32_t nearly_equal<V>(real_t<V>, real_t<V>);                                        \
    template int32_t ceil_pts<V>(real_t<V>);                                                       \
    template int32_t floor_pts<V>(real_t<V>);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_stage_io(vlx_t* in, vlx_t** out_ref, vlx_t* other, vlx_t** hist_ref, int32_t hist_points,
                             int32_t flags, int32_t* aliased, vlx_t* tmp, vlx_t** saved_out) {
    return vlx::stage_io(in, out_ref, other, hist_ref, hist_points, flags, aliased, tmp, saved_out);
}
VLX_API int32_t vlxf_stage_io(vlxf_t* in, vlxf_t** out_ref, vlxf_t* other, vlxf_t** hist_ref, int32_t hist_points,
                              int32_t flags, int32_t* aliased, vlxf_t* tmp, vlxf_t** saved_out) {
    return vlx::stage_io(in, out_ref, other, hist_ref, hist_points, flags, aliased, tmp, saved_out);
}
VLX_API int32_t vlx_unstage_io(vlx_t* out, int32_t aliased, vlx_t* saved_out) {
    return vlx::unstage_io(out, aliased, saved_out);
}
VLX_API int32_t vlxf_unstage_io(vlxf_t* out, int32_t aliased, vlxf_t* saved_out) {
    return vlx::unstage_io(out, aliased, saved_out);
}
VLX_API int32_t vlxd_deci(vlx_t* in, vlx_t* out, int32_t factor, vlx_t* hist) { return vlx::deci(in, out, factor, hist); }
VLX_API int32_t vlxfd_deci(vlxf_t* in, vlxf_t* out, int32_t factor, vlxf_t* hist) {
    return vlx::deci(in, out, factor, hist);
}
VLX_API int32_t vlx_nearly_equal(double a, double b) { return vlx::nearly_equal<vlx_t>(a, b); }
VLX_API int32_t vlxf_nearly_equal(float a, float b) { return vlx::nearly_equal<vlxf_t>(a, b); }
VLX_API int32_t vlx_ceil_pts(double x) { return vlx::ceil_pts<vlx_t>(x); }
VLX_API int32_t vlxf_ceil_pts(float x) { return vlx::ceil_pts<vlxf_t>(x); }
VLX_API int32_t vlx_floor_pts(double x) { return vlx::floor_pts<vlx_t>(x); }
VLX_API int32_t vlxf_floor_pts(float x) { return vlx::floor_pts<vlxf_t>(x); }
}
