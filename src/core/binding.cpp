// Optional hand-off of power-of-two transforms to a vendor DFT module and its
// OpenMP runtime, both loaded at run time on first use: the flags word that
// steers it, the table of committed descriptors, and the thread controls.
// Without the modules everything here is inert and transforms stay native.
#include "core/frame.hpp"
#include "core/platform.hpp"
#include "transforms/transforms.hpp"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <cstdlib>

namespace vlx {
namespace {

constexpr uint32_t flag_bound = VLX_DFT_BOUND;
constexpr uint32_t flag_fast = VLX_DFT_FAST;
constexpr uint32_t flag_keep = VLX_DFT_KEEP;

// The vendor interface's configuration values.
constexpr int dfti_single = 35;
constexpr int dfti_double = 36;
constexpr int dfti_complex = 32;
constexpr int dfti_real = 33;
constexpr int dfti_forward_scale = 4;
constexpr int dfti_number_of_user_threads = 26;

// The vendors' C prototypes; the status and the lengths are `long`.
using CreateFn = long (*)(void** handle, int precision, int domain, long dimension, ...);
using SetValueFn = long (*)(void* handle, int param, ...);
using CommitFn = long (*)(void* handle);
using ComputeFn = long (*)(void* handle, void* inout, ...);
using FreeFn = long (*)(void** handle);
using QueryFn = int (*)();
using SetCountFn = void (*)(int);
using SetTextFn = void (*)(const char*);

// Functions of the two modules; any of them may be null if its module lacks it.
struct ModuleCalls {
    CreateFn create;
    SetValueFn set_value;
    CommitFn commit;
    ComputeFn forward;
    ComputeFn backward;
    FreeFn free;
    QueryFn max_threads;
    QueryFn num_procs;
    SetCountFn set_num_threads;
    QueryFn blocktime;
    SetTextFn set_defaults;
};

struct Descriptor {
    void* descriptor;
    int32_t length;
    int32_t complex_domain;
};

template <VlxVector V>
struct BindingState {
    std::atomic<int32_t> bind_counter{0};
    // A plain word in meaning; atomic only so that a change made on one
    // thread is seen whole on another's next transform.
    std::atomic<uint32_t> flags{0};
    ModuleCalls calls{};
    // Published once both modules are loaded and `calls` is filled.
    std::atomic<const ModuleCalls*> bound{nullptr};
    // Guarded by lock 0; handles are used outside it under the active counter.
    Descriptor* table = nullptr;
    int32_t count = 0;
};

template <VlxVector V>
BindingState<V> binding_state;

enum class Binding { not_first, failed, bound };

template <VlxVector V>
int32_t kmp_set_blocktime(int32_t ms);

// The once-only binding of a family.  A failed attempt is not repeated, and
// the environment changes stand whatever the outcome.
template <VlxVector V>
Binding bind_if_first() {
    BindingState<V>& s = binding_state<V>;
    if (!bounded_counter_first(s.bind_counter)) return Binding::not_first;
    if (!modules::env_is_set("MKL_DISABLE_FAST_MM")) modules::env_set("MKL_DISABLE_FAST_MM", "YES");
    bool blocktime_set = false;
    if (!modules::env_is_set("KMP_BLOCKTIME")) {
        modules::env_set("KMP_BLOCKTIME", "0");
        blocktime_set = true;
    }
    void* dfti = modules::load(modules::dfti_module);
    if (dfti == nullptr) return Binding::failed;
    // On failure here the first module stays loaded.
    void* openmp = modules::load(modules::openmp_module);
    if (openmp == nullptr) return Binding::failed;

    ModuleCalls& c = s.calls;
    c.create = modules::function<CreateFn>(dfti, "DftiCreateDescriptor");
    c.set_value = modules::function<SetValueFn>(dfti, "DftiSetValue");
    c.commit = modules::function<CommitFn>(dfti, "DftiCommitDescriptor");
    c.forward = modules::function<ComputeFn>(dfti, "DftiComputeForward");
    c.backward = modules::function<ComputeFn>(dfti, "DftiComputeBackward");
    c.free = modules::function<FreeFn>(dfti, "DftiFreeDescriptor");
    c.max_threads = modules::function<QueryFn>(openmp, "omp_get_max_threads");
    c.num_procs = modules::function<QueryFn>(openmp, "omp_get_num_procs");
    c.set_num_threads = modules::function<SetCountFn>(openmp, "ompc_set_num_threads");
    c.blocktime = modules::function<QueryFn>(openmp, "kmp_get_blocktime");
    c.set_defaults = modules::function<SetTextFn>(openmp, "kmpc_set_defaults");
    s.bound.store(&c);

    // The flags word is still 0, so this call stops at its own test and
    // reaches no runtime function: the variable alone sets the block time.
    // The call is kept, in this place, for that order.
    if (blocktime_set) kmp_set_blocktime<V>(0);
    s.flags.fetch_or(flag_bound | flag_fast);
    return Binding::bound;
}

template <VlxVector V>
uint32_t flags_word() {
    return binding_state<V>.flags.load();
}

// Runtime queries and settings; a function the module lacks (or a family
// whose modules never loaded but whose flags word holds other bits) answers
// 0 and sets nothing.
template <VlxVector V>
int32_t runtime_query(QueryFn ModuleCalls::*fn) {
    const ModuleCalls* c = binding_state<V>.bound.load();
    return c != nullptr && c->*fn != nullptr ? (c->*fn)() : 0;
}

template <VlxVector V>
int32_t dft_get_flags(uint32_t* flags) {
    bind_if_first<V>();
    if (flags != nullptr) *flags = flags_word<V>();
    return 0;
}

template <VlxVector V>
int32_t dft_set_flags(uint32_t flags) {
    BindingState<V>& s = binding_state<V>;
    const Binding b = bind_if_first<V>();
    // The bound bit is sticky once the modules are in; without them the
    // fast path cannot be forced on.
    if (b == Binding::bound || (flags_word<V>() & flag_bound) != 0)
        s.flags.store(flags | flag_bound);
    else
        s.flags.store(flags & ~(flag_bound | flag_fast | flag_keep));
    return 0;
}

template <VlxVector V>
int32_t kmp_get_blocktime(int32_t* ms) {
    if (ms == nullptr) return 0;  // before binding, on purpose
    bind_if_first<V>();
    *ms = flags_word<V>() != 0 ? runtime_query<V>(&ModuleCalls::blocktime) : 0;
    return 0;
}

template <VlxVector V>
int32_t kmp_set_blocktime(int32_t ms) {
    bind_if_first<V>();
    if (flags_word<V>() == 0) return 0;
    char text[32];
    std::snprintf(text, sizeof text, "KMP_BLOCKTIME=%d", static_cast<int>(ms));
    const ModuleCalls* c = binding_state<V>.bound.load();
    if (c != nullptr && c->set_defaults != nullptr) c->set_defaults(text);
    return 0;
}

template <VlxVector V>
int32_t omp_get_max_threads(int32_t* n) {
    if (n == nullptr) return 0;
    bind_if_first<V>();
    *n = flags_word<V>() != 0 ? runtime_query<V>(&ModuleCalls::max_threads) : 0;
    return 0;
}

template <VlxVector V>
int32_t omp_set_num_threads(int32_t n) {
    bind_if_first<V>();
    if (flags_word<V>() == 0) return 0;
    const ModuleCalls* c = binding_state<V>.bound.load();
    if (c != nullptr && c->set_num_threads != nullptr) c->set_num_threads(n);
    // A descriptor is committed for a thread count.
    return dft_descriptors_free<V>() < 0 ? -1 : 0;
}

// A descriptor of this length and domain, committed, appended to the table
// (the caller holds lock 0); null on any failure.  A failed record is not
// counted, so the next add takes its place; a handle it may hold is lost.
template <VlxVector V>
void* add_descriptor(int32_t n, int32_t complex_domain) {
    using T = real_t<V>;
    BindingState<V>& s = binding_state<V>;
    // realloc of the null first table is the malloc of the first record.
    s.table = static_cast<Descriptor*>(std::realloc(s.table, (size_t(s.count) + 1) * sizeof(Descriptor)));
    if (s.table == nullptr) return nullptr;
    Descriptor& r = s.table[s.count];
    r = {nullptr, n, complex_domain};
    const ModuleCalls* c = s.bound.load();
    if (c == nullptr || c->create == nullptr || c->set_value == nullptr || c->commit == nullptr) return nullptr;
    const int precision = std::is_same_v<V, vlx_t> ? dfti_double : dfti_single;
    const long status = c->create(&r.descriptor, precision, complex_domain != 0 ? dfti_complex : dfti_real, 1L,
                                  static_cast<long>(n));
    if (status != 0 || r.descriptor == nullptr) return nullptr;
    // 1/N in the family's precision, passed on as a double.
    const T scale = T(1) / static_cast<T>(std::max<int32_t>(n, 1));
    if (c->set_value(r.descriptor, dfti_forward_scale, static_cast<double>(scale)) != 0) return nullptr;
    // A runtime held to one thread: tell the module that many callers may
    // compute on one descriptor at the same time.
    int32_t threads = 0;
    omp_get_max_threads<V>(&threads);
    if (threads == 1) {
        const int procs = c->num_procs != nullptr ? c->num_procs() : 0;
        if (c->set_value(r.descriptor, dfti_number_of_user_threads, procs) != 0) return nullptr;
    }
    if (c->commit(r.descriptor) != 0) return nullptr;
    ++s.count;
    return r.descriptor;
}

template <VlxVector V>
void* find_descriptor(int32_t n, int32_t complex_domain) {
    const BindingState<V>& s = binding_state<V>;
    if (s.table == nullptr) return nullptr;
    for (int32_t i = 0; i < s.count; ++i) {
        const Descriptor& r = s.table[i];
        if (r.length == n && r.complex_domain == complex_domain && r.descriptor != nullptr) return r.descriptor;
    }
    return nullptr;
}

}  // namespace

template <VlxVector V>
int32_t dft_descriptors_free() {
    bind_if_first<V>();
    BindingState<V>& s = binding_state<V>;
    lib_lock(0);
    lib_active_wait();
    int32_t result = 0;
    const ModuleCalls* c = s.bound.load();
    for (int32_t i = 0; s.table != nullptr && i < s.count; ++i) {
        // A refused release fails the call, but the table goes all the same.
        if (c == nullptr || c->free == nullptr || c->free(&s.table[i].descriptor) != 0) result = -1;
    }
    if (s.count > 0) {
        std::free(s.table);
        s.table = nullptr;
    }
    s.count = 0;
    lib_unlock(0);
    return result;
}

template <VlxVector V>
bool dft_bound_fast() {
    bind_if_first<V>();
    return (flags_word<V>() & flag_fast) != 0;
}

template <VlxVector V>
int32_t dft_fast_transform(V* v, int32_t inverse, int32_t complex_domain) {
    BindingState<V>& s = binding_state<V>;
    const int32_t n = v->points;
    if (!is_power_of_two(n)) return -1;
    if (complex_domain != 0) {
        if (rtoc(v) < 0) return -1;
    } else {
        if (v->complex) return -1;
        // Room for n/2 + 1 complex points with the n real samples left where
        // they are, as the module's in-place real transform expects.
        v->complex = 1;
        if (realloc(v, n, 0) < 0) return -1;
    }
    lib_lock(0);
    lib_active_enter();
    void* handle = find_descriptor<V>(n, complex_domain);
    if (handle == nullptr) handle = add_descriptor<V>(n, complex_domain);
    // Deliberately no unlock and no leave: a descriptor that cannot be made
    // leaves lock 0 held and the counter raised.
    if (handle == nullptr) return -1;
    lib_unlock(0);
    const ModuleCalls* c = s.bound.load();
    const ComputeFn compute = inverse == 0 ? c->forward : c->backward;
    // A failed compute leaves the counter raised, also deliberately.
    if (compute == nullptr || compute(handle, static_cast<void*>(v->data)) != 0) return -1;
    lib_active_leave();
    if ((flags_word<V>() & flag_keep) == 0 && dft_descriptors_free<V>() < 0) return -1;
    set_transform_delta(v, n);
    if (complex_domain == 0) v->points = n / 2 + 1;
    return 0;
}

#define VLX_INSTANTIATE(V)                                    \
    template int32_t dft_descriptors_free<V>();               \
    template bool dft_bound_fast<V>();                        \
    template int32_t dft_fast_transform<V>(V*, int32_t, int32_t);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_dft_get_flags(uint32_t* flags) { return vlx::dft_get_flags<vlx_t>(flags); }
VLX_API int32_t vlxf_dft_get_flags(uint32_t* flags) { return vlx::dft_get_flags<vlxf_t>(flags); }
VLX_API int32_t vlx_dft_set_flags(uint32_t flags) { return vlx::dft_set_flags<vlx_t>(flags); }
VLX_API int32_t vlxf_dft_set_flags(uint32_t flags) { return vlx::dft_set_flags<vlxf_t>(flags); }
VLX_API int32_t vlx_kmp_get_blocktime(int32_t* ms) { return vlx::kmp_get_blocktime<vlx_t>(ms); }
VLX_API int32_t vlxf_kmp_get_blocktime(int32_t* ms) { return vlx::kmp_get_blocktime<vlxf_t>(ms); }
VLX_API int32_t vlx_kmp_set_blocktime(int32_t ms) { return vlx::kmp_set_blocktime<vlx_t>(ms); }
VLX_API int32_t vlxf_kmp_set_blocktime(int32_t ms) { return vlx::kmp_set_blocktime<vlxf_t>(ms); }
VLX_API int32_t vlx_omp_get_max_threads(int32_t* n) { return vlx::omp_get_max_threads<vlx_t>(n); }
VLX_API int32_t vlxf_omp_get_max_threads(int32_t* n) { return vlx::omp_get_max_threads<vlxf_t>(n); }
VLX_API int32_t vlx_omp_set_num_threads(int32_t n) { return vlx::omp_set_num_threads<vlx_t>(n); }
VLX_API int32_t vlxf_omp_set_num_threads(int32_t n) { return vlx::omp_set_num_threads<vlxf_t>(n); }
}
