// Streaming element-wise operations against memcpy over the same sizes, in
// the same run.  Throughput counts bytes read plus bytes written; the size
// argument is the bytes of one complex (or, for real shapes, one real)
// source vector, and memcpy copies that many bytes.
//
// The build machine is shared, so each iteration runs the operation and a
// memcpy of the same size back to back and times both in thread CPU time:
// drift and time slicing then touch both alike.  bytes_per_second is the
// operation's; the counters give memcpy's and the ratio.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <vector>

namespace {

struct Owned {
    vlx_t v;
    Owned(int64_t points, bool is_complex) {
        vlx_init(&v);
        v.points = static_cast<int32_t>(points);
        v.complex = is_complex ? 1 : 0;
        if (vlx_alloc(&v) != 0) std::abort();
        const int64_t n = is_complex ? 2 * points : points;
        for (int64_t i = 0; i < n; ++i) v.data[i] = 1.0 + 1e-9 * double(i % 1000);
    }
    ~Owned() { vlx_destroy(&v); }
};

constexpr int64_t kScalar = sizeof(double);

double thread_seconds() {
    timespec t;
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t);
    return double(t.tv_sec) + 1e-9 * double(t.tv_nsec);
}

// Runs op and a memcpy of copy_bytes per iteration; moved is the operation's
// bytes read plus written.
template <class Op>
void against_memcpy(benchmark::State& state, int64_t moved, int64_t copy_bytes, Op op) {
    std::vector<char> from(static_cast<size_t>(copy_bytes), 1), to(static_cast<size_t>(copy_bytes), 0);
    double op_time = 0, copy_time = 0;
    for (auto _ : state) {
        const double t0 = thread_seconds();
        op();
        benchmark::ClobberMemory();
        const double t1 = thread_seconds();
        std::memcpy(to.data(), from.data(), from.size());
        benchmark::DoNotOptimize(to.data());
        benchmark::ClobberMemory();
        const double t2 = thread_seconds();
        op_time += t1 - t0;
        copy_time += t2 - t1;
        state.SetIterationTime(t1 - t0);
    }
    const double n = double(state.iterations());
    state.SetBytesProcessed(state.iterations() * moved);
    state.counters["memcpy_Bps"] = n * 2.0 * double(copy_bytes) / copy_time;
    state.counters["of_memcpy"] = (n * double(moved) / op_time) / (n * 2.0 * double(copy_bytes) / copy_time);
}

void BM_memcpy(benchmark::State& state) {
    const size_t bytes = static_cast<size_t>(state.range(0));
    std::vector<char> src(bytes, 1), dst(bytes, 0);
    for (auto _ : state) {
        std::memcpy(dst.data(), src.data(), bytes);
        benchmark::DoNotOptimize(dst.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * int64_t(2 * bytes));
}

// a, b and a third dst; shape by the two flags.  Bytes: both sources read,
// dst written.
template <int32_t (*Op)(vlx_t*, vlx_t*, vlx_t*)>
void binary(benchmark::State& state, bool ac, bool bc, bool in_place) {
    const int64_t bytes = state.range(0);
    const int64_t points = bytes / kScalar / ((ac || bc) ? 2 : 1);
    Owned a(points, ac), b(points, bc), d(points, ac || bc);
    vlx_t* dst = in_place ? &a.v : &d.v;
    if (in_place && !ac && bc) std::abort();  // a real a cannot hold the result without growing
    const int64_t moved = points * kScalar * ((ac ? 2 : 1) + (bc ? 2 : 1) + ((ac || bc) ? 2 : 1));
    against_memcpy(state, moved, bytes, [&] {
        if (Op(&a.v, &b.v, dst) != 0) state.SkipWithError("operation failed");
    });
}

void BM_add_rr(benchmark::State& s) { binary<vlxb_add>(s, false, false, false); }
void BM_add_cc(benchmark::State& s) { binary<vlxb_add>(s, true, true, false); }
void BM_mul_rr(benchmark::State& s) { binary<vlxb_mul>(s, false, false, false); }
void BM_mul_cc(benchmark::State& s) { binary<vlxb_mul>(s, true, true, false); }
void BM_mul_cr(benchmark::State& s) { binary<vlxb_mul>(s, true, false, false); }
void BM_mul_rc(benchmark::State& s) { binary<vlxb_mul>(s, false, true, false); }
void BM_mul_cr_in_place(benchmark::State& s) { binary<vlxb_mul>(s, true, false, true); }

void BM_scale(benchmark::State& state) {
    const int64_t points = state.range(0) / kScalar / 2;
    Owned v(points, true);
    double s = 1.0;
    against_memcpy(state, 2 * points * 2 * kScalar, state.range(0), [&] {
        // alternate factors so the values stay bounded
        s = s == 1.0 ? 0.5 : 2.0;
        vlxi_scale(&v.v, s);
    });
}

void BM_conj(benchmark::State& state) {
    const int64_t points = state.range(0) / kScalar / 2;
    Owned v(points, true);
    against_memcpy(state, 2 * points * 2 * kScalar, state.range(0), [&] { vlxi_conj(&v.v); });
}

void BM_magsq(benchmark::State& state) {
    const int64_t points = state.range(0) / kScalar / 2;
    Owned src(points, true), dst(points, false);
    against_memcpy(state, (2 + 1) * points * kScalar, state.range(0), [&] { vlxu_magsq(&src.v, &dst.v); });
}

void sizes(benchmark::internal::Benchmark* b) {
    b->Arg(16 << 20)->Arg(64 << 20)->Unit(benchmark::kMillisecond)->UseManualTime();
}

void plain_sizes(benchmark::internal::Benchmark* b) {
    b->Arg(16 << 20)->Arg(64 << 20)->Unit(benchmark::kMillisecond);
}

}  // namespace

BENCHMARK(BM_memcpy)->Apply(plain_sizes);
BENCHMARK(BM_add_rr)->Apply(sizes);
BENCHMARK(BM_add_cc)->Apply(sizes);
BENCHMARK(BM_mul_rr)->Apply(sizes);
BENCHMARK(BM_mul_cc)->Apply(sizes);
BENCHMARK(BM_mul_cr)->Apply(sizes);
BENCHMARK(BM_mul_rc)->Apply(sizes);
BENCHMARK(BM_mul_cr_in_place)->Apply(sizes);
BENCHMARK(BM_scale)->Apply(sizes);
BENCHMARK(BM_conj)->Apply(sizes);
BENCHMARK(BM_magsq)->Apply(sizes);

BENCHMARK_MAIN();
