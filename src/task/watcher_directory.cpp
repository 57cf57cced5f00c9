// One watched directory of a task: changed files go to the task's change handler, added ones
// to its added-file handler, and a directory that cannot be watched is reported.
#include "task/watcher_task.h"

namespace LSP {

WatcherDirectory::WatcherDirectory(WatcherTask* task, const std::string& directory)
    : task_(task), directory_(directory) {}

WatcherDirectory::~WatcherDirectory() { Stop(); }

void WatcherDirectory::Start() {
  Stop();
  task_->Trace().Verbose("Starting to watch directory: %s\n", directory_.c_str());
  vexil::DirectoryEvents events{
      [this](const std::string& path) { Guarded([&] { task_->OnFileChanged(path); }); },
      [this](const std::string& path) { Guarded([&] { task_->OnFileAdded(path); }); },
      [this] {
        Guarded([&] {
          task_->Trace().Error("Watcher Task: '%s' => Changes were lost in directory: %s\n", task_->Name(),
                               directory_.c_str());
        });
      },
      [this](const std::string& reason) { Guarded([&] { ReportUnwatchable(reason); }); }};
  std::string reason;
  watch_ = vexil::WatchTaskDirectory(directory_, std::move(events), reason);
  if (!watch_) ReportUnwatchable(reason);
}

void WatcherDirectory::Stop() { watch_.reset(); }

void WatcherDirectory::ReportUnwatchable(const std::string& reason) const {
  task_->Trace().Error("Watcher Task: '%s' => Cannot watch directory: %s: %s\n", task_->Name(), directory_.c_str(),
                       reason.c_str());
}

void WatcherDirectory::Guarded(const std::function<void()>& handle) {
  const WatcherTask::InEvent event(task_);
  // An exception would end the watcher's thread, and with it all watching of the directory.
  try {
    handle();
  } catch (const std::exception& e) {
    task_->Trace().Error("Error: %s\n\n", e.what());
  }
}

}  // namespace LSP
