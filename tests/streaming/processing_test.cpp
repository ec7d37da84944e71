// The sweep averager, correlation and the spectrum pipeline, both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <complex>

using namespace vlxtest;

namespace {

VLX_TWIN(h, avg) VLX_TWIN(h, corr) VLX_TWIN(i, scale) VLX_TEST_TWIN(t_bcorr, vlxb_corr, vlxfb_corr) VLX_TWIN(h, dft)
VLX_TWIN(h, fft) VLX_TWIN(i, window2)

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

}  // namespace
