// The packets of a pcap or pcapng file, read from a stream in bounded memory.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "host/input/ByteSource.h"
#include "host/input/CaptureHandle.h"
#include "host/input/Input.h"

namespace vesk::host {

inline constexpr MessageKind kCaptureCut{"capture-cut", Severity::kError, kExitFindings};
inline constexpr MessageKind kCaptureDamaged{"capture-damaged", Severity::kError, kExitFindings};
inline constexpr MessageKind kPacketDamaged{"packet-damaged", Severity::kError, kExitFindings};
inline constexpr MessageKind kPacketTooLarge{"packet-too-large", Severity::kWarning, kExitOk};

/// Whether the USB reports of captures with this link type can be read.
bool isUsbLinkType(int linkType);

/// Gives the packets of the interfaces whose link type is one of ours. Packets of all others are numbered and counted.
class CaptureFile {
 public:
  /// Reads the file header. Damage of the file becomes a message to `sink`, and the packets end there.
  static std::unique_ptr<CaptureFile> open(ByteSource &source, ReadSink &sink);
  CaptureFile(ByteSource &source, ReadSink &sink) : source_(source), sink_(sink) {}
  CaptureFile(const CaptureFile &) = delete;
  CaptureFile &operator=(const CaptureFile &) = delete;
  virtual ~CaptureFile() = default;

  /// False at the end. Throws InputError.
  virtual bool next(CapturedPacket &packet) = 0;

  /// Records so far that packet analysers would number.
  std::uint64_t packets() const { return packets_; }
  /// The link types that are not ours, with the packets of each.
  const std::map<int, std::uint64_t> &otherLinkTypes() const { return others_; }
  bool hasUsb() const { return hasUsb_; }

 protected:
  /// Larger records are passed over: no USB report is near that size, and libpcap would need memory for them.
  static constexpr std::size_t kMostRecord = std::size_t{512} << 10;

  void tell(const MessageKind &kind, Place place, std::string text);
  /// `size` bytes at the front of the source, or nothing after saying that the file was cut.
  std::string_view whole(std::uint64_t size);
  /// Takes a record that is not read; false after saying that the file ends within it.
  bool passOver(std::uint64_t size);
  /// The same for a packet, which is counted and told.
  bool passOverPacket(std::uint64_t size);
  void tellCut(std::uint64_t claimed, std::uint64_t present);

  ByteSource &source_;
  ReadSink &sink_;
  std::uint64_t packets_ = 0;
  std::map<int, std::uint64_t> others_;
  bool hasUsb_ = false;
};

}  // namespace vesk::host
