// Version reports, features 0xD0 and 0xD2: the firmware's version as text.
#include <array>
#include <cstring>
#include <optional>
#include <stdexcept>

#include "plugin/HIDReportVeskPlugin.h"
#include "values/Utf8.h"

namespace vesk {
namespace {

/// The components of an extended version, one a line, in the firmware's order.
constexpr std::array<Key, 6> kComponents = {"PROJECT", "SDK", "TOOLCHAIN", "KORVO", "VENDOR", "ALGS"};

/// The text from byte 1 to the first zero, however far that lies; nothing where it is not UTF-8.
std::optional<std::string_view> versionText(const char *report) {
  const std::string_view text(report + 1);
  if (!isUtf8(text)) return std::nullopt;
  return text;
}

[[noreturn]] void throwAbsentText() {
  throw std::invalid_argument("HIDReportVeskPlugin: the version text is not UTF-8");
}

/// Takes a text apart at its line feeds. A text has one line more than it has line feeds.
class LineTaker {
 public:
  explicit LineTaker(std::string_view text) : rest_(text) {}

  bool hasMore() const { return hasMore_; }
  std::string_view take() {
    const std::size_t lineFeed = rest_.find('\n');
    const std::string_view line = rest_.substr(0, lineFeed);
    hasMore_ = lineFeed != std::string_view::npos;
    if (hasMore_) rest_.remove_prefix(lineFeed + 1);
    return line;
  }

 private:
  std::string_view rest_;
  bool hasMore_ = true;
};

DisplayLines toLines(std::string_view version) {
  DisplayLines out(1, version.size() + 1);
  out.add(version);
  return out;
}

DisplayLines toComponentLines(std::string_view version) {
  DisplayLines out(kComponents.size() + 1, version.size() + 1);
  for (LineTaker lines(version); lines.hasMore();) out.add(lines.take());
  return out;
}

ReportValue toComponents(std::string_view version) {
  Dictionary out(kComponents.size());
  LineTaker lines(version);
  for (const Key component : kComponents) {
    if (!lines.hasMore()) throw std::out_of_range("HIDReportVeskPlugin: the extended version has fewer than six lines");
    out.add(component, Text(lines.take()));
  }
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseVersion() const {
  const auto version = vesk::versionText(report_buf_);
  if (useStrings_) {
    if (!version) vesk::throwAbsentText();
    return vesk::toLines(*version);
  }
  if (!version) return {};
  return ReportValue(vesk::Text(*version));
}

ReportResult HIDReportVeskPlugin::parseVersionExtended() const {
  const auto version = vesk::versionText(report_buf_);
  if (useStrings_) {
    if (!version) return {};
    return vesk::toComponentLines(*version);
  }
  if (!version) vesk::throwAbsentText();
  return vesk::toComponents(*version);
}
