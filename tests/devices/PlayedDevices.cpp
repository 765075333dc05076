// Preloaded into the program under test: plays HID devices where the machine has none.
//
// VESK_DEVICES names a folder. Its folder `class` stands for /sys/class/hidraw, and its folder hidrawN for the node
// /dev/hidrawN, with the files
//   info            bus, vendor and product in hexadecimal
//   name phys uniq descriptor       what the device says of itself; one that is missing is refused with EINVAL
//   refused         an errno with which opening fails
//   features/e0     the answer to that request; one that is missing is refused with EPIPE
//   features/e0.is  what happens instead: "mute", "gone", or an errno
//   inputs, inputs.2 ...            what the node delivers when it is opened for the first time, the second ...: a
//                                   report in hexadecimal a line; "gone", as the last line, takes the device away
// All other paths and descriptors are left alone.
#include <dirent.h>
#include <fcntl.h>
#include <linux/hidraw.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <sstream>
#include <string>
#include <string_view>

#include "tests/faults/Overlay.h"

namespace {

using test::modeOf;
using test::next;

constexpr std::string_view kClass = "/sys/class/hidraw", kNode = "/dev/hidraw";

/// Where a path of a device leads in the played folder; empty for all other paths.
std::string played(const char *path) {
  const char *folder = std::getenv("VESK_DEVICES");
  const std::string_view text(path);
  if (folder == nullptr) return {};
  if (text.starts_with(kClass)) return std::string(folder) + "/class" + std::string(text.substr(kClass.size()));
  if (text.starts_with(kNode)) return std::string(folder) + "/hidraw" + std::string(text.substr(kNode.size()));
  return {};
}

/// By way of <cstdio>, whose system calls another preloaded library does not see.
std::optional<std::string> fileBytes(const std::string &path) {
  std::FILE *file = std::fopen(path.c_str(), "rb");
  if (file == nullptr) return {};
  std::string bytes;
  for (int c; (c = std::getc(file)) != EOF;) bytes += static_cast<char>(c);
  std::fclose(file);
  return bytes;
}

/// One open node. A pair of sockets keeps reports apart and tells a reader when the other end is gone, as a node does.
struct Node {
  std::string folder;
  int device = -1;  // the device's end
};

// By descriptor. A program under test opens a handful, one after the other.
constexpr int kMost = 1024;
Node nodes[kMost];
std::atomic<int> opens = 0;

Node *nodeOf(int fd) {
  return fd >= 0 && fd < kMost && !nodes[fd].folder.empty() ? &nodes[fd] : nullptr;
}

int refuse(int error) {
  errno = error;
  return -1;
}

void leave(Node &node) {
  if (node.device >= 0) next<int(int)>("close")(node.device);
  node.device = -1;
}

std::string fromHex(const std::string &line) {
  std::istringstream digits(line);
  std::string bytes;
  for (unsigned byte = 0; digits >> std::hex >> byte;) bytes += static_cast<char>(byte);
  return bytes;
}

void deliver(Node &node) {
  const int turn = ++opens;
  const std::string file = node.folder + (turn == 1 ? "/inputs" : "/inputs." + std::to_string(turn));
  std::istringstream lines(fileBytes(file).value_or(""));
  for (std::string line; std::getline(lines, line);) {
    if (line == "gone") return leave(node);
    const std::string report = fromHex(line);
    if (::send(node.device, report.data(), report.size(), MSG_DONTWAIT) < 0) std::abort();  // more than can wait
  }
}

int openNode(const std::string &folder, int flags) {
  struct stat status {};
  if (next<int(const char *, struct stat *)>("stat")(folder.c_str(), &status) != 0) return -1;
  // A played node never takes anything: whoever wants to write is a mistake.
  if ((flags & O_ACCMODE) != O_RDONLY) return refuse(EROFS);
  if (const auto error = fileBytes(folder + "/refused")) return refuse(std::stoi(*error));
  int ends[2];
  const int nonBlocking = (flags & O_NONBLOCK) != 0 ? SOCK_NONBLOCK : 0;
  if (::socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC | nonBlocking, 0, ends) != 0) return -1;
  if (ends[0] >= kMost) std::abort();
  nodes[ends[0]] = {folder, ends[1]};
  deliver(nodes[ends[0]]);
  return ends[0];
}

int openPlayed(const char *name, const char *path, int flags, mode_t mode) {
  const std::string instead = played(path);
  if (!instead.empty() && std::string_view(path).starts_with(kNode)) return openNode(instead, flags);
  return next<int(const char *, int, ...)>(name)(instead.empty() ? path : instead.c_str(), flags, mode);
}

/// What the device says of itself, cut to the size of the caller's buffer.
int tell(const Node &node, const char *what, void *buffer, std::size_t size) {
  auto bytes = fileBytes(node.folder + "/" + what);
  if (!bytes) return refuse(EINVAL);
  bytes->push_back('\0');
  const std::size_t count = std::min(bytes->size(), size);
  std::memcpy(buffer, bytes->data(), count);
  return static_cast<int>(count);
}

