// Reader of sample files: the stream's first byte tells the binary form from
// the text form, and either family reads scalars of either width.
#include "fileio/fileio.hpp"

#include "core/platform.hpp"

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>

namespace vlx {
namespace {

// The text reader grows the vector by this many scalars at a time.
constexpr int32_t text_block = 1024;
// Comment lines are read into a buffer of this size (255 characters).
constexpr int line_size = 256;

// Character classes of the C locale, whatever the caller's locale says.
inline bool is_space(int c) { return c == ' ' || c == '\t' || c == '\n' || c == '\v' || c == '\f' || c == '\r'; }
inline bool is_digit(int c) { return c >= '0' && c <= '9'; }
inline bool is_xdigit(int c) { return is_digit(c) || (c >= 'a' && c <= 'f') || (c >= 'A' && c <= 'F'); }
inline int lower(int c) { return (c >= 'A' && c <= 'Z') ? c + ('a' - 'A') : c; }
inline int xdigit_value(int c) { return is_digit(c) ? c - '0' : lower(c) - 'a' + 10; }

// Where the scanner takes its characters from: the stream, or a comment line
// already in memory (whose terminator acts as the end of stream).
struct StreamSource {
    std::FILE* f;
    int get() { return std::getc(f); }
    void unget(int c) {
        if (c != EOF) std::ungetc(c, f);
    }
};

struct LineSource {
    const char* s;
    size_t at = 0;
    int get() { return s[at] != '\0' ? static_cast<unsigned char>(s[at++]) : EOF; }
    void unget(int c) {
        if (c != EOF) --at;
    }
};

// The characters of one number token, on the stack unless it is very long.
class Token {
public:
    Token() = default;
    ~Token() {
        if (text_ != local_) std::free(text_);
    }
    Token(const Token&) = delete;
    Token& operator=(const Token&) = delete;

    void push(int c) {
        if (length_ + 1 >= capacity_ && !grow()) {
            lost_ = true;
            return;
        }
        text_[length_++] = static_cast<char>(c);
    }
    // Null if memory ran out on the way.
    const char* text() {
        if (lost_) return nullptr;
        text_[length_] = '\0';
        return text_;
    }

private:
    bool grow() {
        if (lost_) return false;
        const size_t wanted = capacity_ * 2;
        char* bigger = static_cast<char*>(text_ == local_ ? std::malloc(wanted) : std::realloc(text_, wanted));
        if (bigger == nullptr) return false;
        if (text_ == local_) std::memcpy(bigger, local_, length_);
        text_ = bigger;
        capacity_ = wanted;
        return true;
    }

