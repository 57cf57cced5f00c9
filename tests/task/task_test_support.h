// Helpers for the task tests: options that trace into the trace log, waits for trace
// lines and for processes to be gone, and the fixture of the watcher-command tests.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "../watch/watch_callbacks.h"
#include "task/watcher_event.h"
#include "vexil/task/watcher_options.h"
#include "vexil_test/support.h"

namespace tasktest {

using vexil::xFileTags;
using vexil::xWatcherEvent;
using vexil_test::TraceLine;
using vexil_test::TraceLog;
using watchtest::Error;
using watchtest::kDeadline;
using watchtest::ReturnsWithin;
using watchtest::Verbose;
using watchtest::WaitForTrace;

inline xWatcherOptions Options(const std::string& arguments, int timeout = 10000, bool useCommand = true) {
  xWatcherOptions options;
  options.trace = &TraceLog::Callback;
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

inline bool Traced(const TraceLine& wanted) {
  const std::vector<TraceLine> lines = TraceLog::Lines();
  return std::find(lines.begin(), lines.end(), wanted) != lines.end();
}

// A text traced under `title` that contains `piece`.
inline bool WaitForText(const std::string& title, const std::string& piece,
                        std::chrono::milliseconds deadline = kDeadline) {
  return TraceLog::WaitUntilTraced(
      [&](const TraceLine& line) { return line.title == title && line.text.find(piece) != std::string::npos; }, deadline);
}

// Appends to `path` until `piece` is traced under `title`: a directory watcher that has
// only just started may miss a first write.
inline bool ModifyUntilTraced(const std::string& path, const std::string& title, const std::string& piece) {
  return vexil_test::WaitFor([&] {
    std::ofstream(path, std::ios::app) << "changed\n";
    return WaitForText(title, piece, std::chrono::milliseconds(500));
  });
}

// Gone means ended and collected: a zombie still counts as existing.
inline bool WaitUntilGone(int pid) {
  return vexil_test::WaitFor([pid] { return !vexil_test::ProcessExists(pid); });
}

inline const char* const kTask = "build";
inline const std::string kTimedOut = "\nWatcher Command: 'build' => Timed out waiting for watcher task to complete.\n";
inline const std::string kRefusal =
    "\nWatcher Command: 'build' => Refused to run: the file name contains characters the command interpreter "
    "would interpret.\n";
inline const std::string kMissingAdvice =
    "Make sure the executable exists, the details are correctly configured and the executable is in the PATH.\n\n";

// File names that would make the platform's interpreter do more than the command (each
// tries to create "pwned" in the test's directory).
extern const std::vector<std::string> kInterpretedNames;
// A command of the platform's that runs for seconds, with this time-out.
xWatcherOptions LongCommand(int timeout);

// Events for files of a temporary directory, the recording reset before each test.
class WatcherCommand : public ::testing::Test {
 protected:
  void SetUp() override { watchtest::ResetRecording(); }

  std::unique_ptr<xWatcherEvent> Event(const std::string& file, const xWatcherOptions& options) {
    return std::make_unique<xWatcherEvent>(kTask, xFileTags(dir_ / file), options);
  }

  // Starts a command that outlives its time-out; returns once the time-out is reported.
  std::unique_ptr<xWatcherEvent> TimedOut(const xWatcherOptions& options) {
    auto event = Event("a.cpp", options);
    EXPECT_TRUE(event->Start());
    EXPECT_TRUE(WaitForTrace(Error(kTimedOut)));
    return event;
  }

  watchtest::TempDir dir_;
};

}  // namespace tasktest
