// Watcher commands on every platform: a missing program is a launch failure, and a file
// name the command interpreter would read as syntax is never run.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "task_test_support.h"

namespace {

using namespace tasktest;

TEST_F(WatcherCommand, MissingProgramIsALaunchFailure) {
  auto event = Event("a.cpp", Direct("vexil-no-such-program", "$FN"));
  EXPECT_FALSE(event->Start());
  EXPECT_TRUE(WaitForText("Error", "\nWatcher Command: build => " + kMissingAdvice));
  EXPECT_TRUE(Traced(Notice(kTask, "Watcher Event Command Run complete.")));
  EXPECT_EQ(event->Command().Id(), 0);
}

TEST_F(WatcherCommand, FileNamesTheInterpreterWouldReadAsSyntaxAreNeverRun) {
  for (const std::string& name : kInterpretedNames) {
    watchtest::ResetRecording();
    xWatcherOptions options = Options("echo $F");
    options.directory = dir_.Path().string();
    auto event = Event(name, options);
    EXPECT_FALSE(event->Start()) << name;
    EXPECT_TRUE(Traced(Error(kRefusal))) << name;
    EXPECT_TRUE(event->Command().HaveErrors()) << name;
    EXPECT_EQ(event->Command().Id(), 0) << name;
  }
  EXPECT_FALSE(std::filesystem::exists(dir_ / "pwned"));

  // Only inserted values count: the text the host configured is its own.
  watchtest::ResetRecording();
  auto own = Event("a.cpp", Options("echo $F; echo done"));
  own->Start();
  EXPECT_TRUE(WaitForText("Message", "done"));
  EXPECT_FALSE(Traced(Error(kRefusal)));
}

}  // namespace
