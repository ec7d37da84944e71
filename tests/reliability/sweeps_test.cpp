// The allocation-failure sweep and the hostile-argument sweep over the
// operation table, in both families.
#include "harness.hpp"

#include <cstdio>
#include <fstream>
#include <set>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

namespace rel {

const char* kind_name(VKind k) {
    static const char* const names[] = {"normal", "neg_points", "no_points",  "one_point", "odd_complex", "nonfinite",
                                        "lent",   "neg_alloc",  "huge",       "huge_pairs", "lent_tiny", "big"};
    return names[int(k)];
}

const char* role_name(Role r) {
    static const char* const names[] = {"in", "io", "grow", "out", "hist", "fixed", "coef"};
    return names[int(r)];
}

bool kind_fits(VKind k, Role r) {
    if (r == Role::fixed) return false;
    const bool dest = r == Role::out || r == Role::hist;
    if (k == VKind::lent_tiny) return dest;
    if (k == VKind::huge || k == VKind::huge_pairs) return dest || r == Role::grow;
    return true;
}

std::string Mode::describe() const {
    char b[96];
    std::string d;
    if (vec >= 0) std::snprintf(b, sizeof b, "vector %d (%s) %s; ", vec, role, kind_name(kind)), d += b;
    if (scalar >= 0) std::snprintf(b, sizeof b, "scalar %d = %g; ", scalar, scalar_value), d += b;
    if (integer >= 0) std::snprintf(b, sizeof b, "integer %d = %lld; ", integer, static_cast<long long>(int_value)), d += b;
    if (alias_at >= 0) std::snprintf(b, sizeof b, "vector %d is vector %d; ", alias_at, alias_of), d += b;
    if (all_same) d += "all vectors the same; ";
    return d.empty() ? "normal" : d;
}

namespace {

// Seconds one call may take before it counts as a hang (sanitizers are slow).
constexpr unsigned kCallBudget = 60;

class Setup : public ::testing::Environment {
    void SetUp() override {
        install_hooks();
        vlx_lib_init();
        // Once-only work that allocates (binding, seeding) happens here, so that
        // every sweep sees the same allocation points on every run.
        uint32_t flags = 0;
        vlx_dft_get_flags(&flags), vlxf_dft_get_flags(&flags);
        vlx_t d;
        vlxf_t f;
        vlx_init(&d), vlxf_init(&f);
        d.points = f.points = 8;
        vlxc_rand(&d, 0), vlxfc_rand(&f, 0);
        vlx_destroy(&d), vlxf_destroy(&f);
    }
};
const auto* const setup = ::testing::AddGlobalTestEnvironment(new Setup);

template <class V>
int call(const Row& r, Ctx<V>& c) {
    if constexpr (vlxtest::is_double<V>) return r.d(c); else return r.f(c);
}

template <class V>
int32_t free_internal() {
    return vlxtest::is_double<V> ? vlx_free_internal() : vlxf_free_internal();
}

template <class V>
std::string label(const Row& r, const std::string& what) {
    return std::string(r.name) + (vlxtest::is_double<V> ? " (double) " : " (float) ") + what;
}

// A vector the call may have touched is one that can be destroyed and read:
// owned storage covers its samples, and no samples without storage.
template <class V>
::testing::AssertionResult usable(const V* v) {
    const int64_t n = v->complex ? 2 * int64_t(v->points) : int64_t(v->points);
    if (v->alloc > 0 && n > v->alloc) return ::testing::AssertionFailure() << n << " scalars over alloc " << v->alloc;
    if (v->alloc <= 0 && v->data == nullptr && v->points > 0)
        return ::testing::AssertionFailure() << v->points << " points and no storage";
    return ::testing::AssertionSuccess();
}

// Checks every vector that the call was handed unspoiled.
template <class V>
void check_vectors(Ctx<V>& c, const std::string& what, bool count_kept = false) {
    for (int i = 0; i < c.used; ++i) {
        V* v = c.vec(i);
        if (count_kept && v->data == nullptr && v->alloc == 0) continue;  // as the reader states
        bool spoiled = false;
        for (int a = 0; a < c.nvec; ++a) spoiled |= c.args[a] == v && a == c.mode.vec;
        if (!spoiled) {
            EXPECT_TRUE(usable(v)) << what << ", vector " << i;
        }
    }
}

// Every vector of the context as it stands: shape, spacing and scalars.
template <class V>
std::vector<std::vector<double>> snapshot(Ctx<V>& c) {
    std::vector<std::vector<double>> all;
    for (int i = 0; i < c.used; ++i) {
        const V* v = c.vec(i);
        const int64_t n = v->data == nullptr ? 0 : v->complex ? 2 * int64_t(v->points) : int64_t(v->points);
        all.push_back({double(v->points), double(v->complex), double(v->delta)});
        for (int64_t j = 0; j < n; ++j) all.back().push_back(double(v->data[j]));
    }
    return all;
}

bool same_snapshot(const std::vector<std::vector<double>>& a, const std::vector<std::vector<double>>& b) {
    if (a.size() != b.size()) return false;
    for (size_t i = 0; i < a.size(); ++i)
        if (a[i].size() != b[i].size() || (!a[i].empty() && std::memcmp(a[i].data(), b[i].data(), a[i].size() * 8) != 0))
            return false;
    return true;
}

// After the context is gone and the caches are released, no hook block may
// remain unless the row's leak is a settled one.
template <class V>
void check_released(Ctx<V>& c, const std::string& what, bool leak_allowed) {
    c.clear();
    // Both families: the hook blocks of either count, and a block freed here
    // must belong to no cache.
    EXPECT_EQ(free_internal<V>(), 0) << what;
    vlx_free_internal(), vlxf_free_internal();
    const long live = live_hook_blocks();
    if (!leak_allowed) {
        EXPECT_EQ(live, 0) << what << ": vector blocks left behind";
    }
    release_hook_blocks();
}

void check_heap_leaks([[maybe_unused]] const std::string& what) {
#if defined(__SANITIZE_ADDRESS__)
    EXPECT_EQ(__lsan_do_recoverable_leak_check(), 0) << what << ": heap blocks leaked (see the report above)";
#endif
}

// Runs one call under the counted window.
template <class V>
int run(const Row& r, Ctx<V>& c, long fail_at, const std::string& what, long* count = nullptr, long* failed = nullptr) {
    Window& w = window();
    w = Window{};
    w.fail_at = fail_at;
    w.open = true;
    static const bool trace = std::getenv("VLX_RELIABILITY_TRACE") != nullptr;
    if (trace) std::fprintf(stderr, "trace: %s\n", what.c_str());
    watch(what, kCallBudget);
    const int rc = call(r, c);
    unwatch();
    w.open = false;
    if (count != nullptr) *count = w.count;
    if (failed != nullptr) *failed = w.failed;
    return rc;
}

bool sanitizer_thread() {
#if defined(__SANITIZE_THREAD__)
    return true;
#else
    return false;
#endif
}

// The long versions: VLX_RELIABILITY_LONG=1 also sweeps the warm-cache path.
bool long_run() {
    const char* e = std::getenv("VLX_RELIABILITY_LONG");
    return e != nullptr && *e != '\0' && *e != '0';
}

}  // namespace

template <class V>
class Reliability : public ::testing::Test {};
TYPED_TEST_SUITE(Reliability, vlxtest::Families);

// Every allocation point of a representative call, failed in turn: the call
// fails (unless the row has a fallback), the vectors stay usable, and nothing
// is left behind once the caches are released.
TYPED_TEST(Reliability, EveryAllocationFailure) {
    using V = TypeParam;
    if (sanitizer_thread()) GTEST_SKIP() << "the sweeps run in the other builds";
    long rows_swept = 0, points_total = 0;
    for (const Row& r : rows()) {
        const bool leak_ok = r.flags & kSettledLeak;
        for (const bool cold : {true, false}) {
            if (!cold && !long_run()) break;
            long n = 0;
            int rc0;
            std::vector<std::vector<double>> want;
            {
                Ctx<V> c;
                if (!cold) call(r, c), c.clear();  // fill the caches first
                if (cold) free_internal<V>();
                rc0 = run(r, c, 0, label<V>(r, "counting"), &n);
                if (!(r.flags & kFails)) {
                    EXPECT_GE(rc0, 0) << label<V>(r, "normal call");
                }
                want = snapshot(c);
                check_released(c, label<V>(r, "counting"), leak_ok);
            }
            ++rows_swept, points_total += n;
            for (long k = 1; k <= n; ++k) {
                const std::string what = label<V>(r, "failing allocation " + std::to_string(k) + " of " + std::to_string(n));
                Ctx<V> c;
                if (!cold) call(r, c), c.clear();
                if (cold) free_internal<V>();
                long failed = 0;
                const int rc = run(r, c, k, what, nullptr, &failed);
                // A call that survives the failure (a table it can do
                // without) must give the normal result, bit for bit.
                if (failed > 0 && rc0 >= 0 && rc >= 0) {
                    EXPECT_TRUE(!(r.flags & kRandom) && same_snapshot(snapshot(c), want))
                        << what << ": succeeded with another result";
                }
                check_vectors(c, what, rc < 0 && (r.flags & kCountKept));
                check_released(c, what, leak_ok);
            }
            check_heap_leaks(label<V>(r, "allocation failures"));
        }
    }
    std::printf("[ figures  ] %s: %ld sweeps, %ld allocation points\n", vlxtest::is_double<V> ? "double" : "float",
                rows_swept, points_total);
}

// Every argument spoiled in turn: lengths, complex flags, samples, lent
// storage, scalars, integers and aliasing.  No crash, hang, undefined
// behaviour, unbounded allocation or leak on success; vectors stay usable.
TYPED_TEST(Reliability, HostileArguments) {
    using V = TypeParam;
    if (sanitizer_thread()) GTEST_SKIP() << "the sweeps run in the other builds";
    using T = vlxtest::real_of<V>;
    const double big = double(std::numeric_limits<T>::max());
    const double scalars[] = {std::nan(""), HUGE_VAL, -HUGE_VAL, 0.0, -3.0, big, double(std::numeric_limits<T>::denorm_min())};
    const int64_t integers[] = {-1, 0, 1, INT32_MAX, INT32_MIN, 65537, int64_t(1) << 30};
    long cases = 0;
    for (const Row& r : rows()) {
        if (r.flags & kNoHostile) continue;
        std::vector<Mode> modes;
        {
            Ctx<V> c;
            run(r, c, 0, label<V>(r, "normal"));
            for (int i = 0; i < c.nvec; ++i)
                for (VKind k : kVecKinds)
                    if (kind_fits(k, c.roles[size_t(i)]) && !(k == VKind::big && (r.flags & kQuadratic)))
                        modes.push_back(Mode{}), modes.back().vec = i, modes.back().kind = k,
                        modes.back().role = role_name(c.roles[size_t(i)]);
            for (int i = 0; i < c.nscalar; ++i)
                for (double x : scalars) modes.push_back(Mode{}), modes.back().scalar = i, modes.back().scalar_value = x;
            for (int i = 0; i < c.nint; ++i)
                for (int64_t x : integers) modes.push_back(Mode{}), modes.back().integer = i, modes.back().int_value = x;
            int pairs = 0;
            for (int j = 0; j < c.nvec; ++j)
                for (int i = 0; i < j; ++i)
                    if (may_alias(c.roles[size_t(i)], c.roles[size_t(j)]))
                        modes.push_back(Mode{}), modes.back().alias_of = i, modes.back().alias_at = j, ++pairs;
            if (pairs > 1) modes.push_back(Mode{}), modes.back().all_same = true;
            // A vector and a number spoiled at once.
            const size_t single = modes.size();
            for (size_t i = 0; i < single; ++i)
                for (size_t j = 0; j < single; ++j)
                    if (modes[i].vec >= 0 && (modes[j].scalar >= 0 || modes[j].integer >= 0)) {
                        Mode m = modes[j];
                        m.vec = modes[i].vec, m.kind = modes[i].kind, m.role = modes[i].role;
                        modes.push_back(m);
                    }
            check_released(c, label<V>(r, "normal"), r.flags & kSettledLeak);
        }
        for (const Mode& m : modes) {
            // The long run fails every allocation of every case in turn too.
            long n = 0;
            for (long k = 0; k <= n; ++k) {
                const std::string what = label<V>(r, m.describe() + (k ? " allocation " + std::to_string(k) : ""));
                Ctx<V> c(m);
                const int rc = run(r, c, k, what, k == 0 && long_run() ? &n : nullptr);
                check_vectors(c, what, rc < 0 && (r.flags & kCountKept));
                // A failed call may drop a block it could not grow, as a failed
                // resize does; a successful one leaves nothing behind.
                check_released(c, what, rc < 0 || (r.flags & kSettledLeak));
                ++cases;
            }
        }
        check_heap_leaks(label<V>(r, "hostile arguments"));
    }
    std::printf("[ figures  ] %s: %ld argument cases\n", vlxtest::is_double<V> ? "double" : "float", cases);
}

// An infinite ratio would halve for ever in the streaming resampler's set-up:
// it is refused before anything is stored.
TYPED_TEST(Reliability, InfiniteRatioRefused) {
    using V = TypeParam;
    using T = vlxtest::real_of<V>;
    std::conditional_t<vlxtest::is_double<V>, vlxh_rsmp_coef_t, vlxfh_rsmp_coef_t> coef;
    ASSERT_EQ(REL_TW(h, rsmp_coef_init)(&coef), 0);
    ASSERT_EQ(REL_TW(h, rsmp_coef_alloc)(&coef, 0), 0);
    ASSERT_EQ(REL_TW(h, rsmp_coef_setup)(&coef, T(5.5), 0, 0), 0);
    const auto before = coef;
    watch("vlxh_rsmp_coef_setup with an infinite ratio", kCallBudget);
    EXPECT_EQ(REL_TW(h, rsmp_coef_setup)(&coef, std::numeric_limits<T>::infinity(), 1, 0), -1);
    unwatch();
    EXPECT_EQ(std::memcmp(&coef, &before, sizeof coef), 0);
    // The largest finite ratio still halves to its end.
    EXPECT_EQ(REL_TW(h, rsmp_coef_setup)(&coef, std::numeric_limits<T>::max(), 0, 0), 0);
    EXPECT_EQ(coef.octaves, std::numeric_limits<T>::max_exponent - 1);
    REL_TW(h, rsmp_coef_destroy)(&coef);
}

// Lists the exported operations that have no row yet (a report, not a
// failure: subsystems arrive one by one).
TEST(ReliabilityCoverage, OperationsWithoutRows) {
    std::string header = __FILE__;
    header = header.substr(0, header.rfind("/tests/")) + "/include/libvlx.h";
    std::ifstream in(header);
    ASSERT_TRUE(in.good()) << header;
    std::set<std::string> covered;
    for (const Row& r : rows()) covered.insert(r.name);
    // Calls without arguments to spoil, reading state only, or run by the
    // set-up of other rows (fclose, the streaming objects' init and destroy).
    const std::set<std::string> trivial = {"vlx_lib_alloc", "vlx_lib_realloc", "vlx_lib_free", "vlx_init",
                                           "vlx_lib_init", "vlx_free_internal", "vlx_version", "vlx_dft_get_flags",
                                           "vlx_kmp_get_blocktime", "vlx_omp_get_max_threads", "vlx_unstage_io",
                                           "vlxf_fclose", "vlxh_rsmp_coef_init", "vlxh_rsmp_coef_destroy",
                                           "vlxh_rsmp_state_init", "vlxh_rsmp_state_destroy"};
    std::string line, missing;
    int total = 0;
    while (std::getline(in, line)) {
        const size_t open = line.find('(');
        if (line.rfind("VLX_API ", 0) != 0 || open == std::string::npos) continue;
        const size_t start = line.find_last_of(" *", open) + 1;
        const std::string name = line.substr(start, open - start);
        const std::string prefix = name.substr(0, name.find('_'));
        if (prefix.find('f', 3) != std::string::npos && prefix != "vlxf") continue;  // float twins
        const bool file_family = name.rfind("vlxf_fopen", 0) == 0 || name.rfind("vlxf_fclose", 0) == 0 ||
                                 name.rfind("vlxf_fread", 0) == 0 || name.rfind("vlxf_fwrite", 0) == 0;
        if (prefix == "vlxf" && !file_family) continue;  // vlxf_ twins of vlx_
        if (prefix == "vlxff" || trivial.count(name)) continue;
        ++total;
        if (!covered.count(name)) missing += " " + name;
    }
    std::printf("[ figures  ] %d operations, %zu with rows; without:%s\n", total, covered.size(), missing.c_str());
}

}  // namespace rel
