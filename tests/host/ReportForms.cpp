// The forms that hold the reports themselves: hex text, raw bytes and recordings.
#include "tests/host/Formatting.h"

namespace {

using namespace vesk::host;
using test::format;
using test::fromHex;
using test::given;
using test::Given;
using testing::ElementsAre;
using testing::IsEmpty;

Given at(std::int64_t nanoseconds, std::string_view device, Given report) {
  report.report.timeNs = nanoseconds;
  report.report.device = device;
  return report;
}

TEST(Hex, namesEachReportAndShowsItsBytes) {
  const std::string text = format("hex", {at(3'000'412'000, "1.7", given(fromHex("E0 0D 05 00 21 40 24"))),
                                          given(std::string(17, '\xD0')), given(fromHex("99"))})
                               .text;
  EXPECT_EQ(text,
            "# feature 0xE0 black-box-summary, 7 bytes, 3.000412 s, device 1.7\n"
            "E0 0D 05 00 21 40 24\n"
            "\n"
            "# feature 0xD0 version, 17 bytes\n"
            "D0 D0 D0 D0 D0 D0 D0 D0 D0 D0 D0 D0 D0 D0 D0 D0\n"
            "D0\n"
            "\n"
            "# feature 0x99, 1 byte\n"
            "99\n"
            "\n");
}

TEST(Raw, isTheBytes) {
  const auto formatted = format("raw", {given(fromHex("DE 01")), given(fromHex("E0 0D 05 00 21 40 24"))});
  EXPECT_EQ(formatted.text, fromHex("DE 01 E0 0D 05 00 21 40 24"));
  EXPECT_THAT(formatted.codes, IsEmpty());
}

TEST(Raw, saysWhereABorderIsLost) {
  EXPECT_THAT(format("raw", {given(fromHex("DE 01 02"))}).codes, ElementsAre("raw-border"));
  EXPECT_THAT(format("raw", {given(fromHex("D0 31 2E"))}).codes, ElementsAre("raw-border"));
  EXPECT_THAT(format("raw", {given(fromHex("D0 31 00 00 32"))}).codes, ElementsAre("raw-border"));
  EXPECT_THAT(format("raw", {given(fromHex("D0 31 00 00"))}).codes, IsEmpty());
  EXPECT_THAT(format("raw", {given(fromHex("99 31"))}).codes, ElementsAre("raw-border"));
  Given other = given(fromHex("E0 0D 05 00 21 40 24"));  // what a device gave that was asked for another report
  other.report.id = 0xE3;
  EXPECT_THAT(format("raw", {other}).codes, ElementsAre("raw-border"));
  other.bytes.clear();
  EXPECT_THAT(format("raw", {other}).codes, ElementsAre("raw-border"));
}

// The lines behind the header of the first device.
std::string events(const std::string &text) {
  const std::size_t header = text.find("\nI: ");
  return header == std::string::npos ? text : text.substr(text.find('\n', header + 1) + 1);
}

TEST(Recording, hasAHeaderAndALineAReport) {
  Given image = at(0, "", given("\x76" + std::string(791, '\x05')));
  image.report.vendorProduct = 0x05AC0A1Bu;
  Given summary = at(2'500'135'000, "", given(fromHex("E0 0D 05 00 21 40 24")));
  summary.report.vendorProduct = 0x05AC0A1Bu;
  const std::string text = format("recording", {image, summary}).text;
  std::string fives;
  for (int i = 0; i < 791; ++i) fives += " 05";
  EXPECT_THAT(text, testing::StartsWith("R: "));
  EXPECT_THAT(text, testing::HasSubstr("\nN: Vesk controller\nI: 3 05ac 0a1b\nE: 000000.000000 792 76 05 05 "));
  EXPECT_EQ(events(text), "E: 000000.000000 792 76" + fives + "\nF: 000002.500135 7 e0 0d 05 00 21 40 24\n");
}

// The descriptor, walked item by item as a driver does.
TEST(Recording, itsDescriptorDeclaresEveryReport) {
  const std::string text = format("recording", {given(fromHex("DE 00"))}).text;
  const std::string line = text.substr(3, text.find('\n') - 3);
  const std::string bytes = fromHex(line.substr(line.find(' ') + 1));
  EXPECT_EQ(std::to_string(bytes.size()), line.substr(0, line.find(' ')));
  std::map<unsigned, std::pair<unsigned, unsigned>> reports;  // ID to main item and bytes with the ID
  unsigned id = 0, count = 0;
  int depth = 0;
  for (std::size_t i = 0; i < bytes.size();) {
    const auto item = static_cast<unsigned char>(bytes[i]);
    unsigned data = 0;
    const std::size_t size = (item & 3) == 3 ? 4 : item & 3;
    for (std::size_t k = size; k > 0; --k) data = data << 8 | static_cast<unsigned char>(bytes.at(i + k));
    i += 1 + size;
    switch (item & 0xFC) {
      case 0x84:
        id = data;
        break;
      case 0x94:
        count = data;
        break;
      case 0x80:
      case 0xB0:
        reports[id] = {item & 0xFCu, count + 1};
        break;
      case 0xA0:
        ++depth;
        break;
      case 0xC0:
        --depth;
        break;
      default:
        break;
    }
  }
  EXPECT_EQ(depth, 0);
  const std::map<unsigned, std::pair<unsigned, unsigned>> expected = {
      {0x76, {0x80, 792}},  {0x77, {0x80, 2064}}, {0xA2, {0xB0, 193}}, {0xA9, {0xB0, 49}},  {0xD0, {0xB0, 256}},
      {0xD2, {0xB0, 256}},  {0xDC, {0xB0, 25}},   {0xDE, {0xB0, 2}},   {0xDF, {0xB0, 25}},  {0xE0, {0xB0, 7}},
      {0xE1, {0xB0, 1023}}, {0xE2, {0xB0, 241}},  {0xE3, {0xB0, 57}},  {0xE4, {0xB0, 401}}, {0xE5, {0xB0, 401}},
      {0xEA, {0xB0, 1023}}, {0xEC, {0xB0, 193}}};
  EXPECT_EQ(reports, expected);
}

TEST(Recording, devicesAreIntroducedAsTheyTurnUp) {
  const std::string text =
      format("recording", {at(0, "1.7", given(fromHex("DE 00"))), at(0, "1.9", given(fromHex("DE 01"))),
                           at(0, "1.9", given(fromHex("DE 02"))), at(0, "1.7", given(fromHex("DE 03")))})
          .text;
  const std::string descriptor = text.substr(0, text.find('\n') + 1);
  EXPECT_EQ(text, descriptor +
                      "N: Vesk controller, device 1.7\nI: 3 0000 0000\n"
                      "F: 000000.000000 2 de 00\n"
                      "D: 1\n" +
                      descriptor +
                      "N: Vesk controller, device 1.9\nI: 3 0000 0000\n"
                      "F: 000000.000000 2 de 01\n"
                      "F: 000000.000000 2 de 02\n"
                      "D: 0\n"
                      "F: 000000.000000 2 de 03\n");
}

TEST(Recording, timesAreRoundedToMicroseconds) {
  EXPECT_EQ(events(format("recording", {at(1'499, "", given(fromHex("DE 00"))), at(1'500, "", given(fromHex("DE 00"))),
                                        at(999'999'500, "", given(fromHex("DE 00"))), given(fromHex("DE 00")),
                                        at(1'290'272'185'081'322'000, "", given(fromHex("DE 00")))})
                       .text),
            "F: 000000.000001 2 de 00\n"
            "F: 000000.000002 2 de 00\n"
            "F: 000001.000000 2 de 00\n"
            "F: 000001.000000 2 de 00\n"  // without a time of its own
            "F: 1290272185.081322 2 de 00\n");
}

TEST(Recording, whatItCannotHoldIsSaid) {
  const auto early = format("recording", {at(-1, "", given(fromHex("DE 00")))});
  EXPECT_EQ(events(early.text), "F: 000000.000000 2 de 00\n");
  EXPECT_THAT(early.codes, ElementsAre("negative-time"));
  Given output = given(fromHex("DE 00"));
  output.report.type = ReportType::kOutput;
  const auto none = format("recording", {output});
  EXPECT_EQ(none.text, "");
  EXPECT_THAT(none.codes, ElementsAre("not-recordable"));
}

TEST(OutputKinds, areFoundByName) {
  for (const std::string_view name : {"text", "json", "jsonl", "csv", "hex", "raw", "recording"}) {
    ASSERT_NE(findOutputKind(name), nullptr) << name;
    EXPECT_EQ(findOutputKind(name)->name, name);
  }
  EXPECT_EQ(outputKinds().size(), 7u);
  EXPECT_EQ(findOutputKind("xml"), nullptr);
}

}  // namespace
