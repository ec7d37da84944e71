/*
 * libvlx — signal processing on vectors of real or complex samples.
 *
 * Every operation exists twice: on double-precision vectors (`vlx_t`) and on
 * single-precision vectors (`vlxf_t`); the single-precision twin sits on the
 * line below its double twin and shares its comment.  Every function returns
 * an int32_t status, 0 for success and negative (as a rule -1) for failure,
 * unless its comment says otherwise.  Null pointers are not checked unless a
 * comment says so.
 *
 * Prefixes: vlx_ general, vlxi_ in place, vlxb_ two operands, vlxbs_ two
 * operands to a scalar, vlxu_ one source and one destination, vlxs_
 * statistics, vlxc_ creators, vlxd_ filters and rate changers, vlxh_
 * measurement-level and streaming processors; an `f` after `vlx` names the
 * single-precision twin.
 */
#ifndef LIBVLX_H
#define LIBVLX_H

#include <stdint.h>
#include <stdio.h>

#if defined(_WIN32)
#  if defined(VLX_BUILDING)
#    define VLX_API __declspec(dllexport)
#  else
#    define VLX_API
#  endif
#else
#  define VLX_API __attribute__((visibility("default")))
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* A C program that includes <complex.h> first has `complex` defined as a
 * macro; the field below keeps its name, so the macro is set aside here. */
#if defined(complex)
#  pragma push_macro("complex")
#  undef complex
#  define VLX_RESTORE_COMPLEX_MACRO 1
#endif

/* ======================================================================== */
/* Vectors and memory                                                       */
/* ======================================================================== */

/* A vector of real or complex samples with a spacing on the x axis.
 * `alloc` counts scalars (not points); 0 or less means `data` is not owned
 * (null, or storage lent by the caller).  The scalar count is `points`,
 * doubled when `complex` is non-zero; complex samples are interleaved re, im. */
typedef struct vlx_t {
    double   delta;    /* sample spacing on the x axis; 1.0 after vlx_init */
    double*  data;     /* the samples */
    int32_t  alloc;    /* capacity of data in scalars; <= 0: not owned */
    int32_t  points;   /* logical length in points */
    int32_t  complex;  /* non-zero: interleaved re, im pairs */
    int32_t  reserved; /* cleared by vlx_init and vlx_destroy, never read */
} vlx_t;

typedef struct vlxf_t {
    float    delta;
    float*   data;
    int32_t  alloc;
    int32_t  points;
    int32_t  complex;
    int32_t  reserved;
} vlxf_t;

#if defined(VLX_RESTORE_COMPLEX_MACRO)
#  pragma pop_macro("complex")
#  undef VLX_RESTORE_COMPLEX_MACRO
#endif

/* Allocator hooks, one triple for each precision.  Return values are ignored.
 * alloc: store in v->data a new block of at least the scalar count (or null);
 *   it must release the old block itself when v->alloc > 0; never sets alloc.
 * realloc: store in v->data a block of at least the scalar count that keeps
 *   the old content (or null); data is null on entry when v owned nothing, and
 *   the library then copies the old samples itself; never sets alloc.
 * free: release v->data; the library clears the fields afterwards. */
typedef int32_t (*vlx_alloc_hook_t)(vlx_t* v);
typedef int32_t (*vlx_realloc_hook_t)(vlx_t* v, int32_t old_points, int32_t old_complex);
typedef int32_t (*vlx_free_hook_t)(vlx_t* v);
typedef int32_t (*vlxf_alloc_hook_t)(vlxf_t* v);
typedef int32_t (*vlxf_realloc_hook_t)(vlxf_t* v, int32_t old_points, int32_t old_complex);
typedef int32_t (*vlxf_free_hook_t)(vlxf_t* v);

/* Install a hook (null restores the standard heap); the slot's previous value
 * is stored through old_hook unless it is null.  Hooks of one precision do
 * not affect the other.  Set them before other threads use the library. */
VLX_API int32_t vlx_lib_alloc(vlx_alloc_hook_t new_hook, vlx_alloc_hook_t* old_hook);
VLX_API int32_t vlxf_lib_alloc(vlxf_alloc_hook_t new_hook, vlxf_alloc_hook_t* old_hook);
VLX_API int32_t vlx_lib_realloc(vlx_realloc_hook_t new_hook, vlx_realloc_hook_t* old_hook);
VLX_API int32_t vlxf_lib_realloc(vlxf_realloc_hook_t new_hook, vlxf_realloc_hook_t* old_hook);
VLX_API int32_t vlx_lib_free(vlx_free_hook_t new_hook, vlx_free_hook_t* old_hook);
VLX_API int32_t vlxf_lib_free(vlxf_free_hook_t new_hook, vlxf_free_hook_t* old_hook);

/* Sets delta to 1 and every other field to 0; releases nothing.  Always 0. */
VLX_API int32_t vlx_init(vlx_t* v);
VLX_API int32_t vlxf_init(vlxf_t* v);
/* Releases owned storage (lent storage is left alone), then as vlx_init.  Always 0. */
VLX_API int32_t vlx_destroy(vlx_t* v);
VLX_API int32_t vlxf_destroy(vlxf_t* v);
/* Set points and complex first: makes alloc at least the scalar count; old
 * samples are not kept.  Capacity only grows.  On failure the vector is empty
 * (data null, alloc and points 0). */
VLX_API int32_t vlx_alloc(vlx_t* v);
VLX_API int32_t vlxf_alloc(vlxf_t* v);
/* Set the new points and complex first and pass the old ones: as vlx_alloc,
 * keeping the old samples (copied out of lent storage into an owned block). */
VLX_API int32_t vlx_realloc(vlx_t* v, int32_t old_points, int32_t old_complex);
VLX_API int32_t vlxf_realloc(vlxf_t* v, int32_t old_points, int32_t old_complex);
/* Sets every scalar to 0 (owning storage for them first); points < 1 become 0. */
VLX_API int32_t vlxi_zero(vlx_t* v);
VLX_API int32_t vlxfi_zero(vlxf_t* v);
/* Real to complex in place, imaginary parts 0; a complex vector is left as it is. */
VLX_API int32_t vlxi_rtoc(vlx_t* v);
VLX_API int32_t vlxfi_rtoc(vlxf_t* v);
/* Extends with zeros to new_n points; never shortens. */
VLX_API int32_t vlxi_zpad(vlx_t* v, int32_t new_n);
VLX_API int32_t vlxfi_zpad(vlxf_t* v, int32_t new_n);
/* Appends src behind dst (dst turns complex if src is); dst->delta stays.
 * A vector may be appended to itself. */
VLX_API int32_t vlx_append(vlx_t* dst, vlx_t* src);
VLX_API int32_t vlxf_append(vlxf_t* dst, vlxf_t* src);
/* Copies src into dst, delta included (destination first). */
VLX_API int32_t vlx_copy(vlx_t* dst, vlx_t* src);
VLX_API int32_t vlxf_copy(vlxf_t* dst, vlxf_t* src);
/* Copies at most max_points leading points of src into dst. */
VLX_API int32_t vlx_copy_at_most(vlx_t* dst, vlx_t* src, int32_t max_points);
VLX_API int32_t vlxf_copy_at_most(vlxf_t* dst, vlxf_t* src, int32_t max_points);
/* dst = count points of src from start (source first); the range is clamped
 * to src, so a range outside it gives a shorter or empty result.  src and dst
 * may be the same owning vector, which trims it in place. */
VLX_API int32_t vlxu_subvec(vlx_t* src, vlx_t* dst, int32_t start, int32_t count);
VLX_API int32_t vlxfu_subvec(vlxf_t* src, vlxf_t* dst, int32_t start, int32_t count);
/* Overwrites dst from point `at` with count points of src from start (both
 * clamped); dst grows if needed, never shifts, and takes src->delta. */
VLX_API int32_t vlx_insert_subvec(vlx_t* src, vlx_t* dst, int32_t start, int32_t count, int32_t at);
VLX_API int32_t vlxf_insert_subvec(vlxf_t* src, vlxf_t* dst, int32_t start, int32_t count, int32_t at);
/* Converts to a single-precision vector by rounding; -1 if src is dst. */
VLX_API int32_t vlxu_tof(vlx_t* src, vlxf_t* dst);
VLX_API int32_t vlxfu_tof(vlxf_t* src, vlxf_t* dst);
/* Compares delta, then the samples in order, with an absolute tolerance:
 * *result is 1, -1 or 0 at the first difference beyond it.  Returns -1 (and
 * leaves *result alone) if the lengths differ.  A real operand compares as if
 * its imaginary parts were 0. */
VLX_API int32_t vlx_cmp(vlx_t* a, vlx_t* b, double tolerance, int32_t* result);
VLX_API int32_t vlxf_cmp(vlxf_t* a, vlxf_t* b, float tolerance, int32_t* result);

/* ======================================================================== */
/* Library frame                                                            */
/* ======================================================================== */

/* Makes the library's two locks usable; call once before a second thread
 * enters the library.  Safe to repeat.  Always 0.  One function, two names. */
VLX_API int32_t vlx_lib_init(void);
VLX_API int32_t vlxf_lib_init(void);
/* Releases every internal cache of the double (vlx_) or the float (vlxf_)
 * family; caches refill on next use.  0, or -1 if a step failed. */
VLX_API int32_t vlx_free_internal(void);
VLX_API int32_t vlxf_free_internal(void);
/* The library's version without its point: 328 for 3.28.  One function, two names. */
VLX_API int32_t vlx_version(void);
VLX_API int32_t vlxf_version(void);

/* ======================================================================== */
/* Optional vendor transform binding                                        */
/* ======================================================================== */
/* If the DFT module libmkl_rt.so.2 and the OpenMP runtime libiomp5.so can be
 * loaded (loader search path) at a family's first transform or binding call,
 * power-of-two vlxi_fft and vlxi_rfft go to them.  Without them every call
 * below is inert and returns 0.  Each family has its own state.  Binding
 * sets MKL_DISABLE_FAST_MM=YES and KMP_BLOCKTIME=0 where they are unset. */

/* Bits of the flags word; other bits are stored and returned unused. */
#define VLX_DFT_BOUND  0x1000 /* both modules loaded; set by binding, kept by vlx_dft_set_flags */
#define VLX_DFT_FAST   0x2000 /* power-of-two transforms take the modules (on after binding) */
#define VLX_DFT_KEEP   0x4000 /* keep descriptors between transforms, not freed after each */

/* Binds if first; stores the flags word unless flags is NULL.  Returns 0. */
VLX_API int32_t vlx_dft_get_flags(uint32_t* flags);
VLX_API int32_t vlxf_dft_get_flags(uint32_t* flags);
/* Binds if first; sets the flags word (VLX_DFT_BOUND kept when bound; without
 * the modules VLX_DFT_BOUND, VLX_DFT_FAST and VLX_DFT_KEEP are cleared).  Returns 0. */
VLX_API int32_t vlx_dft_set_flags(uint32_t flags);
VLX_API int32_t vlxf_dft_set_flags(uint32_t flags);
/* Stores the runtime's block time in ms (0 if the flags word is 0); NULL ms
 * returns at once, without binding.  Returns 0. */
VLX_API int32_t vlx_kmp_get_blocktime(int32_t* ms);
VLX_API int32_t vlxf_kmp_get_blocktime(int32_t* ms);
/* Binds if first; sets the runtime's block time in ms if the flags word is not 0.  Returns 0. */
VLX_API int32_t vlx_kmp_set_blocktime(int32_t ms);
VLX_API int32_t vlxf_kmp_set_blocktime(int32_t ms);
/* Stores the runtime's maximum thread count (0 if the flags word is 0); NULL n
 * returns at once, without binding.  Returns 0. */
