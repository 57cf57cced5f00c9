// The waiting line of the command-line host, printed by a thread of its own so that the
// wait itself (often inside the library) needs no change.
#include "wait_notice.h"

#include <chrono>
#include <cstdio>

#include "host_process.h"

namespace cli {

WaitNotice::WaitNotice(const std::string& what) {
  if (!ErrorsToTerminal()) return;
  thread_ = std::thread([this, what] {
    std::unique_lock<std::mutex> lock(mutex_);
    if (!over_.wait_for(lock, std::chrono::seconds(1), [this] { return done_; })) {
      std::fprintf(stderr, "vexil: waiting for %s...\n", what.c_str());
    }
  });
}

WaitNotice::~WaitNotice() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    done_ = true;
  }
  over_.notify_all();
  if (thread_.joinable()) thread_.join();
}

}  // namespace cli
