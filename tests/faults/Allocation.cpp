// Memory that runs out: for every report, both forms and every n, the n-th allocation of a decode fails.
#include <gtest/gtest.h>

#include <cstdlib>
#include <new>
#include <optional>
#include <random>

#include "plugin/HIDReportVeskPlugin.h"
#include "tests/CaptureStdout.h"

namespace {

struct Memory {
  bool armed = false;
  std::size_t allocations = 0;  // since it was armed
  std::size_t failing = 0;      // the one that fails, counted from 1; 0 for none
  std::ptrdiff_t living = 0;    // blocks that are not yet given back
} memory;

void *allocate(std::size_t size) {
  if (memory.armed && ++memory.allocations == memory.failing) return nullptr;
  void *block = std::malloc(size == 0 ? 1 : size);
  if (block != nullptr) ++memory.living;
  return block;
}

void *allocateOrThrow(std::size_t size) {
  void *block = allocate(size);
  if (block == nullptr) throw std::bad_alloc();
  return block;
}

void release(void *block) {
  if (block != nullptr) --memory.living;
  std::free(block);
}

}  // namespace

void *operator new(std::size_t size) {
  return allocateOrThrow(size);
}
void *operator new[](std::size_t size) {
  return allocateOrThrow(size);
}
void *operator new(std::size_t size, const std::nothrow_t &) noexcept {
  return allocate(size);
}
void *operator new[](std::size_t size, const std::nothrow_t &) noexcept {
  return allocate(size);
}
void operator delete(void *block) noexcept {
  release(block);
}
void operator delete[](void *block) noexcept {
  release(block);
}
void operator delete(void *block, std::size_t) noexcept {
  release(block);
}
void operator delete[](void *block, std::size_t) noexcept {
  release(block);
}

namespace {

struct Case {
  unsigned id;
  std::size_t size;
  friend std::ostream &operator<<(std::ostream &out, const Case &c) {
    return out << c.id << " of " << c.size << " bytes";
  }
};

constexpr Case kCases[] = {{0xD0, 40},   {0xD2, 90},  {0xDC, 25}, {0xDE, 2},   {0xE0, 7},   {0xE1, 1023},
                           {0xEA, 1023}, {0xE2, 241}, {0xE3, 57}, {0xE4, 401}, {0xE5, 401}, {0xA2, 193},
                           {0xEC, 193},  {0xDF, 25},  {0xA9, 49}, {0x76, 792}, {0x77, 2064}};

std::string bytesOf(const Case &report) {
  std::mt19937 random(report.id);
  std::string bytes(report.size, '\0');
  for (char &c : bytes) c = static_cast<char>(random() & 0xFF);
  if (report.id == 0xD0 || report.id == 0xD2)  // lines longer than what a std::string keeps in itself
    for (std::size_t i = 0; i < bytes.size(); ++i) bytes[i] = i % 15 == 14 ? '\n' : 'v';
  bytes[0] = static_cast<char>(report.id);
  return bytes;
}

/// Counts while it lives, and lets the given allocation fail.
class Armed {
 public:
  explicit Armed(std::size_t failing) {
    memory.allocations = 0;
    memory.failing = failing;
    memory.armed = true;
  }
  ~Armed() { memory.armed = false; }
  Armed(const Armed &) = delete;
  Armed &operator=(const Armed &) = delete;
};

struct Decode {
  HIDReportVeskPlugin &plugin;
  const PaddedReport &report;
  unsigned id;

