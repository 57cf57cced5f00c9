// One project of the workspace tree: its root folder and the further directories the host
// adds, each checked to exist, refused when already present, and traced.
#include <Poco/Exception.h>
#include <Poco/File.h>

#include "watch/watcher_tree.h"

namespace LSP {

bool CanWatch(const vexil::Tracer& tracer, xChangeCallback change) {
  if (tracer.Callback() && change) return true;
  tracer.Verbose("Invalid tracing.");
  return false;
}

bool IsExistingDirectory(const std::string& path) {
  if (path.empty()) return false;  // Poco asserts on an empty path
  try {
    const Poco::File file(path);
    return file.exists() && file.isDirectory();
  } catch (const Poco::Exception&) {
    return false;  // unreadable counts as missing
  }
}

WatcherProject::WatcherProject(const char* name, const char* root, xChangeCallback change,
                               TraceCallback trace, TraceLevel level)
    : change_(change),
      tracer_(trace, level),
      name_(name ? name : ""),
      root_(root ? root : "") {}

void WatcherProject::Start() {
  tracer_.Verbose("WatcherProject::Start:\n");
  Stop();
  if (!CanWatch(tracer_, change_)) return;
  if (!IsExistingDirectory(root_)) {
    tracer_.Verbose("Invalid Directory: '%s'\n", root_.c_str());
    return;
  }
  tracer_.Verbose("Project: %s Directory: %s\n", name_.c_str(), root_.c_str());
  folders_[root_] = std::make_unique<WatcherFolder>(root_, tracer_.Callback(), tracer_.Level());
}

void WatcherProject::Stop() {
  tracer_.Verbose("WatcherProject::Stop:\n");
  folders_.clear();
}

void WatcherProject::AddDirectory(const char* directory) {
  tracer_.Verbose("WatcherProject::AddDirectory:\n");
  if (!CanWatch(tracer_, change_)) return;
  const std::string path = directory ? directory : "";
  if (!IsExistingDirectory(path)) {
    tracer_.Verbose("Ignoring Invalid Directory: '%s'\n", path.c_str());
    return;
  }
  if (folders_.count(path)) {
    tracer_.Verbose("Ignoring duplicate directory: '%s'\n", path.c_str());
    return;
  }
  folders_[path] = std::make_unique<WatcherFolder>(path, tracer_.Callback(), tracer_.Level());
}

void WatcherProject::RemoveDirectory(const char* directory) {
  tracer_.Verbose("WatcherProject::RemoveDirectory: %s\n", directory ? directory : "");
  for (auto& [path, folder] : folders_) {
    if (!folder->IsYou(directory)) continue;
    folder->Stop();
    folders_.erase(directory);
    return;
  }
}

}  // namespace LSP
