// The trace queue record, its process-wide queue, and the protocol names of trace levels.
// The queue is the host's alternative to a callback: any thread writes, the host drains.
#include "vexil/host/trace.h"

SafeQueue<xTraceEvent> xTraceEvent::m_watcherQueue;

std::string TraceToString(LSP::TraceLevel level) {
  switch (level) {
    case LSP::TraceLevel::Off: return "off";
    case LSP::TraceLevel::Messages: return "messages";
    case LSP::TraceLevel::Verbose: return "verbose";
  }
  return "";
}

xTraceEvent::xTraceEvent(TraceType type, const char* title, const char* message, const char* detail)
    : type(type), title(title), text(message) {
  if (detail && *detail) {
    text += '\n';
    text += detail;
  }
}

SafeQueue<xTraceEvent>& xTraceEvent::queue() { return m_watcherQueue; }

void xTraceEvent::Write(TraceType type, const char* title, const char* message, const char* detail) {
  m_watcherQueue.Push(xTraceEvent(type, title, message, detail));
}
