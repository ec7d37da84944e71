// All roots of a real polynomial: closed forms up to degree 5 that keep real
// roots real, search and deflation for any degree, and the expansion of a
// root list back into the monic polynomial.
#include "stats/stats.hpp"

#include "elementwise/elementwise.hpp"

namespace vlx {
namespace {

template <VlxVector V>
struct roots_consts;

template <>
struct roots_consts<vlx_t> {
    static constexpr double third_pi = 1.0471975511965976;
    static constexpr double sqrt3 = 1.7320508075688772;
    // how far below 0 a term of the quartic's factors may fall
    static constexpr double quartic_tolerance = -1.7763568394002505e-15;
};

template <>
struct roots_consts<vlxf_t> {
    static constexpr float third_pi = 1.0471975803375244f;
    static constexpr float sqrt3 = 1.7320507764816284f;
    static constexpr float quartic_tolerance = -9.5367431640625e-07f;
};

// The closed forms call the math library in double on widened values in both
// twins (wide_*), narrowing each result.

// x^2 a + x b + c into out: two ascending reals (returns false), or a
// conjugate pair re, im, re, -im with im below zero first (returns true).
template <class T>
bool quadratic(T a, T b, T c, T* out) {
    const T disc = b * b - (a * T(4)) * c;
    if (disc < T(0)) {
        const T w = wide_sqrt(-disc);
        const T s = T(1) / (a * T(2));
        const T re = -(s * b);
        const T im = s > T(0) ? s * (-w) : s * w;
        out[0] = re, out[1] = im, out[2] = re, out[3] = -im;
        return true;
    }
    // Sign chosen against b, so the smaller root escapes cancellation.
    const T w = wide_sqrt(disc);
    const T q = ((b > T(0) ? -w : w) - b) * T(0.5);
    const T r1 = q == T(0) ? c : c / q;
    const T r2 = q / a;
    if (r1 > r2) {
        out[0] = r2, out[1] = r1;
    } else {
        out[0] = r1, out[1] = r2;
    }
    return false;
}

// Roots of a[3] x^3 + ... + a[0] into out: three ascending reals (returns
// false), or the real root and a pair, as three complex points (true).
template <VlxVector V>
bool cubic(const real_t<V>* a, real_t<V>* out) {
    using T = real_t<V>;
    using K = roots_consts<V>;
    const T r = T(1) / a[3];
    const T A = a[2] * r / T(3), B = a[1] * r, c0 = a[0] * r * T(0.5);
    const T Q = B / T(3) - A * A;
    const T Q3 = Q * Q * Q;
    const T R = (B * T(0.5) - A * A) * A - c0;
    const T D = R * R + Q3;
    if (!(D > T(0))) {
        const T t = Q == T(0) ? T(0) : wide_acos(R / wide_sqrt(-Q3)) / T(3);
        const T m = wide_sqrt(-Q) * T(2);
        out[0] = -(wide_cos(t - K::third_pi) * m) - A;
        out[1] = -(wide_cos(t + K::third_pi) * m) - A;
        out[2] = wide_cos(t) * m - A;
        return false;
    }
    const T s = wide_sqrt(D);
    T u, v;
    if (R > T(0)) {
        const T w = s + R;
        u = w == T(0) ? T(0) : wide_exp(wide_log(w) / T(3));
        v = -(Q / u);
    } else {
        const T w = s - R;
        v = w == T(0) ? T(0) : -wide_exp(wide_log(w) / T(3));
        u = -(Q / v);
    }
    const T sum = v + u;
    const T diff = (v - u) * K::sqrt3 * T(0.5);
    out[0] = sum - A, out[1] = T(0);
    out[2] = sum * T(-0.5) - A, out[3] = diff;
    out[4] = sum * T(-0.5) - A, out[5] = -diff;
    return true;
}

// Ferrari's method through the resolvent cubic.  out takes four points:
// ascending reals (returns false), or complex with the real roots first.
template <VlxVector V>
bool quartic(const real_t<V>* a, real_t<V>* out) {
    using T = real_t<V>;
    const T r = T(1) / a[4];
    const T c3 = a[3] * r, c2 = a[2] * r, c1 = a[1] * r, c0 = a[0] * r;
    const T e = c3 * c3 * T(0.25) - c2;
    const T resolvent[4] = {T(-4) * c0 * e - c1 * c1, c3 * c1 - T(4) * c0, -c2, T(1)};
    T y3[6];
    const bool complex_resolvent = cubic<V>(resolvent, y3);
    constexpr T t0 = roots_consts<V>::quartic_tolerance;
    auto fits = [&](T y) { return !(y + e < t0) && !(y * y * T(0.25) - c0 < t0); };
    T y = y3[0];
    if (!complex_resolvent) {
        if (fits(y3[1]))
            y = y3[1];
        else if (fits(y3[2]))
            y = y3[2];
    }
    T f = y + e, g = y * y * T(0.25) - c0;
    if (f < T(0)) f = T(0);
    if (g < T(0)) g = T(0);
    T R = wide_sqrt(f);
    const T S = wide_sqrt(g), h = y * T(0.5);
    if (h * c3 - c1 < T(0)) R = -R;
    T k1;
    if (h < T(0) || c0 == T(0)) {
        k1 = h - S;
    } else {
        const T sh = S + h;
        k1 = sh == T(0) ? sh : c0 / sh;
    }
    T q1[4], q2[4];
    const bool x1 = quadratic(T(1), c3 * T(0.5) - R, k1, q1);
    const T k2 = k1 == T(0) ? S * T(2) : c0 / k1;
    const bool x2 = quadratic(T(1), R + c3 * T(0.5), k2, q2);
    if (!x1 && !x2) {
        int i = 0, j = 0;
        for (int o = 0; o < 4; ++o) out[o] = (j == 2 || (i < 2 && !(q2[j] < q1[i]))) ? q1[i++] : q2[j++];
        return false;
    }
    auto put = [out](int at, const T* from, bool as_pair) {
        if (as_pair) {
            for (int k = 0; k < 4; ++k) out[2 * at + k] = from[k];
        } else {
            out[2 * at] = from[0], out[2 * at + 1] = T(0);
            out[2 * at + 2] = from[1], out[2 * at + 3] = T(0);
        }
    };
    if (x1 && x2) {
        const bool first = q1[0] < q2[0] || (q1[0] == q2[0] && q1[1] < q2[1]);
        put(0, first ? q1 : q2, true);
        put(2, first ? q2 : q1, true);
    } else {
        // the real pair of roots first
        put(0, x1 ? q2 : q1, false);
        put(2, x1 ? q1 : q2, true);
    }
    return true;
}

// Synthetic division by (x - r), remainder dropped.
template <VlxVector V>
void deflate_linear(V* v, real_t<V> r) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n <= 0) return;
    T* a = v->data;
    T b = a[n - 1];
    for (int64_t k = n - 2; k >= 0; --k) {
        const T next = b * r + a[k];
        a[k] = b;
        b = next;
    }
    v->points = static_cast<int32_t>(n - 1);
}

