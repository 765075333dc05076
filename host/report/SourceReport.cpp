// The words for a place in an input.
#include "host/report/SourceReport.h"

namespace vesk::host {

std::string Place::text() const {
  switch (kind) {
    case Kind::kNone:
      return {};
    case Kind::kLine:
      return std::to_string(number);
    case Kind::kPacket:
      return "packet " + std::to_string(number);
    case Kind::kOffset:
      return "offset " + std::to_string(number);
  }
  return {};
}

}  // namespace vesk::host
