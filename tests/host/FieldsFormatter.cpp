// Reports field by field.
#include "host/output/FieldsFormatter.h"

#include "tests/host/Formatting.h"

namespace {

using namespace vesk::host;
using test::fromHex;
using test::given;
using test::Given;
using testing::HasSubstr;

std::string fields(std::vector<Given> reports) {
  const auto formatter = makeFieldsFormatter();
  Decoder decoder({formatter->wantsLines(), formatter->wantsValue(), false, false});
  OutputBuffer out;
  bool first = true;
  for (Given &each : reports) {
    each.report.bytes = each.bytes;
    std::vector<Finding> findings;
    formatter->report(out, each.report, decoder.decode(each.report), first, findings);
    EXPECT_TRUE(findings.empty());
    first = false;
  }
  return std::string(out.text());
}

TEST(Fields, showBytesBesideTheirValues) {
  EXPECT_THAT(fields({given(fromHex("A9 01000000 02000000 FFFFFFFF 00000000" + std::string(64, '0')))}),
              testing::StartsWith("== f: feature 0xA9 power-modes, 49 bytes\n"
                                  "     1  01 00 00 00               INIT time ms              1 ms\n"
                                  "     5  02 00 00 00               INIT times entered        2\n"
                                  "     9  ff ff ff ff               ACTIVE time ms            4294967295 ms\n"));
}

TEST(Fields, missingBytesAndSurplusOnesAreShownAsSuch) {
  EXPECT_EQ(fields({given(fromHex("DE")), given(fromHex("DE 02 AB CD"))}),
            "== f: feature 0xDE adc-dump-state, 1 byte\n"
            "     1  --                        ADC Dump State            \"STANDBY\"\n"
            "\n"
            "== f: feature 0xDE adc-dump-state, 4 bytes\n"
            "     1  02                        ADC Dump State            \"CONTINUOUS\"\n"
            "     2  ab cd                     not decoded\n");
}

TEST(Fields, arraysAreNumberedRowByRow) {
  std::string bytes = "\x76" + std::string(791, '\0');
  test::put(bytes, 16 + 4 * 5, 0xFFFFFFFE, 4);
  const std::string text = fields({given(bytes)});
  EXPECT_THAT(
      text, HasSubstr("    16  00 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00  D_SCAN_I 0                0 0 0 0\n"
                      "    32  00 00 00 00 fe ff ff ff 00 00 00 00 00 00 00 00  D_SCAN_I 4                0 -2 0 0\n"));
  EXPECT_THAT(text, HasSubstr("   788  00 00 00 00               TMON_DEG_C                0 degC\n"));
}

TEST(Fields, bitsAndOptionsAreTakenApart) {
  const std::string summary = fields({given(fromHex("E0 0D 05 00 21 40 24"))});
  EXPECT_THAT(summary, HasSubstr("     4  21                        bit 5 BLOB_LAFE           1\n"));
  EXPECT_THAT(summary, HasSubstr("     6  24                        bit 2 HIDSPI_SLAVE        1\n"
                                 "     6  24                        bit 3 OTP                 0\n"));
  EXPECT_THAT(summary, HasSubstr("     6  24                        bit 7 unused\n"));
  std::string config = "\xE2" + std::string(240, '\0');
  config[26] = '\x05';
  config[202] = '\x33';
  const std::string options = fields({given(config)});
  EXPECT_THAT(options, HasSubstr("    26  05                        OPEN_SHORT_EVENT_SINGLE_OPEN  "
                                 "{\"ERROR_LEVEL\":\"CRITICAL\",\"OPTIONS_RAW\":5}\n"));
  EXPECT_THAT(options, HasSubstr("   202  33                        unused\n"));
}

TEST(Fields, whatTheValueLeavesOutIsReadFromItsBytes) {
  std::string bytes = "\xE1" + std::string(1022, '\0');
  test::put(bytes, 985, 0x0201, 2);
  EXPECT_THAT(fields({given(bytes)}), HasSubstr("   985  01 02                     PMGR # Events             513\n"));
  // And where the report ends within them.
  EXPECT_THAT(fields({given(bytes.substr(0, 986))}),
              HasSubstr("   985  01 --                     PMGR # Events             1\n"));
}

TEST(Fields, textsHaveTheirWholeLength) {
  EXPECT_EQ(fields({given(std::string("\xD0"
                                      "1.2.3 abcdefghijkl\0",
                                      20))}),
            "== f: feature 0xD0 version, 20 bytes\n"
            "     1  31 2e 32 2e 33 20 61 62 63 64 65 66 67 68 69 6a  text                      "
            "\"1.2.3 abcdefghijkl\"\n"
            "    17  6b 6c 00                  text\n");
}

TEST(Fields, whatDoesNotDecodeShowsItsBytesAlone) {
  EXPECT_EQ(fields({given(fromHex("D0 FF FE 00"))}),
            "== f: feature 0xD0 version, 4 bytes\n"
            "     1  ff fe 00                  text\n");
  EXPECT_EQ(fields({given(fromHex("D0"))}),
            "== f: feature 0xD0 version, 1 byte\n"
            "     1  --                        text                      \"\"\n");
}

TEST(Fields, bytesThatAreNobodysStandInOneRow) {
  EXPECT_THAT(fields({given("\xE4" + std::string(400, '\x07'))}),
              HasSubstr("   394  07 07 07 07 07 07 07      unused\n"));
}

TEST(Fields, unknownReportsShowTheirBytes) {
  EXPECT_EQ(fields({given(fromHex("99 01 02"))}),
            "== f: feature 0x99, 3 bytes\n"
            "     1  01 02                     not decoded\n");
}

}  // namespace
