// A mutex-guarded deque with one condition variable, signalled on every push and once
// more when the producer ends; pushes evict the oldest items past the byte limit.
#include "transport/message_queue.h"

namespace vexil {

void MessageQueue::Push(std::string item) {
  std::lock_guard<std::mutex> lock(mutex_);
  bytes_ += Footprint(item);
  items_.push_back(std::move(item));
  while (bytes_ > byteLimit_ && items_.size() > 1) {
    bytes_ -= Footprint(items_.front());
    items_.pop_front();
  }
  ready_.notify_one();
}

void MessageQueue::Finish() {
  std::lock_guard<std::mutex> lock(mutex_);
  finished_ = true;
  ready_.notify_all();
}

void MessageQueue::Interrupt() {
  std::lock_guard<std::mutex> lock(mutex_);
  interrupted_ = true;
  ready_.notify_all();
}

std::size_t MessageQueue::Size() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return items_.size();
}

bool MessageQueue::TryPop(std::string& item) {
  std::lock_guard<std::mutex> lock(mutex_);
  return TakeFront(item);
}

std::size_t MessageQueue::Bytes() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return bytes_;
}

MessageQueue::Wait MessageQueue::WaitPop(std::string& item, std::chrono::milliseconds limit) {
  std::unique_lock<std::mutex> lock(mutex_);
  ready_.wait_for(lock, limit, [this] { return !items_.empty() || finished_ || interrupted_; });
  if (interrupted_) {
    interrupted_ = false;
    return Wait::Interrupted;
  }
  if (TakeFront(item)) return Wait::Taken;
  return finished_ ? Wait::Finished : Wait::TimedOut;
}

bool MessageQueue::TakeFront(std::string& item) {
  if (items_.empty()) return false;
  bytes_ -= Footprint(items_.front());
  item = std::move(items_.front());
  items_.pop_front();
  return true;
}

}  // namespace vexil
