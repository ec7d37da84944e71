// Windows, both families: names, closed forms, the cosine-sum recurrence bit for bit, every id's normalisation, worked
// examples and the cache; parametric windows, the direct operations and FIR prototypes; metrics, fixed and measured.
#include "vlx_test.hpp"

#include <complex>
#include <numeric>
#include <string>

using namespace vlxtest;

namespace {

VLX_TWIN(i, window2) VLX_TWIN(i, window) VLX_TWIN(i, window_cos) VLX_TWIN(i, window_kaiser) VLX_TWIN(i, window_gauss)
VLX_TWIN(i, window_sinc) VLX_TWIN(i, window_tukey) VLX_TWIN(i, window_fir)
VLX_TEST_TWIN(t_synth, vlx_window_synth, vlxf_window_synth)
VLX_TEST_TWIN(t_cos_sum, vlx_window_cos_sum, vlxf_window_cos_sum)

// The metrics take a scalar out pointer; these route by its type.
#define VLX_METRIC_TWIN(name)                                                                  \
    inline int32_t t_##name(double* out, auto... a) { return vlx_##name(out, a...); }          \
    inline int32_t t_##name(float* out, auto... a) { return vlxf_##name(out, a...); }
VLX_METRIC_TWIN(window2_scale) VLX_METRIC_TWIN(window_scale) VLX_METRIC_TWIN(window_metric)
#undef VLX_METRIC_TWIN

// Window id with flags on n points, through the synthesis engine.
template <class V>
std::vector<real_of<V>> synth(int32_t id, int32_t flags, int32_t n, double width = 0.0, int32_t* status = nullptr) {
    Vec<V> w;
    w->points = n;
    EXPECT_EQ(t_alloc(w.get()), 0);
    const int32_t st = t_synth(w.get(), id, flags, static_cast<real_of<V>>(width));
    if (status != nullptr) *status = st;
    else EXPECT_EQ(st, 0) << "id " << id << " flags " << flags << " n " << n;
    return w.values();
}

// The mean a mean-normalised window keeps: c0, just below 1 for the flat tops (ids 8 to 13).
inline double c0_of(int32_t id) {
    const double flat[6] = {0.9994484, 0.9996403, 0.999760855, 0.999820406, 0.99974762, 0.999813874};
    return id >= 8 && id <= 13 ? flat[id - 8] : 1.0;
}

template <class T>
long double mean_of(const std::vector<T>& x) { return std::accumulate(x.begin(), x.end(), 0.0L) / x.size(); }

template <class T>
long double rms_of(const std::vector<T>& x) { return std::sqrt(std::inner_product(x.begin(), x.end(), x.begin(), 0.0L) / x.size()); }

long double bessel_i0(long double x) {
    long double term = 1, sum = 1;
    for (int k = 1; k < 200 && term > 1e-30L * sum; ++k) sum += term *= (x / (2 * k)) * (x / (2 * k));
    return sum;
}


// Full width in bins at which |W(f)| / W(0) of a periodic window first falls to level.
double width_at(const std::vector<double>& w, double level) {
    const double n = double(w.size()), sum = std::accumulate(w.begin(), w.end(), 0.0);
    auto response = [&](double f) {
        std::complex<double> z = 0;
        for (size_t i = 0; i < w.size(); ++i) z += w[i] * std::polar(1.0, 2 * M_PI * f * (double(i) - std::floor(n / 2)) / n);
        return std::abs(z) / sum;
    };
    double lo = 0, hi = 0.05;
    while (response(hi) > level) lo = hi, hi += 0.05;
    for (int k = 0; k < 40; ++k) (response(0.5 * (lo + hi)) > level ? lo : hi) = 0.5 * (lo + hi);
    return lo + hi;
}

}  // namespace

VLX_TYPED_SUITE(Synthesis);
VLX_TYPED_SUITE(Parametric);
VLX_TYPED_SUITE(Metrics);

