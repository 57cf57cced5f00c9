// Requests and replies against the fake server: tick counting, ignored messages, error
// replies by id, server requests answered, dead servers, big or split frames, servers
// that misbehave in every way that once hung or crashed the host, and a blocking callback.
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <functional>
#include <mutex>
#include <string>
#include <thread>

#include "transport_test_support.h"

namespace {

using namespace std::chrono_literals;
using namespace transport_test;
using Texts = std::vector<std::string>;

class ServerTraffic : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }

  // A started fake server at `level`, tracing into the log.
  std::unique_ptr<vexil::xServer> Started(int timeout = 2000, std::vector<std::string> directives = {},
                                          LSP::TraceLevel level = LSP::TraceLevel::Messages) {
    auto server = std::make_unique<vexil::xServer>(FakeStart(std::move(directives), timeout, level));
    EXPECT_TRUE(server->Start());
    TraceLog::Clear();
    return server;
  }
};

std::string Sent(const std::string& body) {
  return "\nSent: Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body + "\n";
}

TEST_F(ServerTraffic, PromptReplyUsesNoTickAndIsTracedAsSentAndReceived) {
  auto server = Started();
  FakeParams none("");
  LSP::RequestMessage request("fake/echo", &none);
  TextResult result;
  LSP::ResponseMessage response(&result);
  server->Write(request);
  server->Read(request.id, response);
  EXPECT_EQ(server->LastWaitTicks(), 0);
  EXPECT_EQ(result.method, "fake/echo");
  EXPECT_EQ(response.id, request.id);
  EXPECT_FALSE(server->HaveErrors());
  std::string reply = R"({"jsonrpc":"2.0","id":)" + std::to_string(request.id) +
                      R"(,"result":{"method":"fake/echo","answers":[],"received":[]}})";
  EXPECT_EQ(TraceLog::Texts(), (Texts{Sent(request.ToJSON()), "Reply: " + reply + "\n"}));
}

TEST_F(ServerTraffic, TimeOutsCountTicksTraceAndCancel) {
  for (auto [timeout, ticks] : {std::pair{200, 3}, {1, 1}, {250, 3}}) {
    auto server = Started(timeout);
    TextResult result;
    FakeParams none("");
    LSP::RequestMessage request("fake/silent", &none);
    LSP::ResponseMessage response(&result);
    server->Write(request);
    server->Read(request.id, response);
    EXPECT_EQ(server->LastWaitTicks(), ticks) << "timeout " << timeout;
    EXPECT_FALSE(result.read);
    EXPECT_FALSE(server->HaveErrors());
    std::string cancel = R"({"jsonrpc":"2.0","method":"$/cancelRequest","params":{"id":)" +
                         std::to_string(request.id) + "}}";
    EXPECT_EQ(TraceLog::Texts(), (Texts{Sent(request.ToJSON()), "Reply: Timed out waiting for reply......\n",
                                        "Output: \n", kHint, Sent(cancel)}));
    TraceLog::Clear();
  }
}

TEST_F(ServerTraffic, IgnoredMessagesExtendTheCountdownByHalf) {
  // Answering already, so that only its notifications' arrival is timed, not its start.
  auto server = Started(30000);
  TextResult result;
  Ask(*server, "fake/echo", "", result);
  server->Timeout(200);
  TraceLog::Clear();
  // Two notifications, then silence: the countdown goes 3, 4, 6 and six ticks run out.
  Ask(*server, "fake/silent", R"({"notifications":2})", result);
  EXPECT_EQ(server->LastWaitTicks(), 6);
  Texts texts = TraceLog::Texts();
  ASSERT_GE(texts.size(), 3u);
  EXPECT_EQ(texts[1].rfind("Ignoring Reply: {\"jsonrpc\":\"2.0\",\"method\":\"fake/progress\"", 0), 0u);
  EXPECT_EQ(texts[2].rfind("Ignoring Reply: {\"jsonrpc\":\"2.0\",\"method\":\"fake/progress\"", 0), 0u);

  // A notification is what Read(-1) waits for; numbered replies are passed over.
  TraceLog::Clear();
  FakeParams one(R"({"notifications":1,"stale":[7]})");
  LSP::RequestMessage request("fake/echo", &one);
  server->Write(request);
  LSP::ResponseMessage next(nullptr);
  server->Read(-1, next);
  EXPECT_EQ(next.id, -1);
  EXPECT_EQ(server->LastWaitTicks(), 0);
  LSP::ResponseMessage reply(&result);
  server->Read(request.id, reply);
  EXPECT_EQ(reply.id, request.id);
  EXPECT_EQ(TraceLog::Count("Ignoring Reply: {\"jsonrpc\":\"2.0\",\"id\":7,\"result\":null}\n"), 1);
}

