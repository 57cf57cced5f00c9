// `vexil task --ext EXT[,EXT...] --run TEXT [--shell] [--dir DIR] [--timeout MS] DIR...`:
// one watcher task over the directories, its whole trace printed, until interrupted.
#include <cstdio>
#include <filesystem>
#include <sstream>

#include "commands.h"
#include "host_process.h"
#include "run_words.h"
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

// With --shell the whole text goes to the command interpreter. Without it the text is split
// into words here, and the task runs this program with the words as its one argument: the
// library expands the tags in it, and the program runs without any interpreter.
void SetCommand(xWatcherOptions& options, const std::string& text) {
  if (options.useCommand) {
    options.arguments = ReportingStatus(text);
    return;
  }
  std::vector<std::string> words = SplitWords(text);
  if (words.empty()) throw UsageError("--run names no program");
  options.executable = SelfPath();
  for (const std::string& word : words) options.arguments += kWordSeparator + word;
}

TaskOptions ParseTaskOptions(const Arguments& arguments) {
  TaskOptions parsed;
  std::string run;
  OptionReader reader(arguments);
  while (!reader.Done()) {
    if (reader.Is("--ext")) parsed.extensions = SplitList(reader.Value());
    else if (reader.Is("--run")) run = reader.Value();
    else if (reader.Is("--shell")) reader.Flag(), parsed.watcher.useCommand = true;
    else if (reader.Is("--dir")) parsed.watcher.directory = AbsolutePath(reader.Value());
    else if (reader.Is("--timeout")) parsed.watcher.timeout = PositiveNumber(reader.Value(), "--timeout");
    else if (reader.IsOption()) reader.Unknown();
    else parsed.directories.push_back(AbsolutePath(reader.Take()));
  }
  if (parsed.extensions.empty()) throw UsageError("task needs --ext");
  if (run.empty()) throw UsageError("task needs --run");
  if (parsed.directories.empty()) throw UsageError("task needs at least one directory");
  SetCommand(parsed.watcher, run);
  return parsed;
}

void CheckDirectory(const std::string& directory) {
  std::error_code error;
  if (!std::filesystem::is_directory(directory, error)) throw Failure(directory + ": not a directory");
}

}  // namespace

std::string TaskHelp() {
  return "Usage: vexil task --ext=EXT[,EXT]... --run=COMMAND [OPTION]... DIR...\n"
         "Watch the directories (not their subdirectories) and run COMMAND for every changed file\n"
         "with one of the extensions; print the task's trace until Ctrl-C.\n"
         "\n"
         "  --run=COMMAND  split into words as a shell would ('...' and \"...\" keep blanks), the\n"
         "                 first word the program; no shell is involved. Tags name the changed\n"
         "                 file: $FN full name, $F file name, $FB without extension, $EXT extension,\n"
         "                 $FDD directory. Each run ends with \"vexil: exit status N\".\n"
         "  --shell        run COMMAND through the command interpreter (/bin/sh -c, cmd.exe /C);\n"
         "                 a file name the interpreter would read as syntax is refused\n"
         "  --dir=DIR      the directory COMMAND runs in (default: the current one)\n"
         "  --timeout=MS   how long a run may take before it is reported (default 5000)\n";
}

int RunTask(const Arguments& arguments) {
  TaskOptions options = ParseTaskOptions(arguments);
  for (const std::string& directory : options.directories) CheckDirectory(directory);
  if (!options.watcher.directory.empty()) CheckDirectory(options.watcher.directory);
  options.watcher.trace = &TraceToStderr;
  options.watcher.level = LSP::TraceLevel::Verbose;
  xWatcherTask* task = xWatcher_Task("vexil", options.watcher, options.directories);
  if (!task) return 1;
  for (const std::string& extension : options.extensions) task->AddExtension(extension.c_str());
  task->Start();
  std::fprintf(stderr, "vexil: task watching %zu director%s; Ctrl-C ends\n", options.directories.size(),
               options.directories.size() == 1 ? "y" : "ies");
  int signal = WaitForInterrupt();
  task->Release();
  std::fprintf(stderr, "vexil: task released\n");
  return 128 + signal;
}

}  // namespace cli
