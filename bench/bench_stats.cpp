// Statistics against the memory system and the standard sort: the streaming
// statistics are compared with a plain memcpy of the same data (bytes per
// second), the median with std::sort of the same samples, in one run.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <vector>

namespace {

constexpr int64_t kPoints = 1000000;

std::vector<double> samples(int64_t n) {
    std::mt19937_64 rng(7);
    std::normal_distribution<double> dist(0.0, 1.0);
    std::vector<double> out(static_cast<size_t>(n));
    for (auto& x : out) x = dist(rng);
    return out;
}

// A library vector holding the benchmark's samples.
struct Source {
    vlx_t v;
    vlx_t dst;
    explicit Source(int64_t n) {
        vlx_init(&v);
        vlx_init(&dst);
        v.points = static_cast<int32_t>(n);
        vlx_alloc(&v);
        const auto x = samples(n);
        std::copy(x.begin(), x.end(), v.data);
    }
    ~Source() {
        vlx_destroy(&v);
        vlx_destroy(&dst);
    }
};

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

template <int32_t (*Fn)(const vlx_t*, vlx_t*)>
void BM_stat(benchmark::State& state) {
    Source s(kPoints);
    for (auto _ : state) {
        Fn(&s.v, &s.dst);
        benchmark::DoNotOptimize(s.dst.data[0]);
    }
    state.SetBytesProcessed(state.iterations() * kPoints * int64_t(sizeof(double)));
}

template <int32_t (*Fn)(const vlxf_t*, vlxf_t*)>
void BM_stat_float(benchmark::State& state) {
    vlxf_t v, dst;
    vlxf_init(&v);
    vlxf_init(&dst);
    v.points = static_cast<int32_t>(kPoints);
    vlxf_alloc(&v);
    const auto x = samples(kPoints);
    for (int64_t i = 0; i < kPoints; ++i) v.data[i] = static_cast<float>(x[i]);
    for (auto _ : state) {
        Fn(&v, &dst);
        benchmark::DoNotOptimize(dst.data[0]);
    }
    state.SetBytesProcessed(state.iterations() * kPoints * int64_t(sizeof(float)));
    vlxf_destroy(&v);
    vlxf_destroy(&dst);
}

// The copy is outside the timing: the median pays for its own copy, the
// standard sort does not.
void BM_std_sort(benchmark::State& state) {
    const auto x = samples(kPoints);
    std::vector<double> y(x.size());
    for (auto _ : state) {
        state.PauseTiming();
        std::copy(x.begin(), x.end(), y.begin());
        state.ResumeTiming();
        std::sort(y.begin(), y.end());
        benchmark::DoNotOptimize(y.data());
    }
    state.SetItemsProcessed(state.iterations() * kPoints);
}

void BM_median(benchmark::State& state) {
    Source s(kPoints);
    for (auto _ : state) {
        vlxs_median(&s.v, &s.dst);
        benchmark::DoNotOptimize(s.dst.data[0]);
    }
    state.SetItemsProcessed(state.iterations() * kPoints);
}

void BM_peak(benchmark::State& state) {
    Source s(kPoints);
    for (auto _ : state) {
        vlxs_peak(&s.v, &s.dst, VLX_PEAK_PARABOLA, 0);
        benchmark::DoNotOptimize(s.dst.data[0]);
    }
    state.SetBytesProcessed(state.iterations() * kPoints * int64_t(sizeof(double)));
}

}  // namespace

BENCHMARK(BM_memcpy)->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat, vlxs_sum)->Name("BM_sum")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat, vlxs_mean)->Name("BM_mean")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat, vlxs_rms)->Name("BM_rms")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat, vlxs_pop_var)->Name("BM_pop_var")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat, vlxs_skew)->Name("BM_skew")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat, vlxs_excess)->Name("BM_excess")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat_float, vlxfs_sum)->Name("BM_float_sum")->Unit(benchmark::kMicrosecond);
BENCHMARK_TEMPLATE(BM_stat_float, vlxfs_pop_var)->Name("BM_float_pop_var")->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_peak)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_std_sort)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_median)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
