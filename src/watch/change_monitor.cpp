// The platform-independent part of the change monitor: the worker's life, the hand-over of
// reports outside the lock, the batching of one read, and the report texts backends share.
#include "watch/change_monitor.h"

#include <utility>

#include "watch/monitor_backend.h"

namespace vexil {

const char kChannelNotCreated[] = "Error when creating IOCP.\n";
const char kWorkerNotRunning[] = "Watcher thread is not running.\n";

namespace {

// The backend whose worker runs on this thread, if any.
thread_local const MonitorBackend* workerOf = nullptr;

}  // namespace

std::string CannotOpenDirectory(unsigned long error) {
  return "Cannot create directory handle: " + std::to_string(error) + "\n";
}

std::string NotADirectory(const std::string& path) {
  return "Path provided is not a directory: " + path + "\n";
}

void ReportChannelFailure(unsigned long error, const std::vector<std::int64_t>& ids, Deliveries& deliveries) {
  deliveries.push_back({Delivery::Kind::Text, 0, {},
                        "IOCP channel has failed with error code: " + std::to_string(error) + "\n"});
  for (std::int64_t id : ids) deliveries.push_back({Delivery::Kind::WatchError, id, {}, {}});
}

void BatchList::Add(std::string name, unsigned action) {
  if (!open_) batches_.emplace_back();
  open_ = true;
  batches_.back().emplace(std::move(name), action);
}

void BatchList::AddRename(std::string from, std::string to) {
  batches_.push_back({{std::move(from), kActionRenamedOld}, {std::move(to), kActionRenamedNew}});
  open_ = false;
}

void BatchList::MoveInto(std::int64_t id, Deliveries& deliveries) {
  for (ChangeBatch& batch : batches_) deliveries.push_back({Delivery::Kind::Batch, id, std::move(batch), {}});
  batches_.clear();
  open_ = false;
}

void MonitorBackend::StartWorker() {
  // The worker keeps its backend: a handler that destroys the monitor returns into it.
  worker_ = std::thread([self = shared_from_this()] {
    workerOf = self.get();
    self->Run();
    self->stopped_ = true;
  });
}

void MonitorBackend::Stop() {
  stopRequested_ = true;
  Wake();
  if (!worker_.joinable()) return;
  if (OnWorker()) {
    worker_.detach();  // it cannot wait for itself; it ends when the handler returns
  } else {
    worker_.join();
  }
}

bool MonitorBackend::OnWorker() const { return workerOf == this; }

std::error_code MonitorBackend::Add(const std::string& root, std::int64_t id, const WatchOptions& options) {
  {
    // Listed first, so that the watch's first changes are not taken for a removed watch's.
    std::lock_guard<std::mutex> lock(gateMutex_);
    live_.insert(id);
  }
  const std::error_code failure = AddWatch(root, id, options);
  if (failure) {
    std::lock_guard<std::mutex> lock(gateMutex_);
    live_.erase(id);
  }
  return failure;
}

void MonitorBackend::Remove(std::int64_t id) {
  RemoveWatch(id);
  std::unique_lock<std::mutex> lock(gateMutex_);
  live_.erase(id);
  if (OnWorker()) return;
  deliveryEnded_.wait(lock, [&] { return !delivering_ || deliveringId_ != id; });
}

void MonitorBackend::Deliver(Deliveries& deliveries) {
  for (Delivery& delivery : deliveries) {
    if (stopRequested_) return;
    DeliverOne(delivery);
  }
}

void MonitorBackend::DeliverOne(Delivery& delivery) {
  if (delivery.kind == Delivery::Kind::Text) return handlers_.errorText(delivery.text);
  if (!Listed(delivery.id)) return;
  if (delivery.kind == Delivery::Kind::Batch) {
    handlers_.event(delivery.id, delivery.batch);
  } else if (delivery.kind == Delivery::Kind::Limit) {
    handlers_.limitReached(delivery.id, delivery.text);
  } else {
    handlers_.watchError(delivery.id);
  }
  {
    std::lock_guard<std::mutex> lock(gateMutex_);
    delivering_ = false;
  }
  deliveryEnded_.notify_all();
}

bool MonitorBackend::Listed(std::int64_t id) {
  std::lock_guard<std::mutex> lock(gateMutex_);
  if (!live_.count(id)) return false;
  delivering_ = true;
  deliveringId_ = id;
  return true;
}

ChangeMonitor::ChangeMonitor(MonitorHandlers handlers) : reportAddFailure_(handlers.errorText) {
  backend_ = CreateMonitorBackend(std::move(handlers), errorText_);
  if (backend_) backend_->StartWorker();
}

ChangeMonitor::~ChangeMonitor() {
  if (backend_) backend_->Stop();
}

bool ChangeMonitor::AddWatch(const std::string& root, std::int64_t id, const WatchOptions& options,
                             std::error_code* failure) {
  std::error_code error;
  if (!backend_ || !backend_->Running()) {
    errorText_ = kWorkerNotRunning;
    reportAddFailure_(errorText_);
    error = std::make_error_code(std::errc::operation_canceled);
  } else {
    error = backend_->Add(root, id, options);
  }
  if (failure) *failure = error;
  return !error;
}

void ChangeMonitor::RemoveWatch(std::int64_t id) {
  if (backend_) backend_->Remove(id);
}

bool ChangeMonitor::InHandler() const { return backend_ && backend_->OnWorker(); }

}  // namespace vexil