TEST(Catalogue, NamesAndIds) {
    const struct { const char* name; int32_t id; } from[] = {
        {"Hann", 2}, {"hANN", 2}, {"p110", 2}, {"VLX_WINDOW_HANN", 2}, {"vlx_window_P110", 2}, {"RRC", 25},
        {"blackman_nuttall", 28}, {"Gauss73", 31}, {"Han", -1}, {"Hann ", -1}, {"", -1}, {"VLX_WINDOW_", -1}};
    int32_t id = 99;
    for (const auto& c : from) {
        EXPECT_EQ(vlx_window_from_str(c.name, &id), c.id < 0 ? -1 : 0) << c.name;
        EXPECT_EQ(id, c.id < 0 ? 0 : c.id) << c.name;  // no match: the uniform window
        EXPECT_EQ(vlxf_window_from_str(c.name, &id), c.id < 0 ? -1 : 0) << c.name;
    }
    for (int32_t i = 0; i < 32; ++i) {  // each canonical name's constant-style twin leads back
        char name[32];
        std::string upper = "VLX_WINDOW_";
        EXPECT_EQ(vlx_window_to_str(i, name, sizeof name), 0);
        for (const char* p = name; *p; ++p) upper += static_cast<char>(std::toupper(*p));
        EXPECT_TRUE(vlxf_window_from_str(upper.c_str(), &id) == 0 && id == i) << upper;
    }
    const struct { int32_t id, len, result; const char* want; } to[] = {
        {25, 32, 0, "Cos_Lobe"}, {6, 32, 0, "Blackman_Harris4"}, {4, 3, 0, "Bl"}, {4, 1, 0, ""}, {32, 8, -1, ""}, {-1, 8, -1, ""}};
    for (const auto& c : to) {
        char buf[32];
        std::memset(buf, 'x', sizeof buf);
        EXPECT_TRUE(vlxf_window_to_str(c.id, buf, c.len) == c.result && std::string(buf) == c.want) << c.id << " " << c.len;
    }
    EXPECT_EQ(vlx_window_to_str(2, nullptr, 8) + vlx_window_from_str(nullptr, &id), -2);
}

// Peak mode at x = d / n, d the distance from the centre (float: 1024 angle additions).
TYPED_TEST(Synthesis, ShapesMatchClosedForms) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 5e-12L : 3e-4L;
    const struct { int32_t id; std::vector<long double> c; } forms[] = {
        {2, {0.5L, 0.5L}}, {3, {0.54L, 0.46L}}, {4, {0.42L, 0.5L, 0.08L}}, {29, {0.35875L, 0.48829L, 0.14128L, 0.01168L}},
        {1, {}}, {25, {}}};
    auto form = [](int32_t id, const std::vector<long double>& c, long double x) {
        if (id == 1) return 1 - 2 * std::fabs(x);  // triangle
        if (id == 25) return std::cos(M_PIl * x);  // cosine lobe
        long double s = 0;
        for (size_t k = 0; k < c.size(); ++k) s += c[k] * std::cos(2 * M_PIl * k * x);
        return s;
    };
    for (const auto& f : forms)
        for (int32_t n : {1, 2, 3, 4, 7, 8, 64, 1025, 3001}) {
            const std::vector<T> w = synth<TypeParam>(f.id, VLX_WNORM_PEAK, n);
            for (int32_t i = 0; i < n; ++i)
                ASSERT_TRUE(near(w[i], form(f.id, f.c, static_cast<long double>(i - n / 2) / n), tol)) << f.id << " " << n << " " << i;
        }
    for (int32_t id : {0, 1, 25}) {  // no symmetric form of these
        int32_t st = 0;
        synth<TypeParam>(id, VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC, 8, 0.0, &st);
        EXPECT_EQ(st, -1) << id;
    }
}

// Angles by repeated addition, re-seeded every 1024 samples; the float step is 2 pi (single) over n divided in double.
TYPED_TEST(Synthesis, CosineSumBitsFollowRecurrence) {
    using T = real_of<TypeParam>;
    for (int32_t count : {2, 5, 7})
        for (int32_t n : {6, 2050, 3073}) {
            const std::vector<T> c = random_values<T>(count, 17u * n + count);
            const T step = is_double<TypeParam> ? T(6.283185307179586 / n) : T(6.2831854820251465 / n);
            auto at = [&](T theta) {
                T s = c[0], a = theta;
                for (int k = 1; k < count; ++k, a += theta) s += c[k] * std::cos(a);
                return s;
            };
            std::vector<T> want(n, c[0]);
            for (int k = 1; k < count; ++k) want[n / 2] += c[k];
            T theta = step;
            for (int32_t i = 1; i <= (n - 1) / 2; ++i) {
                want[n / 2 + i] = want[n / 2 - i] = at(theta);
                theta = i % 1024 == 0 ? T(i + 1) * step : theta + step;
            }
            if (n % 2 == 0) want[0] = at(theta);
            Vec<TypeParam> coefs(c, false), w(std::vector<T>(n), false);
            ASSERT_EQ(t_cos_sum(w.get(), coefs.get(), 0, T(0)), 0);
            EXPECT_TRUE(same_scalars(w.values(), want)) << count << " " << n;
        }
    for (int32_t n : {2050, 3073}) {  // the triangle: repeated subtraction, re-seeded every 1024 samples
        const std::vector<T> w = synth<TypeParam>(1, VLX_WNORM_PEAK, n);
        const T d = T(2) / T(n);
        T v = T(1) - d;
        for (int32_t i = 1; i <= (n - 1) / 2; v = i % 1024 == 0 ? T(1) - T(i + 1) * d : v - d, ++i)
            ASSERT_TRUE(same_bits(w[n / 2 + i], v) && same_bits(w[n / 2 - i], v)) << n << " " << i;
    }
}

