// Hwfilt and the polyphase resampler, both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <complex>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

using namespace vlxtest;

namespace {

VLX_TWIN(d, hwfilt)
VLX_TEST_TWIN(t_hwfilt_in_place, vlxi_hwfilt, vlxfi_hwfilt)
VLX_TWIN(d, rsmp)
VLX_TWIN(d, rsmp2)
VLX_TEST_TWIN(t_table, vlxc_rsmp, vlxfc_rsmp)

template <class V>
class Rate : public ::testing::Test {};
TYPED_TEST_SUITE(Rate, Families);

// Feeds x in blocks of random length (in place on odd blocks if asked) through
// `run(block, out, hist)`, collecting the outputs.
template <class V, class Run>
std::vector<real_of<V>> in_blocks(const std::vector<real_of<V>>& x, bool xc, uint32_t seed, V* hist, Run run,
                                  bool in_place = true) {
    using T = real_of<V>;
    const int64_t w = xc ? 2 : 1, total = int64_t(x.size()) / w;
    std::vector<T> got;
    std::mt19937 rng(seed);
    for (int64_t at = 0, i = 0; at < total; ++i) {
        const int64_t len = std::min<int64_t>(rng() % 70, total - at);
        Vec<V> block(std::vector<T>(x.begin() + at * w, x.begin() + (at + len) * w), xc), other;
        V* out = in_place && i % 2 ? block.get() : other.get();
        EXPECT_EQ(run(block.get(), out, hist), 0);
        got.insert(got.end(), out->data, out->data + out->points * w);
        at += len;
    }
    return got;
}

// The impulse response from silence, and its transform against H(z).
TYPED_TEST(Rate, HwfiltImpulseAndTransferFunction) {
    using V = TypeParam;
    using T = real_of<V>;
    std::vector<T> impulse(256, T(0));
    impulse[0] = 1;
    Vec<V> v(impulse, false);
    ASSERT_EQ(t_hwfilt_in_place(&v, 0), 0);
    EXPECT_EQ(std::vector<T>(v->data, v->data + 6), (std::vector<T>{0.00390625, 0.03125, 0.1171875, 0.265625,
                                                                     0.384765625, 0.328125}));
    using C = std::complex<long double>;
    for (long double f : {0.0L, 0.1L, 0.15L, 0.25L, 1.0L / 3, 0.5L}) {
        const C z1 = std::polar(1.0L, -2 * 3.14159265358979323846L * f);
        const C section = 0.25L * (1.0L + 2.0L * z1 + 2.0L * z1 * z1 + z1 * z1 * z1) / (1.0L + 0.5L * z1 * z1);
        C sum = 0, zk = 1;
        for (int k = 0; k < 256; ++k, zk *= z1) sum += (long double)v[k] * zk;
        EXPECT_LT(std::abs(sum - std::pow(section, 4)), is_double<V> ? 1e-12 : 1e-6) << f;
    }
}

// Blocks on one history give one long call bit for bit, in place or not; a
// complex source is two independent real streams; failures change nothing.
TYPED_TEST(Rate, HwfiltStreamsAndFailures) {
    using V = TypeParam;
    using T = real_of<V>;
    const auto x = random_values<T>(1000, 5);
    Vec<V> whole(x, false), hist;
    ASSERT_EQ(t_hwfilt(&whole, &whole, 0, hist.get()), 0);
    Vec<V> stream_hist;
    EXPECT_EQ(in_blocks<V>(x, false, 6, stream_hist.get(), [](V* in, V* out, V* h) { return t_hwfilt(in, out, 0, h); }),
              whole.values());
    EXPECT_EQ(stream_hist.values(), hist.values());

    std::vector<T> re(500), im(500);
    Vec<V> cx(x, true), sep_re, sep_im;
    for (int i = 0; i < 500; ++i) re[i] = x[2 * i], im[i] = x[2 * i + 1];
    sep_re.assign(re, false), sep_im.assign(im, false);
    ASSERT_EQ(t_hwfilt_in_place(&cx, 0), 0);
    ASSERT_EQ(t_hwfilt_in_place(&sep_re, 0), 0);
    ASSERT_EQ(t_hwfilt_in_place(&sep_im, 0), 0);
    for (int i = 0; i < 500; ++i) EXPECT_TRUE(cx[2 * i] == sep_re[i] && cx[2 * i + 1] == sep_im[i]) << i;

    Vec<V> in({1, 2, 3}), out({7}), long_hist(random_values<T>(14, 7), false);
    const auto before = long_hist.values();
    EXPECT_EQ(t_hwfilt(&in, &out, 1, long_hist.get()), -1);
    EXPECT_EQ(out.values(), std::vector<T>{7});
    EXPECT_EQ(long_hist.values(), before);
    ASSERT_EQ(t_hwfilt(&in, &out, 0, long_hist.get()), 0);
    EXPECT_TRUE(long_hist[12] == before[12] && long_hist[13] == before[13]);
}

// A slow sine comes out as the sine at the output times, delayed by half the
// window of 13 taps and scaled by the kernel's gain at its frequency; the
// count stops where the window would leave the block.
TYPED_TEST(Rate, ResamplerFollowsSlowSine) {
    using V = TypeParam;
    using T = real_of<V>;
    Vec<V> coef;
    coef->points = 13314;
    ASSERT_EQ(t_table(&coef, 4), 0);
    const int32_t n = 2000;
    const double f0 = 0.01, two_pi = 6.283185307179586;
    long double gain = 0;  // the continuous kernel's transform, centred
    for (int idx = 0; idx <= 13 * 1024; ++idx) gain += coef[1 + idx] * std::cos(two_pi * f0 * (idx / 1024.0L - 6.5L));
    gain /= 1024;
    std::vector<T> x(n);
    for (int i = 0; i < n; ++i) x[size_t(i)] = T(std::sin(two_pi * f0 * i));
    for (int method : {0, 1})
        for (double ratio : {0.91875, 1.7, 0.5}) {
            Vec<V> in(x, false), out;
            in->delta = T(2);
            out->points = 10000;
            ASSERT_EQ(t_rsmp(&in, &out, method, &coef, T(ratio), nullptr), 0);
            EXPECT_EQ(out->delta, T(2) * T(ratio));
            EXPECT_NEAR(out->points, std::floor(n / ratio) + 1, 1);
            for (int32_t i = int32_t(20 / ratio); i < out->points; ++i)
                ASSERT_NEAR(out[i], gain * std::sin(two_pi * f0 * (i * ratio - 6.5)), 2e-4) << method << " " << ratio;
        }
}

// Blocks of any length on one history continue one stream, real and complex;
// the history's last point says where each block was used up to.
TYPED_TEST(Rate, ResamplerStreamsAcrossBlocks) {
    using V = TypeParam;
    using T = real_of<V>;
    Vec<V> coef;
    coef->points = 2050;
    ASSERT_EQ(t_table(&coef, 2), 0);
    for (bool xc : {false, true})
        for (double ratio : {0.73, 1.0, 2.6}) {
            const auto x = random_values<T>(size_t(xc ? 1200 : 600), 9);
            Vec<V> whole(x, xc), out, hist;
            out->points = 5000;
            ASSERT_EQ(t_rsmp(&whole, &out, 1, &coef, T(ratio), hist.get()), 0);
            Vec<V> stream_hist;
            const auto got = in_blocks<V>(x, xc, 3, stream_hist.get(), [&](V* in, V* o, V* h) {
                o->points = 5000;
                const T n = T(in->points);
                const int32_t r = t_rsmp(in, o, 1, coef.get(), T(ratio), h);
                EXPECT_EQ(h->data[(8 + 1) * (xc ? 2 : 1)], n);  // used up to the end
                return r;
            }, false);  // in place, the preset count would be the block's length
            const auto want = out.values();
            ASSERT_EQ(got.size(), want.size());
            for (size_t i = 0; i < got.size(); ++i) ASSERT_NEAR(got[i], want[i], is_double<V> ? 1e-13 : 1e-5) << i;
        }
}

// Refusals, the copy of a short table, a zero request, and the temporary
// table of vlxd_rsmp2.
TYPED_TEST(Rate, ResamplerEdgesAndFailures) {
    using V = TypeParam;
    using T = real_of<V>;
    const auto x = random_values<T>(100, 4);
    Vec<V> coef, complex_coef({1, 0, 2, 0}, true), short_coef({8}), in(x, false), cin(x, true), out, hist;
    coef->points = 2050;
    ASSERT_EQ(t_table(&coef, 2), 0);
    EXPECT_EQ(t_rsmp(&in, &out, 1, &coef, T(-1), nullptr), -1);
    EXPECT_EQ(t_rsmp(&in, &out, 1, &complex_coef, T(1), nullptr), -1);
    EXPECT_EQ(t_rsmp(&cin, &out, 0, &coef, T(1), nullptr), -1);
    EXPECT_EQ(t_rsmp(&in, &out, 2, &coef, T(1), nullptr), -1);
    in->delta = T(3);
    ASSERT_EQ(t_rsmp(&in, &out, 1, &short_coef, T(7), nullptr), 0);
    EXPECT_TRUE(has_shape(out.get(), 100, 0, 3.0));
    EXPECT_EQ(out.values(), x);

    // ratio 1, method 0: phase 0 throughout, and silence for the first output
    out->points = 1000;
    ASSERT_EQ(t_rsmp(&in, &out, 0, &coef, T(1), nullptr), 0);
    EXPECT_EQ(out->points, 101);
    EXPECT_EQ(out[0], T(0));
    T acc = 0;
    for (int j = 0; j < 8; ++j) acc += coef[1 + j * 256] * x[size_t(j)];
    EXPECT_EQ(out[8], acc);

    // a zero request only re-normalises mu: 2.5 moves the window on by 3
    std::vector<T> past(10, T(0));
    past[8] = T(2.5);
    hist.assign(past, false);
    out->points = 0;
    ASSERT_EQ(t_rsmp(&in, &out, 1, &coef, T(1), hist.get()), 0);
    EXPECT_EQ(out->points, 0);
    EXPECT_EQ(std::vector<T>(hist->data + 5, hist->data + 10), (std::vector<T>{x[0], x[1], x[2], T(-0.5), T(3)}));
    hist[8] = T(-1);
    out->points = 5;
    EXPECT_EQ(t_rsmp(&in, &out, 1, &coef, T(1), hist.get()), -1);

    Vec<V> direct, made;
    direct->points = made->points = 50;
    ASSERT_EQ(t_rsmp(&in, &direct, 1, &coef, T(1.3), nullptr), 0);
    ASSERT_EQ(t_rsmp2(&in, &made, 1, 2, T(1.3), nullptr), 0);
    EXPECT_TRUE(same_scalars(made.values(), direct.values()));
    EXPECT_EQ(t_rsmp2(&in, &made, 1, 5, T(1), nullptr), -1);
    EXPECT_EQ(in.values(), x);
#if defined(__SANITIZE_ADDRESS__)
    __lsan::ScopedDisabler settled_loss;  // a failed run keeps its table: settled behaviour
#endif
    EXPECT_EQ(t_rsmp2(&in, &made, 3, 0, T(1), nullptr), -1);
}

}  // namespace
