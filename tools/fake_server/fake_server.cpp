// A scripted language server for the transport tests. Start-up directives come as
// arguments; what it does for each request is chosen by the request's method and params.
//
// Arguments (each may hold several, separated by ';'):
//   stdout=TEXT, stderr=TEXT  write TEXT (with \r \n \t \\ \xHH escapes) at start-up
//   exit=N                    exit with code N right after start-up
//   hang                      never read; keep every pipe open until killed
//   ignore-exit               stay alive after "exit" and after stdin closes
//   grandchild=MS             start a copy that holds the pipes while we live, then MS longer
//   hold=PID:MS               (that copy) wait for process PID to end, then MS, then exit
//   result=METHOD:JSON        answer METHOD with JSON as its result (e.g. null)
//   error=METHOD              answer METHOD with error -32603 "refused METHOD"
//   late=METHOD:MS            answer METHOD only after MS milliseconds
//   ask=METHOD                send METHOD to the client while answering "initialize"
//   result-file=PATH          answer every request but "shutdown" with the JSON in PATH as its result
//   flood-stderr=BYTES        write that many bytes of log lines to stderr, as a chatty server does
//   flood-stdout=BYTES        write that many bytes of text without any header to stdout
//   flood-notifications=N     send N notifications
//   flood-done=PATH           create PATH once every flood above is written
//   send=METHOD:N             send N requests METHOD to the client (ids 0 to N-1), reading nothing
//   await=N                   read until N answers from the client have come
//   close-stdin               close standard input, so that the client's writes fail
//   pause=MS                  wait MS milliseconds before the next directive
//   fail-once=PATH            exit with code 1 unless PATH exists, creating it
//   diagnose                  publish diagnostics of opened and changed documents (below)
// Methods: "fake/silent" (the prelude, no answer), "fake/exit" (params.code), "fake/stall" (a
// notification and half a frame, then nothing until killed), "fake/cwd", "fake/env" (the variables
// params.names, null when unset), "fake/received" (the notifications seen so far),
// "shutdown" (null), "exit" (a notification: ends the server). Any request may carry
// params: delay (ms), stderr, garbage (raw stdout text), notifications (count), stale
// (ids answered first), ask (methods sent to the client, each answer awaited; a method
// given as {"method", "params"} goes with those params), chatter
// (notifications sent after each asked method, before its answer is read), askSameId,
// error {code, message, id: "same"|"null"|"none"|number}, unparsable, size (bytes of "data"
// in the result), split (write the answer in pieces of this size), trickle (ms of one
// notification every 50 ms before answering), deep {depth, in: "notification"|"id"|"result"}
// (arrays nested depth levels deep as a notification's params, a request's id or the result).
// The notification "fake/publish" makes the server publish diagnostics at once, while the
// client waits for nothing: params.count publications, one document after another of
// params.documents ("file:///fake/doc<N>.cpp", N from params.from); publication K for a document reports
// "pass K" (and params.padding dots) on line K with code "fake<K>", or nothing when
// params.empty is true.
// With the start-up directive "diagnose", after each didOpen and each whole-text didChange
// the server publishes, like a real one, an error "found error" (code "fake-error") for
// every line of the text that holds "error".
#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <map>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <rapidjson/document.h>
#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

#include "fake_os.h"
#include "fake_wire.h"

namespace {

using Json = rapidjson::Document;

constexpr unsigned kSafetyLifetimeSeconds = 120;  // never outlive a forgotten test by long

struct Options {
  bool ignoreExit = false;
  std::string result;  // the JSON text every request is answered with, when set
  bool diagnose = false;
};

// Per-method scripts given as start-up directives, for requests whose params the
// client writes itself (initialize, shutdown and the feature requests).
struct MethodScripts {
  std::map<std::string, std::string> results;
  std::map<std::string, int> delays;
  std::vector<std::string> refused;
  std::vector<std::string> askedOnInitialize;
};

MethodScripts scripts;

// Splits "METHOD:VALUE" at its first colon (method names hold none).
std::pair<std::string, std::string> MethodAndValue(const std::string& text) {
  std::size_t colon = text.find(':');
  if (colon == std::string::npos) return {text, ""};
  return {text.substr(0, colon), text.substr(colon + 1)};
}

std::vector<std::string> received;  // notifications from the client, as sent

void Pause(int milliseconds) { std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds)); }

