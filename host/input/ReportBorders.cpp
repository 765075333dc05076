// Borders by report ID.
#include "host/input/ReportBorders.h"

#include <algorithm>

#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

const KnownReport *reportAt(std::string_view bytes) {
  return findReport(std::uint32_t{static_cast<unsigned char>(bytes[0])});
}

}  // namespace

std::size_t reportLength(std::string_view bytes) {
  const KnownReport *known = reportAt(bytes);
  if (known == nullptr) return 0;
  if (known->length != KnownReport::Length::kText) return std::min<std::size_t>(known->layoutSize, bytes.size());
  const std::size_t textEnd = bytes.find('\0', 1);
  if (textEnd == std::string_view::npos) return bytes.size();
  return std::min(bytes.find_first_not_of('\0', textEnd), bytes.size());
}

bool isWholeReport(std::string_view bytes) {
  const KnownReport *known = bytes.empty() ? nullptr : reportAt(bytes);
  if (known == nullptr) return false;
  if (known->length == KnownReport::Length::kText) return bytes.find('\0', 1) != std::string_view::npos;
  if (known->length == KnownReport::Length::kExact) return bytes.size() == known->layoutSize;
  return bytes.size() >= known->layoutSize &&
         bytes.find_first_not_of('\0', known->layoutSize) == std::string_view::npos;
}

bool isTextReport(std::string_view bytes) {
  const KnownReport *known = bytes.empty() ? nullptr : reportAt(bytes);
  return known != nullptr && known->length == KnownReport::Length::kText;
}

std::size_t countReports(std::string_view bytes) {
  std::size_t count = 0;
  while (!bytes.empty()) {
    const std::size_t length = reportLength(bytes);
    if (length == 0 || length < reportAt(bytes)->layoutSize) return 0;
    bytes.remove_prefix(length);
    ++count;
  }
  return count;
}

}  // namespace vesk::host
