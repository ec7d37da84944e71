// Transforms of any length: accuracy against long double, the chirp path bit
// for bit against a literal chirp-z built on the literal power-of-two engine,
// the cache turn on a change of direction, delta, and the real forms.
#include "fft_reference.hpp"

#include <thread>

using namespace vlxtest;
using fftref::cld;

namespace {

VLX_TEST_TWIN(t_dft, vlxi_dft, vlxfi_dft)
VLX_TEST_TWIN(t_rdft, vlxi_rdft, vlxfi_rdft)
VLX_TEST_TWIN(t_irdft, vlxi_irdft, vlxfi_irdft)
template <class V>
int32_t free_caches() {
    if constexpr (is_double<V>) return vlx_free_internal();
    else return vlxf_free_internal();
}

template <class V>
class DftTest : public ::testing::Test {};
TYPED_TEST_SUITE(DftTest, Families);

template <class T>
std::vector<cld> as_cld(const std::vector<T>& x, bool cplx) {
    std::vector<cld> y(cplx ? x.size() / 2 : x.size());
    for (size_t i = 0; i < y.size(); ++i) y[i] = cplx ? cld(x[2 * i], x[2 * i + 1]) : cld(x[i], 0);
    return y;
}

// v = v * c point by point, in the product's order for complex operands and
// for a real v.
template <class T>
void literal_mul(std::vector<T>& v, bool& cplx, const std::vector<T>& c) {
    std::vector<T> out(c.size());
    for (size_t i = 0; i < c.size() / 2; ++i) {
        if (!cplx) {
            out[2 * i] = v[i] * c[2 * i], out[2 * i + 1] = v[i] * c[2 * i + 1];
        } else {
            const T ar = v[2 * i], ai = v[2 * i + 1], br = c[2 * i], bi = c[2 * i + 1];
            out[2 * i] = br * ar - bi * ai, out[2 * i + 1] = ai * br + bi * ar;
        }
    }
    v = out, cplx = true;
}

// The chirp-z transform written out from its recipe, run with the last of
// `dirs` on a cache that was built for the first of them and turned at every
// change of direction since.
template <class T>
std::vector<T> literal_chirp_z(std::vector<T> x, bool cplx, const std::vector<int>& dirs) {
    constexpr bool dbl = std::is_same_v<T, double>;
    const size_t n = cplx ? x.size() / 2 : x.size();
    size_t len = 4;
    while (len < 2 * n - 2) len *= 2;
    auto chirp = [&](bool conj) {
        std::vector<T> c(2 * n);
        int64_t m = 1;
        const T inv_n = T(1) / T(n);
        for (int64_t i = 0; i < int64_t(n); ++i) {
            m = (m + 2 * i - 1) % int64_t(2 * n);
            const T a = (T(m) * (dbl ? T(-3.141592653589793) : T(-3.1415927f))) * inv_n;
            c[2 * i] = dbl ? T(std::cos(double(a))) : std::cos(float(a));
            const T s = dbl ? T(std::sin(double(a))) : std::sin(float(a));
            c[2 * i + 1] = conj ? -s : s;
        }
        return c;
    };
    auto spectrum = [&](int dir) {
        const std::vector<T> c = chirp(dir == 1);
        std::vector<T> s(2 * len, T(0));
        s[0] = 1;
        for (size_t i = 1; i < n; ++i)
            s[2 * i] = s[2 * (len - i)] = c[2 * i], s[2 * i + 1] = s[2 * (len - i) + 1] = -c[2 * i + 1];
        if (dir == 0)
            for (auto& e : s) e = e * (T(1) / T(n));
        fftref::literal_fft(s, true);
        return s;
    };
    const int d = dirs.back();
    const std::vector<T> c = chirp(d == 1);
    std::vector<T> s = spectrum(dirs[0]);
    for (size_t k = 1; k < dirs.size(); ++k) {
        if (dirs[k] == dirs[k - 1]) continue;
        std::vector<T> t(s);
        const T f = dirs[k] != 0 ? T(n) : T(1) / T(n);
        for (size_t i = 0; i < len; ++i) {
            const size_t j = i == 0 ? 0 : len - i;
            t[2 * i] = s[2 * j] * f, t[2 * i + 1] = -s[2 * j + 1] * f;
        }
        s = t;
    }
    literal_mul(x, cplx, c);
    x.resize(2 * len, T(0));
    fftref::literal_fft(x, true);
    literal_mul(x, cplx, s);
    fftref::literal_fft(x, false);
    x.resize(2 * n);
    literal_mul(x, cplx, c);
    return x;
}

}  // namespace

