// FIR engine, symmetric and decimating FIR, hwfilt and resampler, their vector lanes; filter staging, the decimator
// and the tolerant point counts. Both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <climits>
#include <complex>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

using namespace vlxtest;

namespace {

VLX_TWIN(d, fir) VLX_TWIN(d, sfir) VLX_TWIN(d, sfir_deci) VLX_TWIN(d, deci) VLX_TWIN(d, hwfilt) VLX_TWIN(d, rsmp)
VLX_TWIN(d, rsmp2) VLX_TEST_TWIN(t_hwfilt_in_place, vlxi_hwfilt, vlxfi_hwfilt)
VLX_TEST_TWIN(t_table, vlxc_rsmp, vlxfc_rsmp) VLX_TEST_TWIN(t_stage, vlx_stage_io, vlxf_stage_io)
VLX_TEST_TWIN(t_unstage, vlx_unstage_io, vlxf_unstage_io)

VLX_TYPED_SUITE(Filters);

// The plain sum from 0, oldest first, in A: T is the engine's order, long double a reference.
template <class A, class T>
std::vector<A> conv(const std::vector<T>& x, bool xc, const std::vector<T>& h, bool hc, const std::vector<T>& past) {
    const int64_t wx = xc ? 2 : 1, wh = hc ? 2 : 1, n = int64_t(x.size()) / wx, m = int64_t(h.size()) / wh;
    std::vector<A> y;
    for (int64_t k = 0; k < n; ++k) {
        A re = 0, im = 0;
        for (int64_t i = m - 1, j = k - i; i >= 0; --i, ++j) {
            const T* s = j >= 0 ? &x[size_t(j * wx)] : past.empty() ? nullptr : &past[size_t((m - 1 + j) * wx)];
            const A xr = s ? A(s[0]) : A(0), xi = s && xc ? A(s[1]) : A(0);
            const A hr = h[size_t(i * wh)], hi = hc ? A(h[size_t(i * wh + 1)]) : A(0);
            if (xc && hc) re += hr * xr - hi * xi, im += hr * xi + hi * xr;
            else if (xc) re += hr * xr, im += hr * xi;
            else re += hr * xr, im += hi * xr;
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

// Direct kernels, real and complex: the stated order bit for bit (vector lanes too).
TYPED_TEST(Filters, DirectKernelsKeepTheirOrder) {
    using V = TypeParam; using T = real_of<V>;
    for (int32_t m : {1, 2, 7, 45, 60})
        for (int cx = 0; cx < 8; ++cx) {
            const bool xc = cx & 1, hc = cx & 2, with_hist = cx & 4;
            const int32_t taps = hc ? m : std::min(m, xc ? 35 : 45), n = 103;  // real taps stay direct
            const auto x = random_values<T>(size_t(n * (xc ? 2 : 1)), 1 + m), h = random_values<T>(size_t(taps * (hc ? 2 : 1)), 2 + m);
            const auto past = with_hist ? random_values<T>(size_t((taps - 1) * (xc ? 2 : 1)), 3) : std::vector<T>{};
            Vec<V> in(x, xc), filter(h, hc), out, hist(past, xc);
            in->delta = T(0.25);
            ASSERT_EQ(t_fir(&in, &out, &filter, with_hist ? hist.get() : nullptr), 0);
            EXPECT_TRUE(has_shape(out.get(), n, (xc || hc) ? 1 : 0, 0.25));
            EXPECT_TRUE(same_scalars(out.values(), conv<T>(x, xc, h, hc, past))) << "m " << taps << " cx " << cx;
            EXPECT_EQ(hist.values(), with_hist ? std::vector<T>(x.end() - (taps - 1) * (xc ? 2 : 1), x.end()) : past);
        }
}

// Fast convolution to rounding: with or without history and wrap, n a power of two or not.
TYPED_TEST(Filters, FastPathMatchesPlainSum) {
    using V = TypeParam; using T = real_of<V>;
    struct Case { int32_t m, n; bool xc; };
    for (const Case c : {Case{46, 1000, false}, Case{63, 1024, false}, Case{200, 300, false}, Case{36, 1000, true},
                         Case{255, 4096, false}, Case{99, 98, true}})
        for (bool with_hist : {false, true}) {
            const int64_t w = c.xc ? 2 : 1;
            const auto x = random_values<T>(size_t(c.n * w), 7), h = random_values<T>(size_t(c.m), 8);
            const auto past = with_hist ? random_values<T>(size_t((c.m - 1) * w), 9) : std::vector<T>{};
            Vec<V> in(x, c.xc), filter(h, false), hist(past, c.xc);
            ASSERT_EQ(t_fir(&in, &in, &filter, with_hist ? hist.get() : nullptr), 0);  // in place
            EXPECT_TRUE(close_to(in.values(), conv<long double>(x, c.xc, h, false, past), is_double<V> ? 1e-12 : 1e-3));
            EXPECT_TRUE(!with_hist || same_scalars(hist.values(), std::vector<T>(x.end() - (c.m - 1) * w, x.end())));
        }
}

// Cache hits within 5 epsilons of the first tap (0: exactly), delta included.
TYPED_TEST(Filters, SpectrumCacheKeyAndTolerance) {
    using V = TypeParam; using T = real_of<V>;
    const auto x = random_values<T>(1000, 11);
    auto run = [&](const std::vector<T>& taps, T delta) {
        Vec<V> in(x, false), filter(taps, false), out;
        filter->delta = delta;
        EXPECT_EQ(t_fir(&in, &out, &filter, nullptr), 0);
        return std::vector<T>(out->data + 64, out->data + 1000);  // past the wrap repair
    };
    for (T first_tap : {T(1), T(0)}) {
        auto h = random_values<T>(64, 12), nudged = h, moved = h;
        h[0] = nudged[0] = moved[0] = first_tap;
        nudged[63] += T(2) * std::numeric_limits<T>::epsilon(), moved[63] += T(1e-3);
        const auto first = run(h, 1);
        EXPECT_TRUE((run(nudged, 1) == first) == (first_tap != 0) && run(moved, 1) != first && run(h, 1) == first);
        EXPECT_NE(run(nudged, T(1.001)), first);
    }
}

// Symmetric filters stream as the full filter on either path; the decimating kernel keeps exactly the plain samples.
TYPED_TEST(Filters, SymmetricStreamsMatchExpandedFilter) {
    using V = TypeParam; using T = real_of<V>;
    const double tol = is_double<V> ? 1e-12 : 1e-4;
    const int64_t total = 400;
    for (int32_t m : {1, 2, 9, 30, 31, 40})
        for (int kind = 0; kind < 8; ++kind) {
            const bool odd = kind & 1, anti = kind & 2, xc = kind & 4;
            const int64_t w = xc ? 2 : 1, N = odd ? 2 * m - 1 : 2 * m;
            const auto x = random_values<T>(size_t(total * w), 20 + m), half = random_values<T>(size_t(m), 30 + m);
            std::vector<T> full = half;
            for (int64_t i = m - (odd ? 2 : 1); i >= 0; --i) full.push_back(anti ? -half[size_t(i)] : half[size_t(i)]);
            const auto want = conv<long double>(x, xc, full, false, {});
            std::vector<long double> kept;
            for (int64_t k = 0; k < total * w; ++k) if ((k / w) % 3 == 0) kept.push_back(want[size_t(k)]);
            Vec<V> filter(half, false), hist, deci_hist, sfir_hist, plain_hist;
            const auto got = in_blocks<V>(x, xc, uint32_t(kind + m), [&](V* in, V* out) { return t_sfir(in, out, &filter, odd, anti, hist.get()); });
            EXPECT_TRUE(close_to(got, want, tol)) << "m " << m << " kind " << kind;
            const auto dec = in_blocks<V>(x, xc, uint32_t(kind), [&](V* in, V* out) {
                Vec<V> plain;
                const int32_t n = in->points;
                EXPECT_EQ(t_sfir(in, &plain, &filter, odd, anti, sfir_hist.get()), 0);
                EXPECT_EQ(t_deci(&plain, &plain, 3, plain_hist.get()), 0);
                const int32_t r = t_sfir_deci(in, out, &filter, odd, anti, 3, deci_hist.get());
                EXPECT_EQ(out->delta, T(3));
                const std::vector<T> kept_here(out->data, out->data + out->points * w);
                EXPECT_TRUE(n < N - 1 || N >= 61 || same_scalars(kept_here, plain.values()));  // both kernels
                return r;
            });
            EXPECT_TRUE(close_to(dec, kept, tol)) << "m " << m << " kind " << kind;
        }
}

// Empty filters copy; a decimating one keeps every factor-th sample and its surplus history point.
TYPED_TEST(Filters, EmptyFilters) {
    using V = TypeParam; using T = real_of<V>;
    const auto x = random_values<T>(100, 40);
    Vec<V> in(x, false), empty, out, hist({T(5), T(6)});
    in->delta = T(0.5);
    EXPECT_TRUE(t_fir(&in, &out, &empty, hist.get()) == 0 && same_scalars(out.values(), x) && has_shape(out.get(), 100, 0, 0.5));
    EXPECT_TRUE(t_sfir_deci(&in, &out, &empty, 1, 0, 4, hist.get()) == 0 && has_shape(out.get(), 24, 0, 2.0) && out[0] == x[5]);
    EXPECT_EQ(hist.values(), (std::vector<T>{1, 6}));  // the surplus point stays
}

// Impulse from silence against H(z); blocks give one call bit for bit; complex is two real streams; id 1 is refused.
TYPED_TEST(Filters, Hwfilt) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> v(std::vector<T>(256, T(0)), false);
    v[0] = 1;
    ASSERT_EQ(t_hwfilt_in_place(&v, 0), 0);
    EXPECT_EQ(std::vector<T>(v->data, v->data + 6), (std::vector<T>{0.00390625, 0.03125, 0.1171875, 0.265625, 0.384765625, 0.328125}));
    for (long double f : {0.0L, 0.1L, 0.15L, 0.25L, 1.0L / 3, 0.5L}) {
        const std::complex<long double> z = std::polar(1.0L, -2 * 3.14159265358979323846L * f);
        std::complex<long double> sum = 0, zk = 1;
        for (int k = 0; k < 256; ++k, zk *= z) sum += (long double)v[k] * zk;
        EXPECT_LT(std::abs(sum - std::pow(0.25L * (1.0L + 2.0L * z + 2.0L * z * z + z * z * z) / (1.0L + 0.5L * z * z), 4)),
                  is_double<V> ? 1e-12 : 1e-6) << f;
    }
    const auto x = random_values<T>(1000, 5);
    Vec<V> whole(x, false), hist, stream_hist;
    ASSERT_EQ(t_hwfilt(&whole, &whole, 0, hist.get()), 0);
    EXPECT_EQ(in_blocks<V>(x, false, 6, [&](V* in, V* out) { return t_hwfilt(in, out, 0, stream_hist.get()); }), whole.values());
    EXPECT_EQ(stream_hist.values(), hist.values());
    std::vector<T> pairs;  // the imaginary part negated: its own stream gives the negated bits
    for (T v : x) pairs.push_back(v), pairs.push_back(-v);
    Vec<V> cx(pairs, true);
    ASSERT_EQ(t_hwfilt_in_place(&cx, 0), 0);
    for (int i = 0; i < 1000; ++i) ASSERT_TRUE(cx[2 * i] == whole[i] && cx[2 * i + 1] == -whole[i]) << i;
    Vec<V> in({1, 2, 3}), out({7}), long_hist(random_values<T>(14, 7), false);
    const auto before = long_hist.values();
    EXPECT_TRUE(t_hwfilt(&in, &out, 1, long_hist.get()) == -1 && out.values() == std::vector<T>{7} && long_hist.values() == before);
    ASSERT_EQ(t_hwfilt(&in, &out, 0, long_hist.get()), 0);
    EXPECT_TRUE(long_hist[12] == before[12] && long_hist[13] == before[13]);
}

// A slow sine comes out at the output times, delayed by 6.5 and scaled by the kernel's gain.
TYPED_TEST(Filters, ResamplerFollowsASlowSine) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> coef;
    coef->points = 13314;
    ASSERT_EQ(t_table(&coef, 4), 0);
    const double f0 = 0.01, two_pi = 6.283185307179586;
    long double gain = 0;  // the continuous kernel's transform, centred
    for (int idx = 0; idx <= 13 * 1024; ++idx) gain += coef[1 + idx] * std::cos(two_pi * f0 * (idx / 1024.0L - 6.5L)) / 1024;
    std::vector<T> x(2000);
    for (size_t i = 0; i < x.size(); ++i) x[i] = T(std::sin(two_pi * f0 * double(i)));
    for (int method : {0, 1})
        for (double ratio : {0.91875, 1.7, 0.5}) {
            Vec<V> in(x, false), out;
            in->delta = T(2), out->points = 10000;
            ASSERT_EQ(t_rsmp(&in, &out, method, &coef, T(ratio), nullptr), 0);
            EXPECT_EQ(out->delta, T(2) * T(ratio));
            EXPECT_NEAR(out->points, std::floor(2000 / ratio) + 1, 1);
            for (int32_t i = int32_t(20 / ratio); i < out->points; ++i)
                ASSERT_NEAR(out[i], gain * std::sin(two_pi * f0 * (i * ratio - 6.5)), 2e-4) << method << " " << ratio;
        }
}

// Refusals, a short table's copy, phase 0 at ratio 1, a zero request, vlxd_rsmp2.
TYPED_TEST(Filters, ResamplerEdgesAndFailures) {
    using V = TypeParam; using T = real_of<V>;
    const auto x = random_values<T>(100, 4);
    Vec<V> coef, complex_coef({1, 0, 2, 0}, true), short_coef({8}), in(x, false), cin(x, true), out, hist, made;
    coef->points = 2050;
    ASSERT_EQ(t_table(&coef, 2), 0);
    EXPECT_EQ(t_rsmp(&in, &out, 1, &coef, T(-1), nullptr) + t_rsmp(&in, &out, 1, &complex_coef, T(1), nullptr), -2);
    EXPECT_EQ(t_rsmp(&cin, &out, 0, &coef, T(1), nullptr) + t_rsmp(&in, &out, 2, &coef, T(1), nullptr), -2);
    in->delta = T(3);
    ASSERT_EQ(t_rsmp(&in, &out, 1, &short_coef, T(7), nullptr), 0);
    EXPECT_TRUE(has_shape(out.get(), 100, 0, 3.0) && out.values() == x);

    out->points = 1000;
    ASSERT_EQ(t_rsmp(&in, &out, 0, &coef, T(1), nullptr), 0);
    T acc = 0;
    for (int j = 0; j < 8; ++j) acc += coef[1 + j * 256] * x[size_t(j)];
    EXPECT_TRUE(out->points == 101 && out[0] == T(0) && out[8] == acc);

    std::vector<T> past(10, T(0));
    past[8] = T(2.5);  // mu 2.5: a zero request moves the window on by 3
    hist.assign(past, false), out->points = 0;
    ASSERT_EQ(t_rsmp(&in, &out, 1, &coef, T(1), hist.get()), 0);
    EXPECT_EQ(std::vector<T>(hist->data + 5, hist->data + 10), (std::vector<T>{x[0], x[1], x[2], T(-0.5), T(3)}));
    hist[8] = T(-1), out->points = 5;
    EXPECT_EQ(t_rsmp(&in, &out, 1, &coef, T(1), hist.get()), -1);

    out->points = made->points = 50;
    ASSERT_EQ(t_rsmp(&in, &out, 1, &coef, T(1.3), nullptr) + t_rsmp2(&in, &made, 1, 2, T(1.3), nullptr), 0);
    EXPECT_TRUE(same_scalars(made.values(), out.values()) && t_rsmp2(&in, &made, 1, 5, T(1), nullptr) == -1);
    EXPECT_EQ(in.values(), x);
#if defined(__SANITIZE_ADDRESS__)
    __lsan::ScopedDisabler settled_loss;  // a failed run keeps its table: settled behaviour
#endif
    EXPECT_EQ(t_rsmp2(&in, &made, 3, 0, T(1), nullptr), -1);
}

// One stream in random blocks of up to 400 points, lanes on then off: the outputs and the final history, joined.
template <class V, class Run>
std::vector<real_of<V>> stream(int32_t lanes, const std::vector<real_of<V>>& x, bool xc, uint32_t seed, bool in_place,
                               Run run) {
    EXPECT_EQ(vlx_filter_lanes(lanes), lanes);
    Vec<V> hist;
    auto got = in_blocks<V>(x, xc, seed, [&](V* in, V* out) { return run(in, out, hist.get()); }, in_place, 400);
    const auto kept = hist.values();
    got.insert(got.end(), kept.begin(), kept.end());
    return got;
}

// Random ratios both ways, both methods, real and complex, short blocks kept in the history, output counts cut short.
TYPED_TEST(Filters, LanesResamplerKeepsScalarBits) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t widest = vlx_filter_lanes(-1);
    Vec<V> table;
    table->points = 13314;  // 13 taps: windows end inside a register
    ASSERT_EQ(t_table(table.get(), 4), 0);
    std::mt19937 rng(7);
    for (int trial = 0; trial < 24; ++trial) {
        const bool cx = trial % 3 == 2;
        const int32_t method = cx ? 1 : trial % 2, cap = int32_t(rng() % 50);
        const T ratio = T(std::uniform_real_distribution<double>(trial % 4 ? 0.3 : 0.999, 2.5)(rng));
        const auto x = random_values<T>(size_t(3000 * (cx ? 2 : 1)), uint32_t(trial));
        const auto run = [&](V* in, V* out, V* hist) {
            out->points = trial % 5 ? 100000 : cap;
            return t_rsmp(in, out, method, table.get(), ratio, hist);
        };
        EXPECT_TRUE(same_scalars(stream<V>(widest, x, cx, uint32_t(trial), false, run),
                                 stream<V>(0, x, cx, uint32_t(trial), false, run))) << "trial " << trial;
    }
    vlx_filter_lanes(widest);
}

// Every odd/anti pairing, real and complex, with and without history, plain and decimating, some blocks short.
TYPED_TEST(Filters, LanesSymmetricKernelsKeepScalarBits) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t widest = vlx_filter_lanes(-1);
    for (int32_t m : {1, 2, 12, 20, 31, 60})
        for (int kind = 0; kind < 8; ++kind)
            for (int32_t factor : {0, 1, 2, 3, 7}) {
                const bool odd = kind & 1, anti = kind & 2, xc = kind & 4, keep = (m + factor) % 2;
                const auto x = random_values<T>(size_t(1500 * (xc ? 2 : 1)), uint32_t(m * 8 + kind));
                Vec<V> filter(random_values<T>(size_t(m), uint32_t(m)), false);
                const auto run = [&](V* in, V* out, V* hist) {
                    V* past = keep ? hist : nullptr;
                    return factor ? t_sfir_deci(in, out, &filter, odd, anti, factor, past) : t_sfir(in, out, &filter, odd, anti, past);
                };
                EXPECT_TRUE(same_scalars(stream<V>(widest, x, xc, uint32_t(kind + factor), true, run),
                                         stream<V>(0, x, xc, uint32_t(kind + factor), true, run)))
                    << "m " << m << " kind " << kind << " factor " << factor;
            }
    vlx_filter_lanes(widest);
}

