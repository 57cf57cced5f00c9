// Watcher commands through /bin/sh: one that runs on and ends, ones that end at once, and
// the names the shell would interpret.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "task_test_support.h"

namespace {

using namespace tasktest;

TEST_F(WatcherCommand, OutputIsTracedAndTheEndReportedOnceTheCommandEnds) {
  // Still running at the 100 ms look, ended long before its 60 s. On the way it writes a
  // frame header that promises 900 MB, a 1 MiB line, and more lines than are held at once.
  const std::string output =
      "printf 'Content-Length: 900000000\\r\\n\\r\\n'; head -c 1048576 /dev/zero | tr '\\0' x; echo; seq 200000; ";
  auto event = Event("a.cpp", Options(output + "echo built $F; sleep 1; printf unended", 60000));
  ASSERT_TRUE(event->Start());
  const int pid = event->Command().Id();
  EXPECT_GT(pid, 0);

  ASSERT_TRUE(WaitForTrace(Notice(kTask, "Watcher Command Run event complete.")));
  // Traced line by line, each cut like any trace line: the rest of the long line is dropped,
  // and the last line counts without a line end.
  for (const std::string& text : std::vector<std::string>{"Content-Length: 900000000\n", "\n", std::string(4095, 'x'),
                                                          "1\n", "200000\n", "built a.cpp\n", "unended\n"})
    EXPECT_TRUE(Traced(Message(text))) << text.substr(0, 30);
  const std::vector<TraceLine> lines = TraceLog::Lines();
  EXPECT_EQ(std::count_if(lines.begin(), lines.end(),
                          [](const TraceLine& line) { return line.text.find("xx") != std::string::npos; }),
            1);
  EXPECT_TRUE(event->Command().Completed());
  EXPECT_FALSE(event->Command().HaveErrors());
  EXPECT_TRUE(vexil_test::WaitFor([&] { return event->Finished(); }));  // the notice comes just before the thread's end
  for (const std::string& text : std::vector<std::string>{
           "Watcher Event starting....\n\n", " Executable: /bin/sh\n", "  Arguments: -c " + output + "echo built a.cpp; sleep 1; printf unended \n",
           "Use Command: Yes\n", "     Timout: 60000 (milliseconds)\n\n", "Watcher Event starting ", "complete.\n\n"})
    EXPECT_TRUE(Traced(Verbose(text))) << text;
  EXPECT_FALSE(Traced(Notice(kTask, "Watcher Event Command Run complete.")));
  EXPECT_TRUE(WaitUntilGone(pid));  // reaped, no zombie
}

TEST_F(WatcherCommand, CommandsThatEndAtOnceGetNoWaitingThread) {
  // The end is looked for 100 ms after the launch, which a busy machine may not give even
  // `true`: the command is launched again until one ended by then.
  auto endedAtOnce = [this](const std::string& file, const xWatcherOptions& options) {
    for (int attempt = 0; attempt < 10; ++attempt) {
      watchtest::ResetRecording();
      auto event = Event(file, options);
      if (!event->Start()) return event;
    }
    return std::unique_ptr<xWatcherEvent>();
  };
  auto quiet = endedAtOnce("a.cpp", Direct("true", "", 0));
  ASSERT_TRUE(quiet);
  EXPECT_TRUE(quiet->Finished());
  EXPECT_TRUE(Traced(Notice(kTask, "Watcher Event Command Run complete.")));
  EXPECT_TRUE(Traced(Verbose("     Timout: 5000 (milliseconds)\n\n")));  // 0 means 5000
  EXPECT_TRUE(Traced(Verbose("  Arguments: \n")));                      // an empty argument is left out

  // Without the shell the file name is one argument that nothing reads as syntax.
  xWatcherOptions echo = Direct("echo", "quick $F");
  echo.directory = dir_.Path().string();
  auto talking = endedAtOnce("x;touch pwned;.cpp", echo);
  ASSERT_TRUE(talking);
  EXPECT_TRUE(Traced(Message("quick x;touch pwned;.cpp\n")));  // one argument, blanks and all
  EXPECT_FALSE(std::filesystem::exists(dir_ / "pwned"));
  EXPECT_FALSE(Traced(Verbose("Watcher Event starting ")));
  EXPECT_FALSE(Traced(Notice(kTask, "Watcher Command Run event complete.")));
}

}  // namespace

namespace tasktest {

xWatcherOptions LongCommand(int timeout) { return Direct("sleep", "30", timeout); }

const std::vector<std::string> kInterpretedNames = {
    "x;touch pwned;.cpp", "x$(touch pwned).cpp", "x`touch pwned`.cpp", "x|touch pwned.cpp", "x&&touch pwned&&.cpp",
    "x\ntouch pwned\n.cpp", "x'.cpp", "x\".cpp", "x>pwned.cpp", "x*.cpp", "x\\.cpp"};

}  // namespace tasktest
