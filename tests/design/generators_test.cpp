// Lines, cosines and complex exponentials against long-double references,
// with the exact restart of the rotation every 256 samples.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {
VLX_TWIN(c, line)
VLX_TWIN(c, cos)
VLX_TWIN(c, cexp)

template <class V>
class Generators : public ::testing::Test {};
TYPED_TEST_SUITE(Generators, Families);

// A preset vector as a generator expects it: points, delta and complex.
template <class V>
void preset(Vec<V>& v, int32_t points, double delta, int32_t is_complex) {
    v->points = points, v->delta = static_cast<real_of<V>>(delta), v->complex = is_complex;
}

TYPED_TEST(Generators, LineIsARunningSumWithZeroImaginaryParts) {
    using T = real_of<TypeParam>;
    for (int32_t cx : {0, 1}) {
        Vec<TypeParam> v;
        preset(v, 1000, 0.1, cx);
        ASSERT_EQ(t_line(&v, T(0.3), T(-2)), 0);
        EXPECT_TRUE(has_shape(v.get(), 1000, cx, 0.1));
        T value = T(-2);
        for (int64_t k = 0; k < 1000; ++k, value += T(0.1) * T(0.3)) {
            ASSERT_TRUE(same_bits(v[k * (1 + cx)], value) && (!cx || v[2 * k + 1] == T(0))) << k;
        }
    }
}

TYPED_TEST(Generators, ToneAndExponentialFollowTheirAngle) {
    using T = real_of<TypeParam>;
    const double tol = is_double<TypeParam> ? 1e-12 : 1e-4;
    const T freq = T(0.0123), phase = T(0.7), delta = T(0.5);
    Vec<TypeParam> re, cx, ex, ex_real;
    preset(re, 1000, delta, 0), preset(cx, 1000, delta, 1), preset(ex, 1000, delta, 1), preset(ex_real, 1000, delta, 0);
    ASSERT_EQ(t_cos(&re, freq, phase), 0);
    ASSERT_EQ(t_cos(&cx, freq, phase), 0);
    ASSERT_EQ(t_cexp(&ex, freq, phase), 0);
    ASSERT_EQ(t_cexp(&ex_real, freq, phase), 0);  // a real vector gets the cosine
    EXPECT_TRUE(has_shape(cx.get(), 1000, 1, 0.5) && has_shape(ex_real.get(), 1000, 0, 0.5));
    EXPECT_TRUE(same_scalars(ex_real.values(), re.values()));
    for (int64_t k = 0; k < 1000; ++k) {
        const long double angle = 2 * 3.14159265358979323846L * (long double)freq * k * (long double)delta + phase;
        ASSERT_TRUE(near(re[k], cosl(angle), tol)) << k;
        ASSERT_TRUE(same_bits(cx[2 * k], re[k]) && cx[2 * k + 1] == T(0)) << k;
        ASSERT_TRUE(near(ex[2 * k], cosl(angle), tol) && near(ex[2 * k + 1], sinl(angle), tol)) << k;
    }
    // Each block restarts at the exact angle, whatever the rotation gathered:
    // the float tone in single precision reduced in double, the float
    // exponential wholly in double.
    const T w = delta * T(2) * static_cast<T>(3.141592653589793) * freq;
    for (int64_t k : {256, 512, 768}) {
        const T angle = T(k) * w + phase;
        const double wide = double(k) * double(w) + double(phase);
        if constexpr (is_double<TypeParam>) {
            EXPECT_TRUE(same_bits(re[k], std::cos(angle)) && same_bits(ex[2 * k + 1], std::sin(angle)));
        } else {
            EXPECT_TRUE(same_bits(re[k], float(std::cos(std::fmod(double(angle), 6.283185307179586)))));
            EXPECT_TRUE(same_bits(ex[2 * k + 1], float(std::sin(std::fmod(wide, 6.283185307179586)))));
        }
    }
}

TYPED_TEST(Generators, EmptyConstantAndFailedStorage) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> empty, flat;
    preset(empty, 0, 1.0, 1), preset(flat, 300, 0.25, 0);
    EXPECT_EQ(t_cos(&empty, T(1), T(0)) | t_cexp(&empty, T(1), T(0)) | t_line(&empty, T(1), T(0)), 0);
    ASSERT_EQ(t_cos(&flat, T(0), T(0)), 0);
    EXPECT_TRUE(same_scalars(flat.values(), std::vector<T>(300, T(1))));
    FailingAlloc<TypeParam> failing;
    for (int32_t which = 0; which < 3; ++which) {
        Vec<TypeParam> v;
        preset(v, 10, 1.0, 1);
        const int32_t r = which == 0 ? t_line(&v, T(1), T(0)) : which == 1 ? t_cos(&v, T(1), T(0)) : t_cexp(&v, T(1), T(0));
        EXPECT_EQ(r, -1);
        EXPECT_EQ(v->points, 0);
    }
}

}  // namespace
