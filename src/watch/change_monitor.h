// Watches directory trees with one platform notification channel and one worker thread,
// and reports batches of created, removed and renamed names per watch to three handlers.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <set>
#include <string>
#include <utility>

namespace vexil {

// The actions a batch carries; the numbers reach the host unchanged.
enum ChangeAction : unsigned {
  kActionAdded = 1,
  kActionRemoved = 2,
  kActionModified = 3,
  kActionRenamedOld = 4,
  kActionRenamedNew = 5,
};

// Names relative to the watch's root, directories with a trailing separator, ordered by
// (name, action) so that one name changed twice the same way within a batch counts once.
using ChangeBatch = std::set<std::pair<std::string, unsigned>>;

// The three callbacks. They run on the worker thread, except the error text of a failed
// add, which runs on the caller's thread; they must not call back into the monitor.
struct MonitorHandlers {
  std::function<void(std::int64_t id, const ChangeBatch& batch)> event;
  std::function<void(std::int64_t id)> watchError;
  std::function<void(const std::string& message)> errorText;
};

class MonitorBackend;

class ChangeMonitor {
 public:
  // Never throws for a channel that cannot be created: ErrorText() says so instead, and
  // such a monitor refuses every add. A thread that cannot start throws.
  explicit ChangeMonitor(MonitorHandlers handlers);
  // Stops every watch and joins the worker: no handler runs once this has returned.
  ~ChangeMonitor();
  ChangeMonitor(const ChangeMonitor&) = delete;
  ChangeMonitor& operator=(const ChangeMonitor&) = delete;

  // Empty when construction succeeded.
  const std::string& ErrorText() const { return errorText_; }
  // Watches `root` and its whole subtree under `id`; false (reported) when it cannot.
  bool AddWatch(const std::string& root, std::int64_t id);
  // Stops one watch; its handlers are not called for it afterwards.
  void RemoveWatch(std::int64_t id);

 private:
  MonitorHandlers handlers_;
  std::string errorText_;
  std::unique_ptr<MonitorBackend> backend_;
};

}  // namespace vexil
