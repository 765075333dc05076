// One reader, two ways for its bytes to come.
#include "fuzz/ReadInput.h"

#include "fuzz/FuzzInput.h"
#include "fuzz/RecordedReports.h"

namespace fuzz {

namespace {

using namespace vesk::host;

constexpr const char *kFile = "f";

class SlowBytes : public RawBytes {
 public:
  SlowBytes(std::string_view bytes, std::size_t most) : rest_(bytes), most_(most) {}
  std::size_t read(char *out, std::size_t size) override {
    const std::size_t count = std::min({size, most_, rest_.size()});
    rest_.copy(out, count);
    rest_.remove_prefix(count);
    return count;
  }

 private:
  std::string_view rest_;
  std::size_t most_;
};

RecordedReports read(const InputKind &kind, ByteSource &source, const ReadOptions &options) {
  RecordedReports found(kFile);
  try {
    kind.read(source, options, found);
  } catch (const InputError &error) {
    check(*error.what() != '\0', "an input error has a text");
    found.story += std::string("unreadable: ") + error.what() + "\n";
    ++found.messages;
  }
  return found;
}

}  // namespace

int readInput(const char *name, const std::uint8_t *data, std::size_t size) {
  FuzzInput input(data, size);
  const auto flags = input.take<std::uint8_t>();
  ReadOptions options;
  options.split = (flags & 1) != 0;
  if ((flags & 2) != 0) options.forcedType = (flags & 4) != 0 ? ReportType::kInput : ReportType::kFeature;
  options.kindForced = (flags & 8) != 0;

  const InputKind *kind = findInputKind(name);
  check(kind != nullptr, "the input kind exists");
  const std::string_view bytes = input.rest();
  kind->matches(bytes.substr(0, kHeadSize));
  detectInputKind(bytes.substr(0, kHeadSize));

  ByteSource whole(kFile, std::string(bytes));
  const RecordedReports found = read(*kind, whole, options);
  check(bytes.empty() || !found.bytes.empty() || found.messages != 0, "what is not read is told");

  ByteSource slow(kFile, std::make_unique<SlowBytes>(bytes, 1 + flags / 16u * 7u));
  checkSame(read(*kind, slow, options).story, found.story, "bytes that come slowly");
  return 0;
}

}  // namespace fuzz
