// An input as a stream of bytes that can be looked at before it is taken, in bounded memory.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace vesk::host {

/// An input that cannot be opened or read. what() is for people and does not name the input.
class InputError : public std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// Where bytes come from.
class RawBytes {
 public:
  virtual ~RawBytes() = default;
  /// Up to `size` bytes into `out`, at least one, or 0 at the end. Throws InputError.
  virtual std::size_t read(char *out, std::size_t size) = 0;
};

class ByteSource {
 public:
  /// How far peek() can look.
  static constexpr std::size_t kMostAhead = std::size_t{4} << 20;

  /// Called after each read with the bytes that were read so far and how many there are in all, where that is known;
  /// both as they lie in the file, packed or not.
  using Watch = std::function<void(std::uint64_t read, std::optional<std::uint64_t> size)>;

  /// Opens a file, or standard input for "-"; gzip is unpacked on the way. Throws InputError.
  static std::unique_ptr<ByteSource> open(const std::string &path, Watch watch = {});
  ByteSource(std::string name, std::unique_ptr<RawBytes> raw);
  /// Reads from a text of its own.
  ByteSource(std::string name, std::string bytes);
  ~ByteSource();

  /// As the user named it; "(standard input)" for "-".
  const std::string &name() const { return name_; }
  /// Bytes that were taken so far, which is the offset of the next one.
  std::uint64_t offset() const { return taken_; }

  /// All bytes that are at hand, at least `wanted` of them unless the input ends before, or cannot be read any further.
  /// REQUIRES: wanted <= kMostAhead. The view lives until the next call of anything but offset().
  std::string_view peek(std::size_t wanted = 1);
  /// At the end: throws InputError where it is none, because the rest could not be read.
  void checkEnd() const;
  /// Takes bytes that peek() has shown.
  void skip(std::size_t size);

  /// The next line without its line end (LF or CR LF), and takes it; false at the end. A last line without a line end
  /// counts, unless the input cannot be read any further. A line longer than kMostAhead - 1 ends with InputError.
  bool nextLine(std::string_view &line);

 private:
  std::string name_;
  std::unique_ptr<RawBytes> raw_;
  std::vector<char> buffer_;
  std::size_t begin_ = 0, end_ = 0;  // what is at hand
  bool atEnd_ = false;
  std::string failure_;  // why nothing more could be read
  std::uint64_t taken_ = 0;
};

}  // namespace vesk::host
