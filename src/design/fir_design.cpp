// FIR design: the ideal impulse responses of the standard filter types, and
// five fixed half-filter coefficient sets.
#include "design/design.hpp"

#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"
#include "stats/stats.hpp"
#include "windows/windows.hpp"

#include <cstdint>
#include <type_traits>

namespace vlx {
namespace {

// The threshold of the Hilbert and ramp kernels in each family.
template <VlxVector V>
struct fir_consts;

template <>
struct fir_consts<vlx_t> {
    // below this a*a the Hilbert kernel takes its limit -0.5
    static constexpr double tiny_square = 2.6645352591003757e-15;
};

template <>
struct fir_consts<vlxf_t> {
    static constexpr float tiny_square = 1.4305115e-06f;
};

constexpr double smoother_taps5[3] = {0.4243801, 0.4973406, 0.0782793};

template <class T>
inline T sinc_of(T a) {
    return a == T(0) ? T(1) : own_sin(a) / a;
}

// Walks the taps in pairs outward from the middle: for odd n the pairs
// (h-k, h+k) at distance k = 1 .. h, for even n (h-1-k, h+k) at k + 0.5.
// The argument a starts at one step, or half a step for an even n, and
// advances by repeated addition.  pair(a, lo, hi) writes both taps.
template <class T, class Pair>
void pairs_outward(int64_t n, T step, Pair pair) {
    const int64_t h = n / 2;
    int64_t lo = h - 1;
    int64_t hi = n % 2 == 1 ? h + 1 : h;
    T a = n % 2 == 1 ? step : step * T(0.5);
    for (; lo >= 0; --lo, ++hi, a += step) pair(a, lo, hi);
}

template <VlxVector V>
int32_t low_pass(V* v, real_t<V> b) {
    using T = real_t<V>;
    T* x = v->data;
    const int64_t n = v->points;
    if (n % 2 == 1) x[n / 2] = b;
    pairs_outward<T>(n, family<V>::pi * b, [&](T a, int64_t lo, int64_t hi) { x[lo] = x[hi] = b * sinc_of(a); });
    return 0;
}

template <VlxVector V>
int32_t band_pass(V* v, real_t<V> fc, real_t<V> bw) {
    using T = real_t<V>;
    const T b = bw * T(0.5) * T(2);
    low_pass(v, b);
    // the carrier in a second pass, the odd centre doubled
    T* x = v->data;
    const int64_t n = v->points;
    if (n % 2 == 1) x[n / 2] = x[n / 2] * T(2);
    pairs_outward<T>(n, family<V>::two_pi * fc, [&](T a, int64_t lo, int64_t hi) {
        const T c = own_cos(a);
        x[lo] = x[lo] * c * T(2);
        x[hi] = x[hi] * c * T(2);
    });
    return 0;
}

// The complement of a response on an odd n: negated, 1 added to the centre.
template <VlxVector V>
int32_t complement(V* v) {
    if (neg(v) != 0) return -1;
    v->data[v->points / 2] += real_t<V>(1);
    return 0;
}

// Scales v to a sum of 1 through its mean; a zero mean leaves it alone.
template <VlxVector V>
int32_t unit_sum(V* v) {
    using T = real_t<V>;
    V temp;
    if (init(&temp) != 0) return -1;
    const int32_t st = mean(v, &temp);
    const T m = st == 0 ? temp.data[0] : T(0);
    if (destroy(&temp) < 0 || st != 0) return -1;
    if (m == T(0)) return 0;
    return scale(v, T(1) / (static_cast<T>(v->points) * m));
}

// Tap h is c0, taps h-k and h+k are c[k]/2: the frequency response is the
// window itself, and the taps add up to the table's sum.
template <VlxVector V>
int32_t direct_taps(V* v, const real_t<V>* c, int32_t count) {
    using T = real_t<V>;
    T* x = v->data;
    const int64_t h = v->points / 2;
    x[h] = c[0];
    for (int32_t k = 1; k < count; ++k) x[h - k] = x[h + k] = c[k] * T(0.5);
    return 0;
}

template <VlxVector V>
int32_t window_smoother(V* v, real_t<V> shape) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n < 1) return 0;
    T a = shape;
    if (a == T(0)) {
        int32_t count = 0;
        switch (n) {
        case 3: a = T(6.321022275); break;
        case 4: a = T(7.5194); break;
        case 5: {
            const T c[3] = {T(smoother_taps5[0]), T(smoother_taps5[1]), T(smoother_taps5[2])};
            return direct_taps(v, c, 3);
        }
        case 6: a = T(10.686); break;
        case 7: return direct_taps(v, window_table<V>(28, wnorm_peak, &count), 4);
        case 8: a = T(13.962); break;
        case 9: return direct_taps(v, window_table<V>(7, wnorm_peak, &count), 5);
        case 11: return direct_taps(v, window_table<V>(26, wnorm_peak, &count), 6);
        case 13: return direct_taps(v, window_table<V>(27, wnorm_peak, &count), 7);
        default:
            a = n % 2 == 0 ? static_cast<T>(n) * T(1.5707963267948966) + T(1.4)
                           : static_cast<T>(n + 1) * T(1.5707963267948966);
        }
    }
    const T a2 = a * a;
    const T d = a * T(4) / static_cast<T>(n + 1);
    T* x = v->data;
    if (n % 2 == 1) x[n / 2] = own_sinh(own_sqrt(a2));
    // no division by the root here, unlike the sinhc smoother
    pairs_outward<T>(n, d, [&](T c, int64_t lo, int64_t hi) {
        const T r = a2 - c * c * T(0.25);
        x[lo] = x[hi] = r <= T(0) ? own_sin(own_sqrt(-r)) : own_sinh(own_sqrt(r));
    });
    return unit_sum(v);
}

