// Analytic signal and Hilbert transform: tones turn cos into sin, DC and
// Nyquist have no quadrature part, and the short lengths keep their shape.
#include "fft_reference.hpp"

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_analytic, vlxi_analytic, vlxfi_analytic)
VLX_TEST_TWIN(t_hilbert, vlxi_hilbert, vlxfi_hilbert)

template <class V>
class AnalyticTest : public ::testing::Test {};
TYPED_TEST_SUITE(AnalyticTest, Families);

}  // namespace

// x = a cos(w n) + b (DC) + c (-1)^n (Nyquist, even N only): the analytic
// signal is x + j a sin(w n), the Hilbert transform a sin(w n), whether the
// input is real or complex with zero imaginary parts.
TYPED_TEST(AnalyticTest, TonesAndEdgeBins) {
    using T = real_of<TypeParam>;
    const long double two_pi = 6.283185307179586476925286766559L;
    for (int32_t n : {3, 4, 7, 8, 10, 64, 99, 360}) {
        for (int32_t bin : {1, (n - 1) / 2}) {
            const double tol = 2 * fftref::transform_tolerance(std::numeric_limits<T>::epsilon(), 12);
            std::vector<T> x(n), c(2 * size_t(n), T(0));
            std::vector<long double> s(n);
            for (int32_t i = 0; i < n; ++i) {
                const long double w = two_pi * bin * i / n;
                x[i] = T(0.75L * std::cos(w) + 0.5L + (n % 2 ? 0 : (i % 2 ? -0.25L : 0.25L)));
                c[2 * i] = x[i];
                s[i] = 0.75L * std::sin(w);
            }
            for (bool cplx : {false, true}) {
                Vec<TypeParam> a(cplx ? c : x, cplx), h(cplx ? c : x, cplx);
                ASSERT_EQ(t_analytic(&a), 0);
                ASSERT_EQ(t_hilbert(&h), 0);
                ASSERT_EQ(a->complex, 1);
                ASSERT_EQ(h->complex, cplx ? 1 : 0);
                ASSERT_EQ(h->points, n);
                for (int32_t i = 0; i < n; ++i) {
                    ASSERT_TRUE(near(a[2 * i], x[i], tol)) << n << " " << bin << " at " << i;
                    ASSERT_TRUE(near(a[2 * i + 1], s[i], tol)) << n << " " << bin << " at " << i;
                    ASSERT_TRUE(near(h[cplx ? 2 * i : i], s[i], tol)) << n << " " << bin << " at " << i;
                    if (cplx) {
                        ASSERT_TRUE(near(h[2 * i + 1], 0, tol)) << n << " " << bin << " at " << i;
                    }
                }
            }
        }
    }
}

TYPED_TEST(AnalyticTest, ShortLengths) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> a({1, 0, -1, 0}), h({1, 0, -1, 0});
    ASSERT_EQ(t_analytic(&a), 0);
    ASSERT_EQ(t_hilbert(&h), 0);
    const std::vector<T> want_a = {1, 0, 0, 1, -1, 0, 0, -1}, want_h = {0, 1, 0, -1};
    for (size_t i = 0; i < want_a.size(); ++i) EXPECT_TRUE(near(a[i], want_a[i], 1e-6)) << i;
    for (size_t i = 0; i < want_h.size(); ++i) EXPECT_TRUE(near(h[i], want_h[i], 1e-6)) << i;

    Vec<TypeParam> two({3, -1});  // both bins kept as they are
    ASSERT_EQ(t_analytic(&two), 0);
    EXPECT_EQ(two->complex, 1);
    const T want_two[] = {3, 0, -1, 0};
    for (int i = 0; i < 4; ++i) EXPECT_TRUE(near(two[i], want_two[i], 1e-6)) << i;

    // One real sample in a one-scalar block: the analytic signal keeps it,
    // the Hilbert transform zeroes it in place and stays real.
    Vec<TypeParam> one({5}), zero({5});
    one->delta = T(4);
    ASSERT_EQ(t_analytic(&one), 0);
    EXPECT_EQ(one->complex, 0);
    EXPECT_TRUE(same_bits(one[0], T(5)));
    EXPECT_TRUE(same_bits(one->delta, T(4)));
    ASSERT_EQ(t_hilbert(&zero), 0);
    EXPECT_EQ(zero->complex, 0);
    EXPECT_TRUE(same_bits(zero[0], T(0)));
}
