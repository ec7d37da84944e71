// The vector object: lifecycle, storage through the allocator hooks,
// conversion, composition and comparison.
#include "core.hpp"

#include <cstdlib>
#include <cstring>
#include <limits>

namespace vlx {
namespace {

// One hook triple for each precision; plain process-wide variables, to be set
// before other threads use the library.
template <VlxVector V>
struct Hooks {
    static inline typename family<V>::alloc_hook alloc = nullptr;
    static inline typename family<V>::realloc_hook realloc = nullptr;
    static inline typename family<V>::free_hook free = nullptr;
};

template <class Hook>
int32_t swap_hook(Hook& slot, Hook new_hook, Hook* old_hook) {
    if (old_hook != nullptr) *old_hook = slot;
    slot = new_hook;
    return 0;
}

// The empty state after a failed resize; delta and complex keep their values.
template <VlxVector V>
int32_t fail_empty(V* v) {
    v->data = nullptr;
    v->alloc = 0;
    v->points = 0;
    return -1;
}

// A requirement beyond what `alloc` can count is an allocation failure.
inline bool representable(int64_t scalars) {
    return scalars <= std::numeric_limits<int32_t>::max();
}

template <VlxVector V>
void copy_scalars(real_t<V>* to, const real_t<V>* from, int64_t n) {
    if (n > 0 && to != from) std::memcpy(to, from, static_cast<size_t>(n) * sizeof(real_t<V>));
}

template <VlxVector V>
void move_scalars(real_t<V>* to, const real_t<V>* from, int64_t n) {
    if (n > 0 && to != from) std::memmove(to, from, static_cast<size_t>(n) * sizeof(real_t<V>));
}

// Start and count clamped against a source vector, in points.
struct Range {
    int32_t start;
    int32_t count;
};

inline Range clamp_range(int32_t start, int32_t count, int32_t points) {
    int64_t s = start < 0 ? 0 : start;
    if (s > points) s = points < 0 ? 0 : points;
    int64_t c = count < 0 ? 0 : count;
    if (s + c > points) c = points - s;
    if (c < 0) c = 0;
    return {static_cast<int32_t>(s), static_cast<int32_t>(c)};
}

}  // namespace

template <VlxVector V>
int32_t init(V* v) {
    v->delta = real_t<V>(1);
    v->data = nullptr;
    v->alloc = 0;
    v->points = 0;
    v->complex = 0;
    v->reserved = 0;
    return 0;
}

template <VlxVector V>
int32_t destroy(V* v) {
    if (v->alloc > 0) {
        if (Hooks<V>::free != nullptr)
            Hooks<V>::free(v);
        else
            std::free(v->data);
    }
    return init(v);
}

template <VlxVector V>
int32_t alloc(V* v) {
    const int64_t required = scalar_count(v);
    if (required <= v->alloc) return 0;
    if (!representable(required)) {
        // The old samples are dropped as on any allocation; the hook that
        // would have released them is not called, so release them here.
        if (v->alloc > 0) {
            if (Hooks<V>::free != nullptr)
                Hooks<V>::free(v);
            else if (Hooks<V>::alloc == nullptr)
                std::free(v->data);
        }
        return fail_empty(v);
    }
    if (Hooks<V>::alloc != nullptr) {
        Hooks<V>::alloc(v);  // the hook releases the old block itself
    } else {
        if (v->alloc > 0) std::free(v->data);
        v->data = static_cast<real_t<V>*>(std::malloc(static_cast<size_t>(required) * sizeof(real_t<V>)));
    }
    if (v->data == nullptr) return fail_empty(v);
    v->alloc = static_cast<int32_t>(required);
    return 0;
}

template <VlxVector V>
int32_t realloc(V* v, int32_t old_points, int32_t old_complex) {
    const int64_t required = scalar_count(v);
    if (required <= v->alloc) return 0;
    // Lent storage is never resized or freed: its samples are copied into a
    // block of the vector's own once that exists.
    real_t<V>* lent = nullptr;
    if (v->alloc <= 0 && v->data != nullptr) {
        lent = v->data;
        v->data = nullptr;
    }
    if (!representable(required)) return fail_empty(v);  // an owned block is dropped, as on a failed realloc
    if (Hooks<V>::realloc != nullptr) {
        Hooks<V>::realloc(v, old_points, old_complex);
    } else {
        // A failed enlargement leaves the old block allocated; it is dropped.
        v->data = static_cast<real_t<V>*>(
            std::realloc(v->data, static_cast<size_t>(required) * sizeof(real_t<V>)));
    }
    if (v->data == nullptr) return fail_empty(v);
    if (lent != nullptr) {
        int64_t old_scalars = old_complex ? 2 * static_cast<int64_t>(old_points) : old_points;
        if (old_scalars > required) old_scalars = required;
        copy_scalars<V>(v->data, lent, old_scalars);
    }
    v->alloc = static_cast<int32_t>(required);
    return 0;
}

template <VlxVector V>
int32_t zero(V* v) {
    if (v->points < 1) {
        v->points = 0;
        return 0;
    }
    // old_points 0: a lent block's samples are not worth copying.
    if (realloc(v, 0, v->complex) < 0) return -1;
    std::memset(v->data, 0, static_cast<size_t>(scalar_count(v)) * sizeof(real_t<V>));
    return 0;
}

template <VlxVector V>
int32_t rtoc(V* v) {
    if (v->complex) return 0;
    v->complex = 1;
    if (realloc(v, v->points, 0) < 0) return -1;
    if (v->points < 1) return 0;
    // From the last sample to the first, so that the spread is safe in place.
    real_t<V>* d = v->data;
    for (int64_t i = v->points - 1; i >= 0; --i) {
        d[2 * i] = d[i];
        d[2 * i + 1] = real_t<V>(0);
    }
    return 0;
}

template <VlxVector V>
int32_t zpad(V* v, int32_t new_n) {
    const int32_t old = v->points < 0 ? 0 : v->points;
    if (old >= new_n) return 0;
    v->points = new_n;
    if (realloc(v, old, v->complex) < 0) return -1;
    const int64_t width = v->complex ? 2 : 1;
    real_t<V>* d = v->data;
    for (int64_t i = width * old; i < width * new_n; ++i) d[i] = real_t<V>(0);
    return 0;
}

template <VlxVector V>
int32_t append(V* dst, V* src) {
    if (src->complex && !dst->complex && rtoc(dst) < 0) return -1;
    const int32_t n = src->points;
    const int32_t old = dst->points;
    dst->points = old + n;
    if (realloc(dst, old, dst->complex) < 0) return -1;
    // Read src->data only now: appending a vector to itself may have moved it.
    const real_t<V>* s = src->data;
    real_t<V>* d = dst->data;
    if (dst->complex) {
        d += 2 * static_cast<int64_t>(old);
        if (src->complex) {
            copy_scalars<V>(d, s, 2 * static_cast<int64_t>(n));
        } else {
            for (int64_t i = 0; i < n; ++i) {
                d[2 * i] = s[i];
                d[2 * i + 1] = real_t<V>(0);
            }
        }
    } else {
        copy_scalars<V>(d + old, s, n);
    }
    return 0;
}

template <VlxVector V>
int32_t subvec(V* src, V* dst, int32_t start, int32_t count) {
    const Range r = clamp_range(start, count, src->points);
    dst->points = r.count;
    dst->complex = src->complex;
    dst->delta = src->delta;
    if (alloc(dst) < 0) return -1;
    const int64_t width = src->complex ? 2 : 1;
    const int64_t s = width * r.start;
    const int64_t c = width * r.count;
    if (dst->data != src->data)
        copy_scalars<V>(dst->data, src->data + s, c);
    else if (s != 0)
        move_scalars<V>(dst->data, src->data + s, c);
    return 0;
}

template <VlxVector V>
int32_t copy(V* dst, V* src) {
    return subvec(src, dst, 0, src->points);
}

template <VlxVector V>
int32_t copy_at_most(V* dst, V* src, int32_t max_points) {
    return subvec(src, dst, 0, max_points);
}

template <VlxVector V>
int32_t insert_subvec(V* src, V* dst, int32_t start, int32_t count, int32_t at) {
    const Range r = clamp_range(start, count, src->points);
    int32_t a = at < 0 ? 0 : at;
    if (a > dst->points) a = dst->points < 0 ? 0 : dst->points;
    if (src->complex && !dst->complex) {
        if (a != 0 || r.count < dst->points) {
            const int32_t status = rtoc(dst);
            if (status < 0) return status;
        } else {
            // The whole of dst is replaced: no point spreading its samples.
            dst->complex = 1;
            dst->points = a;
        }
    }
    if (dst->points < r.count + a) {
        const int32_t old = dst->points;
        dst->points = r.count + a;
        const int32_t status = realloc(dst, old, dst->complex);
        if (status < 0) return status;
    }
    dst->delta = src->delta;
    const int64_t src_width = src->complex ? 2 : 1;
    const int64_t s = src_width * r.start;
    const int64_t c = src_width * r.count;
    const int64_t target = (dst->complex ? 2 : 1) * static_cast<int64_t>(a);
    const real_t<V>* from = src->data + s;
    real_t<V>* to = dst->data + target;
    if (!src->complex && dst->complex) {
        for (int64_t i = 0; i < r.count; ++i) {
            to[2 * i] = from[i];
            to[2 * i + 1] = real_t<V>(0);
        }
    } else if (dst->data != src->data) {
        copy_scalars<V>(to, from, c);
    } else if (s != target) {
        move_scalars<V>(to, from, c);
    }
    return 0;
}

template <VlxVector V>
int32_t cmp(V* a, V* b, real_t<V> tolerance, int32_t* result) {
    using T = real_t<V>;
    if (a->points != b->points) return -1;
    // Orders by d = x - y; a NaN difference fails both tests and counts as equal.
    auto order = [tolerance](T d) -> int32_t {
        if (d > tolerance) return 1;
        if (-tolerance > d) return -1;
        return 0;
    };
    int32_t r = order(a->delta - b->delta);
    const int64_t n = a->points;
    const T* x = a->data;
    const T* y = b->data;
    if (r == 0) {
        if (a->complex == b->complex) {
            const int64_t scalars = a->complex ? 2 * n : n;
            for (int64_t i = 0; i < scalars && r == 0; ++i) r = order(x[i] - y[i]);
        } else if (a->complex) {
            // b real: its imaginary parts count as 0
            for (int64_t i = 0; i < n && r == 0; ++i) {
                r = order(x[2 * i] - y[i]);
                if (r == 0) r = order(x[2 * i + 1]);
            }
        } else {
            // a real: d = 0 - b.im, so the imaginary part orders with its sign turned
            for (int64_t i = 0; i < n && r == 0; ++i) {
                r = order(x[i] - y[2 * i]);
                if (r == 0) r = -order(y[2 * i + 1]);
            }
        }
    }
    *result = r;
    return 0;
}

template <VlxVector V>
int32_t set_alloc_hook(typename family<V>::alloc_hook h, typename family<V>::alloc_hook* old) {
    return swap_hook(Hooks<V>::alloc, h, old);
}
template <VlxVector V>
int32_t set_realloc_hook(typename family<V>::realloc_hook h, typename family<V>::realloc_hook* old) {
    return swap_hook(Hooks<V>::realloc, h, old);
}
template <VlxVector V>
int32_t set_free_hook(typename family<V>::free_hook h, typename family<V>::free_hook* old) {
    return swap_hook(Hooks<V>::free, h, old);
}

// Converts any family's vector to single precision by plain rounding.
template <VlxVector V>
int32_t to_float(V* src, vlxf_t* dst) {
    if (static_cast<const void*>(src) == static_cast<const void*>(dst)) return -1;
    dst->delta = static_cast<float>(src->delta);
    dst->complex = src->complex;
    dst->points = src->points;
    if (alloc(dst) < 0) return -1;
    const int64_t n = scalar_count(src);
    for (int64_t i = 0; i < n; ++i) dst->data[i] = static_cast<float>(src->data[i]);
    return 0;
}

#define VLX_INSTANTIATE(V)                                                                  \
    template int32_t init<V>(V*);                                                           \
    template int32_t destroy<V>(V*);                                                        \
    template int32_t alloc<V>(V*);                                                          \
    template int32_t realloc<V>(V*, int32_t, int32_t);                                      \
    template int32_t zero<V>(V*);                                                           \
    template int32_t rtoc<V>(V*);                                                           \
    template int32_t zpad<V>(V*, int32_t);                                                  \
    template int32_t append<V>(V*, V*);                                                     \
    template int32_t copy<V>(V*, V*);                                                       \
    template int32_t copy_at_most<V>(V*, V*, int32_t);                                      \
    template int32_t subvec<V>(V*, V*, int32_t, int32_t);                                   \
    template int32_t insert_subvec<V>(V*, V*, int32_t, int32_t, int32_t);                   \
    template int32_t cmp<V>(V*, V*, real_t<V>, int32_t*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_init(vlx_t* v) { return vlx::init(v); }
VLX_API int32_t vlxf_init(vlxf_t* v) { return vlx::init(v); }
VLX_API int32_t vlx_destroy(vlx_t* v) { return vlx::destroy(v); }
VLX_API int32_t vlxf_destroy(vlxf_t* v) { return vlx::destroy(v); }
VLX_API int32_t vlx_alloc(vlx_t* v) { return vlx::alloc(v); }
VLX_API int32_t vlxf_alloc(vlxf_t* v) { return vlx::alloc(v); }
VLX_API int32_t vlx_realloc(vlx_t* v, int32_t p, int32_t c) { return vlx::realloc(v, p, c); }
VLX_API int32_t vlxf_realloc(vlxf_t* v, int32_t p, int32_t c) { return vlx::realloc(v, p, c); }
VLX_API int32_t vlxi_zero(vlx_t* v) { return vlx::zero(v); }
VLX_API int32_t vlxfi_zero(vlxf_t* v) { return vlx::zero(v); }
VLX_API int32_t vlxi_rtoc(vlx_t* v) { return vlx::rtoc(v); }
VLX_API int32_t vlxfi_rtoc(vlxf_t* v) { return vlx::rtoc(v); }
VLX_API int32_t vlxi_zpad(vlx_t* v, int32_t n) { return vlx::zpad(v, n); }
VLX_API int32_t vlxfi_zpad(vlxf_t* v, int32_t n) { return vlx::zpad(v, n); }
VLX_API int32_t vlx_append(vlx_t* d, vlx_t* s) { return vlx::append(d, s); }
VLX_API int32_t vlxf_append(vlxf_t* d, vlxf_t* s) { return vlx::append(d, s); }
VLX_API int32_t vlx_copy(vlx_t* d, vlx_t* s) { return vlx::copy(d, s); }
VLX_API int32_t vlxf_copy(vlxf_t* d, vlxf_t* s) { return vlx::copy(d, s); }
VLX_API int32_t vlx_copy_at_most(vlx_t* d, vlx_t* s, int32_t m) { return vlx::copy_at_most(d, s, m); }
VLX_API int32_t vlxf_copy_at_most(vlxf_t* d, vlxf_t* s, int32_t m) { return vlx::copy_at_most(d, s, m); }
VLX_API int32_t vlxu_subvec(vlx_t* s, vlx_t* d, int32_t a, int32_t c) { return vlx::subvec(s, d, a, c); }
VLX_API int32_t vlxfu_subvec(vlxf_t* s, vlxf_t* d, int32_t a, int32_t c) { return vlx::subvec(s, d, a, c); }
VLX_API int32_t vlx_insert_subvec(vlx_t* s, vlx_t* d, int32_t a, int32_t c, int32_t at) {
    return vlx::insert_subvec(s, d, a, c, at);
}
VLX_API int32_t vlxf_insert_subvec(vlxf_t* s, vlxf_t* d, int32_t a, int32_t c, int32_t at) {
    return vlx::insert_subvec(s, d, a, c, at);
}
VLX_API int32_t vlxu_tof(vlx_t* s, vlxf_t* d) { return vlx::to_float(s, d); }
VLX_API int32_t vlxfu_tof(vlxf_t* s, vlxf_t* d) { return vlx::to_float(s, d); }
VLX_API int32_t vlx_cmp(vlx_t* a, vlx_t* b, double t, int32_t* r) { return vlx::cmp(a, b, t, r); }
VLX_API int32_t vlxf_cmp(vlxf_t* a, vlxf_t* b, float t, int32_t* r) { return vlx::cmp(a, b, t, r); }
VLX_API int32_t vlx_lib_alloc(vlx_alloc_hook_t h, vlx_alloc_hook_t* o) { return vlx::set_alloc_hook<vlx_t>(h, o); }
VLX_API int32_t vlxf_lib_alloc(vlxf_alloc_hook_t h, vlxf_alloc_hook_t* o) { return vlx::set_alloc_hook<vlxf_t>(h, o); }
VLX_API int32_t vlx_lib_realloc(vlx_realloc_hook_t h, vlx_realloc_hook_t* o) {
    return vlx::set_realloc_hook<vlx_t>(h, o);
}
VLX_API int32_t vlxf_lib_realloc(vlxf_realloc_hook_t h, vlxf_realloc_hook_t* o) {
    return vlx::set_realloc_hook<vlxf_t>(h, o);
}
VLX_API int32_t vlx_lib_free(vlx_free_hook_t h, vlx_free_hook_t* o) { return vlx::set_free_hook<vlx_t>(h, o); }
VLX_API int32_t vlxf_lib_free(vlxf_free_hook_t h, vlxf_free_hook_t* o) { return vlx::set_free_hook<vlxf_t>(h, o); }
}
