// Splits a pcapng file into blocks and gives each USB interface a libpcap handle of its own. libpcap refuses a file in
// which interfaces differ in link type or snapshot length, or sections in byte order; such files come out of every
// capture of more than one interface, and of `cat`.
#include "host/input/PcapngFile.h"

#include <cstring>

#include "host/input/CaptureBytes.h"

namespace vesk::host {

namespace {

enum BlockType : std::uint32_t {
  kSectionHeader = 0x0A0D0D0A,
  kInterfaceDescription = 1,
  kPacketBlock = 2,
  kSimplePacket = 3,
  kEnhancedPacket = 6,
  kJournalEntry = 9,  // packet analysers number these too
};

constexpr std::uint64_t kSmallestBlock = 12;  // type, length, and the length once more
constexpr std::size_t kSectionHeaderSize = 28;
constexpr std::size_t kLeastInterfaceBlock = 20, kMostInterfaceBlock = 64 << 10;
constexpr std::size_t kMostInterfaces = 65536, kMostHandles = 64;  // in a section
constexpr std::size_t kPacketHeadSize = 12;                        // type, length, and the interface's number

class PcapngFile : public CaptureFile {
 public:
  using CaptureFile::CaptureFile;

  bool next(CapturedPacket &packet) override {
    while (good_ && !source_.peek(1).empty()) {
      if (nextBlock(packet)) return true;
    }
    return false;
  }

 private:
  struct Interface {
    int linkType = 0;
    unsigned number = 0;                    // in the file
    std::unique_ptr<CaptureHandle> handle;  // only where the link type is one of ours
  };

  bool nextBlock(CapturedPacket &packet);
  bool beginSection();
  void addInterface(std::string_view block);
  bool readPacket(std::uint32_t type, std::string_view block, CapturedPacket &packet);
  const Interface *interfaceOf(std::uint32_t type, std::string_view block) const;
  bool damaged(std::string text) {
    tell(kCaptureDamaged, Place::offset(source_.offset()), std::move(text) + "; nothing behind it was read");
    return good_ = false;
  }

