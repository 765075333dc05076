// Buffered reading in large pieces from a file, standard input, or memory; gzip on the way.
#include "host/input/ByteSource.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <zlib.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace vesk::host {

namespace {

constexpr std::size_t kPiece = std::size_t{256} << 10;  // larger ones were not faster

class FileBytes : public RawBytes {
 public:
  FileBytes(int fd, ByteSource::Watch watch) : fd_(fd), watch_(std::move(watch)) {
    struct stat status {};
    if (::fstat(fd, &status) == 0 && S_ISREG(status.st_mode)) size_ = static_cast<std::uint64_t>(status.st_size);
  }
  ~FileBytes() override {
    if (fd_ != STDIN_FILENO) ::close(fd_);
  }
  FileBytes(const FileBytes &) = delete;
  FileBytes &operator=(const FileBytes &) = delete;

  std::size_t read(char *out, std::size_t size) override {
    ssize_t got = 0;
    while ((got = ::read(fd_, out, size)) < 0)
      if (errno != EINTR) throw InputError(std::strerror(errno));
    read_ += static_cast<std::uint64_t>(got);
    if (watch_) watch_(read_, size_);
    return static_cast<std::size_t>(got);
  }

 private:
  int fd_;
  ByteSource::Watch watch_;
  std::uint64_t read_ = 0;
  std::optional<std::uint64_t> size_;
};

class MemoryBytes : public RawBytes {
 public:
  explicit MemoryBytes(std::string bytes) : bytes_(std::move(bytes)) {}
  std::size_t read(char *out, std::size_t size) override {
    const std::size_t count = std::min(size, bytes_.size() - at_);
    std::memcpy(out, bytes_.data() + at_, count);
    at_ += count;
    return count;
  }

 private:
  std::string bytes_;
  std::size_t at_ = 0;
};

/// Unpacks a gzip stream, members one after the other, in fixed memory.
class GzipBytes : public RawBytes {
 public:
  explicit GzipBytes(std::unique_ptr<ByteSource> packed) : packed_(std::move(packed)) {
    if (inflateInit2(&stream_, 15 + 16) != Z_OK) throw InputError("zlib could not be started");
  }
  ~GzipBytes() override { inflateEnd(&stream_); }
  GzipBytes(const GzipBytes &) = delete;
  GzipBytes &operator=(const GzipBytes &) = delete;

  std::size_t read(char *out, std::size_t size) override {
    stream_.next_out = reinterpret_cast<Bytef *>(out);
    stream_.avail_out = static_cast<uInt>(size);
    while (stream_.avail_out == size && failure_.empty()) {
      const std::string_view input = insideMember_ ? packed_->peek() : nextMember();
      if (input.empty()) {
        packed_->checkEnd();
        if (insideMember_) throw InputError("the gzip data are cut off in the middle");
        return 0;
      }
      stream_.next_in = reinterpret_cast<Bytef *>(const_cast<char *>(input.data()));
      stream_.avail_in = static_cast<uInt>(input.size());
      insideMember_ = true;
      const int status = inflate(&stream_, Z_NO_FLUSH);
      packed_->skip(input.size() - stream_.avail_in);
      if (status == Z_STREAM_END) {
        insideMember_ = false;
        inflateReset(&stream_);
      } else if (status != Z_OK && status != Z_BUF_ERROR) {
        failure_ =
            std::string("the gzip data are damaged: ") + (stream_.msg != nullptr ? stream_.msg : "unknown error");
      }
    }
    if (stream_.avail_out == size) throw InputError(failure_);  // what was unpacked before comes first
    return size - stream_.avail_out;
  }

 private:
  /// What follows the zeros that may pad the file behind a member; empty at its end.
  std::string_view nextMember() {
    std::string_view input = packed_->peek();
    while (!input.empty() && input[0] == '\0') {
      packed_->skip(std::min(input.find_first_not_of('\0'), input.size()));
      input = packed_->peek();
    }
    return input;
  }

  std::unique_ptr<ByteSource> packed_;
  z_stream stream_{};
  bool insideMember_ = false;
  std::string failure_;
};

}  // namespace

std::unique_ptr<ByteSource> ByteSource::open(const std::string &path, Watch watch) {
  const bool standardInput = path == "-";
  const std::string name = standardInput ? "(standard input)" : path;
  int fd = STDIN_FILENO;
  if (!standardInput) {
    do fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    while (fd < 0 && errno == EINTR);
    if (fd < 0) throw InputError(std::strerror(errno));
  }
  auto source = std::make_unique<ByteSource>(name, std::make_unique<FileBytes>(fd, std::move(watch)));
  const std::string_view head = source->peek(2);
  if (head.empty()) source->checkEnd();
  if (!head.starts_with("\x1f\x8b")) return source;
  return std::make_unique<ByteSource>(name, std::make_unique<GzipBytes>(std::move(source)));
}

ByteSource::ByteSource(std::string name, std::unique_ptr<RawBytes> raw)
    : name_(std::move(name)), raw_(std::move(raw)), buffer_(kPiece) {}

ByteSource::ByteSource(std::string name, std::string bytes)
    : ByteSource(std::move(name), std::make_unique<MemoryBytes>(std::move(bytes))) {}

ByteSource::~ByteSource() = default;

std::string_view ByteSource::peek(std::size_t wanted) {
  while (end_ - begin_ < wanted && !atEnd_) {
    if (begin_ != 0 && buffer_.size() - begin_ < wanted) {
      std::memmove(buffer_.data(), buffer_.data() + begin_, end_ - begin_);
      end_ -= begin_;
      begin_ = 0;
    }
    if (end_ == buffer_.size()) buffer_.resize(std::min(buffer_.size() * 2, kMostAhead));
    std::size_t got = 0;
    try {
      got = raw_->read(buffer_.data() + end_, buffer_.size() - end_);
    } catch (const InputError &error) {  // what is at hand can be read all the same
      failure_ = error.what();
    }
    if (got == 0) atEnd_ = true;
    end_ += got;
  }
  return {buffer_.data() + begin_, end_ - begin_};
}

void ByteSource::checkEnd() const {
  if (!failure_.empty()) throw InputError(failure_);
}

void ByteSource::skip(std::size_t size) {
  begin_ += size;
  taken_ += size;
  if (begin_ == end_) begin_ = end_ = 0;
}

bool ByteSource::nextLine(std::string_view &line) {
  std::string_view ahead = peek();
  std::size_t searched = 0, lineFeed = 0;
  while ((lineFeed = ahead.find('\n', searched)) == std::string_view::npos) {
    searched = ahead.size();
    if (searched + 1 > kMostAhead) throw InputError("a line is longer than 4 MiB");
    ahead = peek(searched + 1);
    if (ahead.size() == searched) break;  // the end, without a line feed
  }
  if (lineFeed == std::string_view::npos && !failure_.empty()) {  // nobody knows what the rest of it said
    skip(ahead.size());
    return false;
  }
  if (ahead.empty()) return false;
  line = ahead.substr(0, lineFeed);
  skip(std::min(line.size() + 1, ahead.size()));
  if (line.ends_with('\r')) line.remove_suffix(1);
  return true;
}

}  // namespace vesk::host
