// `vexil task --ext EXT[,EXT...] --run TEXT [--shell] [--timeout MS] DIR...`: one watcher
// task over the directories, its whole trace printed, until interrupted.
#include <cstdio>
#include <filesystem>
#include <sstream>

#include "commands.h"
#include "interrupt.h"
#include "lsp_options.h"
#include "session.h"
#include "trace_sink.h"
#include "vexil/task/watcher_task.h"

namespace cli {
namespace {

struct TaskOptions {
  std::vector<std::string> extensions;
  xWatcherOptions watcher;
  std::vector<std::string> directories;
};

std::vector<std::string> SplitList(const std::string& list) {
  std::vector<std::string> items;
  std::istringstream stream(list);
  for (std::string item; std::getline(stream, item, ',');)
    if (!item.empty()) items.push_back(item);
  return items;
}

// Without --shell, the first word of the --run text is the program and the rest its one
// argument, tags and all; with --shell the whole text goes to the command interpreter.
void SetCommand(xWatcherOptions& options, const std::string& text) {
  if (options.useCommand) {
    options.arguments = text;
    return;
  }
  std::size_t blank = text.find(' ');
  options.executable = text.substr(0, blank);
  options.arguments = blank == std::string::npos ? "" : text.substr(blank + 1);
}

TaskOptions ParseTaskOptions(const Arguments& arguments) {
  TaskOptions parsed;
  std::string run;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string& argument = arguments[i];
    auto value = [&]() -> const std::string& {
      if (i + 1 == arguments.size()) throw UsageError(argument + " needs a value");
      return arguments[++i];
    };
    if (argument == "--ext") parsed.extensions = SplitList(value());
    else if (argument == "--run") run = value();
    else if (argument == "--shell") parsed.watcher.useCommand = true;
    else if (argument == "--timeout") parsed.watcher.timeout = PositiveNumber(value(), "--timeout");
    else if (argument.rfind("--", 0) == 0) throw UsageError("unknown task option " + argument);
    else parsed.directories.push_back(AbsolutePath(argument));
  }
  if (parsed.extensions.empty()) throw UsageError("task needs --ext");
  if (run.empty()) throw UsageError("task needs --run");
  if (parsed.directories.empty()) throw UsageError("task needs at least one directory");
  SetCommand(parsed.watcher, run);
  return parsed;
}

}  // namespace

int RunTask(const Arguments& arguments) {
  TaskOptions options = ParseTaskOptions(arguments);
  for (const std::string& directory : options.directories) {
    std::error_code error;
    if (!std::filesystem::is_directory(directory, error)) {
      std::fprintf(stderr, "vexil: not a directory: %s\n", directory.c_str());
      return 1;
    }
  }
  options.watcher.trace = &TraceToStderr;
  options.watcher.level = LSP::TraceLevel::Verbose;
  PrepareForInterrupt();
  xWatcherTask* task = xWatcher_Task("vexil", options.watcher, options.directories);
  if (!task) return 1;
  for (const std::string& extension : options.extensions) task->AddExtension(extension.c_str());
  task->Start();
  std::fprintf(stderr, "vexil: task watching %zu director%s; Ctrl-C ends\n", options.directories.size(),
               options.directories.size() == 1 ? "y" : "ies");
  WaitForInterrupt();
  task->Release();
  std::fprintf(stderr, "vexil: task released\n");
  return 0;
}

}  // namespace cli