template <VlxVector V>
int32_t delayed_low_pass(V* v, real_t<V> fc, real_t<V> delay) {
    using T = real_t<V>;
    const int64_t n = v->points;
    constexpr T pi = family<V>::pi;
    T* x = v->data;
    T a = (static_cast<T>(1 - n) - delay * T(2)) * fc * pi;
    const T step = fc * T(2) * pi;
    for (int64_t k = 0; k < n; ++k, a += step) x[k] = sinc_of(a) * fc * T(2);
    return unit_sum(v);
}

// Antisymmetric kernels: tap h is 0 for odd n, the high side takes the
// value and the low side its negative.
template <VlxVector V, class Value>
int32_t antisymmetric(V* v, real_t<V> step, Value value) {
    using T = real_t<V>;
    T* x = v->data;
    const int64_t n = v->points;
    if (n % 2 == 1) x[n / 2] = T(0);
    pairs_outward<T>(n, step, [&](T a, int64_t lo, int64_t hi) {
        const T y = value(a);
        x[hi] = y;
        x[lo] = -y;
    });
    return 0;
}

// (cos a - 1)/a^2, or its limit -0.5 where a^2 is too small to divide by.
template <VlxVector V>
real_t<V> cos_kernel(real_t<V> a) {
    using T = real_t<V>;
    const T a2 = a * a;
    return a2 >= fir_consts<V>::tiny_square ? (own_cos(a) - T(1)) / a2 : T(-0.5);
}

template <VlxVector V>
int32_t gaussian(V* v, real_t<V> fc) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n < 1) return 0;
    const T nn = static_cast<T>(n);
    const T sigma = own_sqrt(own_log(T(2))) / (nn * T(2) * family<V>::pi * fc);
    if (gauss_form(v, sigma, 38, nn) != 0) return -1;
    return unit_sum(v);
}

template <VlxVector V>
int32_t sinhc_smoother(V* v, real_t<V> shape) {
    using T = real_t<V>;
    const int64_t n = v->points;
    if (n < 1) return 0;
    T a = shape;
    if (a == T(0)) {
        switch (n) {
        case 3: a = T(5.922377); break;
        case 5: a = T(9.4861669); break;
        case 7: a = T(12.56733); break;
        case 9: a = T(15.939169); break;
        case 11: a = T(19.10109); break;
        default: a = static_cast<T>(n) * T(1.610830415) + T(1.386795655);
        }
    }
    const T a2 = a * a;
    const T d = own_sqrt(a2 + T(9.869604401089358)) * T(4) / static_cast<T>(n + 1);
    T* x = v->data;
    if (n % 2 == 1) x[n / 2] = own_sinh(own_sqrt(a2)) / own_sqrt(a2);
    pairs_outward<T>(n, d, [&](T c, int64_t lo, int64_t hi) {
        const T q = a2 - c * c * T(0.25);
        T y;
        if (q <= T(0)) {
            const T r = own_sqrt(-q);
            y = r == T(0) ? T(1) : own_sin(r) / r;
        } else {
            y = own_sinh(own_sqrt(q)) / own_sqrt(q);
        }
        x[lo] = x[hi] = y;
    });
    return unit_sum(v);
}

