// The sample files: reading, hostile headers, the writers byte for byte, round trips, gnuplot, a decimal comma.
#include "vlx_test.hpp"

#include <climits>
#include <clocale>
#include <cstdio>
#include <fstream>
#include <string>
#include <thread>

using namespace vlxtest;

VLX_TYPED_SUITE(Reader);
VLX_TYPED_SUITE(Writers);

namespace {

VLX_TEST_TWIN(t_fread, vlxf_fread, vlxff_fread)
inline int32_t t_fwrite2(const vlx_t* v, FILE* f, int32_t format) { return vlxf_fwrite2(v, f, format); }
inline int32_t t_fwrite2(const vlxf_t* v, FILE* f, int32_t format) { return vlxff_fwrite2(v, f, format); }

// Everything from the stream's position to its end; the stream is closed.
std::string drain(FILE* f) {
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

struct TextCase { std::string input; int32_t status, points, is_complex; double delta; std::vector<double> values;
                  std::string rest; /* what the next call finds */ };

const std::vector<TextCase> text_cases = {
    {"", 0, 0, 0, 1, {}, ""}, {" \n# only a comment\n", 1, 0, 0, 1, {}, ""}, {"abc", -1, 0, 0, 1, {}, "abc"},
    {"#VLX points = 0\n1 2", 1, 0, 0, 1, {}, "1 2"}, {"#VLX points = 3\n1 2", -1, 2, 0, 1, {1, 2}, ""},
    {"#VLX points = 3\n1 2 3 4 5", 1, 3, 0, 1, {1, 2, 3}, " 4 5"},
    {"#VLX complex = 1\n1 2 3", 1, 2, 1, 1, {1, 2, 3, 0}, ""}, {"1 2 #VLX complex = 1\n", 1, 1, 1, 1, {1, 2}, ""},
    {"#VLX complex = 1\n1 x", -1, 1, 0, 1, {1}, "x"}, {"#VLXpoints=2\n#VLX delta =0.5\n1 2 3", 1, 2, 0, 0.5, {1, 2}, " 3"},
    // hexadecimal integers, by value: 32-bit words, signed, negated in 32 bits
    {"0.0x10 00x10 -0x10 0xFFFFFFFF -0x80000000 0x1ffffffff 0", 1, 7, 0, 1, {16, 16, -16, -1, INT_MIN, -1, 0}, ""},
    {"0x1p3", -1, 1, 0, 1, {1}, "p3"}, {"0xg", -1, 0, 0, 1, {}, ""},  // no hexadecimal floating notation
    {"1#x\n2 -", 1, 2, 0, 1, {1, 2}, ""},  // a sign alone at the end is no token
    {"0." + std::string(200, '0') + "1e201", 1, 1, 0, 1, {1}, ""},  // a token longer than any buffer
    {"nan -inf INFINITY -0 1e-500 1e", 1, 6, 0, 1, {NAN, -INFINITY, INFINITY, -0.0, 0, 1}, ""},
    // the last line without newline loses its last character: 1 point declared
    {"7\n#VLX points = 12", 1, 1, 0, 1, {7}, ""},
    // 255 characters fit the line buffer, the last of them is cut; the rest of a longer line is dropped
    {"#VLX delta =" + std::string(238, ' ') + "0.255\n1\n#" + std::string(300, ' ') + "2\n3", 1, 2, 0, 0.25, {1, 3}, ""},
};

// A binary file: form 1 or 2 (width fixed) or 3 (width in the type word), delta 0.125, in either byte order.
std::string binary_file(int form, bool swap, uint32_t width, int32_t points, int32_t is_complex,
                        const std::vector<double>& scalars) {
    std::string out;
    auto put = [&](auto x) {
        const std::string b(reinterpret_cast<const char*>(&x), sizeof x);
        out += swap ? std::string(b.rbegin(), b.rend()) : b;
    };
    auto scalar = [&](double x) { width == 8 ? put(x) : put(static_cast<float>(x)); };
    put(0xEB0000BEu | uint32_t(form) << 16 | uint32_t(form) << 12);
    if (form == 3) put(0x400u | width);
    put(points), put(is_complex), scalar(0.125);
    for (double x : scalars) scalar(x);
    return out;
}

// Bit for bit (signs of zero and NaN too): the value converted for binary files, its printed digits parsed for text.
template <class R, class W>
void expect_same(const std::vector<R>& got, const std::vector<W>& written, bool text) {
    std::vector<R> want;
    for (W w : written) {
        char digits[64];
        std::snprintf(digits, sizeof digits, sizeof(W) == 8 ? "%.16g" : "%.7g", static_cast<double>(w));
        const R parsed = sizeof(R) == 8 ? R(std::strtod(digits, nullptr)) : R(std::strtof(digits, nullptr));
        want.push_back(text ? parsed : static_cast<R>(w));
    }
    EXPECT_TRUE(same_scalars(got, want));
    for (size_t i = 0; i < got.size() && i < want.size(); ++i) EXPECT_EQ(std::signbit(got[i]), std::signbit(want[i]));
}

// Several vectors in one stream, written by family V and read by family R.
template <class V, class R>
void round_trip(int32_t format) {
    using T = real_of<V>;
    using L = std::numeric_limits<T>;
    std::vector<T> many = random_values<T>(2500, 5, -1e6, 1e6);
    many.insert(many.begin(), {L::quiet_NaN(), -L::quiet_NaN(), L::infinity(), -L::infinity(), T(-0.0), L::max(),
                               L::lowest(), L::min(), L::denorm_min(), T(1) / T(3)});
    // An empty text vector reads on into the next header: one, at the end.
    const bool text = format == VLX_FORMAT_ASCII;
    std::vector<std::pair<std::vector<T>, bool>> sets = {
        {{T(-2.5)}, false}, {many, false}, {{T(-2.5), T(4)}, true}, {many, true}, {{}, text}};
    if (!text) sets.push_back({{}, false});
    FILE* f = std::tmpfile();
    for (const auto& [x, is_complex] : sets) {
        Vec<V> v(x, is_complex);
        v->delta = T(0.25);
        ASSERT_EQ(t_fwrite2(v.get(), f, format), 0);
    }
    std::rewind(f);
    for (const auto& [x, is_complex] : sets) {
        Vec<R> r;
        ASSERT_EQ(t_fread(r.get(), f), 1);
        EXPECT_TRUE(has_shape(r.get(), int32_t(x.size()) / (is_complex ? 2 : 1), is_complex, 0.25));
        expect_same(r.values(), x, text);
    }
    EXPECT_EQ(t_fread(Vec<R>().get(), f), 0);
    std::fclose(f);
}

}  // namespace

TYPED_TEST(Reader, TextTokensKeysAndLines) {
    for (const TextCase& c : text_cases) {
        SCOPED_TRACE(c.input.substr(0, 60));
        Vec<TypeParam> v;
        std::string rest;
        EXPECT_TRUE(read_from(&v, c.input, &rest) == c.status && has_shape(v.get(), c.points, c.is_complex, c.delta));
        const std::vector<real_of<TypeParam>> want(c.values.begin(), c.values.end());
        EXPECT_TRUE(rest == c.rest && same_scalars(std::vector(v->data, v->data + want.size()), want)) << rest;
    }
}

TYPED_TEST(Reader, BinaryFormsInBothOrdersAndWidths) {
    using T = real_of<TypeParam>;
    const std::vector<double> x = {1.5, -2.25, 3, -0.0};
    for (const auto& [form, width] : {std::pair{1, 8u}, {2, 4u}, {3, 4u}, {3, 8u}})
        for (bool swap : {false, true}) {
            SCOPED_TRACE(::testing::Message() << "form " << form << " width " << width << " swap " << swap);
            Vec<TypeParam> v;
            std::string rest;  // complex kept as written
            EXPECT_TRUE(read_from(&v, binary_file(form, swap, width, 2, 7, x) + "\xBE", &rest) == 1 && rest == "\xBE");
            EXPECT_TRUE(has_shape(v.get(), 2, 7, 0.125) && same_scalars(v.values(), std::vector<T>(x.begin(), x.end())));
        }
}

TYPED_TEST(Reader, BrokenAndHostileBinaryHeaders) {
    Vec<TypeParam> v;
    EXPECT_TRUE(read_from(&v, binary_file(3, false, 8, -5, 0, {})) == 1 && has_shape(v.get(), -5, 0, 0.125));  // no scalars
    EXPECT_TRUE(read_from(&v, binary_file(3, true, 6, 1, 0, {})) == -1 && v->points == 1);  // width 6
    EXPECT_EQ(read_from(&v, binary_file(3, false, 8, 1, 0, {}).substr(0, 10)), -1);  // short header
    EXPECT_EQ(read_from(&v, "\xEB\x01\x10\xBF"), -1);                                  // no magic
    EXPECT_TRUE(read_from(&v, binary_file(2, false, 4, 1000, 0, {1, 2})) == -1 && has_shape(v.get(), 1000, 0, 0.125));  // short data
    // Counts the vector cannot hold fail in the allocation, not in arithmetic.
    EXPECT_TRUE(read_from(&v, binary_file(3, false, 4, INT_MAX, 1, {1})) == -1 && v->alloc == 0 && v->points == 0);
    FailingAlloc<TypeParam> no_memory;
    EXPECT_TRUE(read_from(&v, binary_file(1, true, 8, INT_MAX, 0, {1})) == -1 && v->alloc == 0 && v->points == 0 && v->data == nullptr);
    EXPECT_TRUE(read_from(&v, "1 2") == -1 && v->alloc == 0 && v->points == 0);  // text growth fails too
}

// Growth in blocks of 1024 scalars, never shrinking; a declared count ends the read exactly at a block boundary.
TYPED_TEST(Reader, TextAcrossBlocks) {
    std::string text = "#VLX points = 2048\n";
    for (int i = 0; i < 2050; ++i) text += std::to_string(i) + "\n";
    Vec<TypeParam> v;
    std::string rest;
    EXPECT_TRUE(read_from(&v, text, &rest) == 1 && v->points == 2048 && v->alloc == 2048 && v[2047] == 2047);
    EXPECT_EQ(rest, "\n2048\n2049\n");
}

TEST(ReaderStreams, DashIsStandardStreamAndStaysOpen) {
    EXPECT_TRUE(vlxf_fopen("-", "rb") == stdin && vlxff_fopen("-", "w+b") == stdout && vlxf_fopen("-", "a") == nullptr);
    EXPECT_TRUE(vlxf_fclose(stdin) == 0 && vlxff_fclose(stdout) == 0);
}

TYPED_TEST(Writers, RoundTripsThroughTheReader) {
    for (int32_t format : {VLX_FORMAT_BINARY, VLX_FORMAT_ASCII}) {
        SCOPED_TRACE(format);
        round_trip<TypeParam, vlx_t>(format);
        round_trip<TypeParam, vlxf_t>(format);
    }
}

TYPED_TEST(Writers, EveryFormByteForByte) {
    const bool d = is_double<TypeParam>;
    Vec<TypeParam> real({1.5, 0.1f, -2});  // 0.1f prints as 0.1 in 7 digits, 0.1 in 16
    real->delta = 0.5;
    if (d) real[1] = real_of<TypeParam>(0.1);
    std::string ascii = "#VLX ASCII data from libvlx package\n#VLX points = 3\n#VLX complex = 0\n#VLX type = 8\n"
                        "#VLX delta = 0.5\n1.5\n0.1\n-2\n";
    if (!d) ascii[ascii.find('8')] = '4';
    EXPECT_EQ(written(real.get(), VLX_FORMAT_ASCII), ascii);
    EXPECT_EQ(written(real.get(), VLX_FORMAT_SUMMARY), "[3/0.5] 1.5 0.1 -2\n");
    EXPECT_EQ(written(real.get(), VLX_FORMAT_GNUPLOT), "# gnuplot data from libvlx package\nset zeroaxis\n\nplot '-' "
              "title \"Data\" with lines\n\n# X Y\n0 1.5\n0.5 0.1\n1 -2\ne\n\npause mouse key\n");
    // The minimum, at the edge, decides the range.
    EXPECT_EQ(written(real.get(), VLX_FORMAT_TRACE),
              "LibvlxData\tTrue\nInputRange\t2\nInputZoom\tFalse\nTrcTtl\tLibvlx Data\nXDelta\t0.5\nY\n1.5\n0.1\n-2\n");
    Vec<TypeParam> cx({1, 2, 3, -4}, true);
    EXPECT_EQ(written(cx.get(), VLX_FORMAT_ASCII | VLX_FORMAT_NO_HEADER | 0x400), "1 2\n3 -4\n");
    EXPECT_EQ(written(cx.get(), VLX_FORMAT_SUMMARY), "[2/1] 1,2 3,-4\n");
    EXPECT_EQ(written(cx.get(), VLX_FORMAT_GNUPLOT | VLX_FORMAT_NO_DATA),
              "# gnuplot data from libvlx package\nset zeroaxis\n\n"
              "plot '-' using 1:(sqrt($2**2+$3**2)) title \"Magnitude\" with lines\n#plot '-' using 1:(atan2($3,$2)) "
              "title \"Phase\" with lines\n#plot '-' using 1:2 title \"Real\" with lines\n#plot '-' using 1:3 title "
              "\"Imag\" with lines\n#plot '-' using 2:3 title \"Real vs. Imag\" with lines\n#splot '-' title \"Data\" "
              "with lines\n\n# X Yreal Yimag\n");
    EXPECT_EQ(written(cx.get(), VLX_FORMAT_GNUPLOT | VLX_FORMAT_NO_HEADER), "0 1 2\n1 3 -4\n");
    EXPECT_EQ(written(cx.get(), VLX_FORMAT_TRACE),
              "LibvlxData\tTrue\nInputRange\t5\nInputZoom\tTrue\nTrcTtl\tLibvlx Data\nXDelta\t1\nY\n1\t2\n3\t-4\n");
    const std::string bin = written(cx.get(), VLX_FORMAT_BINARY | VLX_FORMAT_NO_DATA);
    std::string head("\xBE\x30\x03\xEB\x08\x04\0\0\x02\0\0\0\x01\0\0\0", 16);  // magic, type 1032, 2, 1
    head[4] = d ? 8 : 4;
    EXPECT_TRUE(bin.substr(0, 16) == head && bin.size() == (d ? 24u : 20u));
    EXPECT_EQ(written(cx.get(), VLX_FORMAT_BINARY | VLX_FORMAT_NO_HEADER).size(), d ? 32u : 16u);
    int32_t status = 0;
    for (int32_t bad : {5, 0x1FF}) EXPECT_TRUE(written(cx.get(), bad, &status).empty() && status == -1);
}

TYPED_TEST(Writers, SummaryNumbersAndRanges) {
    using T = real_of<TypeParam>;
    Vec<TypeParam> v({T(9999), T(1234.5678), T(123456), T(1234567890), T(-1e12), T(NAN)});
    EXPECT_EQ(written(v.get(), VLX_FORMAT_SUMMARY | VLX_FORMAT_NO_HEADER), "9999 1235 123456 1.235e+09 -1e+12 nan\n");
    EXPECT_EQ(written(v.get(), VLX_FORMAT_SUMMARY | VLX_FORMAT_NO_DATA), "[6/1] \n");
    EXPECT_EQ(written(v.get(), VLX_FORMAT_SUMMARY | VLX_FORMAT_NO_DATA | VLX_FORMAT_NO_HEADER), "\n");
    EXPECT_EQ(written(v.get(), VLX_FORMAT_GNUPLOT | VLX_FORMAT_NO_DATA | VLX_FORMAT_NO_HEADER), "");
    Vec<TypeParam> fresh, zeros({0, 0, 0});
    EXPECT_EQ(written(fresh.get(), VLX_FORMAT_SUMMARY), "[0/1]\n");
    for (auto* z : {fresh.get(), zeros.get()}) EXPECT_EQ(written(z, VLX_FORMAT_TRACE).substr(16, 13), "InputRange\t1\n");
    std::vector<T> ramp;
    std::string line;
    for (int i = 0; i < 33; ++i) ramp.push_back(T(i)), line.append(i ? " " : "").append(std::to_string(i));
    Vec<TypeParam> r33(ramp, false), r32(std::vector<T>(ramp.begin(), ramp.end() - 1), false);
    EXPECT_EQ(written(r32.get(), VLX_FORMAT_SUMMARY | VLX_FORMAT_NO_HEADER), line.substr(0, line.size() - 3) + "\n");
    EXPECT_EQ(written(r33.get(), VLX_FORMAT_SUMMARY), std::string("[33/1] ").append(line, 0, line.size() - 3) + " ...\n");
    // The next of 1, 2, 4, 5, 10 in the decade; a rounding error above a step stays on it; at most the family's bound.
    const T bound = is_double<TypeParam> ? T(1e100) : T(1e15f), up = T(1) + 2 * std::numeric_limits<T>::epsilon();
    const std::vector<std::pair<T, T>> ranges = {{T(0), T(1)}, {T(-3), T(1)}, {T(1), T(1)}, {T(1.2), T(2)},
                                                 {T(3), T(4)}, {T(4.5), T(5)}, {T(6), T(10)}, {T(2) * up, T(2)},
                                                 {T(0.03), T(0.03) / T(3) * T(4)}, {bound * T(1.5), bound}};
    for (const auto& [x, want] : ranges)
        EXPECT_EQ(is_double<TypeParam> ? T(vlxf_auto_range(double(x))) : T(vlxff_auto_range(float(x))), want) << x;
}

TYPED_TEST(Writers, GnuplotDrawsTheScript) {
    if (std::system("gnuplot --version > /dev/null 2>&1") != 0) GTEST_SKIP() << "gnuplot is not installed";
    const std::string script = ::testing::TempDir() + "vlx_plot.gp", png = ::testing::TempDir() + "vlx_plot.png";
    for (bool is_complex : {false, true}) {
        Vec<TypeParam> v(random_values<real_of<TypeParam>>(200, 3), is_complex);
        std::remove(png.c_str());
        FILE* f = std::fopen(script.c_str(), "w");
        ASSERT_EQ(t_fwrite2(v.get(), f, VLX_FORMAT_GNUPLOT), 0);
        std::fclose(f);
        // A gnuplot without mouse support stops at the closing pause, after the plot is out.
        (void)std::system(("gnuplot -e \"set terminal png; set output '" + png + "'\" " + script + " 2>/dev/null").c_str());
        char magic[4] = {};
        std::ifstream(png, std::ios::binary).read(magic, 4);
        EXPECT_EQ(std::string(magic + 1, 3), "PNG") << is_complex;
    }
}

// Numbers stay in the C locale under a thread's or the process's decimal comma, threads at once; the locale stays.
TYPED_TEST(Writers, TextIsTheSameUnderADecimalComma) {
    locale_t german = newlocale(LC_ALL_MASK, "de_DE.UTF-8", static_cast<locale_t>(nullptr));
    if (german == static_cast<locale_t>(nullptr)) GTEST_SKIP() << "de_DE.UTF-8 is not available";
    Vec<TypeParam> v(random_values<real_of<TypeParam>>(64, 9, -1e5, 1e5), true);
    v->delta = real_of<TypeParam>(0.125);
    std::vector<std::string> in_c;
    for (int32_t fmt = 1; fmt <= 4; ++fmt) in_c.push_back(written(v.get(), fmt));
    auto check = [&] {
        ASSERT_STREQ(localeconv()->decimal_point, ",");
        for (int32_t fmt = 1; fmt <= 4; ++fmt) EXPECT_EQ(written(v.get(), fmt), in_c[fmt - 1]) << fmt;
        Vec<TypeParam> back;
        EXPECT_EQ(read_from(back.get(), in_c[0]), 1);
        EXPECT_TRUE(has_shape(back.get(), 32, 1, 0.125));
        expect_same(back.values(), v.values(), true);
        EXPECT_STREQ(localeconv()->decimal_point, ",");
    };
    auto in_thread = [&] { uselocale(german), check(), uselocale(LC_GLOBAL_LOCALE); };
    std::thread first(in_thread), second(in_thread);
    first.join(), second.join();
    std::setlocale(LC_ALL, "de_DE.UTF-8");
    check();
    std::setlocale(LC_ALL, "C");
    freelocale(german);
}
