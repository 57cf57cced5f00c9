// Trace lines about what the library's own threads did (answers sent or failed,
// diagnostics dropped or malformed), kept until the host's thread delivers them.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <deque>
#include <mutex>
#include <string>

#include "host/trace_line.h"

namespace vexil {

// The readers and the input writer never call the host back: a callback that waits for
// the host's thread (one that hands its line to a UI thread) could otherwise stall them,
// and a destructor joining them would wait for the callback. Their lines are formatted
// at once and traced by the host's thread at its next exchange with the server.
class DeferredTrace {
 public:
  // Lines wait here while the host sends nothing; beyond this the oldest give way.
  static constexpr std::size_t kByteLimit = std::size_t{4} << 20;

  explicit DeferredTrace(const Tracer& tracer) : tracer_(tracer) {}
  DeferredTrace(const DeferredTrace&) = delete;
  DeferredTrace& operator=(const DeferredTrace&) = delete;

  // Keep a line under the level rules of Tracer; any thread.
  void Message(const char* format, ...) VEXIL_PRINTF(2, 3);
  void Error(const char* format, ...) VEXIL_PRINTF(2, 3);
  // Traces every kept line, oldest first. Called on the host's thread, no lock held.
  void Deliver();

 private:
  struct Line {
    const char* title;
    std::string text;
  };

  // Formats and keeps the line when the level admits it (`wanted`).
  void Keep(bool wanted, const char* title, const char* format, va_list args);

  const Tracer tracer_;
  std::mutex mutex_;
  std::deque<Line> lines_;
  std::size_t bytes_ = 0;
};

}  // namespace vexil
