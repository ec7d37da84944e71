// Power-of-two complex transforms against FFTW, measured side by side.
//
// Without arguments: for N = 2^8 .. 2^18 and both precisions, repetitions of
// our transform and FFTW's (FFTW_MEASURE plan) alternate, so that the drift
// of a shared machine affects both; the table gives median times per
// transform and the median of the per-repetition ratios.  Each repetition is
// a batch of forward + inverse round trips on the same buffer, refreshed from
// the input at the same interval for both (FFTW's unscaled pair grows by N).
// Then, the same way, vlxi_rfft against our complex transform (FFTW's r2c
// against its c2c beside it) and the chirp path of vlxi_dft against
// FFTW_ESTIMATE; --reps=K sets the repetitions (21).
// With --accuracy: relative L2 errors of both against a long-double transform.
// With --benchmark_* arguments: the Google Benchmark cases instead.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <complex>
#include <cstdio>
#include <cstring>
#include <random>
#include <string>
#include <type_traits>
#include <vector>

#ifdef VLX_HAVE_FFTW
#include <fftw3.h>
#endif

namespace {

template <class V>
struct Ops;
template <>
struct Ops<vlx_t> {
    using T = double;
    static void init(vlx_t* v) { vlx_init(v); }
    static void destroy(vlx_t* v) { vlx_destroy(v); }
    static int alloc(vlx_t* v) { return vlx_alloc(v); }
    static int fft(vlx_t* v, int inverse) { return vlxi_fft(v, inverse); }
    static int rfft(vlx_t* v) { return vlxi_rfft(v); }
    static int dft(vlx_t* v, int inverse) { return vlxi_dft(v, inverse); }
    static const char* name() { return "double"; }
};
template <>
struct Ops<vlxf_t> {
    using T = float;
    static void init(vlxf_t* v) { vlxf_init(v); }
    static void destroy(vlxf_t* v) { vlxf_destroy(v); }
    static int alloc(vlxf_t* v) { return vlxf_alloc(v); }
    static int fft(vlxf_t* v, int inverse) { return vlxfi_fft(v, inverse); }
    static int rfft(vlxf_t* v) { return vlxfi_rfft(v); }
    static int dft(vlxf_t* v, int inverse) { return vlxfi_dft(v, inverse); }
    static const char* name() { return "float"; }
};

template <class T>
std::vector<T> input(size_t scalars) {
    std::mt19937_64 rng(42);
    std::uniform_real_distribution<double> dist(-1.0, 1.0);
    std::vector<T> x(scalars);
    for (auto& s : x) s = static_cast<T>(dist(rng));
    return x;
}

// Our transform on a complex vector of n points, round trips at a time.
template <class V>
struct Ours {
    using T = typename Ops<V>::T;
    V v;
    std::vector<T> x;
    explicit Ours(size_t n) : x(input<T>(2 * n)) {
        Ops<V>::init(&v);
        v.points = static_cast<int32_t>(n);
        v.complex = 1;
        Ops<V>::alloc(&v);
        refresh();
    }
    ~Ours() { Ops<V>::destroy(&v); }
    void refresh() { std::memcpy(v.data, x.data(), x.size() * sizeof(T)); }
    void round_trip() {
        Ops<V>::fft(&v, 0);
        Ops<V>::fft(&v, 1);
    }
};

#ifdef VLX_HAVE_FFTW
template <class T>
struct Fftw;
template <>
struct Fftw<double> {
    fftw_complex* buf;
    fftw_plan fwd, inv;
    std::vector<double> x;
    explicit Fftw(size_t n) : x(input<double>(2 * n)) {
        buf = fftw_alloc_complex(n);
        fwd = fftw_plan_dft_1d(int(n), buf, buf, FFTW_FORWARD, FFTW_MEASURE);
        inv = fftw_plan_dft_1d(int(n), buf, buf, FFTW_BACKWARD, FFTW_MEASURE);
        refresh();
    }
    ~Fftw() {
        fftw_destroy_plan(fwd);
        fftw_destroy_plan(inv);
        fftw_free(buf);
    }
    void refresh() { std::memcpy(buf, x.data(), x.size() * sizeof(double)); }
    void round_trip() {
        fftw_execute(fwd);
        fftw_execute(inv);
    }
};
template <>
struct Fftw<float> {
    fftwf_complex* buf;
    fftwf_plan fwd, inv;
    std::vector<float> x;
    explicit Fftw(size_t n) : x(input<float>(2 * n)) {
        buf = fftwf_alloc_complex(n);
        fwd = fftwf_plan_dft_1d(int(n), buf, buf, FFTW_FORWARD, FFTW_MEASURE);
        inv = fftwf_plan_dft_1d(int(n), buf, buf, FFTW_BACKWARD, FFTW_MEASURE);
        refresh();
    }
    ~Fftw() {
        fftwf_destroy_plan(fwd);
        fftwf_destroy_plan(inv);
        fftwf_free(buf);
    }
    void refresh() { std::memcpy(buf, x.data(), x.size() * sizeof(float)); }
    void round_trip() {
        fftwf_execute(fwd);
        fftwf_execute(inv);
    }
};
#endif

// Round trips between refreshes: FFTW's unscaled pair multiplies by n, which
// must stay far from overflow in single precision.
int refresh_interval(int m) { return std::max(1, 60 / m); }

template <class Engine>
double time_batch(Engine& e, int trips, int m) {
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < trips; ++i) {
        if (i % refresh_interval(m) == 0) e.refresh();
        e.round_trip();
    }
    const std::chrono::duration<double> d = std::chrono::steady_clock::now() - start;
    return d.count() / (2.0 * trips);  // seconds per transform
}

