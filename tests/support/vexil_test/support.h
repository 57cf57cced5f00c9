// Portable helpers for tests: a temporary directory removed with its contents, control
// over processes a test started (the library itself never kills a child), polling, waiting
// on what callbacks collect, reading a file, framing.
#pragma once

#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <mutex>
#include <string>
#include <thread>

namespace vexil_test {

class TempDirectory {
 public:
  // A new, empty directory under `base` (the system's temporary directory when empty).
  explicit TempDirectory(const std::filesystem::path& base = {});
  ~TempDirectory();
  TempDirectory(const TempDirectory&) = delete;
  TempDirectory& operator=(const TempDirectory&) = delete;

  const std::filesystem::path& Path() const { return path_; }
  std::string operator/(const std::string& relative) const { return (path_ / relative).string(); }

 private:
  std::filesystem::path path_;
};

// /dev/shm where it exists, else empty (the system's temporary directory): in memory,
// creating files is fast enough to expose a watcher's races and not hide its cost.
std::filesystem::path MemoryBackedBase();

// Ends the process `id` at once, as a crash would.
void KillProcess(int id);
// Whether the process `id` still exists (an exited but unreaped child counts as existing).
bool ProcessExists(int id);

// Polls `condition` until it holds or `limit` has passed; says whether it held. For states
// nothing signals, such as a thread's end or a process's.
inline bool WaitFor(const std::function<bool()>& condition,
                    std::chrono::milliseconds limit = std::chrono::seconds(30)) {
  const auto deadline = std::chrono::steady_clock::now() + limit;
  while (!condition()) {
    if (std::chrono::steady_clock::now() > deadline) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  return true;
}

// The bytes of the file at `path`; empty when it cannot be read.
inline std::string ReadFile(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(file), {});
}

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
                 std::chrono::milliseconds deadline = std::chrono::seconds(30)) {
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

// `body` as a server frames it on the wire.
inline std::string Frame(const std::string& body) {
  return "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

}  // namespace vexil_test
