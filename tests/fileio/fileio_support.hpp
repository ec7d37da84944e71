// Streams in memory for the file tests, and the file family's twins.
#pragma once

#include "vlx_test.hpp"

#include <cstdio>
#include <string>

namespace vlxtest {

VLX_TEST_TWIN(t_fread, vlxf_fread, vlxff_fread)
VLX_TEST_TWIN(t_read_text, vlxf_read_text, vlxff_read_text)
inline int32_t t_fwrite2(const vlx_t* v, FILE* f, int32_t format) { return vlxf_fwrite2(v, f, format); }
inline int32_t t_fwrite2(const vlxf_t* v, FILE* f, int32_t format) { return vlxff_fwrite2(v, f, format); }

// A temporary file holding `bytes`, positioned at its start.
inline FILE* stream_of(const std::string& bytes) {
    FILE* f = std::tmpfile();
    std::fwrite(bytes.data(), 1, bytes.size(), f);
    std::rewind(f);
    return f;
}

// Everything from the stream's position to its end; the stream is closed.
inline std::string drain(FILE* f) {
    std::string s;
    for (int c; (c = std::getc(f)) != EOF;) s.push_back(static_cast<char>(c));
    std::fclose(f);
    return s;
}

// What one writer call puts into an empty stream.
template <class V>
std::string written(const V* v, int32_t format, int32_t* status = nullptr) {
    FILE* f = std::tmpfile();
    const int32_t r = t_fwrite2(v, f, format);
    if (status != nullptr) *status = r;
    std::rewind(f);
    return drain(f);
}

}  // namespace vlxtest
