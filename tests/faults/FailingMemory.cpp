// Preloaded into the program under test: from its first call of signal() on, which is the first thing that it does, the
// n-th allocation fails.
//
// VESK_NO_MEMORY says which, counted from 1; 0 lets all succeed, and tells their number on standard error at the end.
#include <dlfcn.h>

#include <atomic>
#include <cerrno>
#include <csignal>
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

sighandler_t signal(int number, sighandler_t handler) noexcept {
  const auto before =
      reinterpret_cast<sighandler_t (*)(int, sighandler_t)>(dlsym(RTLD_NEXT, "signal"))(number, handler);
  if (const char *text = std::getenv("VESK_NO_MEMORY")) failing = std::atol(text);
  begun = true;
  return before;
}

}  // extern "C"
