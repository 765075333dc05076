// What a filter lets through.
#include "host/report/Filter.h"

#include <gtest/gtest.h>

namespace vesk::host {
namespace {

SourceReport report(std::uint32_t id) {
  SourceReport source;
  source.id = id;
  return source;
}

TEST(Filter, AnEmptyOneWantsEverything) {
  EXPECT_TRUE(Filter().wants(report(0x99)));
}

TEST(Filter, TakesReportsByNumberAndName) {
  Filter filter;
  for (const char *name : {"0xE0", "0Xe1", "226", "open-short-result"}) EXPECT_TRUE(filter.addReport(name)) << name;
  for (const std::uint32_t id : {0xE0u, 0xE1u, 0xE2u, 0xE3u}) EXPECT_TRUE(filter.wants(report(id))) << id;
  EXPECT_FALSE(filter.wants(report(0xE4)));
}

TEST(Filter, RefusesWhatNoReportIsCalled) {
  for (const char *name : {"", "0x", "0x99", "E0", "224x", "0xE0 ", "-32", "summary", "99999999999"})
    EXPECT_FALSE(Filter().addReport(name)) << name;
}

TEST(Filter, TakesOneTypeAndOneDevice) {
  Filter filter;
  filter.type = ReportType::kInput;
  EXPECT_FALSE(filter.wants(report(0xE0)));
  Filter device;
  device.setDevice("1.7");
  SourceReport source = report(0xE0);
  EXPECT_FALSE(device.wants(source));
  source.device = "1.7";
  EXPECT_TRUE(device.wants(source));
}

TEST(Filter, TakesADeviceByVendorAndProduct) {
  Filter filter;
  filter.setDevice("0x1234:0XABCD");
  SourceReport source = report(0xE0);
  source.device = "1.7";
  EXPECT_FALSE(filter.wants(source));
  source.vendorProduct = 0x1234ABCD;
  EXPECT_TRUE(filter.wants(source));
}

TEST(Filter, ANameWithAColonThatIsNoPairOfNumbersIsAName) {
  for (const char *name : {"usb:x", "1234:x", "1234:ABCDx", "1234:1ABCD", "11234:ABCD", "1234:"}) {
    Filter filter;
    filter.setDevice(name);
    SourceReport source = report(0xE0);
    source.vendorProduct = 0x1234ABCD;
    EXPECT_FALSE(filter.wants(source)) << name;
    source.device = name;
    EXPECT_TRUE(filter.wants(source)) << name;
  }
}

TEST(Filter, ASpanOfTimeHoldsItsEndsAndNoReportWithoutATime) {
  Filter filter;
  filter.fromNs = 10;
  filter.toNs = 20;
  SourceReport source = report(0xE0);
  EXPECT_FALSE(filter.wants(source));
  for (const auto &[time, wanted] : {std::pair(9, false), {10, true}, {20, true}, {21, false}}) {
    source.timeNs = time;
    EXPECT_EQ(filter.wants(source), wanted) << time;
  }
  Filter to;
  to.toNs = 20;
  EXPECT_FALSE(to.wants(report(0xE0)));
}

}  // namespace
}  // namespace vesk::host
