// Straight-line fit of one vector: y against x = index * delta for a real
// vector, imaginary against real part for a complex one.  Both exports fill
// the same twenty-number record; the short form keeps slope and intercept.
#include "stats/stats.hpp"

namespace vlx {
namespace {

using stats::block_sums;
using stats::saturate;

template <VlxVector V>
struct regression_consts;
template <>
struct regression_consts<vlx_t> {
    static constexpr double third = 0.3333333333333333;
};
template <>
struct regression_consts<vlxf_t> {
    static constexpr float third = 0.33333334f;
};

template <class T>
T within_one(T x) {
    if (x > T(1)) return T(1);
    if (x < T(-1)) return T(-1);
    return x;
}

// One direction of the fit: the regression of b on a, with the means ma, mb,
// the variances va, vb, the covariance c and the correlation rho; writes the
// seven entries from out[0].
template <VlxVector V>
void fit_one_way(real_t<V>* out, real_t<V> ma, real_t<V> mb, real_t<V> va, real_t<V> vb, real_t<V> c,
                 real_t<V> rho, real_t<V> n, real_t<V> f) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    out[0] = va == T(0) ? bound : c * (T(1) / va);
    out[1] = va == T(0) ? bound : mb - (c * ma) * (T(1) / va);
    T resid = (T(1) - rho * rho) * vb;
    if (resid < T(0)) resid = T(0);
    out[2] = resid * f;
    const T g = va == T(0) ? bound : resid / (n * va);
    const T e = ma * ma + va;
    out[3] = g * f;
    out[4] = g * e * f;
    out[5] = -(g * ma * f);
    out[6] = e == T(0) ? T(0) : within_one((T(-1) / own_sqrt(e)) * ma);
}

// Fills the record vector (at least 20 points) from src.
template <VlxVector V>
int32_t regression_record(const V* src, V* record) {
    using T = real_t<V>;
    constexpr T bound = family<V>::bound;
    constexpr T third = regression_consts<V>::third;
    if (record->points < 20) return -1;
    T* out = record->data;
    const int64_t n = src->points > 0 ? src->points : 0;
    const T* s = src->data;
    const T d = src->delta == T(0) ? T(1) : src->delta;

    // Pivots near the means keep the sums of squares from cancelling.
    T px = T(0), py = T(0);
    T sums[5];  // Sx, Sy, Sxx, Sxy, Syy of the shifted values
    if (src->complex) {
        if (n > 0) {
            px = (s[2 * (n / 2)] + s[0] + s[2 * (n - 1)]) * third;
            py = (s[2 * (n / 2) + 1] + s[1] + s[2 * (n - 1) + 1]) * third;
        }
        block_sums<5, 2>(n, sums, [s, px, py](int64_t i, T(&a)[5]) {
            const T x = saturate(s[2 * i] - px, bound);
            const T y = saturate(s[2 * i + 1] - py, bound);
            a[0] += x;
            a[1] += y;
            a[2] += x * x;
            a[3] += x * y;
            a[4] += y * y;
        });
    } else {
        if (n > 0) {
            px = static_cast<T>(n - 1) * d * T(0.5);
            py = (s[n / 2] + s[0] + s[n - 1]) * third;
        }
        block_sums<5, 2>(n, sums, [s, d, px, py](int64_t i, T(&a)[5]) {
            // The abscissa counts from 0 in every block of 2048: a longer
            // vector is fitted against a sawtooth.  Settled, and kept.
            const T x = static_cast<T>(i % stats::block) * d - px;
            const T y = saturate(s[i] - py, bound);
            a[0] += x;
            a[1] += y;
            a[2] += x * x;
            a[3] += x * y;
            a[4] += y * y;
        });
    }

    for (int k = 0; k < 20; ++k) out[k] = T(0);
    if (n <= 1) {
        out[1] = out[15] = sums[1] + py;
        out[8] = out[14] = sums[0] + px;
        return 0;
    }
    const T r = T(1) / static_cast<T>(n);
    const T mx0 = r * sums[0];
    const T my0 = r * sums[1];
    const T mx = mx0 + px;
    const T my = my0 + py;
    T vx = r * sums[2] - mx0 * mx0;
    T vy = r * sums[4] - my0 * my0;
    const T c = r * sums[3] - mx0 * my0;
    if (vx < T(0)) vx = T(0);
    if (vy < T(0)) vy = T(0);
    const T nn = static_cast<T>(n);
    const T f = n >= 3 ? nn / static_cast<T>(n - 2) : T(0);
    const T h = nn / static_cast<T>(n - 1);
    const T rho = (vx == T(0) || vy == T(0)) ? T(0) : within_one(c / own_sqrt(vy * vx));
    fit_one_way<V>(out, mx, my, vx, vy, c, rho, nn, f);
    fit_one_way<V>(out + 7, my, mx, vy, vx, c, rho, nn, f);
    out[14] = mx;
    out[15] = my;
    out[16] = h * vx;
    out[17] = h * vy;
    out[18] = h * c;
    out[19] = rho;
    return 0;
}

// The record lives on the stack behind a vector that lends it.
template <VlxVector V>
struct LocalRecord {
    real_t<V> values[20];
    V v;
    int32_t fill(const V* src) {
        if (init(&v) < 0) return -1;
        v.data = values;
        v.points = 20;
        return regression_record(src, &v);
    }
};

}  // namespace

template <VlxVector V>
int32_t lin_regres(const V* src, V* dst) {
    LocalRecord<V> rec;
    if (rec.fill(src) < 0) return -1;
    // src is finished with, so dst may be src
    dst->points = 2;
    dst->complex = 0;
    if (alloc(dst) < 0) return -1;
    dst->data[0] = rec.values[0];
    dst->data[1] = rec.values[1];
    return 0;
}

template <VlxVector V>
int32_t lin_regres2(const V* src, V* dst) {
    LocalRecord<V> rec;
    if (rec.fill(src) < 0) return -1;
    dst->points = 20;
    dst->complex = 0;
    if (alloc(dst) < 0) return -1;
    // the copy brings the record's delta of 1 along
    return copy(dst, &rec.v);
}

template int32_t lin_regres<vlx_t>(const vlx_t*, vlx_t*);
template int32_t lin_regres<vlxf_t>(const vlxf_t*, vlxf_t*);
template int32_t lin_regres2<vlx_t>(const vlx_t*, vlx_t*);
template int32_t lin_regres2<vlxf_t>(const vlxf_t*, vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxs_lin_regres(const vlx_t* src, vlx_t* dst) { return vlx::lin_regres(src, dst); }
VLX_API int32_t vlxfs_lin_regres(const vlxf_t* src, vlxf_t* dst) { return vlx::lin_regres(src, dst); }
VLX_API int32_t vlxs_lin_regres2(const vlx_t* src, vlx_t* dst) { return vlx::lin_regres2(src, dst); }
VLX_API int32_t vlxfs_lin_regres2(const vlxf_t* src, vlxf_t* dst) { return vlx::lin_regres2(src, dst); }
}