double median(std::vector<double> v) {
    std::sort(v.begin(), v.end());
    const size_t h = v.size() / 2;
    return v.size() % 2 ? v[h] : 0.5 * (v[h - 1] + v[h]);
}

template <class V>
void interleaved_table(int reps) {
    using T [[maybe_unused]] = typename Ops<V>::T;
    std::printf("\ncomplex %s, seconds per transform (median of %d interleaved repetitions)\n", Ops<V>::name(), reps);
    std::printf("%8s %12s %12s %10s\n", "N", "libvlx", "FFTW", "ratio");
    for (int m = 8; m <= 18; ++m) {
        const size_t n = size_t(1) << m;
        Ours<V> ours(n);
#ifdef VLX_HAVE_FFTW
        Fftw<T> peer(n);
#endif
        // about 2 ms of our transform per batch
        ours.round_trip();
        const double once = time_batch(ours, 4, m);
        const int trips = std::max(1, int(1e-3 / std::max(once, 1e-9)));
        std::vector<double> mine, theirs, ratio;
        for (int r = 0; r < reps; ++r) {
#ifdef VLX_HAVE_FFTW
            // alternate who goes first
            double a, b;
            if (r % 2 == 0) {
                a = time_batch(ours, trips, m);
                b = time_batch(peer, trips, m);
            } else {
                b = time_batch(peer, trips, m);
                a = time_batch(ours, trips, m);
            }
            mine.push_back(a);
            theirs.push_back(b);
            ratio.push_back(a / b);
#else
            mine.push_back(time_batch(ours, trips, m));
#endif
        }
#ifdef VLX_HAVE_FFTW
        std::printf("%8zu %12.3e %12.3e %10.2f\n", n, median(mine), median(theirs), median(ratio));
#else
        std::printf("%8zu %12.3e %12s %10s\n", n, median(mine), "-", "-");
#endif
        std::fflush(stdout);
    }
}

// One forward transform per call, each from a fresh copy of the input (the
// copy is inside the timing for every engine): ours of n complex points, of
// n reals (vlxi_rfft), and of any length (vlxi_dft); FFTW's c2c and r2c.
template <class V>
struct OursOnce {
    using T = typename Ops<V>::T;
    V v;
    std::vector<T> x;
    int kind;  // 0 complex fft, 1 rfft, 2 dft
    size_t n;
    OursOnce(size_t n_, int kind_) : x(input<T>(kind_ == 1 ? n_ : 2 * n_)), kind(kind_), n(n_) {
        Ops<V>::init(&v);
        v.points = static_cast<int32_t>(n);
        v.complex = 1;
        Ops<V>::alloc(&v);
    }
    ~OursOnce() { Ops<V>::destroy(&v); }
    void call() {
        v.points = static_cast<int32_t>(n);
        v.complex = kind == 1 ? 0 : 1;
        std::memcpy(v.data, x.data(), x.size() * sizeof(T));
        if (kind == 0) Ops<V>::fft(&v, 0);
        if (kind == 1) Ops<V>::rfft(&v);
        if (kind == 2) Ops<V>::dft(&v, 0);
    }
};

