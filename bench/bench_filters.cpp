// FIR filters and the resampler against liquid-dsp, measured side by side.
//
// Without arguments: each row alternates repetitions of our call and the
// peer's on the same 1M samples (who goes first alternates too), timed in
// thread CPU time so that the other loads of a shared machine fall on both;
// the table gives median seconds and the median of the per-repetition
// ratios (peer time / our time: above 1 means we are faster).  Then the
// resamplers' passband error and image rejection on tones.
// With --benchmark_* arguments: the Google Benchmark cases instead.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#ifdef VLX_HAVE_LIQUID
#include <liquid/liquid.h>
#endif
#ifdef VLX_HAVE_FFTW
#include <fftw3.h>
#endif

#include <time.h>

#include <algorithm>
#include <cmath>
#include <complex>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <random>
#include <type_traits>
#include <vector>

namespace {

constexpr int32_t kPoints = 1000000;

template <class V>
struct Ops;
template <>
struct Ops<vlx_t> {
    using T = double;
    static const char* name() { return "double"; }
    static int32_t init(vlx_t* v) { return vlx_init(v); }
    static int32_t alloc(vlx_t* v) { return vlx_alloc(v); }
    static int32_t destroy(vlx_t* v) { return vlx_destroy(v); }
    static int32_t fir(vlx_t* a, vlx_t* b, vlx_t* h, vlx_t* s) { return vlxd_fir(a, b, h, s); }
    static int32_t sfir(vlx_t* a, vlx_t* b, vlx_t* h, vlx_t* s) { return vlxd_sfir(a, b, h, 1, 0, s); }
    static int32_t sfir_deci(vlx_t* a, vlx_t* b, vlx_t* h, vlx_t* s) { return vlxd_sfir_deci(a, b, h, 1, 0, 2, s); }
    static int32_t table(vlx_t* v, int32_t d) { return vlxc_rsmp(v, d); }
    static int32_t rsmp(vlx_t* a, vlx_t* b, vlx_t* c, double r) { return vlxd_rsmp(a, b, 1, c, r, nullptr); }
};
template <>
struct Ops<vlxf_t> {
    using T = float;
    static const char* name() { return "float"; }
    static int32_t init(vlxf_t* v) { return vlxf_init(v); }
    static int32_t alloc(vlxf_t* v) { return vlxf_alloc(v); }
    static int32_t destroy(vlxf_t* v) { return vlxf_destroy(v); }
    static int32_t fir(vlxf_t* a, vlxf_t* b, vlxf_t* h, vlxf_t* s) { return vlxfd_fir(a, b, h, s); }
    static int32_t sfir(vlxf_t* a, vlxf_t* b, vlxf_t* h, vlxf_t* s) { return vlxfd_sfir(a, b, h, 1, 0, s); }
    static int32_t sfir_deci(vlxf_t* a, vlxf_t* b, vlxf_t* h, vlxf_t* s) { return vlxfd_sfir_deci(a, b, h, 1, 0, 2, s); }
    static int32_t table(vlxf_t* v, int32_t d) { return vlxfc_rsmp(v, d); }
    static int32_t rsmp(vlxf_t* a, vlxf_t* b, vlxf_t* c, double r) { return vlxfd_rsmp(a, b, 1, c, float(r), nullptr); }
};

// A vector of the library holding values.
template <class V>
struct Vector {
    V v;
    explicit Vector(const std::vector<double>& x = {}) {
        Ops<V>::init(&v);
        v.points = int32_t(x.size());
        Ops<V>::alloc(&v);
        for (size_t i = 0; i < x.size(); ++i) v.data[i] = typename Ops<V>::T(x[i]);
    }
    ~Vector() { Ops<V>::destroy(&v); }
};

std::vector<double> noise(size_t n, uint32_t seed) {
    std::mt19937_64 rng(seed);
    std::uniform_real_distribution<double> dist(-1, 1);
    std::vector<double> x(static_cast<size_t>(n));
    for (auto& s : x) s = dist(rng);
    return x;
}

// Windowed-sinc low-pass of n taps, cutoff fc cycles per sample.
std::vector<double> lowpass(int n, double fc) {
    std::vector<double> h(static_cast<size_t>(n));
    for (int i = 0; i < n; ++i) {
        const double t = i - (n - 1) / 2.0, w = 0.54 - 0.46 * std::cos(2 * M_PI * i / (n - 1));
        h[size_t(i)] = w * (t == 0 ? 2 * fc : std::sin(2 * M_PI * fc * t) / (M_PI * t));
    }
    return h;
}

double cpu_seconds() {
    timespec ts;
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
    return double(ts.tv_sec) + 1e-9 * double(ts.tv_nsec);
}

double timed(const std::function<void()>& f) {
    const double start = cpu_seconds();
    f();
    return cpu_seconds() - start;
}

double median(std::vector<double> v) {
    std::sort(v.begin(), v.end());
    const size_t h = v.size() / 2;
    return v.size() % 2 ? v[h] : 0.5 * (v[h - 1] + v[h]);
}

void row(const char* what, int reps, const std::function<void()>& ours, const std::function<void()>& peer) {
    ours(), peer();  // warm caches and plans
    std::vector<double> a, b, ratio;
    for (int r = 0; r < reps; ++r) {
        double x, y;
        if (r % 2 == 0) {
            x = timed(ours), y = timed(peer);
        } else {
            y = timed(peer), x = timed(ours);
        }
        a.push_back(x), b.push_back(y), ratio.push_back(y / x);
    }
    std::printf("%-52s %10.2f %10.2f %8.2f\n", what, 1e3 * median(a), 1e3 * median(b), median(ratio));
    std::fflush(stdout);
}

const std::function<void()> none = [] {};

template <class V>
void speed_table(int reps) {
    using T = typename Ops<V>::T;
    std::printf("\n%s, 1M samples, ms (median of %d interleaved repetitions); ratio = peer / ours\n", Ops<V>::name(),
                reps);
    std::printf("%-52s %10s %10s %8s\n", "case", "libvlx", "peer", "ratio");
    const auto x = noise(kPoints, 1);
    Vector<V> in(x), out;
    std::vector<float> xf(x.begin(), x.end()), yf(xf.size() + 16);
    for (int taps : {45, 63, 255}) {
        Vector<V> h(lowpass(taps, 0.2));
        std::vector<float> hf(h.v.data, h.v.data + taps);
        char label[96];
        std::snprintf(label, sizeof label, "vlxd_fir real, %d taps (%s) / firfilt_rrrf", taps,
                      taps < 46 ? "direct" : "fast convolution");
        auto ours = [&] { Ops<V>::fir(&in.v, &out.v, &h.v, nullptr); };
#ifdef VLX_HAVE_LIQUID
        firfilt_rrrf q = firfilt_rrrf_create(hf.data(), unsigned(taps));
        row(label, reps, ours, [&] { firfilt_rrrf_execute_block(q, xf.data(), unsigned(kPoints), yf.data()); });
        firfilt_rrrf_destroy(q);
        if (taps == 255) {
            const unsigned block = 4096;
            fftfilt_rrrf f = fftfilt_rrrf_create(hf.data(), unsigned(taps), block);
            row("vlxd_fir real, 255 taps / fftfilt_rrrf (4096 blocks)", reps, ours, [&] {
                for (unsigned i = 0; i + block <= unsigned(kPoints); i += block) fftfilt_rrrf_execute(f, xf.data() + i, yf.data() + i);
            });
            fftfilt_rrrf_destroy(f);
        }
#ifdef VLX_HAVE_FFTW
        // What the fast path's transforms cost at FFTW's pace: the length is
        // the block's (2^20 here), the forward is real and the inverse runs
        // on the full complex spectrum.  Only the double twin needs this row.
        if (std::is_same_v<T, double> && taps != 45) {
            const int nfft = 1 << 20;
            double* a = fftw_alloc_real(2 * size_t(nfft));
            fftw_complex* c = fftw_alloc_complex(size_t(nfft));
            fftw_plan fwd = fftw_plan_dft_r2c_1d(nfft, a, reinterpret_cast<fftw_complex*>(a), FFTW_MEASURE);
            fftw_plan inv = fftw_plan_dft_1d(nfft, c, c, FFTW_BACKWARD, FFTW_MEASURE);
            auto fftw_path = [&] {
                std::copy(x.begin(), x.end(), a);
                std::fill(a + kPoints, a + nfft, 0.0);
                fftw_execute(fwd);
                for (int i = 0; i <= nfft / 2; ++i) c[i][0] = a[2 * i], c[i][1] = a[2 * i + 1];
                for (int i = nfft / 2 + 1; i < nfft; ++i) c[i][0] = c[nfft - i][0], c[i][1] = -c[nfft - i][1];
                fftw_execute(inv);
            };
            std::snprintf(label, sizeof label, "  FFTW r2c + c2c of 2^20 (double) / %s",
                          taps == 63 ? "firfilt_rrrf" : "fftfilt_rrrf");
            if (taps == 63) {
                firfilt_rrrf q2 = firfilt_rrrf_create(hf.data(), unsigned(taps));
                row(label, reps, fftw_path, [&] { firfilt_rrrf_execute_block(q2, xf.data(), unsigned(kPoints), yf.data()); });
                firfilt_rrrf_destroy(q2);
            } else {
                fftfilt_rrrf f = fftfilt_rrrf_create(hf.data(), unsigned(taps), 4096);
                row(label, reps, fftw_path, [&] {
                    for (unsigned i = 0; i + 4096 <= unsigned(kPoints); i += 4096) fftfilt_rrrf_execute(f, xf.data() + i, yf.data() + i);
                });
                fftfilt_rrrf_destroy(f);
            }
            fftw_destroy_plan(fwd), fftw_destroy_plan(inv);
            fftw_free(a), fftw_free(c);
        }
#endif
#else
        row(label, reps, ours, none);
#endif
    }
    {
        Vector<V> half(lowpass(39, 0.25));
        half.v.points = 20;  // first half and centre of the 39-tap half-band
        row("vlxd_sfir_deci by 2, 39 taps / vlxd_sfir", reps, [&] { Ops<V>::sfir_deci(&in.v, &out.v, &half.v, nullptr); },
            [&] { Ops<V>::sfir(&in.v, &out.v, &half.v, nullptr); });
    }
    {
        Vector<V> table;
        table.v.points = 13314;
        Ops<V>::table(&table.v, 4);
        const double ratio = 0.91875;
        auto ours = [&] {
            out.v.points = int32_t(kPoints / ratio) + 2;
            Ops<V>::rsmp(&in.v, &out.v, &table.v, ratio);
        };
#ifdef VLX_HAVE_LIQUID
        std::vector<float> yr(size_t(kPoints / ratio) + 64);
        row("vlxd_rsmp method 1, design 4, ratio 0.91875 / resamp_rrrf", reps, ours, [&] {
            resamp_rrrf q = resamp_rrrf_create(float(1 / ratio), 7, 0.45f, 60.0f, 64);
            unsigned ny = 0;
            resamp_rrrf_execute_block(q, xf.data(), unsigned(kPoints), yr.data(), &ny);
            resamp_rrrf_destroy(q);
        });
#else
        row("vlxd_rsmp method 1, design 4, ratio 0.91875", reps, ours, none);
#endif
        (void)sizeof(T);
    }
}

// Amplitude of frequency f (cycles per sample) in y by a Hann-weighted
// correlation, relative to a unit sine.
double tone_amplitude(const float* y, size_t n, double f) {
    std::complex<double> acc = 0;
    double wsum = 0;
    for (size_t i = 0; i < n; ++i) {
        const double w = 0.5 - 0.5 * std::cos(2 * M_PI * double(i) / double(n - 1));
        acc += w * double(y[i]) * std::polar(1.0, -2 * M_PI * f * double(i));
        wsum += w;
    }
    return 2 * std::abs(acc) / wsum;
}

// A tone through each resampler at ratio 0.91875 (a rise of the rate): the
// gain at the tone, and the image that a tone near the input's Nyquist
// leaves inside the new band (f_in -> 1 - f_in).
void quality_table() {
    const double ratio = 0.91875;
    const size_t n = 1 << 16, skip = 256;
    std::printf("\nresamplers, float, ratio %.5f: passband gain (dB) and image level (dB below the tone)\n", ratio);
    std::printf("%-28s %12s %12s %12s %12s\n", "", "gain 0.05", "gain 0.2", "gain 0.4", "image 0.47");
    vlxf_t table;
    vlxf_init(&table);
    table.points = 13314;
    vlxfc_rsmp(&table, 4);
    for (int who = 0; who < 2; ++who) {
        double cols[4];
        int c = 0;
        for (double f : {0.05, 0.2, 0.4, 0.47}) {
            std::vector<float> x(n), y(size_t(double(n) / ratio) + 64);
            for (size_t i = 0; i < n; ++i) x[i] = float(std::sin(2 * M_PI * f * double(i)));
            size_t ny = 0;
            if (who == 0) {
                vlxf_t in, out;
                vlxf_init(&in), vlxf_init(&out);
                in.points = int32_t(n), vlxf_alloc(&in);
                std::copy(x.begin(), x.end(), in.data);
                out.points = int32_t(y.size());
                vlxfd_rsmp(&in, &out, 1, &table, float(ratio), nullptr);
                ny = size_t(out.points);
                std::copy(out.data, out.data + ny, y.begin());
                vlxf_destroy(&in), vlxf_destroy(&out);
            } else {
#ifdef VLX_HAVE_LIQUID
                resamp_rrrf q = resamp_rrrf_create(float(1 / ratio), 7, 0.45f, 60.0f, 64);
                unsigned got = 0;
                resamp_rrrf_execute_block(q, x.data(), unsigned(n), y.data(), &got);
                resamp_rrrf_destroy(q);
                ny = got;
#endif
            }
            if (ny <= 2 * skip) {
                cols[c++] = NAN;
                continue;
            }
            const double fo = f * ratio;  // the tone in output cycles per sample
            const double tone = tone_amplitude(y.data() + skip, ny - 2 * skip, fo);
            cols[c++] = f < 0.46 ? 20 * std::log10(tone)
                                 : 20 * std::log10(tone / tone_amplitude(y.data() + skip, ny - 2 * skip, (1 - f) * ratio));
        }
        std::printf("%-28s %12.3f %12.3f %12.3f %12.1f\n", who == 0 ? "vlxfd_rsmp design 4, method 1" : "resamp_rrrf m 7, 60 dB",
                    cols[0], cols[1], cols[2], cols[3]);
    }
    vlxf_destroy(&table);
}

void BM_fir63(benchmark::State& state) {
    const auto x = noise(kPoints, 1);
    Vector<vlx_t> in(x), out, h(lowpass(63, 0.2));
    for (auto _ : state) vlxd_fir(&in.v, &out.v, &h.v, nullptr);
    state.SetItemsProcessed(state.iterations() * kPoints);
}

}  // namespace

BENCHMARK(BM_fir63)->Unit(benchmark::kMillisecond);

int main(int argc, char** argv) {
    int reps = 7;
    bool gbench = false;
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
    speed_table<vlx_t>(reps);
    speed_table<vlxf_t>(reps);
    quality_table();
    return 0;
}
