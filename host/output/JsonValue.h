// A report's value tree as JSON.
#pragma once

#include "host/output/OutputBuffer.h"
#include "values/ReportValue.h"

namespace vesk::host {

/// Writes the tree: its keys, nesting and order. True where a number in it does not survive every reader, so that
/// appendExact() has something to tell.
bool appendJsonValue(OutputBuffer &out, const ReportValue &value);

/// Writes the object that tells such numbers as strings, under their JSON Pointers: integers beyond 2^53 by all their
/// digits, and "nan", "inf" or "-inf" where the tree has null.
void appendExact(OutputBuffer &out, const ReportValue &value);

}  // namespace vesk::host
