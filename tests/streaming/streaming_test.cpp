// The sweep averager, correlation and the spectrum pipeline; the streaming resampler: set-up, delay and start-up,
// point counts, a stream in blocks, one measurement's road. Both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <complex>

using namespace vlxtest;

namespace {

VLX_TWIN(h, avg) VLX_TWIN(h, corr) VLX_TWIN(i, scale) VLX_TEST_TWIN(t_bcorr, vlxb_corr, vlxfb_corr) VLX_TWIN(h, dft)
VLX_TWIN(h, fft) VLX_TWIN(i, window2) VLX_TWIN(c, cos) VLX_TWIN(c, rand) VLX_TWIN(b, add) VLX_TWIN(s, peak)
VLX_TWIN(i, window_gauss)

VLX_TYPED_SUITE(Measuring);

// From zeros and a record of ones a linear step leaves its weight: fixed, 1/count, or with LIMITED at most 1/limit.
TYPED_TEST(Measuring, WeightSchedule) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t lin = VLX_AVG_LINEAR, lim = VLX_AVG_LINEAR | VLX_AVG_LIMITED;
    const struct { int32_t mode, count; T weight, limit, want; } cases[] = {
        {lin, 2, T(0.25), 0, T(0.25)}, {lin, 5, 0, 0, 0}, {lin, 7, -1, 8, T(1) / T(7)}, {lim, 7, -1, 8, T(1) / T(7)},
        {lim, 50, -1, 8, T(1) / T(8)}, {lim, 9, -1, -3, T(1) / T(9)}, {lim, 3, -1, T(2.5), T(0.4)}};
    for (const auto& c : cases) {
        Vec<V> in{1, 1}, acc{0, 0};
        ASSERT_EQ(t_avg(in.get(), acc.get(), nullptr, c.mode, c.count, 0, c.weight, c.limit), 0);
        EXPECT_TRUE(same_bits(acc[0], c.want) && same_bits(acc[1], c.want)) << c.mode << " count " << c.count;
    }
}

// Twelve sweeps in each mode against the textbook result in long double.
TYPED_TEST(Measuring, ModesOverSweeps) {
    using V = TypeParam; using T = real_of<V>;
    const int sweeps = 12, n = 9;
    std::vector<std::vector<T>> recs;
    for (int k = 0; k < sweeps; ++k) recs.push_back(random_values<T>(n, 100 + k, 0.5, 4.0));
    for (int32_t mode : {0, 1, 2, 3, 4, 5, 6, 9, 1 | VLX_AVG_POWER | VLX_AVG_LOG, 3 | VLX_AVG_MAG})
        for (bool own_work : {false, true}) {
            Vec<V> acc, work;
            for (int k = 0; k <= sweeps; ++k) {  // sweep 0 starts acc as sweep 1 does
                Vec<V> in(recs[std::max(k - 1, 0)], false);
                if (mode & VLX_AVG_MAG) t_scale(in.get(), T(-1));  // magnitudes undo the sign
                ASSERT_EQ(t_avg(in.get(), acc.get(), own_work ? work.get() : nullptr, mode, k, 3, T(-1), T(0)), 0);
            }
            for (int i = 0; i < n; ++i) {
                long double sum = 0, rsum = 0, lsum = 0, hi = 0, lo = 1e30L;
                for (int k = 0; k < sweeps; ++k) {
                    const long double x = recs[k][i];
                    sum += x, rsum += 1 / x, lsum += std::log(x), hi = std::max(hi, x), lo = std::min(lo, x);
                }
                // mode 6 with period 3 takes sweeps 1, 4, 7, 10; mode 9 keeps the first
                const long double want[] = {recs[sweeps - 1][i], sum / sweeps, hi, lo, sweeps / rsum,
                                            std::exp(lsum / sweeps), recs[9][i], 0, 0, recs[0][i]};
                const long double w = (mode & VLX_AVG_LOG) ? 2 * lsum / sweeps : want[mode & 15];
                EXPECT_TRUE(near(acc[i], w, 40 * std::numeric_limits<T>::epsilon() * (1 + std::fabs(w)))) << mode << " at " << i;
            }
        }
}

