// How a watcher task hears of its directories, one platform's facility behind one interface:
// files whose content changed and files that appeared, in the directory itself, not below.
#pragma once

#include <functional>
#include <memory>
#include <string>

namespace vexil {

// Called on the platform watcher's thread with the file's full path (the directory, a
// separator, the name), or with the reason the directory cannot be watched any more.
struct DirectoryEvents {
  std::function<void(const std::string& path)> changed;
  std::function<void(const std::string& path)> added;
  // Watching goes on, but the system dropped changes it could not keep up with.
  std::function<void()> lost;
  std::function<void(const std::string& reason)> failed;
};

class DirectoryWatch {
 public:
  // Once it has returned, no event of this watch runs any more (unless it is destroyed from
  // one of them, which then finishes first).
  virtual ~DirectoryWatch() = default;
};

// Starts watching `directory`. Null, with `reason` in the system's words, when it cannot.
std::unique_ptr<DirectoryWatch> WatchTaskDirectory(const std::string& directory, DirectoryEvents events,
                                                   std::string& reason);

}  // namespace vexil
