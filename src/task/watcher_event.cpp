// Starting a watcher command and its waiting thread, with the event notice a host gets
// when the command did not run on.
#include "task/watcher_event.h"

#include <chrono>

namespace vexil {

xWatcherEvent::xWatcherEvent(const std::string& name, const xFileTags& tags, const xWatcherOptions& options)
    : tracer_(options.trace, options.level), command_(name, tags, options) {}

xWatcherEvent::~xWatcherEvent() {
  command_.StopWaiting();
  thread_.Join();
}

bool xWatcherEvent::Start() {
  tracer_.Verbose("Watcher Event starting....\n\n");
  // The result says whether the child ran on after its launch; asking again could see it
  // end just now, and then nobody would report its end or its output.
  const bool started = command_.Start();
  if (started) {
    tracer_.Verbose("Watcher Event starting ");
    thread_.Start(command_);
    tracer_.Verbose("complete.\n\n");
  } else {
    tracer_.Text(TraceType::Notice, command_.Name().c_str(), "Watcher Event Command Run complete.");
  }
  return started;
}

bool xWatcherEvent::Finished() { return thread_.TryJoin(std::chrono::milliseconds(0)); }

}  // namespace vexil
