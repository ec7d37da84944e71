// The library frame: the two locks, the active counter that keeps shared
// tables alive while they are read outside lock 0, the bounded reference
// counter for once-only work, and the teardown of the process-wide caches.
// Nothing outside src/core touches the locks or counters except through here.
#pragma once

#include "core.hpp"

#include <atomic>
#include <cstdint>

namespace vlx {

// Enter or leave lock n (0 or 1); both do nothing until vlx_lib_init has run.
// Lock 1 may be held while taking lock 0, never the reverse.
void lib_lock(int n);
void lib_unlock(int n);

// The counter of operations that hold a pointer to a lock-0 table after
// releasing the lock.
void lib_active_enter();
void lib_active_leave();
// Waits until no operation holds such a pointer: sleeps of 6, 7, 8, ... ms.
void lib_active_wait();

// Bounded reference counter: true for the one caller that must do the
// once-only work.  The counter is never decremented except to keep it near
// 10000, so the check can run on every call for the life of the process.
inline bool bounded_counter_first(std::atomic<int32_t>& counter) {
    // At the bound an increment would be undone at once: skip the pair, the
    // two locked operations being most of a short transform's entry cost.
    if (counter.load(std::memory_order_relaxed) >= 10000) return false;
    const int32_t n = counter.fetch_add(1) + 1;
    if (n > 10000) counter.fetch_sub(1);
    return n == 1;
}

// Reader protocol for tables under lock 0: the constructor takes lock 0 and
// raises the active counter; release_lock() leaves the lock once the table is
// found or built; the destructor lowers the counter (and unlocks if still held).
class TableReader {
public:
    TableReader() {
        lib_lock(0);
        lib_active_enter();
    }
    ~TableReader() {
        if (locked_) lib_unlock(0);
        lib_active_leave();
    }
    void release_lock() {
        if (locked_) {
            lib_unlock(0);
            locked_ = false;
        }
    }
    TableReader(const TableReader&) = delete;
    TableReader& operator=(const TableReader&) = delete;

private:
    bool locked_ = true;
};

// Holds lock n for a scope.
class LockGuard {
public:
    explicit LockGuard(int n) : n_(n) { lib_lock(n_); }
    ~LockGuard() { lib_unlock(n_); }
    LockGuard(const LockGuard&) = delete;
    LockGuard& operator=(const LockGuard&) = delete;

private:
    int n_;
};

// The teardown steps of vlx_free_internal / vlxf_free_internal, in the order
// they run.  Each cache owner plugs its step in (register_teardown) when it
// first fills its cache; a step never plugged in has nothing to release.
// A step takes its own lock and, for lock-0 tables, waits for readers.
enum class TeardownStep : int {
    fir_scratch = 0,
    sfir_scratch,
    bitrev_lists,
    dct_state,
    chirp,
    dft_descriptors,
    twiddle_tables,
    window_cache,
    count
};

using TeardownFn = int32_t (*)();

// The descriptor release of the vendor transform binding.  It is always step
// dft_descriptors, called directly rather than plugged in, because it binds
// the modules if nothing has yet: a teardown can be their first use.
template <VlxVector V>
int32_t dft_descriptors_free();

template <VlxVector V>
void register_teardown(TeardownStep step, TeardownFn fn);

template <VlxVector V>
int32_t free_internal();

}  // namespace vlx
