// FIR engine, symmetric and decimating symmetric FIR, both families.
#include "vlx_test.hpp"

#include <algorithm>

using namespace vlxtest;

namespace {

VLX_TWIN(d, fir)
VLX_TWIN(d, sfir)
VLX_TWIN(d, sfir_deci)
VLX_TWIN(d, deci)

template <class V>
int32_t free_internal() { return is_double<V> ? vlx_free_internal() : vlxf_free_internal(); }

template <class V>
class Fir : public ::testing::Test {};
TYPED_TEST_SUITE(Fir, Families);

// The plain sum oldest sample first, history first, from 0, in accumulator
// type A: A = T gives the order the engine keeps, A = long double a reference.
// `past` holds m - 1 points, or nothing for silence.
template <class A, class T>
std::vector<A> conv(const std::vector<T>& x, bool xc, const std::vector<T>& h, bool hc, const std::vector<T>& past) {
    const int64_t wx = xc ? 2 : 1, wh = hc ? 2 : 1, n = int64_t(x.size()) / wx, m = int64_t(h.size()) / wh;
    std::vector<A> y;
    for (int64_t k = 0; k < n; ++k) {
        A re = 0, im = 0;
        for (int64_t i = m - 1; i >= 0; --i) {
            const int64_t j = k - i;
            const T* s = j >= 0 ? &x[size_t(j * wx)] : past.empty() ? nullptr : &past[size_t((m - 1 + j) * wx)];
            const A xr = s ? A(s[0]) : A(0), xi = s && xc ? A(s[1]) : A(0);
            const A hr = h[size_t(i * wh)], hi = hc ? A(h[size_t(i * wh + 1)]) : A(0);
            if (xc && hc) re += hr * xr - hi * xi, im += hr * xi + hi * xr;
            else if (xc) re += hr * xr, im += hr * xi;
            else if (hc) re += hr * xr, im += hi * xr;
            else re += hr * xr;
        }
        y.push_back(re);
        if (xc || hc) y.push_back(im);
    }
    return y;
}

template <class T>
::testing::AssertionResult close_to(const std::vector<T>& got, const std::vector<long double>& want, double tol) {
    if (got.size() != want.size()) return ::testing::AssertionFailure() << got.size() << " vs " << want.size();
    for (size_t i = 0; i < got.size(); ++i)
        if (!near(got[i], want[i], tol)) return near(got[i], want[i], tol) << " at scalar " << i;
    return ::testing::AssertionSuccess();
}

template <class T>
std::vector<T> full_filter(const std::vector<T>& half, bool odd, bool anti) {
    std::vector<T> f = half;
    for (int64_t i = int64_t(half.size()) - (odd ? 2 : 1); i >= 0; --i) f.push_back(anti ? -half[size_t(i)] : half[size_t(i)]);
    return f;
}

// Direct kernels, every mix of real and complex: the engine's bits are the
// stated order (the vector lanes included), and close to long double.
TYPED_TEST(Fir, DirectKernelsKeepTheirOrder) {
    using V = TypeParam;
    using T = real_of<V>;
    const double tol = is_double<V> ? 1e-13 : 2e-5;
    for (int32_t m : {1, 2, 7, 45, 60})
        for (int cx = 0; cx < 4; ++cx)
            for (bool with_hist : {false, true}) {
                const bool xc = cx & 1, hc = cx & 2;
                const int32_t n = 103;  // real taps stay below the fast path's thresholds
                const int32_t taps = hc ? m : std::min(m, xc ? 35 : 45);
                const auto x = random_values<T>(size_t(n * (xc ? 2 : 1)), 1 + m);
                const auto h = random_values<T>(size_t(taps * (hc ? 2 : 1)), 2 + m);
                const auto past = with_hist ? random_values<T>(size_t((taps - 1) * (xc ? 2 : 1)), 3) : std::vector<T>{};
                Vec<V> in(x, xc), filter(h, hc), out, hist(past, xc);
                in->delta = T(0.25);
                ASSERT_EQ(t_fir(&in, &out, &filter, with_hist ? hist.get() : nullptr), 0);
                EXPECT_TRUE(has_shape(out.get(), n, (xc || hc) ? 1 : 0, 0.25));
                const auto order = conv<T>(x, xc, h, hc, past);
                EXPECT_TRUE(same_scalars(out.values(), order)) << "m " << taps << " cx " << cx << " hist " << with_hist;
                EXPECT_TRUE(close_to(out.values(), conv<long double>(x, xc, h, hc, past), tol));
                if (with_hist) {  // the last taps - 1 inputs, oldest first
                    EXPECT_EQ(hist.values(), std::vector<T>(x.end() - (taps - 1) * (xc ? 2 : 1), x.end()));
                }
            }
}

// The fast convolution agrees with the plain sum to rounding, with and
// without history, n a power of two or not, and on both thresholds.
TYPED_TEST(Fir, FastPathMatchesPlainSum) {
    using V = TypeParam;
    using T = real_of<V>;
    const double tol = is_double<V> ? 1e-12 : 1e-3;  // sums of up to 255 terms of size 1
    struct Case { int32_t m, n; bool xc; };
    for (const Case c : {Case{46, 1000, false}, Case{63, 1024, false}, Case{200, 300, false}, Case{36, 1000, true},
                         Case{255, 4096, false}, Case{99, 98, true}})
        for (bool with_hist : {false, true}) {
            const int64_t w = c.xc ? 2 : 1;
            const auto x = random_values<T>(size_t(c.n * w), 7), h = random_values<T>(size_t(c.m), 8);
            const auto past = with_hist ? random_values<T>(size_t((c.m - 1) * w), 9) : std::vector<T>{};
            Vec<V> in(x, c.xc), filter(h, false), hist(past, c.xc);
            ASSERT_EQ(t_fir(&in, &in, &filter, with_hist ? hist.get() : nullptr), 0);  // in place
            EXPECT_TRUE(close_to(in.values(), conv<long double>(x, c.xc, h, false, past), tol)) << c.m << " " << c.n;
            if (with_hist) {
                EXPECT_EQ(hist.values(), std::vector<T>(x.end() - (c.m - 1) * w, x.end()));
            }
        }
    EXPECT_EQ(free_internal<V>(), 0);
}

// The spectrum cache hits within 5 epsilons of the first tap: the samples
// that only the spectrum makes stay those of the cached filter.
TYPED_TEST(Fir, SpectrumCacheKeyAndTolerance) {
    using V = TypeParam;
    using T = real_of<V>;
    const auto x = random_values<T>(1000, 11);
    auto h = random_values<T>(64, 12);
    h[0] = 1;
    auto run = [&](const std::vector<T>& taps, T delta) {
        Vec<V> in(x, false), filter(taps, false), out;
        filter->delta = delta;
        EXPECT_EQ(t_fir(&in, &out, &filter, nullptr), 0);
        return std::vector<T>(out->data + 64, out->data + 1000);
    };
    const auto first = run(h, 1);
    auto nudged = h, moved = h;
    nudged[63] += T(2) * std::numeric_limits<T>::epsilon();  // below 5 epsilons of h[0]
    moved[63] += T(1e-3);
    EXPECT_EQ(run(nudged, 1), first);
    EXPECT_NE(run(moved, 1), first);
    EXPECT_EQ(run(h, 1), first);
    h[0] = 0;  // a first tap of 0 must match exactly
    const auto zero_first = run(h, 1);
    nudged = h, nudged[63] += T(2) * std::numeric_limits<T>::epsilon();
    EXPECT_NE(run(nudged, 1), zero_first);
    EXPECT_EQ(free_internal<V>(), 0);
}

// Symmetric filters of every kind equal the expanded filter to rounding, the
// expansion path and the kernel path alike; blocks of any length on one
// history continue one stream, and the decimating kernel keeps exactly the
// samples of the plain filter followed by the decimator.
TYPED_TEST(Fir, SymmetricStreamsMatchExpandedFilter) {
    using V = TypeParam;
    using T = real_of<V>;
    const double tol = is_double<V> ? 1e-12 : 1e-4;
    const int32_t total = 400;
    for (int32_t m : {1, 2, 9, 30, 31, 40})
        for (int kind = 0; kind < 8; ++kind) {
            const bool odd = kind & 1, anti = kind & 2, xc = kind & 4;
            const int64_t w = xc ? 2 : 1;
            const auto x = random_values<T>(size_t(total * w), 20 + m), half = random_values<T>(size_t(m), 30 + m);
            const auto want = conv<long double>(x, xc, full_filter(half, odd, anti), false, {});
            const int32_t N = odd ? 2 * m - 1 : 2 * m;
            Vec<V> filter(half, false), hist, deci_hist, sfir_hist, plain_hist;
            std::vector<T> got, decimated, plain_decimated;
            std::mt19937 rng(uint32_t(kind + m));
            for (int32_t at = 0, factor = 3; at < total;) {
                const int32_t len = std::min<int32_t>(int32_t(rng() % 90), total - at);  // short blocks expand
                Vec<V> block(std::vector<T>(x.begin() + at * w, x.begin() + (at + len) * w), xc), out, dout, pout;
                ASSERT_EQ(t_sfir(&block, &out, &filter, odd, anti, hist.get()), 0);
                got.insert(got.end(), out->data, out->data + out->points * w);
                ASSERT_EQ(t_sfir_deci(&block, &dout, &filter, odd, anti, factor, deci_hist.get()), 0);
                decimated.insert(decimated.end(), dout->data, dout->data + dout->points * w);
                // the same block through the plain filter and the decimator
                ASSERT_EQ(t_sfir(&block, &pout, &filter, odd, anti, sfir_hist.get()), 0);
                ASSERT_EQ(t_deci(&pout, &pout, factor, plain_hist.get()), 0);
                if (len >= N - 1 && N < 61) {  // both run the symmetric kernel
                    EXPECT_TRUE(same_scalars(std::vector<T>(dout->data, dout->data + dout->points * w),
                                             std::vector<T>(pout->data, pout->data + pout->points * w)));
                }
                plain_decimated.insert(plain_decimated.end(), pout->data, pout->data + pout->points * w);
                EXPECT_EQ(dout->delta, T(factor));
                at += len;
            }
            EXPECT_TRUE(close_to(got, want, tol)) << "m " << m << " kind " << kind;
            std::vector<long double> kept;
            for (int64_t k = 0; k < total; k += 3)
                for (int64_t c = 0; c < w; ++c) kept.push_back(want[size_t(k * w + c)]);
            EXPECT_TRUE(close_to(decimated, kept, tol)) << "m " << m << " kind " << kind;
            EXPECT_TRUE(close_to(plain_decimated, kept, tol));
        }
    EXPECT_EQ(free_internal<V>(), 0);
}

// Empty filters copy; failures leave -1; in place equals out of place.
TYPED_TEST(Fir, EdgesAndFailures) {
    using V = TypeParam;
    using T = real_of<V>;
    const auto x = random_values<T>(100, 40);
    vlx_lib_init();
    Vec<V> in(x, false), empty, out, hist({T(5), T(6)});
    in->delta = T(0.5);
    ASSERT_EQ(t_fir(&in, &out, &empty, hist.get()), 0);
    EXPECT_EQ(out.values(), x);
    EXPECT_TRUE(has_shape(out.get(), 100, 0, 0.5));
    // a copy, then every 4th sample from the skip count of 5 at point 0
    ASSERT_EQ(t_sfir_deci(&in, &out, &empty, 1, 0, 4, hist.get()), 0);
    EXPECT_TRUE(has_shape(out.get(), 24, 0, 2.0));
    EXPECT_EQ(out[0], x[5]);
    EXPECT_EQ(hist.values(), (std::vector<T>{1, 6}));  // the surplus point stays

    for (int path = 0; path < 3; ++path) {
        Vec<V> src(x, false), filter(random_values<T>(path == 2 ? 64 : 20, 41), false), result(x, false);
        FailingAlloc<V> failing;
        // aliasing needs a temporary, and the fast path a workspace
        const int32_t r = path == 0   ? t_fir(&src, &src, &filter, nullptr)
                          : path == 1 ? t_sfir(&src, &src, &filter, 1, 0, nullptr)
                                      : t_fir(&src, &result, &filter, nullptr);
        EXPECT_EQ(r, -1) << path;
    }
    Vec<V> again(x, false), filter(random_values<T>(64, 42), false);
    EXPECT_EQ(t_fir(&again, &again, &filter, nullptr), 0);  // the lock was released
    EXPECT_EQ(free_internal<V>(), 0);
    EXPECT_EQ(free_internal<V>(), 0);
}

}  // namespace
