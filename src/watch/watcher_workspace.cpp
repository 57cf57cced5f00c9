// The workspace of the tree: projects by name, matched without regard to letter case; a
// second start of a known project adds its root as a further directory.
#include "watch/watcher_tree.h"

namespace LSP {

WatcherWorkspace::WatcherWorkspace(xChangeCallback change, TraceCallback trace, TraceLevel level)
    : change_(change), tracer_(trace, level) {}

WatcherWorkspace::~WatcherWorkspace() { Stop(); }

// The tree has no use for the host's user data: only the extended watcher hands it back.
void WatcherWorkspace::Start(const char* name, const char* root, const void* userData) {
  if (!CanWatch(tracer_, change_)) return;
  const std::string directory = root ? root : "";
  if (!IsExistingDirectory(directory)) {
    tracer_.Verbose("Invalid Directory: '%s'\n", directory.c_str());
    return;
  }
  const std::string project = name ? name : "";
  tracer_.Verbose("Project: %s Directory: %s\n", project.c_str(), directory.c_str());
  auto& entry = projects_[project];
  if (!entry)
    entry = std::make_unique<WatcherProject>(project.c_str(), directory.c_str(), change_,
                                             tracer_.Callback(), tracer_.Level());
  entry->AddDirectory(directory.c_str());
}

void WatcherWorkspace::Stop() {
  for (auto& entry : projects_) entry.second->Stop();
  projects_.clear();
}

void WatcherWorkspace::AddDirectory(const char* name, const char* directory) {
  tracer_.Verbose("WatcherWorkspace::AddDirectory:\n");
  if (WatcherProject* project = Find(name)) project->AddDirectory(directory);
}

void WatcherWorkspace::RemoveDirectory(const char* name, const char* directory) {
  tracer_.Verbose("WatcherWorkspace::RemoveDirectory:\n");
  if (WatcherProject* project = Find(name)) project->RemoveDirectory(directory);
}

WatcherProject* WatcherWorkspace::Find(const char* name) {
  const auto found = projects_.find(name ? name : "");
  return found == projects_.end() ? nullptr : found->second.get();
}

}  // namespace LSP

xWatcherWorkspace* xWatcher_Workspace(xChangeCallback change, TraceCallback trace,
                                      LSP::TraceLevel level) {
  return new LSP::WatcherWorkspace(change, trace, level);
}
