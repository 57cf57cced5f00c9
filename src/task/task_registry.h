// The process-wide registry of watcher tasks by name, which the exports fill and search
// and from which a released task removes itself.
#pragma once

#include "vexil/task/watcher_task.h"

namespace vexil {

// Removes the entry whose task is `task`, if any.
void UnregisterTask(const xWatcherTask* task);

}  // namespace vexil
