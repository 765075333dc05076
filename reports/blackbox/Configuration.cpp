// Black box configuration, feature 0xE2: one option byte for each severity level and for each event.
#include <algorithm>
#include <array>

#include "plugin/HIDReportVeskPlugin.h"
#include "reports/blackbox/Catalogue.h"
#include "reports/blackbox/OptionByte.h"

namespace vesk {
namespace {

struct Global {
  Label<40> label;
  Key key;
};
constexpr Global kGlobals[] = {
    {"Global Trace Config", "GLOBAL_CONFIG_TRACE"}, {"Global Debug Config", "GLOBAL_CONFIG_DEBUG"},
    {"Global Info Config", "GLOBAL_CONFIG_INFO"},   {"Global Warning Config", "GLOBAL_CONFIG_WARNING"},
    {"Global Error Config", "GLOBAL_CONFIG_ERROR"}, {"Global Critical Config", "GLOBAL_CONFIG_CRITICAL"},
};

constexpr std::size_t kFirstGlobal = 1;  // behind the report ID
constexpr std::size_t kFirstEvent = kFirstGlobal + std::size(kGlobals);

/// The firmware's QOR block is ten bytes long for nine events: its byte 8 belongs to nobody, and its last event is
/// byte 9.
constexpr std::size_t kQorGap = 8;

/// Where each module's option bytes start, by module index: one byte an event, and one more in QOR.
constexpr std::array<std::size_t, kModules> kModuleOffsets = [] {
  std::array<std::size_t, kModules> offsets{};
  std::size_t offset = kFirstEvent;
  for (std::size_t m = 0; m < kModules; ++m) {
    offsets[m] = offset;
    offset += kEventCounts[m] + (m == kQor ? 1 : 0);
  }
  return offsets;
}();
static_assert(kModuleOffsets[kBlobLafe] == 33 && kModuleOffsets[kHidspiMaster] == 96 && kModuleOffsets[kQor] == 194);
static_assert(kModuleOffsets[kHidspiSlave] == 204 && kModuleOffsets[kPmgr] == 233 && kModuleOffsets[kBlobLsfn] == 234);

/// Which byte holds an event's options.
constexpr std::size_t optionByte(std::size_t module, std::size_t event) {
  return kModuleOffsets[module] + event + (module == kQor && event >= kQorGap ? 1 : 0);
}

constexpr std::size_t kDoubleOpen = 3, kSingleOpen = 4;

/// Which byte the screen shows for it: OPEN_SHORT_EVENT_SINGLE_OPEN shows that of OPEN_SHORT_EVENT_DOUBLE_OPEN, for the
/// panel test sets both alike and its screens are compared by line. A dictionary holds the event's own byte.
constexpr std::size_t shownByte(std::size_t module, std::size_t event) {
  return optionByte(module, module == kOpenShortTest && event == kSingleOpen ? kDoubleOpen : event);
}

using EventBytes =
    std::array<std::array<std::uint8_t, *std::max_element(kEventCounts.begin(), kEventCounts.end())>, kModules>;

/// A byte's place for each event of each module.
consteval EventBytes eventBytes(std::size_t (*place)(std::size_t module, std::size_t event)) {
  EventBytes bytes{};
  for (std::size_t m = 0; m < kModules; ++m)
    for (std::size_t e = 0; e < kEventCounts[m]; ++e) bytes[m][e] = static_cast<std::uint8_t>(place(m, e));
  return bytes;
}
constexpr EventBytes kOptionBytes = eventBytes(optionByte);
constexpr EventBytes kShownBytes = eventBytes(shownByte);

struct Layout {
  std::array<U8, 241> bytes;  // the report ID first
};
static_assert(sizeof(Layout) == kModuleOffsets[kBlobLsfn] + kEventCounts[kBlobLsfn]);

constexpr std::size_t kEntries = [] {
  std::size_t count = std::size(kGlobals);
  for (const std::size_t events : kEventCounts) count += events;
  return count;
}();

void addEvents(DisplayLines &out, const Layout &r, ModuleIndex module) {
  const auto events = kCatalogue[module].events;
  const auto &shown = kShownBytes[module];
  using Row = Format<"%40s: %s%s">;
  constexpr std::size_t kRoom = Row::kRoom<Label<40>, TextBlock<16>, FlagText>;
  out.rows(events.size(), kRoom, [=, &r, &shown](char *row, std::size_t e) {
    const std::uint8_t option = r.bytes[shown[e]];
    return Row::write(row, events[e].label, kLevelTexts[option & kLevelMask], kFlagTexts[option >> kFlagShift]);
  });
  out.add("");
}

DisplayLines toLines(const Layout &r) {
  DisplayLines out(272, 24576);
  for (std::size_t g = 0; g < std::size(kGlobals); ++g)
    out.line<"%40s:  %s">(kGlobals[g].label, kFlagTexts[r.bytes[kFirstGlobal + g] >> kFlagShift]);
  out.add("");
  for (const ModuleIndex module : kFunctionalOrder) addEvents(out, r, module);
  for (const ModuleIndex module : kBlobOrder) {
    out.line<"%40s">(kCatalogue[module].name.text());
    addEvents(out, r, module);
  }
  return out;
}

void addEvents(Dictionary &out, const Layout &r, ModuleIndex module) {
  const auto events = kCatalogue[module].events;
  for (std::size_t e = 0; e < events.size(); ++e)
    addOption(out.addDictionary(events[e].key, 2), r.bytes[kOptionBytes[module][e]]);
}

ReportValue toValue(const Layout &r) {
  Dictionary out(kEntries, 2 * kEntries);
  for (std::size_t g = 0; g < std::size(kGlobals); ++g)
    addOption(out.addDictionary(kGlobals[g].key, 2), r.bytes[kFirstGlobal + g]);
  for (const ModuleIndex module : kFunctionalOrder) addEvents(out, r, module);
  for (const ModuleIndex module : kBlobOrder) addEvents(out, r, module);
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseBlackBoxConfig() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}
