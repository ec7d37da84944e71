// Reliability machinery: a counted, failing allocator, a watchdog, and the argument context through which one row
// of the operation table serves the normal call, every hostile variant and every aliasing.
#pragma once

#include "vlx_test.hpp"

#include <array>
#include <cstdio>
#include <string>

namespace rel {

using vlxtest::is_double;
using vlxtest::real_of;

// ---- counted allocation (heap.cpp) ----
// A window on the calling thread: every allocation made in it (hook or malloc/calloc/realloc) is counted, the
// fail_at-th one fails, and any single request above 256 MiB fails.  Pausing hides the harness's own allocations.
struct Window {
    bool open = false;
    int paused = 0;
    long count = 0, fail_at = 0, failed = 0;
};
Window& window();
struct Pause {
    Pause() { ++window().paused; }
    ~Pause() { --window().paused; }
};
long live_hook_blocks();     // blocks made through the hooks and alive now
void release_hook_blocks();  // frees them (after a settled leak)
void install_hooks();
// Names the call in flight; a call that outlives the budget ends the process with that name on stderr.
void watch(const std::string& what, unsigned seconds);
void unwatch();

// Shape, spacing and scalars of a vector, compared bit for bit by same_image.
template <class V>
std::vector<double> image(const V* v) {
    std::vector<double> x{double(v->points), double(v->complex), double(v->delta)};
    const int64_t n = v->data == nullptr ? 0 : v->complex ? 2 * int64_t(v->points) : int64_t(v->points);
    for (int64_t j = 0; j < n; ++j) x.push_back(double(v->data[j]));
    return x;
}
inline bool same_image(const std::vector<double>& a, const std::vector<double>& b) {
    return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size() * sizeof(double)) == 0;
}