// Mean c0, rms 1, centre 1 for every id, short (aliased) and narrower windows too; the metrics' scale is synthesis's.
TYPED_TEST(Synthesis, EveryIdNormalises) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 1e-12L : 2e-5L;
    for (int32_t id = 0; id < 32; ++id) {
        const long double c0 = static_cast<T>(c0_of(id));
        for (int32_t n : {1, 2, 3, 5, 8, 33, 1000})
            for (int32_t extra : {0, VLX_WFLAG_WIDTH}) {
                const double width = extra ? 0.6 * n + 0.3 : 0.0;
                int32_t st = 0;
                const std::vector<T> peak = synth<TypeParam>(id, VLX_WNORM_PEAK | extra, n, width, &st);
                if (st != 0) continue;  // triangle, sinc lobe and Tukey take no width
                const std::vector<T> mean = synth<TypeParam>(id, VLX_WNORM_MEAN | extra, n, width),
                                     rms = synth<TypeParam>(id, VLX_WNORM_RMS | extra, n, width);
                T s0 = 0, s1 = 0;
                ASSERT_TRUE(t_window2_scale(&s0, id, VLX_WNORM_MEAN | extra, n, static_cast<T>(width)) == 0 &&
                            t_window2_scale(&s1, id, VLX_WNORM_RMS | extra, n, static_cast<T>(width)) == 0);
                EXPECT_TRUE(near(mean_of(mean), c0, tol) && near(rms_of(rms), 1.0L, tol) && (extra || near(peak[n / 2], 1.0L, tol)) &&
                            near(s0 * mean_of(peak) / mean_of(mean), 1.0L, tol) && near(s1 * rms_of(peak) / rms_of(rms), 1.0L, tol))
                    << id << " " << n << " " << extra;
            }
    }
}

TYPED_TEST(Synthesis, WorkedExamples) {
    using T = real_of<TypeParam>;
    const T h8 = static_cast<T>(0.5 + 0.5 * std::cos(M_PI / 4));
    const struct { int32_t id, flags, n; double width; std::vector<double> want; } cases[] = {
        {2, VLX_WNORM_PEAK | VLX_WFLAG_NO_SWAP, 8, 0, {0, 0.5 - h8 + 0.5, 0.5, h8, 1, h8, 0.5, 0.5 - h8 + 0.5}},
        {0, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, 8, 2.5, {8 / 3.0, 8 / 3.0, 8 / 3.0, 0, 0, 0, 0, 0}},
        {2, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH | VLX_WFLAG_NO_SWAP, 16, 4.0,
         {0, 0, 0, 0, 0, 0, 0, 0.5, 1, 0.5, 0, 0, 0, 0, 0, 0}},
        {2, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH | VLX_WFLAG_NO_SWAP, 4, 8.0, {0.5, h8, 1, h8}},  // cut by the ends
    };
    for (const auto& c : cases) {
        Vec<TypeParam> v(std::vector<T>(c.n, T(1)), false);
        ASSERT_EQ(t_window2(v.get(), c.id, c.flags, static_cast<T>(c.width)), 0);
        for (int32_t i = 0; i < c.n; ++i) EXPECT_NEAR(v[i], c.want[i], is_double<TypeParam> ? 1e-15 : 1e-6) << c.n << " " << i;
    }
    // id 0 without a width changes nothing; every id keeps delta and complex
    Vec<TypeParam> z({1, 2, 3, 4, 5, 6}, true);
    EXPECT_EQ(t_window(z.get(), 0, VLX_WNORM_RMS) + t_window(z.get(), 0, VLX_WNORM_PEAK | VLX_WFLAG_SWAP_UNIFORM), 0);
    EXPECT_EQ(z.values(), (std::vector<T>{3, 4, 5, 6, 1, 2}));  // only rotated on request
    for (int32_t id = 0; id < 32; ++id) {
        Vec<TypeParam> c(random_values<T>(2 * 12, 5u), true);
        c->delta = T(0.25);
        EXPECT_TRUE(t_window2(c.get(), id, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, T(12)) == (id == 1 || id == 23 || id == 24 ? -1 : 0) &&
                    has_shape(c.get(), 12, 1, 0.25)) << id;
    }
    Vec<TypeParam> v(std::vector<T>(8, T(1)), false);
    EXPECT_EQ(t_window2(v.get(), 2, 3, T(0)) + t_window(v.get(), 2, VLX_WFLAG_WIDTH) + t_window2(v.get(), 32, 0, T(0)), -3);
    EXPECT_EQ(v.values(), std::vector<T>(8, T(1)));
    // a width equal to n is the full window up to rounding
    EXPECT_TRUE(same_scalars(synth<TypeParam>(7, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH, 100, 100.0),
                             synth<TypeParam>(7, VLX_WNORM_PEAK, 100), 8));
}

