// The list of output forms.
#include "host/output/CsvFormatter.h"
#include "host/output/Formatter.h"
#include "host/output/HexFormatter.h"
#include "host/output/JsonFormatter.h"
#include "host/output/RawFormatter.h"
#include "host/output/RecordingFormatter.h"
#include "host/output/TextFormatter.h"

namespace vesk::host {

namespace {

constexpr OutputKind kKinds[] = {
    {"text", "the display lines", makeTextFormatter},
    {"json", "one JSON document", makeJsonFormatter},
    {"jsonl", "JSON, one object a line", makeJsonLinesFormatter},
    {"csv", "samples, one row a channel", makeCsvFormatter},
    {"hex", "the reports as hex text", makeHexFormatter},
    {"raw", "the reports' bytes", makeRawFormatter},
    {"recording", "the reports as a HID recording", makeRecordingFormatter},
};

}  // namespace

std::span<const OutputKind> outputKinds() {
  return kKinds;
}

const OutputKind *findOutputKind(std::string_view name) {
  for (const OutputKind &kind : kKinds)
    if (kind.name == name) return &kind;
  return nullptr;
}

}  // namespace vesk::host