// Division by x^2 - 2 re x + (re^2 + im^2), remainder dropped.  Each b[k] is
// written two places up, over the a[k+2] it has just used, and the quotient
// is moved down at the end.
template <VlxVector V>
void deflate_quadratic(V* v, real_t<V> re, real_t<V> im) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n <= 0) return;
    if (n < 3) {
        v->points = 0;
        return;
    }
    T* a = v->data;
    const T s = re * T(2), t = -(re * re + im * im);
    // b[n-3] = a[n-1] already sits at n - 1.
    if (n >= 4) a[n - 2] = a[n - 1] * s + a[n - 2];
    for (int64_t k = n - 5; k >= 0; --k) a[k + 2] = a[k + 4] * t + a[k + 3] * s + a[k + 2];
    for (int64_t k = 0; k < n - 2; ++k) a[k] = a[k + 2];
    v->points = static_cast<int32_t>(n - 2);
}

template <VlxVector V>
int32_t set_list(V* dst, int32_t points, int32_t is_complex) {
    dst->points = points;
    dst->complex = is_complex;
    return alloc(dst);
}

template <VlxVector V>
int32_t quintic(const V* src, V* dst) {
    using T = real_t<V>;
    if (set_list(dst, 5, 1) < 0) return -1;
    V local;
    init(&local);
    // A quintic always has a real root.
    if (psolve(src, &local, T(0)) != 0) {
        destroy(&local);
        return -1;
    }
    const T r = local.data[0];
    if (copy(&local, const_cast<V*>(src)) < 0) {
        destroy(&local);
        return -1;
    }
    deflate_linear(&local, r);
    const bool is_complex = quartic<V>(local.data, dst->data);
    destroy(&local);
    T* d = dst->data;
    dst->points = 5;
    if (!is_complex) {
        dst->complex = 0;
        d[4] = r;
        return sort(dst);
    }
    // r joins in ascending place among the real roots in front.
    int at = 0;
    if (d[1] == T(0) && !(d[0] > r)) at = d[2] > r ? 1 : 2;
    for (int k = 4; k > at; --k) d[2 * k] = d[2 * k - 2], d[2 * k + 1] = d[2 * k - 1];
    d[2 * at] = r, d[2 * at + 1] = T(0);
    dst->complex = 1;
    return 0;
}

