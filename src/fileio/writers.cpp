// Writers of sample files: the binary and text forms the reader takes back,
// a one-line summary, a gnuplot script and a tab-separated trace.  Numbers
// are printed in the C locale whatever the caller's locale is.
#include "fileio/fileio.hpp"

#include "core/platform.hpp"
#include "core/precise_math.hpp"
#include "filters/filters.hpp"
#include "stats/stats.hpp"

#include <cstdint>
#include <cstdio>

#if defined(__SANITIZE_ADDRESS__)
#define VLX_LSAN 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define VLX_LSAN 1
#endif
#endif
#if defined(VLX_LSAN)
#include <sanitizer/lsan_interface.h>
#endif

namespace vlx {
namespace {

constexpr int32_t kind_binary = VLX_FORMAT_BINARY;
constexpr int32_t kind_ascii = VLX_FORMAT_ASCII;
constexpr int32_t kind_summary = VLX_FORMAT_SUMMARY;
constexpr int32_t kind_gnuplot = VLX_FORMAT_GNUPLOT;
constexpr int32_t kind_trace = VLX_FORMAT_TRACE;

// The number conversions: 16 significant digits for double vectors, 7 for
// float ones, which are widened for printing.
template <VlxVector V>
struct number_text;
template <>
struct number_text<vlx_t> {
    static constexpr const char* one = "%.16g";
    static constexpr const char* line = "%.16g\n";
    static constexpr const char* pair = "%.16g %.16g\n";
    static constexpr const char* triple = "%.16g %.16g %.16g\n";
    static constexpr const char* tab_pair = "%.16g\t%.16g\n";
};
template <>
struct number_text<vlxf_t> {
    static constexpr const char* one = "%.7g";
    static constexpr const char* line = "%.7g\n";
    static constexpr const char* pair = "%.7g %.7g\n";
    static constexpr const char* triple = "%.7g %.7g %.7g\n";
    static constexpr const char* tab_pair = "%.7g\t%.7g\n";
};

template <VlxVector V>
inline int64_t points_to_write(const V* v) {
    return v->points < 0 ? 0 : v->points;
}

// ---- format 0: binary form 3 ----

template <VlxVector V>
int32_t binary_header(const V* v, std::FILE* f) {
    const uint32_t magic = 0xEB0330BEu;
    const uint32_t type = sizeof(real_t<V>) == 8 ? 1032u : 1028u;
    if (std::fwrite(&magic, 4, 1, f) != 1) return -1;
    if (std::fwrite(&type, 4, 1, f) != 1) return -1;
    if (std::fwrite(&v->points, 4, 1, f) != 1) return -1;
    if (std::fwrite(&v->complex, 4, 1, f) != 1) return -1;
    if (std::fwrite(&v->delta, sizeof v->delta, 1, f) != 1) return -1;
    return 0;
}

template <VlxVector V>
int32_t binary_data(const V* v, std::FILE* f) {
    const int64_t n = v->complex != 0 ? 2 * points_to_write(v) : points_to_write(v);
    if (n == 0) return 0;
    const size_t count = static_cast<size_t>(n);
    return std::fwrite(v->data, sizeof(real_t<V>), count, f) == count ? 0 : -1;
}

// ---- format 1: text ----

template <VlxVector V>
int32_t ascii_header(const V* v, std::FILE* f) {
    std::fputs("#VLX ASCII data from libvlx package\n", f);
    std::fprintf(f, "#VLX points = %ld\n", static_cast<long>(v->points));
    std::fprintf(f, "#VLX complex = %d\n", static_cast<int>(v->complex));
    std::fprintf(f, "#VLX type = %lu\n", static_cast<unsigned long>(sizeof(real_t<V>)));
    std::fputs("#VLX delta = ", f);
    std::fprintf(f, number_text<V>::line, static_cast<double>(v->delta));
    return 0;
}

template <VlxVector V>
int32_t ascii_data(const V* v, std::FILE* f) {
    const int64_t n = points_to_write(v);
    const real_t<V>* x = v->data;
    for (int64_t i = 0; i < n; ++i) {
        if (v->complex != 0)
            std::fprintf(f, number_text<V>::pair, static_cast<double>(x[2 * i]), static_cast<double>(x[2 * i + 1]));
        else
            std::fprintf(f, number_text<V>::line, static_cast<double>(x[i]));
    }
    return 0;
}

// ---- format 2: one-line summary ----

// Four significant digits for small and huge magnitudes, whole numbers in
// between (and for NaN); compared in the vector's precision, where the
// float 999999999 is 1e9.
template <VlxVector V>
void summary_number(std::FILE* f, real_t<V> x) {
    using T = real_t<V>;
    const bool short_form = (x > T(-9999) && x < T(9999)) || x > T(999999999) || x < T(-999999999);
    std::fprintf(f, short_form ? "%.4g" : "%.0f", static_cast<double>(x));
}

constexpr int64_t summary_samples = 32;

template <VlxVector V>
int32_t summary_header(const V* v, std::FILE* f) {
    std::fputs("[", f);
    summary_number<V>(f, static_cast<real_t<V>>(v->points));
    std::fputs("/", f);
    summary_number<V>(f, v->delta);
    std::fputs(v->points > 0 ? "] " : "]", f);
    return 0;
}

template <VlxVector V>
int32_t summary_data(const V* v, std::FILE* f, bool no_data) {
    // The line is ended even when only the header (or nothing) was written.
    if (no_data) {
        std::fputs("\n", f);
        return 0;
    }
    const int64_t n = points_to_write(v) < summary_samples ? points_to_write(v) : summary_samples;
    for (int64_t i = 0; i < n; ++i) {
        if (i > 0) std::fputs(" ", f);
        if (v->complex != 0) {
            summary_number<V>(f, v->data[2 * i]);
            std::fputs(",", f);
            summary_number<V>(f, v->data[2 * i + 1]);
        } else {
            summary_number<V>(f, v->data[i]);
        }
    }
    if (v->points > summary_samples) std::fputs(" ...", f);
    std::fputs("\n", f);
    return 0;
}

// ---- format 3: gnuplot script ----

template <VlxVector V>
int32_t gnuplot_header(const V* v, std::FILE* f) {
    std::fputs("# gnuplot data from libvlx package\nset zeroaxis\n\n", f);
    if (v->complex == 0) {
        std::fputs("plot '-' title \"Data\" with lines\n\n# X Y\n", f);
        return 0;
    }
    // The commented plots are alternatives a user enables by hand.
    std::fputs("plot '-' using 1:(sqrt($2**2+$3**2)) title \"Magnitude\" with lines\n"
               "#plot '-' using 1:(atan2($3,$2)) title \"Phase\" with lines\n"
               "#plot '-' using 1:2 title \"Real\" with lines\n"
               "#plot '-' using 1:3 title \"Imag\" with lines\n"
               "#plot '-' using 2:3 title \"Real vs. Imag\" with lines\n"
               "#splot '-' title \"Data\" with lines\n"
               "\n"
               "# X Yreal Yimag\n",
               f);
    return 0;
}

template <VlxVector V>
int32_t gnuplot_data(const V* v, std::FILE* f) {
    using T = real_t<V>;
    const int64_t n = points_to_write(v);
    for (int64_t i = 0; i < n; ++i) {
        // The abscissa is formed in the vector's precision.
        const T x = static_cast<T>(i) * v->delta;
        if (v->complex != 0)
            std::fprintf(f, number_text<V>::triple, static_cast<double>(x), static_cast<double>(v->data[2 * i]),
                         static_cast<double>(v->data[2 * i + 1]));
        else
            std::fprintf(f, number_text<V>::pair, static_cast<double>(x), static_cast<double>(v->data[i]));
    }
    return 0;
}

// ---- format 4: trace ----

// Value of a peak search into the work vector.
template <VlxVector V>
int32_t peak_value(const V* v, V* work, int32_t flags, real_t<V>* value) {
    const int32_t status = peak(v, work, flags, 0);
    if (status < 0) return status;
    *value = work->data[0];
    return 0;
}

// The largest magnitude, refined by a parabola unless the sample search hit
// the bound: complex samples by the root of their power, real ones by the
// larger of the maximum's and the minimum's magnitudes.
template <VlxVector V>
int32_t trace_magnitude(const V* v, V* work, real_t<V>* out) {
    using T = real_t<V>;
    constexpr T gate = family<V>::bound;
    T value;
    int32_t status;
    if (v->complex != 0) {
        if ((status = peak_value(v, work, 0, &value)) < 0) return status;
        T a = own_sqrt(value);
        if (a < gate) {
            if ((status = peak_value(v, work, VLX_PEAK_PARABOLA, &value)) < 0) return status;
            a = own_sqrt(value);
        }
        *out = a;
        return 0;
    }
    if ((status = peak_value(v, work, 0, &value)) < 0) return status;
    T a = std::fabs(value);
    if (a < gate) {
        if ((status = peak_value(v, work, VLX_PEAK_PARABOLA, &value)) < 0) return status;
        a = std::fabs(value);
    }
    if ((status = peak_value(v, work, VLX_PEAK_MIN, &value)) < 0) return status;
    T b = std::fabs(value);
    if (b < gate) {
        if ((status = peak_value(v, work, VLX_PEAK_MIN | VLX_PEAK_PARABOLA, &value)) < 0) return status;
        b = std::fabs(value);
    }
    if (b > a) a = b;
    *out = a;
    return 0;
}

template <VlxVector V>
int32_t trace_header(const V* v, std::FILE* f) {
    std::fputs("LibvlxData\tTrue\n", f);
    // The work vector is deliberately never destroyed: its storage stays
    // allocated on every path, as the trace writer has always done.
    V work;
    init(&work);
    real_t<V> magnitude = 0;
    const int32_t status = trace_magnitude(v, &work, &magnitude);
#if defined(VLX_LSAN)
    if (work.data != nullptr) __lsan_ignore_object(work.data);
#endif
    if (status < 0) return status;
    std::fputs("InputRange\t", f);
    std::fprintf(f, number_text<V>::line, static_cast<double>(auto_range<V>(magnitude)));
    std::fprintf(f, "InputZoom\t%s\n", v->complex != 0 ? "True" : "False");
    std::fputs("TrcTtl\tLibvlx Data\n", f);
    std::fputs("XDelta\t", f);
    std::fprintf(f, number_text<V>::line, static_cast<double>(v->delta));
    std::fputs("Y\n", f);
    return 0;
}

template <VlxVector V>
int32_t trace_data(const V* v, std::FILE* f) {
    const int64_t n = points_to_write(v);
    for (int64_t i = 0; i < n; ++i) {
        if (v->complex != 0)
            std::fprintf(f, number_text<V>::tab_pair, static_cast<double>(v->data[2 * i]),
                         static_cast<double>(v->data[2 * i + 1]));
        else
            std::fprintf(f, number_text<V>::line, static_cast<double>(v->data[i]));
    }
    return 0;
}

}  // namespace

template <VlxVector V>
real_t<V> auto_range(real_t<V> value) {
    using T = real_t<V>;
    if (value <= T(0)) value = T(1);
    // The decade's exponent in the vector's precision, its power in double.
    const T p = static_cast<T>(pow64(10.0, static_cast<double>(own_floor(own_log10(value)))));
    const T steps[4] = {p, T(2) * p, T(4) * p, T(5) * p};
    T r = T(10) * p;
    for (const T step : steps) {
        // A value a rounding error above a step stays on it.
        if (!(value > step) || nearly_equal<V>(value, step)) {
            r = step;
            break;
        }
    }
    return r > family<V>::bound ? family<V>::bound : r;
}

template <VlxVector V>
int32_t file_write(const V* v, std::FILE* f, int32_t format) {
    const int32_t kind = format & 0xFF;
    if (kind > kind_trace) return -1;
    const bool header = (format & VLX_FORMAT_NO_HEADER) == 0;
    const bool data = (format & VLX_FORMAT_NO_DATA) == 0;
    platform::CLocaleScope c_numbers;
    int32_t status = 0;
    switch (kind) {
    case kind_binary:
        if (header && (status = binary_header(v, f)) < 0) return status;
        if (data && (status = binary_data(v, f)) < 0) return status;
        return 0;
    case kind_ascii:
        if (header) ascii_header(v, f);
        if (data) ascii_data(v, f);
        return 0;
    case kind_summary:
        if (header) summary_header(v, f);
        return summary_data(v, f, !data);
    case kind_gnuplot:
        if (header) gnuplot_header(v, f);
        if (data) gnuplot_data(v, f);
        // Blocks appended with a flag set are left open for the caller.
        if (header && data) std::fputs("e\n\npause mouse key\n", f);
        return 0;
    case kind_trace:
        if (header && (status = trace_header(v, f)) < 0) return status;
        if (data) trace_data(v, f);
        return 0;
    default:
        return -1;
    }
}

#define VLX_INSTANTIATE(V)                                               \
    template int32_t file_write<V>(const V*, std::FILE*, int32_t);       \
    template real_t<V> auto_range<V>(real_t<V>);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxf_fwrite(const vlx_t* v, FILE* stream) { return vlx::file_write(v, stream, VLX_FORMAT_BINARY); }
VLX_API int32_t vlxff_fwrite(const vlxf_t* v, FILE* stream) { return vlx::file_write(v, stream, VLX_FORMAT_BINARY); }
VLX_API int32_t vlxf_fwrite_ascii(const vlx_t* v, FILE* stream) { return vlx::file_write(v, stream, VLX_FORMAT_ASCII); }
VLX_API int32_t vlxff_fwrite_ascii(const vlxf_t* v, FILE* stream) {
    return vlx::file_write(v, stream, VLX_FORMAT_ASCII);
}
VLX_API int32_t vlxf_fwrite2(const vlx_t* v, FILE* stream, int32_t format) {
    return vlx::file_write(v, stream, format);
}
VLX_API int32_t vlxff_fwrite2(const vlxf_t* v, FILE* stream, int32_t format) {
    return vlx::file_write(v, stream, format);
}
VLX_API double vlxf_auto_range(double value) { return vlx::auto_range<vlx_t>(value); }
VLX_API float vlxff_auto_range(float value) { return vlx::auto_range<vlxf_t>(value); }
}
