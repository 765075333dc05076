// A growing block of bytes to be written, filled in place.
#pragma once

#include <algorithm>
#include <cstring>
#include <memory>
#include <string_view>

namespace vesk::host {

class OutputBuffer {
 public:
  std::string_view text() const { return {bytes_.get(), size_}; }
  std::size_t size() const { return size_; }
  void clear() { size_ = 0; }

  /// `bytes` writable bytes at the end, to be taken by advanceTo().
  char *room(std::size_t bytes) {
    if (capacity_ - size_ < bytes) grow(bytes);
    return bytes_.get() + size_;
  }
  /// The same behind `end`, up to where the room that was taken is filled already; returns where that lies now.
  char *room(char *end, std::size_t bytes) {
    if (static_cast<std::size_t>(bytes_.get() + capacity_ - end) < bytes) {
      advanceTo(end);
      end = room(bytes);
    }
    return end;
  }
  void advanceTo(const char *end) { size_ = static_cast<std::size_t>(end - bytes_.get()); }

  void append(std::string_view text) {
    char *out = room(text.size());
    if (!text.empty()) std::memcpy(out, text.data(), text.size());
    size_ += text.size();
  }
  void append(char c) {
    *room(1) = c;
    ++size_;
  }

 private:
  void grow(std::size_t bytes) {
    const std::size_t capacity = std::max(capacity_ * 2, size_ + bytes + 4096);
    auto larger = std::make_unique_for_overwrite<char[]>(capacity);
    if (size_ != 0) std::memcpy(larger.get(), bytes_.get(), size_);
    bytes_ = std::move(larger);
    capacity_ = capacity;
  }

  std::unique_ptr<char[]> bytes_;
  std::size_t size_ = 0;
  std::size_t capacity_ = 0;
};

}  // namespace vesk::host
