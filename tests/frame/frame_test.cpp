// The frame's internals: locks before and after vlx_lib_init, the bounded counter and the teardown order. Linked
// against the static library, whose internal symbols are visible.  (The teardown's wait for readers outside the lock
// is exercised by the reliability soak, which releases the caches under running operations.)
#include "core/frame.hpp"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>
#include <vector>

namespace {

using std::chrono::milliseconds;

// How long another thread waits for lock n while this thread holds it for 100 ms.
int64_t blocked_ms(int n) {
    std::atomic<bool> held{false};
    int64_t waited = 0;
    vlx::lib_lock(n);
    std::thread other([&] {
        held.wait(false);
        const auto t0 = std::chrono::steady_clock::now();
        vlx::LockGuard lock(n);
        waited = std::chrono::duration_cast<milliseconds>(std::chrono::steady_clock::now() - t0).count();
    });
    held = true;
    held.notify_one();
    std::this_thread::sleep_for(milliseconds(100));
    vlx::lib_unlock(n);
    other.join();
    return waited;
}

// Runs first in this executable: before vlx_lib_init the locks do nothing.
TEST(Frame, LocksWorkOnlyAfterInitAndInitRepeats) {
    EXPECT_TRUE(blocked_ms(0) < 50 && blocked_ms(1) < 50);
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([] {
            for (int i = 0; i < 2600; ++i) EXPECT_EQ(vlx_lib_init(), 0);
        });
    for (auto& t : threads) t.join();
    EXPECT_EQ(vlxf_lib_init(), 0);
    EXPECT_TRUE(blocked_ms(0) >= 60 && blocked_ms(1) >= 60);
    {  // recursive for the holding thread
        vlx::LockGuard a(1), b(1), c(0);
    }
    EXPECT_TRUE(vlx_version() == 328 && vlxf_version() == 328);

    std::atomic<int32_t> counter{0};
    int first = 0;
    for (int i = 0; i < 25000; ++i) first += vlx::bounded_counter_first(counter) ? 1 : 0;
    EXPECT_TRUE(first == 1 && counter.load() <= 10000 && counter.load() >= 9999);
}

std::vector<int> ran;
template <int N, int Result>
int32_t record_step() {
    return ran.push_back(N), Result;
}

TEST(Frame, TeardownRunsStepsInOrderAndStopsAtAFailure) {
    using vlx::TeardownStep;
    EXPECT_EQ(vlx_free_internal(), 0);  // nothing plugged in
    vlx::register_teardown<vlx_t>(TeardownStep::window_cache, &record_step<8, 0>);
    vlx::register_teardown<vlx_t>(TeardownStep::fir_scratch, &record_step<1, 0>);
    vlx::register_teardown<vlx_t>(TeardownStep::bitrev_lists, &record_step<3, 0>);
    vlx::register_teardown<vlx_t>(TeardownStep::twiddle_tables, &record_step<7, 0>);
    ran.clear();
    EXPECT_EQ(vlxf_free_internal(), 0);  // the float family has its own steps
    EXPECT_TRUE(ran.empty() && vlx_free_internal() == 0);
    EXPECT_EQ(ran, (std::vector<int>{1, 3, 7, 8}));
    vlx::register_teardown<vlx_t>(TeardownStep::chirp, &record_step<5, -7>);
    ran.clear();
    EXPECT_EQ(vlx_free_internal(), -1);  // any negative status becomes -1
    EXPECT_EQ(ran, (std::vector<int>{1, 3, 5}));
    for (int s = 0; s < static_cast<int>(TeardownStep::count); ++s)
        vlx::register_teardown<vlx_t>(static_cast<TeardownStep>(s), nullptr);
}

}  // namespace
