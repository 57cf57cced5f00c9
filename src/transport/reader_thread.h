// A thread that runs one reader and is joined at most once, at the latest when it is
// destroyed, so no path can leave it running or join it twice.
#pragma once

#include <thread>

#include <Poco/Runnable.h>

namespace vexil {

class ReaderThread {
 public:
  ReaderThread() = default;
  ReaderThread(const ReaderThread&) = delete;
  ReaderThread& operator=(const ReaderThread&) = delete;
  ~ReaderThread() { Join(); }

  void Start(Poco::Runnable& body) {
    Join();
    thread_ = std::thread([&body] { body.run(); });
  }

  // Returns at once when the thread never started or was joined before.
  void Join() {
    if (thread_.joinable()) thread_.join();
  }

 private:
  std::thread thread_;
};

}  // namespace vexil