VLX_TYPED_SUITE(Staging);

// Blocks fed one after another give one long call's samples exactly, whatever the split: every factor-th sample.
TYPED_TEST(Staging, BlockFedDecimationEqualsOneCall) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t total = 97;
    for (bool cx : {false, true})
        for (int32_t factor : {-2, 0, 1, 2, 3, 4, 7, 16, 100})
            for (uint32_t split_seed = 0; split_seed < 12; ++split_seed) {
                const int64_t w = cx ? 2 : 1;
                const auto x = random_values<T>(size_t(total * w), 42);
                const int32_t f = factor < 1 ? 1 : factor;
                std::vector<T> want;
                for (int64_t k = 0; k < total; k += f)
                    for (int64_t c = 0; c < w; ++c) want.push_back(x[size_t(k * w + c)]);
                Vec<V> hist;  // empty: starts from silence; odd blocks decimate in place
                const auto got = in_blocks<V>(x, cx, split_seed, [&](V* in, V* out) {
                    in->delta = T(0.5);
                    const int32_t r = t_deci(in, out, factor, hist.get());
                    EXPECT_TRUE(out->complex == (cx ? 1 : 0) && out->delta == (T(f) * T(0.5)));
                    return r;
                }, true, 23);
                EXPECT_EQ(got, want) << "factor " << factor << " split " << split_seed << " cx " << cx;
                EXPECT_EQ(hist->complex, cx ? 1 : 0);
            }
}

