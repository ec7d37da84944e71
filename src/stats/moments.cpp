// Scalar statistics of a vector: sums, moments, means and extremes, each
// delivered as a one-point vector.
#include "stats/lanes_avx.hpp"
#include "stats/stats.hpp"

namespace vlx {
namespace {

using stats::block_sums;
using stats::beyond;
using stats::saturate;

// Constants of the moments that differ between the families.
template <VlxVector V>
struct moment_consts;

template <>
struct moment_consts<vlx_t> {
    static constexpr double third = 0.3333333333333333;
};

template <>
struct moment_consts<vlxf_t> {
    static constexpr float third = 0.33333334f;
};

// Writes the one-point result; the statistic is computed before this, so
// dst may be src.
template <VlxVector V>
int32_t put(V* dst, bool is_complex, real_t<V> re, real_t<V> im = real_t<V>(0)) {
    dst->points = 1;
    dst->complex = is_complex ? 1 : 0;
    if (alloc(dst) < 0) return -1;
    dst->data[0] = re;
    if (is_complex) dst->data[1] = im;
    return 0;
}

template <VlxVector V>
int64_t points_of(const V* v) {
    return v->points > 0 ? v->points : 0;
}

// Block sum of the scalars: re and im separately for a complex vector.
template <VlxVector V>
void plain_sums(const V* src, real_t<V> (&s)[2]) {
    using T = real_t<V>;
    const int64_t n = points_of(src);
    const T* x = src->data;
    if (src->complex) {
        block_sums<2, 4>(n, s, [x](int64_t i, T(&a)[2]) {
            a[0] += x[2 * i];
            a[1] += x[2 * i + 1];
        });
    } else {
        T one[1];
        block_sums<1, 8>(n, one, [x](int64_t i, T(&a)[1]) { a[0] += x[i]; });
        s[0] = one[0];
        s[1] = T(0);
    }
}

// Sum of squared magnitudes; a sample with a component beyond the bound adds
// exactly the bound.
template <VlxVector V>
real_t<V> magsq(const V* src) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = points_of(src);
    const T* x = src->data;
    T s[1];
    if (src->complex) {
        block_sums<1, 8>(n, s, [x](int64_t i, T(&a)[1]) {
            const T re = x[2 * i], im = x[2 * i + 1];
            a[0] += (beyond(re, bound) || beyond(im, bound)) ? bound : re * re + im * im;
        });
    } else {
        s[0] = T(0);
        int64_t start = 0;
#if VLX_STATS_AVX
        if constexpr (std::is_same_v<T, double>)
            if (stats::avx::available()) start = stats::avx::square_sums(x, n, bound, s);
#endif
        stats::block_sums_from<1, 8>(start, n, s, [x](int64_t i, T(&a)[1]) {
            const T v = x[i];
            a[0] += beyond(v, bound) ? bound : v * v;
        });
    }
    return s[0];
}

// Population variance about a pivot near the mean, so that the sum of
// squares does not cancel.  The pivot multiplies by the stored one third.
template <VlxVector V>
real_t<V> variance(const V* src) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = points_of(src);
    if (n < 1) return T(0);
    const T* x = src->data;
    const T r = T(1) / static_cast<T>(n);
    const int64_t mid = n / 2;
    if (src->complex) {
        const T pr = (x[2 * mid] + x[0] + x[2 * (n - 1)]) * moment_consts<V>::third;
        const T pi = (x[2 * mid + 1] + x[1] + x[2 * (n - 1) + 1]) * moment_consts<V>::third;
        T s[4];  // S1 re, S2 re, S1 im, S2 im
        block_sums<4, 2>(n, s, [x, pr, pi](int64_t i, T(&a)[4]) {
            const T dr = saturate(x[2 * i] - pr, bound);
            const T di = saturate(x[2 * i + 1] - pi, bound);
            a[0] += dr;
            a[1] += dr * dr;
            a[2] += di;
            a[3] += di * di;
        });
        const T m_re = r * s[0];
        const T m_im = r * s[2];
        return r * s[1] + r * s[3] - m_re * m_re - m_im * m_im;
    }
    const T p = (x[mid] + x[0] + x[n - 1]) * moment_consts<V>::third;
    T s[2] = {T(0), T(0)};
    int64_t start = 0;
#if VLX_STATS_AVX
    if constexpr (std::is_same_v<T, double>)
        if (stats::avx::available()) start = stats::avx::pivot_sums(x, n, p, bound, s);
#endif
    stats::block_sums_from<2, 4>(start, n, s, [x, p](int64_t i, T(&a)[2]) {
        const T d = saturate(x[i] - p, bound);
        a[0] += d;
        a[1] += d * d;
    });
    const T m = r * s[0];
    return r * s[1] - m * m;
}

