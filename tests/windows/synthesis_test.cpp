// The catalogue's names, the cosine sums against their closed forms and bit
// for bit against the recurrence they are defined by, the normalisation of
// every id, worked examples, the cache and windowing from several threads.
#include "window_support.hpp"

#include <string>
#include <thread>

using namespace vlxtest;

template <class V>
class Synthesis : public ::testing::Test {};
TYPED_TEST_SUITE(Synthesis, Families);

TEST(Catalogue, NamesAndIds) {
    const struct { const char* name; int32_t result, id; } from[] = {
        {"Hann", 0, 2}, {"hANN", 0, 2}, {"p110", 0, 2}, {"VLX_WINDOW_HANN", 0, 2}, {"vlx_window_P110", 0, 2},
        {"RRC", 0, 25}, {"blackman_nuttall", 0, 28}, {"Gauss73", 0, 31}, {"Han", -1, 0}, {"Hann ", -1, 0},
        {"", -1, 0}, {"VLX_WINDOW_", -1, 0}, {"Kaiser7", -1, 0},
    };
    for (const auto& c : from) {
        int32_t id = 99;
        EXPECT_EQ(vlx_window_from_str(c.name, &id), c.result) << c.name;
        EXPECT_EQ(id, c.id) << c.name;
        EXPECT_EQ(vlxf_window_from_str(c.name, &id), c.result) << c.name;
    }
    int32_t id = 7;
    EXPECT_EQ(vlx_window_from_str(nullptr, &id), -1);
    EXPECT_EQ(id, 7);
    // every canonical name and its constant-style twin lead back to the id
    for (int32_t i = 0; i < 32; ++i) {
        char name[32];
        ASSERT_EQ(vlx_window_to_str(i, name, sizeof name), 0);
        std::string upper = "VLX_WINDOW_";
        for (const char* p = name; *p; ++p) upper += static_cast<char>(std::toupper(*p));
        EXPECT_EQ(vlxf_window_from_str(upper.c_str(), &id), 0);
        EXPECT_EQ(id, i) << upper;
    }
    const struct { int32_t id, len, result; const char* want; } to[] = {
        {25, 32, 0, "Cos_Lobe"}, {6, 32, 0, "Blackman_Harris4"}, {4, 3, 0, "Bl"}, {4, 1, 0, ""},
        {32, 8, -1, ""}, {-1, 8, -1, ""},
    };
    for (const auto& c : to) {
        char buf[32];
        std::memset(buf, 'x', sizeof buf);
        EXPECT_EQ(vlxf_window_to_str(c.id, buf, c.len), c.result);
        EXPECT_STREQ(buf, c.want);
    }
    EXPECT_EQ(vlx_window_to_str(2, nullptr, 8), -1);
    EXPECT_EQ(vlx_window_to_str(2, nullptr, 0), -1);
}

// Peak mode against c0 + c1 cos(2 pi d / n) + ..., d the distance from the
// centre.  Float tolerance: up to 1024 repeated additions of the base angle.
TYPED_TEST(Synthesis, CosineSumsMatchClosedForm) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 5e-12L : 3e-4L;
    for (int32_t id = 2; id < 30; ++id) {
        const PeakTable& t = peak_table(id);
        if (t.count == 0) continue;
        for (int32_t n : {1, 2, 3, 4, 7, 8, 64, 1025, 3001}) {
            const std::vector<T> w = synth<TypeParam>(id, VLX_WNORM_PEAK, n);
            for (int32_t i = 0; i < n; ++i)
                ASSERT_TRUE(near(w[i], cos_sum_ld(t, 2 * M_PIl * (i - n / 2) / n), tol)) << id << " " << n << " " << i;
        }
    }
}

