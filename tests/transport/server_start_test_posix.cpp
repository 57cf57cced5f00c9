// Launching and closing the server against the fake through /bin/sh: the launch details,
// every launch failure with its trace order, early exits, working directory, and the close.
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <memory>
#include <string>

#include "transport_test_support.h"

namespace {

using namespace transport_test;
using Texts = std::vector<std::string>;

std::string CurrentDirectory() {
  char buffer[4096];
  return getcwd(buffer, sizeof buffer) ? buffer : "";
}

TEST_F(ServerStart, CommandLaunchShowsWhatRunsSkipsEmptyArgumentsAndDefaultsTheTimeout) {
  xServerStart start = FakeStart({"", "ignored-by-sh"}, 0);
  start.useCommand = true;
  start.executable = std::string("'") + VEXIL_FAKE_SERVER + "' 'stderr=hello world\\n'";
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

  EXPECT_TRUE(ErrorLineArrives(server, "hello world"));  // standard error, at verbose level

  xServerStart quiet = FakeStart();
  quiet.timeout = -5;
  quiet.argument1 = "";
  vexil::xServer defaults(quiet);
  TraceLog::Clear();
  ASSERT_TRUE(defaults.Start());
  EXPECT_EQ(TraceLog::Texts("Verbose")[2], "  Arguments: \n");
  EXPECT_EQ(TraceLog::Texts("Verbose")[4], "     Timout: 200 (milliseconds)\n\n");
}

TEST_F(ServerStart, MissingExecutableOrDirectoryReportsInOrderWithTheHintOnce) {
  struct Case {
    std::string executable, directory, error;
  } cases[] = {
      {"/nonexistent/server", "", "Error: Cannot find executable: /nonexistent/server\n\n"},
      {"no-such-language-server-here", "", "Error: Cannot find executable: no-such-language-server-here\n\n"},
      {VEXIL_FAKE_SERVER, "/nonexistent/dir", "Error: Cannot change to directory: /nonexistent/dir\n\n"},
  };
  for (const Case& c : cases) {
    TraceLog::Clear();
    xServerStart start = FakeStart({}, 200, LSP::TraceLevel::Messages);
    start.executable = c.executable;
    start.directory = c.directory;
    vexil::xServer server(start);
    EXPECT_FALSE(server.Start());
    EXPECT_EQ(TraceLog::Texts(), (Texts{c.error, kHint, "\nError Reason: No such file or directory\n", kFailedStart,
                                        kCheckDetails}));
    EXPECT_TRUE(server.HaveErrors());
    EXPECT_EQ(server.ErrorMessage(), c.error.substr(7, c.error.size() - 9));
  }
}

TEST_F(ServerStart, ProgramsThatEndAtOnceThroughTheInterpreterOrNotAreFailedStarts) {
  xServerStart truth = FakeStart({}, 200, LSP::TraceLevel::Off);
  truth.executable = "true";
  auto exitsAtOnce = FailedStart(truth);
  ASSERT_TRUE(exitsAtOnce);
  EXPECT_EQ(TraceLog::Texts(), (Texts{kFailedStart, kCheckDetails, kHint}));

  // Through the interpreter a missing program is the interpreter's to report.
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

TEST_F(ServerStart, WorkingDirectoryIsTheServersAndNotTheHosts) {
  std::string before = CurrentDirectory();
  xServerStart start = FakeStart();
  start.directory = "/tmp";
  {
    vexil::xServer server(start);
    ASSERT_TRUE(server.Start());
    EXPECT_EQ(CurrentDirectory(), before);
    TextResult result;
    Ask(server, "fake/cwd", "", result);
    EXPECT_EQ(result.cwd, "/tmp");
  }
  EXPECT_EQ(CurrentDirectory(), before);
}

TEST_F(ServerStart, CloseSequenceIsTracedAndLeavesAWellBehavedServerToEnd) {
  int id;
  {
    vexil::xServer server(FakeStart());
    ASSERT_TRUE(server.Start());
    id = server.Id();
    TraceLog::Clear();
  }
  EXPECT_EQ(TraceLog::Texts(), (Texts{"Closing language server.....\n", "Closing pipes.....\n",
                                      "Waiting for threads to end....\n", "Language server close complete.\n\n"}));
  // Its input closed, the fake ends by itself: nobody killed it. If it ended before the
  // destructor's last look, the destructor has reaped it already.
  int status = 0;
  pid_t ended = 0;
  EXPECT_TRUE(WaitFor([&] { return (ended = waitpid(id, &status, WNOHANG)) != 0; }));
  EXPECT_TRUE(ended == -1 || (WIFEXITED(status) && WEXITSTATUS(status) == 0));
}

}  // namespace
