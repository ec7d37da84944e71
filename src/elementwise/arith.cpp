// The in-place arithmetic family, its one-source forms (vlxu_), the tone
// adder and the stubs.  Limits keep every result finite: B is the family's
// bound, standing in for infinity.
#include "elementwise/elementwise.hpp"
#include "elementwise/inplace.hpp"
#include "elementwise/simd.hpp"

#include <bit>
#include <cstring>
#include <limits>
#include <type_traits>

namespace vlx {

using inplace::beyond;
using inplace::Cx;

template <VlxVector V>
int32_t scale(V* v, real_t<V> s) {
    const int64_t n = v->points < 1 ? 0 : scalar_count(v);
    real_t<V>* d = v->data;
    simd::dispatch([=]() VLX_INLINE_LOOP {
        for (int64_t i = 0; i < n; ++i) d[i] = d[i] * s;
    });
    return 0;
}

template <VlxVector V>
int32_t offset(V* v, real_t<V> c) {
    using T = real_t<V>;
    return inplace::map_both(v, [c](T x) { return x + c; }, [c](T a, T b) { return Cx<T>{a + c, b}; });
}

namespace {

// Real input made complex in place, each x spread into (f(x)) from the last
// point down so that nothing unread is overwritten.  An empty vector stays real.
template <VlxVector V, class F>
int32_t spread_real(V* v, F f) {
    using T = real_t<V>;
    const int32_t n = v->points;
    if (n < 1) return 0;
    v->complex = 1;
    if (realloc(v, n, 0) < 0) return -1;
    T* d = v->data;
    for (int64_t i = int64_t(n) - 1; i >= 0; --i) {
        const Cx<T> r = f(d[i]);
        d[2 * i] = r.re;
        d[2 * i + 1] = r.im;
    }
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t cscale(V* v, real_t<V> re, real_t<V> im) {
    using T = real_t<V>;
    if (!v->complex) return spread_real(v, [re, im](T x) { return Cx<T>{x * re, x * im}; });
    return inplace::map_both(v, [](T x) { return x; },
                             [re, im](T a, T b) { return Cx<T>{a * re - b * im, b * re + a * im}; });
}

template <VlxVector V>
int32_t neg(V* v) {
    const int64_t n = v->points < 1 ? 0 : scalar_count(v);
    real_t<V>* d = v->data;
    simd::dispatch([=]() VLX_INLINE_LOOP {
        for (int64_t i = 0; i < n; ++i) d[i] = -d[i];
    });
    return 0;
}

template <VlxVector V>
int32_t abs_each(V* v) {
    return inplace::map_real(v, [](real_t<V> x) { return std::fabs(x); });
}

template <VlxVector V>
int32_t conj(V* v) {
    if (!v->complex) return 0;
    const int64_t n = v->points;
    real_t<V>* d = v->data;
    // negation flips the sign bit: +0.0 becomes -0.0
    simd::dispatch([=]() VLX_INLINE_LOOP {
        for (int64_t i = 0; i < n; ++i) d[2 * i + 1] = -d[2 * i + 1];
    });
    return 0;
}

template <VlxVector V>
int32_t timesi(V* v) {
    using T = real_t<V>;
    if (!v->complex) return spread_real(v, [](T x) { return Cx<T>{T(0), x}; });
    return inplace::map_both(v, [](T x) { return x; }, [](T a, T b) { return Cx<T>{-b, a}; });
}

namespace {

template <class T>
inline T mag_real(T x) {
    return std::fabs(x);
}
template <class T>
inline T mag_pair(T a, T b) {
    return wide_hypot(a, b);
}
// The tests are combined without short-circuit so that the loops vectorise.
template <VlxVector V>
inline real_t<V> magsq_real(real_t<V> x) {
    constexpr real_t<V> big = family<V>::bound;
    const real_t<V> sq = x * x;
    return beyond(x, big) ? big : sq;
}
template <VlxVector V>
inline real_t<V> magsq_pair(real_t<V> a, real_t<V> b) {
    constexpr real_t<V> big = family<V>::bound;
    const bool over = beyond(a, big) | beyond(b, big);
    const real_t<V> power = b * b + a * a;
    return over ? big : power;
}

// Packs one scalar per point from src's samples into d, forward, which is
// safe when d is src's own storage.  src_complex is read before any change.
template <VlxVector V, class FR, class FC>
void pack(const real_t<V>* x, real_t<V>* d, int64_t n, bool src_complex, FR fr, FC fc) {
    if (src_complex) {
        simd::dispatch([=]() VLX_INLINE_LOOP {
            for (int64_t i = 0; i < n; ++i) d[i] = fc(x[2 * i], x[2 * i + 1]);
        });
    } else {
        simd::dispatch([=]() VLX_INLINE_LOOP {
            for (int64_t i = 0; i < n; ++i) d[i] = fr(x[i]);
        });
    }
}

// Complex power into a destination apart from the source, in blocks: the
// compiler does not vectorise the clamp's two tests, so the power goes first
// and the rare parts beyond the bound are patched after, from the source.
// Same values as magsq_pair, sample by sample.
template <VlxVector V>
void magsq_apart(const real_t<V>* x, real_t<V>* d, int64_t n) {
    using T = real_t<V>;
    constexpr T big = family<V>::bound;
    using Bits = std::conditional_t<sizeof(T) == 8, int64_t, int32_t>;
    constexpr Bits magnitude = std::numeric_limits<Bits>::max();
    constexpr Bits big_bits = std::bit_cast<Bits>(big);
    constexpr int64_t block = 1024;
    for (int64_t i0 = 0; i0 < n; i0 += block) {
        const int64_t end = i0 + block < n ? i0 + block : n;
        // any part whose magnitude bits exceed the bound's (NaN included)
        // sends the block through the exact test
        bool flagged = false;
        simd::dispatch([=, &flagged]() VLX_INLINE_LOOP {
            Bits any = 0;
            for (int64_t i = i0; i < end; ++i) {
                d[i] = x[2 * i + 1] * x[2 * i + 1] + x[2 * i] * x[2 * i];
                any |= static_cast<Bits>((std::bit_cast<Bits>(x[2 * i]) & magnitude) > big_bits);
                any |= static_cast<Bits>((std::bit_cast<Bits>(x[2 * i + 1]) & magnitude) > big_bits);
            }
            flagged = any != 0;
        });
        if (!flagged) continue;
        for (int64_t i = i0; i < end; ++i)
            if (beyond(x[2 * i], big) || beyond(x[2 * i + 1], big)) d[i] = big;
    }
}

template <VlxVector V, class FR, class FC>
void pack_power(const real_t<V>* x, real_t<V>* d, int64_t n, bool src_complex, FR fr, FC fc) {
    if (src_complex && !simd::overlaps(d, n, x, 2 * n))
        magsq_apart<V>(x, d, n);
    else
        pack<V>(x, d, n, src_complex, fr, fc);
}

// vlxi_mag, vlxi_magsq: the vector turns real, even when empty.
template <VlxVector V, class FR, class FC>
int32_t pack_in_place(V* v, FR fr, FC fc) {
    const bool was_complex = v->complex != 0;
    v->complex = 0;
    const int64_t n = v->points;
    pack<V>(v->data, v->data, n, was_complex, fr, fc);
    return 0;
}

// vlxu_mag, vlxu_magsq: dst sized like a real copy of src.
template <bool power, VlxVector V, class FR, class FC>
int32_t pack_into(V* src, V* dst, FR fr, FC fc) {
    const bool src_complex = src->complex != 0;
    V shape = *src;
    shape.complex = 0;
    if (prepare_dest(&shape, &shape, dst) < 0) return -1;
    if constexpr (power)
        pack_power<V>(src->data, dst->data, dst->points, src_complex, fr, fc);
    else
        pack<V>(src->data, dst->data, dst->points, src_complex, fr, fc);
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t mag(V* v) {
    using T = real_t<V>;
    return pack_in_place(v, [](T x) { return mag_real(x); }, [](T a, T b) { return mag_pair(a, b); });
}

template <VlxVector V>
int32_t magsq(V* v) {
    using T = real_t<V>;
    return pack_in_place(v, [](T x) { return magsq_real<V>(x); }, [](T a, T b) { return magsq_pair<V>(a, b); });
}

template <VlxVector V>
int32_t mag_to(V* src, V* dst) {
    using T = real_t<V>;
    return pack_into<false>(src, dst, [](T x) { return mag_real(x); }, [](T a, T b) { return mag_pair(a, b); });
}

template <VlxVector V>
int32_t magsq_to(V* src, V* dst) {
    using T = real_t<V>;
    return pack_into<true>(src, dst, [](T x) { return magsq_real<V>(x); }, [](T a, T b) { return magsq_pair<V>(a, b); });
}

template <VlxVector V>
int32_t square(V* v) {
    using T = real_t<V>;
    constexpr T big = family<V>::bound;
    return inplace::map_both(
        v, [](T x) { return beyond(x, big) ? big : x * x; },
        [](T a, T b) {
            a = inplace::clamp_part(a, big);
            b = inplace::clamp_part(b, big);
            return Cx<T>{a * a - b * b, a * T(2) * b};
        });
}

template <VlxVector V>
int32_t recip(V* v) {
    using T = real_t<V>;
    constexpr T big = family<V>::bound;
    return inplace::map_both(
        v, [](T x) { return x == T(0) ? big : T(1) / x; },
        [](T a, T b) {
            T f;
            if (beyond(a, big) || beyond(b, big)) {
                f = T(1) / big;
            } else {
                const T m = b * b + a * a;
                f = m <= T(0) ? big : T(1) / m;
            }
            // (0, 0) gives (0, -0): f * 0 is 0, never the bound
            return Cx<T>{f * a, -(f * b)};
        });
}

namespace {

template <VlxVector V>
inline real_t<V> sqrt_real(real_t<V> x) {
    return x < real_t<V>(0) ? real_t<V>(0) : own_sqrt(x);
}

template <VlxVector V>
inline Cx<real_t<V>> sqrt_pair(real_t<V> a, real_t<V> b) {
    using T = real_t<V>;
    constexpr T big = family<V>::bound;
    const T r = beyond(a, big) || beyond(b, big) ? big : own_sqrt(a * a + b * b);
    const T q = own_sqrt(r);
    if (q <= T(0)) return {T(0), T(0)};
    const T p = own_atan2(b, a) * T(0.5);
    return {q * own_cos(p), q * own_sin(p)};
}

}  // namespace

template <VlxVector V>
int32_t sqrt_each(V* v) {
    return inplace::map_both(v, sqrt_real<V>, sqrt_pair<V>);
}

template <VlxVector V>
int32_t sqrt_to(V* src, V* dst) {
    using T = real_t<V>;
    const bool src_complex = src->complex != 0;
    if (prepare_dest(src, src, dst) < 0) return -1;
    const int64_t n = dst->points;
    const T* x = src->data;
    T* d = dst->data;
    if (!src_complex) {
        for (int64_t i = 0; i < n; ++i) d[i] = sqrt_real<V>(x[i]);
    } else {
        for (int64_t i = 0; i < n; ++i) {
            const Cx<T> r = sqrt_pair<V>(x[2 * i], x[2 * i + 1]);
            d[2 * i] = r.re;
            d[2 * i + 1] = r.im;
        }
    }
    return 0;
}

template <VlxVector V>
int32_t ptor(V* v) {
    using T = real_t<V>;
    if (!v->complex) return 0;
    return inplace::map_both(v, [](T x) { return x; }, [](T a, T b) {
        return Cx<T>{a * own_cos(b), a * own_sin(b)};
    });
}

template <VlxVector V>
int32_t addcos(V* v, uint32_t flags, real_t<V> freq, real_t<V> amp, real_t<V> phase) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n < 1) return 0;
    // one angle per sample, multiplied in this order
    const T step = v->delta * T(2) * family<V>::pi * freq;
    const T cs = own_cos(step);
    const T sn = own_sin(step);
    const bool with_sine = v->complex && (flags & 1u);
    const int64_t stride = v->complex ? 2 : 1;
    T* d = v->data;
    // The rotation recurrence restarts from the math library every 256
    // samples, which bounds its drift.
    for (int64_t k0 = 0; k0 < n; k0 += 256) {
        const T angle = static_cast<T>(k0) * step + phase;
        T c, s;
        if constexpr (std::is_same_v<T, float>) {
            // the float twin restarts through double, reduced to one turn
            const double turn = std::fmod(static_cast<double>(angle), 6.283185307179586);
            c = static_cast<float>(cos64(turn));
            s = static_cast<float>(sin64(turn));
        } else {
            c = cos64(angle);
            s = sin64(angle);
        }
        const int64_t end = k0 + 256 < n ? k0 + 256 : n;
        for (int64_t k = k0; k < end; ++k) {
            d[stride * k] = d[stride * k] + amp * c;
            if (with_sine) d[2 * k + 1] = d[2 * k + 1] + amp * s;
            const T c2 = c * cs - s * sn;
            s = s * cs + c * sn;
            c = c2;
        }
    }
    return 0;
}

// erf, erfc, gamma and lgamma and their float names: one stub, kept in the
// interface on purpose, that does nothing and always fails.
int32_t not_implemented(const void*) {
    return -1;
}

#define VLX_INSTANTIATE(V)                                                      \
    template int32_t scale<V>(V*, real_t<V>);                                 \
    template int32_t offset<V>(V*, real_t<V>);                                \
    template int32_t cscale<V>(V*, real_t<V>, real_t<V>);                     \
    template int32_t neg<V>(V*);                                              \
    template int32_t abs_each<V>(V*);                                         \
    template int32_t conj<V>(V*);                                             \
    template int32_t timesi<V>(V*);                                           \
    template int32_t mag<V>(V*);                                              \
    template int32_t magsq<V>(V*);                                            \
    template int32_t square<V>(V*);                                           \
    template int32_t recip<V>(V*);                                            \
    template int32_t sqrt_each<V>(V*);                                        \
    template int32_t ptor<V>(V*);                                             \
    template int32_t addcos<V>(V*, uint32_t, real_t<V>, real_t<V>, real_t<V>); \
    template int32_t mag_to<V>(V*, V*);                                       \
    template int32_t magsq_to<V>(V*, V*);                                     \
    template int32_t sqrt_to<V>(V*, V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_scale(vlx_t* v, double s) { return vlx::scale(v, s); }
VLX_API int32_t vlxfi_scale(vlxf_t* v, float s) { return vlx::scale(v, s); }
VLX_API int32_t vlxi_offset(vlx_t* v, double c) { return vlx::offset(v, c); }
VLX_API int32_t vlxfi_offset(vlxf_t* v, float c) { return vlx::offset(v, c); }
VLX_API int32_t vlxi_cscale(vlx_t* v, double re, double im) { return vlx::cscale(v, re, im); }
VLX_API int32_t vlxfi_cscale(vlxf_t* v, float re, float im) { return vlx::cscale(v, re, im); }
VLX_API int32_t vlxi_neg(vlx_t* v) { return vlx::neg(v); }
VLX_API int32_t vlxfi_neg(vlxf_t* v) { return vlx::neg(v); }
VLX_API int32_t vlxi_abs(vlx_t* v) { return vlx::abs_each(v); }
VLX_API int32_t vlxfi_abs(vlxf_t* v) { return vlx::abs_each(v); }
VLX_API int32_t vlxi_conj(vlx_t* v) { return vlx::conj(v); }
VLX_API int32_t vlxfi_conj(vlxf_t* v) { return vlx::conj(v); }
VLX_API int32_t vlxi_timesi(vlx_t* v) { return vlx::timesi(v); }
VLX_API int32_t vlxfi_timesi(vlxf_t* v) { return vlx::timesi(v); }
VLX_API int32_t vlxi_mag(vlx_t* v) { return vlx::mag(v); }
VLX_API int32_t vlxfi_mag(vlxf_t* v) { return vlx::mag(v); }
VLX_API int32_t vlxi_magsq(vlx_t* v) { return vlx::magsq(v); }
VLX_API int32_t vlxfi_magsq(vlxf_t* v) { return vlx::magsq(v); }
VLX_API int32_t vlxi_square(vlx_t* v) { return vlx::square(v); }
VLX_API int32_t vlxfi_square(vlxf_t* v) { return vlx::square(v); }
VLX_API int32_t vlxi_recip(vlx_t* v) { return vlx::recip(v); }
VLX_API int32_t vlxfi_recip(vlxf_t* v) { return vlx::recip(v); }
VLX_API int32_t vlxi_sqrt(vlx_t* v) { return vlx::sqrt_each(v); }
VLX_API int32_t vlxfi_sqrt(vlxf_t* v) { return vlx::sqrt_each(v); }
VLX_API int32_t vlxi_ptor(vlx_t* v) { return vlx::ptor(v); }
VLX_API int32_t vlxfi_ptor(vlxf_t* v) { return vlx::ptor(v); }
VLX_API int32_t vlxi_addcos(vlx_t* v, uint32_t flags, double freq, double amp, double phase) { return vlx::addcos(v, flags, freq, amp, phase); }
VLX_API int32_t vlxfi_addcos(vlxf_t* v, uint32_t flags, float freq, float amp, float phase) { return vlx::addcos(v, flags, freq, amp, phase); }
VLX_API int32_t vlxi_erf(vlx_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxfi_erf(vlxf_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxi_erfc(vlx_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxfi_erfc(vlxf_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxi_gamma(vlx_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxfi_gamma(vlxf_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxi_lgamma(vlx_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxfi_lgamma(vlxf_t* v) { return vlx::not_implemented(v); }
VLX_API int32_t vlxu_mag(vlx_t* src, vlx_t* dst) { return vlx::mag_to(src, dst); }
VLX_API int32_t vlxfu_mag(vlxf_t* src, vlxf_t* dst) { return vlx::mag_to(src, dst); }
VLX_API int32_t vlxu_magsq(vlx_t* src, vlx_t* dst) { return vlx::magsq_to(src, dst); }
VLX_API int32_t vlxfu_magsq(vlxf_t* src, vlxf_t* dst) { return vlx::magsq_to(src, dst); }
VLX_API int32_t vlxu_sqrt(vlx_t* src, vlx_t* dst) { return vlx::sqrt_to(src, dst); }
VLX_API int32_t vlxfu_sqrt(vlxf_t* src, vlxf_t* dst) { return vlx::sqrt_to(src, dst); }
}
