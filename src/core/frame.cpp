// Locks, counters, teardown of the caches, and the version call.
#include "frame.hpp"

#include "vlx_version.hpp"

#include <pthread.h>

#include <chrono>
#include <thread>

namespace vlx {
namespace {

// Shared by both precisions.  The mutexes are plain storage until
// vlx_lib_init initialises them: nothing runs when the library loads.
pthread_mutex_t locks[2];
std::atomic<int32_t> lock_ready[2];
std::atomic<int32_t> init_counter{0};
std::atomic<int32_t> active_counter{0};

// One table of plugged-in teardown steps for each precision.
template <VlxVector V>
struct Teardown {
    static inline std::atomic<TeardownFn> steps[static_cast<int>(TeardownStep::count)];
};

}  // namespace

void lib_lock(int n) {
    if (lock_ready[n].load(std::memory_order_acquire)) pthread_mutex_lock(&locks[n]);
}

void lib_unlock(int n) {
    if (lock_ready[n].load(std::memory_order_acquire)) pthread_mutex_unlock(&locks[n]);
}

void lib_active_enter() { active_counter.fetch_add(1); }

void lib_active_leave() { active_counter.fetch_sub(1); }

void lib_active_wait() {
    // A growing sleep keeps the poll cheap while a long transform is in
    // flight; there is deliberately no time-out.
    for (int ms = 6; active_counter.load() != 0; ++ms)
        std::this_thread::sleep_for(std::chrono::milliseconds(ms));
}

template <VlxVector V>
void register_teardown(TeardownStep step, TeardownFn fn) {
    Teardown<V>::steps[static_cast<int>(step)].store(fn);
}

template <VlxVector V>
int32_t free_internal() {
    for (int s = 0; s < static_cast<int>(TeardownStep::count); ++s) {
        const TeardownFn fn = s == static_cast<int>(TeardownStep::dft_descriptors) ? &dft_descriptors_free<V>
                                                                                     : Teardown<V>::steps[s].load();
        if (fn != nullptr && fn() < 0) return -1;
    }
    return 0;
}

template void register_teardown<vlx_t>(TeardownStep, TeardownFn);
template void register_teardown<vlxf_t>(TeardownStep, TeardownFn);
template int32_t free_internal<vlx_t>();
template int32_t free_internal<vlxf_t>();

int32_t lib_init() {
    if (bounded_counter_first(init_counter)) {
        for (int n = 0; n < 2; ++n) {
            pthread_mutexattr_t attr;
            if (pthread_mutexattr_init(&attr) != 0) continue;
            const bool ok = pthread_mutexattr_settype(&attr, PTHREAD_MUTEX_RECURSIVE) == 0 &&
                            pthread_mutex_init(&locks[n], &attr) == 0;
            pthread_mutexattr_destroy(&attr);
            // A lock that could not be made stays a no-op; locks are never deleted.
            if (ok) lock_ready[n].store(1, std::memory_order_release);
        }
    }
    return 0;
}

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_lib_init(void) { return vlx::lib_init(); }
VLX_API int32_t vlxf_lib_init(void) __attribute__((alias("vlx_lib_init")));
VLX_API int32_t vlx_free_internal(void) { return vlx::free_internal<vlx_t>(); }
VLX_API int32_t vlxf_free_internal(void) { return vlx::free_internal<vlxf_t>(); }
VLX_API int32_t vlx_version(void) { return VLX_VERSION_NUMBER; }
VLX_API int32_t vlxf_version(void) __attribute__((alias("vlx_version")));
}
