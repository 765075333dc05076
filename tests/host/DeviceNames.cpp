// How devices are recognised, named and opened, and what is said where that fails.
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <fstream>

#include "host/device/Hidraw.h"
#include "host/device/OpenDevice.h"
#include "host/device/ReportDescriptor.h"
#include "host/device/UdevRule.h"
#include "tests/host/FakeHid.h"

namespace {

using namespace vesk::host;
using test::controller;
using test::declaring;
using test::FakeNode;
using test::FakeSystem;
using test::mouse;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

std::vector<int> declared(const std::string &descriptor) {
  std::vector<int> ids;
  for (const KnownReport *report : declaredReports(descriptor)) ids.push_back(report->id);
  return ids;
}

Message errorOf(const std::function<void()> &call) {
  try {
    call();
  } catch (const DeviceError &error) {
    return error.message();
  }
  ADD_FAILURE() << "no DeviceError";
  return {};
}

// --- report descriptors

TEST(ReportDescriptor, tellsOurReportsUnderTheirTypes) {
  EXPECT_THAT(declared(declaring({0x77, 0xE0, 0x01}, {0xE0, 0xA9, 0x76, 0x02})), ElementsAre(0x77, 0xA9, 0xE0));
  EXPECT_EQ(declared(test::controllerDescriptor()).size(), 17u);
  EXPECT_THAT(declared(""), IsEmpty());
}

TEST(ReportDescriptor, itemsHaveZeroOneTwoOrFourBytes) {
  // 0x87 is a report ID with four bytes of data, 0x86 one with two; 0xB0 a feature without data.
  EXPECT_THAT(declared(std::string("\x87\xE0\0\0\0\xB1\x02\x86\xE1\0\xB0", 12)), ElementsAre(0xE0, 0xE1));
  // A report ID without data is none, and the one before it holds.
  EXPECT_THAT(declared("\x85\xE0\x84\xB1\x02"), ElementsAre(0xE0));
  // Data are no items, whatever they look like.
  EXPECT_THAT(declared(std::string("\x85\xE0\x27\x85\xE1\xB1\x02", 7)), IsEmpty());
}

TEST(ReportDescriptor, outputReportsAreNoneOfOurs) {
  EXPECT_THAT(declared("\x85\xE0\x91\x02\x85\x76\x91\x02"), IsEmpty());
}

TEST(ReportDescriptor, longItemsArePassedOver) {
  EXPECT_THAT(declared(std::string("\xFE\x03\x11\x85\xE1\xB1\x85\xE0\xB1\x02", 10)), ElementsAre(0xE0));
}

TEST(ReportDescriptor, everyCutIsBearable) {
  const std::string whole = test::controllerDescriptor() + std::string("\xFE\x03\x11\x85\xE1\xB1", 6);
  for (std::size_t size = 0; size < whole.size(); ++size) EXPECT_LE(declared(whole.substr(0, size)).size(), 17u);
}

TEST(ReportDescriptor, aControllerSpeaksMoreOfOurReportsThanChanceHas) {
  EXPECT_TRUE(speaksOurReports(test::controllerDescriptor()));
  EXPECT_TRUE(speaksOurReports(declaring({0x76, 0x77}, {}))) << "the interface with the inputs alone";
  EXPECT_TRUE(speaksOurReports(declaring({}, {0xD0, 0xD2, 0xDC, 0xDE, 0xE0, 0xE1, 0xEA, 0xE2})));
  EXPECT_FALSE(speaksOurReports(declaring({0x76}, {0xD0, 0xD2, 0xDC, 0xDE, 0xE0, 0xE1, 0xEA})));
  EXPECT_FALSE(speaksOurReports(declaring({0xD0, 0xD2, 0xDC, 0xDE, 0xE0, 0xE1, 0xEA, 0xE2}, {0x76, 0x77})));
}

// --- names

TEST(FindDevice, withoutANameItIsTheOneThatSpeaksOurReports) {
  const std::vector devices = {mouse(), controller()};
  EXPECT_EQ(findDevice(devices, ""), "/dev/hidraw1");
}

TEST(FindDevice, namesAreNodesIdsAndSerials) {
  const std::vector devices = {mouse(), controller("/dev/hidraw1", "S1"), controller("/dev/hidraw12", "S2")};
  EXPECT_EQ(findDevice(devices, "hidraw12"), "/dev/hidraw12");
  EXPECT_EQ(findDevice(devices, "S2"), "/dev/hidraw12");
  EXPECT_EQ(findDevice(devices, "046d:c077"), "/dev/hidraw0");
  EXPECT_EQ(findDevice(devices, "46D:C077"), "/dev/hidraw0");
}

TEST(FindDevice, aPathIsTakenAsItIs) {
  EXPECT_EQ(findDevice({}, "/dev/hidraw99"), "/dev/hidraw99");
  EXPECT_EQ(findDevice({}, "./node"), "./node");
}

TEST(FindDevice, amongInterfacesOfOneDeviceTheOneThatSpeaksOurReportsIsMeant) {
  DeviceIdentity keyboard = controller("/dev/hidraw0");
  keyboard.descriptor = declaring({0x01}, {});
  const std::vector devices = {keyboard, controller("/dev/hidraw1")};
  EXPECT_EQ(findDevice(devices, "1234:5678"), "/dev/hidraw1");
  EXPECT_EQ(findDevice(devices, "S1"), "/dev/hidraw1");
}

TEST(FindDevice, anAmbiguousNameListsTheCandidatesInOrder) {
  const std::vector devices = {mouse(), controller("/dev/hidraw2", "S1"), controller("/dev/hidraw10", "")};
  const Message message = errorOf([&] { findDevice(devices, "1234:5678"); });
  EXPECT_EQ(message.kind->code, "ambiguous-device");
  EXPECT_EQ(message.kind->exitCode, 2);
  EXPECT_EQ(message.text,
            "more than one device is called 1234:5678; name one of them with --device:\n"
            "  /dev/hidraw2  USB 1234:5678  Vesk Controller  serial S1  (speaks the controller's reports)\n"
            "  /dev/hidraw10  USB 1234:5678  Vesk Controller  (speaks the controller's reports)");
}

TEST(FindDevice, aNameOfNothingListsWhatThereIs) {
  const std::vector devices = {mouse()};
  const Message message = errorOf([&] { findDevice(devices, "S9"); });
  EXPECT_EQ(message.kind->code, "no-device");
  EXPECT_EQ(message.kind->exitCode, 3);
  EXPECT_EQ(message.text, "no device is called S9; there are:\n  /dev/hidraw0  USB 046d:c077  Mouse");
  DeviceIdentity nameless = mouse();
  nameless.name.clear();
  EXPECT_EQ(errorOf([&] { findDevice(std::vector{nameless}, "S9"); }).text,
            "no device is called S9; there are:\n  /dev/hidraw0  USB 046d:c077");
  EXPECT_EQ(errorOf([] { findDevice({}, ""); }).text,
            "no device speaks the controller's reports; there is no HID device here");
}

TEST(FindDevice, idsAreWholeHexNumbers) {
  const std::vector devices = {mouse()};
  for (const char *name : {"046d:c077x", "046d:", ":c077", ":", "10046d:c077", "046d-c077", "0x46d:c077"})
    EXPECT_EQ(errorOf([&] { findDevice(devices, name); }).kind->code, "no-device") << name;
}

TEST(FindDevice, controlCharactersOfANameReachNoTerminal) {
  DeviceIdentity device = mouse();
  device.name = "Mo\x1B[2Juse\n\x7F";
  EXPECT_THAT(errorOf([&] { findDevice(std::vector{device}, "x"); }).text, HasSubstr("Mo [2Juse  "));
}

// --- opening

TEST(OpenDevice, opens) {
  FakeSystem system;
  system.devices = {controller()};
  system.onOpen = [](const std::string &path) {
    EXPECT_EQ(path, "/dev/hidraw1");
    return HidSystem::Opened{std::make_unique<FakeNode>()};
  };
  const Stop stop;
  EXPECT_NE(openDevice(system, "", stop), nullptr);
  EXPECT_EQ(system.opens, 1);
}

TEST(OpenDevice, triesAgainWhereRightsOrTheNodeComeLate) {
  FakeSystem system;
  system.onOpen = [&](const std::string &) -> HidSystem::Opened {
    if (system.opens == 1) return {nullptr, ENOENT};
    if (system.opens < 4) return {nullptr, EACCES};
    return {std::make_unique<FakeNode>()};
  };
  const Stop stop;
  EXPECT_NE(openDevice(system, "/dev/hidraw1", stop), nullptr);
  EXPECT_EQ(system.opens, 4);
}

TEST(OpenDevice, namesModeOwnerAndRuleWhereRightsAreMissing) {
  const std::string node = testing::TempDir() + "vesk-node";
  std::ofstream(node).close();
  ASSERT_EQ(::chmod(node.c_str(), 0640), 0);
  FakeSystem system;
  system.devices = {mouse(), controller(canonicalNode(node))};
  system.onOpen = [](const std::string &) { return HidSystem::Opened{nullptr, EACCES}; };
  const Stop stop;
  const auto begin = std::chrono::steady_clock::now();
  const Message message = errorOf([&] { openDevice(system, node, stop); });
  EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::seconds(1));
  EXPECT_EQ(message.kind->code, "device-denied");
  EXPECT_EQ(message.kind->exitCode, 3);
  EXPECT_EQ(message.file, node);
  EXPECT_THAT(message.text, StartsWith("cannot be opened: Permission denied (mode 0640, owner "));
  EXPECT_THAT(message.text, HasSubstr("ATTRS{idVendor}==\"1234\", ATTRS{idProduct}==\"5678\", TAG+=\"uaccess\""));
  EXPECT_THAT(message.text, Not(HasSubstr("046d"))) << "of this device alone";
  std::filesystem::remove(node);
}

