// What both capture formats share, and the older of them: pcap.
#include "host/input/CaptureFile.h"

#include <algorithm>

#include "host/input/CaptureBytes.h"
#include "host/input/PcapngFile.h"

namespace vesk::host {

namespace {

constexpr std::size_t kFileHeaderSize = 24, kRecordHeaderSize = 16;

class PcapFile : public CaptureFile {
 public:
  PcapFile(ByteSource &source, ReadSink &sink) : CaptureFile(source, sink) { good_ = readHeader(); }

  bool next(CapturedPacket &packet) override {
    while (good_ && !source_.peek(1).empty()) {
      if (nextRecord(packet)) return true;
    }
    return false;
  }

 private:
  bool readHeader() {
    const std::string_view head = whole(kFileHeaderSize);
    if (head.empty()) return false;
    bigEndian_ = head[0] == '\xa1';
    linkType_ = static_cast<int>(number32(head, 20, bigEndian_) & 0xFFFF);
    hasUsb_ = isUsbLinkType(linkType_);
    if (!hasUsb_) {
      others_[linkType_] = 0;
    } else if (handle_ = std::make_unique<CaptureHandle>(head); !handle_->error().empty()) {
      tell(kCaptureDamaged, Place::offset(0), handle_->error());
      return false;
    }
    source_.skip(kFileHeaderSize);
    return true;
  }

  bool nextRecord(CapturedPacket &packet) {
    const std::string_view header = whole(kRecordHeaderSize);
    if (header.empty()) return good_ = false;
    const std::uint64_t size = kRecordHeaderSize + std::uint64_t{number32(header, 8, bigEndian_)};
    if (!hasUsb_) {
      good_ = passOver(size);
      if (good_) others_[linkType_] = ++packets_;
      return false;
    }
    if (size > kMostRecord) {
      good_ = passOverPacket(size);
      return false;
    }
    const std::string_view record = whole(size);
    if (record.empty()) return good_ = false;
    ++packets_;
    packet.number = packets_;
    packet.linkType = linkType_;
    const bool taken = handle_->read(record, {}, packet);
    if (!taken) tell(kPacketDamaged, Place::packet(packets_), handle_->error());
    source_.skip(record.size());
    return taken;
  }

  std::unique_ptr<CaptureHandle> handle_;
  bool bigEndian_ = false;
  bool good_ = false;
  int linkType_ = 0;
};

}  // namespace

bool isUsbLinkType(int linkType) {
  return linkType == DLT_USB_LINUX || linkType == DLT_USB_LINUX_MMAPPED || linkType == DLT_USBPCAP;
}

std::unique_ptr<CaptureFile> CaptureFile::open(ByteSource &source, ReadSink &sink) {
  if (source.peek(4).starts_with("\x0a\x0d\x0d\x0a")) return openPcapng(source, sink);
  return std::make_unique<PcapFile>(source, sink);
}

void CaptureFile::tell(const MessageKind &kind, Place place, std::string text) {
  sink_.message({&kind, source_.name(), place, {}, std::move(text)});
}

std::string_view CaptureFile::whole(std::uint64_t size) {
  const std::string_view ahead = source_.peek(size);
  if (ahead.size() >= size) return ahead.substr(0, size);
  source_.checkEnd();
  tellCut(size, ahead.size());
  return {};
}

bool CaptureFile::passOver(std::uint64_t size) {
  for (std::uint64_t left = size; left != 0;) {
    const std::size_t count = std::min<std::uint64_t>(source_.peek(1).size(), left);
    if (count == 0) {
      source_.checkEnd();
      tellCut(size, size - left);
      return false;
    }
    source_.skip(count);
    left -= count;
  }
  return true;
}

bool CaptureFile::passOverPacket(std::uint64_t size) {
  if (!passOver(size)) return false;
  tell(kPacketTooLarge, Place::packet(++packets_),
       "a record of " + std::to_string(size) + " bytes was passed over; records of up to " +
           std::to_string(kMostRecord) + " are read, which is far above any report");
  return true;
}

void CaptureFile::tellCut(std::uint64_t claimed, std::uint64_t present) {
  tell(kCaptureCut, Place::offset(source_.offset()),
       "the capture was cut off behind packet " + std::to_string(packets_) + ": of a record of " +
           std::to_string(claimed) + " bytes only " + std::to_string(present) +
           " are there; what came before was read");
}

}  // namespace vesk::host
