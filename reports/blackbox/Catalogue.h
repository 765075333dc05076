// The black box's modules and events: their order, their counts, and the texts and keys that stand for them.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>

#include "values/PrintfFormat.h"
#include "values/ReportValue.h"

namespace vesk {

inline constexpr std::size_t kModules = 22;

/// The firmware's order: the bit number in the summary's mask, and the order of the blocks in the other two reports.
enum ModuleIndex : std::uint8_t {
  kBlackBox,
  kPse,
  kOpenShortTest,
  kScanLogger,
  kSvcSmgr,
  kBlobLafe,
  kBlobLfcl,
  kBlobLpmp,
  kBlobLspr,
  kBlobLssp,
  kBlobLssc,
  kBlobLsrx,
  kBlobLspm,
  kBlobLrtc,
  kHidspiMaster,
  kAlgs,
  kSys,
  kQor,
  kHidspiSlave,
  kOtp,
  kPmgr,
  kBlobLsfn,
};

/// Events of each module, by module index. Everything that is laid out by module follows from these counts.
inline constexpr std::array<std::size_t, kModules> kEventCounts = {5, 10, 6, 1,  4,  7, 7, 7,  7, 7, 7,
                                                                   7, 7,  7, 17, 79, 2, 9, 26, 3, 1, 7};

/// The order in which the summary lists the modules: the firmware's, but for the two HIDSPI modules side by side.
inline constexpr std::array<ModuleIndex, kModules> kSummaryOrder = {
    kBlackBox, kPse,      kOpenShortTest, kScanLogger, kSvcSmgr,  kBlobLafe, kBlobLfcl,     kBlobLpmp,
    kBlobLspr, kBlobLssp, kBlobLssc,      kBlobLsrx,   kBlobLspm, kBlobLrtc, kHidspiMaster, kHidspiSlave,
    kAlgs,     kSys,      kQor,           kOtp,        kPmgr,     kBlobLsfn};

/// The order of the full report and of the configuration: first the modules that are software, then the blobs.
inline constexpr std::array<ModuleIndex, 12> kFunctionalOrder = {kBlackBox, kPse,          kOpenShortTest, kScanLogger,
                                                                 kSvcSmgr,  kHidspiMaster, kHidspiSlave,   kAlgs,
                                                                 kSys,      kQor,          kOtp,           kPmgr};
inline constexpr std::array<ModuleIndex, 10> kBlobOrder = {kBlobLafe, kBlobLfcl, kBlobLpmp, kBlobLspr, kBlobLssp,
                                                           kBlobLssc, kBlobLsrx, kBlobLspm, kBlobLrtc, kBlobLsfn};

/// An event's text on screen and its key in a dictionary.
struct Event {
  Label<40> label;
  Key key;

  /// An event of a functional module: both are its name.
  template <std::size_t Size>
  consteval Event(const char (&name)[Size]) : label(name), key(name) {}  // NOLINT: implicit
  /// An event of a blob: the text is shared by all blobs, the key names the blob.
  template <std::size_t LabelSize, std::size_t KeySize>
  consteval Event(const char (&shared)[LabelSize], const char (&own)[KeySize]) : label(shared), key(own) {}
};

/// One module and the texts formed from its name.
struct Module {
  Key name;
  Label<40> idLabel;  // unused for blobs, whose ID line has a form of its own
  Label<40> countLabel;
  Key idKey;
  Key countKey;
  std::span<const Event> events;
};

/// By module index.
extern const std::array<Module, kModules> kCatalogue;

}  // namespace vesk
