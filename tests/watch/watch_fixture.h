// Real temporary directories and a thread-safe record of what watchers reported, with
// waits on conditions under generous deadlines instead of sleeps.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <mutex>
#include <string>
#include <system_error>
#include <thread>

#include "vexil_test/support.h"

namespace watchtest {

namespace fs = std::filesystem;

// Long enough that only a real loss or hang runs into it.
constexpr std::chrono::seconds kDeadline{30};

class TempDir : public vexil_test::TempDirectory {
 public:
  TempDir() : TempDirectory(vexil_test::MemoryBackedBase()) {}
};

inline void Touch(const std::string& path) { std::ofstream(path).put('x'); }

// Guards whatever a test collects from callbacks and lets the test thread wait on it.
class Shared {
 public:
  // Notifies under the lock: a waiter that returns may end the process, and a callback
  // thread must not touch this object after it could have.
  template <typename Change>
  void Update(Change change) {
    std::lock_guard<std::mutex> lock(mutex_);
    change();
    changed_.notify_all();
  }

  // True when `condition` held before the deadline.
  bool WaitUntil(const std::function<bool()>& condition,
                 std::chrono::milliseconds deadline = kDeadline) {
    std::unique_lock<std::mutex> lock(mutex_);
    return changed_.wait_for(lock, deadline, condition);
  }

  template <typename Reader>
  auto Read(Reader read) {
    std::lock_guard<std::mutex> lock(mutex_);
    return read();
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
};

// Runs `work` on its own thread; false when it has not returned within the deadline (a
// hang), in which case the thread is abandoned so the test can fail instead of blocking.
inline bool ReturnsWithin(std::chrono::seconds deadline, std::function<void()> work) {
  auto done = std::make_shared<Shared>();
  auto finished = std::make_shared<bool>(false);
  std::thread([work, done, finished] {
    work();
    done->Update([&] { *finished = true; });
  }).detach();
  return done->WaitUntil([&] { return *finished; }, deadline);
}

}  // namespace watchtest