// The stored count still to drop, on blocks of 0, 1, 2, ...; without a history each block starts at its first sample.
TYPED_TEST(Staging, DecimationSkipCount) {
    using V = TypeParam; using T = real_of<V>;
    struct Case { T stored; int32_t n, factor, points; T first, next; };
    const Case cases[] = {  // the whole block still to be dropped; a negative count is 0; counts round to nearest
        {7, 5, 3, 0, -1, 2}, {0, 10, 4, 3, 0, 2}, {0, 0, 4, 0, -1, 0}, {-3, 4, 2, 2, 0, 0}, {1.4f, 6, 2, 3, 1, 1},
        {1.5f, 6, 2, 2, 2, 0}};
    for (const Case& c : cases) {
        std::vector<T> x(size_t(c.n));
        for (int32_t i = 0; i < c.n; ++i) x[size_t(i)] = T(i);
        Vec<V> in(x, false), out, hist({c.stored});
        ASSERT_EQ(t_deci(in.get(), out.get(), c.factor, hist.get()), 0);
        EXPECT_TRUE(out->points == c.points && (c.points == 0 || out[0] == c.first) && hist[0] == c.next) << c.stored << " " << c.n;
    }
    Vec<V> in({1, 2, 3, 4, 5}), dst;
    ASSERT_EQ(t_deci(in.get(), in.get(), 2, static_cast<V*>(nullptr)), 0);
    EXPECT_EQ(in.values(), (std::vector<T>{1, 3, 5}));
    FailingAlloc<V> failing;  // a failed destination is left empty
    EXPECT_TRUE(t_deci(in.get(), dst.get(), 1, static_cast<V*>(nullptr)) == -1 && dst->points == 0);
}