// Every lag against the direct sum in long double: sample-type pairs, power-of-2 and other lengths, every work.
TYPED_TEST(Measuring, CorrelationMatchesDirectSum) {
    using V = TypeParam; using T = real_of<V>; using C = std::complex<long double>;
    const struct { int32_t n, m, ref_points; } cases[] = {{1, 1, 1}, {2, 1, 3}, {16, 16, 16}, {37, 5, 9}, {64, 7, 7}, {100, 33, 40}, {257, 256, 300}};
    for (const auto& c : cases)
        for (int run = 0; run < 16; ++run) {
            const bool rc = run & 1, sc = run & 2;
            const int work_kind = run >> 2, halve = work_kind == 3;
            const auto rv = random_values<T>(size_t(c.ref_points * (rc ? 2 : 1)), c.n);
            const auto sv = random_values<T>(size_t(c.n * (sc ? 2 : 1)), c.n + 1);
            Vec<V> ref(rv, rc), sig(sv, sc), out, work;
            sig->delta = T(0.5), ref->delta = T(1.5);
            V* w = work_kind == 0 ? nullptr : work_kind == 1 ? work.get() : work_kind == 2 ? ref.get() : out.get();
            const int32_t r = halve ? t_corr(ref.get(), sig.get(), out.get(), w, c.m, 1) : t_bcorr(ref.get(), sig.get(), out.get(), w, c.m);
            EXPECT_EQ(ref.values(), rv);  // work given as ref is not used
            // a real template makes out real, and the real transform refuses the complex signal
            if (!rc && sc) { EXPECT_EQ(r, -1); continue; }
            ASSERT_TRUE(r == 0 && has_shape(out.get(), c.n - c.m + 1, rc ? 1 : 0, 1.0));
            auto at = [](const std::vector<T>& v, bool cx, int i) { return cx ? C(v[2 * i], v[2 * i + 1]) : C(v[i], 0); };
            for (int k = 0; k <= c.n - c.m; ++k) {
                C sum = 0;
                for (int j = 0; j < c.m; ++j) sum += std::conj(at(rv, rc, j)) * at(sv, sc, j + k);
                sum /= c.m * (halve ? 2.0L : 1.0L);
                const long double tol = 30 * std::numeric_limits<T>::epsilon() * std::log2(2.0 * c.n);
                EXPECT_TRUE(near(std::abs(at(out.values(), rc, k) - sum), 0, tol)) << c.n << "/" << c.m << " run " << run << " lag " << k;
            }
        }
    Vec<V> ref{1, 2, 3}, sig{1, 2, 3, 4}, out{7}, longer{1, 2, 3, 4, 5};
    for (int32_t m : {0, -1, 4}) EXPECT_EQ(t_bcorr(ref.get(), sig.get(), out.get(), nullptr, m), -1) << m;
    EXPECT_EQ(t_corr(longer.get(), sig.get(), out.get(), nullptr, 5, 0), -1);
    EXPECT_EQ(out.values(), std::vector<T>{7});
}

