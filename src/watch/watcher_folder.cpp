// One folder of a watched project: it knows its own path and answers, without regard to
// letter case, whether a directory is its own.
#include "watch/watcher_tree.h"

namespace LSP {

WatcherFolder::WatcherFolder(const std::string& directory, TraceCallback trace, TraceLevel level)
    : tracer_(trace, level) {
  tracer_.Verbose("WatcherFolder::CreateWatcher: %s\n", directory.c_str());
  path_ = directory;
}

void WatcherFolder::Stop() { tracer_.Verbose("WatcherFolder::Stop: %s\n", path_.c_str()); }

bool WatcherFolder::IsYou(const char* directory) {
  return directory && vexil::CompareNoCase(path_.c_str(), directory) == 0;
}

xWatcherFolder* WatcherFolder::FindFolder(const char* directory) {
  tracer_.Verbose("WatcherFolder::FindFolder: %s\n", directory ? directory : "");
  return IsYou(directory) ? this : nullptr;
}

}  // namespace LSP
