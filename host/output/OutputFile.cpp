// Writing whole buffers, and the rename that makes a file appear.
#include "host/output/OutputFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <optional>
#include <utility>

namespace vesk::host {

namespace {

/// Makes a pipe hold several writes, so that its reader works while we do. Where that is refused, or the output is no
/// pipe, it stays as it is.
void widenPipe(int fd) {
  constexpr int kPipeBytes = 1 << 20;  // what Linux lets anybody have
  const int bytes = ::fcntl(fd, F_GETPIPE_SZ);
  if (bytes > 0 && bytes < kPipeBytes) ::fcntl(fd, F_SETPIPE_SZ, kPipeBytes);
}

/// Where a path leads: /dev/stdout and its like to a descriptor that is open already.
struct Target {
  std::string path;
  int descriptor = -1;
};

/// Nothing where links lead round and round.
std::optional<Target> followLinks(const std::string &path) {
  constexpr int kMostLinks = 40;
  const std::string ourFolder = "/proc/" + std::to_string(::getpid()) + "/fd";
  std::filesystem::path at = path;
  std::error_code error;
  for (int links = 0; links < kMostLinks; ++links) {
    const auto folder = std::filesystem::weakly_canonical(std::filesystem::absolute(at, error).parent_path(), error);
    if (folder == ourFolder) return Target{path, std::atoi(at.filename().c_str())};
    if (!std::filesystem::is_symlink(at, error)) return Target{at.native()};
    const std::filesystem::path next = std::filesystem::read_symlink(at, error);
    at = next.is_absolute() ? next : at.parent_path() / next;
  }
  return {};
}

constexpr int kDeadlySignals[] = {SIGHUP, SIGINT, SIGQUIT, SIGTERM};

char guarded[PATH_MAX];  // the temporary file that a deadly signal removes; empty for none

extern "C" void removeGuarded(int number) {
  if (guarded[0] != '\0') ::unlink(guarded);
  ::signal(number, SIG_DFL);
  ::raise(number);
}

/// Signals that would kill, and nobody else handles, remove the file first.
void guard(const std::string &path) {
  if (guarded[0] != '\0' || path.size() >= sizeof guarded) return;
  std::memcpy(guarded, path.c_str(), path.size() + 1);
  for (const int number : kDeadlySignals) {
    struct sigaction now {};
    if (::sigaction(number, nullptr, &now) == 0 && now.sa_handler == SIG_DFL) ::signal(number, removeGuarded);
  }
}

void unguard(const std::string &path) {
  if (path != guarded) return;
  guarded[0] = '\0';
  for (const int number : kDeadlySignals) {
    struct sigaction now {};
    if (::sigaction(number, nullptr, &now) == 0 && now.sa_handler == removeGuarded) ::signal(number, SIG_DFL);
  }
}

}  // namespace

OutputFile::OutputFile(const std::string &path) : name_(path == "-" ? "(standard output)" : path) {
  if (path == "-") {
    isShared_ = true;
    widenPipe(fd_);
    return;
  }
  struct stat existing {};
  const auto target = followLinks(path);
  if (!target) {
    errno = ELOOP;
    fail("cannot be created");
  }
  // What is there and no regular file (a device, a FIFO, /dev/stdout) cannot be replaced and is written to as it is.
  isShared_ = target->descriptor >= 0;
  if (isShared_ || (::stat(path.c_str(), &existing) == 0 && !S_ISREG(existing.st_mode))) {
    fd_ = isShared_ ? ::fcntl(target->descriptor, F_DUPFD_CLOEXEC, STDERR_FILENO + 1)
                    : ::open(path.c_str(), O_WRONLY | O_CLOEXEC);
    if (fd_ < 0) fail("cannot be opened");
    widenPipe(fd_);
    return;
  }
  path_ = target->path;
  temporary_ = path_ + ".XXXXXX";
  fd_ = ::mkostemp(temporary_.data(), O_CLOEXEC);
  if (fd_ < 0) {
    temporary_.clear();
    fail("cannot be created");
  }
  guard(temporary_);
  const mode_t mask = ::umask(0);
  ::umask(mask);
  ::fchmod(fd_, 0666 & ~mask);
}

OutputFile::~OutputFile() {
  if (fd_ > STDERR_FILENO) ::close(fd_);
  if (temporary_.empty()) return;
  ::unlink(temporary_.c_str());
  unguard(temporary_);
}

void OutputFile::write(std::string_view bytes) {
  off_t done = 0;
  while (!bytes.empty()) {
    const ssize_t written = ::write(fd_, bytes.data(), bytes.size());
    if (written >= 0) {
      bytes.remove_prefix(static_cast<std::size_t>(written));
      done += written;
    } else if (errno == EPIPE && isShared_) {
      throw PipeClosed();
    } else if (errno != EINTR) {
      const int error = errno;
      if (isPublished()) takeBack(done);
      errno = error;
      fail("cannot be written");
    }
  }
}

void OutputFile::takeBack(off_t size) {
  const off_t start = ::lseek(fd_, -size, SEEK_CUR);
  // Where that fails too there is nothing left to do.
  if (start >= 0 && ::ftruncate(fd_, start) != 0) return;
}

void OutputFile::publish() {
  if (temporary_.empty()) return;
  if (::rename(temporary_.c_str(), path_.c_str()) != 0) fail("cannot take its name");
  unguard(temporary_);
  temporary_.clear();
}

void OutputFile::commit() {
  if (fd_ <= STDERR_FILENO) return;
  if (!path_.empty() && ::fsync(fd_) != 0) fail("cannot be written");
  if (::close(std::exchange(fd_, -1)) != 0) fail("cannot be written");
  publish();
}

bool OutputFile::isTerminal() const {
  return ::isatty(fd_) == 1;
}

void OutputFile::fail(const char *what) const {
  throw OutputError(name_ + ": " + what + ": " + std::strerror(errno));
}

}  // namespace vesk::host
