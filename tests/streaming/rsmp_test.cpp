// The streaming resampler: set-up, point counts, delay and start-up, and the
// run of a stream in blocks, both families.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {

template <class V>
using Coef = std::conditional_t<is_double<V>, vlxh_rsmp_coef_t, vlxfh_rsmp_coef_t>;
template <class V>
using State = std::conditional_t<is_double<V>, vlxh_rsmp_state_t, vlxfh_rsmp_state_t>;

#define VLX_RSMP_TWIN(name)                                                                             \
    template <class... A>                                                                               \
    inline auto t_##name(vlxh_rsmp_coef_t* c, A&&... a) { return vlxh_rsmp_##name(c, std::forward<A>(a)...); } \
    template <class... A>                                                                               \
    inline auto t_##name(vlxfh_rsmp_coef_t* c, A&&... a) { return vlxfh_rsmp_##name(c, std::forward<A>(a)...); }
VLX_RSMP_TWIN(coef_init)
VLX_RSMP_TWIN(coef_alloc)
VLX_RSMP_TWIN(coef_setup)
VLX_RSMP_TWIN(coef_destroy)
inline int32_t t_in_pts(int32_t* n, vlxh_rsmp_coef_t* c, int32_t p, int32_t s) { return vlxh_rsmp_get_in_pts(n, c, p, s); }
inline int32_t t_in_pts(int32_t* n, vlxfh_rsmp_coef_t* c, int32_t p, int32_t s) { return vlxfh_rsmp_get_in_pts(n, c, p, s); }
inline int32_t t_out_pts(int32_t* n, vlxh_rsmp_coef_t* c, int32_t p, int32_t s, int32_t a) {
    return vlxh_rsmp_get_out_pts(n, c, p, s, a);
}
inline int32_t t_out_pts(int32_t* n, vlxfh_rsmp_coef_t* c, int32_t p, int32_t s, int32_t a) {
    return vlxfh_rsmp_get_out_pts(n, c, p, s, a);
}
inline int32_t t_delay(double* d, vlxh_rsmp_coef_t* c, int32_t u) { return vlxh_rsmp_get_delay_pts(d, c, u); }
inline int32_t t_delay(float* d, vlxfh_rsmp_coef_t* c, int32_t u) { return vlxfh_rsmp_get_delay_pts(d, c, u); }
inline int32_t t_settle(double* d, vlxh_rsmp_coef_t* c, int32_t u) { return vlxh_rsmp_get_settle_pts(d, c, u); }
inline int32_t t_settle(float* d, vlxfh_rsmp_coef_t* c, int32_t u) { return vlxfh_rsmp_get_settle_pts(d, c, u); }

template <class V>
class StreamingResampler : public ::testing::Test {};
TYPED_TEST_SUITE(StreamingResampler, Families);

// Ratio split, discards, delay and start-up of ratios that need no filter
// reload; the figures follow from the stage filters' half lengths.
TYPED_TEST(StreamingResampler, SetupAndArithmetic) {
    using V = TypeParam;
    using T = real_of<V>;
    struct Case {
        T ratio;
        int32_t forced, k;
        T r;
        int32_t skip_mid, skip_out;
        T delay_in, delay_out, settle_in;
    };
    const Case cases[] = {
        {T(4), 0, 2, T(1), 33, 0, T(57), T(14.25), T(132)},
        {T(2), 0, 1, T(1), 33, 0, T(19), T(9.5), T(66)},
        {T(3), 0, 1, T(1.5), 33, 43, T(82.5), T(27.5), T(195)},  // 24 + 19 behind 35 / 1.5
        {T(1), 1, 0, T(1), 0, 54, T(27), T(27), T(54)},
        {T(-5), 1, 0, T(1), 0, 54, T(27), T(27), T(54)},  // 0 or below reads as 1
        {T(1.9999), 0, 0, T(1.9999), 0, 37, 0, 0, 0},
        {T(0.9765625), 0, 0, T(0.9765625), 0, 55, 0, 0, 0},
    };
    for (const Case& c : cases) {
        Coef<V> coef;
        ASSERT_EQ(t_coef_init(&coef), 0);
        ASSERT_EQ(t_coef_setup(&coef, c.ratio, c.forced, 0), 0);
        EXPECT_EQ(coef.octaves, c.k) << c.ratio;
        EXPECT_EQ(coef.ratio, c.r) << c.ratio;
        EXPECT_EQ(coef.skip_mid, c.skip_mid) << c.ratio;
        EXPECT_EQ(coef.skip_out, c.skip_out) << c.ratio;
        T d = 0, dout = 0, settle = 0;
        ASSERT_EQ(t_delay(&d, &coef, 0), 0);
        ASSERT_EQ(t_delay(&dout, &coef, 1), 0);
        ASSERT_EQ(t_settle(&settle, &coef, 0), 0);
        if (c.delay_in != 0) { EXPECT_EQ(d, c.delay_in) << c.ratio; }
        if (c.delay_out != 0) { EXPECT_EQ(dout, c.delay_out) << c.ratio; }
        if (c.settle_in != 0) { EXPECT_EQ(settle, c.settle_in) << c.ratio; }
        EXPECT_EQ(t_coef_setup(&coef, T(8), 0, 1), -1);  // reserved: nothing stored
        EXPECT_EQ(coef.octaves, c.k);
        ASSERT_EQ(t_coef_destroy(&coef), 0);
    }
}

// What get_in_pts asks for delivers what get_out_pts promises, for settled
// and unsettled counts, and the edge figures hold.
TYPED_TEST(StreamingResampler, PointCountsAgree) {
    using V = TypeParam;
    using T = real_of<V>;
    for (T ratio : {T(1), T(1.25), T(1.9999), T(2), T(3), T(4), T(6.3), T(1000)}) {
        Coef<V> coef;
        t_coef_init(&coef);
        ASSERT_EQ(t_coef_setup(&coef, ratio, 0, 0), 0);
        for (int32_t settled : {0, 1})
            for (int32_t want : {0, 1, 2, 7, 100, 4096, 100000}) {
                int32_t in = -1, got = -1, most = -1;
                ASSERT_EQ(t_in_pts(&in, &coef, want, settled), 0);
                ASSERT_EQ(t_out_pts(&got, &coef, in, settled, 1), 0);
                ASSERT_EQ(t_out_pts(&most, &coef, in, 0, 0), 0);
                EXPECT_GE(got, want) << "ratio " << ratio << " settled " << settled;
                EXPECT_GE(most, got) << "ratio " << ratio;
                if (want == 0 && settled) { EXPECT_EQ(in, 0); }
            }
        int32_t n = 5;
        EXPECT_EQ(t_in_pts(static_cast<int32_t*>(nullptr), &coef, 10, 0), 0);
        EXPECT_EQ(t_in_pts(&n, static_cast<Coef<V>*>(nullptr), 10, 0), -1);
        EXPECT_EQ(n, 5);
    }
    Coef<V> one;
    t_coef_init(&one);
    t_coef_setup(&one, T(1), 0, 0);
    for (int32_t p : {-7, 0, 13}) {
        int32_t n = -1;
        t_out_pts(&n, &one, p, 1, 0);
        EXPECT_EQ(n, p < 0 ? 0 : p);
    }
    Coef<V> fresh;  // never set up: r 0, total = s, resampling formula
    t_coef_init(&fresh);
    T d = 0;
    t_delay(&d, &fresh, 1);
    EXPECT_EQ(d, T(17.5));
}

}  // namespace
