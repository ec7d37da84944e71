// The reader: text tokens, keys and line handling from a table, hand-made binary files in every form and byte order,
// and hostile headers.
#include "fileio_support.hpp"

#include <climits>

using namespace vlxtest;

VLX_TYPED_SUITE(Reader);

namespace {

struct TextCase { std::string input; int32_t status, points, is_complex; double delta; std::vector<double> values;
                  std::string rest; /* what the next call finds */ };

const std::vector<TextCase> text_cases = {
    {"", 0, 0, 0, 1, {}, ""},
    {" \n# only a comment\n", 1, 0, 0, 1, {}, ""},
    {"#VLX points = 0\n1 2", 1, 0, 0, 1, {}, "1 2"},
    {"#VLX points = 3\n1 2 3 4 5", 1, 3, 0, 1, {1, 2, 3}, " 4 5"},
    {"#VLX points = 3\n1 2", -1, 2, 0, 1, {1, 2}, ""},
    {"#VLX complex = 1\n1 2 3", 1, 2, 1, 1, {1, 2, 3, 0}, ""},
    {"1 2 #VLX complex = 1\n", 1, 1, 1, 1, {1, 2}, ""},
    {"#VLXpoints=2\n#VLX delta =0.5\n1 2 3", 1, 2, 0, 0.5, {1, 2}, " 3"},
    // hexadecimal integers, by value: 32-bit words, signed, negated in 32 bits
    {"0.0x10 00x10 -0x10 0xFFFFFFFF -0x80000000 0x1ffffffff 0", 1, 7, 0, 1, {16, 16, -16, -1, INT_MIN, -1, 0}, ""},
    {"0x1p3", -1, 1, 0, 1, {1}, "p3"},  // no hexadecimal floating notation
    {"0xg", -1, 0, 0, 1, {}, ""},
    {"1#x\n2 -", 1, 2, 0, 1, {1, 2}, ""},  // a sign alone at the end is no token
    {"abc", -1, 0, 0, 1, {}, "abc"},
    {"0." + std::string(200, '0') + "1e201", 1, 1, 0, 1, {1}, ""},  // a token longer than any buffer
    {"#VLX complex = 1\n1 x", -1, 1, 0, 1, {1}, "x"},
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
    EXPECT_EQ(read_from(&v, binary_file(2, false, 4, 1000, 0, {1, 2})), -1);           // short data
    EXPECT_TRUE(has_shape(v.get(), 1000, 0, 0.125));
    // Counts the vector cannot hold fail in the allocation, not in arithmetic.
    EXPECT_EQ(read_from(&v, binary_file(3, false, 4, INT_MAX, 1, {1})), -1);
    EXPECT_TRUE(v->alloc == 0 && v->points == 0);
    FailingAlloc<TypeParam> no_memory;
    EXPECT_EQ(read_from(&v, binary_file(1, true, 8, INT_MAX, 0, {1})), -1);
    EXPECT_TRUE(v->alloc == 0 && v->points == 0 && v->data == nullptr);
    EXPECT_EQ(read_from(&v, "1 2"), -1);  // text growth fails too
    EXPECT_TRUE(v->alloc == 0 && v->points == 0);
}

// The vector grows in blocks of 1024 scalars and never shrinks; a declared count ends the read exactly at a block
// boundary.
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
