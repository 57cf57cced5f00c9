// The workspace → project → folder tree behind xWatcher_Workspace. It validates, dedupes
// and traces the directories the host names; it reports no changes (the extended watcher does).
#pragma once

// On Windows, Poco's headers bring in windows.h, whose RemoveDirectory macro would rename
// the tree's operation in some files and not in others: take it in first, then drop the macro.
#include <Poco/Foundation.h>
#undef RemoveDirectory

#include <map>
#include <memory>
#include <string>

#include "host/trace_line.h"
#include "vexil/watch/watcher.h"
#include "watch/no_case.h"

namespace LSP {

class WatcherFolder : public xWatcherFolder {
 public:
  WatcherFolder(const std::string& directory, TraceCallback trace, TraceLevel level);

  void Stop() override;
  bool IsYou(const char* directory) override;
  xWatcherFolder* FindFolder(const char* directory) override;

 private:
  std::string path_;
  vexil::Tracer tracer_;
};

class WatcherProject : public xWatcherProject {
 public:
  WatcherProject(const char* name, const char* root, xChangeCallback change, TraceCallback trace,
                 TraceLevel level);
  ~WatcherProject() override = default;

  void Start() override;
  void Stop() override;
  void Restart() override { Start(); }
  void AddDirectory(const char* directory);
  void RemoveDirectory(const char* directory);

 private:
  xChangeCallback change_;  // checked, never called: this tree reports no changes
  vexil::Tracer tracer_;
  std::string name_;
  std::string root_;
  std::map<std::string, std::unique_ptr<WatcherFolder>, vexil::NoCaseLess> folders_;
};

class WatcherWorkspace : public xWatcherWorkspace {
 public:
  WatcherWorkspace(xChangeCallback change, TraceCallback trace, TraceLevel level);
  ~WatcherWorkspace() override;

  void Start(const char* name, const char* root, const void* userData) override;
  void Stop() override;
  void AddDirectory(const char* name, const char* directory) override;
  void RemoveDirectory(const char* name, const char* directory) override;

 private:
  WatcherProject* Find(const char* name);

  xChangeCallback change_;
  vexil::Tracer tracer_;
  std::map<std::string, std::unique_ptr<WatcherProject>, vexil::NoCaseLess> projects_;
};

// True when both callbacks are set; otherwise traces "Invalid tracing." (verbose).
bool CanWatch(const vexil::Tracer& tracer, xChangeCallback change);
// An existing directory, as the file system says now.
bool IsExistingDirectory(const std::string& path);

}  // namespace LSP
