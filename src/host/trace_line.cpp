// Bounded formatting of trace lines and the level rules of the three titles.
// A line longer than the buffer is cut; the callback is called once per line.
#include "host/trace_line.h"

#include <cstdio>
#include <vector>

namespace vexil {

void TraceFormattedV(TraceCallback trace, TraceType type, const char* title, std::size_t bufferSize,
                     const char* format, va_list args) {
  if (!trace) return;
  if (bufferSize == kTraceBufferSize) {
    char buffer[kTraceBufferSize];
    std::vsnprintf(buffer, sizeof buffer, format, args);
    trace(type, title, buffer);
    return;
  }
  std::vector<char> buffer(bufferSize > 0 ? bufferSize : 1);
  std::vsnprintf(buffer.data(), buffer.size(), format, args);
  trace(type, title, buffer.data());
}

void TraceFormatted(TraceCallback trace, TraceType type, const char* title, std::size_t bufferSize,
                    const char* format, ...) {
  va_list args;
  va_start(args, format);
  TraceFormattedV(trace, type, title, bufferSize, format, args);
  va_end(args);
}

#define VEXIL_TRACE_IF(condition, title)                                                  \
  do {                                                                                    \
    if (!(condition)) return;                                                             \
    va_list args;                                                                         \
    va_start(args, format);                                                               \
    TraceFormattedV(callback_, TraceType::Line, title, kTraceBufferSize, format, args);   \
    va_end(args);                                                                         \
  } while (false)

void Tracer::Verbose(const char* format, ...) const { VEXIL_TRACE_IF(Verbose(), "Verbose"); }
void Tracer::Message(const char* format, ...) const { VEXIL_TRACE_IF(Messages(), "Message"); }
void Tracer::Error(const char* format, ...) const { VEXIL_TRACE_IF(callback_ != nullptr, "Error"); }

#undef VEXIL_TRACE_IF

void Tracer::Text(TraceType type, const char* title, const char* text) const {
  if (callback_) callback_(type, title, text);
}

}  // namespace vexil
