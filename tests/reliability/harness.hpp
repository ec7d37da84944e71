// Machinery of the reliability sweeps: a counted, failing allocator behind
// both the vector hooks and the standard heap; the argument context through
// which every row of the operation table asks for its vectors and scalars, so
// that one row serves the normal call, every hostile variant and every
// aliasing; and a watchdog that turns a hang into a failure with a name.
#pragma once

#include "vlx_test.hpp"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace rel {

// ---- counted allocation (heap.cpp) -------------------------------------------
// A window on the calling thread: every allocation made in it (hook or
// malloc/calloc/realloc) is counted, the fail_at-th one fails, and any single
// request above the cap fails.  Pausing hides the harness's own allocations.
struct Window {
    bool open = false;
    int paused = 0;
    long count = 0;
    long fail_at = 0;
    long failed = 0;
};
Window& window();
struct Pause {
    Pause() { ++window().paused; }
    ~Pause() { --window().paused; }
};
constexpr size_t kCapBytes = size_t(1) << 28;  // no single request above 256 MiB
bool should_fail(size_t bytes);
void* raw_malloc(size_t bytes);
void raw_free(void* p);

// Hook blocks alive now; release_hook_blocks() frees them (after a settled leak).
long live_hook_blocks();
void release_hook_blocks();
void install_hooks();

// ---- watchdog ------------------------------------------------------------------
// Names the call in flight; a call that outlives the budget ends the process
// with that name on stderr.
void watch(const std::string& what, unsigned seconds);
void unwatch();

// ---- argument context ------------------------------------------------------------
// coef: a read-only operand (taps, tables) that no destination may share;
// fixed: never spoiled nor aliased.
enum class Role { in, io, grow, out, hist, fixed, coef };
// Whether arguments of these roles may be one vector.
inline bool may_alias(Role a, Role b) {
    auto writes = [](Role r) { return r == Role::io || r == Role::grow || r == Role::out; };
    if (a == Role::hist || b == Role::hist || a == Role::fixed || b == Role::fixed) return false;
    return !((a == Role::coef && writes(b)) || (b == Role::coef && writes(a)));
}
// How the selected vector argument is spoiled.
enum class VKind {
    normal,
    neg_points,   // points -7 over normal storage
    no_points,    // points 0, nothing owned
    one_point,
    odd_complex,  // complex 2 (storage for pairs)
    nonfinite,    // NaN, +inf, -inf among the samples
    lent,         // alloc 0 over a caller's block of exactly the scalar count
    neg_alloc,    // alloc -3 over a caller's block
    huge,         // points 2^31-1, nothing owned (grow, out, hist only)
    huge_pairs,   // points 2^30, nothing owned: 2^31 scalars once complex (grow, out, hist only)
    lent_tiny,    // one-scalar lent block, points 1 (out, hist only)
    big,          // 46341 points, whose square overflows 32 bits (not on quadratic rows)
};
constexpr VKind kVecKinds[] = {VKind::neg_points, VKind::no_points, VKind::one_point, VKind::odd_complex,
                               VKind::nonfinite,  VKind::lent,      VKind::neg_alloc, VKind::huge,
                               VKind::huge_pairs, VKind::lent_tiny, VKind::big};
const char* kind_name(VKind k);
bool kind_fits(VKind k, Role r);

struct Mode {
    int vec = -1;  // vector argument spoiled by kind (arguments count in the order they are made)
    const char* role = "";
    VKind kind = VKind::normal;
    int scalar = -1;  // scalar argument replaced by scalar_value
    double scalar_value = 0;
    int integer = -1;  // integer argument replaced by int_value
    int64_t int_value = 0;
    int alias_of = -1, alias_at = -1;  // argument alias_at is argument alias_of
    bool all_same = false;             // every aliasable argument is the first one
    std::string describe() const;
};

template <class V>
struct Ctx {
    using T = vlxtest::real_of<V>;
    Mode mode;
    int nvec = 0, nscalar = 0, nint = 0;
    std::vector<Role> roles;  // of the vector arguments handed out, in order
    std::array<V, 16> pool{};
    std::array<V*, 16> args{};
    std::array<vlxf_t, 4> fpool{};
    int used = 0, fused = 0;
    std::vector<std::vector<T>> lent;
    uint32_t seed = 1;

