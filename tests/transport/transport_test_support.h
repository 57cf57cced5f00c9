// Helpers for the transport tests: params that script the fake server per request, start
// records that launch it, traced into the shared trace log.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "json/rapidjson.h"
#include "transport/server.h"
#include "vexil/host/records.h"
#include "vexil/protocol/message.h"
#include "vexil_test/support.h"
#include "vexil_test/trace_log.h"

namespace transport_test {

using vexil_test::TraceLog;
using Texts = std::vector<std::string>;

inline const std::string kHint =
    "For extra debug information, edit the Document Type and in the Language Server panel set the Trace Level to "
    "Verbose.\n";
inline const std::string kFailedStart =
    "The language server failed to start. Make sure the langauge server has been correctly installed.\n\n";
inline const std::string kCheckDetails =
    "Make sure the executable and directory details are correct and if required the system PATH is also correct.\n";

// Whether a write fails once the server has closed its input. Wine gives every child
// started without a console a console host that holds its standard input too, so there
// a closed input only shows as a pipe that fills up.
#ifdef _WIN32
constexpr bool kClosedInputFailsWrites = false;
#else
constexpr bool kClosedInputFailsWrites = true;
#endif

// A start record for the fake server with up to seven directives.
inline xServerStart FakeStart(std::vector<std::string> directives = {}, int timeout = 2000,
                              LSP::TraceLevel level = LSP::TraceLevel::Verbose) {
  xServerStart start;
  start.trace = &TraceLog::Callback;
  start.level = level;
  start.timeout = timeout;
  start.executable = VEXIL_FAKE_SERVER;
  std::string xServerStart::*slots[] = {&xServerStart::argument1, &xServerStart::argument2, &xServerStart::argument3,
                                        &xServerStart::argument4, &xServerStart::argument5, &xServerStart::argument6,
                                        &xServerStart::argument7};
  for (std::size_t i = 0; i < 7 && i < directives.size(); ++i) start.*slots[i] = directives[i];
  return start;
}

// Params that tell the fake server how to answer one request, given as a JSON object.
class FakeParams : public LSP::Params {
 public:
  explicit FakeParams(const std::string& json) { script_.Parse(json.empty() ? "{}" : json); }
  void Write(LSP::xWriter& writer) override {
    const LSP::JsonValue& members = script_.Root().Value();
    for (auto member = members.MemberBegin(); member != members.MemberEnd(); ++member) {
      writer.Raw(member->name.GetString(), member->value);
    }
  }

 private:
  LSP::xReader script_;
};

// Keeps the whole reply text.
class TextResult : public LSP::Result {
 public:
  void Read(const LSP::xObject& value) override {
    method = value.String("method");
    cwd = value.String("cwd");
    data = value.String("data");
    answers = value.Object("answers").IsArray() ? value.Object("answers").Value().Size() : 0;
    read = true;
  }
  void Write(LSP::xWriter& writer) override {}
  using JsonObject::Read;

  bool read = false;
  std::string method;
  std::string cwd;
  std::string data;
  unsigned answers = 0;
};

// Sends one request scripted by `params` and reads its reply.
inline TextResult Ask(vexil::xServer& server, const char* method, const std::string& params = "") {
  FakeParams scripted(params);
  LSP::RequestMessage request(method, &scripted);
  TextResult result;
  LSP::ResponseMessage response(&result);
  server.Write(request);
  server.Read(request.id, response);
  return result;
}

// Sends a notification scripted by `params`: no reply is awaited.
inline void Notify(vexil::xServer& server, const char* method, const std::string& params = "") {
  FakeParams scripted(params);
  LSP::NotificationMessage note(method, &scripted);
  server.Write(note);
}

using vexil_test::WaitFor;

// Standard error is traced while a reply is awaited, and the two pipes keep no common
// order: ask until `line` has come through, once.
inline bool ErrorLineArrives(vexil::xServer& server, const std::string& line) {
  return WaitFor([&] {
    Ask(server, "fake/echo");
    return TraceLog::Count("Reply: " + line + "\n") == 1;
  });
}

// A server of a program that ends at once, whose start failed; null when ten did not. The
// start looks 150 ms after the launch, which a busy machine may not give even such a
// program: it is launched again, with a clear trace, until its start saw it end.
inline std::unique_ptr<vexil::xServer> FailedStart(const xServerStart& start) {
  for (int attempt = 0; attempt < 10; ++attempt) {
    TraceLog::Clear();
    auto server = std::make_unique<vexil::xServer>(start);
    if (!server->Start()) return server;
  }
  return nullptr;
}

// A launch that fails for a missing executable or directory: the error it records, and the
// reason the system gives, as the trace quotes it.
struct LaunchFailure {
  std::string executable, directory, error, reason;
};
// This platform's launch failures (each platform's start test has them).
std::vector<LaunchFailure> LaunchFailures();

// Each test of the fake server reads only its own trace lines.
class FakeServerTest : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }

  // A started fake server at `level`, the lines of its start cleared from the log.
  static std::unique_ptr<vexil::xServer> Started(int timeout = 2000, LSP::TraceLevel level = LSP::TraceLevel::Messages) {
    auto server = std::make_unique<vexil::xServer>(FakeStart({}, timeout, level));
    EXPECT_TRUE(server->Start());
    TraceLog::Clear();
    return server;
  }
};
using ServerStart = FakeServerTest;

}  // namespace transport_test
