// Polynomial evaluation and single-root search: Laguerre's step with Newton's
// as the alternative, inside layers of tolerance tests, bounds and restarts
// that keep the search sound on coefficients of very different sizes.  All
// evaluation runs on the coefficients in place; nothing is deflated here.
#include "stats/stats.hpp"

#include <cstring>

namespace vlx {
namespace {

using stats::beyond;

template <VlxVector V>
struct poly_consts;

template <>
struct poly_consts<vlx_t> {
    static constexpr double eps2 = 4.930380657631324e-32;
    static constexpr double eps2x64 = 3.1554436208840472e-30;
    static constexpr double four_eps = 8.881784197001252e-16;
    // taken for a square too large to form
    static constexpr double huge = 1e200;
};

template <>
struct poly_consts<vlxf_t> {
    static constexpr float eps2 = 1.4210854715202004e-14f;
    static constexpr float eps2x64 = 9.094947017729282e-13f;
    static constexpr float four_eps = 4.76837158203125e-07f;
    static constexpr float huge = 1e30f;
};

template <class T>
struct Cx {
    T re, im;
};

// The four-multiply product; both factors' pairings are symmetric, so the
// operand order does not change a bit.
template <class T>
inline Cx<T> mul(Cx<T> a, Cx<T> b) {
    return {a.re * b.re - a.im * b.im, a.re * b.im + a.im * b.re};
}

// a / b as a times the conjugate of b times 1/|b|^2.  A |b|^2 below the
// smallest normal takes BOUND as its reciprocal and 1.0 as b's real part, so
// that no division by zero happens and the result points somewhere sane.
template <VlxVector V>
inline Cx<real_t<V>> guarded_div(Cx<real_t<V>> a, Cx<real_t<V>> b) {
    using T = real_t<V>;
    const T m = b.re * b.re + b.im * b.im;
    T inv, bre;
    if (m < family<V>::tiny) {
        inv = family<V>::bound;
        bre = T(1);
    } else {
        inv = T(1) / m;
        bre = b.re;
    }
    return {(a.re * bre + a.im * b.im) * inv, (a.im * bre - a.re * b.im) * inv};
}

// Value and first derivative by synthetic division in one Horner pass.
template <VlxVector V>
inline void eval_real(const V* poly, real_t<V> x, real_t<V>& p, real_t<V>& dp) {
    using T = real_t<V>;
    const int64_t n = poly->points;
    const T* a = poly->data;
    if (n < 1) {
        p = dp = T(0);
        return;
    }
    p = a[n - 1];
    dp = T(0);
    for (int64_t k = n - 2; k >= 0; --k) {
        dp = dp * x + p;
        p = p * x + a[k];
    }
}

// The second derivative has its own pass on the coefficients k(k-1) a[k].
template <VlxVector V>
inline real_t<V> eval_second_real(const V* poly, real_t<V> x) {
    using T = real_t<V>;
    const int64_t n = poly->points;
    const T* a = poly->data;
    if (n < 3) return T(0);
    T pp = static_cast<T>((n - 1) * (n - 2)) * a[n - 1];
    for (int64_t k = n - 2; k >= 2; --k) pp = pp * x + static_cast<T>(k * (k - 1)) * a[k];
    return pp;
}

// The complex forms: complex z, real coefficients added to the real part.
template <VlxVector V>
inline void eval_complex(const V* poly, Cx<real_t<V>> z, Cx<real_t<V>>& p, Cx<real_t<V>>& dp) {
    using T = real_t<V>;
    const int64_t n = poly->points;
    const T* a = poly->data;
    if (n < 1) {
        p = dp = {T(0), T(0)};
        return;
    }
    p = {a[n - 1], T(0)};
    dp = {T(0), T(0)};
    for (int64_t k = n - 2; k >= 0; --k) {
        const Cx<T> d = mul(dp, z);
        dp = {d.re + p.re, d.im + p.im};
        const Cx<T> q = mul(p, z);
        p = {q.re + a[k], q.im};
    }
}

template <VlxVector V>
inline Cx<real_t<V>> eval_second_complex(const V* poly, Cx<real_t<V>> z) {
    using T = real_t<V>;
    const int64_t n = poly->points;
    const T* a = poly->data;
    if (n < 3) return {T(0), T(0)};
    Cx<T> pp = {static_cast<T>((n - 1) * (n - 2)) * a[n - 1], T(0)};
    for (int64_t k = n - 2; k >= 2; --k) {
        const Cx<T> q = mul(pp, z);
        pp = {q.re + static_cast<T>(k * (k - 1)) * a[k], q.im};
    }
    return pp;
}

// The same bits in both components.
template <class T>
inline bool same_point(Cx<T> a, Cx<T> b) {
    return std::memcmp(&a.re, &b.re, sizeof(T)) == 0 && std::memcmp(&a.im, &b.im, sizeof(T)) == 0;
}

// Tolerance of a search: spread * n * 0.25.
template <VlxVector V>
inline real_t<V> search_tolerance(const V* poly) {
    using T = real_t<V>;
    return coef_spread(poly) * static_cast<T>(poly->points) * T(0.25);
}

// Residual test of a real root; the exhausted search scales by the signed
// derivative, the converged one by its magnitude, and that difference stays.
template <VlxVector V>
inline bool real_residual_ok(const V* poly, real_t<V> y, real_t<V> limit, bool signed_scale) {
    using T = real_t<V>;
    T p, dp;
    eval_real(poly, y, p, dp);
    const T scale = signed_scale ? dp : std::fabs(dp);
    if (scale > T(1)) p = p / scale;
    return limit > std::fabs(p);
}

// The converged (or relaxed) end of a complex search: residual test against
// limit, then w is stored and classed real or complex by the same limit.
template <VlxVector V>
inline int32_t finish_complex(const V* poly, V* dst, Cx<real_t<V>> w, real_t<V> limit) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    Cx<T> p, dp;
    eval_complex(poly, w, p, dp);
    if (beyond(dp.re, bound) || beyond(dp.im, bound)) {
        p = {p.re / bound, p.im / bound};
    } else {
        const T m = own_sqrt(dp.re * dp.re + dp.im * dp.im);
        if (m > T(1)) p = {p.re / m, p.im / m};
    }
    if (!(limit > std::fabs(p.re) && limit > std::fabs(p.im))) return -1;
    dst->data[0] = w.re;
    dst->data[1] = w.im;
    const T inv = w.re == T(0) ? bound : T(1) / w.re;
    dst->complex = (poly->data[0] == T(0) || limit > std::fabs(w.im * inv)) ? 0 : 1;
    return 0;
}

// The bound of Lagrange on the positive roots of c(0..n-1), where c(k) is
// a[k] or, for the lower bound, the coefficients of p(-x).  Negating all of
// them changes no magnitude, so "opposite sign to the lead" covers both the
// polynomial and its negative.
template <VlxVector V, bool Lower>
real_t<V> lagrange_bound(const V* poly) {
    using T = real_t<V>;
    const int64_t n = poly->points;
    if (n < 1) return T(0);
    const T* a = poly->data;
    auto c = [&](int64_t k) { return (Lower && (k & 1)) ? -a[k] : a[k]; };
    int64_t top = n - 1;
    while (top >= 0 && c(top) == T(0)) --top;
    const T lead = top >= 0 ? c(top) : T(1);
    const bool positive = lead > T(0);
    int64_t k = 1;
    bool found = false;
    T b = T(0);
    for (int64_t j = top - 1; j >= 0; --j) {
        const T v = c(j);
        if (positive ? v < T(0) : v > T(0)) {
            if (!found) k = top - j;
            found = true;
            if (std::fabs(v) > b) b = std::fabs(v);
        }
    }
    // No opposite sign: b is 0, the logarithm -inf and the term 0.
    const T term = own_exp(own_log(b / std::fabs(lead)) * (T(1) / static_cast<T>(k)));
    return Lower ? T(-1) - term : term + T(1);
}

}  // namespace

