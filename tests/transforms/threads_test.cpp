// Transforms on several threads sharing the caches while another thread releases them: every result stays
// bit-identical to a single-threaded run.
#include "fft_reference.hpp"

#include <atomic>
#include <thread>

using namespace vlxtest;
using namespace fftref;

namespace {

template <class V>
std::vector<real_of<V>> transformed(const std::vector<real_of<V>>& in, int kind) {
    Vec<V> v(in, kind != 2);
    const int status = kind == 2 ? t_rfft(&v) : t_fft(&v, kind);
    EXPECT_EQ(status, 0);
    return v.values();
}

struct Job {
    std::vector<double> d_in, d_want;
    std::vector<float> f_in, f_want;
    int kind;  // 0 forward, 1 inverse, 2 real
};

TEST(Threads, SharedCachesUnderTeardown) {
    vlx_lib_init();
    std::vector<Job> jobs;
    int seed = 0;
    for (int m : {4, 8, 10, 12, 13}) {
        for (int kind = 0; kind <= 2; ++kind) {
            Job j;
            const size_t scalars = (size_t(1) << m) * (kind == 2 ? 1 : 2);
            j.d_in = random_values<double>(scalars, ++seed);
            j.f_in = random_values<float>(scalars, ++seed);
            j.kind = kind;
            j.d_want = transformed<vlx_t>(j.d_in, kind);
            j.f_want = transformed<vlxf_t>(j.f_in, kind);
            jobs.push_back(std::move(j));
        }
    }
    ASSERT_TRUE(vlx_free_internal() == 0 && vlxf_free_internal() == 0);

    std::atomic<bool> done{false};
    std::atomic<int> mismatches{0};
    std::thread releaser([&] {
        while (!done.load()) {
            if (vlx_free_internal() != 0 || vlxf_free_internal() != 0) ++mismatches;
            std::this_thread::yield();
        }
    });
    std::vector<std::thread> workers;
    for (int w = 0; w < 4; ++w) {
        workers.emplace_back([&, w] {
            for (int round = 0; round < 6; ++round) {
                for (size_t i = 0; i < jobs.size(); ++i) {
                    const Job& j = jobs[(i + size_t(w) * 5) % jobs.size()];
                    if (transformed<vlx_t>(j.d_in, j.kind) != j.d_want) ++mismatches;
                    if (transformed<vlxf_t>(j.f_in, j.kind) != j.f_want) ++mismatches;
                }
            }
        });
    }
    for (auto& t : workers) t.join();
    done = true;
    releaser.join();
    EXPECT_EQ(mismatches.load(), 0);
}

}  // namespace
