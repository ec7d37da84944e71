// Concurrency soak: worker threads run cached-table operations of both families while another thread releases the
// caches in a loop; every result must equal the single-threaded one bit for bit.  VLX_SOAK_SECONDS and
// VLX_SOAK_THREADS set the length and the number of workers.
#include "harness.hpp"

#include <atomic>
#include <chrono>
#include <cstdio>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>

namespace rel {
namespace {

using vlxtest::Vec;

struct Job {
    std::string name;
    std::function<std::vector<double>()> run;  // the status, then the image of the result
    double tolerance = 0;                      // relative to the largest magnitude; 0: bit for bit
    bool matches(const std::vector<double>& got, const std::vector<double>& want) const {
        if (tolerance == 0 || got.size() != want.size()) return same_image(got, want);
        double top = 0, diff = 0;
        for (size_t i = 4; i < got.size(); ++i)
            top = std::max(top, std::fabs(want[i])), diff = std::max(diff, std::fabs(got[i] - want[i]));
        return same_image({got.begin(), got.begin() + 4}, {want.begin(), want.begin() + 4}) && diff <= tolerance * top;
    }
};

// Runs op on a fresh vector of n reproducible points.
template <class V>
Job job(const char* name, int32_t n, bool cplx, std::function<int(V*)> op) {
    return {std::string(name) + (is_double<V> ? "" : " (float)"), [=] {
                Vec<V> v(vlxtest::random_values<real_of<V>>(size_t(cplx ? 2 * n : n), uint32_t(n)), cplx);
                v->delta = real_of<V>(0.5);
                const int rc = op(v.get());
                std::vector<double> r = image(v.get());
                return r.insert(r.begin(), double(rc)), r;
            }};
}

// op(v, out), then out copied back into v.
template <class V, class Op>
int through(V* v, Op op) {
    Vec<V> out;
    const int r = op(v, out.get());
    return vlxtest::t_copy(v, out.get()), r;
}

// v filtered by taps 0.01 * (1 + k % 7) (real), plain or in the symmetric form (half the taps given).
template <class V>
int filtered(V* v, int32_t taps, bool symmetric) {
    std::vector<real_of<V>> h;
    for (int32_t k = 0; k < taps; ++k) h.push_back(real_of<V>(0.01 * (1 + k % 7)));
    Vec<V> f(h, false);
    return through(v, [&](V* in, V* out) {
        return symmetric ? REL_TW(d, sfir)(in, out, f.get(), 0, 0, nullptr) : REL_TW(d, fir)(in, out, f.get(), nullptr);
    });
}

// Reads a file image from memory: a binary one of complex samples, or a text one of real samples, written once by
// the family's writer.
template <class V>
Job file_job(bool text) {
    Vec<V> v(vlxtest::random_values<real_of<V>>(text ? 700 : 1400, 7), !text);
    v->delta = real_of<V>(0.25);
    std::FILE* f = std::tmpfile();
    REL_TW(f, fwrite2)(v.get(), f, text ? VLX_FORMAT_ASCII : VLX_FORMAT_BINARY);
    auto file = std::make_shared<std::string>(size_t(std::ftell(f)), '\0');
    std::rewind(f);
    if (std::fread(file->data(), 1, file->size(), f) != file->size()) file->clear();
    std::fclose(f);
    return job<V>(text ? "text read" : "binary read", 1, false, [file](V* into) {
        std::FILE* m = fmemopen(file->data(), file->size(), "r");
        const int r = REL_TW(f, fread)(into, m) == 1 ? 0 : -1;
        return std::fclose(m), r;
    });
}

template <class V>
void add_jobs(std::vector<Job>& jobs) {
    jobs.push_back(file_job<V>(false));
    jobs.push_back(file_job<V>(true));
    jobs.push_back(job<V>("window", 1000, true, [](V* v) { return REL_TW(i, window)(v, VLX_WINDOW_HANN, 0); }));
    jobs.push_back(job<V>("window width", 512, false,
                          [](V* v) { return REL_TW(i, window2)(v, VLX_WINDOW_HANN + 4, VLX_WFLAG_WIDTH, 300); }));
    jobs.push_back(job<V>("spectrum", 1000, false, [](V* v) {
        return through(v, [](V* in, V* out) { return REL_TW(h, fft)(in, out, 1024, 1, VLX_WINDOW_HANN + 2, 0); });
    }));
    jobs.push_back(job<V>("fir fast", 2048, false, [](V* v) { return filtered(v, 64, false); }));
    jobs.push_back(job<V>("fir fast complex", 1024, true, [](V* v) { return filtered(v, 64, false); }));
    // The fast path keeps one filter key for its real and complex spectra, so a real call whose transform length
    // matches the last real spectrum of another filter uses that spectrum (settled): the expanded symmetric filter
    // therefore runs at another transform length than the plain one.
    jobs.push_back(job<V>("sfir expanded", 700, false, [](V* v) { return filtered(v, 40, true); }));
    jobs.push_back(job<V>("fft", 1024, true, [](V* v) { return REL_TW(i, fft)(v, 0); }));
    jobs.push_back(job<V>("inverse fft", 256, true, [](V* v) { return REL_TW(i, fft)(v, 1); }));
    jobs.push_back(job<V>("rfft", 2048, false, [](V* v) { return REL_TW(i, rfft)(v); }));
    jobs.push_back(job<V>("bitrev", 512, true, [](V* v) { return REL_TW(i, bitrev_scale)(v); }));
    jobs.push_back(job<V>("dft", 1000, true, [](V* v) { return REL_TW(i, dft)(v, 0); }));
    jobs.push_back(job<V>("rdft", 999, false, [](V* v) { return REL_TW(i, rdft)(v); }));
    jobs.push_back(job<V>("analytic", 500, false, [](V* v) { return REL_TW(i, analytic)(v); }));
    // The any-length transform turns its cached filter when only the direction changes rather than rebuilding it,
    // so its last bits depend on the call before (and on a release in between): these agree to rounding only.
    for (size_t i = jobs.size() - 3; i < jobs.size(); ++i) jobs[i].tolerance = is_double<V> ? 1e-13 : 1e-5;
    jobs.push_back(job<V>("dct", 300, false, [](V* v) { return REL_TW(i, dct)(v, 2); }));
    // Uniform noise lies in [-1, 1] (a float draw may round up to 1): compared by the count of samples outside.
    jobs.push_back(job<V>("noise", 4096, false, [](V* v) {
        const int r = REL_TW(c, rand)(v, 0);
        const auto outside = std::count_if(v->data, v->data + v->points, [](auto x) { return !(x >= -1 && x <= 1); });
        return v->points = 1, v->data[0] = real_of<V>(outside), r;
    }));
    // Shuffles, by their sorted samples.
    jobs.push_back(job<V>("shuffle", 1000, true, [](V* v) {
        const int r = REL_TW(i, shuffle)(v);
        return REL_TW(i, sort)(v), r;
    }));
}

double env_number(const char* name, double fallback) {
    const char* e = std::getenv(name);
    return e != nullptr && *e != '\0' ? std::atof(e) : fallback;
}

}  // namespace

TEST(ReliabilitySoak, CachesReleasedUnderRunningOperations) {
    install_hooks();
    vlx_lib_init();
    std::vector<Job> jobs;
    add_jobs<vlx_t>(jobs);
    add_jobs<vlxf_t>(jobs);
    std::vector<std::vector<double>> want;
    for (const Job& j : jobs) {
        want.push_back(j.run());
        ASSERT_GE(want.back()[0], 0) << j.name;
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
            for (size_t i = size_t(t); !stop.load(); i = (i + 1) % jobs.size(), ++calls)
                if (!jobs[i].matches(jobs[i].run(), want[i])) {
                    std::lock_guard<std::mutex> lock(m);
                    wrong.push_back(jobs[i].name);
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
