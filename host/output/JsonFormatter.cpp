// Records, messages and the envelope around them.
#include "host/output/JsonFormatter.h"

#include "host/output/JsonText.h"
#include "host/output/JsonValue.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

constexpr std::string_view kEnvelope = R"({"format":"vesk-report/1","tool":{"version":)";

void appendStringOrNull(OutputBuffer &out, std::string_view text) {
  if (text.empty())
    out.append("null");
  else
    appendJsonString(out, text);
}

void appendSource(OutputBuffer &out, const SourceReport &report) {
  out.append(R"({"source":{"file":)");
  appendJsonString(out, report.file);
  out.append(R"(,"index":)");
  appendNumber(out, report.index);
  out.append(R"(,"time":)");
  if (report.timeNs)
    appendSeconds(out, *report.timeNs);
  else
    out.append("null");
  out.append(R"(,"device":)");
  appendStringOrNull(out, report.device);
}

void appendReport(OutputBuffer &out, const SourceReport &report) {
  out.append(R"(},"report":{"id":)");
  appendNumber(out, report.id);
  out.append(R"(,"hex":")");
  out.advanceTo(writeHex(out.room(kNumberRoom), report.id, 2, true));
  out.append(R"(","type":")");
  out.append(typeName(report.type));
  out.append(report.typeGuessed ? R"(","type_guessed":true,"name":)" : R"(","name":)");
  const KnownReport *known = findReport(report.id);
  appendStringOrNull(out, known == nullptr ? "" : known->name);
  out.append(R"(,"length":)");
  appendNumber(out, std::uint64_t{report.bytes.size()});
}

void appendValue(OutputBuffer &out, const std::optional<ReportValue> &value) {
  out.append(R"(},"value":)");
  bool lossy = false;
  if (value)
    lossy = appendJsonValue(out, *value);
  else
    out.append("null");
  out.append(R"(,"exact":)");
  if (lossy)
    appendExact(out, *value);
  else
    out.append("{}");
}

void appendLines(OutputBuffer &out, const std::optional<DisplayLines> &lines) {
  out.append(R"(,"lines":)");
  if (!lines) return out.append("null");
  out.append('[');
  for (std::size_t i = 0; i < lines->size(); ++i) {
    if (i != 0) out.append(',');
    appendJsonString(out, (*lines)[i]);
  }
  out.append(']');
}

void appendCodeAndSeverity(OutputBuffer &out, const MessageKind &kind, Severity severity) {
  out.append(R"({"code":)");
  appendJsonString(out, kind.code);
  out.append(R"(,"severity":")");
  out.append(severityName(severity));
}

/// The findings of the decoder; what the form finds is never about JSON.
void appendFindings(OutputBuffer &out, const std::vector<Finding> &findings) {
  out.append(R"(,"messages":[)");
  for (const Finding &finding : findings) {
    if (&finding != &findings.front()) out.append(',');
    appendCodeAndSeverity(out, *finding.kind, finding.severity);
    out.append(R"(","text":)");
    appendJsonString(out, finding.text);
    out.append('}');
  }
  out.append(']');
}

void appendPlace(OutputBuffer &out, const Place &place) {
  constexpr std::string_view kKinds[] = {"", "line", "packet", "offset"};
  if (place.kind == Place::Kind::kNone) return out.append("null");
  out.append(R"({"kind":")");
  out.append(kKinds[static_cast<std::size_t>(place.kind)]);
  out.append(R"(","number":)");
  appendNumber(out, place.number);
  out.append('}');
}

void appendMessage(OutputBuffer &out, const Messages::Kept &kept) {
  const Message &message = kept.first;
  appendCodeAndSeverity(out, *message.kind, kept.severity);
  out.append(R"(","file":)");
  appendStringOrNull(out, message.file);
  out.append(R"(,"place":)");
  appendPlace(out, message.place);
  out.append(R"(,"report_id":)");
  if (message.reportId)
    appendNumber(out, *message.reportId);
  else
    out.append("null");
  out.append(R"(,"text":)");
  appendJsonString(out, message.text);
  out.append(R"(,"count":)");
  appendNumber(out, kept.count);
  out.append('}');
}

void appendMessages(OutputBuffer &out, const Messages &messages) {
  out.append(R"(,"messages":[)");
  for (const Messages::Kept &kept : messages.kept()) {
    if (&kept != &messages.kept().front()) out.append(',');
    appendMessage(out, kept);
  }
  out.append(R"(],"exit_status":)");
  appendNumber(out, std::int32_t{messages.exitCode()});
  out.append("}\n");
}

class JsonFormatter : public Formatter {
 public:
  JsonFormatter(const FormatOptions &options, bool isDocument) : options_(options), isDocument_(isDocument) {}

  bool wantsLines() const override { return options_.withLines; }
  bool wantsValue() const override { return true; }

  void begin(OutputBuffer &out) override {
    if (!isDocument_) return;
    envelope(out);
    out.append(R"(,"reports":[)");
  }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &decoded, bool first,
              std::vector<Finding> &) override {
    if (isDocument_) out.append(first ? "\n" : ",\n");
    appendSource(out, report);
    appendReport(out, report);
    appendValue(out, decoded.value);
    if (options_.withLines) appendLines(out, decoded.lines);
    if (options_.withBytes) {
      out.append(R"(,"bytes":")");
      appendHexDigits(out, report.bytes);
      out.append('"');
    }
    appendFindings(out, decoded.findings);
    out.append(isDocument_ ? "}" : "}\n");
  }

  void end(OutputBuffer &out, const Summary &summary) override {
    if (isDocument_) {
      out.append(summary.reports == 0 ? "]" : "\n]");
    } else {
      envelope(out);
      out.append(R"(,"summary":{"reports":)");
      appendNumber(out, summary.reports);
      out.append('}');
    }
    appendMessages(out, *summary.messages);
  }

 private:
  void envelope(OutputBuffer &out) const {
    out.append(kEnvelope);
    appendJsonString(out, VESK_REPORT_VERSION);
    out.append(R"(,"argv":[)");
    for (const std::string &argument : options_.arguments) {
      if (&argument != &options_.arguments.front()) out.append(',');
      appendJsonString(out, argument);
    }
    out.append("]}");
  }

  FormatOptions options_;
  bool isDocument_;
};

}  // namespace

std::unique_ptr<Formatter> makeJsonFormatter(const FormatOptions &options) {
  return std::make_unique<JsonFormatter>(options, true);
}

std::unique_ptr<Formatter> makeJsonLinesFormatter(const FormatOptions &options) {
  return std::make_unique<JsonFormatter>(options, false);
}

}  // namespace vesk::host