template <VlxVector V>
int32_t peval(const V* src, V* dst, real_t<V> x) {
    using T = real_t<V>;
    if (src->complex) return -1;
    const int64_t n = src->points;
    const T* a = src->data;
    T value = T(0);
    if (n >= 1) {
        value = a[n - 1];
        for (int64_t k = n - 2; k >= 0; --k) value = value * x + a[k];
    }
    // Stored after the last read of src, so dst may be src.
    dst->points = 1;
    dst->complex = 0;
    if (alloc(dst) < 0) return -1;
    dst->data[0] = value;
    return 0;
}

template <VlxVector V>
real_t<V> coef_spread(const V* p) {
    using T = real_t<V>;
    const int64_t n = p->points;
    const T* a = p->data;
    T big = T(0);
    for (int64_t k = 0; k < n; ++k)
        if (std::fabs(a[k]) > big) big = std::fabs(a[k]);
    if (big == T(0)) return T(1);
    // Coefficients negligible against the largest do not count.
    const T floor = big * family<V>::eps;
    T small = family<V>::bound;
    for (int64_t k = 0; k < n; ++k) {
        const T m = std::fabs(a[k]);
        if (!(m < floor) && m < small) small = m;
    }
    return big / small;
}

template <VlxVector V>
real_t<V> laguerre_step_real(const V* poly, real_t<V> x) {
    using T = real_t<V>;
    const int64_t n = poly->points;
    if (n < 2) return T(0);
    T p, dp;
    eval_real(poly, x, p, dp);
    if (p == T(0)) return T(0);
    const T inv = T(1) / p;
    const T g = dp * inv;
    const T g2 = g * g;
    const T h = g2 - eval_second_real(poly, x) * inv;
    const T degree = static_cast<T>(n - 1), m = static_cast<T>(n - 2);
    const T d = (h * degree - g2) * m;
    T den = g;
    // A negative radicand drops the root instead of going complex.
    if (d > T(0)) {
        const T s = own_sqrt(d);
        den = g >= T(0) ? g + s : g - s;
    }
    return den != T(0) ? degree / den : family<V>::bound;
}

