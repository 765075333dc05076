// The memory behind DisplayLines.
#include "values/DisplayLines.h"

#include <algorithm>
#include <utility>

DisplayLines::DisplayLines(std::size_t lines, std::size_t bytes) {
  allocate(lines, bytes);
}

DisplayLines::DisplayLines(DisplayLines &&other) noexcept
    : memory_(std::move(other.memory_)),
      ends_(std::exchange(other.ends_, nullptr)),
      text_(std::exchange(other.text_, nullptr)),
      size_(std::exchange(other.size_, 0)),
      lineRoom_(std::exchange(other.lineRoom_, 0)),
      used_(std::exchange(other.used_, 0)),
      textRoom_(std::exchange(other.textRoom_, 0)) {}

DisplayLines &DisplayLines::operator=(DisplayLines &&other) noexcept {
  DisplayLines taken(std::move(other));
  std::swap(memory_, taken.memory_);
  std::swap(ends_, taken.ends_);
  std::swap(text_, taken.text_);
  std::swap(size_, taken.size_);
  std::swap(lineRoom_, taken.lineRoom_);
  std::swap(used_, taken.used_);
  std::swap(textRoom_, taken.textRoom_);
  return *this;
}

std::string_view DisplayLines::operator[](std::size_t index) const noexcept {
  const std::size_t begin = index == 0 ? 0 : ends_[index - 1] + 1;
  return {text_ + begin, ends_[index] - begin};
}

bool operator==(const DisplayLines &a, const DisplayLines &b) noexcept {
  return std::equal(a.ends_, a.ends_ + a.size_, b.ends_, b.ends_ + b.size_) && a.text() == b.text();
}

/// New memory for both; what it is filled with is the caller's business.
void DisplayLines::allocate(std::size_t lines, std::size_t bytes) {
  memory_ = std::make_unique_for_overwrite<std::byte[]>(lines * sizeof(std::size_t) + bytes);
  ends_ = reinterpret_cast<std::size_t *>(memory_.get());
  text_ = reinterpret_cast<char *>(ends_ + lines);
  lineRoom_ = lines;
  textRoom_ = bytes;
}

void DisplayLines::grow(std::size_t bytes, std::size_t lines) {
  DisplayLines larger(std::max(lineRoom_ * 2, size_ + lines), std::max(textRoom_ * 2, used_ + bytes));
  std::copy_n(ends_, size_, larger.ends_);
  std::copy_n(text_, used_, larger.text_);
  larger.size_ = size_;
  larger.used_ = used_;
  *this = std::move(larger);
}
