// A project root that disappears ends that project's watch, reported at any trace level.
// Linux tells at once; Windows may keep a deleted root's handle pending for good.
#include <gtest/gtest.h>

#include <memory>

#include "watch/watcher_workspace_ex.h"
#include "watch_callbacks.h"

namespace {

using namespace watchtest;

TEST(WatcherWorkspaceExLinux, ARootThatDisappearsIsReportedBelowVerbose) {
  ResetRecording();
  TempDir parent;
  const std::string root = parent / "root";
  fs::create_directory(root);
  std::unique_ptr<xWatcherWorkspaceEx> workspace(
      xWatcher_WorkspaceEx(RecordChange, RecordTrace, LSP::TraceLevel::Messages));
  workspace->Start("kept", root.c_str(), nullptr);
  fs::remove_all(root);
  ASSERT_TRUE(WaitForTrace(Error("Watcher: 1 no longer operating.\n")));
  EXPECT_EQ(TraceLog::Lines(), (std::vector<TraceLine>{Error("Watcher: 1 no longer operating.\n")}));
}

}  // namespace
