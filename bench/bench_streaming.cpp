// The streaming resampler against soxr (high-quality recipe) and
// libsamplerate, and the spectrum pipeline against FFTW's real transform with
// a window multiplication, timed in one run with the repetitions interleaved.
//
// Resampling: 10 s of 48 kHz noise to 44.1 kHz and back, in 4096-sample
// blocks; throughput in input samples per second over both directions.
// Quality, beside the speed: a 1 kHz tone's level error after 48 to 44.1 kHz,
// and the level of a 23 kHz tone's alias (21.1 kHz) in the 44.1 kHz output.
// Spectrum: vlxh_fft of a 65536-point real record with the Hann window, and
// FFTW's r2c (FFTW_MEASURE) of a copy multiplied by a stored Hann window.
// Google Benchmark provides DoNotOptimize; the tables are printed by main.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <complex>
#include <cstdio>
#include <cstring>
#include <cstdlib>
#include <functional>
#include <memory>
#include <random>
#include <vector>

#ifdef VLX_HAVE_SOXR
#include <soxr.h>
#endif
#ifdef VLX_HAVE_SAMPLERATE
#include <samplerate.h>
#endif
#ifdef VLX_HAVE_FFTW
#include <fftw3.h>
#endif

namespace {

constexpr double rate_a = 48000, rate_b = 44100;
constexpr size_t block = 4096;

template <class T>
struct Fam;
template <>
struct Fam<double> {
    using V = vlx_t;
    using Coef = vlxh_rsmp_coef_t;
    using State = vlxh_rsmp_state_t;
    static constexpr auto init = vlx_init, destroy = vlx_destroy, alloc = vlx_alloc;
    static constexpr auto coef_init = vlxh_rsmp_coef_init, coef_alloc = vlxh_rsmp_coef_alloc,
                          coef_setup = vlxh_rsmp_coef_setup, coef_destroy = vlxh_rsmp_coef_destroy,
                          state_init = vlxh_rsmp_state_init, state_reset = vlxh_rsmp_state_reset,
                          state_destroy = vlxh_rsmp_state_destroy, out_pts = vlxh_rsmp_get_out_pts, run = vlxh_rsmp;
    static constexpr auto fft = vlxh_fft;
    static const char* name() { return "double"; }
};
template <>
struct Fam<float> {
    using V = vlxf_t;
    using Coef = vlxfh_rsmp_coef_t;
    using State = vlxfh_rsmp_state_t;
    static constexpr auto init = vlxf_init, destroy = vlxf_destroy, alloc = vlxf_alloc;
    static constexpr auto coef_init = vlxfh_rsmp_coef_init, coef_alloc = vlxfh_rsmp_coef_alloc,
                          coef_setup = vlxfh_rsmp_coef_setup, coef_destroy = vlxfh_rsmp_coef_destroy,
                          state_init = vlxfh_rsmp_state_init, state_reset = vlxfh_rsmp_state_reset,
                          state_destroy = vlxfh_rsmp_state_destroy, out_pts = vlxfh_rsmp_get_out_pts, run = vlxfh_rsmp;
    static constexpr auto fft = vlxfh_fft;
    static const char* name() { return "float"; }
};

// A streaming converter from rate `from` to rate `to`, fed block by block.
template <class T>
struct Converter {
    virtual ~Converter() = default;
    virtual void reset() = 0;
    virtual void push(const T* x, size_t n, std::vector<T>& out) = 0;
};

template <class T>
struct Ours final : Converter<T> {
    using F = Fam<T>;
    typename F::Coef coef;
    typename F::State state;
    typename F::V in, out, work;
    Ours(double from, double to) {
        F::coef_init(&coef), F::coef_alloc(&coef, 0), F::coef_setup(&coef, T(from / to), 0, 0);
        F::state_init(&state), F::init(&in), F::init(&out), F::init(&work);
        reset();
    }
    ~Ours() override {
        F::state_destroy(&state), F::coef_destroy(&coef), F::destroy(&in), F::destroy(&out), F::destroy(&work);
    }
    void reset() override { F::state_reset(&coef, &state); }
    void push(const T* x, size_t n, std::vector<T>& o) override {
        in.points = int32_t(n);
        F::alloc(&in);
        std::memcpy(in.data, x, n * sizeof(T));
        int32_t limit = 0;
        F::out_pts(&limit, &coef, int32_t(n), 0, 0);
        out.points = limit;
        F::run(&in, &out, &work, &coef, &state);
        o.insert(o.end(), out.data, out.data + out.points);
    }
};

#ifdef VLX_HAVE_SOXR
template <class T>
struct Soxr final : Converter<T> {
    soxr_t s;
    std::vector<T> buf;
    Soxr(double from, double to) : buf(block * 2) {
        const auto type = sizeof(T) == 8 ? SOXR_FLOAT64_I : SOXR_FLOAT32_I;
        const soxr_io_spec_t io = soxr_io_spec(type, type);
        const soxr_quality_spec_t q = soxr_quality_spec(SOXR_HQ, 0);
        s = soxr_create(from, to, 1, nullptr, &io, &q, nullptr);
    }
    ~Soxr() override { soxr_delete(s); }
    void reset() override { soxr_clear(s); }
    void push(const T* x, size_t n, std::vector<T>& o) override {
        size_t done_in = 0, done_out = 0;
        soxr_process(s, x, n, &done_in, buf.data(), buf.size(), &done_out);
        o.insert(o.end(), buf.begin(), buf.begin() + long(done_out));
    }
};
#endif

#ifdef VLX_HAVE_SAMPLERATE
// libsamplerate converts float samples; the double run converts at its edges.
template <class T>
struct Src final : Converter<T> {
    SRC_STATE* s;
    double ratio;
    std::vector<float> fin, fout;
    Src(double from, double to) : ratio(to / from), fin(block), fout(block * 2) {
        int err = 0;
        s = src_new(SRC_SINC_MEDIUM_QUALITY, 1, &err);
    }
    ~Src() override { src_delete(s); }
    void reset() override { src_reset(s); }
    void push(const T* x, size_t n, std::vector<T>& o) override {
        std::copy(x, x + n, fin.begin());
        SRC_DATA d{};
        d.data_in = fin.data(), d.input_frames = long(n), d.data_out = fout.data();
        d.output_frames = long(fout.size()), d.src_ratio = ratio;
        src_process(s, &d);
        o.insert(o.end(), fout.begin(), fout.begin() + d.output_frames_gen);
    }
};
#endif

template <class T>
void feed(Converter<T>& c, const std::vector<T>& x, std::vector<T>& out) {
    out.clear();
    c.reset();
    for (size_t at = 0; at < x.size(); at += block) c.push(x.data() + at, std::min(block, x.size() - at), out);
}

// Level in dB of a tone of frequency f (cycles per sample) in y, from the
// Hann-weighted projection of the middle half.
template <class T>
double tone_db(const std::vector<T>& y, double f) {
    const size_t a = y.size() / 4, b = 3 * y.size() / 4;
    std::complex<double> z = 0;
    double w = 0;
    for (size_t j = a; j < b; ++j) {
        const double h = 1 - std::cos(2 * M_PI * double(j - a) / double(b - a));
        z += h * double(y[j]) * std::polar(1.0, -2 * M_PI * f * double(j));
        w += h;
    }
    return 20 * std::log10(2 * std::abs(z) / w);
}

double median(std::vector<double> v) {
    std::sort(v.begin(), v.end());
    return v[v.size() / 2];
}

double seconds(const std::function<void()>& f) {
    const auto t0 = std::chrono::steady_clock::now();
    f();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - t0).count();
}

