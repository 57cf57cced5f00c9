// xServer: one language server process with its three pipes and two reader threads,
// the framing of outgoing messages and the matching of replies to requests.
#pragma once

#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include <Poco/Exception.h>

#include "host/trace_line.h"
#include "transport/deferred_trace.h"
#include "transport/diagnostics_store.h"
#include "transport/environment.h"
#include "transport/host_answers.h"
#include "transport/message_dispatcher.h"
#include "transport/process.h"
#include "vexil/host/records.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace vexil {

struct ServerStreams;
class MessageQueue;

class xServer {
 public:
  // Copies the record; launches nothing.
  explicit xServer(const xServerStart& start);
  xServer(const xServer&) = delete;
  xServer& operator=(const xServer&) = delete;
  // Closes our ends of the pipes and waits for the readers; the server is left to end
  // by itself and is never killed.
  virtual ~xServer();

  // Launches unless running, with fresh pipes and readers once the earlier ones have
  // ended; true when the server still runs 150 ms after the launch.
  bool Start();
  // Tells both readers to stop; they end within one poll interval.
  void Cancel();
  int Id() const { return process_.Id(); }
  TraceCallback Trace() const { return tracer_.Callback(); }
  LSP::TraceLevel Level() const { return tracer_.Level(); }
  // False also once a write missed its deadline: that server's input is closed.
  bool IsRunning();
  bool HaveErrors() const { return haveErrors_; }
  const char* ErrorMessage() const { return errorMessage_.c_str(); }
  // Record and report a caught exception.
  void Exception(const Poco::Exception& e);
  void Exception(const std::exception& e);

  // Send one message; dropped silently while the server is not running. Never throw.
  // True once the message was written.
  bool Write(LSP::RequestMessage& message);
  bool Write(LSP::NotificationMessage& message);
  // Waits for the reply to `id` (-1: the next message that is not a numbered reply) and
  // reads it into `response`. Never throws; failures end up in HaveErrors().
  void Read(int id, LSP::ResponseMessage& response);

  // Waits of 100 ms in which nothing arrived, used by the last reply wait.
  int LastWaitTicks() const { return lastWaitTicks_; }
  // Ends the request in progress (from its write to the end of the wait for its reply)
  // within a tick, as a time-out would but with the line "Request Cancelled: <id>" instead
  // of the time-out's; nothing when no request is in progress. Any thread.
  void CancelWait();
  // Sets the error state and traces `text` as an "Error" line, for a message refused
  // before anything was sent.
  void Refuse(const std::string& text);

  // The server's notifications, the requests routed to the host and its exit go to
  // `handler` on the dispatch thread; null hands nothing over and routes nothing.
  void SetMessageHandler(xMessageHandler handler, void* userData);
  // Server requests of `methods`, and with `unknown` every one the library has no answer
  // of its own for, are handed to the handler (when one is set) for the host to answer.
  void RouteToHost(const std::vector<std::string>& methods, bool unknown);
  // Answers the routed request `idJson` with the JSON `resultJson`, or with an error;
  // false for text that is not JSON and for an id that does not wait. Any thread.
  bool Reply(const char* idJson, const char* resultJson);
  bool ReplyError(const char* idJson, int code, const char* message);
  // Answers every routed request still waiting with the time-out's error (at Exit).
  void DeclineHostRequests() { answers_.DeclineAll(); }
  // Gives the output reader a moment to finish, then hands the handler what is left and
  // the server's exit; called once the server has ended, before the connection goes.
  void FinishMessages();
  // Sets (or with a null value removes) a variable of the environment of later launches;
  // false, changing nothing, for a name that cannot be one and while the server runs.
  bool Environment(const char* name, const char* value);

  // The reply wait limit in milliseconds; a value below 1 becomes the default. Writes
  // get as long, and never less than kMinimumWriteMs.
  int Timeout() const { return timeout_; }
  void Timeout(int milliseconds);
  // The folders a "workspace/workspaceFolders" request from the server is answered with.
  void WorkspaceFolders(const std::vector<LSP::WorkspaceFolder>& folders);
  // The server's diagnostics by document, kept whether or not a request is waiting.
  DiagnosticsStore& Diagnostics() { return diagnostics_; }

  // A part of the library that answers the server's requests of `method` itself (the
  // watched files take registrations): `answer` gets the params as JSON text and says
  // whether it took them, with the reason when not; the request is answered with null or
  // with error -32602 and that reason. It runs on the output reader's thread. A null
  // `answer` gives the method back to the default answers once a call in progress ended.
  using OwnAnswer = std::function<bool(const std::string& params, std::string& error)>;
  void AnswerWith(const std::string& method, OwnAnswer answer);
  // Sends `body`, a message of the library's own, from a thread other than the host's:
  // traced like the host's messages, the error state untouched. The caller stops calling it
  // before the server is started again and before the connection goes. True once written.
  bool SendFromAnyThread(const std::string& body);
  // Traces `text` under "Error" on the host's thread, at its next call.
  void ErrorLater(const std::string& text) { deferred_.Error("%s", text.c_str()); }
  // Traces, on the host's thread, the lines the library's threads have left for it.
  void TraceDeferred() { deferred_.Deliver(); }

