// The connection's handshake against the fake server: initialize and initialized, the
// verbose start-up lines, the long initialize wait, shutdown by its own id, and exit.
#include <gtest/gtest.h>

#include <chrono>
#include <string>

#include "connection_test_support.h"

namespace {

using namespace std::chrono_literals;
using namespace connection_test;
using transport_test::FakeStart;
using Texts = std::vector<std::string>;

constexpr char kName[] = "lifecycle";

class ConnectionLifecycle : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }
  void TearDown() override { Dispose(kName); }

  static xLanguageServer* Connection(std::vector<std::string> directives = {}, int timeout = 2000,
                                     LSP::TraceLevel level = LSP::TraceLevel::Messages) {
    xServerStart start = FakeStart(std::move(directives), timeout, level);
    start.name = kName;
    return Vexil_Start(start);
  }

  static xServerInitialise Init() {
    xServerInitialise init;
    init.processId = 42;
    init.rootPath = "/work/root dir";
    init.options = R"({"initializationOptions":{"style":"tabs"}})";
    init.workspaceFolders.emplace_back("file:///work/root%20dir", "root dir");
    return init;
  }
};

TEST_F(ConnectionLifecycle, StartInitializesOnceAndAnnouncesIt) {
  xLanguageServer* server = Connection({}, 2000, LSP::TraceLevel::Verbose);
  ASSERT_TRUE(server->Start(Init()));
  Texts verbose = TraceLog::Texts("Verbose");
  auto processLine = std::find(verbose.begin(), verbose.end(), "Process Id: 42\n");
  ASSERT_NE(processLine, verbose.end());
  EXPECT_EQ(*(processLine + 1), " Root Path: /work/root dir\n");
  EXPECT_EQ(*(processLine + 2), "   Options: {\"initializationOptions\":{\"style\":\"tabs\"}}\n");

  Texts bodies = SentBodies();
  ASSERT_EQ(bodies.size(), 2u);
  const std::string& initialize = bodies[0];
  EXPECT_NE(initialize.find(R"("method":"initialize","params":{"processId":42,"rootUri":"file:///work/root%20dir",)"
                            R"("initializationOptions":{"style":"tabs"},"capabilities":)"),
            std::string::npos)
      << initialize;
  EXPECT_NE(initialize.find(R"("trace":"verbose","workspaceFolders":[{"uri":"file:///work/root%20dir","name":"root dir"}]}})"),
            std::string::npos)
      << initialize;
  EXPECT_EQ(bodies[1], R"({"jsonrpc":"2.0","method":"initialized","params":{}})");

  // Initialized already: neither a second Start nor Initialize writes anything.
  TraceLog::Clear();
  EXPECT_TRUE(server->Start(Init()));
  EXPECT_TRUE(server->Initialize(Init()));
  EXPECT_TRUE(TraceLog::Lines().empty());
}

TEST_F(ConnectionLifecycle, StartUpDetailsAreVerboseOnlyAndNothingIsSentToAStoppedServer) {
  xLanguageServer* server = Connection();
  EXPECT_FALSE(server->Initialize(Init()));
  EXPECT_TRUE(TraceLog::Lines().empty());
  ASSERT_TRUE(server->Start(Init()));
  EXPECT_FALSE(TraceLog::Contains("Process Id"));
  EXPECT_TRUE(TraceLog::Contains(R"("trace":"messages")"));
}

TEST_F(ConnectionLifecycle, InitializeOutwaitsAShortHostTimeout) {
  // The reply comes ten times later than the host's 200 ms would wait, well within the
  // handshake's own limit; the next request must not suffer for it.
  xLanguageServer* server = Connection({"late=initialize:2000"}, 200);
  ASSERT_TRUE(server->Start(Init()));
  EXPECT_FALSE(TraceLog::Contains("Timed out"));
  EXPECT_NE(SentBody("initialized"), "");
  LSP::TextDocumentPositionParams params;
  server->TextDocument_Hover(&params);
  EXPECT_FALSE(server->HaveErrors());
  EXPECT_FALSE(TraceLog::Contains("Timed out"));
}

TEST_F(ConnectionLifecycle, AnInitializeThatNeverAnswersStillCountsAsInitialized) {
  xLanguageServer* server = Connection({"late=initialize:100000"}, 200);
  EXPECT_TRUE(server->Start(Init()));
  EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), 1);
  EXPECT_NE(SentBody("initialized"), "");
  EXPECT_EQ(SentBody("$/cancelRequest"), "");  // the protocol cannot cancel initialize
}

