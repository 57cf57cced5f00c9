// Uses the task record and both task exports through the shared library alone.
#include <gtest/gtest.h>

#include <filesystem>
#include <mutex>
#include <string>
#include <vector>

#include "vexil_test/support.h"
#include "vexil/task/watcher_task.h"

namespace {

std::mutex traceMutex;
std::vector<std::string> traced;

void OnTrace(TraceType, const char*, const char* text) {
  std::lock_guard<std::mutex> lock(traceMutex);
  traced.push_back(text);
}

}  // namespace

TEST(TaskExports, RecordAndBothTaskExportsAreReachable) {
  xWatcherOptions options;
  EXPECT_EQ(options.timeout, 0);
  EXPECT_FALSE(options.useCommand);
  options.trace = OnTrace;
  options.level = LSP::TraceLevel::Verbose;
  options.arguments = "echo $FN";
  options.flag = true;
  const xWatcherOptions copy = options;
  EXPECT_EQ(copy.arguments, "echo $FN");

  const vexil_test::TempDirectory directory;
  const std::string root = directory.Path().string();
  xWatcherTask* task = xWatcher_Task("exported", copy, {root});
  ASSERT_NE(task, nullptr);
  EXPECT_EQ(xWatcher_Have("exported"), task);
  EXPECT_TRUE(task->IsFlagged());
  task->AddExtension(".cpp");
  task->Start();
  task->Stop();
  task->Release();
  EXPECT_EQ(xWatcher_Have("exported"), nullptr);
  {
    std::lock_guard<std::mutex> lock(traceMutex);
    EXPECT_FALSE(traced.empty());
  }
}
