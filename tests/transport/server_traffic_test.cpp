// Requests and replies against the fake server: tick counting, ignored messages, error
// replies by id, server requests answered, dead servers, and big or split frames.
#include <gtest/gtest.h>

#include <chrono>
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

}  // namespace
