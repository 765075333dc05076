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

/// Cuts the first line off `rest`, which becomes nothing behind the last line.
std::string_view takeLine(std::optional<std::string_view> &rest) {
  const std::size_t lineFeed = rest->find('\n');
  const std::string_view line = rest->substr(0, lineFeed);
  if (lineFeed == std::string_view::npos)
    rest.reset();
  else
    rest->remove_prefix(lineFeed + 1);
  return line;
}

DisplayLines toLines(std::string_view version) {
  DisplayLines out(1, version.size() + 1);
  out.add(version);
  return out;
}

DisplayLines toComponentLines(std::string_view version) {
  DisplayLines out(kComponents.size() + 1, version.size() + 1);
  for (std::optional rest = version; rest;) out.add(takeLine(rest));
  return out;
}

ReportValue toComponents(std::string_view version) {
  Dictionary out(kComponents.size());
  std::optional rest = version;
  for (const Key component : kComponents) {
    if (!rest) throw std::out_of_range("HIDReportVeskPlugin: the extended version has fewer than six lines");
    out.add(component, std::string(takeLine(rest)));
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
  return ReportValue(std::string(*version));
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
