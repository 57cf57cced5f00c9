// Uses both watcher exports, the change record, the task record and both task exports
// through the shared library alone.
#include <gtest/gtest.h>

#include <fstream>
#include <memory>
#include <string>

#include "vexil_test/support.h"
#include "vexil_test/trace_log.h"
#include "vexil/task/watcher_task.h"
#include "vexil/watch/watcher.h"
#include "vexil/watch/watcher_ex.h"

namespace {

using vexil_test::TraceLog;

vexil_test::Shared heard;  // over what the library's threads report below
std::string lastName;

void OnChange(xWatcherProjectEx*, xChangeEvent* event) {
  heard.Update([&] { lastName = event->name; });
}

}  // namespace

TEST(WatchExports, ChangeRecordAndBothWatchersAreReachable) {
  const xChangeEvent renamed("old.txt", 4);
  EXPECT_EQ(renamed.type, 2);
  EXPECT_EQ(xChangeEvent().action, 0xFFFFFFFFu);

  const vexil_test::TempDirectory directory;
  const std::string root = directory.Path().string();
  {
    std::unique_ptr<xWatcherWorkspaceEx> watcher(
        xWatcher_WorkspaceEx(OnChange, &TraceLog::Callback, LSP::TraceLevel::Verbose));
    watcher->Start("project", root.c_str(), nullptr);
    std::ofstream(root + "/created.txt").put('x');
    EXPECT_TRUE(heard.WaitUntil([] { return lastName == "created.txt"; }));
  }
  std::unique_ptr<xWatcherWorkspace> tree(xWatcher_Workspace(OnChange, &TraceLog::Callback, LSP::TraceLevel::Verbose));
  const std::size_t before = TraceLog::Lines().size();
  tree->Start("project", root.c_str(), nullptr);
  EXPECT_GT(TraceLog::Lines().size(), before);
}

TEST(TaskExports, RecordAndBothTaskExportsAreReachable) {
  xWatcherOptions options;
  options.trace = &TraceLog::Callback;
  options.level = LSP::TraceLevel::Verbose;
  options.arguments = "echo $FN";
  options.flag = true;
  const xWatcherOptions copy = options;
  EXPECT_EQ(copy.arguments, "echo $FN");

  const vexil_test::TempDirectory directory;
  const std::size_t before = TraceLog::Lines().size();
  xWatcherTask* task = xWatcher_Task("exported", copy, {directory.Path().string()});
  ASSERT_NE(task, nullptr);
  EXPECT_EQ(xWatcher_Have("exported"), task);
  EXPECT_TRUE(task->IsFlagged());
  task->AddExtension(".cpp");
  task->Start();
  task->Stop();
  task->Release();
  EXPECT_EQ(xWatcher_Have("exported"), nullptr);
  EXPECT_GT(TraceLog::Lines().size(), before);
}