// Forward then inverse gives the record times the window, in its own time order: the window stays, the factor 2 and the
// padding's scaling go.  nfft 0 takes the record's power of 2; SUM, CENTRED, RAW ignore nfft and fraction.
TYPED_TEST(Measuring, SpectrumInverseRestoresWindowedRecord) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t two = VLX_SPEC_TWO_SIDED;
    const struct { int32_t n, nfft; T fraction; int32_t window, flags; } cases[] = {
        {64, 0, 0, 0, 0}, {64, 0, 1, VLX_WINDOW_HANN, 0}, {64, 64, 2, VLX_WINDOW_FLATTOP, two},
        {64, 0, 0, 0, VLX_SPEC_CENTRED}, {64, 0, 0, VLX_WINDOW_HANN, VLX_SPEC_SUM}, {64, 0, 0, 3, VLX_SPEC_NO_WINDOW},
        {64, 0, 0, 0, VLX_SPEC_RAW}, {200, 128, 0, VLX_WINDOW_HANN, 0}, {50, 128, T(0.25), VLX_WINDOW_GAUSS70, 0},
        {100, 256, T(0.3), 0, two}, {37, 0, 0, VLX_WINDOW_BLACKMAN, 0},
    };
    for (const auto& c : cases)
        for (int run = 0; run < 4; ++run) {  // complex record or not; vlxh_fft, or vlxh_dft on the whole record
            const bool cx = run & 1, pow2 = run < 2;
            if ((!pow2 && (c.nfft != 0 || c.fraction != 0)) || (pow2 && c.nfft == 0 && (c.n & (c.n - 1)))) continue;
            const auto x = random_values<T>(size_t(c.n * (cx ? 2 : 1)), c.n + c.window);
            Vec<V> in(x, cx), spectrum, back;
            // complex records always take the two-sided way back
            const int32_t inv = VLX_SPEC_INVERSE | (cx ? VLX_SPEC_TWO_SIDED_IN : 0) | (c.n % 2 ? VLX_SPEC_ODD : 0);
            auto run_one = [&](V* from, V* to, int32_t flags) {
                return pow2 ? t_fft(from, to, c.nfft, c.fraction, c.window, flags) : t_dft(from, to, c.window, flags);
            };
            ASSERT_TRUE(run_one(in.get(), spectrum.get(), c.flags) == 0 && run_one(spectrum.get(), back.get(), c.flags | inv) == 0);
            const int32_t len = c.nfft ? c.nfft : c.n, one_sided = !cx && !(c.flags & (two | VLX_SPEC_RAW));
            EXPECT_EQ(spectrum->points, pow2 ? (one_sided ? len / 2 + 1 : len) : (one_sided ? c.n / 2 + 1 : c.n));
            // the record the forward path took, windowed as it did but not rotated
            const bool whole = !pow2 || (c.flags & (VLX_SPEC_SUM | VLX_SPEC_CENTRED | VLX_SPEC_RAW));
            const double f = (c.fraction > 0 && c.fraction <= 1 && !whole) ? c.fraction : 1;
            const double rec = std::min<double>(pow2 ? T(len) * T(f) : c.n, c.n);
            Vec<V> want(std::vector<T>(x.begin(), x.begin() + int64_t(std::ceil(rec)) * (cx ? 2 : 1)), cx);
            const int32_t wflags = (pow2 ? VLX_WFLAG_WIDTH : 0) | VLX_WFLAG_NO_SWAP;
            if (!(c.flags & (VLX_SPEC_NO_WINDOW | VLX_SPEC_RAW))) { ASSERT_EQ(t_window2(want.get(), c.window, wflags, T(rec)), 0); }
            ASSERT_EQ(back->points, want->points) << c.n << " window " << c.window << " flags " << c.flags;
            // a real record comes back complex from the two-sided way, imaginary parts 0
            auto part = [](Vec<V>& v, int64_t i, int p) { return v->complex ? v[2 * i + p] : p ? T(0) : v[i]; };
            for (int64_t i = 0; i < want->points; ++i)
                for (int p : {0, 1})
                    ASSERT_TRUE(near(part(back, i, p), part(want, i, p), 60 * std::numeric_limits<T>::epsilon()))
                        << c.n << " window " << c.window << " flags " << c.flags << " cx " << cx << " at " << i;
        }
    Vec<V> any{1, 2};
    EXPECT_TRUE(t_fft(any.get(), static_cast<V*>(nullptr), 0, T(1), 0, 0) == -1 && t_dft(static_cast<V*>(nullptr), any.get(), 0, 0) == -1);
}

