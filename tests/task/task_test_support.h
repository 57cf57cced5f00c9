// Helpers for the task tests: options that trace into the shared recording, and waits
// for trace lines and for processes to be gone, on conditions with generous deadlines.
#pragma once

#include <chrono>
#include <fstream>
#include <functional>
#include <string>
#include <thread>

#include "../watch/watch_callbacks.h"
#include "vexil/task/watcher_options.h"

namespace tasktest {

using watchtest::kDeadline;
using watchtest::Recorded;
using watchtest::TraceLine;

inline xWatcherOptions Options(const std::string& arguments, int timeout = 10000, bool useCommand = true) {
  xWatcherOptions options;
  options.trace = &watchtest::RecordTrace;
  options.level = LSP::TraceLevel::Verbose;
  options.timeout = timeout;
  options.useCommand = useCommand;
  options.arguments = arguments;
  return options;
}

// `executable` run with `arguments` as its one argument, without the interpreter.
inline xWatcherOptions Direct(const std::string& executable, const std::string& arguments, int timeout = 2000) {
  xWatcherOptions options = Options(arguments, timeout, false);
  options.executable = executable;
  return options;
}

inline TraceLine Notice(const std::string& title, const std::string& text) {
  return {TraceType::Notice, title, text};
}
inline TraceLine Message(const std::string& text) { return {TraceType::Line, "Message", text}; }
using watchtest::Error;
using watchtest::Verbose;
using watchtest::WaitForTrace;

// Call only with the recording's lock held (inside WaitUntil or Read).
inline bool AnyTraced(const std::function<bool(const TraceLine&)>& match) {
  for (const TraceLine& line : Recorded().traces) {
    if (match(line)) return true;
  }
  return false;
}

inline bool Traced(const TraceLine& wanted) {
  return Recorded().shared.Read([&] { return AnyTraced([&](const TraceLine& line) { return line == wanted; }); });
}


// A text traced under `title` that contains `piece`.
inline bool WaitForText(const std::string& title, const std::string& piece,
                        std::chrono::milliseconds deadline = kDeadline) {
  return watchtest::WaitForTraceWhere(
      [&](const TraceLine& line) { return line.title == title && line.text.find(piece) != std::string::npos; }, deadline);
}

// Appends to `path` until `piece` is traced under `title`: a directory watcher that has
// only just started may miss a first write.
inline bool ModifyUntilTraced(const std::string& path, const std::string& title, const std::string& piece) {
  const auto end = std::chrono::steady_clock::now() + kDeadline;
  while (std::chrono::steady_clock::now() < end) {
    std::ofstream(path, std::ios::app) << "changed\n";
    if (WaitForText(title, piece, std::chrono::milliseconds(500))) return true;
  }
  return false;
}

// For a state nothing signals, such as a thread's end or a process's.
inline bool PollUntil(const std::function<bool()>& condition) {
  const auto end = std::chrono::steady_clock::now() + kDeadline;
  while (std::chrono::steady_clock::now() < end) {
    if (condition()) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return false;
}

// Gone means ended and collected: a zombie still counts as existing.
inline bool WaitUntilGone(int pid) {
  return PollUntil([pid] { return !vexil_test::ProcessExists(pid); });
}

}  // namespace tasktest
