// vlx: the road of one measurement from the command line.  Reads a record
// (a sample file, an audio file or a generated tone), optionally changes its
// rate, averages windowed spectra, reads the peak and writes the trace.
#include "vlx_measure.hpp"

#include <CLI/CLI.hpp>

#include <cmath>
#include <cstdio>
#include <optional>
#include <unistd.h>

using namespace vlxtool;

namespace {

struct ToneSpec {
    double frequency = 0;
    double level_db = 0;
};

ToneSpec parse_tone(const std::string& text) {
    ToneSpec t;
    const auto colon = text.find(':');
    try {
        size_t used = 0;
        t.frequency = std::stod(text.substr(0, colon), &used);
        if (used != text.substr(0, colon).size()) throw std::invalid_argument(text);
        if (colon != std::string::npos) {
            const std::string level = text.substr(colon + 1);
            t.level_db = std::stod(level, &used);
            if (used != level.size()) throw std::invalid_argument(text);
        }
    } catch (const std::exception&) {
        throw Failure{"--tone takes FREQ or FREQ:DBFS, not '" + text + "'"};
    }
    if (!std::isfinite(t.frequency) || !std::isfinite(t.level_db)) throw Failure{"--tone: not a finite number"};
    return t;
}

bool is_power_of_two(int64_t n) { return n > 0 && (n & (n - 1)) == 0; }

void check(int32_t status, const char* what) {
    if (status < 0) throw Failure{std::string(what) + " failed"};
}

// A tone of the given level (dB re an amplitude of 1) plus Gaussian noise of
// the given rms level, `points` samples at `rate`.
void generate(vlx_t* v, int32_t points, double rate, const std::optional<ToneSpec>& tone,
              const std::optional<double>& noise_db) {
    v->points = points;
    v->complex = 0;
    v->delta = 1.0 / rate;
    check(vlx_alloc(v), "allocation");
    check(vlxi_zero(v), "generator");
    if (tone) {
        check(vlxc_cos(v, tone->frequency, 0.0), "tone generator");
        check(vlxi_scale(v, std::pow(10.0, tone->level_db / 20.0)), "tone generator");
    }
    if (noise_db) {
        Vector noise;
        noise->points = points;
        noise->complex = 0;
        noise->delta = v->delta;
        check(vlxc_rand(&noise, 1), "noise generator");
        check(vlxi_scale(&noise, std::pow(10.0, *noise_db / 20.0)), "noise generator");
        check(vlxb_add(v, &noise, v), "noise generator");
    }
}

int32_t default_nfft(int32_t points) {
    int32_t n = 1;
    while (n <= points / 2 && n < 65536) n *= 2;
    return n;
}

struct SpectrumArgs {
    std::string file;
    std::string tone;
    double rate = 0;
    std::optional<double> noise;
    std::string window = "hann";
    int32_t nfft = 0;
    double fraction = 1.0;
    int32_t average = 1;
    double resample_to = 0;
    std::string format;
    std::string out;
    std::string png;
    int channel = 0;
};

int run_spectrum(const SpectrumArgs& a) {
    const int32_t window = window_by_name(a.window);
    if (a.nfft != 0 && (!is_power_of_two(a.nfft) || a.nfft < 4)) throw Failure{"--nfft must be a power of 2 from 4 up"};
    if (!(a.fraction > 0 && a.fraction <= 1)) throw Failure{"--fraction must lie in (0, 1]"};
    if (a.average < 1 || a.average > 100000) throw Failure{"--average must be from 1 to 100000"};
    if (a.file.empty() == a.tone.empty()) throw Failure{"give either an input FILE or --tone"};
    if (a.resample_to < 0 || !std::isfinite(a.resample_to)) throw Failure{"--resample-to must be a positive rate"};

    Vector signal;
    double rate = a.rate;
    if (!a.tone.empty()) {
        if (rate <= 0) rate = 48000;
        const ToneSpec tone = parse_tone(a.tone);
        const int32_t nfft = a.nfft ? a.nfft : 65536;
        const double out_rate = a.resample_to > 0 ? a.resample_to : rate;
        // Enough input for `average` records at the output rate.
        const double needed = std::ceil(nfft * a.fraction) * static_cast<double>(a.average) * rate / out_rate + 1;
        if (needed > 2.0e9) throw Failure{"the record would be too long"};
        generate(&signal, static_cast<int32_t>(needed), rate, tone, a.noise);
    } else {
        Recording rec = read_input(a.file, a.channel);
        check(vlx_copy(&signal, &rec.vectors.front()), "copy");
        if (a.rate > 0) signal->delta = 1.0 / a.rate;
        if (!(signal->delta > 0)) throw Failure{a.file + ": the samples have no positive spacing; give --rate"};
        rate = 1.0 / signal->delta;
    }
    if (a.resample_to > 0) {
        Vector resampled;
        resample(&signal, &resampled, rate / a.resample_to, false);
        check(vlx_copy(&signal, &resampled), "copy");
        rate = a.resample_to;
    }

    SpectrumSettings settings;
    settings.window = window;
    settings.nfft = a.nfft ? a.nfft : default_nfft(static_cast<int32_t>(signal->points / a.fraction));
    settings.fraction = a.fraction;
    settings.average = a.average;
    Vector power;
    Readout r;
    measure_spectrum(&signal, settings, &power, r);

    std::printf("peak         %.2f Hz  %.2f dB\n", r.frequency, r.level_db);
    std::printf("noise floor  %.2f dB per bin (median)\n", r.floor_db);
    std::printf("window       %s: ENBW %.4f bins (%.4g Hz), 3 dB bandwidth %.4f bins (%.4g Hz)\n",
                window_name(window).c_str(), r.enbw_bins, r.enbw_bins * r.bin_hz, r.bw3_bins, r.bw3_bins * r.bin_hz);
    std::printf("record       %d-point transform at %.6g Hz, bin %.6g Hz, %d record%s averaged\n", r.nfft, rate,
                r.bin_hz, r.records, r.records == 1 ? "" : "s");
    std::fflush(stdout);

    Vector db;
    power_to_db(&power, &db);
    if (!a.out.empty() || !a.format.empty()) {
        const std::string path = a.out.empty() ? "-" : a.out;
        const Form form = a.format.empty() ? form_from_path(path) : form_from_name(a.format);
        if (form == Form::audio) throw Failure{"a spectrum cannot be written as audio"};
        write_vectors(path, form, {&db});
    }
    if (!a.png.empty()) {
        char title[160];
        std::snprintf(title, sizeof title, "%s window, %d-point transform, %d average%s: peak %.2f Hz, %.2f dB",
                      window_name(window).c_str(), r.nfft, r.records, r.records == 1 ? "" : "s", r.frequency,
                      r.level_db);
        render_png(&db, a.png, title);
    }
    return 0;
}

int run_resample(const std::string& in, const std::string& out, double to, double ratio, int channel,
                 const std::string& format) {
    if ((to > 0) == (ratio > 0)) throw Failure{"give exactly one of --to HZ and --ratio R"};
    Recording rec = read_input(in, channel);
    vlx_t* src = &rec.vectors.front();
    if (!(src->delta > 0) && to > 0) throw Failure{in + ": the samples have no positive spacing; use --ratio"};
    const double r = ratio > 0 ? ratio : (1.0 / src->delta) / to;
    Vector result;
    resample(src, &result, r, isatty(2) != 0);
    const Form form = format.empty() ? form_from_path(out) : form_from_name(format);
    write_vectors(out, form, {&result});
    return 0;
}

int run_convert(const std::string& in, const std::string& out, const std::string& format, int channel) {
    Recording rec = read_input(in, channel);
    const Form form = format.empty() ? form_from_path(out) : form_from_name(format);
    std::vector<vlx_t*> all;
    for (auto& v : rec.vectors) all.push_back(&v);
    write_vectors(out, form, all);
    return 0;
}

int run_info(const std::string& in, int channel) {
    Recording rec = read_input(in, channel);
    if (rec.audio)
        std::printf("audio: %d channel%s at %.6g Hz (channel %d shown)\n", rec.channels, rec.channels == 1 ? "" : "s",
                    rec.rate, channel);
    for (auto& v : rec.vectors) check(vlxf_fwrite2(&v, stdout, VLX_FORMAT_SUMMARY), "summary");
    return 0;
}

int run_windows() {
    std::printf("%3s  %-18s %10s %12s %12s\n", "id", "name", "ENBW", "3 dB width", "6 dB width");
    for (int32_t id = 0; id < 32; ++id) {
        double enbw = 0, bw3 = 0, bw6 = 0;
        check(vlx_window_metric(&enbw, 0, id, 4096, 4096.0), "window metric");
        check(vlx_window_metric(&bw3, 1, id, 4096, 4096.0), "window metric");
        check(vlx_window_metric(&bw6, 2, id, 4096, 4096.0), "window metric");
        std::printf("%3d  %-18s %10.4f %12.4f %12.4f\n", id, window_name(id).c_str(), enbw, bw3, bw6);
    }
    std::printf("(widths in bins of the window's own length)\n");
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    CLI::App app{"vlx: spectra, rate changes and sample files with libvlx"};
    app.require_subcommand(1);
    app.set_version_flag("--version", "vlx with libvlx " + std::to_string(vlx_version() / 100) + "." +
                                          std::to_string(vlx_version() % 100));

    SpectrumArgs sa;
    auto* spectrum = app.add_subcommand("spectrum", "averaged, windowed spectrum of a record with a peak readout");
    spectrum->add_option("FILE", sa.file, "sample file (text or binary, - for standard input) or audio file");
    spectrum->add_option("--tone", sa.tone, "generate a tone instead: FREQ[:DBFS] (level re an amplitude of 1)");
    spectrum->add_option("--rate", sa.rate, "sample rate in Hz (generated tones: 48000; files: from the file)")
        ->check(CLI::PositiveNumber);
    spectrum->add_option("--noise", sa.noise, "add Gaussian noise of this rms level, dB re 1");
    spectrum->add_option("--window", sa.window, "window name (see 'vlx windows')")->capture_default_str();
    spectrum->add_option("--nfft", sa.nfft, "transform length, a power of 2 (default: the record's, at most 65536)");
    spectrum->add_option("--fraction", sa.fraction, "part of the transform length the record fills, (0, 1]")
        ->capture_default_str();
    spectrum->add_option("--average", sa.average, "number of successive records to average")->capture_default_str();
    spectrum->add_option("--resample-to", sa.resample_to, "change the rate to HZ before the spectrum");
    spectrum->add_option("--format", sa.format, "trace form: binary, text, summary, gnuplot, trace");
    spectrum->add_option("--out", sa.out, "write the trace (dB per bin) here, - for standard output");
    spectrum->add_option("--png", sa.png, "render the trace to this PNG through gnuplot");
    spectrum->add_option("--channel", sa.channel, "channel of an audio file, from 0")->check(CLI::NonNegativeNumber);

    std::string rs_in, rs_out, rs_format;
    double rs_to = 0, rs_ratio = 0;
    int rs_channel = 0;
    auto* resample_cmd = app.add_subcommand("resample", "change the rate of a record, streamed block by block");
    resample_cmd->add_option("IN", rs_in, "input sample or audio file")->required();
    resample_cmd->add_option("OUT", rs_out, "output file (form from its extension, or --format)")->required();
    resample_cmd->add_option("--to", rs_to, "new rate in Hz")->check(CLI::PositiveNumber);
    resample_cmd->add_option("--ratio", rs_ratio, "input samples per output sample")->check(CLI::PositiveNumber);
    resample_cmd->add_option("--format", rs_format, "binary, text, summary, gnuplot, trace or audio");
    resample_cmd->add_option("--channel", rs_channel, "channel of an audio file, from 0")->check(CLI::NonNegativeNumber);

    std::string cv_in, cv_out, cv_format;
    int cv_channel = 0;
    auto* convert = app.add_subcommand("convert", "rewrite a sample or audio file in another form");
    convert->add_option("IN", cv_in, "input file")->required();
    convert->add_option("OUT", cv_out, "output file, - for standard output")->required();
    convert->add_option("--format", cv_format, "binary, text, summary, gnuplot, trace or audio");
    convert->add_option("--channel", cv_channel, "channel of an audio file, from 0")->check(CLI::NonNegativeNumber);

    std::string info_in;
    int info_channel = 0;
    auto* info = app.add_subcommand("info", "one summary line per vector of a file");
    info->add_option("FILE", info_in, "sample or audio file")->required();
    info->add_option("--channel", info_channel, "channel of an audio file, from 0")->check(CLI::NonNegativeNumber);

    auto* windows = app.add_subcommand("windows", "the window catalogue with its bandwidths");

    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp& e) {
        return app.exit(e);
    } catch (const CLI::CallForAllHelp& e) {
        return app.exit(e);
    } catch (const CLI::CallForVersion& e) {
        return app.exit(e);
    } catch (const CLI::ParseError& e) {
        std::fprintf(stderr, "vlx: %s\n", e.what());
        return 2;
    }

    vlx_lib_init();
    int status = 0;
    try {
        if (*spectrum) status = run_spectrum(sa);
        else if (*resample_cmd) status = run_resample(rs_in, rs_out, rs_to, rs_ratio, rs_channel, rs_format);
        else if (*convert) status = run_convert(cv_in, cv_out, cv_format, cv_channel);
        else if (*info) status = run_info(info_in, info_channel);
        else if (*windows) status = run_windows();
    } catch (const Failure& f) {
        std::fprintf(stderr, "vlx: %s\n", f.message.c_str());
        status = 2;
    }
    vlx_free_internal();
    return status;
}