// Relative L2 error against a long-double sum.  The chirp path is two
// power-of-two transforms of length L < 4N between three products with
// unit-modulus factors (a few eps each), so the bound is twice the engine's
// own for length L.  That one is not eps sqrt(log2 L): the engine's twiddle
// recurrence adds up to min(L/8, 256) eps, and it dominates from L = 1024 on
// (measured: about 85 eps at L = 4096 against a bound of 540 eps).
TYPED_TEST(DftTest, MatchesLongDoubleSumForAnyLength) {
    using T = real_of<TypeParam>;
    const double eps = std::numeric_limits<T>::epsilon();
    for (int32_t n : {1, 2, 3, 5, 6, 7, 12, 17, 31, 33, 60, 97, 127, 129, 255, 257, 360, 1000, 1023, 1025, 2187, 3001}) {
        for (int inverse : {0, 1}) {
            const std::vector<T> x = random_values<T>(2 * size_t(n), 7u + n);
            Vec<TypeParam> v(x, true);
            ASSERT_EQ(t_dft(&v, inverse), 0) << n;
            const std::vector<cld> want = fftref::exact_dft(as_cld(x, true), inverse != 0);
            int m = 2;
            while ((int64_t(1) << m) < 2 * int64_t(n) - 2) ++m;
            EXPECT_LE(double(fftref::rel_l2(v->data, want, n)), 2 * fftref::transform_tolerance(eps, m))
                << "n " << n << " inverse " << inverse;
        }
    }
}

// Bit for bit against the literal chirp-z, real and complex input, for a
// fresh cache and for caches turned by changes of direction at one length.
// Direction 2 gets forward chirps and no 1/N, and turns without conjugation.
TYPED_TEST(DftTest, ChirpPathIsBitExactThroughCacheTurns) {
    using T = real_of<TypeParam>;
    const std::vector<std::vector<int>> runs = {{0}, {1}, {2}, {0, 1}, {1, 0}, {0, 2}, {2, 0}, {0, 1, 0}};
    for (int32_t n : {3, 5, 6, 9, 10, 100, 1025}) {
        for (bool cplx : {true, false}) {
            const std::vector<T> x = random_values<T>(cplx ? 2 * size_t(n) : size_t(n), 3u * n);
            for (const auto& dirs : runs) {
                ASSERT_EQ(free_caches<TypeParam>(), 0);
                Vec<TypeParam> v;
                for (int d : dirs) {
                    v.assign(x, cplx);
                    ASSERT_EQ(t_dft(&v, d), 0);
                }
                const std::vector<T> want = literal_chirp_z(x, cplx, dirs);
                ASSERT_EQ(v.scalars(), int64_t(want.size()));
                for (size_t i = 0; i < want.size(); ++i)
                    ASSERT_TRUE(same_bits(v[i], want[i])) << n << " run of " << dirs.size() << " at " << i;
            }
        }
    }
}

// Forward then inverse restores the samples, and the cache rebuilt for each
// change of length gives the numbers of a fresh cache.
TYPED_TEST(DftTest, RoundTripsAndRebuildsOnLengthChange) {
    using T = real_of<TypeParam>;
    const double tol = 40 * std::numeric_limits<T>::epsilon();
    std::vector<std::vector<T>> fresh;
    for (int32_t n : {6, 10}) {
        ASSERT_EQ(free_caches<TypeParam>(), 0);
        Vec<TypeParam> v(random_values<T>(2 * size_t(n), n), true);
        ASSERT_EQ(t_dft(&v, 1), 0);
        fresh.push_back(v.values());
    }
    for (int round = 0; round < 2; ++round) {
        for (size_t k = 0; k < 2; ++k) {
            const int32_t n = k == 0 ? 6 : 10;
            const std::vector<T> x = random_values<T>(2 * size_t(n), n);
            Vec<TypeParam> v(x, true);
            ASSERT_EQ(t_dft(&v, 1), 0);
            for (size_t i = 0; i < x.size(); ++i) ASSERT_TRUE(same_bits(v[i], fresh[k][i])) << n << " at " << i;
            ASSERT_EQ(t_dft(&v, 0), 0);
            for (size_t i = 0; i < x.size(); ++i) ASSERT_TRUE(near(v[i], x[i], tol)) << n << " at " << i;
        }
    }
}

