// The queue between a pipe reader's thread and its one consumer: completed message
// bodies or error lines, with a wait that also ends when the reader has finished.
#pragma once

#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <string>

namespace vexil {

class MessageQueue {
 public:
  enum class Wait { Taken, TimedOut, Finished };

  void Push(std::string item);
  // No more items will come: wakes every waiter so it need not sit out its limit.
  void Finish();
  std::size_t Size() const;
  bool TryPop(std::string& item);
  // Takes the front item, waiting up to `limit` for one. Finished means the queue is
  // empty and its producer has ended, so waiting longer cannot help.
  Wait WaitPop(std::string& item, std::chrono::milliseconds limit);

 private:
  bool TakeFront(std::string& item);

  mutable std::mutex mutex_;
  std::condition_variable ready_;
  std::deque<std::string> items_;
  bool finished_ = false;
};

}  // namespace vexil