template <VlxVector V>
int32_t fill(V* v, int32_t type, real_t<V> arg1, real_t<V> arg2) {
    using T = real_t<V>;
    const int64_t n = v->points;
    constexpr T pi = family<V>::pi;
    switch (type) {
    case 0: return band_pass(v, arg1, arg2);
    case 1:
        if (n % 2 == 0 || n < 1) return -1;
        band_pass(v, arg1, arg2);
        return complement(v);
    case 2:
        if (n % 2 == 0 || n < 1) return -1;
        low_pass(v, T(2) * arg1);
        return complement(v);
    case 3: return low_pass(v, T(2) * arg1);
    case 4: return window_smoother(v, arg1);
    case 5: return delayed_low_pass(v, arg1, arg2);
    case 6: {
        const T s = arg1 * T(2) * pi;
        return antisymmetric(v, s, [s, arg1](T a) {
            const T y = a != T(0) ? (own_cos(a) - own_sin(a) * (T(1) / a)) * (T(1) / a) : T(0);
            return y * s * arg1 * T(2);
        });
    }
    case 7: return gaussian(v, arg1);
    case 8:
        return antisymmetric(v, arg1 * T(2) * pi, [arg1](T a) { return a * arg1 * T(2) * cos_kernel<V>(a); });
    case 9: return sinhc_smoother(v, arg1);
    default: {  // 10: the ramp |f|
        const T b = arg1 * T(2);
        T* x = v->data;
        if (n % 2 == 1) x[n / 2] = b * b * T(0.5);
        pairs_outward<T>(n, b * pi, [&](T a, int64_t lo, int64_t hi) {
            x[lo] = x[hi] = (cos_kernel<V>(a) + sinc_of(a)) * b * b;
        });
        return 0;
    }
    }
}

// ---- fixed sets: first halves of symmetric filters ----

constexpr double set100[12] = {
    0.000652614993819046, 0.00161398511533566, 0.000548992786994134, 0.0116567216928761,
    -0.00562175791231776, 0.0468479126026349,  -0.0276748405838295,  0.135579125376994,
    -0.075108484786155,   0.303557392557081,   -0.139425088639288,   0.494746834127881};
constexpr double set101[20] = {
    0.000368132791542899, 0.000967915759393971, 0.000171001256853212, -0.00209709414433782,
    -0.00134559393257076, 0.00376444811111315,  0.00369259510337955,  -0.00616294219783637,
    -0.00824555590147736, 0.00885290712394496,  0.0157666480717501,   -0.0118857692786052,
    -0.0283982005099745,  0.014655079795871,    0.0502662469080564,   -0.0170833584807637,
    -0.0976221957445371,  0.0185823751149414,   0.315351886691414,    0.480803804305858};
constexpr double set102[5] = {0.002115989672005283, -0.007732946323003534, 0.0243458281985552,
                              -0.09624514305502549, 1.155032543014937};
constexpr double set103[38] = {
    3.4966046308112134e-05, 0.0, -8.890121427115801e-05, 0.0, 0.00019574075606263111, 0.0,
    -0.00037941992238659634, 0.0, 0.0006743054613047954, 0.0, -0.0011234971701612841, 0.0,
    0.0017798065780786922, 0.0, -0.0027071653817045084, 0.0, 0.003983060944529006, 0.0,
    -0.005703281106897204, 0.0, 0.00799127265142471, 0.0, -0.011016749698681258, 0.0,
    0.015033795818387062, 0.0, -0.020463247749472953, 0.0, 0.028087593320209617, 0.0,
    -0.03958276344724114, 0.0, 0.05932757336687017, 0.0, -0.10345023189044444, 0.0,
    0.3174166414983233, 0.5};
