// The show-case behind `make demo`: real servers over the example projects and a watcher
// over a temporary directory, each step checked, with a short account on stdout.
#pragma once

#include <chrono>
#include <filesystem>
#include <stdexcept>
#include <random>
#include <string>

#include "actions.h"

namespace cli {

// A step that did not give what it should; its text is the one-line explanation.
class DemoFailure : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// Prints one step of the account: what was done, and what came of it.
void Report(const std::string& what, const std::string& result);
// Throws DemoFailure with `explanation` unless `condition` holds.
void Expect(bool condition, const std::string& explanation);
// Seconds since `start`, as "0.42 s".
std::string Elapsed(std::chrono::steady_clock::time_point start);

// The one-based position of `offset` bytes into the first `needle` in `path`.
Action At(ActionKind kind, const std::string& path, const std::string& needle, std::size_t offset);
// The one-based line of the first `needle` in `path`, 0 when absent.
int LineOf(const std::string& path, const std::string& needle);

// A directory of its own below the system's temporary one, removed again on the way out.
class TemporaryDirectory {
 public:
  TemporaryDirectory() {
    std::random_device random;
    path_ = std::filesystem::temp_directory_path() / ("vexil-demo-" + std::to_string(random()));
    std::filesystem::create_directories(path_);
  }
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;
  ~TemporaryDirectory() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  const std::filesystem::path& Path() const { return path_; }

 private:
  std::filesystem::path path_;
};

void DemoClangd(const std::string& examples);
void DemoPylsp(const std::string& examples);
void DemoWatcher();
void DemoTask();

}  // namespace cli
