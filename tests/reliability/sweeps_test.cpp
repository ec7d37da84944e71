// The allocation-failure sweep and the hostile-argument sweep over the operation table, in both families.
#include "harness.hpp"

#include <cstdio>
#include <fstream>
#include <set>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

namespace rel {

// Unused fields read -1.
std::string Mode::describe() const {
    char b[200];
    std::snprintf(b, sizeof b, "vector %d (%s) %s; scalar %d = %g; integer %d = %lld; vector %d is vector %d%s", vec,
                  kRoleNames[int(role)], kKindNames[int(kind)], scalar, scalar_value, integer,
                  static_cast<long long>(int_value), alias_at, alias_of, all_same ? "; all vectors the same" : "");
    return b;
}

namespace {

constexpr unsigned kCallBudget = 60;  // seconds one call may take before it counts as a hang (sanitizers are slow)
#if defined(__SANITIZE_THREAD__)
#define REL_SWEEPS_SKIPPED GTEST_SKIP() << "the sweeps run in the other builds"
#else
#define REL_SWEEPS_SKIPPED (void)0
#endif
// VLX_RELIABILITY_LONG=1 also sweeps the warm-cache path, and every allocation of every hostile case.
const bool long_run = [] {
    const char* e = std::getenv("VLX_RELIABILITY_LONG");
    return e != nullptr && *e != '\0' && *e != '0';
}();

// Once-only work that allocates (binding, seeding) happens before the sweeps, so that every sweep sees the same
// allocation points on every run.
class Setup : public ::testing::Environment {
    void SetUp() override {
        install_hooks();
        vlx_lib_init();
        uint32_t flags = 0;
        vlx_dft_get_flags(&flags), vlxf_dft_get_flags(&flags);
        vlxtest::Vec<vlx_t> d({1, 2, 3});
        vlxtest::Vec<vlxf_t> f({1, 2, 3});
        vlxc_rand(d.get(), 0), vlxfc_rand(f.get(), 0);
    }
};
const auto* const setup = ::testing::AddGlobalTestEnvironment(new Setup);

template <class V>
std::string label(const Row& r, const std::string& what) {
    return std::string(r.name) + (is_double<V> ? " (double) " : " (float) ") + what;
}

void check_heap_leaks([[maybe_unused]] const std::string& what) {
#if defined(__SANITIZE_ADDRESS__)
    EXPECT_EQ(__lsan_do_recoverable_leak_check(), 0) << what << ": heap blocks leaked (see the report above)";
#endif
}

// What a call left: its status, the window's counts, the images of its vectors, and the arguments it asked for.
struct Outcome {
    int rc = 0;
    long count = 0, failed = 0;
    std::vector<std::vector<double>> images;
    std::vector<Role> roles;
    int nscalar = 0, nint = 0;
};

// Runs one call in the counted window, failing its fail_at-th allocation.  Then every vector the call was handed
// unspoiled can be destroyed and read: owned storage covers its samples, and no samples without storage (the text
// reader, as stated, may keep the count read with no storage after a failure).  After the context is gone and the
// caches of both families are released, no hook block may remain unless the row's leak is a settled one, or the call
// failed and failed_may_leak (it may drop a block it could not grow, as a failed resize does).
template <class V>
Outcome run(const Row& r, const Mode& m, long fail_at, const std::string& what, bool failed_may_leak) {
    static const bool trace = std::getenv("VLX_RELIABILITY_TRACE") != nullptr;
    if (trace) std::fprintf(stderr, "trace: %s\n", what.c_str());
    Ctx<V> c(m);
    Window& w = window();
    w = Window{.open = true, .fail_at = fail_at};
    watch(what, kCallBudget);
    Outcome o;
    o.rc = r(c);
    unwatch();
    w.open = false;
    o.count = w.count, o.failed = w.failed, o.roles = c.roles, o.nscalar = c.nscalar, o.nint = c.nint;
    const bool count_kept = o.rc < 0 && (r.flags & kCountKept);
    for (int i = 0; i < c.used; ++i) {
        const V* v = &c.pool[size_t(i)];
        if (m.vec >= 0 && c.args[size_t(m.vec)] == v) continue;
        if (m.vec < 0) o.images.push_back(image(v));
        if (count_kept && v->data == nullptr && v->alloc == 0) continue;
        const int64_t n = v->complex ? 2 * int64_t(v->points) : int64_t(v->points);
        EXPECT_FALSE(v->alloc > 0 && n > v->alloc) << what << ", vector " << i << ": " << n << " scalars over alloc " << v->alloc;
        EXPECT_FALSE(v->alloc <= 0 && v->data == nullptr && v->points > 0) << what << ", vector " << i << ": no storage";
    }
    c.clear();
    EXPECT_EQ(vlxtest::t_free_internal<V>(), 0) << what;
    vlx_free_internal(), vlxf_free_internal();
    EXPECT_TRUE((r.flags & kSettledLeak) || (failed_may_leak && o.rc < 0) || live_hook_blocks() == 0)
        << what << ": vector blocks left behind";
    release_hook_blocks();
    return o;
}

}  // namespace

VLX_TYPED_SUITE(Reliability);

// Every allocation point of a representative call, failed in turn: the call fails (unless it can do without, and
// then gives the normal result bit for bit), the vectors stay usable, and nothing is left behind once the caches are
// released.
TYPED_TEST(Reliability, EveryAllocationFailure) {
    using V = TypeParam;
    REL_SWEEPS_SKIPPED;
    long rows_swept = 0, points_total = 0;
    for (const Row& r : rows()) {
        for (const bool cold : {true, false}) {
            if (!cold && !long_run) break;
            // Cold: the family's caches released first; warm: filled by a call first.
            auto prepare = [&] {
                Ctx<V> c;
                cold ? (void)vlxtest::t_free_internal<V>() : (void)r(c);
            };
            prepare();
            const Outcome o = run<V>(r, {}, 0, label<V>(r, "counting"), false);
            EXPECT_TRUE(o.rc >= 0 || (r.flags & kFails)) << label<V>(r, "normal call");
            ++rows_swept, points_total += o.count;
            for (long k = 1; k <= o.count; ++k) {
                const std::string what = label<V>(r, "failing allocation " + std::to_string(k) + " of " + std::to_string(o.count));
                prepare();
                const Outcome f = run<V>(r, {}, k, what, false);
                bool same = f.images.size() == o.images.size() && !(r.flags & kRandom);
                for (size_t i = 0; same && i < f.images.size(); ++i) same = same_image(f.images[i], o.images[i]);
                EXPECT_TRUE(f.failed == 0 || o.rc < 0 || f.rc < 0 || same) << what << ": succeeded with another result";
            }
            check_heap_leaks(label<V>(r, "allocation failures"));
        }
    }
    std::printf("[ figures  ] %s: %ld sweeps, %ld allocation points\n", is_double<V> ? "double" : "float", rows_swept,
                points_total);
}

// Every argument spoiled in turn: lengths, complex flags, samples, lent storage, scalars, integers and aliasing.  No
// crash, hang, undefined behaviour, unbounded allocation or leak on success; vectors stay usable.
TYPED_TEST(Reliability, HostileArguments) {
    using V = TypeParam;
    using T = real_of<V>;
    REL_SWEEPS_SKIPPED;
    const double scalars[] = {std::nan(""), HUGE_VAL, -HUGE_VAL, 0.0, -3.0, double(std::numeric_limits<T>::max()),
                              double(std::numeric_limits<T>::denorm_min())};
    const int64_t integers[] = {-1, 0, 1, INT32_MAX, INT32_MIN, 65537, int64_t(1) << 30};
    long cases = 0;
    for (const Row& r : rows()) {
        if (r.flags & kNoHostile) continue;
        std::vector<Mode> modes;
        const Outcome c0 = run<V>(r, {}, 0, label<V>(r, "normal"), false);
        const int nvec = int(c0.roles.size());
        for (int i = 0; i < nvec; ++i)
            for (int k = 1; k <= int(VKind::big); ++k)
                if (kind_fits(VKind(k), c0.roles[size_t(i)]) && !(VKind(k) == VKind::big && (r.flags & kQuadratic)))
                    modes.push_back({.vec = i, .role = c0.roles[size_t(i)], .kind = VKind(k)});
        for (int i = 0; i < c0.nscalar; ++i)
            for (double x : scalars) modes.push_back({.scalar = i, .scalar_value = x});
        for (int i = 0; i < c0.nint; ++i)
            for (int64_t x : integers) modes.push_back({.integer = i, .int_value = x});
        const size_t before_pairs = modes.size();
        for (int j = 0; j < nvec; ++j)
            for (int i = 0; i < j; ++i)
                if (may_alias(c0.roles[size_t(i)], c0.roles[size_t(j)])) modes.push_back({.alias_of = i, .alias_at = j});
        if (modes.size() > before_pairs + 1) modes.push_back({.all_same = true});
        // A vector and a number spoiled at once.
        const size_t single = modes.size();
        for (size_t i = 0; i < single; ++i)
            for (size_t j = 0; j < single; ++j)
                if (modes[i].vec >= 0 && (modes[j].scalar >= 0 || modes[j].integer >= 0)) {
                    Mode m = modes[j];
                    m.vec = modes[i].vec, m.kind = modes[i].kind, m.role = modes[i].role;
                    modes.push_back(m);
                }
        for (const Mode& m : modes) {
            long n = 0;  // the long run fails every allocation of every case in turn too
            for (long k = 0; k <= n; ++k, ++cases) {
                const std::string what = label<V>(r, m.describe() + (k ? " allocation " + std::to_string(k) : ""));
                const Outcome o = run<V>(r, m, k, what, true);
                if (k == 0 && long_run) n = o.count;
            }
        }
        check_heap_leaks(label<V>(r, "hostile arguments"));
    }
    std::printf("[ figures  ] %s: %ld argument cases\n", is_double<V> ? "double" : "float", cases);
}

// An infinite ratio would halve for ever in the streaming resampler's set-up: it is refused before anything is
// stored, while the largest finite ratio still halves to its end.
TYPED_TEST(Reliability, InfiniteRatioRefused) {
    using V = TypeParam;
    using T = real_of<V>;
    std::conditional_t<is_double<V>, vlxh_rsmp_coef_t, vlxfh_rsmp_coef_t> coef;
    ASSERT_EQ(REL_TW(h, rsmp_coef_init)(&coef) | REL_TW(h, rsmp_coef_alloc)(&coef, 0), 0);
    ASSERT_EQ(REL_TW(h, rsmp_coef_setup)(&coef, T(5.5), 0, 0), 0);
    const auto before = coef;
    watch("vlxh_rsmp_coef_setup with an infinite ratio", kCallBudget);
    EXPECT_EQ(REL_TW(h, rsmp_coef_setup)(&coef, std::numeric_limits<T>::infinity(), 1, 0), -1);
    unwatch();
    EXPECT_EQ(std::memcmp(&coef, &before, sizeof coef), 0);
    EXPECT_EQ(REL_TW(h, rsmp_coef_setup)(&coef, std::numeric_limits<T>::max(), 0, 0), 0);
    EXPECT_EQ(coef.octaves, std::numeric_limits<T>::max_exponent - 1);
    REL_TW(h, rsmp_coef_destroy)(&coef);
}

// Lists the exported operations that have no row yet (a report, not a failure: subsystems arrive one by one).
TEST(ReliabilityCoverage, OperationsWithoutRows) {
    const std::string source = __FILE__;
    std::ifstream in(source.substr(0, source.rfind("/tests/")) + "/include/libvlx.h");
    std::set<std::string> declared, covered;
    for (std::string line; std::getline(in, line);) {
        const size_t open = line.find('('), start = line.find_last_of(" *", open) + 1;
        if (line.rfind("VLX_API ", 0) == 0 && open != std::string::npos) declared.insert(line.substr(start, open - start));
    }
    for (const Row& r : rows()) covered.insert(r.name);
    // Calls without arguments to spoil, reading state only, or run by the set-up of other rows.
    const std::set<std::string> trivial = {"vlx_lib_alloc", "vlx_lib_realloc", "vlx_lib_free", "vlx_init",
                                           "vlx_lib_init", "vlx_free_internal", "vlx_version", "vlx_dft_get_flags",
                                           "vlx_kmp_get_blocktime", "vlx_omp_get_max_threads", "vlx_unstage_io",
                                           "vlxf_fclose", "vlxh_rsmp_coef_init", "vlxh_rsmp_coef_destroy",
                                           "vlxh_rsmp_state_init", "vlxh_rsmp_state_destroy"};
    std::string missing;
    int total = 0;
    for (const std::string& name : declared) {
        const bool float_twin = name[3] == 'f' && declared.count(name.substr(0, 3) + name.substr(4));  // vlxf?_x of vlx?_x
        if (float_twin || trivial.count(name)) continue;
        ++total;
        if (!covered.count(name)) missing += " " + name;
    }
    EXPECT_GT(total, 0);
    std::printf("[ figures  ] %d operations, %zu with rows; without:%s\n", total, covered.size(), missing.c_str());
}

}  // namespace rel
