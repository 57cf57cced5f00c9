// The connection's handshake against the fake server: initialize and initialized, the
// verbose start-up lines, the long initialize wait, shutdown by its own id, and exit.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <functional>
#include <set>
#include <thread>
#include <regex>
#include <string>

#include "../protocol/reply_helpers.h"
#include "../watch/watch_fixture.h"
#include "connection_test_support.h"
#include "vexil/client/uri.h"

namespace {

using namespace std::chrono_literals;
using namespace connection_test;
using Texts = std::vector<std::string>;

constexpr char kName[] = "lifecycle";

class ConnectionLifecycle : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }
  void TearDown() override { Dispose(kName); }

  // The next request is answered at once: no earlier wait is left to make it suffer.
  static void ExpectAnswered(xLanguageServer* server) {
    LSP::TextDocumentPositionParams params;
    server->TextDocument_Hover(&params);
    EXPECT_FALSE(server->HaveErrors());
    EXPECT_FALSE(TraceLog::Contains("Timed out"));
  }
};

// What each opt-in changes of the initialize request: nothing, unless it enables client
// capabilities. The request is otherwise the model's, byte for byte; the start-up details
// are traced at the verbose level only; a server that asks for the folders while it
// initializes gets those of initialize; once initialized, neither Start nor Initialize
// writes anything. The reply's capabilities are handed out as read and as text, in both forms
// of the synchronisation member.
TEST_F(ConnectionLifecycle, OnlyEnabledFeaturesChangeTheInitializeRequestAndItsReplyIsHandedOut) {
  struct Row {
    std::vector<const char*> features;
    std::vector<std::pair<std::string, std::string>> changes;  // on the expected text
    std::string capabilities = R"({"textDocumentSync": "full","hoverProvider":true})";
    // The hover provider, the change kind, open/close, save and its text, the position
    // encoding, and the old synchronisation member, which stays unread.
    const char* read = "1|0|0|0|0|utf-16|0";
    LSP::TraceLevel level = LSP::TraceLevel::Messages;
  };
  const std::string treeEnd = R"("diagnostic":{"dynamicRegistration":false}})";
  const std::string features = vexil_test::ReadDataFile("feature_capabilities.json");
  const Row rows[] = {
      {{}, {}, R"({"textDocumentSync": 2,"hoverProvider":true,"positionEncoding":"utf-8"})", "1|2|1|1|0|utf-8|0"},
      {{},
       {{R"("trace":"messages")", R"("trace":"verbose")"}},
       R"({"textDocumentSync": {"openClose":true,"change":1,"save":{"includeText":true}},"hoverProvider":true})",
       "1|1|1|1|1|utf-16|0",
       LSP::TraceLevel::Verbose},
      {{"messages", "unknown"},
       {},
       R"({"textDocumentSync": {"change":2,"save":false},"hoverProvider":true,"positionEncoding":8})",
       "1|2|0|0|0|utf-16|0"},
      {{"progress"}, {{treeEnd + "}", treeEnd + R"(,"window":{"workDoneProgress":true}})"}}},
      {{"configuration", "configuration"}, {{R"("configuration":false)", R"("configuration":true)"}}},
      {{"features"},
       {{R"("applyEdit":false,"workspaceEdit":{"documentChanges":false)",
         R"("applyEdit":true,"workspaceEdit":{"documentChanges":true)"},
        {R"("willSave":false)", R"("willSave":true)"},
        {R"("codeAction":{"dynamicRegistration":false})",
         R"("codeAction":{"dynamicRegistration":false,)" +
             features.substr(features.find(R"("codeActionLiteralSupport")"),
                             features.find(R"(,"rename")") - features.find(R"("codeActionLiteralSupport")"))},
        {R"("rename":{"dynamicRegistration":false})",
         R"("rename":{"dynamicRegistration":false,"prepareSupport":true})"},
        {treeEnd + "}",
         treeEnd.substr(0, treeEnd.size() - 1) + features.substr(features.find(R"(,"semanticTokens")"))}}},
      {{"positionEncoding"}, {{treeEnd + "}", treeEnd + R"(,"general":{"positionEncodings":["utf-8","utf-16"]}})"}}},
      {{"watchedFiles"},
       {{R"("didChangeWatchedFiles":{"dynamicRegistration":false})",
         R"("didChangeWatchedFiles":{"dynamicRegistration":true,"relativePatternSupport":true})"}}},
  };
  for (const Row& row : rows) {
    xLanguageServer* server =
        Fake(kName, {"ask=workspace/workspaceFolders", "result=initialize:{\"capabilities\":" + row.capabilities + "}"},
             2000, row.level);
    for (const char* feature : row.features) EXPECT_EQ(server->Enable(feature), std::string(feature) != "unknown");
    xServerInitialise init;
    init.processId = 4242;
    init.rootPath = "/home/dev/project";
    init.options = R"({"initializationOptions":{"fallbackFlags":["-std=c++17"],"clangdFileStatus":true}})";
    init.workspaceFolders.emplace_back("file:///home/dev/project", "project");
    EXPECT_FALSE(server->Initialize(init)) << "nothing is sent to a stopped server";
    EXPECT_TRUE(TraceLog::Lines().empty());
    EXPECT_STREQ(server->ServerCapabilitiesJson(), "");
    ASSERT_TRUE(server->Start(init));
    const LSP::ServerCapabilities read = server->ServerCapabilities();
    EXPECT_EQ(vexil_test::Fields(read.hoverProvider, read.documentSync.change, read.documentSync.openClose,
                                 read.documentSyncSave, read.documentSync.save.includeText, read.positionEncoding,
                                 read.textDocumentSync.change),
              row.read);
    std::string compact = row.capabilities;
    compact.erase(compact.find(' '), 1);
    EXPECT_EQ(server->ServerCapabilitiesJson(), compact);
    const bool verbose = row.level == LSP::TraceLevel::Verbose;
    ASSERT_EQ(TraceLog::Contains("Process Id"), verbose) << "start-up details are verbose only";
    const Texts details = TraceLog::Texts("Verbose");
    const Texts startUp = {"Process Id: 4242\n", " Root Path: /home/dev/project\n",
                           "   Options: " + init.options + "\n"};
    EXPECT_EQ(std::search(details.begin(), details.end(), startUp.begin(), startUp.end()) != details.end(), verbose);
    EXPECT_TRUE(TraceLog::Contains(
        R"({"jsonrpc":"2.0","id":0,"result":[{"uri":"file:///home/dev/project","name":"project"}]})"));
    EXPECT_EQ(SentBodies().size(), 3u);  // with the answer to the server's request, in either order
    EXPECT_EQ(SentBody("initialized"), R"({"jsonrpc":"2.0","method":"initialized","params":{}})");
    std::string expected = vexil_test::ReadDataFile("initialize_request.json");
    // Request ids count up through the process.
    std::string sent = std::regex_replace(SentBody("initialize"), std::regex(R"(^(\{"jsonrpc":"2.0","id":)\d+)"), "$011");
    expected.replace(expected.find("file:///home/dev/project"), 24, FileToUri(init.rootPath.c_str()));
    for (const auto& [from, to] : row.changes) expected.replace(expected.find(from), from.size(), to);
    EXPECT_EQ(sent, expected) << row.features.size();
    TraceLog::Clear();
    EXPECT_TRUE(server->Start(init));
    EXPECT_TRUE(server->Initialize(init));
    // Nothing, but the error for a missing folder the watcher may trace at any time.
    EXPECT_TRUE(TraceLog::Texts("Message").empty() && TraceLog::Texts("Verbose").empty());
    Dispose(kName);
    TraceLog::Clear();
  }
}

// A host's message handler: what it was handed, on which threads. It answers requests
// with `reply` (a result, or "error" for an error) unless that is empty.
struct Handed {
  static void Handler(void* user, const char* method, const char* id, const char* params) {
    Handed& self = *static_cast<Handed*>(user);
    self.shared.Update([&] {
      self.lines.push_back(std::string(method) + " " + (id ? id : "-") + " " + params);
      self.threads.insert(std::this_thread::get_id());
      if (!id || self.reply.empty()) return;
      self.answered = self.reply == "error" ? self.server->ReplyError(id, -32001, "declined")
                                            : self.server->Reply(id, self.reply.c_str());
    });
  }

  watchtest::Shared shared;  // over the lines and threads
  std::vector<std::string> lines;
  std::set<std::thread::id> threads;
  xLanguageServer* server = nullptr;
  std::string reply;
  std::atomic<bool> answered{false};
};

TEST_F(ConnectionLifecycle, ServerMessagesReachTheHandlerAndRequestsAreAlwaysAnswered) {
  const std::string items = R"({"items":[{"section":"a"},{"section":"b"}]})";
  struct Row {
    const char* name;
    std::vector<const char*> features;
    std::vector<std::string> directives;
    const char* reply;
    std::function<std::string(xLanguageServer*)> action;  // returns what the server got back
    std::vector<std::string> handed;
    std::string answer;  // part of the returned text
  };
  auto ask = [](const char* params, const char* method = "fake/echo") {
    return [params, method](xLanguageServer* server) { return server->Request(method, params); };
  };
  const Row rows[] = {
      {"notifications in arrival order", {}, {}, "", ask(R"({"notifications":3})"),
       {R"(fake/progress - {"left":3})", R"(fake/progress - {"left":2})", R"(fake/progress - {"left":1})"}, ""},
      {"a request routed by its feature, answered from the handler", {"configuration"}, {}, R"([{"tabSize": 4}])",
       ask(R"({"ask":["workspace/configuration"]})"), {"workspace/configuration 0 " + items},
       R"({"jsonrpc":"2.0","id":0,"result":[{"tabSize":4}]})"},
      {"not opted in: the library answers", {}, {}, "[1]", ask(R"({"ask":["workspace/configuration"]})"), {},
       R"({"jsonrpc":"2.0","id":0,"result":[null,null]})"},
      {"an edit to apply, routed by its feature", {"features"}, {}, R"({"applied": true})",
       ask(R"({"ask":["workspace/applyEdit"]})"), {"workspace/applyEdit 0 " + items},
       R"({"jsonrpc":"2.0","id":0,"result":{"applied":true}})"},
      {"any other request, declined by the host", {"messages"}, {}, "error", ask(R"({"ask":["workspace/applyEdit"]})"),
       {"workspace/applyEdit 0 " + items},
       R"({"jsonrpc":"2.0","id":0,"error":{"code":-32001,"message":"declined"}})"},
      {"unanswered until Exit", {"messages"}, {"send=workspace/applyEdit:1"}, "",
       [](xLanguageServer* server) {
         EXPECT_TRUE(server->Exit());
         return TraceLog::Contains(R"({"jsonrpc":"2.0","id":0,"error":{"code":-32803,"message":"Request not answered"}})")
                    ? "declined"
                    : "";
       },
       {"workspace/applyEdit 0 " + items, R"(exit - {"status":0})"}, "declined"},
      {"the server's exit status", {}, {}, "", ask(R"({"code":3})", "fake/exit"), {R"(exit - {"status":3})"}, ""},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.name);
    Handed handed;
    handed.reply = row.reply;
    handed.server = Fake(kName, row.directives);
    handed.server->SetMessageHandler(&Handed::Handler, &handed);
    for (const char* feature : row.features) EXPECT_TRUE(handed.server->Enable(feature));
    ASSERT_TRUE(handed.server->Start(xServerInitialise()));
    std::string returned = row.action(handed.server);
    EXPECT_NE(returned.find(row.answer), std::string::npos) << returned;
    EXPECT_TRUE(handed.shared.WaitUntil([&] { return handed.lines.size() >= row.handed.size(); }));
    EXPECT_EQ(handed.shared.Read([&] { return handed.lines; }), row.handed);
    EXPECT_EQ(handed.answered, !row.handed.empty() && std::string(row.reply).size() > 0);
    const auto threads = handed.shared.Read([&] { return handed.threads; });
    if (!row.handed.empty()) {
      EXPECT_EQ(threads.size(), 1u);
      EXPECT_EQ(threads.count(std::this_thread::get_id()), 0u);
    }
    // An answered request waits no more.
    EXPECT_FALSE(Vexil_Have(kName) && handed.server->Reply("0", "null"));
    Dispose(kName);
    TraceLog::Clear();
  }
}

// Registration and unregistration of watched files through the server's own requests: the
// kinds a watcher asks for, patterns relative to a folder, and a new session that starts
// without them (the batches: watched_files_test). What the fake server received is in every
// reply to "fake/echo".
TEST_F(ConnectionLifecycle, FilesChangedOnDiskReachTheServerAsItRegistersForThem) {
  vexil_test::TempDirectory temporary;
  const std::filesystem::path root = std::filesystem::absolute(temporary.Path());
  const auto file = [&](const std::string& name) { return (root / name).make_preferred().string(); };
  std::ofstream(file("old.py")).put('x');
  xLanguageServer* server = Fake(kName);
  ASSERT_TRUE(server->Enable("watchedFiles"));
  xServerInitialise init;
  init.rootPath = root.string();
  ASSERT_TRUE(server->Start(init));
  const auto ask = [&](const char* method, const std::string& params) {
    return server->Request("fake/echo", (R"({"ask":[{"method":")" + std::string(method) + R"(","params":)" + params + "}]}").c_str());
  };
  const auto registration = [](const char* id, const std::string& watcher) {
    return R"({"registrations":[{"id":")" + std::string(id) + R"(","method":"workspace/didChangeWatchedFiles",)" +
           R"("registerOptions":{"watchers":[)" + watcher + "]}}]}";
  };
  const auto received = [&](const std::string& name) {
    return server->Request("fake/echo", "{}").find(FileToUri(file(name).c_str()) + "\\\",") != std::string::npos;
  };
  // Writes to each file in turn, appending to one that exists; once the last is told, which were.
  const auto told = [&](std::vector<std::string> names) {
    for (const std::string& name : names) std::ofstream(file(name), std::ios::app).put('x');
    EXPECT_TRUE(transport_test::WaitFor([&] { return received(names.back()); }, 30s));
    std::string heard;
    for (const std::string& name : names) heard += received(name) ? name + ";" : "";
    return heard;
  };
  // Nothing registered yet: every change under the folder is told.
  std::filesystem::create_directory(file("sub"));
  EXPECT_EQ(told({"early.txt"}), "early.txt;");
  // Python files created or deleted only: a change of one and other files are not told.
  const std::string python = registration("py", R"({"globPattern":"**/*.py","kind":5})");
  EXPECT_NE(ask("client/registerCapability", python).find(R"("id":0,"result":null)"), std::string::npos);
  EXPECT_EQ(told({"old.py", "a.txt", "a.py"}), "a.py;");

  // Unregistered, then text files of "sub" only, by a pattern relative to it.
  const char* dropped = R"({"unregisterations":[{"id":"py","method":"workspace/didChangeWatchedFiles"}]})";
  EXPECT_NE(ask("client/unregisterCapability", dropped).find(R"("result":null)"), std::string::npos);
  const std::string relative =
      R"({"globPattern":{"baseUri":")" + FileToUri(file("sub").c_str()) + R"(","pattern":"*.txt"}})";
  EXPECT_NE(ask("client/registerCapability", registration("txt", relative)).find(R"("result":null)"),
            std::string::npos);
  EXPECT_EQ(told({"b.py", "b.txt", "sub/b.txt"}), "sub/b.txt;");
  EXPECT_NE(ask("client/registerCapability", "{}").find(R"("error":{"code":-32602,)"), std::string::npos);

  // Shut down and initialized again: the registrations of the earlier session are gone.
  EXPECT_TRUE(server->Shutdown());
  ASSERT_TRUE(server->Start(init));
  EXPECT_EQ(told({"c.py"}), "c.py;");
}

// How the handshake's replies come, against a 200 ms host time-out: a late initialize reply
// is waited for within the handshake's own limit, one that never comes still lets the
// handshake go on (the protocol cannot cancel initialize), and an error reply fails it. A
// server that refuses shutdown stays initialized; one that ignores exit keeps its
// connection, usable as before.
TEST_F(ConnectionLifecycle, HandshakeRepliesLateNeverOrRefused) {
  struct Row {
    const char* name;
    const char* directive;
    bool started;
    int timeouts;
    const char* error;
    bool ending = false;  // refuses shutdown and ignores exit
  } rows[] = {
      {"late", "late=initialize:2000", true, 0, ""},
      {"never", "late=initialize:100000", true, 1, ""},
      {"refused", "error=initialize", false, 0, "refused initialize"},
      {"no ending", "error=shutdown;ignore-exit", true, 0, "", true},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.name);
    xLanguageServer* server = Fake(kName, {row.directive}, 200);
    EXPECT_EQ(server->Start(xServerInitialise()), row.started);
    EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), row.timeouts);
    EXPECT_EQ(SentBody("initialized") != "", row.started);
    EXPECT_EQ(SentBody("$/cancelRequest"), "");
    if (!row.started) {
      EXPECT_TRUE(server->HaveErrors());
      EXPECT_STREQ(server->ErrorMessage(), row.error);
    }
    if (row.ending) {
      EXPECT_FALSE(server->Shutdown());
      TraceLog::Clear();
      EXPECT_TRUE(server->Initialize(xServerInitialise()));
      EXPECT_TRUE(SentBodies().empty());
      EXPECT_FALSE(server->Exit());
      EXPECT_EQ(Vexil_Have(kName), server);
      EXPECT_NE(SentBody("exit"), "");
    }
    if (row.timeouts == 0 && row.started) ExpectAnswered(server);
    Dispose(kName);
    TraceLog::Clear();
  }
}

TEST_F(ConnectionLifecycle, ShutdownTakesItsOwnReplyARelaunchWorksAndExitEmptiesTheRegistry) {
  // Never started: shut down and exited without a word.
  xLanguageServer* never = Fake(kName);
  EXPECT_TRUE(never->Shutdown());
  EXPECT_TRUE(never->Exit());
  EXPECT_TRUE(SentBodies().empty());
  EXPECT_EQ(Vexil_Have(kName), nullptr);

  // A 20 s host time-out: waiting for anything but the shutdown reply would last that long.
  xLanguageServer* server = Fake(kName, {}, 20000);
  ASSERT_TRUE(server->Start(xServerInitialise()));
  auto before = std::chrono::steady_clock::now();
  EXPECT_TRUE(server->Shutdown());
  EXPECT_LT(std::chrono::steady_clock::now() - before, 2s);
  EXPECT_FALSE(TraceLog::Contains("Timed out"));

  // Shut down: a new Start skips the launch and initializes again.
  int process = server->Id();
  TraceLog::Clear();
  EXPECT_TRUE(server->Start(xServerInitialise()));
  EXPECT_EQ(server->Id(), process);
  EXPECT_NE(SentBody("initialize"), "");

  // Killed: a new Start launches it again, with pipes of its own, on the same connection.
  vexil_test::KillProcess(process);
  ASSERT_TRUE(transport_test::WaitFor([&] { return !server->IsRunning(); }));
  EXPECT_TRUE(server->Start(xServerInitialise()));
  EXPECT_NE(server->Id(), process);
  ExpectAnswered(server);

  EXPECT_TRUE(server->Shutdown());
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(Vexil_Have(kName), nullptr);
}

}  // namespace