// ---- argument context ----
// coef: a read-only operand (taps, tables) that no destination may share; fixed: never spoiled nor aliased.
enum class Role { in, io, grow, out, hist, fixed, coef };
inline const char* const kRoleNames[] = {"in", "io", "grow", "out", "hist", "fixed", "coef"};
inline bool writes(Role r) { return r == Role::io || r == Role::grow || r == Role::out; }
// Whether arguments of these roles may be one vector.
inline bool may_alias(Role a, Role b) {
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
inline const char* const kKindNames[] = {"normal", "neg_points", "no_points", "one_point", "odd_complex", "nonfinite",
                                         "lent",   "neg_alloc",  "huge",      "huge_pairs", "lent_tiny",  "big"};
inline bool kind_fits(VKind k, Role r) {
    const bool dest = r == Role::out || r == Role::hist;
    if (r == Role::fixed) return false;
    if (k == VKind::lent_tiny) return dest;
    return (k != VKind::huge && k != VKind::huge_pairs) || dest || r == Role::grow;
}

struct Mode {
    int vec = -1;  // vector argument spoiled by kind (arguments count in the order they are made)
    Role role = Role::in;
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
    using vec = V;
    using T = real_of<V>;
    Mode mode;
    int nvec = 0, nscalar = 0, nint = 0, used = 0;
    std::vector<Role> roles;  // of the vector arguments handed out, in order
    std::array<V, 16> pool{};
    std::array<V*, 16> args{};
    std::vector<std::vector<T>> lent;
    uint32_t seed = 1;

    explicit Ctx(const Mode& m = {}) : mode(m) {}
    Ctx(const Ctx&) = delete;
    Ctx& operator=(const Ctx&) = delete;
    ~Ctx() { clear(); }

    V* in(int32_t points, bool cplx = false) { return make(Role::in, points, cplx); }
    V* io(int32_t points, bool cplx = false) { return make(Role::io, points, cplx); }
    V* grow(int32_t points, bool cplx = false) { return make(Role::grow, points, cplx); }
    V* out() { return make(Role::out, 0, false); }
    V* hist() { return make(Role::hist, 0, false); }
    V* fixed(int32_t points, bool cplx = false) { return make(Role::fixed, points, cplx); }
    V* coef(int32_t points, bool cplx = false) { return make(Role::coef, points, cplx); }
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
    T s(double x) { return T(nscalar++ == mode.scalar ? mode.scalar_value : x); }
    int32_t n(int32_t x) { return nint++ == mode.integer ? int32_t(mode.int_value) : x; }
    uint32_t u(uint32_t x) { return nint++ == mode.integer ? uint32_t(mode.int_value) : x; }
    void clear() {
        Pause p;
        for (int i = 0; i < used; ++i) vlxtest::t_destroy(&pool[size_t(i)]);
        used = nvec = nscalar = nint = 0;
        roles.clear();
        lent.clear();
    }

private:
    V* make(Role role, int32_t points, bool cplx) {
        Pause p;
        const int i = nvec++;
        roles.push_back(role);
        if (i == mode.alias_at) return args[size_t(i)] = args[size_t(mode.alias_of)];
        if (mode.all_same && role != Role::coef && role != Role::hist && role != Role::fixed)
            for (int j = 0; j < i; ++j)
                if (may_alias(roles[size_t(j)], role) && roles[size_t(j)] != Role::coef) return args[size_t(i)] = args[size_t(j)];
        V* v = &pool[size_t(used++)];
        args[size_t(i)] = v;
        vlxtest::t_init(v);
        v->delta = T(0.5);
        const VKind k = i == mode.vec ? mode.kind : VKind::normal;
        const bool dest = role == Role::out || role == Role::hist;
        if (dest && k == VKind::normal) return v;
        v->complex = cplx;
        switch (k) {
            case VKind::no_points: points = 0; break;
            case VKind::one_point: points = 1; break;
            case VKind::big: points = 46341; break;
            case VKind::odd_complex: v->complex = 2; break;
            case VKind::huge: v->points = INT32_MAX; return v;
            case VKind::huge_pairs: v->points = int32_t(1) << 30; return v;
            default: break;
        }
        v->points = dest && points == 0 ? 4 : points;
        if (k == VKind::lent || k == VKind::neg_alloc || k == VKind::lent_tiny) {
            if (k == VKind::lent_tiny) v->points = 1, v->complex = 0;
            lent.emplace_back(size_t(v->complex ? 2 * v->points : v->points), T(0.25));
            v->data = lent.back().data();
            v->alloc = k == VKind::neg_alloc ? -3 : 0;
        } else if (v->points > 0) {
            vlxtest::t_alloc(v);
            const auto x = vlxtest::random_values<T>(size_t(v->alloc), seed++);
            std::copy(x.begin(), x.end(), v->data);
        }
        if (k == VKind::nonfinite && v->alloc >= 3) {
            v->data[0] = std::numeric_limits<T>::quiet_NaN();
            v->data[1] = std::numeric_limits<T>::infinity();
            v->data[v->alloc - 1] = -std::numeric_limits<T>::infinity();
        }
        if (k == VKind::neg_points) v->points = -7;
        return v;
    }
};

// One row of the operation table: the same body compiled for each family.
struct Row {
    const char* name;
    int (*d)(Ctx<vlx_t>&);
    int (*f)(Ctx<vlxf_t>&);
    unsigned flags;
    template <class V>
    int operator()(Ctx<V>& c) const {
        if constexpr (is_double<V>) return d(c); else return f(c);
    }
};
enum : unsigned {
    kSettledLeak = 1,  // a failed run may leave hook blocks behind, as the library settles
    kRandom = 2,       // results differ from call to call (noise): compared by status only
    kNoHostile = 4,    // not in the hostile sweep (the row's arguments are pointers it cannot spoil)
    kQuadratic = 8,    // work grows with the square of a length or worse: no 46341-point vectors
    kFails = 16,       // the normal call fails by design
    kCountKept = 32,   // a failed growth leaves the count read so far with no storage (text reader)
};
const std::vector<Row>& rows();

// The body, a stateless generic lambda, called with the context and the family's function D or F.
template <auto D, auto F, class Body>
Row row(const char* name, Body, unsigned flags) {
    return {name, [](Ctx<vlx_t>& c) { return Body{}(c, D); }, [](Ctx<vlxf_t>& c) { return Body{}(c, F); }, flags};
}

// The twin of a function for the family of V.
template <class V, class D, class F>
auto twin(D d, F f) {
    if constexpr (is_double<V>) return d; else return f;
}
#define REL_TW(prefix, name) ::rel::twin<V>(vlx##prefix##_##name, vlxf##prefix##_##name)

// A stream to write to, or one holding v in the given form at its start; its buffer is made before the window opens.
struct Stream {
    std::FILE* f;
    Stream() {
        Pause p;
        f = std::fopen("/dev/null", "w");
        std::fputc(' ', f);
    }
    template <class V>
    Stream(V* v, int32_t form) : f((Pause(), std::tmpfile())) {
        Pause p;
        REL_TW(f, fwrite2)(v, f, form);
        std::rewind(f);
        std::ungetc(std::fgetc(f), f);
    }
    ~Stream() {
        Pause p;
        std::fclose(f);
    }
};

// REL_ROW(prefix, name, body): body sees `c` (the context), `fn` (the family's operation), V and T; returns the status.
#define REL_ROWF(flags, prefix, name, ...)                                                                       \
    ::rel::row<vlx##prefix##_##name, vlxf##prefix##_##name>(                                                     \
        "vlx" #prefix "_" #name,                                                                                 \
        []([[maybe_unused]] auto& c, [[maybe_unused]] auto fn) -> int {                                                     \
            using V [[maybe_unused]] = typename std::remove_reference_t<decltype(c)>::vec;                       \
            using T [[maybe_unused]] = ::rel::real_of<V>;                                                        \
            __VA_ARGS__                                                                                          \
        },                                                                                                       \
        flags)
#define REL_ROW(prefix, name, ...) REL_ROWF(0u, prefix, name, __VA_ARGS__)

}  // namespace rel
