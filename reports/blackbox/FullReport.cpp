// Black box full report, features 0xE1 and 0xEA: every module's ID, event count and counters.
#include <array>

#include "plugin/HIDReportVeskPlugin.h"
#include "reports/blackbox/Catalogue.h"

namespace vesk {
namespace {

/// What every module's block begins with; its counters follow.
struct BlockHead {
  U16 moduleId;
  U16 eventCount;
};
static_assert(sizeof(BlockHead) == 4);

/// One module's block within a layout.
struct Block {
  BlockHead head;
  const char *counters;

  U32 counter(std::size_t event) const { return read<U32>(counters + sizeof(U32) * event); }
};

constexpr std::size_t kFirstBlock = 3;  // behind the report ID and the module count

constexpr std::size_t blockSize(std::size_t module) {
  return sizeof(BlockHead) + sizeof(U32) * kEventCounts[module];
}

/// Where each module's block starts in the report, by module index.
constexpr std::array<std::size_t, kModules> kBlockOffsets = [] {
  std::array<std::size_t, kModules> offsets{};
  std::size_t offset = kFirstBlock;
  for (std::size_t m = 0; m < kModules; offset += blockSize(m++)) offsets[m] = offset;
  return offsets;
}();
static_assert(kBlockOffsets[kBlobLafe] == 127 && kBlockOffsets[kHidspiMaster] == 415 && kBlockOffsets[kAlgs] == 487);
static_assert(kBlockOffsets[kHidspiSlave] == 859 && kBlockOffsets[kPmgr] == 983 && kBlockOffsets[kBlobLsfn] == 991);

struct Layout {
  U8 reportId;
  U16 moduleCount;
  std::array<char, 1020> blocks;

  Block block(ModuleIndex module) const {
    const char *bytes = blocks.data() + (kBlockOffsets[module] - kFirstBlock);
    return {read<BlockHead>(bytes), bytes + sizeof(BlockHead)};
  }
};
static_assert(sizeof(Layout) == 1023 && sizeof(Layout) == kBlockOffsets[kBlobLsfn] + blockSize(kBlobLsfn));

constexpr std::size_t kEntries = [] {
  std::size_t count = 0;
  for (const std::size_t events : kEventCounts) count += 2 + events;
  return count;
}();

void addBlock(DisplayLines &out, const Layout &r, ModuleIndex index, bool isBlob) {
  const Module &module = kCatalogue[index];
  const Block block = r.block(index);
  if (isBlob)
    out.line<"%30s Module ID: 0x%04X">(module.name.text(), block.head.moduleId);
  else
    out.line<"%40s: 0x%04X">(module.idLabel, block.head.moduleId);
  out.line<"%40s: %i">(module.countLabel, block.head.eventCount);
  const auto events = module.events;
  using Row = Format<"%40s: %i">;
  out.rows(events.size(), Row::kRoom<Label<40>, U32>,
           [=](char *row, std::size_t e) { return Row::write(row, events[e].label, block.counter(e)); });
  out.add("");
}

DisplayLines toLines(const Layout &r) {
  DisplayLines out(303, 16384);
  out.add("---Black Box Full Report---");
  out.add("");
  out.line<"%40s: %i">("Module Count", r.moduleCount);
  out.add("");
  for (const ModuleIndex module : kFunctionalOrder) addBlock(out, r, module, false);
  for (const ModuleIndex module : kBlobOrder) addBlock(out, r, module, true);
  return out;
}

void addBlock(Dictionary &out, const Layout &r, ModuleIndex index) {
  const Module &module = kCatalogue[index];
  EntryAdder entries = out.addDictionary(module.name, 2 + module.events.size());
  const Block block = r.block(index);
  entries.add(module.idKey, u16(block.head.moduleId));
  // PMGR's dictionary has no event count; its lines have one.
  if (index != kPmgr) entries.add(module.countKey, u16(block.head.eventCount));
  for (std::size_t e = 0; e < module.events.size(); ++e) entries.add(module.events[e].key, u32(block.counter(e)));
}

ReportValue toValue(const Layout &r) {
  Dictionary out(1 + kModules, kEntries);
  out.add("MODULE_COUNT", u16(r.moduleCount));
  for (const ModuleIndex module : kFunctionalOrder) addBlock(out, r, module);
  for (const ModuleIndex module : kBlobOrder) addBlock(out, r, module);
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseBlackBoxFullReport() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}
