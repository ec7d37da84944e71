// Concurrency soak: worker threads run cached-table operations of both families while another thread releases the
// caches in a loop; every result must equal the single-threaded one bit for bit.  VLX_SOAK_SECONDS and
// VLX_SOAK_THREADS set the length and the number of workers.
#include "harness.hpp"

#include <atomic>
#include <chrono>
#include <mutex>
#include <thread>

namespace rel {
namespace {

// The any-length transform turns its cached filter when only the direction changes rather than rebuilding it, so
// its last bits depend on the call before (and on a release in between): these rows agree to rounding only.
constexpr unsigned kToRounding = 1u << 16;

const std::vector<Row> jobs = {
    REL_ROW(f, fread, Stream i(c.in(1400, true), VLX_FORMAT_BINARY); return fn(c.out(), i.f) == 1 ? 0 : -1;),
    REL_ROW(f, fread, Stream i(c.in(700), VLX_FORMAT_ASCII); return fn(c.out(), i.f) == 1 ? 0 : -1;),
    REL_ROW(i, window, return fn(c.io(1000, true), c.n(VLX_WINDOW_HANN), c.n(0));),
    REL_ROW(i, window2, return fn(c.io(512), c.n(VLX_WINDOW_HANN + 4), c.n(VLX_WFLAG_WIDTH), c.s(300));),
    REL_ROW(h, fft, return fn(c.in(1000), c.out(), c.n(1024), c.s(1), c.n(VLX_WINDOW_HANN + 2), c.n(0));),
    // Same creation order, so the real and complex fast paths get the same taps.
    REL_ROW(d, fir, return fn(c.in(2048), c.out(), c.coef(64), nullptr);),
    REL_ROW(d, fir, return fn(c.in(1024, true), c.out(), c.coef(64), nullptr);),
    // The fast path keeps one filter key for its real and complex spectra, so a real call whose transform length
    // matches the last real spectrum of another filter uses that spectrum (settled): the expanded symmetric filter
    // therefore runs at another transform length (700 points) than the plain one.
    REL_ROW(d, sfir, return fn(c.in(700), c.out(), c.coef(40), c.n(0), c.n(0), nullptr);),
    REL_ROW(i, fft, return fn(c.io(1024, true), c.n(0));),
    REL_ROW(i, fft, return fn(c.io(256, true), c.n(1));),
    REL_ROW(i, rfft, return fn(c.io(2048));),
    REL_ROW(i, bitrev_scale, return fn(c.io(512, true));),
    REL_ROWF(kToRounding, i, dft, return fn(c.io(1000, true), c.n(0));),
    REL_ROWF(kToRounding, i, rdft, return fn(c.io(999));),
    REL_ROWF(kToRounding, i, analytic, return fn(c.io(500));),
    REL_ROW(i, dct, return fn(c.io(300), c.u(2));),
    // Uniform noise lies in [-1, 1] (a float draw may round up to 1): compared by the count of samples outside.
    REL_ROW(c, rand, V* v = c.io(4096); const int r = fn(v, c.n(0));
            v->data[0] = T(std::count_if(v->data, v->data + v->points, [](T x) { return !(x >= -1 && x <= 1); }));
            return v->points = 1, r;),
    // Shuffles, by their sorted samples.
    REL_ROW(i, shuffle, V* v = c.io(1000, true); const int r = fn(v); return REL_TW(i, sort)(v), r;),
};

// Job i: row i of the doubles, then of the floats.  The status, then the images of every vector of the call.
template <class V>
std::vector<double> run(const Row& row) {
    Ctx<V> c;
    std::vector<double> r{double(row(c))};
    for (int i = 0; i < c.used; ++i) {
        const auto x = image(&c.pool[size_t(i)]);
        r.insert(r.end(), x.begin(), x.end());
    }
    return r;
}
std::vector<double> run(size_t i) {
    return i < jobs.size() ? run<vlx_t>(jobs[i]) : run<vlxf_t>(jobs[i - jobs.size()]);
}

bool matches(size_t i, const std::vector<double>& got, const std::vector<double>& want) {
    if (!(jobs[i % jobs.size()].flags & kToRounding) || got.size() != want.size()) return same_image(got, want);
    const double tolerance = i < jobs.size() ? 1e-13 : 1e-5;  // relative to the largest magnitude
    double top = 0, diff = 0;
    for (size_t k = 4; k < got.size(); ++k)
        top = std::max(top, std::fabs(want[k])), diff = std::max(diff, std::fabs(got[k] - want[k]));
    return same_image({got.begin(), got.begin() + 4}, {want.begin(), want.begin() + 4}) && diff <= tolerance * top;
}

std::string name(size_t i) { return std::string(jobs[i % jobs.size()].name) + (i < jobs.size() ? "" : " (float)"); }

double env_number(const char* name, double fallback) {
    const char* e = std::getenv(name);
    return e != nullptr && *e != '\0' ? std::atof(e) : fallback;
}

}  // namespace

TEST(ReliabilitySoak, CachesReleasedUnderRunningOperations) {
    install_hooks();
    vlx_lib_init();
    const size_t count = 2 * jobs.size();
    std::vector<std::vector<double>> want;
    for (size_t i = 0; i < count; ++i) {
        want.push_back(run(i));
        ASSERT_GE(want.back()[0], 0) << name(i);
    }
    const double seconds = env_number("VLX_SOAK_SECONDS", 2);
    const int workers = std::max(1, int(env_number("VLX_SOAK_THREADS", 3)));
    std::atomic<bool> stop{false};
    std::atomic<long> calls{0}, releases{0}, release_failures{0};
    std::mutex m;
    std::vector<std::string> wrong;
    std::vector<std::thread> threads;
    for (int t = 0; t < workers; ++t)
        threads.emplace_back([&, t] {
            for (size_t i = size_t(t); !stop.load(); i = (i + 1) % count, ++calls)
                if (!matches(i, run(i), want[i])) {
                    std::lock_guard<std::mutex> lock(m);
                    wrong.push_back(name(i));
                }
        });
    std::thread freer([&] {
        for (; !stop.load(); ++releases, std::this_thread::yield())
            release_failures += (vlx_free_internal() != 0) + (vlxf_free_internal() != 0);
    });
    std::this_thread::sleep_for(std::chrono::duration<double>(seconds));
    stop = true;
    for (auto& t : threads) t.join();
    freer.join();
    vlx_free_internal(), vlxf_free_internal();
    EXPECT_TRUE(wrong.empty()) << wrong.size() << " results differ, first: " << wrong.front() << ", last: " << wrong.back();
    EXPECT_TRUE(release_failures.load() == 0 && releases.load() > 0);
    std::printf("[ figures  ] %d workers for %.1f s (%.1f thread-seconds): %ld calls, %ld cache releases\n", workers,
                seconds, seconds * (workers + 1), calls.load(), releases.load());
}

}  // namespace rel