// The defined recurrence: base angle by repeated addition of the step, each
// term's argument by adding the base angle, re-seeded after every 1024
// samples; the float step is 2 pi (single) over n divided in double.
TYPED_TEST(Synthesis, CosineSumBitsFollowRecurrence) {
    using T = real_of<TypeParam>;
    for (int32_t id : {2, 7, 11, 27}) {
        const PeakTable& t = peak_table(id);
        T c[7];
        for (int k = 0; k < t.count; ++k) c[k] = static_cast<T>(t.c[k]);
        for (int32_t n : {6, 2050, 3073}) {
            const T step = is_double<TypeParam> ? T(6.283185307179586 / n) : T(6.2831854820251465 / n);
            auto at = [&](T theta) {
                T s = c[0], a = theta;
                for (int k = 1; k < t.count; ++k, a += theta) s += c[k] * std::cos(a);
                return s;
            };
            std::vector<T> want(n);
            T centre = c[0];
            for (int k = 1; k < t.count; ++k) centre += c[k];
            want[n / 2] = centre;
            T theta = step;
            for (int32_t i = 1; i <= (n - 1) / 2; ++i) {
                want[n / 2 + i] = want[n / 2 - i] = at(theta);
                theta = i % 1024 == 0 ? T(i + 1) * step : theta + step;
            }
            if (n % 2 == 0) want[0] = at(theta);
            EXPECT_TRUE(same_scalars(synth<TypeParam>(id, VLX_WNORM_PEAK, n), want)) << id << " " << n;
        }
    }
}

// Mean mode gives mean c0, rms mode rms 1, peak mode a centre of 1, for every
// id and every length, short ones (aliasing corrections) included.
TYPED_TEST(Synthesis, EveryIdNormalises) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 1e-12L : 2e-5L;
    const double flat_c0[6] = {0.9994484, 0.9996403, 0.999760855, 0.999820406, 0.99974762, 0.999813874};
    for (int32_t id = 0; id < 32; ++id) {
        for (int32_t n : {1, 2, 3, 5, 8, 33, 1000}) {
            const long double c0 = (id >= 8 && id <= 13) ? static_cast<T>(flat_c0[id - 8]) : 1.0L;
            EXPECT_TRUE(near(mean_of(synth<TypeParam>(id, VLX_WNORM_MEAN, n)), c0, tol)) << id << " " << n;
            EXPECT_TRUE(near(rms_of(synth<TypeParam>(id, VLX_WNORM_RMS, n)), 1.0L, tol)) << id << " " << n;
            EXPECT_TRUE(near(synth<TypeParam>(id, VLX_WNORM_PEAK, n)[n / 2], 1.0L, tol)) << id << " " << n;
            // a narrower window is measured again after the zeros around it
            if (id != 1 && id != 23 && id != 24 && n >= 8) {
                const double width = 0.6 * n + 0.3;
                EXPECT_TRUE(near(mean_of(synth<TypeParam>(id, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, n, width)), c0, tol));
                EXPECT_TRUE(near(rms_of(synth<TypeParam>(id, VLX_WNORM_RMS | VLX_WFLAG_WIDTH, n, width)), 1.0L, tol));
            }
        }
    }
}

TYPED_TEST(Synthesis, TriangleAndCosineLobeShapes) {
    using T = real_of<TypeParam>;
    const long double tol = is_double<TypeParam> ? 1e-12L : 1e-4L;
    for (int32_t n : {2, 5, 8, 3001}) {
        const std::vector<T> tri = synth<TypeParam>(1, VLX_WNORM_PEAK, n);
        const std::vector<T> lobe = synth<TypeParam>(25, VLX_WNORM_PEAK, n);
        for (int32_t i = 0; i < n; ++i) {
            const long double d = std::fabs(static_cast<long double>(i - n / 2));
            ASSERT_TRUE(near(tri[i], 1.0L - 2.0L * d / n, tol)) << n << " " << i;
            ASSERT_TRUE(near(lobe[i], std::cos(M_PIl * d / n), tol)) << n << " " << i;
        }
    }
    int32_t st = 0;
    synth<TypeParam>(1, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH, 8, 4.0, &st);
    EXPECT_EQ(st, -1);
    for (int32_t id : {0, 1, 2, 25}) {
        synth<TypeParam>(id, VLX_WNORM_PEAK | VLX_WFLAG_SYMMETRIC, 8, 0.0, &st);
        EXPECT_EQ(st, -1) << id;
    }
}

