// Resampling tables: the built-in kernels' shape, both expansion rules
// against long double, and the degenerate and failing inputs.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {
VLX_TWIN(c, rsmp)
VLX_TWIN(c, rsmp_cos)
VLX_TWIN(c, rsmp_pcos)

template <class V>
class ResamplingTables : public ::testing::Test {};
TYPED_TEST_SUITE(ResamplingTables, Families);

TYPED_TEST(ResamplingTables, BuiltInKernelsAreSymmetricAndPeakInTheMiddle) {
    // 1024 phases; design 4 gives the 13314-point table of the streaming resampler
    const double taps[] = {8, 13, 8, 10, 13};
    for (int32_t design = 0; design < 5; ++design) {
        Vec<TypeParam> v;
        v->points = int32_t(taps[design]) * 1024 + 2;
        ASSERT_EQ(t_rsmp(&v, design), 0);
        const int64_t mid = 1 + (v->points - 2) / 2;
        EXPECT_EQ(v[0], taps[design]);
        bool symmetric = true, peak = true;
        for (int64_t i = 1; i < mid; ++i) symmetric &= same_bits(v[mid - i], v[mid + i]), peak &= v[mid] >= v[mid - i];
        EXPECT_TRUE(symmetric && peak) << design;
        EXPECT_LT(std::fabs(v[1]), 1e-3 * v[mid]) << design;  // the ends are nearly zero
    }
}

TYPED_TEST(ResamplingTables, ExpansionRulesAgainstLongDouble) {
    using T = real_of<TypeParam>;
    const double tol = is_double<TypeParam> ? 1e-14 : 2e-6;
    Vec<TypeParam> design({T(6), T(0.4), T(-0.3), T(0.2), T(0.05)});
    for (bool polynomial : {false, true}) {
        Vec<TypeParam> v, cx;
        v->points = 66, cx->points = 66, cx->complex = 1;
        ASSERT_EQ(polynomial ? t_rsmp_pcos(&v, design.get()) : t_rsmp_cos(&v, design.get()), 0);
        ASSERT_EQ(polynomial ? t_rsmp_pcos(&cx, design.get()) : t_rsmp_cos(&cx, design.get()), 0);
        EXPECT_TRUE(has_shape(cx.get(), 66, 1, 1.0));
        for (int i = 0; i <= 32; ++i) {
            const long double theta = i * 2 * 3.14159265358979323846L / 64, c = cosl(theta);
            long double want = design[1];
            for (int k = 2; k < 5; ++k) want += design[k] * (polynomial ? powl(c, k - 1) : cosl((k - 1) * theta));
            EXPECT_TRUE(near(v[33 - i], want, tol) && same_bits(v[33 + i], v[33 - i])) << i;
        }
        for (int64_t k = 0; k < 66; ++k) EXPECT_TRUE(same_bits(cx[2 * k], v[k]) && cx[2 * k + 1] == T(0)) << k;
    }
    // two points: T and the value at theta 0, the coefficients' sum
    Vec<TypeParam> two;
    two->points = 2;
    ASSERT_EQ(t_rsmp_cos(&two, design.get()), 0);
    EXPECT_TRUE(same_scalars(two.values(), {T(6), T(T(T(T(0.4) + T(-0.3)) + T(0.2)) + T(0.05))}));
}

TYPED_TEST(ResamplingTables, DegenerateAndFailingInputs) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> v, one({T(9)}), pair({T(9), T(0), T(1), T(0)}, true);
    v->points = 7;
    EXPECT_EQ(t_rsmp(&v, 0), -1);  // odd n
    v->points = 10;
    EXPECT_EQ(t_rsmp(&v, 5) & t_rsmp(&v, -1) & t_rsmp_cos(&v, pair.get()), -1);
    ASSERT_EQ(t_rsmp_pcos(&v, one.get()), 0);  // a design of T alone
    std::vector<T> want(10, T(0));
    want[0] = T(9);
    EXPECT_TRUE(same_scalars(v.values(), want));
    v->points = 1;
    ASSERT_EQ(t_rsmp(&v, 3), 0);
    EXPECT_EQ(v[0], T(10));
    FailingAlloc<TypeParam> failing;
    Vec<TypeParam> w;
    w->points = 10;
    EXPECT_EQ(t_rsmp(&w, 0), -1);
    EXPECT_EQ(w->points, 0);
}

}  // namespace
