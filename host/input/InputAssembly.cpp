// The bytes of a report in pieces.
#include "host/input/InputAssembly.h"

#include <algorithm>

namespace vesk::host {

void InputAssembly::begin(const KnownReport &report, std::string_view piece, std::uint64_t packet,
                          std::optional<std::int64_t> timeNs) {
  report_ = &report;
  bytes_.assign(piece);
  pieceSize_ = piece.size();
  packet_ = packet;
  timeNs_ = timeNs;
}

bool InputAssembly::append(std::string_view piece) {
  if (piece.size() != std::min<std::size_t>(pieceSize_, report_->layoutSize - bytes_.size())) return false;
  bytes_.append(piece);
  return true;
}

}  // namespace vesk::host