VLX_API int32_t vlx_omp_get_max_threads(int32_t* n);
VLX_API int32_t vlxf_omp_get_max_threads(int32_t* n);
/* Binds if first; if the flags word is not 0 sets the runtime's thread count
 * and frees the family's descriptors.  0, or -1 if a descriptor release failed. */
VLX_API int32_t vlx_omp_set_num_threads(int32_t n);
VLX_API int32_t vlxf_omp_set_num_threads(int32_t n);

/* ======================================================================== */
/* Transforms                                                               */
/* ======================================================================== */
/* Forward transforms carry 1/N, inverse ones nothing.  After a transform
 * delta is 1/(N * delta), or 1e100 (float: 999999986991104) if it was 0. */

/* --- complex and real power-of-two transforms --- */

/* Complex transform in place, points a power of two (else -1, nothing
 * changed); inverse 0 is forward with 1/N, non-zero inverse unscaled.  A real
 * vector becomes complex, except with 1 point. */
VLX_API int32_t vlxi_fft(vlx_t* v, int32_t inverse);
VLX_API int32_t vlxfi_fft(vlxf_t* v, int32_t inverse);
/* Reorders real or complex points into bit-reversed order; points a power of two. */
VLX_API int32_t vlxi_bitrev(vlx_t* v);
VLX_API int32_t vlxfi_bitrev(vlxf_t* v);
/* As vlxi_bitrev, multiplying every sample by 1/points in the same pass. */
VLX_API int32_t vlxi_bitrev_scale(vlx_t* v);
VLX_API int32_t vlxfi_bitrev_scale(vlxf_t* v);
/* Real vector of N points (a power of two) to its half spectrum in place:
 * N/2 + 1 complex bins with 1/N, Nyquist as the last bin.  -1 if complex. */
VLX_API int32_t vlxi_rfft(vlx_t* v);
VLX_API int32_t vlxfi_rfft(vlxf_t* v);
/* Half spectrum of P points back to 2(P - 1) real samples (a power of two),
 * through the full spectrum and the inverse complex transform. */
VLX_API int32_t vlxi_irfft(vlx_t* v);
VLX_API int32_t vlxfi_irfft(vlxf_t* v);
/* Extends a half spectrum of P points in place to the full one: 2(P - 1)
 * points, plus 1 if odd is non-zero; conjugate mirror (plain mirror for a
 * real vector).  P < 2 (P < 3 with odd 0) is left alone. */
VLX_API int32_t vlxi_orecon(vlx_t* v, int32_t odd);
VLX_API int32_t vlxfi_orecon(vlxf_t* v, int32_t odd);
/* The same as vlxi_orecon(v, 0). */
VLX_API int32_t vlxi_recon(vlx_t* v);
VLX_API int32_t vlxfi_recon(vlxf_t* v);


/* --- any length, cosine transform, analytic signal --- */

/* Complex transform of any length in place, real or complex input; inverse
 * 0 forward with 1/N, non-zero inverse.  Fewer than 2 points: delta only. */
VLX_API int32_t vlxi_dft(vlx_t* v, int32_t inverse);
VLX_API int32_t vlxfi_dft(vlxf_t* v, int32_t inverse);
/* Real vector of any length N to its half spectrum of N/2 + 1 bins, with
 * 1/N.  -1 if complex. */
VLX_API int32_t vlxi_rdft(vlx_t* v);
VLX_API int32_t vlxfi_rdft(vlxf_t* v);
/* Half spectrum of P points back to real samples: 2(P - 1) of them, or
 * 2(P - 1) + 1 if odd is non-zero. */
VLX_API int32_t vlxi_irdft(vlx_t* v, int32_t odd);
VLX_API int32_t vlxfi_irdft(vlxf_t* v, int32_t odd);
/* Cosine transform of type II of a real vector, any length, in place, with
 * 1/N; flags: 1 inverse, 2 scaled form (bins doubled, bin 0 times sqrt(1/2)).
 * Forward, delta becomes 1/(2 N delta); the inverse undoes it.  -1 if complex. */
VLX_API int32_t vlxi_dct(vlx_t* v, uint32_t flags);
VLX_API int32_t vlxfi_dct(vlxf_t* v, uint32_t flags);
/* Analytic signal in place, any length: real part the input, imaginary part
 * its Hilbert transform; complex for 2 points or more. */
VLX_API int32_t vlxi_analytic(vlx_t* v);
VLX_API int32_t vlxfi_analytic(vlxf_t* v);
/* Hilbert transform in place, any length (DC and Nyquist go to 0); a real
 * vector stays real, a complex one complex. */
VLX_API int32_t vlxi_hilbert(vlx_t* v);
VLX_API int32_t vlxfi_hilbert(vlxf_t* v);

/* ======================================================================== */
/* Windows                                                                  */
/* ======================================================================== */
/* A window is chosen by its id, 0 to 31.  n is the window vector's points;
 * its centre is index n/2, and the periodic forms take their arguments from n
 * (a window's period is n).  By default a window is normalised to mean c0
 * (1.0, a little less for the flat tops 8-13), applied, and rotated so that
 * its centre lands at index 0. */

#define VLX_WINDOW_UNIFORM                0
#define VLX_WINDOW_RECTANGULAR            0
#define VLX_WINDOW_NONE                   0
#define VLX_WINDOW_P000                   0
#define VLX_WINDOW_BARTLETT               1
#define VLX_WINDOW_TRIANGULAR             1
#define VLX_WINDOW_HANN                   2
#define VLX_WINDOW_P110                   2
#define VLX_WINDOW_HAMMING                3
#define VLX_WINDOW_P100                   3
#define VLX_WINDOW_BLACKMAN               4
#define VLX_WINDOW_BLACKMAN_HARRIS3       5
#define VLX_WINDOW_P200                   5
#define VLX_WINDOW_BLACKMAN_HARRIS4       6
#define VLX_WINDOW_P310                   6
#define VLX_WINDOW_LOWLEAK                6
#define VLX_WINDOW_GAUSSTOP               7
#define VLX_WINDOW_P400                   7
#define VLX_WINDOW_CHEBY5                 7
#define VLX_WINDOW_FLAT4                  8
#define VLX_WINDOW_P301                   8
#define VLX_WINDOW_FLATTOP                9
#define VLX_WINDOW_FLAT5                  9
#define VLX_WINDOW_P401                   9
#define VLX_WINDOW_FLAT6                  10
#define VLX_WINDOW_P511                   10
#define VLX_WINDOW_FLAT7                  11
#define VLX_WINDOW_P611                   11
#define VLX_WINDOW_P501                   12
#define VLX_WINDOW_P601                   13
#define VLX_WINDOW_KAISER70               14
#define VLX_WINDOW_KAISER80               15
#define VLX_WINDOW_KAISER90               16
#define VLX_WINDOW_KAISER100              17
#define VLX_WINDOW_KAISER110              18
#define VLX_WINDOW_KAISER120              19
#define VLX_WINDOW_GAUSS60                20
#define VLX_WINDOW_GAUSS70                21
#define VLX_WINDOW_GAUSS80                22
#define VLX_WINDOW_RIEMANN                23
#define VLX_WINDOW_SINC_LOBE              23
#define VLX_WINDOW_TUKEY25                24
#define VLX_WINDOW_COS_LOBE               25
#define VLX_WINDOW_RRC                    25
#define VLX_WINDOW_SQRT_HANN              25
#define VLX_WINDOW_CHEBY6                 26
#define VLX_WINDOW_CHEBY7                 27
#define VLX_WINDOW_CHEBY4                 28
#define VLX_WINDOW_NUTTALL                28
#define VLX_WINDOW_BLACKMAN_NUTTALL       28
#define VLX_WINDOW_ORIG_BLACKMAN_HARRIS4  29
#define VLX_WINDOW_KAISER89               30
#define VLX_WINDOW_GAUSS73                31

/* Window flags: one normalisation mode (bits 0-1; 3 is invalid) plus bits. */
#define VLX_WNORM_MEAN          0  /* mean of the samples is c0 */
#define VLX_WNORM_RMS           1  /* root mean square of the samples is 1 */
#define VLX_WNORM_PEAK          2  /* the centre value is 1 */
#define VLX_WFLAG_SYMMETRIC     4  /* mirror-symmetric form (parametric windows only) */
#define VLX_WFLAG_WIDTH         8  /* the width argument is in force */
#define VLX_WFLAG_SWAP_UNIFORM 16  /* rotate after applying id 0 */
#define VLX_WFLAG_NO_SWAP      32  /* do not rotate after applying any other id */

/* --- catalogue --- */

/* Window id of a name (short or VLX_WINDOW_ style), case-insensitive, whole
 * string only.  0 when found; -1 with *id = 0 if none matches; -1 for NULL. */
VLX_API int32_t vlx_window_from_str(const char* name, int32_t* id);
VLX_API int32_t vlxf_window_from_str(const char* name, int32_t* id);
/* Canonical name of id into dst of len bytes (at least 1), cut to len - 1
 * characters and zero-terminated.  -1 (dst[0] = 0) for an unknown id. */
VLX_API int32_t vlx_window_to_str(int32_t id, char* dst, int32_t len);
VLX_API int32_t vlxf_window_to_str(int32_t id, char* dst, int32_t len);

/* --- synthesis and application --- */

/* Multiplies the real or complex v in place by window id with flags; with
 * VLX_WFLAG_WIDTH a window of width points (real) is centred in v, zeros
 * around it.  Windows are cached (16 per family) under lock 1.  0 or -1. */
VLX_API int32_t vlxi_window2(vlx_t* v, int32_t id, int32_t flags, double width);
VLX_API int32_t vlxfi_window2(vlxf_t* v, int32_t id, int32_t flags, float width);
/* vlxi_window2 with width 0; -1 if flags has VLX_WFLAG_WIDTH. */
VLX_API int32_t vlxi_window(vlx_t* v, int32_t id, int32_t flags);
VLX_API int32_t vlxfi_window(vlxf_t* v, int32_t id, int32_t flags);
/* Multiplies v by the cosine sum c0 + c1 cos(2 pi i/n) + ... of the real
 * vector coefs (i counted from the centre), unnormalised, then rotates. */
VLX_API int32_t vlxi_window_cos(vlx_t* v, vlx_t* coefs);
VLX_API int32_t vlxfi_window_cos(vlxf_t* v, vlxf_t* coefs);

/* --- parametric windows (no cache; rotated unless VLX_WFLAG_NO_SWAP) --- */

/* Kaiser window of shape beta (limited to 460.5, rms mode 230.3; float 69.1, 34.5). */
VLX_API int32_t vlxi_window_kaiser(vlx_t* v, double beta, int32_t flags);
VLX_API int32_t vlxfi_window_kaiser(vlxf_t* v, float beta, int32_t flags);
/* Gaussian exp(-0.5 (t / (sigma n))^2), t the distance from the centre. */
VLX_API int32_t vlxi_window_gauss(vlx_t* v, double sigma, int32_t flags);
VLX_API int32_t vlxfi_window_gauss(vlxf_t* v, float sigma, int32_t flags);
/* Sinc lobe (sin a / a)^power, a reaching x (radians) at the window's edge;
 * -1 with VLX_WFLAG_WIDTH. */
