// The filter's rules.
#include "host/report/Filter.h"

#include <algorithm>
#include <charconv>

#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

std::optional<std::uint32_t> parseHex(std::string_view digits) {
  if (digits.starts_with("0x") || digits.starts_with("0X")) digits.remove_prefix(2);
  std::uint32_t value = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), value, 16);
  if (error != std::errc() || end != digits.data() + digits.size() || value > 0xFFFF) return {};
  return value;
}

}  // namespace

bool Filter::wants(const SourceReport &report) const {
  if (!reportIds.empty() && std::find(reportIds.begin(), reportIds.end(), report.id) == reportIds.end()) return false;
  if (type && report.type != *type) return false;
  if (!device.empty() && report.device != device) return false;
  if (vendorProduct && report.vendorProduct != vendorProduct) return false;
  // A report without a time is before and after nothing, so a span of time does not hold it.
  if (fromNs && (!report.timeNs || *report.timeNs < *fromNs)) return false;
  if (toNs && (!report.timeNs || *report.timeNs > *toNs)) return false;
  return true;
}

bool Filter::addReport(std::string_view idOrName) {
  const KnownReport *known = findReport(idOrName);
  if (known == nullptr) return false;
  reportIds.push_back(known->id);
  return true;
}

void Filter::setDevice(std::string_view name) {
  if (const std::size_t colon = name.find(':'); colon != std::string_view::npos) {
    const auto vendor = parseHex(name.substr(0, colon)), product = parseHex(name.substr(colon + 1));
    if (vendor && product) {
      vendorProduct = *vendor << 16 | *product;
      return;
    }
  }
  device = name;
}

}  // namespace vesk::host
