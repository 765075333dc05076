// The output forms: each turns decoded reports into bytes.
#pragma once

#include <span>
#include <string>
#include <vector>

#include "host/decode/Decoder.h"
#include "host/diagnostics/Messages.h"
#include "host/output/OutputBuffer.h"
#include "host/report/SourceReport.h"

namespace vesk::host {

/// What stands at the end of a run.
struct Summary {
  std::uint64_t reports = 0;  // that went to the output
  const Messages *messages = nullptr;
};

class Formatter {
 public:
  virtual ~Formatter() = default;

  /// Which forms of a report it needs.
  virtual bool wantsLines() const { return false; }
  virtual bool wantsValue() const { return false; }
  /// Whether report() may be called from several threads at once, which it may where nothing is kept between reports.
  virtual bool isStateless() const { return true; }

  virtual void begin(OutputBuffer &) {}
  /// `first`: no report was formatted before. Findings that the form itself has are appended to `findings`.
  virtual void report(OutputBuffer &out, const SourceReport &report, const Decoded &decoded, bool first,
                      std::vector<Finding> &findings) = 0;
  virtual void end(OutputBuffer &, const Summary &) {}
};

/// What the user can say about the output.
struct FormatOptions {
  bool headers = false;
  bool withLines = false;
  bool withBytes = false;
  bool lenient = false;
  std::vector<std::string> arguments;  // the command line without the program's name, for the JSON envelope
};

struct OutputKind {
  std::string_view name;  // as -o takes it
  std::string_view title;
  std::unique_ptr<Formatter> (*make)(const FormatOptions &options);
};

std::span<const OutputKind> outputKinds();
/// Null where there is none of that name.
const OutputKind *findOutputKind(std::string_view name);

}  // namespace vesk::host