VLX_API int32_t vlxi_window_sinc(vlx_t* v, double x, double power, int32_t flags);
VLX_API int32_t vlxfi_window_sinc(vlxf_t* v, float x, float power, int32_t flags);
/* Tukey window: flat middle, cosine taper over the fraction alpha (0 to 1)
 * of the length; -1 with VLX_WFLAG_WIDTH. */
VLX_API int32_t vlxi_window_tukey(vlx_t* v, double alpha, int32_t flags);
VLX_API int32_t vlxfi_window_tukey(vlxf_t* v, float alpha, int32_t flags);
/* FIR prototype window, peak 1, symmetric, unrotated: id 100 Gaussian of
 * bandwidth param, 101 Kaiser of transition width param (cycles per sample),
 * 102 and 103 sinc lobes of bandwidth param; other ids as vlxi_window. */
VLX_API int32_t vlxi_window_fir(vlx_t* v, int32_t id, double param);
VLX_API int32_t vlxfi_window_fir(vlxf_t* v, int32_t id, float param);

/* --- metrics (results through out; nothing is cached) --- */

/* Factor from the peak-normalised window to the mode in flags, for points
 * samples (and width with VLX_WFLAG_WIDTH).  1 for peak mode or points < 1. */
VLX_API int32_t vlx_window2_scale(double* out, int32_t id, int32_t flags, int32_t points, double width);
VLX_API int32_t vlxf_window2_scale(float* out, int32_t id, int32_t flags, int32_t points, float width);
/* vlx_window2_scale with width 0; -1 with VLX_WFLAG_WIDTH. */
VLX_API int32_t vlx_window_scale(double* out, int32_t id, int32_t flags, int32_t points);
VLX_API int32_t vlxf_window_scale(float* out, int32_t id, int32_t flags, int32_t points);
/* Equivalent noise bandwidth in bins of points, of a window of width points. */
VLX_API int32_t vlx_window2_enbw(double* out, int32_t id, int32_t points, double width);
VLX_API int32_t vlxf_window2_enbw(float* out, int32_t id, int32_t points, float width);
/* Equivalent noise bandwidth in bins of a full-length window (Hann: 1.5). */
VLX_API int32_t vlx_window_enbw(double* out, int32_t id, int32_t points);
VLX_API int32_t vlxf_window_enbw(float* out, int32_t id, int32_t points);
/* selector 0: ENBW; 1: 3 dB bandwidth; 2: 6 dB bandwidth, in bins of points
 * for a window of width points (width <= 0: 1e100, float 1e15). */
VLX_API int32_t vlx_window_metric(double* out, int32_t selector, int32_t id, int32_t points, double width);
VLX_API int32_t vlxf_window_metric(float* out, int32_t selector, int32_t id, int32_t points, float width);

/* ======================================================================== */
/* Generators and resampling tables                                         */
/* ======================================================================== */
/* The generators fill a vector whose points, delta and complex flag the caller
 * has set; sample k stands at x = k*delta, so frequencies are in cycles per
 * unit of x.  points and delta are left as they are. */

/* v[k] = offset + k*delta*slope, by adding delta*slope sample after sample;
 * a complex v gets zero imaginary parts.  0, or -1 if storage fails. */
VLX_API int32_t vlxc_line(vlx_t* v, double slope, double offset);
VLX_API int32_t vlxfc_line(vlxf_t* v, float slope, float offset);
/* v[k] = cos(2*pi*freq*k*delta + phase), phase in radians, by a rotation
 * restarted exactly every 256 samples; a complex v gets zero imaginary parts. */
VLX_API int32_t vlxc_cos(vlx_t* v, double freq, double phase);
VLX_API int32_t vlxfc_cos(vlxf_t* v, float freq, float phase);
/* v[k] = exp(j*(2*pi*freq*k*delta + phase)) in a complex v; a real v gets
 * the cosine (vlxc_cos).  0, or -1 if storage fails. */
VLX_API int32_t vlxc_cexp(vlx_t* v, double freq, double phase);
VLX_API int32_t vlxfc_cexp(vlxf_t* v, float freq, float phase);

/* Fills v (points and complex preset) with noise of a kind: 0 uniform in
 * [-1, 1) (complex: in the unit disc), 1 Gaussian of variance 1 (complex:
 * each part), 2 exponential of mean 1, 3 Laplace (2 and 3 real only).  Draws
 * on the C library's rand(), seeded once per family from the machine; each
 * rand() value counts by its low 15 bits (rand() & 0x7FFF), so a uniform
 * draw takes 4 calls (60 bits; float: 2 calls, 30 bits).  Holds lock 1 for
 * the whole fill.  -1 for another kind, kinds 2 and 3 on a complex v (after
 * sizing it), or if storage fails. */
VLX_API int32_t vlxc_rand(vlx_t* v, int32_t kind);
VLX_API int32_t vlxfc_rand(vlxf_t* v, int32_t kind);
/* Random permutation of the samples in place (complex pairs stay together),
 * by a Fisher-Yates walk on 31-bit draws of the same generator.  Returns 0. */
VLX_API int32_t vlxi_shuffle(vlx_t* v);
VLX_API int32_t vlxfi_shuffle(vlxf_t* v);

/* A resampling table is a real vector of n = T*P + 2 points (n even): T, the
 * taps per phase, in data[0], then T*P + 1 samples of one low-pass kernel
 * over P phases, symmetric about the middle entry data[1 + (n-2)/2].  The
 * caller presets n (and so P); a design is a real vector of T and shape
 * coefficients.  n below 2 or a design of fewer than 2 scalars: 0, v zero
 * with data[0] = T where both have a first scalar. */

/* Expands built-in design 0 to 4 (T = 8, 13, 8, 10, 13) into v, a kernel
 * that peaks in the middle.  0; -1 for another design, an odd n or if
 * storage fails. */
VLX_API int32_t vlxc_rsmp(vlx_t* v, int32_t design);
VLX_API int32_t vlxfc_rsmp(vlxf_t* v, int32_t design);
/* Expands design d = (T, a0, a1, ...) as the cosine sum a0 + a1*cos(theta) +
 * a2*cos(2*theta) + ..., theta from 0 at the middle to pi at the ends.  -1
 * for an odd n, a complex d or if storage fails.  A complex v gets the
 * table as real parts. */
VLX_API int32_t vlxc_rsmp_cos(vlx_t* v, const vlx_t* d);
VLX_API int32_t vlxfc_rsmp_cos(vlxf_t* v, const vlxf_t* d);
/* As vlxc_rsmp_cos, with the shape a polynomial a0 + a1*c + a2*c^2 + ... in
 * c = cos(theta). */
VLX_API int32_t vlxc_rsmp_pcos(vlx_t* v, const vlx_t* d);
VLX_API int32_t vlxfc_rsmp_pcos(vlxf_t* v, const vlxf_t* d);

/* ======================================================================== */
/* Generators and filter design: FIR design                                 */
/* ======================================================================== */

/* Impulse response of type into v, whose points the caller sets (complex v:
 * the same taps, imaginary parts 0); frequencies in cycles per sample.
 * 0 band pass (arg1 centre, arg2 width), 1 band stop (same, odd points),
 * 2 high pass (arg1 cut, odd points), 3 low pass (arg1 cut), 4 window-shaped
 * smoother (arg1 shape, 0 default), 5 low pass with delay arg2 samples,
 * 6 differentiator, 7 Gaussian (arg1 bandwidth), 8 Hilbert transformer
 * (arg1 band edge), 9 sinhc smoother (arg1 shape), 10 ramp |f|.  4, 5, 7, 9
 * sum to 1; the others are unwindowed.  0, or -1 (type above 10, no memory). */
VLX_API int32_t vlxc_fir(vlx_t* v, int32_t type, double arg1, double arg2);
VLX_API int32_t vlxfc_fir(vlxf_t* v, int32_t type, float arg1, float arg2);
/* Fixed half-filter set 100 to 104 into v (12, 20, 5, 38 or 61 points). */
VLX_API int32_t vlxc_fir2(vlx_t* v, int32_t set);
VLX_API int32_t vlxfc_fir2(vlxf_t* v, int32_t set);

/* ======================================================================== */
/* Filters: staging and decimation                                          */
/* ======================================================================== */
/* A filter's history `hist` is an optional vector owned by the caller that
 * carries the stream from block to block; NULL or empty starts from silence.
 * Output has as many points as input, except in rate changers. */

/* Staging flags of vlx_stage_io. */
#define VLX_STAGE_ALIAS       1 /* route a destination sharing the source's data through a temporary */
#define VLX_STAGE_KEEP_POINTS 2 /* the caller has set out->points already */

/* Keeps every factor-th sample (factor < 1 taken as 1) after the skip count carried in
 * hist->data[0] (hist may be NULL), so blocks fed in turn give what one long call gives.
 * out may be in; out->delta = factor * in->delta. */
VLX_API int32_t vlxd_deci(vlx_t* in, vlx_t* out, int32_t factor, vlx_t* hist);
VLX_API int32_t vlxfd_deci(vlxf_t* in, vlxf_t* out, int32_t factor, vlxf_t* hist);

/* ======================================================================== */
/* Filters: FIR, symmetric FIR, hwfilt, resampler                           */
/* ======================================================================== */
/* Filters keep their delay and give as many points as the input; out may be
 * in.  hist (may be NULL) carries the last inputs so that blocks fed in turn
 * continue one stream.  Each returns 0, or -1 on failure. */

/* FIR filter: out[k] = sum of filter[i] * in[k - i] over the filter->points taps, real or complex
 * source and taps; hist holds the last filter->points - 1 inputs.  Long real filters run a fast
 * convolution with the filter's spectrum cached.  An empty filter copies in. */
VLX_API int32_t vlxd_fir(vlx_t* in, vlx_t* out, vlx_t* filter, vlx_t* hist);
VLX_API int32_t vlxfd_fir(vlxf_t* in, vlxf_t* out, vlxf_t* filter, vlxf_t* hist);
/* Linear-phase FIR from the first half of its taps: 2m taps, or 2m - 1 with odd non-zero
 * (filter's last tap the centre); anti non-zero negates the mirrored half.  hist: N - 1 inputs. */
VLX_API int32_t vlxd_sfir(vlx_t* in, vlx_t* out, vlx_t* filter, int32_t odd, int32_t anti, vlx_t* hist);
VLX_API int32_t vlxfd_sfir(vlxf_t* in, vlxf_t* out, vlxf_t* filter, int32_t odd, int32_t anti, vlxf_t* hist);
/* vlxd_sfir then vlxd_deci by factor (below 1 taken as 1); hist holds the N - 1 inputs and, at
 * point N - 1, the skip count.  out->delta = factor * in->delta. */
VLX_API int32_t vlxd_sfir_deci(vlx_t* in, vlx_t* out, vlx_t* filter, int32_t odd, int32_t anti, int32_t factor, vlx_t* hist);
VLX_API int32_t vlxfd_sfir_deci(vlxf_t* in, vlxf_t* out, vlxf_t* filter, int32_t odd, int32_t anti, int32_t factor, vlxf_t* hist);
/* Fixed low-pass of four power-of-two sections (id 0 only; zeros at 1/3 and 1/2 of the rate,
 * gain 1 at 0); hist: 12 points of section state.  -1 for another id. */
