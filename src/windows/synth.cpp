// Window synthesis: the cosine-sum tables, the constant, triangle and
// cosine-lobe forms, the engine that reaches every window of the catalogue,
// and the 16-entry cache behind vlxi_window2.
#include "windows/windows.hpp"

#include "core/frame.hpp"
#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"
#include "filters/filters.hpp"
#include "stats/stats.hpp"

#include <array>
#include <cstdlib>
#include <type_traits>

namespace vlx {
namespace {

// The three tables of a cosine-sum id: normalised to mean (c0 = 1, or just
// below for the flat tops), to rms 1, and to peak 1.  Ids with count 0 have
// no table.  Stored as written; the float tables are these values rounded
// to nearest.
template <class T>
struct CosTable {
    int32_t count;
    T c[3][7];
};

constexpr CosTable<double> cos_tables[32] = {
    /* 0 Uniform */ {1, {{1.0}, {1.0}, {1.0}}},
    /* 1 Bartlett */ {0, {}},
    /* 2 Hann */ {2, {{1.0, 1.0}, {0.816496580927726, 0.816496580927726}, {0.5, 0.5}}},
    /* 3 Hamming */ {2, {{1.0, 0.8518518518518519}, {0.8566034682170329, 0.729699250703398}, {0.54, 0.46}}},
    /* 4 Blackman */ {3, {{1.0, 1.1904761904761905, 0.19047619047619047},
                          {0.76099944650684, 0.905951722031952, 0.144952275525112},
                          {0.42, 0.5, 0.08}}},
    /* 5 Blackman_Harris3 */ {3, {{1.0, 1.171912, 0.184449},
                                  {0.766131803818887, 0.897839054477, 0.14131224508259},
                                  {0.424383190860823, 0.497339753968089, 0.078277055171088}}},
    /* 6 Blackman_Harris4 */ {4, {{1.0, 1.36998268534551, 0.405410267365249, 0.0354275820197432},
                                  {0.703382979783909, 0.963622503470687, 0.28515868189436, 0.0249191582075858},
                                  {0.355768, 0.487396, 0.144232, 0.012604}}},
    /* 7 Gausstop */ {5, {{1.0, 1.45875529060575, 0.543087184045061, 0.0881671850028154, 0.00390252806853846},
                          {0.671860109083022, 0.980079488671818, 0.364878614714106, 0.0592360145335345,
                           0.00262195293382781},
                          {0.3232153788877343, 0.471492143957626, 0.1755341299601972, 0.02849699010614994,
                           0.001261357088292677}}},
    /* 8 Flat4 */ {4, {{0.9994484, 1.911456, 1.078578, 0.183162},
                       {0.540110737248871, 1.03296769435899, 0.582873071546678, 0.0989823615265958},
                       {0.239523981482822, 0.458092235226179, 0.258487878813733, 0.0438959044772663}}},
    /* 9 Flattop */ {5, {{0.9996403, 1.940411, 1.3079112, 0.4038558, 0.0350962},
                         {0.511503346408074, 0.992883860231563, 0.669241681837557, 0.206647924424725,
                          0.0179582833407247},
                         {0.213283237831627, 0.414006058783449, 0.279055911943774, 0.0861666667911267,
                          0.00748812465002295}}},
    /* 10 Flat6 */ {6, {{0.999760855, 1.959279864368, 1.482207318028, 0.639636244612, 0.1236443547086,
                         0.00669641875546},
                        {0.486122572817733, 0.952677996716077, 0.720706788313935, 0.311015994818339,
                         0.0601206893875967, 0.00325605898429494},
                        {0.191847568346755, 0.375972989750395, 0.28442588877861, 0.122742011293553,
                         0.0237265428747444, 0.00128499895594193}}},
    /* 11 Flat7 */ {7, {{0.999820406, 1.968927018592, 1.58314833527, 0.813811630104, 0.226727679792,
                         0.0278660778114, 0.000908305448086},
                        {0.468805828779846, 0.923210265782527, 0.742322484061889, 0.381588166666788,
                         0.106310350533314, 0.013066126301104, 0.000425895376629477},
                        {0.177865709213752, 0.350267506494545, 0.281638382006947, 0.144775183509154,
                         0.0403343233670632, 0.00495730999606168, 0.000161585412477099}}},
    /* 12 P501 */ {6, {{0.99974762, 1.95719157697, 1.462421292406, 0.611433912448, 0.11186507767,
                        0.00553658087878},
                       {0.489148752531658, 0.957599497301472, 0.715522134332392, 0.299157636933899,
                        0.0547324765765759, 0.00270889530114197},
                       {0.194193773561842, 0.380170365312055, 0.284064801584131, 0.118766633064811,
                        0.0217289855238924, 0.00107544095326841}}},
    /* 13 P601 */ {7, {{0.999813874, 1.967871907162, 1.57208459675, 0.79456597081, 0.21505509556,
                        0.0252934034374, 0.00076928806393},
                       {0.470756142359013, 0.926560244624348, 0.740206251856888, 0.374116444065528,
                        0.101257353806709, 0.0119092416488318, 0.000362214498874338},
                       {0.179324203849725, 0.352952756714861, 0.281965299769994, 0.142511435204976,
                        0.0385717630030842, 0.0045365638065367, 0.00013797765082358}}},
    /* 14-19 Kaiser */ {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}}, {0, {}},
    /* 20-22 Gauss */ {0, {}}, {0, {}}, {0, {}},
    /* 23 Riemann */ {0, {}},
    /* 24 Tukey25 */ {0, {}},
    /* 25 Cos_Lobe */ {0, {}},
    /* 26 Cheby6 */ {6, {{1.0, 1.53951155812595, 0.686121800332923, 0.163259479767629, 0.0171216530445669,
                         0.000468580713698982},
                        {0.640985739298621, 0.986804954244135, 0.439794289435299, 0.104646998336362,
                         0.0109747354347862, 0.000300353555191417},
                        {0.2935578950102797, 0.4519357723474506, 0.2014164714263962, 0.04792610922105837,
                         0.005026196426859393, 0.0001375555679558877}}},
    /* 27 Cheby7 */ {7, {{1.0, 1.59812711476556, 0.803789665431762, 0.242553114942046, 0.0396794225998661,
                         0.00283906676076922, 5.04419470220404e-05},
                        {0.616596956347906, 0.985400314821504, 0.495614261249127, 0.149557512425969,
                         0.0244662112047198, 0.00175055992355881, 3.11023510060524e-05},
                        {0.2712203605850388, 0.4334446123274422, 0.2180041228929303, 0.06578534329560609,
                         0.01076186730534183, 0.0007700127105808265, 1.368088305992921e-05}}},
    /* 28 Cheby4 */ {4, {{1.0, 1.3454396382218, 0.37570489620083, 0.029267408526112},
                        {0.71136832024283, 0.95710313542998, 0.26726456091739, 0.020819907241081},
                        {0.3635819, 0.4891775, 0.1365995, 0.0106411}}},
    /* 29 Orig_Blackman_Harris4 */ {4, {{1.0, 1.3610871080139, 0.3938118466899, 0.032557491289199},
                                       {0.70633853697136, 0.96138827656514, 0.27816448363293, 0.02299661076467},
                                       {0.35875, 0.48829, 0.14128, 0.01168}}},
    /* 30 Kaiser89 */ {0, {}},
    /* 31 Gauss73 */ {0, {}},
};

constexpr std::array<CosTable<float>, 32> narrow_tables() {
    std::array<CosTable<float>, 32> out{};
    for (int id = 0; id < 32; ++id) {
        out[id].count = cos_tables[id].count;
        for (int mode = 0; mode < 3; ++mode)
            for (int k = 0; k < 7; ++k) out[id].c[mode][k] = static_cast<float>(cos_tables[id].c[mode][k]);
    }
    return out;
}

constexpr std::array<CosTable<float>, 32> cos_tables_f = narrow_tables();

template <VlxVector V>
const CosTable<real_t<V>>& table_of(int32_t id) {
    if constexpr (std::is_same_v<V, vlx_t>)
        return cos_tables[id];
    else
        return cos_tables_f[id];
}

// 2 pi / n.  The float twin divides 2 pi rounded to single by n in double
// and rounds the quotient.
template <VlxVector V>
real_t<V> full_step(int64_t n) {
    if constexpr (std::is_same_v<V, vlx_t>)
        return 6.283185307179586 / static_cast<double>(n);
    else
        return static_cast<float>(6.2831854820251465 / static_cast<double>(n));
}

// The value of the sum at base angle theta: term k's argument is the
// previous one plus theta, and the terms are added from c0 on.
template <class T>
inline T cos_sum_at(const T* c, int32_t count, T theta) {
    T s = c[0];
    T arg = theta;
    for (int32_t k = 1; k < count; ++k) {
        s += c[k] * own_cos(arg);
        arg += theta;
    }
    return s;
}

// A window narrower than its vector (m pairs written): an even whole width
// clears w[h+m], so that it occupies exactly that many positions; zeros
// outside.
template <VlxVector V>
void narrow_ends(V* w, real_t<V> width, int64_t m, int64_t m0) {
    using T = real_t<V>;
    T* x = w->data;
    const int64_t n = w->points;
    const int64_t h = n / 2;
    const int32_t f = floor_pts<V>(width);
    if (nearly_equal<V>(width, static_cast<T>(f)) && f % 2 == 0 && f != 0) x[h + m] = T(0);
    for (int64_t i = m + 1; i <= m0; ++i) x[h + i] = x[h - i] = T(0);
    if (n % 2 == 0) x[0] = T(0);
}

// Whether a width under flag 8 is narrower than the vector: not greater and
// not nearly equal to n.
template <VlxVector V>
bool is_narrower(real_t<V> width, int64_t n) {
    using T = real_t<V>;
    return !(width > static_cast<T>(n)) && !nearly_equal<V>(width, static_cast<T>(n));
}

template <VlxVector V>
int64_t width_pairs(real_t<V> width, int64_t m0) {
    const int64_t m = floor_pts<V>(width) / 2;
    return m < m0 ? m : m0;
}

template <VlxVector V>
int32_t constant_form(V* w, V* table, int32_t flags, real_t<V> width) {
    using T = real_t<V>;
    if (table->complex || w->complex || (flags & wflag_symmetric)) return -1;
    if (table->points < 1) return zero(w);
    if (table->points > 1) return -1;
    const int64_t n = w->points;
    if (n < 1) return 0;
    int64_t m = n;
    if (flags & wflag_width) {
        int64_t c = ceil_pts<V>(width);
        if (c < 1) c = 1;
        m = c < n ? c : n;
    }
    // not centred: the window begins at index 0
    const T c0 = table->data[0];
    T* x = w->data;
    for (int64_t i = 0; i < m; ++i) x[i] = c0;
    for (int64_t i = m; i < n; ++i) x[i] = T(0);
    return 0;
}

template <VlxVector V>
int32_t triangle_form(V* w, int32_t flags) {
    using T = real_t<V>;
    if (w->complex || (flags & (wflag_width | wflag_symmetric))) return -1;
    const int64_t n = w->points;
    if (n < 1) return 0;
    const T nn = static_cast<T>(n);
    const int32_t mode = flags & wnorm_mask;
    T p;
    if (mode == wnorm_mean)
        p = n % 2 == 0 ? T(2) : T(2) * nn * nn / (nn * nn + T(1));
    else if (mode == wnorm_rms)
        p = own_sqrt(nn * T(3) * nn / (nn * nn + T(2)));
    else
        p = T(1);
    const T d = p * T(2) / nn;
    const int64_t h = n / 2;
    T* x = w->data;
    x[h] = p;
    T v = p - d;
    for (int64_t i = 1; i <= (n - 1) / 2; ++i) {
        x[h + i] = x[h - i] = v;
        // re-seeded so that the repeated subtraction cannot drift
        v = (i % 1024 == 0) ? p - static_cast<T>(i + 1) * d : v - d;
    }
    if (n % 2 == 0) x[0] = T(0);
    return 0;
}

// The mean (mode 0) or the rms (any other mode) of w; -1 if it fails.
template <VlxVector V>
int32_t measure(V* w, int32_t mode, real_t<V>* value) {
    V r;
    init(&r);
    const int32_t st = mode == wnorm_mean ? mean(w, &r) : rms(w, &r);
    if (st == 0) *value = r.data[0];
    destroy(&r);
    return st < 0 ? -1 : 0;
}

template <VlxVector V>
int32_t cos_lobe_form(V* w, int32_t flags, real_t<V> width) {
    using T = real_t<V>;
    if (w->complex || (flags & wflag_symmetric)) return -1;
    const int64_t n = w->points;
    if (n < 1) return 0;
    const int64_t h = n / 2;
    const int64_t m0 = (n - 1) / 2;
    const bool has_width = (flags & wflag_width) != 0;
    T step;
    int64_t m;
    if (!has_width) {
        step = family<V>::pi / static_cast<T>(n);
        m = m0;
    } else {
        step = width == T(0) ? T(0) : family<V>::pi / width;
        m = width_pairs<V>(width, m0);
    }
    T* x = w->data;
    x[h] = T(1);
    T a = step;
    for (int64_t i = 1; i <= m; ++i) {
        x[h + i] = x[h - i] = own_cos(a);
        a = (i % 1024 == 0) ? static_cast<T>(i + 1) * step : a + step;
    }
    if (has_width && is_narrower<V>(width, n))
        narrow_ends(w, width, m, m0);
    else if (n % 2 == 0)
        x[0] = T(0);  // cos(pi/2)

    const int32_t mode = flags & wnorm_mask;
    if (mode == wnorm_peak) return 0;
    T s = T(0);
    if (measure(w, mode, &s) != 0) return -1;
    // no guard against a zero measure, unlike the cosine sums
    return scale(w, T(1) / s);
}

// Brings a constant form or cosine sum to its normalisation: a window
// narrower than its vector is measured; a full one needs a correction only
// when its cosine terms alias on a short vector.
template <VlxVector V>
int32_t normalise_sum(V* w, const real_t<V>* c, int32_t count, int32_t flags) {
    using T = real_t<V>;
    const int32_t mode = flags & wnorm_mask;
    if (mode == wnorm_peak) return 0;
    const int64_t n = w->points;
    T s;
    if (flags & wflag_width) {
        T measured = T(0);
        if (measure(w, mode, &measured) != 0) return -1;
        if (mode == wnorm_mean)
            s = measured == T(0) ? T(0) : c[0] / measured;
        else
            s = measured == T(0) ? T(0) : T(1) / measured;
        return scale(w, s);
    }
    if (mode == wnorm_mean) {
        if (n >= count) return 0;
        s = c[0] / aliased_sum(c, count, n);
    } else {
        if (n >= 2 * static_cast<int64_t>(count) - 1) return 0;
        s = T(1) / own_sqrt(aliased_mean_square(c, count, n));
    }
    return scale(w, s);
}

// ---- cache ----

template <VlxVector V>
struct WindowEntry {
    V window;
    int32_t id;
    int32_t flags;
    real_t<V> width;
};

inline constexpr int32_t cache_entries = 16;

template <VlxVector V>
struct WindowCacheState {
    WindowEntry<V>* entries = nullptr;
    int32_t count = 0;
    int32_t last = cache_entries - 1;  // the entry filled last
};

template <VlxVector V>
WindowCacheState<V> window_cache;

// x times the window w, halves exchanged: x[i] = x[i+h] w[i+h] and x[i+h] =
// x[i] w[i]; each complex pair is scaled by the real window.
template <class T>
void multiply_swapping(T* __restrict x, const T* __restrict w, int64_t h, bool is_complex) {
    if (!is_complex) {
        for (int64_t i = 0; i < h; ++i) {
            const T lo = x[i] * w[i];
            const T hi = x[i + h] * w[i + h];
            x[i] = hi;
            x[i + h] = lo;
        }
        return;
    }
    for (int64_t i = 0; i < h; ++i) {
        const T lo_re = x[2 * i] * w[i], lo_im = x[2 * i + 1] * w[i];
        const T hi_re = x[2 * (i + h)] * w[i + h], hi_im = x[2 * (i + h) + 1] * w[i + h];
        x[2 * i] = hi_re;
        x[2 * i + 1] = hi_im;
        x[2 * (i + h)] = lo_re;
        x[2 * (i + h) + 1] = lo_im;
    }
}

// Search, claim and fill, and the multiplication; runs under lock 1.  On
// entry *rotate_now says whether the result is to be rotated; it comes back
// true if the rotation is still to be done.
template <VlxVector V>
int32_t window2_locked(V* v, int32_t id, int32_t flags, real_t<V> width, bool* rotate_now) {
    WindowCacheState<V>& state = window_cache<V>;
    const int32_t key = flags & wflag_key_mask;
    const bool has_width = (flags & wflag_width) != 0;
    WindowEntry<V>* entry = nullptr;
    for (int32_t i = 0; i < state.count; ++i) {
        WindowEntry<V>& e = state.entries[i];
        if (e.window.points == v->points && e.id == id && e.flags == key &&
            (!has_width || nearly_equal<V>(width, e.width))) {
            entry = &e;
            break;
        }
    }
    if (entry == nullptr) {
        if (state.entries == nullptr) {
            state.entries = static_cast<WindowEntry<V>*>(std::malloc(cache_entries * sizeof(WindowEntry<V>)));
            if (state.entries == nullptr) return -1;
            register_teardown<V>(TeardownStep::window_cache, &window_cache_free<V>);
        }
        // strict rotation once full, with no regard to use
        int32_t slot;
        if (state.count < cache_entries) {
            slot = state.count;
            init(&state.entries[slot].window);
        } else {
            slot = (state.last + 1) % cache_entries;
        }
        entry = &state.entries[slot];
        entry->id = id;
        entry->flags = key;
        entry->width = width;
        entry->window.points = v->points;
        if (alloc(&entry->window) != 0) return -1;
        state.last = slot;
        if (state.count < cache_entries) ++state.count;
        // A failed synthesis keeps the entry and its key: the same call
        // repeated multiplies by whatever the storage holds.  Settled.
        if (window_synth(&entry->window, id, flags, width) != 0) return -1;
    }
    entry->window.delta = v->delta;
    if (*rotate_now && v->points >= 2 && v->points % 2 == 0) {
        // An even rotation is an exchange of halves, so it rides along with
        // the multiplication: the same products, moved in one pass.
        if (prepare_dest(v, &entry->window, v) < 0) return -1;
        multiply_swapping(v->data, entry->window.data, v->points / 2, v->complex != 0);
        *rotate_now = false;
        return 0;
    }
    return mul(v, &entry->window, v);
}

}  // namespace

