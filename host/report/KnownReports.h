// The table of the controller's reports: what `reports` lists, what `explain` explains, what the length checks go by.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "host/report/Field.h"
#include "host/report/SourceReport.h"

namespace vesk::host {

struct KnownReport {
  enum class Length : std::uint8_t { kExact, kAtLeast, kText };

  std::uint8_t id;
  ReportType type;
  std::string_view name;     // for people and for --report
  std::uint32_t layoutSize;  // bytes with the report ID; for a text, the least that it can have
  Length length;
  std::string_view decoder;
  std::string_view title;
  std::span<const FieldRow> fields;  // behind the report ID
};

/// In the order in which they are listed.
std::span<const KnownReport> knownReports();

/// Null for an ID that is none of the controller's.
const KnownReport *findReport(std::uint32_t id);

/// By "0xE0", "224" or name; null for anything else.
const KnownReport *findReport(std::string_view idOrName);

}  // namespace vesk::host