VLX_API int32_t vlxd_hwfilt(vlx_t* in, vlx_t* out, int32_t id, vlx_t* hist);
VLX_API int32_t vlxfd_hwfilt(vlxf_t* in, vlxf_t* out, int32_t id, vlxf_t* hist);
/* vlxd_hwfilt in place, from silence, with no history kept. */
VLX_API int32_t vlxi_hwfilt(vlx_t* v, int32_t id);
VLX_API int32_t vlxfi_hwfilt(vlxf_t* v, int32_t id);
/* Resamples by ratio (input samples per output, >= 0) with a polyphase table coef (T in
 * data[0], T * P + 1 entries); method 0 nearest lower phase (real only), 1 interpolated.
 * out->points preset to the most outputs wanted, set to those made; out->delta = in->delta * ratio;
 * hist: T + 2 points (window, mu, T + position reached).  coef under 2 points copies in. */
VLX_API int32_t vlxd_rsmp(vlx_t* in, vlx_t* out, int32_t method, vlx_t* coef, double ratio, vlx_t* hist);
VLX_API int32_t vlxfd_rsmp(vlxf_t* in, vlxf_t* out, int32_t method, vlxf_t* coef, float ratio, vlxf_t* hist);
/* vlxd_rsmp with built-in table design 0 to 4 (vlxc_rsmp) made and destroyed in the call; after
 * a failed run the table is not released. */
VLX_API int32_t vlxd_rsmp2(vlx_t* in, vlx_t* out, int32_t method, int32_t design, double ratio, vlx_t* hist);
VLX_API int32_t vlxfd_rsmp2(vlxf_t* in, vlxf_t* out, int32_t method, int32_t design, float ratio, vlxf_t* hist);

/* ======================================================================== */
/* Streaming and measurement                                                */
/* ======================================================================== */
/* The streaming resampler splits a rate ratio (input samples per output
 * sample) into 2^octaves, done by decimate-by-2 stages (or one interpolate-
 * by-2 stage), and a remainder near 1 done by a polyphase stage.  The
 * coefficient object describes a ratio and may be shared by any number of
 * streams; each stream keeps its filter memory in its own state object.
 * Order of calls: coef_init, coef_alloc, coef_setup; per stream state_init,
 * state_alloc, state_reset; vlxh_rsmp per block; state_destroy, coef_destroy. */

/* Coefficient object (float twin: vlxf_t members and a float ratio). */
typedef struct vlxh_rsmp_coef_t {
    vlx_t    half_filter; /* half of the octave and last-decimation filter */
    int32_t  half_odd;    /* odd flag of half_filter (1) */
    vlx_t    pre_filter;  /* half of the filter ahead of the polyphase stage */
    int32_t  pre_odd;     /* odd flag of pre_filter (1) */
    vlx_t    table;       /* polyphase table, 13 taps by 1024 phases */
    int32_t  method;      /* resampler method (1: linear between phases) */
    double   ratio;       /* remainder ratio after the power of 2 */
    int32_t  octaves;     /* decimate-by-2 stages; -1: one interpolate-by-2 stage */
    int32_t  forced;      /* non-zero: run the polyphase stage even at ratio 1 */
    int32_t  skip_mid;    /* start-up samples dropped behind the octave stages */
    int32_t  skip_out;    /* start-up samples dropped at the end */
} vlxh_rsmp_coef_t;

typedef struct vlxfh_rsmp_coef_t {
    vlxf_t   half_filter;
    int32_t  half_odd;
    vlxf_t   pre_filter;
    int32_t  pre_odd;
    vlxf_t   table;
    int32_t  method;
    float    ratio;
    int32_t  octaves;
    int32_t  forced;
    int32_t  skip_mid;
    int32_t  skip_out;
} vlxfh_rsmp_coef_t;

/* State object of one stream (float twin: vlxf_t members). */
typedef struct vlxh_rsmp_state_t {
    int32_t  stages;      /* number of octave-stage histories */
    vlx_t*   stage_hist;  /* one history per octave stage (standard heap) */
    int32_t  reserved;    /* zero */
    int32_t  skip_mid;    /* start-up samples still to drop behind the octave stages */
    vlx_t    pre_hist;    /* history of the pre-filter */
    vlx_t    rsmp_hist;   /* window, position and time of the polyphase stage */
    vlx_t    post_hist;   /* history of the last decimation */
    vlx_t    spare;       /* never written */
    int32_t  skip_out;    /* start-up samples still to drop at the end */
} vlxh_rsmp_state_t;

typedef struct vlxfh_rsmp_state_t {
    int32_t  stages;
    vlxf_t*  stage_hist;
    int32_t  reserved;
    int32_t  skip_mid;
    vlxf_t   pre_hist;
    vlxf_t   rsmp_hist;
    vlxf_t   post_hist;
    vlxf_t   spare;
    int32_t  skip_out;
} vlxfh_rsmp_state_t;

/* Inits the three vectors and zeroes the other fields.  NULL coef: 0. */
VLX_API int32_t vlxh_rsmp_coef_init(vlxh_rsmp_coef_t* coef);
VLX_API int32_t vlxfh_rsmp_coef_init(vlxfh_rsmp_coef_t* coef);
/* Fills the filters and the polyphase table; kind must be 0 (else -1). */
VLX_API int32_t vlxh_rsmp_coef_alloc(vlxh_rsmp_coef_t* coef, int32_t kind);
VLX_API int32_t vlxfh_rsmp_coef_alloc(vlxfh_rsmp_coef_t* coef, int32_t kind);
/* Configures a ratio in input samples per output sample (0 or below: 1);
 * forced non-zero runs the polyphase stage even at 1.  reserved must be 0.
 * An infinite ratio is refused with -1, nothing stored. */
VLX_API int32_t vlxh_rsmp_coef_setup(vlxh_rsmp_coef_t* coef, double ratio, int32_t forced, int32_t reserved);
VLX_API int32_t vlxfh_rsmp_coef_setup(vlxfh_rsmp_coef_t* coef, float ratio, int32_t forced, int32_t reserved);
/* Destroys the three vectors and zeroes the other fields.  NULL coef: 0. */
VLX_API int32_t vlxh_rsmp_coef_destroy(vlxh_rsmp_coef_t* coef);
VLX_API int32_t vlxfh_rsmp_coef_destroy(vlxfh_rsmp_coef_t* coef);
/* Zeroes a state object and inits its vectors.  NULL state: 0. */
VLX_API int32_t vlxh_rsmp_state_init(vlxh_rsmp_state_t* state);
VLX_API int32_t vlxfh_rsmp_state_init(vlxfh_rsmp_state_t* state);
/* Sizes the histories for coef and a real (is_complex 0) or complex stream,
 * keeping samples already held.  NULL state: 0. */
VLX_API int32_t vlxh_rsmp_state_alloc(vlxh_rsmp_coef_t* coef, vlxh_rsmp_state_t* state, int32_t is_complex);
VLX_API int32_t vlxfh_rsmp_state_alloc(vlxfh_rsmp_coef_t* coef, vlxfh_rsmp_state_t* state, int32_t is_complex);
/* Clears the histories and arms the start-up discards of coef.  NULL state: 0. */
VLX_API int32_t vlxh_rsmp_state_reset(vlxh_rsmp_coef_t* coef, vlxh_rsmp_state_t* state);
VLX_API int32_t vlxfh_rsmp_state_reset(vlxfh_rsmp_coef_t* coef, vlxfh_rsmp_state_t* state);
/* Releases the histories and zeroes the counts.  NULL state: 0. */
VLX_API int32_t vlxh_rsmp_state_destroy(vlxh_rsmp_state_t* state);
VLX_API int32_t vlxfh_rsmp_state_destroy(vlxfh_rsmp_state_t* state);
/* *result = input points needed for out_points outputs; settled non-zero adds
 * the start-up.  NULL coef: -1; NULL result: 0, nothing written. */
VLX_API int32_t vlxh_rsmp_get_in_pts(int32_t* result, vlxh_rsmp_coef_t* coef, int32_t out_points, int32_t settled);
VLX_API int32_t vlxfh_rsmp_get_in_pts(int32_t* result, vlxfh_rsmp_coef_t* coef, int32_t out_points, int32_t settled);
/* *result = outputs from in_points inputs: the largest count possible, or with
 * at_least (and settled 0) a count certain to be reached; settled takes the
 * start-up away.  NULL coef: -1; NULL result: 0, nothing written. */
VLX_API int32_t vlxh_rsmp_get_out_pts(int32_t* result, vlxh_rsmp_coef_t* coef, int32_t in_points, int32_t settled, int32_t at_least);
VLX_API int32_t vlxfh_rsmp_get_out_pts(int32_t* result, vlxfh_rsmp_coef_t* coef, int32_t in_points, int32_t settled, int32_t at_least);
/* *result = group delay of the cascade in input points, or in output points
 * when in_output_units is non-zero.  No NULL checks. */
VLX_API int32_t vlxh_rsmp_get_delay_pts(double* result, vlxh_rsmp_coef_t* coef, int32_t in_output_units);
VLX_API int32_t vlxfh_rsmp_get_delay_pts(float* result, vlxfh_rsmp_coef_t* coef, int32_t in_output_units);
/* *result = length of the start-up discards in input points, or in output
 * points when in_output_units is non-zero.  NULL coef: -1; NULL result: 0. */
VLX_API int32_t vlxh_rsmp_get_settle_pts(double* result, vlxh_rsmp_coef_t* coef, int32_t in_output_units);
VLX_API int32_t vlxfh_rsmp_get_settle_pts(float* result, vlxfh_rsmp_coef_t* coef, int32_t in_output_units);
/* Pushes one block of the stream through the cascade.  Preset out->points to
 * the most points wanted; on return it holds the points delivered (delta:
 * in's times the ratio).  work (scratch) and state may be NULL (a temporary,
 * no history kept); in and work may share storage with out, work being a
 * vector of its own. */
VLX_API int32_t vlxh_rsmp(vlx_t* in, vlx_t* out, vlx_t* work, vlxh_rsmp_coef_t* coef, vlxh_rsmp_state_t* state);
VLX_API int32_t vlxfh_rsmp(vlxf_t* in, vlxf_t* out, vlxf_t* work, vlxfh_rsmp_coef_t* coef, vlxfh_rsmp_state_t* state);

/* Averaging modes of vlxh_avg (low four bits of mode; 7 to 15 do nothing). */
#define VLX_AVG_LAST      0   /* acc = record */
#define VLX_AVG_LINEAR    1   /* acc = (record - acc) * w + acc */
#define VLX_AVG_MAX       2   /* maximum hold */
#define VLX_AVG_MIN       3   /* minimum hold */
#define VLX_AVG_HARMONIC  4   /* linear average of reciprocals */
#define VLX_AVG_GEOMETRIC 5   /* linear average of logarithms */
#define VLX_AVG_SAMPLE    6   /* take the sweep where count mod period is 1 */
/* Flags of vlxh_avg, or'ed into mode; the conversions run in this order. */
#define VLX_AVG_LIMITED   16  /* the weight stops falling at 1/limit */
#define VLX_AVG_POWER     32  /* record to squared magnitudes first */
#define VLX_AVG_MAG       64  /* record to magnitudes */
#define VLX_AVG_LOG       128 /* record to natural logarithms */

/* Folds sweep number count (1 for the first, which always starts acc) of in
 * into acc.  Weight w: weight if >= 0, else 1/count (with VLX_AVG_LIMITED at
 * most 1/limit).  work holds conversions (NULL: a temporary).  Every step
 * runs; -1 if any failed. */
