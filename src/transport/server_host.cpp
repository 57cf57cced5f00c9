// The host's side of what a server says on its own: the handler, the server requests the
// host answers (from any thread), the cancelling of a reply wait, and the environment of
// later launches.
#include <algorithm>
#include <chrono>

#include "json/json_depth.h"
#include "protocol/raw_json.h"
#include "transport/server.h"
#include "transport/server_requests.h"
#include "transport/server_streams.h"

namespace vexil {
namespace {

// The server has ended, so its output ends too, unless a process it started holds it.
constexpr std::chrono::milliseconds kOutputEndLimit{500};

bool IsId(const LSP::JsonValue& id) { return id.IsNumber() || id.IsString(); }

}  // namespace

void xServer::CancelWait() {
  std::lock_guard<std::mutex> lock(waitMutex_);
  if (!requestActive_) return;
  cancelled_ = true;
  if (waitingOn_) waitingOn_->Interrupt();
}

void xServer::BeginRequest() {
  std::lock_guard<std::mutex> lock(waitMutex_);
  requestActive_ = true;
  cancelled_ = false;
}

void xServer::WaitOn(MessageQueue& replies) {
  std::lock_guard<std::mutex> lock(waitMutex_);
  waitingOn_ = &replies;
  // Cancelled while it was being written: the wait ends at its first look.
  if (cancelled_) replies.Interrupt();
}

bool xServer::WaitCancelled() {
  std::lock_guard<std::mutex> lock(waitMutex_);
  return cancelled_;
}

void xServer::EndRequest() {
  std::lock_guard<std::mutex> lock(waitMutex_);
  requestActive_ = false;
  waitingOn_ = nullptr;
}

void xServer::Refuse(const std::string& text) {
  haveErrors_ = true;
  errorMessage_ = text;
  tracer_.Error("%s\n", text.c_str());
}

void xServer::SetMessageHandler(xMessageHandler handler, void* userData) {
  handler_.Set(handler, userData);
  if (streams_) streams_->dispatcher.Wake();
}

void xServer::RouteToHost(const std::vector<std::string>& methods, bool unknown) {
  std::lock_guard<std::mutex> lock(routesMutex_);
  hostMethods_ = methods;
  hostAnswersUnknown_ = unknown;
}

bool xServer::RoutedToHost(const std::string& method) {
  std::lock_guard<std::mutex> lock(routesMutex_);
  if (std::find(hostMethods_.begin(), hostMethods_.end(), method) != hostMethods_.end()) return true;
  return hostAnswersUnknown_ && !HasOwnAnswer(method);
}

bool xServer::HandToHost(ServerStreams& streams, const LSP::xObject& message) {
  if (!handler_.IsSet() || !message.Object("method").IsString()) return false;
  std::string method = message.Object("method").GetString();
  bool request = IsServerRequest(message);
  LSP::xObject id = message.Object("id");
  if (request && (!IsId(id.Value()) || !RoutedToHost(method))) return false;
  LSP::xObject params = message.Object("params");
  // Written out recursively: deeper nesting could exhaust the stack of this thread.
  if (!LSP::NestedWithin(params.Value(), LSP::kNestingLimit)) {
    deferred_.Error("Message Not Handed Over: %s: nested deeper than %d levels\n", method.c_str(),
                    LSP::kNestingLimit);
    return false;
  }
  HostMessage handed{method, request ? LSP::RawJsonText(id) : "", params.IsNull() ? "null" : LSP::RawJsonText(params)};
  // Expected before it is posted, so that an answer from the handler finds it.
  if (request) answers_.Expect(handed.id, method);
  streams.dispatcher.Post(std::move(handed));
  return request;
}

std::string xServer::RequestId(const char* idJson) {
  LSP::JsonDocument id;
  std::string error;
  if (!idJson || !LSP::ParseJsonText(idJson, id, error) || !IsId(id)) return "";
  return LSP::RawJsonText(LSP::xObject(id));
}

bool xServer::Reply(const char* idJson, const char* resultJson) {
  std::string id = RequestId(idJson);
  if (id.empty()) return false;
  LSP::JsonDocument result;
  std::string error;
  if (!LSP::ParseJsonText(resultJson && *resultJson ? resultJson : "null", result, error)) {
    deferred_.Error("Invalid JSON for %s: %s\n", ("the reply to " + id).c_str(), error.c_str());
    return false;
  }
  std::string text = LSP::RawJsonText(LSP::xObject(result));
  return answers_.Answer(id, ResultResponse(id, text.empty() ? "null" : text));
}

bool xServer::ReplyError(const char* idJson, int code, const char* message) {
  std::string id = RequestId(idJson);
  return !id.empty() && answers_.Answer(id, ErrorResponse(id, code, message ? message : ""));
}

void xServer::FinishMessages() {
  if (!streams_) return;
  streams_->outThread.TryJoin(kOutputEndLimit);
  streams_->dispatcher.Stop();
}

bool xServer::Environment(const char* name, const char* value) {
  if (!name || !IsVariableName(name) || IsRunning()) return false;
  environment_.erase(std::remove_if(environment_.begin(), environment_.end(),
                                    [&](const EnvironmentChange& change) { return SameVariable(change.name, name); }),
                     environment_.end());
  environment_.push_back({name, value ? std::optional<std::string>(value) : std::nullopt});
  return true;
}

}  // namespace vexil
