// Decodes what comes, and draws the last image as often as an eye can follow.
#include "host/device/LiveView.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include "host/device/OpenDevice.h"

namespace vesk::host {

namespace {

using namespace std::chrono_literals;

constexpr auto kDrawEvery = 50ms;
constexpr std::int64_t kRateWindowNs = 2'000'000'000;
constexpr std::uint32_t kSensorImage = 0x76, kAdcDumpPacket = 0x77;
// The second screen, so that what was there comes back, and no cursor.
constexpr const char *kEnter = "\x1b[?1049h\x1b[?25l\x1b[2J", *kLeave = "\x1b[?25h\x1b[?1049l";

}  // namespace

LiveView::LiveView(const DeviceIdentity &device, const std::string &scan, const Messages::Options &options)
    : node_(device.node),
      scan_(scan),
      held_(std::tmpfile()),
      messages_(options, held_ != nullptr ? held_ : stderr),
      decoder_({.lines = false, .value = true}) {
  state_.title = device.node + "  " + printable(device.name);
  state_.scan = scan + "-SCAN";
  screen_.write(kEnter);
}

LiveView::~LiveView() {
  try {
    screen_.write(kLeave);
  } catch (...) {  // the terminal has gone, and with it what there was to restore
  }
  if (held_ == nullptr) return;
  std::rewind(held_);
  for (int c; (c = std::getc(held_)) != EOF;) std::putc(c, stderr);
  std::fclose(held_);
}

void LiveView::report(const SourceReport &report, const LossCounter::Total &losses) {
  state_.lost = losses.lost;
  const Decoded &decoded = decoder_.decode(report);
  for (const Finding &finding : decoded.findings) failure(report.id, finding);
  if (report.id == kSensorImage && decoded.value) {
    imageTimes_.push_back(*report.timeNs);
    while (imageTimes_.back() - imageTimes_.front() > kRateWindowNs) imageTimes_.pop_front();
    takeImage(*decoded.value);
  }
  if (report.id == kAdcDumpPacket) ++state_.packets;
  draw();
}

void LiveView::failure(std::uint32_t id, const Finding &problem) {
  messages_.add({problem.kind, node_, {}, id, problem.text});
}

void LiveView::takeImage(const ReportValue &image) {
  state_.frameNumber = image.at("FRAME_NUMBER").as<std::uint32_t>();
  state_.degC = image.at("TMON_DEG_C").as<float>();
  state_.inPhase = image.at(scan_ + "_SCAN_I").as<std::vector<std::int32_t>>();
  state_.quadrature = image.at(scan_ + "_SCAN_Q").as<std::vector<std::int32_t>>();
  const std::int64_t window = imageTimes_.back() - imageTimes_.front();
  state_.framesPerSecond =
      window > 0 ? static_cast<double>(imageTimes_.size() - 1) * 1e9 / static_cast<double>(window) : 0;
}

void LiveView::draw() {
  const auto now = std::chrono::steady_clock::now();
  if (now - drawn_ < kDrawEvery) return;
  drawn_ = now;
  if (winsize size{}; ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col != 0) {
    state_.columns = size.ws_col;
    state_.rows = size.ws_row;
  }
  screen_.write(drawView(state_));
}

}  // namespace vesk::host