TYPED_TEST(Synthesis, UserCoefficientsAndAllocationFailure) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> coefs({0.5, 0.5});  // the one-pass multiply-and-rotate of even lengths keeps the bits
    for (int32_t n : {7, 8, 10})
        for (bool cx : {false, true}) {
            const std::vector<T> x = random_values<T>((cx ? 2 : 1) * n, 9u + n);
            Vec<TypeParam> user(x, cx), hann(x, cx);
            ASSERT_EQ(t_window_cos(user.get(), coefs.get()) + t_window(hann.get(), 2, VLX_WNORM_PEAK), 0);
            EXPECT_TRUE(same_scalars(user.values(), hann.values())) << n << cx;
        }
    Vec<TypeParam> w(std::vector<T>(8, T(2)), false), empty, cplx({1, 0}, true);
    EXPECT_TRUE(t_window_cos(empty.get(), cplx.get()) == -1 && t_cos_sum(w.get(), coefs.get(), VLX_WFLAG_SYMMETRIC, T(0)) == -1);
    // allocation failure leaves the vector alone
    ASSERT_EQ(t_free_internal<TypeParam>(), 0);
    Vec<TypeParam> v(std::vector<T>(16, T(3)), false);
    FailingAlloc<TypeParam> fail;
    EXPECT_EQ(t_window(v.get(), 2, 0) + t_window_kaiser(v.get(), T(5), 0) + t_window_cos(v.get(), v.get()), -3);
    EXPECT_EQ(v.values(), std::vector<T>(16, T(3)));
    set_hooks<TypeParam>(nullptr, nullptr);  // the failed claim left no entry behind
    EXPECT_TRUE(t_window(v.get(), 2, VLX_WNORM_PEAK) == 0 && v[0] == T(3));
}

// A failed synthesis keeps its entry, which makes hits and evictions visible.
TYPED_TEST(Synthesis, CacheReuseAndStrictRotation) {
    using T = real_of<TypeParam>;
    ASSERT_EQ(t_free_internal<TypeParam>(), 0);
    Vec<TypeParam> v(std::vector<T>(8, T(1)), false);
    const int32_t failing = VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC;  // a cosine sum rejects flag 4
    EXPECT_EQ(t_window2(v.get(), 2, failing, T(0)), -1);
    EXPECT_EQ(t_window2(v.get(), 2, failing | VLX_WFLAG_NO_SWAP, T(0)), 0);  // the rotation flags share the key
    for (int32_t k = 0; k < 16; ++k) {
        Vec<TypeParam> other(std::vector<T>(9 + k, T(1)), false);
        EXPECT_EQ(t_window(other.get(), 3, VLX_WNORM_PEAK), 0);
        EXPECT_EQ(t_window2(v.get(), 2, failing, T(0)), k < 15 ? 0 : -1) << k;  // the 17th key takes entry 0
    }
    EXPECT_TRUE((t_free_internal<TypeParam>()) == 0 && t_window2(v.get(), 2, failing, T(0)) == -1);
    // widths are keys only under flag 8, and then up to rounding noise
    Vec<TypeParam> a(std::vector<T>(64, T(1)), false), b(std::vector<T>(64, T(1)), false);
    const T near_40 = T(40) * (1 + std::numeric_limits<T>::epsilon());
    ASSERT_EQ(t_window2(a.get(), 4, VLX_WFLAG_WIDTH, T(40)) + t_window2(b.get(), 4, VLX_WFLAG_WIDTH, near_40), 0);
    EXPECT_TRUE(same_scalars(a.values(), b.values()));
}

