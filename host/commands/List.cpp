// `list`: the HID devices of this machine, and which of them is the controller.
#include <algorithm>
#include <cstring>

#include "host/commands/Command.h"
#include "host/device/Hidraw.h"
#include "host/device/OpenDevice.h"
#include "host/device/ReportDescriptor.h"
#include "host/device/UdevRule.h"
#include "host/output/JsonText.h"
#include "host/output/OutputFile.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

std::string declaredText(const DeviceIdentity &device) {
  const std::size_t ours = declaredReports(device.descriptor).size(), all = knownReports().size();
  if (ours == 0) return "none of ours";
  const std::string count =
      ours == all ? "all " + std::to_string(all) : std::to_string(ours) + " of " + std::to_string(all);
  return count + (speaksOurReports(device.descriptor) ? " of ours: a controller" : " of ours, by chance");
}

/// Characters, of which a name may have some that are several bytes long.
std::size_t width(const std::string &text) {
  return static_cast<std::size_t>(
      std::ranges::count_if(text, [](char c) { return (static_cast<unsigned char>(c) & 0xC0) != 0x80; }));
}

/// Columns as wide as their widest cell, two blanks apart.
std::string asTable(const std::vector<std::vector<std::string>> &rows) {
  std::vector<std::size_t> widths(rows.front().size());
  for (const auto &row : rows)
    for (std::size_t k = 0; k < row.size(); ++k) widths[k] = std::max(widths[k], width(row[k]));
  std::string table;
  for (const auto &row : rows) {
    std::string line;
    for (std::size_t k = 0; k < row.size(); ++k) line += row[k] + std::string(widths[k] + 2 - width(row[k]), ' ');
    table += line.substr(0, line.find_last_not_of(' ') + 1) + "\n";
  }
  return table;
}

std::string textList(const std::vector<DeviceIdentity> &devices) {
  std::vector<std::vector<std::string>> rows = {{"node", "bus", "ids", "name", "serial", "declared reports"}};
  for (const DeviceIdentity &device : devices)
    rows.push_back({device.node, busName(device.bus), idsText(device), printable(device.name), printable(device.serial),
                    declaredText(device)});
  return asTable(rows);
}

void appendMember(OutputBuffer &out, std::string_view key, std::string_view text) {
  appendJsonString(out, key);
  out.append(": ");
  appendJsonString(out, text);
  out.append(", ");
}

void appendDevice(OutputBuffer &out, const DeviceIdentity &device) {
  out.append('{');
  appendMember(out, "node", device.node);
  appendMember(out, "bus", busName(device.bus));
  appendMember(out, "vendor", formatted<"%04x">(std::uint32_t{device.vendor}));
  appendMember(out, "product", formatted<"%04x">(std::uint32_t{device.product}));
  appendMember(out, "name", device.name);
  appendMember(out, "serial", device.serial);
  appendMember(out, "physical_path", device.physicalPath);
  out.append("\"reports\": [");
  const auto declared = declaredReports(device.descriptor);
  for (const KnownReport *report : declared) {
    if (report != declared.front()) out.append(", ");
    appendNumber(out, report->id);
  }
  out.append("], \"is_controller\": ");
  out.append(speaksOurReports(device.descriptor) ? "true}" : "false}");
}

std::string jsonList(const std::vector<DeviceIdentity> &devices) {
  OutputBuffer out;
  out.append(R"({"format": "vesk-report-devices/1", "devices": [)");
  for (const DeviceIdentity &device : devices) {
    out.append(&device == &devices.front() ? "\n" : ",\n");
    appendDevice(out, device);
  }
  out.append(devices.empty() ? "]}\n" : "\n]}\n");
  return std::string(out.text());
}

}  // namespace

void addList(CLI::App &app, CommandContext &context) {
  CLI::App *command =
      app.add_subcommand("list", "List HID devices; the controller is known by the reports it declares");
  const auto form = std::make_shared<std::string>("text");
  command->add_option("-o,--output", *form, "output form: text, json")
      ->check(CLI::IsMember({"text", "json"}))
      ->type_name("FORM")
      ->capture_default_str();
  command->callback([form, &context] {
    Messages messages(context.messages);
    std::vector<DeviceIdentity> devices;
    try {
      devices = Hidraw().list();
    } catch (const DeviceError &error) {
      messages.add(error.message());
    }
    for (const DeviceIdentity &device : devices)
      if (device.unreadable != 0)
        messages.add({&kDeviceUnopened,
                      device.node,
                      {},
                      {},
                      std::string("cannot be looked at: ") + std::strerror(device.unreadable)});
    OutputFile("-").write(*form == "json" ? jsonList(devices) : textList(devices));
    context.exitCode = messages.exitCode();
  });
}

}  // namespace vesk::host