  ReportResult operator()() const {
    return plugin.reportToObject(report.data(), id, id == 0x76 || id == 0x77 ? 0 : 2, report.length());
  }
};

bool same(const ReportResult &a, const ReportResult &b) {
  if (a.index() != b.index()) return false;
  if (const auto *lines = std::get_if<DisplayLines>(&a)) return *lines == std::get<DisplayLines>(b);
  return std::get<ReportValue>(a) == std::get<ReportValue>(b);
}

class Allocation : public testing::TestWithParam<std::tuple<Case, bool, bool>> {};

TEST_P(Allocation, EachOneThatFailsLeavesNothingBehind) {
  // No structured binding: clang 14 cannot use one in a lambda.
  const Case report = std::get<0>(GetParam());
  const bool strings = std::get<1>(GetParam()), decimal = std::get<2>(GetParam());
  const PaddedReport padded(bytesOf(report));
  const auto plugin = HIDReportVeskPlugin::init();
  plugin->setUseStrings(strings);
  plugin->setDisplayDecimal(decimal);
  const Decode decode{*plugin, padded, report.id};

  std::size_t needed = 0;
  const ReportResult wanted = [&] {
    const Armed armed(0);
    ReportResult result = decode();
    needed = memory.allocations;
    return result;
  }();
  ASSERT_NE(wanted.index(), 0u);
  if (strings) {
    EXPECT_LE(needed, 3u) << "one block of text, one of line ends";
  }

  for (std::size_t n = 1; n <= needed; ++n) {
    const auto before = memory.living;
    bool raised = false;
    {
      const Armed armed(n);
      try {
        const ReportResult result = decode();
      } catch (const std::bad_alloc &) {
        raised = true;
      }
    }
    EXPECT_TRUE(raised) << "allocation " << n << " of " << needed;
    EXPECT_EQ(memory.living, before) << "allocation " << n;
    EXPECT_EQ(plugin->useStrings(), strings);
    ASSERT_TRUE(same(decode(), wanted)) << "after allocation " << n << " failed";
  }
}

TEST_P(Allocation, EachOneThatFailsInACopyLeavesNothingBehind) {
  const Case report = std::get<0>(GetParam());
  if (std::get<1>(GetParam())) return;  // lines cannot be copied
  const PaddedReport padded(bytesOf(report));
  const auto plugin = HIDReportVeskPlugin::init();
  const ReportResult result = Decode{*plugin, padded, report.id}();
  const auto &value = std::get<ReportValue>(result);
  std::size_t needed = 0;
  {
    const Armed armed(0);
    const ReportValue copy = value.clone();
    needed = memory.allocations;
  }
  const auto before = memory.living;
  for (std::size_t n = 1; n <= needed; ++n) {
    const Armed armed(n);
    EXPECT_THROW(value.clone(), std::bad_alloc) << n;
    memory.armed = false;
    ASSERT_EQ(memory.living, before) << n;
  }
}

TEST_P(Allocation, NothingIsPrintedWhereOneFails) {
  const Case report = std::get<0>(GetParam());
  const PaddedReport padded(bytesOf(report));
  const auto plugin = HIDReportVeskPlugin::init();
  const std::int32_t type = report.id == 0x76 || report.id == 0x77 ? 0 : 2;
  bool raised = true;
  for (std::size_t n = 1; raised; ++n) {
    raised = false;
    const std::string printed = test::captureStdout([&] {
      const Armed armed(n);
      try {
        plugin->parseReport(padded.data(), report.id, type, padded.length());
      } catch (const std::bad_alloc &) {
        raised = true;
      }
    });
    EXPECT_EQ(printed.empty(), raised) << "allocation " << n;
    EXPECT_TRUE(raised || n > 1) << "nothing was allocated";
  }
}

INSTANTIATE_TEST_SUITE_P(Reports, Allocation,
                         testing::Combine(testing::ValuesIn(kCases), testing::Bool(), testing::Bool()),
                         [](const auto &each) {
                           char name[32];
                           std::snprintf(name, sizeof(name), "%02X%s%s", std::get<0>(each.param).id,
                                         std::get<1>(each.param) ? "Lines" : "Value",
                                         std::get<2>(each.param) ? "Decimal" : "");
                           return std::string(name);
                         });

TEST(AllocationOfTheObject, InitGivesNothingWhereOneFails) {
  std::size_t needed = 0;
  {
    const Armed armed(0);
    const auto plugin = HIDReportVeskPlugin::init();
    needed = memory.allocations;
  }
  ASSERT_GT(needed, 30u);  // three tables
  const auto before = memory.living;
  for (std::size_t n = 1; n <= needed; ++n) {
    const Armed armed(n);
    const auto plugin = HIDReportVeskPlugin::init();
    memory.armed = false;
    ASSERT_EQ(plugin, nullptr) << n;
    ASSERT_EQ(memory.living, before) << n;
  }
}

TEST(AllocationOfOptions, FlagsStayAsTheyWereWhereOneFails) {
  const char *const arguments[] = {"-decimal", "-decimal"};
  for (std::size_t n = 1;; ++n) {
    const auto plugin = HIDReportVeskPlugin::init();
    plugin->setUseStrings(true);
    const auto before = memory.living;
    try {
      const Armed armed(n);
      ASSERT_TRUE(plugin->parseArgs(2, arguments));
    } catch (const std::bad_alloc &) {
      EXPECT_TRUE(plugin->useStrings());
      EXPECT_FALSE(plugin->displayDecimal());
      EXPECT_EQ(memory.living, before);
      continue;
    }
    EXPECT_GT(n, 3u);
    EXPECT_FALSE(plugin->useStrings());
    EXPECT_TRUE(plugin->displayDecimal());
    return;
  }
}

}  // namespace
