// Every format that is used anywhere, against the C library: random values and all special cases.
#include "values/PrintfFormat.h"

#include <gtest/gtest.h>

#include <bit>
#include <limits>
#include <random>
#include <vector>

#include "tests/Text.h"
#include "values/DisplayLines.h"

namespace {

using LongLong = unsigned long long;

/// One format both ways, as a string and as a display line. The compiler checks the C library's side.
#define EXPECT_LIKE_PRINTF(format, ...)                                \
  do {                                                                 \
    char wanted[1024];                                                 \
    std::snprintf(wanted, sizeof(wanted), format, __VA_ARGS__);        \
    ASSERT_EQ(vesk::formatted<format>(__VA_ARGS__), wanted) << format; \
    DisplayLines line;                                                 \
    line.line<format>(__VA_ARGS__);                                    \
    ASSERT_EQ(line.text(), std::string(wanted) + "\n") << format;      \
  } while (false)

std::vector<std::uint32_t> interestingWords() {
  std::vector<std::uint32_t> words;
  for (int bit = 0; bit < 32; ++bit)
    for (const std::uint32_t near : {0u, 1u, ~0u}) words.push_back((1u << bit) + near);
  for (std::uint32_t ten = 1; ten < 1'000'000'000; ten *= 10)
    for (const std::uint32_t near : {0u, ~0u}) words.push_back(ten + near), words.push_back(0u - ten - near);
  std::mt19937 random(1);
  for (int i = 0; i < 20000; ++i) words.push_back(static_cast<std::uint32_t>(random()) >> random() % 32);
  return words;
}

TEST(PrintfFormat, Words) {
  for (const std::uint32_t v : interestingWords()) {
    const auto s = static_cast<std::int32_t>(v);
    EXPECT_LIKE_PRINTF("%14d ", s);
    EXPECT_LIKE_PRINTF("%14d ", v);  // an unsigned word is read back as signed
    EXPECT_LIKE_PRINTF("%08x ", v);
    EXPECT_LIKE_PRINTF("%08x ", s);
    EXPECT_LIKE_PRINTF("[Frame # = %u]", v);
    EXPECT_LIKE_PRINTF("[Frame Params = 0x%08x]", v);
    EXPECT_LIKE_PRINTF("[Timestamp = %u ms]", v);
    EXPECT_LIKE_PRINTF("[TMON Params = 0x%08x]", v);
    EXPECT_LIKE_PRINTF("[ADC Packet #    = %u]", v);
    EXPECT_LIKE_PRINTF("[Payload Size    = %u]", v);
    EXPECT_LIKE_PRINTF("[Total Dump Size = %u]", v);
    EXPECT_LIKE_PRINTF("Start Address       = 0x%08x", v);
    EXPECT_LIKE_PRINTF("Channel Enable Mask = %04x%08x", v, ~v);
    EXPECT_LIKE_PRINTF("Sample Count        = %u", v);
    EXPECT_LIKE_PRINTF("Stim Timer Compare  = %u", v);
    EXPECT_LIKE_PRINTF("Module Count:   %i", v);
    EXPECT_LIKE_PRINTF("    Feed Count:%u", v);
    EXPECT_LIKE_PRINTF("      Register:0x%08X", v);
    EXPECT_LIKE_PRINTF("          Wake:%u", v);
    EXPECT_LIKE_PRINTF("         Sleep:%u", v);
    EXPECT_LIKE_PRINTF("INIT                : %12u ms", v);
    EXPECT_LIKE_PRINTF("INIT                : %u", v);
    EXPECT_LIKE_PRINTF("%20s: %i", "PSE", v);
    EXPECT_LIKE_PRINTF("%40s: %i", "PSE_EVENT_FS_TX_PUP", v);
  }
}

TEST(PrintfFormat, EveryHalfWord) {
  for (unsigned v = 0; v <= 0xFFFF; ++v) {
    EXPECT_LIKE_PRINTF("%40s: 0x%04X", "BLACK_BOX Module ID", v);
    EXPECT_LIKE_PRINTF("%30s Module ID: 0x%04X", "BLOB_LSFN", v);
    EXPECT_LIKE_PRINTF("[Flags = 0x%04x]", v);
  }
}

TEST(PrintfFormat, EveryByte) {
  for (unsigned v = 0; v <= 0xFF; ++v) {
    const auto byte = static_cast<std::uint8_t>(v);
    EXPECT_LIKE_PRINTF("[Cookie = 0x%02x]", byte);
    EXPECT_LIKE_PRINTF("[Magic Value     = 0x%02x%02x%02x]", byte, v ^ 0xFF, v / 2);
  }
}

TEST(PrintfFormat, LongWords) {
  std::mt19937_64 random(2);
  for (int i = 0; i < 20000; ++i) {
    const LongLong v = i < 64 ? LongLong{1} << i : i == 64 ? 0 : random() >> random() % 64;
    EXPECT_LIKE_PRINTF("Feed Timestamp:0x%016llX", v);
    EXPECT_LIKE_PRINTF("%llu %lld %llx", v, static_cast<long long>(v), v);
  }
}

TEST(PrintfFormat, Texts) {
  for (std::size_t size = 0; size < 60; ++size) {
    const std::string text(size, 'N');
    const char *name = text.c_str();
    EXPECT_LIKE_PRINTF("%20s: %i", name, 1);
    EXPECT_LIKE_PRINTF("%40s: %i", name, -1);
    EXPECT_LIKE_PRINTF("%40s: 0x%04X", name, 0x1Fu);
    EXPECT_LIKE_PRINTF("%30s Module ID: 0x%04X", name, 0xABCDu);
    EXPECT_LIKE_PRINTF("%40s", name);
    EXPECT_LIKE_PRINTF("%40s: %s %s%s%s%s%s", name, "WARNING", "MASKED ", "", name, "", "x");
    EXPECT_LIKE_PRINTF("%40s:  %s%s%s%s%s", name, "", "", "", "", "(no options set)");
    EXPECT_LIKE_PRINTF("Severity Level: %s", name);
    EXPECT_LIKE_PRINTF("Trigger Source      = %s", name);
    EXPECT_LIKE_PRINTF("ADC Dump State: %s", name);
    EXPECT_LIKE_PRINTF("Open/Short Test %s Data:", name);
    EXPECT_LIKE_PRINTF("Brownout: %s", name);
    EXPECT_LIKE_PRINTF("[%s I]", name);
    EXPECT_LIKE_PRINTF("[%s Q]", name);
    EXPECT_LIKE_PRINTF("%s %s", name, name);
    EXPECT_LIKE_PRINTF("%19s|", name);
    EXPECT_EQ(vesk::formatted<"%40s|">(std::string_view(text)), test::printed("%40s|", name));
  }
}

/// What could be taken for a part of the conversion before it.
TEST(PrintfFormat, LettersBehindAConversionAreText) {
  EXPECT_LIKE_PRINTF("%il", 5);
  EXPECT_LIKE_PRINTF("%slli", "5");
  EXPECT_LIKE_PRINTF("%lluu", LongLong{5});
  EXPECT_LIKE_PRINTF("%f.3f-0 ", 0.5);
  EXPECT_LIKE_PRINTF("%08x8", 5u);
}

TEST(PrintfFormat, AConversionIsItsFlagsWidthPrecisionAndKind) {
  const auto c = vesk::format::parseConversion("x% -19.3f%lld", 1);
  EXPECT_EQ(c.begin, 1u);
  EXPECT_EQ(c.end, 9u);
  EXPECT_EQ(c.kind, 'f');
  EXPECT_TRUE(c.left && c.blank && !c.zeros && !c.longLong);
  EXPECT_EQ(c.width, 19u);
  EXPECT_EQ(c.precision, 3u);
  const auto d = vesk::format::parseConversion("x% -19.3f%lld", 9);
  EXPECT_EQ(d.begin, 9u);
  EXPECT_EQ(d.end, 13u);
  EXPECT_EQ(d.kind, 'i');
  EXPECT_TRUE(!d.left && !d.blank && !d.zeros && d.longLong);
  EXPECT_EQ(d.width, 0u);
  EXPECT_EQ(d.precision, 6u);
}

/// In a program these end the compilation.
TEST(PrintfFormat, WhatIsNotInTheSubsetIsRefused) {
  const auto refusal = [](const char *format) -> std::string {
    try {
      vesk::format::parseConversion(format, 0);
    } catch (const char *why) {
      return why;
    }
    return "none";
  };
  for (const char *format : {"%", "%c", "%p", "%n", "%5", "%q", "%e", "%li", "%%", "%+i", "%#x", "%*i"})
    EXPECT_EQ(refusal(format), "a conversion that is not in the subset") << format;
  for (const char *format : {"%05i", "%05u", "%05s", "%05.3f"})
    EXPECT_EQ(refusal(format), "leading zeros are for hexadecimal numbers") << format;
  for (const char *format : {"%5x", "%8X"})
    EXPECT_EQ(refusal(format), "a width of hexadecimal digits wants leading zeros") << format;
  for (const char *format : {"% i", "%-s", "%-5u", "% x", "%-X"})
    EXPECT_EQ(refusal(format), "the blank flag and left alignment are for floats") << format;
  for (const char *format : {"%llf", "%lls"}) EXPECT_EQ(refusal(format), "ll is for integers") << format;
  for (const char *format : {"%.3i", "%.6x", "%.3s", "%.6u"})
    EXPECT_EQ(refusal(format), "a precision is for floats") << format;
  for (const char *format : {"%.2f", "%.5f", "%.7f", "%.0f", "%9.4f"})
    EXPECT_EQ(refusal(format), "floats have 3 or 6 decimals") << format;
  for (const char *format : {"%s", "%20s", "%i", "%14d", "%u", "%12u", "%x", "%08x", "%X", "%04X", "%f", "%.3f", "%.6f",
                             "% -13.3f", "%lli", "%llu", "%llx", "%016llX"})
    EXPECT_EQ(refusal(format), "none") << format;
}

TEST(PrintfFormat, LabelsPaddedByTheCompiler) {
  EXPECT_EQ(vesk::formatted<"%40s: %i">(vesk::Label<40>("PMGR # Events"), 7),
            test::printed("%40s: %i", "PMGR # Events", 7));
  EXPECT_EQ(vesk::formatted<"%20s: %i">(vesk::Label<20>("PSE"), -7), test::printed("%20s: %i", "PSE", -7));
  constexpr char longest[] = "0123456789012345678901234567890123456789_over";
  EXPECT_EQ(vesk::formatted<"%40s: %i">(vesk::Label<40>(longest), 7), test::printed("%40s: %i", longest, 7));
  EXPECT_EQ(vesk::formatted<"%40s|">(vesk::Label<40>("")), std::string(40, ' ') + "|");
  constexpr auto block = [] {
    vesk::TextBlock<32> words;
    words.append("MASKED ");
    words.append("GPIO_1 ");
    return words;
  }();
  EXPECT_EQ(vesk::formatted<"<%s>">(block), "<MASKED GPIO_1 >");
}

void expectFloat(float v) {
  EXPECT_LIKE_PRINTF("% -13.3f ", double{v});
  EXPECT_LIKE_PRINTF("[TMON = %f degC]", double{v});
  ASSERT_EQ(vesk::formatted<"% -13.3f ">(v), test::printed("% -13.3f ", double{v}));
}
void expectDouble(double v) {
  EXPECT_LIKE_PRINTF("Feed Wallclock:%15.3f", v);
  EXPECT_LIKE_PRINTF("% -13.3f ", v);
  EXPECT_LIKE_PRINTF("%f", v);
}

TEST(PrintfFormat, SpecialFloats) {
  using Float = std::numeric_limits<float>;
  for (const float v : {0.0f,
                        1.0f,
                        1.5f,
                        2.5f,
                        36.5f,
                        0.0005f,
                        0.0015f,
                        2.5e-3f,
                        0.9995f,
                        999.9995f,
                        0x1p-11f,
                        3 * 0x1p-4f,
                        0x1p-4f,
                        Float::min(),
                        Float::denorm_min(),
                        Float::max(),
                        Float::epsilon(),
                        Float::infinity(),
                        Float::quiet_NaN(),
                        Float::signaling_NaN(),
                        16777216.0f,
                        999999.94f,
                        9999999.0f,
                        1e7f,
                        1e20f}) {
    expectFloat(v);
    expectFloat(-v);
    expectFloat(std::nextafter(v, Float::max()));
    expectFloat(std::nextafter(v, 0.0f));
  }
  EXPECT_EQ(vesk::formatted<"% -13.3f ">(-Float::quiet_NaN()), "-nan          ");
  EXPECT_EQ(vesk::formatted<"% -13.3f ">(Float::quiet_NaN()), " nan          ");
  EXPECT_EQ(vesk::formatted<"% -13.3f ">(-0.0f), "-0.000        ");
  for (int exponent = -149; exponent < 128; ++exponent) {
    expectFloat(std::ldexp(1.0f, exponent));
    expectFloat(-std::ldexp(1.0f, exponent));
  }
}

TEST(PrintfFormat, RandomFloats) {
  std::mt19937 random(3);
  for (int i = 0; i < 100000; ++i) expectFloat(std::bit_cast<float>(static_cast<std::uint32_t>(random())));
  for (int i = 0; i < 100000; ++i) expectFloat(static_cast<float>(static_cast<std::int32_t>(random())) / 65536.0f);
}

/// Doubles that no float holds go another way than those that one does.
TEST(PrintfFormat, RandomDoubles) {
  std::mt19937_64 random(4);
  for (const double v :
       {0.0, -0.0, 0.1, 0.0005, 0.0015, 1250999.875, 18446744027136.0, 1e15, 1e22, 1.7976931348623157e308, 5e-324,
        std::numeric_limits<double>::infinity(), -std::numeric_limits<double>::infinity(),
        std::numeric_limits<double>::quiet_NaN(), -std::numeric_limits<double>::quiet_NaN()})
    expectDouble(v);
  for (int i = 0; i < 30000; ++i) {
    expectDouble(std::bit_cast<double>(random()));
    expectDouble(static_cast<double>(static_cast<std::int64_t>(random())) / 0x1p32);
    expectDouble(static_cast<double>(random() % 10'000'000) / 1000.0);
    expectDouble(double{static_cast<float>(random()) * 1e-6f});
  }
}

TEST(PrintfFormat, FieldsOfALayoutPrintAsTheirNumbers) {
  const char bytes[] = {'\xFE', '\xFF', '\xFF', '\xFF'};
  EXPECT_EQ(vesk::formatted<"%u">(vesk::read<vesk::U32>(bytes)), "4294967294");
  EXPECT_EQ(vesk::formatted<"%i">(vesk::read<vesk::U32>(bytes)), "-2");
  EXPECT_EQ(vesk::formatted<"%14d ">(vesk::read<vesk::I32>(bytes)), "            -2 ");
  EXPECT_EQ(vesk::formatted<"%04X">(vesk::read<vesk::U16>(bytes)), "FFFE");
  EXPECT_EQ(vesk::formatted<"0x%02x">(vesk::read<vesk::U8>(bytes)), "0xfe");
}

TEST(PrintfFormat, TextWithoutConversions) {
  EXPECT_EQ(vesk::formatted<"--Black Box Summary--">(), "--Black Box Summary--");
}

}  // namespace
