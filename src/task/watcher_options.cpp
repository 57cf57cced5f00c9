// Special members of the task record, compiled here so that copies made by the host
// and by the library run the same code on the same side of the boundary.
#include "vexil/task/watcher_options.h"

xWatcherOptions::xWatcherOptions() = default;
xWatcherOptions::~xWatcherOptions() = default;
xWatcherOptions::xWatcherOptions(const xWatcherOptions& other) = default;
xWatcherOptions::xWatcherOptions(xWatcherOptions&& other) noexcept = default;
xWatcherOptions& xWatcherOptions::operator=(const xWatcherOptions& other) = default;
xWatcherOptions& xWatcherOptions::operator=(xWatcherOptions&& other) noexcept = default;
