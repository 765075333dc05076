// Hex text: every layout of the same bytes as the tools print it, the traps in them, and what is refused.
#include "host/input/HexTextLine.h"
#include "tests/host/ReadInput.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

// 0x76, then 0x20 to 0x47: the text column of a dump ends with what looks like hex.
const std::string kSample = bytesOf(
    "76 20 21 22 23 24 25 26 27 28 29 2a 2b 2c 2d 2e 2f 30 31 32 33 34 35 36 37 38 39 3a 3b 3c 3d 3e 3f 40 41 42 43 44 "
    "45 46 47");
const std::string kSummary = bytesOf("e0 0d 05 00 21 40 24");

void expectOne(std::string_view text, const std::string &bytes) {
  SCOPED_TRACE(text);
  EXPECT_EQ(detectedKind(text), "hex");
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.bytes(), ElementsAre(bytes));
  EXPECT_THAT(result.said(), IsEmpty());
}

void expectRefused(std::string_view text, std::string_view code, std::string_view words, std::string_view place = "1",
                   int exitCode = 3) {
  SCOPED_TRACE(text);
  const ReadResult result = readInput(text, "hex");
  EXPECT_THAT(result.reports, IsEmpty());
  ASSERT_FALSE(result.messages.empty());
  EXPECT_EQ(result.messages[0].code, code);
  EXPECT_EQ(result.messages[0].place, place);
  EXPECT_EQ(result.messages[0].exitCode, exitCode);
  EXPECT_THAT(result.messages[0].text, HasSubstr(words));
}

TEST(HexTextInput, ReadsEveryLayoutOfTheSameBytes) {
  expectOne(R"(00000000: 7620 2122 2324 2526 2728 292a 2b2c 2d2e  v !"#$%&'()*+,-.
00000010: 2f30 3132 3334 3536 3738 393a 3b3c 3d3e  /0123456789:;<=>
00000020: 3f40 4142 4344 4546 47                   ?@ABCDEFG
)",
            kSample);
  expectOne(R"(00000000: 76 20 21 22 23 24 25 26  v !"#$%&
00000008: 27 28 29 2A 2B 2C 2D 2E  '()*+,-.
00000010: 2F 30 31 32 33 34 35 36  /0123456
00000018: 37 38 39 3A 3B 3C 3D 3E  789:;<=>
00000020: 3F 40 41 42 43 44 45 46  ?@ABCDEF
00000028: 47                       G
)",
            kSample);
  expectOne(R"(00000000: 7620212223242526 2728292a2b2c2d2e  v !"#$%&'()*+,-.
00000010: 2f30313233343536 3738393a3b3c3d3e  /0123456789:;<=>
00000020: 3f40414243444546 47                ?@ABCDEFG
)",
            kSample);
  expectOne(R"(76202122232425262728292a2b2c2d2e2f303132333435363738393a3b3c
3d3e3f4041424344454647
)",
            kSample);
  expectOne(R"(unsigned char b41[] = {
  0x76, 0x20, 0x21, 0x22, 0x23, 0x24, 0x25, 0x26, 0x27, 0x28, 0x29, 0x2a,
  0x2b, 0x2c, 0x2d, 0x2e, 0x2f, 0x30, 0x31, 0x32, 0x33, 0x34, 0x35, 0x36,
  0x37, 0x38, 0x39, 0x3a, 0x3b, 0x3c, 0x3d, 0x3e, 0x3f, 0x40, 0x41, 0x42,
  0x43, 0x44, 0x45, 0x46, 0x47
};
unsigned int b41_len = 41;
)",
            kSample);
  expectOne(R"(00000000  76 20 21 22 23 24 25 26  27 28 29 2a 2b 2c 2d 2e  |v !"#$%&'()*+,-.|
00000010  2f 30 31 32 33 34 35 36  37 38 39 3a 3b 3c 3d 3e  |/0123456789:;<=>|
00000020  3f 40 41 42 43 44 45 46  47                       |?@ABCDEFG|
00000029
)",
            kSample);
  expectOne(R"(000000 76 20 21 22 23 24 25 26 27 28 29 2a 2b 2c 2d 2e
000010 2f 30 31 32 33 34 35 36 37 38 39 3a 3b 3c 3d 3e
000020 3f 40 41 42 43 44 45 46 47
000029
)",
            kSample);
  expectOne(R"(000000 76 20 21 22 23 24 25 26 27 28 29 2a 2b 2c 2d 2e  >v !"#$%&'()*+,-.<
000010 2f 30 31 32 33 34 35 36 37 38 39 3a 3b 3c 3d 3e  >/0123456789:;<=><
000020 3f 40 41 42 43 44 45 46 47                       >?@ABCDEFG<
000029
)",
            kSample);
  expectOne(R"( 76 20 21 22 23 24 25 26 27 28 29 2a 2b 2c 2d 2e
 2f 30 31 32 33 34 35 36 37 38 39 3a 3b 3c 3d 3e
 3f 40 41 42 43 44 45 46 47
)",
            kSample);
}

TEST(HexTextInput, ReadsOctalAndDecimalOffsetsBeforeBytes) {
  expectOne(R"(0000000 76 20 21 22 23 24 25 26 27 28 29 2a 2b 2c 2d 2e
0000020 2f 30 31 32 33 34 35 36 37 38 39 3a 3b 3c 3d 3e
0000040 3f 40 41 42 43 44 45 46 47
0000051
)",
            kSample);
  expectOne(R"(0000000 76 20 21 22 23 24 25 26 27 28 29 2a 2b 2c 2d 2e
0000016 2f 30 31 32 33 34 35 36 37 38 39 3a 3b 3c 3d 3e
0000032 3f 40 41 42 43 44 45 46 47
0000041
)",
            kSample);
}

