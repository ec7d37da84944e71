// Names, closed-form shapes, the cosine-sum recurrence bit for bit, every id's normalisation, worked examples, cache.
#include "window_support.hpp"

#include <string>

using namespace vlxtest;

VLX_TYPED_SUITE(Synthesis);

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
    for (const auto& f : forms) {
        for (int32_t n : {1, 2, 3, 4, 7, 8, 64, 1025, 3001}) {
            const std::vector<T> w = synth<TypeParam>(f.id, VLX_WNORM_PEAK, n);
            for (int32_t i = 0; i < n; ++i)
                ASSERT_TRUE(near(w[i], form(f.id, f.c, static_cast<long double>(i - n / 2) / n), tol)) << f.id << " " << n << " " << i;
        }
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
    for (int32_t count : {2, 5, 7}) {
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
        for (int32_t n : {1, 2, 3, 5, 8, 33, 1000}) {
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
    for (int32_t n : {7, 8, 10}) {
        for (bool cx : {false, true}) {
            const std::vector<T> x = random_values<T>((cx ? 2 : 1) * n, 9u + n);
            Vec<TypeParam> user(x, cx), hann(x, cx);
            ASSERT_EQ(t_window_cos(user.get(), coefs.get()) + t_window(hann.get(), 2, VLX_WNORM_PEAK), 0);
            EXPECT_TRUE(same_scalars(user.values(), hann.values())) << n << cx;
        }
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