// Short-length corrections shared with the metrics.
template <class T>
T aliased_sum(const T* c, int32_t count, int64_t n) {
    T s = T(0);
    for (int32_t k = 0; k < count; ++k)
        if (k % n == 0) s += c[k];
    return s;
}

template <class T>
T aliased_mean_square(const T* c, int32_t count, int64_t n) {
    T a = T(1);
    for (int32_t j = 0; j < count; ++j) {
        if (j > 0 && (2 * j) % n == 0) a += c[j] * c[j] * T(0.5);
        for (int32_t k = j + 1; k < count; ++k) {
            if ((k - j) % n == 0) a += c[k] * c[j];
            if ((k + j) % n == 0) a += c[k] * c[j];
        }
    }
    return a;
}

template <VlxVector V>
const real_t<V>* window_table(int32_t id, int32_t mode, int32_t* count) {
    if (id < 0 || id > 31 || mode < 0 || mode > 2) return nullptr;
    const CosTable<real_t<V>>& t = table_of<V>(id);
    if (t.count == 0) return nullptr;
    *count = t.count;
    return t.c[mode];
}

template <VlxVector V>
int32_t window_cos_sum(V* w, V* coefs, int32_t flags, real_t<V> width) {
    using T = real_t<V>;
    if (coefs->complex || w->complex || (flags & wflag_symmetric)) return -1;
    if (coefs->points < 1) return zero(w);
    const int64_t n = w->points;
    if (n < 1) return 0;
    const int64_t h = n / 2;
    const int64_t m0 = (n - 1) / 2;
    const bool has_width = (flags & wflag_width) != 0;
    T step;
    int64_t m;
    if (!has_width) {
        step = full_step<V>(n);
        m = m0;
    } else {
        step = width == T(0) ? T(0) : family<V>::two_pi / width;
        m = width_pairs<V>(width, m0);
    }
    const T* c = coefs->data;
    const int32_t count = coefs->points;
    T* x = w->data;
    T centre = c[0];
    for (int32_t k = 1; k < count; ++k) centre += c[k];
    x[h] = centre;
    // The base angle grows by repeated addition, restarted from a product
    // every 1024 samples so that rounding cannot build up.
    T theta = step;
    for (int64_t i = 1; i <= m; ++i) {
        x[h + i] = x[h - i] = cos_sum_at(c, count, theta);
        theta = (i % 1024 == 0) ? static_cast<T>(i + 1) * step : theta + step;
    }
    if (has_width && is_narrower<V>(width, n)) {
        narrow_ends(w, width, m, m0);
        return 0;
    }
    // distance n/2 for a full window; a wider one is cut by the vector's ends
    if (n % 2 == 0) x[0] = cos_sum_at(c, count, theta);
    return 0;
}