TEST(HexTextInput, ReadsPlainDigitsInEverySpelling) {
  for (const char *text : {"E0 0D 05 00 21 40 24",
                           "e00d0500214024",
                           "e00d 0500 2140 24",
                           "0xE0 0x0D 0x05 0x00 0x21 0x40 0x24",
                           "0XE0 0X0D 0X05 0X00 0X21 0X40 0X24",
                           "0xe00d0500214024",
                           "e0,0d,05,00,21,40,24",
                           "e0, d, 5, 0, 21, 40, 24",
                           "[e0, 0d, 05, 00, 21, 40, 24]",
                           "{ 0xe0, 0x0d, 0x05, 0x00, 0x21, 0x40, 0x24 };",
                           "E0;0D;05;00;21;40;24",
                           "e0:0d:05:00:21:40:24",
                           "E0-0D-05-00-21-40-24",
                           "0000:\te0\t0d\t05\t00\t21\t40\t24\n",
                           "0000\te0\t0d\t05\t00\t21\t40\t24\n",
                           "\"\\xe0\\x0d\\x05\\x00\\x21\\x40\\x24\"",
                           "\te0\t0d 05\t00   21 40 24  \r\n",
                           "\xef\xbb\xbf"
                           "e0 0d 05 00 21 40 24\n",
                           "# black box\ne0 0d // severity, count\n05 00 21 # mask\n40 24",
                           "e0 0d /* severity */ 05 00\n/* two\nlines */ 21 40 24",
                           "const uint8_t report[7] = { 0xe0, 0x0d, 0x05, 0x00, 0x21, 0x40, 0x24 };",
                           "Report: e0 0d 05 00 21 40 24",
                           "Report = e00d0500214024",
                           "dump = 00000000: e00d 0500 2140 24",
                           "{\"report\": \"e0 0d 05 00 21 40 24\"}",
                           "  \"usb.capdata\": \"e0:0d:05:00:21:40:24\",",
                           "report (size 7) (numbered) = e0 0d 05 00 21 40 24",
                           "> e0 0d 05 00\n> 21 40 24\n",
                           "e0 0d 05 00 21 40 24 |.e0..!@$|",
                           "e0 0d 05 00 21 40 24 >.e0..!@$<",
                           "0000   e0 0d 05 00 21 40 24                              ....!@$\n",
                           "E0 0D 05 00\n21 40\n24\n"})
    expectOne(text, kSummary);
}

TEST(HexTextInput, ReadsWhatOtherToolsPrint) {
  expectOne(R"(Opening device, vid/pid: 0x16C0/0x0486
Reading 64-byte input report 0, 250 msec timeout...read 7 bytes:
 E0 0D 05 00 21 40 24
Closing device
)",
            kSummary);
  expectOne("\t0x0000:  e00d 0500 2140 24                        ....!@$\n", kSummary);
}

TEST(HexTextInput, ANumberBehindWordsNeedNotBeAReport) {
  for (const char *label : {"length: 64", "size = 7", "Length: 76", "Length of report: 76", "Its ID is: 0xde",
                            "Feature report e0: 64 bytes long"})
    expectOne(std::string(label) + "\ne0 0d 05 00 21 40 24\n", kSummary);
}

TEST(HexTextInput, ABMayBeABeginningOfBytes) {
  expectOne("b e0 05\n", bytesOf("0be005"));  // and not Python's b'...' or b"..."
}

TEST(HexTextInput, TheFirstFieldIsNoOffsetWithoutBytesOfTwoDigits) {
  vesk::host::HexTextLine line;
  line.parse("00000010 e00d 0500");
  EXPECT_FALSE(line.mayHaveOffset());
  line.parse("00000010 e0 0d");
  EXPECT_TRUE(line.mayHaveOffset());
  line.parse("no fields");
  EXPECT_FALSE(line.mayHaveOffset());
}

TEST(HexTextInput, CutsTheTextColumnByItsPlace) {
  const std::string trap =
      bytesOf("76 11 12 13 14 15 16 17 18 19 1a 1b 1c 1d 1e 1f 3f 40 41 42 43 44 45 46 30 31 32 33 20 65 30 20");
  expectOne(R"(00000000: 76111213 14151617 18191a1b 1c1d1e1f  v...............
00000010: 3f404142 43444546 30313233 20653020  ?@ABCDEF0123 e0 
)",
            trap);
  expectOne(R"(00000000: 76 11 12 13 14 15 16 17  v.......
00000008: 18 19 1a 1b 1c 1d 1e 1f  ........
00000010: 3f 40 41 42 43 44 45 46  ?@ABCDEF
00000018: 30 31 32 33 20 65 30 20  0123 e0 
)",
            trap);
  expectOne(R"(00000000  76 11 12 13 14 15 16 17  18 19 1a 1b 1c 1d 1e 1f  |v...............|
00000010  3f 40 41 42 43 44 45 46  30 31 32 33 20 65 30 20  |?@ABCDEF0123 e0 |
00000020
)",
            trap);
}

TEST(HexTextInput, TakesComments_NotTheTextColumnForComments) {
  expectOne(R"(00000000: e02f 2a23 2f2f 2f                        ./*#///
)",
            bytesOf("e0 2f 2a 23 2f 2f 2f"));
}

