// For libraries that are preloaded: what lies behind a function that they lay their own over.
#pragma once

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/types.h>

#include <cstdarg>

namespace test {

// Static, because a library must look behind itself, and not behind another one that is preloaded too and would lend it
// its copy.

/// The function of that name that the program would have got.
template <class Function>
static Function *next(const char *name) {
  return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name));
}

/// open() has a mode only where it may make a file.
static inline mode_t modeOf(int flags, va_list arguments) {
  return (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
}

}  // namespace test