// delta: 1/(N delta) from the delta at entry, the family's fallback for 0
// (also for lengths 0 and 1, where only delta changes).
TYPED_TEST(DftTest, DeltaFollowsTheEntryValue) {
    using T = real_of<TypeParam>;
    const T fallback = is_double<TypeParam> ? T(1e100) : T(999999986991104.0f);
    for (int32_t n : {0, 1, 6, 7, 8}) {
        for (T delta : {T(0), T(-0.0), T(0.3), T(-2)}) {
            Vec<TypeParam> v(random_values<T>(size_t(n), n), false);
            v->delta = delta;
            ASSERT_EQ(t_dft(&v, 0), 0);
            const T want = delta == 0 ? fallback : T(1) / (T(n > 1 ? n : 1) * delta);
            EXPECT_TRUE(same_bits(v->delta, want)) << n << " " << delta << ": " << v->delta;
            EXPECT_EQ(v->points, n);
            EXPECT_EQ(v->complex, n > 1 ? 1 : 0);
        }
    }
}

// The real forms: rdft keeps the first N/2 + 1 bins of the complex transform
// (the same bits off the powers of two); irdft gives back N real samples.
TYPED_TEST(DftTest, RealFormsOfAnyLength) {
    using T = real_of<TypeParam>;
    const double tol = 40 * std::numeric_limits<T>::epsilon();
    for (int32_t n : {1, 2, 3, 6, 7, 8, 15, 16, 100, 101}) {
        const std::vector<T> x = random_values<T>(size_t(n), 11u * n);
        Vec<TypeParam> half(x, false), full(x, false);
        ASSERT_EQ(t_rdft(&half), 0);
        ASSERT_EQ(t_dft(&full, 0), 0);
        ASSERT_EQ(half->points, n / 2 + 1);
        EXPECT_TRUE(same_bits(half->delta, full->delta));
        for (int64_t i = 0; i < half.scalars(); ++i) {
            if (n & (n - 1)) ASSERT_TRUE(same_bits(half[i], full[i])) << n << " at " << i;
            else ASSERT_TRUE(near(half[i], full[i], tol)) << n << " at " << i;
        }
        ASSERT_EQ(t_irdft(&half, n & 1), 0);
        ASSERT_EQ(half->points, n);
        ASSERT_EQ(half->complex, 0);
        for (int32_t i = 0; i < n; ++i) ASSERT_TRUE(near(half[i], x[i], tol)) << n << " at " << i;
    }
    Vec<TypeParam> c({1, 2, 3, 4}, true);
    EXPECT_EQ(t_rdft(&c), -1);
    EXPECT_EQ(c->complex, 1);
}

// Jobs of distinct lengths on several threads while another thread releases
// the caches: each call finds its own entry or rebuilds it, so every result
// must equal the single-threaded one bit for bit.  A cache shared without
// lock 1 mixes chirps of different lengths.
TEST(DftThreads, ChirpAndCosineCachesAreShared) {
    vlx_lib_init();
    struct Job {
        int32_t n;
        int kind;  // 0, 1, 2: vlxi_dft direction; 3, 4: vlxi_dct forward, inverse
        std::vector<double> in, want;
    };
    auto run = [](Job& j, std::vector<double>& out) {
        Vec<vlx_t> v(j.in, j.kind < 3);
        const int32_t status = j.kind < 3 ? vlxi_dft(&v, j.kind) : vlxi_dct(&v, j.kind == 4 ? 1u : 0u);
        out = v.values();
        return status;
    };
    std::vector<Job> jobs = {{6, 0, {}, {}}, {10, 1, {}, {}}, {7, 2, {}, {}}, {100, 0, {}, {}}, {9, 3, {}, {}}, {11, 4, {}, {}}};
    for (Job& j : jobs) {
        j.in = random_values<double>(j.kind < 3 ? 2 * size_t(j.n) : size_t(j.n), j.n);
        ASSERT_EQ(run(j, j.want), 0);
    }
    std::atomic<int> failures{0};
    std::atomic<bool> done{false};
    std::vector<std::thread> workers;
    for (int t = 0; t < 3; ++t) {
        workers.emplace_back([&, t] {
            std::vector<double> out;
            for (int r = 0; r < 1000; ++r) {
                Job& j = jobs[(r + 2 * t) % jobs.size()];
                if (run(j, out) != 0 || out.size() != j.want.size() || std::memcmp(out.data(), j.want.data(), out.size() * sizeof(double)) != 0)
                    ++failures;
            }
        });
    }
    std::thread releaser([&] {
        while (!done) vlx_free_internal();
    });
    for (auto& w : workers) w.join();
    done = true;
    releaser.join();
    EXPECT_EQ(failures, 0);
}