TEST(HexTextInput, TakesAFieldForAnOffsetOnlyWhereTheOffsetsGrow) {
  // Eight digits first, and bytes behind them: data, for the second line is not eight bytes further.
  const ReadResult result = readInput("e00d0500 21 40\n24000000 01 02\n");
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("e00d0500214024000000 0102")));
  EXPECT_THAT(readInput("00000010 e0 21\n00000012 22 23\n").bytes(), ElementsAre(bytesOf("e0212223")));
  expectOne("e00d0500 21 40 24\n", kSummary);
  // In base 10 the second one is no number at all.
  expectOne("00000010 e0 21\n0000000a 22 23\n", bytesOf("00000010e0210000000a2223"));
  expectOne("e0 0d 05 00\n0000 21 40\n", bytesOf("e00d050000002140"));
  expectOne("00000000: e00d 0500 2140 24\n", kSummary);
}

TEST(HexTextInput, SaysWhereADumpDoesNotBeginAtZero) {
  const ReadResult result = readInput("00000010: e00d 0500 2140 24    ....!@$\n");
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary));
  EXPECT_THAT(result.said(), ElementsAre("dump-begin 1"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("0x10"));
}

TEST(HexTextInput, FillsSqueezedLines) {
  const std::string zeros(1023, '\0');
  for (const char *text : {R"(00000000  00 00 00 00 00 00 00 00  00 00 00 00 00 00 00 00  |................|
*
000003f0  00 00 00 00 00 00 00 00  00 00 00 00 00 00 00     |...............|
000003ff
)",
                           R"(0000000 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00
*
0001760 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00
0001777
)",
                           R"(0000000 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00
*
0001008 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00
0001023
)",
                           R"(00000000: 0000 0000 0000 0000 0000 0000 0000 0000  ................
*
000003f0: 0000 0000 0000 0000 0000 0000 0000 00    ...............
)"})
    expectOne(text, zeros);
}

TEST(HexTextInput, TakesTheLengthFromTheLastOffset) {
  expectOne(R"(00000000  00 00 00 00 00 00 00 00  00 00 00 00 00 00 00 00  |................|
*
00000400
)",
            std::string(1024, '\0'));
  expectOne(R"(000000 e1 00 00 00 00 00 00 00 00 00 00 00 00 00 00 00
000010 ff ff ff ff ff ff ff ff ff ff ff ff ff ff ff ff
*
000040
)",
            bytesOf("e1000000000000000000000000000000") + std::string(48, '\xff'));
}

TEST(HexTextInput, AReportThatIsGivenUpEndsLikeAnyOther) {
  // The first problem is told, not what follows from it.
  EXPECT_THAT(readInput("e0 021\n2g 05 00 01\n*\n\nde 01\n").said(), ElementsAre("bad-input 1"));
  // Both dumps are refused, for the second begins at zero again.
  EXPECT_THAT(readInput("0000000 0de0 0005 4021 0024\n0000007\n0000000 01de 0000\n0000003\n", "hex").said(),
              ElementsAre("swapped-words 1", "swapped-words 3"));
}

TEST(HexTextInput, RefusesSqueezedLinesWithoutAnEnd) {
  expectRefused("000000 e1 00 00 00\n*\n", "bad-input", "length is unknown", "2", 4);
  expectRefused(" e1 00 00 00\n*\n 00 01\n", "bad-input", "od -An -v -tx1", "3", 4);
  expectRefused(" e1 00 00 00\n*\n 00 01\n*\n 02 03\n", "bad-input", "od -An -v -tx1", "3", 4);
  expectRefused("*\ne1 00\n", "bad-input", "none before it", "1", 4);
  expectRefused("00000000:\n*\n00000010: e0\n", "bad-input", "whole number of lines", "3", 4);
  expectRefused("000000 e1 00 00 00\n*\n000007\n", "bad-input", "whole number of lines", "3", 4);
}

TEST(HexTextInput, RefusesAGapThatNoReportHas) {
  expectRefused("00000000  00 00 00 00\n*\nfffffff0\n", "bad-input", "", "3", 4);
  expectRefused("00000000: 0000\n*\nffffffffffffffff: 00\n", "bad-input", "", "3", 4);
}

TEST(HexTextInput, SeesMissingLines) {
  expectRefused(R"(00000000: 7620 2122 2324 2526 2728 292a 2b2c 2d2e  v !"#$%&'()*+,-.
00000020: 3f40 4142 4344 4546 47                   ?@ABCDEFG
)",
                "bad-input", "00000010 was expected", "2", 4);
  expectRefused("00000000  76 20 21 22\n00000008  2f 30\n", "bad-input", "was expected", "2", 4);
  expectRefused("0000000 76 20 21 22\n0000014 2f 30\n", "bad-input", "0000014 where 0000004 was expected", "2", 4);
  expectRefused("00000000: 7620\n2122\n", "bad-input", "an offset was expected", "2", 4);
  expectRefused("e00d05\n00000003:\n", "bad-input", "an offset, but the lines before it have none", "2", 4);
  expectRefused("0000000a: e0 0d\n0000000f: 05\n", "bad-input", "0000000f where 0000000c was expected", "2", 4);
  expectRefused("000000a e0 0d\n", "bad-input", "\"000000a\" is no offset", "1", 4);
}

