// libpcap over bytes that are handed to it one packet at a time.
#pragma once

#include <pcap/pcap.h>

#include <cstdint>
#include <cstdio>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace vesk::host {

/// One packet as libpcap gives it: the link-layer header in this machine's byte order (USBPcap: always little-endian).
struct CapturedPacket {
  std::uint64_t number = 0;            // as packet analysers count, from 1
  std::optional<std::int64_t> timeNs;  // since 1970
  unsigned interface = 0;              // of the interfaces of one file, each has a number of its own
  int linkType = 0;
  std::string_view bytes;  // until the next packet
};

/// Reads one interface of a capture. Whoever uses it finds the borders of the records and hands over whole ones, so
/// libpcap never waits for bytes, never meets the end of a file in the middle of a record, and is never asked to hold
/// one of a size that nobody has checked. All else that differs between captures (byte orders, units and offsets of
/// time, padding and options) is libpcap's work.
class CaptureHandle {
 public:
  /// `head`: a file header, or a section header and an interface description. error() says whether libpcap took it.
  explicit CaptureHandle(std::string_view head);
  CaptureHandle(const CaptureHandle &) = delete;
  CaptureHandle &operator=(const CaptureHandle &) = delete;

  /// Fills `packet`'s time and bytes from one whole record, given in two pieces. False where libpcap refuses it; the
  /// next record can be read all the same. REQUIRES: the constructor left no error.
  bool read(std::string_view first, std::string_view second, CapturedPacket &packet);

  /// Why libpcap refused what it was given last; empty where it did not.
  const std::string &error() const { return error_; }

 private:
  struct Close {
    void operator()(pcap_t *handle) const { pcap_close(handle); }
  };
  static ssize_t give(void *self, char *out, std::size_t size);

  std::string_view first_, second_;  // what libpcap may read
  std::FILE *stream_ = nullptr;      // belongs to handle_ once that is open
  std::unique_ptr<pcap_t, Close> handle_;
  std::string error_;
};

}  // namespace vesk::host
