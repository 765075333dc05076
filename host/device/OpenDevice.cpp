// Finding and opening, and the words for what went wrong.
#include "host/device/OpenDevice.h"

#include <grp.h>
#include <pwd.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <filesystem>
#include <optional>

#include "host/device/ReportDescriptor.h"
#include "host/device/UdevRule.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr milliseconds kHotPlugTime{1000}, kRetryAfter{50};

std::optional<std::uint16_t> parseId(std::string_view digits) {
  std::uint16_t id = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), id, 16);
  if (digits.empty() || error != std::errc() || end != digits.data() + digits.size()) return {};
  return id;
}

bool isPath(const std::string &name) {
  return name.find('/') != std::string::npos;
}

bool hasIds(const DeviceIdentity &device, std::string_view name) {
  const std::size_t colon = name.find(':');
  if (colon == std::string_view::npos) return false;
  return parseId(name.substr(0, colon)) == device.vendor && parseId(name.substr(colon + 1)) == device.product;
}

bool isCalled(const DeviceIdentity &device, const std::string &name) {
  if (name.empty()) return speaksOurReports(device.descriptor);
  return device.node == "/dev/" + name || device.serial == name || hasIds(device, name);
}

/// One line each, for people.
std::string listed(std::span<const DeviceIdentity> devices) {
  std::string text;
  for (const DeviceIdentity &device : devices) {
    text += "\n  " + device.node + "  " + busName(device.bus) + " " + idsText(device);
    if (!device.name.empty()) text += "  " + printable(device.name);
    if (!device.serial.empty()) text += "  serial " + printable(device.serial);
    if (speaksOurReports(device.descriptor)) text += "  (speaks the controller's reports)";
    if (device.unreadable != 0)
      text += std::string("  (cannot be looked at: ") + std::strerror(device.unreadable) + ")";
  }
  return text;
}

/// " (mode 0600, owner root, group root)"; empty where the node cannot be looked at.
std::string rightsOf(const std::string &node) {
  struct stat status {};
  if (::stat(node.c_str(), &status) != 0) return {};
  const passwd *owner = ::getpwuid(status.st_uid);
  const group *members = ::getgrgid(status.st_gid);
  char mode[8];
  const std::string_view digits(mode, std::to_chars(mode, std::end(mode), status.st_mode & 07777u, 8).ptr);
  return " (mode " + std::string(4 - std::min<std::size_t>(digits.size(), 4), '0') + std::string(digits) + ", owner " +
         (owner != nullptr ? owner->pw_name : std::to_string(status.st_uid)) + ", group " +
         (members != nullptr ? members->gr_name : std::to_string(status.st_gid)) + ")";
}

DeviceError denied(HidSystem &system, const std::string &node, int error) {
  std::string text = std::string("cannot be opened: ") + std::strerror(error) + rightsOf(node);
  const std::string target = canonicalNode(node);
  try {
    for (const DeviceIdentity &device : system.list())
      if (device.node == target) text += "; this udev rule would help:\n" + udevRule(device);
  } catch (const DeviceError &) {  // the rights are what is wrong; the rule was only a help
  }
  while (text.ends_with('\n')) text.pop_back();
  return DeviceError({&kDeviceDenied, node, {}, {}, text});
}

}  // namespace

std::string findDevice(std::span<const DeviceIdentity> devices, const std::string &name) {
  if (isPath(name)) return name;
  std::vector<DeviceIdentity> called;
  std::ranges::copy_if(devices, std::back_inserter(called), [&](const auto &device) { return isCalled(device, name); });
  const auto speaks = [](const DeviceIdentity &device) { return speaksOurReports(device.descriptor); };
  if (std::ranges::count_if(called, speaks) == 1) called = {*std::ranges::find_if(called, speaks)};
  if (called.size() == 1) return called.front().node;

  const std::string what = name.empty() ? "speaks the controller's reports" : "is called " + name;
  if (called.empty()) {
    const std::string all = devices.empty() ? "; there is no HID device here" : "; there are:" + listed(devices);
    throw DeviceError({&kNoDevice, {}, {}, {}, "no device " + what + all});
  }
  throw DeviceError({&kAmbiguousDevice,
                     {},
                     {},
                     {},
                     "more than one device " + what + "; name one of them with --device:" + listed(called)});
}

std::string canonicalNode(const std::string &path) {
  std::error_code none;
  return std::filesystem::weakly_canonical(path, none);
}

std::unique_ptr<HidNode> openDevice(HidSystem &system, const std::string &name, const Stop &stop) {
  const std::string node = isPath(name) ? name : findDevice(system.list(), name);
  const auto end = std::chrono::steady_clock::now() + kHotPlugTime;
  for (;;) {
    HidSystem::Opened opened = system.open(node);
    if (opened.node) return std::move(opened.node);
    const bool isDenied = opened.error == EACCES || opened.error == EPERM;
    const bool mayChange = isDenied || opened.error == ENOENT || opened.error == EINTR;
    if (mayChange && std::chrono::steady_clock::now() < end) {
      if (stop.waitFor(kRetryAfter)) return nullptr;
      continue;
    }
    if (isDenied) throw denied(system, node, opened.error);
    const char *reason =
        opened.error == ENOTTY || opened.error == EINVAL ? "not a HID device node" : std::strerror(opened.error);
    throw DeviceError({&kDeviceUnopened, node, {}, {}, std::string("cannot be opened: ") + reason});
  }
}

std::string idsText(const DeviceIdentity &device) {
  return formatted<"%04x:%04x">(std::uint32_t{device.vendor}, std::uint32_t{device.product});
}

std::string printable(std::string_view text) {
  std::string clean(text);
  for (char &c : clean)
    if (static_cast<unsigned char>(c) < ' ' || c == '\x7F') c = ' ';
  return clean;
}

}  // namespace vesk::host
