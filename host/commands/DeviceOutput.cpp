// One write a report, so that whoever follows the output sees it at once.
#include "host/commands/DeviceOutput.h"

#include <ctime>

#include "host/device/DeviceRecording.h"

namespace vesk::host {

namespace {

Messages::Options messageOptions(const OutputOptions &output, const CommandContext &context) {
  Messages::Options options = context.messages;
  options.lenient = output.lenient;
  return options;
}

std::unique_ptr<Formatter> makeFormatter(const OutputOptions &output, const CommandContext &context) {
  if (output.form == "recording") return makeDeviceRecordingFormatter();
  FormatOptions format = output.format;
  format.arguments = context.arguments;
  format.lenient = output.lenient;
  return findOutputKind(output.form)->make(format);
}

}  // namespace

DeviceOutput::DeviceOutput(const OutputOptions &output, const CommandContext &context, const Options &options)
    : options_(options),
      isRecording_(output.form == "recording"),
      messages_(messageOptions(output, context)),
      file_(output.file),
      formatter_(makeFormatter(output, context)),
      printer_(*formatter_, output.decimal, output.lenient) {
  formatter_->begin(buffer_);
}

void DeviceOutput::begin(const DeviceIdentity &device) {
  node_ = device.node;
  vendorProduct_ = std::uint32_t{device.vendor} << 16 | device.product;
  if (isRecording_) buffer_.append(recordingHeader(device, options_.identity, std::time(nullptr)));
  flush();
  if (options_.grows) file_.publish();
}

void DeviceOutput::report(SourceReport report) {
  report.file = node_;
  report.index = reports_;
  report.vendorProduct = vendorProduct_;
  printer_.print(report, reports_++ == 0, buffer_, reportMessages_);
  flush();
  for (Message &message : reportMessages_) messages_.add(std::move(message));
  reportMessages_.clear();
}

void DeviceOutput::failure(std::uint32_t id, const Finding &problem) {
  if (isRecording_) buffer_.append(failureComment(id, problem));
  flush();
  messages_.add({problem.kind, node_, {}, id, problem.text});
}

void DeviceOutput::finish() {
  messages_.finishFile(node_);
  formatter_->end(buffer_, {reports_, &messages_});
  flush();
  // A recording without a device is none.
  if (!isRecording_ || !node_.empty()) file_.commit();
}

void DeviceOutput::flush() {
  file_.write(buffer_.text());
  buffer_.clear();
}

}  // namespace vesk::host