TYPED_TEST(Synthesis, WorkedExamples) {
    using T = real_of<TypeParam>;
    const T h8 = static_cast<T>(0.5 + 0.5 * std::cos(M_PI / 4)), h5 = static_cast<T>(0.5 + 0.5 * std::cos(4 * M_PI / 5)),
            h5a = static_cast<T>(0.5 + 0.5 * std::cos(2 * M_PI / 5));
    const struct { int32_t id, flags, n; double width; std::vector<double> want; } cases[] = {
        {2, VLX_WNORM_PEAK | VLX_WFLAG_NO_SWAP, 8, 0, {0, 0.5 - h8 + 0.5, 0.5, h8, 1, h8, 0.5, 0.5 - h8 + 0.5}},
        {2, VLX_WNORM_PEAK | VLX_WFLAG_NO_SWAP, 5, 0, {h5, h5a, 1, h5a, h5}},
        {2, VLX_WNORM_MEAN, 1, 0, {1.0}},
        {2, VLX_WNORM_RMS | VLX_WFLAG_NO_SWAP, 2, 0, {0.0, std::sqrt(2.0)}},
        {0, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, 8, 2.5, {8 / 3.0, 8 / 3.0, 8 / 3.0, 0, 0, 0, 0, 0}},
        {2, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH | VLX_WFLAG_NO_SWAP, 16, 4.0,
         {0, 0, 0, 0, 0, 0, 0, 0.5, 1, 0.5, 0, 0, 0, 0, 0, 0}},
        // wider than the vector: cut by its ends, w[0] at distance n/2 of 2n
        {2, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH | VLX_WFLAG_NO_SWAP, 4, 8.0, {0.5, h8, 1, h8}},
    };
    for (const auto& c : cases) {
        Vec<TypeParam> v(std::vector<T>(c.n, T(1)), false);
        v->delta = T(0.25);
        ASSERT_EQ(t_window2(v.get(), c.id, c.flags, static_cast<T>(c.width)), 0);
        EXPECT_TRUE(has_shape(v.get(), c.n, 0, 0.25));
        for (int32_t i = 0; i < c.n; ++i) EXPECT_NEAR(v[i], c.want[i], is_double<TypeParam> ? 1e-15 : 1e-6) << c.n << " " << i;
    }
    // id 0 without a width changes nothing, complex and rms mode included;
    // every other id keeps delta and the complex flag
    Vec<TypeParam> z({1, 2, 3, 4, 5, 6}, true);
    EXPECT_EQ(t_window(z.get(), 0, VLX_WNORM_RMS), 0);
    EXPECT_EQ(z.values(), (std::vector<T>{1, 2, 3, 4, 5, 6}));
    EXPECT_EQ(t_window(z.get(), 0, VLX_WFLAG_SWAP_UNIFORM), 0);
    EXPECT_EQ(z.values(), (std::vector<T>{3, 4, 5, 6, 1, 2}));
    for (int32_t id = 0; id < 32; ++id) {
        Vec<TypeParam> c(random_values<T>(2 * 12, 5u), true);
        c->delta = T(0.25);
        EXPECT_EQ(t_window2(c.get(), id, VLX_WNORM_MEAN | VLX_WFLAG_WIDTH, T(12)), id == 1 || id == 23 || id == 24 ? -1 : 0);
        EXPECT_TRUE(has_shape(c.get(), 12, 1, 0.25)) << id;
    }
    Vec<TypeParam> v(std::vector<T>(8, T(1)), false);
    EXPECT_EQ(t_window2(v.get(), 2, 3, T(0)), -1);
    EXPECT_EQ(t_window(v.get(), 2, VLX_WFLAG_WIDTH), -1);
    EXPECT_EQ(t_window2(v.get(), 32, 0, T(0)), -1);
    EXPECT_EQ(v.values(), std::vector<T>(8, T(1)));
    // a width equal to n is the full window up to rounding
    EXPECT_TRUE(same_scalars(synth<TypeParam>(7, VLX_WNORM_PEAK | VLX_WFLAG_WIDTH, 100, 100.0),
                             synth<TypeParam>(7, VLX_WNORM_PEAK, 100), 8));
}