std::string Text(const rapidjson::Value& value) {
  rapidjson::StringBuffer buffer;
  rapidjson::Writer<rapidjson::StringBuffer> writer(buffer);
  value.Accept(writer);
  return buffer.GetString();
}

std::string Quote(const std::string& text) { return Text(rapidjson::Value(text.c_str(), static_cast<rapidjson::SizeType>(text.size()))); }

int IntParam(const rapidjson::Value& params, const char* name) {
  return params.HasMember(name) && params[name].IsInt() ? params[name].GetInt() : 0;
}

std::string StringParam(const rapidjson::Value& params, const char* name) {
  return params.HasMember(name) && params[name].IsString() ? params[name].GetString() : "";
}

void Send(const std::string& body) { fake::WriteRaw(fake::kStdout, fake::Frame(body)); }

// A copy of this server holds the inherited pipes while the server lives, and `linger`
// ms after it is gone, as a language server's helper process might.
void StartGrandchild(const std::string& linger) {
  fake::SpawnSelf("hold=" + std::to_string(fake::ProcessId()) + ":" + linger);
}

[[noreturn]] void HoldPipes(const std::string& parentAndLinger) {
  fake::WaitForProcessEnd(std::strtoul(parentAndLinger.c_str(), nullptr, 10));
  Pause(std::atoi(parentAndLinger.substr(parentAndLinger.find(':') + 1).c_str()));
  std::_Exit(0);
}

std::string ReadFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

// Writes `total` bytes to `descriptor` as repeats of `pattern`, in pipe-sized writes.
void Flood(int descriptor, const std::string& pattern, long long total) {
  std::string block;
  while (block.size() < 65536) block += pattern;
  for (long long left = total; left > 0; left -= static_cast<long long>(block.size())) {
    fake::WriteRaw(descriptor, left < static_cast<long long>(block.size()) ? block.substr(0, static_cast<std::size_t>(left)) : block);
  }
}

// Arrays nested `depth` levels deep.
std::string Nested(int depth) { return std::string(static_cast<std::size_t>(depth), '[') + std::string(static_cast<std::size_t>(depth), ']'); }

std::string Request(const std::string& id, const std::string& method,
                    const std::string& params = R"({"items":[{"section":"a"},{"section":"b"}]})") {
  return "{\"jsonrpc\":\"2.0\",\"id\":" + id + ",\"method\":" + Quote(method) + ",\"params\":" + params + "}";
}

// Reads until the client's answer to one of our requests; its notifications on the way
// are kept as received. Ends the server when the input ends.
std::string ReadAnswer() {
  std::string body;
  while (fake::ReadMessage(body)) {
    Json message;
    if (message.Parse(body.c_str()).HasParseError() || !message.IsObject() || !message.HasMember("method")) return body;
    received.push_back(body);
  }
  std::_Exit(0);
}

void SendNotifications(int count) {
  for (int i = count; i > 0; --i) {
    Send("{\"jsonrpc\":\"2.0\",\"method\":\"fake/progress\",\"params\":{\"left\":" + std::to_string(i) + "}}");
  }
}

