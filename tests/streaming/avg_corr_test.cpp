// The sweep averager and correlation, both families.
#include "vlx_test.hpp"

#include <algorithm>
#include <complex>

using namespace vlxtest;

namespace {

VLX_TWIN(h, avg)
VLX_TWIN(i, scale)
VLX_TWIN(h, corr)
VLX_TEST_TWIN(t_bcorr, vlxb_corr, vlxfb_corr)

template <class V>
class Averaging : public ::testing::Test {};
TYPED_TEST_SUITE(Averaging, Families);

// From an accumulator of zeros and a record of ones, a linear step leaves
// exactly the weight it used.
TYPED_TEST(Averaging, WeightSchedule) {
    using V = TypeParam;
    using T = real_of<V>;
    struct Case {
        int32_t mode, count;
        T weight, limit, want;
    };
    const int32_t lin = VLX_AVG_LINEAR, lim = VLX_AVG_LINEAR | VLX_AVG_LIMITED;
    const Case cases[] = {
        {lin, 2, T(0.25), 0, T(0.25)}, {lin, 5, T(0), 0, T(0)},      // fixed weights, 0 freezes acc
        {lin, 4, T(-1), 0, T(1) / T(4)}, {lin, 7, T(-1), 8, T(1) / T(7)},  // running mean; limit needs the flag
        {lim, 7, T(-1), 8, T(1) / T(7)}, {lim, 8, T(-1), 8, T(1) / T(8)}, {lim, 50, T(-1), 8, T(1) / T(8)},
        {lim, 9, T(-1), 0, T(1) / T(9)}, {lim, 9, T(-1), -3, T(1) / T(9)},  // limit 0 or below: plain mean
        {lim, 3, T(-1), T(2.5), T(1) / T(2.5)},
    };
    for (const Case& c : cases) {
        Vec<V> in{1, 1, 1}, acc{0, 0, 0};
        ASSERT_EQ(t_avg(in.get(), acc.get(), nullptr, c.mode, c.count, 0, c.weight, c.limit), 0);
        for (int i = 0; i < 3; ++i) EXPECT_TRUE(same_bits(acc[i], c.want)) << c.mode << " count " << c.count;
    }
}

// Twelve sweeps in each mode against the textbook result in long double.
TYPED_TEST(Averaging, ModesOverSweeps) {
    using V = TypeParam;
    using T = real_of<V>;
    const int sweeps = 12, n = 9;
    std::vector<std::vector<T>> recs;
    for (int k = 0; k < sweeps; ++k) recs.push_back(random_values<T>(n, 100 + k, 0.5, 4.0));
    for (int32_t mode : {0, 1, 2, 3, 4, 5, 6, 9, 1 | VLX_AVG_POWER | VLX_AVG_LOG, 3 | VLX_AVG_MAG}) {
        for (bool own_work : {false, true}) {
            Vec<V> acc, work;
            for (int k = 1; k <= sweeps; ++k) {
                Vec<V> in(recs[k - 1], false);
                if (mode == (3 | VLX_AVG_MAG)) t_scale(in.get(), T(-1));  // magnitudes undo the sign
                ASSERT_EQ(t_avg(in.get(), acc.get(), own_work ? work.get() : nullptr, mode, k, 3, T(-1), T(0)), 0);
            }
            for (int i = 0; i < n; ++i) {
                long double sum = 0, rsum = 0, lsum = 0, hi = -1e30L, lo = 1e30L;
                for (int k = 0; k < sweeps; ++k) {
                    const long double x = recs[k][i];
                    sum += x, rsum += 1 / x, lsum += std::log(x), hi = std::max(hi, x), lo = std::min(lo, x);
                }
                long double want = 0;
                switch (mode) {
                    case 0: want = recs[sweeps - 1][i]; break;
                    case 1: want = sum / sweeps; break;
                    case 2: want = hi; break;
                    case 3:
                    case 3 | VLX_AVG_MAG: want = lo; break;
                    case 4: want = sweeps / rsum; break;
                    case 5: want = std::exp(lsum / sweeps); break;
                    case 6: want = recs[9][i]; break;  // sweeps 1, 4, 7, 10 with period 3
                    case 9: want = recs[0][i]; break;
                    default: want = 2 * lsum / sweeps;  // mean of logarithms of powers
                }
                EXPECT_TRUE(near(acc[i], want, 40 * std::numeric_limits<T>::epsilon() * (1 + std::fabs(want))))
                    << "mode " << mode << " point " << i;
            }
        }
    }
}

TYPED_TEST(Averaging, SamplePeriodsAndFirstSweep) {
    using V = TypeParam;
    using T = real_of<V>;
    struct Case {
        int32_t period;
        std::vector<int> taken;  // sweeps (1..10) after which acc changes
    };
    const Case cases[] = {{3, {1, 4, 7, 10}}, {0, {1}}, {1, {1, 2, 3, 4, 5, 6, 7, 8, 9, 10}}, {-2, {1}}};
    for (const Case& c : cases) {
        Vec<V> acc;
        T held = -1;
        for (int k = 0; k <= 10; ++k) {  // count 0 replaces too
            Vec<V> in{T(k)};
            ASSERT_EQ(t_avg(in.get(), acc.get(), nullptr, VLX_AVG_SAMPLE, k, c.period, T(0), T(0)), 0);
            if (k <= 1 || std::count(c.taken.begin(), c.taken.end(), k)) held = T(k);
            EXPECT_EQ(acc[0], held) << "period " << c.period << " sweep " << k;
        }
    }
}

template <class V>
class Correlation : public ::testing::Test {};
TYPED_TEST_SUITE(Correlation, Families);

// Every lag against the direct sum in long double; all four sample-type
// pairs, power-of-two and other lengths, each choice of work.
TYPED_TEST(Correlation, MatchesDirectSum) {
    using V = TypeParam;
    using T = real_of<V>;
    using C = std::complex<long double>;
    struct Case {
        int32_t n, m, ref_points;
    };
    const Case cases[] = {{1, 1, 1}, {2, 1, 3}, {16, 16, 16}, {37, 5, 9}, {64, 7, 7}, {100, 33, 40}, {257, 256, 300}};
    for (const Case& c : cases)
        for (int shape = 0; shape < 4; ++shape)
            for (int work_kind = 0; work_kind < 4; ++work_kind) {
                const bool rc = shape & 1, sc = shape & 2;
                const auto rv = random_values<T>(size_t(c.ref_points * (rc ? 2 : 1)), c.n);
                const auto sv = random_values<T>(size_t(c.n * (sc ? 2 : 1)), c.n + 1);
                Vec<V> ref(rv, rc), sig(sv, sc), out, work;
                sig->delta = T(0.5), ref->delta = T(1.5);
                V* w = work_kind == 0 ? nullptr : work_kind == 1 ? work.get() : work_kind == 2 ? ref.get() : out.get();
                const int32_t halve = work_kind == 3;
                ASSERT_EQ(halve ? t_corr(ref.get(), sig.get(), out.get(), w, c.m, 1)
                                : t_bcorr(ref.get(), sig.get(), out.get(), w, c.m),
                          0);
                ASSERT_TRUE(has_shape(out.get(), c.n - c.m + 1, (rc || sc) ? 1 : 0, 1.0));
                EXPECT_EQ(ref.values(), rv);  // work given as ref is not used
                auto at = [](const std::vector<T>& v, bool cx, int i) {
                    return cx ? C(v[2 * i], v[2 * i + 1]) : C(v[i], 0);
                };
                const long double tol = 30 * std::numeric_limits<T>::epsilon() * std::log2(2.0 * c.n);
                for (int k = 0; k <= c.n - c.m; ++k) {
                    C sum = 0;
                    for (int j = 0; j < c.m; ++j) sum += std::conj(at(rv, rc, j)) * at(sv, sc, j + k);
                    sum /= c.m * (halve ? 2.0L : 1.0L);
                    const C got = (rc || sc) ? C(out[2 * k], out[2 * k + 1]) : C(out[k], 0);
                    EXPECT_TRUE(near(std::abs(got - sum), 0, tol)) << c.n << "/" << c.m << " shape " << shape << " lag " << k;
                }
            }
}

TYPED_TEST(Correlation, RefusesBadLagCounts) {
    using V = TypeParam;
    Vec<V> ref{1, 2, 3}, sig{1, 2, 3, 4}, out{7};
    for (int32_t m : {0, -1, 4, 5}) EXPECT_EQ(t_bcorr(ref.get(), sig.get(), out.get(), nullptr, m), -1) << m;
    Vec<V> longer{1, 2, 3, 4, 5};
    EXPECT_EQ(t_corr(longer.get(), sig.get(), out.get(), nullptr, 5, 0), -1);
    EXPECT_EQ(out.values(), std::vector<real_of<V>>{7});
}

}  // namespace
