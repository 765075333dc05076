// What every text and raw reader does with the reports that it finds: number them, name their file, hand them over.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

/// No report is longer. What claims to be is damaged, or is no report.
inline constexpr std::size_t kMostReportBytes = std::size_t{64} << 10;

class FoundReports {
 public:
  FoundReports(const ByteSource &source, const ReadOptions &options, ReadSink &sink)
      : source_(source), options_(options), sink_(sink) {}

  /// Hands over a report whose bytes are all that is known of it. REQUIRES: !bytes.empty().
  void addUntyped(std::string_view bytes, Place place) {
    SourceReport report;
    report.bytes = bytes;
    report.id = static_cast<unsigned char>(bytes[0]);
    report.type = typeOf(report.id, options_);
    report.typeGuessed = !options_.forcedType;
    report.place = place;
    add(report);
  }

  /// Hands over a report; file and index are filled in.
  void add(SourceReport &report) {
    report.file = source_.name();
    report.index = count_++;
    sink_.report(report);
  }

  void say(const MessageKind &kind, Place place, std::string text, std::optional<std::uint32_t> reportId = {}) {
    if (kind.severity == Severity::kError) ++errors_;
    sink_.message({&kind, source_.name(), place, reportId, std::move(text)});
  }

  /// At the end: an input that gave neither a report nor an error is one that nobody may take for decoded.
  void finish(std::string_view expected) {
    if (count_ == 0 && errors_ == 0) say(kNoReports, {}, "no report in it; expected " + std::string(expected));
  }

 private:
  const ByteSource &source_;
  const ReadOptions &options_;
  ReadSink &sink_;
  std::uint64_t count_ = 0;
  std::uint64_t errors_ = 0;
};

}  // namespace vesk::host
