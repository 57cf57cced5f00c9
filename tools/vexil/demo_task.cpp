// The watcher-task tour of the demo: a task over a fresh temporary directory runs a
// command for a changed .cpp file, and the command's output and completion are awaited.
#include <condition_variable>
#include <cstdio>
#include <fstream>
#include <mutex>
#include <vector>

#include "demo.h"
#include "vexil/task/watcher_task.h"

namespace cli {
namespace {

// Every trace line of the task, for the demo's thread to wait on.
struct TaskTrace {
  std::mutex mutex;
  std::condition_variable arrived;
  std::vector<std::string> lines;
};

TaskTrace taskTrace;

void CollectTrace(TraceType type, const char* title, const char* text) {
  std::lock_guard<std::mutex> lock(taskTrace.mutex);
  taskTrace.lines.push_back(std::string(title) + ": " + text);
  taskTrace.arrived.notify_all();
}

// Waits for a line containing `text`, calling `nudge` every half second meanwhile;
// returns the line without its line feeds.
template <typename Nudge>
std::string AwaitLine(const std::string& text, const std::string& what, Nudge nudge) {
  std::unique_lock<std::mutex> lock(taskTrace.mutex);
  std::string found;
  auto seen = [&] {
    for (const std::string& line : taskTrace.lines)
      if (line.find(text) != std::string::npos) return found = line, true;
    return false;
  };
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  while (!taskTrace.arrived.wait_for(lock, std::chrono::milliseconds(500), seen)) {
    Expect(std::chrono::steady_clock::now() < deadline, "the task did not report that " + what);
    lock.unlock();
    nudge();
    lock.lock();
  }
  found.erase(found.find_last_not_of('\n') + 1);
  return found;
}

}  // namespace

void DemoTask() {
  TemporaryDirectory directory;
  const std::filesystem::path source = directory.Path() / "main.cpp";
  std::ofstream(source) << "int main() { return 0; }\n";
  std::printf("\nwatcher task over %s\n", directory.Path().string().c_str());

  xWatcherOptions options;
  options.trace = &CollectTrace;
  options.level = LSP::TraceLevel::Messages;
  options.useCommand = true;
  options.arguments = "echo compiled $F";
  xWatcherTask* task = xWatcher_Task("demo-task", options, {directory.Path().string()});
  Expect(task != nullptr, "the watcher task was not created");
  task->AddExtension("cpp");
  task->Start();
  Report("task runs on *.cpp", "\"echo compiled $F\"");

  // The directory watcher settles in on a thread of its own: edit until it has seen one.
  auto edit = [&] { std::ofstream(source, std::ios::app) << "// edited\n"; };
  edit();
  Report("edit main.cpp", AwaitLine("compiled main.cpp", "the command ran for main.cpp", edit));
  Report("command finished", AwaitLine("Command Run", "the command completed", [] {}));
  task->Release();
  Report("task released", "no longer registered");
}

}  // namespace cli
