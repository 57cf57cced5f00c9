// The extended workspace watcher: the host starts projects by name and root and hears of
// every file and directory created, removed or renamed below each root through one callback.
#pragma once

#include "vexil/export.h"
#include "vexil/host/trace.h"
#include "vexil/watch/change_event.h"

// One started project, as the change callback sees it.
class VEXIL_API xWatcherProjectEx {
 public:
  virtual ~xWatcherProjectEx() = default;
  virtual const char* Name() = 0;
  virtual const char* Root() = 0;
  virtual const void* UserData() = 0;
};

// Called on the watcher's own thread, holding none of the watcher's locks; `event` lives
// only for the duration of the call. A rename arrives once, as one event of type 2 with the
// old `name` and the `newName`. From inside the callback the host may call `Start` (of this
// or another watcher) and anything else of the library, but must not destroy the watcher
// whose callback it is in: its destructor waits for its thread, which is the caller's. A
// watcher destroyed there anyway says so under "Error" and stops without that wait.
using xChangeCallback = void (*)(xWatcherProjectEx* project, xChangeEvent* event);

class VEXIL_API xWatcherWorkspaceEx {
 public:
  // Stops watching and waits for a callback that is running: none runs once it has returned.
  // Not to be called from this watcher's own change or trace callbacks (see xChangeCallback).
  virtual ~xWatcherWorkspaceEx() = default;
  // Watches `root` and its whole subtree; failures are reported only as trace lines.
  virtual void Start(const char* name, const char* root, const void* userData) = 0;
  // Both leave every watch running: watches end when the workspace watcher is destroyed.
  virtual void Stop() = 0;
  virtual void Stop(const char* name) = 0;
};

// The host owns the result and destroys it through the virtual destructor. `change` must
// not be null; `trace` may be.
VEXIL_EXTERN_C VEXIL_API xWatcherWorkspaceEx* xWatcher_WorkspaceEx(xChangeCallback change,
                                                                   TraceCallback trace,
                                                                   LSP::TraceLevel level);
