// Real temporary directories in memory for the watchers, files made in them, and a wait
// that tells a call that hangs from one that returns.
#pragma once

#include <chrono>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
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

using vexil_test::Shared;

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