template <class T>
void resampler_table(int reps) {
    struct Peer {
        const char* name;
        std::unique_ptr<Converter<T>> down, up;
    };
    std::vector<Peer> peers;
    peers.push_back({"libvlx", std::make_unique<Ours<T>>(rate_a, rate_b), std::make_unique<Ours<T>>(rate_b, rate_a)});
#ifdef VLX_HAVE_SOXR
    peers.push_back({"soxr HQ", std::make_unique<Soxr<T>>(rate_a, rate_b), std::make_unique<Soxr<T>>(rate_b, rate_a)});
#endif
#ifdef VLX_HAVE_SAMPLERATE
    peers.push_back({"libsamplerate medium", std::make_unique<Src<T>>(rate_a, rate_b), std::make_unique<Src<T>>(rate_b, rate_a)});
#endif
    std::mt19937_64 rng(1);
    std::uniform_real_distribution<double> dist(-0.5, 0.5);
    std::vector<T> noise(size_t(10 * rate_a)), mid, back;
    for (auto& s : noise) s = T(dist(rng));
    std::vector<std::vector<double>> times(peers.size());
    for (int r = 0; r < reps; ++r)
        for (size_t p = 0; p < peers.size(); ++p) {
            const size_t i = (p + size_t(r)) % peers.size();  // rotate who goes first
            times[i].push_back(seconds([&] {
                feed(*peers[i].down, noise, mid);
                feed(*peers[i].up, mid, back);
                benchmark::DoNotOptimize(back.data());
            }));
        }
    std::printf("\n%s: 10 s at 48 kHz to 44.1 kHz and back, blocks of 4096 (median of %d)\n", Fam<T>::name(), reps);
    std::printf("| %-22s | %12s | %10s | %14s | %14s |\n", "converter", "Msamples/s", "vs soxr", "1 kHz error dB", "23 kHz alias dB");
    std::vector<T> tone(size_t(2 * rate_a)), hf(tone.size()), out;
    for (size_t i = 0; i < tone.size(); ++i)
        tone[i] = T(std::cos(2 * M_PI * 1000 / rate_a * double(i))), hf[i] = T(std::cos(2 * M_PI * 23000 / rate_a * double(i)));
    const double soxr_time = peers.size() > 1 ? median(times[1]) : 0;
    for (size_t p = 0; p < peers.size(); ++p) {
        const double t = median(times[p]), total = double(noise.size() + mid.size());
        feed(*peers[p].down, tone, out);
        const double err = tone_db(out, 1000 / rate_b);
        feed(*peers[p].down, hf, out);
        const double alias = tone_db(out, (rate_b - 23000) / rate_b);
        std::printf("| %-22s | %12.1f | %10.2f | %+14.4f | %14.1f |\n", peers[p].name, total / t * 1e-6,
                    soxr_time > 0 ? soxr_time / t : 0.0, err, alias);
    }
}

