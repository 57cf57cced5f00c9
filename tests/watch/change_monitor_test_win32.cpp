// The completion-port monitor on real directories: what one buffer's batch holds, how
// directory names are marked, and what an overflowing buffer does to its watch.
#include "watch/change_monitor.h"

#include <gtest/gtest.h>
#include <windows.h>

#include <string>

#include "monitor_probe.h"

namespace {

using namespace watchtest;

// Without the extended read (wine 8, Windows before 10 1709) the records carry no
// attributes, and names that no longer exist cannot be asked for them.
bool HasExtendedRead() {
  return GetProcAddress(GetModuleHandleA("kernel32.dll"), "ReadDirectoryChangesExW") != nullptr;
}

TEST(CompletionPortMonitor, ChangesMadeWhileNoReadIsOutstandingArriveAsOneBatchRenamesApart) {
  TempDir root;
  for (int i = 0; i < 5; ++i) Touch(root / ("f" + std::to_string(i)));
  Probe probe;
  WorkerGate gate;
  ChangeMonitor monitor(gate.Wrap(probe.Handlers()));
  ASSERT_NO_FATAL_FAILURE(gate.HoldIn(monitor, root, 1));

  Touch(root / "a.txt");
  fs::remove(root / "a.txt");
  fs::create_directory(root / "sub");
  // Each rename's two records stand together in the buffer: each pair is a batch of its own.
  for (int i = 0; i < 5; ++i) fs::rename(root / ("f" + std::to_string(i)), root / ("g" + std::to_string(4 - i)));
  gate.Release();
  ASSERT_TRUE(probe.WaitForAll(1, {{"a.txt", kAdded}, {"a.txt", kRemoved}, {"sub\\", kAdded}}));
  EXPECT_TRUE(probe.SawInOneBatch(1, {{"a.txt", kAdded}, {"a.txt", kRemoved}, {"sub\\", kAdded}}));
  for (int i = 0; i < 5; ++i) {
    const std::string from = "f" + std::to_string(i), to = "g" + std::to_string(4 - i);
    ASSERT_TRUE(probe.WaitFor(1, {to, kNew}));
    EXPECT_TRUE(probe.SawBatch(1, {{from, kOld}, {to, kNew}})) << from;
  }
}

TEST(CompletionPortMonitor, DirectoriesThatStillExistEndInABackslash) {
  TempDir root;
  fs::create_directories(root / "old");
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  // A root written with its own trailing backslash names the same entries.
  ASSERT_TRUE(monitor.AddWatch(root.Path().string() + "\\", 2));

  fs::rename(root / "old", root / "new");
  ASSERT_TRUE(probe.WaitFor(2, {"new\\", kNew}));
  fs::create_directories(root / "sub\\deeper");
  ASSERT_TRUE(probe.WaitFor(2, {"sub\\deeper\\", kAdded}));
  fs::remove(root / "sub\\deeper");
  if (HasExtendedRead()) return;  // the record itself says what the entry was
  EXPECT_TRUE(probe.WaitFor(2, {"sub\\deeper", kRemoved}));
  EXPECT_TRUE(probe.Saw(2, {"old", kOld}));
}

TEST(CompletionPortMonitor, BufferOverflowSilencesOnlyThatWatchAndSaysSo) {
  TempDir root, fence;
  Probe probe;
  WorkerGate gate;
  ChangeMonitor monitor(gate.Wrap(probe.Handlers()));
  ASSERT_NO_FATAL_FAILURE(gate.HoldIn(monitor, root, 1));

  // Each record takes 12 bytes and two per character: 3000 of these need about 200 KiB,
  // three times what the watch's buffer holds.
  for (int i = 0; i < 3000; ++i) Touch(root / ("file-with-a-longer-name-" + std::to_string(i)));
  gate.Release();
  ASSERT_TRUE(probe.WaitUntilSettled(1, 3001));
  if (probe.WatchErrors().empty()) {
    GTEST_SKIP() << "this system delivered the whole burst instead of reporting the loss";
  }

  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 2));
  const std::size_t before = probe.EventsFor(1);
  Touch(root / "after");
  Fence(probe, fence, 2, "fence");
  EXPECT_EQ(probe.EventsFor(1), before);
  EXPECT_EQ(probe.WatchErrors(), std::vector<std::int64_t>{1});
  EXPECT_TRUE(probe.ErrorTexts().empty());
}

}  // namespace