TEST(OpenDevice, sayWhatOtherFailuresAre) {
  const Stop stop;
  for (const auto &[error, words] : {std::pair(ENODEV, "No such device"), std::pair(ENOTTY, "not a HID device node")}) {
    FakeSystem system;
    system.onOpen = [error = error](const std::string &) { return HidSystem::Opened{nullptr, error}; };
    const Message message = errorOf([&] { openDevice(system, "/dev/x", stop); });
    EXPECT_EQ(message.kind->code, "device-unopened");
    EXPECT_EQ(message.kind->exitCode, 3);
    EXPECT_THAT(message.text, HasSubstr(words));
    EXPECT_EQ(system.opens, 1) << "no use to try again";
  }
}

TEST(OpenDevice, aStopEndsTheAttempts) {
  FakeSystem system;
  Stop stop;
  system.onOpen = [&](const std::string &) {
    stop.request();
    return HidSystem::Opened{nullptr, EACCES};
  };
  EXPECT_EQ(openDevice(system, "/dev/hidraw1", stop), nullptr);
  EXPECT_EQ(system.opens, 1);
}

// --- the kernel's folders

class HidrawFolder : public testing::Test {
 protected:
  HidrawFolder() { std::filesystem::remove_all(folder_); }
  ~HidrawFolder() override { std::filesystem::remove_all(folder_); }