template <VlxVector V>
real_t<V> newton_step_real(const V* poly, real_t<V> x) {
    using T = real_t<V>;
    T p, dp;
    eval_real(poly, x, p, dp);
    return dp != T(0) ? p / dp : p * family<V>::bound;
}

template <VlxVector V>
int32_t root_iterate_real(const V* poly, real_t<V>* result, real_step_fn<V> step, real_t<V> x, real_t<V> lo,
                          real_t<V> hi) {
    using T = real_t<V>;
    constexpr T eps = family<V>::eps;
    const int64_t n = poly->points;
    if (n < 1) {
        *result = T(0);
        return 0;
    }
    const T tol = search_tolerance(poly);
    int64_t clamps = 0;
    T y = x, r = T(0);
    const int64_t rounds = 16 * n;
    for (int64_t i = 0; i < rounds; ++i) {
        T dx = step(poly, x);
        y = x - dx;
        // Each clamp after the first lands 1/128 of the span further inside,
        // which breaks a cycle against the bound.
        if (y > hi) {
            y = hi - (hi - lo) * static_cast<T>(clamps) * T(0.0078125);
            dx = x - y;
            ++clamps;
        } else if (y < lo) {
            y = lo + (hi - lo) * static_cast<T>(clamps) * T(0.0078125);
            dx = x - y;
            ++clamps;
        }
        r = y == T(0) ? dx * family<V>::bound : dx / y;
        if (std::fabs(r) < eps) {
            *result = y;
            return real_residual_ok(poly, y, tol * eps, false) ? 0 : -1;
        }
        x = y;
    }
    *result = y;
    if (!(static_cast<T>(n) * poly_consts<V>::four_eps > std::fabs(r))) return -1;
    return real_residual_ok(poly, y, T(4) * tol * eps, true) ? 0 : -1;
}

