// Tells reports that say something new from those that repeat the one before.
#pragma once

#include <map>
#include <string>

#include "host/report/SourceReport.h"

namespace vesk::host {

/// A sensor image's frame number and time, and an ADC dump packet's number, count for nothing: they always change.
class ChangeFilter {
 public:
  /// Whether it differs from the last report of its type and ID.
  bool isNew(const SourceReport &report);

 private:
  std::map<std::pair<ReportType, std::uint32_t>, std::string> last_;
};

}  // namespace vesk::host