void StartUp(const std::string& directive, Options& options) {
  std::string key = directive.substr(0, directive.find('='));
  std::string value = directive.find('=') == std::string::npos ? "" : directive.substr(directive.find('=') + 1);
  if (key == "stdout") fake::WriteRaw(fake::kStdout, fake::Unescape(value));
  else if (key == "stderr") fake::WriteRaw(fake::kStderr, fake::Unescape(value));
  else if (key == "exit") std::_Exit(std::atoi(value.c_str()));
  else if (key == "hang") fake::SleepUntilKilled();
  else if (key == "ignore-exit") options.ignoreExit = true;
  else if (key == "diagnose") options.diagnose = true;
  else if (key == "grandchild") StartGrandchild(value);
  else if (key == "hold") HoldPipes(value);
  else if (key == "result") scripts.results.insert(MethodAndValue(value));
  else if (key == "late") {
    auto [method, milliseconds] = MethodAndValue(value);
    scripts.delays[method] = std::atoi(milliseconds.c_str());
  }
  else if (key == "error") scripts.refused.push_back(value);
  else if (key == "ask") scripts.askedOnInitialize.push_back(value);
  else if (key == "result-file") options.result = ReadFile(value);
  else if (key == "flood-stderr") Flood(fake::kStderr, "I[12:00:00.000] ASTWorker building file /src/main.cpp version 1 with command\n", std::atoll(value.c_str()));
  else if (key == "flood-stdout") Flood(fake::kStdout, "progress: indexing file 17 of 2000\n", std::atoll(value.c_str()));
  else if (key == "flood-notifications") SendNotifications(std::atoi(value.c_str()));
  else if (key == "flood-done") std::ofstream(value).put('\n');
  else if (key == "send") {
    auto [method, count] = MethodAndValue(value);
    for (int id = 0; id < std::atoi(count.c_str()); ++id) Send(Request(std::to_string(id), method));
  }
  else if (key == "await") {
    for (int i = std::atoi(value.c_str()); i > 0; --i) ReadAnswer();
  }
  else if (key == "close-stdin") fake::CloseInput();
  else if (key == "pause") Pause(std::atoi(value.c_str()));
  else if (key == "fail-once" && !std::ifstream(value)) {
    std::ofstream(value).put('\n');
    std::_Exit(1);
  }
}

bool Refused(const std::string& method) {
  for (const std::string& refused : scripts.refused) {
    if (refused == method) return true;
  }
  return false;
}

// Sends each method of params.ask (and, for "initialize", of the ask directives) as a request
// to the client and waits for its answer.
std::vector<std::string> AskClient(const std::string& method, const rapidjson::Value& params,
                                   const std::string& requestId) {
  std::vector<std::pair<std::string, std::string>> methods;  // with their params, when given
  if (method == "initialize")
    for (const std::string& asked : scripts.askedOnInitialize) methods.emplace_back(asked, "");
  if (params.HasMember("ask") && params["ask"].IsArray()) {
    for (const rapidjson::Value& asked : params["ask"].GetArray()) {
      if (asked.IsString()) methods.emplace_back(asked.GetString(), "");
      if (asked.IsObject() && asked.HasMember("params")) methods.emplace_back(StringParam(asked, "method"), Text(asked["params"]));
    }
  }
  bool sameId = params.HasMember("askSameId") && params["askSameId"].IsTrue();
  std::vector<std::string> answers;
  int next = 0;
  for (const auto& [asked, askedParams] : methods) {
    const std::string id = sameId ? requestId : std::to_string(next++);
    Send(askedParams.empty() ? Request(id, asked) : Request(id, asked, askedParams));
    SendNotifications(IntParam(params, "chatter"));
    answers.push_back(ReadAnswer());
  }
  return answers;
}

std::string ErrorId(const rapidjson::Value& error, const std::string& requestId) {
  if (!error.HasMember("id") || (error["id"].IsString() && std::string(error["id"].GetString()) == "same")) {
    return "\"id\":" + requestId + ",";
  }
  if (error["id"].IsString() && std::string(error["id"].GetString()) == "none") return "";
  if (error["id"].IsString() && std::string(error["id"].GetString()) == "null") return "\"id\":null,";
  return "\"id\":" + Text(error["id"]) + ",";
}

std::string Result(const std::string& method, const rapidjson::Value& params, const std::vector<std::string>& answers) {
  auto scripted = scripts.results.find(method);
  if (scripted != scripts.results.end()) return scripted->second;
  if (method == "shutdown") return "null";
  std::ostringstream result;
  result << "{\"method\":" << Quote(method);
  if (method == "fake/cwd") {
    result << ",\"cwd\":" << Quote(fake::CurrentDirectory());
  }
  if (method == "fake/env" && params.HasMember("names") && params["names"].IsArray()) {
    result << ",\"env\":{";
    for (const rapidjson::Value& name : params["names"].GetArray()) {
      const char* value = std::getenv(name.GetString());
      result << (&name == params["names"].Begin() ? "" : ",") << Quote(name.GetString()) << ":"
             << (value ? Quote(value) : "null");
    }
    result << "}";
  }
  result << ",\"answers\":[";
  for (std::size_t i = 0; i < answers.size(); ++i) result << (i ? "," : "") << answers[i];
  result << "],\"received\":[";
  for (std::size_t i = 0; i < received.size(); ++i) result << (i ? "," : "") << Quote(received[i]);
  result << "]";
  if (int size = IntParam(params, "size")) result << ",\"data\":\"" << std::string(static_cast<std::size_t>(size), 'x') << "\"";
  result << "}";
  return result.str();
}