TEST_F(ServerTraffic, ErrorRepliesAreTakenOnlyForTheirOwnIdOrNone) {
  auto server = Started(200);
  TextResult result;
  // A late error for another request is ignored; the wait then times out.
  Ask(*server, "fake/echo", R"({"error":{"code":-32603,"message":"late","id":999}})", result);
  EXPECT_FALSE(server->HaveErrors());
  EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), 1);

  for (const char* id : {"\"none\"", "\"same\""}) {
    TraceLog::Clear();
    Ask(*server, "fake/echo", std::string(R"({"error":{"code":-32603,"message":"boom","id":)") + id + "}}", result);
    EXPECT_TRUE(server->HaveErrors()) << id;
    EXPECT_STREQ(server->ErrorMessage(), "boom");
    EXPECT_EQ(TraceLog::Texts("Error"), (Texts{"Read Error: boom\n\n", kHint}));
  }

  // A null id is taken too (the server could not read the request), though the
  // envelope cannot read a null id and says so.
  TraceLog::Clear();
  Ask(*server, "fake/echo", R"({"error":{"code":-32700,"message":"boom","id":"null"}})", result);
  EXPECT_EQ(server->LastWaitTicks(), 0);
  EXPECT_TRUE(server->HaveErrors());
  EXPECT_EQ(TraceLog::Texts("Error"),
            (Texts{"Error: Expecting a 'int' JSON object but found 'null' JSON object.\n\n", kHint}));

  // Method not found is a warning: the error state stays clear but keeps the text.
  TraceLog::Clear();
  Ask(*server, "fake/echo", R"({"error":{"code":-32601,"message":"Unhandled method fake/echo"}})", result);
  EXPECT_FALSE(server->HaveErrors());
  EXPECT_STREQ(server->ErrorMessage(), "Unhandled method fake/echo");
  EXPECT_EQ(TraceLog::Count("Warning: Unhandled method fake/echo\n\n"), 1);
  EXPECT_TRUE(TraceLog::Texts("Error").empty());

  // Every write starts with a clean error state.
  FakeParams none("");
  LSP::NotificationMessage note("fake/note", &none);
  server->Write(note);
  EXPECT_STREQ(server->ErrorMessage(), "");
}

TEST_F(ServerTraffic, UnparsableBodyIsTakenAsTheReplyAndLeavesTheResponseAlone) {
  auto server = Started();
  TextResult result;
  LSP::ResponseMessage response = Ask(*server, "fake/echo", R"({"unparsable":true})", result);
  EXPECT_FALSE(result.read);
  EXPECT_EQ(response.id, -1);
  EXPECT_FALSE(server->HaveErrors());
  EXPECT_EQ(TraceLog::Count("JSON Parse Failed:\nthis is not json\n"), 1);
  EXPECT_EQ(TraceLog::Count("Reply: this is not json\n"), 1);
}

