// Plain-function callbacks for the watchers, recording every change event and trace line
// the host would receive, so tests can wait for them and compare them exactly.
#pragma once

#include <algorithm>
#include <chrono>
#include <string>
#include <vector>

#include "vexil/watch/watcher_ex.h"
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

struct TraceLine {
  TraceType type;
  std::string title;
  std::string text;

  bool operator==(const TraceLine& other) const {
    return type == other.type && title == other.title && text == other.text;
  }
};

// One recording at a time: the callbacks are plain functions, so the record is global.
struct Recording {
  Shared shared;
  std::vector<Delivered> events;
  std::vector<TraceLine> traces;
};

inline Recording& Recorded() {
  static Recording recording;
  return recording;
}

inline void ResetRecording() {
  Recorded().shared.Update([] {
    Recorded().events.clear();
    Recorded().traces.clear();
  });
}

inline void RecordChange(xWatcherProjectEx* project, xChangeEvent* event) {
  Delivered delivered{project->Name(), project->Root(), project->UserData(), event->type,
                      event->action,   event->name,     event->newName};
  Recorded().shared.Update([&] { Recorded().events.push_back(delivered); });
}

inline void RecordTrace(TraceType type, const char* title, const char* text) {
  TraceLine line{type, title, text};
  Recorded().shared.Update([&] { Recorded().traces.push_back(line); });
}

inline std::vector<TraceLine> Traces() {
  return Recorded().shared.Read([] { return Recorded().traces; });
}

inline std::vector<Delivered> Events() {
  return Recorded().shared.Read([] { return Recorded().events; });
}

// Waits until a traced line matches. Only the lines added since the last look are
// searched: a command's output of 200,000 lines wakes the waiter at every line, and
// searching all of them each time is quadratic.
template <typename Match>
bool WaitForTraceWhere(Match match, std::chrono::milliseconds deadline = kDeadline) {
  std::size_t searched = 0;
  return Recorded().shared.WaitUntil(
      [&] {
        const auto& traces = Recorded().traces;
        const auto from = traces.begin() + static_cast<std::ptrdiff_t>(std::min(searched, traces.size()));
        searched = traces.size();
        return std::find_if(from, traces.end(), match) != traces.end();
      },
      deadline);
}

inline bool WaitForTrace(const TraceLine& line) {
  return WaitForTraceWhere([&](const TraceLine& traced) { return traced == line; });
}

inline TraceLine Verbose(const std::string& text) { return {TraceType::Line, "Verbose", text}; }
inline TraceLine Error(const std::string& text) { return {TraceType::Line, "Error", text}; }

}  // namespace watchtest
