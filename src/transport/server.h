// xServer: one language server process with its three pipes and two reader threads,
// the framing of outgoing messages and the matching of replies to requests.
#pragma once

#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include <Poco/Exception.h>
#include <Poco/Pipe.h>

#include "host/trace_line.h"
#include "transport/diagnostics_store.h"
#include "transport/pipe_reader.h"
#include "transport/process.h"
#include "transport/reader_thread.h"
#include "vexil/host/records.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace vexil {

class xServer {
 public:
  // Copies the record; launches nothing.
  explicit xServer(const xServerStart& start);
  xServer(const xServer&) = delete;
  xServer& operator=(const xServer&) = delete;
  // Closes our ends of the pipes and waits for the readers; the server is left to end
  // by itself and is never killed.
  virtual ~xServer();

  // Launches unless running; true when the server still runs 150 ms after the launch.
  bool Start();
  // Tells both readers to stop; they end within one poll interval.
  void Cancel();
  int Id() const { return process_.Id(); }
  TraceCallback Trace() const { return tracer_.Callback(); }
  LSP::TraceLevel Level() const { return tracer_.Level(); }
  bool IsRunning() { return process_.IsRunning(); }
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

  // The reply wait limit in milliseconds; a value below 1 becomes the default.
  int Timeout() const { return timeout_; }
  void Timeout(int milliseconds);
  // The folders a "workspace/workspaceFolders" request from the server is answered with.
  void WorkspaceFolders(const std::vector<LSP::WorkspaceFolder>& folders);
  // The server's diagnostics by document, kept whether or not a request is waiting.
  DiagnosticsStore& Diagnostics() { return diagnostics_; }

 protected:
  // Clears the error state and sends `text`, a message's JSON body, framed.
  void Write(const char* text, int length, bool isRequest);
  // The text of the reply to `id`; empty when none came in time.
  std::string Reply(int id);
  // Whether `text` is to be taken as the reply to `id`.
  bool HaveId(int id, const std::string& text);
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
  void CloseInput();
  void JoinReaders();
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
  void Dispatch(LSP::xReader& message);
  void StoreDiagnostics(const LSP::xObject& notification);

  std::string joined_;
  Tracer tracer_;
  Poco::Pipe inPipe_;
  Poco::Pipe outPipe_;
  Poco::Pipe errPipe_;
  xPipeReader outReader_;
  xPipeErrReader errReader_;
  ReaderThread outThread_;
  ReaderThread errThread_;
  xProcess process_;
  int timeout_;
  bool useCommand_;
  std::string executable_;
  std::string directory_;
  std::vector<std::string> arguments_;
  bool haveErrors_ = false;
  std::string errorMessage_;
  std::mutex writeMutex_;  // one framed message at a time, from the host or the reader
  std::mutex foldersMutex_;  // the host sets the folders while the reader may answer with them
  std::vector<LSP::WorkspaceFolder> folders_;
  DiagnosticsStore diagnostics_;
  int lastWaitTicks_ = 0;
};

// The hint that ends most error reports.
extern const char* const kTraceLevelHint;

}  // namespace vexil