  void add(const std::string &node, const std::string &uevent, const std::string &descriptor) {
    std::filesystem::create_directories(folder_ / node / "device");
    std::ofstream(folder_ / node / "device/uevent") << uevent;
    std::ofstream(folder_ / node / "device/report_descriptor", std::ios::binary) << descriptor;
  }

  const std::filesystem::path folder_ = testing::TempDir() + "vesk-hidraw-class";
};

TEST_F(HidrawFolder, isReadInTheOrderOfNodes) {
  add("hidraw10", "HID_ID=001C:0000ABCD:00000001\nHID_NAME=Ger\xC3\xA4t = 1\nHID_PHYS=\nHID_UNIQ=SN 7\n", "\x85\xE0");
  add("hidraw9", "DRIVER=hid-generic\nHID_ID=0003:0000046D:0000C077\nHID_NAME=Mouse\nHID_PHYS=usb/input0\n", "");
  add("hidraw11", "", "");
  const auto devices = Hidraw(folder_).list();
  ASSERT_EQ(devices.size(), 3u);
  EXPECT_EQ(devices[0].node, "/dev/hidraw9");
  EXPECT_EQ(idsText(devices[0]), "046d:c077");
  EXPECT_EQ(devices[0].physicalPath, "usb/input0");
  EXPECT_EQ(devices[0].serial, "");
  EXPECT_EQ(devices[1].node, "/dev/hidraw10");
  EXPECT_EQ(busName(devices[1].bus), "SPI");
  EXPECT_EQ(devices[1].vendor, 0xABCD);
  EXPECT_EQ(devices[1].product, 1);
  EXPECT_EQ(devices[1].name, "Ger\xC3\xA4t = 1");
  EXPECT_EQ(devices[1].serial, "SN 7");
  EXPECT_EQ(devices[1].descriptor, "\x85\xE0");
  EXPECT_EQ(devices[2].bus, 0u) << "a device that left while it was read";
}

