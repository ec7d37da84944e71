// What this platform decides for the optional vendor transform binding: the
// module names, how a module is loaded and a function found in it, and the
// environment.  The binding itself reads the same on every platform.
#pragma once

#include <dlfcn.h>

#include <cstdlib>
#include <cstring>

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