template <VlxVector V>
real_t<V> root_upper_bound(const V* p) {
    return lagrange_bound<V, false>(p);
}

template <VlxVector V>
real_t<V> root_lower_bound(const V* p) {
    return lagrange_bound<V, true>(p);
}

template <VlxVector V>
int32_t newton_step(const V* poly, real_t<V> re, real_t<V> im, real_t<V>* dz) {
    using T = real_t<V>;
    Cx<T> p, dp;
    eval_complex(poly, Cx<T>{re, im}, p, dp);
    const Cx<T> r = guarded_div<V>(p, dp);
    dz[0] = r.re;
    dz[1] = r.im;
    return 0;
}

template <VlxVector V>
int32_t laguerre_step(const V* poly, real_t<V> re, real_t<V> im, real_t<V>* dz) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = poly->points;
    dz[0] = dz[1] = T(0);
    if (n <= 1) return 0;
    const Cx<T> z{re, im};
    Cx<T> p, dp;
    eval_complex(poly, z, p, dp);
    // A root hit exactly: no movement.
    if (p.re == T(0) && p.im == T(0)) {
        dz[0] = p.re;
        dz[1] = p.im;
        return 0;
    }
    const Cx<T> u = guarded_div<V>(Cx<T>{T(1), T(0)}, p);
    const Cx<T> g = mul(dp, u);
    const Cx<T> g2 = mul(g, g);
    const Cx<T> hu = mul(eval_second_complex(poly, z), u);
    const T degree = static_cast<T>(n - 1), m = static_cast<T>(n - 2);
    const Cx<T> e{degree * (g2.re - hu.re), degree * (g2.im - hu.im)};
    const Cx<T> d{m * (e.re - g2.re), m * (e.im - g2.im)};
    const T radius = (beyond(d.re, bound) || beyond(d.im, bound)) ? bound : own_sqrt(d.re * d.re + d.im * d.im);
    const T angle = (d.re == T(0) && d.im == T(0)) ? T(0) : own_atan2(d.im, d.re) * T(0.5);
    const T sr = own_sqrt(radius);
    const Cx<T> s{sr * own_cos(angle), sr * own_sin(angle)};
    const Cx<T> plus{g.re + s.re, g.im + s.im}, minus{g.re - s.re, g.im - s.im};
    const T mp = plus.re * plus.re + plus.im * plus.im;
    const T mm = minus.re * minus.re + minus.im * minus.im;
    const Cx<T> den = mp > mm ? plus : minus;  // a tie takes G - s
    if (den.re == T(0) && den.im == T(0)) {
        dz[0] = dz[1] = bound;
        return 0;
    }
    const Cx<T> r = guarded_div<V>(Cx<T>{degree, T(0)}, den);
    dz[0] = r.re;
    dz[1] = r.im;
    return 0;
}

