// What the host says of a report beside its decoded forms: lengths, types, decoders that raise or give nothing.
#include "host/decode/Decoder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

namespace vesk::host {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

SourceReport report(const std::string &bytes, ReportType type = ReportType::kFeature) {
  SourceReport source;
  source.bytes = bytes;
  source.id = static_cast<unsigned char>(bytes[0]);
  source.type = type;
  return source;
}

std::vector<std::string> codes(const Decoded &decoded) {
  std::vector<std::string> codes;
  for (const Finding &finding : decoded.findings) codes.emplace_back(finding.kind->code);
  return codes;
}

constexpr Decoder::Options kLines{true, false, false, false};
constexpr Decoder::Options kValue{false, true, false, false};

TEST(Decoder, AWholeReportGivesBothFormsAndNothingToSay) {
  Decoder decoder({true, true, false, false});
  const std::string bytes("\xE0\x0D\x05\x00\x21\x40\x24", 7);
  const Decoded &decoded = decoder.decode(report(bytes));
  ASSERT_TRUE(decoded.lines && decoded.value);
  EXPECT_EQ(decoded.lines->size(), 26u);
  EXPECT_EQ(decoded.value->at("SEVERITY_LEVEL").as<std::uint8_t>(), 13);
  EXPECT_THAT(codes(decoded), IsEmpty());
}

TEST(Decoder, AShortReportIsDecodedWithZerosAndSaid) {
  Decoder decoder(kLines);
  const Decoded &decoded = decoder.decode(report(std::string("\xE0\x0D", 2)));
  EXPECT_TRUE(decoded.lines);
  ASSERT_THAT(codes(decoded), ElementsAre("short-report"));
  EXPECT_EQ(decoded.findings[0].severity, Severity::kError);
  EXPECT_EQ(decoded.findings[0].text, "2 bytes long, 7 expected; the missing ones are read as zero");
}

TEST(Decoder, LenientMakesAShortReportAWarning) {
  Decoder decoder({true, false, false, true});
  EXPECT_EQ(decoder.decode(report("\xE0")).findings.at(0).severity, Severity::kWarning);
}

TEST(Decoder, BytesBehindTheLayoutAreNoted) {
  Decoder decoder(kLines);
  const Decoded &decoded = decoder.decode(report(std::string("\xDE\x01\x00", 3)));
  ASSERT_THAT(codes(decoded), ElementsAre("trailing-bytes"));
  EXPECT_EQ(decoded.findings[0].severity, Severity::kNote);
}

TEST(Decoder, InputReportsHaveOneLength) {
  for (const std::size_t length : {791u, 793u}) {
    Decoder decoder(kValue);
    std::string bytes(length, '\0');
    bytes[0] = '\x76';
    const Decoded &decoded = decoder.decode(report(bytes, ReportType::kInput));
    EXPECT_FALSE(decoded.value);
    EXPECT_THAT(codes(decoded), ElementsAre("wrong-length"));
  }
}

TEST(Decoder, AnIdThatNobodyKnowsAndATypeThatIsAnother) {
  Decoder decoder(kLines);
  EXPECT_THAT(codes(decoder.decode(report("\x99"))), ElementsAre("unknown-report"));
  EXPECT_THAT(codes(decoder.decode(report("\xE0", ReportType::kInput))), ElementsAre("wrong-type"));
}

TEST(Decoder, AVersionThatIsTooShortRaisesInOneFormOnly) {
  const std::string bytes("\xD2one\ntwo\0", 9);
  Decoder lines(kLines), value(kValue);
  EXPECT_EQ(lines.decode(report(bytes)).lines->size(), 2u);
  const Decoded &decoded = value.decode(report(bytes));
  EXPECT_FALSE(decoded.value);
  EXPECT_THAT(codes(decoded), ElementsAre("decoder-raised"));
}

TEST(Decoder, ATextThatIsNotUtf8IsSaidInEitherForm) {
  const std::string bytes("\xD0\xFF\0", 3);
  Decoder lines(kLines), value(kValue);
  EXPECT_THAT(codes(lines.decode(report(bytes))), ElementsAre("decoder-raised"));
  EXPECT_THAT(codes(value.decode(report(bytes))), ElementsAre("nothing-decoded"));
}

TEST(Decoder, ATextWithoutItsZeroEndsWithTheReport) {
  Decoder decoder(kLines);
  const Decoded &decoded =
      decoder.decode(report("\xD0"
                            "1.2"));
  EXPECT_EQ((*decoded.lines)[0], "1.2");
  EXPECT_THAT(codes(decoded), ElementsAre("unterminated-text"));
}

TEST(Decoder, NothingOfOneReportIsLeftInTheNext) {
  Decoder decoder(kLines);
  const std::string whole("\xE0\x0D\x05\x00\x21\x40\x24", 7);
  decoder.decode(report("\xE0"));
  EXPECT_THAT(codes(decoder.decode(report(whole))), IsEmpty());
  EXPECT_FALSE(decoder.decode(report("\x99")).lines);
}

TEST(Decoder, AFormThatDecodesNothingHasNothingToSay) {
  Decoder decoder({false, false, false, false});
  EXPECT_THAT(codes(decoder.decode(report("\x99"))), IsEmpty());
}

}  // namespace
}  // namespace vesk::host
