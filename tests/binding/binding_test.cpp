// The vendor transform binding, each scenario in a process of its own (see
// tests/CMakeLists.txt): modules absent, the stand-in DFT module with the real
// OpenMP runtime, a preset environment, refusals, the families side by side.
#include "../transforms/fft_reference.hpp"

#include <dlfcn.h>

#include <string>

using namespace vlxtest;
using namespace fftref;

namespace {

template <class V>
struct api;
#define VLX_BINDING_API(V, p, prec)                                                      \
    template <>                                                                          \
    struct api<V> {                                                                      \
        static constexpr auto get = p##_dft_get_flags, set = p##_dft_set_flags;         \
        static constexpr auto blocktime = p##_kmp_get_blocktime, threads = p##_omp_get_max_threads; \
        static constexpr auto set_blocktime = p##_kmp_set_blocktime, set_threads = p##_omp_set_num_threads; \
        static constexpr auto release = p##_free_internal;                              \
        static constexpr int precision = prec;                                           \
    };
VLX_BINDING_API(vlx_t, vlx, 36)
VLX_BINDING_API(vlxf_t, vlxf, 35)

template <class V>
uint32_t flags() {
    uint32_t f = 0;
    EXPECT_EQ(api<V>::get(&f), 0);
    return f;
}
template <class F>
int32_t query(F fn) {
    int32_t x = -1;
    EXPECT_EQ(fn(&x), 0);
    return x;
}

bool scenario(const char* name) {
    const char* s = std::getenv("VLX_BINDING_SCENARIO");
    return s != nullptr && std::strcmp(s, name) == 0;
}
#define SCENARIO(name) \
    if (!scenario(name)) GTEST_SKIP() << "runs as a process of its own under ctest"

// A function of a module that the library has loaded.
template <class F>
F module_fn(const char* module, const char* name) {
    void* m = dlopen(module, RTLD_NOW | RTLD_NOLOAD);
    EXPECT_NE(m, nullptr);
    return reinterpret_cast<F>(dlsym(m, name));
}
// The calls the stand-in module received since the last look.
std::string calls() {
    static size_t seen = 0;
    const std::string all = module_fn<const char* (*)()>("libmkl_rt.so.2", "standin_trace")();
    const std::string fresh = all.substr(seen);
    seen = all.size();
    return fresh;
}

// How the stand-in names a descriptor's creation, up to the domain.
template <class V>
std::string created() {
    char t[8];
    std::snprintf(t, sizeof t, "c%d.", api<V>::precision);
    return t;
}

enum Kind { forward, inverse, real_fft, real_fft_as_complex };

// A transform through the library against the module's own DFT (fast) or the
// native engine's recipe, bit for bit, with layout and delta.
template <class V>
void expect_transform(Kind kind, int n, bool fast) {
    using T = real_of<V>;
    const bool real_in = kind >= real_fft;
    const std::vector<T> in = random_values<T>(size_t(n) * (real_in ? 1 : 2), 7 * n + kind);
    Vec<V> v(in, !real_in);
    v->delta = 0.5;
    ASSERT_EQ(kind == real_fft ? t_rfft(&v) : t_fft(&v, kind == inverse), 0);
    std::vector<T> want(in);
    if (kind == real_fft_as_complex) {
        want.assign(2 * size_t(n), T(0));
        for (int i = 0; i < n; ++i) want[2 * i] = in[i];
    }
    const int points = kind == real_fft ? n / 2 + 1 : n;
    if (fast) {
        want.resize(std::max(want.size(), 2 * size_t(points)));
        module_fn<void (*)(int, void*, long, int, int, double)>("libmkl_rt.so.2", "standin_dft")(
            api<V>::precision, want.data(), n, kind == real_fft, kind == inverse, kind == inverse ? 1.0 : 1.0 / n);
        want.resize(2 * size_t(points));
    } else if (kind == real_fft) {
        want = literal_rfft(in);
    } else {
        literal_fft(want, kind == inverse);
    }
    EXPECT_TRUE(same_scalars(v.values(), want)) << kind << " " << n;
    EXPECT_TRUE(has_shape(v.get(), points, 1, 2.0 / n));
}

template <class V>
class Absent : public ::testing::Test {};
template <class V>
class Present : public ::testing::Test {};
template <class V>
class Refusals : public ::testing::Test {};
TYPED_TEST_SUITE(Absent, Families);
TYPED_TEST_SUITE(Present, Families);
TYPED_TEST_SUITE(Refusals, Families);

TYPED_TEST(Absent, InertAndNative) {
    SCENARIO("Absent");
    using A = api<TypeParam>;
    EXPECT_EQ(A::blocktime(nullptr), 0);
    EXPECT_EQ(std::getenv("KMP_BLOCKTIME"), nullptr);  // not bound by that call
    EXPECT_EQ(A::get(nullptr), 0);
    EXPECT_STREQ(std::getenv("MKL_DISABLE_FAST_MM"), "YES");
    EXPECT_STREQ(std::getenv("KMP_BLOCKTIME"), "0");
    EXPECT_EQ(dlopen("libmkl_rt.so.2", RTLD_NOW | RTLD_NOLOAD), nullptr);
    for (uint32_t f : {0x0u, 0x7000u, 0x2000u, 0xf000u}) EXPECT_EQ((A::set(f), flags<TypeParam>()), f & 0x8000u);
    // A flags word of 0x8000 without modules must not reach any runtime call.
    EXPECT_EQ(A::set_blocktime(5) | A::set_threads(1), 0);
    EXPECT_EQ(query(A::blocktime) | query(A::threads), 0);
    for (Kind k : {forward, inverse, real_fft}) expect_transform<TypeParam>(k, 16, false);
    Vec<TypeParam> one({3});
    EXPECT_EQ(t_rfft(&one), 0);
    EXPECT_TRUE(has_shape(one.get(), 1, 0, 1.0));  // one real point stays real natively
    EXPECT_EQ(A::release(), 0);
}

TYPED_TEST(Present, FlagsDescriptorsThreads) {
    SCENARIO("Present");
    using A = api<TypeParam>;
    EXPECT_EQ(flags<TypeParam>(), 0x3000u);
    EXPECT_STREQ(std::getenv("MKL_DISABLE_FAST_MM"), "YES");
    EXPECT_STREQ(std::getenv("KMP_BLOCKTIME"), "0");
    EXPECT_EQ(query(A::blocktime), 0);
    EXPECT_EQ(query(A::threads), 2);
    const std::string c = created<TypeParam>();
    // Without KEEP each transform makes and frees its descriptor.
    const struct {
        Kind kind;
        int n;
        std::string calls;
    } cases[] = {{forward, 8, c + "32.1/8 s4=0.125 m f x "},
                 {inverse, 8, c + "32.1/8 s4=0.125 m b x "},
                 {real_fft, 16, c + "33.1/16 s4=0.0625 m f x "},
                 {real_fft, 1, c + "33.1/1 s4=1 m f x "},  // one real point comes back complex
                 {real_fft_as_complex, 1, c + "32.1/1 s4=1 m f x "}};
    for (const auto& k : cases) {
        expect_transform<TypeParam>(k.kind, k.n, true);
        EXPECT_EQ(calls(), k.calls);
    }
    // KEEP: one descriptor per length and domain, reused.
    A::set(0x6000);
    EXPECT_EQ(flags<TypeParam>(), 0x7000u);
    for (Kind k : {forward, inverse, real_fft}) expect_transform<TypeParam>(k, 16, true);
    EXPECT_EQ(calls(), c + "32.1/16 s4=0.0625 m f b " + c + "33.1/16 s4=0.0625 m f ");
    // A thread count releases them; a runtime held to one thread gets the user-thread setting.
    EXPECT_EQ(A::set_threads(1), 0);
    EXPECT_EQ(calls(), "x x ");
    EXPECT_EQ(query(A::threads), 1);
    expect_transform<TypeParam>(forward, 16, true);
    const int procs = module_fn<int (*)()>("libiomp5.so", "omp_get_num_procs")();
    EXPECT_EQ(calls(), c + "32.1/16 s4=0.0625 s26=" + std::to_string(procs) + " m f ");
    EXPECT_EQ(A::release(), 0);
    EXPECT_EQ(calls(), "x ");
    EXPECT_EQ(A::set_threads(2), 0);
    expect_transform<TypeParam>(forward, 16, true);
    A::set(0x2000);  // the next transform frees what was kept
    expect_transform<TypeParam>(forward, 16, true);
    EXPECT_EQ(calls(), c + "32.1/16 s4=0.0625 m f f x ");
    // Fast bit cleared: the native engines, the module untouched.
    A::set(0);
    EXPECT_EQ(flags<TypeParam>(), 0x1000u);
    for (Kind k : {forward, inverse, real_fft}) expect_transform<TypeParam>(k, 16, false);
    // Refused before any descriptor: a length not a power of two, the real domain on a complex vector.
    A::set(0x2000);
    Vec<TypeParam> odd({1, 2, 3}), cplx({1, 2, 3, 4}, true);
    EXPECT_EQ(t_fft(&odd, 0) | t_rfft(&cplx), -1);
    EXPECT_TRUE(has_shape(odd.get(), 3, 0, 1.0) && has_shape(cplx.get(), 2, 1, 1.0));
    EXPECT_EQ(calls(), "");
}

TYPED_TEST(Refusals, ModuleFailures) {
    SCENARIO("Refusals");
    using T = real_of<TypeParam>;
    const std::string c = created<TypeParam>();
    // A refused release fails the transform after computing; the table goes all the same.
    setenv("STANDIN_FAIL", "free", 1);
    Vec<TypeParam> v(random_values<T>(16, 1), true);
    EXPECT_EQ(t_fft(&v, 0), -1);
    EXPECT_EQ(v->delta, T(1));
    EXPECT_EQ(calls(), c + "32.1/8 s4=0.125 m f x ");
    // With KEEP, so that nothing waits on the counter a failure leaves raised:
    // a descriptor that cannot be made leaves the vector complex, untransformed.
    api<TypeParam>::set(0x6000);
    setenv("STANDIN_FAIL", "create", 1);
    Vec<TypeParam> r({1, 2}), want({1, 0, 2, 0}, true);
    EXPECT_EQ(t_fft(&r, 0), -1);
    EXPECT_TRUE(same_scalars(r.values(), want.values()) && has_shape(r.get(), 2, 1, 1.0));
    EXPECT_EQ(calls(), c + "32.1/2 ");
    unsetenv("STANDIN_FAIL");
    expect_transform<TypeParam>(forward, 2, true);
    EXPECT_EQ(calls(), c + "32.1/2 s4=0.5 m f ");
    setenv("STANDIN_FAIL", "compute", 1);
    EXPECT_EQ(t_fft(&r, 1), -1);
    EXPECT_EQ(calls(), "b ");
}

TEST(Environment, PresetValuesStand) {
    SCENARIO("Environment");  // MKL_DISABLE_FAST_MM empty, KMP_BLOCKTIME 7
    EXPECT_EQ(flags<vlx_t>(), 0x3000u);
    EXPECT_STREQ(std::getenv("MKL_DISABLE_FAST_MM"), "YES");
    EXPECT_STREQ(std::getenv("KMP_BLOCKTIME"), "7");
    EXPECT_EQ(query(vlx_kmp_get_blocktime), 7);
    EXPECT_EQ(vlx_kmp_set_blocktime(25), 0);
    EXPECT_EQ(query(vlxf_kmp_get_blocktime), 25);  // one runtime for both families
}

TEST(Families, BindSeparately) {
    SCENARIO("Families");
    EXPECT_EQ(flags<vlx_t>(), 0x3000u);
    vlx_dft_set_flags(0x8000);
    EXPECT_EQ(flags<vlxf_t>(), 0x3000u);
    EXPECT_EQ(flags<vlx_t>(), 0x9000u);
    expect_transform<vlx_t>(forward, 8, false);
    expect_transform<vlxf_t>(forward, 8, true);
    EXPECT_EQ(calls(), "c35.32.1/8 s4=0.125 m f x ");
}

}  // namespace
