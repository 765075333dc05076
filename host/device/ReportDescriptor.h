// What a report descriptor tells about a device: which reports it speaks.
#pragma once

#include <string_view>
#include <vector>

#include "host/report/KnownReports.h"

namespace vesk::host {

/// The controller's reports that the descriptor declares, each under the type that it has with us, in the order of
/// knownReports(). A descriptor that ends in the middle of an item counts up to there.
std::vector<const KnownReport *> declaredReports(std::string_view descriptor);

/// Whether this is the controller, or one of the interfaces between which it divides its reports.
bool speaksOurReports(std::string_view descriptor);

}  // namespace vesk::host
