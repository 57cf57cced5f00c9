// Formats trace lines into a bounded buffer and hands them to the host's callback.
// Every subsystem reports through this one helper; the level rules live in Tracer.
#pragma once

#include <cstdarg>
#include <cstddef>

#include "vexil/host/trace.h"

#if defined(__GNUC__)
#  define VEXIL_PRINTF(fmt, args) __attribute__((format(gnu_printf, fmt, args)))
#else
#  define VEXIL_PRINTF(fmt, args)
#endif

namespace vexil {

// Lines are cut at this size, terminator included.
constexpr std::size_t kTraceBufferSize = 4096;

// Formats into a buffer of `bufferSize` bytes and calls `trace` once; does nothing
// when `trace` is null.
void TraceFormatted(TraceCallback trace, TraceType type, const char* title, std::size_t bufferSize,
                    const char* format, ...) VEXIL_PRINTF(5, 6);
void TraceFormattedV(TraceCallback trace, TraceType type, const char* title, std::size_t bufferSize,
                     const char* format, va_list args);

// A callback with its level. "Verbose" lines go out at level 2 only, "Message" lines
// at level 1 or 2, "Error" lines at any level; a null callback silences all of them.
class Tracer {
 public:
  Tracer(TraceCallback callback, LSP::TraceLevel level) : callback_(callback), level_(level) {}

  TraceCallback Callback() const { return callback_; }
  LSP::TraceLevel Level() const { return level_; }
  bool Verbose() const { return callback_ && level_ == LSP::TraceLevel::Verbose; }
  bool Messages() const { return callback_ && level_ != LSP::TraceLevel::Off; }

  void Verbose(const char* format, ...) const VEXIL_PRINTF(2, 3);
  void Message(const char* format, ...) const VEXIL_PRINTF(2, 3);
  void Error(const char* format, ...) const VEXIL_PRINTF(2, 3);
  // Passes `text` unformatted (and uncut) under `title` when the callback is set.
  void Text(TraceType type, const char* title, const char* text) const;

 private:
  TraceCallback callback_;
  LSP::TraceLevel level_;
};

}  // namespace vexil
