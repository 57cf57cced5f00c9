// xServer: one language server process with its three pipes and two reader threads,
// the framing of outgoing messages and the matching of replies to requests.
#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include <Poco/Exception.h>

#include "host/trace_line.h"
#include "transport/deferred_trace.h"
#include "transport/diagnostics_store.h"
#include "transport/process.h"
#include "vexil/host/records.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace vexil {

struct ServerStreams;

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
  void Write(LSP::RequestMessage& message);
  void Write(LSP::NotificationMessage& message);
  // Waits for the reply to `id` (-1: the next message that is not a numbered reply) and
  // reads it into `response`. Never throws; failures end up in HaveErrors().
  void Read(int id, LSP::ResponseMessage& response);

  // Waits of 100 ms in which nothing arrived, used by the last reply wait.
  int LastWaitTicks() const { return lastWaitTicks_; }

  // The reply wait limit in milliseconds; a value below 1 becomes the default. Writes
  // get as long, and never less than kMinimumWriteMs.
  int Timeout() const { return timeout_; }
  void Timeout(int milliseconds);
  // The folders a "workspace/workspaceFolders" request from the server is answered with.
  void WorkspaceFolders(const std::vector<LSP::WorkspaceFolder>& folders);
  // The server's diagnostics by document, kept whether or not a request is waiting.
  DiagnosticsStore& Diagnostics() { return diagnostics_; }

  // Large texts to a busy server need time to go through.
  static constexpr int kMinimumWriteMs = 5000;

 protected:
  // What the client sends back for a message from the server: an answer to a request,
  // or nothing (empty `body`). Stores published diagnostics on the way.
  struct Answer {
    std::string method;
    std::string body;
  };
  // Clears the error state and sends `text`, a message's JSON body, framed.
  void Write(const char* text, int length, bool isRequest);
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
  // Reply and HaveId that leave the reply's parsed document in `parsed` / `reader`.
  std::string Reply(int id, std::unique_ptr<LSP::xReader>& parsed);
  bool HaveId(int id, const std::string& text, LSP::xReader& reader);
  void WriteMessage(LSP::MessageBase& message);
  void Transmit(const std::string& body, bool reportReaderErrors);
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
  void StoreDiagnostics(const LSP::xObject& notification);
  std::vector<LSP::WorkspaceFolder> Folders();

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
  std::mutex foldersMutex_;  // the host sets the folders while the reader may answer with them
  std::vector<LSP::WorkspaceFolder> folders_;
  DiagnosticsStore diagnostics_;
  int lastWaitTicks_ = 0;
  // The last request written; a time-out cancels it unless it is "initialize".
  int lastRequestId_ = 0;
  std::string lastRequestMethod_;
  // The pipes, readers and writer of the current launch; null before the first.
  std::unique_ptr<ServerStreams> streams_;
};

// The hint that ends most error reports.
extern const char* const kTraceLevelHint;

}  // namespace vexil