VLX_TWIN(h, rsmp)
// The resampler's set-up calls, each family's told apart by the coefficient or state type it takes.
#define VLX_RSMP_TWIN(name)                                                                                         \
    template <class... A> auto t_##name(A... a) -> decltype(vlxh_##name(a...)) { return vlxh_##name(a...); }       \
    template <class... A> auto t_##name(A... a) -> decltype(vlxfh_##name(a...)) { return vlxfh_##name(a...); }
VLX_RSMP_TWIN(rsmp_coef_init) VLX_RSMP_TWIN(rsmp_coef_alloc) VLX_RSMP_TWIN(rsmp_coef_setup) VLX_RSMP_TWIN(rsmp_coef_destroy)
VLX_RSMP_TWIN(rsmp_state_init) VLX_RSMP_TWIN(rsmp_state_reset) VLX_RSMP_TWIN(rsmp_state_destroy)
VLX_RSMP_TWIN(rsmp_get_in_pts) VLX_RSMP_TWIN(rsmp_get_out_pts) VLX_RSMP_TWIN(rsmp_get_delay_pts)
VLX_RSMP_TWIN(rsmp_get_settle_pts)
#undef VLX_RSMP_TWIN
template <class V> using Coef = std::conditional_t<is_double<V>, vlxh_rsmp_coef_t, vlxfh_rsmp_coef_t>;
template <class V> using State = std::conditional_t<is_double<V>, vlxh_rsmp_state_t, vlxfh_rsmp_state_t>;

// A coefficient object set up for a ratio and one stream's state, armed (start-up discards on).
template <class V>
struct Stream {
    Coef<V> coef;
    State<V> state;
    Stream(double ratio, int32_t forced) {
        t_rsmp_coef_init(&coef), t_rsmp_state_init(&state);
        EXPECT_EQ(t_rsmp_coef_alloc(&coef, 0) | t_rsmp_coef_setup(&coef, real_of<V>(ratio), forced, 0) |
                      t_rsmp_state_reset(&coef, &state), 0);
    }
    ~Stream() { t_rsmp_state_destroy(&state), t_rsmp_coef_destroy(&coef); }
    int32_t out_pts(int32_t n, int32_t settled, int32_t at_least) {
        int32_t r = -1;
        return t_rsmp_get_out_pts(&r, &coef, n, settled, at_least) == 0 ? r : -1;
    }
    int32_t run(V* in, V* out, V* work, bool keep = true) { return t_rsmp(in, out, work, &coef, keep ? &state : nullptr); }
};

VLX_TYPED_SUITE(StreamingResampler);