template <VlxVector V>
int32_t window_synth(V* w, int32_t id, int32_t flags, real_t<V> width) {
    using T = real_t<V>;
    if (w->complex) return -1;
    if (w->points < 1) return 0;
    switch (id) {
    case 1:
        return triangle_form(w, flags);
    case 14: case 15: case 16: case 17: case 18: case 19: case 30:
        return kaiser_form(w, catalogue_kaiser_beta<V>(id), flags, width);
    case 20: case 21: case 22: case 31:
        return gauss_form(w, catalogue_gauss_sigma<V>(id), flags, width);
    case 23:
        return sinc_form(w, family<V>::pi, T(1), flags);
    case 24:
        return tukey_form(w, T(0.25), flags);
    case 25:
        return cos_lobe_form(w, flags, width);
    default:
        break;
    }
    int32_t count = 0;
    const T* c = window_table<V>(id, flags & wnorm_mask, &count);
    if (c == nullptr) return -1;
    // The table is lent to a temporary vector for the filling step.
    V table;
    if (init(&table) != 0) return -1;
    table.data = const_cast<T*>(c);
    table.points = count;
    const int32_t st = id == 0 ? constant_form(w, &table, flags, width) : window_cos_sum(w, &table, flags, width);
    if (st != 0) return st;
    return normalise_sum(w, c, count, flags);
}