template <VlxVector V>
int32_t root_iterate(const V* poly, V* dst, complex_step_fn<V> step, real_t<V> re, real_t<V> im, int32_t relaxed) {
    using T = real_t<V>;
    using K = poly_consts<V>;
    constexpr T bound = family<V>::bound, eps = family<V>::eps;
    const int64_t n = poly->points;
    if (n < 1) {
        dst->complex = 0;
        dst->data[0] = T(0);
        return 0;
    }
    const T tol = search_tolerance(poly);
    T s = T(0);
    Cx<T> z{re, im}, w{re, im};
    const int64_t rounds = 20 * n, relative_rounds = 16 * n;
    // The library's own steps are pure functions of z.  Near a root that the
    // tests cannot accept, z often circles among a few points in the last
    // bits until the round limit; once z repeats a point of the last few
    // rounds, the rounds between repeat exactly, so whole cycles that stay
    // inside one kind of round are skipped.  Results are unchanged.
    const bool pure = step == &laguerre_step<V> || step == &newton_step<V>;
    constexpr int64_t history = 8;
    Cx<T> seen[history];
    int64_t seen_from = 0;
    for (int64_t i = 0; i < rounds; ++i) {
        if (pure) {
            for (int64_t period = 1; period <= history && i - period >= seen_from; ++period) {
                if (!same_point(seen[(i - period) % history], z)) continue;
                const int64_t end = i <= relative_rounds ? relative_rounds : (i - period >= relative_rounds ? rounds : i);
                const int64_t skip = (end - i) / period * period;
                i += skip;
                if (skip > 0) seen_from = i;
                break;
            }
            if (i >= rounds) break;
            seen[i % history] = z;
        }
        T dz[2];
        step(poly, z.re, z.im, dz);
        w = {z.re - dz[0], z.im - dz[1]};
        if (i < relative_rounds) {
            // Relative change, component by component.
            const T r_re = w.re == T(0) ? dz[0] * bound : dz[0] / w.re;
            const T r_im = w.im == T(0) ? dz[1] * bound : dz[1] / w.im;
            if (std::fabs(r_re) < eps && std::fabs(r_im) < eps) return finish_complex(poly, dst, w, tol * eps);
        } else {
            // Then the squared step against the squared point.
            s = (beyond(dz[0], bound) || beyond(dz[1], bound)) ? K::huge : dz[0] * dz[0] + dz[1] * dz[1];
            if (beyond(w.re, bound) || beyond(w.im, bound))
                s = s / K::huge;
            else if (w.re == T(0) && w.im == T(0))
                s = s * bound;
            else
                s = s / (w.re * w.re + w.im * w.im);
            if (s < K::eps2) return finish_complex(poly, dst, w, tol * eps);
        }
        z = w;
    }
    const T tn = static_cast<T>(n);
    const T limit = relaxed ? tn * eps : tn * tn * tn * K::eps2x64;
    if (!(limit > s)) return -1;
    return finish_complex(poly, dst, w, T(4) * tol * eps);
}

template <VlxVector V>
int32_t root_restarts(const V* poly, V* dst, complex_step_fn<V> step, real_t<V> re, real_t<V> im, int32_t relaxed) {
    using T = real_t<V>;
    // The float twin forms each product in double and narrows it before the
    // following addition.
    auto times = [](T x, double c) { return static_cast<T>(static_cast<double>(x) * c); };
    if (root_iterate(poly, dst, step, re, im, 0) == 0) return 0;
    const T re2 = times(re, 1.5) + T(1), im2 = times(im, 1.2) + T(1.2);
    if (root_iterate(poly, dst, step, re2, im2, 0) == 0) return 0;
    const T re3 = times(re2, -0.7444444444444445) - T(3), im3 = times(im2, -0.34444444444444444) - T(5);
    if (root_iterate(poly, dst, step, re3, im3, 0) == 0) return 0;
    // The last start swaps the components.
    if (root_iterate(poly, dst, step, im3, times(re3, 0.987654321), relaxed) == 0) return 0;
    return -1;
}

