// A watcher task: its options and watched extensions, its directories, and the change
// handlers that trace a changed file and start its command.
#include "task/watcher_task.h"

#include <cctype>

#include "task/task_registry.h"

namespace LSP {
namespace {

// The task whose event runs on this thread, if any.
thread_local const WatcherTask* eventOf = nullptr;

// Extensions are compared in lower case, as the host adds them.
std::string LowerCase(std::string text) {
  for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

}  // namespace

WatcherTask::WatcherTask(const std::string& name, const xWatcherOptions& options,
                         const std::vector<std::string>& directories)
    : name_(name), options_(options), tracer_(options.trace, options.level) {
  tracer_.Verbose("\nWatcher Task: '%s'\n", name_.c_str());
  for (const std::string& directory : directories) {
    directories_.push_back(std::make_unique<WatcherDirectory>(this, directory));
  }
}

WatcherTask::~WatcherTask() {
  // No handler may start a command once the commands are being destroyed.
  Stop();
  std::lock_guard<std::mutex> lock(commandsMutex_);
  commands_.clear();
}

void WatcherTask::AddExtension(const char* extension) {
  if (!extension) return;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    extensions_[extension] = true;
  }
  tracer_.Verbose("Watching Extension: %s\n", extension);
}

bool WatcherTask::IsFlagged() {
  std::lock_guard<std::mutex> lock(mutex_);
  return options_.flag;
}

const char* WatcherTask::Name() { return name_.c_str(); }

void WatcherTask::Enable() {
  std::lock_guard<std::mutex> lock(mutex_);
  options_.disabled = false;
}

void WatcherTask::Release() {
  if (RefusedInOwnEvent("Release")) return;
  Stop();
  vexil::UnregisterTask(this);
  delete this;
}

void WatcherTask::Start() {
  if (RefusedInOwnEvent("Start")) return;
  if (Options().disabled) {
    tracer_.Verbose("Watcher Task: '%s' => Ignoring disabled watcher.\n", name_.c_str());
    return;
  }
  tracer_.Verbose("Watcher Task: '%s' => Starting watcher.....\n", name_.c_str());
  for (auto& directory : directories_) directory->Start();
}

void WatcherTask::Stop() {
  if (RefusedInOwnEvent("Stop")) return;
  for (auto& directory : directories_) directory->Stop();
}

void WatcherTask::OnFileChanged(const std::string& path) {
  const vexil::xFileTags tags(path);
  const std::string extension = LowerCase(tags.EXT);
  if (!IsWatched(extension)) {
    tracer_.Verbose("Watcher Task: '%s' => Ignoring changes for File: %s  Extension: %s\n", name_.c_str(),
                    tags.FN.c_str(), extension.c_str());
    return;
  }
  const xWatcherOptions options = Options();
  TraceChanged(tags, options);
  RunCommand(tags, options);
}

void WatcherTask::OnFileAdded(const std::string& path) {
  const vexil::xFileTags tags(path);
  if (!IsWatched(LowerCase(tags.EXT))) return;
  TraceAdded(tags, Options());
  tracer_.Text(TraceType::Notice, name_.c_str(), "An onFileAdded event.\n");
}

WatcherTask::InEvent::InEvent(const WatcherTask* task) : outer_(eventOf) { eventOf = task; }

WatcherTask::InEvent::~InEvent() { eventOf = outer_; }

bool WatcherTask::RefusedInOwnEvent(const char* operation) {
  if (eventOf != this) return false;
  tracer_.Error("Watcher Task: '%s' => %s refused: called from the task's own callback, it would wait for itself.\n",
                name_.c_str(), operation);
  return true;
}

xWatcherOptions WatcherTask::Options() {
  std::lock_guard<std::mutex> lock(mutex_);
  return options_;
}

bool WatcherTask::IsWatched(const std::string& extension) {
  std::lock_guard<std::mutex> lock(mutex_);
  // Hosts add extensions with their dot or without it.
  const bool dotted = !extension.empty() && extension[0] == '.';
  return extensions_.count(extension) > 0 || (dotted && extensions_.count(extension.substr(1)) > 0);
}

void WatcherTask::TraceChanged(const vexil::xFileTags& tags, const xWatcherOptions& options) const {
  if (!tracer_.Verbose()) return;
  tracer_.Verbose("      Event: %s\n", "Changed");
  tracer_.Verbose("       Path: %s\n", tags.FN.c_str());
  tracer_.Verbose("  Full Name: %s\n", tags.FN.c_str());
  tracer_.Verbose("  Directory: %s\n", tags.FDD.c_str());
  tracer_.Verbose("  File Name: %s\n", tags.F.c_str());
  tracer_.Verbose("  Base Name: %s\n", tags.FB.c_str());
  tracer_.Verbose("  Extension: %s\n", tags.EXT.c_str());
  tracer_.Verbose(" UseCommand: %d\n", options.useCommand ? 1 : 0);
  tracer_.Verbose(" Executable: %s\n", options.executable.c_str());
  tracer_.Verbose("  Directory: %s\n", options.directory.c_str());
  tracer_.Verbose("  Arguments: %s\n", options.arguments.c_str());
}

void WatcherTask::TraceAdded(const vexil::xFileTags& tags, const xWatcherOptions& options) const {
  if (!tracer_.Verbose()) return;
  tracer_.Verbose("     Event: %s\n", "Added");
  tracer_.Verbose("      Path: %s\n", tags.FN.c_str());
  tracer_.Verbose("UseCommand: %d\n", options.useCommand ? 1 : 0);
  tracer_.Verbose("Executable: %s\n", options.executable.c_str());
  tracer_.Verbose(" Directory: %s\n", options.directory.c_str());
  tracer_.Verbose(" Arguments: %s\n", options.arguments.c_str());
}

void WatcherTask::RunCommand(const vexil::xFileTags& tags, const xWatcherOptions& options) {
  auto event = std::make_unique<vexil::xWatcherEvent>(name_, tags, options);
  event->Start();
  // Only commands still waited for stay; the others are destroyed after the lock is
  // released, so other directories' handlers do not wait for them.
  std::vector<std::unique_ptr<vexil::xWatcherEvent>> finished;
  std::lock_guard<std::mutex> lock(commandsMutex_);
  commands_.emplace(tags.FN, std::move(event));
  for (auto entry = commands_.begin(); entry != commands_.end();) {
    if (!entry->second->Finished()) {
      ++entry;
      continue;
    }
    finished.push_back(std::move(entry->second));
    entry = commands_.erase(entry);
  }
}

}  // namespace LSP