template <VlxVector V>
int32_t window_cache_free() {
    LockGuard lock(1);
    WindowCacheState<V>& state = window_cache<V>;
    if (state.entries != nullptr) {
        for (int32_t i = 0; i < state.count; ++i)
            if (destroy(&state.entries[i].window) < 0) return -1;
        std::free(state.entries);
        state.entries = nullptr;
    }
    state.count = 0;
    return 0;
}

template <VlxVector V>
int32_t window2(V* v, int32_t id, int32_t flags, real_t<V> width) {
    if ((flags & wnorm_mask) == 3) return -1;
    if (id == 0 && !(flags & wflag_width)) {
        // nothing to multiply; the uniform window is rotated only on request
        if (flags & wflag_swap_uniform) return swap_halves2(v) != 0 ? -1 : 0;
        return 0;
    }
    // The uniform window stays unrotated unless asked, every other window is
    // rotated unless told not to.
    bool rotate_now = id == 0 ? (flags & wflag_swap_uniform) != 0 : !(flags & wflag_no_swap);
    int32_t st;
    {
        // Both families' caches and the multiplication: an entry can be
        // overwritten by the next caller as soon as the lock is free.
        LockGuard lock(1);
        st = window2_locked(v, id, flags, width, &rotate_now);
    }
    if (st < 0 || !rotate_now) return st;
    return swap_halves2(v) != 0 ? -1 : 0;
}

