#!/usr/bin/env python3
"""Deliberate faults, one at a time, against the test suites.

Each fault is a one-line textual patch of one library source.  The script
copies the tree to a scratch folder (build/ and .git left out), builds it once,
then for each fault: patches the copy, rebuilds the suite that should catch it,
runs that suite through ctest, records caught / NOT CAUGHT, and puts the file
back.  A fault is caught when the build fails or any test of the suite fails.

    python3 tests/faults/inject.py [--tree DIR] [--work DIR] [--only ID,ID] [--list]

Not part of CI: a full run takes a quarter of an hour or so on two cores.
"""
import argparse, os, shutil, subprocess, sys, time

# id, file, text to find (exactly once), replacement, suite, what it breaks
FAULTS = [
    # core vector object
    ("core-rtoc-order", "src/core/vector.cpp", "for (int64_t i = v->points - 1; i >= 0; --i) {",
     "for (int64_t i = 0; i < v->points; ++i) {", "core", "real-to-complex spread runs forwards, overwriting in place"),
    ("core-subvec-alias", "src/core/vector.cpp", "else if (s != 0)", "else if (s < 0)",
     "core", "sub-vector of a vector into itself skips the move"),
    ("core-zpad-off1", "src/core/vector.cpp", "for (int64_t i = width * old; i < width * new_n; ++i)",
     "for (int64_t i = width * old + 1; i < width * new_n; ++i)", "core", "zero padding misses the first new scalar"),
    ("core-clamp-count", "src/core/vector.cpp", "if (s + c > points) c = points - s;",
     "if (s + c > points) c = points - s - 1;", "core", "clamped range one point short"),
    ("core-cmp-delta-order", "src/core/vector.cpp", "int32_t r = order(a->delta - b->delta);",
     "int32_t r = order(b->delta - a->delta);", "core", "comparison orders the spacings the other way round"),
    ("core-insert-spread-edge", "src/core/vector.cpp", "if (a != 0 || r.count < dst->points) {",
     "if (a != 0 || r.count <= dst->points) {", "core",
     "complex insert over the whole of a real vector spreads the old samples first"),
    # frame
    ("frame-counter-bound", "src/core/frame.hpp", "if (n > 10000) counter.fetch_sub(1);",
     "if (n > 1000) counter.fetch_sub(1);", "frame", "bounded counter held at the wrong level"),
    ("frame-teardown-last", "src/core/frame.cpp", "for (int s = 0; s < static_cast<int>(TeardownStep::count); ++s) {",
     "for (int s = 0; s < static_cast<int>(TeardownStep::count) - 1; ++s) {", "frame", "teardown skips the last step"),
    # transforms
    ("fft-restart-run", "src/transforms/fft.cpp", "if (run == 256) {", "if (run == 255) {",
     "transforms", "twiddle recurrence restarts one entry early"),
    ("fft-sqrt2-constant", "src/transforms/fft.cpp", "T(-1.4142135623730951)", "T(-1.4142135623730949)",
     "transforms", "pi/4 triple constant one ulp off"),
    ("fft-rotate-order", "src/transforms/fft_kernels.inc", "const auto m = S::mul(S::add(z, zs), c);",
     "const auto m = S::add(S::mul(z, c), S::mul(zs, c));", "transforms", "three-multiply rotation distributed"),
    ("real-merge-assoc", "src/transforms/real.cpp", "e[j] = er + (u + v);", "e[j] = (er + u) + v;",
     "transforms", "real split step re-associated"),
    ("dct-restart-run", "src/transforms/dct.cpp", "if (run == 256) {", "if (run == 128) {",
     "transforms", "DCT table recurrence restarts too often"),
    # windows
    ("win-triangle-reseed", "src/windows/synth.cpp", "v = (i % 1024 == 0)", "v = (i % 1000 == 0)",
     "windows", "triangle re-seeding period changed"),
    ("win-triangle-mean", "src/windows/synth.cpp", "T(2) * nn * nn / (nn * nn + T(1))",
     "T(2) * nn * nn / (nn * nn + T(2))", "windows", "odd triangle mean-normalised peak constant"),
    ("win-cossum-wide", "src/windows/synth.cpp", "s += c[k] * own_cos(arg);", "s += c[k] * wide_cos(arg);",
     "windows", "cosine-sum window in double for the float twin"),
    ("win-scale-alias-edge", "src/windows/metrics.cpp", "else if (mode == wnorm_rms && points < 2 * count - 1)",
     "else if (mode == wnorm_rms && points < 2 * count - 2)", "windows",
     "rms scale factor misses the aliasing correction at its longest length"),
    # design: generators, random, FIR design, resampler design
    ("gen-float-restart", "src/design/generators.cpp", "x = static_cast<float>(cos64(turn));",
     "x = cos32(static_cast<float>(turn));", "design", "float cosine wave restarts in single precision"),
    ("rand-laplace-sign", "src/design/random.cpp", "d[k] = (r & 0x4000u) ? e : -e;", "d[k] = (r & 0x4000u) ? -e : e;",
     "design", "Laplace sign bit read the other way round"),
    ("rand-draw31-bits", "src/design/random.cpp", "return (high << 16) | (middle << 15) | low;",
     "return (high << 16) | (middle << 14) | low;", "design", "31-bit draw assembled with the middle bit misplaced"),
    ("firdes-pi2-constant", "src/design/fir_design.cpp", "T(9.869604401089358)", "T(9.8696044)",
     "design", "pi squared in the type 9 kernel shortened"),
    ("rsmpdes-horner", "src/design/rsmp_design.cpp", "value = value * c + a[k];", "value = c * value + a[k] * T(1.0000001);",
     "design", "cosine polynomial coefficient scaled"),
    # filters
    ("hist-short-block", "src/filters/filters.hpp",
     "std::memmove(hist + (keep - n) * w, x, static_cast<size_t>(n * w) * sizeof(T));",
     "std::memmove(hist + (keep - n - 1) * w, x, static_cast<size_t>(n * w) * sizeof(T));", "filters",
     "history update one slot early for a block shorter than the history"),
    ("fir-fast-history", "src/filters/fir.cpp", "for (int64_t j = 0; j <= m - 2 - k; ++j)",
     "for (int64_t j = 0; j < m - 2 - k; ++j)", "filters", "fast FIR adds one past sample too few"),
    ("fir-complex-order", "src/filters/fir.cpp", "re += hr * vr - hi * vi;", "re = re + hr * vr - hi * vi;",
     "filters", "complex tap product added in two steps"),
    ("fir-fast-threshold", "src/filters/fir.cpp", "constexpr int32_t fast_taps_complex = 36;",
     "constexpr int32_t fast_taps_complex = 35;", "filters", "fast convolution threshold for complex sources moved"),
    ("deci-delta", "src/filters/staging.cpp", "out->delta = static_cast<T>(factor) * in_delta;",
     "out->delta = in_delta;", "filters", "decimation keeps the input spacing"),
    # element-wise
    ("div-complex-recip", "src/elementwise/binary.cpp", "return Cx<T>{(bi * ai + br * ar) * r,",
     "return Cx<T>{(bi * ai + br * ar) / m,", "elementwise", "complex division real part divides directly"),
    ("div-underflow", "src/elementwise/binary.cpp", "counts as zero even when b is not exactly 0.\n            if (T(0) >= m) {",
     "counts as zero even when b is not exactly 0.\n            if (T(0) > m) {",
     "elementwise", "underflowing divisor not treated as zero"),
    ("rtop-spread-order", "src/elementwise/phase.cpp", "for (int64_t i = n - 1; i >= 0; --i) {\n            const T s = x[i];",
     "for (int64_t i = 0; i < n; ++i) {\n            const T s = x[i];", "elementwise",
     "real-to-polar spread runs forwards, overwriting in place"),
    ("pdiffer-index", "src/elementwise/phase.cpp", "x[2 * (i - 1)] = k * x[2 * i];", "x[2 * (i - 1)] = k * x[2 * i - 2];",
     "elementwise", "polynomial derivative reads the previous coefficient"),
    ("addcos-float-restart", "src/elementwise/arith.cpp", "c = static_cast<float>(cos64(turn));",
     "c = cos32(static_cast<float>(turn));", "elementwise", "float added cosine restarts in single precision"),
    ("layout-center-lead", "src/elementwise/layout.cpp", "int64_t lead = (old - new_n) / 2;",
     "int64_t lead = (old - new_n + 1) / 2;", "elementwise", "centred truncation rounds the lead the other way"),
    # stats, peak, poly, regression, interpolation
    ("stats-block-size", "src/stats/stats.hpp", "inline constexpr int64_t block = 2048;",
     "inline constexpr int64_t block = 1024;", "stats", "sums in blocks of the wrong size"),
    ("peak-first-max", "src/stats/peak.cpp", "if (x[i] > best) best = x[i], best_i = i;",
     "if (x[i] >= best) best = x[i], best_i = i;", "stats", "the last of equal maxima is taken"),
    ("peak-pair-index", "src/stats/peak.cpp", "out[1] = static_cast<T>(k) + d;", "out[1] = static_cast<T>(i) + d;",
     "stats", "log-ratio position from the peak instead of the pair's left sample"),
    ("regress-f-two-points", "src/stats/regression.cpp", "const T f = n >= 3 ? nn / static_cast<T>(n - 2) : T(0);",
     "const T f = n >= 2 ? nn / static_cast<T>(n - 2) : T(0);", "stats", "residual factor off by one point"),
    ("poly-second-deriv", "src/stats/poly.cpp", "pp = {q.re + static_cast<T>(k * (k - 1)) * a[k], q.im};",
     "pp = {q.re + static_cast<T>(k * (k + 1)) * a[k], q.im};", "stats", "second derivative weight off by one"),
    ("interp-knot-edge", "src/stats/interp.cpp", "while (k < n - 1 && t >= xs[k]) ++k;",
     "while (k < n - 1 && t > xs[k]) ++k;", "stats", "a step query on a knot takes the segment below"),
    ("rsmp-skip-out", "src/streaming/rsmp_stream.cpp", "const int32_t extra = k >= 0 ? 19 :",
     "const int32_t extra = k >= 0 ? 18 :", "streaming", "start-up discard of a decimating stream one point short"),
    ("avg-zero-weight", "src/streaming/avg.cpp", "if (weight >= T(0)) return weight;",
     "if (weight > T(0)) return weight;", "streaming", "a fixed weight of 0 read as the running mean's"),
    ("unwrap-first", "src/elementwise/phase.cpp", "T p = T(0);  // the first sample is measured from 0 as well",
     "T p = n > 0 ? x[0] : T(0);", "elementwise", "unwrapping takes the first sample as its own reference"),
    ("spline-start-diag", "src/stats/interp.cpp", "w.diag[0] = T(2);", "w.diag[0] = T(3);", "stats",
     "spline with a given start slope: first diagonal weight changed"),
    ("deci-skip-round", "src/filters/staging.cpp", "const T rounded = stored + T(0.5);", "const T rounded = stored;",
     "filters", "stored decimation skip count truncated instead of rounded"),
    ("win-kaiser-negative", "src/windows/parametric.cpp", "if (beta > limit || beta < -limit) beta = limit;",
     "if (beta > limit) beta = limit;", "windows", "a large negative Kaiser beta left unclamped"),
    ("corr-work-alias", "src/streaming/corr.cpp", "if (work != nullptr && work != ref && work != out) return correlate",
     "if (work != nullptr && work != ref) return correlate", "streaming",
     "correlation work given as the output used in place instead of a temporary"),
    ("poly-skip-overrun", "src/stats/poly.cpp", "const int64_t skip = (end - i) / period * period;",
     "const int64_t skip = (end - i + period - 1) / period * period;", "stats",
     "root search skips one cycle past the end of its kind of round"),
    ("hilbert-nyquist", "src/transforms/analytic.cpp", "const int64_t h = (n + 1) / 2;", "const int64_t h = n / 2 + 1;",
     "transforms", "Hilbert transform turns the Nyquist bin as a positive frequency"),
    ("avg-mixed-weight", "src/elementwise/binary.cpp", "bi * (T(1) - alpha)", "(bi - bi * alpha)", "elementwise",
     "weighted average of a real and a complex source: imaginary weight distributed"),
    # sample files
    ("file-float-digits", "src/fileio/writers.cpp", 'static constexpr const char* line = "%.7g\\n";',
     'static constexpr const char* line = "%.6g\\n";', "fileio", "float text lines written with a digit too few"),
    ("file-swap32", "src/fileio/reader.cpp", "(x >> 24) | ((x >> 8) & 0xFF00u) | ((x << 8) & 0xFF0000u) | (x << 24)",
     "(x >> 24) | ((x << 8) & 0xFF00u) | ((x >> 8) & 0xFF0000u) | (x << 24)", "fileio",
     "byte swap of 32-bit words exchanges the middle bytes wrongly"),
    ("file-odd-complex", "src/fileio/reader.cpp", "v->data[count] = T(0);", "v->data[count] = T(1);", "fileio",
     "odd complex text file: the missing imaginary part not zero"),
    ("file-summary-cut", "src/fileio/writers.cpp", 'if (v->points > summary_samples) std::fputs(" ...", f);',
     'if (v->points >= summary_samples) std::fputs(" ...", f);', "fileio",
     "summary marks a vector of exactly 32 points as cut"),
    # binding of the vendor transform modules
    # reliability (argument checks that only the sweeps exercise)
    ("rel-ratio-max", "src/streaming/rsmp_stream.cpp", "if (ratio > std::numeric_limits<T>::max()) return -1;",
     "if (ratio >= std::numeric_limits<T>::max()) return -1;", "reliability",
     "streaming resampler refuses the largest finite ratio along with an infinite one"),
    ("bind-scale-param", "src/core/binding.cpp", "constexpr int dfti_forward_scale = 4;",
     "constexpr int dfti_forward_scale = 5;", "binding", "forward scale set through the wrong parameter"),
    ("bind-precision", "src/core/binding.cpp", "constexpr int dfti_double = 36;", "constexpr int dfti_double = 35;",
     "binding", "double descriptors created in single precision"),
    ("bind-user-threads", "src/core/binding.cpp", "constexpr int dfti_number_of_user_threads = 26;",
     "constexpr int dfti_number_of_user_threads = 27;", "binding", "user-thread count set through the wrong parameter"),
]


