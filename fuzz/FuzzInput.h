// Takes numbers from the front of a fuzzer's bytes; what is left is the report or the file.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace fuzz {

class FuzzInput {
 public:
  FuzzInput(const std::uint8_t *data, std::size_t size) : rest_(reinterpret_cast<const char *>(data), size) {}

  /// The next number; what is missing at the end counts as zero.
  template <class Number>
  Number take() {
    Number number{};
    const std::size_t size = std::min(sizeof(number), rest_.size());
    std::memcpy(&number, rest_.data(), size);
    rest_.remove_prefix(size);
    return number;
  }
  std::string_view rest() const { return rest_; }

 private:
  std::string_view rest_;
};

}  // namespace fuzz