template <VlxVector V>
int32_t window(V* v, int32_t id, int32_t flags) {
    if (flags & wflag_width) return -1;
    return window2(v, id, flags, real_t<V>(0));
}

template <VlxVector V>
int32_t window_cos(V* v, V* coefs) {
    using T = real_t<V>;
    // Failures return at once and leave the temporary undestroyed: settled.
    V temp;
    if (init(&temp) != 0) return -1;
    temp.points = v->points;
    if (alloc(&temp) != 0) return -1;
    if (window_cos_sum(&temp, coefs, 0, T(0)) != 0) return -1;
    temp.delta = v->delta;
    if (mul(v, &temp, v) != 0) return -1;
    if (swap_halves2(v) != 0) return -1;
    return destroy(&temp) < 0 ? -1 : 0;
}

#define VLX_WINDOW_SYNTH_INSTANCES(V)                                                           \
    template const real_t<V>* window_table<V>(int32_t, int32_t, int32_t*);                      \
    template int32_t window_synth<V>(V*, int32_t, int32_t, real_t<V>);                          \
    template int32_t window_cos_sum<V>(V*, V*, int32_t, real_t<V>);                             \
    template int32_t window2<V>(V*, int32_t, int32_t, real_t<V>);                               \
    template int32_t window<V>(V*, int32_t, int32_t);                                           \
    template int32_t window_cos<V>(V*, V*);                                                     \
    template int32_t window_cache_free<V>();
