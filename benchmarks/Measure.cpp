// measure FILE COMMAND...: runs the command and writes to FILE the seconds of processor and of wall time and the
// kibibytes of memory that it took. The kernel counts the memory of whoever starts a program as the program's own, so
// that must be somebody small.
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>

#include <chrono>
#include <cstdio>

extern char **environ;

namespace {

double seconds(const timeval &time) {
  return static_cast<double>(time.tv_sec) + 1e-6 * static_cast<double>(time.tv_usec);
}

}  // namespace

int main(int argc, char **argv) {
  using Clock = std::chrono::steady_clock;
  if (argc < 3) {
    std::fputs("usage: measure FILE COMMAND...\n", stderr);
    return 2;
  }
  const auto start = Clock::now();
  pid_t child = 0;
  int status = 0;
  rusage usage{};
  if (::posix_spawnp(&child, argv[2], nullptr, nullptr, argv + 2, environ) != 0 ||
      ::wait4(child, &status, 0, &usage) != child)
    return 3;
  const std::chrono::duration<double> wall = Clock::now() - start;
  std::FILE *file = std::fopen(argv[1], "w");
  if (file == nullptr) return 5;
  std::fprintf(file, "%.6f %.6f %ld\n", seconds(usage.ru_utime) + seconds(usage.ru_stime), wall.count(),
               usage.ru_maxrss);
  if (std::fclose(file) != 0) return 5;
  return WIFEXITED(status) ? WEXITSTATUS(status) : 1;
}