TEST(HexTextInput, RefusesWordsByName) {
  expectRefused("0000000 0de0 0005 4021 0024                    \n0000007\n", "swapped-words", "'hexdump -C'");
  expectRefused("0000000 0de0 0005 4021 0024\n0000007\n", "swapped-words", "'od -Ax -v -tx1'");
  expectRefused(" 0de0 0005 4021 0024\n", "swapped-words", "'xxd'");
  expectRefused("0000000    2076    2221    2423    2625    2827    2a29    2c2b    2e2d\n0000010\n", "swapped-words",
                "xxd");
  expectRefused("0000000 22212076 26252423 2a292827 2e2d2c2b\n0000020\n", "swapped-words", "xxd");
  expectRefused("0000000 0024402100050de0\n0000007\n", "swapped-words", "xxd");
  expectRefused("00000000: 00050de0   244021                    ....!@$\n", "swapped-words", "'xxd -e'");
  expectRefused("00000000: 22212076 26252423 2a292827 2e2d2c2b  v !\"#$%&'()*+,-.\n", "swapped-words", "'xxd -e'");
  expectRefused("00000000: 2076 2221 2423 2625 2827 2a29 2c2b 2e2d  v !\"#$%&'()*+,-.\n", "swapped-words", "'xxd -e'");
  // Blanks in the text, which do not set the last group off.
  expectRefused("00000000: 23222176 27262524 2b2a2028 2f2e2d2c  v!\"#$%&'( *+,-./\n", "swapped-words", "'xxd -e'");
  expectRefused("00000000: 23202176 27262524                    v! #$%&'\n", "swapped-words", "'xxd -e'");
}

TEST(HexTextInput, RefusesOctalDecimalAndBits) {
  expectRefused("0000000 006740 000005 040041 000044\n0000007\n", "octal-text", "'od -Ax -v -tx1'");
  expectRefused(" 006740 000005 040041 000044\n", "octal-text", "octal");
  expectRefused("0000000 00001206740 00011040041\n0000007\n", "octal-text", "octal");
  expectRefused("0000000 340 015 005 000 041 100 044\n0000007\n", "octal-text", "octal");
  expectRefused("0000000   03552   00005   16417   00036                                \n0000007\n", "decimal-text",
                "'hexdump -C'");
  expectRefused(
      "00000000: 11100000 00001101 00000101 00000000 00100001 01000000  ....!@\n"
      "00000006: 00100100                                               $\n",
      "bit-text", "'xxd -b'");
  expectRefused("11100000 00001101 00000101\n", "bit-text", "bits");
  expectRefused("00000000: 11100000 00001101 00000101\n", "bit-text", "bits");
  expectRefused("0000000  -32   13    5    0   33   64   36\n0000007\n", "bad-input", "\"-32\" in column 10", "1", 4);
  expectRefused("0000000 340  \\r 005  \\0   !   @   $\n0000007\n", "bad-input", "'od -Ax -v -tx1' print them", "1", 4);
}

TEST(HexTextInput, DoesNotTakeGroupsOfZerosForBits) {
  expectOne("01000000 00000001\n", bytesOf("0100000000000001"));
  expectOne("00000000: 00000000 00000000 00000000 00000000  ................\n", std::string(16, '\0'));
  expectOne("e0000000 00000000 00000000\n", bytesOf("e00000000000000000000000"));
}

TEST(HexTextInput, DoesNotTakeLaterLinesForOctalWords) {
  expectOne("e0 0d 05 00 21 40 24\n006740 000005\n", bytesOf("e00d0500214024006740000005"));
}

TEST(HexTextInput, KnowsDeleteInATextColumn) {
  expectOne("00000000: e07f 0500 2140 24  ....!@$\n", bytesOf("e07f0500214024"));
}

TEST(HexTextInput, NamesLineAndColumnOfASlip) {
  expectRefused("e0 0d\n05 0 021 40\n", "bad-input", "\"021\" in column 6 has an odd number of digits", "2", 4);
  expectRefused("e0 0d 05 00 2g 40 24", "bad-input", "\"2g\" in column 13", "1", 4);
  expectRefused("e0 0d 05 00 " + std::string(30, 'g'), "bad-input", "\"" + std::string(24, 'g') + "...\"", "1", 4);
  expectRefused("g0 0d 05 00 21 40 24", "bad-input", "\"g0\" in column 1", "1", 4);
  expectRefused("g0 0d", "bad-input", "\"g0\" in column 1", "1", 4);
  expectRefused("g0:0d", "bad-input", "\"g0\" in column 1", "1", 4);
  expectRefused("e0: 0g", "bad-input", "\"0g\" in column 5", "1", 4);
  expectRefused("0xe0, 0x1ff, 0x05", "bad-input", "0x1ff", "1", 4);
  expectRefused("0xe0, 0x0d05, 0x05", "bad-input", "more than a byte", "1", 4);
  expectRefused("0xe00d, 0x0500", "bad-input", "\"0xe00d\" in column 1 is more than a byte", "1", 4);
  expectRefused("0000000 0abcd 01234\n", "bad-input", "\"0000000\" in column 1 has an odd number", "1", 4);
  expectRefused("e00d0", "bad-input", "odd number", "1", 4);
  expectRefused("0000007\ne00d\n", "bad-input", "odd number", "1", 4);
  expectRefused("[118, 119, 100]", "bad-input", "decimal", "1", 4);
  expectRefused("e0 0d \xff\x01", "bad-input", "\\xff\\x01", "1", 4);
  expectRefused("b'\\xe0\\x0d\\x05'", "bad-input", "\"b\" in column 1", "1", 4);
  expectRefused("x = b'\\xde\\x02'", "bad-input", "\"x\" in column 1", "1", 4);
  expectRefused("b\"\\xe0\\x0d\\x05\"", "bad-input", "\"b\" in column 1", "1", 4);
  expectRefused("/* e0 0d 05\n21 40\n", "bad-input", "does not end", "1", 4);
}