    Ctx() = default;
    explicit Ctx(const Mode& m) : mode(m) {}
    Ctx(const Ctx&) = delete;
    Ctx& operator=(const Ctx&) = delete;
    ~Ctx() { clear(); }

    V* in(int32_t points, bool cplx = false) { return make(Role::in, points, cplx); }
    V* io(int32_t points, bool cplx = false) { return make(Role::io, points, cplx); }
    V* grow(int32_t points, bool cplx = false) { return make(Role::grow, points, cplx); }
    V* out() { return make(Role::out, 0, false); }
    // Points preset and no storage yet: a vector that the operation fills.
    V* bare(int32_t points, bool cplx = false) {
        V* v = make(Role::grow, points, cplx);
        if (v->alloc > 0 && mode.kind == VKind::normal) {
            Pause p;
            const int32_t n = v->points;
            vlxtest::t_destroy(v);
            v->points = n, v->complex = cplx, v->delta = T(0.5);
        }
        return v;
    }
    V* hist() { return make(Role::hist, 0, false); }
    V* fixed(int32_t points, bool cplx = false) { return make(Role::fixed, points, cplx); }
    V* coef(int32_t points, bool cplx = false) { return make(Role::coef, points, cplx); }
    // A vector with given samples, an ordinary source.
    V* vals(std::initializer_list<double> x, bool cplx = false, Role role = Role::in) {
        V* v = make(role, int32_t(x.size() / (cplx ? 2 : 1)), cplx);
        int i = 0;
        if (intact(v) && v->alloc >= int32_t(x.size()))  // an alias may be shorter
            for (double d : x) v->data[i++] = T(d);
        return v;
    }
    // Not the spoiled argument (so its samples may be set).
    bool intact(const V* v) const { return mode.vec < 0 || args[size_t(mode.vec)] != v || mode.kind == VKind::normal; }
    vlxf_t* fout() {
        Pause p;
        vlxf_t* f = &fpool[fused++];
        vlxf_init(f);
        return f;
    }
    T s(double x) {
        const int i = nscalar++;
        return T(i == mode.scalar ? mode.scalar_value : x);
    }
    int32_t n(int32_t x) {
        const int i = nint++;
        return i == mode.integer ? int32_t(mode.int_value) : x;
    }
    uint32_t u(uint32_t x) {
        const int i = nint++;
        return i == mode.integer ? uint32_t(mode.int_value) : x;
    }
    void clear() {
        Pause p;
        for (int i = 0; i < used; ++i) vlxtest::t_destroy(&pool[i]);
        for (int i = 0; i < fused; ++i) vlxf_destroy(&fpool[i]);
        used = fused = 0;
        nvec = nscalar = nint = 0;
        roles.clear();
        lent.clear();
    }
    // Every vector handed out, for the state checks.
    V* vec(int i) { return &pool[i]; }

private:
    V* make(Role role, int32_t points, bool cplx) {
        Pause p;
        const int i = nvec++;
        roles.push_back(role);
        if (i == mode.alias_at) return args[i] = args[mode.alias_of];
        if (mode.all_same && role != Role::coef && role != Role::hist && role != Role::fixed)
            for (int j = 0; j < i; ++j)
                if (may_alias(roles[size_t(j)], role) && roles[size_t(j)] != Role::coef) return args[i] = args[j];
        V* v = &pool[used++];
        vlxtest::t_init(v);
        v->delta = T(0.5);
        const VKind k = i == mode.vec ? mode.kind : VKind::normal;
        const bool dest = role == Role::out || role == Role::hist;
        if (dest && k == VKind::normal) return args[i] = v;
        v->complex = cplx;
        switch (k) {
            case VKind::no_points: points = 0; break;
            case VKind::one_point: points = 1; break;
            case VKind::big: points = 46341; break;
            case VKind::odd_complex: v->complex = 2; break;
            case VKind::huge: v->points = INT32_MAX; return args[i] = v;
            case VKind::huge_pairs: v->points = int32_t(1) << 30; return args[i] = v;
            default: break;
        }
        if (dest && points == 0) points = 4;
        v->points = points;
        if (k == VKind::lent || k == VKind::neg_alloc || k == VKind::lent_tiny) {
            if (k == VKind::lent_tiny) v->points = 1, v->complex = 0;
            lent.emplace_back(size_t(v->complex ? 2 * v->points : v->points), T(0.25));
            v->data = lent.back().data();
            v->alloc = k == VKind::neg_alloc ? -3 : 0;
        } else if (points > 0) {
            vlxtest::t_alloc(v);
            const auto x = vlxtest::random_values<T>(size_t(v->alloc), seed++);
            for (int32_t j = 0; j < v->alloc; ++j) v->data[j] = x[size_t(j)];
        }
        if (k == VKind::nonfinite && v->alloc >= 3) {
            v->data[0] = std::numeric_limits<T>::quiet_NaN();
            v->data[1] = std::numeric_limits<T>::infinity();
            v->data[v->alloc - 1] = -std::numeric_limits<T>::infinity();
        }
        if (k == VKind::neg_points) v->points = -7;
        return args[i] = v;
    }
};

