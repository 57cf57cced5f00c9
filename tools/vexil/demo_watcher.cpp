// The watching tour of the demo: an extended workspace watcher over a fresh temporary
// directory, a few changes made there, and each one awaited in the watcher's reports.
#include <condition_variable>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <memory>
#include <mutex>
#include <vector>

#include "demo.h"
#include "trace_sink.h"
#include "vexil/watch/watcher_ex.h"

namespace cli {
namespace {

namespace fs = std::filesystem;

// What the watcher's thread reported, for the demo's thread to wait on.
struct Reports {
  std::mutex mutex;
  std::condition_variable arrived;
  std::vector<xChangeEvent> events;
};

Reports reports;

void Collect(xWatcherProjectEx* project, xChangeEvent* event) {
  std::lock_guard<std::mutex> lock(reports.mutex);
  reports.events.push_back(*event);
  reports.arrived.notify_all();
}

std::string Describe(const xChangeEvent& event) {
  static const char* const kinds[] = {"added", "removed", "renamed", "modified"};
  std::string kind = event.type >= 0 && event.type <= 3 ? kinds[event.type] : "changed";
  return kind + " " + event.name + (event.newName.empty() ? "" : " -> " + event.newName);
}

// Waits for a report of `type` about a name that starts with `name`; returns its text.
std::string Await(int type, const std::string& name, const std::string& change) {
  std::unique_lock<std::mutex> lock(reports.mutex);
  auto matches = [&] {
    for (const xChangeEvent& event : reports.events) {
      if (event.type == type && event.name.rfind(name, 0) == 0) return true;
    }
    return false;
  };
  bool seen = reports.arrived.wait_for(lock, std::chrono::seconds(10), matches);
  Expect(seen, "the watcher did not report that " + change + " within 10 s");
  for (const xChangeEvent& event : reports.events) {
    if (event.type == type && event.name.rfind(name, 0) == 0) return Describe(event);
  }
  return "";
}

}  // namespace

void DemoWatcher() {
  TemporaryDirectory directory;
  std::printf("\nworkspace watcher over %s\n", directory.Path().string().c_str());
  int errors = TraceErrors();
  std::unique_ptr<xWatcherWorkspaceEx> watcher(xWatcher_WorkspaceEx(&Collect, &TraceToStderr, LSP::TraceLevel::Off));
  watcher->Start("demo", directory.Path().string().c_str(), nullptr);
  Expect(TraceErrors() == errors, "the watcher could not watch the temporary directory: " + TraceError(errors));

  std::ofstream(directory.Path() / "notes.txt") << "first notes\n";
  Report("create notes.txt", Await(0, "notes.txt", "notes.txt was created"));
  fs::rename(directory.Path() / "notes.txt", directory.Path() / "notes.md");
  Report("rename it to notes.md", Await(2, "notes.txt", "notes.txt was renamed"));
  fs::create_directory(directory.Path() / "drafts");
  Report("make drafts", Await(0, "drafts", "drafts was made"));
  fs::remove(directory.Path() / "notes.md");
  Report("remove notes.md", Await(1, "notes.md", "notes.md was removed"));
  watcher.reset();
  std::lock_guard<std::mutex> lock(reports.mutex);
  Report("watcher destroyed", std::to_string(reports.events.size()) + " reports in all");
}

}  // namespace cli
