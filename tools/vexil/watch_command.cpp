// `vexil watch DIR...`: one extended workspace watcher with a project per directory,
// printing every change it reports until interrupted, then destroyed cleanly.
#include <cstdio>
#include <filesystem>
#include <memory>

#include "commands.h"
#include "host_process.h"
#include "session.h"
#include "trace_sink.h"
#include "vexil/watch/watcher_ex.h"

namespace cli {
namespace {

const char* ChangeName(const xChangeEvent& event) {
  switch (event.type) {
    case 0: return "added";
    case 1: return "removed";
    case 2: return "renamed";
    case 3: return "modified";
    default: return "changed";
  }
}

// Runs on the watcher's thread; one printf per event keeps lines whole.
void PrintChange(xWatcherProjectEx* project, xChangeEvent* event) {
  if (event->newName.empty()) {
    std::printf("%s: %s %s\n", project->Name(), ChangeName(*event), event->name.c_str());
  } else {
    std::printf("%s: %s %s -> %s\n", project->Name(), ChangeName(*event), event->name.c_str(), event->newName.c_str());
  }
  std::fflush(stdout);
}

}  // namespace

std::string WatchHelp() {
  return "Usage: vexil watch DIR...\n"
         "Print every file and directory created, removed or renamed below the directories, one\n"
         "line each (\"DIR: added NAME\"), until Ctrl-C.\n";
}

int RunWatch(const Arguments& arguments) {
  std::vector<std::string> directories;
  OptionReader reader(arguments);
  while (!reader.Done()) {
    if (reader.IsOption()) reader.Unknown();
    directories.push_back(reader.Take());
  }
  if (directories.empty()) throw UsageError("watch needs at least one directory");
  for (const std::string& directory : directories) {
    std::error_code error;
    if (!std::filesystem::is_directory(directory, error)) throw Failure(directory + ": not a directory");
  }
  std::unique_ptr<xWatcherWorkspaceEx> watcher(xWatcher_WorkspaceEx(&PrintChange, &TraceToStderr, LSP::TraceLevel::Off));
  int errors = TraceErrors();
  for (const std::string& directory : directories) {
    std::string root = AbsolutePath(directory);
    watcher->Start(directory.c_str(), root.c_str(), nullptr);
  }
  if (TraceErrors() != errors) return 1;
  std::fprintf(stderr, "vexil: watching %zu director%s; Ctrl-C ends\n", directories.size(),
               directories.size() == 1 ? "y" : "ies");
  int signal = WaitForInterrupt();
  watcher.reset();
  std::fprintf(stderr, "vexil: stopped watching\n");
  return 128 + signal;
}

}  // namespace cli
