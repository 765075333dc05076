// A recording of a live device: who it is and when it was, then one line a report.
#pragma once

#include <ctime>
#include <memory>
#include <string>

#include "host/device/HidNode.h"
#include "host/output/Formatter.h"

namespace vesk::host {

/// What stands at the top of a recording. Serial number, physical path and the name of this machine can tell whose
/// device it is; without `identity` they are left out.
std::string recordingHeader(const DeviceIdentity &device, bool identity, std::time_t now);

/// A comment for a report that was asked for in vain, so that a recording tells it to who reads the text; readers of
/// recordings pass over it: "# F 0xE3 error request-timeout: no answer within 5 s".
std::string failureComment(std::uint32_t id, const Finding &problem);

/// The lines of the reports alone.
std::unique_ptr<Formatter> makeDeviceRecordingFormatter();

}  // namespace vesk::host