VLX_API int32_t vlxh_avg(vlx_t* in, vlx_t* acc, vlx_t* work, int32_t mode, int32_t count, int32_t period, double weight, double limit);
VLX_API int32_t vlxfh_avg(vlxf_t* in, vlxf_t* acc, vlxf_t* work, int32_t mode, int32_t count, int32_t period, float weight, float limit);
/* out[k] = mean over j < lags_pts of conj(ref[j]) * sig[j + k], for each of
 * the sig->points - lags_pts + 1 lags, by one power-of-2 transform length;
 * halved when halve is non-zero.  work: scratch (NULL: a temporary).
 * 0 < lags_pts <= ref->points, sig->points required, else -1; a real ref
 * with a complex sig also gives -1 (the transforms follow ref's type). */
VLX_API int32_t vlxh_corr(vlx_t* ref, vlx_t* sig, vlx_t* out, vlx_t* work, int32_t lags_pts, int32_t halve);
VLX_API int32_t vlxfh_corr(vlxf_t* ref, vlxf_t* sig, vlxf_t* out, vlxf_t* work, int32_t lags_pts, int32_t halve);
/* vlxh_corr with halve 0. */
VLX_API int32_t vlxb_corr(vlx_t* ref, vlx_t* sig, vlx_t* out, vlx_t* work, int32_t lags_pts);
VLX_API int32_t vlxfb_corr(vlxf_t* ref, vlxf_t* sig, vlxf_t* out, vlxf_t* work, int32_t lags_pts);

/* Flags of the spectrum pipeline. */
#define VLX_SPEC_INVERSE      1   /* spectrum to time */
#define VLX_SPEC_TWO_SIDED    2   /* complex transform also for real data, centred, no factor 2 */
#define VLX_SPEC_SUM          4   /* plain sum instead of amplitude scaling */
#define VLX_SPEC_NO_WINDOW    8   /* no window; only the rotation */
#define VLX_SPEC_CENTRED      16  /* time origin in the middle of the record even for window 0 */
#define VLX_SPEC_TWO_SIDED_IN 32  /* inverse: input is a centred two-sided spectrum, factor 0.5 kept */
#define VLX_SPEC_ODD          64  /* inverse of a one-sided spectrum of odd length (vlxh_dft only) */
#define VLX_SPEC_RAW          128 /* the transform alone */

/* Spectrum of a record of any length, window id 0 to 31 (0: uniform), scaled
 * so that a sine's peak reads its amplitude; one-sided (n/2 + 1 points) for a
 * real record.  VLX_SPEC_INVERSE goes back.  out->delta: the transform's. */
VLX_API int32_t vlxh_dft(vlx_t* in, vlx_t* out, int32_t window, int32_t flags);
VLX_API int32_t vlxfh_dft(vlxf_t* in, vlxf_t* out, int32_t window, int32_t flags);
/* As vlxh_dft on a power-of-2 transform length: the smallest power of 2 at
 * least nfft (< 1: in->points), of which the first fraction (0 < f <= 1, else
 * 1) is record taken from in, windowed, and zero-padded. */
VLX_API int32_t vlxh_fft(vlx_t* in, vlx_t* out, int32_t nfft, double fraction, int32_t window, int32_t flags);
VLX_API int32_t vlxfh_fft(vlxf_t* in, vlxf_t* out, int32_t nfft, float fraction, int32_t window, int32_t flags);

/* ======================================================================== */
/* Element-wise: two-operand operations                                     */
/* ======================================================================== */
/* Sources a and b, destination dst, which may be either source.  A real
 * operand meets a complex one as if its imaginary parts were 0; the result is
 * complex if either source is, and its delta is the mean of the two deltas.
 * Unequal points give -1 unless a comment says otherwise. */

