#include "vlx_io.hpp"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cerrno>
#include <cstring>
#include <unistd.h>

#ifdef VLX_TOOL_HAVE_SNDFILE
#include <sndfile.h>
#endif

namespace vlxtool {

namespace {

std::string lower(std::string s) {
    for (char& c : s) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return s;
}

std::string extension(const std::string& path) {
    const auto slash = path.find_last_of('/');
    const auto dot = path.find_last_of('.');
    if (dot == std::string::npos || (slash != std::string::npos && dot < slash)) return "";
    return lower(path.substr(dot + 1));
}

bool is_audio_extension(const std::string& ext) {
    return ext == "wav" || ext == "flac" || ext == "aif" || ext == "aiff" || ext == "ogg" || ext == "au";
}

#ifdef VLX_TOOL_HAVE_SNDFILE
// Reads one channel of an audio file as a real vector with delta 1/rate.
// Returns false when libsndfile does not recognise the file.
bool read_audio(const std::string& path, int channel, Recording& rec) {
    SF_INFO info{};
    SNDFILE* file = sf_open(path.c_str(), SFM_READ, &info);
    if (!file) return false;
    if (channel < 0 || channel >= info.channels) {
        sf_close(file);
        throw Failure{path + ": no channel " + std::to_string(channel) + " (the file has " +
                      std::to_string(info.channels) + ")"};
    }
    if (info.frames > INT32_MAX) {
        sf_close(file);
        throw Failure{path + ": too long for one record"};
    }
    std::vector<double> frames(static_cast<size_t>(info.frames) * static_cast<size_t>(info.channels));
    const sf_count_t got = sf_readf_double(file, frames.data(), info.frames);
    sf_close(file);
    Vector v;
    v->points = static_cast<int32_t>(got);
    v->complex = 0;
    if (vlx_alloc(&v) < 0) throw Failure{path + ": out of memory"};
    for (sf_count_t i = 0; i < got; ++i) v->data[i] = frames[static_cast<size_t>(i * info.channels + channel)];
    v->delta = 1.0 / info.samplerate;
    rec.audio = true;
    rec.channels = info.channels;
    rec.rate = info.samplerate;
    rec.vectors.push_back(std::move(v));
    return true;
}
#endif

}  // namespace

bool have_audio_support() {
#ifdef VLX_TOOL_HAVE_SNDFILE
    return true;
#else
    return false;
#endif
}

Recording read_input(const std::string& path, int channel) {
    Recording rec;
    if (path != "-" && access(path.c_str(), R_OK) != 0)
        throw Failure{path + ": " + std::strerror(errno)};
#ifdef VLX_TOOL_HAVE_SNDFILE
    if (path != "-" && read_audio(path, channel, rec)) return rec;
#else
    if (is_audio_extension(extension(path)))
        throw Failure{path + ": audio files need libsndfile, which this vlx was built without"};
#endif
    (void)channel;
    FILE* in = vlxf_fopen(path.c_str(), "rb");
    if (!in) throw Failure{path + ": " + std::strerror(errno)};
    for (;;) {
        Vector v;
        const int32_t r = vlxf_fread(&v, in);
        if (r == 0) break;
        if (r < 0) {
            vlxf_fclose(in);
            throw Failure{path + ": not a readable sample file (corrupt or truncated at vector " +
                          std::to_string(rec.vectors.size() + 1) + ")"};
        }
        // White space after the last vector of a text file reads as one
        // more, empty vector: it carries nothing.
        if (v->points > 0) rec.vectors.push_back(std::move(v));
    }
    vlxf_fclose(in);
    if (rec.vectors.empty()) throw Failure{path + ": holds no samples"};
    if (rec.vectors.front()->delta > 0) rec.rate = 1.0 / rec.vectors.front()->delta;
    return rec;
}

Form form_from_name(const std::string& name) {
    const std::string n = lower(name);
    if (n == "binary") return Form::binary;
    if (n == "text" || n == "ascii") return Form::text;
    if (n == "summary") return Form::summary;
    if (n == "gnuplot") return Form::gnuplot;
    if (n == "trace") return Form::trace;
    if (n == "audio" || n == "wav") return Form::audio;
    throw Failure{"unknown format '" + name + "' (binary, text, summary, gnuplot, trace, audio)"};
}

Form form_from_path(const std::string& path) {
    const std::string ext = extension(path);
    if (ext == "txt" || ext == "dat" || ext == "asc") return Form::text;
    if (ext == "gp" || ext == "gnuplot" || ext == "plt") return Form::gnuplot;
    if (ext == "tsv" || ext == "trace") return Form::trace;
    if (is_audio_extension(ext)) return Form::audio;
    return Form::binary;
}

Output::Output(std::string path) : path_(std::move(path)) {
    if (path_ == "-") {
        stream_ = vlxf_fopen("-", "wb");
        return;
    }
    temp_ = path_ + ".partial-" + std::to_string(getpid());
    stream_ = std::fopen(temp_.c_str(), "wb");
    if (!stream_) throw Failure{path_ + ": " + std::strerror(errno)};
}

Output::~Output() {
    if (path_ == "-") {
        if (stream_) std::fflush(stream_);
        return;
    }
    if (stream_) std::fclose(stream_);
    if (!committed_) std::remove(temp_.c_str());
}

void Output::commit() {
    if (path_ == "-") {
        std::fflush(stream_);
        return;
    }
    const bool flushed = std::fflush(stream_) == 0 && !std::ferror(stream_);
    const bool closed = std::fclose(stream_) == 0;
    stream_ = nullptr;
    if (!flushed || !closed) throw Failure{path_ + ": write failed"};
    if (std::rename(temp_.c_str(), path_.c_str()) != 0) throw Failure{path_ + ": " + std::strerror(errno)};
    committed_ = true;
}

void write_vectors(const std::string& path, Form form, std::vector<vlx_t*> vectors) {
    if (form == Form::audio) {
        if (vectors.size() != 1) throw Failure{path + ": an audio file takes one vector"};
        write_audio(path, vectors.front());
        return;
    }
    int32_t selector = VLX_FORMAT_BINARY;
    switch (form) {
        case Form::binary: selector = VLX_FORMAT_BINARY; break;
        case Form::text: selector = VLX_FORMAT_ASCII; break;
        case Form::summary: selector = VLX_FORMAT_SUMMARY; break;
        case Form::gnuplot: selector = VLX_FORMAT_GNUPLOT; break;
        case Form::trace: selector = VLX_FORMAT_TRACE; break;
        case Form::audio: break;
    }
    Output out(path);
    for (vlx_t* v : vectors)
        if (vlxf_fwrite2(v, out.stream(), selector) < 0) throw Failure{path + ": write failed"};
    out.commit();
}

void write_audio(const std::string& path, const vlx_t* v) {
#ifdef VLX_TOOL_HAVE_SNDFILE
    if (v->complex) throw Failure{path + ": an audio file takes real samples"};
    if (!(v->delta > 0)) throw Failure{path + ": the samples have no positive spacing, so no rate"};
    const std::string ext = extension(path);
    SF_INFO info{};
    info.channels = 1;
    info.samplerate = static_cast<int>(std::lround(1.0 / v->delta));
    if (ext == "flac") info.format = SF_FORMAT_FLAC | SF_FORMAT_PCM_24;
    else if (ext == "aif" || ext == "aiff") info.format = SF_FORMAT_AIFF | SF_FORMAT_FLOAT;
    else info.format = SF_FORMAT_WAV | SF_FORMAT_FLOAT;
    const std::string temp = path + ".partial-" + std::to_string(getpid()) + "." + (ext.empty() ? "wav" : ext);
    SNDFILE* file = sf_open(temp.c_str(), SFM_WRITE, &info);
    if (!file) throw Failure{path + ": " + sf_strerror(nullptr)};
    const sf_count_t n = v->points > 0 ? v->points : 0;
    const bool ok = sf_write_double(file, v->data, n) == n;
    sf_close(file);
    if (!ok || std::rename(temp.c_str(), path.c_str()) != 0) {
        std::remove(temp.c_str());
        throw Failure{path + ": write failed"};
    }
#else
    (void)v;
    throw Failure{path + ": audio files need libsndfile, which this vlx was built without"};
#endif
}

}  // namespace vlxtool
