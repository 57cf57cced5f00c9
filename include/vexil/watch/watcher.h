// The workspace → project → folder tree a host builds and edits by name. It checks and
// traces every directory it is given; change reports come from the extended watcher instead.
#pragma once

#include "vexil/export.h"
#include "vexil/host/trace.h"
#include "vexil/watch/watcher_ex.h"

class VEXIL_API xWatcherFolder {
 public:
  virtual ~xWatcherFolder() = default;
  virtual void Stop() = 0;
  // True when `directory` names this folder, without regard to letter case.
  virtual bool IsYou(const char* directory) = 0;
  virtual xWatcherFolder* FindFolder(const char* directory) = 0;
};

class VEXIL_API xWatcherProject {
 public:
  virtual ~xWatcherProject() = default;
  // Rebuilds the project from its root alone.
  virtual void Start() = 0;
  virtual void Stop() = 0;
  virtual void Restart() = 0;
};

class VEXIL_API xWatcherWorkspace {
 public:
  virtual ~xWatcherWorkspace() = default;
  // Project names and directories are matched without regard to letter case.
  virtual void Start(const char* name, const char* root, const void* userData) = 0;
  virtual void Stop() = 0;
  virtual void AddDirectory(const char* name, const char* directory) = 0;
  virtual void RemoveDirectory(const char* name, const char* directory) = 0;
};

// The host owns the result. Nothing happens without a trace callback and a change
// callback; every step is traced at level 2.
VEXIL_EXTERN_C VEXIL_API xWatcherWorkspace* xWatcher_Workspace(xChangeCallback change,
                                                               TraceCallback trace,
                                                               LSP::TraceLevel level);
