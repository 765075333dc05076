// The display lines of one report: one block of text in which every line ends in a line feed, and where each line ends.
#pragma once

#include <cstddef>
#include <cstring>
#include <memory>
#include <string_view>

#include "values/PrintfFormat.h"

/// An ordered list of lines. The borders are kept beside the text and never searched for, because a version text may
/// itself hold a line feed. Move-only; the views that it hands out live as long as it does and is not added to.
class DisplayLines {
 public:
  /// Iterates over the lines as std::string_view.
  class Iterator;

  DisplayLines() = default;
  /// Room for `lines` lines and `bytes` bytes of text, in one allocation; both grow when that was too little.
  DisplayLines(std::size_t lines, std::size_t bytes);
  DisplayLines(DisplayLines &&other) noexcept;
  DisplayLines &operator=(DisplayLines &&other) noexcept;

  std::size_t size() const noexcept { return size_; }
  bool empty() const noexcept { return size_ == 0; }
  /// Line `index` without its line end. REQUIRES: index < size().
  std::string_view operator[](std::size_t index) const noexcept;
  Iterator begin() const noexcept;
  Iterator end() const noexcept;
  /// All lines, each followed by a line feed.
  std::string_view text() const noexcept { return {text_, used_}; }

  // What is appended must not be a view of this object.

  /// Appends one line as it stands.
  void add(std::string_view line) {
    char *const out = room(line.size() + 1, 1);
    if (!line.empty()) std::memcpy(out, line.data(), line.size());
    endLine(out + line.size());
  }

  /// Appends one line made by a printf format: line<"%20s: %i">("PSE", 1).
  template <vesk::FormatText F, class... Args>
  void line(const Args &...args) {
    endLine(vesk::Format<F>::write(room(vesk::Format<F>::room(args...) + 1, 1), args...));
  }

  /// Appends `count` lines of at most `bytes` bytes each: write(out, i) writes line i at `out` and returns its end. The
  /// way for tables, because room is looked for once, and where the text ends stays in a register.
  template <class Write>
  void rows(std::size_t count, std::size_t bytes, Write write) {
    char *out = room(count * (bytes + 1), count);
    char *const text = text_;
    std::size_t *const ends = ends_ + size_;
    for (std::size_t i = 0; i < count; ++i) {
      out = write(out, i);
      ends[i] = static_cast<std::size_t>(out - text);
      *out++ = '\n';
    }
    size_ += count;
    used_ = static_cast<std::size_t>(out - text);
  }

  friend bool operator==(const DisplayLines &a, const DisplayLines &b) noexcept;

 private:
  char *room(std::size_t bytes, std::size_t lines) {
    if (textRoom_ - used_ < bytes || lineRoom_ - size_ < lines) grow(bytes, lines);
    return text_ + used_;
  }
  void endLine(char *end) {
    *end = '\n';
    const auto at = static_cast<std::size_t>(end - text_);
    ends_[size_++] = at;
    used_ = at + 1;
  }
  void allocate(std::size_t lines, std::size_t bytes);
  void grow(std::size_t bytes, std::size_t lines);

  std::unique_ptr<std::byte[]> memory_;  // of both; not zeroed first, because it is about to be written
  std::size_t *ends_ = nullptr;          // where the line feed behind each line stands
  char *text_ = nullptr;
  std::size_t size_ = 0, lineRoom_ = 0;
  std::size_t used_ = 0, textRoom_ = 0;
};

class DisplayLines::Iterator {
 public:
  using value_type = std::string_view;
  using difference_type = std::ptrdiff_t;

  Iterator() = default;
  Iterator(const DisplayLines *lines, std::size_t index) noexcept : lines_(lines), index_(index) {}
  std::string_view operator*() const noexcept { return (*lines_)[index_]; }
  Iterator &operator++() noexcept {
    ++index_;
    return *this;
  }
  Iterator operator++(int) noexcept {
    Iterator before = *this;
    ++index_;
    return before;
  }
  friend bool operator==(const Iterator &, const Iterator &) = default;

 private:
  const DisplayLines *lines_ = nullptr;
  std::size_t index_ = 0;
};

inline DisplayLines::Iterator DisplayLines::begin() const noexcept {
  return {this, 0};
}
inline DisplayLines::Iterator DisplayLines::end() const noexcept {
  return {this, size()};
}