// The "in" member of the params' deep script; empty when there is none.
std::string DeepIn(const rapidjson::Value& params) {
  return params.HasMember("deep") && params["deep"].IsObject() ? StringParam(params["deep"], "in") : "";
}

std::string Answer(const std::string& method, const rapidjson::Value& params, const std::string& id,
                   const std::vector<std::string>& answers, const Options& options) {
  if (params.HasMember("unparsable")) return "this is not json";
  if (DeepIn(params) == "result") {
    return "{\"jsonrpc\":\"2.0\",\"id\":" + id + ",\"result\":" + Nested(IntParam(params["deep"], "depth")) + "}";
  }
  if (Refused(method)) {
    return "{\"jsonrpc\":\"2.0\",\"id\":" + id + ",\"error\":{\"code\":-32603,\"message\":" + Quote("refused " + method) + "}}";
  }
  if (params.HasMember("error") && params["error"].IsObject()) {
    const rapidjson::Value& error = params["error"];
    return "{\"jsonrpc\":\"2.0\"," + ErrorId(error, id) + "\"error\":{\"code\":" + std::to_string(IntParam(error, "code")) +
           ",\"message\":" + Quote(StringParam(error, "message")) + "}}";
  }
  std::string result = options.result.empty() || method == "shutdown" ? Result(method, params, answers) : options.result;
  return "{\"jsonrpc\":\"2.0\",\"id\":" + id + ",\"result\":" + result + "}";
}

void WriteAnswer(const std::string& body, int split) {
  std::string framed = fake::Frame(body);
  if (split <= 0) return fake::WriteRaw(fake::kStdout, framed);
  for (std::size_t at = 0; at < framed.size(); at += static_cast<std::size_t>(split)) {
    fake::WriteRaw(fake::kStdout, framed.substr(at, static_cast<std::size_t>(split)));
    Pause(1);
  }
}

void Prelude(const std::string& method, const rapidjson::Value& params) {
  Pause(IntParam(params, "delay"));
  if (scripts.delays.count(method)) Pause(scripts.delays[method]);
  if (params.HasMember("stderr")) fake::WriteRaw(fake::kStderr, fake::Unescape(StringParam(params, "stderr")));
  if (params.HasMember("garbage")) fake::WriteRaw(fake::kStdout, fake::Unescape(StringParam(params, "garbage")));
  SendNotifications(IntParam(params, "notifications"));
  for (int left = IntParam(params, "trickle"); left > 0; left -= 50) {
    SendNotifications(1);
    Pause(50);
  }
  std::string deepIn = DeepIn(params);
  if (deepIn == "notification") {
    Send("{\"jsonrpc\":\"2.0\",\"method\":\"fake/deep\",\"params\":{\"value\":" + Nested(IntParam(params["deep"], "depth")) + "}}");
  } else if (deepIn == "id") {
    Send(Request(Nested(IntParam(params["deep"], "depth")), "window/workDoneProgress/create"));
    ReadAnswer();
  }
  if (params.HasMember("stale") && params["stale"].IsArray()) {
    for (const rapidjson::Value& stale : params["stale"].GetArray()) {
      Send("{\"jsonrpc\":\"2.0\",\"id\":" + Text(stale) + ",\"result\":null}");
    }
  }
}

std::string PublishedDiagnostic(int pass, int padding) {
  std::string line = std::to_string(pass);
  return "{\"range\":{\"start\":{\"line\":" + line + ",\"character\":0},\"end\":{\"line\":" + line +
         ",\"character\":4}},\"severity\":" + std::to_string(pass % 2 + 1) + ",\"code\":\"fake" + line +
         "\",\"source\":\"fake\",\"message\":\"pass " + line + std::string(static_cast<std::size_t>(padding), '.') + "\"}";
}

void SendPublication(const std::string& uri, const std::string& diagnostics) {
  Send("{\"jsonrpc\":\"2.0\",\"method\":\"textDocument/publishDiagnostics\",\"params\":{\"uri\":" + Quote(uri) +
       ",\"diagnostics\":[" + diagnostics + "]}}");
}