namespace {

template <VlxVector V>
int32_t psolve_core(const V* src, V* dst, real_t<V> x) {
    using T = real_t<V>;
    if (src->complex) return -1;
    dst->points = 1;
    dst->complex = 0;
    if (alloc(dst) < 0) return -1;
    dst->data[0] = T(0);
    const T lo = root_lower_bound(src), hi = root_upper_bound(src);
    const real_step_fn<V> steps[2] = {&laguerre_step_real<V>, &newton_step_real<V>};
    for (const real_step_fn<V> step : steps) {
        const T start = x < lo ? lo : (x > hi ? hi : x);
        const T starts[4] = {start, (lo + hi) * T(0.5), lo, hi};
        for (const T s : starts)
            if (root_iterate_real(src, dst->data, step, s, lo, hi) == 0) return 0;
    }
    return -1;  // dst holds the last iterate
}

template <VlxVector V>
int32_t pcsolve_core(const V* src, V* dst, real_t<V> re, real_t<V> im) {
    using T = real_t<V>;
    if (src->complex) return -1;
    dst->points = 1;
    dst->complex = 1;
    if (alloc(dst) < 0) return -1;
    dst->data[0] = dst->data[1] = T(0);
    if (root_restarts(src, dst, &laguerre_step<V>, re, im, 0) == 0) {
        const int32_t cls = dst->complex;
        const T root_re = dst->data[0], root_im = cls ? dst->data[1] : T(0);
        // Polish with Newton's step; a failed polish keeps Laguerre's root.
        if (root_restarts(src, dst, &newton_step<V>, root_re, root_im, 0) != 0) {
            dst->data[0] = root_re;
            dst->data[1] = root_im;
            dst->complex = cls;
        }
        return 0;
    }
    return root_restarts(src, dst, &newton_step<V>, re, im, 1) == 0 ? 0 : -1;
}

// The exported iteration layers size an empty dst for the one root they store.
template <VlxVector V>
int32_t sized_for_root(V* dst) {
    if (dst->data != nullptr) return 0;
    dst->points = 1;
    dst->complex = 1;
    return alloc(dst);
}

// dst equal to src: the search works into a fresh vector, copied over after.
template <VlxVector V, class Core>
int32_t through_local(const V* src, V* dst, Core core) {
    if (src != dst) return core(dst);
    V local;
    init(&local);
    const int32_t status = core(&local);
    const int32_t copied = copy(dst, &local);
    const int32_t destroyed = destroy(&local);
    return (copied < 0 || destroyed < 0) ? -1 : status;
}

}  // namespace

template <VlxVector V>
int32_t psolve(const V* src, V* dst, real_t<V> x) {
    return through_local(src, dst, [&](V* out) { return psolve_core(src, out, x); });
}

template <VlxVector V>
int32_t pcsolve(const V* src, V* dst, real_t<V> re, real_t<V> im) {
    return through_local(src, dst, [&](V* out) { return pcsolve_core(src, out, re, im); });
}

