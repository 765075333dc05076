// The black box's modules and events: the counts that are known, and the public table of blob names.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "plugin/HIDReportVeskPlugin.h"
#include "tests/reports/blackbox/ExpectedCatalogue.h"

namespace {

using namespace test;
using testing::ElementsAre;

/// The expectations themselves, before anything is compared with them.
TEST(Catalogue, ExpectationsAreWhole) {
  std::vector<std::size_t> counts;
  std::size_t functional = 0, blobs = 0;
  for (const Module &module : kModules) {
    counts.push_back(module.events.size());
    (module.isBlob() ? blobs : functional) += module.events.size();
  }
  EXPECT_THAT(counts, ElementsAre(5, 10, 6, 1, 4, 7, 7, 7, 7, 7, 7, 7, 7, 7, 17, 79, 2, 9, 26, 3, 1, 7));
  EXPECT_EQ(functional, 163u);
  EXPECT_EQ(blobs, 70u);
  EXPECT_EQ(kModules[15].events[23], "ALGS_EVENT_PIXEL_NOISE_CNT_CH_0");
  EXPECT_EQ(kModules[15].events[70], "ALGS_EVENT_PIXEL_NOISE_CNT_CH_47");
  EXPECT_EQ(kModules[12].key(2), "BLOB_LSPM_EVENT_BAD_CHECKSUM");

  for (auto orders : {kSummaryOrder, [] {
                        auto both = kFunctionalOrder;
                        both.insert(both.end(), kBlobOrder.begin(), kBlobOrder.end());
                        return both;
                      }()}) {
    std::sort(orders.begin(), orders.end());
    for (std::size_t i = 0; i < 22; ++i) EXPECT_EQ(orders.at(i), i);
  }
  for (std::size_t i = 0; i < 22; ++i) {  // the block offsets are a running sum; those of the option bytes all but one
    const std::size_t fullEnd = kFullReportOffsets[i] + 4 + 4 * counts[i];
    EXPECT_EQ(fullEnd, i == 21 ? 1023 : kFullReportOffsets[i + 1]);
    const std::size_t configurationEnd = kConfigurationOffsets[i] + counts[i] + (i == 17 ? 1 : 0);
    EXPECT_EQ(configurationEnd, i == 21 ? 241 : kConfigurationOffsets[i + 1]);
  }
}

TEST(Catalogue, BlobNames) {
  EXPECT_THAT(std::vector<std::string>(std::begin(blob_names), std::end(blob_names)),
              ElementsAre("BLOB_LAFE", "BLOB_LFCL", "BLOB_LPMp", "BLOB_LSPR", "BLOB_LSSp", "BLOB_LSSC", "BLOB_LSRx",
                          "BLOB_LSPM", "BLOB_LRTC", "BLOB_LSFN"));
  static_assert(std::extent_v<decltype(blob_names)> == 10);
  static_assert(std::is_same_v<std::remove_extent_t<decltype(blob_names)>, const char *const>);
  for (std::size_t i = 0; i < 10; ++i) EXPECT_EQ(blob_names[i], kModules[kBlobOrder[i]].name);
}

}  // namespace
