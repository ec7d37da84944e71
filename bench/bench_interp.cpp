// Cubic spline interpolation, 1,000,000 ascending queries on a 1000-point
// table, against scipy's CubicSpline on the same table and queries.  scipy
// runs in a python process (bench/scipy_interp.py) started by its benchmark,
// which reports its own timings; run with repetitions and random
// interleaving so that both sides see the same machine.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <unistd.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>
#include <type_traits>
#include <vector>

namespace {

constexpr int32_t kTable = 1000;
constexpr int32_t kQueries = 1000000;

// x_i = i + 0.3 sin i (strictly rising), a smooth y, evenly spread queries.
template <class V>
struct Table {
    using T = std::remove_pointer_t<decltype(V::data)>;
    V x, y, y2, xi, yi;
    Table() {
        for (V* v : {&x, &y, &y2, &xi, &yi}) {
            std::memset(v, 0, sizeof(V));
            v->delta = 1;
        }
        x.points = y.points = kTable;
        xi.points = kQueries;
        grow(&x), grow(&y), grow(&xi);
        for (int32_t i = 0; i < kTable; ++i) {
            const double xv = i + 0.3 * std::sin(double(i));
            x.data[i] = T(xv);
            y.data[i] = T(std::sin(0.05 * xv) + 0.1 * std::cos(0.37 * xv));
        }
        const double x0 = x.data[0], x1 = x.data[kTable - 1];
        for (int32_t j = 0; j < kQueries; ++j) xi.data[j] = T(x0 + (x1 - x0) * (double(j) / (kQueries - 1)));
    }
    ~Table() {
        for (V* v : {&x, &y, &y2, &xi, &yi}) release(v);
    }
    static void grow(vlx_t* v) { vlx_alloc(v); }
    static void grow(vlxf_t* v) { vlxf_alloc(v); }
    static void release(vlx_t* v) { vlx_destroy(v); }
    static void release(vlxf_t* v) { vlxf_destroy(v); }
};

void BM_vlx_interp_spline(benchmark::State& state) {
    Table<vlx_t> t;
    vlxb_cspline_2d(&t.x, &t.y, &t.y2, 0, 0, VLX_SPLINE_NOT_A_KNOT, VLX_SPLINE_NOT_A_KNOT);
    for (auto _ : state) {
        vlx_interp(&t.x, &t.y, &t.y2, &t.xi, &t.yi, VLX_INTERP_SPLINE);
        benchmark::DoNotOptimize(t.yi.data[kQueries / 2]);
    }
    state.SetItemsProcessed(state.iterations() * kQueries);
}

// Second derivatives made inside the call (y2 null), as CubicSpline(x, y)(q).
void BM_vlx_cspline_with_setup(benchmark::State& state) {
    Table<vlx_t> t;
    for (auto _ : state) {
        vlx_cspline(&t.x, &t.y, nullptr, &t.xi, &t.yi);
        benchmark::DoNotOptimize(t.yi.data[kQueries / 2]);
    }
    state.SetItemsProcessed(state.iterations() * kQueries);
}

void BM_vlxf_interp_spline(benchmark::State& state) {
    Table<vlxf_t> t;
    vlxfb_cspline_2d(&t.x, &t.y, &t.y2, 0, 0, VLX_SPLINE_NOT_A_KNOT, VLX_SPLINE_NOT_A_KNOT);
    for (auto _ : state) {
        vlxf_interp(&t.x, &t.y, &t.y2, &t.xi, &t.yi, VLX_INTERP_SPLINE);
        benchmark::DoNotOptimize(t.yi.data[kQueries / 2]);
    }
    state.SetItemsProcessed(state.iterations() * kQueries);
}

constexpr int kScipyReps = 10;

// Runs the python side once per call and hands its timings of one kind
// ("eval" or "full") to the benchmark: the processor time as the manual time
// (comparable with the CPU column of the library's rows on a busy machine),
// the wall time as a counter.
void scipy_timings(benchmark::State& state, const char* kind) {
    std::string script = __FILE__;
    script = script.substr(0, script.find_last_of('/') + 1) + "scipy_interp.py";
    // Debian's python3-scipy lives with the system interpreter.
    const char* python = access("/usr/bin/python3", X_OK) == 0 ? "/usr/bin/python3" : "python3";
    const std::string command = std::string(python) + " " + script + " " + std::to_string(kScipyReps) + " 2>/dev/null";
    std::vector<double> cpu, wall;
    if (std::FILE* pipe = popen(command.c_str(), "r")) {
        char name[16];
        double w, c;
        while (std::fscanf(pipe, "%15s %lf %lf", name, &w, &c) == 3)
            if (std::strcmp(name, kind) == 0) wall.push_back(w), cpu.push_back(c);
        pclose(pipe);
    }
    if (cpu.empty()) {
        state.SkipWithError("python3 with scipy not available");
        return;
    }
    size_t i = 0;
    double wall_sum = 0;
    for (auto _ : state) {
        state.SetIterationTime(cpu[i % cpu.size()]);
        wall_sum += wall[i++ % wall.size()];
    }
    state.counters["wall_ms"] = 1e3 * wall_sum / double(i);
    state.SetItemsProcessed(state.iterations() * kQueries);
}

void BM_scipy_CubicSpline_eval(benchmark::State& state) { scipy_timings(state, "eval"); }
void BM_scipy_CubicSpline_with_setup(benchmark::State& state) { scipy_timings(state, "full"); }

}  // namespace

BENCHMARK(BM_vlx_interp_spline)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_scipy_CubicSpline_eval)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(kScipyReps);
BENCHMARK(BM_vlx_cspline_with_setup)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_scipy_CubicSpline_with_setup)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(kScipyReps);
BENCHMARK(BM_vlxf_interp_spline)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
