// The vector object: storage rules, lent storage, hooks, composition, comparison.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {

// A counting allocator installed through the hooks: it records the calls and the old shape the library passes, can
// be told to fail, and counts the blocks alive.
template <class V>
struct Counting {
    static inline int allocs, reallocs, frees, live, last_old_points, last_old_complex;
    static inline bool fail;
    static size_t bytes(const V* v) { return size_t(v->complex ? 2 * int64_t(v->points) : v->points) * sizeof(*v->data); }
    static int32_t on_alloc(V* v) {
        ++allocs;
        if (v->alloc > 0) std::free(v->data), --live;  // the hook releases the old block itself
        v->data = fail ? nullptr : static_cast<real_of<V>*>(std::malloc(bytes(v)));
        return live += v->data != nullptr, 0;
    }
    static int32_t on_realloc(V* v, int32_t old_points, int32_t old_complex) {
        ++reallocs, last_old_points = old_points, last_old_complex = old_complex;
        if (fail) return on_alloc(v), --allocs, -1;
        live += v->data == nullptr;
        return v->data = static_cast<real_of<V>*>(std::realloc(v->data, bytes(v))), 0;
    }
    static int32_t on_free(V* v) { return ++frees, --live, std::free(v->data), 0; }
};

template <class V>
class VectorTest : public ::testing::Test {
protected:
    using C = Counting<V>;
    void SetUp() override {
        C::allocs = C::reallocs = C::frees = C::live = 0, C::fail = false;
        set_hooks<V>(&C::on_alloc, &C::on_realloc, &C::on_free);
    }
    void TearDown() override {
        set_hooks<V>(nullptr, nullptr);
        EXPECT_EQ(C::live, 0) << "a block was leaked or freed twice";
    }
};
TYPED_TEST_SUITE(VectorTest, Families);

template <class T>
using Vals = std::vector<T>;

TYPED_TEST(VectorTest, GrowthIsExactNeverShrinksAndFailureLeavesTheEmptyState) {
    using V = TypeParam;
    using T = real_of<V>;
    using C = Counting<V>;
    V v;
    v.reserved = 77;
    t_init(&v);
    EXPECT_TRUE(v.delta == 1 && v.reserved == 0 && t_alloc(&v) == 0 && C::allocs == 0);  // 0 <= 0: nothing to do
    v.points = 5, v.complex = 1;
    EXPECT_TRUE(t_alloc(&v) == 0 && v.alloc == 10 && C::allocs == 1);  // scalars, exactly
    v.points = 3, v.complex = 0;
    EXPECT_TRUE(t_alloc(&v) == 0 && v.alloc == 10 && C::allocs == 1);  // a smaller requirement changes nothing
    for (int i = 0; i < 3; ++i) v.data[i] = T(i + 1);
    v.points = 11;
    EXPECT_TRUE(t_realloc(&v, 3, 0) == 0 && v.alloc == 11 && C::reallocs == 1 && C::last_old_points == 3);
    EXPECT_EQ(Vals<T>(v.data, v.data + 3), (Vals<T>{1, 2, 3}));
    t_destroy(&v);
    EXPECT_TRUE(C::frees == 1 && v.data == nullptr && v.alloc == 0);

    // Each resizing operation with a failing allocator: -1, and the empty state with spacing and kind kept.
    int32_t (*const failing[])(V*) = {
        [](V* v) { return v->points = 100, t_alloc(v); },  [](V* v) { return v->points = 100, t_realloc(v, 4, 1); },
        [](V* v) { return v->points = 100, t_zero(v); },   [](V* v) { return t_zpad(v, 100); },
        [](V* v) { return t_append(v, v); },               [](V* v) { return v->complex = 0, v->points = 4, t_rtoc(v); },
    };
    for (auto op : failing) {
        Vec<V> w({1, 2, 3, 4}, true);
        w->delta = T(0.25);
        C::fail = true;
        EXPECT_EQ(op(w.get()), -1);
        C::fail = false;
        EXPECT_TRUE(w->data == nullptr && w->alloc == 0 && w->points == 0 && w->delta == T(0.25) && w->complex == 1);
    }
}

