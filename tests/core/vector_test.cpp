// The vector object: storage rules, lent storage, hooks, composition, comparison.
#include "vlx_test.hpp"

#include <cstdlib>

using namespace vlxtest;

namespace {

// A counting allocator installed through the hooks.  It records every call and the arguments the library passes, and
// can be told to fail.
template <class V>
struct Counting {
    using T = real_of<V>;
    static inline int allocs = 0, reallocs = 0, frees = 0, live = 0;
    static inline int32_t last_old_points = -1, last_old_complex = -1;
    static inline bool fail = false;

    static int64_t wanted(const V* v) { return v->complex ? 2 * int64_t(v->points) : v->points; }
    static int32_t on_alloc(V* v) {
        ++allocs;
        if (v->alloc > 0) std::free(v->data), --live;  // the hook releases the old block itself
        v->data = fail ? nullptr : static_cast<T*>(std::malloc(size_t(wanted(v)) * sizeof(T)));
        if (v->data) ++live;
        return 0;
    }
    static int32_t on_realloc(V* v, int32_t old_points, int32_t old_complex) {
        ++reallocs, last_old_points = old_points, last_old_complex = old_complex;
        if (fail) {
            if (v->alloc > 0) --live, std::free(v->data);
            v->data = nullptr;
            return -1;
        }
        if (v->data == nullptr) ++live;
        v->data = static_cast<T*>(std::realloc(v->data, size_t(wanted(v)) * sizeof(T)));
        return 0;
    }
    static int32_t on_free(V* v) { return ++frees, --live, std::free(v->data), 0; }
    static void install() { allocs = reallocs = frees = live = 0, fail = false, set_hooks<V>(&on_alloc, &on_realloc, &on_free); }
};

template <class V>
class VectorTest : public ::testing::Test {
protected:
    using T = real_of<V>;
    void SetUp() override { Counting<V>::install(); }
    void TearDown() override {
        set_hooks<V>(nullptr, nullptr);
        EXPECT_EQ(Counting<V>::live, 0) << "a block was leaked or freed twice";
    }
};
TYPED_TEST_SUITE(VectorTest, Families);

TYPED_TEST(VectorTest, GrowthIsExactAndNeverShrinks) {
    using V = TypeParam;
    using C = Counting<V>;
    V v;
    v.reserved = 77;
    t_init(&v);
    EXPECT_TRUE(v.delta == 1 && v.reserved == 0);
    EXPECT_TRUE(t_alloc(&v) == 0 && C::allocs == 0);  // 0 <= 0: nothing to allocate

    v.points = 5, v.complex = 1;
    ASSERT_EQ(t_alloc(&v), 0);
    EXPECT_TRUE(v.alloc == 10 && C::allocs == 1);  // scalars, exactly
    v.points = 3, v.complex = 0;  // a smaller requirement changes nothing
    ASSERT_EQ(t_alloc(&v), 0);
    EXPECT_TRUE(v.alloc == 10 && C::allocs == 1);

    for (int i = 0; i < 3; ++i) v.data[i] = real_of<V>(i + 1);
    v.points = 11;
    ASSERT_EQ(t_realloc(&v, 3, 0), 0);
    EXPECT_TRUE(v.alloc == 11 && C::reallocs == 1 && C::last_old_points == 3);
    EXPECT_EQ(std::vector<real_of<V>>(v.data, v.data + 3), (std::vector<real_of<V>>{1, 2, 3}));

    t_destroy(&v);
    EXPECT_TRUE(C::frees == 1 && v.data == nullptr && v.alloc == 0);
}

TYPED_TEST(VectorTest, FailedResizeLeavesTheEmptyState) {
    using V = TypeParam;
    using C = Counting<V>;
    // Each resizing operation, with a failing allocator, on an owning vector.
    struct Case { const char* name; int32_t (*op)(V*); };
    const Case cases[] = {
        {"alloc", [](V* v) { v->points = 100; return t_alloc(v); }},
        {"realloc", [](V* v) { v->points = 100; return t_realloc(v, 4, v->complex); }},
        {"zero", [](V* v) { v->points = 100; return t_zero(v); }}, {"zpad", [](V* v) { return t_zpad(v, 100); }},
        {"append", [](V* v) { return t_append(v, v); }},
        {"rtoc", [](V* v) { v->complex = 0, v->points = 4; return t_rtoc(v); }},
    };
    for (const Case& c : cases) {
        Vec<V> v({1, 2, 3, 4}, true);
        v->delta = real_of<V>(0.25);
        C::fail = true;
        EXPECT_EQ(c.op(v.get()), -1) << c.name;
        C::fail = false;
        EXPECT_TRUE(v->data == nullptr && v->alloc == 0 && v->points == 0) << c.name;
        EXPECT_TRUE(v->delta == real_of<V>(0.25) && v->complex == 1) << c.name;
    }
}

TYPED_TEST(VectorTest, LentStorageIsNeverWrittenOrFreed) {
    using V = TypeParam; using T = real_of<V>;
    using C = Counting<V>;
    T lent[8] = {1, 2, 3, 4, 5, 6, 7, 8};
    const std::vector<T> original(lent, lent + 8);
    auto lend = [&](V* v) {
        t_init(v);
        v->data = lent;
        v->points = 8;
    };

    V v;
    lend(&v);
    ASSERT_EQ(t_rtoc(&v), 0);  // detaches: the owned copy is spread, the lender's samples stay
    EXPECT_TRUE(v.alloc == 16 && v.data != lent);
    EXPECT_EQ(std::vector<T>(v.data, v.data + 16), (std::vector<T>{1, 0, 2, 0, 3, 0, 4, 0, 5, 0, 6, 0, 7, 0, 8, 0}));
    EXPECT_EQ(std::vector<T>(lent, lent + 8), original);
    t_destroy(&v);

    lend(&v);
    ASSERT_EQ(t_zero(&v), 0);  // an owned block of zeros; the lent samples are not worth copying
    EXPECT_TRUE(C::last_old_points == 0 && v.data != lent);
    EXPECT_EQ(std::vector<T>(v.data, v.data + 8), std::vector<T>(8, T(0)));
    EXPECT_EQ(std::vector<T>(lent, lent + 8), original);
    t_destroy(&v);

    const int frees_before = C::frees;
    lend(&v);
    t_destroy(&v);  // lent: nothing released, fields reset
    EXPECT_TRUE(C::frees == frees_before && v.data == nullptr && v.points == 0);
}

TYPED_TEST(VectorTest, ZeroPadRtocAndAppend) {
    using V = TypeParam; using T = real_of<V>;
    Vec<V> v({1, 2, 3, 9, 9});
    v->points = 3;  // stale samples beyond the points must be cleared
    ASSERT_EQ(t_zpad(v.get(), 2), 0);  // never shortens
    EXPECT_EQ(v->points, 3);
    ASSERT_EQ(t_zpad(v.get(), 5), 0);
    EXPECT_EQ(v.values(), (std::vector<T>{1, 2, 3, 0, 0}));

    ASSERT_EQ(t_append(v.get(), v.get()), 0);  // appending to itself doubles it
    EXPECT_EQ(v.values(), (std::vector<T>{1, 2, 3, 0, 0, 1, 2, 3, 0, 0}));
    EXPECT_EQ(v->alloc, 10);

    Vec<V> r({5, 6});
    Vec<V> c({7, 8}, true);
    r->delta = 3;
    ASSERT_EQ(t_append(r.get(), c.get()), 0);  // the destination turns complex, keeps its delta
    EXPECT_TRUE(has_shape(r.get(), 3, 1, 3));
    EXPECT_EQ(r.values(), (std::vector<T>{5, 0, 6, 0, 7, 8}));
    ASSERT_EQ(t_append(c.get(), Vec<V>({9}).get()), 0);  // real behind complex: imaginary part 0
    EXPECT_EQ(c.values(), (std::vector<T>{7, 8, 9, 0}));

    EXPECT_TRUE(t_rtoc(c.get()) == 0 && c->points == 2);  // already complex: no change
    Vec<V> z({4, 5});
    z->points = -1;
    EXPECT_TRUE(t_zero(z.get()) == 0 && z->points == 0);
}

TYPED_TEST(VectorTest, SubvecClampsAndTrimsInPlace) {
    using V = TypeParam; using T = real_of<V>;
    struct Case { int32_t start, count; std::vector<T> expected; };
    const Case cases[] = {
        {2, 3, {2, 3, 4}},   {-5, 2, {0, 1}}, {100, 2, {}}, {8, 5, {8, 9}},
        {0, -3, {}},         {9, 1, {9}},     {0, 100, {0, 1, 2, 3, 4, 5, 6, 7, 8, 9}},
    };
    for (const Case& c : cases) {
        Vec<V> src({0, 1, 2, 3, 4, 5, 6, 7, 8, 9});
        src->delta = real_of<V>(0.5);
        Vec<V> dst;
        ASSERT_EQ(t_subvec(src.get(), dst.get(), c.start, c.count), 0);
        EXPECT_EQ(dst.values(), c.expected) << c.start << "," << c.count;
        EXPECT_EQ(dst->delta, real_of<V>(0.5));

        // The same range trimmed in place: capacity unchanged.
        ASSERT_EQ(t_subvec(src.get(), src.get(), c.start, c.count), 0);
        EXPECT_TRUE(src.values() == c.expected && src->alloc == 10);
    }

    Vec<V> cx({1, 2, 3, 4, 5, 6}, true);
    Vec<V> out;
    ASSERT_EQ(t_copy_at_most(out.get(), cx.get(), 2), 0);
    EXPECT_EQ(out.values(), (std::vector<T>{1, 2, 3, 4}));
    EXPECT_EQ(out->complex, 1);
    ASSERT_EQ(t_copy(out.get(), cx.get()), 0);
    EXPECT_EQ(out.values(), cx.values());
}

TYPED_TEST(VectorTest, InsertSubvecOverwritesAndGrows) {
    using V = TypeParam; using T = real_of<V>;
    using C = Counting<V>;
    {
        Vec<V> src({10, 11, 12});
        src->delta = 7;
        Vec<V> dst({0, 1, 2, 3});
        ASSERT_EQ(t_insert_subvec(src.get(), dst.get(), 1, 5, 3), 0);  // count clamps to 2, grows dst to 5
        EXPECT_EQ(dst.values(), (std::vector<T>{0, 1, 2, 11, 12}));
        EXPECT_EQ(dst->delta, 7);  // the source's spacing wins
    }
    {
        Vec<V> src({10, 11});
        Vec<V> dst({1, 2, 3, 4, 5, 6}, true);
        ASSERT_EQ(t_insert_subvec(src.get(), dst.get(), 0, 2, 1), 0);  // real into complex: im 0
        EXPECT_EQ(dst.values(), (std::vector<T>{1, 2, 10, 0, 11, 0}));
    }
    {
        Vec<V> v({0, 1, 2, 3, 4, 5});
        ASSERT_EQ(t_insert_subvec(v.get(), v.get(), 0, 4, 2), 0);  // overlapping move within one vector
        EXPECT_EQ(v.values(), (std::vector<T>{0, 1, 0, 1, 2, 3}));
    }
    {
        // A complex source over the whole of a real destination: the old samples are not spread first (the library
        // reallocates from 0 points).
        Vec<V> src({1, 2, 3, 4}, true);
        Vec<V> dst({9, 9});
        C::last_old_points = -1;
        ASSERT_EQ(t_insert_subvec(src.get(), dst.get(), 0, 2, 0), 0);
        EXPECT_TRUE(C::last_old_points == 0 && C::last_old_complex == 1 && dst.values() == src.values());
        // Over part of it, the destination is spread to complex first.
        Vec<V> part({5, 6, 7});
        ASSERT_EQ(t_insert_subvec(src.get(), part.get(), 1, 1, 1), 0);
        EXPECT_EQ(part.values(), (std::vector<T>{5, 0, 3, 4, 7, 0}));
    }
}

TYPED_TEST(VectorTest, CompareWalksDeltaThenSamples) {
    using V = TypeParam; using T = real_of<V>;
    const T nan = std::numeric_limits<T>::quiet_NaN();
    struct Case { std::vector<T> a; bool ac; std::vector<T> b; bool bc; T tolerance, delta_b; int32_t expected; };
    const Case cases[] = {
        {{1, 2}, false, {1, 2}, false, 0, 1, 0},
        {{1, 2}, false, {1, 2}, false, -1, 1, 1},         // d = 0 > -1
        {{1, 5}, false, {1, 2}, false, 1, 1, 1},
        {{9, 9}, false, {1, 1}, false, 1, 3, -1},          // delta decides first
        {{1, nan}, false, {1, 7}, false, 0, 1, 0},         // NaN counts as equal
        {{1, 2}, true, {1}, false, 1, 1, 1},               // a.im = 2 against an absent 0
        {{1, -2}, true, {1}, false, 1, 1, -1}, {{1, 0.5}, true, {1}, false, 1, 1, 0},
        {{3, 0, 1, 0}, true, {3, 0, 1, 1}, true, 0.5, 1, -1},
    };
    for (size_t i = 0; i < std::size(cases); ++i) {
        const Case& c = cases[i];
        Vec<V> a(c.a, c.ac);
        Vec<V> b(c.b, c.bc);
        b->delta = c.delta_b;
        int32_t result = 99;
        EXPECT_EQ(t_cmp(a.get(), b.get(), c.tolerance, &result), 0) << i;
        EXPECT_EQ(result, c.expected) << "case " << i;
    }
    Vec<V> a({1, 2, 3});
    Vec<V> b({1, 2});
    int32_t result = 99;
    EXPECT_TRUE(t_cmp(a.get(), b.get(), T(0), &result) == -1 && result == 99);
}

TEST(Vector, ConversionToFloatRoundsAndRefusesItself) {
    Vec<vlx_t> d({0.1, 1e300, -2.5, 1.0 / 3}, true);
    d->delta = 0.1;
    Vec<vlxf_t> f;
    ASSERT_EQ(vlxu_tof(d.get(), f.get()), 0);
    EXPECT_TRUE(has_shape(f.get(), 2, 1, double(0.1f)));
    EXPECT_EQ(f.values(), (std::vector<float>{0.1f, std::numeric_limits<float>::infinity(), -2.5f, 1.0f / 3}));
    EXPECT_EQ(vlxu_tof(reinterpret_cast<vlx_t*>(f.get()), f.get()), -1);

    Vec<vlxf_t> g;
    ASSERT_EQ(vlxfu_tof(f.get(), g.get()), 0);
    EXPECT_TRUE(g.values() == f.values() && (vlxfu_tof(g.get(), g.get()) == -1 && g->points == 2));
}

TEST(Vector, HooksBelongToOnePrecision) {
    Counting<vlx_t>::install();
    vlx_alloc_hook_t previous = nullptr;
    EXPECT_TRUE(vlx_lib_alloc(&Counting<vlx_t>::on_alloc, &previous) == 0 && previous == (&Counting<vlx_t>::on_alloc));
    {
        Vec<vlxf_t> f({1, 2, 3});  // float storage does not touch the double hooks
        Vec<vlx_t> d({1, 2, 3});
    }
    EXPECT_TRUE(Counting<vlx_t>::allocs == 1 && Counting<vlx_t>::frees == 1);
    set_hooks<vlx_t>(nullptr, nullptr);
    EXPECT_TRUE(vlx_lib_alloc(nullptr, &previous) == 0 && previous == nullptr);
}

}  // namespace
