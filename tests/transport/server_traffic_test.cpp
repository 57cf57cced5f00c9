// Requests and replies against the fake server: tick counting, ignored messages, error
// replies by id, server requests answered, dead servers, big or split frames, servers
// that misbehave in every way that once hung or crashed the host, and a blocking callback.
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>

#include "transport_test_support.h"

namespace {

using namespace std::chrono_literals;
using namespace transport_test;

using ServerTraffic = FakeServerTest;

std::string Sent(const std::string& body) {
  return "\nSent: " + vexil_test::Frame(body) + "\n";
}

// What of the reply was read: nothing, only the envelope's id, or the id and the result.
enum class Taken { Nothing, Id, Result };

// What the host read, its error state and its trace lines after one request to a fresh
// fake server, whose reply the request's params script. In `traced`, "{id}" stands for the
// request's id, "{request}" for the line sent with it, and a JSON object for a line sent.
struct Exchange {
  const char* name;
  const char* method;
  std::string params;
  int timeout;
  Taken taken;
  int ticks;                // -1: not checked
  bool errors;              // HaveErrors()
  const char* message;      // ErrorMessage(); null: not checked
  const char* title;        // traced is the whole trace under this title ("": all); null: each line once
  Texts traced;
  unsigned answers = 0;     // server requests the read reply says were answered
  std::size_t data = 0;     // size of the data the read reply carries
  // A read without id comes first, and takes a notification at once.
  bool notification = false;
};

std::string Expanded(std::string text, LSP::RequestMessage& request) {
  if (text == "{request}") return Sent(request.ToJSON());
  for (std::size_t at; (at = text.find("{id}")) != std::string::npos;) text.replace(at, 4, std::to_string(request.id));
  return text.rfind("{\"", 0) == 0 ? Sent(text) : text;
}

TEST_F(ServerTraffic, RepliesTimeOutsErrorsAndServerRequests) {
  const std::string timedOut = "Reply: Timed out waiting for reply......\n";
  const Texts timeOut = {"{request}", timedOut, "Output: \n", kHint,
                         R"({"jsonrpc":"2.0","method":"$/cancelRequest","params":{"id":{id}}})"};
  const Texts readError = {"Read Error: boom\n\n", kHint};
  const Exchange rows[] = {
      {"a prompt reply takes no tick", "fake/echo", "", 2000, Taken::Result, 0, false, "", "",
       {"{request}", R"(Reply: {"jsonrpc":"2.0","id":{id},"result":{"method":"fake/echo","answers":[],"received":[]}})" "\n"}},
      {"a time-out counts ticks, traces and cancels", "fake/silent", "", 200, Taken::Nothing, 3, false, "", "", timeOut},
      {"a time-out of 1 ms is one tick", "fake/silent", "", 1, Taken::Nothing, 1, false, "", "", timeOut},
      {"a time-out rounds its ticks", "fake/silent", "", 250, Taken::Nothing, 3, false, "", "", timeOut},
      {"each ignored message extends the countdown by half", "fake/silent", R"({"notifications":2})", 200, Taken::Nothing, 6,
       false, "", nullptr,
       {R"(Ignoring Reply: {"jsonrpc":"2.0","method":"fake/progress","params":{"left":2}})" "\n",
        R"(Ignoring Reply: {"jsonrpc":"2.0","method":"fake/progress","params":{"left":1}})" "\n"}},
      {"a late error for another request is ignored", "fake/echo",
       R"({"error":{"code":-32603,"message":"late","id":999}})", 200, Taken::Nothing, -1, false, "", nullptr, {timedOut}},
      {"an error without an id is taken", "fake/echo", R"({"error":{"code":-32603,"message":"boom","id":"none"}})",
       2000, Taken::Nothing, 0, true, "boom", "Error", readError},
      {"an error for this request is taken", "fake/echo", R"({"error":{"code":-32603,"message":"boom","id":"same"}})",
       2000, Taken::Id, 0, true, "boom", "Error", readError},
      // The server could not read the request; the envelope cannot read a null id and says so.
      {"an error with a null id is taken", "fake/echo", R"({"error":{"code":-32700,"message":"boom","id":"null"}})",
       2000, Taken::Nothing, 0, true, nullptr, "Error",
       {"Error: Expecting a 'int' JSON object but found 'null' JSON object.\n\n", kHint}},
      {"method not found is a warning that keeps its text", "fake/echo",
       R"({"error":{"code":-32601,"message":"Unhandled method fake/echo"}})", 2000, Taken::Id, 0, false,
       "Unhandled method fake/echo", "",
       {"{request}", R"(Reply: {"jsonrpc":"2.0","id":{id},"error":{"code":-32601,"message":"Unhandled method fake/echo"}})" "\n",
        "Warning: Unhandled method fake/echo\n\n"}},
      {"an unparsable body is taken as the reply", "fake/echo", R"({"unparsable":true})", 2000, Taken::Nothing, 0, false, "",
       nullptr, {"JSON Parse Failed:\nthis is not json\n", "Reply: this is not json\n"}},
      {"server requests are answered and never taken as the reply", "fake/echo",
       R"({"ask":["workspace/configuration","window/workDoneProgress/create","client/registerCapability","fake/unknown"]})",
       2000, Taken::Result, 0, false, "", nullptr,
       {R"(Ignoring Reply: {"jsonrpc":"2.0","id":0,"method":"workspace/configuration","params":{"items":[{"section":"a"},{"section":"b"}]}})" "\n",
        R"({"jsonrpc":"2.0","id":0,"result":[null,null]})", R"({"jsonrpc":"2.0","id":1,"result":null})",
        R"({"jsonrpc":"2.0","id":2,"result":null})",
        R"({"jsonrpc":"2.0","id":3,"error":{"code":-32601,"message":"Method not found"}})"},
       4},
      {"a server request with the awaited id is not the reply", "fake/echo",
       R"({"ask":["window/workDoneProgress/create"],"askSameId":true})", 2000, Taken::Result, 0, false, "", nullptr, {}, 1},
      {"a read without id takes a notification, and numbered replies are passed over", "fake/echo",
       R"({"notifications":1,"stale":[7]})", 2000, Taken::Result, 0, false, "", nullptr,
       {R"(Ignoring Reply: {"jsonrpc":"2.0","id":7,"result":null})" "\n"}, 0, 0, true},
      {"a 4 MB reply arrives whole", "fake/echo", R"({"size":4000000})", 30000, Taken::Result, -1, false, "", nullptr, {}, 0,
       4000000},
      {"a reply split in 7 writes after noise arrives whole", "fake/echo", R"({"split":7,"garbage":"warning: noise\n"})",
       2000, Taken::Result, -1, false, "", nullptr, {}},
  };
  for (const Exchange& row : rows) {
    SCOPED_TRACE(row.name);
    // Answering already, so that only the reply is timed, not the server's start.
    auto server = Started(30000);
    Ask(*server, "fake/echo");
    server->Timeout(row.timeout);
    TraceLog::Clear();
    FakeParams params(row.params);
    LSP::RequestMessage request(row.method, &params);
    TextResult result;
    LSP::ResponseMessage response(&result);
    server->Write(request);
    if (row.notification) {
      LSP::ResponseMessage next(nullptr);
      server->Read(-1, next);
      EXPECT_EQ(next.id, -1);
      EXPECT_EQ(server->LastWaitTicks(), 0);
    }
    server->Read(request.id, response);
    EXPECT_EQ(response.id, row.taken == Taken::Nothing ? -1 : request.id);
    EXPECT_EQ(result.read, row.taken == Taken::Result);
    if (result.read) {
      EXPECT_EQ(result.method, row.method);
      EXPECT_EQ(result.answers, row.answers);
      EXPECT_EQ(result.data.size(), row.data);
    }
    if (row.ticks >= 0) { EXPECT_EQ(server->LastWaitTicks(), row.ticks); }
    EXPECT_EQ(server->HaveErrors(), row.errors);
    if (row.message) { EXPECT_STREQ(server->ErrorMessage(), row.message); }
    Texts expected;
    for (const std::string& text : row.traced) expected.push_back(Expanded(text, request));
    if (row.title) {
      EXPECT_EQ(TraceLog::Texts(row.title), expected);
    } else {
      for (const std::string& line : expected) EXPECT_EQ(TraceLog::Count(line), 1) << line;
    }
    Notify(*server, "fake/note");  // every write starts with a clean error state
    EXPECT_STREQ(server->ErrorMessage(), "");
  }
}

// Asks, and kills the server once the read has passed over the notification `method` makes
// it send first: the read is then under way, and its wait has to end at once with the server.
std::function<void(vexil::xServer&)> KilledWhileAwaited(const char* method, const std::string& params) {
  return [method, params](vexil::xServer& server) {
    const int id = server.Id();
    std::thread killer([id] {
      WaitFor([] { return TraceLog::Contains("Ignoring Reply: "); }, 30s);
      vexil_test::KillProcess(id);
    });
    auto asked = std::chrono::steady_clock::now();
    Ask(server, method, params);
    killer.join();
    EXPECT_LT(std::chrono::steady_clock::now() - asked, 3s);  // its time-out is 30 s
    // Its output may end before its exit is seen: the next request fails fast only after.
    EXPECT_TRUE(WaitFor([&] { return !server.IsRunning(); }));
  };
}

// Waits for the server to be gone (killed first when `kill`), then launches it again.
std::function<void(vexil::xServer&)> Relaunched(bool kill) {
  return [kill](vexil::xServer& server) {
    if (kill) vexil_test::KillProcess(server.Id());
    // A slow machine may see a failed launch end only after the start's grace time.
    EXPECT_TRUE(WaitFor([&] { return !server.IsRunning(); }));
    EXPECT_TRUE(server.Start());
  };
}

// A didOpen whose text is more than any pipe holds.
void WriteBigText(vexil::xServer& server) {
  Notify(server, "textDocument/didOpen", R"({"textDocument":{"text":")" + std::string(std::size_t{1} << 20, 'x') + R"("}})");
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
    EXPECT_EQ(Ask(server, "fake/echo", params).read, read);
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
         EXPECT_TRUE(WaitFor([&] {
           Notify(server, "fake/note");  // the failed answer is traced by the host's next exchange
           return TraceLog::Contains("Answer Failed");
         }));
       },
       {"Answer Failed: window/workDoneProgress/create: the server's input is closed\n"}, Next::TimesOut},
      {"exited: writing to it fails quietly", {},
       [](vexil::xServer& server) {
         FakeParams exitNow(R"({"code":3})");
         LSP::RequestMessage die("fake/exit", &exitNow);
         server.Write(die);
         EXPECT_TRUE(WaitFor([&] { return !server.IsRunning(); }));
         TraceLog::Clear();
         server.Write(die);  // no SIGPIPE, no trace, error state untouched
         EXPECT_TRUE(TraceLog::Lines().empty());
         EXPECT_FALSE(server.HaveErrors());
       },
       {}, Next::FailsFast},
      {"dies while a read waits", {}, KilledWhileAwaited("fake/silent", R"({"notifications":1})"),
       {"Reply: Timed out waiting for reply......\n"}, Next::FailsFast, 30000},
      // What it had sent of the header is the stray output.
      {"dies in the middle of a frame", {}, KilledWhileAwaited("fake/stall", ""), {"Output: Content-Length: \n"},
       Next::FailsFast, 30000},
      {"died: Start launches it again", {}, Relaunched(true), {}, Next::Works},
      {"failed to start: Start launches it again", {"fail-once=" + scratch / "failed"}, Relaunched(false), {}, Next::Works},
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
    const bool read = Ask(server, "fake/echo").read;
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 30s);
    EXPECT_EQ(read, row.next == Next::Works);
    EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), row.next == Next::TimesOut ? 1 : 0);
    if (row.next == Next::FailsFast) {
      EXPECT_STREQ(server.ErrorMessage(), "A server read was requested but the server is not running.");
      EXPECT_EQ(TraceLog::Count("Error: A server read was requested but the server is not running.\n\n"), 1);
      EXPECT_TRUE(TraceLog::Contains(kHint));
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
    taken_.WaitUntil([] { return open_; });
  }
  static void Open(bool open) {
    taken_.Update([&] { open_ = open; });
  }

 private:
  static inline vexil_test::Shared taken_;
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
  Notify(server, "fake/note");  // its "Sent" line blocks until the server has been answered
  uiThread.join();
  EXPECT_TRUE(std::filesystem::exists(answered));
}

// Each server request handed to the host is answered once: by the host, or by the timer.
TEST_F(ServerTraffic, HostAnswersGoOutOnceFromTheHostOrWhenTheirTimeIsUp) {
  vexil_test::Shared shared;
  Texts sent;
  vexil::HostAnswers answers(200ms);
  answers.Attach([&](std::string body, const std::string& method) {
    shared.Update([&] { sent.push_back(method + " " + body); });
  });
  answers.Expect("1", "a");
  answers.Expect(R"("x")", "b");
  EXPECT_TRUE(answers.Answer("1", "one"));
  EXPECT_FALSE(answers.Answer("1", "again"));
  EXPECT_TRUE(shared.WaitUntil([&] { return sent.size() == 2; }));
  EXPECT_FALSE(answers.Answer(R"("x")", "late"));
  EXPECT_EQ(
      shared.Read([&] { return sent; }),
      (Texts{"a one", R"(b {"jsonrpc":"2.0","id":"x","error":{"code":-32803,"message":"Request not answered"}})"}));
}

}  // namespace
