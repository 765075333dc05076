// The display lines of one report: one block of text in which every line ends in a line feed, and where each line ends.
#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "values/PrintfFormat.h"

/// An ordered list of lines. The borders are kept beside the text and never searched for, because a version text may
/// itself hold a line feed. Move-only; the views that it hands out live as long as it does and is not added to.
class DisplayLines {
 public:
  /// Iterates over the lines as std::string_view.
  class Iterator;

  DisplayLines() = default;
  /// Room for `lines` lines and `bytes` bytes of text in one allocation each; both grow when that was too little.
  DisplayLines(std::size_t lines, std::size_t bytes);
  DisplayLines(DisplayLines &&other) noexcept;
  DisplayLines &operator=(DisplayLines &&other) noexcept;

  std::size_t size() const noexcept { return ends_.size(); }
  bool empty() const noexcept { return ends_.empty(); }
  /// Line `index` without its line end. REQUIRES: index < size().
  std::string_view operator[](std::size_t index) const noexcept;
  Iterator begin() const noexcept;
  Iterator end() const noexcept;
  /// All lines, each followed by a line feed.
  std::string_view text() const noexcept { return {text_.get(), used_}; }

  // What is appended must not be a view of this object.

  /// Appends one line as it stands.
  void add(std::string_view line);

  /// Appends one line made by a printf format: line<"%20s: %i">("PSE", 1).
  template <vesk::FormatText F, class... Args>
  void line(const Args &...args) {
    endLine(vesk::Format<F>::write(room(vesk::Format<F>::room(args...) + 1), args...));
  }

  /// For writers of long lines: `bytes` writable bytes at the end of the text, to be closed by endLine().
  char *room(std::size_t bytes) {
    if (capacity_ - used_ < bytes) grow(bytes);
    return text_.get() + used_;
  }
  /// Closes the line whose text ends at `end`. REQUIRES: one more byte of room there.
  void endLine(char *end) {
    *end = '\n';
    const auto size = static_cast<std::size_t>(end - text_.get());
    ends_.push_back(size);
    used_ = size + 1;
  }

  friend bool operator==(const DisplayLines &a, const DisplayLines &b) noexcept {
    return a.ends_ == b.ends_ && a.text() == b.text();
  }

 private:
  void grow(std::size_t bytes);

  std::unique_ptr<char[]> text_;  // not a std::string: room that is about to be written need not be zeroed first
  std::size_t used_ = 0;
  std::size_t capacity_ = 0;
  std::vector<std::size_t> ends_;  // where the line feed behind each line stands
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