#define VLX_INSTANTIATE(V)                                                                                         \
    template int32_t peval<V>(const V*, V*, real_t<V>);                                                           \
    template int32_t psolve<V>(const V*, V*, real_t<V>);                                                          \
    template int32_t pcsolve<V>(const V*, V*, real_t<V>, real_t<V>);                                              \
    template real_t<V> coef_spread<V>(const V*);                                                                  \
    template real_t<V> laguerre_step_real<V>(const V*, real_t<V>);                                                \
    template real_t<V> newton_step_real<V>(const V*, real_t<V>);                                                  \
    template int32_t root_iterate_real<V>(const V*, real_t<V>*, real_step_fn<V>, real_t<V>, real_t<V>, real_t<V>); \
    template real_t<V> root_upper_bound<V>(const V*);                                                             \
    template real_t<V> root_lower_bound<V>(const V*);                                                             \
    template int32_t newton_step<V>(const V*, real_t<V>, real_t<V>, real_t<V>*);                                  \
    template int32_t laguerre_step<V>(const V*, real_t<V>, real_t<V>, real_t<V>*);                                \
    template int32_t root_iterate<V>(const V*, V*, complex_step_fn<V>, real_t<V>, real_t<V>, int32_t);            \
    template int32_t root_restarts<V>(const V*, V*, complex_step_fn<V>, real_t<V>, real_t<V>, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxs_peval(const vlx_t* s, vlx_t* d, double x) { return vlx::peval(s, d, x); }
VLX_API int32_t vlxfs_peval(const vlxf_t* s, vlxf_t* d, float x) { return vlx::peval(s, d, x); }
VLX_API int32_t vlxs_psolve(const vlx_t* s, vlx_t* d, double x) { return vlx::psolve(s, d, x); }
VLX_API int32_t vlxfs_psolve(const vlxf_t* s, vlxf_t* d, float x) { return vlx::psolve(s, d, x); }
VLX_API int32_t vlxs_pcsolve(const vlx_t* s, vlx_t* d, double re, double im) { return vlx::pcsolve(s, d, re, im); }
VLX_API int32_t vlxfs_pcsolve(const vlxf_t* s, vlxf_t* d, float re, float im) { return vlx::pcsolve(s, d, re, im); }

VLX_API double vlxs_coef_spread(const vlx_t* p) { return vlx::coef_spread(p); }
VLX_API float vlxfs_coef_spread(const vlxf_t* p) { return vlx::coef_spread(p); }
VLX_API double vlxs_laguerre_step_real(const vlx_t* p, double x) { return vlx::laguerre_step_real(p, x); }
VLX_API float vlxfs_laguerre_step_real(const vlxf_t* p, float x) { return vlx::laguerre_step_real(p, x); }
VLX_API double vlxs_newton_step_real(const vlx_t* p, double x) { return vlx::newton_step_real(p, x); }
VLX_API float vlxfs_newton_step_real(const vlxf_t* p, float x) { return vlx::newton_step_real(p, x); }
VLX_API int32_t vlxs_root_iterate_real(const vlx_t* p, double* result, vlx_root_step_real_t step, double x, double lo,
                                       double hi) {
    return vlx::root_iterate_real(p, result, step, x, lo, hi);
}
VLX_API int32_t vlxfs_root_iterate_real(const vlxf_t* p, float* result, vlxf_root_step_real_t step, float x, float lo,
                                        float hi) {
    return vlx::root_iterate_real(p, result, step, x, lo, hi);
}
VLX_API double vlxs_root_upper_bound(const vlx_t* p) { return vlx::root_upper_bound(p); }
VLX_API float vlxfs_root_upper_bound(const vlxf_t* p) { return vlx::root_upper_bound(p); }
VLX_API double vlxs_root_lower_bound(const vlx_t* p) { return vlx::root_lower_bound(p); }
VLX_API float vlxfs_root_lower_bound(const vlxf_t* p) { return vlx::root_lower_bound(p); }
VLX_API int32_t vlxs_newton_step(const vlx_t* p, double re, double im, double* dz) {
    return vlx::newton_step(p, re, im, dz);
}
VLX_API int32_t vlxfs_newton_step(const vlxf_t* p, float re, float im, float* dz) {
    return vlx::newton_step(p, re, im, dz);
}
VLX_API int32_t vlxs_laguerre_step(const vlx_t* p, double re, double im, double* dz) {
    return vlx::laguerre_step(p, re, im, dz);
}
VLX_API int32_t vlxfs_laguerre_step(const vlxf_t* p, float re, float im, float* dz) {
    return vlx::laguerre_step(p, re, im, dz);
}
VLX_API int32_t vlxs_root_iterate(const vlx_t* p, vlx_t* d, vlx_root_step_t step, double re, double im,
                                  int32_t relaxed) {
    return vlx::sized_for_root(d) < 0 ? -1 : vlx::root_iterate(p, d, step, re, im, relaxed);
}
VLX_API int32_t vlxfs_root_iterate(const vlxf_t* p, vlxf_t* d, vlxf_root_step_t step, float re, float im,
                                   int32_t relaxed) {
    return vlx::sized_for_root(d) < 0 ? -1 : vlx::root_iterate(p, d, step, re, im, relaxed);
}
VLX_API int32_t vlxs_root_restarts(const vlx_t* p, vlx_t* d, vlx_root_step_t step, double re, double im,
                                   int32_t relaxed) {
    return vlx::sized_for_root(d) < 0 ? -1 : vlx::root_restarts(p, d, step, re, im, relaxed);
}
VLX_API int32_t vlxfs_root_restarts(const vlxf_t* p, vlxf_t* d, vlxf_root_step_t step, float re, float im,
                                    int32_t relaxed) {
    return vlx::sized_for_root(d) < 0 ? -1 : vlx::root_restarts(p, d, step, re, im, relaxed);
}
}