    char local_[64];
    char* text_ = local_;
    size_t length_ = 0;
    size_t capacity_ = sizeof local_;
    bool lost_ = false;
};

// Reads the rest of a word such as "inf" or "inity", case-insensitively.
// 1 when it matched; otherwise the end of the token: -1 at the end of the
// input, 0 in front of another character, which goes back.
template <class Source>
int scan_word(Source& in, Token& token, const char* rest) {
    for (; *rest != '\0'; ++rest) {
        const int c = in.get();
        if (lower(c) != *rest) {
            if (c == EOF) return -1;
            in.unget(c);
            return 0;
        }
        token.push(c);
    }
    return 1;
}

// One decimal floating number, as a scanf "%lg" ("%g" for float) conversion
// reads it in the C locale, except that hexadecimal notation is not taken:
// the token stops in front of the 'x' of "0x", so that the caller sees the
// hexadecimal digits itself.  Leading white space is skipped.  Returns 1 with
// *out set, 0 when the characters are no number (the first one that does not
// fit goes back), -1 when the input ends before a number is complete.
template <class T, class Source>
int scan_real(Source& in, T* out) {
    Token token;
    int c = in.get();
    while (is_space(c)) c = in.get();
    if (c == EOF) return -1;
    if (c == '+' || c == '-') {
        token.push(c);
        c = in.get();
    }
    if (lower(c) == 'i' || lower(c) == 'n') {
        const bool inf = lower(c) == 'i';
        token.push(c);
        const int matched = scan_word(in, token, inf ? "nf" : "an");
        if (matched != 1) return matched;
        if (inf) {
            c = in.get();
            if (lower(c) == 'i') {
                token.push(c);
                const int rest = scan_word(in, token, "nity");
                if (rest != 1) return rest;
            } else {
                in.unget(c);
            }
        }
    } else {
        int digits = 0;
        for (; is_digit(c); c = in.get(), ++digits) token.push(c);
        if (c == '.') {
            token.push(c);
            for (c = in.get(); is_digit(c); c = in.get(), ++digits) token.push(c);
        }
        if (digits == 0) {
            if (c == EOF) return -1;
            in.unget(c);
            return 0;
        }
        // An exponent mark without digits is taken and ignored, as the C
        // runtime's scan does.
        if (c == 'e' || c == 'E') {
            token.push(c);
            c = in.get();
            if (c == '+' || c == '-') {
                token.push(c);
                c = in.get();
            }
            for (; is_digit(c); c = in.get()) token.push(c);
        }
        in.unget(c);
    }
    const char* text = token.text();
    if (text == nullptr) return 0;
    char* end = nullptr;
    if constexpr (std::is_same_v<T, float>)
        *out = platform::strtof_c(text, &end);
    else
        *out = platform::strtod_c(text, &end);
    return 1;
}

// A "%lx" conversion into a 32-bit word: an optional "0x" prefix, then hex
// digits; the value saturates at 64 bits and keeps its low 32.  The caller has
// checked that a hex digit comes first.
uint32_t scan_hex(std::FILE* f) {
    uint64_t value = 0;
    int c = std::getc(f);
    if (c == '0') {
        const int mark = std::getc(f);
        if (lower(mark) == 'x') {
            c = std::getc(f);
            if (!is_xdigit(c)) {
                if (c != EOF) std::ungetc(c, f);
                return 0;
            }
        } else {
            if (mark != EOF) std::ungetc(mark, f);
        }
    }
    constexpr uint64_t top = std::numeric_limits<uint64_t>::max();
    for (; is_xdigit(c); c = std::getc(f)) {
        const uint64_t d = static_cast<uint64_t>(xdigit_value(c));
        value = value > (top - d) / 16 ? top : value * 16 + d;
    }
    if (c != EOF) std::ungetc(c, f);
    return static_cast<uint32_t>(value);
}

// sscanf matching of a key: a blank stands for any run of white space (also
// none), every other character for itself.
bool match_key(LineSource& in, const char* key) {
    for (; *key != '\0'; ++key) {
        if (*key == ' ') {
            int c = in.get();
            while (is_space(c)) c = in.get();
            in.unget(c);
        } else if (in.get() != static_cast<unsigned char>(*key)) {
            return false;
        }
    }
    return true;
}

// A "%ld" conversion: white space, a sign, decimal digits; the value
// saturates at the limits of a 64-bit long, as the C runtime's does.
bool scan_long(LineSource& in, int64_t* out) {
    int c = in.get();
    while (is_space(c)) c = in.get();
    const bool negative = c == '-';
    if (c == '+' || c == '-') c = in.get();
    if (!is_digit(c)) return false;
    uint64_t magnitude = 0;
    constexpr uint64_t limit = uint64_t(1) << 63;
    for (; is_digit(c); c = in.get()) {
        const uint64_t d = static_cast<uint64_t>(c - '0');
        magnitude = magnitude > (limit - d) / 10 ? limit : magnitude * 10 + d;
    }
    if (!negative && magnitude >= limit) magnitude = limit - 1;
    *out = negative ? static_cast<int64_t>(0 - magnitude) : static_cast<int64_t>(magnitude);
    return true;
}

// The state of one text read that the comment keys change.
template <class T>
struct TextKeys {
    bool declared = false;
    int64_t declared_points = 0;
    int32_t complex_value = 0;
    // Whether the declared count is in: scalars, or pairs of them when complex.
    bool reached(int64_t count) const {
        return declared && count >= declared_points && (complex_value == 0 || count / 2 >= declared_points);
    }
};

// Reads a comment line from its '#' and applies the keys on it.  A line that
// does not end in a newline within the buffer is cut short, and the last
// character of what was read is dropped whatever it is: without a final
// newline a line loses its last real character, which is settled behaviour.
template <VlxVector V>
void read_comment(V* v, std::FILE* f, TextKeys<real_t<V>>& keys) {
    char line[line_size];
    if (std::fgets(line, line_size, f) == nullptr) return;
    const size_t length = std::strlen(line);
    if (length == 0 || line[length - 1] != '\n') {
        int c;
        do c = std::getc(f);
        while (c != '\n' && c != EOF);
    }
    if (length > 0) line[length - 1] = '\0';

    LineSource points_in{line};
    int64_t points = 0;
    if (match_key(points_in, "#VLX points = ") && scan_long(points_in, &points)) {
        keys.declared = true;
        keys.declared_points = points < 0 ? 0 : points;
    }
    LineSource complex_in{line};
    int64_t complex_value = 0;
    // "%d" keeps the low 32 bits of what it read.
    if (match_key(complex_in, "#VLX complex = ") && scan_long(complex_in, &complex_value))
        keys.complex_value = static_cast<int32_t>(static_cast<uint64_t>(complex_value));
    LineSource delta_in{line};
    real_t<V> delta;
    if (match_key(delta_in, "#VLX delta = ") && scan_real(delta_in, &delta) == 1) v->delta = delta;
}

}  // namespace

std::FILE* file_open(const char* path, const char* mode) {
    if (std::strcmp(path, "-") != 0) return std::fopen(path, mode);
    std::FILE* stream;
    if (mode[0] == 'r')
        stream = stdin;
    else if (mode[0] == 'w')
        stream = stdout;
    else
        return nullptr;
    // A 'b' counts in second or third place only.
    if (mode[1] == 'b' || (mode[1] != '\0' && mode[2] == 'b')) platform::set_binary_mode(stream);
    return stream;
}

int32_t file_close(std::FILE* stream) {
    if (stream == stdin || stream == stdout) return 0;
    return std::fclose(stream);
}

template <VlxVector V>
int32_t read_text(V* v, std::FILE* f) {
    using T = real_t<V>;
    TextKeys<T> keys;
    int64_t count = 0;  // scalars read
    int32_t status = 1;
    v->complex = 0;
    v->delta = T(1);
    v->points = 0;

    // Until the end, points counts scalars and is the capacity asked for.
    for (bool more = true; more;) {
        const int32_t kept = v->points;
        if (kept > std::numeric_limits<int32_t>::max() - text_block) {
            status = -1;
            break;
        }
        v->points = kept + text_block;
        if (realloc(v, kept, 0) < 0) {
            status = -1;
            break;
        }
        T* at = v->data + count;
        for (int32_t in_block = 0; in_block < text_block;) {
            int c = std::getc(f);
            if (is_space(c)) continue;
            if (c == '#') {
                std::ungetc(c, f);
                read_comment(v, f, keys);
                continue;
            }
            if (c == EOF) {
                status = std::feof(f) ? 1 : -1;
                more = false;
                break;
            }
            const bool negative = c == '-';
            std::ungetc(c, f);
            // The declared count is in: what follows belongs to the next call.
            if (keys.reached(count)) {
                more = false;
                break;
            }
            StreamSource in{f};
            const int scanned = scan_real(in, at);
            if (scanned != 1) {
                status = (scanned == -1 && std::feof(f)) ? 1 : -1;
                more = false;
                break;
            }
            // A zero in front of 'x' opens a hexadecimal integer; the test is
            // on the value, so 0.0x10 and 00x10 read as 16 as well.
            if (*at == T(0)) {
                const int next = std::getc(f);
                if (next == EOF) {
                    ++count;
                    status = std::feof(f) ? 1 : -1;
                    more = false;
                    break;
                }
                if (next == 'x') {
                    const int first = std::getc(f);
                    if (!is_xdigit(first)) {
                        status = -1;
                        more = false;
                        break;
                    }
                    std::ungetc(first, f);
                    const uint32_t word = scan_hex(f);
                    // Negated as a 32-bit integer: -0x80000000 stays -2^31.
                    const uint32_t signed_word = negative ? 0u - word : word;
                    *at = static_cast<T>(static_cast<int32_t>(signed_word));
                } else if (std::ungetc(next, f) == EOF) {
                    status = std::feof(f) ? 1 : -1;
                    more = false;
                    break;
                }
            }
            ++at;
            ++count;
            if (keys.reached(count)) {
                more = false;
                break;
            }
            ++in_block;
        }
    }

    v->points = static_cast<int32_t>(count);
    if (keys.complex_value != 0) {
        if (status < 0) return status;
        v->complex = 1;
        // An odd scalar count leaves the last sample without an imaginary
        // part; the block size is even, so there is room for it.
        if (count % 2 != 0) {
            v->data[count] = T(0);
            v->points += 1;
        }
        v->points /= 2;
    }
    if (status < 0 || !keys.declared || v->points == keys.declared_points) return status;
    return -1;
}

namespace {

inline uint32_t swap32(uint32_t x) {
    return (x >> 24) | ((x >> 8) & 0xFF00u) | ((x << 8) & 0xFF0000u) | (x << 24);
}
inline uint64_t swap64(uint64_t x) {
    return (static_cast<uint64_t>(swap32(static_cast<uint32_t>(x))) << 32) | swap32(static_cast<uint32_t>(x >> 32));
}

// One scalar of the file's width, swapped if needed, in the vector's type.
template <class T>
T load_scalar(const unsigned char* p, uint32_t width, bool swap) {
    if (width == 8) {
        uint64_t bits;
        std::memcpy(&bits, p, 8);
        if (swap) bits = swap64(bits);
        double x;
        std::memcpy(&x, &bits, 8);
        return static_cast<T>(x);
    }
    uint32_t bits;
    std::memcpy(&bits, p, 4);
    if (swap) bits = swap32(bits);
    float x;
    std::memcpy(&x, &bits, 4);
    return static_cast<T>(x);
}

// The magic of each form, as a number in the reader's own byte order; the
// byte-swapped value marks a file from a machine of the other order.
constexpr uint32_t magic_form[4] = {0, 0xEB0110BEu, 0xEB0220BEu, 0xEB0330BEu};

}  // namespace

template <VlxVector V>
int32_t read_binary(V* v, std::FILE* f) {
    using T = real_t<V>;
    uint32_t magic;
    if (std::fread(&magic, 4, 1, f) != 1) return -1;
    int form = 0;
    bool swap = false;
    for (int k = 1; k <= 3; ++k) {
        if (magic == magic_form[k]) form = k;
        if (magic == swap32(magic_form[k])) form = k, swap = true;
    }
    if (form == 0) return -1;
    uint32_t type = 0;
    if (form == 3 && std::fread(&type, 4, 1, f) != 1) return -1;
    // points goes straight into the vector: a short header leaves what was read.
    if (std::fread(&v->points, 4, 1, f) != 1) return -1;
    int32_t is_complex;
    if (std::fread(&is_complex, 4, 1, f) != 1) return -1;
    if (swap) {
        type = swap32(type);
        v->points = static_cast<int32_t>(swap32(static_cast<uint32_t>(v->points)));
        is_complex = static_cast<int32_t>(swap32(static_cast<uint32_t>(is_complex)));
    }
    v->complex = is_complex;  // as it stands, not made 0 or 1
    const uint32_t width = form == 1 ? 8 : form == 2 ? 4 : (type & 0xFFu);
    if (width != 4 && width != 8) return -1;
    unsigned char raw[8];
    if (std::fread(raw, width, 1, f) != 1) return -1;
    v->delta = load_scalar<T>(raw, width, swap);

    // The count comes from the file: taken in 64 bits, and vlx_alloc refuses
    // what a vector cannot hold before anything is read into it.
    int64_t n = v->points < 0 ? 0 : v->points;
    if (is_complex != 0) n *= 2;
    if (alloc(v) < 0) return -1;
    if (n == 0) return 1;
    const size_t count = static_cast<size_t>(n);
    if (width == sizeof(T)) {
        if (std::fread(v->data, width, count, f) != count) return -1;
        if (swap) {
            auto* bytes = reinterpret_cast<unsigned char*>(v->data);
            for (size_t i = 0; i < count; ++i) v->data[i] = load_scalar<T>(bytes + i * width, width, true);
        }
        return 1;
    }
    auto* temp = static_cast<unsigned char*>(std::malloc(count * width));
    if (temp == nullptr) return -1;
    if (std::fread(temp, width, count, f) != count) {
        std::free(temp);
        return -1;
    }
    for (size_t i = 0; i < count; ++i) v->data[i] = load_scalar<T>(temp + i * width, width, swap);
    std::free(temp);
    return 1;
}

template <VlxVector V>
int32_t file_read(V* v, std::FILE* f) {
    v->points = 0;
    const int c = std::getc(f);
    if (c == EOF) return 0;
    if (std::ungetc(c, f) == EOF) return -1;
    // A text file that begins with one of these bytes fails on the magic.
    if (c == 0xEB || c == 0xBE) return read_binary(v, f);
    return read_text(v, f);
}

#define VLX_INSTANTIATE(V)                                  \
    template int32_t read_text<V>(V*, std::FILE*);          \
    template int32_t read_binary<V>(V*, std::FILE*);        \
    template int32_t file_read<V>(V*, std::FILE*);
VLX_INSTANTIATE(vlx_t)
VLX_INSTANTIATE(vlxf_t)
#undef VLX_INSTANTIATE

}  // namespace vlx

extern "C" {
VLX_API FILE* vlxf_fopen(const char* path, const char* mode) { return vlx::file_open(path, mode); }
VLX_API FILE* vlxff_fopen(const char* path, const char* mode) { return vlx::file_open(path, mode); }
VLX_API int32_t vlxf_fclose(FILE* stream) { return vlx::file_close(stream); }
VLX_API int32_t vlxff_fclose(FILE* stream) { return vlx::file_close(stream); }
VLX_API int32_t vlxf_fread(vlx_t* v, FILE* stream) { return vlx::file_read(v, stream); }
VLX_API int32_t vlxff_fread(vlxf_t* v, FILE* stream) { return vlx::file_read(v, stream); }
VLX_API int32_t vlxf_read_text(vlx_t* v, FILE* stream) { return vlx::read_text(v, stream); }
VLX_API int32_t vlxff_read_text(vlxf_t* v, FILE* stream) { return vlx::read_text(v, stream); }
VLX_API int32_t vlxf_read_binary(vlx_t* v, FILE* stream) { return vlx::read_binary(v, stream); }
VLX_API int32_t vlxff_read_binary(vlxf_t* v, FILE* stream) { return vlx::read_binary(v, stream); }
}
