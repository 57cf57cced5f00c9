// The platform-independent face of the change monitor: the refusal once the worker has
// stopped, and the report texts every backend shares.
#include "watch/change_monitor.h"

#include <utility>

#include "watch/monitor_backend.h"

namespace vexil {

const char kChannelNotCreated[] = "Error when creating IOCP.\n";
const char kWorkerNotRunning[] = "Watcher thread is not running.\n";

std::string CannotOpenDirectory(unsigned long error) {
  return "Cannot create directory handle: " + std::to_string(error) + "\n";
}

std::string NotADirectory(const std::string& path) {
  return "Path provided is not a directory: " + path + "\n";
}

void ReportChannelFailure(const MonitorHandlers& handlers, unsigned long error,
                          const std::vector<std::int64_t>& ids) {
  handlers.errorText("IOCP channel has failed with error code: " + std::to_string(error) + "\n");
  for (std::int64_t id : ids) handlers.watchError(id);
}

ChangeMonitor::ChangeMonitor(MonitorHandlers handlers) : handlers_(std::move(handlers)) {
  backend_ = CreateMonitorBackend(handlers_, errorText_);
}

ChangeMonitor::~ChangeMonitor() = default;

bool ChangeMonitor::AddWatch(const std::string& root, std::int64_t id) {
  if (!backend_ || !backend_->Running()) {
    errorText_ = kWorkerNotRunning;
    handlers_.errorText(errorText_);
    return false;
  }
  return backend_->Add(root, id);
}

void ChangeMonitor::RemoveWatch(std::int64_t id) {
  if (backend_) backend_->Remove(id);
}

}  // namespace vexil