  bool good_ = true;
  bool bigEndian_ = false;
  std::string sectionHeader_;
  std::vector<Interface> interfaces_;  // of this section
  unsigned interfacesBefore_ = 0;      // in earlier sections
  std::size_t handles_ = 0;            // of this section
};

bool isPacket(std::uint32_t type) {
  return type == kEnhancedPacket || type == kPacketBlock || type == kSimplePacket;
}

bool PcapngFile::nextBlock(CapturedPacket &packet) {
  const std::string_view head = whole(8);
  if (head.empty()) return good_ = false;
  // A section header's type reads the same in both byte orders, and what follows it tells which one holds.
  const bool isSection = number32(head, 0, false) == kSectionHeader;
  if (isSection && !beginSection()) return false;
  const std::uint32_t type = isSection ? kSectionHeader : number32(source_.peek(8), 0, bigEndian_);
  const std::uint64_t size = number32(source_.peek(8), 4, bigEndian_);
  if (size < (isSection ? kSectionHeaderSize : kSmallestBlock) || size % 4 != 0)
    return damaged("a block claims a length of " + std::to_string(size) + " bytes, which no block has");
  if (type == kInterfaceDescription && (size < kLeastInterfaceBlock || size > kMostInterfaceBlock))
    return damaged("an interface is described in " + std::to_string(size) + " bytes");
  if (isPacket(type) && size > kMostRecord) {
    good_ = passOverPacket(size);
    return false;
  }
  if (!isPacket(type) && type != kInterfaceDescription) {
    if (good_ = passOver(size); good_ && type == kJournalEntry) ++packets_;
    return false;
  }
  const std::string_view block = whole(size);
  if (block.empty()) return good_ = false;
  if (number32(block, size - 4, bigEndian_) != size)
    return damaged("a block's two lengths differ: " + std::to_string(size) + " and " +
                   std::to_string(number32(block, size - 4, bigEndian_)));
  bool found = false;
  if (type == kInterfaceDescription) {
    addInterface(block);
  } else {
    ++packets_;
    found = readPacket(type, block, packet);
  }
  source_.skip(size);
  return found;
}

bool PcapngFile::beginSection() {
  const std::string_view head = whole(kSectionHeaderSize - 4);
  if (head.empty()) return good_ = false;
  const std::string_view magic = head.substr(8, 4);
  if (magic != "\x4d\x3c\x2b\x1a" && magic != "\x1a\x2b\x3c\x4d")
    return damaged("a section does not say its byte order");
  bigEndian_ = magic[0] == '\x1a';
  // The handles see a section header without options, for libpcap has a limit of its own for its size.
  const char length[] = {kSectionHeaderSize, 0, 0, 0}, lengthBig[] = {0, 0, 0, kSectionHeaderSize};
  const std::string_view size(bigEndian_ ? lengthBig : length, 4);
  sectionHeader_ = std::string(head.substr(0, 4)).append(size).append(head.substr(8)).append(size);
  interfacesBefore_ += static_cast<unsigned>(interfaces_.size());
  interfaces_.clear();
  handles_ = 0;
  return true;
}

void PcapngFile::addInterface(std::string_view block) {
  if (interfaces_.size() == kMostInterfaces) {
    damaged("more than " + std::to_string(kMostInterfaces) + " interfaces in one section");
    return;
  }
  Interface &added = interfaces_.emplace_back();
  added.number = interfacesBefore_ + static_cast<unsigned>(interfaces_.size()) - 1;
  added.linkType = number16(block, 8, bigEndian_);
  if (!isUsbLinkType(added.linkType)) {
    others_[added.linkType] += 0;
    return;
  }
  hasUsb_ = true;
  if (handles_ == kMostHandles) {
    tell(kCaptureDamaged, Place::offset(source_.offset()),
         "more than " + std::to_string(kMostHandles) + " USB interfaces in one section; this one is not read");
    return;
  }
  ++handles_;
  added.handle = std::make_unique<CaptureHandle>(sectionHeader_ + std::string(block));
  if (added.handle->error().empty()) return;
  tell(kCaptureDamaged, Place::offset(source_.offset()),
       "interface " + std::to_string(interfaces_.size() - 1) + " cannot be read: " + added.handle->error());
  added.handle.reset();
}

const PcapngFile::Interface *PcapngFile::interfaceOf(std::uint32_t type, std::string_view block) const {
  std::size_t index = 0;
  if (type == kEnhancedPacket && block.size() >= 16) index = number32(block, 8, bigEndian_);
  if (type == kPacketBlock && block.size() >= 16) index = number16(block, 8, bigEndian_);
  return index < interfaces_.size() ? &interfaces_[index] : nullptr;
}

bool PcapngFile::readPacket(std::uint32_t type, std::string_view block, CapturedPacket &packet) {
  const Interface *from = interfaceOf(type, block);
  if (from == nullptr) {
    tell(kPacketDamaged, Place::packet(packets_), "belongs to an interface that the file does not describe; not read");
    return false;
  }
  if (from->handle == nullptr) {
    if (!isUsbLinkType(from->linkType)) ++others_[from->linkType];
    return false;
  }
  // The handle knows one interface, which is its number 0.
  char head[kPacketHeadSize];
  std::memcpy(head, block.data(), sizeof(head));
  if (type == kEnhancedPacket) std::memset(head + 8, 0, 4);
  if (type == kPacketBlock) std::memset(head + 8, 0, 2);
  packet.number = packets_;
  packet.interface = from->number;
  packet.linkType = from->linkType;
  if (!from->handle->read({head, sizeof(head)}, block.substr(sizeof(head)), packet)) {
    tell(kPacketDamaged, Place::packet(packets_), from->handle->error());
    return false;
  }
  if (type == kSimplePacket) packet.timeNs.reset();  // has none
  return true;
}

}  // namespace

std::unique_ptr<CaptureFile> openPcapng(ByteSource &source, ReadSink &sink) {
  return std::make_unique<PcapngFile>(source, sink);
}

}  // namespace vesk::host