// Ratio split, filter, discards, delay and start-up; one object reloads its filter through every set-up.
TYPED_TEST(StreamingResampler, SetupAndArithmetic) {
    using V = TypeParam; using T = real_of<V>;
    // figures: delay in input and output points, start-up; -1: not checked
    const struct { T ratio; int32_t forced, k; T r; int32_t half, skip_mid, skip_out; T figures[3]; } cases[] = {
        {T(4), 0, 2, T(1), 20, 33, 0, {T(57), T(14.25), T(132)}},
        {T(3), 0, 1, T(1.5), 20, 33, 43, {T(82.5), T(27.5), T(195)}},  // 24 + 19 behind 35 / 1.5
        {T(-5), 1, 0, T(1), 20, 0, 54, {T(27), T(27), T(54)}},         // 0 or below reads as 1
        {T(1.9999), 0, 0, T(1.9999), 20, 0, 37, {-1, -1, -1}},
        {T(0.9765625), 0, 0, T(0.9765625), 20, 0, 55, {-1, -1, -1}},
        {T(0.97), 0, -1, T(1.94), 38, 74, 56, {-1, -1, -1}},
        {T(0.1), 0, -1, T(0.2), 61, 120, 235, {T(41.75), T(417.5), -1}},  // not brought up further
        {T(0.7), 0, -1, T(1.4), 61, 120, 85, {-1, -1, -1}},
        {T(0.5), 0, -1, T(1), 61, 120, 0, {T(30), T(60), T(60)}},
    };
    Stream<V> s(1, 0);
    T got[3];
    for (const auto& c : cases) {
        ASSERT_EQ(t_rsmp_coef_setup(&s.coef, c.ratio, c.forced, 0), 0);
        const auto& o = s.coef;
        EXPECT_TRUE(o.octaves == c.k && o.ratio == c.r && o.half_filter.points == c.half && o.skip_mid == c.skip_mid &&
                    o.skip_out == c.skip_out) << c.ratio;
        t_rsmp_get_delay_pts(&got[0], &s.coef, 0), t_rsmp_get_delay_pts(&got[1], &s.coef, 1);
        t_rsmp_get_settle_pts(&got[2], &s.coef, 0);
        for (int i = 0; i < 3; ++i) EXPECT_TRUE(c.figures[i] < 0 || got[i] == c.figures[i]) << c.ratio << " figure " << i;
        EXPECT_TRUE(t_rsmp_coef_setup(&s.coef, T(8), 0, 1) == -1 && s.coef.octaves == c.k);  // reserved: nothing stored
    }
    Coef<V> fresh;  // never set up: r 0, total = s, resampling formula
    t_rsmp_coef_init(&fresh), t_rsmp_get_delay_pts(&got[0], &fresh, 1);
    EXPECT_EQ(got[0], T(17.5));
}

// Inputs asked for by get_in_pts give what get_out_pts promises; the edges.
TYPED_TEST(StreamingResampler, PointCountsAgree) {
    for (double ratio : {0.1, 0.97, 1.0, 1.25, 1.9999, 2.0, 3.0, 4.0, 6.3, 1000.0}) {
        Stream<TypeParam> s(ratio, 0);
        for (int32_t settled : {0, 1})
            for (int32_t want : {0, 1, 2, 7, 100, 4096, 100000}) {
                int32_t in = -1;
                ASSERT_EQ(t_rsmp_get_in_pts(&in, &s.coef, want, settled), 0);
                EXPECT_GE(s.out_pts(in, settled, 1), want) << "ratio " << ratio << " settled " << settled;
                EXPECT_TRUE(s.out_pts(in, 0, 0) >= s.out_pts(in, 0, 1) && (want != 0 || !settled || in == 0)) << ratio;
            }
        int32_t n = 5;  // ratio 1 is a copy
        EXPECT_TRUE(t_rsmp_get_in_pts(nullptr, &s.coef, 10, 0) == 0 &&
                    t_rsmp_get_in_pts(&n, decltype(&s.coef){}, 10, 0) == -1 && n == 5 &&
                    (ratio != 1.0 || (s.out_pts(-7, 1, 0) == 0 && s.out_pts(13, 1, 0) == 13)));
    }
}

