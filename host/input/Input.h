// The inputs: what kinds there are, how each is recognised, and the functions that read them.
#pragma once

#include <optional>
#include <span>
#include <string_view>

#include "host/diagnostics/Message.h"
#include "host/input/ByteSource.h"
#include "host/report/SourceReport.h"

namespace vesk::host {

/// Takes what a reader finds, in the order in which it stands in the input.
class ReadSink {
 public:
  virtual ~ReadSink() = default;
  virtual void report(const SourceReport &report) = 0;
  virtual void message(Message message) = 0;
};

/// What the user can say about how inputs are to be read.
struct ReadOptions {
  bool split = false;                    // raw binary holds many reports one behind the other
  std::optional<ReportType> forcedType;  // the type of reports whose input does not tell it
  bool kindForced = false;               // the user named the kind, so nobody is to doubt it
};

struct InputKind {
  std::string_view name;  // as --input-format takes it
  std::string_view title;
  /// Whether an input that begins with `head` (up to kHeadSize bytes) is of this kind.
  bool (*matches)(std::string_view head);
  /// Reads to the end. Throws InputError where reading fails; everything else becomes a message.
  void (*read)(ByteSource &source, const ReadOptions &options, ReadSink &sink);
};

/// How much of an input decides its kind.
inline constexpr std::size_t kHeadSize = 4096;

/// In the order in which they are asked; the last one takes what nobody else does.
std::span<const InputKind> inputKinds();
/// By name; null where there is none.
const InputKind *findInputKind(std::string_view name);
/// By content.
const InputKind &detectInputKind(std::string_view head);

/// The type that an ID has where the input does not tell it: what the user says, else what the table of reports says.
ReportType typeOf(std::uint32_t id, const ReadOptions &options);

}  // namespace vesk::host
