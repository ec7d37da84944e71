// Streams in temporary files for the file tests, and the file family's twins.
#pragma once

#include "vlx_test.hpp"

#include <cstdio>
#include <string>

namespace vlxtest {

VLX_TEST_TWIN(t_fread, vlxf_fread, vlxff_fread)
inline int32_t t_fwrite2(const vlx_t* v, FILE* f, int32_t format) { return vlxf_fwrite2(v, f, format); }
inline int32_t t_fwrite2(const vlxf_t* v, FILE* f, int32_t format) { return vlxff_fwrite2(v, f, format); }

// Everything from the stream's position to its end; the stream is closed.
inline std::string drain(FILE* f) {
    std::string s;
    for (int c; (c = std::getc(f)) != EOF;) s.push_back(static_cast<char>(c));
    std::fclose(f);
    return s;
}

// One read from a stream holding `bytes`; *rest gets what the next call finds.
template <class V>
int32_t read_from(V* v, const std::string& bytes, std::string* rest = nullptr) {
    FILE* f = std::tmpfile();
    std::fwrite(bytes.data(), 1, bytes.size(), f);
    std::rewind(f);
    const int32_t r = t_fread(v, f);
    const std::string left = drain(f);
    if (rest != nullptr) *rest = left;
    return r;
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