// Blocks of random sizes continue one call's stream to rounding, each between the certain count and the most.
TYPED_TEST(StreamingResampler, BlocksContinueOneStream) {
    using V = TypeParam; using T = real_of<V>;
    const int32_t total = 3000;
    for (double ratio : {0.1, 0.5, 0.97, 1.0, 1.088, 1.5, 2.0, 3.3, 4.0, 8.0})
        for (int64_t w : {1, 2}) {  // real, complex
            const auto x = random_values<T>(size_t(total * w), 7);
            Stream<V> whole(ratio, ratio == 1.0), blocks(ratio, ratio == 1.0);
            Vec<V> in(x, w == 2), out, work, scratch;
            in->delta = T(0.5);
            out->points = whole.out_pts(total, 0, 0);
            ASSERT_EQ(whole.run(in.get(), out.get(), work.get()), 0);
            EXPECT_EQ(out->delta, T(0.5) * T(ratio));
            std::vector<T> got;
            std::mt19937 rng(11);
            for (int32_t at = 0, len = 0; at < total; at += len) {
                len = std::min<int32_t>(int32_t(rng() % 400), total - at);
                Vec<V> block(std::vector<T>(x.begin() + at * w, x.begin() + (at + len) * w), w == 2);
                const int32_t most = blocks.out_pts(len, 0, 0), least = blocks.out_pts(len, 0, 1);
                const bool started = blocks.state.skip_mid == 0 && blocks.state.skip_out == 0;
                work->points = most;
                ASSERT_EQ(blocks.run(block.get(), work.get(), at % 3 ? scratch.get() : nullptr), 0);
                EXPECT_TRUE(work->points <= most && (!started || work->points >= least)) << ratio;
                got.insert(got.end(), work->data, work->data + work->points * w);
            }
            ASSERT_EQ(got.size(), size_t(out.scalars())) << "ratio " << ratio;
            for (size_t i = 0; i < got.size(); ++i)
                ASSERT_TRUE(near(got[i], out[int64_t(i)], 2000 * std::numeric_limits<T>::epsilon())) << ratio << " " << i;
        }
}

// A tone comes out delayed by get_delay_pts, in input and in output points.
TYPED_TEST(StreamingResampler, ToneDelay) {
    using V = TypeParam; using T = real_of<V>;
    for (double ratio : {0.1, 0.7, 0.97, 1.0, 1.088, 1.5, 2.0, 3.3, 8.0}) {
        Stream<V> s(ratio, ratio == 1.0);
        const double f = 0.01 / std::max(ratio, 1.0);
        Vec<V> in, out;
        in->points = 16000, out->points = s.out_pts(16000, 0, 0);
        ASSERT_EQ(t_cos(in.get(), T(f), T(0)), 0);
        ASSERT_EQ(s.run(in.get(), out.get(), nullptr, false), 0);  // no state: output j at input time j * ratio
        std::complex<double> z = 0;  // Hann-weighted phase of the settled middle
        const int32_t a = out->points / 4, b = out->points - 300;
        for (int32_t j = a; j < b; ++j)
            z += (1 - std::cos(2 * M_PI * (j - a) / (b - a))) * double(out[j]) * std::polar(1.0, -2 * M_PI * f * ratio * j);
        T want = 0, want_out = 0;
        t_rsmp_get_delay_pts(&want, &s.coef, 0), t_rsmp_get_delay_pts(&want_out, &s.coef, 1);
        const double period = 1 / f, got = std::fmod(-std::arg(z) / (2 * M_PI * f) - want + 2.5 * period, period) - period / 2;
        EXPECT_TRUE(near(got, 0, 0.1) && near(want_out * ratio, want, 1e-4 * want)) << ratio << ": " << got;
    }
}

// |sum of taps[i] e^(-j 2 pi f i / step)| / step: a filter's gain at f cycles per sample, the table's kernel read at
// `step` entries a sample. A half filter (centre tap last) counts its mirrored half too.
template <class V>
double gain(const V* taps, double f, bool half, int64_t from = 0, double step = 1) {
    std::vector<double> t(taps->data + from, taps->data + taps->points);
    if (half) t.insert(t.end(), t.rbegin() + 1, t.rend());
    std::complex<double> z = 0;
    for (size_t i = 0; i < t.size(); ++i) z += t[i] * std::polar(1.0, -2 * M_PI * f * double(i) / step);
    return std::abs(z) / step;
}

