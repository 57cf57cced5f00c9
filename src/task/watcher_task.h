// LSP::WatcherTask, the implementation of a named watcher task, and LSP::WatcherDirectory,
// one watched directory of it on the platform's directory watch.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "host/trace_line.h"
#include "task/directory_watch.h"
#include "task/watcher_event.h"
#include "vexil/task/watcher_task.h"

namespace LSP {

class WatcherTask;

// Watches one directory (not its subdirectories) for its task while started.
class WatcherDirectory {
 public:
  WatcherDirectory(WatcherTask* task, const std::string& directory);
  WatcherDirectory(const WatcherDirectory&) = delete;
  WatcherDirectory& operator=(const WatcherDirectory&) = delete;
  ~WatcherDirectory();

  // Restarts watching; a directory that cannot be watched is reported under "Error".
  void Start();
  // Returns once no change handler of this directory runs any more.
  void Stop();

 private:
  void ReportUnwatchable(const std::string& reason) const;
  // Runs a handler as the task's own event, and reports what it throws instead of letting
  // it reach the watcher's thread.
  void Guarded(const std::function<void()>& handle);

  WatcherTask* task_;
  std::string directory_;
  std::unique_ptr<vexil::DirectoryWatch> watch_;
};

class WatcherTask : public xWatcherTask {
 public:
  // Copies the options; watches nothing before Start.
  WatcherTask(const std::string& name, const xWatcherOptions& options, const std::vector<std::string>& directories);
  // Stops watching and destroys the commands; children still running are left to end.
  ~WatcherTask() override;

  void AddExtension(const char* extension) override;
  bool IsFlagged() override;
  const char* Name() override;
  void Enable() override;
  void Release() override;
  void Start() override;
  void Stop() override;

  // Change handlers, called on the directory watchers' threads.
  void OnFileChanged(const std::string& path);
  void OnFileAdded(const std::string& path);
  const vexil::Tracer& Trace() const { return tracer_; }

  // Marks the calling thread as running one of this task's events while it lives.
  class InEvent {
   public:
    explicit InEvent(const WatcherTask* task);
    ~InEvent();
    InEvent(const InEvent&) = delete;
    InEvent& operator=(const InEvent&) = delete;

   private:
    const WatcherTask* outer_;
  };

 private:
  // True, and reported, when `operation` is called from one of this task's own events: it
  // would wait for the event's thread, which is the caller's.
  bool RefusedInOwnEvent(const char* operation);
  xWatcherOptions Options();
  // Whether `extension` (in lower case, with its dot) is watched.
  bool IsWatched(const std::string& extension);
  void TraceChanged(const vexil::xFileTags& tags, const xWatcherOptions& options) const;
  void TraceAdded(const vexil::xFileTags& tags, const xWatcherOptions& options) const;
  void RunCommand(const vexil::xFileTags& tags, const xWatcherOptions& options);

  const std::string name_;
  std::mutex mutex_;  // options_ and extensions_: the host edits them while handlers read
  xWatcherOptions options_;
  const vexil::Tracer tracer_;
  std::mutex commandsMutex_;
  // Commands by file; a file changed again while its command runs gets a second one.
  std::multimap<std::string, std::unique_ptr<vexil::xWatcherEvent>> commands_;
  std::map<std::string, bool> extensions_;
  std::vector<std::unique_ptr<WatcherDirectory>> directories_;
};

}  // namespace LSP
