// The keys and values in the order of the plug-in's tree.
#include "benchmarks/SaxJson.h"

#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

#include <cstdint>
#include <cstring>
#include <string>

#include "reports/blackbox/Catalogue.h"

namespace vesk::benchmarks {

namespace {

using Writer = rapidjson::Writer<rapidjson::StringBuffer>;

template <class Number>
Number at(const char *report, std::size_t offset) {
  Number number;
  std::memcpy(&number, report + offset, sizeof number);
  return number;
}

void key(Writer &writer, std::string_view name) {
  writer.Key(name.data(), static_cast<rapidjson::SizeType>(name.size()));
}

void unsignedEntry(Writer &writer, std::string_view name, std::uint32_t value) {
  key(writer, name);
  writer.Uint(value);
}

void image(Writer &writer, const char *r) {
  unsignedEntry(writer, "FRAME_NUMBER", at<std::uint32_t>(r, 4));
  unsignedEntry(writer, "FRAME_PARAMS", at<std::uint32_t>(r, 8));
  unsignedEntry(writer, "TIMESTAMP_MS", at<std::uint32_t>(r, 12));
  key(writer, "TMON_DEG_C");
  writer.Double(static_cast<double>(at<float>(r, 788)));
  unsignedEntry(writer, "TMON_PARAMS", at<std::uint32_t>(r, 784));
  unsignedEntry(writer, "COOKIE", at<std::uint8_t>(r, 1));
  unsignedEntry(writer, "FLAGS", at<std::uint16_t>(r, 2));
  const char *const blocks[] = {"D_SCAN_I", "D_SCAN_Q", "P_SCAN_I", "P_SCAN_Q"};
  std::size_t offset = 16;
  for (const char *block : blocks) {
    key(writer, block);
    writer.StartArray();
    for (unsigned i = 0; i < 48; ++i, offset += 4) writer.Int(at<std::int32_t>(r, offset));
    writer.EndArray();
  }
}

void packet(Writer &writer, const char *r) {
  unsignedEntry(writer, "PACKET_ID", at<std::uint32_t>(r, 4));
  key(writer, "MAGIC_VALUE");
  writer.Int(at<std::uint8_t>(r, 1) << 2 | at<std::uint8_t>(r, 2) << 1 | at<std::uint8_t>(r, 3));
  unsignedEntry(writer, "PAYLOAD_SIZE", at<std::uint32_t>(r, 8));
  unsignedEntry(writer, "TOTAL_DUMP_SIZE", at<std::uint32_t>(r, 12));
  key(writer, "PAYLOAD_DATA");
  writer.StartArray();
  for (unsigned i = 0; i < 512; ++i) writer.Uint(at<std::uint32_t>(r, 16 + 4 * i));
  writer.EndArray();
}

/// Calls `visit` with each module in the order of the tree, functional ones first.
template <class Visit>
void forEachModule(Visit visit) {
  for (const ModuleIndex module : kFunctionalOrder) visit(module);
  for (const ModuleIndex module : kBlobOrder) visit(module);
}

/// Where each module's part of a report begins, where a module takes `size(module)` bytes.
template <class Size>
std::array<std::size_t, kModules> offsets(std::size_t first, Size size) {
  std::array<std::size_t, kModules> all;
  for (std::size_t m = 0; m < kModules; first += size(m++)) all[m] = first;
  return all;
}

void fullReport(Writer &writer, const char *r) {
  static const auto begin = offsets(3, [](std::size_t m) { return 4 + 4 * kEventCounts[m]; });
  unsignedEntry(writer, "MODULE_COUNT", at<std::uint16_t>(r, 1));
  forEachModule([&](ModuleIndex index) {
    const Module &module = kCatalogue[index];
    key(writer, module.name.text());
    writer.StartObject();
    unsignedEntry(writer, module.idKey.text(), at<std::uint16_t>(r, begin[index]));
    if (index != kPmgr) unsignedEntry(writer, module.countKey.text(), at<std::uint16_t>(r, begin[index] + 2));
    for (std::size_t e = 0; e < module.events.size(); ++e)
      unsignedEntry(writer, module.events[e].key.text(), at<std::uint32_t>(r, begin[index] + 4 + 4 * e));
    writer.EndObject();
  });
}

void option(Writer &writer, std::string_view name, unsigned option) {
  constexpr std::string_view levels[] = {"TRACE", "DEBUG",    "INFO",    "WARNING",
                                         "ERROR", "CRITICAL", "UNKNOWN", "UNKNOWN"};
  const std::string_view level = levels[option & 7];
  key(writer, name);
  writer.StartObject();
  key(writer, "ERROR_LEVEL");
  writer.String(level.data(), static_cast<rapidjson::SizeType>(level.size()));
  key(writer, "OPTIONS_RAW");
  writer.Int(static_cast<int>(option));
  writer.EndObject();
}

void configuration(Writer &writer, const char *r) {
  static const auto begin = offsets(7, [](std::size_t m) { return kEventCounts[m] + (m == kQor ? 1 : 0); });
  const char *const globals[] = {"TRACE", "DEBUG", "INFO", "WARNING", "ERROR", "CRITICAL"};
  for (std::size_t g = 0; g < std::size(globals); ++g)
    option(writer, "GLOBAL_CONFIG_" + std::string(globals[g]), at<std::uint8_t>(r, 1 + g));
  forEachModule([&](ModuleIndex index) {
    const auto events = kCatalogue[index].events;
    for (std::size_t e = 0; e < events.size(); ++e)
      option(writer, events[e].key.text(), at<std::uint8_t>(r, begin[index] + e + (index == kQor && e == 8 ? 1 : 0)));
  });
}

}  // namespace

std::string_view saxJson(const char *report, unsigned id) {
  static rapidjson::StringBuffer buffer;
  buffer.Clear();
  Writer writer(buffer);
  writer.StartObject();
  if (id == 0x76) image(writer, report);
  if (id == 0x77) packet(writer, report);
  if (id == 0xE1) fullReport(writer, report);
  if (id == 0xE2) configuration(writer, report);
  writer.EndObject();
  return {buffer.GetString(), buffer.GetSize()};
}

}  // namespace vesk::benchmarks
