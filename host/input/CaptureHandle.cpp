// A stream of our own under libpcap's offline reader.
#include "host/input/CaptureHandle.h"

#include <stdio_ext.h>

#include <cerrno>
#include <cstring>

namespace vesk::host {

ssize_t CaptureHandle::give(void *self, char *out, std::size_t size) {
  auto &handle = *static_cast<CaptureHandle *>(self);
  if (handle.first_.empty()) std::swap(handle.first_, handle.second_);
  const std::size_t count = handle.first_.copy(out, size);
  handle.first_.remove_prefix(count);
  return static_cast<ssize_t>(count);
}

CaptureHandle::CaptureHandle(std::string_view head) : first_(head) {
  // It keeps its buffer, without which the C library reads a stream of this kind byte by byte.
  stream_ = fopencookie(this, "rb", {&CaptureHandle::give, nullptr, nullptr, nullptr});
  if (stream_ == nullptr) {
    error_ = std::strerror(errno);
    return;
  }
  __fsetlocking(stream_, FSETLOCKING_BYCALLER);  // nobody else has it, and locks were a tenth of the reading
  char reason[PCAP_ERRBUF_SIZE] = {};
  handle_.reset(pcap_fopen_offline_with_tstamp_precision(stream_, PCAP_TSTAMP_PRECISION_NANO, reason));
  first_ = {};
  if (handle_ != nullptr) return;
  error_ = reason;
  std::fclose(stream_);
}

bool CaptureHandle::read(std::string_view first, std::string_view second, CapturedPacket &packet) {
  constexpr std::uint64_t kSecond = 1'000'000'000;
  first_ = first;
  second_ = second;
  pcap_pkthdr *header = nullptr;
  const unsigned char *bytes = nullptr;
  error_.clear();
  if (pcap_next_ex(handle_.get(), &header, &bytes) != 1) {
    error_ = pcap_geterr(handle_.get());
    // What libpcap left of the record must not be taken for the next one.
    __fpurge(stream_);
    std::clearerr(stream_);
    if (error_.empty()) error_ = "the record holds no packet";
    return false;
  }
  // Unsigned, because a damaged time may lie anywhere.
  packet.timeNs = static_cast<std::int64_t>(static_cast<std::uint64_t>(header->ts.tv_sec) * kSecond +
                                            static_cast<std::uint64_t>(header->ts.tv_usec));
  packet.bytes = {reinterpret_cast<const char *>(bytes), header->caplen};
  return true;
}

}  // namespace vesk::host
