// Watcher commands through cmd.exe: one that writes and ends, one that outlives its
// time-out, a missing program, and file names cmd.exe would read as syntax.
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <string>

#include "watcher_cmd_fixture.h"

namespace {

using namespace tasktest;

TEST_F(WatcherCommand, CmdExeRunsTheTextTracesItsOutputAndReportsTheEnd) {
  // ping keeps it running past the 100 ms look, for about a second of its 30.
  auto event = Event("a.cpp", Options("echo built $F & ping -n 2 127.0.0.1 >nul", 30000));
  ASSERT_TRUE(event->Start());
  ASSERT_TRUE(WaitForLine(Notice(kTask, "Watcher Command Run event complete.")));
  EXPECT_TRUE(WaitForText("Message", "built a.cpp"));
  EXPECT_TRUE(event->Command().Completed());
  EXPECT_FALSE(event->Command().HaveErrors());
  EXPECT_TRUE(Traced(Verbose(" Executable: cmd.exe\n")));
  EXPECT_TRUE(Traced(Verbose("  Arguments: /C echo built a.cpp & ping -n 2 127.0.0.1 >nul \n")));
}

TEST_F(WatcherCommand, CommandThatOutlivesItsTimeOutIsReportedAndLeftRunning) {
  // About nine seconds of pinging against half a second allowed.
  auto event = Event("a.cpp", Options("ping -n 10 127.0.0.1 >nul", 500));
  ASSERT_TRUE(event->Start());
  const int pid = event->Command().Id();
  ASSERT_TRUE(WaitForLine(Error(kTimedOut)));
  EXPECT_TRUE(Traced(Error("ERROR: The Watcher Command task is still running.\n")));
  EXPECT_TRUE(event->Command().HaveErrors());
  EXPECT_FALSE(event->Command().Completed());
  EXPECT_TRUE(vexil_test::ProcessExists(pid)) << "the library never ends a command";
  event.reset();
  EXPECT_TRUE(Traced(Verbose("Watcher command close complete.\n\n")));
  vexil_test::KillProcess(pid);
}

TEST_F(WatcherCommand, MissingProgramIsALaunchFailure) {
  xWatcherOptions options = Options("$FN", 2000, false);
  options.executable = "vexil-no-such-program";
  auto event = Event("a.cpp", options);
  EXPECT_FALSE(event->Start());
  EXPECT_TRUE(WaitForText("Error", "\nWatcher Command: build => " + kMissingAdvice));
  EXPECT_TRUE(Traced(Notice(kTask, "Watcher Event Command Run complete.")));
  EXPECT_EQ(event->Command().Id(), 0);
}

TEST_F(WatcherCommand, FileNamesCmdExeWouldInterpretAreNeverRun) {
  const std::string pwned = dir_ / "pwned.txt";
  for (const char* name : {"x&echo pwned>pwned.txt&.cpp", "x|echo.cpp", "x<in.cpp", "x^.cpp", "x%PATH%.cpp",
                           "x\".cpp"}) {
    watchtest::ResetRecording();
    xWatcherOptions options = Options("echo $F");
    options.directory = dir_.Path().string();
    auto event = Event(name, options);
    EXPECT_FALSE(event->Start()) << name;
    EXPECT_TRUE(Traced(Error(kRefusal))) << name;
    EXPECT_EQ(event->Command().Id(), 0) << name;
  }
  EXPECT_FALSE(std::filesystem::exists(pwned));
}

}  // namespace
