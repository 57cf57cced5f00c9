// Starts one monitor watch per project and turns each batch into change events for the
// host: rename halves are paired within a batch, and failures become "Error" trace lines.
#include "watch/watcher_workspace_ex.h"

#include <utility>

namespace LSP {
namespace {

// The "no longer operating" line has always been cut at this size.
constexpr std::size_t kWatchErrorLineSize = 512;

constexpr char kDestroyedInCallback[] =
    "WatcherWorkspaceEx destroyed from inside its own callback: watching has stopped, without waiting for that "
    "callback to return.\n";

const char* TextOrEmpty(const char* text) { return text ? text : ""; }

}  // namespace

WatcherProjectEx::WatcherProjectEx(const char* name, const char* root, const void* userData)
    : name_(TextOrEmpty(name)), root_(TextOrEmpty(root)), userData_(userData) {}

WatcherWorkspaceEx::WatcherWorkspaceEx(xChangeCallback change, TraceCallback trace, TraceLevel level)
    : change_(change), tracer_(trace, level) {
  monitor_ = std::make_unique<vexil::ChangeMonitor>(vexil::MonitorHandlers{
      [this](std::int64_t id, const vexil::ChangeBatch& batch) { OnEvent(id, batch); },
      [this](std::int64_t id) { OnError(id); },
      [this](const std::string& message) { OnError(message); }});
  if (!monitor_->ErrorText().empty()) OnError(monitor_->ErrorText());
}

WatcherWorkspaceEx::~WatcherWorkspaceEx() {
  *alive_ = false;
  // The worker cannot wait for itself; the handler it returns into sees that this is gone.
  if (monitor_->InHandler()) tracer_.Text(TraceType::Line, "Error", kDestroyedInCallback);
  std::map<std::int64_t, std::unique_ptr<WatcherProjectEx>> projects;
  {
    std::lock_guard<std::mutex> lock(projectsLock_);
    projects.swap(projects_);
  }
  // The worker may still hold a project it found before the swap; it is freed after the join.
  monitor_.reset();
}

void WatcherWorkspaceEx::Start(const char* name, const char* root, const void* userData) {
  name = TextOrEmpty(name);
  root = TextOrEmpty(root);
  tracer_.Verbose("WatcherWorkspace::Start - Project: %s  Directory: %s\n", name, root);
  const std::int64_t id = ++lastId_;
  // Listed before the watch exists, so that its first changes find their project.
  {
    std::lock_guard<std::mutex> lock(projectsLock_);
    projects_[id] = std::make_unique<WatcherProjectEx>(name, root, userData);
  }
  if (monitor_->AddWatch(root, id)) {
    tracer_.Verbose("Watcher started on ID: %d\n", static_cast<int>(static_cast<std::uint32_t>(id)));
    return;
  }
  {
    std::lock_guard<std::mutex> lock(projectsLock_);
    projects_.erase(id);
  }
  tracer_.Verbose("Failed to start watcher.\n");
}

WatcherProjectEx* WatcherWorkspaceEx::FindProject(std::int64_t id) {
  std::lock_guard<std::mutex> lock(projectsLock_);
  const auto found = projects_.find(id);
  return found == projects_.end() ? nullptr : found->second.get();
}

void WatcherWorkspaceEx::OnEvent(std::int64_t id, const vexil::ChangeBatch& batch) {
  // The host may destroy this object from either callback: nothing of it is touched after
  // one that did.
  const auto alive = alive_;
  std::string pendingOld;
  std::string pendingNew;
  for (const auto& [name, action] : batch) {
    WatcherProjectEx* project = FindProject(id);
    if (!project) continue;
    xChangeEvent event(name, action);
    tracer_.Verbose("Id: %lld  Project: %s  Directory: %s\n", static_cast<long long>(id),
                    project->Name(), name.c_str());
    if (!*alive) return;
    if (event.type == 2) {
      (action == vexil::kActionRenamedOld ? pendingOld : pendingNew) = name;
      if (pendingOld.empty() || pendingNew.empty()) continue;
      event.name = std::exchange(pendingOld, std::string());
      event.newName = std::exchange(pendingNew, std::string());
    }
    change_(project, &event);
    if (!*alive) return;
  }
}

void WatcherWorkspaceEx::OnError(std::int64_t id) {
  vexil::TraceFormatted(tracer_.Callback(), TraceType::Line, "Error", kWatchErrorLineSize,
                        "Watcher: %lld no longer operating.\n", static_cast<long long>(id));
}

void WatcherWorkspaceEx::OnError(const std::string& message) {
  tracer_.Text(TraceType::Line, "Error", message.c_str());
}

}  // namespace LSP

xWatcherWorkspaceEx* xWatcher_WorkspaceEx(xChangeCallback change, TraceCallback trace,
                                          LSP::TraceLevel level) {
  return new LSP::WatcherWorkspaceEx(change, trace, level);
}
