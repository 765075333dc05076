// The two reports that check their length, in memory of exactly their length: not one byte behind it may be read.
#include <cstring>
#include <memory>

#include "fuzz/Check.h"
#include "fuzz/FuzzInput.h"
#include "fuzz/PrintedValue.h"
#include "plugin/HIDReportVeskPlugin.h"

namespace {

using fuzz::check;

void checkReport(std::string_view bytes, std::uint32_t id, bool decimal) {
  const auto plugin = HIDReportVeskPlugin::init();
  plugin->setDisplayDecimal(decimal);
  const std::unique_ptr<char[]> exact(new char[bytes.size()]);
  if (!bytes.empty()) std::memcpy(exact.get(), bytes.data(), bytes.size());
  const auto run = [&](bool strings) {
    plugin->setUseStrings(strings);
    return plugin->reportToObject(exact.get(), id, 0, static_cast<std::int64_t>(bytes.size()));
  };
  const ReportResult lines = run(true), value = run(false);
  if (bytes.size() != (id == 0x76 ? 792u : 2064u))
    return check(std::holds_alternative<std::monostate>(lines) && std::holds_alternative<std::monostate>(value),
                 "another length yields nothing");
  check(std::holds_alternative<DisplayLines>(lines) && std::holds_alternative<ReportValue>(value), "both forms");
  fuzz::checkSame(std::string(std::get<DisplayLines>(lines).text()),
                  fuzz::printedValue(id, std::get<ReportValue>(value), bytes, decimal), "lines against value");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  fuzz::FuzzInput input(data, size);
  const auto flags = input.take<std::uint8_t>();
  const std::string_view bytes = input.rest().substr(0, 4096);
  const std::uint32_t id = (flags & 2) != 0 ? 0x77 : 0x76;
  checkReport(bytes, id, (flags & 1) != 0);
  // The right length is rare in what a fuzzer makes, so each input is also stretched or cut to it.
  std::string whole(bytes);
  whole.resize(id == 0x76 ? 792 : 2064, '\x5A');
  checkReport(whole, id, (flags & 1) != 0);
  return 0;
}