TYPED_TEST(VectorTest, LentStorageIsNeverWrittenOrFreed) {
    using V = TypeParam;
    using T = real_of<V>;
    T lent[8] = {1, 2, 3, 4, 5, 6, 7, 8};
    const Vals<T> original(lent, lent + 8);
    V a, b, c;
    for (V* v : {&a, &b, &c}) t_init(v), v->data = lent, v->points = 8;
    // rtoc detaches: the owned copy is spread, the lender's samples stay.
    ASSERT_EQ(t_rtoc(&a), 0);
    EXPECT_TRUE(a.alloc == 16 && a.data != lent);
    EXPECT_EQ(Vals<T>(a.data, a.data + 16), (Vals<T>{1, 0, 2, 0, 3, 0, 4, 0, 5, 0, 6, 0, 7, 0, 8, 0}));
    // zero makes an owned block of zeros (the lent samples are not worth copying).
    ASSERT_EQ(t_zero(&b), 0);
    EXPECT_TRUE(Counting<V>::last_old_points == 0 && b.data != lent && Vals<T>(b.data, b.data + 8) == Vals<T>(8, T(0)));
    const int frees = Counting<V>::frees;
    t_destroy(&c);  // releases nothing, resets the fields
    EXPECT_TRUE(c.data == nullptr && c.points == 0 && Counting<V>::frees == frees);
    t_destroy(&a), t_destroy(&b);
    EXPECT_EQ(Vals<T>(lent, lent + 8), original);
}

TYPED_TEST(VectorTest, ZeroPadRtocAndAppend) {
    using V = TypeParam;
    using T = real_of<V>;
    Vec<V> v({1, 2, 3, 9, 9});
    v->points = 3;  // stale samples beyond the points must be cleared
    EXPECT_TRUE(t_zpad(v.get(), 2) == 0 && v->points == 3);  // never shortens
    ASSERT_EQ(t_zpad(v.get(), 5), 0);
    EXPECT_EQ(v.values(), (Vals<T>{1, 2, 3, 0, 0}));
    ASSERT_EQ(t_append(v.get(), v.get()), 0);  // appending to itself doubles it
    EXPECT_TRUE(v.values() == (Vals<T>{1, 2, 3, 0, 0, 1, 2, 3, 0, 0}) && v->alloc == 10);

    Vec<V> r({5, 6}), c({7, 8}, true), z({4, 5});
    r->delta = 3;
    ASSERT_EQ(t_append(r.get(), c.get()), 0);  // the destination turns complex, keeps its delta
    EXPECT_TRUE(has_shape(r.get(), 3, 1, 3) && r.values() == (Vals<T>{5, 0, 6, 0, 7, 8}));
    ASSERT_EQ(t_append(c.get(), Vec<V>({9}).get()), 0);  // real behind complex: imaginary part 0
    EXPECT_EQ(c.values(), (Vals<T>{7, 8, 9, 0}));
    EXPECT_TRUE(t_rtoc(c.get()) == 0 && c->points == 2);  // already complex: no change
    z->points = -1;
    EXPECT_TRUE(t_zero(z.get()) == 0 && z->points == 0);
}

TYPED_TEST(VectorTest, SubvecClampsAndTrimsInPlace) {
    using V = TypeParam;
    using T = real_of<V>;
    const struct { int32_t start, count; Vals<T> expected; } cases[] = {
        {2, 3, {2, 3, 4}}, {-5, 2, {0, 1}}, {100, 2, {}}, {8, 5, {8, 9}}, {0, -3, {}}, {9, 1, {9}},
        {0, 100, {0, 1, 2, 3, 4, 5, 6, 7, 8, 9}},
    };
    for (const auto& c : cases) {
        Vec<V> src({0, 1, 2, 3, 4, 5, 6, 7, 8, 9}), dst;
        src->delta = T(0.5);
        ASSERT_EQ(t_subvec(src.get(), dst.get(), c.start, c.count), 0);
        EXPECT_TRUE(dst.values() == c.expected && dst->delta == T(0.5)) << c.start << "," << c.count;
        // The same range trimmed in place: capacity unchanged.
        ASSERT_EQ(t_subvec(src.get(), src.get(), c.start, c.count), 0);
        EXPECT_TRUE(src.values() == c.expected && src->alloc == 10) << c.start << "," << c.count;
    }
    Vec<V> cx({1, 2, 3, 4, 5, 6}, true), out;
    ASSERT_EQ(t_copy_at_most(out.get(), cx.get(), 2), 0);
    EXPECT_TRUE(out.values() == (Vals<T>{1, 2, 3, 4}) && out->complex == 1);
    EXPECT_TRUE(t_copy(out.get(), cx.get()) == 0 && out.values() == cx.values());
}