TEST_F(HidrawFolder, mayBeMissing) {
  EXPECT_THAT(Hidraw(folder_ / "none").list(), IsEmpty());
}

TEST(Hidraw, opensNothingButHidNodes) {
  Hidraw hidraw;
  const auto null = hidraw.open("/dev/null");
  EXPECT_EQ(null.node, nullptr);
  EXPECT_EQ(null.error, ENOTTY);
  EXPECT_EQ(hidraw.open("/dev/no-such-node").error, ENOENT);
  EXPECT_EQ(hidraw.open("/").error, ENOTTY);
}

// --- rules

TEST(UdevRule, matchesUsbDevicesByTheirAttributes) {
  const std::string rule = udevRule({"/dev/hidraw1", 0x03, 0x0A5C, 0x00EF, "", "", "", ""});
  EXPECT_THAT(rule, HasSubstr("\nKERNEL==\"hidraw*\", ATTRS{idVendor}==\"0a5c\", ATTRS{idProduct}==\"00ef\", "
                              "TAG+=\"uaccess\"\n"));
  EXPECT_THAT(rule, HasSubstr("ATTRS{idProduct}==\"00ef\", GROUP=\"plugdev\", MODE=\"0660\"\n"));
  EXPECT_THAT(rule, HasSubstr("/etc/udev/rules.d/70-"));
  EXPECT_THAT(rule, HasSubstr("udevadm control --reload-rules && udevadm trigger"));
}

TEST(UdevRule, matchesOthersByTheirHidFolder) {
  const std::string i2c = udevRule({"/dev/hidraw1", 0x18, 0x0A5C, 0x00EF, "", "", "", ""});
  EXPECT_THAT(i2c, HasSubstr("\nKERNEL==\"hidraw*\", KERNELS==\"0018:0A5C:00EF.*\", TAG+=\"uaccess\"\n"));
  EXPECT_THAT(i2c, Not(HasSubstr("ATTRS")));
  EXPECT_THAT(udevRule({"", 0x1C, 0x0A5C, 0x00EF, "", "", "", ""}), HasSubstr("KERNELS==\"001C:0A5C:00EF.*\""));
}

TEST(BusName, isWhatPeopleCallIt) {
  EXPECT_EQ(busName(0x01), "PCI");
  EXPECT_EQ(busName(0x03), "USB");
  EXPECT_EQ(busName(0x05), "Bluetooth");
  EXPECT_EQ(busName(0x06), "virtual");
  EXPECT_EQ(busName(0x18), "I2C");
  EXPECT_EQ(busName(0x19), "host");
  EXPECT_EQ(busName(0x1C), "SPI");
  EXPECT_EQ(busName(0x1D), "RMI");
  EXPECT_EQ(busName(0x1F), "ISH");
  EXPECT_EQ(busName(0x20), "SFH");
  EXPECT_EQ(busName(0x42), "bus 0x42");
}

}  // namespace
