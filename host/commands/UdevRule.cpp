// `udev-rule`: the rule that gives users access to a device.
#include "host/device/UdevRule.h"

#include <algorithm>

#include "host/commands/Command.h"
#include "host/commands/DeviceOptions.h"
#include "host/device/Hidraw.h"
#include "host/device/OpenDevice.h"
#include "host/output/OutputFile.h"

namespace vesk::host {

namespace {

void printRule(const std::string &name, CommandContext &context) {
  Messages messages(context.messages);
  try {
    const auto devices = Hidraw().list();
    const std::string node = findDevice(devices, name);
    const auto device = std::ranges::find(devices, canonicalNode(node), &DeviceIdentity::node);
    if (device == devices.end()) throw DeviceError({&kNoDevice, node, {}, {}, "this is no HID device of this machine"});
    OutputFile("-").write(udevRule(*device));
  } catch (const DeviceError &error) {
    messages.add(error.message());
  }
  context.exitCode = messages.exitCode();
}

}  // namespace

void addUdevRule(CLI::App &app, CommandContext &context) {
  CLI::App *command = app.add_subcommand("udev-rule", "Print the udev rule that gives users access to a device");
  const auto options = std::make_shared<DeviceOptions>();
  options->addDevice(*command);
  command->callback([options, &context] { printRule(options->device, context); });
}

}  // namespace vesk::host
