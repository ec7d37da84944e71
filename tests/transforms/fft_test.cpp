// The complex power-of-two transform through the public interface.
#include "fft_reference.hpp"

#include <cmath>
#include <limits>

using namespace vlxtest;
using namespace fftref;

namespace {

VLX_TYPED_SUITE(Fft);

template <class V>
double eps_of() { return std::numeric_limits<real_of<V>>::epsilon(); }

// The reordered, depth-first engine does exactly the arithmetic of the literal stage-by-stage walk: every scalar must
// match bit for bit, also for lengths whose tables restart the recurrence (n/8 > 257).
TYPED_TEST(Fft, MatchesLiteralEngineBitForBit) {
    using T = real_of<TypeParam>;
    for (int m = 2; m <= 16; ++m) {
        const size_t n = size_t(1) << m;
        for (int inverse = 0; inverse <= 1; ++inverse) {
            const std::vector<T> input = random_values<T>(2 * n, 100 + m);
            std::vector<T> want = input;
            literal_fft(want, inverse != 0);
            Vec<TypeParam> v(input, true);
            ASSERT_EQ(t_fft(&v, inverse), 0);
            size_t mismatches = 0;
            for (size_t i = 0; i < 2 * n; ++i) mismatches += !same_bits(v[i], want[i]);
            EXPECT_EQ(mismatches, 0u) << "n = " << n << " inverse = " << inverse;
        }
    }
}

// Relative L2 error against long double within a small multiple of eps sqrt(log2 N), forward and after a round trip;
// this also vouches for the literal engine above.
TYPED_TEST(Fft, AccuracyAgainstLongDouble) {
    using T = real_of<TypeParam>;
    for (int m = 0; m <= 12; ++m) {
        const size_t n = size_t(1) << m;
        const std::vector<T> input = random_values<T>(2 * n, 7 + m);
        std::vector<cld> x(n);
        for (size_t k = 0; k < n; ++k) x[k] = cld(input[2 * k], input[2 * k + 1]);
        const std::vector<cld> want = exact_dft(x, false);
        const double tol = transform_tolerance(eps_of<TypeParam>(), m);
        Vec<TypeParam> v(input, true);
        ASSERT_EQ(t_fft(&v, 0), 0);
        EXPECT_LE(double(rel_l2(v.get()->data, want, n)), tol) << "forward, n = " << n;
        ASSERT_EQ(t_fft(&v, 1), 0);
        EXPECT_LE(double(rel_l2(v.get()->data, x, n)), 2 * tol) << "round trip, n = " << n;
    }
}

// Small lengths whose results are exact in both precisions.
TYPED_TEST(Fft, ExactSmallLengths) {
    using T = real_of<TypeParam>;
    struct Case { std::vector<T> in; bool in_complex; int inverse; std::vector<T> out; bool out_complex; };
    const Case cases[] = {
        {{5}, false, 0, {5}, false},                     // one real point stays real
        {{5, -2}, true, 1, {5, -2}, true},               // one complex point unchanged
        {{1, 3}, false, 0, {2, 0, -1, 0}, true},         // halved, then sum and difference
        {{2, 0, -1, 0}, true, 1, {1, 0, 3, 0}, true},
        {{1, 2, 3, 4}, false, 0, {2.5, 0, -0.5, 0.5, -0.5, 0, -0.5, -0.5}, true},
        {{10, 0, -2, 2, -2, 0, -2, -2}, true, 1, {4, 0, 8, 0, 12, 0, 16, 0}, true},
        {{1, 1, 1, 1, 1, 1, 1, 1}, false, 0, {1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0}, true},
    };
    for (const Case& c : cases) {
        Vec<TypeParam> v(c.in, c.in_complex);
        ASSERT_EQ(t_fft(&v, c.inverse), 0);
        EXPECT_EQ(v->complex != 0, c.out_complex);
        EXPECT_EQ(v.values(), c.out) << "input of " << c.in.size() << " scalars";
    }
}

TYPED_TEST(Fft, Delta) {
    using T = real_of<TypeParam>;
    const T nan = std::numeric_limits<T>::quiet_NaN();
    const T fallback = bound_of<TypeParam>();
    struct Case { T delta; int points; int inverse; T want; };
    const Case cases[] = {
        {T(0), 4, 0, fallback}, {T(-0.0), 8, 1, fallback}, {T(-2), 8, 0, T(-0.0625)},
        {T(0.5), 1, 0, T(2)},   {T(0), 2, 1, fallback},    {T(4), 2, 0, T(0.125)}, {nan, 8, 0, nan},
    };
    for (const Case& c : cases) {
        Vec<TypeParam> v(std::vector<T>(2 * c.points, T(1)), true);
        v->delta = c.delta;
        ASSERT_EQ(t_fft(&v, c.inverse), 0);
        EXPECT_TRUE(same_scalars<T>({v->delta}, {c.want})) << v->delta << " for delta " << c.delta;
    }
}

// Not a power of two: -1 with the vector untouched, real or complex.
TYPED_TEST(Fft, RejectsOtherLengths) {
    using T = real_of<TypeParam>;
    for (int points : {0, 3, 6, 12, 1000}) {
        for (int cplx = 0; cplx <= 1; ++cplx) {
            const std::vector<T> in = random_values<T>(size_t(points) * (cplx + 1), 5);
            Vec<TypeParam> v(in, cplx != 0);
            v->delta = T(0.25);
            EXPECT_TRUE(t_fft(&v, 0) == -1 && (has_shape(v.get(), points, cplx, 0.25) && v.values() == in));
        }
    }
    Vec<TypeParam> v;
    v->points = -4;
    EXPECT_EQ(t_fft(&v, 1), -1);
}

// A real vector is spread in place to 2N scalars; its transform is that of the same data given as complex.
TYPED_TEST(Fft, RealInputGrowsToComplex) {
    using T = real_of<TypeParam>;
    const std::vector<T> in = random_values<T>(64, 9);
    std::vector<T> spread(128, T(0));
    for (size_t i = 0; i < 64; ++i) spread[2 * i] = in[i];
    Vec<TypeParam> real(in, false), cplx(spread, true);
    ASSERT_TRUE(t_fft(&real, 0) == 0 && t_fft(&cplx, 0) == 0 && real->alloc == 128 && real->points == 64);
    EXPECT_TRUE(same_scalars(real.values(), cplx.values()));
}

}  // namespace
