// Watcher commands through cmd.exe: one that writes and ends, and the file names cmd.exe
// would read as syntax.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "task_test_support.h"

namespace {

using namespace tasktest;

TEST_F(WatcherCommand, CmdExeRunsTheTextTracesItsOutputAndReportsTheEnd) {
  // ping keeps it running past the 100 ms look, for about a second of its 30.
  auto event = Event("a.cpp", Options("echo built $F & ping -n 2 127.0.0.1 >nul", 30000));
  ASSERT_TRUE(event->Start());
  ASSERT_TRUE(WaitForTrace(Notice(kTask, "Watcher Command Run event complete.")));
  EXPECT_TRUE(WaitForText("Message", "built a.cpp"));
  EXPECT_TRUE(event->Command().Completed());
  EXPECT_FALSE(event->Command().HaveErrors());
  EXPECT_TRUE(Traced(Verbose(" Executable: cmd.exe\n")));
  EXPECT_TRUE(Traced(Verbose("  Arguments: /C echo built a.cpp & ping -n 2 127.0.0.1 >nul \n")));
}

}  // namespace

namespace tasktest {

// About nine seconds of pinging.
xWatcherOptions LongCommand(int timeout) { return Options("ping -n 10 127.0.0.1 >nul", timeout); }

const std::vector<std::string> kInterpretedNames = {"x&echo pwned>pwned&.cpp", "x|echo.cpp", "x<in.cpp", "x^.cpp",
                                                    "x%PATH%.cpp", "x\".cpp"};

}  // namespace tasktest
