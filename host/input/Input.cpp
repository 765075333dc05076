// The list of input kinds, and how one is chosen.
#include "host/input/Input.h"

#include <array>

#include "host/input/Capture.h"
#include "host/input/HexText.h"
#include "host/input/HidRecording.h"
#include "host/input/RawBinary.h"
#include "host/input/UsbhidDump.h"
#include "host/input/UsbmonText.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

// Binary magics first, then texts from the most particular to the least, and at last whatever has bytes.
const std::array kKinds = {kCapture, kHidRecording, kUsbhidDump, kUsbmonText, kHexText, kRawBinary};

}  // namespace

std::span<const InputKind> inputKinds() {
  return kKinds;
}

const InputKind *findInputKind(std::string_view name) {
  for (const InputKind &kind : kKinds)
    if (kind.name == name) return &kind;
  return nullptr;
}

const InputKind &detectInputKind(std::string_view head) {
  for (const InputKind &kind : kKinds)
    if (kind.matches(head)) return kind;
  return kKinds.back();
}

ReportType typeOf(std::uint32_t id, const ReadOptions &options) {
  if (options.forcedType) return *options.forcedType;
  const KnownReport *known = findReport(id);
  return known == nullptr ? ReportType::kFeature : known->type;
}

}  // namespace vesk::host
