// References for the power-of-two transforms: the literal split-radix recipes, bit for bit, and a long-double sum.
#pragma once

#include "vlx_test.hpp"

#include <algorithm>
#include <cmath>
#include <complex>
#include <type_traits>
#include <vector>

namespace fftref {

VLX_TEST_TWIN(t_fft, vlxi_fft, vlxfi_fft) VLX_TEST_TWIN(t_rfft, vlxi_rfft, vlxfi_rfft)
VLX_TEST_TWIN(t_irfft, vlxi_irfft, vlxfi_irfft) VLX_TEST_TWIN(t_orecon, vlxi_orecon, vlxfi_orecon)
VLX_TEST_TWIN(t_recon, vlxi_recon, vlxfi_recon) VLX_TEST_TWIN(t_bitrev, vlxi_bitrev, vlxfi_bitrev)
VLX_TEST_TWIN(t_bitrev_scale, vlxi_bitrev_scale, vlxfi_bitrev_scale)

inline int log2i(size_t n) {
    int m = 0;
    while ((size_t(1) << m) < n) ++m;
    return m;
}

inline size_t reverse_index(size_t i, int bits) {
    size_t r = 0;
    for (int b = 0; b < bits; ++b, i >>= 1) r = (r << 1) | (i & 1);
    return r;
}

// The twiddle table: recurrence restarted every 256 entries, pi/4 constants, reflected 3-theta triples.
template <class T>
std::vector<T> literal_table(size_t n) {
    constexpr bool dbl = std::is_same_v<T, double>;
    std::vector<T> t(3 * n / 2, T(0));
    t[0] = t[3] = 1, t[1] = t[2] = t[4] = t[5] = -1;
    const T e = dbl ? T(6.283185307179586) / T(n) : T(6.2831855f) / T(n);
    const T c1 = dbl ? T(std::cos(double(e))) : std::cos(float(e)), s1 = dbl ? T(std::sin(double(e))) : std::sin(float(e));
    T c = c1, s = s1;
    for (size_t k = 1, in_run = 0; k < n / 8; ++k, ++in_run) {
        if (in_run == 256) c = T(std::cos(double(T(k) * e))), s = T(std::sin(double(T(k) * e))), in_run = 0;
        t[6 * k] = c, t[6 * k + 1] = -(c + s), t[6 * k + 2] = s - c;
        const size_t r = n / 4 - k;
        t[6 * r] = s, t[6 * r + 1] = -(c + s), t[6 * r + 2] = c - s;
        const T cn = c1 * c - s1 * s;
        s = s * c1 + s1 * c, c = cn;
    }
    if (n > 4) {
        t[6 * (n / 8)] = dbl ? T(0.7071067811865476) : T(0.70710677f);
        t[6 * (n / 8) + 1] = dbl ? T(-1.4142135623730951) : T(-1.4142135f);
        t[6 * (n / 8) + 2] = 0;
    }
    for (size_t k = 1; k < n / 4; ++k) {
        const size_t i = 3 * k;
        T* to = &t[6 * k + 3];
        if (i < n / 4) {
            for (int j = 0; j < 3; ++j) to[j] = t[6 * i + j];
        } else if (i <= n / 2) {
            const T* f = &t[6 * (n / 2 - i)];
            to[0] = -f[0], to[1] = -f[2], to[2] = -f[1];
        } else {
            const T* f = &t[6 * (i - n / 2)];
            to[0] = -f[0], to[1] = -f[1], to[2] = -f[2];
        }
    }
    return t;
}

// A block depends only on its parent (complex) or children (real): recursion gives the level walk's bits.
template <class T>
void literal_block(T* x, size_t len, size_t n, const std::vector<T>& t, bool inverse) {
    auto rot = [inverse](T& re, T& im, const T* tri) {
        const T mm = (re + im) * tri[0];
        const T nr = inverse ? mm + tri[1] * im : mm + tri[2] * im, ni = inverse ? mm + tri[2] * re : mm + tri[1] * re;
        re = nr, im = ni;
    };
    if (len == 2) {  // the closing pass
        const T r = x[0], i = x[1];
        x[0] = r + x[2], x[1] = i + x[3], x[2] = r - x[2], x[3] = i - x[3];
    }
    if (len < 4) return;
    const size_t q = len / 4;
    for (size_t k = 0; k < q; ++k) {  // the L-shaped butterfly, then the half and the two quarters
        T *a0 = x + 2 * k, *a1 = a0 + 2 * q, *a2 = a0 + 4 * q, *a3 = a0 + 6 * q;
        const T ur = a0[0] - a2[0], ui = a0[1] - a2[1], wr = a1[0] - a3[0], wi = a1[1] - a3[1];
        a0[0] = a0[0] + a2[0], a0[1] = a0[1] + a2[1], a1[0] = a1[0] + a3[0], a1[1] = a1[1] + a3[1];
        T z1r = inverse ? ur - wi : ur + wi, z1i = inverse ? ui + wr : ui - wr;
        T z3r = inverse ? ur + wi : ur - wi, z3i = inverse ? ui - wr : ui + wr;
        if (k > 0) rot(z1r, z1i, &t[6 * k * (n / len)]), rot(z3r, z3i, &t[6 * k * (n / len) + 3]);
        a2[0] = z1r, a2[1] = z1i, a3[0] = z3r, a3[1] = z3i;
    }
    literal_block(x, 2 * q, n, t, inverse);
    literal_block(x + 4 * q, q, n, t, inverse);
    literal_block(x + 6 * q, q, n, t, inverse);
}

// The complex engine (n >= 4 interleaved points): the blocks, then the reordering (times 1/N forward).
template <class T>
void literal_fft(std::vector<T>& x, bool inverse) {
    const size_t n = x.size() / 2;
    const int m = log2i(n);
    literal_block(x.data(), n, n, literal_table<T>(n), inverse);
    std::vector<T> y(x.size());
    const T f = T(1) / T(n);
    for (size_t i = 0; i < n; ++i) {
        const size_t r = reverse_index(i, m);
        y[2 * r] = inverse ? x[2 * i] : x[2 * i] * f;
        y[2 * r + 1] = inverse ? x[2 * i + 1] : x[2 * i + 1] * f;
    }
    x = y;
}

// A block of the real engine at point p of x (real parts in place, 4h points), after its half and quarters.
template <class T>
void literal_real_block(std::vector<T>& x, size_t p, size_t len, size_t n, const std::vector<T>& t) {
    auto re = [&](size_t i) -> T& { return x[2 * i]; };
    auto im = [&](size_t i) -> T& { return x[2 * i + 1]; };
    if (len == 2) {  // the two-point pass
        const T a = re(p), b = re(p + 1);
        re(p) = a + b, re(p + 1) = a - b;
    }
    if (len < 4) return;
    const size_t h = len / 4;
    literal_real_block(x, p, 2 * h, n, t);
    literal_real_block(x, p + 2 * h, h, n, t);
    literal_real_block(x, p + 3 * h, h, n, t);
    const T x0 = re(p), x2 = re(p + 2 * h), x3 = re(p + 3 * h), tt = x3 + x2;
    re(p) = x0 + tt, re(p + 2 * h) = x0 - tt, im(p + h) = x3 - x2;
    for (size_t k = 1; k < h / 2; ++k) {
        const T* pr = &t[6 * (k * (n / len))];
        T m1 = (re(p + 2 * h + k) + im(p + 2 * h + k)) * pr[0];
        const T w1r = m1 + pr[2] * im(p + 2 * h + k), w1i = m1 + pr[1] * re(p + 2 * h + k);
        T m3 = (re(p + 3 * h + k) + im(p + 3 * h + k)) * pr[3];
        const T w3r = m3 + pr[5] * im(p + 3 * h + k), w3i = m3 + pr[4] * re(p + 3 * h + k);
        const T sr = w1r + w3r, si = w1i + w3i, dr = w3r - w1r, di = w3i - w1i;
        const T e1r = re(p + k), e1i = im(p + k), e2r = re(p + h - k), e2i = im(p + h - k);
        re(p + k) = e1r + sr, im(p + k) = e1i + si;
        re(p + 2 * h - k) = e1r - sr, im(p + 2 * h - k) = si - e1i;
        re(p + h - k) = e2r + di, im(p + h - k) = dr + e2i;
        re(p + h + k) = e2r - di, im(p + h + k) = dr - e2i;
    }
    if (h > 1) {
        const T r = std::is_same_v<T, double> ? T(0.7071067811865476) : T(0.70710677f);
        const size_t k = h / 2;
        const T u = -r * re(p + 3 * h + k), v = r * re(p + 2 * h + k), er = re(p + k), ei = im(p + k);
        re(p + k) = er + (u + v), im(p + k) = (u - v) + ei;
        re(p + h + k) = er - (u + v), im(p + h + k) = (u - v) - ei;
    }
}

// The real engine on n real samples (n >= 4): scaled reversal, then the blocks; n/2 + 1 bins out.
template <class T>
std::vector<T> literal_rfft(const std::vector<T>& in) {
    const size_t n = in.size();
    std::vector<T> x(2 * n, T(0));
    for (size_t i = 0; i < n; ++i) x[2 * reverse_index(i, log2i(n))] = in[i] * (T(1) / T(n));
    literal_real_block(x, 0, n, n, literal_table<T>(n));
    x.resize(n + 2);
    return x;
}

using cld = std::complex<long double>;

// The naive long-double sum with exp(-+j 2 pi n k / N); as the library's pair, forward carries 1/N, inverse nothing.
inline std::vector<cld> exact_dft(const std::vector<cld>& x, bool inverse) {
    const size_t n = x.size();
    std::vector<cld> w(n), y(n);
    for (size_t k = 0; k < n; ++k) w[k] = std::polar(1.0L, (inverse ? 1 : -1) * 6.283185307179586476925286766559L * k / n);
    for (size_t k = 0; k < n; ++k) {
        for (size_t j = 0; j < n; ++j) y[k] += x[j] * w[(j * k) % n];
        if (!inverse) y[k] /= static_cast<long double>(n);
    }
    return y;
}

// Bound for 2^m points: a few eps sqrt(m) for the butterflies plus one eps per step of the twiddle runs.
inline double transform_tolerance(double eps, int m) {
    const double steps = m >= 3 ? std::min(double(size_t(1) << (m - 3)), 256.0) : 0.0;
    return eps * (4 * std::sqrt(std::max(1.0, double(m))) + steps);
}

// Relative L2 error of interleaved data against a long-double reference.
template <class T>
long double rel_l2(const T* got, const std::vector<cld>& want, size_t points) {
    long double num = 0, den = 0;
    for (size_t k = 0; k < points; ++k) {
        const long double dr = got[2 * k] - want[k].real(), di = got[2 * k + 1] - want[k].imag();
        num += dr * dr + di * di;
        den += std::norm(want[k]);
    }
    return den == 0 ? std::sqrt(num) : std::sqrt(num / den);
}

}  // namespace fftref
