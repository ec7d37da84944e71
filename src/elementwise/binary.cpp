// The two-operand family: sources a and b into dst, where dst may be either
// source.  Every member reads the sources' flags before preparing dst (which
// may overwrite a source's attributes) and the data pointers after (growing
// may move them).
#include "elementwise/elementwise.hpp"
#include "elementwise/simd.hpp"

#include <type_traits>

namespace vlx {
namespace {

template <class T>
struct Cx {
    T re, im;
};

// Runs an element operation over the four shapes of (a complex, b complex):
//   rr(x, y)              real with real, forward; with by_scalar also the
//                         scalars of complex with complex
//   cc(ar, ai, br, bi)    complex with complex, forward, pair loaded whole
//   cr(ar, ai, b)         complex with real
//   rc(a, br, bi)         real with complex
// The mixed shapes walk down from the last sample when dst overlaps a
// source: the result needs two scalars where the real source had one, and
// only that order lets dst be the real source without overwriting a scalar
// still to be read.  Apart from the sources the order cannot be seen, and the
// forward loop is the one that vectorises.
template <bool by_scalar, VlxVector V, class RR, class CC, class CR, class RC>
int32_t run_shapes(V* a, V* b, V* dst, RR rr, CC cc, CR cr, RC rc) {
    using T = real_t<V>;
    const bool ac = a->complex != 0;
    const bool bc = b->complex != 0;
    if (prepare_dest(a, b, dst) < 0) return -1;
    const int64_t n = dst->points;
    const T* x = a->data;
    const T* y = b->data;
    T* d = dst->data;
    if (!ac && !bc) {
        simd::dispatch([=]() VLX_INLINE_LOOP {
            for (int64_t i = 0; i < n; ++i) d[i] = rr(x[i], y[i]);
        });
    } else if (ac && bc) {
        if constexpr (by_scalar) {
            simd::dispatch([=]() VLX_INLINE_LOOP {
                for (int64_t i = 0; i < 2 * n; ++i) d[i] = rr(x[i], y[i]);
            });
        } else {
            simd::dispatch([=]() VLX_INLINE_LOOP {
                for (int64_t i = 0; i < n; ++i) {
                    const Cx<T> r = cc(x[2 * i], x[2 * i + 1], y[2 * i], y[2 * i + 1]);
                    d[2 * i] = r.re;
                    d[2 * i + 1] = r.im;
                }
            });
        }
    } else if (simd::overlaps(d, 2 * n, x, ac ? 2 * n : n) || simd::overlaps(d, 2 * n, y, bc ? 2 * n : n)) {
        if (ac) {
            for (int64_t i = n - 1; i >= 0; --i) {
                const Cx<T> r = cr(x[2 * i], x[2 * i + 1], y[i]);
                d[2 * i] = r.re;
                d[2 * i + 1] = r.im;
            }
        } else {
            for (int64_t i = n - 1; i >= 0; --i) {
                const Cx<T> r = rc(x[i], y[2 * i], y[2 * i + 1]);
                d[2 * i] = r.re;
                d[2 * i + 1] = r.im;
            }
        }
    } else {
        simd::dispatch([=]() VLX_INLINE_LOOP {
            for (int64_t i = 0; i < n; ++i) {
                const Cx<T> r = ac ? cr(x[2 * i], x[2 * i + 1], y[i]) : rc(x[i], y[2 * i], y[2 * i + 1]);
                d[2 * i] = r.re;
                d[2 * i + 1] = r.im;
            }
        });
    }
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t prepare_dest(V* a, V* b, V* dst) {
    using T = real_t<V>;
    const int32_t old_complex = dst->complex;
    if (a->points != b->points) return -1;
    const int32_t n = a->points;
    const bool same_data = dst->data == a->data || dst->data == b->data;
    dst->delta = (a->delta + b->delta) * T(0.5);
    dst->complex = (a->complex || b->complex) ? 1 : 0;
    dst->points = n;
    // A source's samples are kept; a separate destination's are not worth it.
    const int32_t r = same_data ? realloc(dst, n, old_complex) : alloc(dst);
    return r < 0 ? -1 : 0;
}

template <VlxVector V>
int32_t mul(V* a, V* b, V* dst) {
    using T = real_t<V>;
    return run_shapes<false>(
        a, b, dst, [](T x, T y) { return x * y; },
        [](T ar, T ai, T br, T bi) { return Cx<T>{br * ar - bi * ai, ai * br + bi * ar}; },
        [](T ar, T ai, T y) { return Cx<T>{ar * y, ai * y}; },
        [](T x, T br, T bi) { return Cx<T>{x * br, x * bi}; });
}

// The element loop of addition; needs equal points (vlxb_add_equal).
template <VlxVector V>
int32_t add_equal(V* a, V* b, V* dst) {
    using T = real_t<V>;
    return run_shapes<true>(
        a, b, dst, [](T x, T y) { return x + y; }, [](T, T, T, T) { return Cx<T>{}; },
        [](T ar, T ai, T y) { return Cx<T>{ar + y, ai}; }, [](T x, T br, T bi) { return Cx<T>{x + br, bi}; });
}

// The element loop of subtraction; needs equal points (vlxb_sub_equal).
template <VlxVector V>
int32_t sub_equal(V* a, V* b, V* dst) {
    using T = real_t<V>;
    return run_shapes<true>(
        a, b, dst, [](T x, T y) { return x - y; }, [](T, T, T, T) { return Cx<T>{}; },
        [](T ar, T ai, T y) { return Cx<T>{ar - y, ai}; },
        // -bi flips the sign bit, so +0.0 becomes -0.0
        [](T x, T br, T bi) { return Cx<T>{x - br, -bi}; });
}

template <VlxVector V>
int32_t add(V* a, V* b, V* dst) {
    if (a->points == b->points) return add_equal(a, b, dst);
    const bool a_shorter = a->points < b->points;
    V* shorter = a_shorter ? a : b;
    V* longer = a_shorter ? b : a;
    V tmp;
    int32_t r = init(&tmp);
    if (r < 0) return r;
    r = copy(&tmp, shorter);
    if (r < 0) return r;
    if (zpad(&tmp, longer->points) < 0) {
        const int32_t d = destroy(&tmp);
        return d < 0 ? d : -1;
    }
    r = a_shorter ? add_equal(&tmp, b, dst) : add_equal(a, &tmp, dst);
    const int32_t d = destroy(&tmp);
    return d < 0 ? d : r;
}

template <VlxVector V>
int32_t sub(V* a, V* b, V* dst) {
    if (a->points == b->points) return sub_equal(a, b, dst);
    const bool a_shorter = a->points < b->points;
    V* shorter = a_shorter ? a : b;
    V* longer = a_shorter ? b : a;
    V tmp;
    // Unlike add, a failed copy or padding returns at once and leaves the
    // temporary alone; the two have always differed here.
    int32_t r = init(&tmp);
    if (r < 0) return r;
    r = copy(&tmp, shorter);
    if (r < 0) return r;
    r = zpad(&tmp, longer->points);
    if (r < 0) return r;
    r = a_shorter ? sub_equal(&tmp, b, dst) : sub_equal(a, &tmp, dst);
    const int32_t d = destroy(&tmp);
    return d < 0 ? d : r;
}

template <VlxVector V>
int32_t conj_mul(V* a, V* b, V* dst) {
    using T = real_t<V>;
    if (!b->complex) return mul(a, b, dst);
    return run_shapes<false>(
        a, b, dst, [](T x, T y) { return x * y; },
        [](T ar, T ai, T br, T bi) { return Cx<T>{bi * ai + br * ar, ai * br - bi * ar}; },
        [](T ar, T ai, T y) { return Cx<T>{ar * y, ai * y}; },
        [](T x, T br, T bi) { return Cx<T>{x * br, -(x * bi)}; });
}

template <VlxVector V>
int32_t divide(V* a, V* b, V* dst) {
    using T = real_t<V>;
    // The substitute for a division by zero is positive whatever the signs.
    constexpr T big = family<V>::bound;
    return run_shapes<false>(
        a, b, dst,
        [](T x, T y) {
            if (y == T(0)) return x == T(0) ? T(0) : big;
            return x / y;
        },
        [](T ar, T ai, T br, T bi) {
            const T m = bi * bi + br * br;
            // An underflowing m counts as zero even when b is not exactly 0.
            if (T(0) >= m) {
                if (ar == T(0) && br == T(0) && ai == T(0) && bi == T(0)) return Cx<T>{T(0), T(0)};
                return Cx<T>{big, big};
            }
            const T r = T(1) / m;
            return Cx<T>{(bi * ai + br * ar) * r, (ai * br - bi * ar) * r};
        },
        [](T ar, T ai, T y) {
            if (y == T(0)) {
                if (ai == T(0) && ar == T(0)) return Cx<T>{T(0), T(0)};
                return Cx<T>{big, big};
            }
            const T r = T(1) / y;
            return Cx<T>{ar * r, ai * r};
        },
        [](T x, T br, T bi) {
            const T m = bi * bi + br * br;
            if (T(0) >= m) {
                if (x == T(0) && br == T(0) && bi == T(0)) return Cx<T>{T(0), T(0)};
                return Cx<T>{big, big};
            }
            const T r = T(1) / m;
            // The products with 0 are deliberate: an infinite or NaN part of b
            // reaches both parts of the result.
            const T zero = T(0);
            return Cx<T>{(br * x + bi * zero) * r, (br * zero - bi * x) * r};
        });
}

template <VlxVector V>
int32_t avg_add(V* a, V* b, V* dst, real_t<V> alpha) {
    using T = real_t<V>;
    return run_shapes<true>(
        a, b, dst, [alpha](T x, T y) { return (x - y) * alpha + y; }, [](T, T, T, T) { return Cx<T>{}; },
        [alpha](T ar, T ai, T y) { return Cx<T>{(ar - y) * alpha + y, alpha * ai}; },
        [alpha](T x, T br, T bi) { return Cx<T>{(x - br) * alpha + br, bi * (T(1) - alpha)}; });
}

namespace {

// Ranking value of a sample for max and min: the squared magnitude, or the
// limit itself once a part lies beyond it.  The limit is compared with parts
// but ranks on the squared scale, so (1e101, 0) ranks below (1e60, 0): kept
// as it has always been; it keeps the squares of sentinels from overflowing.
template <VlxVector V>
real_t<V> rank(real_t<V> re, real_t<V> im) {
    constexpr real_t<V> limit = family<V>::bound;
    if (re > limit || re < -limit || im > limit || im < -limit) return limit;
    return im * im + re * re;
}

// Picks whole samples: take_a(a, b) for real pairs, take_a_by_rank(ra, rb)
// as soon as either source is complex.  Ties and NaNs go to b.
template <VlxVector V, class Real, class Ranked>
int32_t pick(V* a, V* b, V* dst, Real take_a, Ranked take_a_by_rank) {
    using T = real_t<V>;
    const bool ac = a->complex != 0;
    const bool bc = b->complex != 0;
    if (prepare_dest(a, b, dst) < 0) return -1;
    const int64_t n = dst->points;
    const T* x = a->data;
    const T* y = b->data;
    T* d = dst->data;
    if (!ac && !bc) {
        for (int64_t i = 0; i < n; ++i) d[i] = take_a(x[i], y[i]) ? x[i] : y[i];
        return 0;
    }
    for (int64_t i = n - 1; i >= 0; --i) {
        const T ar = ac ? x[2 * i] : x[i];
        const T ai = ac ? x[2 * i + 1] : T(0);
        const T br = bc ? y[2 * i] : y[i];
        const T bi = bc ? y[2 * i + 1] : T(0);
        const bool use_a = take_a_by_rank(rank<V>(ar, ai), rank<V>(br, bi));
        d[2 * i] = use_a ? ar : br;
        d[2 * i + 1] = use_a ? ai : bi;
    }
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t maximum(V* a, V* b, V* dst) {
    using T = real_t<V>;
    return pick(a, b, dst, [](T x, T y) { return x > y; }, [](T ra, T rb) { return ra > rb; });
}

template <VlxVector V>
int32_t minimum(V* a, V* b, V* dst) {
    using T = real_t<V>;
    return pick(a, b, dst, [](T x, T y) { return x < y; }, [](T ra, T rb) { return rb > ra; });
}

namespace {

// Storage for a result of `points` that is not the sources' common length:
// keeps the old samples when dst shares a source's data.
template <VlxVector V>
int32_t grow_result(V* a, V* b, V* dst, int32_t n, int32_t old_complex) {
    if (dst->data == a->data || dst->data == b->data) return realloc(dst, n, old_complex);
    return alloc(dst);
}

}  // namespace

template <VlxVector V>
int32_t inter(V* a, V* b, V* dst) {
    using T = real_t<V>;
    if (a->points != b->points) return -1;
    const int32_t n = a->points;
    const bool ac = a->complex != 0;
    const bool bc = b->complex != 0;
    const int32_t old_complex = dst->complex;
    // the mean spacing, halved: twice the samples over the same span
    dst->delta = (a->delta + b->delta) * T(0.25);
    dst->complex = (ac || bc) ? 1 : 0;
    dst->points = 2 * n;
    if (grow_result(a, b, dst, n, old_complex) < 0) return -1;
    const T* x = a->data;
    const T* y = b->data;
    T* d = dst->data;
    if (!ac && !bc) {
        for (int64_t i = int64_t(n) - 1; i >= 0; --i) {
            const T xa = x[i];
            const T yb = y[i];
            d[2 * i + 1] = yb;
            d[2 * i] = xa;
        }
        return 0;
    }
    for (int64_t i = int64_t(n) - 1; i >= 0; --i) {
        const T ar = ac ? x[2 * i] : x[i];
        const T ai = ac ? x[2 * i + 1] : T(0);
        const T br = bc ? y[2 * i] : y[i];
        const T bi = bc ? y[2 * i + 1] : T(0);
        d[4 * i + 2] = br;
        d[4 * i + 3] = bi;
        d[4 * i] = ar;
        d[4 * i + 1] = ai;
    }
    return 0;
}

template <VlxVector V>
int32_t ritoc(V* re, V* im, V* dst) {
    using T = real_t<V>;
    if (re->complex || im->complex || re->points != im->points) return -1;
    const int32_t n = re->points;
    const int32_t old_points = dst->points;
    const int32_t old_complex = dst->complex;
    dst->delta = (re->delta + im->delta) * T(0.5);
    dst->complex = 1;
    dst->points = n;
    // Always the keeping form, source or not.
    if (realloc(dst, old_points, old_complex) < 0) return -1;
    const T* x = re->data;
    const T* y = im->data;
    T* d = dst->data;
    for (int64_t i = int64_t(n) - 1; i >= 0; --i) {
        const T r = x[i];
        const T j = y[i];
        d[2 * i + 1] = j;
        d[2 * i] = r;
    }
    return 0;
}

namespace {

// The convolution loops; dst must share no storage with a source
// (vlxb_pmul_into).
template <VlxVector V>
int32_t pmul_into(V* a, V* b, V* dst) {
    using T = real_t<V>;
    const bool ac = a->complex != 0;
    const bool bc = b->complex != 0;
    const int64_t na = a->points;
    const int64_t nb = b->points;
    dst->delta = (a->delta + b->delta) * T(0.5);
    dst->complex = (ac || bc) ? 1 : 0;
    dst->points = (na >= 1 && nb >= 1) ? static_cast<int32_t>(na + nb - 1) : 0;
    int32_t r = alloc(dst);
    if (r < 0) return r;
    r = zero(dst);
    if (r < 0) return r;
    const T* x = a->data;
    const T* y = b->data;
    T* d = dst->data;
    for (int64_t i = 0; i < na; ++i) {
        for (int64_t j = 0; j < nb; ++j) {
            const int64_t k = i + j;
            if (!ac && !bc) {
                d[k] = d[k] + x[i] * y[j];
            } else if (ac && bc) {
                const T ar = x[2 * i], ai = x[2 * i + 1], br = y[2 * j], bi = y[2 * j + 1];
                d[2 * k] = d[2 * k] + (br * ar - bi * ai);
                d[2 * k + 1] = d[2 * k + 1] + (ai * br + bi * ar);
            } else if (ac) {
                d[2 * k] = d[2 * k] + x[2 * i] * y[j];
                d[2 * k + 1] = d[2 * k + 1] + x[2 * i + 1] * y[j];
            } else {
                d[2 * k] = d[2 * k] + x[i] * y[2 * j];
                d[2 * k + 1] = d[2 * k + 1] + x[i] * y[2 * j + 1];
            }
        }
    }
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t pmul(V* a, V* b, V* dst) {
    if (dst->data != a->data && dst->data != b->data) return pmul_into(a, b, dst);
    V tmp;
    int32_t r = init(&tmp);
    if (r < 0) return r;
    const int32_t product = pmul_into(a, b, &tmp);
    const int32_t copied = copy(dst, &tmp);
    const int32_t destroyed = destroy(&tmp);
    if (destroyed < 0) return destroyed;
    if (copied < 0) return copied;
    return product;
}

template <VlxVector V>
int32_t dot(V* a, V* b, V* dst) {
    using T = real_t<V>;
    if (a->points != b->points) return -1;
    const int64_t n = a->points;
    const bool ac = a->complex != 0;
    const bool bc = b->complex != 0;
    const int32_t old_complex = dst->complex;
    // delta is left alone: a scalar result has no spacing
    dst->points = 1;
    dst->complex = (ac || bc) ? 1 : 0;
    if (grow_result(a, b, dst, static_cast<int32_t>(n), old_complex) < 0) return -1;
    const T* x = a->data;
    const T* y = b->data;
    T re = T(0), im = T(0);
    if (!ac && !bc) {
        // Running partial sums, one per lane, over the first multiple of the
        // lane count; the rounding therefore differs from left to right.
        constexpr int lanes = std::is_same_v<T, float> ? 8 : 4;
        const int64_t blocked = n - n % lanes;
        T part[lanes] = {};
        for (int64_t i = 0; i < blocked; i += lanes)
            for (int k = 0; k < lanes; ++k) part[k] = part[k] + x[i + k] * y[i + k];
        for (int k = 0; k < lanes; ++k) re = re + part[k];
        for (int64_t i = blocked; i < n; ++i) re = re + x[i] * y[i];
    } else if (ac && bc) {
        for (int64_t i = 0; i < n; ++i) {
            const T ar = x[2 * i], ai = x[2 * i + 1], br = y[2 * i], bi = y[2 * i + 1];
            re = re + (br * ar - bi * ai);
            im = im + (ai * br + bi * ar);
        }
    } else if (ac) {
        for (int64_t i = 0; i < n; ++i) {
            re = re + x[2 * i] * y[i];
            im = im + x[2 * i + 1] * y[i];
        }
    } else {
        for (int64_t i = 0; i < n; ++i) {
            re = re + x[i] * y[2 * i];
            im = im + x[i] * y[2 * i + 1];
        }
    }
    T* d = dst->data;
    d[0] = re;
    if (dst->complex) d[1] = im;
    return 0;
}

#define VLX_INSTANTIATE(V)                              \
    template int32_t prepare_dest<V>(V*, V*, V*);       \
    template int32_t add_equal<V>(V*, V*, V*);          \
    template int32_t sub_equal<V>(V*, V*, V*);          \
    template int32_t add<V>(V*, V*, V*);                \
    template int32_t sub<V>(V*, V*, V*);                \
    template int32_t mul<V>(V*, V*, V*);                \
    template int32_t conj_mul<V>(V*, V*, V*);           \
    template int32_t divide<V>(V*, V*, V*);             \
    template int32_t avg_add<V>(V*, V*, V*, real_t<V>); \
    template int32_t maximum<V>(V*, V*, V*);            \
    template int32_t minimum<V>(V*, V*, V*);            \
    template int32_t inter<V>(V*, V*, V*);              \
    template int32_t ritoc<V>(V*, V*, V*);              \
    template int32_t pmul<V>(V*, V*, V*);               \
    template int32_t dot<V>(V*, V*, V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxb_prepare_dest(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::prepare_dest(a, b, dst); }
VLX_API int32_t vlxfb_prepare_dest(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::prepare_dest(a, b, dst); }
VLX_API int32_t vlxb_add(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::add(a, b, dst); }
VLX_API int32_t vlxfb_add(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::add(a, b, dst); }
VLX_API int32_t vlxb_sub(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::sub(a, b, dst); }
VLX_API int32_t vlxfb_sub(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::sub(a, b, dst); }
VLX_API int32_t vlxb_mul(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::mul(a, b, dst); }
VLX_API int32_t vlxfb_mul(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::mul(a, b, dst); }
VLX_API int32_t vlxb_conj_mul(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::conj_mul(a, b, dst); }
VLX_API int32_t vlxfb_conj_mul(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::conj_mul(a, b, dst); }
VLX_API int32_t vlxb_div(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::divide(a, b, dst); }
VLX_API int32_t vlxfb_div(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::divide(a, b, dst); }
VLX_API int32_t vlxb_max(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::maximum(a, b, dst); }
VLX_API int32_t vlxfb_max(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::maximum(a, b, dst); }
VLX_API int32_t vlxb_min(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::minimum(a, b, dst); }
VLX_API int32_t vlxfb_min(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::minimum(a, b, dst); }
VLX_API int32_t vlxb_inter(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::inter(a, b, dst); }
VLX_API int32_t vlxfb_inter(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::inter(a, b, dst); }
VLX_API int32_t vlxb_ritoc(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::ritoc(a, b, dst); }
VLX_API int32_t vlxfb_ritoc(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::ritoc(a, b, dst); }
VLX_API int32_t vlxb_pmul(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::pmul(a, b, dst); }
VLX_API int32_t vlxfb_pmul(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::pmul(a, b, dst); }
VLX_API int32_t vlxb_avg_add(vlx_t* a, vlx_t* b, vlx_t* dst, double alpha) { return vlx::avg_add(a, b, dst, alpha); }
VLX_API int32_t vlxfb_avg_add(vlxf_t* a, vlxf_t* b, vlxf_t* dst, float alpha) { return vlx::avg_add(a, b, dst, alpha); }
VLX_API int32_t vlxbs_dot(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::dot(a, b, dst); }
VLX_API int32_t vlxfbs_dot(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::dot(a, b, dst); }
}
