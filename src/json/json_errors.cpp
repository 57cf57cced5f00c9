// Formatted exception texts for the JSON layer and the protocol model.
// Messages are cut at 1024 bytes, like every bounded text of the library.
#include "json/json_errors.h"

#include <cstdarg>
#include <cstdio>
#include <stdexcept>

#include "vexil/json/json.h"

namespace LSP {

void ThrowFormatted(const char* format, ...) {
  char buffer[1024];
  va_list args;
  va_start(args, format);
  std::vsnprintf(buffer, sizeof buffer, format, args);
  va_end(args);
  throw std::runtime_error(buffer);
}

void RequireName(const char* name) {
  if (!name) throw AssertException("str != 0");
}

}  // namespace LSP
