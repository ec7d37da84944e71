// Lines, tones and complex exponentials against long double, with the rotation's exact restarts.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {
VLX_TWIN(c, line) VLX_TWIN(c, cos) VLX_TWIN(c, cexp) VLX_TWIN(c, rand) VLX_TWIN(c, rsmp)

VLX_TYPED_SUITE(Generators);

template <class V>  // a creator's vector: points, delta and complex preset by the caller
V* preset(Vec<V>& v, int32_t points, double delta, int32_t cx) {
    return v->points = points, v->delta = real_of<V>(delta), v->complex = cx, v.get();
}

TYPED_TEST(Generators, LineToneAndExponentialFollowTheirReferences) {
    using T = real_of<TypeParam>;
    const T freq = T(0.0123), phase = T(0.7), delta = T(0.5), tol = is_double<TypeParam> ? T(1e-12) : T(1e-4);
    Vec<TypeParam> line, re, cx, ex, ex_real;
    ASSERT_EQ(t_line(preset(line, 1000, delta, 1), T(0.3), T(-2)) | t_cos(preset(re, 1000, delta, 0), freq, phase) |
                  t_cos(preset(cx, 1000, delta, 1), freq, phase) | t_cexp(preset(ex, 1000, delta, 1), freq, phase) |
                  t_cexp(preset(ex_real, 1000, delta, 0), freq, phase), 0);
    EXPECT_TRUE(has_shape(cx.get(), 1000, 1, 0.5) && has_shape(ex_real.get(), 1000, 0, 0.5));
    Vec<TypeParam> e[5];  // creators leave empty vectors empty
    EXPECT_EQ(t_line(preset(e[0], 0, 1, 0), T(1), T(0)) | t_cos(preset(e[1], 0, 1, 0), T(1), T(0)) |
                  t_cexp(preset(e[2], 0, 1, 1), T(1), T(0)) | t_rand(preset(e[3], 0, 1, 0), 1) | t_rsmp(preset(e[4], 0, 1, 0), 0), 0);
    EXPECT_TRUE(same_scalars(ex_real.values(), re.values()));  // a real vector gets the cosine
    T value = T(-2);  // the line is a running sum
    for (int64_t k = 0; k < 1000; ++k, value += delta * T(0.3)) {
        const long double angle = 2 * 3.14159265358979323846L * (long double)freq * k * (long double)delta + phase;
        ASSERT_TRUE(same_bits(line[2 * k], value) && line[2 * k + 1] == T(0)) << k;
        ASSERT_TRUE(near(re[k], cosl(angle), tol) && same_bits(cx[2 * k], re[k]) && cx[2 * k + 1] == T(0)) << k;
        ASSERT_TRUE(near(ex[2 * k], cosl(angle), tol) && near(ex[2 * k + 1], sinl(angle), tol)) << k;
    }
    // Sample 256 restarts at the exact angle, whatever the rotation gathered: the float tone in single precision
    // reduced in double, the float exponential wholly in double.
    const T w = delta * T(2) * static_cast<T>(3.141592653589793) * freq, angle = T(256) * w + phase;
    if constexpr (is_double<TypeParam>)
        EXPECT_TRUE(same_bits(re[256], std::cos(angle)) && same_bits(ex[513], std::sin(angle)));
    else
        EXPECT_TRUE(same_bits(re[256], float(std::cos(std::fmod(double(angle), 6.283185307179586)))) &&
                    same_bits(ex[513], float(std::sin(std::fmod(256.0 * w + double(phase), 6.283185307179586)))));
}

}  // namespace
