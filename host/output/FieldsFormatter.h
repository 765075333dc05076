// Each report field by field: where it lies, its bytes, and what they mean.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

std::unique_ptr<Formatter> makeFieldsFormatter();

}  // namespace vesk::host
