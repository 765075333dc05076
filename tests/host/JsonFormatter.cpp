// JSON documents and JSON Lines, whole, as their readers see them.
#include "host/output/JsonFormatter.h"

#include "tests/host/Formatting.h"

namespace {

using namespace vesk::host;
using test::format;
using test::fromHex;
using test::given;
using test::Given;

const std::string kTool = R"("tool":{"version":")" VESK_REPORT_VERSION R"(","argv":["decode","s.pcapng"]})";

FormatOptions options() {
  FormatOptions options;
  options.arguments = {"decode", "s.pcapng"};
  return options;
}

std::string openShortRecord(std::string_view extra = "") {
  return R"({"source":{"file":"s.pcapng","index":17,"time":3.000412,"device":"1.7"},)"
         R"("report":{"id":227,"hex":"E3","type":"feature","name":"open-short-result","length":57},)"
         R"("value":{"SHORT_TX_POS":18446744073709551615,"SHORT_TX_NEG":0,"SHORT_BOTH":0,"OPEN_TX_POS":0,)"
         R"("OPEN_TX_NEG":0,"OPEN_BOTH":0,"WEAK_OS":258},"exact":{"/SHORT_TX_POS":"18446744073709551615"})" +
         std::string(extra) + R"(,"messages":[]})";
}

Given openShort() {
  Given report = given(fromHex("E3 FFFFFFFFFFFFFFFF" + std::string(80, '0') + "0201000000000000"));
  report.report.file = "s.pcapng";
  report.report.index = 17;
  report.report.timeNs = 3'000'412'000;
  report.report.device = "1.7";
  return report;
}

TEST(JsonLines, oneObjectAReportAndOneForTheRun) {
  EXPECT_EQ(format("jsonl", {openShort()}, options()).text,
            openShortRecord() + "\n" + R"({"format":"vesk-report/1",)" + kTool +
                R"(,"summary":{"reports":1},"messages":[],"exit_status":0})" + "\n");
}

TEST(JsonLines, aRunWithoutReportsHasItsSummary) {
  EXPECT_EQ(
      format("jsonl", {}, options()).text,
      R"({"format":"vesk-report/1",)" + kTool + R"(,"summary":{"reports":0},"messages":[],"exit_status":0})" + "\n");
}

TEST(JsonDocument, oneRecordALineWithinTheEnvelope) {
  const std::string state = R"({"source":{"file":"f","index":1,"time":null,"device":null},)"
                            R"("report":{"id":222,"hex":"DE","type":"feature","name":"adc-dump-state","length":2},)"
                            R"("value":"SINGLE","exact":{},"messages":[]})";
  EXPECT_EQ(format("json", {openShort(), given(fromHex("DE 01"), 1)}, options()).text,
            R"({"format":"vesk-report/1",)" + kTool + ",\"reports\":[\n" + openShortRecord() + ",\n" + state + "\n" +
                R"(],"messages":[],"exit_status":0})" + "\n");
}

TEST(JsonDocument, aRunWithoutReportsIsADocumentToo) {
  EXPECT_EQ(format("json", {}).text, R"({"format":"vesk-report/1","tool":{"version":")" VESK_REPORT_VERSION
                                     R"(","argv":[]},"reports":[],"messages":[],"exit_status":0})"
                                     "\n");
}

