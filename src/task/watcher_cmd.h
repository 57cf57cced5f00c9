// xWatcherCmd: the child process a watcher task runs for one changed file, with its
// output traced while it runs and a time after which it is given up on (not killed).
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <vector>

#include <Poco/Exception.h>
#include <Poco/Pipe.h>
#include <Poco/Runnable.h>

#include "host/trace_line.h"
#include "task/command_output.h"
#include "task/file_tags.h"
#include "transport/process.h"
#include "transport/reader_thread.h"
#include "vexil/task/watcher_options.h"

namespace vexil {

class xWatcherCmd : public Poco::Runnable {
 public:
  // Expands the tags in the options' argument text; launches nothing. `name` is the
  // task's, the title of the command's notices.
  xWatcherCmd(const std::string& name, const xFileTags& tags, const xWatcherOptions& options);
  xWatcherCmd(const xWatcherCmd&) = delete;
  xWatcherCmd& operator=(const xWatcherCmd&) = delete;
  // Stops reading; a child still running is left to end by itself and is never killed.
  ~xWatcherCmd() override;

  // The launched child's process id; 0 before a launch.
  int Id() const;
  const std::string& Name() const { return name_; }
  // False too once the child has been given up on after its time-out.
  bool IsRunning();
  bool Completed() const { return completed_; }
  bool HaveErrors() const { return errors_; }
  std::string ErrorMessage() const;

  // Launches unless running; true when the child still runs 100 ms later. Never throws.
  bool Start();
  // Stops reading the output within a third of the time-out; reports a child that runs on.
  void Cancel();
  // Makes run() return at its next poll without waiting for the child.
  void StopWaiting();
  // Record and report a caught exception.
  void Exception(const Poco::Exception& e);
  void Exception(const std::exception& e);

 protected:
  // Every part followed by `separator`; valid until the next call.
  const char* Join(const std::vector<std::string>& parts, const char* separator);
  // Appends `argument` unless it is empty.
  void AddArgument(const std::string& argument);
  // Polls the child every 100 ms until it ends or its time is out.
  void run() override;

 private:
  void Launch();
  void ReportLaunchFailure(const std::string& text);
  void ReportRefusal();
  void ReportEnd();
  void ReportTimeOut();
  void RecordException(const std::string& text);
  // Traces the lines the child wrote since the last look, one "Message" each.
  void TraceOutput();
  // Gives the reader up to a third of the time-out to read to the end of a finished
  // child's output, tracing it meanwhile, so that its last lines are traced too.
  void DrainOutput();
  // False when StopWaiting was called before the poll interval passed. Traces the output
  // meanwhile whenever the reader has no room for more.
  bool WaitPollInterval();
  // Called by the reader when its backlog is full.
  void OutputWaiting();
  std::chrono::milliseconds ReaderGrace() const;

  std::string joined_;
  Tracer tracer_;
  Poco::Pipe outPipe_;  // the child's standard output and standard error together
  CommandOutputReader reader_;
  bool cancelled_ = false;
  ReaderThread readerThread_;
  mutable std::mutex processMutex_;  // the child is looked at from the task's and the run thread
  xProcess process_;
  int id_ = 0;  // kept when the child is given up on and the process wrapper forgets it
  bool useCommand_;
  std::atomic<bool> completed_{false};
  std::atomic<bool> errors_{false};
  int timeout_;
  mutable std::mutex errorMutex_;
  std::string errorMessage_;
  std::string executable_;
  std::string name_;
  std::string directory_;
  std::vector<std::string> arguments_;
  // A tag value the interpreter would read as syntax: the command is refused.
  bool refused_ = false;
  std::mutex waitMutex_;
  std::condition_variable waitChanged_;
  bool stopWaiting_ = false;
  bool outputWaiting_ = false;
};

}  // namespace vexil
