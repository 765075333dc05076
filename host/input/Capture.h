// USB captures as an input.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

bool isCapture(std::string_view head);
void readCapture(ByteSource &source, const ReadOptions &options, ReadSink &sink);

inline constexpr InputKind kCapture{"capture", "USB capture (pcap, pcapng)", isCapture, readCapture};

}  // namespace vesk::host
