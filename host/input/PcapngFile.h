// The newer capture format, pcapng: sections of blocks, with several interfaces in one file.
#pragma once

#include <memory>

#include "host/input/CaptureFile.h"

namespace vesk::host {

std::unique_ptr<CaptureFile> openPcapng(ByteSource &source, ReadSink &sink);

}  // namespace vesk::host
