// Analytic signal and Hilbert transform: tones, the DC and Nyquist bins, short lengths.
#include "fft_reference.hpp"

using namespace vlxtest;

namespace {

VLX_TEST_TWIN(t_analytic, vlxi_analytic, vlxfi_analytic) VLX_TEST_TWIN(t_hilbert, vlxi_hilbert, vlxfi_hilbert)

VLX_TYPED_SUITE(AnalyticTest);

}  // namespace

// x = a cos(w i) + DC + Nyquist (even N): the analytic signal is x + j a sin(w i), the Hilbert transform a sin(w i),
// for real input and for complex input with zero imaginary parts.  Tolerance as for the transforms of any length up
// to L = 1024.
TYPED_TEST(AnalyticTest, TonesAndEdgeBins) {
    using T = real_of<TypeParam>;
    const double tol = 2 * fftref::transform_tolerance(std::numeric_limits<T>::epsilon(), 10);
    for (int32_t n : {3, 4, 7, 8, 10, 64, 99, 360}) {
        for (int32_t bin : {1, (n - 1) / 2}) {
            std::vector<T> x(n), c(2 * size_t(n), T(0));
            std::vector<long double> s(n);
            for (int32_t i = 0; i < n; ++i) {
                const long double w = 6.283185307179586476925286766559L * bin * i / n;
                c[2 * i] = x[i] = T(0.75L * std::cos(w) + 0.5L + (n % 2 ? 0 : (i % 2 ? -0.25L : 0.25L)));
                s[i] = 0.75L * std::sin(w);
            }
            for (bool cplx : {false, true}) {
                Vec<TypeParam> a(cplx ? c : x, cplx), h(cplx ? c : x, cplx);
                ASSERT_TRUE(t_analytic(&a) == 0 && t_hilbert(&h) == 0 && a->complex == 1);
                ASSERT_EQ(h->complex, cplx ? 1 : 0);
                for (int32_t i = 0; i < n; ++i) {
                    ASSERT_TRUE(near(a[2 * i], x[i], tol) && near(a[2 * i + 1], s[i], tol)) << n << " " << bin << " " << i;
                    ASSERT_TRUE(near(h[cplx ? 2 * i : i], s[i], tol) && (!cplx || near(h[2 * i + 1], 0, tol))) << n << " " << i;
                }
            }
        }
    }
}

// Two points keep both bins; one real sample in a one-scalar block: the analytic signal keeps it (and delta), the
// Hilbert transform zeroes it in place and stays real.
TYPED_TEST(AnalyticTest, ShortLengths) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> two({3, -1}), one({5}), zero({5});
    one->delta = T(4);
    ASSERT_TRUE(t_analytic(&two) == 0 && t_analytic(&one) == 0 && t_hilbert(&zero) == 0);
    EXPECT_TRUE(same_scalars(two.values(), {3, 0, -1, 0}, 2));
    EXPECT_TRUE(one->complex == 0 && same_bits(one[0], T(5)) && same_bits(one->delta, T(4)));
    EXPECT_TRUE(zero->complex == 0 && same_bits(zero[0], T(0)));
}
