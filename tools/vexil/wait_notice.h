// One line telling a person at a terminal what the command is waiting for, once the wait
// has lasted a second; nothing when stderr is no terminal or the wait ends sooner.
#pragma once

#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace cli {

class WaitNotice {
 public:
  // `what`, as in "vexil: waiting for clangd...".
  explicit WaitNotice(const std::string& what);
  WaitNotice(const WaitNotice&) = delete;
  WaitNotice& operator=(const WaitNotice&) = delete;
  // The wait is over.
  ~WaitNotice();

 private:
  std::mutex mutex_;
  std::condition_variable over_;
  bool done_ = false;
  std::thread thread_;
};

}  // namespace cli
