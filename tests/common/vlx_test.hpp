// Shared test support: the two families as GoogleTest types, overloads that route a call to the twin of the vector's
// family, an owning vector wrapper, and closeness checks in which a NaN never passes.
#pragma once

#include "libvlx.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <initializer_list>
#include <limits>
#include <random>
#include <type_traits>
#include <utility>
#include <vector>

namespace vlxtest {

using Families = ::testing::Types<vlx_t, vlxf_t>;

// A typed test suite over both families: VLX_TYPED_SUITE(Name); then TYPED_TEST(Name, ...).
#define VLX_TYPED_SUITE(name) \
    template <class V>        \
    class name : public ::testing::Test {}; \
    TYPED_TEST_SUITE(name, ::vlxtest::Families)

// The scalar type of a family: double for vlx_t, float for vlxf_t.
template <class V>
using real_of = std::remove_pointer_t<decltype(V::data)>;

template <class V>
constexpr bool is_double = std::is_same_v<V, vlx_t>;

// The family's saturation bound, also the spacing a transform gives a vector of spacing 0.
template <class V>
constexpr real_of<V> bound_of() { return is_double<V> ? real_of<V>(1e100) : real_of<V>(1e15f); }

template <class V>
inline int32_t t_free_internal() { return is_double<V> ? vlx_free_internal() : vlxf_free_internal(); }

// Defines `name(vector, args...)` for both families, forwarding to the double export or its float twin by the type of
// the first argument.
#define VLX_TEST_TWIN(name, dfn, ffn)                                                            \
    template <class... A>                                                                        \
    inline auto name(vlx_t* v, A&&... a) { return dfn(v, std::forward<A>(a)...); }              \
    template <class... A>                                                                        \
    inline auto name(vlxf_t* v, A&&... a) { return ffn(v, std::forward<A>(a)...); }

// The usual prefixes: VLX_TWIN(i, neg) is t_neg over vlxi_neg and vlxfi_neg.
#define VLX_TWIN(prefix, name) VLX_TEST_TWIN(t_##name, vlx##prefix##_##name, vlxf##prefix##_##name)

VLX_TEST_TWIN(t_init, vlx_init, vlxf_init) VLX_TEST_TWIN(t_destroy, vlx_destroy, vlxf_destroy)
VLX_TEST_TWIN(t_alloc, vlx_alloc, vlxf_alloc) VLX_TEST_TWIN(t_realloc, vlx_realloc, vlxf_realloc)
VLX_TEST_TWIN(t_zero, vlxi_zero, vlxfi_zero) VLX_TEST_TWIN(t_rtoc, vlxi_rtoc, vlxfi_rtoc)
VLX_TEST_TWIN(t_zpad, vlxi_zpad, vlxfi_zpad) VLX_TEST_TWIN(t_append, vlx_append, vlxf_append)
VLX_TEST_TWIN(t_copy, vlx_copy, vlxf_copy) VLX_TEST_TWIN(t_copy_at_most, vlx_copy_at_most, vlxf_copy_at_most)
VLX_TEST_TWIN(t_subvec, vlxu_subvec, vlxfu_subvec) VLX_TEST_TWIN(t_cmp, vlx_cmp, vlxf_cmp)
VLX_TEST_TWIN(t_insert_subvec, vlx_insert_subvec, vlxf_insert_subvec)

// An owning vector for tests: initialised on construction, destroyed on exit.
template <class V>
class Vec {
public:
    using T = real_of<V>;
    Vec() { t_init(&v_); }
    // Real samples, or complex ones given as re, im pairs when is_complex.
    Vec(std::initializer_list<T> values, bool is_complex = false) : Vec() { assign(values, is_complex); }
    Vec(const std::vector<T>& values, bool is_complex) : Vec() { assign(values, is_complex); }
    ~Vec() { t_destroy(&v_); }
    Vec(const Vec&) = delete;
    Vec& operator=(const Vec&) = delete;

    template <class C>
    void assign(const C& values, bool is_complex) {
        v_.complex = is_complex ? 1 : 0;
        v_.points = static_cast<int32_t>(values.size() / (is_complex ? 2 : 1));
        EXPECT_EQ(t_alloc(&v_), 0);
        int32_t i = 0;
        for (T x : values) v_.data[i++] = x;
    }

