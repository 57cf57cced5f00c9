// A mutex-guarded deque with one condition variable, signalled on every push and once
// more when the producer ends; pushes evict the oldest items past the byte limit.
#include "transport/message_queue.h"

#include <thread>

namespace vexil {
namespace {

// Long enough for a short request's reply from a server that answers at once, short
// enough that a slower reply costs a negligible amount of processor time.
constexpr std::chrono::microseconds kWatchTime{100};

}  // namespace

void MessageQueue::Signal() {
  signals_.fetch_add(1, std::memory_order_release);
  ready_.notify_all();
}

void MessageQueue::Watch(unsigned seen, std::chrono::milliseconds limit) const {
  const auto end = std::chrono::steady_clock::now() + std::min<std::chrono::microseconds>(kWatchTime, limit);
  // Yielding lets the reader's thread run on this core when the machine is busy.
  while (signals_.load(std::memory_order_acquire) == seen && std::chrono::steady_clock::now() < end)
    std::this_thread::yield();
}

void MessageQueue::Push(std::string item) {
  std::lock_guard<std::mutex> lock(mutex_);
  bytes_ += Footprint(item);
  items_.push_back(std::move(item));
  while (bytes_ > byteLimit_ && items_.size() > 1) {
    bytes_ -= Footprint(items_.front());
    items_.pop_front();
  }
  Signal();
}

void MessageQueue::Finish() {
  std::lock_guard<std::mutex> lock(mutex_);
  finished_ = true;
  Signal();
}

void MessageQueue::Interrupt() {
  std::lock_guard<std::mutex> lock(mutex_);
  interrupted_ = true;
  Signal();
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
  if (items_.empty() && !finished_ && !interrupted_) {
    const unsigned seen = signals_.load(std::memory_order_relaxed);
    lock.unlock();
    Watch(seen, limit);
    lock.lock();
  }
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