TYPED_TEST(Synthesis, UserCoefficients) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> v(std::vector<T>(8, T(2)), false), coefs({0.5, 0.5});
    ASSERT_EQ(t_window_cos(v.get(), coefs.get()), 0);
    Vec<TypeParam> hann(std::vector<T>(8, T(2)), false);
    ASSERT_EQ(t_window(hann.get(), 2, VLX_WNORM_PEAK), 0);
    EXPECT_TRUE(same_scalars(v.values(), hann.values()));
    // the cached path multiplies and rotates an even complex vector in one pass
    const std::vector<T> x = random_values<T>(2 * 10, 9u);
    Vec<TypeParam> cv(x, true), ch(x, true);
    ASSERT_EQ(t_window_cos(cv.get(), coefs.get()), 0);
    ASSERT_EQ(t_window(ch.get(), 2, VLX_WNORM_PEAK), 0);
    EXPECT_TRUE(same_scalars(cv.values(), ch.values()));
    Vec<TypeParam> empty, cplx({1, 0}, true);
    EXPECT_EQ(t_window_cos(empty.get(), cplx.get()), -1);
    EXPECT_EQ(t_cos_sum(v.get(), coefs.get(), VLX_WFLAG_SYMMETRIC, T(0)), -1);
}

// A failed synthesis keeps its entry, so the same key repeated finds it and
// succeeds: that makes hits and evictions visible from outside.
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
        if (k == 14) {
            EXPECT_EQ(t_window2(v.get(), 2, failing, T(0)), 0);  // 15 new keys: still held
        }
    }
    EXPECT_EQ(t_window2(v.get(), 2, failing, T(0)), -1);  // the 17th key took entry 0
    EXPECT_EQ(t_free_internal<TypeParam>(), 0);
    EXPECT_EQ(t_window2(v.get(), 2, failing, T(0)), -1);
    // widths are keys only under flag 8, and then up to rounding noise
    Vec<TypeParam> a(std::vector<T>(64, T(1)), false), b(std::vector<T>(64, T(1)), false);
    ASSERT_EQ(t_window2(a.get(), 4, VLX_WFLAG_WIDTH, T(40)), 0);
    ASSERT_EQ(t_window2(b.get(), 4, VLX_WFLAG_WIDTH, T(40) * (1 + std::numeric_limits<T>::epsilon())), 0);
    EXPECT_TRUE(same_scalars(a.values(), b.values()));
    EXPECT_EQ(t_free_internal<TypeParam>(), 0);
}

TYPED_TEST(Synthesis, AllocationFailureLeavesVectorAlone) {
    using T = real_of<TypeParam>;
    ASSERT_EQ(t_free_internal<TypeParam>(), 0);
    Vec<TypeParam> v(std::vector<T>(16, T(3)), false);
    {
        FailingAlloc<TypeParam> fail;
        EXPECT_EQ(t_window(v.get(), 2, 0), -1);
        EXPECT_EQ(t_window_kaiser(v.get(), T(5), 0), -1);
        EXPECT_EQ(t_window_cos(v.get(), v.get()), -1);
    }
    EXPECT_EQ(v.values(), std::vector<T>(16, T(3)));
    EXPECT_EQ(t_window(v.get(), 2, VLX_WNORM_PEAK), 0);  // the failed claim left no entry behind
    EXPECT_EQ(v[0], T(3));
}

// Windowing from several threads at once, through more keys than the cache
// holds, gives what one thread gets.
TYPED_TEST(Synthesis, SeveralThreads) {
    using T = real_of<TypeParam>;
    vlx_lib_init();
    constexpr int kKeys = 24;
    std::vector<std::vector<T>> want(kKeys);
    for (int k = 0; k < kKeys; ++k) {
        Vec<TypeParam> v(std::vector<T>(100 + k, T(1)), false);
        ASSERT_EQ(t_window(v.get(), 2 + k % 12, k % 3), 0);
        want[k] = v.values();
    }
    std::vector<std::thread> threads;
    std::atomic<int> wrong{0};
    for (int th = 0; th < 4; ++th) {
        threads.emplace_back([&, th] {
            for (int r = 0; r < 60; ++r) {
                const int k = (r * 7 + th * 5) % kKeys;
                Vec<TypeParam> v(std::vector<T>(100 + k, T(1)), false);
                if (t_window(v.get(), 2 + k % 12, k % 3) != 0 || !same_scalars(v.values(), want[k])) ++wrong;
            }
        });
    }
    for (auto& t : threads) t.join();
    EXPECT_EQ(wrong.load(), 0);
}