TYPED_TEST(Parametric, ClosedForms) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 2e-13L : 2e-5L;
    for (int32_t n : {2, 3, 4, 5, 16, 101, 1000})
        for (bool sym : {false, true}) {
            const int32_t flags = VLX_WNORM_PEAK | (sym ? VLX_WFLAG_SYMMETRIC : 0);
            const long double len = sym ? n - 1 : n;
            const std::vector<T> kaiser = synth<TypeParam>(16, flags, n), gauss = synth<TypeParam>(21, flags, n),
                                 tukey = synth<TypeParam>(24, flags, n), sinc = synth<TypeParam>(23, flags, n);
            const long double beta = static_cast<T>(12.014077292090791), sigma = static_cast<T>(0.1442161);
            // distance from the centre, n/2 or (n - 1)/2 if symmetric
            auto distance = [n](int32_t i, bool s) { return std::fabs(s ? i - (n - 1) / 2.0L : (long double)(i - n / 2)); };
            for (int32_t i = 0; i < n; ++i) {
                // Gaussian and Tukey keep the periodic form for an odd symmetric n
                const long double d = distance(i, sym), dp = distance(i, sym && n % 2 == 0);
                const long double u = std::max(0.0L, 1 - 4 * d * d / (len * len));
                ASSERT_TRUE(near(kaiser[i], bessel_i0(beta * std::sqrt(u)) / bessel_i0(beta), tol)) << n << sym << i;
                ASSERT_TRUE(near(gauss[i], std::exp(-0.5L * std::pow(dp / (n * sigma), 2)), tol)) << n << sym << i;
                const long double flat = 0.75L * n * 0.5L, a = M_PIl * 2 * dp / n;
                const long double g = dp <= flat ? 1 : 0.5L * (1 + std::cos(2 * M_PIl * (dp - flat) / (0.25L * n)));
                ASSERT_TRUE(near(tukey[i], g, tol)) << n << sym << i;
                ASSERT_TRUE(near(sinc[i], a == 0 ? 1 : std::sin(a) / a, tol)) << n << sym << i;
            }
        }
}