#ifdef VLX_HAVE_FFTW
// kind 0 c2c in place, 1 r2c out of place; flags FFTW_MEASURE or FFTW_ESTIMATE.
struct FftwOnce {
    double* in;
    fftw_complex* out;
    fftw_plan plan;
    std::vector<double> x;
    FftwOnce(size_t n, int kind, unsigned flags) : x(input<double>(kind == 1 ? n : 2 * n)) {
        in = fftw_alloc_real(2 * n);
        out = fftw_alloc_complex(n / 2 + 1);
        auto* c = reinterpret_cast<fftw_complex*>(in);
        plan = kind == 1 ? fftw_plan_dft_r2c_1d(int(n), in, out, flags)
                         : fftw_plan_dft_1d(int(n), c, c, FFTW_FORWARD, flags);
    }
    ~FftwOnce() {
        fftw_destroy_plan(plan);
        fftw_free(in);
        fftw_free(out);
    }
    void call() {
        std::memcpy(in, x.data(), x.size() * sizeof(double));
        fftw_execute(plan);
    }
};
#endif

template <class E>
double time_calls(E& e, int calls) {
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < calls; ++i) e.call();
    const std::chrono::duration<double> d = std::chrono::steady_clock::now() - start;
    return d.count() / calls;
}

// Median times of a and b, and the median of their per-repetition ratios,
// alternating who goes first; batches of about 1 ms.
template <class A, class B>
void interleave(A& a, B& b, int reps, double out[3]) {
    a.call();
    b.call();
    const int calls = std::max(1, int(1e-3 / std::max(time_calls(a, 4), 1e-9)));
    std::vector<double> ta, tb, ratio;
    for (int r = 0; r < reps; ++r) {
        double x, y;
        if (r % 2 == 0) {
            x = time_calls(a, calls);
            y = time_calls(b, calls);
        } else {
            y = time_calls(b, calls);
            x = time_calls(a, calls);
        }
        ta.push_back(x);
        tb.push_back(y);
        ratio.push_back(x / y);
    }
    out[0] = median(ta);
    out[1] = median(tb);
    out[2] = median(ratio);
}

// vlxi_rfft against our complex transform of the same n; beside it FFTW's
// r2c against its c2c (both FFTW_MEASURE), double precision.
void real_table(int reps) {
    std::printf("\nreal double, seconds per forward transform incl. input copy (median of %d interleaved)\n", reps);
    std::printf("%8s %12s %12s %8s %12s %12s %8s\n", "N", "vlxi_rfft", "vlxi_fft", "ratio", "FFTW r2c", "FFTW c2c",
                "ratio");
    for (int m = 8; m <= 18; ++m) {
        const size_t n = size_t(1) << m;
        OursOnce<vlx_t> real(n, 1), cplx(n, 0);
        double ours[3];
        interleave(real, cplx, reps, ours);
#ifdef VLX_HAVE_FFTW
        FftwOnce r2c(n, 1, FFTW_MEASURE), c2c(n, 0, FFTW_MEASURE);
        double theirs[3];
        interleave(r2c, c2c, reps, theirs);
        std::printf("%8zu %12.3e %12.3e %8.2f %12.3e %12.3e %8.2f\n", n, ours[0], ours[1], ours[2], theirs[0],
                    theirs[1], theirs[2]);
#else
        std::printf("%8zu %12.3e %12.3e %8.2f\n", n, ours[0], ours[1], ours[2]);
#endif
        std::fflush(stdout);
    }
}

// The chirp path of vlxi_dft against FFTW_ESTIMATE of the same length, double.
void chirp_table(int reps) {
#ifdef VLX_HAVE_FFTW
    std::printf("\nvlxi_dft (chirp), double, seconds per forward transform incl. input copy (median of %d interleaved)\n",
                reps);
    std::printf("%8s %12s %12s %8s\n", "N", "vlxi_dft", "FFTW est.", "ratio");
    for (size_t n : {size_t(1000), size_t(10007), size_t(100003)}) {
        OursOnce<vlx_t> ours(n, 2);
        FftwOnce peer(n, 0, FFTW_ESTIMATE);
        double t[3];
        interleave(ours, peer, reps, t);
        std::printf("%8zu %12.3e %12.3e %8.2f\n", n, t[0], t[1], t[2]);
        std::fflush(stdout);
    }
#else
    (void)reps;
#endif
}

using cld = std::complex<long double>;

// Long-double radix 2 with each twiddle from the math library, forward, 1/N.
void exact_forward(std::vector<cld>& x) {
    const size_t n = x.size();
    if (n == 1) return;
    std::vector<cld> even(n / 2), odd(n / 2);
    for (size_t j = 0; j < n / 2; ++j) even[j] = x[2 * j], odd[j] = x[2 * j + 1];
    exact_forward(even);
    exact_forward(odd);
    const long double two_pi = 6.283185307179586476925286766559L;
    for (size_t k = 0; k < n / 2; ++k) {
        const cld t = std::polar(1.0L, -two_pi * k / n) * odd[k];
        x[k] = (even[k] + t) / 2.0L;
        x[k + n / 2] = (even[k] - t) / 2.0L;
    }
}

