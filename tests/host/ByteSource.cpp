// Bytes that can be looked at before they are taken: files, memory, gzip, lines.
#include "host/input/ByteSource.h"

#include <gtest/gtest.h>
#include <unistd.h>
#include <zlib.h>

#include <filesystem>
#include <fstream>

namespace vesk::host {
namespace {

/// Gives one byte at a time, as a slow pipe does.
class Dripping : public RawBytes {
 public:
  explicit Dripping(std::string bytes) : bytes_(std::move(bytes)) {}
  std::size_t read(char *out, std::size_t) override {
    if (at_ == bytes_.size()) return 0;
    *out = bytes_[at_++];
    return 1;
  }

 private:
  std::string bytes_;
  std::size_t at_ = 0;
};

std::string takeAll(ByteSource &source) {
  std::string all;
  for (std::string_view ahead; !(ahead = source.peek()).empty(); source.skip(ahead.size())) all += ahead;
  source.checkEnd();
  return all;
}

std::string packed(const std::string &bytes) {
  z_stream stream{};
  EXPECT_EQ(deflateInit2(&stream, 6, Z_DEFLATED, 15 + 16, 8, Z_DEFAULT_STRATEGY), Z_OK);
  std::string out(compressBound(bytes.size()) + 64, '\0');
  stream.next_in = reinterpret_cast<Bytef *>(const_cast<char *>(bytes.data()));
  stream.avail_in = static_cast<uInt>(bytes.size());
  stream.next_out = reinterpret_cast<Bytef *>(out.data());
  stream.avail_out = static_cast<uInt>(out.size());
  EXPECT_EQ(deflate(&stream, Z_FINISH), Z_STREAM_END);
  out.resize(stream.total_out);
  deflateEnd(&stream);
  return out;
}

class FileOnDisk {
 public:
  explicit FileOnDisk(const std::string &bytes) : path_(testing::TempDir() + "/source." + std::to_string(::getpid())) {
    std::ofstream(path_, std::ios::binary) << bytes;
  }
  ~FileOnDisk() { std::filesystem::remove(path_); }
  FileOnDisk(const FileOnDisk &) = delete;
  FileOnDisk &operator=(const FileOnDisk &) = delete;
  const std::string &path() const { return path_; }

 private:
  std::string path_;
};

std::string pattern(std::size_t size) {
  std::string bytes(size, '\0');
  for (std::size_t i = 0; i < size; ++i) bytes[i] = static_cast<char>(i * 2654435761u >> 13);
  return bytes;
}

TEST(ByteSource, ShowsWhatItGivesAndCountsWhatIsTaken) {
  ByteSource source("name", std::make_unique<Dripping>("abcdef"));
  EXPECT_EQ(source.peek(3).substr(0, 3), "abc");
  EXPECT_EQ(source.offset(), 0u);
  source.skip(2);
  EXPECT_EQ(source.offset(), 2u);
  EXPECT_EQ(source.peek(100), "cdef");
  source.skip(4);
  EXPECT_EQ(source.peek(1), "");
}

TEST(ByteSource, LooksFarAheadFromEveryPlace) {
  const std::string bytes = pattern(3'000'000);
  ByteSource source("name", bytes);
  source.peek(1);
  source.skip(200'001);
  EXPECT_EQ(source.peek(2'000'000).substr(0, 2'000'000), std::string_view(bytes).substr(200'001, 2'000'000));
  EXPECT_EQ(takeAll(source), bytes.substr(200'001));
}

TEST(ByteSource, CutsLinesAtLineFeedsAndTakesCarriageReturnsOff) {
  ByteSource source("name", std::make_unique<Dripping>("one\r\n\ntwo\rthree\nlast"));
  std::vector<std::string> lines;
  for (std::string_view line; source.nextLine(line);) lines.emplace_back(line);
  EXPECT_EQ(lines, (std::vector<std::string>{"one", "", "two\rthree", "last"}));
}

TEST(ByteSource, ReadsNoLineBeyondItsBound) {
  ByteSource good("name", std::string(ByteSource::kMostAhead - 1, 'x') + "\n");
  std::string_view line;
  EXPECT_TRUE(good.nextLine(line));
  EXPECT_EQ(line.size(), ByteSource::kMostAhead - 1);
  ByteSource bad("name", std::string(ByteSource::kMostAhead + 1, 'x'));
  EXPECT_THROW(bad.nextLine(line), InputError);
}

TEST(ByteSource, UnpacksGzipMembersOneBehindTheOther) {
  const std::string first = pattern(700'000), second = "and more";
  const FileOnDisk file(packed(first) + packed(second));
  EXPECT_EQ(takeAll(*ByteSource::open(file.path())), first + second);
}

TEST(ByteSource, NamesGzipThatIsCutOrDamaged) {
  const std::string whole = packed(pattern(100'000));
  for (const std::size_t size : {std::size_t{3}, std::size_t{10}, whole.size() / 2, whole.size() - 1}) {
    const FileOnDisk file(whole.substr(0, size));
    EXPECT_THROW(takeAll(*ByteSource::open(file.path())), InputError) << size;
  }
  std::string damaged = whole;
  damaged[whole.size() / 2] = static_cast<char>(damaged[whole.size() / 2] ^ 0x40);
  const FileOnDisk file(damaged);
  EXPECT_THROW(takeAll(*ByteSource::open(file.path())), InputError);
  const FileOnDisk garbage(whole + "garbage");
  EXPECT_THROW(takeAll(*ByteSource::open(garbage.path())), InputError);
}

TEST(ByteSource, GivesWhatCameBeforeTheGzipDataFailed) {
  std::string lines;
  for (int i = 0; i < 3000; ++i) lines += "line " + std::to_string(i) + "\n";
  const std::string whole = packed(lines);
  for (const std::string &bytes : {whole + "garbage", whole.substr(0, whole.size() - 100)}) {
    const FileOnDisk file(bytes);
    const auto source = ByteSource::open(file.path());
    std::string read;
    for (std::string_view line; source->nextLine(line);) read += std::string(line) + "\n";
    EXPECT_GT(read.size(), lines.size() / 2);
    EXPECT_TRUE(lines.starts_with(read));  // whole lines only
    EXPECT_THROW(source->checkEnd(), InputError);
  }
}

TEST(ByteSource, TakesZerosBehindGzipDataForPadding) {
  const std::string first = pattern(70'000);
  const FileOnDisk file(packed(first) + std::string(1000, '\0'));
  EXPECT_EQ(takeAll(*ByteSource::open(file.path())), first);
  const FileOnDisk between(packed(first) + std::string(100, '\0') + packed("more"));
  EXPECT_EQ(takeAll(*ByteSource::open(between.path())), first + "more");
}

TEST(ByteSource, SaysWhyAFileCannotBeOpened) {
  EXPECT_THROW(ByteSource::open("/no/such/file"), InputError);
  EXPECT_THROW(ByteSource::open("/"), InputError);
}

TEST(ByteSource, TellsItsWatchHowFarItIs) {
  const FileOnDisk file(pattern(1'000'000));
  std::uint64_t last = 0, size = 0;
  const auto source = ByteSource::open(file.path(), [&](std::uint64_t read, std::optional<std::uint64_t> all) {
    EXPECT_GE(read, last);
    last = read;
    size = all.value_or(0);
  });
  takeAll(*source);
  EXPECT_EQ(last, 1'000'000u);
  EXPECT_EQ(size, 1'000'000u);
}

}  // namespace
}  // namespace vesk::host
