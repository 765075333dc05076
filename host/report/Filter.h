// Which reports of an input the user wants.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/report/SourceReport.h"

namespace vesk::host {

struct Filter {
  std::vector<std::uint32_t> reportIds;  // empty: all
  std::optional<ReportType> type;
  std::string device;  // as SourceReport names it
  std::optional<std::uint32_t> vendorProduct;
  std::optional<std::int64_t> fromNs, toNs;

  bool wants(const SourceReport &report) const;

  /// Takes "0xE0", "224" or a name; false where nothing is called so.
  bool addReport(std::string_view idOrName);
  /// Takes "1.7", "0" or "1234:5678".
  void setDevice(std::string_view name);
};

}  // namespace vesk::host