TEST(HexTextInput, LosesOneReportToASlipAndNoOther) {
  const ReadResult result = readInput("e0 0d 05 00 21 40 24\n\nde 0x\nde 01\n\nde 02\n");
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary, bytesOf("de01"), bytesOf("de02")));
  EXPECT_THAT(result.said(), ElementsAre("bad-input 3"));
  // Neither the whole report before it, nor those that are whole in a line behind it.
  const ReadResult around = readInput("de 00\nde 01\nzz 01\ne0 0d 05 00 21 40 24\nde 02\n");
  EXPECT_THAT(around.bytes(), ElementsAre(bytesOf("de00"), bytesOf("de01"), kSummary, bytesOf("de02")));
  EXPECT_THAT(around.said(), ElementsAre("bad-input 3"));
  const ReadResult dump = readInput("00000000  de 01\n00000002\nde 0g\n");
  EXPECT_THAT(dump.bytes(), ElementsAre(bytesOf("de01")));
  EXPECT_THAT(dump.said(), ElementsAre("bad-input 3"));
}

TEST(HexTextInput, SaysWhichLinesASlipTakesWithIt) {
  const ReadResult result = readInput("e3 00 00 00\n00 00 0g 00\n00 00 00 00\n\nde 01\n");
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("de01")));
  ASSERT_THAT(result.said(), ElementsAre("bad-input 2"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("\"0g\" in column 7"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("; lines 1 to 3 are left out"));
}

TEST(HexTextInput, AWholeReportOfSeveralLinesEndsWhereTheNextBegins) {
  const std::string fault = numbered(0xE3, 57), version = bytesOf("d0312e3000");
  for (const std::size_t size : {8u, 16u, 57u}) {
    std::string text;
    for (std::size_t at = 0; at < fault.size(); at += size)
      text += digitsOf(std::string_view(fault).substr(at, size)) + "\n";
    const ReadResult result = readInput(text + "de 02\nd0 31 2e 30 00\nde 01\n");
    EXPECT_THAT(result.bytes(), ElementsAre(fault, bytesOf("de02"), version, bytesOf("de01"))) << size;
    EXPECT_THAT(result.said(), IsEmpty()) << size;
  }
}

TEST(HexTextInput, OurOwnCommentsSayTheLength) {
  const std::string text = "\xd0" + std::string(14, '\0') + "\x31\xd0" + std::string(14, '\0') + "\x32\xde\x02";
  const std::string lines =
      digitsOf(text.substr(0, 16)) + "\n" + digitsOf(text.substr(16, 16)) + "\n" + digitsOf(text.substr(32)) + "\n";
  const std::string comment = "# feature 0xD0 version, 34 bytes, device 1.7\n";
  for (const std::string between : {"", "\n"}) {
    const ReadResult result = readInput(comment + lines + between + comment + lines);
    EXPECT_THAT(result.bytes(), ElementsAre(text, text));
    EXPECT_THAT(result.said(), IsEmpty());
  }
  EXPECT_THAT(readInput(comment + lines + "e0 0d\n").bytes(), ElementsAre(text, bytesOf("e00d")));
  EXPECT_EQ(readInput("# feature 0xD0, 17 bytes\n" + lines).bytes().size(), 2u) << "within the second line";
  for (const char *other : {"# feature 0xD0 version\n", "# feature 0xD0, 34 words\n", "# feature 0xD0, x bytes\n",
                            "# a feature 0xD0, 34 bytes\n"}) {
    const ReadResult result = readInput(other + lines);
    EXPECT_THAT(result.bytes(), ElementsAre(text)) << other;
    EXPECT_THAT(result.said(), ElementsAre("report-border 3")) << other;
  }
}

TEST(HexTextInput, ACommentSaysTheLengthOfTheNextReportAlone) {
  EXPECT_THAT(readInput("# feature 0xE1, 1023 bytes\n\ne0 0d 05 00 21 40 24\nde 02\n").bytes(),
              ElementsAre(kSummary, bytesOf("de02")));
}

TEST(HexTextInput, ATextMayHaveOldBytesBehindItsZero) {
  const std::string text = bytesOf("d0342e372e322d31313833000000000076312e30206f6c640000000000000000");
  for (const std::size_t size : {8u, 16u}) {
    std::string lines;
    for (std::size_t at = 0; at < text.size(); at += size)
      lines += digitsOf(std::string_view(text).substr(at, size)) + "\n";
    const ReadResult result = readInput(lines);
    EXPECT_THAT(result.bytes(), ElementsAre(text));
    EXPECT_EQ(result.said().size(), 1u);  // "v1.0" could be an image
  }
}

TEST(HexTextInput, ATextEndsWhereItsLastLineIsShorter) {
  const std::string text = "\xd0" + std::string(20, 'v') + std::string(5, '\0');
  const std::string rows = digitsOf(text.substr(0, 16)) + "\n" + digitsOf(text.substr(16)) + "\n";
  const ReadResult result = readInput(rows + "de 02\n");
  EXPECT_THAT(result.bytes(), ElementsAre(text, bytesOf("de02")));
  EXPECT_THAT(result.said(), IsEmpty());
  // In lines as long as 'xxd -p' makes them it may go on.
  const std::string thirty = "\xd0" + std::string(28, 'v') + std::string(1, '\0');
  const ReadResult goesOn = readInput(digitsOf(thirty) + "\n" + digitsOf(thirty) + "\n");
  EXPECT_THAT(goesOn.bytes(), ElementsAre(thirty + thirty));
  EXPECT_THAT(goesOn.said(), ElementsAre("raw-many-reports 1"));
}

TEST(HexTextInput, ASlipInADumpTakesTheDumpWithIt) {
  EXPECT_THAT(readInput("00000000: de01  ..\nde 0g\n").said(), ElementsAre("bad-input 2"));
  EXPECT_THAT(readInput("000000 e1 00 00 00\n*\nzz 01\n").said(), ElementsAre("bad-input 3"));
}

TEST(HexTextInput, ReportsPaddedWithZerosAreWhole) {
  const std::string row = "00 00 00 00 00 00 00 00\n", report = "e0 0d 05 00 21 40 24 00\n" + row;
  const ReadResult result = readInput(report + report + "de 02 00 00 00 00 00 00\n" + row);
  EXPECT_EQ(result.reports.size(), 3u);
  EXPECT_THAT(result.said(), IsEmpty());
  // An ID within the layout begins nothing.
  EXPECT_THAT(readInput("dc " + digitsOf(std::string(15, '\x01')) + "\ne0 " + digitsOf(std::string(8, '\x01')) +
                        " 00 00 00 00 00 00 00\n")
                  .said(),
              IsEmpty());
}

TEST(HexTextInput, DashesPartBytes_NotDatesAndRanges) {
  EXPECT_THAT(readInput("D0-34-2E-37-\n2E-31-00\n").bytes(), ElementsAre(bytesOf("d0342e372e3100")));
  EXPECT_THAT(readInput("DE-02\n").bytes(), ElementsAre(bytesOf("de02")));
  EXPECT_THAT(readInput("e0 0d E1-02-03-04-05\n").bytes(), ElementsAre(bytesOf("e00de102030405")));
  EXPECT_THAT(readInput("E0-0D-05-00-21-40-24 # one\n").bytes(), ElementsAre(kSummary));
  EXPECT_THAT(readInput("device 11-22-33-44-55\nDE 02\n").bytes(), ElementsAre(bytesOf("de02")));
  for (const char *label : {"Reports E0-E5 of unit 3", "part 76-11", "E0-E5", "Log of E1-02-03", "the 11-14-23"}) {
    const ReadResult result = readInput(std::string(label) + "\nE0 01 02 03\n04 05 06\n");
    EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("e0010203040506"))) << label;
    EXPECT_THAT(result.said(), IsEmpty()) << label;
  }
}

