// The queue between a pipe reader's thread and its one consumer: completed message
// bodies or error lines, with a wait that also ends when the reader has finished, and a
// bound on the memory it holds.
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <string>

namespace vexil {

class MessageQueue {
 public:
  enum class Wait { Taken, TimedOut, Finished, Interrupted };

  // Holds at most `byteLimit` bytes, counted by Footprint: nothing may drain the queue
  // for a long time (the host sends no request), so the oldest items give way.
  explicit MessageQueue(std::size_t byteLimit) : byteLimit_(byteLimit) {}

  // What an item costs: its allocation and its place in the queue.
  static std::size_t Footprint(const std::string& item) { return item.capacity() + sizeof(std::string); }

  // Appends `item`, dropping the oldest items until the queue fits its limit again; the
  // newest item is kept whatever its size.
  void Push(std::string item);
  // No more items will come: wakes every waiter so it need not sit out its limit.
  void Finish();
  std::size_t Size() const;
  // The Footprint of everything queued.
  std::size_t Bytes() const;
  bool TryPop(std::string& item);
  // Takes the front item, waiting up to `limit` for one. Finished means the queue is
  // empty and its producer has ended, so waiting longer cannot help. The first moments of
  // the wait are spent watching rather than sleeping: a quick server's reply then costs no
  // wake-up of the waiting thread.
  Wait WaitPop(std::string& item, std::chrono::milliseconds limit);
  // Ends the wait in progress, or else the next one, with Interrupted. Any thread.
  void Interrupt();

 private:
  bool TakeFront(std::string& item);
  // Under the lock: something a waiter looks for happened.
  void Signal();
  // Returns once something may have happened since `seen`, or after a short while.
  void Watch(unsigned seen, std::chrono::milliseconds limit) const;

  const std::size_t byteLimit_;
  mutable std::mutex mutex_;
  std::condition_variable ready_;
  std::deque<std::string> items_;
  std::size_t bytes_ = 0;
  bool finished_ = false;
  bool interrupted_ = false;
  std::atomic<unsigned> signals_{0};  // pushes, the finish and interruptions so far
};

}  // namespace vexil
