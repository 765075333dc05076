// Puts an input report together that came in several transfers, because its reader asked for one bus packet at a time.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "host/report/KnownReports.h"

namespace vesk::host {

/// The report that one endpoint is about to give. Its length follows from its ID. A short piece alone ends nothing:
/// both input reports are multiples of 8 long and one of 16, so with packets of that size none of their pieces is
/// short.
class InputAssembly {
 public:
  /// The first piece, which begins with the report ID. REQUIRES: it is shorter than the report.
  void begin(const KnownReport &report, std::string_view piece, std::uint64_t packet,
             std::optional<std::int64_t> timeNs);
  /// The next piece. False where it is no continuation: all but the last have the size of the first.
  bool append(std::string_view piece);
  void end() { report_ = nullptr; }

  bool isActive() const { return report_ != nullptr; }
  bool isWhole() const { return bytes_.size() == report_->layoutSize; }
  const KnownReport &report() const { return *report_; }
  std::string_view bytes() const { return bytes_; }
  std::size_t pieceSize() const { return pieceSize_; }
  /// Where and when it began.
  std::uint64_t packet() const { return packet_; }
  std::optional<std::int64_t> timeNs() const { return timeNs_; }

  /// Whether the piece sizes alone make it all but certain that this was one report: large pieces, or one that is
  /// shorter than the others just at the end.
  bool isConvincing() const { return pieceSize_ >= 64 || report_->layoutSize % pieceSize_ != 0; }

 private:
  const KnownReport *report_ = nullptr;  // null while nothing is put together
  std::string bytes_;
  std::size_t pieceSize_ = 0;
  std::uint64_t packet_ = 0;
  std::optional<std::int64_t> timeNs_;
};

}  // namespace vesk::host
