// A walk over a report descriptor's items.
#include "host/device/ReportDescriptor.h"

#include <algorithm>
#include <optional>
#include <set>
#include <utility>

namespace vesk::host {

namespace {

// An item's first byte is its tag and type in the upper six bits, and the size of its data in the lower two.
constexpr unsigned kTagMask = 0xFC, kInput = 0x80, kOutput = 0x90, kFeature = 0xB0, kReportId = 0x84;
constexpr unsigned kLongItem = 0xFE;  // followed by the size of its data and a tag
// Other devices may use one of our IDs by chance, but not so many of them.
constexpr std::ptrdiff_t kEnoughInputs = 2, kEnoughFeatures = 8;

std::optional<ReportType> reportType(unsigned tag) {
  if (tag == kInput) return ReportType::kInput;
  if (tag == kOutput) return ReportType::kOutput;
  if (tag == kFeature) return ReportType::kFeature;
  return {};
}

std::set<std::pair<ReportType, std::uint32_t>> declarations(std::string_view rest) {
  std::set<std::pair<ReportType, std::uint32_t>> found;
  std::uint32_t reportId = 0;
  const auto byteAt = [&](std::size_t index) { return static_cast<unsigned char>(rest[index]); };
  while (!rest.empty()) {
    const unsigned first = byteAt(0);
    std::size_t size = 1;
    if (first == kLongItem) {
      size = rest.size() < 2 ? rest.size() : std::size_t{3} + byteAt(1);
    } else {
      constexpr std::size_t kDataSizes[] = {0, 1, 2, 4};
      size += kDataSizes[first & 3];
    }
    if (size > rest.size()) break;
    if (first != kLongItem) {
      if ((first & kTagMask) == kReportId && size > 1) reportId = byteAt(1);
      if (const auto type = reportType(first & kTagMask)) found.emplace(*type, reportId);
    }
    rest.remove_prefix(size);
  }
  return found;
}

}  // namespace

std::vector<const KnownReport *> declaredReports(std::string_view descriptor) {
  const auto found = declarations(descriptor);
  std::vector<const KnownReport *> ours;
  for (const KnownReport &report : knownReports())
    if (found.contains({report.type, report.id})) ours.push_back(&report);
  return ours;
}

bool speaksOurReports(std::string_view descriptor) {
  const auto ours = declaredReports(descriptor);
  const auto inputs =
      std::ranges::count_if(ours, [](const KnownReport *report) { return report->type == ReportType::kInput; });
  return inputs >= kEnoughInputs || std::ssize(ours) - inputs >= kEnoughFeatures;
}

}  // namespace vesk::host
