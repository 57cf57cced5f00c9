// The change monitor's Linux backend: one inotify descriptor and one worker thread that
// waits with poll() on it and on an eventfd through which destruction wakes the worker.
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <mutex>
#include <utility>

#include "watch/inotify_tree.h"
#include "watch/monitor_backend.h"

namespace vexil {
namespace {

// One read takes as much as one Windows notification buffer: 64 KiB.
constexpr std::size_t kReadBufferSize = 65536;
// How long a move out waits for its other half before it counts as a removal. The kernel
// queues both halves at once, so only a read that fell between them ever waits this long.
constexpr int kMoveOutWaitMs = 20;

// A watch stays listed after an overflow, silent, as the Windows backend keeps it.
enum class WatchState { Active, Silent };

enum class Wait { Read, Quiet, Woken, Failed };

class InotifyBackend final : public MonitorBackend {
 public:
  InotifyBackend(MonitorHandlers handlers, UniqueFd inotify, UniqueFd wake)
      : MonitorBackend(std::move(handlers)),
        inotify_(std::move(inotify)),
        wake_(std::move(wake)),
        tree_(inotify_.Get()) {}

 protected:
  void Run() override;
  void Wake() override {
    const std::uint64_t one = 1;
    // An eventfd write only fails when the counter would overflow, which one write cannot do.
    [[maybe_unused]] const ssize_t written = write(wake_.Get(), &one, sizeof one);
  }
  std::error_code AddWatch(const std::string& root, std::int64_t id, const WatchOptions& options) override;
  void RemoveWatch(std::int64_t id) override;

 private:
  // Waits up to `timeoutMs` (-1: for good) for a buffer of events and reads it.
  Wait ReadOnce(char* buffer, std::size_t& length, int timeoutMs, int& error);
  void Collect(ReadOutcome outcome, Deliveries& deliveries);
  void Unwatched(ReadOutcome& outcome, Deliveries& deliveries) const;
  std::vector<std::int64_t> WatchIds() const;

  UniqueFd inotify_;
  UniqueFd wake_;
  std::mutex mutex_;  // over tree_ and watches_
  InotifyTree tree_;
  std::map<std::int64_t, WatchState> watches_;
};

std::error_code InotifyBackend::AddWatch(const std::string& root, std::int64_t id, const WatchOptions& options) {
  struct stat status;
  if (stat(root.c_str(), &status) != 0) {
    const int error = errno;
    ReportNow(CannotOpenDirectory(error));
    return {error, std::generic_category()};
  }
  if (!S_ISDIR(status.st_mode)) {
    ReportNow(NotADirectory(root));
    return std::make_error_code(std::errc::not_a_directory);
  }
  ReadOutcome outcome;
  int error = 0;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    if (!Running()) return std::make_error_code(std::errc::operation_canceled);
    error = tree_.AddRoot(root, id, options, outcome);
    if (!error) watches_[id] = WatchState::Active;
  }
  Deliveries reports;
  Unwatched(outcome, reports);
  for (const Delivery& report : reports) {
    if (report.kind == Delivery::Kind::Limit) ReportLimitNow(report.id, report.text);
    if (report.kind == Delivery::Kind::Text) ReportNow(report.text);
  }
  if (!error) return {};
  if (error == ENOSPC && HearsLimits()) {
    ReportLimitNow(id, root);
  } else {
    ReportNow(CannotOpenDirectory(error));
  }
  return {error, std::generic_category()};
}

void InotifyBackend::RemoveWatch(std::int64_t id) {
  std::lock_guard<std::mutex> lock(mutex_);
  tree_.Remove(id);
  watches_.erase(id);
}

void InotifyBackend::Run() {
  std::vector<char> buffer(kReadBufferSize);
  bool holding = false;
  int error = 0;
  for (;;) {
    std::size_t length = 0;
    const Wait wait = ReadOnce(buffer.data(), length, holding ? kMoveOutWaitMs : -1, error);
    if (wait == Wait::Woken || wait == Wait::Failed) break;
    Deliveries deliveries;
    {
      std::lock_guard<std::mutex> lock(mutex_);
      Collect(tree_.Translate(buffer.data(), length), deliveries);
      holding = tree_.Holding();
    }
    Deliver(deliveries);
  }
  LoopEnded();
  if (!error) return;
  Deliveries deliveries;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    ReportChannelFailure(static_cast<unsigned long>(error), WatchIds(), deliveries);
  }
  Deliver(deliveries);
}

Wait InotifyBackend::ReadOnce(char* buffer, std::size_t& length, int timeoutMs, int& error) {
  for (;;) {
    pollfd waits[2] = {{wake_.Get(), POLLIN, 0}, {inotify_.Get(), POLLIN, 0}};
    const int ready = poll(waits, 2, timeoutMs);
    if (ready < 0 && errno == EINTR) continue;
    if (ready < 0) {
      error = errno;
      return Wait::Failed;
    }
    if (waits[0].revents) return Wait::Woken;
    if (ready == 0) return Wait::Quiet;
    const ssize_t got = read(inotify_.Get(), buffer, kReadBufferSize);
    if (got > 0) {
      length = static_cast<std::size_t>(got);
      return Wait::Read;
    }
    if (got < 0 && errno != EINTR && errno != EAGAIN) {
      error = errno;
      return Wait::Failed;
    }
  }
}

// Batches first, so that a watch's last changes reach the host before it is declared gone.
void InotifyBackend::Collect(ReadOutcome outcome, Deliveries& deliveries) {
  Unwatched(outcome, deliveries);
  for (auto& [id, batches] : outcome.batches) batches.MoveInto(id, deliveries);
  for (std::int64_t id : outcome.rootsGone) {
    deliveries.push_back({Delivery::Kind::WatchError, id, {}, {}});
    watches_.erase(id);
  }
  if (!outcome.overflow) return;
  for (auto& [id, state] : watches_) {
    if (state == WatchState::Silent) continue;
    deliveries.push_back({Delivery::Kind::WatchError, id, {}, {}});
    tree_.Remove(id);
    state = WatchState::Silent;
  }
}

// Directories the watch limit left out go to the limit handler when there is one, else they
// are error texts like any other directory that cannot be watched.
void InotifyBackend::Unwatched(ReadOutcome& outcome, Deliveries& deliveries) const {
  for (std::string& text : outcome.errors) deliveries.push_back({Delivery::Kind::Text, 0, {}, std::move(text)});
  for (auto& [ids, path] : outcome.limited) {
    if (!HearsLimits()) deliveries.push_back({Delivery::Kind::Text, 0, {}, CannotWatchDirectory(path, ENOSPC)});
    for (std::int64_t id : ids)
      if (HearsLimits()) deliveries.push_back({Delivery::Kind::Limit, id, {}, path});
  }
}

std::vector<std::int64_t> InotifyBackend::WatchIds() const {
  std::vector<std::int64_t> ids;
  for (const auto& entry : watches_) ids.push_back(entry.first);
  return ids;
}

}  // namespace

std::shared_ptr<MonitorBackend> CreateMonitorBackend(MonitorHandlers handlers, std::string& errorText) {
  UniqueFd inotify(inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  UniqueFd wake(eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC));
  if (!inotify.Valid() || !wake.Valid()) {
    errorText = kChannelNotCreated;
    return nullptr;
  }
  return std::make_shared<InotifyBackend>(std::move(handlers), std::move(inotify), std::move(wake));
}

}  // namespace vexil
