// Input and output of the vlx tool: the library's sample files, audio files
// through libsndfile when it is built in, and outputs that appear only whole.
#pragma once

#include "libvlx.h"

#include <cstdio>
#include <string>
#include <vector>

namespace vlxtool {

// An error that ends the program with one line on standard error and status 2.
struct Failure {
    std::string message;
};

// A vector that destroys itself.
class Vector {
public:
    Vector() { vlx_init(&v_); }
    ~Vector() { vlx_destroy(&v_); }
    Vector(const Vector&) = delete;
    Vector& operator=(const Vector&) = delete;
    Vector(Vector&& other) noexcept : v_(other.v_) { vlx_init(&other.v_); }
    vlx_t* operator&() { return &v_; }
    vlx_t* operator->() { return &v_; }
    const vlx_t* operator->() const { return &v_; }

private:
    vlx_t v_;
};

// A record read from a file: its vectors (a sample file may hold several)
// and, for audio, the channel count and rate of the source.
struct Recording {
    std::vector<Vector> vectors;
    bool audio = false;
    int channels = 1;
    double rate = 0;
};

// Reads a sample file (text or binary, "-" for standard input) or an audio
// file; `channel` picks one channel of a multi-channel audio file.
Recording read_input(const std::string& path, int channel);

// The output forms the tool writes.
enum class Form { binary, text, summary, gnuplot, trace, audio };
Form form_from_name(const std::string& name);
// The form a path's extension suggests, binary if none does.
Form form_from_path(const std::string& path);

// Writes to a temporary file beside `path` and renames it over `path` on
// commit(), so a failed run leaves no partial output behind.  "-" writes to
// standard output directly.
class Output {
public:
    explicit Output(std::string path);
    ~Output();
    Output(const Output&) = delete;
    Output& operator=(const Output&) = delete;
    FILE* stream() { return stream_; }
    const std::string& temp_path() const { return temp_; }
    void commit();

private:
    std::string path_;
    std::string temp_;
    FILE* stream_ = nullptr;
    bool committed_ = false;
};

// Writes vectors in a library form to `path`.
void write_vectors(const std::string& path, Form form, std::vector<vlx_t*> vectors);
// Writes one real vector as a mono audio file (float samples), rate 1/delta.
void write_audio(const std::string& path, const vlx_t* v);

bool have_audio_support();

}  // namespace vlxtool
