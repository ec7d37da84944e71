// Interpolation of a tabulated function y(x) at query points xi, and the
// second derivatives of its cubic spline.  Queries are meant to ascend: the
// segment index only moves up, so a sweep costs O(n + m).
#include "design/design.hpp"
#include "elementwise/elementwise.hpp"
#include "stats/stats.hpp"

#include <cstdlib>

namespace vlx {
namespace {

template <VlxVector V>
struct spline_consts;
template <>
struct spline_consts<vlx_t> {
    static constexpr double sixth = 0.16666666666666666;
};
template <>
struct spline_consts<vlxf_t> {
    static constexpr float sixth = 0.16666667f;
};

template <class T>
T cube(T v) {
    return v * v * v;
}

// The one cubic through four points, for not-a-knot at both ends: its second
// derivative A x + Bc at each abscissa.  x is cubed as it stands, without a
// shift to the origin.
template <VlxVector V>
int32_t four_point_cubic(const real_t<V>* x, const real_t<V>* y, real_t<V>* out) {
    using T = real_t<V>;
    const T a = x[1] - x[0];
    const T b = x[2] - x[1];
    const T c = x[3] - x[2];
    if (a <= T(0) || b <= T(0) || c <= T(0)) return -1;
    const T p = cube(x[2]) - cube(x[1]);
    const T e = y[2] - y[1];
    const T u = b / a;
    const T v = c / b;
    const T f = e - (y[1] - y[0]) * u;
    const T d1 = p - (cube(x[1]) - cube(x[0])) * u;
    if (d1 == T(0)) return -1;
    const T r = T(1) / d1;
    const T g = (b + a) * b;
    const T w = (cube(x[3]) - cube(x[2]) - v * p) * r;
    const T d2 = (c + b) * c - w * g;
    if (d2 == T(0)) return -1;
    const T q = (y[3] - y[2] - v * e - w * f) / d2;
    const T slope = (f - q * g) * r * T(6);
    const T base = q * T(2);
    for (int i = 0; i < 4; ++i) out[i] = x[i] * slope + base;
    return 0;
}

// The five work arrays of the spline set-up, released together.
template <class T>
struct WorkArrays {
    T* h = nullptr;
    T* lower = nullptr;
    T* diag = nullptr;
    T* upper = nullptr;
    T* rhs = nullptr;
    bool take(int64_t n) {
        const size_t bytes = static_cast<size_t>(n) * sizeof(T);
        h = static_cast<T*>(std::malloc(bytes));
        lower = static_cast<T*>(std::malloc(bytes));
        diag = static_cast<T*>(std::malloc(bytes));
        upper = static_cast<T*>(std::malloc(bytes));
        rhs = static_cast<T*>(std::malloc(bytes));
        return h && lower && diag && upper && rhs;
    }
    ~WorkArrays() {
        std::free(h);
        std::free(lower);
        std::free(diag);
        std::free(upper);
        std::free(rhs);
    }
};

// Not-a-knot at an end: the node next to it stops being a knot, and its row
// asks the cubic spanning the two gaps to pass through y at that node.
// ha is the gap on the node's left, hb the one on its right; `near` is the
// neighbour on the side of the end, `far` the other one.
template <class T>
void not_a_knot_row(T ha, T hb, T y_node, T y_left, T y_right, T& coef_near, T& coef_far, T& rhs, bool at_start) {
    const T s = ha + hb;
    const T r = T(1) / s;
    const T a = hb * r;
    const T b = ha * r;
    const T a_coef = (a * a - T(1)) * a;
    const T b_coef = (b * b - T(1)) * b;
    coef_near = at_start ? a_coef : b_coef;
    coef_far = at_start ? b_coef : a_coef;
    const T mixed = at_start ? y_right * ha + hb * y_left : y_left * hb + y_right * ha;
    rhs = (y_node - mixed * r) * (r * T(6) * r);
}

}  // namespace

template <VlxVector V>
int32_t tridiagonal_solve(real_t<V>* lower, real_t<V>* diag, real_t<V>* upper, real_t<V>* rhs, real_t<V>* out,
                          int32_t m) {
    using T = real_t<V>;
    if (m < 1) return -1;
    // Elimination from the bottom row up, no pivoting and no test for a zero
    // pivot; then substitution downward.
    lower[0] = T(0);
    T g = T(1) / diag[m - 1];
    lower[m - 1] = lower[m - 1] * g;
    rhs[m - 1] = rhs[m - 1] * g;
    for (int64_t i = m - 2; i >= 0; --i) {
        const T d = diag[i] - upper[i] * lower[i + 1];
        g = T(1) / d;
        rhs[i] = (rhs[i] - upper[i] * rhs[i + 1]) * g;
        lower[i] = lower[i] * g;
    }
    out[0] = rhs[0];
    for (int64_t i = 1; i < m; ++i) out[i] = rhs[i] - lower[i] * out[i - 1];
    return 0;
}

template <VlxVector V>
int32_t cspline_2d(const V* x, V* y, V* y2, real_t<V> d0, real_t<V> dn, int32_t end0, int32_t endn) {
    using T = real_t<V>;
    if (x->complex || y->complex) return -1;
    if (prepare_dest(const_cast<V*>(x), y, y2) < 0) return -1;
    const int64_t n = y2->points;
    if (n < 4) return -1;
    const T* xs = x->data;
    T* ys = y->data;
    T* out = y2->data;
    // Both ends not-a-knot on four points would remove both interior knots.
    if (n == 4 && end0 == VLX_SPLINE_NOT_A_KNOT && endn == VLX_SPLINE_NOT_A_KNOT)
        return four_point_cubic<V>(xs, ys, out);

    WorkArrays<T> w;
    if (!w.take(n)) return -1;
    T* h = w.h;
    for (int64_t i = 1; i < n; ++i) {
        h[i] = xs[i] - xs[i - 1];
        if (h[i] <= T(0)) return -1;  // before y is touched
    }

    // Start row.  Not-a-knot folds node 1 away: row 1 then stands for node 0,
    // with y[1] and h[2] standing in for node 0 and the joined gap.
    if (end0 < 0 || end0 > 3) return -1;
    int64_t first = 0;
    const T ha0 = h[1], hb0 = h[2];
    const T y1_saved = ys[1];
    switch (end0) {
        case VLX_SPLINE_NOT_A_KNOT:
            not_a_knot_row(ha0, hb0, ys[1], ys[0], ys[2], w.diag[1], w.upper[1], w.rhs[1], true);
            h[2] = ha0 + hb0;
            ys[1] = ys[0];
            first = 1;
            break;
        case VLX_SPLINE_FIRST_DERIVATIVE:
            w.diag[0] = T(2);
            w.upper[0] = T(1);
            w.rhs[0] = ((ys[1] - ys[0]) / h[1] - d0) * (T(6) / h[1]);
            break;
        case VLX_SPLINE_SECOND_DERIVATIVE:
            w.diag[0] = T(1);
            w.upper[0] = T(0);
            w.rhs[0] = d0;
            break;
        default:  // natural
            w.diag[0] = T(1);
            w.upper[0] = T(0);
            w.rhs[0] = T(0);
            break;
    }

    // End row, the mirror image.  A bad endn leaves the start's change of y
    // in place; that is the settled behaviour.
    if (endn < 0 || endn > 3) return -1;
    int64_t last = n - 1;
    const T ha1 = h[n - 2], hb1 = h[n - 1];
    const T yn_saved = ys[n - 2];
    switch (endn) {
        case VLX_SPLINE_NOT_A_KNOT:
            not_a_knot_row(ha1, hb1, ys[n - 2], ys[n - 3], ys[n - 1], w.diag[n - 2], w.lower[n - 2], w.rhs[n - 2],
                           false);
            h[n - 2] = ha1 + hb1;
            ys[n - 2] = ys[n - 1];
            last = n - 2;
            break;
        case VLX_SPLINE_FIRST_DERIVATIVE:
            w.lower[n - 1] = T(1);
            w.diag[n - 1] = T(2);
            w.rhs[n - 1] = (dn - (ys[n - 1] - ys[n - 2]) / h[n - 1]) * (T(6) / h[n - 1]);
            break;
        case VLX_SPLINE_SECOND_DERIVATIVE:
            w.lower[n - 1] = T(0);
            w.diag[n - 1] = T(1);
            w.rhs[n - 1] = dn;
            break;
        default:  // natural
            w.lower[n - 1] = T(0);
            w.diag[n - 1] = T(1);
            w.rhs[n - 1] = T(0);
            break;
    }

    // Interior rows, each scaled by the reciprocal of its right gap so that
    // upper is 1.
    for (int64_t i = first + 1; i < last; ++i) {
        const T right = T(1) / h[i + 1];
        const T t = h[i] * right;
        w.lower[i] = t;
        w.diag[i] = (t + T(1)) * T(2);
        w.upper[i] = T(1);
        w.rhs[i] = ((ys[i + 1] - ys[i]) * right - (ys[i] - ys[i - 1]) * (T(1) / h[i])) * (right * T(6));
    }
    tridiagonal_solve<V>(w.lower + first, w.diag + first, w.upper + first, w.rhs + first, out + first,
                         static_cast<int32_t>(last - first + 1));

    // Across a removed knot the second derivative is linear.
    if (end0 == VLX_SPLINE_NOT_A_KNOT) {
        out[0] = out[1];
        ys[1] = y1_saved;
        h[2] = hb0;
        out[1] = (out[2] * ha0 + out[0] * hb0) / (ha0 + hb0);
    }
    if (endn == VLX_SPLINE_NOT_A_KNOT) {
        out[n - 1] = out[n - 2];
        ys[n - 2] = yn_saved;
        h[n - 2] = ha1;
        out[n - 2] = (out[n - 3] * hb1 + out[n - 1] * ha1) / (ha1 + hb1);
    }
    return 0;
}

namespace {

// The query loop of vlx_interp, on a table of two points or more.
template <VlxVector V>
int32_t interp_queries(const V* x, const V* y, const V* y2, const real_t<V>* q, real_t<V>* out, int64_t m,
                       int32_t method, bool hold) {
    using T = real_t<V>;
    const T* xs = x->data;
    const T* ys = y->data;
    const int64_t n = x->points;
    int64_t j = 0;
    int64_t k = 1;
    if (hold)
        while (j < m && xs[0] > q[j]) out[j++] = ys[0];  // a NaN query goes on to the method
    if (j == m) return 0;
    while (k < n - 1 && q[j] >= xs[k]) ++k;
    if (xs[k] - xs[k - 1] == T(0)) return -1;

    // Moves k up past the abscissas at or below t.  The checked form refuses
    // each gap of 0 as k reaches it, also one it only passes over.
    auto advance = [&](T t) {
        while (k < n - 1 && t >= xs[k]) ++k;
    };
    auto advance_checked = [&](T t) {
        while (k < n - 1 && t >= xs[k]) {
            ++k;
            if (xs[k] - xs[k - 1] == T(0)) return false;
        }
        return true;
    };

    T r_seg = T(0);
    switch (method) {
        case VLX_INTERP_STEP:
            // only the first gap is tested
            for (; j < m; ++j) {
                const T t = q[j];
                advance(t);
                if (t >= xs[k]) break;  // beyond the table, with or without held ends
                out[j] = ys[k - 1];
            }
            break;
        case VLX_INTERP_LINEAR:
            for (int64_t seg = 0; j < m; ++j) {
                const T t = q[j];
                if (!advance_checked(t)) return -1;
                if (hold && t >= xs[k]) break;
                // the reciprocal of a segment is the same for all its queries
                if (seg != k) {
                    seg = k;
                    r_seg = T(1) / (xs[k] - xs[k - 1]);
                }
                out[j] = ((xs[k] - t) * ys[k - 1] + (t - xs[k - 1]) * ys[k]) * r_seg;
            }
            break;
        case VLX_INTERP_QUADRATIC: {
            // k is the centre of the three points k-1, k, k+1, the one nearest the query.
            if (xs[k] - q[j] > q[j] - xs[k - 1] && k >= 2) --k;
            if (k >= n - 1) k = n - 2;
            T a, b, s, r;
            auto widths = [&]() {
                a = xs[k] - xs[k - 1];
                b = xs[k + 1] - xs[k];
                s = a + b;
                const T p = a * b * s;
                r = T(1) / p;
                return p != T(0);
            };
            if (!widths()) return -1;
            for (; j < m; ++j) {
                const T t = q[j];
                while (t - xs[k] > xs[k + 1] - t && k < n - 2) {
                    ++k;
                    if (!widths()) return -1;
                }
                if (t >= xs[k + 1] && hold) {
                    ++k;
                    break;
                }
                const T d = t - xs[k];
                const T u = a + d;
                const T v = d - b;
                // the Lagrange parabola on the one reciprocal
                out[j] = (ys[k - 1] * b * d * v - ys[k] * s * u * v + ys[k + 1] * a * u * d) * r;
            }
            break;
        }
        case VLX_INTERP_SPLINE: {
            const T* m2 = y2->data;
            T h = T(0);
            for (int64_t seg = 0; j < m; ++j) {
                const T t = q[j];
                if (!advance_checked(t)) return -1;
                if (seg != k) {
                    seg = k;
                    h = xs[k] - xs[k - 1];
                    r_seg = T(1) / h;
                }
                const T r = r_seg;
                if (hold && t >= xs[k]) break;
                const T A = xs[k] - t;
                const T B = t - xs[k - 1];
                out[j] = ((A * A * r - h) * A * m2[k - 1] + (B * B * r - h) * B * m2[k]) * spline_consts<V>::sixth +
                         (ys[k - 1] * A + ys[k] * B) * r;
            }
            break;
        }
        default:
            break;  // methods without a formula: everything takes the fill
    }
    // The fill: every query left takes the value at the segment's right end.
    for (; j < m; ++j) out[j] = ys[k];
    return 0;
}

template <VlxVector V>
int32_t interp_core(const V* x, const V* y, const V* y2, const V* xi, V* yi, int32_t flags) {
    using T = real_t<V>;
    if (x->complex || y->complex || xi->complex) return -1;
    if (x->points != y->points) return -1;
    const int64_t n = x->points;
    int32_t method = flags & 7;
    const bool hold = (flags & VLX_INTERP_HOLD_ENDS) != 0;
    // A parabola needs three points.
    if ((method & 3) == 3 && n <= 2) method = VLX_INTERP_LINEAR;
    if (method == VLX_INTERP_SPLINE && (y2 == nullptr || y2->complex || y2->points != n)) return -1;
    // yi may be xi: take its size and spacing first.
    const int32_t m = xi->points;
    const T spacing = xi->delta;
    yi->points = m;
    yi->complex = 0;
    yi->delta = spacing;
    if (alloc(yi) < 0) return -1;
    if (n < 1) return zero(yi);
    const T* q = xi->data;
    T* out = yi->data;
    if (n == 1) {
        if (method != VLX_INTERP_SPLINE) return line(yi, T(0), y->data[0]);
        const T curve = y2->data[0];
        const T base = y->data[0];
        const T x0 = x->data[0];
        for (int64_t j = 0; j < m; ++j) {
            const T d = q[j] - x0;
            out[j] = curve * T(0.5) * d * d + base;
        }
        return 0;
    }
    return interp_queries(x, y, y2, q, out, m, method, hold);
}

}  // namespace

template <VlxVector V>
int32_t interp(const V* x, V* y, const V* y2, const V* xi, V* yi, int32_t flags) {
    if ((flags & 7) != VLX_INTERP_SPLINE || y2 != nullptr) return interp_core(x, y, y2, xi, yi, flags);
    // No second derivatives given: a local set with not-a-knot ends.
    V local;
    init(&local);
    int32_t status = cspline_2d(x, y, &local, real_t<V>(0), real_t<V>(0), VLX_SPLINE_NOT_A_KNOT,
                                VLX_SPLINE_NOT_A_KNOT);
    if (status == 0) status = interp_core(x, y, &local, xi, yi, flags);
    const int32_t released = destroy(&local);
    return released < 0 ? released : status;
}

#define VLX_INSTANTIATE(V)                                                                                   \
    template int32_t tridiagonal_solve<V>(real_t<V>*, real_t<V>*, real_t<V>*, real_t<V>*, real_t<V>*, int32_t); \
    template int32_t cspline_2d<V>(const V*, V*, V*, real_t<V>, real_t<V>, int32_t, int32_t);                 \
    template int32_t interp<V>(const V*, V*, const V*, const V*, V*, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_interp(const vlx_t* x, vlx_t* y, const vlx_t* y2, const vlx_t* xi, vlx_t* yi, int32_t flags) {
    return vlx::interp(x, y, y2, xi, yi, flags);
}
VLX_API int32_t vlxf_interp(const vlxf_t* x, vlxf_t* y, const vlxf_t* y2, const vlxf_t* xi, vlxf_t* yi,
                            int32_t flags) {
    return vlx::interp(x, y, y2, xi, yi, flags);
}
VLX_API int32_t vlx_cspline(const vlx_t* x, vlx_t* y, const vlx_t* y2, const vlx_t* xi, vlx_t* yi) {
    return vlx::interp(x, y, y2, xi, yi, VLX_INTERP_SPLINE);
}
VLX_API int32_t vlxf_cspline(const vlxf_t* x, vlxf_t* y, const vlxf_t* y2, const vlxf_t* xi, vlxf_t* yi) {
    return vlx::interp(x, y, y2, xi, yi, VLX_INTERP_SPLINE);
}
VLX_API int32_t vlxb_cspline_2d(const vlx_t* x, vlx_t* y, vlx_t* y2, double d0, double dn, int32_t end0, int32_t endn) {
    return vlx::cspline_2d(x, y, y2, d0, dn, end0, endn);
}
VLX_API int32_t vlxfb_cspline_2d(const vlxf_t* x, vlxf_t* y, vlxf_t* y2, float d0, float dn, int32_t end0,
                                 int32_t endn) {
    return vlx::cspline_2d(x, y, y2, d0, dn, end0, endn);
}
VLX_API int32_t vlxb_tridiagonal_solve(double* lower, double* diag, double* upper, double* rhs, double* out,
                                       int32_t m) {
    return vlx::tridiagonal_solve<vlx_t>(lower, diag, upper, rhs, out, m);
}
VLX_API int32_t vlxfb_tridiagonal_solve(float* lower, float* diag, float* upper, float* rhs, float* out, int32_t m) {
    return vlx::tridiagonal_solve<vlxf_t>(lower, diag, upper, rhs, out, m);
}
}