int tellInfo(const Node &node, hidraw_devinfo &info) {
  const auto text = fileBytes(node.folder + "/info");
  unsigned bus = 0, vendor = 0, product = 0;
  if (!text || !(std::istringstream(*text) >> std::hex >> bus >> vendor >> product)) return refuse(ENOTTY);
  info = {bus, static_cast<std::int16_t>(vendor), static_cast<std::int16_t>(product)};
  return 0;
}

int tellDescriptor(const Node &node, hidraw_report_descriptor &descriptor) {
  const auto bytes = fileBytes(node.folder + "/descriptor");
  if (!bytes) return refuse(EINVAL);
  std::memcpy(descriptor.value, bytes->data(), std::min<std::size_t>(bytes->size(), descriptor.size));
  return 0;
}

int tellDescriptorSize(const Node &node, int &size) {
  const auto bytes = fileBytes(node.folder + "/descriptor");
  if (!bytes) return refuse(EINVAL);
  size = static_cast<int>(bytes->size());
  return 0;
}

int answer(Node &node, char *buffer, std::size_t size) {
  constexpr char kDigits[] = "0123456789abcdef";
  const auto id = static_cast<unsigned char>(buffer[0]);
  const std::string file = node.folder + "/features/" + kDigits[id >> 4] + kDigits[id & 15];
  const std::string instead = fileBytes(file + ".is").value_or("");
  if (instead == "mute") return ::poll(nullptr, 0, -1);  // until a signal comes
  if (instead == "gone") {
    leave(node);
    return refuse(EIO);
  }
  if (!instead.empty()) return refuse(std::stoi(instead));
  const auto bytes = fileBytes(file);
  if (!bytes || node.device < 0) return refuse(node.device < 0 ? ENODEV : EPIPE);
  const std::size_t count = std::min(bytes->size(), size);
  std::memcpy(buffer, bytes->data(), count);
  return static_cast<int>(count);
}

int control(Node &node, unsigned long request, void *argument) {
  if (_IOC_TYPE(request) != 'H') return refuse(ENOTTY);
  const std::size_t size = _IOC_SIZE(request);
  switch (_IOC_NR(request)) {
    case _IOC_NR(HIDIOCGRDESCSIZE):
      return tellDescriptorSize(node, *static_cast<int *>(argument));
    case _IOC_NR(HIDIOCGRDESC):
      return tellDescriptor(node, *static_cast<hidraw_report_descriptor *>(argument));
    case _IOC_NR(HIDIOCGRAWINFO):
      return tellInfo(node, *static_cast<hidraw_devinfo *>(argument));
    case _IOC_NR(HIDIOCGRAWNAME(0)):
      return tell(node, "name", argument, size);
    case _IOC_NR(HIDIOCGRAWPHYS(0)):
      return tell(node, "phys", argument, size);
    case _IOC_NR(HIDIOCGRAWUNIQ(0)):
      return tell(node, "uniq", argument, size);
    case _IOC_NR(HIDIOCGFEATURE(0)):
      return answer(node, static_cast<char *>(argument), size);
    default:
      return refuse(EROFS);  // all others write
  }
}

}  // namespace

extern "C" {

int open(const char *path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = modeOf(flags, arguments);
  va_end(arguments);
  return openPlayed("open", path, flags, mode);
}

int open64(const char *path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = modeOf(flags, arguments);
  va_end(arguments);
  return openPlayed("open64", path, flags, mode);
}

int openat(int folder, const char *path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = modeOf(flags, arguments);
  va_end(arguments);
  const std::string instead = played(path);
  return next<int(int, const char *, int, ...)>("openat")(folder, instead.empty() ? path : instead.c_str(), flags,
                                                          mode);
}

DIR *opendir(const char *path) {
  const std::string instead = played(path);
  return next<DIR *(const char *)>("opendir")(instead.empty() ? path : instead.c_str());
}

int stat(const char *path, struct stat *status) noexcept {
  const std::string instead = played(path);
  return next<int(const char *, struct stat *)>("stat")(instead.empty() ? path : instead.c_str(), status);
}

// A played node is no link.
char *realpath(const char *path, char *resolved) noexcept {
  if (played(path).empty()) return next<char *(const char *, char *)>("realpath")(path, resolved);
  return resolved == nullptr ? ::strdup(path) : std::strcpy(resolved, path);
}

ssize_t read(int fd, void *buffer, size_t size) {
  const ssize_t count = next<ssize_t(int, void *, size_t)>("read")(fd, buffer, size);
  return count == 0 && size != 0 && nodeOf(fd) != nullptr ? refuse(EIO) : count;  // the device has gone
}

int close(int fd) {
  if (Node *node = nodeOf(fd)) {
    leave(*node);
    *node = {};
  }
  return next<int(int)>("close")(fd);
}

int ioctl(int fd, unsigned long request, ...) noexcept {
  va_list arguments;
  va_start(arguments, request);
  void *argument = va_arg(arguments, void *);
  va_end(arguments);
  if (Node *node = nodeOf(fd)) return control(*node, request, argument);
  return next<int(int, unsigned long, ...)>("ioctl")(fd, request, argument);
}

}  // extern "C"