/* dst = a + b; the shorter source counts as zero-extended (result: the longer points). */
VLX_API int32_t vlxb_add(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_add(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* dst = a - b; the shorter source counts as zero-extended (result: the longer points). */
VLX_API int32_t vlxb_sub(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_sub(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* dst = a * b, point by point. */
VLX_API int32_t vlxb_mul(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_mul(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* dst = a * conj(b), point by point. */
VLX_API int32_t vlxb_conj_mul(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_conj_mul(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* dst = a / b.  A division by zero gives 0 for a zero numerator, otherwise
 * +1e100 (float: +1e15) in every part, whatever the signs. */
VLX_API int32_t vlxb_div(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_div(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* dst = (a - b) * alpha + b: exponential averaging with weight alpha on a. */
VLX_API int32_t vlxb_avg_add(vlx_t* a, vlx_t* b, vlx_t* dst, double alpha);
VLX_API int32_t vlxfb_avg_add(vlxf_t* a, vlxf_t* b, vlxf_t* dst, float alpha);
/* The larger (max) or smaller (min) sample of each pair; once either source is
 * complex, whole samples by power, parts beyond 1e100 (float: 1e15) ranking at
 * 1e100.  Ties and NaNs give b's sample. */
VLX_API int32_t vlxb_max(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_max(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
VLX_API int32_t vlxb_min(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_min(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* Interleaves samples: a[0], b[0], a[1], b[1], ...; 2 * points, delta the mean halved. */
VLX_API int32_t vlxb_inter(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_inter(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* Complex dst from real vectors re and im; -1 if either is complex. */
VLX_API int32_t vlxb_ritoc(vlx_t* re, vlx_t* im, vlx_t* dst);
VLX_API int32_t vlxfb_ritoc(vlxf_t* re, vlxf_t* im, vlxf_t* dst);
/* Polynomial product (full linear convolution): a.points + b.points - 1
 * points, 0 if either is empty.  Any lengths. */
VLX_API int32_t vlxb_pmul(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_pmul(vlxf_t* a, vlxf_t* b, vlxf_t* dst);
/* One-point dst = sum of a[i] * b[i] (nothing conjugated); dst->delta is left alone. */
VLX_API int32_t vlxbs_dot(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfbs_dot(vlxf_t* a, vlxf_t* b, vlxf_t* dst);

/* ======================================================================== */
/* Element-wise: arithmetic and math                                        */
/* ======================================================================== */

/* In place, one vector; points < 1 is a no-op returning 0.  B stands for
 * 1e100 (float: 1e15), E for ln B = 230.2585 (float: 34.538776), T for the
 * smallest normal value.  "Real only" functions return -1 for a complex
 * vector and change nothing.  Clamps replace domain errors; NaN passes them. */

/* Every scalar times s. */
VLX_API int32_t vlxi_scale(vlx_t* v, double s);
VLX_API int32_t vlxfi_scale(vlxf_t* v, float s);
/* Adds c to every real sample, or to the real part of every complex one. */
VLX_API int32_t vlxi_offset(vlx_t* v, double c);
VLX_API int32_t vlxfi_offset(vlxf_t* v, float c);
/* Multiplies by re + j im; a real vector becomes complex (-1 if it cannot grow). */
VLX_API int32_t vlxi_cscale(vlx_t* v, double re, double im);
VLX_API int32_t vlxfi_cscale(vlxf_t* v, float re, float im);
/* Negates every scalar. */
VLX_API int32_t vlxi_neg(vlx_t* v);
VLX_API int32_t vlxfi_neg(vlxf_t* v);
/* |x|; real only (vlxi_mag takes magnitudes of complex samples). */
VLX_API int32_t vlxi_abs(vlx_t* v);
VLX_API int32_t vlxfi_abs(vlxf_t* v);
/* Complex conjugate (sign bit of im flipped); a real vector is left alone. */
VLX_API int32_t vlxi_conj(vlx_t* v);
VLX_API int32_t vlxfi_conj(vlxf_t* v);
/* Multiplies by j; a real vector becomes complex (-1 if it cannot grow). */
VLX_API int32_t vlxi_timesi(vlx_t* v);
VLX_API int32_t vlxfi_timesi(vlxf_t* v);
/* Magnitude |x| or hypot(re, im); the vector becomes real. */
VLX_API int32_t vlxi_mag(vlx_t* v);
VLX_API int32_t vlxfi_mag(vlxf_t* v);
/* Power x*x or re*re + im*im, B once a part exceeds B; the vector becomes real. */
VLX_API int32_t vlxi_magsq(vlx_t* v);
VLX_API int32_t vlxfi_magsq(vlxf_t* v);
/* Square: x*x (B beyond B); complex parts clamped to +-B first. */
VLX_API int32_t vlxi_square(vlx_t* v);
VLX_API int32_t vlxfi_square(vlxf_t* v);
/* Reciprocal: 1/x, B for 0; complex (0, 0) gives (0, -0). */
VLX_API int32_t vlxi_recip(vlx_t* v);
VLX_API int32_t vlxfi_recip(vlxf_t* v);
/* Square root: 0 for x < 0; complex: the principal root. */
VLX_API int32_t vlxi_sqrt(vlx_t* v);
VLX_API int32_t vlxfi_sqrt(vlxf_t* v);
/* e^x, B for x > E; complex: e^re * (cos im, sin im). */
VLX_API int32_t vlxi_exp(vlx_t* v);
VLX_API int32_t vlxfi_exp(vlxf_t* v);
/* 10^x, B for x > 100 (float: 15); real: the walk stops at the first sample
 * below -B, leaving it and the rest unchanged; complex: re below -B gives -B. */
VLX_API int32_t vlxi_exp10(vlx_t* v);
VLX_API int32_t vlxfi_exp10(vlxf_t* v);
/* Natural logarithm, ln T below T; complex: (ln |z|, arg z). */
VLX_API int32_t vlxi_log(vlx_t* v);
VLX_API int32_t vlxfi_log(vlxf_t* v);
/* Base-10 logarithm, log10 T below T; complex: (log10 |z|, arg z * log10 e). */
VLX_API int32_t vlxi_log10(vlx_t* v);
VLX_API int32_t vlxfi_log10(vlxf_t* v);
/* factor * log10: 20 for decibels of an amplitude, 10 of a power; complex as vlxi_log10, both parts times factor. */
VLX_API int32_t vlxi_db(vlx_t* v, double factor);
VLX_API int32_t vlxfi_db(vlxf_t* v, float factor);
/* Complex (magnitude, phase in radians) to (re, im); a real vector is left alone. */
VLX_API int32_t vlxi_ptor(vlx_t* v);
VLX_API int32_t vlxfi_ptor(vlxf_t* v);
/* Adds amp * cos(2 pi freq k delta + phase) to sample k (freq in cycles per
 * unit of x); with flags bit 1 (value 1) a complex vector also gets the sine
 * in its imaginary part. */
VLX_API int32_t vlxi_addcos(vlx_t* v, uint32_t flags, double freq, double amp, double phase);
VLX_API int32_t vlxfi_addcos(vlxf_t* v, uint32_t flags, float freq, float amp, float phase);
/* Real only: sin, cos, tan, atan, tanh of each sample (radians). */
VLX_API int32_t vlxi_sin(vlx_t* v);
VLX_API int32_t vlxfi_sin(vlxf_t* v);
VLX_API int32_t vlxi_cos(vlx_t* v);
VLX_API int32_t vlxfi_cos(vlxf_t* v);
VLX_API int32_t vlxi_tan(vlx_t* v);
VLX_API int32_t vlxfi_tan(vlxf_t* v);
VLX_API int32_t vlxi_atan(vlx_t* v);
VLX_API int32_t vlxfi_atan(vlxf_t* v);
VLX_API int32_t vlxi_tanh(vlx_t* v);
VLX_API int32_t vlxfi_tanh(vlxf_t* v);
/* Real only: acos, asin; 0 where |x| > 1. */
VLX_API int32_t vlxi_acos(vlx_t* v);
VLX_API int32_t vlxfi_acos(vlxf_t* v);
VLX_API int32_t vlxi_asin(vlx_t* v);
VLX_API int32_t vlxfi_asin(vlxf_t* v);
/* Real only: cosh (B where |x| > E), sinh (+-B where |x| > E). */
VLX_API int32_t vlxi_cosh(vlx_t* v);
VLX_API int32_t vlxfi_cosh(vlxf_t* v);
VLX_API int32_t vlxi_sinh(vlx_t* v);
VLX_API int32_t vlxfi_sinh(vlxf_t* v);
/* Real only: sin(x)/x, 1 at 0 (no factor of pi). */
VLX_API int32_t vlxi_sinc(vlx_t* v);
VLX_API int32_t vlxfi_sinc(vlxf_t* v);
/* Real only: modified Bessel function I0 (B where |x| > E). */
VLX_API int32_t vlxi_besi0(vlx_t* v);
VLX_API int32_t vlxfi_besi0(vlxf_t* v);
/* Real only: Bessel functions J0, J1, and Y0, Y1 (0 where x <= 0). */
VLX_API int32_t vlxi_besj0(vlx_t* v);
VLX_API int32_t vlxfi_besj0(vlxf_t* v);
VLX_API int32_t vlxi_besj1(vlx_t* v);
VLX_API int32_t vlxfi_besj1(vlxf_t* v);
VLX_API int32_t vlxi_besy0(vlx_t* v);
VLX_API int32_t vlxfi_besy0(vlxf_t* v);
VLX_API int32_t vlxi_besy1(vlx_t* v);
VLX_API int32_t vlxfi_besy1(vlxf_t* v);
/* Not implemented: always -1, the vector unchanged. */
VLX_API int32_t vlxi_erf(vlx_t* v);
VLX_API int32_t vlxfi_erf(vlxf_t* v);
VLX_API int32_t vlxi_erfc(vlx_t* v);
VLX_API int32_t vlxfi_erfc(vlxf_t* v);
VLX_API int32_t vlxi_gamma(vlx_t* v);
VLX_API int32_t vlxfi_gamma(vlxf_t* v);
VLX_API int32_t vlxi_lgamma(vlx_t* v);
VLX_API int32_t vlxfi_lgamma(vlxf_t* v);
/* dst = magnitudes of src (real, src's delta and points); src unchanged
 * unless it is dst. */
VLX_API int32_t vlxu_mag(vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfu_mag(vlxf_t* src, vlxf_t* dst);
/* dst = clamped powers of src, as vlxi_magsq. */
VLX_API int32_t vlxu_magsq(vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfu_magsq(vlxf_t* src, vlxf_t* dst);
/* dst = square roots of src, as vlxi_sqrt (dst complex if src is). */
VLX_API int32_t vlxu_sqrt(vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfu_sqrt(vlxf_t* src, vlxf_t* dst);

/* ======================================================================== */
/* Element-wise: layout operations                                          */
/* ======================================================================== */

/* Drops the imaginary parts of a complex vector (a real one is left alone). */
VLX_API int32_t vlxi_real(vlx_t* v);
VLX_API int32_t vlxfi_real(vlxf_t* v);
/* Reverses the sample order (pairs stay whole). */
VLX_API int32_t vlxi_rev(vlx_t* v);
VLX_API int32_t vlxfi_rev(vlxf_t* v);
/* Keeps only the imaginary parts of a complex vector; a real vector's samples
 * all become 0 (the imaginary part of a real signal). */
VLX_API int32_t vlxi_imag(vlx_t* v);
VLX_API int32_t vlxfi_imag(vlxf_t* v);
/* Drops the first k samples, moving the rest to the front; k is clamped to
 * [0, points].  There is no shift to the right. */
VLX_API int32_t vlxi_shift(vlx_t* v, int32_t k);
VLX_API int32_t vlxfi_shift(vlxf_t* v, int32_t k);
/* Rotates left by n - n/2 samples: sample 0 goes to n/2.  Undoes vlxi_swap_halves2. */
VLX_API int32_t vlxi_swap_halves(vlx_t* v);
VLX_API int32_t vlxfi_swap_halves(vlxf_t* v);
/* Rotates left by n/2 samples: sample n/2 comes to index 0 (a centred
 * record's time zero to the transform's origin).  Undoes vlxi_swap_halves. */
VLX_API int32_t vlxi_swap_halves2(vlx_t* v);
VLX_API int32_t vlxfi_swap_halves2(vlxf_t* v);

/* Flags of vlxi_zpad2 and vlxi_unzpad: one scale mode or'ed with one layout. */
#define VLX_PAD_SCALE_RATIO 0x000 /* samples times new_n/old_n */
#define VLX_PAD_SCALE_SQRT  0x001 /* samples times sqrt(new_n/old_n) */
#define VLX_PAD_SCALE_NONE  0x002 /* samples unscaled */
#define VLX_PAD_HEAD        0x000 /* samples at the start, zeros behind */
#define VLX_PAD_CENTRE      0x100 /* samples in the middle */
#define VLX_PAD_TAIL        0x200 /* samples at the end, zeros before */
#define VLX_PAD_SPLIT       0x300 /* first (old_n+1)/2 at the start, the rest at the end */

/* Extends to new_n points with zeros by a VLX_PAD_ layout and scale mode; no
 * scaling from an empty vector.  new_n not above points: 0, nothing changed.
 * Scale mode 3 or an unknown layout: -1, with the vector already grown. */
VLX_API int32_t vlxi_zpad2(vlx_t* v, int32_t new_n, int32_t flags);
VLX_API int32_t vlxfi_zpad2(vlxf_t* v, int32_t new_n, int32_t flags);
/* Inverse of vlxi_zpad2: shortens to new_n points (negative taken as 0) by
 * the same layout and scale flags, scale new_n/old_n.  new_n not below points:
 * 0, nothing changed; invalid flags: -1, nothing changed.  alloc stays. */
VLX_API int32_t vlxi_unzpad(vlx_t* v, int32_t new_n, int32_t flags);
VLX_API int32_t vlxfi_unzpad(vlxf_t* v, int32_t new_n, int32_t flags);
/* Inserts a zero (pair) behind every sample: twice the points, half the delta. */
VLX_API int32_t vlxi_zinter(vlx_t* v);
VLX_API int32_t vlxfi_zinter(vlxf_t* v);
/* dst = src with each sample times scale followed by a zero (pair); dst
 * gets 2 * src points, src's complex flag and half its delta.  dst may be src. */
VLX_API int32_t vlxu_zinter(vlx_t* src, vlx_t* dst, double scale);
VLX_API int32_t vlxfu_zinter(vlxf_t* src, vlxf_t* dst, float scale);

/* ======================================================================== */
/* Element-wise: phase and time operations                                  */
/* ======================================================================== */
/* pi is 3.141592653589793 (float: 3.1415927). */

/* Real only: unwraps a phase in radians, taking out whole turns so that each
 * sample lies within pi of the previous output (the first within pi of 0). */
VLX_API int32_t vlxi_unwrap(vlx_t* v);
VLX_API int32_t vlxfi_unwrap(vlxf_t* v);
/* Real only: as vlxi_unwrap against the mean of the last window outputs
 * (fewer at the start); window 1 is vlxi_unwrap, 0 reduces against 0.  -1 if window < 0. */
VLX_API int32_t vlxi_unwrap_wnd(vlx_t* v, int32_t window);
VLX_API int32_t vlxfi_unwrap_wnd(vlxf_t* v, int32_t window);
/* First difference per unit of x: (x[i] - x[i-1]) / delta with x[-1] = 0;
 * delta 0 multiplies by 1e100 instead (float: 999999986991104).  Complex: part by part. */
VLX_API int32_t vlxi_differ(vlx_t* v);
VLX_API int32_t vlxfi_differ(vlxf_t* v);
/* Running sum times delta: y[i] = y[i-1] + x[i] * delta.  Complex: part by part. */
VLX_API int32_t vlxi_integ(vlx_t* v);
VLX_API int32_t vlxfi_integ(vlxf_t* v);
/* Real only: replaces the samples by the x positions (in units of delta,
 * linearly interpolated) where they cross level; mode 1 rising, 2 falling, 3 both.  delta becomes 1. */
VLX_API int32_t vlxi_edge(vlx_t* v, int32_t mode, double level);
VLX_API int32_t vlxfi_edge(vlxf_t* v, int32_t mode, float level);
/* Clips every scalar to the range between a and b (either order); *clipped
 * (if not NULL) is 1 if any changed, else 0.  The second argument is unused; NaN stays. */
VLX_API int32_t vlxi_limit(vlx_t* v, int32_t unused, double a, double b, int32_t* clipped);
VLX_API int32_t vlxfi_limit(vlxf_t* v, int32_t unused, float a, float b, int32_t* clipped);
/* Derivative of the polynomial whose coefficients (lowest power first) are
 * the samples; one point fewer. */
VLX_API int32_t vlxi_pdiffer(vlx_t* v);
VLX_API int32_t vlxfi_pdiffer(vlxf_t* v);
/* Phase in radians: complex points give atan2(im, re) (0 at the origin) as a
 * real vector; real samples give pi below 0, else 0. */
VLX_API int32_t vlxi_phase(vlx_t* v);
VLX_API int32_t vlxfi_phase(vlxf_t* v);
/* Polar form: each point becomes the complex pair (magnitude, phase in
 * radians), a real vector turning complex. */
VLX_API int32_t vlxi_rtop(vlx_t* v);
VLX_API int32_t vlxfi_rtop(vlxf_t* v);

/* ======================================================================== */
/* Statistics: moments, histogram, sort and median                          */
/* ======================================================================== */
/* Each statistic makes dst a one-point vector (real, or complex where noted)
 * and leaves its delta alone; dst may be src.  A vector of no points gives a
 * defined value, not an error.  Sums run in blocks of 2048 samples whose
 * partial sums are added to the total in order.  BOUND is 1e100 (float:
 * 999999986991104). */

/* Sum of the samples; complex src gives a complex sum. */
VLX_API int32_t vlxs_sum(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_sum(const vlxf_t* src, vlxf_t* dst);
/* Mean: the sum times 1/points; complex src gives a complex mean.  Empty: 0. */
VLX_API int32_t vlxs_mean(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_mean(const vlxf_t* src, vlxf_t* dst);
/* Sum of squared magnitudes (real); a sample beyond +-BOUND adds BOUND. */
VLX_API int32_t vlxs_magsq_sum(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_magsq_sum(const vlxf_t* src, vlxf_t* dst);
/* Root mean square of the magnitudes (real).  Empty: 0. */
VLX_API int32_t vlxs_rms(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_rms(const vlxf_t* src, vlxf_t* dst);
/* Population variance (real; complex: variance of re plus that of im), from
 * one pass about a pivot; not forced non-negative.  Empty: 0. */
VLX_API int32_t vlxs_pop_var(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_pop_var(const vlxf_t* src, vlxf_t* dst);
/* Sample variance: the population variance times n/(n-1) from two points on. */
VLX_API int32_t vlxs_samp_var(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_samp_var(const vlxf_t* src, vlxf_t* dst);
/* Square root of the population variance (NaN if that rounded below 0). */
VLX_API int32_t vlxs_pop_stddev(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_pop_stddev(const vlxf_t* src, vlxf_t* dst);
/* Square root of the sample variance. */
VLX_API int32_t vlxs_samp_stddev(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_samp_stddev(const vlxf_t* src, vlxf_t* dst);
/* Skewness of a real vector; 0 for empty or constant, BOUND when the spread
 * is 0 but the third moment is not.  Complex src: -1, dst untouched. */
VLX_API int32_t vlxs_skew(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_skew(const vlxf_t* src, vlxf_t* dst);
/* Excess kurtosis of a real vector; -3 for empty or constant.  Complex src:
 * -1, dst untouched. */
VLX_API int32_t vlxs_excess(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_excess(const vlxf_t* src, vlxf_t* dst);
/* Geometric mean from the plain product (which may overflow); 0 if the
 * product is below the smallest normal (so for any negative product).
 * Complex: principal root of the complex product. */
VLX_API int32_t vlxs_gmean(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_gmean(const vlxf_t* src, vlxf_t* dst);
/* Harmonic mean: n / sum of 1/x; 0 if a real sample is 0, BOUND if the
 * reciprocals cancel.  Complex: from the complex reciprocals. */
VLX_API int32_t vlxs_hmean(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_hmean(const vlxf_t* src, vlxf_t* dst);
/* Smallest sample; complex: the sample of least power (first of equals).
 * Real samples at or above BOUND give BOUND; complex ones with a component
 * beyond +-BOUND (or NaN) are never chosen, and if none is, (BOUND, BOUND). */
VLX_API int32_t vlxs_min(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_min(const vlxf_t* src, vlxf_t* dst);
/* Largest sample; complex: the sample of largest power (first of equals).
 * Real samples at or below -BOUND give -BOUND; if no complex sample ranks
 * above -BOUND the result is (0, 0).  NaN samples are passed over. */
VLX_API int32_t vlxs_max(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_max(const vlxf_t* src, vlxf_t* dst);
/* Median by the order of vlxi_sort: the middle sample, or the mean of the two
 * middle ones for an even count.  Empty: 0. */
VLX_API int32_t vlxs_median(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_median(const vlxf_t* src, vlxf_t* dst);
/* Histogram into bins real points, delta = width: bin k counts values in
 * [origin + k*width, origin + (k+1)*width); complex samples count by
 * magnitude.  A value a rounding error above the top edge counts in the top
 * bin; others outside are dropped.  width 0 counts values equal to origin. */
VLX_API int32_t vlxs_hist(const vlx_t* src, vlx_t* dst, double origin, double width, int32_t bins);
VLX_API int32_t vlxfs_hist(const vlxf_t* src, vlxf_t* dst, float origin, float width, int32_t bins);
/* Sorts in place, ascending; complex by power, then re, then im.  NaN
 * samples end up last.  Always 0. */
VLX_API int32_t vlxi_sort(vlx_t* v);
VLX_API int32_t vlxfi_sort(vlxf_t* v);

/* ======================================================================== */
/* Statistics: peak search                                                  */
/* ======================================================================== */

/* Flags of vlxs_peak.  Refinement field (mask 0x700): */
#define VLX_PEAK_SAMPLE               0x000 /* the sample itself */
#define VLX_PEAK_PARABOLA             0x100 /* parabola through three samples */
#define VLX_PEAK_LOG_RATIO            0x200 /* log ratio of two neighbours */
#define VLX_PEAK_LOG_RATIO_CORRECTED  0x300 /* the same with a cubic correction */
/* Search control: */
#define VLX_PEAK_AT_INDEX             0x1000 /* no search: use the index argument */
#define VLX_PEAK_MIN                  0x2000 /* minimum instead of maximum */

/* Finds the largest (VLX_PEAK_MIN: smallest; first of equals) sample, or takes
 * the one at index (VLX_PEAK_AT_INDEX, clamped to the vector), and makes dst
 * two real points: value and fractional sample index (not scaled by delta).
 * Complex samples count by power, |z|^2.  dst may be src (its delta becomes
 * 1).  Returns 0; -1 on failure or an invalid refinement, and -1 with the
 * result filled when a log-ratio offset had to be clamped. */
VLX_API int32_t vlxs_peak(const vlx_t* src, vlx_t* dst, int32_t flags, int32_t index);
VLX_API int32_t vlxfs_peak(const vlxf_t* src, vlxf_t* dst, int32_t flags, int32_t index);

/* ======================================================================== */
/* Statistics: polynomials and roots                                        */
/* ======================================================================== */

/* A polynomial is a real vector with data[k] the coefficient of x^k (constant
 * first); complex coefficient vectors are refused with -1. */

/* dst becomes one real point: the polynomial at x by Horner's rule (0 for an
 * empty vector).  dst may be src. */
VLX_API int32_t vlxs_peval(const vlx_t* src, vlx_t* dst, double x);
VLX_API int32_t vlxfs_peval(const vlxf_t* src, vlxf_t* dst, float x);
/* One real root, searched from x (moved inside the bounds on the real roots)
 * by Laguerre's, then Newton's step: dst becomes one real point.  dst may be
 * src.  -1 if no root passes the residual test (dst holds the last iterate). */
VLX_API int32_t vlxs_psolve(const vlx_t* src, vlx_t* dst, double x);
VLX_API int32_t vlxfs_psolve(const vlxf_t* src, vlxf_t* dst, float x);
/* One real or complex root, searched from (re, im) with restarts and polished
 * by Newton's step: dst becomes one point, complex 0 for a root classed real
 * (re, im still stored).  dst may be src.  -1 if no root was found. */
VLX_API int32_t vlxs_pcsolve(const vlx_t* src, vlx_t* dst, double re, double im);
VLX_API int32_t vlxfs_pcsolve(const vlxf_t* src, vlxf_t* dst, float re, float im);
/* All roots of up to 6 coefficients in closed form (degree 5 with one searched
 * real root); leading zeros lower the degree.  A real list ascends; a complex
 * one has the real roots first (imaginary part 0), then conjugate pairs.
 * Fewer than 2 coefficients or a constant: 0 points.  dst may be src.  -1 for
 * more than 6 coefficients or a failure. */
VLX_API int32_t vlxs_proots(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_proots(const vlxf_t* src, vlxf_t* dst);
/* All roots of any degree, in place: the coefficients become a complex list
 * sorted as vlxi_sort sorts, found by search and deflation.  A search failure
 * returns its status with v partly deflated. */
VLX_API int32_t vlxi_proots(vlx_t* v);
VLX_API int32_t vlxfi_proots(vlxf_t* v);
/* A list of roots (real or complex) becomes the coefficients of the monic
 * polynomial with those roots, of the same complex flag; empty: 1. */
VLX_API int32_t vlxi_pztoc(vlx_t* v);
VLX_API int32_t vlxfi_pztoc(vlxf_t* v);

/* ======================================================================== */
/* Statistics: regression and interpolation                                 */
/* ======================================================================== */

/* Straight-line fit of src: a real vector as y against x = index * delta (delta 0 taken as 1;
 * x restarts at 0 every 2048 points), a complex one as im against re.  dst: slope, intercept. */
VLX_API int32_t vlxs_lin_regres(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_lin_regres(const vlxf_t* src, vlxf_t* dst);
/* The same fit as a record of 20 real points (delta 1): y on x (slope, intercept, residual
 * variance, slope and intercept variances, their covariance and correlation), the same 7 for x on y,
 * means of x and y, sample variances of x and y, sample covariance, correlation.  Slopes of a
 * vanishing variance are 1e100 (float: 999999986991104).  dst may be src. */
VLX_API int32_t vlxs_lin_regres2(const vlx_t* src, vlx_t* dst);
VLX_API int32_t vlxfs_lin_regres2(const vlxf_t* src, vlxf_t* dst);

/* Methods of vlx_interp (the low three bits; 2, 4, 6 and 7 give every query one value) and its flag. */
#define VLX_INTERP_STEP       0  /* the tabulated value on the left */
#define VLX_INTERP_LINEAR     1  /* straight line between neighbours */
#define VLX_INTERP_QUADRATIC  3  /* parabola through the three nearest points (linear below 3 points) */
#define VLX_INTERP_SPLINE     5  /* cubic spline from second derivatives */
#define VLX_INTERP_HOLD_ENDS 16  /* no extrapolation: outside the table take the end value */
/* End conditions of vlxb_cspline_2d. */
#define VLX_SPLINE_NOT_A_KNOT         0 /* the node next to the end is no knot */
#define VLX_SPLINE_FIRST_DERIVATIVE   1 /* the end's first derivative is given */
#define VLX_SPLINE_SECOND_DERIVATIVE  2 /* the end's second derivative is given */
#define VLX_SPLINE_NATURAL            3 /* the end's second derivative is 0 */

/* Interpolates the real table y(x) at the queries xi (meant to ascend) into yi, which gets xi's
 * points and delta; yi may be xi but no other operand.  y2: spline second derivatives, or NULL for
 * not-a-knot ones made here.  -1 on complex operands, unequal lengths or equal abscissas met. */
VLX_API int32_t vlx_interp(const vlx_t* x, vlx_t* y, const vlx_t* y2, const vlx_t* xi, vlx_t* yi, int32_t flags);
VLX_API int32_t vlxf_interp(const vlxf_t* x, vlxf_t* y, const vlxf_t* y2, const vlxf_t* xi, vlxf_t* yi, int32_t flags);
/* vlx_interp with VLX_INTERP_SPLINE. */
VLX_API int32_t vlx_cspline(const vlx_t* x, vlx_t* y, const vlx_t* y2, const vlx_t* xi, vlx_t* yi);
VLX_API int32_t vlxf_cspline(const vlxf_t* x, vlxf_t* y, const vlxf_t* y2, const vlxf_t* xi, vlxf_t* yi);
/* Cubic spline second derivatives of y(x) into y2 (x rising strictly, 4 points or more), with
 * VLX_SPLINE_ end conditions end0, endn and their derivatives d0, dn.  y is changed during the
 * call and put back (not on a bad endn), so no other thread may use it meanwhile. */
VLX_API int32_t vlxb_cspline_2d(const vlx_t* x, vlx_t* y, vlx_t* y2, double d0, double dn, int32_t end0, int32_t endn);
VLX_API int32_t vlxfb_cspline_2d(const vlxf_t* x, vlxf_t* y, vlxf_t* y2, float d0, float dn, int32_t end0, int32_t endn);

/* ======================================================================== */
/* Sample files                                                             */
/* ======================================================================== */

/* Here `vlxf_` names the file functions on double vectors (vlx_t) and
 * `vlxff_` those on single-precision vectors (vlxf_t). */

/* Format selector of vlxf_fwrite2: the low 8 bits choose the form, two flags
 * leave out part of the output, other bits are ignored. */
#define VLX_FORMAT_BINARY     0     /* binary form, read back by vlxf_fread */
#define VLX_FORMAT_ASCII      1     /* text form, read back by vlxf_fread */
#define VLX_FORMAT_SUMMARY    2     /* one line: size, spacing, first 32 samples */
#define VLX_FORMAT_GNUPLOT    3     /* gnuplot script with inline data */
#define VLX_FORMAT_TRACE      4     /* tab-separated trace with a display range */
#define VLX_FORMAT_NO_HEADER  0x100 /* flag: leave the header out */
#define VLX_FORMAT_NO_DATA    0x200 /* flag: leave the samples out */

/* fopen(path, mode), except that path "-" is standard input (mode "r...") or
 * output ("w...", else NULL), in binary mode if mode[1] or mode[2] is 'b'. */
VLX_API FILE* vlxf_fopen(const char* path, const char* mode);
VLX_API FILE* vlxff_fopen(const char* path, const char* mode);
/* fclose(stream), except that standard input and output stay open (0). */
VLX_API int32_t vlxf_fclose(FILE* stream);
VLX_API int32_t vlxff_fclose(FILE* stream);
/* Reads the next vector of a stream into the initialised v, text or binary
 * form as the first byte says, scalars of either width.  Returns 1 when a
 * vector was read, 0 when the stream was at its end, -1 on failure. */
VLX_API int32_t vlxf_fread(vlx_t* v, FILE* stream);
VLX_API int32_t vlxff_fread(vlxf_t* v, FILE* stream);
/* Writes v in the binary form.  Returns 0, -1 on a short write. */
VLX_API int32_t vlxf_fwrite(const vlx_t* v, FILE* stream);
VLX_API int32_t vlxff_fwrite(const vlxf_t* v, FILE* stream);
/* Writes v in the text form (16 significant digits; vlxff_: 7).  Returns 0. */
VLX_API int32_t vlxf_fwrite_ascii(const vlx_t* v, FILE* stream);
VLX_API int32_t vlxff_fwrite_ascii(const vlxf_t* v, FILE* stream);
/* Writes v in the form VLX_FORMAT_* with the flags.  Returns 0; -1 for a form
 * above 4 or a short binary write; the trace header passes on a peak failure. */
VLX_API int32_t vlxf_fwrite2(const vlx_t* v, FILE* stream, int32_t format);
VLX_API int32_t vlxff_fwrite2(const vlxf_t* v, FILE* stream, int32_t format);

/* ======================================================================== */
/* Internal helpers, exported for the library's own layers and for tests.   */
/* Applications do not normally need them.                                  */
/* ======================================================================== */

/* --- two-operand destination preparation --- */

/* Sizes dst for a two-operand result: -1 (dst untouched) if the points
 * differ; sets delta to the mean, complex if either source is, points; keeps
 * the old samples when dst shares a source's data.  -1 if growth fails. */
VLX_API int32_t vlxb_prepare_dest(vlx_t* a, vlx_t* b, vlx_t* dst);
VLX_API int32_t vlxfb_prepare_dest(vlxf_t* a, vlxf_t* b, vlxf_t* dst);

/* --- arithmetic kernels --- */

/* Modified Bessel function of the first kind, order 0, of |x|: a stored power
 * series up to 20 (float: 16), an asymptotic series beyond.  Returns I0. */
VLX_API double vlx_besi0_kernel(double x);
VLX_API float vlxf_besi0_kernel(float x);

/* --- filter staging and tolerant point counts --- */

/* Prepares a filter call: *hist_ref (may be NULL) takes in's complex flag and delta and at least
 * hist_points points; with VLX_STAGE_ALIAS a destination sharing in's data is swapped for tmp
 * (aliased, tmp, saved_out then required); out gets in's points (unless VLX_STAGE_KEEP_POINTS),
 * complex if in or other is, in's delta, and storage. */
VLX_API int32_t vlx_stage_io(vlx_t* in, vlx_t** out_ref, vlx_t* other, vlx_t** hist_ref, int32_t hist_points, int32_t flags, int32_t* aliased, vlx_t* tmp, vlx_t** saved_out);
VLX_API int32_t vlxf_stage_io(vlxf_t* in, vlxf_t** out_ref, vlxf_t* other, vlxf_t** hist_ref, int32_t hist_points, int32_t flags, int32_t* aliased, vlxf_t* tmp, vlxf_t** saved_out);
/* Closes a staged call: when aliased, copies out into saved_out and destroys
 * out (the temporary); otherwise 0 at once.  -1 if aliased without saved_out. */
VLX_API int32_t vlx_unstage_io(vlx_t* out, int32_t aliased, vlx_t* saved_out);
VLX_API int32_t vlxf_unstage_io(vlxf_t* out, int32_t aliased, vlxf_t* saved_out);
/* 1 if b/a lies within 1 +- 20 epsilons (float: 7), or both are within 20
 * smallest normals of 0; otherwise 0 (also for a NaN). */
VLX_API int32_t vlx_nearly_equal(double a, double b);
VLX_API int32_t vlxf_nearly_equal(float a, float b);
/* A computed length as a point count, rounded up, a value within relative
 * noise of a whole number taken as that number; 0 to 2147483647. */
VLX_API int32_t vlx_ceil_pts(double x);
VLX_API int32_t vlxf_ceil_pts(float x);
/* As vlx_ceil_pts, rounded down. */
VLX_API int32_t vlx_floor_pts(double x);
VLX_API int32_t vlxf_floor_pts(float x);

/* --- polynomial root searches --- */

/* Step functions: a real step returns dx (next point x - dx); a complex step
 * writes dz[0], dz[1] (next point z - dz) and returns 0. */
typedef double (*vlx_root_step_real_t)(const vlx_t* poly, double x);
typedef float (*vlxf_root_step_real_t)(const vlxf_t* poly, float x);
typedef int32_t (*vlx_root_step_t)(const vlx_t* poly, double re, double im, double* dz);
typedef int32_t (*vlxf_root_step_t)(const vlxf_t* poly, float re, float im, float* dz);

/* Largest |coefficient| over the smallest one not below largest * epsilon;
 * 1 for a zero or empty polynomial.  Returns the spread. */
VLX_API double vlxs_coef_spread(const vlx_t* poly);
VLX_API float vlxfs_coef_spread(const vlxf_t* poly);
/* Real Laguerre step at x (BOUND for a zero denominator, 0 at a root). */
VLX_API double vlxs_laguerre_step_real(const vlx_t* poly, double x);
VLX_API float vlxfs_laguerre_step_real(const vlxf_t* poly, float x);
/* Real Newton step p/p' at x (p * BOUND when p' is 0). */
VLX_API double vlxs_newton_step_real(const vlx_t* poly, double x);
VLX_API float vlxfs_newton_step_real(const vlxf_t* poly, float x);
/* Iterates step from x inside [lo, hi], storing the last point in *result;
 * 0 if it passes the residual test, -1 otherwise. */
VLX_API int32_t vlxs_root_iterate_real(const vlx_t* poly, double* result, vlx_root_step_real_t step, double x, double lo, double hi);
VLX_API int32_t vlxfs_root_iterate_real(const vlxf_t* poly, float* result, vlxf_root_step_real_t step, float x, float lo, float hi);
/* Lagrange's bound above the positive roots (at least 1; 0 if empty). */
VLX_API double vlxs_root_upper_bound(const vlx_t* poly);
VLX_API float vlxfs_root_upper_bound(const vlxf_t* poly);
/* Lagrange's bound below the negative roots (at most -1; 0 if empty). */
VLX_API double vlxs_root_lower_bound(const vlx_t* poly);
VLX_API float vlxfs_root_lower_bound(const vlxf_t* poly);
/* Complex Newton step p/p' at (re, im) into dz; returns 0. */
VLX_API int32_t vlxs_newton_step(const vlx_t* poly, double re, double im, double* dz);
VLX_API int32_t vlxfs_newton_step(const vlxf_t* poly, float re, float im, float* dz);
/* Complex Laguerre step at (re, im) into dz; returns 0. */
VLX_API int32_t vlxs_laguerre_step(const vlx_t* poly, double re, double im, double* dz);
VLX_API int32_t vlxfs_laguerre_step(const vlxf_t* poly, float re, float im, float* dz);
/* Iterates step from (re, im); on success stores the root as dst's first
 * point (dst needs room for one complex point; an empty dst is sized) and
 * sets dst's complex flag to its class.  relaxed widens the final limit.
 * 0 or -1. */
VLX_API int32_t vlxs_root_iterate(const vlx_t* poly, vlx_t* dst, vlx_root_step_t step, double re, double im, int32_t relaxed);
VLX_API int32_t vlxfs_root_iterate(const vlxf_t* poly, vlxf_t* dst, vlxf_root_step_t step, float re, float im, int32_t relaxed);
/* vlxs_root_iterate from (re, im) and three derived starts, the last one
 * relaxed if relaxed is set; 0 at the first success, -1 if all fail. */
VLX_API int32_t vlxs_root_restarts(const vlx_t* poly, vlx_t* dst, vlx_root_step_t step, double re, double im, int32_t relaxed);
VLX_API int32_t vlxfs_root_restarts(const vlxf_t* poly, vlxf_t* dst, vlxf_root_step_t step, float re, float im, int32_t relaxed);

/* --- regression and interpolation --- */

/* Solves the tridiagonal system of m rows (lower[i] x[i-1] + diag[i] x[i] + upper[i] x[i+1] =
 * rhs[i]) into out, eliminating from the bottom row up without pivoting; overwrites lower and rhs.  -1 if m < 1. */
VLX_API int32_t vlxb_tridiagonal_solve(double* lower, double* diag, double* upper, double* rhs, double* out, int32_t m);
VLX_API int32_t vlxfb_tridiagonal_solve(float* lower, float* diag, float* upper, float* rhs, float* out, int32_t m);

/* --- windows --- */

/* Fills the real w (points set, storage sized) with window id: no
 * multiplication, no rotation.  0 or -1. */
VLX_API int32_t vlx_window_synth(vlx_t* w, int32_t id, int32_t flags, double width);
VLX_API int32_t vlxf_window_synth(vlxf_t* w, int32_t id, int32_t flags, float width);
/* Fills w with the cosine sum of the real coefs, centred at points/2;
 * flags VLX_WFLAG_WIDTH with width, VLX_WFLAG_SYMMETRIC gives -1. */
VLX_API int32_t vlx_window_cos_sum(vlx_t* w, vlx_t* coefs, int32_t flags, double width);
VLX_API int32_t vlxf_window_cos_sum(vlxf_t* w, vlxf_t* coefs, int32_t flags, float width);
/* (sin a / a)^p; where sin a / a <= 0: itself for p = 1, 1 for p = 0, its
 * square for p = 2, else 0. */
VLX_API double vlx_sinc_pow(double a, double p);
VLX_API float vlxf_sinc_pow(float a, float p);

/* --- sample files --- */

/* The two forms of vlxf_fread on their own, from the stream's position.
 * Return 1 when a vector was read, -1 on failure. */
VLX_API int32_t vlxf_read_text(vlx_t* v, FILE* stream);
VLX_API int32_t vlxff_read_text(vlxf_t* v, FILE* stream);
VLX_API int32_t vlxf_read_binary(vlx_t* v, FILE* stream);
VLX_API int32_t vlxff_read_binary(vlxf_t* v, FILE* stream);
/* Display range of the trace form: value (0 or less counts as 1) rounded up
 * to 1, 2, 4, 5 or 10 times its decade, at most 1e100 (vlxff_: 1e15). */
VLX_API double vlxf_auto_range(double value);
VLX_API float vlxff_auto_range(float value);

/* --- transforms --- */

/* Caps the vector lanes of the power-of-two transforms at lanes (0 scalar,
 * 1 AVX, 2 AVX-512F; negative only asks); every level gives the same bits.
 * Returns the level in effect, limited by the processor. */
VLX_API int32_t vlx_transform_lanes(int32_t lanes);

/* --- filters --- */

/* Caps the vector lanes of the filter kernels (FIR, symmetric, decimating,
 * resampler) at lanes (0 scalar, 1 AVX2; negative only asks); every level
 * gives the same bits.  Returns the level in effect, limited by the processor. */
VLX_API int32_t vlx_filter_lanes(int32_t lanes);

#ifdef __cplusplus
}
#endif

#endif /* LIBVLX_H */
