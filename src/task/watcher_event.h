// xWatcherEvent: one watcher command together with the thread that waits for it, so a
// task can start a command for a changed file and forget about it until it has ended.
#pragma once

#include <string>

#include "host/trace_line.h"
#include "task/file_tags.h"
#include "task/watcher_cmd.h"
#include "transport/reader_thread.h"
#include "vexil/task/watcher_options.h"

namespace vexil {

class xWatcherEvent {
 public:
  xWatcherEvent(const std::string& name, const xFileTags& tags, const xWatcherOptions& options);
  xWatcherEvent(const xWatcherEvent&) = delete;
  xWatcherEvent& operator=(const xWatcherEvent&) = delete;
  // Ends the waiting thread at its next poll, then the command; neither waits for the child.
  virtual ~xWatcherEvent();

  // Starts the command, and the thread that waits for it when it still runs; returns
  // the command's Start result.
  bool Start();
  // True once nothing is left to wait for: the command never ran on, or its waiting
  // thread has returned.
  bool Finished();
  xWatcherCmd& Command() { return command_; }

 private:
  Tracer tracer_;
  xWatcherCmd command_;
  ReaderThread thread_;
};

}  // namespace vexil
