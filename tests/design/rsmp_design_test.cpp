// Resampling tables: the kernels' shape, both expansion rules against long double, degenerate inputs.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {
VLX_TWIN(c, rsmp) VLX_TWIN(c, rsmp_cos) VLX_TWIN(c, rsmp_pcos)

VLX_TYPED_SUITE(ResamplingTables);

TYPED_TEST(ResamplingTables, BuiltInKernelsAreSymmetricAndPeakInTheMiddle) {
    // 1024 phases; design 4 gives the 13314-point table of the streaming resampler
    const int32_t taps[] = {8, 13, 8, 10, 13};
    for (int32_t design = 0; design < 5; ++design) {
        const int64_t mid = 1 + taps[design] * 512;
        Vec<TypeParam> v(std::vector<real_of<TypeParam>>(2 * mid), false);
        ASSERT_EQ(t_rsmp(&v, design), 0);
        bool symmetric = true, peak = true;  // and nearly zero at both ends
        for (int64_t i = 1; i < mid; ++i) symmetric &= same_bits(v[mid - i], v[mid + i]), peak &= v[mid] >= v[mid - i];
        EXPECT_TRUE(v[0] == taps[design] && symmetric && peak && std::fabs(v[1]) < 1e-3 * v[mid]) << design;
    }
}

TYPED_TEST(ResamplingTables, ExpansionRulesAgainstLongDoubleAndDegenerateInputs) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> design({T(6), T(0.4), T(-0.3), T(0.2), T(0.05)}), one({T(9)}), pair({T(9), T(0), T(1), T(0)}, true);
    for (bool polynomial : {false, true}) {
        Vec<TypeParam> v(std::vector<T>(66), false), cx(std::vector<T>(132), true);
        auto expand = [polynomial](TypeParam* e, TypeParam* d) { return polynomial ? t_rsmp_pcos(e, d) : t_rsmp_cos(e, d); };
        ASSERT_EQ(expand(v.get(), design.get()) | expand(cx.get(), design.get()), 0);
        EXPECT_TRUE(has_shape(cx.get(), 66, 1, 1.0));
        for (int i = 0; i <= 32; ++i) {
            const long double theta = i * 2 * 3.14159265358979323846L / 64, c = cosl(theta);
            long double want = design[1];
            for (int k = 2; k < 5; ++k) want += design[k] * (polynomial ? powl(c, k - 1) : cosl((k - 1) * theta));
            EXPECT_TRUE(near(v[33 - i], want, is_double<TypeParam> ? 1e-14 : 2e-6) && same_bits(v[33 + i], v[33 - i]));
        }
        for (int64_t k = 0; k < 66; ++k) EXPECT_TRUE(same_bits(cx[2 * k], v[k]) && cx[2 * k + 1] == T(0)) << k;
    }
    Vec<TypeParam> v({0, 0}), odd({0, 0, 0, 0, 0, 0, 0});  // two points: T and the value at theta 0
    ASSERT_EQ(t_rsmp_cos(&v, design.get()), 0);
    EXPECT_TRUE(same_scalars(v.values(), {T(6), T(T(T(T(0.4) + T(-0.3)) + T(0.2)) + T(0.05))}));
    v->points = 10;
    EXPECT_EQ(t_rsmp(&odd, 0) & t_rsmp(&v, 5) & t_rsmp(&v, -1) & t_rsmp_cos(&v, pair.get()), -1);
    ASSERT_EQ(t_rsmp_pcos(&v, one.get()), 0);  // a design of T alone
    EXPECT_TRUE(same_scalars(v.values(), {T(9), 0, 0, 0, 0, 0, 0, 0, 0, 0}));
    v->points = 1;
    EXPECT_TRUE(t_rsmp(&v, 3) == 0 && v[0] == T(10));
}

}  // namespace
