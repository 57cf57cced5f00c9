// Task directories on Linux: one change monitor serves every task of the process (one inotify
// instance and one thread waiting with poll()), each directory a non-recursive watch that
// reports content changes.
#include <sys/stat.h>

#include <cerrno>
#include <map>
#include <mutex>
#include <system_error>

#include "task/directory_watch.h"
#include "watch/change_monitor.h"

namespace vexil {
namespace {

WatchOptions TaskWatch() {
  WatchOptions options;
  options.recursive = false;
  options.modifications = true;
  return options;
}

std::string Reason(const std::error_code& error) {
  // The kernel's word for it would read "No space left on device".
  if (error == std::error_code(ENOSPC, std::generic_category()))
    return "The system's limit on watched directories (fs.inotify.max_user_watches) was reached";
  return error.message();
}

// Empty while `directory` is one.
std::string WhyNotADirectory(const std::string& directory) {
  struct stat status;
  if (stat(directory.c_str(), &status) != 0) return Reason({errno, std::generic_category()});
  return S_ISDIR(status.st_mode) ? std::string() : Reason(std::make_error_code(std::errc::not_a_directory));
}

class TaskDirectoryWatch;

// The monitor every task directory shares while any is watched.
class SharedMonitor {
 public:
  static std::shared_ptr<SharedMonitor> Acquire();

  SharedMonitor()
      : monitor_({[this](std::int64_t id, const ChangeBatch& batch) { OnBatch(id, batch); },
                  [this](std::int64_t id) { OnBroken(id); },
                  // Add failures reach the caller as its error; the rest end in a watch error.
                  [](const std::string&) {}}) {}

  // A fresh id for `watch`, watching `directory`; 0, with `error` set, when it cannot.
  std::int64_t Add(const std::string& directory, TaskDirectoryWatch* watch, std::error_code& error);
  // The watch of `id` again, after the system dropped some of its changes.
  bool Rewatch(std::int64_t id, const std::string& directory, std::error_code& error);
  // Once this has returned, nothing more is delivered for `id`.
  void Remove(std::int64_t id);

 private:
  void OnBatch(std::int64_t id, const ChangeBatch& batch);
  void OnBroken(std::int64_t id);
  // The watch of `id`: valid throughout a delivery, since Remove waits for that to end.
  TaskDirectoryWatch* Find(std::int64_t id);

  std::mutex mutex_;  // over lastId_ and watches_
  std::int64_t lastId_ = 0;
  std::map<std::int64_t, TaskDirectoryWatch*> watches_;
  ChangeMonitor monitor_;  // last: its worker ends before the table goes
};

class TaskDirectoryWatch final : public DirectoryWatch {
 public:
  TaskDirectoryWatch(std::shared_ptr<SharedMonitor> monitor, std::string directory, DirectoryEvents events)
      : monitor_(std::move(monitor)), directory_(std::move(directory)), events_(std::move(events)) {}
  ~TaskDirectoryWatch() override {
    if (id_) monitor_->Remove(id_);
  }

  bool Start(std::error_code& error) {
    id_ = monitor_->Add(directory_, this, error);
    return id_ != 0;
  }
  void Deliver(const ChangeBatch& batch);
  // The directory went away, or the system dropped changes: watching goes on if it can.
  void Broken();

 private:
  std::string PathOf(const std::string& name) const {
    return directory_.empty() || directory_.back() == '/' ? directory_ + name : directory_ + "/" + name;
  }

  std::shared_ptr<SharedMonitor> monitor_;
  const std::string directory_;
  const DirectoryEvents events_;
  std::int64_t id_ = 0;  // kept through a rewatch
};

std::shared_ptr<SharedMonitor> SharedMonitor::Acquire() {
  static std::mutex mutex;
  static std::weak_ptr<SharedMonitor> shared;
  std::lock_guard<std::mutex> lock(mutex);
  std::shared_ptr<SharedMonitor> monitor = shared.lock();
  if (!monitor) {
    monitor = std::make_shared<SharedMonitor>();
    shared = monitor;
  }
  return monitor;
}

std::int64_t SharedMonitor::Add(const std::string& directory, TaskDirectoryWatch* watch, std::error_code& error) {
  std::int64_t id = 0;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    id = ++lastId_;
    watches_[id] = watch;
  }
  if (monitor_.AddWatch(directory, id, TaskWatch(), &error)) return id;
  std::lock_guard<std::mutex> lock(mutex_);
  watches_.erase(id);
  return 0;
}

bool SharedMonitor::Rewatch(std::int64_t id, const std::string& directory, std::error_code& error) {
  monitor_.RemoveWatch(id);
  return monitor_.AddWatch(directory, id, TaskWatch(), &error);
}

void SharedMonitor::Remove(std::int64_t id) {
  monitor_.RemoveWatch(id);
  {
    std::lock_guard<std::mutex> lock(mutex_);
    watches_.erase(id);
  }
  // A rewatch that ran while this waited for its delivery has added the watch again.
  monitor_.RemoveWatch(id);
}

void SharedMonitor::OnBatch(std::int64_t id, const ChangeBatch& batch) {
  if (TaskDirectoryWatch* watch = Find(id)) watch->Deliver(batch);
}

void SharedMonitor::OnBroken(std::int64_t id) {
  if (TaskDirectoryWatch* watch = Find(id)) watch->Broken();
}

TaskDirectoryWatch* SharedMonitor::Find(std::int64_t id) {
  std::lock_guard<std::mutex> lock(mutex_);
  const auto found = watches_.find(id);
  return found == watches_.end() ? nullptr : found->second;
}

void TaskDirectoryWatch::Deliver(const ChangeBatch& batch) {
  for (const auto& [name, action] : batch) {
    if (name.empty() || name.back() == '/') continue;  // only files run commands
    if (action == kActionModified) events_.changed(PathOf(name));
    if (action == kActionAdded) events_.added(PathOf(name));
  }
}

void TaskDirectoryWatch::Broken() {
  const std::string gone = WhyNotADirectory(directory_);
  std::error_code error;
  const bool watching = gone.empty() && monitor_->Rewatch(id_, directory_, error);
  if (!gone.empty()) return events_.failed(gone);
  events_.lost();
  if (!watching) events_.failed(Reason(error));
}

}  // namespace

std::unique_ptr<DirectoryWatch> WatchTaskDirectory(const std::string& directory, DirectoryEvents events,
                                                   std::string& reason) {
  auto watch = std::make_unique<TaskDirectoryWatch>(SharedMonitor::Acquire(), directory, std::move(events));
  std::error_code error;
  if (watch->Start(error)) return watch;
  reason = Reason(error);
  return nullptr;
}

}  // namespace vexil
