// What each platform's notification backend provides to the change monitor, and what every
// backend shares: the worker thread, the hand-over of reports outside the lock, the batching.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

#include "watch/change_monitor.h"

namespace vexil {

// One report of the worker, gathered under the backend's lock and handed over after it.
// A Limit carries the directory left unwatched as its text.
struct Delivery {
  enum class Kind { Batch, WatchError, Text, Limit };
  Kind kind;
  std::int64_t id;
  ChangeBatch batch;
  std::string text;
};
using Deliveries = std::vector<Delivery>;

// The changes of one watch in one read, as batches in the order they happened: each rename
// pair alone, so that a receiver pairing halves by name order cannot cross two renames, and
// the other changes gathered between them.
class BatchList {
 public:
  void Add(std::string name, unsigned action);
  void AddRename(std::string from, std::string to);
  // Appends the batches to `deliveries` and empties the list.
  void MoveInto(std::int64_t id, Deliveries& deliveries);

 private:
  std::vector<ChangeBatch> batches_;
  bool open_ = false;  // whether the last batch takes further changes
};

class MonitorBackend : public std::enable_shared_from_this<MonitorBackend> {
 public:
  explicit MonitorBackend(MonitorHandlers handlers) : handlers_(std::move(handlers)) {}
  virtual ~MonitorBackend() = default;
  MonitorBackend(const MonitorBackend&) = delete;
  MonitorBackend& operator=(const MonitorBackend&) = delete;

  // Starts the worker, which holds the backend alive until its loop has ended.
  void StartWorker();
  // Ends the worker and joins it; from the worker itself (a handler destroying the monitor)
  // it only lets the worker end once the handler returns.
  void Stop();
  // False once the worker's loop has ended.
  bool Running() const { return !stopped_; }
  bool OnWorker() const;

  // Watches `root`; failures are reported through the error-text handler on this thread.
  std::error_code Add(const std::string& root, std::int64_t id, const WatchOptions& options);
  // Once this has returned, nothing more is delivered for `id` (from a handler: once it returns).
  void Remove(std::int64_t id);

 protected:
  // The worker's loop: returns once Wake() was called or the channel broke.
  virtual void Run() = 0;
  // Makes Run() return soon; may be called from any thread, the worker's included.
  virtual void Wake() = 0;
  virtual std::error_code AddWatch(const std::string& root, std::int64_t id, const WatchOptions& options) = 0;
  virtual void RemoveWatch(std::int64_t id) = 0;

  // Hands the reports over in order, with no lock held: those of removed watches are
  // dropped, and nothing more goes out once the monitor is being destroyed.
  void Deliver(Deliveries& deliveries);
  bool StopRequested() const { return stopRequested_; }
  // Called by Run() when its loop has ended, before it reports why.
  void LoopEnded() { stopped_ = true; }
  // A failed add, told at once on the calling thread.
  void ReportNow(const std::string& text) const { handlers_.errorText(text); }
  // Whether directories left out by the watch limit go to a handler of their own.
  bool HearsLimits() const { return static_cast<bool>(handlers_.limitReached); }
  void ReportLimitNow(std::int64_t id, const std::string& path) const { handlers_.limitReached(id, path); }

 private:
  bool Listed(std::int64_t id);
  void DeliverOne(Delivery& delivery);

  const MonitorHandlers handlers_;
  std::atomic<bool> stopRequested_{false};
  std::atomic<bool> stopped_{false};
  std::mutex gateMutex_;  // over live_ and delivering_
  std::condition_variable deliveryEnded_;
  std::set<std::int64_t> live_;
  bool delivering_ = false;  // a handler runs for deliveringId_
  std::int64_t deliveringId_ = 0;
  std::thread worker_;
};

// This platform's backend, bound to its handlers; its worker is started by the caller. Null,
// with `errorText` set, when the notification channel cannot be created.
std::shared_ptr<MonitorBackend> CreateMonitorBackend(MonitorHandlers handlers, std::string& errorText);

// Report texts shared by the backends; the host's tools match on them.
extern const char kChannelNotCreated[];
extern const char kWorkerNotRunning[];
std::string CannotOpenDirectory(unsigned long error);
std::string NotADirectory(const std::string& path);

// The worker's channel broke: says so, then tells every watch, in the order given, that it
// stopped working.
void ReportChannelFailure(unsigned long error, const std::vector<std::int64_t>& ids, Deliveries& deliveries);

}  // namespace vexil