TEST_F(ConnectionLifecycle, AnErrorReplyFailsInitializeWithTheServersText) {
  xLanguageServer* server = Connection({"error=initialize"});
  EXPECT_FALSE(server->Start(Init()));
  EXPECT_TRUE(server->HaveErrors());
  EXPECT_STREQ(server->ErrorMessage(), "refused initialize");
  EXPECT_EQ(SentBody("initialized"), "");
}

TEST_F(ConnectionLifecycle, ShutdownTakesItsOwnReplyARelaunchWorksAndExitEmptiesTheRegistry) {
  // A 20 s host time-out: waiting for anything but the shutdown reply would last that long.
  xLanguageServer* server = Connection({}, 20000);
  ASSERT_TRUE(server->Start(Init()));
  auto before = std::chrono::steady_clock::now();
  EXPECT_TRUE(server->Shutdown());
  EXPECT_LT(std::chrono::steady_clock::now() - before, 2s);
  EXPECT_FALSE(TraceLog::Contains("Timed out"));

  // Shut down: a new Start skips the launch and initializes again.
  int process = server->Id();
  TraceLog::Clear();
  EXPECT_TRUE(server->Start(Init()));
  EXPECT_EQ(server->Id(), process);
  EXPECT_NE(SentBody("initialize"), "");

  // Killed: a new Start launches it again, with pipes of its own, on the same connection.
  vexil_test::KillProcess(process);
  ASSERT_TRUE(transport_test::WaitFor([&] { return !server->IsRunning(); }));
  EXPECT_TRUE(server->Start(Init()));
  EXPECT_NE(server->Id(), process);
  LSP::TextDocumentPositionParams params;
  server->TextDocument_Hover(&params);
  EXPECT_FALSE(server->HaveErrors());
  EXPECT_FALSE(TraceLog::Contains("Timed out"));

  EXPECT_TRUE(server->Shutdown());
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(Vexil_Have(kName), nullptr);
}

TEST_F(ConnectionLifecycle, RefusedShutdownKeepsTheConnectionInitialized) {
  xLanguageServer* server = Connection({"error=shutdown"});
  ASSERT_TRUE(server->Start(Init()));
  EXPECT_FALSE(server->Shutdown());
  TraceLog::Clear();
  EXPECT_TRUE(server->Initialize(Init()));
  EXPECT_TRUE(SentBodies().empty());
}

TEST_F(ConnectionLifecycle, StoppedServersShutDownAndExitWithoutAWord) {
  xLanguageServer* never = Connection();
  EXPECT_TRUE(never->Shutdown());
  EXPECT_TRUE(never->Exit());
  EXPECT_TRUE(SentBodies().empty());
  EXPECT_EQ(Vexil_Have(kName), nullptr);
}

TEST_F(ConnectionLifecycle, AServerThatIgnoresExitKeepsItsConnection) {
  xLanguageServer* server = Connection({"ignore-exit"});
  ASSERT_TRUE(server->Start(Init()));
  EXPECT_FALSE(server->Exit());
  EXPECT_EQ(Vexil_Have(kName), server);
  EXPECT_NE(SentBody("exit"), "");
  LSP::TextDocumentPositionParams params;
  server->TextDocument_Hover(&params);
  EXPECT_FALSE(server->HaveErrors());
  EXPECT_FALSE(TraceLog::Contains("Timed out"));
}

TEST_F(ConnectionLifecycle, ServerRequestsForFoldersGetTheInitializeFolders) {
  xLanguageServer* server = Connection({"ask=workspace/workspaceFolders"});
  ASSERT_TRUE(server->Start(Init()));
  EXPECT_TRUE(TraceLog::Contains(R"({"jsonrpc":"2.0","id":0,"result":[{"uri":"file:///work/root%20dir","name":"root dir"}]})"));
}

}  // namespace