TEST(HexTextInput, WordsAreLabelsWhateverTheyHold) {
  for (const char *label :
       {"log got b'OK'", "the device is dead", "commit e1a2b3c4 fixed", "serial 7712345678 found"}) {
    const ReadResult result = readInput(std::string(label) + "\nE0 01 02 03\n04 05 06\n");
    EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("e0010203040506"))) << label;
    EXPECT_THAT(result.said(), IsEmpty()) << label;
  }
  EXPECT_THAT(readInput("Feature report: E0 05 zz 00\n\nDE 01\n").said(), ElementsAre("bad-input 1"));
  EXPECT_THAT(readInput("the variable here is x = b'\\xde\\x02' now\n\nDE 01\n").said(), ElementsAre("bad-input 1"));
  EXPECT_THAT(readInput("Get feature report of it: E0 0D 05 0g 00 00 00\n\nDE 01\n").said(),
              ElementsAre("bad-input 1"));
}

TEST(HexTextInput, OneTabMayStandBeforeTheTextColumn) {
  for (const char *text : {"00000000:\te0 01 02 03 04 05 06\t.......\n", "00000000\te0 01 02 03 04 05 06\t.......\n",
                           "0000:\te0\t01\t02\t03\t04\t05\t06\t.......\n"})
    expectOne(text, bytesOf("e0010203040506"));
}

TEST(HexTextInput, WhatMayBeSeveralReportsIsSaid) {
  for (const char *text : {"DE 02, DE 01", "[\"DE 02\", \"DE 01\"]", "{0xDE,0x02},{0xDE,0x01}",
                           "00000000: de02 de01                                ....\n"}) {
    SCOPED_TRACE(text);
    const ReadResult result = readInput(text);
    EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("de02de01")));
    ASSERT_THAT(result.said(), ElementsAre("raw-many-reports 1"));
    EXPECT_THAT(result.messages[0].text, HasSubstr("would make 2 reports"));
  }
  // The last byte of the first one is missing, or the second line goes on with it.
  const ReadResult result = readInput("e0 0d 05 00 21 40\nde 02\n");
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("e00d05002140de02")));
  EXPECT_THAT(result.said(), ElementsAre("report-border 2"));
}

TEST(HexTextInput, DigitsAmongWordsThatCouldBeAReportAreSaid) {
  const ReadResult result = readInput("RX: e00d0500214024\nRX: de02\nRX: 1234\nRX: de021\nRX: 0xde02\n");
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary));
  ASSERT_THAT(result.said(), ElementsAre("report-border 2"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("\"de02\" could be a report"));
}