TEST(JsonRecord, whatWasNotDecodedIsNullAndSaysWhy) {
  const std::string text = format("jsonl", {given(fromHex("99 01"))}).text;
  EXPECT_THAT(text, testing::HasSubstr(R"("report":{"id":153,"hex":"99","type":"feature","name":null,"length":2},)"
                                       R"("value":null,"exact":{},"messages":[{"code":"unknown-report",)"
                                       R"("severity":"error","text":")"));
}

TEST(JsonRecord, aShortReportHasItsValueAndItsMessage) {
  const std::string text = format("jsonl", {given(fromHex("E0 0D 05"))}).text;
  EXPECT_THAT(text, testing::HasSubstr(R"("length":3},"value":{"SEVERITY_LEVEL":13,"MODULE_COUNT":5,)"));
  EXPECT_THAT(text,
              testing::HasSubstr(R"("messages":[{"code":"short-report","severity":"error","text":"3 bytes long)"));
}

TEST(JsonRecord, severalMessagesStandInTheirOrder) {
  const std::string text = format("jsonl", {given("\xD2one\ntwo")}).text;
  EXPECT_THAT(text, testing::HasSubstr(R"("messages":[{"code":"unterminated-text","severity":"warning","text":")"));
  EXPECT_THAT(text, testing::HasSubstr(R"("},{"code":"decoder-raised","severity":"error","text":")"));
}

TEST(JsonRecord, aGuessedTypeIsMarked) {
  Given report = given(fromHex("DE 00"));
  report.report.typeGuessed = true;
  EXPECT_THAT(format("jsonl", {report}).text,
              testing::HasSubstr(R"("type":"feature","type_guessed":true,"name":"adc-dump-state")"));
}

TEST(JsonRecord, withLinesAndBytesOnRequest) {
  FormatOptions wanted = options();
  wanted.withBytes = true;
  const std::string bytes = "e3ffffffffffffffff" + std::string(80, '0') + "0201000000000000";
  EXPECT_THAT(format("jsonl", {openShort()}, wanted).text,
              testing::StartsWith(openShortRecord(R"(,"bytes":")" + bytes + "\"") + "\n"));
  FormatOptions lines;
  lines.withLines = true;
  EXPECT_THAT(
      format("jsonl", {given(fromHex("DE 02"))}, lines).text,
      testing::HasSubstr(R"("value":"CONTINUOUS","exact":{},"lines":["ADC Dump State: CONTINUOUS"],"messages")"));
  EXPECT_THAT(format("jsonl", {given(fromHex("99"))}, lines).text, testing::HasSubstr(R"("lines":null)"));
}

TEST(JsonRecord, namesThatAreNoTextStayValid) {
  Given report = given(fromHex("DE 00"));
  report.report.file = "a\xFF\"b\n";
  EXPECT_THAT(format("jsonl", {report}).text, testing::StartsWith("{\"source\":{\"file\":\"a\xEF\xBF\xBD\\\"b\\n\","));
}

TEST(JsonRecord, deviceTextIsEscaped) {
  EXPECT_THAT(format("jsonl", {given(std::string("\xD0"
                                                 "1.2\t\"\xC3\xA4\"\0",
                                                 10))})
                  .text,
              testing::HasSubstr("\"value\":\"1.2\\t\\\"\xC3\xA4\\\"\""));
  // What is not UTF-8 is not decoded, and the document says so.
  EXPECT_THAT(format("jsonl", {given(std::string("\xD0\xFF\0", 3))}).text,
              testing::HasSubstr(R"("value":null,"exact":{},"messages":[{"code":"nothing-decoded")"));
}

TEST(JsonMessages, tellPlaceReportAndCount) {
  std::FILE *const nowhere = std::fopen("/dev/null", "w");
  Messages messages({}, nowhere);
  messages.add({&kShortReport, "a.txt", Place::line(12), 0xE0, "3 bytes long"});
  messages.add({&kShortReport, "a.txt", Place::line(20), 0xE0, "4 bytes long"});
  messages.add({&kUnreadable, "b", {}, {}, "cannot be opened"});
  messages.add({&kTrailingBytes, "c", Place::packet(7), 0xDE, "1 byte more"});
  std::fclose(nowhere);
  EXPECT_THAT(
      format("json", {}, {}, &messages).text,
      testing::EndsWith(
          R"("reports":[],"messages":[)"
          R"({"code":"short-report","severity":"error","file":"a.txt","place":{"kind":"line","number":12},"report_id":224,"text":"3 bytes long","count":2},)"
          R"({"code":"unreadable","severity":"error","file":"b","place":null,"report_id":null,"text":"cannot be opened","count":1},)"
          R"({"code":"trailing-bytes","severity":"note","file":"c","place":{"kind":"packet","number":7},"report_id":222,"text":"1 byte more","count":1}],)"
          R"("exit_status":4})"
          "\n"));
}

}  // namespace
