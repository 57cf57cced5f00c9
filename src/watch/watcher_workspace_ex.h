// The extended workspace watcher: one change monitor, one watch per started project, and
// the translation of the monitor's batches into the host's change events.
#pragma once

#include <atomic>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>

#include "host/trace_line.h"
#include "vexil/watch/watcher_ex.h"
#include "watch/change_monitor.h"

namespace LSP {

class WatcherProjectEx : public xWatcherProjectEx {
 public:
  WatcherProjectEx(const char* name, const char* root, const void* userData);

  const char* Name() override { return name_.c_str(); }
  const char* Root() override { return root_.c_str(); }
  const void* UserData() override { return userData_; }

 private:
  std::string name_;
  std::string root_;
  const void* userData_;  // the host's, never dereferenced
};

class WatcherWorkspaceEx : public xWatcherWorkspaceEx {
 public:
  WatcherWorkspaceEx(xChangeCallback change, TraceCallback trace, TraceLevel level);
  // Forgets the projects, then stops the monitor: no callback runs once this has returned.
  // Called from one of its own callbacks, it reports that, and the monitor's worker ends
  // when the callback returns instead of being joined.
  ~WatcherWorkspaceEx() override;

  void Start(const char* name, const char* root, const void* userData) override;
  void Stop() override {}
  void Stop(const char* name) override {}

 protected:
  void OnEvent(std::int64_t id, const vexil::ChangeBatch& batch);
  void OnError(std::int64_t id);
  void OnError(const std::string& message);

 private:
  WatcherProjectEx* FindProject(std::int64_t id);

  std::atomic<std::int64_t> lastId_{0};
  xChangeCallback change_;
  // Read by the handlers after each host callback, which may have destroyed this object;
  // a handler keeps its own reference.
  std::shared_ptr<std::atomic<bool>> alive_ = std::make_shared<std::atomic<bool>>(true);
  vexil::Tracer tracer_;
  // Written by Start on the host's thread, read by OnEvent on the monitor's thread.
  std::mutex projectsLock_;
  std::map<std::int64_t, std::unique_ptr<WatcherProjectEx>> projects_;
  // Last, so that its worker is gone before anything it calls back into.
  std::unique_ptr<vexil::ChangeMonitor> monitor_;
};

}  // namespace LSP
