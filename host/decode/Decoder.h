// One report through the plug-in, in the forms that the output wants, with what there is to say about it.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/diagnostics/Message.h"
#include "host/report/SourceReport.h"
#include "plugin/HIDReportVeskPlugin.h"

namespace vesk::host {

/// Something about one report; file, place and report ID are those of the report.
struct Finding {
  const MessageKind *kind;
  Severity severity;
  std::string text;
};

/// What came out of one report. Either form is absent where it was not wanted or where there is none.
struct Decoded {
  std::optional<DisplayLines> lines;
  std::optional<ReportValue> value;
  std::vector<Finding> findings;
};

/// Holds one plug-in object, so it is for one thread.
class Decoder {
 public:
  struct Options {
    bool lines = true;
    bool value = false;
    bool decimal = false;
    bool lenient = false;
  };

  /// Throws std::runtime_error where the plug-in cannot be made or does not take its options.
  explicit Decoder(const Options &options);

  /// The result is good until the next call.
  const Decoded &decode(const SourceReport &report);

 private:
  void judgeLength(const SourceReport &report);
  void find(const MessageKind &kind, std::string text);
  ReportResult run(const SourceReport &report, bool strings);

  Options options_;
  std::unique_ptr<HIDReportVeskPlugin> plugin_;
  PaddedReport padded_;
  Decoded decoded_;
};

}  // namespace vesk::host
