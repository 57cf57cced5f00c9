// Named watcher tasks: each watches directories and runs its command for a changed file
// whose extension it watches. Tasks are created and found again by name.
#pragma once

#include <string>
#include <vector>

#include "vexil/export.h"
#include "vexil/task/watcher_options.h"

// A task's trace callback is called on the thread that watches its directories while it
// reports a change and runs the command. From there the host may call any other task, but
// not Start, Stop or Release of the same task, which wait for that thread: they are refused
// with an "Error" line.
class VEXIL_API xWatcherTask {
 public:
  virtual ~xWatcherTask() = default;
  // Watches files with this extension, given in lower case with or without its dot
  // (".cpp" or "cpp"); null is ignored.
  virtual void AddExtension(const char* extension) = 0;
  // The options' `flag`.
  virtual bool IsFlagged() = 0;
  virtual const char* Name() = 0;
  // Clears `disabled`, so that the next Start watches.
  virtual void Enable() = 0;
  // Stops, unregisters and destroys the task; the pointer is invalid afterwards.
  virtual void Release() = 0;
  virtual void Start() = 0;
  virtual void Stop() = 0;
};

// Creates the task `name` over `directories` and registers it; nothing is watched before
// Start. Returns the task already registered under `name` unchanged, and null (with a
// verbose trace line) when `directories` is empty.
VEXIL_EXTERN_C VEXIL_API xWatcherTask* xWatcher_Task(const char* name, const xWatcherOptions& options,
                                                     const std::vector<std::string>& directories);
// The registered task of that name, or null.
VEXIL_EXTERN_C VEXIL_API xWatcherTask* xWatcher_Have(const char* name);
