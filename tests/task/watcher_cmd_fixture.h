// The fixture of the watcher-command tests: events for files of a temporary directory,
// and the report texts every platform's commands share.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "task/watcher_event.h"
#include "task_test_support.h"

namespace tasktest {

using vexil::xFileTags;
using vexil::xWatcherEvent;

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
