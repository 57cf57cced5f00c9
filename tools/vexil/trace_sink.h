// Where the command-line host sends the library's trace lines: to stderr, each line
// prefixed with its title, while error lines are counted so that a failure is noticed.
#pragma once

#include <string>

#include "vexil/host/trace.h"

namespace cli {

// The callback handed to the library; it may be called from reader threads.
void TraceToStderr(TraceType type, const char* title, const char* text);

// Whether trace lines are printed; errors are counted either way.
void EchoTrace(bool echo);
// The number of error lines seen so far, and one of them (counted from 0) as one line.
int TraceErrors();
std::string TraceError(int index);

}  // namespace cli
