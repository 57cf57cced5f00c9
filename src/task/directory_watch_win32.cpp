// Task directories on Windows: the process library's directory watcher, one thread per
// directory, waiting on the system's change notifications.
#include <Poco/Delegate.h>
#include <Poco/DirectoryWatcher.h>
#include <Poco/Exception.h>

#include "task/directory_watch.h"

namespace vexil {
namespace {

// Matters only where the library has no change notification of the system and scans.
constexpr int kScanIntervalSeconds = 5;

class PocoDirectoryWatch final : public DirectoryWatch {
 public:
  PocoDirectoryWatch(const std::string& directory, DirectoryEvents events)
      : events_(std::move(events)),
        watcher_(directory, Poco::DirectoryWatcher::DW_FILTER_ENABLE_ALL, kScanIntervalSeconds) {
    watcher_.itemModified += Poco::delegate(this, &PocoDirectoryWatch::OnModified);
    watcher_.itemAdded += Poco::delegate(this, &PocoDirectoryWatch::OnAdded);
    watcher_.scanError += Poco::delegate(this, &PocoDirectoryWatch::OnScanError);
  }
  // The watcher, destroyed first, joins its thread, so a handler that is running finishes
  // first, and the subscriptions end with the watcher on this thread. Unsubscribing while
  // that thread notifies would leave it to free the subscriptions itself.

 private:
  void OnModified(const void*, const Poco::DirectoryWatcher::DirectoryEvent& event) {
    events_.changed(event.item.path());
  }
  void OnAdded(const void*, const Poco::DirectoryWatcher::DirectoryEvent& event) { events_.added(event.item.path()); }
  void OnScanError(const void*, const Poco::Exception& error) { events_.failed(error.displayText()); }

  const DirectoryEvents events_;
  Poco::DirectoryWatcher watcher_;
};

}  // namespace

std::unique_ptr<DirectoryWatch> WatchTaskDirectory(const std::string& directory, DirectoryEvents events,
                                                   std::string& reason) {
  try {
    return std::make_unique<PocoDirectoryWatch>(directory, std::move(events));
  } catch (const Poco::Exception& e) {
    reason = e.displayText();
  } catch (const std::exception& e) {
    reason = e.what();
  }
  return nullptr;
}

}  // namespace vexil
