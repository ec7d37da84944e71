// The two-operand family: sources a and b into dst, where dst may be either
// source.  Every member reads the sources' flags before preparing dst (which
// may overwrite a source's attributes) and the data pointers after (growing
// may move them).
#include "elementwise/elementwise.hpp"

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
//   cr(ar, ai, b)         complex with real, backward
//   rc(a, br, bi)         real with complex, backward
// The mixed shapes walk down from the last sample: the result needs two
// scalars where the real source had one, and only that order lets dst be the
// real source without overwriting a scalar still to be read.
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
        for (int64_t i = 0; i < n; ++i) d[i] = rr(x[i], y[i]);
    } else if (ac && bc) {
        if constexpr (by_scalar) {
            for (int64_t i = 0; i < 2 * n; ++i) d[i] = rr(x[i], y[i]);
        } else {
            for (int64_t i = 0; i < n; ++i) {
                const Cx<T> r = cc(x[2 * i], x[2 * i + 1], y[2 * i], y[2 * i + 1]);
                d[2 * i] = r.re;
                d[2 * i + 1] = r.im;
            }
        }
    } else if (ac) {
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

#define VLX_INSTANTIATE(V)                          \
    template int32_t prepare_dest<V>(V*, V*, V*); \
    template int32_t mul<V>(V*, V*, V*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxb_prepare_dest(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::prepare_dest(a, b, dst); }
VLX_API int32_t vlxfb_prepare_dest(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::prepare_dest(a, b, dst); }
VLX_API int32_t vlxb_mul(vlx_t* a, vlx_t* b, vlx_t* dst) { return vlx::mul(a, b, dst); }
VLX_API int32_t vlxfb_mul(vlxf_t* a, vlxf_t* b, vlxf_t* dst) { return vlx::mul(a, b, dst); }
}