TEST(HexTextInput, ADeclarationOverSeveralLinesHidesNoneBeforeIt) {
  const ReadResult result =
      readInput("uint8_t a[2] = { 0xDE, 0x02 };\nuint8_t b[] =\n{\n 0xE0, 0x0D, 0x05, 0x00,\n 0x21, 0x40, 0x24,\n};\n");
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("de02"), kSummary));
  EXPECT_THAT(result.said(), IsEmpty());
}

TEST(HexTextInput, SeparatesReportsByEmptyLines) {
  const ReadResult result = readInput("e0 0d 05\n00 21 40 24\n\n\nde 01\n# between\n\nde 02 # last\n");
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary, bytesOf("de01"), bytesOf("de02")));
  ASSERT_EQ(result.reports.size(), 3u);
  EXPECT_EQ(result.reports[0].place, "1");
  EXPECT_EQ(result.reports[1].place, "5");
  EXPECT_EQ(result.reports[1].index, 1u);
  EXPECT_EQ(result.reports[1].file, "input");
  EXPECT_EQ(result.reports[1].timeNs, std::nullopt);
}

TEST(HexTextInput, AReportGoesOnAcrossACommentLine) {
  expectOne("e0 0d 05\n# the mask\n00 21 40 24\n", kSummary);
}

TEST(HexTextInput, SeparatesReportsByOffsetZero) {
  const ReadResult result = readInput(R"(00000000  e0 0d 05 00 21 40 24                              |....!@$|
00000007
00000000  de 01                                             |..|
00000002
)");
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary, bytesOf("de01")));
  EXPECT_THAT(result.said(), IsEmpty());
  EXPECT_THAT(readInput("00000000: e00d 0500 2140 24    ....!@$\n00000000: de01       ..\n").bytes(),
              ElementsAre(kSummary, bytesOf("de01")));
  EXPECT_THAT(readInput("0000000 e0 0d 05 00 21 40 24\n0000007\n0000000 de 01\n0000002\n").bytes(),
              ElementsAre(kSummary, bytesOf("de01")));
}

TEST(HexTextInput, SeparatesReportsByLabels) {
  const ReadResult result =
      readInput("First one:\ne0 0d 05 00 21 40 24\n==> second.bin <==\nde 01\nE0:\nde 02\n---\nde 03\n");
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary, bytesOf("de01"), bytesOf("de02"), bytesOf("de03")));
  EXPECT_THAT(result.said(), IsEmpty());
  EXPECT_THAT(readInput("{0xe0, 0x0d, 0x05, 0x00, 0x21, 0x40, 0x24},\n{0xde, 0x01},\n").bytes(),
              ElementsAre(kSummary, bytesOf("de01")));
}

TEST(HexTextInput, DataBehindALabelBeginAReport) {
  EXPECT_THAT(readInput("e0 0d 05\nReport: e0 0c 05 00 21 40 24\n").bytes(),
              ElementsAre(bytesOf("e00d05"), bytesOf("e00c0500214024")));
}

TEST(HexTextInput, AKnownIdAloneBeginsNoReport) {
  const std::string image = numbered(0x77, 2064);
  std::string text;
  for (std::size_t at = 0; at < image.size(); at += 7) text += digitsOf(std::string_view(image).substr(at, 7)) + "\n";
  expectOne(text, image);  // lines begin with 0xD0, 0xDE, 0xE5 ... in the middle of it
}

TEST(HexTextInput, ReadsOneReportALineWhereEachIsWhole) {
  EXPECT_THAT(readInput("e0 0d 05 00 21 40 24\ne0 0c 05 00 21 40 24\nde 01\n").bytes(),
              ElementsAre(kSummary, bytesOf("e00c0500214024"), bytesOf("de01")));
  EXPECT_THAT(readInput("e00d0500214024\ne00c0500214024\nde01\nde00\n").bytes(),
              ElementsAre(kSummary, bytesOf("e00c0500214024"), bytesOf("de01"), bytesOf("de00")));
  // What begins with no known ID belongs to the report before it, in a field of its own length too.
  expectOne("e0 0d 05 00 21 40 24\n00 01\n", bytesOf("e00d0500214024 0001"));
}

TEST(HexTextInput, ReadsRunsOfAnalysersAndOfXxdAlike) {
  const std::string image = numbered(0x76, 792), packet = numbered(0x77, 2064), full = numbered(0xE1, 1023);
  const std::string lines = digitsOf(image, "%02x", "") + "\n" + digitsOf(image, "%02x", "") + "\n" +
                            digitsOf(full, "%02x", "") + "\n" + digitsOf(packet, "%02x", "") + "\n" +
                            digitsOf(kSummary, "%02x", "") + "\n";
  EXPECT_THAT(readInput(lines).bytes(), ElementsAre(image, image, full, packet, kSummary));
  EXPECT_THAT(readInput(plainDump(image) + plainDump(image) + plainDump(full) + plainDump(packet) + plainDump(kSummary))
                  .bytes(),
              ElementsAre(image, image, full, packet, kSummary));
  EXPECT_THAT(readInput(digitsOf(image, "%02x", ":") + "\n" + digitsOf(image, "%02x", ":") + "\n").bytes(),
              ElementsAre(image, image));
}

TEST(HexTextInput, RunsOfCutReportsStayApart) {
  EXPECT_THAT(readInput("e00d050021\ne00c050021\n").bytes(), ElementsAre(bytesOf("e00d050021"), bytesOf("e00c050021")));
  EXPECT_THAT(readInput("e00d05\ne00d0500214024\n").bytes(), ElementsAre(bytesOf("e00d05"), kSummary));
  EXPECT_THAT(readInput("550102\n550304\n").bytes(), ElementsAre(bytesOf("550102"), bytesOf("550304")));
}