void Publish(const rapidjson::Value& params) {
  int documents = std::max(1, IntParam(params, "documents"));
  bool empty = params.HasMember("empty") && params["empty"].IsTrue();
  for (int i = 0; i < IntParam(params, "count"); ++i) {
    std::string uri = "file:///fake/doc" + std::to_string(IntParam(params, "from") + i % documents) + ".cpp";
    SendPublication(uri, empty ? "" : PublishedDiagnostic(i / documents, IntParam(params, "padding")));
  }
}

// The text a didOpen or a whole-text didChange carries; false for other changes.
bool DocumentText(const rapidjson::Value& params, std::string& text) {
  if (!params.HasMember("textDocument") || !params["textDocument"].IsObject()) return false;
  const rapidjson::Value& document = params["textDocument"];
  if (document.HasMember("text") && document["text"].IsString()) {
    text = document["text"].GetString();
    return true;
  }
  if (!params.HasMember("contentChanges") || !params["contentChanges"].IsArray()) return false;
  for (const rapidjson::Value& change : params["contentChanges"].GetArray()) {
    if (change.HasMember("range") || !change.HasMember("text") || !change["text"].IsString()) return false;
    text = change["text"].GetString();
  }
  return true;
}

void Diagnose(const rapidjson::Value& params) {
  std::string text;
  if (!DocumentText(params, text)) return;
  std::istringstream lines(text);
  std::string line;
  std::string diagnostics;
  for (int number = 0; std::getline(lines, line); ++number) {
    if (line.find("error") == std::string::npos) continue;
    std::string at = std::to_string(number);
    diagnostics += std::string(diagnostics.empty() ? "" : ",") + "{\"range\":{\"start\":{\"line\":" + at +
                   ",\"character\":0},\"end\":{\"line\":" + at + ",\"character\":5}},\"severity\":1," +
                   "\"code\":\"fake-error\",\"source\":\"fake\",\"message\":\"found error\"}";
  }
  SendPublication(StringParam(params["textDocument"], "uri"), diagnostics);
}

void HandleRequest(const std::string& method, const rapidjson::Value& params, const std::string& id,
                   const Options& options) {
  if (method == "fake/exit") std::_Exit(IntParam(params, "code"));
  if (method == "fake/stall") {
    // In one write: a client that has read the notification has been sent the half frame,
    // and can end the server in the middle of it.
    fake::WriteRaw(fake::kStdout, fake::Frame(R"({"jsonrpc":"2.0","method":"fake/progress","params":{}})") +
                                      "Content-Length: 100\r\n\r\n{\"jsonrpc\":");
    fake::SleepUntilKilled();
  }
  Prelude(method, params);
  if (method == "fake/silent") return;
  std::vector<std::string> answers = AskClient(method, params, id);
  WriteAnswer(Answer(method, params, id, answers, options), IntParam(params, "split"));
}

void Serve(const Options& options) {
  static const rapidjson::Value noParams(rapidjson::kObjectType);
  std::string body;
  while (fake::ReadMessage(body)) {
    Json message;
    if (message.Parse(body.c_str()).HasParseError() || !message.IsObject()) continue;
    std::string method = message.HasMember("method") && message["method"].IsString() ? message["method"].GetString() : "";
    const rapidjson::Value& params = message.HasMember("params") && message["params"].IsObject() ? message["params"] : noParams;
    if (message.HasMember("id")) {
      HandleRequest(method, params, Text(message["id"]), options);
    } else if (method == "exit" && !options.ignoreExit) {
      std::_Exit(0);
    } else if (method == "fake/publish") {
      Publish(params);
    } else {
      received.push_back(body);
      bool changesText = method == "textDocument/didOpen" || method == "textDocument/didChange";
      if (options.diagnose && changesText) Diagnose(params);
    }
  }
  if (options.ignoreExit) fake::SleepUntilKilled();
}

}  // namespace

int main(int argc, char** argv) {
  fake::PrepareProcess(argv[0], kSafetyLifetimeSeconds);
  Options options;
  for (int i = 1; i < argc; ++i) {
    std::istringstream directives(argv[i]);
    std::string directive;
    while (std::getline(directives, directive, ';')) StartUp(directive, options);
  }
  Serve(options);
  return 0;
}