    V* operator&() { return &v_; }
    V* get() { return &v_; }
    V* operator->() { return &v_; }
    int64_t scalars() const { return v_.complex ? 2 * int64_t(v_.points) : v_.points; }
    T& operator[](int64_t i) { return v_.data[i]; }
    std::vector<T> values() const { return std::vector<T>(v_.data, v_.data + scalars()); }

private:
    V v_;
};

// Uniform random samples in [lo, hi), reproducible from the seed.
template <class T>
std::vector<T> random_values(size_t n, uint32_t seed, double lo = -1.0, double hi = 1.0) {
    std::mt19937_64 rng(seed);
    std::uniform_real_distribution<double> dist(lo, hi);
    std::vector<T> out(n);
    for (auto& x : out) x = static_cast<T>(dist(rng));
    return out;
}

// Bit-for-bit equality (so -0.0 differs from +0.0, and equal NaNs match).
template <class T>
bool same_bits(T a, T b) { return std::memcmp(&a, &b, sizeof(T)) == 0; }

// Distance in units in the last place; a NaN is infinitely far from anything.
template <class T>
double ulp_distance(T a, T b) {
    if (std::isnan(a) || std::isnan(b)) return std::numeric_limits<double>::infinity();
    using I = std::conditional_t<sizeof(T) == 8, int64_t, int32_t>;
    // Bit patterns mapped onto one monotonic integer line (-0 and +0 both at 0).
    auto line = [](T x) {
        I i;
        std::memcpy(&i, &x, sizeof(T));
        return i < 0 ? std::numeric_limits<I>::min() - i : i;
    };
    return a == b ? 0.0 : std::fabs(static_cast<double>(line(a)) - static_cast<double>(line(b)));
}

// |a - b| <= tol, written so that a NaN on either side fails.
inline ::testing::AssertionResult near(long double a, long double b, long double tol) {
    if (std::fabs(a - b) <= tol) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << a << " and " << b << " differ by more than " << tol;
}

// Points, complex flag and spacing of a vector in one check.
template <class V>
::testing::AssertionResult has_shape(const V* v, int32_t points, int32_t is_complex, double delta) {
    if (v->points == points && v->complex == is_complex && v->delta == real_of<V>(delta))
        return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "points " << v->points << ", complex " << v->complex << ", delta "
                                         << v->delta << "; want " << points << ", " << is_complex << ", " << delta;
}

// Every scalar of `got` within `ulps` of `want` (0: bit for bit); a NaN matches only a NaN.
template <class T>
::testing::AssertionResult same_scalars(const std::vector<T>& got, const std::vector<T>& want, double ulps = 0) {
    if (got.size() != want.size()) return ::testing::AssertionFailure() << got.size() << " scalars, want " << want.size();
    for (size_t i = 0; i < got.size(); ++i) {
        const bool ok = (std::isnan(got[i]) && std::isnan(want[i])) ||
                        (ulps == 0 ? same_bits(got[i], want[i]) : ulp_distance(got[i], want[i]) <= ulps);
        if (!ok) return ::testing::AssertionFailure() << "scalar " << i << ": " << got[i] << " want " << want[i];
    }
    return ::testing::AssertionSuccess();
}

// x in blocks of random length below max_len (in place on odd ones if asked) through run(block, out), the outputs
// joined.
template <class V, class Run>
std::vector<real_of<V>> in_blocks(const std::vector<real_of<V>>& x, bool xc, uint32_t seed, Run run, bool in_place = true,
                                   int64_t max_len = 90) {
    using T = real_of<V>;
    const int64_t w = xc ? 2 : 1, total = int64_t(x.size()) / w;
    std::vector<T> got;
    std::mt19937 rng(seed);
    for (int64_t at = 0, i = 0; at < total; ++i) {
        const int64_t len = std::min<int64_t>(int64_t(rng() % uint64_t(max_len)), total - at);
        Vec<V> block(std::vector<T>(x.begin() + at * w, x.begin() + (at + len) * w), xc), other;
        V* out = in_place && i % 2 ? block.get() : other.get();
        EXPECT_EQ(run(block.get(), out), 0);
        got.insert(got.end(), out->data, out->data + out->points * w);
        at += len;
    }
    return got;
}

// Installs the family's storage hooks; null restores the library's own.
template <class V>
void set_hooks(int32_t (*a)(V*), int32_t (*r)(V*, int32_t, int32_t), int32_t (*f)(V*) = nullptr) {
    if constexpr (is_double<V>) vlx_lib_alloc(a, nullptr), vlx_lib_realloc(r, nullptr), vlx_lib_free(f, nullptr);
    else vlxf_lib_alloc(a, nullptr), vlxf_lib_realloc(r, nullptr), vlxf_lib_free(f, nullptr);
}

// While in scope every allocation of the family fails: the hooks release the old block and hand back no storage.
template <class V>
struct FailingAlloc {
    static int32_t alloc(V* v) {
        if (v->alloc > 0) std::free(v->data);
        return v->data = nullptr, 0;
    }
    static int32_t realloc(V* v, int32_t, int32_t) { return alloc(v); }
    FailingAlloc() { set_hooks<V>(alloc, realloc); }
    ~FailingAlloc() { set_hooks<V>(nullptr, nullptr); }
};

}  // namespace vlxtest
