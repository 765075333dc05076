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
#include <fstream>
#include <sstream>
#include <string_view>

namespace vesk::host {

namespace {

std::string readAll(const std::filesystem::path &path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream bytes;
  bytes << file.rdbuf();
  return bytes.str();
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
  std::istringstream lines(readAll(folder / "device/uevent"));
  for (std::string line; std::getline(lines, line);) {
    const std::string value = line.substr(std::min(line.find('=') + 1, line.size()));
    if (line.starts_with("HID_ID=")) readIds(value, device);
    if (line.starts_with("HID_NAME=")) device.name = value;
    if (line.starts_with("HID_PHYS=")) device.physicalPath = value;
    if (line.starts_with("HID_UNIQ=")) device.serial = value;
  }
  device.descriptor = readAll(folder / "device/report_descriptor");
  return device;
}

class HidrawNode : public HidNode {
 public:
  HidrawNode(std::string path, int fd) : path_(std::move(path)), fd_(fd) {}
  ~HidrawNode() override { ::close(fd_); }
  HidrawNode(const HidrawNode &) = delete;
  HidrawNode &operator=(const HidrawNode &) = delete;

  DeviceIdentity identity() override {
    DeviceIdentity device;
    device.node = path_;
    hidraw_devinfo info{};
    if (::ioctl(fd_, HIDIOCGRAWINFO, &info) >= 0) {
      device.bus = info.bustype;
      device.vendor = static_cast<std::uint16_t>(info.vendor);  // signed for no reason
      device.product = static_cast<std::uint16_t>(info.product);
    }
    device.name = text(HIDIOCGRAWNAME(kTextSize));
    device.physicalPath = text(HIDIOCGRAWPHYS(kTextSize));
    device.serial = text(HIDIOCGRAWUNIQ(kTextSize));
    hidraw_report_descriptor descriptor{};
    int size = 0;
    if (::ioctl(fd_, HIDIOCGRDESCSIZE, &size) >= 0 && size > 0 && size <= HID_MAX_DESCRIPTOR_SIZE) {
      descriptor.size = static_cast<std::uint32_t>(size);
      if (::ioctl(fd_, HIDIOCGRDESC, &descriptor) >= 0)
        device.descriptor.assign(reinterpret_cast<const char *>(descriptor.value), descriptor.size);
    }
    return device;
  }

  int getFeature(std::span<char> report) override {
    const int count = ::ioctl(fd_, HIDIOCGFEATURE(report.size()), report.data());
    return count < 0 ? -errno : count;
  }

  int read(std::span<char> report) override {
    const ssize_t count = ::read(fd_, report.data(), report.size());
    return count < 0 ? -errno : static_cast<int>(count);
  }

  void waitForReport(int wakeFd) override {
    pollfd waiting[] = {{fd_, POLLIN, 0}, {wakeFd, POLLIN, 0}};
    ::poll(waiting, 2, -1);
  }

  bool isGone(milliseconds within) override {
    pollfd node{fd_, 0, 0};
    return ::poll(&node, 1, static_cast<int>(within.count())) > 0;
  }

 private:
  static constexpr std::size_t kTextSize = 256;

  std::string text(unsigned long request) const {
    char bytes[kTextSize + 1] = {};
    return ::ioctl(fd_, request, bytes) < 0 ? "" : bytes;
  }

  std::string path_;
  int fd_;
};

}  // namespace

std::vector<DeviceIdentity> Hidraw::list() {
  std::vector<DeviceIdentity> devices;
  std::error_code none;
  for (const auto &entry : std::filesystem::directory_iterator(classFolder_, none))
    devices.push_back(readFolder(entry.path()));
  // hidraw10 behind hidraw9.
  std::ranges::sort(devices, {}, [](const DeviceIdentity &d) { return std::pair(d.node.size(), d.node); });
  return devices;
}

HidSystem::Opened Hidraw::open(const std::string &path) {
  const int fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  if (fd < 0) return {nullptr, errno};
  auto node = std::make_unique<HidrawNode>(path, fd);
  hidraw_devinfo info{};
  if (::ioctl(fd, HIDIOCGRAWINFO, &info) < 0) return {nullptr, errno};
  return {std::move(node), 0};
}

}  // namespace vesk::host
