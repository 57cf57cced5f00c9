// The task registry and the two exports that create and find tasks by name. The host's
// trace callback is never called under the registry's lock, so it may call back in.
#include "task/task_registry.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>

#include "host/trace_line.h"
#include "task/watcher_task.h"

namespace vexil {
namespace {

struct Registry {
  std::mutex mutex;
  std::map<std::string, xWatcherTask*> tasks;
};

Registry& Tasks() {
  static Registry registry;
  return registry;
}

std::string Key(const char* name) { return name ? name : ""; }

// The task registered under `name`, or null.
xWatcherTask* Find(const std::string& name) {
  std::lock_guard<std::mutex> lock(Tasks().mutex);
  const auto found = Tasks().tasks.find(name);
  return found == Tasks().tasks.end() ? nullptr : found->second;
}

// Registers `task` unless another thread registered the name first; returns the
// registered task, and destroys `task` when it lost.
xWatcherTask* Register(const std::string& name, std::unique_ptr<xWatcherTask> task) {
  std::lock_guard<std::mutex> lock(Tasks().mutex);
  const auto entry = Tasks().tasks.emplace(name, task.get());
  if (entry.second) task.release();
  return entry.first->second;
}

}  // namespace

void UnregisterTask(const xWatcherTask* task) {
  std::lock_guard<std::mutex> lock(Tasks().mutex);
  for (auto entry = Tasks().tasks.begin(); entry != Tasks().tasks.end(); ++entry) {
    if (entry->second != task) continue;
    Tasks().tasks.erase(entry);
    return;
  }
}

}  // namespace vexil

xWatcherTask* xWatcher_Task(const char* name, const xWatcherOptions& options,
                            const std::vector<std::string>& directories) {
  const vexil::Tracer tracer(options.trace, options.level);
  const std::string key = vexil::Key(name);
  if (directories.empty()) {
    tracer.Verbose("Ignoring '%s' watcher as directories found did not contain file with watched extensions.\n",
                   key.c_str());
    return nullptr;
  }
  // A second task under one name would leave the first watching with nobody to release it.
  if (xWatcherTask* existing = vexil::Find(key)) return existing;
  try {
    return vexil::Register(key, std::make_unique<LSP::WatcherTask>(key, options, directories));
  } catch (const std::exception&) {
    tracer.Verbose("Unexpected error creating watcher task.\n");
    return nullptr;
  }
}

xWatcherTask* xWatcher_Have(const char* name) { return vexil::Find(vexil::Key(name)); }
