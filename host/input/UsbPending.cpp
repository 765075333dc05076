// The table behind the pairing of submits and completions.
#include "host/input/UsbPending.h"

namespace vesk::host {

UsbPending::Submit UsbPending::remove(Index::iterator entry) {
  const Submit removed = *entry->second;
  submits_.erase(entry->second);
  index_.erase(entry);
  return removed;
}

std::optional<UsbPending::Submit> UsbPending::add(const Submit &submit) {
  std::optional<Submit> unanswered = take(submit.interface, submit.bus, submit.transferId);
  if (!unanswered && submits_.size() == kMost) unanswered = takeOldest();
  submits_.push_back(submit);
  index_.emplace(Key{submit.interface, submit.bus, submit.transferId}, std::prev(submits_.end()));
  return unanswered;
}

std::optional<UsbPending::Submit> UsbPending::take(unsigned interface, std::uint16_t bus, std::uint64_t transferId) {
  const auto entry = index_.find({interface, bus, transferId});
  if (entry == index_.end()) return {};
  return remove(entry);
}

std::optional<UsbPending::Submit> UsbPending::takeOldest() {
  if (submits_.empty()) return {};
  const Submit &oldest = submits_.front();
  return take(oldest.interface, oldest.bus, oldest.transferId);
}

}  // namespace vesk::host
