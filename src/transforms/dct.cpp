// The cosine transform of type II and its inverse, for any length: Makhoul's
// even-odd reordering turns it into one real transform of the same length,
// followed by a rotation of each bin by a quarter-sample twiddle.  The work
// vector and the twiddle table are cached for each precision under lock 1.
#include "core/frame.hpp"
#include "core/precise_math.hpp"
#include "elementwise/elementwise.hpp"
#include "transforms/transforms.hpp"

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <type_traits>

namespace vlx {
namespace {

constexpr uint32_t dct_inverse = 1;
constexpr uint32_t dct_scaled = 2;

template <VlxVector V>
struct DctState {
    int32_t work_ready = 0;
    V work{};
    // (cos k eps, sin k eps) for k = 1 .. (n - 1)/2, eps = pi / (2n)
    real_t<V>* table = nullptr;
    int32_t table_size = 0;
};

template <VlxVector V>
DctState<V> dct_state;

// Each precision's constants: sqrt(1/2) and sqrt(2).
template <VlxVector V>
inline constexpr real_t<V> dct_sqrt_half = std::is_same_v<V, vlx_t> ? real_t<V>(0.7071067811865476)
                                                                     : real_t<V>(0.70710677f);
template <VlxVector V>
inline constexpr real_t<V> dct_sqrt_two = std::is_same_v<V, vlx_t> ? real_t<V>(1.4142135623730951)
                                                                    : real_t<V>(1.4142135f);

template <VlxVector V>
int32_t dct_free() {
    LockGuard lock(1);
    DctState<V>& state = dct_state<V>;
    int32_t status = 0;
    if (state.work_ready) {
        status = destroy(&state.work);
        state.work_ready = 0;
    }
    std::free(state.table);
    state.table = nullptr;
    state.table_size = 0;
    return status < 0 ? -1 : 0;
}

template <VlxVector V>
void register_dct_teardown() {
    register_teardown<V>(TeardownStep::dct_state, &dct_free<V>);
}

// Finds or builds the twiddle table of n.  Same recurrence as the fast
// transform's tables, restarted from the math library every 256 entries.
template <VlxVector V>
int32_t dct_table(DctState<V>& state, int32_t n) {
    using T = real_t<V>;
    if (state.table_size == n) return 0;
    if (n <= 0) return 0;
    if (state.table_size > 0) std::free(state.table);
    state.table = nullptr;
    state.table_size = 0;
    const int32_t count = (n - 1) / 2;
    // at least one pair, so that an empty table is not taken for a failure
    T* table = static_cast<T*>(std::malloc(2 * sizeof(T) * static_cast<size_t>(count > 0 ? count : 1)));
    if (table == nullptr) return -1;
    register_dct_teardown<V>();

    T eps, c1, s1;
    if constexpr (std::is_same_v<V, vlx_t>) {
        eps = family<V>::pi / (2.0 * n);
        c1 = cos64(eps);
        s1 = sin64(eps);
    } else {
        eps = family<V>::pi / static_cast<float>(2 * static_cast<int64_t>(n));
        c1 = cos32(eps);
        s1 = sin32(eps);
    }
    T c = c1, s = s1;
    int32_t run = 0;
    for (int32_t k = 1; k <= count; ++k) {
        if (run == 256) {
            // restarts in double for both families
            const T angle = static_cast<T>(k) * eps;
            c = static_cast<T>(cos64(static_cast<double>(angle)));
            s = static_cast<T>(sin64(static_cast<double>(angle)));
            run = 0;
        }
        table[2 * (k - 1)] = c;
        table[2 * (k - 1) + 1] = s;
        ++run;
        const T cn = c1 * c - s1 * s;
        const T sn = s * c1 + s1 * c;
        c = cn;
        s = sn;
    }
    state.table = table;
    state.table_size = n;
    return 0;
}

template <VlxVector V>
void prepare_work(DctState<V>& state) {
    if (!state.work_ready) {
        init(&state.work);
        state.work_ready = 1;
        register_dct_teardown<V>();
    }
}

template <VlxVector V>
int32_t dct_forward(DctState<V>& state, V* v, uint32_t flags) {
    using T = real_t<V>;
    const int32_t n = v->points;
    const int32_t h = (n + 1) / 2;
    prepare_work(state);
    V* work = &state.work;
    work->points = h;
    work->complex = 0;
    if (alloc(work) < 0) return -1;

    // y[i] = x[2i] and y[n-1-i] = x[2i+1]: evens move down in place, odds
    // wait reversed in the work vector.  For odd n the last odd index is past
    // the samples and is not read.
    T* x = v->data;
    T* w = work->data;
    for (int32_t i = 0; i < h; ++i) {
        const T even = x[2 * i];
        if (2 * i + 1 < n) w[h - 1 - i] = x[2 * i + 1];
        x[i] = even;
    }
    if (n % 2 == 0)
        std::memcpy(x + h, w, sizeof(T) * static_cast<size_t>(h));
    else
        std::memcpy(x + h, w + 1, sizeof(T) * static_cast<size_t>(h - 1));

    if (rdft(v) < 0) return -1;
    if (dct_table(state, n) < 0) return -1;

    // D[k] and D[n-k] from bin k; scalar k is written ahead of the bins still
    // to be read, D[n-k] waits in the work vector.
    x = v->data;
    w = work->data;
    const T* t = state.table;
    for (int32_t k = 1; k < h; ++k) {
        const T a = x[2 * k], b = x[2 * k + 1];
        const T c = t[2 * (k - 1)], s = t[2 * (k - 1) + 1];
        x[k] = a * c + b * s;
        w[h - 1 - k] = a * s - b * c;
    }
    int32_t at = h;
    if (n % 2 == 0) {
        x[h] = (x[2 * h] + x[2 * h + 1]) * dct_sqrt_half<V>;
        at = h + 1;
    }
    if (h > 1) std::memcpy(x + at, w, sizeof(T) * static_cast<size_t>(h - 1));
    v->complex = 0;
    v->points = n;

    if (flags & dct_scaled) {
        if (scale(v, T(2)) < 0) return -1;
        v->data[0] = v->data[0] * dct_sqrt_half<V>;
    }
    // the real transform left 1/(n delta); cosine bins are half as far apart
    v->delta = v->delta * T(0.5);
    return 0;
}

template <VlxVector V>
int32_t dct_backward(DctState<V>& state, V* v, uint32_t flags) {
    using T = real_t<V>;
    const int32_t n = v->points;
    if (flags & dct_scaled) {
        if (scale(v, T(0.5)) < 0) return -1;
        v->data[0] = v->data[0] * dct_sqrt_two<V>;
    }
    prepare_work(state);
    V* work = &state.work;
    work->complex = 1;
    work->points = n / 2 + 1;
    work->delta = v->delta;
    if (alloc(work) < 0) return -1;
    if (dct_table(state, n) < 0) return -1;

    const T* d = v->data;
    T* w = work->data;
    const T* t = state.table;
    w[0] = d[0];
    w[1] = 0;
    for (int32_t k = 1; k <= (n - 1) / 2; ++k) {
        const T a = d[k], b = d[n - k];
        const T c = t[2 * (k - 1)], s = t[2 * (k - 1) + 1];
        w[2 * k] = a * c + b * s;
        w[2 * k + 1] = a * s - b * c;
    }
    if (n % 2 == 0) {
        w[n] = d[n / 2] * dct_sqrt_two<V>;
        w[n + 1] = 0;
    }
    if (irdft(work, n & 1) < 0) return -1;

    const T* y = work->data;
    T* x = v->data;
    const int32_t h = (n + 1) / 2;
    for (int32_t i = 0; i < h; ++i) x[2 * i] = y[i];
    for (int32_t i = 0; 2 * i + 1 < n; ++i) x[2 * i + 1] = y[n - 1 - i];
    v->delta = work->delta * T(0.5);
    return 0;
}

}  // namespace

template <VlxVector V>
int32_t dct(V* v, uint32_t flags) {
    using T = real_t<V>;
    if (v->complex) return -1;
    LockGuard lock(1);
    if (v->points <= 0) {
        v->delta = v->delta == T(0) ? family<V>::delta_fallback : T(0.5) / v->delta;
        return 0;
    }
    DctState<V>& state = dct_state<V>;
    return (flags & dct_inverse) ? dct_backward(state, v, flags) : dct_forward(state, v, flags);
}

template int32_t dct<vlx_t>(vlx_t*, uint32_t);
template int32_t dct<vlxf_t>(vlxf_t*, uint32_t);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_dct(vlx_t* v, uint32_t flags) { return vlx::dct(v, flags); }
VLX_API int32_t vlxfi_dct(vlxf_t* v, uint32_t flags) { return vlx::dct(v, flags); }
}
