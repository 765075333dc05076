// Preloaded into the program under test: once it makes its output file, the n-th allocation fails.
//
// VESK_NO_MEMORY says which, counted from 1; 0 lets all succeed, and tells their number on standard error at the end.
// What comes before is the command line, whose library allocates in functions that must not throw.
#include <dlfcn.h>

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstdlib>

extern "C" void *__libc_malloc(std::size_t size);

namespace {

std::atomic<bool> begun = false;
std::atomic<long> count = 0;
long failing = -1;

__attribute__((destructor)) void tell() {
  begun = false;
  if (failing == 0) std::fprintf(stderr, "allocations: %ld\n", count.load());
}

}  // namespace

extern "C" {

void *malloc(std::size_t size) noexcept {
  if (begun && ++count == failing) {
    errno = ENOMEM;
    return nullptr;
  }
  return __libc_malloc(size);
}

int mkostemp(char *name, int flags) {
  const int fd = reinterpret_cast<int (*)(char *, int)>(dlsym(RTLD_NEXT, "mkostemp"))(name, flags);
  if (const char *text = std::getenv("VESK_NO_MEMORY")) failing = std::atol(text);
  begun = true;
  return fd;
}

int mkostemp64(char *name, int flags) {
  return mkostemp(name, flags);
}

}  // extern "C"