  // Large texts to a busy server need time to go through.
  static constexpr int kMinimumWriteMs = 5000;

 protected:
  // What the client sends back for a message from the server: an answer to a request,
  // or nothing (empty `body`). Stores published diagnostics on the way.
  struct Answer {
    std::string method;
    std::string body;
  };
  // Clears the error state and sends `text`, a message's JSON body, framed; true once written.
  bool Write(const char* text, int length, bool isRequest);
  // The text of the reply to `id`; empty when none came in time.
  std::string Reply(int id);
  // Whether `text` is to be taken as the reply to `id`.
  bool HaveId(int id, const std::string& text);
  // Called on the output reader's thread for every message that names a method.
  Answer Respond(LSP::xReader& message);
  // Appends `argument` unless it is empty.
  void AddArgument(const std::string& argument);
  // Every element followed by `separator`; valid until the next call.
  const char* Join(const std::vector<std::string>& list, const char* separator);

 private:
  // Reply and HaveId that leave the reply's parsed document in `parsed` / `reader`; a
  // reply read straight into `response` (when given) leaves no document.
  std::string Reply(int id, std::unique_ptr<LSP::xReader>& parsed, LSP::ResponseMessage* response);
  bool HaveId(int id, const std::string& text, LSP::xReader& reader);
  bool WriteMessage(LSP::MessageBase& message);
  bool Transmit(const std::string& body, bool reportReaderErrors);
  void ReportReaderErrors() const;
  bool Launch();
  void ReportFailedStart(const std::string& reason, bool hint);
  void TraceLaunchDetails();
  void TraceStrayOutput();
  void TraceEarlyErrorLines();
  void RecordException(const std::string& text);
  void DrainErrorLines();
  void ReportTimeOut();
  void CancelRequest(int id);
  // Once the server has ended: waits briefly for the rest of its standard error, so that
  // the trace shows why it ended.
  void AwaitLastWords();
  void Dispatch(ServerStreams& streams, LSP::xReader& message);
  // Hands `message` to the host's handler; true when the host is to answer it.
  bool HandToHost(ServerStreams& streams, const LSP::xObject& message);
  bool RoutedToHost(const std::string& method);
  void QueueAnswer(ServerStreams& streams, const std::string& body, const std::string& method);
  // The canonical text of the id `idJson` of a routed request; empty when it is none.
  std::string RequestId(const char* idJson);
  // The bookkeeping of the request in progress, for CancelWait: it starts with its write,
  // waits on `replies`, and ends with its wait.
  void BeginRequest();
  void WaitOn(MessageQueue& replies);
  bool WaitCancelled();
  void EndRequest();
  void StoreDiagnostics(const LSP::xObject& notification);
  std::vector<LSP::WorkspaceFolder> Folders();
  // The library's own answer to `request`, a server request of `method`; empty when no
  // part of it answers that method.
  std::string OwnAnswerTo(const std::string& method, const LSP::xObject& request);

  std::string joined_;
  Tracer tracer_;
  // Lines of the readers and the input writer, traced on the host's thread.
  DeferredTrace deferred_;
  xProcess process_;
  int timeout_;
  std::atomic<int> writeLimitMs_{kMinimumWriteMs};  // read by the output reader for answers
  bool useCommand_;
  std::string executable_;
  std::string directory_;
  std::vector<std::string> arguments_;
  bool haveErrors_ = false;
  std::string errorMessage_;
  std::mutex ownAnswersMutex_;  // held while an own answer runs, so that removing it waits
  std::map<std::string, OwnAnswer> ownAnswers_;
  std::mutex foldersMutex_;  // the host sets the folders while the reader may answer with them
  std::vector<LSP::WorkspaceFolder> folders_;
  DiagnosticsStore diagnostics_;
  int lastWaitTicks_ = 0;
  // The last request written; a time-out cancels it unless it is "initialize".
  int lastRequestId_ = 0;
  std::string lastRequestMethod_;
  // The host's side of the server's own messages: its handler, the requests it answers
  // and which ones it is handed.
  HandlerSlot handler_;
  HostAnswers answers_;
  std::mutex routesMutex_;
  std::vector<std::string> hostMethods_;
  bool hostAnswersUnknown_ = false;
  // Whether a request is in progress, the queue its wait polls, and whether it was cancelled.
  std::mutex waitMutex_;
  bool requestActive_ = false;
  MessageQueue* waitingOn_ = nullptr;
  bool cancelled_ = false;
  EnvironmentChanges environment_;
  // The pipes, readers and writer of the current launch; null before the first.
  std::unique_ptr<ServerStreams> streams_;
};

// The hint that ends most error reports.
extern const char* const kTraceLevelHint;

}  // namespace vexil
