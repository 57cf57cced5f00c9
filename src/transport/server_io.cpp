// The server's traffic: framing messages and handing them to the input writer, waiting
// for a reply by its id, reading it into the caller's response, and answering the
// server's own requests from the output reader's thread.
#include <algorithm>
#include <chrono>
#include <climits>
#include <memory>
#include <stdexcept>

#include "json/json_depth.h"
#include "protocol/completion_events.h"
#include "protocol/raw_json.h"
#include "transport/server.h"
#include "transport/server_requests.h"
#include "transport/server_streams.h"

namespace vexil {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kTick{100};
// However often ignored messages extend the countdown, a wait ends after this many times
// the countdown's own length: a server that streams progress without answering would
// otherwise keep the host waiting for ever.
constexpr int kWaitCapFactor = 10;

std::string Framed(const std::string& body) {
  return "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

// Adds a line feed to a traced text that lacks one.
const char* LineEnd(const std::string& text) { return !text.empty() && text.back() == '\n' ? "" : "\n"; }

// An ignored message adds half of what is left, up to the largest count there is.
int Extend(int countdown) { return countdown > INT_MAX - countdown / 2 ? INT_MAX : countdown + countdown / 2; }

bool HasNullOrNoId(const LSP::xObject& message) {
  return !message.HasObject("id") || message.Object("id").IsNull();
}

bool IsDiagnosticsPublication(const LSP::xObject& message) {
  return HasNullOrNoId(message) && message.Object("method").IsString() &&
         message.Object("method").GetString() == "textDocument/publishDiagnostics";
}

}  // namespace

bool xServer::Write(LSP::RequestMessage& message) {
  BeginRequest();
  lastRequestId_ = message.id;
  lastRequestMethod_ = message.method;
  return WriteMessage(message);
}

bool xServer::Write(LSP::NotificationMessage& message) { return WriteMessage(message); }

bool xServer::WriteMessage(LSP::MessageBase& message) {
  // Nothing of a failed write reaches the host: a dead server shows on the next read.
  try {
    if (!IsRunning()) throw std::runtime_error("A write to the server was requested but the server is not running.");
    std::string body = message.ToJSON();
    return Write(body.c_str(), static_cast<int>(body.size()), message.IsRequest());
  } catch (const std::exception&) {
    return false;
  }
}

bool xServer::Write(const char* text, int length, bool isRequest) {
  haveErrors_ = false;
  errorMessage_.clear();
  return Transmit(std::string(text, static_cast<std::size_t>(length)), true);
}

bool xServer::Transmit(const std::string& body, bool reportReaderErrors) {
  deferred_.Deliver();
  std::string framed = Framed(body);
  tracer_.Message("\nSent: %s\n", framed.c_str());
  if (reportReaderErrors) ReportReaderErrors();
  if (!streams_) return false;
  // A failed write is silent; one that missed its deadline was reported by the writer.
  bool written = streams_->input.Send(std::move(framed), writeLimitMs_) == InputWriter::Outcome::Written;
  deferred_.Deliver();
  return written;
}

void xServer::ReportReaderErrors() const {
  // Never cleared: once a reader has failed, every later write says so again.
  if (!streams_) return;
  const xPipeReader* readers[] = {&streams_->outReader, &streams_->errReader};
  for (const xPipeReader* reader : readers) {
    std::string errors = reader->Errors();
    if (!errors.empty()) tracer_.Error("\nWrite Error: %s\n", errors.c_str());
  }
}

std::string xServer::Reply(int id) {
  std::unique_ptr<LSP::xReader> parsed;
  return Reply(id, parsed, nullptr);
}

std::string xServer::Reply(int id, std::unique_ptr<LSP::xReader>& parsed, LSP::ResponseMessage* response) {
  lastWaitTicks_ = 0;
  if (!IsRunning()) {
    EndRequest();
    return "";
  }
  int countdown = timeout_ / 100 + 1;
  const Clock::time_point cap = Clock::now() + kWaitCapFactor * countdown * kTick;
  MessageQueue& replies = streams_->outReader.Messages();
  WaitOn(replies);
  std::string text;
  while (countdown >= 1) {
    DrainErrorLines();
    MessageQueue::Wait wait = MessageQueue::Wait::TimedOut;
    // Only a wait in which nothing arrived uses a tick; the reader's end (the server
    // closed its output) ends the wait at once, since no reply can come any more.
    for (auto left = cap - Clock::now(); left > Clock::duration::zero(); left = cap - Clock::now()) {
      auto step = std::min(std::chrono::duration_cast<std::chrono::milliseconds>(left), kTick);
      if ((wait = replies.WaitPop(text, step)) != MessageQueue::Wait::TimedOut) break;
      deferred_.Deliver();
      ++lastWaitTicks_;
      if (--countdown == 0) break;
    }
    // An interruption meant for an earlier wait only wakes this one.
    if (wait == MessageQueue::Wait::Interrupted && !WaitCancelled()) continue;
    if (wait != MessageQueue::Wait::Taken) {
      EndRequest();
      if (wait == MessageQueue::Wait::Interrupted) {
        tracer_.Message("Request Cancelled: %d\n", id);
      } else {
        if (wait == MessageQueue::Wait::Finished) {
          AwaitLastWords();
          DrainErrorLines();
        }
        ReportTimeOut();
      }
      CancelRequest(id);
      return "";
    }
    // A completion list is read as it is parsed and leaves no document; the document read
    // judges every other text, with a fresh reader for each, since a document keeps the
    // memory of every earlier parse.
    const bool read = response && LSP::ReadCompletionReply(text, id, *response);
    std::unique_ptr<LSP::xReader> reader;
    if (!read) reader = std::make_unique<LSP::xReader>();
    if (read || HaveId(id, text, *reader)) {
      EndRequest();
      tracer_.Message("Reply: %s%s", text.c_str(), LineEnd(text));
      parsed = std::move(reader);
      return text;
    }
    countdown = Extend(countdown);
    tracer_.Message("Ignoring Reply: %s%s", text.c_str(), LineEnd(text));
  }
  EndRequest();
  return "";
}

void xServer::DrainErrorLines() {
  deferred_.Deliver();
  std::string line;
  while (streams_->errReader.Messages().TryPop(line)) {
    tracer_.Verbose("Reply: %s%s", line.c_str(), LineEnd(line));
  }
}

void xServer::ReportTimeOut() {
  if (!tracer_.Callback()) return;
  tracer_.Error("Reply: Timed out waiting for reply......\n");
  tracer_.Error("Output: %s\n", streams_->outReader.TakeOutput().c_str());
  tracer_.Error("%s", kTraceLevelHint);
}

void xServer::CancelRequest(int id) {
  // Only numbered requests can be cancelled, and only a running server can hear it. The
  // protocol has no way to cancel "initialize".
  if (id < 1 || !IsRunning()) return;
  if (id == lastRequestId_ && lastRequestMethod_ == "initialize") return;
  try {
    LSP::CancelParams params(id);
    LSP::NotificationMessage cancel("$/cancelRequest", &params);
    Transmit(cancel.ToJSON(), false);
  } catch (const std::exception&) {
  }
}

bool xServer::HaveId(int id, const std::string& text) {
  LSP::xReader reader;
  return HaveId(id, text, reader);
}

bool xServer::HaveId(int id, const std::string& text, LSP::xReader& reader) {
  try {
    if (!reader.Parse(text)) {
      tracer_.Message("JSON Parse Failed:\n%s\n", text.c_str());
      return true;
    }
    LSP::xObject message = reader.Root();
    // Server requests number their own ids, so only a notification can match, and only -1.
    if (message.HasObject("method")) return !IsServerRequest(message) && id == -1;
    // An error without an id answers a request the server could not read; one with
    // another id is a late answer to an earlier request.
    if (message.HasObject("error") && HasNullOrNoId(message)) return true;
    return message.Int("id") == id;
  } catch (const Poco::Exception& e) {
    tracer_.Message("Reply Exception: %s\n", text.c_str());
    Exception(e);
    return true;
  } catch (const std::exception& e) {
    tracer_.Message("Reply Exception: %s\n", text.c_str());
    Exception(e);
    return true;
  } catch (...) {
    return false;
  }
}

void xServer::Read(int id, LSP::ResponseMessage& response) {
  try {
    if (!IsRunning()) throw std::runtime_error("A server read was requested but the server is not running.");
    // The reply was parsed once to recognise it; the same document is read here, unless
    // it was read into the response already.
    std::unique_ptr<LSP::xReader> reader;
    std::string text = Reply(id, reader, &response);
    if (reader && reader->Error().empty()) response.Read(*reader);
    if (!response.HaveError()) return;
    errorMessage_ = response.ErrorMessage();
    if (response.MethodNotFound()) {
      haveErrors_ = false;
      tracer_.Message("Warning: %s\n\n", response.ErrorMessage());
    } else {
      haveErrors_ = true;
      tracer_.Error("Read Error: %s\n\n", response.ErrorMessage());
      tracer_.Error("%s", kTraceLevelHint);
    }
  } catch (const Poco::Exception& e) {
    Exception(e);
  } catch (const std::exception& e) {
    Exception(e);
  }
}

xServer::Answer xServer::Respond(LSP::xReader& message) {
  LSP::xObject root = message.Root();
  if (IsDiagnosticsPublication(root)) {
    StoreDiagnostics(root);
    return {};
  }
  if (!IsServerRequest(root)) return {};
  std::string method = root.Object("method").GetString();
  std::string own = OwnAnswerTo(method, root);
  if (!own.empty()) return {method, own};
  std::vector<LSP::WorkspaceFolder> folders = Folders();
  return {method, AnswerServerRequest(root, folders)};
}

void xServer::AnswerWith(const std::string& method, OwnAnswer answer) {
  std::lock_guard<std::mutex> lock(ownAnswersMutex_);
  if (answer) {
    ownAnswers_[method] = std::move(answer);
  } else {
    ownAnswers_.erase(method);
  }
}

std::string xServer::OwnAnswerTo(const std::string& method, const LSP::xObject& request) {
  constexpr int kInvalidParams = -32602;
  std::lock_guard<std::mutex> lock(ownAnswersMutex_);
  const auto found = ownAnswers_.find(method);
  const LSP::JsonValue& id = request.Object("id").Value();
  if (found == ownAnswers_.end() || !(id.IsNumber() || id.IsString())) return "";
  const std::string idText = LSP::RawJsonText(request.Object("id"));
  LSP::xObject params = request.Object("params");
  // Written out recursively: deeper nesting could exhaust the stack of this thread.
  std::string error = "params nested deeper than " + std::to_string(LSP::kNestingLimit) + " levels";
  if (LSP::NestedWithin(params.Value(), LSP::kNestingLimit) &&
      found->second(params.IsNull() ? "null" : LSP::RawJsonText(params), error))
    return ResultResponse(idText, "null");
  return ErrorResponse(idText, kInvalidParams, error);
}

bool xServer::SendFromAnyThread(const std::string& body) {
  if (!streams_) return false;
  std::string framed = Framed(body);
  deferred_.Message("\nSent: %s\n", framed.c_str());
  return streams_->input.Send(std::move(framed), writeLimitMs_) == InputWriter::Outcome::Written;
}

void xServer::Dispatch(ServerStreams& streams, LSP::xReader& message) {
  if (HandToHost(streams, message.Root())) return;
  Answer answer = Respond(message);
  if (!answer.body.empty()) QueueAnswer(streams, answer.body, answer.method);
}

void xServer::QueueAnswer(ServerStreams& streams, const std::string& body, const std::string& method) {
  // Queued, never written here: the output reader must go on draining the server's
  // output whatever the server does with its input.
  std::string framed = Framed(body);
  deferred_.Message("\nSent: %s\n", framed.c_str());
  streams.input.Answer(std::move(framed), writeLimitMs_, method);
}

std::vector<LSP::WorkspaceFolder> xServer::Folders() {
  std::lock_guard<std::mutex> lock(foldersMutex_);
  return folders_;
}

void xServer::StoreDiagnostics(const LSP::xObject& notification) {
  // A malformed publication is dropped here rather than counted as a failure of the
  // reader, which every later write would report again.
  try {
    LSP::PublishDiagnosticsParams published;
    published.Read(notification.Object("params"));
    diagnostics_.Publish(published);
  } catch (const std::exception& e) {
    deferred_.Error("Diagnostics Error: %s\n", e.what());
  }
}

}  // namespace vexil
