// The spectrum pipeline, both families: the way back restores the windowed
// record, transform lengths and record fractions, and a sine's peak level.
#include "vlx_test.hpp"

using namespace vlxtest;

namespace {

VLX_TWIN(h, dft)
VLX_TWIN(h, fft)
VLX_TWIN(i, window2)
VLX_TWIN(i, swap_halves)

template <class V>
class Spectrum : public ::testing::Test {};
TYPED_TEST_SUITE(Spectrum, Families);

// Forward then inverse gives the record times the window, in its own time
// order: neither the window nor the scaling is divided out, but the factor
// 2 and the length-ratio padding are.
TYPED_TEST(Spectrum, InverseRestoresWindowedRecord) {
    using V = TypeParam;
    using T = real_of<V>;
    struct Case {
        int32_t n, nfft;
        T fraction;
        int32_t window, flags;
    };
    const int32_t two = VLX_SPEC_TWO_SIDED, nowin = VLX_SPEC_NO_WINDOW;
    const Case cases[] = {
        {64, 0, 0, 0, 0},         {64, 0, 1, VLX_WINDOW_HANN, 0},  {64, 64, 2, VLX_WINDOW_FLATTOP, two},
        {64, 0, 0, 0, VLX_SPEC_CENTRED}, {64, 0, 0, VLX_WINDOW_HANN, VLX_SPEC_SUM}, {64, 0, 0, 3, nowin},
        {64, 0, 0, 0, VLX_SPEC_RAW}, {200, 128, 0, VLX_WINDOW_HANN, 0}, {50, 128, T(0.25), VLX_WINDOW_GAUSS70, 0},
        {100, 256, T(0.3), 0, two},  {37, 0, 0, VLX_WINDOW_BLACKMAN, 0},
    };
    for (const Case& c : cases)
        for (bool cx : {false, true})
            for (bool pow2 : {true, false}) {  // vlxh_fft, then vlxh_dft on the whole record
                if (!pow2 && (c.nfft != 0 || c.fraction != 0)) continue;
                if (pow2 && c.nfft == 0 && (c.n & (c.n - 1))) continue;  // its padding would stay
                const auto x = random_values<T>(size_t(c.n * (cx ? 2 : 1)), c.n + c.window);
                Vec<V> in(x, cx), spec, back;
                in->delta = T(0.25);
                // complex records always take the two-sided way back
                const int32_t inv = VLX_SPEC_INVERSE | (cx ? VLX_SPEC_TWO_SIDED_IN : 0) | (c.n % 2 ? VLX_SPEC_ODD : 0);
                if (pow2) {
                    ASSERT_EQ(t_fft(in.get(), spec.get(), c.nfft, c.fraction, c.window, c.flags), 0);
                    ASSERT_EQ(t_fft(spec.get(), back.get(), c.nfft, c.fraction, c.window, c.flags | inv), 0);
                } else {
                    ASSERT_EQ(t_dft(in.get(), spec.get(), c.window, c.flags), 0);
                    ASSERT_EQ(t_dft(spec.get(), back.get(), c.window, c.flags | inv), 0);
                }
                // the record the forward path took, windowed as it did
                int32_t len = 1;
                while (len < (c.nfft > 0 ? c.nfft : c.n)) len *= 2;
                const bool whole = !pow2 || (c.flags & (VLX_SPEC_SUM | VLX_SPEC_CENTRED | VLX_SPEC_RAW));
                const T f = (c.fraction > 0 && c.fraction <= 1 && !whole) ? c.fraction : T(1);
                const double rec = std::min<double>(pow2 ? T(len) * f : c.n, c.n);
                Vec<V> want(std::vector<T>(x.begin(), x.begin() + int64_t(std::ceil(rec)) * (cx ? 2 : 1)), cx);
                if (!(c.flags & (nowin | VLX_SPEC_RAW))) {
                    const int32_t wf = (pow2 ? VLX_WFLAG_WIDTH : 0) | VLX_WFLAG_NO_SWAP;
                    ASSERT_EQ(t_window2(want.get(), c.window, wf, T(rec)), 0);
                }
                ASSERT_EQ(back->points, want->points) << c.n << " window " << c.window << " flags " << c.flags;
                // a real record comes back complex from the two-sided way, with imaginary parts 0
                auto part = [](Vec<V>& v, int64_t i, int p) { return v->complex ? v[2 * i + p] : p ? T(0) : v[i]; };
                for (int64_t i = 0; i < want->points; ++i)
                    for (int p : {0, 1})
                        ASSERT_TRUE(near(part(back, i, p), part(want, i, p), 60 * std::numeric_limits<T>::epsilon()))
                            << c.n << " window " << c.window << " flags " << c.flags << " cx " << cx << " at " << i;
            }
}

// Lengths: nfft 0 takes the record's own power of 2, a fraction takes the
// start of the record and pads, the flags that read the whole record
// ignore both, and a one-sided inverse doubles the half spectrum's length.
TYPED_TEST(Spectrum, TransformLengthsAndFractions) {
    using V = TypeParam;
    using T = real_of<V>;
    struct Case {
        int32_t n, nfft;
        T fraction;
        int32_t flags, points;
        bool complex_out;
    };
    const Case cases[] = {
        {1000, 0, 0, 0, 513, true},   {1000, 1024, T(0.5), 0, 513, true},
        {1000, 256, 1, 0, 129, true}, {1000, 256, 1, VLX_SPEC_CENTRED, 1024, false},
        {300, 64, T(1.5), VLX_SPEC_TWO_SIDED, 64, true}, {513, 0, 0, VLX_SPEC_INVERSE, 1024, false},
        {513, 0, T(0.5), VLX_SPEC_INVERSE, 512, false}, {8, 0, 0, VLX_SPEC_RAW, 8, true},
        {1, 0, 0, 0, 1, false},
    };
    for (const Case& c : cases) {
        const bool cx_in = (c.flags & VLX_SPEC_INVERSE) != 0;
        Vec<V> in(random_values<T>(size_t(c.n * (cx_in ? 2 : 1)), 3), cx_in), out;
        in->delta = T(0.5);
        ASSERT_EQ(t_fft(in.get(), out.get(), c.nfft, c.fraction, VLX_WINDOW_HANN, c.flags), 0);
        if (c.flags == VLX_SPEC_CENTRED) {
            EXPECT_EQ(out->points, 1024 / 2 + 1);  // the whole record's length
        } else {
            EXPECT_EQ(out->points, c.points) << c.n << " " << c.nfft << " " << c.fraction << " " << c.flags;
        }
    }
    Vec<V> in{1, 2, 3}, out;
    EXPECT_EQ(t_fft(in.get(), static_cast<V*>(nullptr), 0, T(1), 0, 0), -1);
    EXPECT_EQ(t_dft(static_cast<V*>(nullptr), out.get(), 0, 0), -1);
}

// A sine in a bin's centre reads its amplitude at the peak (a flat top's
// coherent gain is a little below 1), one-sided with any window of mean
// normalisation, and half of it on each side two-sided.
TYPED_TEST(Spectrum, SinePeakReadsAmplitude) {
    using V = TypeParam;
    using T = real_of<V>;
    const int32_t n = 256;
    std::vector<T> x(n);
    for (int i = 0; i < n; ++i) x[i] = T(1.5 * std::cos(2 * M_PI * 20 * i / n + 0.3));
    for (int32_t window : {0, VLX_WINDOW_HANN, VLX_WINDOW_FLATTOP, VLX_WINDOW_BLACKMAN_HARRIS4})
        for (int32_t flags : {0, VLX_SPEC_TWO_SIDED, VLX_SPEC_CENTRED}) {
            Vec<V> in(x, false), a, b;
            ASSERT_EQ(t_fft(in.get(), a.get(), 0, T(1), window, flags), 0);
            ASSERT_EQ(t_dft(in.get(), b.get(), window, flags), 0);
            const int32_t at = flags & VLX_SPEC_TWO_SIDED ? n / 2 + 20 : 20;
            const double want = flags & VLX_SPEC_TWO_SIDED ? 0.75 : 1.5;
            EXPECT_TRUE(near(std::hypot(a[2 * at], a[2 * at + 1]), want, 1e-3 * want)) << window << " " << flags;
            EXPECT_TRUE(near(std::hypot(b[2 * at], b[2 * at + 1]), want, 1e-3 * want)) << window << " " << flags;
        }
}

}  // namespace