TEST_F(ServerTraffic, ServerRequestsAreAnsweredAndNeverTakenAsTheReply) {
  auto server = Started(2000, {}, LSP::TraceLevel::Messages);
  TextResult result;
  Ask(*server, "fake/echo",
      R"({"ask":["workspace/configuration","window/workDoneProgress/create","client/registerCapability","fake/unknown"]})",
      result);
  EXPECT_EQ(result.method, "fake/echo");
  EXPECT_EQ(result.answers, 4u);
  EXPECT_EQ(TraceLog::Count(Sent(R"({"jsonrpc":"2.0","id":0,"result":[null,null]})")), 1);
  EXPECT_EQ(TraceLog::Count(Sent(R"({"jsonrpc":"2.0","id":1,"result":null})")), 1);
  EXPECT_EQ(TraceLog::Count(Sent(R"({"jsonrpc":"2.0","id":2,"result":null})")), 1);
  EXPECT_EQ(TraceLog::Count(Sent(R"({"jsonrpc":"2.0","id":3,"error":{"code":-32601,"message":"Method not found"}})")),
            1);
  EXPECT_TRUE(TraceLog::Contains("Ignoring Reply: {\"jsonrpc\":\"2.0\",\"id\":0,\"method\":\"workspace/configuration\""));

  // A server request that carries the awaited id is still not the reply.
  TextResult same;
  Ask(*server, "fake/echo", R"({"ask":["window/workDoneProgress/create"],"askSameId":true})", same);
  EXPECT_EQ(same.method, "fake/echo");
  EXPECT_EQ(same.answers, 1u);
}

TEST_F(ServerTraffic, StandardErrorLinesAreTracedAtVerboseLevelWhileWaiting) {
  auto server = Started(2000, {}, LSP::TraceLevel::Verbose);
  TextResult result;
  Ask(*server, "fake/echo", R"({"stderr":"first\r\nsecond\n"})", result);
  ASSERT_TRUE(ErrorLineArrives(*server, "second"));
  EXPECT_EQ(TraceLog::Count("Reply: first\n"), 1);
}

TEST_F(ServerTraffic, BigAndSplitFramesArriveWhole) {
  auto server = Started(30000);  // 4 MB through a sanitized build on a busy machine
  TextResult big;
  Ask(*server, "fake/echo", R"({"size":4000000})", big);
  EXPECT_EQ(big.data.size(), 4000000u);
  TextResult split;
  Ask(*server, "fake/echo", R"({"split":7,"garbage":"warning: noise\n"})", split);
  EXPECT_EQ(split.method, "fake/echo");
}

TEST_F(ServerTraffic, WriteAndReadAfterTheServerDied) {
  auto server = Started();
  TextResult result;
  Ask(*server, "fake/echo", "", result);
  FakeParams exitNow(R"({"code":3})");
  LSP::NotificationMessage dummy("fake/none", &exitNow);
  LSP::RequestMessage die("fake/exit", &exitNow);
  server->Write(die);
  EXPECT_TRUE(WaitFor([&] { return !server->IsRunning(); }));

  TraceLog::Clear();
  LSP::RequestMessage late("fake/echo", &exitNow);
  server->Write(late);  // no SIGPIPE, no trace, error state untouched
  server->Write(dummy);
  EXPECT_TRUE(TraceLog::Lines().empty());
  EXPECT_FALSE(server->HaveErrors());

  LSP::ResponseMessage response(&result);
  server->Read(late.id, response);
  EXPECT_TRUE(server->HaveErrors());
  EXPECT_STREQ(server->ErrorMessage(), "A server read was requested but the server is not running.");
  EXPECT_EQ(TraceLog::Texts(), (Texts{"Error: A server read was requested but the server is not running.\n\n", kHint}));
}

// Kills the server once the read has passed over the notification `method` makes it send
// first: the read is then under way, and its wait has to end with the server.
void AskAndKillWhileAwaited(vexil::xServer& server, const char* method, const std::string& params) {
  const int id = server.Id();
  std::thread killer([id] {
    WaitFor([] { return TraceLog::Contains("Ignoring Reply: "); }, 30s);
    vexil_test::KillProcess(id);
  });
  TextResult result;
  Ask(server, method, params, result);
  killer.join();
}

TEST_F(ServerTraffic, AServerThatDiesWhileAwaitedEndsTheWaitAtOnce) {
  auto server = Started(30000);
  auto asked = std::chrono::steady_clock::now();
  AskAndKillWhileAwaited(*server, "fake/silent", R"({"notifications":1})");
  EXPECT_LT(std::chrono::steady_clock::now() - asked, 3s);
  EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), 1);

  // Killed in the middle of a frame: what it had sent of the header is the stray output.
  auto crashing = Started(30000);
  AskAndKillWhileAwaited(*crashing, "fake/stall", "");
  EXPECT_EQ(TraceLog::Count("Output: Content-Length: \n"), 1);
}

