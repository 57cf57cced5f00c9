// Keeping formatted lines under one lock and tracing them outside it: the host's
// callback runs with no lock of the library held.
#include "transport/deferred_trace.h"

#include <cstdio>

namespace vexil {

void DeferredTrace::Message(const char* format, ...) {
  va_list args;
  va_start(args, format);
  Keep(tracer_.Messages(), "Message", format, args);
  va_end(args);
}

void DeferredTrace::Error(const char* format, ...) {
  va_list args;
  va_start(args, format);
  Keep(tracer_.Callback() != nullptr, "Error", format, args);
  va_end(args);
}

void DeferredTrace::Keep(bool wanted, const char* title, const char* format, va_list args) {
  if (!wanted) return;
  char buffer[kTraceBufferSize];
  std::vsnprintf(buffer, sizeof buffer, format, args);
  std::lock_guard<std::mutex> lock(mutex_);
  lines_.push_back({title, buffer});
  bytes_ += lines_.back().text.capacity();
  while (bytes_ > kByteLimit && lines_.size() > 1) {
    bytes_ -= lines_.front().text.capacity();
    lines_.pop_front();
  }
}

void DeferredTrace::Deliver() {
  std::deque<Line> lines;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    lines.swap(lines_);
    bytes_ = 0;
  }
  for (const Line& line : lines) tracer_.Text(TraceType::Line, line.title, line.text.c_str());
}

}  // namespace vexil
