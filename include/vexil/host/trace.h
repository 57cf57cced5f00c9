// Trace lines for the host: their kinds and levels, and the process-wide trace queue
// that any thread of the library may fill and the host drains at its own pace.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <mutex>
#include <string>

#include "vexil/export.h"

// Kind of a trace line. Ordinary lines are Line (1); the event notices of watcher
// tasks and commands are Notice (0), titled with the task's name.
enum class TraceType : std::int32_t { Notice = 0, Line = 1 };

namespace LSP {
// How much a subsystem reports: Messages adds protocol traffic, Verbose adds details.
enum class TraceLevel : std::int32_t { Off = 0, Messages = 1, Verbose = 2 };
}  // namespace LSP

// The host's trace callback: kind, title ("Verbose", "Message", "Error") and text.
using TraceCallback = void (*)(TraceType type, const char* title, const char* text);

// The protocol's "trace" value for a level: "off", "messages", "verbose", or "" for others.
VEXIL_API std::string TraceToString(LSP::TraceLevel level);

// A first-in first-out queue of values shared between threads. The library pushes;
// the host pops, without waiting or with a wait.
template <typename T>
class SafeQueue {
 public:
  void Push(T item) {
    std::lock_guard<std::mutex> lock(mutex_);
    queue_.push_back(std::move(item));
    ready_.notify_one();
  }

  bool TryPop(T& item) {
    std::lock_guard<std::mutex> lock(mutex_);
    return TakeFront(item);
  }

  // Waits up to `timeout` for an item; false when none arrived in time.
  template <typename Rep, typename Period>
  bool WaitPop(T& item, std::chrono::duration<Rep, Period> timeout) {
    std::unique_lock<std::mutex> lock(mutex_);
    ready_.wait_for(lock, timeout, [this] { return !queue_.empty(); });
    return TakeFront(item);
  }

  T WaitPop() {
    std::unique_lock<std::mutex> lock(mutex_);
    ready_.wait(lock, [this] { return !queue_.empty(); });
    T item = std::move(queue_.front());
    queue_.pop_front();
    return item;
  }

  std::size_t Size() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return queue_.size();
  }

  bool Empty() const { return Size() == 0; }

 private:
  bool TakeFront(T& item) {
    if (queue_.empty()) return false;
    item = std::move(queue_.front());
    queue_.pop_front();
    return true;
  }

  mutable std::mutex mutex_;
  std::condition_variable ready_;
  std::deque<T> queue_;
};

// One trace line as kept in the queue. `context` is left empty by the library.
class VEXIL_API xTraceEvent {
 public:
  xTraceEvent() = default;
  // `title` and `message` must not be null; a non-empty `detail` follows the message
  // after one line feed.
  xTraceEvent(TraceType type, const char* title, const char* message, const char* detail);

  TraceType type = TraceType::Line;
  std::string context;
  std::string title;
  std::string text;

  static SafeQueue<xTraceEvent>& queue();
  // Appends one line to the queue and wakes one waiting host thread.
  static void Write(TraceType type, const char* title, const char* message, const char* detail);

 private:
  static SafeQueue<xTraceEvent> m_watcherQueue;
};