// n / (n - 1) for the sample forms, 1 below two points.
template <class T>
T bessel(int64_t n) {
    return n >= 2 ? static_cast<T>(n) / static_cast<T>(n - 1) : T(1);
}

// Comparison value of a complex sample for the extremes: its power, or the
// bound when a component lies beyond it.
template <class T>
inline T extreme_power(T re, T im, T bound) {
    return (beyond(re, bound) || beyond(im, bound)) ? bound : re * re + im * im;
}

}  // namespace

template <VlxVector V>
int32_t sum(const V* src, V* dst) {
    real_t<V> s[2];
    plain_sums(src, s);
    return put(dst, src->complex != 0, s[0], s[1]);
}

template <VlxVector V>
int32_t mean(const V* src, V* dst) {
    using T = real_t<V>;
    T s[2];
    plain_sums(src, s);
    const int64_t n = points_of(src);
    if (n > 0) {
        // a multiplication by the stored reciprocal, not a division
        const T r = T(1) / static_cast<T>(n);
        s[0] = s[0] * r;
        s[1] = s[1] * r;
    }
    return put(dst, src->complex != 0, s[0], s[1]);
}

template <VlxVector V>
int32_t magsq_sum(const V* src, V* dst) {
    return put(dst, false, magsq(src));
}

template <VlxVector V>
int32_t rms(const V* src, V* dst) {
    using T = real_t<V>;
    T s = magsq(src);
    const int64_t n = points_of(src);
    if (n > 0) s = own_sqrt(s / static_cast<T>(n));
    return put(dst, false, s);
}

// A variance that rounds below zero stands: the standard deviation is then NaN.
template <VlxVector V>
int32_t pop_var(const V* src, V* dst) {
    return put(dst, false, variance(src));
}

template <VlxVector V>
int32_t samp_var(const V* src, V* dst) {
    using T = real_t<V>;
    T v = variance(src);
    const int64_t n = points_of(src);
    if (n >= 2) v = v * bessel<T>(n);
    return put(dst, false, v);
}

template <VlxVector V>
int32_t pop_stddev(const V* src, V* dst) {
    return put(dst, false, own_sqrt(variance(src)));
}

template <VlxVector V>
int32_t samp_stddev(const V* src, V* dst) {
    using T = real_t<V>;
    return put(dst, false, own_sqrt(variance(src) * bessel<T>(points_of(src))));
}

template <VlxVector V>
int32_t skew(const V* src, V* dst) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    if (src->complex) return -1;
    const int64_t n = points_of(src);
    if (n < 1) return put(dst, false, T(0));
    const T* x = src->data;
    // Here the pivot is a true division by 3, unlike the variance's.
    const T p = (x[n / 2] + x[0] + x[n - 1]) / T(3);
    T s[3];
    block_sums<3, 4>(n, s, [x, p](int64_t i, T(&a)[3]) {
        const T d = saturate(x[i] - p, bound);
        const T d2 = d * d;
        a[0] += d;
        a[1] += d2;
        a[2] += d2 * d;
    });
    const T tn = static_cast<T>(n);
    const T m1 = s[0] / tn, m2 = s[1] / tn, m3 = s[2] / tn;
    const T v = m2 - m1 * m1;
    const T t = m3 - T(3) * m2 * m1 + T(2) * m1 * (m1 * m1);
    // The single-precision twin takes this one root in double and narrows it.
    T root;
    if constexpr (std::is_same_v<T, float>)
        root = wide_sqrt(v);
    else
        root = own_sqrt(v);
    const T q = root * v;
    T result;
    if (q != T(0))  // a NaN counts as different from 0
        result = t / q;
    else if (t != T(0))
        result = bound;
    else
        result = T(0);
    return put(dst, false, result);
}

// Excess kurtosis.  A constant or empty vector gives -3: settled behaviour.
template <VlxVector V>
int32_t excess(const V* src, V* dst) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    if (src->complex) return -1;
    const int64_t n = points_of(src);
    if (n < 1) return put(dst, false, T(-3));
    const T* x = src->data;
    T s1[1];
    block_sums<1, 8>(n, s1, [x](int64_t i, T(&a)[1]) { a[0] += saturate(x[i], bound); });
    const T mu = s1[0] / static_cast<T>(n);
    T s[2];
    block_sums<2, 4>(n, s, [x, mu](int64_t i, T(&a)[2]) {
        const T d = saturate(x[i] - mu, bound);
        const T d2 = d * d;
        a[0] += d2;
        a[1] += d2 * d2;
    });
    const T r = T(1) / static_cast<T>(n);
    const T m4 = r * s[1], m2 = r * s[0];
    const T w = m2 * m2;
    T result;
    if (w != T(0))
        result = m4 / w - T(3);
    else if (m4 != T(0))
        result = bound;
    else
        result = T(-3);
    return put(dst, false, result);
}