TYPED_TEST(VectorTest, InsertSubvecOverwritesAndGrows) {
    using V = TypeParam;
    using T = real_of<V>;
    using C = Counting<V>;
    Vec<V> src({10, 11, 12}), dst({0, 1, 2, 3});
    src->delta = 7;
    ASSERT_EQ(t_insert_subvec(src.get(), dst.get(), 1, 5, 3), 0);  // count clamps to 2, grows dst to 5
    EXPECT_TRUE(dst.values() == (Vals<T>{0, 1, 2, 11, 12}) && dst->delta == 7);  // the source's spacing wins

    Vec<V> cdst({1, 2, 3, 4, 5, 6}, true);
    ASSERT_EQ(t_insert_subvec(src.get(), cdst.get(), 0, 2, 1), 0);  // real into complex: im 0
    EXPECT_EQ(cdst.values(), (Vals<T>{1, 2, 10, 0, 11, 0}));

    Vec<V> v({0, 1, 2, 3, 4, 5});
    ASSERT_EQ(t_insert_subvec(v.get(), v.get(), 0, 4, 2), 0);  // overlapping move within one vector
    EXPECT_EQ(v.values(), (Vals<T>{0, 1, 0, 1, 2, 3}));

    // A complex source over the whole of a real destination: the old samples are not spread first (the library
    // reallocates from 0 points).  Over part of it, the destination is spread to complex first.
    Vec<V> csrc({1, 2, 3, 4}, true), whole({9, 9}), part({5, 6, 7});
    C::last_old_points = -1;
    ASSERT_EQ(t_insert_subvec(csrc.get(), whole.get(), 0, 2, 0), 0);
    EXPECT_TRUE(C::last_old_points == 0 && C::last_old_complex == 1 && whole.values() == csrc.values());
    ASSERT_EQ(t_insert_subvec(csrc.get(), part.get(), 1, 1, 1), 0);
    EXPECT_EQ(part.values(), (Vals<T>{5, 0, 3, 4, 7, 0}));
}

TYPED_TEST(VectorTest, CompareWalksDeltaThenSamples) {
    using V = TypeParam;
    using T = real_of<V>;
    const T nan = std::numeric_limits<T>::quiet_NaN();
    const struct { Vals<T> a; bool ac; Vals<T> b; bool bc; T tolerance, delta_b; int32_t expected; } cases[] = {
        {{1, 2}, false, {1, 2}, false, 0, 1, 0},
        {{1, 2}, false, {1, 2}, false, -1, 1, 1},  // d = 0 > -1
        {{1, 5}, false, {1, 2}, false, 1, 1, 1},
        {{9, 9}, false, {1, 1}, false, 1, 3, -1},  // delta decides first
        {{1, nan}, false, {1, 7}, false, 0, 1, 0},  // NaN counts as equal
        {{1, 2}, true, {1}, false, 1, 1, 1},        // a.im = 2 against an absent 0
        {{1, -2}, true, {1}, false, 1, 1, -1},
        {{1, 0.5}, true, {1}, false, 1, 1, 0},
        {{3, 0, 1, 0}, true, {3, 0, 1, 1}, true, 0.5, 1, -1},
        {{1, 2, 3}, false, {1, 2}, false, 0, 1, 99},  // lengths differ: -1, the result untouched
    };
    for (const auto& c : cases) {
        Vec<V> a(c.a, c.ac), b(c.b, c.bc);
        b->delta = c.delta_b;
        int32_t result = 99;
        EXPECT_EQ(t_cmp(a.get(), b.get(), c.tolerance, &result), c.expected == 99 ? -1 : 0);
        EXPECT_EQ(result, c.expected) << "case " << &c - cases;
    }
}

TEST(Vector, ConversionToFloatRoundsAndRefusesItself) {
    Vec<vlx_t> d({0.1, 1e300, -2.5, 1.0 / 3}, true);
    d->delta = 0.1;
    Vec<vlxf_t> f, g;
    ASSERT_EQ(vlxu_tof(d.get(), f.get()), 0);
    EXPECT_TRUE(has_shape(f.get(), 2, 1, double(0.1f)));
    EXPECT_EQ(f.values(), (Vals<float>{0.1f, std::numeric_limits<float>::infinity(), -2.5f, 1.0f / 3}));
    EXPECT_EQ(vlxu_tof(reinterpret_cast<vlx_t*>(f.get()), f.get()), -1);
    ASSERT_EQ(vlxfu_tof(f.get(), g.get()), 0);
    EXPECT_TRUE(g.values() == f.values() && vlxfu_tof(g.get(), g.get()) == -1 && g->points == 2);
}

TEST(Vector, HooksBelongToOnePrecision) {
    using C = Counting<vlx_t>;
    C::allocs = C::frees = C::live = 0;
    vlx_alloc_hook_t previous = nullptr;
    set_hooks<vlx_t>(&C::on_alloc, &C::on_realloc, &C::on_free);
    EXPECT_TRUE(vlx_lib_alloc(&C::on_alloc, &previous) == 0 && previous == &C::on_alloc);
    {
        Vec<vlxf_t> f({1, 2, 3});  // float storage does not touch the double hooks
        Vec<vlx_t> d({1, 2, 3});
    }
    EXPECT_TRUE(C::allocs == 1 && C::frees == 1);
    set_hooks<vlx_t>(nullptr, nullptr);
    EXPECT_TRUE(vlx_lib_alloc(nullptr, &previous) == 0 && previous == nullptr);
}

}  // namespace