TEST(HexTextInput, ATextReportGoesOnUntilItsZero) {
  const std::string text = "\xd0" + std::string(70, 'A') + std::string(1, '\0');
  EXPECT_THAT(readInput(plainDump(text) + plainDump(text)).bytes(), ElementsAre(text, text));
  EXPECT_THAT(readInput("d04100\n005500\n").bytes(), ElementsAre(bytesOf("d04100"), bytesOf("005500")));
}

TEST(HexTextInput, WhatGoesOnAfterFullLinesOfXxdIsToldByItsFirstByte) {
  const std::string text = "\xd0" + std::string(28, 'A') + std::string(1, '\0');  // whole, in one full line
  const std::string rest = std::string(30, '\x55'), again = numbered(0xE0, 30);
  for (const std::string &first : {text, numbered(0xE0, 30), numbered(0x55, 30)}) {
    SCOPED_TRACE(digitsOf(first));
    EXPECT_THAT(readInput(plainDump(first) + plainDump(rest)).bytes(), ElementsAre(first + rest));
    EXPECT_THAT(readInput(plainDump(first) + plainDump(again)).bytes(), ElementsAre(first, again));
  }
}

TEST(HexTextInput, TypeFollowsFromTheIdUnlessTheUserSaysOtherwise) {
  const ReadResult result = readInput("76 01\n\ne0 0d\n\n55 01\n");
  ASSERT_EQ(result.reports.size(), 3u);
  EXPECT_EQ(result.reports[0].type, ReportType::kInput);
  EXPECT_EQ(result.reports[1].type, ReportType::kFeature);
  EXPECT_EQ(result.reports[2].id, 0x55u);
  EXPECT_TRUE(result.reports[0].typeGuessed);
  vesk::host::ReadOptions options;
  options.forcedType = ReportType::kInput;
  const ReadResult forced = readInput("e0 0d\n", {}, options);
  EXPECT_EQ(forced.reports.at(0).type, ReportType::kInput);
  EXPECT_FALSE(forced.reports.at(0).typeGuessed);
}

TEST(HexTextInput, BoundsAReport) {
  std::string lines;
  for (int i = 0; i < 4096; ++i) lines += "e0 01 02 03 04 05 06 07 08 09 0a 0b 0c 0d 0e 0f\n";
  EXPECT_EQ(readInput(lines).bytes().at(0).size(), 65536u);
  lines += "10\n";
  expectRefused(lines, "bad-input", "65536", "1", 4);
  expectRefused(digitsOf(std::string(65537, 'v')), "bad-input", "65536", "1", 4);
  expectRefused(digitsOf(std::string(70000, 'v')), "bad-input", "65536", "1", 4);
  std::string shortLines = "01 02\n", longer = "01 02 03\n";
  for (int i = 0; i < 66000; ++i) shortLines += "03\n", longer += "04 05\n";
  expectRefused(shortLines, "bad-input", "more than 65536 bytes", "65537", 4);
  expectRefused(longer, "bad-input", "more than 65536 bytes", "65536", 4);
  expectRefused("00000000: e000\n*\n0000fff0: e000\n*\n0001ffe0: 00\n", "bad-input", "65536", "5", 4);
  expectRefused(digitsOf(std::string(140000, 'v'), "%02x", ""), "bad-input", "65536", "1", 4);
}

TEST(HexTextInput, TextWithoutDataIsNoHexText) {
  EXPECT_NE(detectedKind("To whom it may concern\n\nA bad idea, added.\n"), "hex");
  EXPECT_NE(detectedKind("<?xml version=\"1.0\"?>\n<a>\n</a>\n"), "hex");
  EXPECT_NE(detectedKind("Five lines of words\nand one\nthat may\nas well\nhold data:\ne0 0d\n"), "hex");
  EXPECT_EQ(detectedKind("e0 0d 05 00 2g 40 24\n"), "hex");  // a slip in what is data otherwise
  EXPECT_NE(detectedKind("e0?\n"), "hex");
  EXPECT_THAT(readInput("# nothing\n", "hex").said(), ElementsAre("no-reports"));
}

TEST(HexTextInput, EveryCutOfEveryLayoutEndsWithAReportOrAMessage) {
  for (const std::string text : {R"(00000000: 7620 2122 2324 2526 2728 292a 2b2c 2d2e  v !"#$%&'()*+,-.
00000010: 2f30 3132 3334 3536 3738 393a 3b3c 3d3e  /0123456789:;<=>
)",
                                 R"(unsigned char b41[] = {
  0x76, 0x20, 0x21, 0x22, 0x23
};
unsigned int b41_len = 5;
)",
                                 R"(00000000  76 20 21 22 23 24 25 26  27 28 29 2a 2b 2c 2d 2e  |v !"#$%&'()*+,-.|
*
00000020
)",
                                 R"(0000000 0de0 0005 4021 0024
0000007
)",
                                 "76:01:02\n/* 76 */ \"\\x76\" # x\n"})
    for (std::size_t size = 1; size <= text.size(); ++size) {
      const ReadResult result = readInput(text.substr(0, size), "hex");
      EXPECT_TRUE(!result.reports.empty() || !result.said().empty()) << text.substr(0, size);
      for (const Found &report : result.reports) EXPECT_FALSE(report.bytes.empty());
    }
}

}  // namespace
}  // namespace test