// A didOpen whose text is more than any pipe holds.
void WriteBigText(vexil::xServer& server) {
  FakeParams text(R"({"textDocument":{"text":")" + std::string(std::size_t{1} << 20, 'x') + R"("}})");
  LSP::NotificationMessage open("textDocument/didOpen", &text);
  server.Write(open);
}

enum class Next { Works, TimesOut, FailsFast };

// A server that misbehaves, the call that once hung or crashed the host on it, the lines
// that call traces once each, and what becomes of the next request.
struct Misbehaviour {
  const char* name;
  std::vector<std::string> directives;
  std::function<void(vexil::xServer&)> call;
  Texts traced;
  Next next;
  int timeout = 200;
};

std::function<void(vexil::xServer&)> Answered(const std::string& params, bool read = true) {
  return [params, read](vexil::xServer& server) {
    TextResult result;
    Ask(server, "fake/echo", params, result);
    EXPECT_EQ(result.read, read);
  };
}

TEST_F(ServerTraffic, MisbehavingServersNeitherHangNorCrashTheHost) {
  vexil_test::TempDirectory scratch;
  const std::string writeTimeout = "Write Timeout: the server read nothing for 5000 ms; its input is closed.\n";
  const std::string deep = R"({"deep":{"depth":300000,"in":")";
  const Misbehaviour rows[] = {
      {"asks while the host writes a big text, then writes more than a pipe holds", {},
       [](vexil::xServer& server) {
         // The server asks only once the host's write has filled its input.
         FakeParams asking(R"({"delay":500,"ask":["window/workDoneProgress/create"],"chatter":2000})");
         LSP::RequestMessage request("fake/echo", &asking);
         server.Write(request);
         WriteBigText(server);
         TextResult result;
         LSP::ResponseMessage response(&result);
         server.Read(request.id, response);
         EXPECT_EQ(result.answers, 1u);
       },
       {}, Next::Works, 2000},  // every later reply lists the big text the server received
      {"stops reading", {"hang"}, WriteBigText, {writeTimeout}, Next::FailsFast},
      {"asks and never reads the answers", {"send=window/workDoneProgress/create:3000", "hang"}, Answered("", false),
       {writeTimeout}, Next::FailsFast},
      {"streams progress and never answers in time", {}, Answered(R"({"trickle":3500})", false),
       {"Reply: Timed out waiting for reply......\n"}, Next::Works},
      // 600 KB frames, parsed up to three times, take their time under the sanitizers.
      {"nests a notification 300,000 deep", {}, Answered(deep + R"(notification"}})"), {}, Next::Works, 2000},
      {"nests a request's id 300,000 deep", {}, Answered(deep + R"(id"}})"),
       {Sent(R"({"jsonrpc":"2.0","id":null,"error":{"code":-32600,"message":"Invalid Request"}})")}, Next::Works, 2000},
      {"nests a reply 300,000 deep", {}, Answered(deep + R"(result"}})", false), {}, Next::Works, 2000},
      {"closed its input, then asks", {"close-stdin", "send=window/workDoneProgress/create:1", "hang"},
       [](vexil::xServer& server) {
         FakeParams none("");
         LSP::NotificationMessage note("fake/note", &none);
         EXPECT_TRUE(WaitFor([&] {
           server.Write(note);  // the failed answer is traced by the host's next exchange
           return TraceLog::Contains("Answer Failed");
         }));
       },
       {"Answer Failed: window/workDoneProgress/create: the server's input is closed\n"}, Next::TimesOut},
      {"died: Start launches it again", {},
       [](vexil::xServer& server) {
         KillServer(server);
         EXPECT_TRUE(server.Start());
       },
       {}, Next::Works},
      {"failed to start: Start launches it again", {"fail-once=" + scratch / "failed"},
       [](vexil::xServer& server) {
         // A slow machine may see the first launch end only after the start's grace time.
         EXPECT_TRUE(WaitFor([&] { return !server.IsRunning(); }));
         EXPECT_TRUE(server.Start());
       },
       {}, Next::Works},
  };
  for (const Misbehaviour& row : rows) {
    SCOPED_TRACE(row.name);
    auto has = [&](const char* directive) {
      return std::find(row.directives.begin(), row.directives.end(), directive) != row.directives.end();
    };
    if (has("close-stdin") && !kClosedInputFailsWrites) continue;
    vexil::xServer server(FakeStart(row.directives, row.timeout, LSP::TraceLevel::Messages));
    server.Start();
    TraceLog::Clear();
    // Writes get 5 s and waits at most 3 s here: a hang is told apart by far.
    auto begin = std::chrono::steady_clock::now();
    row.call(server);
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 40s);
    for (const std::string& line : row.traced) EXPECT_EQ(TraceLog::Count(line), 1) << line;

    TraceLog::Clear();
    begin = std::chrono::steady_clock::now();
    TextResult result;
    Ask(server, "fake/echo", "", result);
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 30s);
    EXPECT_EQ(result.read, row.next == Next::Works);
    EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), row.next == Next::TimesOut ? 1 : 0);
    if (row.next == Next::FailsFast) {
      EXPECT_STREQ(server.ErrorMessage(), "A server read was requested but the server is not running.");
    }
    EXPECT_FALSE(TraceLog::Contains("Write Error"));  // a failed answer is no reader error
    if (has("hang")) vexil_test::KillProcess(server.Id());
  }
}

