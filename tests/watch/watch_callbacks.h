// Plain-function callbacks for the watchers, recording every change event the host would
// receive (trace lines go to the trace log), so tests can wait for them and compare them.
#pragma once

#include <string>
#include <vector>

#include "vexil/watch/watcher_ex.h"
#include "vexil_test/trace_log.h"
#include "watch_fixture.h"

namespace watchtest {

struct Delivered {
  std::string project;
  std::string root;
  const void* userData;
  int type;
  unsigned action;
  std::string name;
  std::string newName;
};

using vexil_test::TraceLine;
using vexil_test::TraceLog;

// One recording at a time: the callbacks are plain functions, so the record is global.
struct Recording {
  Shared shared;
  std::vector<Delivered> events;
};

inline Recording& Recorded() {
  static Recording recording;
  return recording;
}

inline void ResetRecording() {
  Recorded().shared.Update([] { Recorded().events.clear(); });
  TraceLog::Clear();
}

inline void RecordChange(xWatcherProjectEx* project, xChangeEvent* event) {
  Delivered delivered{project->Name(), project->Root(), project->UserData(), event->type,
                      event->action,   event->name,     event->newName};
  Recorded().shared.Update([&] { Recorded().events.push_back(delivered); });
}

// What the watchers are given to trace with.
constexpr TraceCallback RecordTrace = &TraceLog::Callback;

inline std::vector<Delivered> Events() {
  return Recorded().shared.Read([] { return Recorded().events; });
}

inline bool WaitForTrace(const TraceLine& line) {
  return TraceLog::WaitUntilTraced([&](const TraceLine& traced) { return traced == line; });
}

inline TraceLine Verbose(const std::string& text) { return {TraceType::Line, "Verbose", text}; }
inline TraceLine Error(const std::string& text) { return {TraceType::Line, "Error", text}; }

}  // namespace watchtest