// One measurement's road: a noisy tone resampled in blocks, into spectra, averaged over sweeps, peak read.
TYPED_TEST(StreamingResampler, MeasurementRoad) {
    using V = TypeParam; using T = real_of<V>;
    const double rate_in = 48000, rate_out = 44100, tone = 1000, amplitude = 0.5;
    const int32_t n = 4096, sweeps = 32;

    // 48 kHz input: tone plus Gaussian noise of standard deviation 1e-3
    Vec<V> in, noise;
    in->points = noise->points = int32_t((sweeps + 1) * n * rate_in / rate_out);
    in->delta = noise->delta = T(1 / rate_in);
    ASSERT_EQ(t_cos(in.get(), T(tone), T(0.3)) | t_scale(in.get(), T(amplitude)), 0);
    ASSERT_EQ(t_rand(noise.get(), 1) | t_scale(noise.get(), T(1e-3)) | t_add(in.get(), noise.get(), in.get()), 0);

    // to 44.1 kHz in blocks of 4096, start-up discarded
    Stream<V> rs(rate_in / rate_out, 0);
    std::vector<T> stream;
    Vec<V> block, out, work;
    for (int32_t at = 0; at < in->points; at += 4096) {
        out->points = 8192;
        ASSERT_EQ(t_subvec(in.get(), block.get(), at, 4096) | rs.run(block.get(), out.get(), work.get()), 0);
        stream.insert(stream.end(), out->data, out->data + out->points);
    }
    ASSERT_TRUE(stream.size() >= size_t(sweeps * n) && near(out->delta, 1 / rate_out, 1e-6 / rate_out));

    // the cascade's gain: pre-filter, kernel, half-band filter at twice the output rate
    const double f = tone / rate_in, phases = (rs.coef.table.points - 2) / rs.coef.table.data[0];
    const double cascade = gain(&rs.coef.pre_filter, f, true) * gain(&rs.coef.half_filter, f * rs.coef.ratio / 2, true) *
                           gain(&rs.coef.table, f, false, 1, phases);

    Vec<V> record, spectrum, acc, peak, gauss;
    std::vector<double> spread;  // floor's highest bin over its mean after 1, 4, 32 sweeps
    for (int32_t k = 1; k <= sweeps; ++k) {
        record.assign(std::vector<T>(stream.begin() + (k - 1) * n, stream.begin() + k * n), false);
        record->delta = out->delta;
        ASSERT_EQ(t_fft(record.get(), spectrum.get(), n, T(1), VLX_WINDOW_FLATTOP, 0) |
                      t_avg(spectrum.get(), acc.get(), nullptr, VLX_AVG_LINEAR | VLX_AVG_POWER, k, 0, T(-1), T(0)), 0);
        if (k == 1) {  // frequency: the log-ratio peak's constant fits this Gaussian
            ASSERT_EQ(t_window_gauss(record.get(), T(1 / (2 * M_PI * std::sqrt(2 * 0.792233201343665))), 0) |
                          t_fft(record.get(), gauss.get(), n, T(1), 0, VLX_SPEC_NO_WINDOW) |
                          t_peak(gauss.get(), peak.get(), VLX_PEAK_LOG_RATIO, 0), 0);
            EXPECT_TRUE(near(peak[1], tone / rate_out * n, 0.01) && near(gauss->delta, rate_out / n, 1e-3)) << peak[1];
        }
        if (k == 1 || k == 4 || k == sweeps) {
            double top = 0, sum = 0;
            for (int32_t b = 300; b < 700; ++b) top = std::max(top, double(acc[b])), sum += double(acc[b]);
            spread.push_back(top / (sum / 400));
        }
    }
    ASSERT_EQ(t_peak(acc.get(), peak.get(), VLX_PEAK_SAMPLE, 0), 0);
    const double db = 20 * std::log10(std::sqrt(double(peak[0])) / (amplitude * cascade));
    EXPECT_TRUE(near(db, 0, 0.01)) << "reads " << db << " dB from the cascade's gain " << cascade;
    EXPECT_TRUE(spread[2] < spread[1] && spread[1] < spread[0] && spread[2] < 2.0) << spread[0] << " " << spread[1];
}

}  // namespace
