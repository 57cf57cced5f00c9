// Watcher commands on every platform: a missing program is a launch failure, a file name
// the command interpreter would read as syntax is never run, and a command that outlives
// its time-out is left running.
#include <gtest/gtest.h>

#include <chrono>
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

TEST_F(WatcherCommand, CommandThatOutlivesItsTimeOutIsLeftRunningAndCollectedOnceItEnds) {
  auto event = TimedOut(LongCommand(500));
  const int pid = event->Command().Id();
  ASSERT_GT(pid, 0);  // kill(0) would signal the whole test run
  EXPECT_TRUE(Traced(Error("ERROR: The Watcher Command task is still running.\n")));
  EXPECT_TRUE(event->Command().HaveErrors());
  EXPECT_FALSE(event->Command().Completed());
  EXPECT_TRUE(vexil_test::WaitFor([&] { return event->Finished(); }));
  ASSERT_TRUE(vexil_test::ProcessExists(pid)) << "the child is never killed by the library";

  // The reader was stopped although the child holds the pipe open: a reader that waited
  // for the end of the output would hold this up for the rest of the child's run.
  EXPECT_TRUE(ReturnsWithin(std::chrono::seconds(10), [&] { event.reset(); }));
  EXPECT_TRUE(Traced(Verbose("Watcher command close complete.\n\n")));

  vexil_test::KillProcess(pid);
  EXPECT_TRUE(WaitUntilGone(pid)) << "a child given up on is still collected once it ends";

  // Also while its command is still kept, as a task keeps it until the next change.
  watchtest::ResetRecording();
  auto kept = TimedOut(LongCommand(300));
  const int keptPid = kept->Command().Id();
  ASSERT_GT(keptPid, 0);
  vexil_test::KillProcess(keptPid);
  EXPECT_TRUE(WaitUntilGone(keptPid));
}

}  // namespace
