// The verbose account of a launch that servers and watcher commands both give: what is
// started, where, with which arguments, through the interpreter or not, and for how long.
#pragma once

#include <string>

#include "host/trace_line.h"

namespace vexil {

// Traced only at level 2; `joinedArguments` is the argument list as it is shown.
void TraceLaunchDetails(const Tracer& tracer, const std::string& executable, const std::string& directory,
                        const char* joinedArguments, bool useCommand, int timeout);

}  // namespace vexil
