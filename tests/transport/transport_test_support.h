// Helpers for the transport tests: a trace recorder behind the plain callback, params
// that script the fake server per request, and start records that launch it.
#pragma once


#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "json/rapidjson.h"
#include "transport/server.h"
#include "vexil/host/records.h"
#include "vexil/protocol/message.h"
#include "vexil_test/support.h"

namespace transport_test {

struct TraceLine {
  std::string title;
  std::string text;
};

// Every line the library traces goes here; reader threads trace too, hence the lock.
class TraceLog {
 public:
  static void Callback(TraceType type, const char* title, const char* text) {
    std::lock_guard<std::mutex> lock(mutex_);
    lines_.push_back({title, text});
  }
  static void Clear() {
    std::lock_guard<std::mutex> lock(mutex_);
    lines_.clear();
  }
  static std::vector<TraceLine> Lines() {
    std::lock_guard<std::mutex> lock(mutex_);
    return lines_;
  }
  // The texts in order, optionally only those under `title`.
  static std::vector<std::string> Texts(const std::string& title = "") {
    std::vector<std::string> texts;
    for (const TraceLine& line : Lines()) {
      if (title.empty() || line.title == title) texts.push_back(line.text);
    }
    return texts;
  }
  static int Count(const std::string& text) {
    int count = 0;
    for (const TraceLine& line : Lines()) count += line.text == text;
    return count;
  }
  static bool Contains(const std::string& piece) {
    for (const TraceLine& line : Lines()) {
      if (line.text.find(piece) != std::string::npos) return true;
    }
    return false;
  }

 private:
  static inline std::mutex mutex_;
  static inline std::vector<TraceLine> lines_;
};

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
  directives.resize(7);
  start.argument1 = directives[0];
  start.argument2 = directives[1];
  start.argument3 = directives[2];
  start.argument4 = directives[3];
  start.argument5 = directives[4];
  start.argument6 = directives[5];
  start.argument7 = directives[6];
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

// Sends one request scripted by `params` and reads its reply into `result`.
inline LSP::ResponseMessage Ask(vexil::xServer& server, const char* method, const std::string& params,
                                TextResult& result) {
  FakeParams scripted(params);
  LSP::RequestMessage request(method, &scripted);
  LSP::ResponseMessage response(&result);
  server.Write(request);
  server.Read(request.id, response);
  return response;
}

// Polls `condition` until it holds or `limit` has passed.
inline bool WaitFor(const std::function<bool()>& condition, std::chrono::milliseconds limit = std::chrono::seconds(10)) {
  auto deadline = std::chrono::steady_clock::now() + limit;
  while (!condition()) {
    if (std::chrono::steady_clock::now() > deadline) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  return true;
}

// Standard error is traced while a reply is awaited, and the two pipes keep no common
// order: ask until `line` has come through, once.
inline bool ErrorLineArrives(vexil::xServer& server, const std::string& line) {
  return WaitFor([&] {
    TextResult result;
    Ask(server, "fake/echo", "", result);
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

// Each test of a server's start reads only its own trace lines.
class ServerStart : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }
};

// Ends a fake server this test started, by its process id.
inline void KillServer(vexil::xServer& server) {
  vexil_test::KillProcess(server.Id());
  WaitFor([&] { return !server.IsRunning(); });
}

}  // namespace transport_test