template <class T>
void spectrum_table(int reps) {
    using F = Fam<T>;
    const int32_t n = 65536;
    std::mt19937_64 rng(2);
    std::uniform_real_distribution<double> dist(-1, 1);
    typename F::V in, out;
    F::init(&in), F::init(&out);
    in.points = n;
    F::alloc(&in);
    for (int32_t i = 0; i < n; ++i) in.data[i] = T(dist(rng));
    std::vector<double> mine, theirs, ratio;
#ifdef VLX_HAVE_FFTW
    std::vector<T> window(n);
    for (int32_t i = 0; i < n; ++i) window[i] = T(1 - std::cos(2 * M_PI * i / n));
    constexpr bool dbl = sizeof(T) == 8;
    T* buf = static_cast<T*>(dbl ? (void*)fftw_alloc_real(n) : (void*)fftwf_alloc_real(n));
    void* bins = dbl ? (void*)fftw_alloc_complex(n / 2 + 1) : (void*)fftwf_alloc_complex(n / 2 + 1);
    void* plan = dbl ? (void*)fftw_plan_dft_r2c_1d(n, (double*)buf, (fftw_complex*)bins, FFTW_MEASURE)
                     : (void*)fftwf_plan_dft_r2c_1d(n, (float*)buf, (fftwf_complex*)bins, FFTW_MEASURE);
#endif
    const int batch = 20;
    for (int r = 0; r < reps; ++r) {
        const double a = seconds([&] {
            for (int b = 0; b < batch; ++b) F::fft(&in, &out, 0, T(1), VLX_WINDOW_HANN, 0);
        }) / batch;
        mine.push_back(a);
#ifdef VLX_HAVE_FFTW
        const double b = seconds([&] {
            for (int k = 0; k < batch; ++k) {
                for (int32_t i = 0; i < n; ++i) buf[i] = in.data[i] * window[i];
                if constexpr (dbl) fftw_execute((fftw_plan)plan); else fftwf_execute((fftwf_plan)plan);
            }
        }) / batch;
        theirs.push_back(b);
        ratio.push_back(a / b);
#endif
    }
    std::printf("\n%s: 65536-point real record, Hann window (median of %d batches of %d)\n", F::name(), reps, batch);
#ifdef VLX_HAVE_FFTW
    std::printf("vlxh_fft %.1f us, FFTW r2c + window %.1f us, ratio %.2f\n", median(mine) * 1e6, median(theirs) * 1e6,
                median(ratio));
    if constexpr (dbl) fftw_destroy_plan((fftw_plan)plan), fftw_free(buf), fftw_free(bins);
    else fftwf_destroy_plan((fftwf_plan)plan), fftwf_free(buf), fftwf_free(bins);
#else
    std::printf("vlxh_fft %.1f us (no FFTW)\n", median(mine) * 1e6);
#endif
    F::destroy(&in), F::destroy(&out);
}

}  // namespace

int main(int argc, char** argv) {
    const int reps = argc > 1 ? std::max(1, std::atoi(argv[1])) : 7;
    resampler_table<double>(reps);
    resampler_table<float>(reps);
    spectrum_table<double>(reps * 3);
    spectrum_table<float>(reps * 3);
    return 0;
}
