// What the host has to say about its inputs: each kind with a fixed code, a severity and the exit code that it calls
// for.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "host/report/SourceReport.h"

namespace vesk::host {

/// The exit codes. The highest that applies is the program's; 1 is kept free.
enum ExitCode : int {
  kExitOk = 0,
  kExitUsage = 2,       // the command line
  kExitUnreadable = 3,  // an input or a device that could not be opened or read
  kExitFindings = 4,    // a report that could not be decoded as it should be
  kExitOutput = 5,      // output that could not be written
};

enum class Severity : std::uint8_t { kNote, kWarning, kError };

std::string_view severityName(Severity severity);

/// One kind of message. `code` is part of the JSON contract and never changes its meaning.
struct MessageKind {
  std::string_view code;
  Severity severity;
  ExitCode exitCode;
  bool lenient = false;  // --lenient makes it a warning without an exit code
};

// The kinds that decoding gives. Inputs and devices define their own beside their code.
inline constexpr MessageKind kUnknownReport{"unknown-report", Severity::kError, kExitFindings};
inline constexpr MessageKind kWrongLength{"wrong-length", Severity::kError, kExitFindings};
inline constexpr MessageKind kWrongType{"wrong-type", Severity::kError, kExitFindings};
inline constexpr MessageKind kShortReport{"short-report", Severity::kError, kExitFindings, true};
inline constexpr MessageKind kDecoderRaised{"decoder-raised", Severity::kError, kExitFindings};
inline constexpr MessageKind kNothingDecoded{"nothing-decoded", Severity::kError, kExitFindings};
inline constexpr MessageKind kUnterminatedText{"unterminated-text", Severity::kWarning, kExitOk};
inline constexpr MessageKind kTrailingBytes{"trailing-bytes", Severity::kNote, kExitOk};
inline constexpr MessageKind kLostReports{"lost-reports", Severity::kWarning, kExitOk};
inline constexpr MessageKind kLossTotal{"lost-reports-total", Severity::kWarning, kExitOk};
// The kinds that every input can give.
inline constexpr MessageKind kUnreadable{"unreadable", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kUnknownInput{"unknown-input", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kBadInput{"bad-input", Severity::kError, kExitFindings};
inline constexpr MessageKind kNoReports{"no-reports", Severity::kError, kExitFindings};
inline constexpr MessageKind kInputKind{"input-kind", Severity::kNote, kExitOk};

struct Message {
  const MessageKind *kind = nullptr;
  std::string file;
  Place place;
  std::optional<std::uint32_t> reportId;
  std::string text;  // without file, place, severity and report ID, which are put before it
};

}  // namespace vesk::host
