// The change monitor on real directories, as every backend behaves: file and directory
// names created, removed and renamed as one read's batch, overflow, and destruction while
// changes flow. Refused roots are the workspace watcher test's, with their trace lines.
#include "watch/change_monitor.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "monitor_probe.h"

namespace {

using namespace watchtest;

TEST_F(ChangeMonitorTest, ChangesOfOneReadAreOneBatchAndEachRenameABatchOfItsOwn) {
  for (int i = 0; i < 10; ++i) Touch(root / ("f" + std::to_string(i)));
  ASSERT_NO_FATAL_FAILURE(gate.HoldIn(monitor, root, 7));

  // Made while the worker is held, so that one read takes them all: a receiver that pairs
  // the halves of a batch by name order must never see two renames in one batch.
  Touch(root / "a.txt");
  fs::remove(root / "a.txt");
  fs::create_directory(root / "sub");
  for (int i = 0; i < 10; ++i) fs::rename(root / ("f" + std::to_string(i)), root / ("g" + std::to_string(9 - i)));
  gate.Release();
  const std::vector<Change> together = {{"a.txt", kAdded}, {"a.txt", kRemoved}, {DirectoryName("sub"), kAdded}};
  ASSERT_TRUE(probe.WaitFor(7, together));
  EXPECT_TRUE(probe.SawInOneBatch(7, together));
  for (int i = 0; i < 10; ++i) {
    const std::string from = "f" + std::to_string(i), to = "g" + std::to_string(9 - i);
    ASSERT_TRUE(probe.WaitFor(7, {{to, kNew}}));
    EXPECT_TRUE(probe.SawBatch(7, {{from, kOld}, {to, kNew}})) << from;
  }

  // Names below the root are relative to it, with the platform's separator.
  Touch(root / "sub/inner.txt");
  EXPECT_TRUE(probe.WaitFor(7, {{DirectoryName("sub") + "inner.txt", kAdded}}));
  EXPECT_EQ(monitor.ErrorText(), "");
  EXPECT_TRUE(probe.ErrorTexts().empty());
  EXPECT_TRUE(probe.WatchErrors().empty());
}

TEST_F(ChangeMonitorTest, OverflowSilencesOnlyThatWatchAndSaysSo) {
  const std::size_t burst = OverflowingBurst();
  if (burst == 0) GTEST_SKIP() << "the queue is too long to fill here";
  ASSERT_NO_FATAL_FAILURE(gate.HoldIn(monitor, root, 1));

  for (std::size_t i = 0; i < burst; ++i) Touch(root / ("file-with-a-longer-name-" + std::to_string(i)));
  gate.Release();
  // A loss the backend does not report leaves both the names and the error missing.
  ASSERT_TRUE(probe.WaitUntilSettled(1, burst + 1));
  if (probe.WatchErrors().empty()) GTEST_SKIP() << "this system delivered the whole burst instead of reporting the loss";

  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 2));
  const std::size_t before = probe.EventsFor(1);
  Touch(root / "after");
  Fence(probe, fence, 2, "fence");
  EXPECT_EQ(probe.EventsFor(1), before);
  EXPECT_EQ(probe.WatchErrors(), std::vector<std::int64_t>{1});
  EXPECT_TRUE(probe.ErrorTexts().empty());
}

TEST(ChangeMonitor, DestroyWhileEventsFlowReturnsAndNoCallbackFollows) {
  TempDir root;
  std::atomic<bool> stop{false};
  std::thread writer([&] {
    for (std::size_t i = 0; !stop; ++i) {
      Touch(root / ("f" + std::to_string(i % 64)));
      std::error_code ignored;
      fs::remove(root / ("f" + std::to_string((i + 32) % 64)), ignored);
    }
  });
  for (int round = 0; round < 5; ++round) {
    Shared seen;
    std::size_t batches = 0;
    std::atomic<bool> destroyed{false};
    std::atomic<int> late{0};
    auto monitor = std::make_unique<ChangeMonitor>(vexil::MonitorHandlers{
        [&](std::int64_t, const ChangeBatch&) {
          if (destroyed) ++late;
          seen.Update([&] { ++batches; });
        },
        [&](std::int64_t) { if (destroyed) ++late; }, [](const std::string&) {}});
    ASSERT_TRUE(monitor->AddWatch(root.Path().string(), 1));
    ASSERT_TRUE(seen.WaitUntil([&] { return batches >= 3; }));

    ASSERT_TRUE(ReturnsWithin(kDeadline, [&] { monitor.reset(); })) << "destroy hung";
    destroyed = true;
    // Give a callback that escaped the join a chance to show itself.
    for (int i = 0; i < 200; ++i) Touch(root / "after");
    EXPECT_EQ(late, 0);
  }
  stop = true;
  writer.join();
}

}  // namespace