template <VlxVector V>
int32_t proots_core(const V* src, V* dst) {
    using T = real_t<V>;
    if (src->complex) return -1;
    const int32_t n = src->points;
    if (n <= 1) {
        dst->points = 0;
        return 0;
    }
    if (n > 6) return -1;
    const T* a = src->data;
    int32_t top = n - 1;
    while (top > 0 && a[top] == T(0)) --top;
    switch (top) {
    case 5:
        return quintic(src, dst);
    case 4:
        if (set_list(dst, 4, 1) < 0) return -1;
        dst->complex = quartic<V>(a, dst->data) ? 1 : 0;
        return 0;
    case 3: {
        T out[6];
        const bool is_complex = cubic<V>(a, out);
        if (set_list(dst, 3, is_complex ? 1 : 0) < 0) return -1;
        for (int k = 0; k < (is_complex ? 6 : 3); ++k) dst->data[k] = out[k];
        return 0;
    }
    case 2: {
        T out[4];
        const bool is_complex = quadratic(a[2], a[1], a[0], out);
        if (set_list(dst, 2, is_complex ? 1 : 0) < 0) return -1;
        for (int k = 0; k < (is_complex ? 4 : 2); ++k) dst->data[k] = out[k];
        return 0;
    }
    case 1:
        if (set_list(dst, 1, 0) < 0) return -1;
        dst->data[0] = -(a[0] / a[1]);
        return 0;
    default:
        dst->points = 0;
        return 0;
    }
}

}  // namespace

template <VlxVector V>
int32_t proots(const V* src, V* dst) {
    if (src != dst) return proots_core(src, dst);
    V local;
    init(&local);
    const int32_t status = proots_core(src, &local);
    const int32_t copied = copy(dst, &local);
    const int32_t destroyed = destroy(&local);
    return (copied < 0 || destroyed < 0) ? -1 : status;
}

template <VlxVector V>
int32_t proots_inplace(V* v) {
    using T = real_t<V>;
    if (v->complex) return -1;
    int32_t top = v->points - 1;
    while (top >= 0 && v->data[top] == T(0)) --top;
    v->points = top + 1;
    if (v->points > 0) scale(v, T(1) / v->data[v->points - 1]);
    if (v->points < 2) {
        v->points = 0;
        return 0;
    }
    const int32_t degree = v->points - 1;
    // R and the work vector are left undestroyed on every way out: their
    // storage stays behind, as settled for this operation.
    V list, work;
    init(&list);
    init(&work);
    if (set_list(&list, degree, 1) < 0) return -1;
    T* out = list.data;
    int32_t filled = 0;
    while (filled < degree) {
        const int32_t status = pcsolve(static_cast<const V*>(v), &work, T(0), T(0));
        if (status < 0) return status;
        const T re = work.data[0], im = work.data[1];
        out[2 * filled] = re;
        // A pair needs two free places; with one left the root counts as real.
        if (work.complex && im != T(0) && degree - filled >= 2) {
            out[2 * filled + 1] = im;
            out[2 * filled + 2] = re;
            out[2 * filled + 3] = -im;
            filled += 2;
            deflate_quadratic(v, re, im);
        } else {
            out[2 * filled + 1] = T(0);
            filled += 1;
            deflate_linear(v, re);
        }
    }
    sort(&list);
    return copy(v, &list);
}

template <VlxVector V>
int32_t pztoc(V* v) {
    using T = real_t<V>;
    V o;
    init(&o);
    o.complex = v->complex;
    o.points = v->points < 0 ? 1 : v->points + 1;
    int32_t status = zero(&o);
    if (status == 0) {
        T* c = o.data;
        const int64_t top = o.points - 1;
        const int64_t roots = v->points < 0 ? 0 : v->points;
        c[0] = T(1);
        // Every coefficient is touched for every root, the zero ones too.
        for (int64_t i = 0; i < roots; ++i) {
            if (!o.complex) {
                const T nr = -v->data[i];
                for (int64_t k = top; k >= 1; --k) c[k] = c[k] * nr + c[k - 1];
                c[0] = c[0] * nr;
                continue;
            }
            const T nre = -v->data[2 * i], nim = -v->data[2 * i + 1];
            for (int64_t k = top; k >= 0; --k) {
                const T re = c[2 * k] * nre - c[2 * k + 1] * nim;
                const T im = c[2 * k] * nim + c[2 * k + 1] * nre;
                c[2 * k] = k >= 1 ? re + c[2 * k - 2] : re;
                c[2 * k + 1] = k >= 1 ? im + c[2 * k - 1] : im;
            }
        }
    }
    const int32_t copied = copy(v, &o);
    const int32_t destroyed = destroy(&o);
    if (copied < 0) return copied;
    if (destroyed < 0) return destroyed;
    return status;
}

#define VLX_INSTANTIATE(V)                                \
    template int32_t proots<V>(const V*, V*);             \
    template int32_t proots_inplace<V>(V*);               \
    template int32_t pztoc<V>(V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxs_proots(const vlx_t* s, vlx_t* d) { return vlx::proots(s, d); }
VLX_API int32_t vlxfs_proots(const vlxf_t* s, vlxf_t* d) { return vlx::proots(s, d); }
VLX_API int32_t vlxi_proots(vlx_t* v) { return vlx::proots_inplace(v); }
VLX_API int32_t vlxfi_proots(vlxf_t* v) { return vlx::proots_inplace(v); }
VLX_API int32_t vlxi_pztoc(vlx_t* v) { return vlx::pztoc(v); }
VLX_API int32_t vlxfi_pztoc(vlxf_t* v) { return vlx::pztoc(v); }
}
