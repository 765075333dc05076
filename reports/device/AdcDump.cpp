// ADC dump reports: one packet of captured words (input 0x77), the capture's configuration (feature 0xDC) and its state
// (feature 0xDE).
#include <array>
#include <cstddef>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr std::uint32_t kPayloadWords = 512;

struct Packet {
  U8 reportId;
  std::array<U8, 3> magic;
  U32 packetNumber;
  U32 payloadSize;
  U32 totalDumpSize;
  std::array<U32, kPayloadWords> payload;  // always shown whole, whatever payloadSize says
};
static_assert(sizeof(Packet) == 2064 && offsetof(Packet, payload) == 16);

struct Config {
  U8 reportId;
  U32 startAddress;
  U32 channelMaskLow;
  U32 channelMaskHigh;
  U32 sampleCount;
  U32 stimTimerCompare;
  U32 triggerSource;
};
static_assert(sizeof(Config) == 25 && offsetof(Config, triggerSource) == 21);

struct State {
  U8 reportId;
  U8 state;
};
static_assert(sizeof(State) == 2);

/// The three bytes overlap by design: hosts compare this number with the one that the firmware's own tools form with
/// shifts of 2, 1 and 0. On screen the bytes stand side by side instead.
std::int32_t magicValue(const Packet &r) {
  return r.magic[0] << 2 | r.magic[1] << 1 | r.magic[2];
}

Key triggerName(const Config &r) {
  return r.triggerSource == 0 ? Key("RX_EN") : Key("STIM_TIMER");
}

Key stateName(const State &r) {
  switch (r.state) {
    case 0:
      return "STANDBY";
    case 1:
      return "SINGLE";
    case 2:
      return "CONTINUOUS";
    default:
      return "INVALID";
  }
}

DisplayLines toLines(const HIDReportVeskPlugin &plugin, const Packet &r) {
  DisplayLines out(70, 5120);
  out.line<"[ADC Packet #    = %u]">(r.packetNumber);
  out.line<"[Magic Value     = 0x%02x%02x%02x]">(r.magic[0], r.magic[1], r.magic[2]);
  out.line<"[Payload Size    = %u]">(r.payloadSize);
  out.line<"[Total Dump Size = %u]">(r.totalDumpSize);
  out.add("");
  out.add("[Packet Payload Data]");
  plugin.addArrayUint32(out, r.payload.data(), kPayloadWords, "%08x ");  // words of a dump, never decimal
  return out;
}

ReportValue toValue(const HIDReportVeskPlugin &plugin, const Packet &r) {
  Dictionary out(5);
  out.add("PACKET_ID", u32(r.packetNumber));
  out.add("MAGIC_VALUE", i32(magicValue(r)));
  out.add("PAYLOAD_SIZE", u32(r.payloadSize));
  out.add("TOTAL_DUMP_SIZE", u32(r.totalDumpSize));
  out.add("PAYLOAD_DATA", plugin.arrayWithUint32Array(r.payload.data(), kPayloadWords));
  return ReportValue(std::move(out));
}

DisplayLines toLines(const Config &r) {
  DisplayLines out(7, 512);
  out.add("--ADC Dump Configuration--");
  out.add("");
  out.line<"Start Address       = 0x%08x">(r.startAddress);
  out.line<"Channel Enable Mask = %04x%08x">(r.channelMaskHigh, r.channelMaskLow);
  out.line<"Sample Count        = %u">(r.sampleCount);
  out.line<"Stim Timer Compare  = %u">(r.stimTimerCompare);
  out.line<"Trigger Source      = %s">(triggerName(r).text());
  return out;
}

ReportValue toValue(const Config &r) {
  Dictionary out(5);
  out.add("START_ADDRESS", u32(r.startAddress));
  out.add("CHANNEL_ENABLE_MASK", u64(u64(r.channelMaskHigh) << 32 | r.channelMaskLow));
  out.add("SAMPLE_COUNT", u32(r.sampleCount));
  out.add("STIM_TIMER_COMPARE", u32(r.stimTimerCompare));
  out.add("TRIGGER_SOURCE", Text(triggerName(r)));
  return ReportValue(std::move(out));
}

DisplayLines toLines(const State &r) {
  DisplayLines out(1, 64);
  out.line<"ADC Dump State: %s">(stateName(r).text());
  return out;
}

ReportValue toValue(const State &r) {
  return ReportValue(Text(stateName(r)));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseAdcDumpPacket() const {
  if (report_len_ != sizeof(vesk::Packet)) return {};
  const auto report = vesk::read<vesk::Packet>(report_buf_);
  if (useStrings_) return vesk::toLines(*this, report);
  return vesk::toValue(*this, report);
}

ReportResult HIDReportVeskPlugin::parseAdcDumpConfig() const {
  const auto report = vesk::read<vesk::Config>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}

ReportResult HIDReportVeskPlugin::parseAdcDumpState() const {
  const auto report = vesk::read<vesk::State>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}