// Geometric mean from the plain running product: it may overflow or
// underflow on long vectors, and a product below the smallest normal (every
// negative one included) gives 0.
template <VlxVector V>
int32_t gmean(const V* src, V* dst) {
    using T = real_t<V>;
    constexpr T tiny = family<V>::tiny;
    const int64_t n = points_of(src);
    const T* x = src->data;
    const T tn = static_cast<T>(n);
    if (src->complex) {
        T p = T(1), q = T(0);
        for (int64_t i = 0; i < n; ++i) {
            const T re = x[2 * i], im = x[2 * i + 1];
            const T np = p * re - q * im;
            const T nq = p * im + q * re;
            p = np;
            q = nq;
        }
        const T m = p * p + q * q;
        if (n == 0 || m < tiny) return put(dst, true, T(0), T(0));
        const T radius = own_exp(own_log(m) / (T(2) * tn));
        const T angle = own_atan2(q, p) / tn;
        return put(dst, true, radius * own_cos(angle), radius * own_sin(angle));
    }
    T p = T(1);
    for (int64_t i = 0; i < n; ++i) p = p * x[i];
    if (n == 0 || p < tiny) return put(dst, false, T(0));
    return put(dst, false, own_exp(own_log(p) / tn));
}

template <VlxVector V>
int32_t hmean(const V* src, V* dst) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = points_of(src);
    const T* x = src->data;
    const T tn = static_cast<T>(n);
    if (n < 1) return put(dst, src->complex != 0, T(0), T(0));
    if (src->complex) {
        // (A, D) is the sum of reciprocals; a zero sample is not special here.
        T s[2];
        block_sums<2, 4>(n, s, [x](int64_t i, T(&a)[2]) {
            const T re = saturate(x[2 * i], bound);
            const T im = saturate(x[2 * i + 1], bound);
            const T m = im * im + re * re;
            const T g = m <= T(0) ? bound : T(1) / m;
            a[0] += g * re;
            a[1] -= g * im;
        });
        const T A = s[0], D = s[1];
        const T M = D * D + A * A;
        const T h = M <= T(0) ? bound : T(1) / M;
        return put(dst, true, h * A * tn, -(h * D * tn));
    }
    // A sample exactly 0 makes the result 0 whatever else the vector holds.
    bool zero_seen = false;
    T s[1];
    block_sums<1, 8>(n, s, [x, &zero_seen](int64_t i, T(&a)[1]) {
        zero_seen |= x[i] == T(0);
        a[0] += T(1) / x[i];
    });
    if (zero_seen) return put(dst, false, T(0));
    // reciprocals that cancel to 0 give the bound
    return put(dst, false, s[0] != T(0) ? tn / s[0] : bound);
}

template <VlxVector V>
int32_t max(const V* src, V* dst) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = points_of(src);
    const T* x = src->data;
    if (n < 1) return put(dst, src->complex != 0, T(0), T(0));
    if (src->complex) {
        T best = -bound, re = T(0), im = T(0);
        for (int64_t i = 0; i < n; ++i) {
            const T c = extreme_power(x[2 * i], x[2 * i + 1], bound);
            if (c > best) {
                best = c;
                re = x[2 * i];
                im = x[2 * i + 1];
            }
        }
        return put(dst, true, re, im);
    }
    // Samples are not saturated; NaNs are passed over.
    T best = -bound;
    for (int64_t i = 0; i < n; ++i)
        if (x[i] > best) best = x[i];
    return put(dst, false, best);
}

template <VlxVector V>
int32_t min(const V* src, V* dst) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    const int64_t n = points_of(src);
    const T* x = src->data;
    if (n < 1) return put(dst, src->complex != 0, T(0), T(0));
    if (src->complex) {
        // Unlike the maximum's (0, 0), the chosen sample starts at
        // (bound, bound): a vector of huge or NaN samples gives that.  Kept.
        T best = bound, re = bound, im = bound;
        for (int64_t i = 0; i < n; ++i) {
            const T c = extreme_power(x[2 * i], x[2 * i + 1], bound);
            if (c < best) {
                best = c;
                re = x[2 * i];
                im = x[2 * i + 1];
            }
        }
        return put(dst, true, re, im);
    }
    T best = bound;
    for (int64_t i = 0; i < n; ++i)
        if (x[i] < best) best = x[i];
    return put(dst, false, best);
}

