// Exceptions of the JSON layer and the model: formatted texts and the null-name check.
// Type mismatches are plain std::exceptions; library misuse is an AssertException.
#pragma once

#include "host/trace_line.h"

namespace LSP {

// Throws a std::runtime_error whose text is formatted into a 1024-byte buffer.
[[noreturn]] void ThrowFormatted(const char* format, ...) VEXIL_PRINTF(1, 2);

// A member name must not be null; the JSON library would read through the pointer.
void RequireName(const char* name);

}  // namespace LSP
