// Finds the controller's reports among the packets of a USB capture.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "host/input/CaptureHandle.h"
#include "host/input/Input.h"
#include "host/input/UsbDevices.h"
#include "host/input/UsbFindings.h"
#include "host/input/UsbPacket.h"
#include "host/input/UsbPending.h"

namespace vesk::host {

inline constexpr MessageKind kCaptureSummary{"capture-summary", Severity::kNote, kExitOk};

/// Pairs requests with answers and puts input reports together. The controller is known by what it speaks: an answer to
/// GET_REPORT counts if one of our IDs was asked for, interrupt data if they begin with the ID of an input report and
/// have its length, at once or in pieces. What a device or endpoint sends that has given a report of ours counts too,
/// so that an unknown ID or a wrong length is seen there; with all others it is somebody else's traffic.
class CaptureReports {
 public:
  CaptureReports(std::string_view file, const ReadOptions &options, ReadSink &sink)
      : file_(file), options_(options), sink_(sink) {}

  void packet(const CapturedPacket &packet);
  /// After the last one: tells what is still waiting, and the counts.
  void finish(std::uint64_t packets);

 private:
  struct Counts {
    std::uint64_t answers = 0, inputs = 0, assembled = 0, guessed = 0, failed = 0, empty = 0, unanswered = 0, cut = 0,
                  incomplete = 0, written = 0, other = 0;
  };

  void control(const UsbPacket &usb);
  void answer(const UsbPending::Submit &submit, const UsbPacket &usb);
  void getReport(const UsbSetup &setup, const UsbPacket &usb);
  void answerWithoutSubmit(const UsbPacket &usb);
  void unanswered(const UsbPending::Submit &submit);

  void interrupt(const UsbPacket &usb);
  bool continueAssembly(UsbDevice &device, UsbEndpoint &endpoint, std::string_view piece);
  void inputOfKnownId(const KnownReport &known, const UsbPacket &usb);
  void inputOfUnknownId(UsbDevice *device, UsbEndpoint *endpoint, const UsbPacket &usb);
  void incomplete(const UsbDevice &device, InputAssembly &assembly);

  /// True where the capture holds less than was transferred, which is told.
  bool isCut(const UsbPacket &usb, std::optional<std::uint32_t> id);
  void handOver(SourceReport report, const UsbDevice &device);
  void tell(const MessageKind &kind, std::optional<std::uint32_t> id, std::string text, std::uint64_t packet = 0);

  std::string_view file_;
  const ReadOptions &options_;
  ReadSink &sink_;
  UsbPending pending_;
  UsbDevices devices_;
  Counts counts_;
  std::optional<std::int64_t> startNs_;
  std::uint64_t index_ = 0;
  // Of the packet at hand:
  std::uint64_t number_ = 0;
  unsigned interface_ = 0;
  std::optional<std::int64_t> timeNs_;
};

}  // namespace vesk::host
