// What the platform decides, kept in one place so that the rest of the
// library reads the same everywhere: a C locale object for number text that
// must not follow the caller's locale, the switch of a standard stream to
// binary mode, and the loading of the optional vendor modules.
#pragma once

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <dlfcn.h>

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

// The optional vendor transform binding: module names, loading, lookup and
// the environment.
namespace vlx::modules {

// Plain names, so that the loader's search path (LD_LIBRARY_PATH, the cache,
// the default folders) decides where they come from.
inline constexpr const char* dfti_module = "libmkl_rt.so.2";
inline constexpr const char* openmp_module = "libiomp5.so";

// A handle, or null if the module is absent or cannot be loaded.  The library
// never unloads what it loaded.
inline void* load(const char* name) { return dlopen(name, RTLD_NOW | RTLD_LOCAL); }

// A function of a loaded module, or null if the module lacks it.
template <class Fn>
inline Fn function(void* module, const char* name) {
    void* address = dlsym(module, name);
    Fn fn;
    static_assert(sizeof(fn) == sizeof(address));
    std::memcpy(&fn, &address, sizeof(fn));
    return fn;
}

// A variable counts as set only with a value of at least one character: an
// empty one is treated as absent, a value of any length as present.
inline bool env_is_set(const char* name) {
    const char* value = std::getenv(name);
    return value != nullptr && value[0] != '\0';
}

inline void env_set(const char* name, const char* value) { setenv(name, value, 1); }

}  // namespace vlx::modules