TYPED_TEST(Parametric, WorkedExamples) {
    using T = real_of<TypeParam>;
    const T eps = std::numeric_limits<T>::epsilon();
    auto kaiser = [](double beta, int32_t flags, int32_t n) {
        Vec<TypeParam> v(std::vector<T>(n, T(1)), false);
        EXPECT_EQ(t_window_kaiser(v.get(), static_cast<T>(beta), flags | VLX_WFLAG_NO_SWAP), 0);
        return v.values();
    };
    EXPECT_EQ(kaiser(0, VLX_WNORM_PEAK, 9), std::vector<T>(9, T(1)));
    for (int32_t flags : {0, 1, 2, 3, 4, 12}) EXPECT_EQ(kaiser(7, flags, 1), std::vector<T>{T(1)}) << flags;
    const T limit = is_double<TypeParam> ? T(460.51701859880916) : T(69.07755f);  // beta is clamped both ways
    for (double beta : {500, -500}) EXPECT_TRUE(same_scalars(kaiser(beta, VLX_WNORM_MEAN, 33), kaiser(limit, VLX_WNORM_MEAN, 33)));
    // symmetric, even n, odd width 5: pairs at 0.5, 1.5, one more at 2.5, then zeros
    Vec<TypeParam> w(std::vector<T>(8), false);
    ASSERT_EQ(t_synth(w.get(), 15, VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_WIDTH, T(5)), 0);
    const long double b15 = static_cast<T>(10.751776690564654), p15 = bessel_i0(b15);
    const long double k05 = bessel_i0(b15 * std::sqrt(1 - 0.0625L)) / p15, k15 = bessel_i0(b15 * std::sqrt(1 - 0.5625L)) / p15;
    const long double want[8] = {0, 1 / p15, k15, k05, k05, k15, 1 / p15, 0};
    for (int i = 0; i < 8; ++i) EXPECT_TRUE(near(w[i], want[i], 8 * eps)) << i;
    EXPECT_EQ(t_synth(w.get(), 15, VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_WIDTH, T(0.5)), -1);

    // Gaussian of sigma 0, even symmetric: two ones in the middle; mode 3 of the direct Gaussian leaves the scale at 0
    Vec<TypeParam> g(std::vector<T>(6, T(1)), false);
    ASSERT_EQ(t_window_gauss(g.get(), T(0), VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_NO_SWAP), 0);
    EXPECT_EQ(g.values(), (std::vector<T>{0, 0, 1, 1, 0, 0}));
    ASSERT_EQ(t_window_gauss(g.get(), T(0.2), 3), 0);
    EXPECT_EQ(g.values(), std::vector<T>(6, T(0)));
    // Tukey alpha 0: ones, the end sample of an even n included
    Vec<TypeParam> t0(std::vector<T>(10, T(1)), false), empty;
    EXPECT_TRUE(t_window_tukey(t0.get(), T(0), VLX_WNORM_PEAK) == 0 && t0.values() == std::vector<T>(10, T(1)));
    EXPECT_EQ(t_window_sinc(empty.get(), T(1), T(1), VLX_WFLAG_WIDTH) + t_window_tukey(empty.get(), T(1), VLX_WFLAG_WIDTH), -2);
    auto sp = [](double a, double p) { return is_double<TypeParam> ? T(vlx_sinc_pow(a, p)) : vlxf_sinc_pow(T(a), T(p)); };
    const double q = std::sin(4.0) / 4;  // negative: only powers 0, 1 and 2 have a value
    const double cases[][3] = {{0, 3.5, 1}, {M_PI / 2, 2, 4 / (M_PI * M_PI)}, {4, 1, q}, {4, 2, q * q}, {4, 0, 1}, {4, 1.5, 0}};
    for (const auto& c : cases) EXPECT_NEAR(sp(c[0], c[1]), c[2], is_double<TypeParam> ? 1e-15 : 1e-6) << c[0] << " " << c[1];
}

// Direct operations multiply the catalogue's forms in and rotate; the FIR prototypes are symmetric and unrotated.
TYPED_TEST(Parametric, DirectFrameAndPrototypes) {
    using T = real_of<TypeParam>;
    const std::vector<T> x = random_values<T>(2 * 37, 3u);
    Vec<TypeParam> direct(x, true), cached(x, true);
    direct->delta = cached->delta = T(0.5);
    ASSERT_EQ(t_window_kaiser(direct.get(), static_cast<T>(9.473960131326246), VLX_WNORM_RMS) + t_window(cached.get(), 14, VLX_WNORM_RMS), 0);
    EXPECT_TRUE(same_scalars(direct.values(), cached.values()) && has_shape(direct.get(), 37, 1, 0.5));

    for (int32_t n : {31, 32})
        for (const auto& [id, param] : std::vector<std::pair<int32_t, double>>{{100, 0.1}, {101, 0.05}, {102, 0.1}, {103, 0.1}, {103, 0.0}, {14, 0}, {31, 0}}) {
            Vec<TypeParam> v(std::vector<T>(n, T(1)), false);
            ASSERT_EQ(t_window_fir(v.get(), id, static_cast<T>(param)), 0) << id;
            for (int i = 0; i < n; ++i) EXPECT_EQ(v[i], v[n - 1 - i]) << id << " " << i;
            // no centre sample for an even n: the middle pair stands at 0.5
            EXPECT_TRUE((n % 2 == 0 || v[n / 2] == T(1)) && ((param == 0 && id >= 100) || v[0] < T(0.9))) << id;
        }
    Vec<TypeParam> v(x, false);
    EXPECT_EQ(t_window_fir(v.get(), 2, T(0)), -1);  // cosine sums reject the symmetric flag
    // id 0, bandwidth 0, and A = 7.95 < 21 (beta 0, ones) change nothing
    EXPECT_EQ(t_window_fir(v.get(), 0, T(0)) + t_window_fir(v.get(), 100, T(0)) + t_window_fir(v.get(), 101, T(0)), 0);
    EXPECT_EQ(v.values(), x);
}

