// What is printed of messages, and the exit code that they add up to.
#include "host/diagnostics/Messages.h"

#include <gtest/gtest.h>

namespace vesk::host {
namespace {

struct Printed {
  explicit Printed(const Messages::Options &options) : messages(options, stream) {}
  ~Printed() { std::fclose(stream); }
  Printed(const Printed &) = delete;
  Printed &operator=(const Printed &) = delete;

  std::string text() {
    std::string all;
    std::rewind(stream);
    for (int c; (c = std::getc(stream)) != EOF;) all += static_cast<char>(c);
    return all;
  }

  std::FILE *stream = std::tmpfile();
  Messages messages;
};

Message about(const MessageKind &kind, Place place, std::string text = "text") {
  return {&kind, "s.hex", place, 0xE0, std::move(text)};
}

TEST(Messages, NameFilePlaceSeverityAndReport) {
  Printed printed({});
  printed.messages.add(about(kUnknownReport, Place::line(12)));
  printed.messages.add(about(kShortReport, Place::packet(17)));
  printed.messages.add(about(kUnterminatedText, Place::offset(792)));
  printed.messages.add({&kUnreadable, "x", {}, {}, "No such file or directory"});
  EXPECT_EQ(printed.text(),
            "s.hex:12: error: 0xE0: text\n"
            "s.hex:packet 17: error: 0xE0: text\n"
            "s.hex:offset 792: warning: 0xE0: text\n"
            "x: error: No such file or directory\n");
}

TEST(Messages, OneLineForEachCauseAndFileAndThenACount) {
  Printed printed({});
  for (std::uint64_t line = 1; line <= 5; ++line) printed.messages.add(about(kShortReport, Place::line(line)));
  printed.messages.finishFile("s.hex");
  EXPECT_EQ(printed.text(),
            "s.hex:1: error: 0xE0: text\n"
            "s.hex: error: 4 more of this kind (short-report)\n");
  ASSERT_EQ(printed.messages.kept().size(), 1u);
  EXPECT_EQ(printed.messages.kept()[0].count, 5u);
}

TEST(Messages, AFileThatComesAgainIsCountedOnFromWhereItWas) {
  Printed printed({});
  for (std::uint64_t line = 1; line <= 2; ++line) printed.messages.add(about(kShortReport, Place::line(line)));
  printed.messages.finishFile("s.hex");
  printed.messages.finishFile("s.hex");
  for (std::uint64_t line = 1; line <= 3; ++line) printed.messages.add(about(kShortReport, Place::line(line)));
  printed.messages.finishFile("s.hex");
  EXPECT_EQ(printed.text(),
            "s.hex:1: error: 0xE0: text\n"
            "s.hex: error: 1 more of this kind (short-report)\n"
            "s.hex: error: 3 more of this kind (short-report)\n");
}

TEST(Messages, VerboseShowsNotesAndEveryOne) {
  Printed printed({.verbose = true});
  printed.messages.add(about(kTrailingBytes, Place::line(1)));
  printed.messages.add(about(kTrailingBytes, Place::line(2)));
  printed.messages.finishFile("s.hex");
  EXPECT_EQ(printed.text(), "s.hex:1: note: 0xE0: text\ns.hex:2: note: 0xE0: text\n");
}

TEST(Messages, NotesAreKeptThoughNotShown) {
  Printed printed({});
  printed.messages.add(about(kTrailingBytes, Place::line(1)));
  EXPECT_EQ(printed.text(), "");
  EXPECT_EQ(printed.messages.kept().size(), 1u);
}

TEST(Messages, QuietShowsErrorsOnly) {
  Printed printed({.quiet = true});
  printed.messages.add(about(kUnterminatedText, Place::line(1)));
  printed.messages.add(about(kShortReport, Place::line(2)));
  EXPECT_EQ(printed.text(), "s.hex:2: error: 0xE0: text\n");
}

TEST(Messages, TheHighestExitCodeApplies) {
  Printed printed({.quiet = true});
  EXPECT_EQ(printed.messages.exitCode(), 0);
  printed.messages.add(about(kUnterminatedText, {}));
  EXPECT_EQ(printed.messages.exitCode(), 0);
  printed.messages.add(about(kShortReport, {}));
  EXPECT_EQ(printed.messages.exitCode(), 4);
  printed.messages.add(about(kUnreadable, {}));
  EXPECT_EQ(printed.messages.exitCode(), 4);
}

TEST(Messages, LenientTakesTheExitCodeFromShortReportsAlone) {
  Printed printed({.lenient = true});
  printed.messages.add(about(kShortReport, Place::line(1)));
  EXPECT_EQ(printed.messages.exitCode(), 0);
  EXPECT_EQ(printed.text(), "s.hex:1: warning: 0xE0: text\n");
  printed.messages.add(about(kWrongLength, Place::line(2)));
  EXPECT_EQ(printed.messages.exitCode(), 4);
}

TEST(Messages, ClearTheProgressLineAndColourTheSeverityOnATerminal) {
  Printed printed({.colour = true, .overProgress = true});
  printed.messages.add(about(kShortReport, Place::line(1)));
  EXPECT_EQ(printed.text(), "\r\x1b[Ks.hex:1: \x1b[1;31merror:\x1b[0m 0xE0: text\n");
}

}  // namespace
}  // namespace vesk::host
