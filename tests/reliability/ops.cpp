// The operation table: one row per exported operation (a few operations have a second row for another path), each a
// representative call written once for both families.  The context decides which argument is spoiled or aliased.
#include "harness.hpp"

#include <cstdio>

namespace rel {
namespace {

// Operations that return a value, not a status: only their survival counts.
template <class X>
int value_only(X) { return 0; }

// A lane cap set from the context, then put back.
constexpr auto lane_cap = [](auto& c, auto fn) {
    const int32_t old = fn(-1), r = fn(c.n(0));
    return fn(old), r >= 0 ? 0 : -1;
};

// Points doubled, for a vector that must grow (hostile lengths left alone).
template <class V>
V* bump(V* v) {
    if (v->points > 0 && v->points < (1 << 20)) v->points *= 2;
    return v;
}

// A staged filter call closed as a filter closes it.
template <class V, class S, class U>
int staged(Ctx<V>& c, S stage, U unstage, int32_t flags) {
    V *out = c.out(), *hist = c.hist(), *tmp = c.out(), *saved = nullptr;
    int32_t aliased = 0;
    const int r = stage(c.in(64), &out, nullptr, &hist, c.n(16), c.n(flags), &aliased, tmp, &saved);
    return r < 0 ? r : unstage(out, aliased, saved);
}

// Abscissas 0, 0.5, 1, ... : a table that rises strictly.
template <class V>
V* ramp(Ctx<V>& c, int32_t n) {
    V* v = c.coef(n);
    if (c.intact(v) && v->alloc >= n)
        for (int32_t i = 0; i < n; ++i) v->data[i] = real_of<V>(0.5 * i);
    return v;
}

// A resampling table of design 0 with 8 phases.
template <class V>
V* rsmp_table(Ctx<V>& c) {
    V* v = c.coef(66);
    Pause p;
    if (c.intact(v) && v->points == 66) REL_TW(c, rsmp)(v, 0);
    return v;
}

// An output vector asking for up to n points.
template <class V>
V* wanting(Ctx<V>& c, int32_t n) {
    V* v = c.out();
    Pause p;
    if (v->points == 0 && v->data == nullptr) v->points = n, vlxtest::t_alloc(v);
    return v;
}

// A configured streaming resampler of the family of V, destroyed on exit.
template <class V>
struct Resampler {
    std::conditional_t<is_double<V>, vlxh_rsmp_coef_t, vlxfh_rsmp_coef_t> coef;
    std::conditional_t<is_double<V>, vlxh_rsmp_state_t, vlxfh_rsmp_state_t> state;
    Resampler(Ctx<V>& c, double ratio, bool is_complex = false) {
        Pause p;
        REL_TW(h, rsmp_coef_init)(&coef), REL_TW(h, rsmp_coef_alloc)(&coef, 0);
        REL_TW(h, rsmp_coef_setup)(&coef, c.s(ratio), 0, 0);
        REL_TW(h, rsmp_state_init)(&state), REL_TW(h, rsmp_state_alloc)(&coef, &state, is_complex);
        REL_TW(h, rsmp_state_reset)(&coef, &state);
    }
    ~Resampler() {
        Pause p;
        REL_TW(h, rsmp_state_destroy)(&state), REL_TW(h, rsmp_coef_destroy)(&coef);
    }
};

#define POLY c.vals({-6, 11, -6, 1})
#define BINARY(name) REL_ROW(b, name, return fn(c.in(32, true), c.in(32), c.out());)
#define INPLACE(name, cplx) REL_ROW(i, name, return fn(c.io(32, cplx));)
#define STAT(name, cplx) REL_ROW(s, name, return fn(c.in(64, cplx), c.out());)

const std::vector<Row> table = {
    // ---- vectors and memory
    REL_ROW(, alloc, return fn(bump(c.grow(16)));),
    REL_ROW(, realloc, V* v = c.grow(16); const int32_t p = v->points; return fn(bump(v), p, v->complex);),
    REL_ROW(, destroy, return fn(c.grow(16, true));), REL_ROW(i, zero, return fn(c.bare(16, true));),
    REL_ROW(i, rtoc, return fn(c.grow(16));), REL_ROW(i, zpad, return fn(c.grow(16, true), c.n(40));),
    REL_ROW(, append, return fn(c.grow(16), c.in(8, true));), REL_ROW(, copy, return fn(c.out(), c.in(16, true));),
    REL_ROW(, copy_at_most, return fn(c.out(), c.in(16), c.n(5));),
    REL_ROW(u, subvec, return fn(c.in(16, true), c.out(), c.n(2), c.n(5));),
    REL_ROW(, insert_subvec, return fn(c.in(8, true), c.io(16), c.n(1), c.n(5), c.n(3));),
    REL_ROW(u, tof, vlxtest::Vec<vlxf_t> f; return fn(c.in(16, true), f.get());),
    REL_ROW(, cmp, int32_t r = 0; return fn(c.in(16, true), c.in(16), c.s(0.1), &r);),
    // ---- binding calls (inert without the modules); the flags word is restored
    REL_ROW(, dft_set_flags, uint32_t old = 0; REL_TW(, dft_get_flags)(&old);
            const int r = fn(c.u(VLX_DFT_KEEP)); REL_TW(, dft_set_flags)(old); return r;),
    REL_ROW(, kmp_set_blocktime, return fn(c.n(0));), REL_ROW(, omp_set_num_threads, return fn(c.n(1));),
    // ---- lane caps, put back after the call; transforms
    row<vlx_transform_lanes, vlx_transform_lanes>("vlx_transform_lanes", lane_cap, 0u),
    row<vlx_filter_lanes, vlx_filter_lanes>("vlx_filter_lanes", lane_cap, 0u),
    REL_ROW(i, fft, return fn(c.grow(64), c.n(0));), REL_ROW(i, fft, return fn(c.io(64, true), c.n(1));),
    REL_ROW(i, bitrev, return fn(c.io(64, true));), REL_ROW(i, bitrev_scale, return fn(c.io(64));),
    REL_ROW(i, rfft, return fn(c.grow(64));), REL_ROW(i, irfft, return fn(c.grow(33, true));),
    REL_ROW(i, orecon, return fn(c.grow(33, true), c.n(1));), REL_ROW(i, recon, return fn(c.grow(33, true));),
    REL_ROW(i, dft, return fn(c.grow(48), c.n(0));), REL_ROW(i, dft, return fn(c.io(64, true), c.n(1));),
    REL_ROW(i, rdft, return fn(c.grow(48));), REL_ROW(i, irdft, return fn(c.grow(25, true), c.n(1));),
    REL_ROW(i, dct, return fn(c.io(48), c.u(0));), REL_ROW(i, dct, return fn(c.io(48), c.u(3));),
    REL_ROW(i, analytic, return fn(c.grow(48));), REL_ROW(i, hilbert, return fn(c.io(48, true));),
    // ---- two-operand
    BINARY(add), BINARY(sub), BINARY(mul), BINARY(conj_mul), BINARY(div), BINARY(max), BINARY(min),
    BINARY(inter), BINARY(prepare_dest),
    REL_ROW(b, avg_add, return fn(c.in(32, true), c.in(32), c.out(), c.s(0.3));),
    REL_ROW(b, ritoc, return fn(c.in(32), c.in(32), c.out());),
    REL_ROW(b, pmul, return fn(c.in(16), c.in(12, true), c.out());),
    REL_ROW(bs, dot, return fn(c.in(32, true), c.in(32), c.out());),
    // ---- arithmetic and math
    REL_ROW(i, scale, return fn(c.io(32, true), c.s(2.5));), REL_ROW(i, offset, return fn(c.io(32), c.s(1));),
    REL_ROW(i, cscale, return fn(c.grow(32), c.s(1), c.s(2));), REL_ROW(i, timesi, return fn(c.grow(32));),
    REL_ROW(i, db, return fn(c.io(32, true), c.s(20));),
    REL_ROW(i, addcos, return fn(c.io(32, true), c.u(1), c.s(0.1), c.s(2), c.s(0.3));),
    INPLACE(neg, true), INPLACE(abs, false), INPLACE(conj, true), INPLACE(mag, true), INPLACE(magsq, true),
    INPLACE(square, true), INPLACE(recip, true), INPLACE(sqrt, true), INPLACE(exp, true), INPLACE(exp10, false),
    INPLACE(log, true), INPLACE(log10, false), INPLACE(ptor, true), INPLACE(sin, false), INPLACE(cos, false),
    INPLACE(tan, false), INPLACE(atan, false), INPLACE(tanh, false), INPLACE(acos, false), INPLACE(asin, false),
    INPLACE(cosh, false), INPLACE(sinh, false), INPLACE(sinc, false), INPLACE(besi0, false),
    INPLACE(besj0, false), INPLACE(besj1, false), INPLACE(besy0, false), INPLACE(besy1, false),
    REL_ROWF(kFails, i, erf, return fn(c.io(32));), REL_ROWF(kFails, i, erfc, return fn(c.io(32));),
    REL_ROWF(kFails, i, gamma, return fn(c.io(32));), REL_ROWF(kFails, i, lgamma, return fn(c.io(32));),
    REL_ROW(u, mag, return fn(c.in(32, true), c.out());), REL_ROW(u, magsq, return fn(c.in(32, true), c.out());),
    REL_ROW(u, sqrt, return fn(c.in(32, true), c.out());), REL_ROW(, besi0_kernel, return value_only(fn(c.s(3)));),
    // ---- layout
    INPLACE(real, true), INPLACE(rev, true), INPLACE(imag, false), INPLACE(swap_halves, true),
    INPLACE(swap_halves2, false), REL_ROW(i, shift, return fn(c.io(32, true), c.n(5));),
    REL_ROW(i, zpad2, return fn(c.grow(20, true), c.n(32), c.n(VLX_PAD_CENTRE | VLX_PAD_SCALE_SQRT));),
    REL_ROW(i, unzpad, return fn(c.io(32), c.n(20), c.n(VLX_PAD_SPLIT));),
    REL_ROW(i, zinter, return fn(c.grow(16, true));), REL_ROW(u, zinter, return fn(c.in(16), c.out(), c.s(2));),
    // ---- generators, noise, resampling tables
    REL_ROW(c, line, return fn(c.bare(32), c.s(0.5), c.s(1));),
    REL_ROW(c, cos, return fn(c.bare(32), c.s(0.1), c.s(0.2));),
    REL_ROW(c, cexp, return fn(c.bare(32, true), c.s(0.1), c.s(0.2));),
    REL_ROWF(kRandom, c, rand, return fn(c.bare(32), c.n(1));),
    REL_ROWF(kRandom, c, rand, return fn(c.bare(32, true), c.n(0));),
    REL_ROWF(kRandom, i, shuffle, return fn(c.io(32, true));), REL_ROW(c, rsmp, return fn(c.bare(66), c.n(0));),
    REL_ROW(c, rsmp_cos, return fn(c.bare(66), c.vals({8, 0.5, 0.5}, false, Role::coef));),
    REL_ROW(c, rsmp_pcos, return fn(c.bare(66), c.vals({8, 0.5, 0.25, 0.25}, false, Role::coef));),
    // ---- staging and decimation
    REL_ROW(d, deci, return fn(c.in(64), c.out(), c.n(3), c.hist());),
    REL_ROW(, stage_io, return staged(c, fn, REL_TW(, unstage_io), VLX_STAGE_ALIAS);),
    REL_ROW(, nearly_equal, return value_only(fn(c.s(1), c.s(1)));),
    REL_ROW(, ceil_pts, return value_only(fn(c.s(3.5)));), REL_ROW(, floor_pts, return value_only(fn(c.s(3.5)));),
    // ---- statistics
    STAT(sum, true), STAT(mean, true), STAT(magsq_sum, true), STAT(rms, true), STAT(pop_var, true),
    STAT(samp_var, false), STAT(pop_stddev, true), STAT(samp_stddev, false), STAT(skew, false),
    STAT(excess, false), STAT(gmean, true), STAT(hmean, false), STAT(min, true), STAT(max, false),
    STAT(median, true), STAT(median, false),
    REL_ROW(s, hist, return fn(c.in(64, true), c.out(), c.s(-1), c.s(0.25), c.n(8));),
    REL_ROW(i, sort, return fn(c.io(64, true));),
    REL_ROW(s, peak, return fn(c.in(64), c.out(), c.n(VLX_PEAK_PARABOLA), c.n(3));),
    REL_ROW(s, peak, return fn(c.in(64, true), c.out(), c.n(VLX_PEAK_LOG_RATIO_CORRECTED | VLX_PEAK_AT_INDEX), c.n(3));),
    // ---- polynomials and roots
    REL_ROW(s, peval, return fn(POLY, c.out(), c.s(0.5));),
    REL_ROWF(kQuadratic, s, psolve, return fn(POLY, c.out(), c.s(0.5));),
    REL_ROWF(kQuadratic, s, pcsolve, return fn(c.vals({1, 0, 1}), c.out(), c.s(0.1), c.s(0.9));),
    REL_ROWF(kQuadratic, s, proots, return fn(POLY, c.out());),
    REL_ROWF(kQuadratic, s, proots, return fn(c.vals({1, -2, 3, -4, 5, 6}), c.out());),
    REL_ROWF(kSettledLeak | kQuadratic, i, proots, V* v = c.io(8); return fn(v);),
    REL_ROWF(kQuadratic, i, pztoc, return fn(c.io(4));), REL_ROW(s, coef_spread, return value_only(fn(POLY));),
    REL_ROW(s, laguerre_step_real, return value_only(fn(POLY, c.s(0.5)));),
    REL_ROW(s, newton_step_real, return value_only(fn(POLY, c.s(0.5)));),
    REL_ROW(s, root_upper_bound, return value_only(fn(POLY));),
    REL_ROW(s, root_lower_bound, return value_only(fn(POLY));),
    REL_ROWF(kQuadratic, s, root_iterate_real, T r = 0;
            return fn(POLY, &r, REL_TW(s, laguerre_step_real), c.s(0.5), c.s(-10), c.s(10));),
    REL_ROW(s, newton_step, T dz[2]; return fn(POLY, c.s(0.5), c.s(0.5), dz);),
    REL_ROW(s, laguerre_step, T dz[2]; return fn(POLY, c.s(0.5), c.s(0.5), dz);),
    REL_ROWF(kQuadratic, s, root_iterate, return fn(c.vals({1, 0, 1}), c.fixed(1, true), REL_TW(s, laguerre_step), c.s(0.1), c.s(0.9), c.n(0));),
    REL_ROWF(kQuadratic, s, root_restarts, return fn(c.vals({1, 0, 1}), c.fixed(1, true), REL_TW(s, newton_step), c.s(0.1), c.s(0.9), c.n(1));),
    // ---- FIR design and windows
    REL_ROW(c, fir, return fn(c.bare(31), c.n(4), c.s(0.2), c.s(0));),
    REL_ROW(c, fir, return fn(c.bare(30), c.n(8), c.s(0.3), c.s(0));), REL_ROW(c, fir2, return fn(c.out(), c.n(100));),
    REL_ROW(, window_from_str, int32_t id = 0; return fn(c.n(1) ? "hann" : "VLX_WINDOW_KAISER", &id);),
    REL_ROW(, window_to_str, char b[16]; return fn(c.n(VLX_WINDOW_HANN), b, 16);),
    REL_ROW(i, window2, return fn(c.io(64, true), c.n(VLX_WINDOW_HANN), c.n(VLX_WFLAG_WIDTH), c.s(40));),
    REL_ROW(i, window, return fn(c.io(64), c.n(VLX_WINDOW_HANN + 3), c.n(0));),
    REL_ROW(i, window_cos, return fn(c.io(64), c.vals({0.5, 0.5}, false, Role::coef));),
    REL_ROWF(kSettledLeak, i, window_kaiser, return fn(c.io(64, true), c.s(8), c.n(0));),
    REL_ROWF(kSettledLeak, i, window_gauss, return fn(c.io(64), c.s(0.2), c.n(VLX_WFLAG_SYMMETRIC));),
    REL_ROWF(kSettledLeak, i, window_sinc, return fn(c.io(64), c.s(3), c.s(2), c.n(0));),
    REL_ROWF(kSettledLeak, i, window_tukey, return fn(c.io(64), c.s(0.5), c.n(0));),
    REL_ROW(i, window_fir, return fn(c.io(64), c.n(101), c.s(0.1));),
    REL_ROW(, window_synth, return fn(c.io(64), c.n(VLX_WINDOW_HANN + 5), c.n(VLX_WFLAG_WIDTH), c.s(50));),
    REL_ROW(, window_cos_sum, return fn(c.io(64), c.vals({0.5, 0.5}, false, Role::coef), c.n(0), c.s(0));),
    REL_ROW(, window2_scale, T o; return fn(&o, c.n(VLX_WINDOW_HANN), c.n(VLX_WFLAG_WIDTH | 1), c.n(64), c.s(40));),
    REL_ROW(, window_scale, T o; return fn(&o, c.n(VLX_WINDOW_HANN), c.n(2), c.n(64));),
    REL_ROW(, window2_enbw, T o; return fn(&o, c.n(VLX_WINDOW_HANN), c.n(64), c.s(40));),
    REL_ROW(, window_enbw, T o; return fn(&o, c.n(VLX_WINDOW_HANN + 7), c.n(64));),
    REL_ROW(, window_metric, T o; return fn(&o, c.n(1), c.n(VLX_WINDOW_HANN), c.n(64), c.s(40));),
    REL_ROW(, sinc_pow, return value_only(fn(c.s(1.3), c.s(2)));),
    // ---- phase and time
    INPLACE(unwrap, false), INPLACE(differ, true), INPLACE(integ, true), INPLACE(pdiffer, false),
    INPLACE(phase, true), REL_ROW(i, unwrap_wnd, return fn(c.io(64), c.n(4));),
    REL_ROW(i, edge, return fn(c.io(64), c.n(3), c.s(0));),
    REL_ROW(i, limit, int32_t clipped = 0; return fn(c.io(64, true), 0, c.s(-0.5), c.s(0.5), &clipped);),
    REL_ROW(i, rtop, return fn(c.grow(64));),
    // ---- filters and rate changers
    REL_ROW(d, fir, return fn(c.in(64), c.out(), c.coef(8, true), c.hist());),
    REL_ROW(d, fir, return fn(c.in(256), c.out(), c.coef(60), c.hist());),
    REL_ROW(d, fir, return fn(c.in(256, true), c.out(), c.coef(40), c.hist());),
    REL_ROW(d, sfir, return fn(c.in(64), c.out(), c.coef(6), c.n(1), c.n(0), c.hist());),
    REL_ROW(d, sfir, return fn(c.in(256, true), c.out(), c.coef(40), c.n(0), c.n(1), c.hist());),
    REL_ROW(d, sfir_deci, return fn(c.in(256), c.out(), c.coef(6), c.n(1), c.n(0), c.n(3), c.hist());),
    REL_ROW(d, hwfilt, return fn(c.in(64, true), c.out(), c.n(0), c.hist());),
    // without a history (the first block of a stream, nothing kept)
    REL_ROW(d, deci, return fn(c.in(64, true), c.out(), c.n(2), nullptr);),
    REL_ROW(d, fir, return fn(c.in(256), c.out(), c.coef(60), nullptr);),
    REL_ROW(d, sfir, return fn(c.in(64, true), c.out(), c.coef(6), c.n(0), c.n(1), nullptr);),
    REL_ROW(d, sfir_deci, return fn(c.in(256, true), c.out(), c.coef(40), c.n(1), c.n(0), c.n(4), nullptr);),
    REL_ROW(d, hwfilt, return fn(c.in(64), c.out(), c.n(0), nullptr);),
    REL_ROW(d, rsmp, return fn(c.in(64), wanting(c, 30), c.n(0), rsmp_table(c), c.s(2.5), nullptr);),
    REL_ROW(i, hwfilt, return fn(c.io(64), c.n(0));),
    REL_ROW(d, rsmp, return fn(c.in(64), wanting(c, 40), c.n(1), rsmp_table(c), c.s(1.5), c.hist());),
    REL_ROW(d, rsmp, return fn(c.in(64, true), wanting(c, 100), c.n(1), rsmp_table(c), c.s(0.75), c.hist());),
    REL_ROWF(kSettledLeak, d, rsmp2, return fn(c.in(64), wanting(c, 40), c.n(1), c.n(2), c.s(1.5), c.hist());),
    // ---- regression and interpolation
    REL_ROW(s, lin_regres, return fn(c.in(64), c.out());), REL_ROW(s, lin_regres2, return fn(c.in(64, true), c.out());),
    REL_ROW(, interp, return fn(ramp(c, 16), c.coef(16), nullptr, c.in(10), c.out(), c.n(VLX_INTERP_SPLINE));),
    REL_ROW(, interp, return fn(ramp(c, 16), c.coef(16), nullptr, c.in(10), c.out(), c.n(VLX_INTERP_QUADRATIC | VLX_INTERP_HOLD_ENDS));),
    REL_ROW(, cspline, return fn(ramp(c, 16), c.coef(16), c.coef(16), c.in(10), c.out());),
    REL_ROW(b, cspline_2d, return fn(ramp(c, 16), c.coef(16), c.out(), c.s(0.5), c.s(-0.5), c.n(1), c.n(2));),
    REL_ROWF(kNoHostile, b, tridiagonal_solve, T l[8], d[8], u[8], r[8], x[8];
             for (int i = 0; i < 8; ++i) l[i] = T(0.5), d[i] = T(3), u[i] = T(-0.5), r[i] = T(i);
             return fn(l, d, u, r, x, 8);),
    // ---- sample files
    REL_ROW(f, fopen, std::FILE* f = fn("/dev/null", "r"); return f != nullptr ? REL_TW(f, fclose)(f) : -1;),
    REL_ROW(f, fwrite, Stream o; return fn(c.in(64, true), o.f);),
    REL_ROW(f, fwrite_ascii, Stream o; return fn(c.in(64), o.f);),
    REL_ROW(f, fwrite2, Stream o; return fn(c.in(64, true), o.f, c.n(VLX_FORMAT_SUMMARY));),
    REL_ROW(f, fwrite2, Stream o; return fn(c.in(64), o.f, c.n(VLX_FORMAT_GNUPLOT));),
    REL_ROWF(kSettledLeak, f, fwrite2, Stream o; return fn(c.in(64), o.f, c.n(VLX_FORMAT_TRACE));),
    REL_ROW(f, fread, Stream i(c.in(64, true), VLX_FORMAT_BINARY); return fn(c.out(), i.f) == 1 ? 0 : -1;),
    REL_ROWF(kCountKept, f, fread, Stream i(c.in(64), VLX_FORMAT_ASCII); return fn(c.out(), i.f) == 1 ? 0 : -1;),
    REL_ROW(f, read_binary, Stream i(c.in(64, true), VLX_FORMAT_BINARY); return fn(c.out(), i.f) == 1 ? 0 : -1;),
    REL_ROWF(kCountKept, f, read_text, Stream i(c.in(64), VLX_FORMAT_ASCII); return fn(c.out(), i.f) == 1 ? 0 : -1;),
    REL_ROW(f, auto_range, return value_only(fn(c.s(1234.5)));),
    // ---- streaming and measurement level (scratch vectors are never shared: hist())
    REL_ROW(h, rsmp_coef_alloc, decltype(Resampler<V>::coef) k; REL_TW(h, rsmp_coef_init)(&k);
            const int r = fn(&k, c.n(0)); REL_TW(h, rsmp_coef_destroy)(&k); return r;),
    REL_ROW(h, rsmp_coef_setup, Resampler<V> st(c, 1); return fn(&st.coef, c.s(0.3), c.n(1), c.n(0));),
    REL_ROW(h, rsmp_state_alloc, Resampler<V> st(c, 5.5); return fn(&st.coef, &st.state, c.n(1));),
    REL_ROW(h, rsmp_state_reset, Resampler<V> st(c, 0.7); return fn(&st.coef, &st.state);),
    REL_ROW(h, rsmp_get_in_pts, Resampler<V> st(c, 3.3); int32_t n; return fn(&n, &st.coef, c.n(100), c.n(1));),
    REL_ROW(h, rsmp_get_out_pts, Resampler<V> st(c, 0.3); int32_t n; return fn(&n, &st.coef, c.n(100), c.n(0), c.n(1));),
    REL_ROW(h, rsmp_get_delay_pts, Resampler<V> st(c, 2.5); T d; return fn(&d, &st.coef, c.n(1));),
    REL_ROW(h, rsmp_get_settle_pts, Resampler<V> st(c, 2.5); T d; return fn(&d, &st.coef, c.n(1));),
    REL_ROW(h, rsmp, Resampler<V> st(c, 2.5); return fn(c.in(256), wanting(c, 100), c.hist(), &st.coef, &st.state);),
    REL_ROW(h, rsmp, Resampler<V> st(c, 0.7, true); return fn(c.in(256, true), wanting(c, 400), c.hist(), &st.coef, &st.state);),
    REL_ROW(h, avg, return fn(c.in(64, true), c.out(), c.hist(), c.n(VLX_AVG_LINEAR | VLX_AVG_POWER), c.n(1), c.n(2), c.s(-1), c.s(10));),
    REL_ROW(h, avg, return fn(c.in(64), c.io(64), c.hist(), c.n(VLX_AVG_GEOMETRIC | VLX_AVG_LIMITED | VLX_AVG_LOG), c.n(3), c.n(2), c.s(-1), c.s(2));),
    REL_ROW(h, corr, return fn(c.in(16, true), c.in(64, true), c.out(), c.hist(), c.n(16), c.n(1));),
    REL_ROW(b, corr, return fn(c.in(20), c.in(50), c.out(), c.hist(), c.n(12));),
    REL_ROW(h, dft, return fn(c.in(100), c.out(), c.n(VLX_WINDOW_HANN), c.n(0));),
    REL_ROW(h, dft, return fn(c.in(51, true), c.out(), c.n(VLX_WINDOW_HANN), c.n(VLX_SPEC_INVERSE | VLX_SPEC_ODD));),
    REL_ROW(h, fft, return fn(c.in(100), c.out(), c.n(128), c.s(0.75), c.n(VLX_WINDOW_HANN + 1), c.n(0));),
    REL_ROW(h, fft, return fn(c.in(64, true), c.out(), c.n(0), c.s(1), c.n(0), c.n(VLX_SPEC_TWO_SIDED | VLX_SPEC_CENTRED));),
};

}  // namespace

const std::vector<Row>& rows() { return table; }

}  // namespace rel
