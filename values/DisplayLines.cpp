// The text arena behind DisplayLines.
#include "values/DisplayLines.h"

#include <algorithm>
#include <utility>

DisplayLines::DisplayLines(std::size_t lines, std::size_t bytes)
    : text_(std::make_unique_for_overwrite<char[]>(bytes)), capacity_(bytes) {
  ends_.reserve(lines);
}

DisplayLines::DisplayLines(DisplayLines &&other) noexcept
    : text_(std::move(other.text_)),
      used_(std::exchange(other.used_, 0)),
      capacity_(std::exchange(other.capacity_, 0)),
      ends_(std::exchange(other.ends_, {})) {}

DisplayLines &DisplayLines::operator=(DisplayLines &&other) noexcept {
  text_ = std::move(other.text_);
  used_ = std::exchange(other.used_, 0);
  capacity_ = std::exchange(other.capacity_, 0);
  ends_ = std::exchange(other.ends_, {});
  return *this;
}

std::string_view DisplayLines::operator[](std::size_t index) const noexcept {
  const std::size_t begin = index == 0 ? 0 : ends_[index - 1] + 1;
  return {text_.get() + begin, ends_[index] - begin};
}

void DisplayLines::add(std::string_view line) {
  char *out = room(line.size() + 1);
  endLine(std::copy(line.begin(), line.end(), out));
}

void DisplayLines::grow(std::size_t bytes) {
  const std::size_t capacity = std::max(capacity_ * 2, used_ + bytes);
  auto text = std::make_unique_for_overwrite<char[]>(capacity);
  std::copy_n(text_.get(), used_, text.get());
  text_ = std::move(text);
  capacity_ = capacity;
}
