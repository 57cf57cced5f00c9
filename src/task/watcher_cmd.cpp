// A watcher command's life: built with its tags expanded, launched with its output on
// one pipe, polled until it ends or its time is out, and reported on at each step.
#include "task/watcher_cmd.h"

#include <algorithm>
#include <sstream>

#include <Poco/Thread.h>

#include "task/interpreter_safety.h"
#include "transport/launch_report.h"

namespace vexil {
namespace {

constexpr int kDefaultTimeoutMs = 5000;
// The child is looked at this often; the time-out is honoured to this grain.
constexpr int kPollMs = 100;
// While a finished child's last output is read, it is traced this often.
constexpr int kDrainStepMs = 10;

bool AnyInterpreted(const std::vector<std::string>& values) {
  return std::any_of(values.begin(), values.end(), InterpreterWouldInterpret);
}

}  // namespace

xWatcherCmd::xWatcherCmd(const std::string& name, const xFileTags& tags, const xWatcherOptions& options)
    : tracer_(options.trace, options.level),
      reader_(outPipe_),
      useCommand_(options.useCommand),
      timeout_(options.timeout < 1 ? kDefaultTimeoutMs : options.timeout),
      name_(name),
      directory_(options.directory) {
  if (useCommand_) {
    const CommandInterpreter interpreter = SystemCommandInterpreter();
    executable_ = interpreter.program;
    AddArgument(interpreter.runSwitch);
  } else {
    executable_ = options.executable;
  }
  reader_.SetBacklogHandler([this] { OutputWaiting(); });
  // One argument, blanks and all: through the interpreter it is the command line.
  const TagExpansion expansion = ExpandTags(options.arguments, tags);
  refused_ = useCommand_ && AnyInterpreted(expansion.inserted);
  AddArgument(expansion.text);
}

xWatcherCmd::~xWatcherCmd() {
  if (!cancelled_) Cancel();
  // Stopped, the reader ends within one look at its stop flag; it must not call back into
  // this command once its members are going.
  readerThread_.Join();
  tracer_.Verbose("Watcher command close complete.\n\n");
  std::lock_guard<std::mutex> lock(processMutex_);
  process_.Abandon();
}

int xWatcherCmd::Id() const {
  std::lock_guard<std::mutex> lock(processMutex_);
  return id_;
}

bool xWatcherCmd::IsRunning() {
  std::lock_guard<std::mutex> lock(processMutex_);
  return process_.IsRunning();
}

std::string xWatcherCmd::ErrorMessage() const {
  std::lock_guard<std::mutex> lock(errorMutex_);
  return errorMessage_;
}

bool xWatcherCmd::Start() {
  if (IsRunning()) return false;
  TraceLaunchDetails(tracer_, executable_, directory_, Join(arguments_, " "), useCommand_, timeout_);
  if (refused_) {
    ReportRefusal();
    return false;
  }
  try {
    Launch();
  } catch (const Poco::Exception& e) {
    ReportLaunchFailure(e.message());
    return false;
  } catch (const std::exception& e) {
    ReportLaunchFailure(e.what());
    return false;
  }
  TraceOutput();
  Poco::Thread::sleep(kPollMs);
  const bool running = IsRunning();
  if (!running) {
    DrainOutput();
    TraceOutput();
    Cancel();
  }
  return running;
}

void xWatcherCmd::Cancel() {
  cancelled_ = true;
  if (IsRunning()) tracer_.Error("ERROR: The Watcher Command task is still running.\n");
  tracer_.Verbose("Waiting for thread to end....\n");
  // The reader polls its stop flag, so it ends even while the child, or a process that
  // inherited the pipe, keeps the pipe open; nothing is killed.
  reader_.Stop();
  readerThread_.TryJoin(ReaderGrace());
}

void xWatcherCmd::StopWaiting() {
  {
    std::lock_guard<std::mutex> lock(waitMutex_);
    stopWaiting_ = true;
  }
  waitChanged_.notify_all();
}

void xWatcherCmd::Exception(const Poco::Exception& e) { RecordException(e.message()); }

void xWatcherCmd::Exception(const std::exception& e) { RecordException(e.what()); }

const char* xWatcherCmd::Join(const std::vector<std::string>& parts, const char* separator) {
  std::ostringstream text;
  for (const std::string& part : parts) text << part << separator;
  joined_ = text.str();
  return joined_.c_str();
}

void xWatcherCmd::AddArgument(const std::string& argument) {
  if (!argument.empty()) arguments_.push_back(argument);
}

void xWatcherCmd::run() {
  try {
    for (int poll = 0; poll < timeout_ / kPollMs; ++poll) {
      if (!IsRunning()) return ReportEnd();
      TraceOutput();
      if (!WaitPollInterval()) return;
    }
    // A child that ended during the last interval ended within its time.
    if (!IsRunning()) return ReportEnd();
    ReportTimeOut();
  } catch (const Poco::Exception& e) {
    Exception(e);
  } catch (const std::exception& e) {
    Exception(e);
  }
}

void xWatcherCmd::Launch() {
  {
    std::lock_guard<std::mutex> lock(processMutex_);
    process_.Launch(executable_, arguments_, directory_, nullptr, &outPipe_, &outPipe_);
    id_ = process_.Id();
  }
  readerThread_.Start(reader_);
}

void xWatcherCmd::ReportLaunchFailure(const std::string& text) {
  tracer_.Error(
      "%s\nWatcher Command: %s => Make sure the executable exists, the details are correctly configured and the "
      "executable is in the PATH.\n\n",
      text.c_str(), name_.c_str());
}

void xWatcherCmd::ReportRefusal() {
  errors_ = true;
  tracer_.Error(
      "\nWatcher Command: '%s' => Refused to run: the file name contains characters the command interpreter would "
      "interpret.\n",
      name_.c_str());
}

void xWatcherCmd::ReportEnd() {
  DrainOutput();
  TraceOutput();
  completed_ = true;
  tracer_.Text(TraceType::Notice, name_.c_str(), "Watcher Command Run event complete.");
}

void xWatcherCmd::ReportTimeOut() {
  Cancel();
  {
    // Left running, yet collected once it ends, however long this command is kept.
    std::lock_guard<std::mutex> lock(processMutex_);
    process_.Abandon();
  }
  errors_ = true;
  tracer_.Error("\nWatcher Command: '%s' => Timed out waiting for watcher task to complete.\n", name_.c_str());
}

void xWatcherCmd::RecordException(const std::string& text) {
  {
    std::lock_guard<std::mutex> lock(errorMutex_);
    errorMessage_ = text;
  }
  if (!tracer_.Callback()) return;
  tracer_.Error("Error: %s\n\n", text.c_str());
  std::string output, line;
  for (std::size_t count = reader_.LinesHeld(); count > 0 && reader_.TakeLine(line); --count) output += line + "\n";
  if (!output.empty()) tracer_.Error("%s\n\n", output.c_str());
}

void xWatcherCmd::TraceOutput() {
  // Taken at every level, so that unreported output does not hold the child up. Only the
  // lines there now: a child that writes on must not keep the poll from looking at it.
  std::string line;
  for (std::size_t count = reader_.LinesHeld(); count > 0 && reader_.TakeLine(line); --count)
    if (tracer_.Messages()) tracer_.Message("%s\n", line.c_str());
}

void xWatcherCmd::DrainOutput() {
  const auto end = std::chrono::steady_clock::now() + ReaderGrace();
  // A reader waiting for its lines to be taken would otherwise never get to the end.
  while (!readerThread_.TryJoin(std::chrono::milliseconds(kDrainStepMs)) && std::chrono::steady_clock::now() < end)
    TraceOutput();
}

bool xWatcherCmd::WaitPollInterval() {
  const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(kPollMs);
  std::unique_lock<std::mutex> lock(waitMutex_);
  while (waitChanged_.wait_until(lock, end, [this] { return stopWaiting_ || outputWaiting_; })) {
    if (stopWaiting_) return false;
    // The child waits for room in the backlog: trace it now, not at the next poll.
    outputWaiting_ = false;
    lock.unlock();
    TraceOutput();
    lock.lock();
  }
  return true;
}

void xWatcherCmd::OutputWaiting() {
  {
    std::lock_guard<std::mutex> lock(waitMutex_);
    outputWaiting_ = true;
  }
  waitChanged_.notify_all();
}

std::chrono::milliseconds xWatcherCmd::ReaderGrace() const { return std::chrono::milliseconds(timeout_ / 3); }

}  // namespace vexil
