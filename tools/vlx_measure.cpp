#include "vlx_measure.hpp"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

extern char** environ;

namespace vlxtool {

namespace {

constexpr int32_t kWindowCount = 32;

std::string lower(std::string s) {
    for (char& c : s) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return s;
}

size_t edit_distance(const std::string& a, const std::string& b) {
    std::vector<size_t> row(b.size() + 1);
    for (size_t j = 0; j <= b.size(); ++j) row[j] = j;
    for (size_t i = 1; i <= a.size(); ++i) {
        size_t diagonal = row[0];
        row[0] = i;
        for (size_t j = 1; j <= b.size(); ++j) {
            const size_t up = row[j];
            row[j] = std::min({row[j] + 1, row[j - 1] + 1, diagonal + (a[i - 1] == b[j - 1] ? 0 : 1)});
            diagonal = up;
        }
    }
    return row[b.size()];
}

void check(int32_t status, const char* what) {
    if (status < 0) throw Failure{std::string(what) + " failed"};
}

// The streaming resampler's objects, released on every path.
struct Resampler {
    vlxh_rsmp_coef_t coef;
    vlxh_rsmp_state_t state;
    Resampler(double ratio, int32_t complex) {
        vlxh_rsmp_coef_init(&coef);
        vlxh_rsmp_state_init(&state);
        check(vlxh_rsmp_coef_alloc(&coef, 0), "resampler set-up");
        check(vlxh_rsmp_coef_setup(&coef, ratio, 0, 0), "resampler set-up");
        // No reset: a fresh state discards nothing, and the caller drops
        // the cascade's delay itself.
        check(vlxh_rsmp_state_alloc(&coef, &state, complex), "resampler set-up");
    }
    ~Resampler() {
        vlxh_rsmp_state_destroy(&state);
        vlxh_rsmp_coef_destroy(&coef);
    }
    Resampler(const Resampler&) = delete;
    Resampler& operator=(const Resampler&) = delete;
};

void draw_progress(double done) {
    const int width = 40;
    const int filled = static_cast<int>(done * width);
    std::fprintf(stderr, "\r[%.*s%*s] %3d%%", filled, "########################################", width - filled, "",
                 static_cast<int>(done * 100));
    std::fflush(stderr);
}

}  // namespace

int32_t window_by_name(const std::string& name) {
    int32_t id = -1;
    if (vlx_window_from_str(name.c_str(), &id) == 0) return id;
    // Rank the catalogue's names by edit distance and offer the closest three.
    std::vector<std::pair<size_t, std::string>> ranked;
    for (int32_t i = 0; i < kWindowCount; ++i) {
        const std::string known = window_name(i);
        ranked.emplace_back(edit_distance(lower(name), lower(known)), known);
    }
    std::sort(ranked.begin(), ranked.end());
    std::string hint;
    for (size_t i = 0; i < 3 && i < ranked.size(); ++i) hint += (i ? ", " : "") + ranked[i].second;
    throw Failure{"unknown window '" + name + "'; nearest: " + hint + " (see 'vlx windows')"};
}

std::string window_name(int32_t id) {
    char buffer[64];
    if (vlx_window_to_str(id, buffer, sizeof buffer) < 0) return "?";
    return buffer;
}

void resample(vlx_t* in, vlx_t* out, double ratio, bool progress) {
    if (!(ratio > 0) || !std::isfinite(ratio)) throw Failure{"the ratio must be a positive number"};
    Resampler rs(ratio, in->complex);
    // The group delay is dropped from the front so the output lines up with
    // the input.
    double delay = 0;
    vlxh_rsmp_get_delay_pts(&delay, &rs.coef, 1);
    const int64_t lead = std::max<int64_t>(0, std::llround(delay));
    const int64_t wanted = std::llround(in->points / ratio);
    if (wanted > INT32_MAX) throw Failure{"the result would be too long"};

    const int32_t block_out = 4096;
    int32_t block_in = 0;
    check(vlxh_rsmp_get_in_pts(&block_in, &rs.coef, block_out, 0), "resampler");
    block_in = std::max(block_in, 1);

    Vector block, piece, work;
    out->points = 0;
    out->complex = in->complex;
    check(vlx_alloc(out), "allocation");
    out->points = 0;
    int64_t dropped = 0, consumed = 0;
    // Past the input, zeros flush the filters; bounded by the delay.
    const int64_t feed_limit = static_cast<int64_t>(in->points) + static_cast<int64_t>((lead + 1024) * ratio) + 8 * block_in;
    while (out->points < wanted && consumed < feed_limit) {
        const int64_t take = std::min<int64_t>(block_in, std::max<int64_t>(0, in->points - consumed));
        if (take > 0) {
            check(vlxu_subvec(in, &block, static_cast<int32_t>(consumed), static_cast<int32_t>(take)), "resampler");
        } else {
            block->points = block_in;
            block->complex = in->complex;
            check(vlx_alloc(&block), "allocation");
            check(vlxi_zero(&block), "resampler");
        }
        block->delta = in->delta;
        consumed += block->points;
        int32_t limit = 0;
        check(vlxh_rsmp_get_out_pts(&limit, &rs.coef, block->points, 0, 0), "resampler");
        piece->points = limit;
        check(vlxh_rsmp(&block, &piece, &work, &rs.coef, &rs.state), "resampling");
        int32_t start = 0;
        if (dropped < lead) {
            start = static_cast<int32_t>(std::min<int64_t>(lead - dropped, piece->points));
            dropped += start;
        }
        const int32_t keep = static_cast<int32_t>(std::min<int64_t>(piece->points - start, wanted - out->points));
        if (keep > 0) {
            Vector part;
            check(vlxu_subvec(&piece, &part, start, keep), "resampling");
            check(vlx_append(out, &part), "allocation");
        }
        if (progress) draw_progress(std::min(1.0, static_cast<double>(out->points) / std::max<int64_t>(wanted, 1)));
    }
    if (progress) std::fputc('\n', stderr);
    out->delta = in->delta * ratio;
}

void measure_spectrum(vlx_t* signal, const SpectrumSettings& s, vlx_t* power, Readout& r) {
    if (signal->points < 1) throw Failure{"the record is empty"};
    const int32_t nfft = s.nfft;
    // Each record is nfft * fraction samples long (the rest is zero padding).
    const int32_t span = std::max<int32_t>(1, static_cast<int32_t>(std::ceil(nfft * s.fraction)));
    const int32_t records = std::max<int32_t>(1, std::min<int32_t>(s.average, signal->points / span));
    Vector record, spectrum, work;
    for (int32_t i = 0; i < records; ++i) {
        const int32_t start = i * span;
        check(vlxu_subvec(signal, &record, start, std::min(span, signal->points - start)), "record");
        record->delta = signal->delta;
        check(vlxh_fft(&record, &spectrum, nfft, s.fraction, s.window, 0), "spectrum");
        check(vlxh_avg(&spectrum, power, &work, VLX_AVG_LINEAR | VLX_AVG_POWER, i + 1, 0, -1.0, 0.0), "averaging");
    }
    power->delta = spectrum->delta;

    // The peak bin gives the level (a sine's peak bin reads its amplitude);
    // the power centroid over the main lobe gives where the peak lies, which
    // is unbiased for any symmetric window, unlike a parabola through a flat
    // top.
    Vector peak;
    check(vlxs_peak(power, &peak, VLX_PEAK_SAMPLE, 0), "peak search");
    r.level_db = 10.0 * std::log10(std::max(peak->data[0], 1e-40));
    const int32_t top = static_cast<int32_t>(peak->data[1]);
    const double width = std::min<double>(span, signal->points);
    double bw6 = 0;
    check(vlx_window_metric(&bw6, 2, s.window, nfft, width), "window metric");
    const int32_t half = std::max<int32_t>(2, static_cast<int32_t>(std::ceil(1.5 * bw6)));
    double moment = 0, total = 0;
    for (int32_t k = std::max(0, top - half); k <= std::min(power->points - 1, top + half); ++k) {
        moment += power->data[k] * k;
        total += power->data[k];
    }
    const double index = total > 0 ? moment / total : top;
    // A complex record gives a two-sided spectrum with zero frequency in the middle.
    r.frequency = (signal->complex ? index - power->points / 2 : index) * power->delta;
    Vector median;
    check(vlxs_median(power, &median), "noise floor");
    r.floor_db = 10.0 * std::log10(std::max(median->data[0], 1e-40));
    check(vlx_window_metric(&r.enbw_bins, 0, s.window, nfft, width), "window metric");
    check(vlx_window_metric(&r.bw3_bins, 1, s.window, nfft, width), "window metric");
    r.bin_hz = power->delta;
    r.records = records;
    r.nfft = nfft;
}

void power_to_db(const vlx_t* power, vlx_t* db) {
    db->points = power->points;
    db->complex = 0;
    check(vlx_alloc(db), "allocation");
    for (int32_t i = 0; i < power->points; ++i) db->data[i] = 10.0 * std::log10(std::max(power->data[i], 1e-40));
    db->delta = power->delta;
}

void render_png(const vlx_t* db, const std::string& png, const std::string& title) {
    char data_name[] = "/tmp/vlx-plot-XXXXXX";
    const int fd = mkstemp(data_name);
    if (fd < 0) throw Failure{"cannot create a temporary file for gnuplot"};
    FILE* data = fdopen(fd, "w");
    for (int32_t i = 0; i < db->points; ++i) std::fprintf(data, "%.9g %.6g\n", i * db->delta, db->data[i]);
    std::fclose(data);
    const std::string partial = png + ".partial-" + std::to_string(getpid());
    std::string quoted_title;
    for (char c : title) quoted_title += (c == '"' ? '\'' : c);
    const std::string script =
        "set terminal pngcairo size 1000,560 enhanced font 'Sans,10'\n"
        "set output '" + partial + "'\n"
        "set title \"" + quoted_title + "\"\n"
        "set xlabel 'Frequency (Hz)'\nset ylabel 'Level (dB re 1)'\nset grid\nset key off\n"
        "plot '" + std::string(data_name) + "' using 1:2 with lines lw 1 lc rgb '#1f5fa8'\n";
    char script_name[] = "/tmp/vlx-plot-XXXXXX";
    const int sfd = mkstemp(script_name);
    if (sfd < 0) {
        std::remove(data_name);
        throw Failure{"cannot create a temporary file for gnuplot"};
    }
    FILE* sf = fdopen(sfd, "w");
    std::fputs(script.c_str(), sf);
    std::fclose(sf);

    pid_t pid = 0;
    char arg0[] = "gnuplot";
    char* argv[] = {arg0, script_name, nullptr};
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    const int spawned = posix_spawnp(&pid, "gnuplot", &actions, nullptr, argv, environ);
    posix_spawn_file_actions_destroy(&actions);
    int status = 0;
    if (spawned == 0) waitpid(pid, &status, 0);
    std::remove(data_name);
    std::remove(script_name);
    if (spawned != 0) throw Failure{"--png needs gnuplot, which is not installed (apt-get install gnuplot-nox)"};
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0 || std::rename(partial.c_str(), png.c_str()) != 0) {
        std::remove(partial.c_str());
        throw Failure{png + ": gnuplot could not render the picture"};
    }
}

}  // namespace vlxtool