template <class T>
long double rel_l2(const T* got, const std::vector<cld>& want) {
    long double num = 0, den = 0;
    for (size_t k = 0; k < want.size(); ++k) {
        const long double dr = got[2 * k] - want[k].real(), di = got[2 * k + 1] - want[k].imag();
        num += dr * dr + di * di;
        den += std::norm(want[k]);
    }
    return std::sqrt(num / den);
}

template <class V>
void accuracy_table() {
    using T [[maybe_unused]] = typename Ops<V>::T;
    std::printf("\ncomplex %s forward, relative L2 error against long double\n", Ops<V>::name());
    std::printf("%8s %12s %12s\n", "N", "libvlx", "FFTW");
    for (int m = 6; m <= 20; m += 2) {
        const size_t n = size_t(1) << m;
        Ours<V> ours(n);
        std::vector<cld> want(n);
        for (size_t k = 0; k < n; ++k) want[k] = cld(ours.x[2 * k], ours.x[2 * k + 1]);
        exact_forward(want);
        Ops<V>::fft(&ours.v, 0);
        const long double mine = rel_l2(ours.v.data, want);
#ifdef VLX_HAVE_FFTW
        Fftw<T> peer(n);
        peer.refresh();
        if constexpr (std::is_same_v<T, double>) fftw_execute(peer.fwd); else fftwf_execute(peer.fwd);
        T* y = reinterpret_cast<T*>(peer.buf);
        for (size_t i = 0; i < 2 * n; ++i) y[i] = y[i] * (T(1) / T(n));  // exact: a power of two
        std::printf("%8zu %12.2e %12.2e\n", n, double(mine), double(rel_l2(y, want)));
#else
        std::printf("%8zu %12.2e %12s\n", n, double(mine), "-");
#endif
    }
}

template <class V>
void bm_fft(benchmark::State& state) {
    Ours<V> ours(size_t(state.range(0)));
    int m = 0;
    while ((int64_t(1) << m) < state.range(0)) ++m;
    int i = 0;
    for (auto _ : state) {
        if (i++ % refresh_interval(m) == 0) ours.refresh();
        ours.round_trip();
    }
    state.SetItemsProcessed(2 * state.iterations());
}
BENCHMARK(bm_fft<vlx_t>)->RangeMultiplier(4)->Range(1 << 6, 1 << 20);
BENCHMARK(bm_fft<vlxf_t>)->RangeMultiplier(4)->Range(1 << 6, 1 << 20);

#ifdef VLX_HAVE_FFTW
template <class T>
void bm_fftw(benchmark::State& state) {
    Fftw<T> peer(size_t(state.range(0)));
    int m = 0;
    while ((int64_t(1) << m) < state.range(0)) ++m;
    int i = 0;
    for (auto _ : state) {
        if (i++ % refresh_interval(m) == 0) peer.refresh();
        peer.round_trip();
    }
    state.SetItemsProcessed(2 * state.iterations());
}
BENCHMARK(bm_fftw<double>)->RangeMultiplier(4)->Range(1 << 6, 1 << 20);
BENCHMARK(bm_fftw<float>)->RangeMultiplier(4)->Range(1 << 6, 1 << 20);
#endif

}  // namespace

int main(int argc, char** argv) {
    bool gbench = false;
    int reps = 21;
    for (int i = 1; i < argc; ++i) {
        if (std::strncmp(argv[i], "--benchmark", 11) == 0) gbench = true;
        if (std::strncmp(argv[i], "--reps=", 7) == 0) reps = std::max(1, std::atoi(argv[i] + 7));
    }
    if (gbench) {
        benchmark::Initialize(&argc, argv);
        benchmark::RunSpecifiedBenchmarks();
        benchmark::Shutdown();
        return 0;
    }
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "--accuracy") == 0) {
            accuracy_table<vlx_t>();
            accuracy_table<vlxf_t>();
            return 0;
        }
    }
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "--real") == 0) {
            real_table(reps);
            return 0;
        }
    }
    interleaved_table<vlx_t>(reps);
    interleaved_table<vlxf_t>(reps);
    real_table(reps);
    chirp_table(reps);
    return 0;
}
