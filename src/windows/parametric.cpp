// Windows with a real parameter: Kaiser, Gaussian, sinc lobe and Tukey.  Each
// is a catalogue form reached through the synthesis engine and a direct
// operation with the caller's parameter.  Unlike the cosine sums they take
// the symmetric flag, the shape FIR design needs.
#include "windows/windows.hpp"

#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"
#include "stats/stats.hpp"

#include <type_traits>

namespace vlx {
namespace {

// Constants of the parametric forms that differ between the families: the
// catalogue's parameters (float: rounded to nearest) and the Kaiser limits,
// 200 ln 10 and half of it for the rms mode, which squares the samples.
template <VlxVector V>
struct param_consts;

template <>
struct param_consts<vlx_t> {
    static constexpr double kaiser_limit = 460.51701859880916;
    static constexpr double kaiser_rms_limit = 230.25850929940458;
};

template <>
struct param_consts<vlxf_t> {
    static constexpr float kaiser_limit = 69.07755f;
    static constexpr float kaiser_rms_limit = 34.538776f;
};

constexpr double kaiser_betas[7] = {9.473960131326246,  10.751776690564654, 12.014077292090791, 13.264372446115681,
                                    14.505082414495599, 15.73795091271457,  11.9};
constexpr double gauss_sigmas[4] = {0.1583722, 0.1442161, 0.1328102, 0.13966480446927373};

// The two writing positions of a mirror form: lo walks down, hi walks up.
// A symmetric even window has no centre sample: its middle pair is h-1, h.
struct Mirror {
    int64_t lo;
    int64_t hi;
    template <class T>
    void put(T* x, T value) {
        x[lo--] = value;
        x[hi++] = value;
    }
};

// The normalisation of the Gaussian, sinc-lobe and Tukey forms: peak mode
// keeps the samples; mode 3 leaves the scale at 0 and zeroes the window.
template <VlxVector V>
int32_t normalise_measured(V* w, int32_t flags) {
    using T = real_t<V>;
    const int32_t mode = flags & wnorm_mask;
    if (mode == wnorm_peak) return 0;
    T s = T(0);
    if (mode == wnorm_mean || mode == wnorm_rms) {
        V r;
        init(&r);
        const int32_t st = mode == wnorm_mean ? mean(w, &r) : rms(w, &r);
        const T measured = st == 0 ? r.data[0] : T(0);
        destroy(&r);
        if (st != 0) return -1;
        s = T(1) / measured;
    }
    return scale(w, s);
}

// The frame of the direct operations: a temporary of v's points filled by
// the form, multiplied in, rotated unless VLX_WFLAG_NO_SWAP.  A failing step
// returns at once and leaves the temporary undestroyed: settled.
template <VlxVector V, class Fill>
int32_t apply_direct(V* v, int32_t flags, Fill fill) {
    V temp;
    if (init(&temp) != 0) return -1;
    temp.points = v->points;
    if (alloc(&temp) != 0) return -1;
    if (fill(&temp) != 0) return -1;
    temp.delta = v->delta;
    if (mul(v, &temp, v) != 0) return -1;
    if (!(flags & wflag_no_swap) && swap_halves2(v) != 0) return -1;
    return destroy(&temp) < 0 ? -1 : 0;
}

}  // namespace

template <VlxVector V>
real_t<V> catalogue_kaiser_beta(int32_t id) {
    using T = real_t<V>;
    if (id >= 14 && id <= 19) return static_cast<T>(kaiser_betas[id - 14]);
    if (id == 30) return static_cast<T>(kaiser_betas[6]);
    return T(0);
}

template <VlxVector V>
real_t<V> catalogue_gauss_sigma(int32_t id) {
    using T = real_t<V>;
    if (id >= 20 && id <= 22) return static_cast<T>(gauss_sigmas[id - 20]);
    if (id == 31) return static_cast<T>(gauss_sigmas[3]);
    return T(0);
}

template <VlxVector V>
int32_t kaiser_form(V* w, real_t<V> beta, int32_t flags, real_t<V> width) {
    using T = real_t<V>;
    if (w->complex) return -1;
    const int64_t n = w->points;
    if (n <= 0) return 0;
    T* x = w->data;
    if (n == 1) {
        x[0] = T(1);
        return 0;
    }
    const int32_t mode = flags & wnorm_mask;
    const T limit = mode == wnorm_rms ? param_consts<V>::kaiser_rms_limit : param_consts<V>::kaiser_limit;
    if (beta > limit || beta < -limit) beta = limit;

    const bool sym = (flags & wflag_symmetric) != 0;
    const bool se = sym && n % 2 == 0;
    const bool so = sym && n % 2 == 1;
    const bool has_width = (flags & wflag_width) != 0;
    if (se && has_width && width < T(1)) return -1;
    const int64_t h = n / 2;
    const int64_t half = (n - 1) / 2 - (so ? 1 : 0);

    T r;
    int64_t m;
    if (!has_width) {
        const T len = static_cast<T>(sym ? n - 1 : n);
        r = T(4) / (len * len);
        m = half;
    } else {
        if (!sym) {
            r = width == T(0) ? T(0) : T(4) / (width * width);
        } else if (width > T(1)) {
            const T d = width - T(1);
            r = T(4) / (d * d);
        } else {
            r = family<V>::bound;
        }
        m = floor_pts<V>(width) / 2 - (so ? 1 : 0);
        if (m > half) m = half;
        if (m < 0) m = 0;
    }
    auto k = [r, beta](T t) {
        const T a = T(1) - t * r * t;
        return besi0_kernel<V>(own_sqrt(a > T(0) ? a : T(0)) * beta);
    };

    T t;
    Mirror pos{h - 1, h};
    if (se) {
        t = T(0.5);
    } else {
        t = T(1);
        x[h] = besi0_kernel<V>(beta);
        pos.hi = h + 1;
    }
    for (int64_t j = 0; j < m; ++j, t += T(1)) pos.put(x, k(t));

    bool full = true;
    T e = T(1);  // exactly I0(0)
    if (has_width) {
        if (width > static_cast<T>(n))
            e = k(t);  // the vector cuts the window
        else if (!nearly_equal<V>(width, static_cast<T>(n)))
            full = false;
    }
    if (full) {
        if (sym) {
            x[pos.lo] = e;
            x[pos.hi] = e;
        } else if (n % 2 == 0) {
            x[0] = e;
        }
    } else {
        const int32_t f = floor_pts<V>(width);
        if (nearly_equal<V>(width, static_cast<T>(f)) && f % 2 == 0 && f != 0 && !sym) x[pos.hi - 1] = T(0);
        const bool extra = (se && f % 2 == 1) || (so && f >= 2);
        if (extra) pos.put(x, k(t));
        for (int64_t j = m; j < half; ++j) pos.put(x, T(0));
        if (!extra) {
            if (sym) {
                x[pos.lo] = T(0);
                x[pos.hi] = T(0);
            } else if (n % 2 == 0) {
                x[0] = T(0);
            }
        }
    }

    // Kaiser is the only form whose raw samples need a peak scaling; mode 3
    // acts as peak mode here.
    T s;
    if (mode == wnorm_mean || mode == wnorm_rms) {
        V res;
        init(&res);
        const int32_t st = mode == wnorm_mean ? mean(w, &res) : rms(w, &res);
        const T measured = st == 0 ? res.data[0] : T(0);
        destroy(&res);
        if (st != 0) return -1;
        s = T(1) / measured;
    } else {
        s = T(1) / (se ? besi0_kernel<V>(beta) : x[h]);
    }
    return scale(w, s);
}

template <VlxVector V>
int32_t gauss_form(V* w, real_t<V> sigma, int32_t flags, real_t<V> width) {
    using T = real_t<V>;
    if (w->complex) return -1;
    const int64_t n = w->points;
    if (n < 1) return 0;
    const bool se = (flags & wflag_symmetric) && n % 2 == 0;
    const bool has_width = (flags & wflag_width) != 0;
    if (se && has_width && width < T(1)) return -1;
    const int64_t h = n / 2;
    const int64_t m0 = (n - 1) / 2;
    T* x = w->data;

    if (sigma == T(0)) {
        if (zero(w) != 0) return -1;
        x[h] = T(1);
        if (se) x[h - 1] = T(1);
        return normalise_measured(w, flags);
    }
    T r;
    int64_t m;
    if (!has_width) {
        const T nn = static_cast<T>(n);
        r = T(-0.5) / (nn * nn * sigma * sigma);
        m = m0;
    } else {
        r = width == T(0) ? T(0) : T(-0.5) / (width * width * sigma * sigma);
        m = floor_pts<V>(width) / 2;
        if (m > m0) m = m0;
    }
    T t;
    Mirror pos{h - 1, h};
    if (se) {
        t = T(0.5);
    } else {
        t = T(1);
        x[h] = T(1);
        pos.hi = h + 1;
    }
    for (int64_t j = 0; j < m; ++j, t += T(1)) pos.put(x, own_exp(t * r * t));

    if (!has_width || width > static_cast<T>(n) || nearly_equal<V>(width, static_cast<T>(n))) {
        if (n % 2 == 0) {
            const T v = own_exp(t * r * t);
            x[0] = v;
            if (se) x[n - 1] = v;
        }
    } else {
        const int32_t f = floor_pts<V>(width);
        if (nearly_equal<V>(width, static_cast<T>(f)) && f % 2 == 0 && f != 0 && !(flags & wflag_symmetric))
            x[pos.hi - 1] = T(0);
        const bool extra = se && f % 2 == 1;
        if (extra) pos.put(x, own_exp(t * r * t));
        for (int64_t j = m; j < m0; ++j) pos.put(x, T(0));
        if (n % 2 == 0 && !extra) {
            x[0] = T(0);
            if (se) x[n - 1] = T(0);
        }
    }
    return normalise_measured(w, flags);
}

template <VlxVector V>
real_t<V> sinc_pow(real_t<V> a, real_t<V> p) {
    using T = real_t<V>;
    const T q = a == T(0) ? T(1) : own_sin(a) / a;
    if (q > T(0)) return own_exp(own_log(q) * p);
    // beyond the first zero only the powers with a real value keep a sample
    if (nearly_equal<V>(p, T(1))) return q;
    if (p == T(0)) return T(1);
    if (nearly_equal<V>(p, T(2))) return q * q;
    return T(0);
}

template <VlxVector V>
int32_t sinc_form(V* w, real_t<V> x_edge, real_t<V> power, int32_t flags) {
    using T = real_t<V>;
    if ((flags & wflag_width) || w->complex) return -1;
    const int64_t n = w->points;
    if (n < 1) return 0;
    const T step = x_edge * T(2) / static_cast<T>(n);
    const bool se = (flags & wflag_symmetric) && n % 2 == 0;
    const int64_t h = n / 2;
    T* x = w->data;
    T a;
    Mirror pos{h - 1, h};
    if (se) {
        a = step * T(0.5);
    } else {
        a = step;
        x[h] = T(1);
        pos.hi = h + 1;
    }
    // a plain running sum: the distances are exact multiples of step
    for (int64_t j = 0; j < (n - 1) / 2; ++j, a += step) pos.put(x, sinc_pow<V>(a, power));
    if (n % 2 == 0) {
        const T v = sinc_pow<V>(a, power);
        x[0] = v;
        if (se) x[n - 1] = v;
    }
    return normalise_measured(w, flags);
}

template <VlxVector V>
int32_t tukey_form(V* w, real_t<V> alpha, int32_t flags) {
    using T = real_t<V>;
    if (flags & wflag_width) return -1;
    const int64_t n = w->points;
    if (n < 1) return 0;
    if (w->complex) return -1;
    const bool se = (flags & wflag_symmetric) && n % 2 == 0;
    const T flat = (T(1) - alpha) * static_cast<T>(n) * T(0.5);
    const T span = static_cast<T>(n) * alpha;
    const T step = span == T(0) ? T(0) : family<V>::two_pi / span;
    auto g = [flat, step](T t) { return flat >= t ? T(1) : (own_cos((t - flat) * step) + T(1)) * T(0.5); };
    const int64_t h = n / 2;
    T* x = w->data;
    T t;
    Mirror pos{h - 1, h};
    if (se) {
        t = T(0.5);
    } else {
        t = T(1);
        x[h] = flat < T(0) ? (own_cos(-(step * flat)) + T(1)) * T(0.5) : T(1);
        pos.hi = h + 1;
    }
    for (int64_t j = 0; j < (n - 1) / 2; ++j, t += T(1)) pos.put(x, g(t));
    if (n % 2 == 0) {
        if (se) {
            const T v = g(t);
            x[0] = v;
            x[n - 1] = v;
        } else {
            // set by the test, not by the taper
            x[0] = alpha > T(0) ? T(0) : T(1);
        }
    }
    return normalise_measured(w, flags);
}

template <VlxVector V>
int32_t window_kaiser(V* v, real_t<V> beta, int32_t flags) {
    const real_t<V> width = static_cast<real_t<V>>(v->points);
    return apply_direct(v, flags, [=](V* w) { return kaiser_form(w, beta, flags, width); });
}

template <VlxVector V>
int32_t window_gauss(V* v, real_t<V> sigma, int32_t flags) {
    const real_t<V> width = static_cast<real_t<V>>(v->points);
    return apply_direct(v, flags, [=](V* w) { return gauss_form(w, sigma, flags, width); });
}

template <VlxVector V>
int32_t window_sinc(V* v, real_t<V> x, real_t<V> power, int32_t flags) {
    return apply_direct(v, flags, [=](V* w) { return sinc_form(w, x, power, flags); });
}

template <VlxVector V>
int32_t window_tukey(V* v, real_t<V> alpha, int32_t flags) {
    return apply_direct(v, flags, [=](V* w) { return tukey_form(w, alpha, flags); });
}

#define VLX_PARAMETRIC_INSTANCES(V)                                                           \
    template real_t<V> catalogue_kaiser_beta<V>(int32_t);                                     \
    template real_t<V> catalogue_gauss_sigma<V>(int32_t);                                     \
    template int32_t kaiser_form<V>(V*, real_t<V>, int32_t, real_t<V>);                       \
    template int32_t gauss_form<V>(V*, real_t<V>, int32_t, real_t<V>);                        \
    template int32_t sinc_form<V>(V*, real_t<V>, real_t<V>, int32_t);                         \
    template int32_t tukey_form<V>(V*, real_t<V>, int32_t);                                   \
    template real_t<V> sinc_pow<V>(real_t<V>, real_t<V>);                                     \
    template int32_t window_kaiser<V>(V*, real_t<V>, int32_t);                                \
    template int32_t window_gauss<V>(V*, real_t<V>, int32_t);                                 \
    template int32_t window_sinc<V>(V*, real_t<V>, real_t<V>, int32_t);                       \
    template int32_t window_tukey<V>(V*, real_t<V>, int32_t);
VLX_PARAMETRIC_INSTANCES(vlx_t)
VLX_PARAMETRIC_INSTANCES(vlxf_t)
#undef VLX_PARAMETRIC_INSTANCES

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_window_kaiser(vlx_t* v, double beta, int32_t flags) { return vlx::window_kaiser(v, beta, flags); }
VLX_API int32_t vlxfi_window_kaiser(vlxf_t* v, float beta, int32_t flags) { return vlx::window_kaiser(v, beta, flags); }
VLX_API int32_t vlxi_window_gauss(vlx_t* v, double sigma, int32_t flags) { return vlx::window_gauss(v, sigma, flags); }
VLX_API int32_t vlxfi_window_gauss(vlxf_t* v, float sigma, int32_t flags) { return vlx::window_gauss(v, sigma, flags); }
VLX_API int32_t vlxi_window_sinc(vlx_t* v, double x, double power, int32_t flags) { return vlx::window_sinc(v, x, power, flags); }
VLX_API int32_t vlxfi_window_sinc(vlxf_t* v, float x, float power, int32_t flags) { return vlx::window_sinc(v, x, power, flags); }
VLX_API int32_t vlxi_window_tukey(vlx_t* v, double alpha, int32_t flags) { return vlx::window_tukey(v, alpha, flags); }
VLX_API int32_t vlxfi_window_tukey(vlxf_t* v, float alpha, int32_t flags) { return vlx::window_tukey(v, alpha, flags); }
VLX_API double vlx_sinc_pow(double a, double p) { return vlx::sinc_pow<vlx_t>(a, p); }
VLX_API float vlxf_sinc_pow(float a, float p) { return vlx::sinc_pow<vlxf_t>(a, p); }
}
