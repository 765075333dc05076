// Preloaded into the program under test: the n-th call of one system call fails, or does only part of its work.
//
// VESK_FAULT says which: "write 3 ENOSPC" (by number: "write 3 28"), "read 2 short", "write all short", or "count
// FILE", which lets all succeed and writes "read 17" and so on into FILE at the end. Only the program's own calls are
// seen, not those that the C library makes for itself.
#include <dirent.h>
#include <fcntl.h>
#include <poll.h>
#include <pthread.h>
#include <sys/eventfd.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/types.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "tests/faults/Overlay.h"

namespace {

using test::modeOf;
using test::next;

enum Call {
  kOpen,
  kRead,
  kWrite,
  kClose,
  kRename,
  kFsync,
  kMkostemp,
  kIoctl,
  kPoll,
  kEventfd,
  kTmpfile,
  kOpendir,
  kThread,
  kCalls
};
constexpr const char *kNames[kCalls] = {"open",  "read", "write",   "close",   "rename",  "fsync", "mkostemp",
                                        "ioctl", "poll", "eventfd", "tmpfile", "opendir", "thread"};

struct Fault {
  int call = -1;
  long number = 0;  // counted from 1; 0 for all
  int error = 0;    // 0: does part of its work
  char countFile[256] = {};

  Fault() {
    const char *text = std::getenv("VESK_FAULT");
    if (text == nullptr) return;
    if (std::sscanf(text, "count %255s", countFile) == 1) return;
    char name[16], which[16], what[16];
    if (std::sscanf(text, "%15s %15s %15s", name, which, what) != 3) std::abort();
    for (int c = 0; c < kCalls; ++c)
      if (std::strcmp(name, kNames[c]) == 0) call = c;
    if (call < 0) std::abort();
    number = std::strcmp(which, "all") == 0 ? 0 : std::atol(which);
    error = std::strcmp(what, "short") == 0 ? 0 : std::atoi(what);
  }
};

std::atomic<long> counts[kCalls];

const Fault &fault() {
  static const Fault fault;
  return fault;
}

enum class Fate { kNormal, kFails, kShort };

Fate fate(Call call) {
  const long number = ++counts[call];
  if (fault().call != call || (fault().number != 0 && fault().number != number)) return Fate::kNormal;
  if (fault().error == 0) return Fate::kShort;
  errno = fault().error;
  return Fate::kFails;
}

__attribute__((destructor)) void writeCounts() {
  if (fault().countFile[0] == '\0') return;
  if (std::FILE *file = std::fopen(fault().countFile, "w")) {
    for (int c = 0; c < kCalls; ++c) std::fprintf(file, "%s %ld\n", kNames[c], counts[c].load());
    std::fclose(file);
  }
}

int openAs(const char *name, const char *path, int flags, mode_t mode) {
  if (fate(kOpen) == Fate::kFails) return -1;
  return next<int(const char *, int, ...)>(name)(path, flags, mode);
}

}  // namespace

extern "C" {

int pthread_create(pthread_t *thread, const pthread_attr_t *attributes, void *(*start)(void *),
                   void *argument) noexcept {
  if (fate(kThread) == Fate::kFails) return fault().error;
  return next<int(pthread_t *, const pthread_attr_t *, void *(*)(void *), void *)>("pthread_create")(thread, attributes,
                                                                                                     start, argument);
}

int open(const char *path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = modeOf(flags, arguments);
  va_end(arguments);
  return openAs("open", path, flags, mode);
}

int open64(const char *path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = modeOf(flags, arguments);
  va_end(arguments);
  return openAs("open64", path, flags, mode);
}

ssize_t read(int fd, void *buffer, size_t size) {
  const Fate what = fate(kRead);
  if (what == Fate::kFails) return -1;
  return next<ssize_t(int, void *, size_t)>("read")(fd, buffer, what == Fate::kShort && size > 1 ? 1 : size);
}

ssize_t write(int fd, const void *buffer, size_t size) {
  const Fate what = fate(kWrite);
  if (what == Fate::kFails) return -1;
  return next<ssize_t(int, const void *, size_t)>("write")(fd, buffer, what == Fate::kShort && size > 1 ? 1 : size);
}

int close(int fd) {
  const int result = next<int(int)>("close")(fd);
  return fate(kClose) == Fate::kFails ? -1 : result;
}

int rename(const char *from, const char *to) {
  if (fate(kRename) == Fate::kFails) return -1;
  return next<int(const char *, const char *)>("rename")(from, to);
}

int fsync(int fd) {
  if (fate(kFsync) == Fate::kFails) return -1;
  return next<int(int)>("fsync")(fd);
}

int mkostemp(char *name, int flags) {
  if (fate(kMkostemp) == Fate::kFails) return -1;
  return next<int(char *, int)>("mkostemp")(name, flags);
}

int mkostemp64(char *name, int flags) {
  if (fate(kMkostemp) == Fate::kFails) return -1;
  return next<int(char *, int)>("mkostemp64")(name, flags);
}

int ioctl(int fd, unsigned long request, ...) noexcept {
  va_list arguments;
  va_start(arguments, request);
  void *argument = va_arg(arguments, void *);
  va_end(arguments);
  const Fate what = fate(kIoctl);
  if (what == Fate::kFails) return -1;
  const int result = next<int(int, unsigned long, ...)>("ioctl")(fd, request, argument);
  return what == Fate::kShort && result > 1 ? result / 2 : result;
}

int poll(pollfd *fds, nfds_t count, int time) {
  if (fate(kPoll) == Fate::kFails) return -1;
  return next<int(pollfd *, nfds_t, int)>("poll")(fds, count, time);
}

int eventfd(unsigned start, int flags) noexcept {
  if (fate(kEventfd) == Fate::kFails) return -1;
  return next<int(unsigned, int)>("eventfd")(start, flags);
}

FILE *tmpfile() {
  if (fate(kTmpfile) == Fate::kFails) return nullptr;
  return next<FILE *()>("tmpfile")();
}

DIR *opendir(const char *path) {
  if (fate(kOpendir) == Fate::kFails) return nullptr;
  return next<DIR *(const char *)>("opendir")(path);
}

int openat(int folder, const char *path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = modeOf(flags, arguments);
  va_end(arguments);
  if ((flags & O_DIRECTORY) != 0 && fate(kOpendir) == Fate::kFails) return -1;
  return next<int(int, const char *, int, ...)>("openat")(folder, path, flags, mode);
}

}  // extern "C"
