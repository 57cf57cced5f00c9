// The background collector of abandoned children: one thread, started on demand, that
// looks at its children a few times a second and ends when none is left.
#include "transport/child_reaper.h"

#include <sys/wait.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

namespace vexil {
namespace {

// Children are rarely abandoned and a zombie costs only a table slot, so a slow look
// is enough; the wait is cut short when the library is unloaded.
constexpr std::chrono::milliseconds kLookInterval{250};

// True once `pid` has ended and been collected, or can no longer be waited for.
bool Collected(pid_t pid) {
  int status = 0;
  pid_t answer;
  do {
    answer = waitpid(pid, &status, WNOHANG);
  } while (answer < 0 && errno == EINTR);
  return answer != 0;
}

class ChildReaper {
 public:
  ChildReaper() = default;
  ChildReaper(const ChildReaper&) = delete;
  ChildReaper& operator=(const ChildReaper&) = delete;

  ~ChildReaper() {
    {
      std::lock_guard<std::mutex> lock(mutex_);
      stopping_ = true;
    }
    wake_.notify_all();
    if (thread_.joinable()) thread_.join();
  }

  void Adopt(pid_t pid) {
    std::lock_guard<std::mutex> lock(mutex_);
    children_.push_back(pid);
    if (running_ || stopping_) return;
    // The last thread has left its loop and takes the lock no more, so joining it here
    // cannot wait on us.
    if (thread_.joinable()) thread_.join();
    running_ = true;
    thread_ = std::thread([this] { Run(); });
  }

 private:
  void Run() {
    std::unique_lock<std::mutex> lock(mutex_);
    for (;;) {
      children_.erase(std::remove_if(children_.begin(), children_.end(), Collected), children_.end());
      if (children_.empty() || stopping_) break;
      wake_.wait_for(lock, kLookInterval, [this] { return stopping_; });
    }
    running_ = false;
  }

  std::mutex mutex_;
  std::condition_variable wake_;
  std::vector<pid_t> children_;
  bool running_ = false;
  bool stopping_ = false;
  std::thread thread_;
};

ChildReaper& Reaper() {
  static ChildReaper reaper;
  return reaper;
}

}  // namespace

void ReapInBackground(pid_t pid) { Reaper().Adopt(pid); }

}  // namespace vexil
