// The live view's picture, and what stands at the top of a device's recording.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

#include "host/device/DeviceRecording.h"
#include "host/device/LiveView.h"
#include "host/device/View.h"
#include "tests/host/FakeHid.h"

namespace {

using namespace vesk::host;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

/// The picture's lines, without what moves and clears.
std::vector<std::string> linesOf(const ViewState &state) {
  std::string picture = drawView(state);
  EXPECT_THAT(picture, StartsWith("\x1b[H"));
  EXPECT_TRUE(picture.ends_with("\x1b[J"));
  picture = picture.substr(3, picture.size() - 6);
  std::vector<std::string> lines;
  for (std::size_t end; (end = picture.find("\x1b[K\n")) != std::string::npos; picture.erase(0, end + 4))
    lines.push_back(picture.substr(0, end));
  EXPECT_EQ(picture, "");
  return lines;
}

ViewState small() {
  ViewState state;
  state.title = "/dev/hidraw0  Vesk";
  state.scan = "D-SCAN";
  state.inPhase = {4, 2, 0, -1, -4};
  state.quadrature = {0, 0, 0, 0, 0};
  state.frameNumber = 12345;
  state.degC = 36.5f;
  state.framesPerSecond = 59.94;
  state.lost = 3;
  state.rows = 14;
  return state;
}

TEST(View, showsNumbersAndBars) {
  std::string picture;
  for (const std::string &line : linesOf(small())) picture += line + "\n";
  EXPECT_EQ(picture,
            "/dev/hidraw0  Vesk\n"
            "frame 12345   59.9/s   36.50 degC   3 lost\n"
            "D-SCAN I, +-5\n"
            "  ▄    \n"
            "  ██   \n"
            "     ▀█\n"
            "      ▀\n"
            "D-SCAN Q, +-1\n"
            "       \n"
            "       \n"
            "       \n"
            "       \n"
            "  0\n");
}

TEST(View, anOddNumberOfLinesHasItsZeroInTheMiddleOfOne) {
  ViewState state = small();
  state.rows = 8;  // one line a chart
  state.inPhase = {1, -1, 0};
  state.quadrature = {0, 0, 0};
  EXPECT_EQ(linesOf(state)[3], "  ▀▄ ");
}

TEST(View, fullScaleReachesTheEdgesAndNoFurther) {
  ViewState state = small();
  state.inPhase = {INT32_MAX, INT32_MIN, 5'000'000};
  const auto lines = linesOf(state);
  EXPECT_EQ(lines[2], "D-SCAN I, +-4294967295");
  state.inPhase = {5, -5};
  EXPECT_THAT(linesOf(state)[3], "  █ ");
  EXPECT_THAT(linesOf(state)[6], "   █");
}

TEST(View, numbersTheChannels) {
  ViewState state = small();
  state.inPhase.assign(48, 0);
  state.quadrature.assign(48, 0);
  EXPECT_EQ(linesOf(state).back(), "  0       8       16      24      32      40");
}

TEST(View, isNoWiderAndNoTallerThanTheTerminal) {
  ViewState state = small();
  state.inPhase.assign(48, 7);
  state.quadrature.assign(48, -7);
  state.title = "Gerät äöü " + std::string(200, 'x');
  for (const std::size_t columns : {1u, 2u, 3u, 10u, 49u, 50u, 80u, 300u})
    for (const std::size_t rows : {8u, 9u, 24u, 50u, 200u}) {
      state.columns = columns;
      state.rows = rows;
      const auto lines = linesOf(state);
      EXPECT_LT(lines.size(), rows) << "the cursor needs one";
      for (const std::string &line : lines) {
        const auto width =
            std::ranges::count_if(line, [](char c) { return (static_cast<unsigned char>(c) & 0xC0) != 0x80; });
        EXPECT_LE(static_cast<std::size_t>(width), std::max<std::size_t>(columns, 2)) << columns << ": " << line;
      }
    }
}

TEST(View, waitsForAnImage) {
  ViewState state;
  state.title = "x";
  state.packets = 7;
  EXPECT_THAT(linesOf(state), ElementsAre("x", "7 ADC packets   0 lost", "waiting for a sensor image"));
}

TEST(View, theScaleIsTheNextOfOneTwoFive) {
  for (const auto &[most, scale] :
       std::initializer_list<std::pair<std::int32_t, std::uint32_t>>{{0, 1},
                                                                     {1, 1},
                                                                     {2, 2},
                                                                     {3, 5},
                                                                     {5, 5},
                                                                     {6, 10},
                                                                     {10, 10},
                                                                     {11, 20},
                                                                     {-21, 50},
                                                                     {51, 100},
                                                                     {101, 200},
                                                                     {299'999, 500'000},
                                                                     {2'000'000'000, 2'000'000'000},
                                                                     {INT32_MIN, 4'294'967'295}})
    EXPECT_EQ(viewScale({most}), scale) << most;
  EXPECT_EQ(viewScale({}), 1u);
}

TEST(View, hasTheTerminalToItselfWhileItLives) {
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  {
    LiveView view(test::controller(), "P", {});
    view.message({&kLostReports, "/dev/hidraw1", {}, 0x76, "2 lost"});
    std::string image(792, '\0');
    image[0] = 0x76;
    image[4] = 42;
    image[400] = 3;  // P-SCAN I of channel 0
    SourceReport report;
    report.bytes = image;
    report.id = 0x76;
    report.type = ReportType::kInput;
    report.timeNs = 0;
    view.report(report, {.lost = 2});
    report.timeNs = 3'000'000'000;  // by then the first one says nothing about the rate any more
    view.report(report, {.lost = 2});
    std::this_thread::sleep_for(std::chrono::milliseconds(60));
    view.idle();
    std::fflush(stderr);
  }
  const std::string screen = testing::internal::GetCapturedStdout();
  EXPECT_THAT(screen, StartsWith("\x1b[?1049h\x1b[?25l"));
  EXPECT_TRUE(screen.ends_with("\x1b[?25h\x1b[?1049l"));
  EXPECT_THAT(screen, HasSubstr("frame 42   0.0/s   0.00 degC   2 lost"));
  EXPECT_THAT(screen, HasSubstr("P-SCAN I, +-5"));
  EXPECT_EQ(screen.find("/s   0.00"), screen.find("0.0/s   0.00") + 3);
  EXPECT_EQ(screen.rfind("/s   0.00"), screen.rfind("0.0/s   0.00") + 3);
  EXPECT_NE(screen.find("frame 42"), screen.rfind("frame 42"));
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "/dev/hidraw1: warning: 0x76: 2 lost\n");
}

// --- recordings

TEST(DeviceRecording, beginsWithTheDevice) {
  DeviceIdentity device = test::controller();
  device.bus = 0x1C;
  device.vendor = 0x00AB;
  device.descriptor = std::string("\x06\x00\xFF\xC0", 4);
  device.name = "Vesk\nE: 1.0 1 00";
  const std::string header = recordingHeader(device, true, 1'700'000'000);
  EXPECT_THAT(header, StartsWith("# vesk-report "));
  EXPECT_THAT(header, HasSubstr(", 2023-11-14T22:13:20Z, on "));
  EXPECT_THAT(header, HasSubstr("\n# Bus SPI, device 00ab:5678, serial S1\n"
                                "R: 4 06 00 ff c0\n"
                                "N: Vesk E: 1.0 1 00\n"
                                "P: usb-1/input0\n"
                                "I: 1c 00ab 5678\n"));
}

TEST(DeviceRecording, leavesOutWhatTheDeviceDoesNotHave) {
  DeviceIdentity device = test::controller();
  device.serial.clear();
  device.physicalPath.clear();
  const std::string header = recordingHeader(device, true, 1'700'000'000);
  EXPECT_THAT(header, HasSubstr("\n# Bus USB, device 1234:5678\nR: "));
  EXPECT_THAT(header, HasSubstr("\nN: Vesk Controller\nI: 3 1234 5678\n"));
}

TEST(DeviceRecording, doesNotTellWhoseDeviceItIsUnlessItMay) {
  const std::string header = recordingHeader(test::controller(), false, 1'700'000'000);
  EXPECT_THAT(header, HasSubstr(", 2023-11-14T22:13:20Z\n# Bus USB, device 1234:5678\nR: "));
  EXPECT_THAT(header, Not(HasSubstr("S1")));
  EXPECT_THAT(header, Not(HasSubstr("\nP:")));
  EXPECT_THAT(header, HasSubstr("\nN: Vesk Controller\nI: 3 1234 5678\n"));
}

TEST(DeviceRecording, aFailureIsOneCommentLine) {
  constexpr MessageKind kKind{"some-code", Severity::kError, kExitFindings};
  EXPECT_EQ(failureComment(0xE3, {&kKind, Severity::kError, "no\nanswer"}), "# F 0xE3 error some-code: no answer\n");
}

TEST(DeviceRecording, linesAreThoseOfRecordings) {
  const auto formatter = makeDeviceRecordingFormatter();
  OutputBuffer out;
  std::vector<Finding> findings;
  SourceReport report;
  report.bytes = std::string_view("\x77\x00\x01", 3);
  report.type = ReportType::kInput;
  report.timeNs = 2'500'134'500;
  formatter->report(out, report, {}, true, findings);
  report.bytes = "\xE0";
  report.type = ReportType::kFeature;
  report.timeNs = 1'234'567'000'000'000;
  formatter->report(out, report, {}, false, findings);
  EXPECT_EQ(out.text(), "E: 000002.500135 3 77 00 01\nF: 1234567.000000 1 e0\n");
}

}  // namespace
