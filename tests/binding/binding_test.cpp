// The vendor transform binding, one scenario and family per process (see tests/CMakeLists.txt): modules absent, the
// stand-in DFT module with the system's OpenMP runtime (the twins bound apart), refusals, a preset environment.
#include "../transforms/fft_reference.hpp"

#include <dlfcn.h>

#include <string>

using namespace vlxtest;
using namespace fftref;

namespace {

// The binding calls of a family; precision is the module's code for it.
template <class V>
struct api {
    static constexpr bool d = is_double<V>;
    static constexpr auto get = d ? vlx_dft_get_flags : vlxf_dft_get_flags, set = d ? vlx_dft_set_flags : vlxf_dft_set_flags;
    static constexpr auto blocktime = d ? vlx_kmp_get_blocktime : vlxf_kmp_get_blocktime;
    static constexpr auto threads = d ? vlx_omp_get_max_threads : vlxf_omp_get_max_threads;
    static constexpr auto set_blocktime = d ? vlx_kmp_set_blocktime : vlxf_kmp_set_blocktime;
    static constexpr auto set_threads = d ? vlx_omp_set_num_threads : vlxf_omp_set_num_threads;
    static constexpr auto release = d ? vlx_free_internal : vlxf_free_internal;
    static constexpr int precision = d ? 36 : 35;
};

// What a getter stores (-2 if it does not return 0).
template <class R = int32_t, class F>
R got(F fn) {
    R x = R(-1);
    return fn(&x) == 0 ? x : R(-2);
}

bool scenario(const char* name) { return std::getenv("VLX_BINDING_SCENARIO") && !std::strcmp(std::getenv("VLX_BINDING_SCENARIO"), name); }
#define SCENARIO(name) \
    if (!scenario(name)) GTEST_SKIP() << "runs as a process of its own under ctest"

// A function of a module that the library has loaded (omp_... from the runtime).
template <class F>
F module_fn(const char* name) {
    void* m = dlopen(name[0] == 'o' ? "libiomp5.so" : "libmkl_rt.so.2", RTLD_NOW | RTLD_NOLOAD);
    return m == nullptr ? nullptr : reinterpret_cast<F>(dlsym(m, name));
}

// The stand-in's calls since the last look: "c<precision>.<domain>.<dimension>/<length>" create, "s<param>=<value>",
// "m" commit, "f"/"b" compute, "x" free.
std::string calls() {
    static size_t seen = 0;
    const std::string all = module_fn<const char* (*)()>("standin_trace")();
    const std::string fresh = all.substr(seen);
    seen = all.size();
    return fresh;
}
template <class V>
std::string created() { return is_double<V> ? "c36." : "c35."; }

enum Kind { forward, inverse, real_fft, real_as_complex };

// A transform through the library against the module's own DFT (fast) or the native engine's recipe (n >= 4), bit for
// bit, with the layout and delta.
template <class V>
void expect_transform(Kind kind, int n, bool fast) {
    using T = real_of<V>;
    const bool real_in = kind >= real_fft;
    const int points = kind == real_fft ? n / 2 + 1 : n;
    const std::vector<T> in = random_values<T>(size_t(n) * (real_in ? 1 : 2), 7 * n + kind);
    std::vector<T> want(std::max(in.size(), 2 * size_t(points)), T(0));
    for (size_t i = 0; i < in.size(); ++i) want[kind == real_as_complex ? 2 * i : i] = in[i];
    Vec<V> v(in, !real_in);
    v->delta = 0.5;
    ASSERT_EQ(kind == real_fft ? t_rfft(&v) : t_fft(&v, kind == inverse), 0);
    if (fast)
        module_fn<void (*)(int, void*, long, int, int, double)>("standin_dft")(
            api<V>::precision, want.data(), n, kind == real_fft, kind == inverse, kind == inverse ? 1.0 : 1.0 / n);
    else if (kind == real_fft)
        want = literal_rfft(in);
    else
        literal_fft(want, kind == inverse);
    want.resize(2 * size_t(points));
    EXPECT_TRUE(same_scalars(v.values(), want) && has_shape(v.get(), points, 1, 2.0 / n)) << kind << " " << n;
}

VLX_TYPED_SUITE(Binding);

TYPED_TEST(Binding, Absent) {
    SCENARIO("Absent");
    using A = api<TypeParam>;
    EXPECT_EQ(A::blocktime(nullptr) | A::threads(nullptr), 0);
    EXPECT_EQ(std::getenv("KMP_BLOCKTIME"), nullptr);  // those two do not bind
    EXPECT_EQ(A::get(nullptr), 0);
    EXPECT_STREQ(std::getenv("MKL_DISABLE_FAST_MM"), "YES");
    EXPECT_STREQ(std::getenv("KMP_BLOCKTIME"), "0");
    for (uint32_t f : {0x0u, 0x7000u, 0xf000u}) EXPECT_EQ((A::set(f), got<uint32_t>(A::get)), f & 0x8000u);
    // A flags word of 0x8000 with no modules reaches no runtime call.
    EXPECT_EQ(A::set_blocktime(5) | A::set_threads(1) | got(A::blocktime) | got(A::threads), 0);
    for (Kind k : {forward, inverse, real_fft}) expect_transform<TypeParam>(k, 16, false);
    Vec<TypeParam> one({3});
    EXPECT_TRUE(t_rfft(&one) == 0 && has_shape(one.get(), 1, 0, 1.0));  // natively one real point stays real
    EXPECT_EQ(A::release(), 0);
}

TYPED_TEST(Binding, Present) {
    SCENARIO("Present");
    using A = api<TypeParam>;
    EXPECT_TRUE((got<uint32_t>(A::get)) == 0x3000u && got(A::threads) == 2);
    const std::string c = created<TypeParam>();
    // Without KEEP each transform makes and frees its descriptor; forward scale 1/N.
    const struct { Kind kind; int n; std::string calls; } cases[] = {{forward, 8, c + "32.1/8 s4=0.125 m f x "},
                 {inverse, 8, c + "32.1/8 s4=0.125 m b x "}, {real_fft, 16, c + "33.1/16 s4=0.0625 m f x "},
                 {real_fft, 1, c + "33.1/1 s4=1 m f x "},  // one real point comes back complex
                 {real_as_complex, 1, c + "32.1/1 s4=1 m f x "}};
    for (const auto& k : cases) {
        expect_transform<TypeParam>(k.kind, k.n, true);
        EXPECT_EQ(calls(), k.calls);
    }
    A::set(0x6000);  // KEEP: one descriptor per length and domain
    EXPECT_EQ(got<uint32_t>(A::get), 0x7000u);
    for (Kind k : {forward, inverse, real_fft}) expect_transform<TypeParam>(k, 16, true);
    EXPECT_EQ(calls(), c + "32.1/16 s4=0.0625 m f b " + c + "33.1/16 s4=0.0625 m f ");
    // A thread count releases them; a runtime held to one thread gets the user-thread count.
    EXPECT_EQ(A::set_threads(1) + got(A::threads), 1);
    expect_transform<TypeParam>(forward, 16, true);
    EXPECT_EQ(A::release(), 0);
    const std::string procs = std::to_string(module_fn<int (*)()>("omp_get_num_procs")());
    EXPECT_TRUE(calls() == ("x x " + c + "32.1/16 s4=0.0625 s26=" + procs + " m f x ") && A::set_threads(2) == 0);
    expect_transform<TypeParam>(forward, 16, true);
    A::set(0x2000);  // the next transform frees what was kept
    expect_transform<TypeParam>(forward, 16, true);
    EXPECT_EQ(calls(), c + "32.1/16 s4=0.0625 m f f x ");
    A::set(0);  // the native engines, the module untouched
    EXPECT_EQ(got<uint32_t>(A::get), 0x1000u);
    for (Kind k : {forward, inverse, real_fft}) expect_transform<TypeParam>(k, 16, false);
    EXPECT_EQ(calls(), "");
    using W = std::conditional_t<is_double<TypeParam>, vlxf_t, vlx_t>;  // the twin, never touched, is bound on its own
    A::set(0x8000);
    EXPECT_TRUE(got<uint32_t>(api<W>::get) == 0x3000u && got<uint32_t>(A::get) == 0x9000u);
    expect_transform<TypeParam>(forward, 8, false);
    expect_transform<W>(forward, 8, true);
    EXPECT_EQ(calls(), created<W>() + "32.1/8 s4=0.125 m f x ");
}

TYPED_TEST(Binding, Refusals) {
    SCENARIO("Refusals");
    const std::string c = created<TypeParam>();
    Vec<TypeParam> odd({1, 2, 3}), cplx({1, 2, 3, 4}, true), v({1, 2, 3, 4}, true), r({1, 2}), want({1, 0, 2, 0}, true);
    EXPECT_EQ(t_fft(&odd, 0) | t_rfft(&cplx), -1);  // before any descriptor, vectors unchanged
    EXPECT_TRUE(has_shape(odd.get(), 3, 0, 1.0) && has_shape(cplx.get(), 2, 1, 1.0));
    setenv("STANDIN_FAIL", "free", 1);  // fails after computing, delta untouched; the table goes all the same
    EXPECT_TRUE(t_fft(&v, 0) == -1 && v->delta == 1);
    api<TypeParam>::set(0x6000);  // kept: nothing may wait on the counter the next failures leave raised
    setenv("STANDIN_FAIL", "create", 1);
    EXPECT_TRUE(t_fft(&r, 0) == -1 && same_scalars(r.values(), want.values()));  // complex, untransformed
    unsetenv("STANDIN_FAIL");
    expect_transform<TypeParam>(forward, 2, true);
    setenv("STANDIN_FAIL", "compute", 1);
    EXPECT_EQ(t_fft(&r, 1), -1);
    EXPECT_EQ(calls(), c + "32.1/2 s4=0.5 m f x " + c + "32.1/2 " + c + "32.1/2 s4=0.5 m f b ");
}

TYPED_TEST(Binding, Environment) {
    SCENARIO("Environment");  // MKL_DISABLE_FAST_MM empty (counts as unset), KMP_BLOCKTIME 7
    using A = api<TypeParam>;
    EXPECT_EQ(got<uint32_t>(A::get), 0x3000u);
    EXPECT_STREQ(std::getenv("MKL_DISABLE_FAST_MM"), "YES");
    EXPECT_STREQ(std::getenv("KMP_BLOCKTIME"), "7");
    EXPECT_TRUE(got(A::blocktime) == 7 && (A::set_blocktime(25) + got(A::blocktime)) == 25);
}

}  // namespace
