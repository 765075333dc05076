// The way from the inputs that a command was given to its pipeline.
#pragma once

#include "host/commands/InputOptions.h"
#include "host/decode/Pipeline.h"

namespace vesk::host {

/// Reads them all, one after the other; standard input where there are none. What cannot be read becomes a message.
void readInputs(const InputOptions &options, Pipeline &pipeline);

/// From the pipeline's beginning to its end, which comes early where the reader of standard output leaves.
void runInputs(const InputOptions &options, Pipeline &pipeline);

}  // namespace vesk::host