// A host that hands each line to another thread (its UI thread) and waits until that
// thread has taken it; the other thread takes lines only once the server got its answer.
class HandedOverLines {
 public:
  static void Callback(TraceType, const char*, const char*) {
    std::unique_lock<std::mutex> lock(mutex_);
    taken_.wait(lock, [] { return open_; });
  }
  static void Open(bool open) {
    std::lock_guard<std::mutex> lock(mutex_);
    open_ = open;
    taken_.notify_all();
  }

 private:
  static inline std::mutex mutex_;
  static inline std::condition_variable taken_;
  static inline bool open_ = true;
};

TEST_F(ServerTraffic, ACallbackThatWaitsForAnotherThreadHoldsUpNothingElse) {
  vexil_test::TempDirectory scratch;
  const std::string answered = scratch / "answered";
  // The server asks once the host is inside its callback, and goes on only once answered.
  xServerStart start = FakeStart({"pause=500", "send=window/workDoneProgress/create:1", "await=1",
                                  "flood-done=" + answered},
                                 2000, LSP::TraceLevel::Messages);
  start.trace = &HandedOverLines::Callback;
  vexil::xServer server(start);
  ASSERT_TRUE(server.Start());
  HandedOverLines::Open(false);
  std::thread uiThread([&] {
    WaitFor([&] { return std::filesystem::exists(answered); }, 30s);
    HandedOverLines::Open(true);
  });
  FakeParams none("");
  LSP::NotificationMessage note("fake/note", &none);
  server.Write(note);  // its "Sent" line blocks until the server has been answered
  uiThread.join();
  EXPECT_TRUE(std::filesystem::exists(answered));
}

// Each server request handed to the host is answered once: by the host, or by the timer.
TEST_F(ServerTraffic, HostAnswersGoOutOnceFromTheHostOrWhenTheirTimeIsUp) {
  std::mutex mutex;
  Texts sent;
  vexil::HostAnswers answers(200ms);
  answers.Attach([&](std::string body, const std::string& method) {
    std::lock_guard<std::mutex> lock(mutex);
    sent.push_back(method + " " + body);
  });
  answers.Expect("1", "a");
  answers.Expect(R"("x")", "b");
  EXPECT_TRUE(answers.Answer("1", "one"));
  EXPECT_FALSE(answers.Answer("1", "again"));
  EXPECT_TRUE(WaitFor([&] {
    std::lock_guard<std::mutex> lock(mutex);
    return sent.size() == 2;
  }));
  EXPECT_FALSE(answers.Answer(R"("x")", "late"));
  std::lock_guard<std::mutex> lock(mutex);
  EXPECT_EQ(sent, (Texts{"a one", R"(b {"jsonrpc":"2.0","id":"x","error":{"code":-32803,"message":"Request not answered"}})"}));
}

}  // namespace
