// The server's life: built from the host's record, launched with fresh pipes, readers and
// writer each time, reported on when the launch fails, and closed without ever killing it.
#include "transport/server.h"

#include <algorithm>
#include <sstream>

#include <Poco/Thread.h>

#include "transport/launch_report.h"
#include "transport/server_streams.h"

namespace vexil {

const char* const kTraceLevelHint =
    "For extra debug information, edit the Document Type and in the Language Server panel set the Trace Level to "
    "Verbose.\n";

namespace {

constexpr int kDefaultTimeoutMs = 200;
// A server still running this long after its launch counts as started.
constexpr long kStartupGraceMs = 150;
// How long an ended server's error reader may take to read the rest of its pipe; more
// only when a process the server started holds the pipe open.
constexpr std::chrono::milliseconds kLastWordsWait{500};

}  // namespace

xServer::xServer(const xServerStart& start)
    : tracer_(start.trace, start.level),
      deferred_(tracer_),
      timeout_(kDefaultTimeoutMs),
      useCommand_(start.useCommand),
      directory_(start.directory) {
  if (useCommand_) {
    CommandInterpreter interpreter = SystemCommandInterpreter();
    executable_ = interpreter.program;
    AddArgument(interpreter.runSwitch);
    AddArgument(start.executable);
  } else {
    executable_ = start.executable;
  }
  for (const std::string* argument : {&start.argument1, &start.argument2, &start.argument3, &start.argument4,
                                      &start.argument5, &start.argument6, &start.argument7}) {
    AddArgument(*argument);
  }
  Timeout(start.timeout);
  diagnostics_.OnDrop([this](const std::string& uri) { deferred_.Message("Diagnostics Dropped: %s\n", uri.c_str()); });
}

void xServer::Timeout(int milliseconds) {
  timeout_ = milliseconds < 1 ? kDefaultTimeoutMs : milliseconds;
  writeLimitMs_ = std::max(timeout_, kMinimumWriteMs);
}

void xServer::WorkspaceFolders(const std::vector<LSP::WorkspaceFolder>& folders) {
  std::lock_guard<std::mutex> lock(foldersMutex_);
  folders_ = folders;
}

xServer::~xServer() {
  answers_.Attach(nullptr);
  tracer_.Verbose("Closing language server.....\n");
  Cancel();
  tracer_.Verbose("Closing pipes.....\n");
  if (streams_) streams_->CloseInput();
  tracer_.Verbose("Waiting for threads to end....\n");
  if (streams_) streams_->JoinReaders();
  // While the process is still known: the handler hears the rest and the server's exit.
  if (streams_) streams_->dispatcher.Stop();
  deferred_.Deliver();
  // A server that outlives its connection (one that stopped reading) is collected once it
  // ends, never ended here.
  process_.Abandon();
  tracer_.Verbose("Language server close complete.\n\n");
}

bool xServer::IsRunning() { return process_.IsRunning() && !(streams_ && streams_->input.TimedOut()); }

bool xServer::Start() {
  std::string reason;
  bool hint = true;
  if (IsRunning()) return true;
  TraceLaunchDetails();
  bool running = false;
  try {
    running = Launch();
  } catch (const Poco::Exception& e) {
    hint = false;
    reason = LastSystemErrorText();
    Exception(e);
  } catch (const std::exception& e) {
    hint = false;
    reason = LastSystemErrorText();
    Exception(e);
  }
  if (!running) ReportFailedStart(reason, hint);
  return running;
}

void xServer::Cancel() {
  if (streams_) streams_->StopReaders();
}

void xServer::Exception(const Poco::Exception& e) { RecordException(e.message()); }

void xServer::Exception(const std::exception& e) { RecordException(e.what()); }

void xServer::AddArgument(const std::string& argument) {
  if (!argument.empty()) arguments_.push_back(argument);
}

const char* xServer::Join(const std::vector<std::string>& list, const char* separator) {
  std::ostringstream text;
  for (const std::string& element : list) text << element << separator;
  joined_ = text.str();
  return joined_.c_str();
}

bool xServer::Launch() {
  // The earlier launch's threads end before anything new starts; a server that
  // outlived its closed input is left to end by itself.
  answers_.Attach(nullptr);
  streams_.reset();
  streams_ = std::make_unique<ServerStreams>(
      deferred_, handler_, [this](int& status) { return process_.Ended(status); },
      [this](const std::string& id) { answers_.Decline(id); });
  ServerStreams& streams = *streams_;
  streams.outReader.SetDispatch([this, &streams](LSP::xReader& message) { Dispatch(streams, message); });
  answers_.Attach([this, &streams](std::string body, const std::string& method) { QueueAnswer(streams, body, method); });
  process_.Launch(executable_, arguments_, directory_, &streams.inPipe, &streams.outPipe, &streams.errPipe,
                  environment_);
  streams.Start();
  if (tracer_.Messages()) TraceStrayOutput();
  Poco::Thread::sleep(kStartupGraceMs);
  bool running = IsRunning();
  if (tracer_.Messages()) TraceStrayOutput();
  return running;
}

void xServer::ReportFailedStart(const std::string& reason, bool hint) {
  AwaitLastWords();
  if (tracer_.Messages()) {
    TraceEarlyErrorLines();
    TraceStrayOutput();
  }
  if (streams_) streams_->Close();
  if (!reason.empty()) tracer_.Error("\nError Reason: %s%s", reason.c_str(), reason.back() == '\n' ? "" : "\n");
  tracer_.Error(
      "The language server failed to start. Make sure the langauge server has been correctly installed.\n\n");
  tracer_.Error(
      "Make sure the executable and directory details are correct and if required the system PATH is also "
      "correct.\n");
  if (hint) tracer_.Error("%s", kTraceLevelHint);
}

void xServer::AwaitLastWords() {
  if (streams_) streams_->errThread.TryJoin(kLastWordsWait);
}

void xServer::TraceLaunchDetails() {
  if (!tracer_.Verbose()) return;
  vexil::TraceLaunchDetails(tracer_, executable_, directory_, Join(arguments_, " "), useCommand_, timeout_);
}

void xServer::TraceStrayOutput() {
  if (!streams_) return;
  xPipeReader* readers[] = {&streams_->errReader, &streams_->outReader};
  for (xPipeReader* reader : readers) {
    std::string output = reader->TakeOutput();
    if (!output.empty()) tracer_.Text(TraceType::Line, "Message", output.c_str());
  }
}

void xServer::TraceEarlyErrorLines() {
  // Nobody will read a dead server's error queue, yet its last words (an interpreter's
  // "not found") tell why it did not start.
  std::string lines;
  std::string line;
  while (streams_ && streams_->errReader.Messages().TryPop(line)) lines += line + "\n";
  if (!lines.empty()) tracer_.Text(TraceType::Line, "Message", lines.c_str());
}

void xServer::RecordException(const std::string& text) {
  haveErrors_ = true;
  errorMessage_ = text;
  if (!tracer_.Callback()) return;
  tracer_.Error("Error: %s\n\n", text.c_str());
  TraceStrayOutput();
  tracer_.Error("%s", kTraceLevelHint);
}

}  // namespace vexil
