// The counted allocator: the interposed standard heap and the vector hooks of both families share one window.
#include "harness.hpp"

#include <csignal>
#include <mutex>
#include <unordered_set>
#include <unistd.h>

extern "C" {
#if defined(__SANITIZE_THREAD__)
// The thread sanitizer runs only the soak: the standard heap is left alone.
#define REL_REAL(f) f
#elif defined(__SANITIZE_ADDRESS__)
void* __interceptor_malloc(size_t);
void* __interceptor_calloc(size_t, size_t);
void* __interceptor_realloc(void*, size_t);
#define REL_REAL(f) __interceptor_##f
#else
void* __libc_malloc(size_t);
void* __libc_calloc(size_t, size_t);
void* __libc_realloc(void*, size_t);
#define REL_REAL(f) __libc_##f
#endif
}

namespace rel {
namespace {
thread_local Window tls_window;

bool should_fail(size_t bytes) {
    Window& w = tls_window;
    if (!w.open || w.paused > 0) return false;
    if (bytes > (size_t(1) << 28)) return true;
    if (++w.count != w.fail_at) return false;
    return ++w.failed, true;
}

// Hook blocks, tracked so that a leak through the hooks is seen in any build.
std::mutex live_mutex;
std::unordered_set<void*>* live = nullptr;

void track(void* made, void* gone) {
    std::lock_guard<std::mutex> lock(live_mutex);
    Pause pause;
    if (live == nullptr) live = new std::unordered_set<void*>();
    if (gone != nullptr) live->erase(gone);
    if (made != nullptr) live->insert(made);
}

template <class V>
size_t bytes_of(const V* v) {
    const int64_t n = v->complex ? 2 * int64_t(v->points) : int64_t(v->points);
    return size_t(n > 0 ? n : 0) * sizeof(*v->data);
}

template <class V>
int32_t hook_alloc(V* v) {
    if (v->alloc > 0) track(nullptr, v->data), std::free(v->data);
    v->data = should_fail(bytes_of(v)) ? nullptr : static_cast<decltype(v->data)>(REL_REAL(malloc)(bytes_of(v)));
    track(v->data, nullptr);
    return 0;
}

template <class V>
int32_t hook_realloc(V* v, int32_t, int32_t) {
    void* old = v->alloc > 0 ? v->data : nullptr;
    if (should_fail(bytes_of(v))) {  // the failing hook gives the old block back itself
        track(nullptr, old), std::free(old);
        v->data = nullptr;
        return 0;
    }
    // A failed enlargement keeps the old block, which the library drops: it stays tracked, for release_hook_blocks.
    const auto old_bits = reinterpret_cast<uintptr_t>(old);  // not a pointer once realloc has run
    track(nullptr, old);
    void* p = REL_REAL(realloc)(old, bytes_of(v));
    track(p != nullptr ? p : reinterpret_cast<void*>(old_bits), nullptr);
    v->data = static_cast<decltype(v->data)>(p);
    return 0;
}

template <class V>
int32_t hook_free(V* v) {
    track(nullptr, v->data);
    std::free(v->data);
    return 0;
}

char watched[512];
size_t watched_len = 0;

void on_alarm(int) {
    static const char head[] = "\nreliability: call did not return in time: ";
    (void)!write(2, head, sizeof head - 1);
    (void)!write(2, watched, watched_len);
    (void)!write(2, "\n", 1);
    _exit(3);
}
}  // namespace

Window& window() { return tls_window; }

long live_hook_blocks() {
    std::lock_guard<std::mutex> lock(live_mutex);
    return live == nullptr ? 0 : long(live->size());
}

void release_hook_blocks() {
    std::lock_guard<std::mutex> lock(live_mutex);
    if (live == nullptr) return;
    for (void* p : *live) std::free(p);
    live->clear();
}

void install_hooks() {
    vlxtest::set_hooks<vlx_t>(hook_alloc<vlx_t>, hook_realloc<vlx_t>, hook_free<vlx_t>);
    vlxtest::set_hooks<vlxf_t>(hook_alloc<vlxf_t>, hook_realloc<vlxf_t>, hook_free<vlxf_t>);
}

void watch(const std::string& what, unsigned seconds) {
    watched_len = std::min(what.size(), sizeof watched);
    std::memcpy(watched, what.data(), watched_len);
    std::signal(SIGALRM, on_alarm);
    alarm(seconds);
}

void unwatch() { alarm(0); }

}  // namespace rel

// The interposed standard heap.  free needs no wrapper: every block comes from the real allocator.
#if !defined(__SANITIZE_THREAD__)
extern "C" {
void* malloc(size_t n) { return rel::should_fail(n) ? nullptr : REL_REAL(malloc)(n); }
void* calloc(size_t n, size_t m) {
    return rel::should_fail(m != 0 && n > SIZE_MAX / m ? SIZE_MAX : n * m) ? nullptr : REL_REAL(calloc)(n, m);
}
void* realloc(void* p, size_t n) { return n != 0 && rel::should_fail(n) ? nullptr : REL_REAL(realloc)(p, n); }
}
#endif
