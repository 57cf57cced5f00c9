// A thread that runs one reader and is joined at most once, at the latest when it is
// destroyed, so no path can leave it running or join it twice.
#pragma once

#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>
#include <thread>

#include <Poco/Runnable.h>

namespace vexil {

class ReaderThread {
 public:
  ReaderThread() = default;
  ReaderThread(const ReaderThread&) = delete;
  ReaderThread& operator=(const ReaderThread&) = delete;
  ~ReaderThread() { Join(); }

  // `ended`, when given, is called on the thread once the body has returned.
  void Start(Poco::Runnable& body, std::function<void()> ended = {}) {
    Join();
    {
      std::lock_guard<std::mutex> lock(mutex_);
      ended_ = false;
    }
    thread_ = std::thread([this, &body, ended = std::move(ended)] {
      body.run();
      if (ended) ended();
      MarkEnded();
    });
  }

  // Returns at once when the thread never started or was joined before.
  void Join() {
    if (thread_.joinable()) thread_.join();
  }

  // Joins the thread if its body returns within `limit`; otherwise leaves it to a later
  // join and returns false. True at once when there is nothing to wait for.
  bool TryJoin(std::chrono::milliseconds limit) {
    if (!thread_.joinable()) return true;
    {
      std::unique_lock<std::mutex> lock(mutex_);
      if (!endedChanged_.wait_for(lock, limit, [this] { return ended_; })) return false;
    }
    thread_.join();
    return true;
  }

 private:
  void MarkEnded() {
    {
      std::lock_guard<std::mutex> lock(mutex_);
      ended_ = true;
    }
    endedChanged_.notify_all();
  }

  std::mutex mutex_;
  std::condition_variable endedChanged_;
  bool ended_ = false;
  std::thread thread_;
};

}  // namespace vexil