// The history takes the source's type and keeps its surplus; an aliased destination goes through the temporary.
TYPED_TEST(Staging, HistoryAndAliasedDestination) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> in({1, 2, 3, 4}, true), out, hist({9, 8, 7, 6, 5}), a, b;
    in->delta = T(0.25);
    V *hp = hist.get(), *op = out.get(), tmp, *saved = nullptr;
    ASSERT_EQ(t_stage(in.get(), &op, nullptr, &hp, 3, 0, nullptr, nullptr, nullptr), 0);
    EXPECT_TRUE(has_shape(hist.get(), 5, 1, 0.25) && hist[2] == T(8) && hist[3] == T(0) && has_shape(out.get(), 2, 1, 0.25));
    Vec<V> v({1, 2, 3});
    v->points = 2, op = v.get();
    int32_t aliased = -7;
    ASSERT_TRUE(t_stage(v.get(), &op, nullptr, nullptr, 0, VLX_STAGE_ALIAS | VLX_STAGE_KEEP_POINTS, &aliased, &tmp, &saved) == 0 &&
                aliased == 1 && saved == v.get() && op == &tmp && tmp.points == 2);
    for (int32_t i = 0; i < 2; ++i) tmp.data[i] = v[i] * T(10);  // the kernel reads the source
    ASSERT_EQ(t_unstage(op, aliased, saved), 0);
    EXPECT_TRUE(tmp.data == nullptr && v->points == 2 && v[0] == T(10) && v[1] == T(20));
    op = b.get();
    ASSERT_EQ(t_stage(a.get(), &op, nullptr, nullptr, 0, VLX_STAGE_ALIAS, nullptr, nullptr, nullptr), -1);
    ASSERT_EQ(t_stage(a.get(), &op, nullptr, nullptr, 0, VLX_STAGE_ALIAS, &aliased, &tmp, &saved), 0);
    EXPECT_TRUE(aliased == 1 && t_unstage(op, 1, static_cast<V*>(nullptr)) == -1 && t_unstage(op, 1, saved) == 0);
    EXPECT_EQ(t_unstage(a.get(), 0, static_cast<V*>(nullptr)), 0);
}

