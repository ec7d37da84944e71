// Concurrency soak: worker threads run cached-table operations of both
// families while another thread releases the caches in a loop; every result
// must equal the single-threaded one bit for bit.  VLX_SOAK_SECONDS and
// VLX_SOAK_THREADS set the length and the number of workers.
#include "harness.hpp"

#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdio>
#include <functional>
#include <memory>
#include <string>
#include <mutex>
#include <thread>

namespace rel {
namespace {

struct Result {
    int rc = 0;
    int32_t points = 0, is_complex = 0;
    double delta = 0;
    std::vector<double> x;
    bool operator==(const Result& o) const {
        if (rc != o.rc || points != o.points || is_complex != o.is_complex || !vlxtest::same_bits(delta, o.delta) ||
            x.size() != o.x.size())
            return false;
        for (size_t i = 0; i < x.size(); ++i)
            if (!vlxtest::same_bits(x[i], o.x[i])) return false;
        return true;
    }
};

struct Job {
    std::string name;
    std::function<Result()> run;
    double tolerance = 0;  // relative to the largest magnitude; 0: bit for bit
    bool matches(const Result& got, const Result& want) const {
        if (tolerance == 0 || got.x.size() != want.x.size()) return got == want;
        double top = 0, diff = 0;
        for (size_t i = 0; i < got.x.size(); ++i)
            top = std::max(top, std::fabs(want.x[i])), diff = std::max(diff, std::fabs(got.x[i] - want.x[i]));
        return got.rc == want.rc && got.points == want.points && diff <= tolerance * top;
    }
};

// Runs op on a fresh vector of n deterministic points; check may turn a
// random result into a reproducible one (sorted, or a range test).
template <class V>
Job job(const char* name, int32_t n, bool cplx, int (*op)(V*), void (*check)(V*) = nullptr) {
    return {std::string(name) + (vlxtest::is_double<V> ? "" : " (float)"), [=] {
                using T = vlxtest::real_of<V>;
                V v;
                vlxtest::t_init(&v);
                v.points = n, v.complex = cplx, v.delta = T(0.5);
                vlxtest::t_alloc(&v);
                const auto in = vlxtest::random_values<T>(size_t(cplx ? 2 * n : n), uint32_t(n));
                for (size_t i = 0; i < in.size(); ++i) v.data[i] = in[i];
                Result r;
                r.rc = op(&v);
                if (check != nullptr) check(&v);
                r.points = v.points, r.is_complex = v.complex, r.delta = double(v.delta);
                const int64_t s = v.complex ? 2 * int64_t(v.points) : v.points;
                for (int64_t i = 0; i < s; ++i) r.x.push_back(double(v.data[i]));
                vlxtest::t_destroy(&v);
                return r;
            }};
}

template <class V>
void sort_it(V* v) {
    REL_TW(i, sort)(v);
}

// Uniform noise lies in [-1, 1] (a float draw may round up to 1): replaced
// by the count of samples outside.
template <class V>
void count_outside(V* v) {
    int32_t bad = 0;
    for (int32_t i = 0; i < v->points; ++i) bad += !(v->data[i] >= -1 && v->data[i] <= 1);
    v->points = 1, v->data[0] = decltype(v->data[0] + 0)(bad);
}

// v filtered by taps 0.01 * (1 + k % 7) (real) into itself; half taps for
// the symmetric form.
template <class V>
int filtered(V* v, int32_t taps, bool symmetric) {
    V f, out;
    vlxtest::t_init(&f), vlxtest::t_init(&out);
    f.points = taps;
    vlxtest::t_alloc(&f);
    for (int32_t k = 0; k < taps; ++k) f.data[k] = vlxtest::real_of<V>(0.01 * (1 + k % 7));
    const int r = symmetric ? REL_TW(d, sfir)(v, &out, &f, 0, 0, nullptr) : REL_TW(d, fir)(v, &out, &f, nullptr);
    vlxtest::t_copy(v, &out);
    vlxtest::t_destroy(&f), vlxtest::t_destroy(&out);
    return r;
}

// Reads a file image from memory: a binary one of complex samples, or a
// text one of real samples, written once by the family's writer.
template <class V>
Job file_job(bool text) {
    auto image = std::make_shared<std::string>();
    {
        V v;
        vlxtest::t_init(&v);
        v.points = 700, v.complex = !text, v.delta = vlxtest::real_of<V>(0.25);
        vlxtest::t_alloc(&v);
        const auto x = vlxtest::random_values<vlxtest::real_of<V>>(size_t(v.complex ? 1400 : 700), 7);
        for (size_t i = 0; i < x.size(); ++i) v.data[i] = x[i];
        std::FILE* f = std::tmpfile();
        REL_TW(f, fwrite2)(&v, f, text ? VLX_FORMAT_ASCII : VLX_FORMAT_BINARY);
        image->resize(size_t(std::ftell(f)));
        std::rewind(f);
        if (std::fread(image->data(), 1, image->size(), f) != image->size()) image->clear();
        std::fclose(f);
        vlxtest::t_destroy(&v);
    }
    return {std::string(text ? "text read" : "binary read") + (vlxtest::is_double<V> ? "" : " (float)"), [image] {
                V v;
                vlxtest::t_init(&v);
                std::FILE* f = fmemopen(image->data(), image->size(), "r");
                Result r;
                r.rc = REL_TW(f, fread)(&v, f) == 1 ? 0 : -1;
                std::fclose(f);
                r.points = v.points, r.is_complex = v.complex, r.delta = double(v.delta);
                for (int64_t i = 0; i < (v.complex ? 2 * int64_t(v.points) : v.points); ++i) r.x.push_back(double(v.data[i]));
                vlxtest::t_destroy(&v);
                return r;
            }};
}

template <class V>
void add_jobs(std::vector<Job>& jobs) {
    jobs.push_back(file_job<V>(false));
    jobs.push_back(file_job<V>(true));
    jobs.push_back(job<V>("window", 1000, true, [](V* v) { return REL_TW(i, window)(v, VLX_WINDOW_HANN, 0); }));
    jobs.push_back(job<V>("window width", 512, false,
                          [](V* v) { return REL_TW(i, window2)(v, VLX_WINDOW_HANN + 4, VLX_WFLAG_WIDTH, 300); }));
    jobs.push_back(job<V>("spectrum", 1000, false, [](V* v) {
        V out;
        vlxtest::t_init(&out);
        const int r = REL_TW(h, fft)(v, &out, 1024, 1, VLX_WINDOW_HANN + 2, 0);
        vlxtest::t_copy(v, &out);
        vlxtest::t_destroy(&out);
        return r;
    }));
    jobs.push_back(job<V>("fir fast", 2048, false, [](V* v) { return filtered(v, 64, false); }));
    jobs.push_back(job<V>("fir fast complex", 1024, true, [](V* v) { return filtered(v, 64, false); }));
    // The fast path keeps one filter key for its real and complex spectra, so
    // a real call whose transform length matches the last real spectrum of
    // another filter uses that spectrum (settled); the expanded symmetric
    // filter therefore runs at another transform length than the plain one.
    jobs.push_back(job<V>("sfir expanded", 700, false, [](V* v) { return filtered(v, 40, true); }));
    jobs.push_back(job<V>("fft", 1024, true, [](V* v) { return REL_TW(i, fft)(v, 0); }));
    jobs.push_back(job<V>("inverse fft", 256, true, [](V* v) { return REL_TW(i, fft)(v, 1); }));
    jobs.push_back(job<V>("rfft", 2048, false, [](V* v) { return REL_TW(i, rfft)(v); }));
    jobs.push_back(job<V>("bitrev", 512, true, [](V* v) { return REL_TW(i, bitrev_scale)(v); }));
    jobs.push_back(job<V>("dft", 1000, true, [](V* v) { return REL_TW(i, dft)(v, 0); }));
    jobs.push_back(job<V>("rdft", 999, false, [](V* v) { return REL_TW(i, rdft)(v); }));
    jobs.push_back(job<V>("analytic", 500, false, [](V* v) { return REL_TW(i, analytic)(v); }));
    // The any-length transform turns its cached filter when only the direction
    // changes rather than rebuilding it, so its last bits depend on the call
    // before (and on a release in between): these agree to rounding only.
    for (size_t i = jobs.size() - 3; i < jobs.size(); ++i)
        jobs[i].tolerance = vlxtest::is_double<V> ? 1e-13 : 1e-5;
    jobs.push_back(job<V>("dct", 300, false, [](V* v) { return REL_TW(i, dct)(v, 2); }));
    jobs.push_back(job<V>("noise", 4096, false, [](V* v) { return REL_TW(c, rand)(v, 0); }, count_outside<V>));
    jobs.push_back(job<V>("shuffle", 1000, true, [](V* v) { return REL_TW(i, shuffle)(v); }, sort_it<V>));
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
    std::vector<Result> want;
    for (const Job& j : jobs) {
        want.push_back(j.run());
        ASSERT_GE(want.back().rc, 0) << j.name;
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
        while (!stop.load()) {
            release_failures += (vlx_free_internal() != 0) + (vlxf_free_internal() != 0);
            ++releases;
            std::this_thread::yield();
        }
    });
    std::this_thread::sleep_for(std::chrono::duration<double>(seconds));
    stop = true;
    for (auto& t : threads) t.join();
    freer.join();
    vlx_free_internal(), vlxf_free_internal();
    EXPECT_TRUE(wrong.empty()) << wrong.size() << " results differ, first: " << wrong.front() << ", last: " << wrong.back();
    EXPECT_EQ(release_failures.load(), 0);
    EXPECT_GT(releases.load(), 0);
    std::printf("[ figures  ] %d workers for %.1f s (%.1f thread-seconds): %ld calls, %ld cache releases\n", workers,
                seconds, seconds * (workers + 1), calls.load(), releases.load());
}

}  // namespace rel
