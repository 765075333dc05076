// Hands padded reports to the plug-in and judges what it was given.
#include "host/decode/Decoder.h"

#include <algorithm>
#include <stdexcept>

#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

std::string bytesText(std::size_t count) {
  return std::to_string(count) + (count == 1 ? " byte" : " bytes");
}

}  // namespace

Decoder::Decoder(const Options &options) : options_(options), plugin_(HIDReportVeskPlugin::init()) {
  const char *const arguments[] = {"-decimal"};
  if (plugin_ == nullptr || !plugin_->parseArgs(options.decimal ? 1 : 0, arguments))
    throw std::runtime_error("the plug-in could not be started");
}

void Decoder::find(const MessageKind &kind, std::string text) {
  const Severity severity = kind.lenient && options_.lenient ? Severity::kWarning : kind.severity;
  decoded_.findings.push_back({&kind, severity, std::move(text)});
}

void Decoder::judgeLength(const SourceReport &report) {
  const KnownReport *known = findReport(report.id);
  const std::size_t length = report.bytes.size();
  if (known == nullptr) {
    find(kUnknownReport, "no report of the controller has this ID");
  } else if (known->type != report.type) {
    find(kWrongType, "handed over as " + std::string(typeName(report.type)) + " report, but " +
                         std::string(known->name) + " is a report of type " + std::string(typeName(known->type)));
  } else if (known->length == KnownReport::Length::kExact) {
    if (length != known->layoutSize)
      find(kWrongLength,
           bytesText(length) + " long, exactly " + std::to_string(known->layoutSize) + " expected; not decoded");
  } else if (length < known->layoutSize) {
    find(kShortReport, bytesText(length) + " long, " + std::to_string(known->layoutSize) +
                           " expected; the missing ones are read as zero");
  } else if (known->length == KnownReport::Length::kText) {
    if (report.bytes.find('\0', 1) == std::string_view::npos)
      find(kUnterminatedText, "the text has no terminating zero; it ends with the report");
  } else if (length > known->layoutSize) {
    find(kTrailingBytes, bytesText(length - known->layoutSize) + " behind the layout's " +
                             std::to_string(known->layoutSize) + "; not decoded");
  }
}

ReportResult Decoder::run(const SourceReport &report, bool strings) {
  plugin_->setUseStrings(strings);
  try {
    return plugin_->reportToObject(padded_.data(), report.id, static_cast<std::int32_t>(report.type), padded_.length());
  } catch (const std::out_of_range &raised) {
    find(kDecoderRaised, raised.what());
  } catch (const std::invalid_argument &raised) {
    find(kDecoderRaised, raised.what());
  }
  return {};
}

const Decoded &Decoder::decode(const SourceReport &report) {
  decoded_.lines.reset();
  decoded_.value.reset();
  decoded_.findings.clear();
  if (!options_.value && !options_.lines) return decoded_;  // an output form that passes the reports on as they are
  padded_.assign(report.bytes);
  judgeLength(report);

  if (options_.value) {
    ReportResult result = run(report, false);
    if (auto *value = std::get_if<ReportValue>(&result)) decoded_.value = std::move(*value);
  }
  if (options_.lines) {
    ReportResult result = run(report, true);
    if (auto *lines = std::get_if<DisplayLines>(&result)) decoded_.lines = std::move(*lines);
  }
  const bool nothing = !decoded_.value && !decoded_.lines;
  const bool said = std::ranges::any_of(decoded_.findings,
                                        [](const Finding &finding) { return finding.severity == Severity::kError; });
  if (nothing && !said) find(kNothingDecoded, "the decoder gave nothing: the text is not UTF-8");
  return decoded_;
}

}  // namespace vesk::host
