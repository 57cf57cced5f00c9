// Watches directory trees with one platform notification channel and one worker thread,
// and reports batches of created, removed, renamed (and, on request, modified) names per watch.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <set>
#include <string>
#include <system_error>
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
// A rename comes as a batch of its own holding just its old (4) and its new name (5); the
// other changes of one read are gathered between the renames, in the order they happened.
using ChangeBatch = std::set<std::pair<std::string, unsigned>>;

// The callbacks. They run on the worker thread, outside the monitor's lock, except the
// reports of a failed add, which run on the caller's thread. A handler may add and remove
// watches, and may even destroy the monitor: the worker then ends once the handler has
// returned, without waiting for itself, and calls nothing more.
struct MonitorHandlers {
  std::function<void(std::int64_t id, const ChangeBatch& batch)> event;
  std::function<void(std::int64_t id)> watchError;
  std::function<void(const std::string& message)> errorText;
  // Optional: the system's limit on watched directories (Linux's inotify watches) left
  // directory `path` of watch `id`'s tree unwatched. When set, such directories come here
  // instead of through errorText, so that a caller can say it once for a whole tree.
  std::function<void(std::int64_t id, const std::string& path)> limitReached = nullptr;
};

// How one watch looks at its root. The watchers a host starts use the defaults; the other
// settings serve the library's own users (watcher tasks, and whoever needs to know that a
// file's content changed).
struct WatchOptions {
  // The whole tree below the root, or only the root's own entries.
  bool recursive = true;
  // Also report, as kActionModified, every file whose content at a name is new: written to
  // (on Linux once its writer closes it; on Windows as the system reports writes, which may
  // be more than once per save), or put there by a rename or a move into the tree, which is
  // how editors save atomically. Directories are never reported as modified.
  bool modifications = false;
};

class MonitorBackend;

class ChangeMonitor {
 public:
  // Never throws for a channel that cannot be created: ErrorText() says so instead, and
  // such a monitor refuses every add. A thread that cannot start throws.
  explicit ChangeMonitor(MonitorHandlers handlers);
  // Stops every watch and joins the worker: no handler runs once this has returned. From
  // inside a handler it cannot join: the worker ends as soon as that handler returns.
  ~ChangeMonitor();
  ChangeMonitor(const ChangeMonitor&) = delete;
  ChangeMonitor& operator=(const ChangeMonitor&) = delete;

  // Empty when construction succeeded.
  const std::string& ErrorText() const { return errorText_; }
  // Watches `root` (and, by default, its whole subtree) under `id`. False, reported through
  // the error-text handler and with the cause in `failure` when given, when it cannot.
  bool AddWatch(const std::string& root, std::int64_t id, const WatchOptions& options = {},
                std::error_code* failure = nullptr);
  // Stops one watch; its handlers are not called for it once this has returned (unless it
  // is called from one of them, which then finishes first).
  void RemoveWatch(std::int64_t id);
  // True on the worker thread, that is, inside a handler.
  bool InHandler() const;

 private:
  std::string errorText_;
  // A copy of the error-text handler, for adds refused when there is no worker.
  std::function<void(const std::string& message)> reportAddFailure_;
  std::shared_ptr<MonitorBackend> backend_;
};

}  // namespace vexil
