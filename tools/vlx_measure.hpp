// The road of one measurement, as the vlx tool runs it: a record, an
// optional rate change, windowed spectra averaged over successive records,
// and the readout of the peak.
#pragma once

#include "vlx_io.hpp"

#include <string>
#include <vector>

namespace vlxtool {

// A window id by name (case-insensitive); Failure with the nearest names
// when there is no such window.
int32_t window_by_name(const std::string& name);
std::string window_name(int32_t id);

// Streams `in` through the library's streaming resampler in blocks, at
// `ratio` input samples per output sample, and returns the result aligned
// with the input (start-up and group delay removed) and
// round(points / ratio) points long.  `progress` draws a bar on stderr.
void resample(vlx_t* in, vlx_t* out, double ratio, bool progress);

struct SpectrumSettings {
    int32_t window = 0;
    int32_t nfft = 0;      // transform length (a power of 2)
    double fraction = 1;  // part of the transform length the record fills
    int32_t average = 1;  // records to average
};

struct Readout {
    double frequency = 0;     // of the peak, from its fractional index
    double level_db = 0;      // peak amplitude, dB re 1
    double floor_db = 0;      // median bin level, dB re 1
    double enbw_bins = 0;     // equivalent noise bandwidth of the window
    double bw3_bins = 0;      // 3 dB bandwidth of the window
    double bin_hz = 0;        // spacing of the spectrum
    int32_t records = 0;      // records averaged
    int32_t nfft = 0;
};

// Averaged power spectrum of successive records of `signal`: `power` gets
// the mean power per bin (delta the bin spacing), `readout` the figures.
void measure_spectrum(vlx_t* signal, const SpectrumSettings& settings, vlx_t* power, Readout& readout);

// Power in dB re 1 (10 log10, floored at -400 dB), delta kept.
void power_to_db(const vlx_t* power, vlx_t* db);

// Renders a dB trace to PNG through gnuplot; Failure when gnuplot is missing
// or fails.
void render_png(const vlx_t* db, const std::string& png, const std::string& title);

}  // namespace vlxtool
