// Beneath hidapi, whose hidraw back end we do without: it opens for writing too, which needs more rights than reading
// and leaves the promise never to write to our own care; it gives no errno for an open that failed; at unplug its timed
// read discards what is still queued; and its list leaves out devices on virtual buses, names that are not ASCII and
// (before 0.14) the report descriptor, which is how the controller is recognised. What remains is these few calls.
#include "host/device/Hidraw.h"

#include <fcntl.h>
#include <linux/hidraw.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <filesystem>
#include <sstream>
#include <string_view>

#include "host/device/OpenDevice.h"

namespace vesk::host {

namespace {

/// Returns 0, or an errno.
int readAll(const std::filesystem::path &path, std::string &bytes) {
  const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return errno;
  char block[HID_MAX_DESCRIPTOR_SIZE];
  ssize_t count = 0;
  do {
    count = ::read(fd, block, sizeof(block));
    if (count > 0) bytes.append(block, static_cast<std::size_t>(count));
  } while (count > 0 || (count < 0 && errno == EINTR));
  const int error = count < 0 ? errno : 0;
  ::close(fd);
  return error;
}

/// "0003:00001234:00005678"
void readIds(std::string_view text, DeviceIdentity &device) {
  std::uint32_t parts[3] = {};
  for (std::uint32_t &part : parts) {
    const auto end = std::from_chars(text.data(), text.data() + text.size(), part, 16).ptr;
    text.remove_prefix(std::min(text.size(), static_cast<std::size_t>(end - text.data()) + 1));
  }
  device.bus = parts[0];
  device.vendor = static_cast<std::uint16_t>(parts[1]);
  device.product = static_cast<std::uint16_t>(parts[2]);
}

DeviceIdentity readFolder(const std::filesystem::path &folder) {
  DeviceIdentity device;
  device.node = "/dev/" + folder.filename().string();
  std::string uevent;
  device.unreadable = readAll(folder / "device/uevent", uevent);
  std::istringstream lines(uevent);
  for (std::string line; std::getline(lines, line);) {
    const std::string value = line.substr(std::min(line.find('=') + 1, line.size()));
    if (line.starts_with("HID_ID=")) readIds(value, device);
    if (line.starts_with("HID_NAME=")) device.name = value;
    if (line.starts_with("HID_PHYS=")) device.physicalPath = value;
    if (line.starts_with("HID_UNIQ=")) device.serial = value;
  }
  const int error = readAll(folder / "device/report_descriptor", device.descriptor);
  if (device.unreadable == 0) device.unreadable = error;
  return device;
}

class HidrawNode : public HidNode {
 public:
  HidrawNode(const std::string &path, int fd) : fd_(fd) { identity_.node = path; }
  ~HidrawNode() override { ::close(fd_); }
  HidrawNode(const HidrawNode &) = delete;
  HidrawNode &operator=(const HidrawNode &) = delete;

  /// Learns who the device is. Returns 0, or an errno where it does not say.
  int ask() {
    hidraw_devinfo info{};
    if (::ioctl(fd_, HIDIOCGRAWINFO, &info) < 0) return errno;
    identity_.bus = info.bustype;
    identity_.vendor = static_cast<std::uint16_t>(info.vendor);  // signed for no reason
    identity_.product = static_cast<std::uint16_t>(info.product);
    if (const int error = askText(HIDIOCGRAWNAME(kTextSize), identity_.name)) return error;
    if (const int error = askText(HIDIOCGRAWPHYS(kTextSize), identity_.physicalPath)) return error;
    // Kernels before 5.6 do not know this request.
    if (const int error = askText(HIDIOCGRAWUNIQ(kTextSize), identity_.serial); error != 0 && error != EINVAL)
      return error;
    return askDescriptor();
  }

  DeviceIdentity identity() override { return identity_; }

  int getFeature(std::span<char> report) override {
    const int count = ::ioctl(fd_, HIDIOCGFEATURE(report.size()), report.data());
    return count < 0 ? -errno : std::min(count, static_cast<int>(report.size()));
  }

  int read(std::span<char> report) override {
    const ssize_t count = ::read(fd_, report.data(), report.size());
    return count < 0 ? -errno : static_cast<int>(count);
  }

  int waitForReport(int wakeFd) override {
    pollfd waiting[] = {{fd_, POLLIN, 0}, {wakeFd, POLLIN, 0}};
    return ::poll(waiting, 2, -1) < 0 && errno != EINTR ? -errno : 0;
  }

  bool isGone(milliseconds within) override {
    pollfd node{fd_, 0, 0};
    return ::poll(&node, 1, static_cast<int>(within.count())) > 0;
  }

 private:
  static constexpr std::size_t kTextSize = 256;

  int askText(unsigned long request, std::string &text) const {
    char bytes[kTextSize + 1] = {};
    if (::ioctl(fd_, request, bytes) < 0) return errno;
    text = bytes;
    return 0;
  }

  int askDescriptor() {
    hidraw_report_descriptor descriptor{};
    int size = 0;
    if (::ioctl(fd_, HIDIOCGRDESCSIZE, &size) < 0) return errno;
    if (size < 0 || size > HID_MAX_DESCRIPTOR_SIZE) return EMSGSIZE;
    descriptor.size = static_cast<std::uint32_t>(size);
    if (::ioctl(fd_, HIDIOCGRDESC, &descriptor) < 0) return errno;
    identity_.descriptor.assign(reinterpret_cast<const char *>(descriptor.value), static_cast<std::size_t>(size));
    return 0;
  }

  DeviceIdentity identity_;
  int fd_;
};

}  // namespace

std::vector<DeviceIdentity> Hidraw::list() {
  std::vector<DeviceIdentity> devices;
  std::error_code error;
  for (std::filesystem::directory_iterator entry(classFolder_, error), end; entry != end; entry.increment(error)) {
    DeviceIdentity device = readFolder(entry->path());
    // What leaves just now is none.
    if (device.unreadable != ENOENT && device.unreadable != ENODEV) devices.push_back(std::move(device));
  }
  // A kernel that knows no HID devices has no such folder.
  if (error && error != std::errc::no_such_file_or_directory)
    throw DeviceError({&kDeviceUnopened, classFolder_, {}, {}, "cannot be listed: " + error.message()});
  // hidraw10 behind hidraw9.
  std::ranges::sort(devices, {}, [](const DeviceIdentity &d) { return std::pair(d.node.size(), d.node); });
  return devices;
}

HidSystem::Opened Hidraw::open(const std::string &path) {
  const int fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  if (fd < 0) return {nullptr, errno};
  auto node = std::make_unique<HidrawNode>(path, fd);
  if (const int error = node->ask()) return {nullptr, error};
  return {std::move(node), 0};
}

}  // namespace vesk::host