constexpr double set104[61] = {
    3.6454487960244565e-05, 0.0001537513446891243, 0.0001693323749245441, -9.373882191549228e-06,
    -0.0001884326864083242, -5.18141114687579e-05, 0.000241082763048832, 0.00016341703499248085,
    -0.00027306422156393164, -0.00032544926452729233, 0.00025308146408546824, 0.0005279816191202795,
    -0.0001523766651533557, -0.0007490218045535058, -5.4397723327145075e-05, 0.0009532763657598885,
    0.00038413318584999196, -0.0010928609864168351, -0.0008393819121803023, 0.0011104597426021205,
    0.0014028044995294852, -0.0009449128051053725, -0.002032938929358016, 0.000538903555582758,
    0.0026616546779816624, 0.00015088200291636826, -0.0031962049918726966, -0.0011450066618605317,
    0.0035216971352430857, 0.002429493390524192, -0.003510987328057193, -0.0039492493274246405,
    0.003034629668886771, 0.005602074944458008, -0.0019743350872259823, -0.007236605873164184,
    0.00023782095688292933, 0.008654524069594256, 0.0022273864077025965, -0.009616161666598635,
    -0.005422458995573242, 0.009847511707629238, 0.00928953756410821, -0.009045767732197231,
    -0.013709042376421378, 0.0068774468168195674, 0.018503016003339322, -0.002956872635039645,
    -0.023444472526980294, -0.003221105305500864, 0.02827291848716985, 0.012465226285960782,
    -0.032713443251692384, -0.02641324160296535, 0.03649894970700591, 0.04934134455502266,
    -0.039392583401070984, -0.0972166886732064, 0.04120820957656173, 0.31529745751057714,
    0.45817297763908715};

struct FixedSet {
    const double* taps;
    int32_t count;
};
constexpr FixedSet fixed_sets[5] = {{set100, 12}, {set101, 20}, {set102, 5}, {set103, 38}, {set104, 61}};

}  // namespace

template <VlxVector V>
int32_t fir_design(V* v, int32_t type, real_t<V> arg1, real_t<V> arg2) {
    if (alloc(v) != 0) return -1;
    const bool was_complex = v->complex != 0;
    v->complex = 0;
    if (static_cast<uint32_t>(type) > 10u) return -1;
    if (fill(v, type, arg1, arg2) < 0) return -1;
    if (was_complex && rtoc(v) != 0) return -1;
    return 0;
}

template <VlxVector V>
int32_t fir_design_set(V* v, int32_t set) {
    using T = real_t<V>;
    if (set < 100 || set > 104) return -1;
    const FixedSet& s = fixed_sets[set - 100];
    v->points = s.count;
    if (alloc(v) != 0) return -1;
    const bool was_complex = v->complex != 0;
    v->complex = 0;
    // the float set holds each double value rounded to nearest
    for (int32_t k = 0; k < s.count; ++k) v->data[k] = static_cast<T>(s.taps[k]);
    if (was_complex && rtoc(v) != 0) return -1;
    return 0;
}

template int32_t fir_design<vlx_t>(vlx_t*, int32_t, double, double);
template int32_t fir_design<vlxf_t>(vlxf_t*, int32_t, float, float);
template int32_t fir_design_set<vlx_t>(vlx_t*, int32_t);
template int32_t fir_design_set<vlxf_t>(vlxf_t*, int32_t);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxc_fir(vlx_t* v, int32_t type, double arg1, double arg2) { return vlx::fir_design(v, type, arg1, arg2); }
VLX_API int32_t vlxfc_fir(vlxf_t* v, int32_t type, float arg1, float arg2) { return vlx::fir_design(v, type, arg1, arg2); }
VLX_API int32_t vlxc_fir2(vlx_t* v, int32_t set) { return vlx::fir_design_set(v, set); }
VLX_API int32_t vlxfc_fir2(vlxf_t* v, int32_t set) { return vlx::fir_design_set(v, set); }
}
