// Temporary directories with unique names, created atomically and removed with everything
// inside when the test is done.
#include <random>
#include <stdexcept>
#include <system_error>

#include "vexil_test/support.h"

namespace vexil_test {

TempDirectory::TempDirectory(const std::filesystem::path& base) {
  const std::filesystem::path parent = base.empty() ? std::filesystem::temp_directory_path() : base;
  std::random_device seed;
  std::mt19937_64 random(seed());
  for (int attempt = 0; attempt < 100; ++attempt) {
    std::filesystem::path candidate = parent / ("vexil-test-" + std::to_string(random() % 1000000000ULL));
    if (std::filesystem::create_directory(candidate)) {
      path_ = candidate;
      return;
    }
  }
  throw std::runtime_error("cannot create a temporary directory under " + parent.string());
}

std::filesystem::path MemoryBackedBase() {
  std::error_code error;
  return std::filesystem::is_directory("/dev/shm", error) ? std::filesystem::path("/dev/shm") : std::filesystem::path();
}

TempDirectory::~TempDirectory() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

}  // namespace vexil_test