def run(cmd, cwd, log, timeout=None):
    with open(log, "a") as f:
        f.write("$ " + " ".join(cmd) + "\n")
        f.flush()
        try:
            return subprocess.run(cmd, cwd=cwd, stdout=f, stderr=subprocess.STDOUT, timeout=timeout).returncode
        except subprocess.TimeoutExpired:
            f.write("timed out\n")
            return 124


def sync(src, dst):
    """Makes dst a copy of src (build/ and .git left out); only changed files are written, so only they rebuild."""
    keep = set()
    for root, dirs, files in os.walk(src):
        rel = os.path.relpath(root, src)
        dirs[:] = [d for d in dirs if not (rel == "." and d in ("build", ".git"))]
        os.makedirs(os.path.join(dst, rel), exist_ok=True)
        for name in files:
            s, d = os.path.join(root, name), os.path.normpath(os.path.join(dst, rel, name))
            keep.add(d)
            if not os.path.exists(d) or open(s, "rb").read() != open(d, "rb").read():
                shutil.copyfile(s, d)
    for root, dirs, files in os.walk(dst):
        if os.path.relpath(root, dst) == ".":
            dirs[:] = [x for x in dirs if x != "build"]
        for name in files:
            if os.path.join(root, name) not in keep:
                os.remove(os.path.join(root, name))


