// The way from a reader to the output: the same bytes and messages in the same order, whatever the number of threads.
#include "host/decode/Pipeline.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace vesk::host {
namespace {

using testing::HasSubstr;

std::string contents(const std::string &path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

/// A place for output and messages, gone at the end of the test.
class PipelineTest : public testing::Test {
 protected:
  PipelineTest() : folder_(testing::TempDir() + "/pipeline." + std::to_string(::getpid())) {
    std::filesystem::create_directories(folder_);
  }
  ~PipelineTest() override { std::filesystem::remove_all(folder_); }

  struct Outcome {
    std::string output, messages;
    int exitCode;
    std::uint64_t reports;
  };

  /// Runs `feed` through a pipeline.
  template <class Feed>
  Outcome run(std::string_view form, unsigned jobs, const Filter &filter, Feed feed) {
    const std::string path = folder_ + "/output";
    std::FILE *stream = std::tmpfile();
    Outcome outcome;
    {
      Messages messages({}, stream);
      OutputFile output(path);
      const auto formatter = findOutputKind(form)->make({});
      Pipeline pipeline({false, false, false, jobs}, filter, *formatter, output, messages);
      pipeline.begin();
      feed(pipeline);
      pipeline.finish();
      outcome.exitCode = messages.exitCode();
      outcome.reports = pipeline.reports();
    }
    outcome.output = contents(path);
    std::rewind(stream);
    for (int c; (c = std::getc(stream)) != EOF;) outcome.messages += static_cast<char>(c);
    std::fclose(stream);
    return outcome;
  }

  std::string folder_;
};

SourceReport report(std::string_view bytes, std::uint64_t index, ReportType type = ReportType::kFeature) {
  SourceReport source;
  source.bytes = bytes;
  source.id = static_cast<unsigned char>(bytes[0]);
  source.type = type;
  source.file = "f";
  source.place = Place::line(index + 1);
  source.index = index;
  source.device = index % 2 == 0 ? "1.7" : "1.8";
  return source;
}

/// Some thousand reports of three kinds, one short, one unknown, with messages of the reader between them. The bytes
/// are gone as soon as the pipeline has them.
void feedMany(Pipeline &pipeline) {
  for (std::uint64_t i = 0; i < 3000; ++i) {
    std::string bytes = i % 3 == 0 ? std::string("\xE0\x0D\x05\x00\x21\x40\x24", 7) : std::string(2064, '\x77');
    if (i % 3 == 0) bytes[1] = static_cast<char>(i % 8);
    if (i == 1234) bytes = "\x99";
    if (i == 2345) bytes = std::string("\xDF\x01", 2);
    const std::uint32_t number = static_cast<std::uint32_t>(i);
    if (bytes.size() == 2064) std::memcpy(bytes.data() + 4, &number, 4);
    pipeline.report(report(bytes, i, bytes[0] == '\x77' ? ReportType::kInput : ReportType::kFeature));
    bytes.assign(bytes.size(), '\xAA');
    if (i % 1000 == 7) pipeline.message({&kInputKind, "f", Place::line(i), {}, "a note"});
    if (i == 1500) pipeline.finishFile("f");
  }
  pipeline.finishFile("f");
}

TEST_F(PipelineTest, EveryNumberOfThreadsWritesTheSame) {
  for (const std::string form : {"text", "jsonl", "json", "csv", "hex", "raw", "recording"}) {
    const Outcome one = run(form, 1, {}, feedMany);
    EXPECT_EQ(one.reports, 3000u);
    for (const unsigned jobs : {2u, 3u, 8u}) {
      const Outcome many = run(form, jobs, {}, feedMany);
      EXPECT_EQ(many.output == one.output, true) << form << ' ' << jobs;
      EXPECT_EQ(many.messages, one.messages) << form << ' ' << jobs;
      EXPECT_EQ(many.exitCode, one.exitCode);
    }
  }
}

TEST_F(PipelineTest, LargeReportsWaitForNoOthers) {
  const auto feedLarge = [](Pipeline &pipeline) {
    for (std::uint64_t i = 0; i < 20; ++i)
      pipeline.report(report("\xD0" + std::string(60'000, static_cast<char>('a' + i)) + '\0', i));
  };
  const Outcome one = run("text", 1, {}, feedLarge), many = run("text", 2, {}, feedLarge);
  EXPECT_EQ(one.output.size(), 20u * 60'003);  // an empty line before and behind each
  EXPECT_EQ(many.output == one.output, true);
}

TEST_F(PipelineTest, TellsWhatIsShortUnknownAndLost) {
  const Outcome outcome = run("text", 2, {}, feedMany);
  EXPECT_EQ(outcome.exitCode, kExitFindings);
  EXPECT_THAT(outcome.messages, HasSubstr("f:1235: error: 0x99: no report of the controller has this ID\n"));
  EXPECT_THAT(outcome.messages, HasSubstr("f:2346: error: 0xDF: 2 bytes long, 25 expected"));
  EXPECT_THAT(outcome.messages, HasSubstr("warning: 0x77: number "));
}

TEST_F(PipelineTest, FiltersBeforeItDecodes) {
  Filter filter;
  ASSERT_TRUE(filter.addReport("0xDF"));
  const Outcome outcome = run("text", 1, filter, feedMany);
  EXPECT_EQ(outcome.reports, 1u);
  EXPECT_THAT(outcome.output, HasSubstr("Watchdog Data:"));
  EXPECT_THAT(outcome.messages, testing::Not(HasSubstr("0x99")));
}

TEST_F(PipelineTest, AFullDeviceEndsTheRunOnEveryNumberOfThreads) {
  for (const unsigned jobs : {1u, 4u}) {
    Messages messages({true, false, false, false, false}, std::tmpfile());
    OutputFile output("/dev/full");
    const auto formatter = findOutputKind("text")->make({});
    const Filter filter;
    EXPECT_THROW(
        {
          Pipeline pipeline({false, false, false, jobs}, filter, *formatter, output, messages);
          pipeline.begin();
          feedMany(pipeline);
          pipeline.finish();
        },
        OutputError)
        << jobs;
  }
}

TEST_F(PipelineTest, AnEmptyRunIsAValidDocument) {
  const Outcome outcome = run("json", 2, {}, [](Pipeline &) {});
  EXPECT_THAT(outcome.output, HasSubstr("\"reports\":["));
  EXPECT_THAT(outcome.output, HasSubstr("\"exit_status\":0"));
}

}  // namespace
}  // namespace vesk::host
