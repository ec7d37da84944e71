// libFuzzer harness of the sample-file reader.  Each input is read as a
// stream to its end by both families, vector after vector, and every vector
// read is written back in each form.  Storage goes through allocator hooks
// with a cap, so that a header declaring a huge vector fails in the
// allocation as it would on a machine without that much memory.
#include "libvlx.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <initializer_list>

namespace {

constexpr int64_t cap_scalars = int64_t(1) << 22;

template <class V>
int64_t wanted(const V* v) {
    return v->complex ? 2 * int64_t(v->points) : int64_t(v->points);
}

template <class V>
int32_t capped_alloc(V* v) {
    if (v->alloc > 0) std::free(v->data);
    const int64_t n = wanted(v);
    v->data = n <= cap_scalars ? static_cast<decltype(v->data)>(std::malloc(size_t(n) * sizeof *v->data)) : nullptr;
    return 0;
}

template <class V>
int32_t capped_realloc(V* v, int32_t, int32_t) {
    const int64_t n = wanted(v);
    void* grown = n <= cap_scalars ? std::realloc(v->data, size_t(n) * sizeof *v->data) : nullptr;
    if (grown == nullptr) std::free(v->data);
    v->data = static_cast<decltype(v->data)>(grown);
    return 0;
}

FILE* sink = nullptr;

template <class V>
void read_all(const uint8_t* data, size_t size, int32_t (*read)(V*, FILE*), int32_t (*write)(const V*, FILE*, int32_t),
              int32_t (*init)(V*), int32_t (*destroy)(V*)) {
    FILE* f = fmemopen(const_cast<uint8_t*>(data), size, "rb");
    if (f == nullptr) return;
    // Every call takes at least one byte, so this ends; the bound is a guard.
    for (int calls = 0; calls < 100000; ++calls) {
        // A fresh vector each time: the vector core drops (without freeing)
        // an owned block when a count beyond 32 bits fails under hooks.
        V v;
        init(&v);
        const int32_t r = read(&v, f);
        // The trace header's peak search keeps its work vector for good, so
        // the trace form is written without its header here.
        if (r == 1)
            for (int32_t format : {0, 1, 2, 3, 4 | VLX_FORMAT_NO_HEADER}) write(&v, sink, format);
        destroy(&v);
        if (r != 1) break;
    }
    std::fclose(f);
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    vlx_lib_alloc(capped_alloc<vlx_t>, nullptr);
    vlx_lib_realloc(capped_realloc<vlx_t>, nullptr);
    vlxf_lib_alloc(capped_alloc<vlxf_t>, nullptr);
    vlxf_lib_realloc(capped_realloc<vlxf_t>, nullptr);
    sink = std::fopen("/dev/null", "wb");
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size == 0) return 0;
    read_all<vlx_t>(data, size, vlxf_fread, vlxf_fwrite2, vlx_init, vlx_destroy);
    read_all<vlxf_t>(data, size, vlxff_fread, vlxff_fwrite2, vlxf_init, vlxf_destroy);
    return 0;
}