// One row of the operation table: the same body compiled for each family.
struct Row {
    const char* name;
    int (*d)(Ctx<vlx_t>&);
    int (*f)(Ctx<vlxf_t>&);
    unsigned flags;
};
enum : unsigned {
    kSettledLeak = 1,  // a failed run may leave hook blocks behind, as the library settles
    kRandom = 2,       // results differ from call to call (noise): compared by status only
    kNoHostile = 4,    // not in the hostile sweep (the row's arguments are pointers it cannot spoil)
    kQuadratic = 8,
    kFails = 16,       // the normal call fails by design
    kCountKept = 32,   // a failed growth leaves the count read so far with no storage (text reader)    // work grows with the square of a length or worse: no 46341-point vectors
};
const std::vector<Row>& rows();

// The twin of a function for the family of V.
template <class V, class D, class F>
auto twin(D d, F f) {
    if constexpr (vlxtest::is_double<V>) return d; else return f;
}
#define REL_TW(prefix, name) ::rel::twin<V>(vlx##prefix##_##name, vlxf##prefix##_##name)

// ROW(prefix, name, body): body sees `c` (the context), `fn` (the operation of
// the family) and V, T; it returns the operation's status.
#define REL_ROWF(flags, prefix, name, ...)                                                              \
    ::rel::Row{"vlx" #prefix "_" #name,                                                               \
               [](::rel::Ctx<vlx_t>& c) -> int {                                                       \
                   using V = vlx_t;                                                                    \
                   using T = double;                                                                   \
                   [[maybe_unused]] auto fn = vlx##prefix##_##name;                                    \
                   (void)c, (void)sizeof(V), (void)sizeof(T);                                          \
                   __VA_ARGS__                                                                         \
               },                                                                                      \
               [](::rel::Ctx<vlxf_t>& c) -> int {                                                      \
                   using V = vlxf_t;                                                                   \
                   using T = float;                                                                    \
                   [[maybe_unused]] auto fn = vlxf##prefix##_##name;                                   \
                   (void)c, (void)sizeof(V), (void)sizeof(T);                                          \
                   __VA_ARGS__                                                                         \
               },                                                                                      \
               flags}
#define REL_ROW(prefix, name, ...) REL_ROWF(0u, prefix, name, __VA_ARGS__)
// A function shared by both families: fn is the same in both bodies.
#define REL_ROW_SHARED(name, ...)                                                                          \
    ::rel::Row{#name,                                                                                     \
               [](::rel::Ctx<vlx_t>& c) -> int { [[maybe_unused]] auto fn = name; __VA_ARGS__ },           \
               [](::rel::Ctx<vlxf_t>& c) -> int { [[maybe_unused]] auto fn = name; __VA_ARGS__ }, 0u}

}  // namespace rel
