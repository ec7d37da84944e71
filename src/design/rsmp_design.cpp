// Resampling tables: a compact design expanded into one finely sampled,
// symmetric low-pass kernel.
#include "design/design.hpp"

#include "core/precise_math.hpp"

#include <cstdint>

namespace vlx {
namespace {

// The built-in designs: T, then the shape.  The single-precision tables are
// the double values rounded to nearest.
template <class T>
constexpr T design0[] = {T(8.0), T(0.03983447921), T(0.129570053212), T(0.156299536071), T(0.084178353573),
                         T(0.018708674012), T(0.001094282508)};

template <class T>
constexpr T design1[] = {T(13.0), T(0.05334388816061538), T(0.09948840661353847), T(-0.5523586150938461),
                         T(-0.96833591689), T(0.2909142788258462), T(1.1917464242612308), T(0.6030843760147693),
                         T(0.07212686520523076)};

template <class T>
constexpr T design2[] = {T(8.0), T(0.125), T(0.194117084888939), T(0.08883480823357748), T(0.022122753640933936),
                         T(0.002478902484869871), T(7.38484334237839e-05), T(3.371125058247346e-09),
                         T(3.74911427827312e-09), T(-1.594651940934445e-08), T(1.0611265319746411e-08),
                         T(3.180517033162374e-09)};

template <class T>
constexpr T design3[] = {T(10.0), T(0.09991966), T(0.200142671498), T(0.1999988799964), T(0.19426551865140002),
                         T(0.141105717886), T(0.054357881018), T(0.0078228941126), T(0.000164891239632)};

template <class T>
constexpr T design4[] = {T(13.0), T(0.07692307692307693), T(0.3636161165001), T(1.194489746221777),
                         T(1.8352454548154924), T(1.2924626750082309), T(0.41479959754854384),
                         T(0.05103747392790277), T(0.0012502776544880308), T(2.497434259574139e-07),
                         T(9.75489931959823e-07), T(-1.2434185763521924e-06), T(6.673599263884277e-07),
                         T(-1.6808751344240308e-07), T(-0.0), T(-2.7678818205989692e-08), T(2.860853976077846e-08),
                         T(1.031973871690523e-06), T(-1.1140819941422848e-06), T(3.1005813708163463e-07),
                         T(-6.28208788582543e-08), T(-6.033860749333631e-08), T(3.384014045762908e-07),
                         T(-1.0192138280526692e-06), T(3.994612820391208e-07), T(6.797387253493977e-07),
                         T(-2.800306660491323e-07), T(-0.0), T(2.937035867740869e-07), T(-7.924844322778462e-07),
                         T(-1.2840060784070462e-07), T(9.309088489915308e-07), T(-3.2972762414723e-07),
                         T(7.090212186165907e-08), T(3.566672978869454e-08), T(-3.217759142263339e-07),
                         T(3.115681380815085e-07), T(8.603243168804616e-07), T(-8.114130859620616e-07),
                         T(2.805783428091915e-08)};

template <class T, int32_t K>
constexpr int32_t count_of(const T (&)[K]) {
    return K;
}

enum class Shape { cosine_sum, cosine_polynomial };

// a0 + a1*cos(theta) + a2*cos(2 theta) + ..., each argument one more theta
// added to the last; the terms are summed in order.
template <class T>
T cosine_sum(const T* a, int32_t count, T theta) {
    T value = a[0];
    T arg = theta;
    for (int32_t k = 1; k < count; ++k) {
        value = value + a[k] * own_cos(arg);
        arg = arg + theta;
    }
    return value;
}

// a0 + a1*c + a2*c^2 + ... in c = cos(theta), by Horner's rule.
template <class T>
T cosine_polynomial(const T* a, int32_t count, T theta) {
    const T c = own_cos(theta);
    T value = a[count - 1];
    for (int32_t k = count - 2; k >= 0; --k) value = value * c + a[k];
    return value;
}

template <Shape shape, VlxVector V>
int32_t expand(V* v, const V* d) {
    using T = real_t<V>;
    if (alloc(v) != 0) return -1;
    const int32_t n = v->points;
    const int32_t K = d->points;
    if (n < 2 || K < 2) {
        if (zero(v) != 0) return -1;
        if (n >= 1 && K >= 1) v->data[0] = d->data[0];
        return 0;
    }
    if ((n & 1) != 0 || d->complex) return -1;

    const int32_t was_complex = v->complex;
    v->complex = 0;
    T* e = v->data;
    const T* coef = d->data;
    e[0] = coef[0];

    const int32_t half = (n - 2) / 2;
    const T step = n == 2 ? T(0) : family<V>::two_pi / static_cast<T>(n - 2);
    T* middle = e + 1 + half;
    // theta advances by addition, and each value fills both mirror entries
    T theta = T(0);
    for (int32_t i = 0; i <= half; ++i) {
        const T value = shape == Shape::cosine_sum ? cosine_sum(coef + 1, K - 1, theta)
                                                   : cosine_polynomial(coef + 1, K - 1, theta);
        middle[-i] = value;
        middle[i] = value;
        theta = theta + step;
    }

    if (was_complex && rtoc(v) != 0) return -1;
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t rsmp_cos(V* v, const V* d) {
    return expand<Shape::cosine_sum>(v, d);
}

template <VlxVector V>
int32_t rsmp_pcos(V* v, const V* d) {
    return expand<Shape::cosine_polynomial>(v, d);
}

template <VlxVector V>
int32_t rsmp(V* v, int32_t design) {
    using T = real_t<V>;
    V descriptor;
    if (alloc(v) != 0 || init(&descriptor) != 0) return -1;
    if (static_cast<uint32_t>(design) > 4u) return -1;
    // The descriptor borrows a constant table (alloc stays 0), so it owns
    // nothing and is never destroyed; the expansion only reads it.
    const T* table = nullptr;
    switch (design) {
    case 0: table = design0<T>, descriptor.points = count_of(design0<T>); break;
    case 1: table = design1<T>, descriptor.points = count_of(design1<T>); break;
    case 2: table = design2<T>, descriptor.points = count_of(design2<T>); break;
    case 3: table = design3<T>, descriptor.points = count_of(design3<T>); break;
    default: table = design4<T>, descriptor.points = count_of(design4<T>); break;
    }
    descriptor.data = const_cast<T*>(table);
    return design <= 1 ? rsmp_pcos(v, &descriptor) : rsmp_cos(v, &descriptor);
}

#define VLX_INSTANTIATE(V)                          \
    template int32_t rsmp_cos<V>(V*, const V*);     \
    template int32_t rsmp_pcos<V>(V*, const V*);    \
    template int32_t rsmp<V>(V*, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxc_rsmp(vlx_t* v, int32_t design) { return vlx::rsmp(v, design); }
VLX_API int32_t vlxfc_rsmp(vlxf_t* v, int32_t design) { return vlx::rsmp(v, design); }
VLX_API int32_t vlxc_rsmp_cos(vlx_t* v, const vlx_t* d) { return vlx::rsmp_cos(v, d); }
VLX_API int32_t vlxfc_rsmp_cos(vlxf_t* v, const vlxf_t* d) { return vlx::rsmp_cos(v, d); }
VLX_API int32_t vlxc_rsmp_pcos(vlx_t* v, const vlx_t* d) { return vlx::rsmp_pcos(v, d); }
VLX_API int32_t vlxfc_rsmp_pcos(vlxf_t* v, const vlxf_t* d) { return vlx::rsmp_pcos(v, d); }
}
