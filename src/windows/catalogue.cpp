// The window catalogue: every name that stands for a window id, and the two
// conversions between a name and an id.
#include "windows/windows.hpp"

#include <cctype>
#include <cstring>

namespace vlx {
namespace {

struct NameRow {
    const char* name;
    int32_t id;
};

// Short names first, each id's names in order (the first is canonical), then
// the constant-style twin of every short name in the same order.  The two
// families share the table: their contents are identical.
constexpr NameRow name_table[] = {
    {"Uniform", 0}, {"Rectangular", 0}, {"None", 0}, {"P000", 0},
    {"Bartlett", 1}, {"Triangular", 1},
    {"Hann", 2}, {"P110", 2},
    {"Hamming", 3}, {"P100", 3},
    {"Blackman", 4},
    {"Blackman_Harris3", 5}, {"P200", 5},
    {"Blackman_Harris4", 6}, {"P310", 6}, {"Lowleak", 6},
    {"Gausstop", 7}, {"P400", 7}, {"Cheby5", 7},
    {"Flat4", 8}, {"P301", 8},
    {"Flattop", 9}, {"Flat5", 9}, {"P401", 9},
    {"Flat6", 10}, {"P511", 10},
    {"Flat7", 11}, {"P611", 11},
    {"P501", 12},
    {"P601", 13},
    {"Kaiser70", 14}, {"Kaiser80", 15}, {"Kaiser90", 16}, {"Kaiser100", 17}, {"Kaiser110", 18}, {"Kaiser120", 19},
    {"Gauss60", 20}, {"Gauss70", 21}, {"Gauss80", 22},
    {"Riemann", 23}, {"Sinc_Lobe", 23},
    {"Tukey25", 24},
    {"Cos_Lobe", 25}, {"RRC", 25}, {"Sqrt_Hann", 25},
    {"Cheby6", 26},
    {"Cheby7", 27},
    {"Cheby4", 28}, {"Nuttall", 28}, {"Blackman_Nuttall", 28},
    {"Orig_Blackman_Harris4", 29},
    {"Kaiser89", 30},
    {"Gauss73", 31},

    {"VLX_WINDOW_UNIFORM", 0}, {"VLX_WINDOW_RECTANGULAR", 0}, {"VLX_WINDOW_NONE", 0}, {"VLX_WINDOW_P000", 0},
    {"VLX_WINDOW_BARTLETT", 1}, {"VLX_WINDOW_TRIANGULAR", 1},
    {"VLX_WINDOW_HANN", 2}, {"VLX_WINDOW_P110", 2},
    {"VLX_WINDOW_HAMMING", 3}, {"VLX_WINDOW_P100", 3},
    {"VLX_WINDOW_BLACKMAN", 4},
    {"VLX_WINDOW_BLACKMAN_HARRIS3", 5}, {"VLX_WINDOW_P200", 5},
    {"VLX_WINDOW_BLACKMAN_HARRIS4", 6}, {"VLX_WINDOW_P310", 6}, {"VLX_WINDOW_LOWLEAK", 6},
    {"VLX_WINDOW_GAUSSTOP", 7}, {"VLX_WINDOW_P400", 7}, {"VLX_WINDOW_CHEBY5", 7},
    {"VLX_WINDOW_FLAT4", 8}, {"VLX_WINDOW_P301", 8},
    {"VLX_WINDOW_FLATTOP", 9}, {"VLX_WINDOW_FLAT5", 9}, {"VLX_WINDOW_P401", 9},
    {"VLX_WINDOW_FLAT6", 10}, {"VLX_WINDOW_P511", 10},
    {"VLX_WINDOW_FLAT7", 11}, {"VLX_WINDOW_P611", 11},
    {"VLX_WINDOW_P501", 12},
    {"VLX_WINDOW_P601", 13},
    {"VLX_WINDOW_KAISER70", 14}, {"VLX_WINDOW_KAISER80", 15}, {"VLX_WINDOW_KAISER90", 16},
    {"VLX_WINDOW_KAISER100", 17}, {"VLX_WINDOW_KAISER110", 18}, {"VLX_WINDOW_KAISER120", 19},
    {"VLX_WINDOW_GAUSS60", 20}, {"VLX_WINDOW_GAUSS70", 21}, {"VLX_WINDOW_GAUSS80", 22},
    {"VLX_WINDOW_RIEMANN", 23}, {"VLX_WINDOW_SINC_LOBE", 23},
    {"VLX_WINDOW_TUKEY25", 24},
    {"VLX_WINDOW_COS_LOBE", 25}, {"VLX_WINDOW_RRC", 25}, {"VLX_WINDOW_SQRT_HANN", 25},
    {"VLX_WINDOW_CHEBY6", 26},
    {"VLX_WINDOW_CHEBY7", 27},
    {"VLX_WINDOW_CHEBY4", 28}, {"VLX_WINDOW_NUTTALL", 28}, {"VLX_WINDOW_BLACKMAN_NUTTALL", 28},
    {"VLX_WINDOW_ORIG_BLACKMAN_HARRIS4", 29},
    {"VLX_WINDOW_KAISER89", 30},
    {"VLX_WINDOW_GAUSS73", 31},
};
static_assert(sizeof(name_table) / sizeof(name_table[0]) == 106, "53 short names and their constant-style twins");

// Whole-string comparison through the standard tolower, both sides.
bool same_name(const char* a, const char* b) {
    for (;; ++a, ++b) {
        const int ca = std::tolower(static_cast<unsigned char>(*a));
        const int cb = std::tolower(static_cast<unsigned char>(*b));
        if (ca != cb) return false;
        if (ca == 0) return true;
    }
}

}  // namespace

int32_t window_from_str(const char* name, int32_t* id) {
    if (name == nullptr || id == nullptr) return -1;
    for (const NameRow& row : name_table) {
        if (same_name(name, row.name)) {
            *id = row.id;
            return 0;
        }
    }
    // a careless caller gets the uniform window
    *id = 0;
    return -1;
}

int32_t window_to_str(int32_t id, char* dst, int32_t len) {
    if (dst == nullptr || len < 1) return -1;
    for (const NameRow& row : name_table) {
        if (row.id == id) {
            std::strncpy(dst, row.name, static_cast<size_t>(len));
            dst[len - 1] = '\0';
            return 0;
        }
    }
    dst[0] = '\0';
    return -1;
}

}  // namespace vlx

extern "C" {
VLX_API int32_t vlx_window_from_str(const char* name, int32_t* id) { return vlx::window_from_str(name, id); }
VLX_API int32_t vlxf_window_from_str(const char* name, int32_t* id) { return vlx::window_from_str(name, id); }
VLX_API int32_t vlx_window_to_str(int32_t id, char* dst, int32_t len) { return vlx::window_to_str(id, dst, len); }
VLX_API int32_t vlxf_window_to_str(int32_t id, char* dst, int32_t len) { return vlx::window_to_str(id, dst, len); }
}