def main():
    here = os.path.dirname(os.path.abspath(__file__))
    ap = argparse.ArgumentParser()
    ap.add_argument("--tree", default=os.path.dirname(os.path.dirname(here)), help="source tree to test")
    ap.add_argument("--work", default="/tmp/vlx_faults/work", help="scratch copy and build")
    ap.add_argument("--only", default="", help="comma-separated fault ids")
    ap.add_argument("--list", action="store_true")
    ap.add_argument("--jobs", default="2")
    a = ap.parse_args()
    faults = [f for f in FAULTS if not a.only or f[0] in a.only.split(",")]
    if a.list:
        for f in faults:
            print(f"{f[0]:22} {f[4]:12} {f[1]}: {f[5]}")
        return 0
    os.makedirs(a.work, exist_ok=True)
    log = os.path.join(a.work, "inject.log")
    tree = os.path.join(a.work, "tree")
    if os.path.realpath(a.tree) != os.path.realpath(tree):  # --tree may be the scratch tree itself
        sync(a.tree, tree)
    bdir = os.path.join(tree, "build", "release")
    if not os.path.exists(os.path.join(bdir, "build.ninja")):
        if run(["cmake", "--preset", "release", "-DVLX_BUILD_BENCH=OFF", "-DVLX_BUILD_EXAMPLES=OFF"], tree, log):
            sys.exit("configure failed, see " + log)
    suites = sorted({f[4] for f in faults})
    targets = ["test_" + s for s in suites] + (["vlx_standin_dfti"] if "binding" in suites else [])
    if run(["cmake", "--build", bdir, "-j", a.jobs, "--target"] + targets, tree, log):
        sys.exit("the unpatched tree does not build, see " + log)
    for s in suites:  # the unpatched suites must pass, or nothing below means anything
        if run(["ctest", "--test-dir", bdir, "-R", f"^{s}($|_)", "-j", a.jobs], tree, log):
            sys.exit(f"suite {s} fails without a fault, see " + log)
    caught = 0
    for fid, path, old, new, suite, what in faults:
        src = os.path.join(tree, path)
        text = open(src).read()
        if text.count(old) != 1:
            print(f"{fid:22} PATCH DOES NOT APPLY ({text.count(old)} matches)")
            continue
        t0 = time.time()
        try:
            with open(src, "w") as f:
                f.write(text.replace(old, new))
            with open(log, "a") as f:
                f.write(f"\n==== {fid}\n")
            if run(["cmake", "--build", bdir, "-j", a.jobs, "--target", "test_" + suite], tree, log):
                verdict = "caught (build)"
            elif run(["ctest", "--test-dir", bdir, "-R", f"^{suite}($|_)", "-j", a.jobs], tree, log, 1800):
                verdict = "caught"
            else:
                verdict = "NOT CAUGHT"
        finally:
            with open(src, "w") as f:  # a fresh time stamp: the next build recompiles it
                f.write(text)
        caught += verdict.startswith("caught")
        print(f"{fid:22} {suite:12} {verdict:15} {time.time() - t0:5.0f}s  {what}", flush=True)
    print(f"{caught} of {len(faults)} caught")
    return 0 if caught == len(faults) else 1


if __name__ == "__main__":
    sys.exit(main())