VLX_WINDOW_SYNTH_INSTANCES(vlx_t)
VLX_WINDOW_SYNTH_INSTANCES(vlxf_t)
#undef VLX_WINDOW_SYNTH_INSTANCES
template double aliased_sum<double>(const double*, int32_t, int64_t);
template float aliased_sum<float>(const float*, int32_t, int64_t);
template double aliased_mean_square<double>(const double*, int32_t, int64_t);
template float aliased_mean_square<float>(const float*, int32_t, int64_t);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_window2(vlx_t* v, int32_t id, int32_t flags, double width) { return vlx::window2(v, id, flags, width); }
VLX_API int32_t vlxfi_window2(vlxf_t* v, int32_t id, int32_t flags, float width) { return vlx::window2(v, id, flags, width); }
VLX_API int32_t vlxi_window(vlx_t* v, int32_t id, int32_t flags) { return vlx::window(v, id, flags); }
VLX_API int32_t vlxfi_window(vlxf_t* v, int32_t id, int32_t flags) { return vlx::window(v, id, flags); }
VLX_API int32_t vlxi_window_cos(vlx_t* v, vlx_t* coefs) { return vlx::window_cos(v, coefs); }
VLX_API int32_t vlxfi_window_cos(vlxf_t* v, vlxf_t* coefs) { return vlx::window_cos(v, coefs); }
VLX_API int32_t vlx_window_synth(vlx_t* w, int32_t id, int32_t flags, double width) { return vlx::window_synth(w, id, flags, width); }
VLX_API int32_t vlxf_window_synth(vlxf_t* w, int32_t id, int32_t flags, float width) { return vlx::window_synth(w, id, flags, width); }
VLX_API int32_t vlx_window_cos_sum(vlx_t* w, vlx_t* coefs, int32_t flags, double width) { return vlx::window_cos_sum(w, coefs, flags, width); }
VLX_API int32_t vlxf_window_cos_sum(vlxf_t* w, vlxf_t* coefs, int32_t flags, float width) { return vlx::window_cos_sum(w, coefs, flags, width); }
}
