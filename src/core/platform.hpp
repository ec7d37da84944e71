// What the platform decides for number text and standard streams, kept in one
// place so that the file layer reads the same everywhere: a C locale object
// for conversions that must not follow the caller's locale, and the switch of
// a standard stream to binary mode.
#pragma once

#include <cstdio>
#include <cstdlib>

#if defined(_WIN32)
#include <fcntl.h>
#include <io.h>
#include <locale.h>
#else
#include <locale.h>
#endif

namespace vlx::platform {

#if defined(_WIN32)
using c_locale_t = _locale_t;
inline c_locale_t c_locale() {
    static const c_locale_t loc = _create_locale(LC_ALL, "C");
    return loc;
}
inline double strtod_c(const char* s, char** end) { return _strtod_l(s, end, c_locale()); }
inline float strtof_c(const char* s, char** end) { return _strtof_l(s, end, c_locale()); }
#else
using c_locale_t = locale_t;
// Created once, never freed: a locale object costs a few hundred bytes and
// may be in use on any thread until the process ends.
inline c_locale_t c_locale() {
    static const c_locale_t loc = newlocale(LC_ALL_MASK, "C", static_cast<locale_t>(nullptr));
    return loc;
}
inline double strtod_c(const char* s, char** end) { return strtod_l(s, end, c_locale()); }
inline float strtof_c(const char* s, char** end) { return strtof_l(s, end, c_locale()); }
#endif

// While in scope, this thread's formatted output uses the C locale; the
// caller's thread locale (or the global one it follows) comes back on exit.
// The process-wide locale is never touched.
class CLocaleScope {
public:
#if defined(_WIN32)
    CLocaleScope() : previous_(_configthreadlocale(_ENABLE_PER_THREAD_LOCALE)) {
        saved_ = _strdup(setlocale(LC_NUMERIC, nullptr));
        setlocale(LC_NUMERIC, "C");
    }
    ~CLocaleScope() {
        if (saved_ != nullptr) setlocale(LC_NUMERIC, saved_);
        std::free(saved_);
        _configthreadlocale(previous_);
    }
#else
    CLocaleScope() : previous_(c_locale() != nullptr ? uselocale(c_locale()) : nullptr) {}
    ~CLocaleScope() {
        if (previous_ != nullptr) uselocale(previous_);
    }
#endif
    CLocaleScope(const CLocaleScope&) = delete;
    CLocaleScope& operator=(const CLocaleScope&) = delete;

private:
#if defined(_WIN32)
    int previous_;
    char* saved_;
#else
    locale_t previous_;
#endif
};

// Standard streams carry binary data unchanged.  Platforms without text
// translation have nothing to switch.
inline void set_binary_mode(std::FILE* stream) {
#if defined(_WIN32)
    _setmode(_fileno(stream), _O_BINARY);
#else
    (void)stream;
#endif
}

}  // namespace vlx::platform