TYPED_TEST(Metrics, FixedValues) {
    using T = real_of<TypeParam>;
    T out = 0;
    const T flat4 = static_cast<T>(0.9994484) * (T(1) / static_cast<T>(0.239523981482822));
    const struct { int32_t id, flags, points; double width; int32_t result; T want; } scale[] = {
        {99, VLX_WNORM_PEAK, 8, 0, 0, T(1)}, {2, VLX_WNORM_RMS, 0, 0, 0, T(1)}, {2, 3, 8, 0, -1, T(0)},
        {2, VLX_WNORM_MEAN, 64, 0, 0, T(2)}, {8, VLX_WNORM_MEAN, 64, 0, 0, flat4},
        {2, VLX_WNORM_RMS, 64, 0, 0, static_cast<T>(0.816496580927726) * T(2)},
        {1, VLX_WNORM_MEAN, 5, 0, 0, T(25) / T(26) * T(2)}, {1, VLX_WNORM_RMS, 5, 0, 0, std::sqrt(T(75) / T(27))},
        {1, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, 8, 8, -1, T(0)}, {32, VLX_WNORM_MEAN, 8, 0, -1, T(0)},
        {2, VLX_WNORM_MEAN | VLX_WFLAG_SYMMETRIC | VLX_WFLAG_WIDTH, 8, 8, -1, T(0)},
    };
    for (const auto& c : scale) {
        out = 0;
        EXPECT_EQ(t_window2_scale(&out, c.id, c.flags, c.points, static_cast<T>(c.width)), c.result) << c.id;
        EXPECT_TRUE(c.result != 0 || same_bits(out, c.want)) << c.id << " " << out << " " << c.want;
    }
    EXPECT_EQ(t_window_scale(&out, 2, VLX_WFLAG_WIDTH, 8), -1);
    const T b = static_cast<T>(3.7707320044);  // Flattop, 3 dB
    const struct { int32_t selector, id, points; double width; int32_t result; T want; } metric[] = {
        {1, 9, 1000, 1000, 0, T(1000) * b / T(1000)}, {1, 9, 1000, 500, 0, T(1000) * b / T(500)},
        {2, 9, 1000, 0, 0, bound_of<TypeParam>()}, {3, 9, 1000, 1000, -1, 0},
        {1, 32, 1000, 1000, -1, 0}, {1, -1, 1000, 1000, -1, 0}, {0, 0, 7, 7, 0, T(1)}, {0, 0, 1000, 1000, 0, T(1)},
        {0, 2, 64, 64, 0, T(1.5)}, {0, 2, 64, 32, 0, T(3)}};  // 1.5 bins of its own width
    for (const auto& c : metric) {
        out = 0;
        EXPECT_EQ(t_window_metric(&out, c.selector, c.id, c.points, static_cast<T>(c.width)), c.result) << c.id;
        EXPECT_NEAR(out, c.want, (is_double<TypeParam> ? 1e-13 : 1e-5) * c.want) << c.selector << " " << c.id;
    }
    EXPECT_EQ(t_window_metric(static_cast<T*>(nullptr), 0, 2, 8, T(8)), -1);
}

// ENBW, 3 dB (half power) and 6 dB (half amplitude) widths: a few parts in 1e4.
TEST(MetricTable, AgreesWithMeasuredBandwidths) {
    constexpr int32_t n = 4096;
    for (int32_t id = 0; id < 32; ++id) {
        const std::vector<double> w = synth<vlx_t>(id, VLX_WNORM_PEAK, n);
        double enbw = 0, b3 = 0, b6 = 0;  // the flat tops' mean scale is relative to their c0
        ASSERT_TRUE(vlx_window_enbw(&enbw, id, n) == 0 && vlx_window_metric(&b3, 1, id, n, n) == 0 &&
                    vlx_window_metric(&b6, 2, id, n, n) == 0);
        EXPECT_NEAR(enbw, c0_of(id) * c0_of(id) * rms_of(w) * rms_of(w) / (mean_of(w) * mean_of(w)), 1e-9 * enbw) << id;
        EXPECT_NEAR(width_at(w, std::sqrt(0.5)), b3, 5e-4 * b3) << id;
        EXPECT_NEAR(width_at(w, 0.5), b6, 5e-4 * b6) << id;
    }
}
