// One watched directory of a task on the process library's directory watcher: modified
// files go to the task's change handler, added ones to its added-file handler.
#include <Poco/Delegate.h>

#include "task/watcher_task.h"

namespace LSP {
namespace {

// Matters only where the library has no change notification of the system and scans.
constexpr int kScanIntervalSeconds = 5;

}  // namespace

WatcherDirectory::WatcherDirectory(WatcherTask* task, const std::string& directory)
    : task_(task), directory_(directory) {}

WatcherDirectory::~WatcherDirectory() { Stop(); }

void WatcherDirectory::Start() {
  Stop();
  task_->Trace().Verbose("Starting to watch directory: %s\n", directory_.c_str());
  try {
    watcher_ = std::make_unique<Poco::DirectoryWatcher>(directory_, Poco::DirectoryWatcher::DW_FILTER_ENABLE_ALL,
                                                        kScanIntervalSeconds);
  } catch (const Poco::Exception& e) {
    task_->Trace().Error("Error: %s\n\n", e.displayText().c_str());
    return;
  }
  watcher_->itemModified += Poco::delegate(this, &WatcherDirectory::OnModified);
  watcher_->itemAdded += Poco::delegate(this, &WatcherDirectory::OnAdded);
}

void WatcherDirectory::Stop() {
  // The watcher's destructor joins its thread, so a handler that is running finishes
  // first, and the subscriptions end with the watcher on this thread. Unsubscribing
  // while that thread notifies would leave it to free the subscriptions itself.
  watcher_.reset();
}

void WatcherDirectory::OnModified(const void*, const Poco::DirectoryWatcher::DirectoryEvent& event) {
  Guarded([&] { task_->OnFileChanged(event.item.path()); });
}

void WatcherDirectory::OnAdded(const void*, const Poco::DirectoryWatcher::DirectoryEvent& event) {
  Guarded([&] { task_->OnFileAdded(event.item.path()); });
}

void WatcherDirectory::Guarded(const std::function<void()>& handle) {
  // An exception would end the watcher's thread, and with it all watching of the directory.
  try {
    handle();
  } catch (const std::exception& e) {
    task_->Trace().Error("Error: %s\n\n", e.what());
  }
}

}  // namespace LSP
