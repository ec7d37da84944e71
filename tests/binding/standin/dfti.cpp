// Stand-in for the vendor DFT module, built as libmkl_rt.so.2: plain DFTs in the descriptor's precision, a trace of
// the calls for the tests, and refusals on demand through STANDIN_FAIL ("create", "compute" or "free").
#include <cmath>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#define EXPORT extern "C" __attribute__((visibility("default")))

struct Handle { int precision, domain; long n; double scale; };
static std::string trace;

// Notes the call; true if the test asked for this operation to be refused.
static bool refuse(const char* op, const std::string& note) {
    trace += note + " ";
    const char* f = std::getenv("STANDIN_FAIL");
    return f != nullptr && std::strcmp(f, op) == 0;
}

// In place: n complex points, or n real samples to n/2 + 1 complex points; long-double sums, times scale, rounded
// once.
template <class T>
static void plain_dft(T* x, long n, bool real_in, bool inverse, long double scale) {
    std::vector<long double> re(n), im(n, 0.0L);
    for (long j = 0; j < n; ++j) re[j] = real_in ? x[j] : x[2 * j], im[j] = real_in ? 0 : x[2 * j + 1];
    for (long k = 0; k < (real_in ? n / 2 + 1 : n); ++k) {
        long double sr = 0, si = 0;
        for (long j = 0; j < n; ++j) {
            const long double a = 6.283185307179586476925L * static_cast<long double>((j * k) % n) / n;
            const long double c = std::cos(a), s = inverse ? std::sin(a) : -std::sin(a);
            sr += re[j] * c - im[j] * s, si += re[j] * s + im[j] * c;
        }
        x[2 * k] = static_cast<T>(sr * scale), x[2 * k + 1] = static_cast<T>(si * scale);
    }
}

// For the tests: the module's own transform, and the calls so far.
EXPORT void standin_dft(int precision, void* x, long n, int real_in, int inverse, double scale) {
    if (precision == 36) plain_dft(static_cast<double*>(x), n, real_in, inverse, scale);
    else plain_dft(static_cast<float*>(x), n, real_in, inverse, scale);
}
EXPORT const char* standin_trace() { return trace.c_str(); }

EXPORT long DftiCreateDescriptor(void** out, int precision, int domain, long dimension, ...) {
    va_list ap;
    va_start(ap, dimension);
    const long n = va_arg(ap, long);
    va_end(ap);
    using std::to_string;
    if (refuse("create", "c" + to_string(precision) + "." + to_string(domain) + "." + to_string(dimension) + "/" +
                             to_string(n)))
        return 1;
    return *out = new Handle{precision, domain, n, 1.0}, 0;
}
EXPORT long DftiSetValue(void* h, int param, ...) {
    va_list ap;
    va_start(ap, param);
    const double v = param == 4 ? va_arg(ap, double) : va_arg(ap, int);
    va_end(ap);
    if (param == 4) static_cast<Handle*>(h)->scale = v;
    char text[40];
    std::snprintf(text, sizeof text, "s%d=%.17g", param, v);
    return refuse("", text), 0;
}
EXPORT long DftiCommitDescriptor(void*) { return refuse("", "m"), 0; }
static long compute(void* p, void* x, int inverse) {
    const Handle* h = static_cast<Handle*>(p);
    if (refuse("compute", inverse ? "b" : "f")) return 3;
    standin_dft(h->precision, x, h->n, h->domain == 33, inverse, inverse ? 1.0 : h->scale);
    return 0;
}
EXPORT long DftiComputeForward(void* h, void* x, ...) { return compute(h, x, 0); }
EXPORT long DftiComputeBackward(void* h, void* x, ...) { return compute(h, x, 1); }
EXPORT long DftiFreeDescriptor(void** h) {
    delete static_cast<Handle*>(*h);
    *h = nullptr;
    return refuse("free", "x") ? 2 : 0;
}
