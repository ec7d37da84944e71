// Internal view of the vector object: the family traits that tell the two
// precisions apart, typed accessors, and the vector operations as templates.
#pragma once

#include "libvlx.h"

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace vlx {

template <class V>
concept VlxVector = std::same_as<V, vlx_t> || std::same_as<V, vlxf_t>;

// The scalar type of a vector family: double for vlx_t, float for vlxf_t.
template <VlxVector V>
using real_t = std::remove_pointer_t<decltype(V::data)>;

// Constants that differ between the two precisions.  The single-precision
// values are the double values rounded to nearest.
template <VlxVector V>
struct family;

template <>
struct family<vlx_t> {
    using real = double;
    using alloc_hook = vlx_alloc_hook_t;
    using realloc_hook = vlx_realloc_hook_t;
    using free_hook = vlx_free_hook_t;
    // the library's substitute for infinity
    static constexpr double bound = 1e100;
    // largest argument of the exponential clamps
    static constexpr double exp_limit = 230.25850929940458;
    // smallest normal value
    static constexpr double tiny = 2.2250738585072014e-308;
    static constexpr double eps = 2.220446049250313e-16;
    static constexpr double pi = 3.141592653589793;
    static constexpr double two_pi = 6.283185307179586;
    // the delta a transform gives when the input's delta is exactly 0
    static constexpr double delta_fallback = 1e100;
};

template <>
struct family<vlxf_t> {
    using real = float;
    using alloc_hook = vlxf_alloc_hook_t;
    using realloc_hook = vlxf_realloc_hook_t;
    using free_hook = vlxf_free_hook_t;
    static constexpr float bound = 1e15f;  // 999999986991104
    static constexpr float exp_limit = 34.538776f;
    static constexpr float tiny = 1.1754944e-38f;
    static constexpr float eps = 1.1920929e-07f;
    static constexpr float pi = 3.1415927f;
    static constexpr float two_pi = 6.2831855f;
    static constexpr float delta_fallback = 1e15f;
};

// Scalars held by the vector: points, doubled for complex vectors.  Computed
// in 64 bits so that a huge complex length cannot wrap.
template <VlxVector V>
inline int64_t scalar_count(const V* v) {
    return v->complex ? 2 * static_cast<int64_t>(v->points) : static_cast<int64_t>(v->points);
}

template <VlxVector V>
inline bool owns_storage(const V* v) {
    return v->alloc > 0;
}

// Lifecycle and storage (both families; the exports are thin wrappers).
template <VlxVector V> int32_t init(V* v);
template <VlxVector V> int32_t destroy(V* v);
template <VlxVector V> int32_t alloc(V* v);
template <VlxVector V> int32_t realloc(V* v, int32_t old_points, int32_t old_complex);
template <VlxVector V> int32_t zero(V* v);
template <VlxVector V> int32_t rtoc(V* v);
template <VlxVector V> int32_t zpad(V* v, int32_t new_n);
template <VlxVector V> int32_t append(V* dst, V* src);
template <VlxVector V> int32_t copy(V* dst, V* src);
template <VlxVector V> int32_t copy_at_most(V* dst, V* src, int32_t max_points);
template <VlxVector V> int32_t subvec(V* src, V* dst, int32_t start, int32_t count);
template <VlxVector V> int32_t insert_subvec(V* src, V* dst, int32_t start, int32_t count, int32_t at);
template <VlxVector V> int32_t cmp(V* a, V* b, real_t<V> tolerance, int32_t* result);

// Destroys a temporary vector when it goes out of scope.
template <VlxVector V>
class TempVector {
public:
    TempVector() { init(&v_); }
    ~TempVector() { destroy(&v_); }
    TempVector(const TempVector&) = delete;
    TempVector& operator=(const TempVector&) = delete;
    V* get() { return &v_; }
    V* operator->() { return &v_; }

private:
    V v_;
};

// Sets a transform result's spacing: 1 / (n * delta), or the family's
// fallback when delta is exactly 0 (either sign); a NaN delta stays NaN.
template <VlxVector V>
inline void set_transform_delta(V* v, int32_t n) {
    using T = real_t<V>;
    if (v->delta == T(0))
        v->delta = family<V>::delta_fallback;
    else
        v->delta = T(1) / (static_cast<T>(n) * v->delta);
}

}  // namespace vlx
