// Windowing against the memory system: vlxi_window2 with a cached window on a
// 1 Mi-point real vector (a multiplication and a rotation) next to a memcpy
// of the same bytes, in one run; and the synthesis cost per sample of a
// 65536-point seven-term cosine sum, which the cache saves.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <cstring>
#include <random>
#include <vector>

namespace {

constexpr int32_t kPoints = 1 << 20;

std::vector<double> samples(int64_t n) {
    std::mt19937_64 rng(7);
    std::uniform_real_distribution<double> dist(-1.0, 1.0);
    std::vector<double> out(static_cast<size_t>(n));
    for (auto& x : out) x = dist(rng);
    return out;
}

void BM_memcpy(benchmark::State& state) {
    const auto x = samples(kPoints);
    std::vector<double> y(x.size());
    for (auto _ : state) {
        std::memcpy(y.data(), x.data(), x.size() * sizeof(double));
        benchmark::DoNotOptimize(y.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * kPoints * int64_t(sizeof(double)));
}

// The samples are restored outside the timing so that repeated windowing
// never runs into subnormal numbers.
// A uniform window of the full width under VLX_WFLAG_WIDTH is a cached
// window of ones, rotated on request: the same multiply-and-rotate pass as
// any other id, and the samples keep their size however often it runs.
void BM_window2_cached_ones(benchmark::State& state) {
    const auto x = samples(kPoints);
    vlx_t v;
    vlx_init(&v);
    v.points = kPoints;
    vlx_alloc(&v);
    std::memcpy(v.data, x.data(), x.size() * sizeof(double));
    const int32_t flags = VLX_WNORM_MEAN | VLX_WFLAG_WIDTH | VLX_WFLAG_SWAP_UNIFORM;
    vlxi_window2(&v, VLX_WINDOW_UNIFORM, flags, kPoints);  // fills the cache
    for (auto _ : state) {
        vlxi_window2(&v, VLX_WINDOW_UNIFORM, flags, kPoints);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * kPoints * int64_t(sizeof(double)));
    vlx_destroy(&v);
}

void BM_window2_cached(benchmark::State& state) {
    const auto x = samples(kPoints);
    vlx_t v;
    vlx_init(&v);
    v.points = kPoints;
    vlx_alloc(&v);
    std::memcpy(v.data, x.data(), x.size() * sizeof(double));
    vlxi_window2(&v, VLX_WINDOW_HANN, VLX_WNORM_MEAN, 0.0);  // fills the cache
    for (auto _ : state) {
        state.PauseTiming();
        std::memcpy(v.data, x.data(), x.size() * sizeof(double));
        state.ResumeTiming();
        vlxi_window2(&v, VLX_WINDOW_HANN, VLX_WNORM_MEAN, 0.0);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * kPoints * int64_t(sizeof(double)));
    vlx_destroy(&v);
}

template <class V, int32_t (*Synth)(V*, int32_t, int32_t, decltype(V::delta))>
void BM_synth_flat7(benchmark::State& state) {
    V w{};
    w.points = 65536;
    if constexpr (sizeof(w.delta) == 8) vlx_alloc(reinterpret_cast<vlx_t*>(&w));
    else vlxf_alloc(reinterpret_cast<vlxf_t*>(&w));
    for (auto _ : state) {
        Synth(&w, VLX_WINDOW_FLAT7, VLX_WNORM_MEAN, 0);
        benchmark::DoNotOptimize(w.data);
    }
    state.counters["ns_per_sample"] = benchmark::Counter(
        static_cast<double>(state.iterations()) * w.points,
        benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
    if constexpr (sizeof(w.delta) == 8) vlx_destroy(reinterpret_cast<vlx_t*>(&w));
    else vlxf_destroy(reinterpret_cast<vlxf_t*>(&w));
}

}  // namespace

// Interleaved so that all see the same load on a shared machine; CPU time,
// since the machine is shared.
BENCHMARK(BM_memcpy)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_window2_cached_ones)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_window2_cached)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_memcpy)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_window2_cached_ones)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_window2_cached)->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_synth_flat7, vlx_t, vlx_window_synth)->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_synth_flat7, vlxf_t, vlxf_window_synth)->Unit(benchmark::kMicrosecond);

BENCHMARK_MAIN();
