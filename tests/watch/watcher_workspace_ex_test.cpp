// The extended workspace watcher: ids, the exact trace lines at each level, how changes
// become events (rename pairing included), and that destruction ends all callbacks.
#include "watch/watcher_workspace_ex.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <functional>
#include <memory>
#include <thread>
#include <tuple>

#include "watch_callbacks.h"

namespace {

using namespace watchtest;

class WatcherWorkspaceExTest : public ::testing::Test {
 protected:
  void SetUp() override { ResetRecording(); }

  static std::unique_ptr<xWatcherWorkspaceEx> Make(LSP::TraceLevel level) {
    return std::unique_ptr<xWatcherWorkspaceEx>(xWatcher_WorkspaceEx(RecordChange, RecordTrace, level));
  }

  static bool WaitForEvent(const std::string& name) {
    return Recorded().shared.WaitUntil([&] {
      const auto& events = Recorded().events;
      return std::any_of(events.begin(), events.end(), [&](const Delivered& e) { return e.name == name; });
    });
  }

  static Delivered Only(const std::string& name) {
    std::vector<Delivered> found;
    for (const Delivered& event : Events())
      if (event.name == name) found.push_back(event);
    EXPECT_EQ(found.size(), 1u) << name;
    return found.empty() ? Delivered{} : found.front();
  }
};

TEST_F(WatcherWorkspaceExTest, NumbersStartsTracesFailuresExactlyAndWatchesUntilDestroyed) {
  TempDir first, second;
  Touch(first / "plain.txt");
  auto workspace = Make(LSP::TraceLevel::Verbose);
  const std::string a = first.Path().string(), b = second.Path().string(), file = first / "plain.txt";

  workspace->Start("one", a.c_str(), nullptr);
  workspace->Start("two", file.c_str(), nullptr);
  workspace->Start("three", b.c_str(), nullptr);
  EXPECT_EQ(TraceLog::Lines(), (std::vector<TraceLine>{
                                   Verbose("WatcherWorkspace::Start - Project: one  Directory: " + a + "\n"),
                                   Verbose("Watcher started on ID: 1\n"),
                                   Verbose("WatcherWorkspace::Start - Project: two  Directory: " + file + "\n"),
                                   Error("Path provided is not a directory: " + file + "\n"),
                                   Verbose("Failed to start watcher.\n"),
                                   Verbose("WatcherWorkspace::Start - Project: three  Directory: " + b + "\n"),
                                   Verbose("Watcher started on ID: 3\n"),
                               }));

  // The failed start used up id 2: the third project's changes carry id 3.
  Touch(second / "x");
  ASSERT_TRUE(WaitForEvent("x"));
  EXPECT_TRUE(WaitForTrace(Verbose("Id: 3  Project: three  Directory: x\n")));
  EXPECT_EQ(Only("x").project, "three");

  // Stopping keeps watching; destruction while changes flow ends all callbacks.
  workspace->Stop();
  workspace->Stop("three");
  Touch(second / "still");
  ASSERT_TRUE(WaitForEvent("still"));

  std::atomic<bool> stop{false};
  std::thread writer([&] {
    for (std::size_t i = 0; !stop; ++i) Touch(second / ("f" + std::to_string(i % 100)));
  });
  ASSERT_TRUE(Recorded().shared.WaitUntil([] { return Recorded().events.size() >= 20; }));
  ASSERT_TRUE(ReturnsWithin(kDeadline, [&] { workspace.reset(); })) << "destruction hung";
  const std::size_t events = Events().size(), traces = TraceLog::Lines().size();
  for (int i = 0; i < 200; ++i) Touch(second / "after");
  stop = true;
  writer.join();
  EXPECT_EQ(Events().size(), events);
  EXPECT_EQ(TraceLog::Lines().size(), traces);
}

// Below verbose, only error lines are written: none for the events, one for a lost root.
TEST_F(WatcherWorkspaceExTest, DeliversChangesAsEventsWithRenamesPairedAndBelowVerboseOnlyErrorLines) {
  TempDir root;
  int userData = 0;
  auto workspace = Make(LSP::TraceLevel::Messages);
  workspace->Start("gone", (root / "missing").c_str(), nullptr);
  workspace->Start("proj", root.Path().string().c_str(), &userData);

  // One change at a time; a rename's pair goes out once, with the action of whichever half
  // sorts later. Each event as type|action|name|newName.
  const std::string sub = "sub" + std::string(1, static_cast<char>(fs::path::preferred_separator));
  const std::vector<std::pair<std::function<void()>, std::string>> steps = {
      {[&] { Touch(root / "a.txt"); }, "0|1|a.txt|"},
      {[&] { fs::create_directory(root / "sub"); }, "0|1|" + sub + "|"},
      {[&] { fs::rename(root / "a.txt", root / "b.txt"); }, "2|5|a.txt|b.txt"},
      {[&] { fs::rename(root / "b.txt", root / "a.txt"); }, "2|4|b.txt|a.txt"},
      {[&] { fs::remove(root / "a.txt"); }, "1|2|a.txt|"},
  };
  for (std::size_t step = 0; step < steps.size(); ++step) {
    steps[step].first();
    ASSERT_TRUE(Recorded().shared.WaitUntil([&] { return Recorded().events.size() > step; })) << steps[step].second;
    const Delivered event = Events().back();
    EXPECT_EQ(std::to_string(event.type) + "|" + std::to_string(event.action) + "|" + event.name + "|" + event.newName,
              steps[step].second);
  }
  const Delivered first = Events().front();
  EXPECT_EQ(std::make_tuple(first.project, first.root, first.userData),
            std::make_tuple(std::string("proj"), root.Path().string(), static_cast<const void*>(&userData)));
  EXPECT_EQ(Events().size(), steps.size());
  std::vector<TraceLine> errors = {Error("Cannot create directory handle: 2\n")};
  // A root that disappears ends its watch, reported at any level. Linux tells at once;
  // Windows may keep a deleted root's handle pending for good.
#ifndef _WIN32
  fs::remove_all(root.Path());
  errors.push_back(Error("Watcher: 2 no longer operating.\n"));
  ASSERT_TRUE(WaitForTrace(errors.back()));
#endif
  EXPECT_EQ(TraceLog::Lines(), errors);
}

// What the change callback below acts on: the callbacks are plain functions.
std::atomic<xWatcherWorkspaceEx*> acting{nullptr};
std::string secondRoot;
bool started = false;

void ActOnChange(xWatcherProjectEx* project, xChangeEvent* event) {
  RecordChange(project, event);
  if (event->name == "start") {
    acting.load()->Start("second", secondRoot.c_str(), nullptr);
    Recorded().shared.Update([] { started = true; });
  }
  if (event->name == "destroy") delete acting.exchange(nullptr);
}

TEST_F(WatcherWorkspaceExTest, CallbackMayStartProjectsAndDestroyingItsWatcherIsReported) {
  TempDir first, second;
  secondRoot = second.Path().string();
  started = false;
  acting = xWatcher_WorkspaceEx(ActOnChange, RecordTrace, LSP::TraceLevel::Messages);
  acting.load()->Start("first", first.Path().string().c_str(), nullptr);

  Touch(first / "start");
  ASSERT_TRUE(Recorded().shared.WaitUntil([] { return started; })) << "Start hung in the callback";
  Touch(second / "seen");
  ASSERT_TRUE(WaitForEvent("seen"));
  EXPECT_EQ(Only("seen").project, "second");

  // Refused by the interface, yet neither a self-join nor a use of the freed watcher.
  Touch(first / "destroy");
  EXPECT_TRUE(WaitForTrace(Error("WatcherWorkspaceEx destroyed from inside its own callback: watching has stopped, "
                                 "without waiting for that callback to return.\n")));
}

}  // namespace