TEST(PointCounts, NearlyEqualCeilAndFloor) {
    const struct { double a, b; int32_t want; } equal[] = {
        {0.0, 1e-310, 1}, {1e-300, 0.0, 0}, {1.0, 1.0 + 4e-15, 1}, {1.0, 1.0 + 5e-15, 0}, {-2.0, -2.0, 1},
        {2.0, -2.0, 0},   {NAN, NAN, 0},    {1.0, NAN, 0},         {4.4e-307, -4.4e-307, 1}};
    for (const auto& c : equal) EXPECT_EQ(vlx_nearly_equal(c.a, c.b), c.want) << c.a << " " << c.b;
    // the float allowance is 7 epsilons
    EXPECT_TRUE(vlxf_nearly_equal(1.0f, 1.0000007f) == 1 && vlxf_nearly_equal(1.0f, 1.000001f) == 0);
    EXPECT_TRUE(vlxf_nearly_equal(0.0f, 2e-37f) == 1 && vlxf_nearly_equal(3e-37f, 0.0f) == 0);
    struct Case { double x; int32_t ceil, floor; };
    const Case cases[] = {
        {2.0000000000000004, 2, 2}, {1.9999999999999998, 2, 2}, {2.01, 3, 2}, {1.99, 2, 1}, {1e-20, 0, 0},
        {0.5, 1, 0}, {-0.1, 0, 0}, {-1e9, 0, 0}, {NAN, 0, 0}, {3e9, INT_MAX, INT_MAX}, {2147483647.0, INT_MAX, INT_MAX}};
    for (const Case& c : cases) EXPECT_TRUE(vlx_ceil_pts(c.x) == c.ceil && vlx_floor_pts(c.x) == c.floor) << c.x;
    const Case fcases[] = {{2.0000002, 2, 2}, {1.9999999, 2, 2}, {20000.004, 20000, 20000}, {20000.02, 20001, 20000},
                           {2147483648.0, INT_MAX, INT_MAX}, {-3.0, 0, 0}, {0.25, 1, 0}};
    for (const Case& c : fcases) EXPECT_TRUE(vlxf_ceil_pts(float(c.x)) == c.ceil && vlxf_floor_pts(float(c.x)) == c.floor) << c.x;
}

}  // namespace
