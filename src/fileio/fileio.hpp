// Sample files as templates, for the library's other layers: the reader of
// the text and binary forms and the five writers.  Each is explicitly
// instantiated for vlx_t and vlxf_t where it is defined.
#pragma once

#include "core/core.hpp"

#include <cstdint>
#include <cstdio>

namespace vlx {

// ---- reader ----

// "-" is standard input or output; anything else goes to fopen.
std::FILE* file_open(const char* path, const char* mode);
// Standard input and output stay open.
int32_t file_close(std::FILE* stream);

// 1: a vector was read; 0: the stream was at its end; -1: failure.
template <VlxVector V> int32_t file_read(V* v, std::FILE* stream);
// The two forms on their own: 1 or -1.
template <VlxVector V> int32_t read_text(V* v, std::FILE* stream);
template <VlxVector V> int32_t read_binary(V* v, std::FILE* stream);

// ---- writers ----

// Format in the low byte (VLX_FORMAT_*), VLX_FORMAT_NO_HEADER and
// VLX_FORMAT_NO_DATA as flags.  0, or a negative status.
template <VlxVector V> int32_t file_write(const V* v, std::FILE* stream, int32_t format);
// The display range of the trace form: the next of 1, 2, 4, 5, 10 in the
// value's decade, at most the family's bound.
template <VlxVector V> real_t<V> auto_range(real_t<V> value);

}  // namespace vlx
