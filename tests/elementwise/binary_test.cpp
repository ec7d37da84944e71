// Two-operand operations: every shape and aliasing against the stated order bit for bit, the zero rule, the clamps.
#include "vlx_test.hpp"

#include <complex>
#include <functional>

namespace {

using namespace vlxtest;

VLX_TWIN(b, add) VLX_TWIN(b, sub) VLX_TWIN(b, mul) VLX_TWIN(b, conj_mul) VLX_TWIN(b, div) VLX_TWIN(b, avg_add)
VLX_TWIN(b, max) VLX_TWIN(b, min) VLX_TWIN(b, inter) VLX_TWIN(b, ritoc) VLX_TWIN(b, pmul)
VLX_TEST_TWIN(t_dot, vlxbs_dot, vlxfbs_dot) VLX_TEST_TWIN(t_prepare, vlxb_prepare_dest, vlxfb_prepare_dest)

VLX_TYPED_SUITE(Binary);

template <class T>
using Sample = std::complex<T>;

// Reads sample i of a vector as a complex number (im 0 for a real vector).
template <class V>
Sample<real_of<V>> at(V* v, int64_t i) {
    return v->complex ? Sample<real_of<V>>(v->data[2 * i], v->data[2 * i + 1]) : Sample<real_of<V>>(v->data[i], 0);
}

// Every shape, dst a third vector (vector loops), a or b (scalar order, a real dst grows): the bits of ref(a_i, b_i).
template <class V, class Op, class Ref>
void check_shapes(Op op, Ref ref, int32_t n = 67) {
    using T = real_of<V>;
    for (int shape = 0; shape < 4; ++shape) {
        const bool ac = shape & 1, bc = shape & 2;
        for (int alias = 0; alias < 3; ++alias) {  // dst a third vector, a, b
            SCOPED_TRACE(::testing::Message() << "a complex " << ac << ", b complex " << bc << ", alias " << alias);
            Vec<V> a(random_values<T>(n * (ac ? 2 : 1), 11 + shape, -3, 3), ac), b(random_values<T>(n * (bc ? 2 : 1), 23 + shape, -3, 3), bc);
            a->delta = T(0.5), b->delta = T(1.5);
            Vec<V> a0(a.values(), ac), b0(b.values(), bc), third;
            V* dst = alias == 0 ? third.get() : alias == 1 ? a.get() : b.get();
            ASSERT_TRUE(op(a.get(), b.get(), dst) == 0 && has_shape(dst, n, (ac || bc) ? 1 : 0, 1));
            for (int64_t i = 0; i < n; ++i) {
                const Sample<T> want = ref(at(a0.get(), i), at(b0.get(), i), ac, bc), got = at(dst, i);
                ASSERT_TRUE(same_bits(got.real(), want.real()) && (!(ac || bc) || same_bits(got.imag(), want.imag())))
                    << "at " << i << ": " << got << " vs " << want;
            }
        }
    }
}

// Ranking value of max and min: power, or the bound once a part exceeds it.
template <class V>
real_of<V> rank(Sample<real_of<V>> z) {
    const real_of<V> lim = bound_of<V>();
    if (z.real() > lim || z.real() < -lim || z.imag() > lim || z.imag() < -lim) return lim;
    return z.imag() * z.imag() + z.real() * z.real();
}

template <class V>
struct ShapeCase {
    const char* name;
    std::function<int32_t(V*, V*, V*)> op;
    std::function<Sample<real_of<V>>(Sample<real_of<V>>, Sample<real_of<V>>, bool, bool)> ref;
};

// A two-source operation with its destination.
#define BOP(fn) [](V* a, V* b, V* d) { return fn(a, b, d); }

TYPED_TEST(Binary, EveryShapeWithEveryAliasingMatchesTheStatedOrder) {
    using V = TypeParam; using T = real_of<V>;
    using S = Sample<T>;
    const T alpha = T(0.3);
    const std::vector<ShapeCase<V>> cases = {
        {"add", BOP(t_add), [](S a, S b, bool, bool) { return S(a.real() + b.real(), a.imag() + b.imag()); }},
        {"sub", BOP(t_sub),
         [](S a, S b, bool ac, bool) { return S(a.real() - b.real(), ac ? a.imag() - b.imag() : -b.imag()); }},
        {"mul", BOP(t_mul), [](S a, S b, bool ac, bool bc) {
             if (ac && bc) return S(b.real() * a.real() - b.imag() * a.imag(), a.imag() * b.real() + b.imag() * a.real());
             return ac ? S(a.real() * b.real(), a.imag() * b.real()) : S(a.real() * b.real(), a.real() * b.imag());
         }},
        {"conj_mul", BOP(t_conj_mul), [](S a, S b, bool ac, bool bc) {
             if (ac && bc) return S(b.imag() * a.imag() + b.real() * a.real(), a.imag() * b.real() - b.imag() * a.real());
             return ac ? S(a.real() * b.real(), a.imag() * b.real()) : S(a.real() * b.real(), -(a.real() * b.imag()));
         }},
        {"div", BOP(t_div), [](S a, S b, bool ac, bool bc) {
             if (!bc) {
                 const T r = T(1) / b.real();
                 return ac ? S(a.real() * r, a.imag() * r) : S(a.real() / b.real(), 0);
             }
             const T m = b.imag() * b.imag() + b.real() * b.real(), r = T(1) / m;
             return S((b.imag() * a.imag() + b.real() * a.real()) * r, (a.imag() * b.real() - b.imag() * a.real()) * r);
         }},
        {"avg_add", [alpha](V* a, V* b, V* d) { return t_avg_add(a, b, d, alpha); },
         [alpha](S a, S b, bool ac, bool bc) {
             const T re = (a.real() - b.real()) * alpha + b.real();
             if (ac && bc) return S(re, (a.imag() - b.imag()) * alpha + b.imag());
             return ac ? S(re, alpha * a.imag()) : S(re, b.imag() * (T(1) - alpha));
         }},
        {"max", BOP(t_max), [](S a, S b, bool ac, bool bc) {
             if (!ac && !bc) return a.real() > b.real() ? a : b;
             return rank<V>(a) > rank<V>(b) ? a : b;
         }},
        {"min", BOP(t_min), [](S a, S b, bool ac, bool bc) {
             if (!ac && !bc) return a.real() < b.real() ? a : b;
             return rank<V>(b) > rank<V>(a) ? a : b;
         }},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        check_shapes<V>(c.op, c.ref);
    }
}

// The shorter source counts as zeros up to the longer's length, also when it is the destination; delta is the mean.
TYPED_TEST(Binary, UnequalLengthsZeroExtendInAddAndSub) {
    using V = TypeParam; using T = real_of<V>;
    struct Row { bool a_shorter, dst_is_shorter, sub; std::vector<T> want; };
    const std::vector<Row> rows = {
        {true, false, false, {11, 22, 33, 40, 50}}, {false, false, false, {11, 22, 33, 40, 50}},
        {true, true, false, {11, 22, 33, 40, 50}},  {true, false, true, {-9, -18, -27, -40, -50}},
        {false, true, true, {9, 18, 27, 40, 50}},
    };
    for (const Row& r : rows) {
        Vec<V> s({1, 2, 3}), l({10, 20, 30, 40, 50}), out;
        s->delta = 1, l->delta = 3;
        V *a = r.a_shorter ? s.get() : l.get(), *b = r.a_shorter ? l.get() : s.get(), *d = r.dst_is_shorter ? s.get() : out.get();
        ASSERT_EQ(r.sub ? t_sub(a, b, d) : t_add(a, b, d), 0);
        EXPECT_TRUE(d->points == 5 && d->delta == T(2) && std::vector<T>(d->data, d->data + 5) == r.want);
        EXPECT_TRUE(r.dst_is_shorter || s.values() == (std::vector<T>{1, 2, 3})) << r.a_shorter << r.dst_is_shorter << r.sub;
    }
}

TYPED_TEST(Binary, DivisionByZeroGivesPositiveBound) {
    using V = TypeParam; using T = real_of<V>;
    const T big = bound_of<V>();
    const T tiny_b = is_double<V> ? T(1e-200) : T(1e-30f);  // its square underflows to 0
    const T inf = std::numeric_limits<T>::infinity();
    const T nan = std::numeric_limits<T>::quiet_NaN();
    struct Row { std::vector<T> a; bool ac; std::vector<T> b; bool bc; std::vector<T> want; };
    const std::vector<Row> rows = {
        {{-1}, false, {0}, false, {big}}, {{0}, false, {0}, false, {0}}, {{3}, false, {T(-0.0)}, false, {big}},
        {{nan}, false, {0}, false, {big}},  // NaN is not zero
        {{-2, -3}, true, {0}, false, {big, big}}, {{0, 0}, true, {0}, false, {0, 0}},
        {{0, 0}, true, {tiny_b, 0}, true, {big, big}},  // underflowing m
        {{0, 0}, true, {0, 0}, true, {0, 0}}, {{-1, 0}, true, {T(-0.0), 0}, true, {big, big}},
        {{0}, false, {0, T(-0.0)}, true, {0, 0}}, {{-5}, false, {0, 0}, true, {big, big}},
        {{4}, false, {0, 2}, true, {0, -2}},
        {{1}, false, {inf, 0}, true, {nan, nan}},  // b's infinity reaches both parts
    };
    for (const Row& r : rows) {
        Vec<V> a(r.a, r.ac), b(r.b, r.bc), d;
        ASSERT_EQ(t_div(a.get(), b.get(), d.get()), 0);
        EXPECT_TRUE(same_scalars(d.values(), r.want)) << "a[0] " << r.a[0] << " b[0] " << r.b[0];
    }
    // A vector divided by itself gives 0 where it holds 0, not 1.
    Vec<V> x({2, 0, -3});
    ASSERT_EQ(t_div(x.get(), x.get(), x.get()), 0);
    EXPECT_EQ(x.values(), (std::vector<T>{1, 0, 1}));
}

TYPED_TEST(Binary, MaxAndMinRankByClampedPowerWithTiesToB) {
    using V = TypeParam; using T = real_of<V>;
    const T over = is_double<V> ? T(1e101) : T(1e16f);
    const T big_but_finite = is_double<V> ? T(1e60) : T(1e10f);  // power beyond the bound
    struct Row { std::vector<T> a; bool ac; std::vector<T> b; bool bc; std::vector<T> max, min; };
    const std::vector<Row> rows = {
        {{2}, false, {0, 2}, true, {0, 2}, {0, 2}},  // tie: b both ways
        {{0, 2}, true, {2}, false, {2, 0}, {2, 0}},
        {{over, 0}, true, {big_but_finite, 0}, true, {big_but_finite, 0}, {over, 0}},
        {{3, 4}, true, {-5}, false, {-5, 0}, {-5, 0}}, {{T(NAN)}, false, {1}, false, {1}, {1}},
        {{1}, false, {T(NAN)}, false, {T(NAN)}, {T(NAN)}}, {{T(-0.0)}, false, {0}, false, {0}, {0}},
    };
    for (const Row& r : rows) {
        for (bool is_max : {true, false}) {
            Vec<V> a(r.a, r.ac), b(r.b, r.bc), d;
            ASSERT_EQ(is_max ? t_max(a.get(), b.get(), d.get()) : t_min(a.get(), b.get(), d.get()), 0);
            EXPECT_TRUE(same_scalars(d.values(), is_max ? r.max : r.min)) << (is_max ? "max" : "min") << " a[0] " << r.a[0];
        }
    }
}

TYPED_TEST(Binary, InterleaveAndRitoc) {
    using V = TypeParam; using T = real_of<V>;
    for (int alias = 0; alias < 3; ++alias) {
        Vec<V> a({1, 2, 3}), b({10, 11, 20, 21, 30, 31}, true), third;
        a->delta = b->delta = 1;
        V* d = alias == 0 ? third.get() : alias == 1 ? a.get() : b.get();
        ASSERT_TRUE(t_inter(a.get(), b.get(), d) == 0 && has_shape(d, 6, 1, 0.5));
        EXPECT_EQ(std::vector<T>(d->data, d->data + 12), (std::vector<T>{1, 0, 10, 11, 2, 0, 20, 21, 3, 0, 30, 31}));
    }
    Vec<V> a({1, 2, 3}), b({4, 5, 6}), c({1, 0}, true), shorter({1}), re({1, 2, 3}), im({4, 5, 6});
    ASSERT_EQ(t_inter(a.get(), a.get(), a.get()), 0);
    EXPECT_EQ(a.values(), (std::vector<T>{1, 1, 2, 2, 3, 3}));
    EXPECT_TRUE(t_inter(b.get(), shorter.get(), b.get()) == -1 && b->points == 3);
    EXPECT_TRUE(t_ritoc(c.get(), shorter.get(), b.get()) == -1 && t_ritoc(b.get(), shorter.get(), b.get()) == -1);
    EXPECT_EQ(b->complex, 0);
    ASSERT_EQ(t_ritoc(re.get(), im.get(), im.get()), 0);
    EXPECT_EQ(im.values(), (std::vector<T>{1, 4, 2, 5, 3, 6}));
}

TYPED_TEST(Binary, PolynomialProductAgainstDirectConvolution) {
    using V = TypeParam; using T = real_of<V>;
    using LC = std::complex<long double>;
    const int na = 9, nb = 5;
    for (int shape = 0; shape < 4; ++shape)
        for (bool alias : {false, true}) {
            const bool ac = shape & 1, bc = shape & 2;
            Vec<V> a(random_values<T>(na * (ac ? 2 : 1), 5 + shape), ac), b(random_values<T>(nb * (bc ? 2 : 1), 7 + shape), bc), out;
            std::vector<LC> want(na + nb - 1);
            for (int i = 0; i < na; ++i)
                for (int j = 0; j < nb; ++j) want[i + j] += LC(at(a.get(), i)) * LC(at(b.get(), j));
            V* d = alias ? b.get() : out.get();
            ASSERT_TRUE(t_pmul(a.get(), b.get(), d) == 0 && d->points == na + nb - 1 && d->complex == ((ac || bc) ? 1 : 0));
            const long double tol = 16 * std::numeric_limits<T>::epsilon();
            for (int k = 0; k < na + nb - 1; ++k)
                EXPECT_TRUE(near(at(d, k).real(), want[k].real(), tol) && near(at(d, k).imag(), want[k].imag(), tol)) << k;
        }
    Vec<V> a({1, 2}), empty, d({7});
    EXPECT_TRUE(t_pmul(a.get(), empty.get(), d.get()) == 0 && d->points == 0);
}

TYPED_TEST(Binary, DotSumsEveryPointWithLanePartialSums) {
    using V = TypeParam; using T = real_of<V>;
    const int lanes = is_double<V> ? 4 : 8;
    for (int n : {0, 3, lanes, 4 * lanes + 3, 1001}) {
        const std::vector<T> xa = random_values<T>(n, 1, -1e3, 1e3), xb = random_values<T>(n, 2);
        T part[8] = {};
        const int blocked = n - n % lanes;
        for (int i = 0; i < blocked; ++i) part[i % lanes] = part[i % lanes] + xa[i] * xb[i];
        T want = 0;
        for (int k = 0; k < lanes; ++k) want = want + part[k];
        for (int i = blocked; i < n; ++i) want = want + xa[i] * xb[i];
        Vec<V> a(xa, false), b(xb, false);
        a->delta = 4;
        ASSERT_TRUE(t_dot(a.get(), b.get(), a.get()) == 0 && has_shape(a.get(), 1, 0, 4));  // dst a still sums all n
        EXPECT_TRUE(same_bits(a[0], want)) << n << ": " << a[0] << " vs " << want;
    }
    Vec<V> c({1, 2, 3, 4}, true), r({10, 100});
    ASSERT_EQ(t_dot(c.get(), c.get(), r.get()), 0);
    EXPECT_EQ(r.values(), (std::vector<T>{(1 - 4) + (9 - 16), 4 + 24}));  // no conjugate
}

// A destination that cannot be sized: -1, nothing changes; storage that cannot be had: the destination left empty.
TYPED_TEST(Binary, PrepareDestFailures) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> a({1, 2}), b({1, 2, 3, 4}, true), longer({1, 2, 3}), d({5});
    d->delta = 7;
    EXPECT_TRUE(t_prepare(a.get(), longer.get(), d.get()) == -1 && d->points == 1 && d->delta == T(7));
    {
        FailingAlloc<V> failing;
        EXPECT_TRUE(t_mul(a.get(), b.get(), d.get()) == -1 && t_add(a.get(), b.get(), a.get()) == -1);
    }
    EXPECT_TRUE((d->points == 0 && d->alloc == 0 && d->complex == 1 && d->delta == T(1)) && a->data == nullptr);
}

}  // namespace
