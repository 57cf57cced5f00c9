// Launching and closing the server against the fake through /bin/sh: the launch details,
// what fails a launch here, a missing program through the shell, the working directory,
// and the close.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <filesystem>
#include <memory>
#include <string>

#include "transport_test_support.h"

namespace {

using namespace transport_test;

TEST_F(ServerStart, CommandLaunchShowsWhatRunsSkipsEmptyArgumentsAndDefaultsTheTimeout) {
  xServerStart start = FakeStart({"", "ignored-by-sh"}, 0);
  start.useCommand = true;
  start.executable = std::string("'") + VEXIL_FAKE_SERVER + "' 'stderr=hello world\\r\\nsecond\\n'";
  vexil::xServer server(start);
  EXPECT_EQ(server.Id(), -1);
  ASSERT_TRUE(server.Start());
  EXPECT_EQ(TraceLog::Texts("Verbose"),
            (Texts{" Executable: /bin/sh\n", "  Directory: \n", "  Arguments: -c " + start.executable + " ignored-by-sh \n",
                   "Use Command: Yes\n", "     Timout: 200 (milliseconds)\n\n"}));
  EXPECT_GT(server.Id(), 0);

  TraceLog::Clear();
  EXPECT_TRUE(server.Start());  // already running: nothing happens
  EXPECT_TRUE(TraceLog::Lines().empty());

  // Standard error, at verbose level, a line a trace line whatever its line end.
  EXPECT_TRUE(ErrorLineArrives(server, "second"));
  EXPECT_EQ(TraceLog::Count("Reply: hello world\n"), 1);
}

// A direct launch's details with the defaults, the server's own working directory, and a
// close that leaves a well-behaved server to end by itself.
TEST_F(ServerStart, DirectLaunchInItsOwnDirectoryAndTheClose) {
  const std::string before = std::filesystem::current_path().string();
  xServerStart start = FakeStart();
  start.timeout = -5;
  start.directory = "/tmp";
  int id;
  {
    vexil::xServer server(start);
    ASSERT_TRUE(server.Start());
    EXPECT_EQ(TraceLog::Texts("Verbose"), (Texts{" Executable: " VEXIL_FAKE_SERVER "\n", "  Directory: /tmp\n",
                                                 "  Arguments: \n", "Use Command: No\n",
                                                 "     Timout: 200 (milliseconds)\n\n"}));
    EXPECT_EQ(std::filesystem::current_path().string(), before);
    EXPECT_EQ(Ask(server, "fake/cwd").cwd, "/tmp");
    id = server.Id();
    TraceLog::Clear();
  }
  EXPECT_EQ(std::filesystem::current_path().string(), before);
  EXPECT_EQ(TraceLog::Texts(), (Texts{"Closing language server.....\n", "Closing pipes.....\n",
                                      "Waiting for threads to end....\n", "Language server close complete.\n\n"}));
  // Its input closed, the fake ends by itself: nobody killed it. If it ended before the
  // destructor's last look, the destructor has reaped it already.
  int status = 0;
  pid_t ended = 0;
  EXPECT_TRUE(WaitFor([&] { return (ended = waitpid(id, &status, WNOHANG)) != 0; }));
  EXPECT_TRUE(ended == -1 || (WIFEXITED(status) && WEXITSTATUS(status) == 0));
}

// Through the interpreter a missing program is the interpreter's to report.
TEST_F(ServerStart, AProgramMissingThroughTheInterpreterIsAFailedStart) {
  xServerStart command = FakeStart({}, 200, LSP::TraceLevel::Messages);
  command.useCommand = true;
  command.executable = "no-such-language-server-here --stdio";
  auto missing = FailedStart(command);
  ASSERT_TRUE(missing);
  Texts texts = TraceLog::Texts();
  ASSERT_EQ(texts.size(), 4u);
  EXPECT_NE(texts[0].find("not found"), std::string::npos) << texts[0];
  EXPECT_EQ(Texts(texts.begin() + 1, texts.end()), (Texts{kFailedStart, kCheckDetails, kHint}));
}

}  // namespace

namespace transport_test {

std::vector<LaunchFailure> LaunchFailures() {
  const std::string missing = "No such file or directory";
  return {{"/nonexistent/server", "", "Cannot find executable: /nonexistent/server", missing},
          {"no-such-language-server-here", "", "Cannot find executable: no-such-language-server-here", missing},
          {VEXIL_FAKE_SERVER, "/nonexistent/dir", "Cannot change to directory: /nonexistent/dir", missing}};
}

}  // namespace transport_test