#define VLX_INSTANTIATE(V)                                 \
    template int32_t sum<V>(const V*, V*);                 \
    template int32_t mean<V>(const V*, V*);                \
    template int32_t magsq_sum<V>(const V*, V*);           \
    template int32_t rms<V>(const V*, V*);                 \
    template int32_t pop_var<V>(const V*, V*);             \
    template int32_t samp_var<V>(const V*, V*);            \
    template int32_t pop_stddev<V>(const V*, V*);          \
    template int32_t samp_stddev<V>(const V*, V*);         \
    template int32_t skew<V>(const V*, V*);                \
    template int32_t excess<V>(const V*, V*);              \
    template int32_t gmean<V>(const V*, V*);               \
    template int32_t hmean<V>(const V*, V*);               \
    template int32_t min<V>(const V*, V*);                 \
    template int32_t max<V>(const V*, V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxs_sum(const vlx_t* s, vlx_t* d) { return vlx::sum(s, d); }
VLX_API int32_t vlxfs_sum(const vlxf_t* s, vlxf_t* d) { return vlx::sum(s, d); }
VLX_API int32_t vlxs_mean(const vlx_t* s, vlx_t* d) { return vlx::mean(s, d); }
VLX_API int32_t vlxfs_mean(const vlxf_t* s, vlxf_t* d) { return vlx::mean(s, d); }
VLX_API int32_t vlxs_magsq_sum(const vlx_t* s, vlx_t* d) { return vlx::magsq_sum(s, d); }
VLX_API int32_t vlxfs_magsq_sum(const vlxf_t* s, vlxf_t* d) { return vlx::magsq_sum(s, d); }
VLX_API int32_t vlxs_rms(const vlx_t* s, vlx_t* d) { return vlx::rms(s, d); }
VLX_API int32_t vlxfs_rms(const vlxf_t* s, vlxf_t* d) { return vlx::rms(s, d); }
VLX_API int32_t vlxs_pop_var(const vlx_t* s, vlx_t* d) { return vlx::pop_var(s, d); }
VLX_API int32_t vlxfs_pop_var(const vlxf_t* s, vlxf_t* d) { return vlx::pop_var(s, d); }
VLX_API int32_t vlxs_samp_var(const vlx_t* s, vlx_t* d) { return vlx::samp_var(s, d); }
VLX_API int32_t vlxfs_samp_var(const vlxf_t* s, vlxf_t* d) { return vlx::samp_var(s, d); }
VLX_API int32_t vlxs_pop_stddev(const vlx_t* s, vlx_t* d) { return vlx::pop_stddev(s, d); }
VLX_API int32_t vlxfs_pop_stddev(const vlxf_t* s, vlxf_t* d) { return vlx::pop_stddev(s, d); }
VLX_API int32_t vlxs_samp_stddev(const vlx_t* s, vlx_t* d) { return vlx::samp_stddev(s, d); }
VLX_API int32_t vlxfs_samp_stddev(const vlxf_t* s, vlxf_t* d) { return vlx::samp_stddev(s, d); }
VLX_API int32_t vlxs_skew(const vlx_t* s, vlx_t* d) { return vlx::skew(s, d); }
VLX_API int32_t vlxfs_skew(const vlxf_t* s, vlxf_t* d) { return vlx::skew(s, d); }
VLX_API int32_t vlxs_excess(const vlx_t* s, vlx_t* d) { return vlx::excess(s, d); }
VLX_API int32_t vlxfs_excess(const vlxf_t* s, vlxf_t* d) { return vlx::excess(s, d); }
VLX_API int32_t vlxs_gmean(const vlx_t* s, vlx_t* d) { return vlx::gmean(s, d); }
VLX_API int32_t vlxfs_gmean(const vlxf_t* s, vlxf_t* d) { return vlx::gmean(s, d); }
VLX_API int32_t vlxs_hmean(const vlx_t* s, vlx_t* d) { return vlx::hmean(s, d); }
VLX_API int32_t vlxfs_hmean(const vlxf_t* s, vlxf_t* d) { return vlx::hmean(s, d); }
VLX_API int32_t vlxs_min(const vlx_t* s, vlx_t* d) { return vlx::min(s, d); }
VLX_API int32_t vlxfs_min(const vlxf_t* s, vlxf_t* d) { return vlx::min(s, d); }
VLX_API int32_t vlxs_max(const vlx_t* s, vlx_t* d) { return vlx::max(s, d); }
VLX_API int32_t vlxfs_max(const vlxf_t* s, vlxf_t* d) { return vlx::max(s, d); }
}
