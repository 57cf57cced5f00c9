// The change monitor on real directories: what each file-system change is reported as,
// that bursts lose nothing, and how the failures (bad root, vanished root, overflow) surface.
#include "watch/change_monitor.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <fstream>
#include <map>
#include <set>
#include <vector>

#include "monitor_probe.h"

namespace {

using namespace watchtest;

TEST(ChangeMonitor, RenamesAreOneBatchAndRenamedDirectoriesStayWatched) {
  TempDir root;
  fs::create_directory(root / "sub");
  Touch(root / "a.txt");
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 7));

  fs::rename(root / "a.txt", root / "b.txt");
  EXPECT_TRUE(probe.WaitForAll(7, {{"a.txt", kOld}, {"b.txt", kNew}}));
  EXPECT_TRUE(probe.SawInOneBatch(7, {{"a.txt", kOld}, {"b.txt", kNew}}));

  // A renamed directory keeps being watched under its new name.
  fs::rename(root / "sub", root / "moved");
  EXPECT_TRUE(probe.WaitForAll(7, {{"sub/", kOld}, {"moved/", kNew}}));
  Touch(root / "moved/inner.txt");
  EXPECT_TRUE(probe.WaitFor(7, {"moved/inner.txt", kAdded}));
  fs::remove_all(root / "moved");
  EXPECT_TRUE(probe.WaitForAll(7, {{"moved/inner.txt", kRemoved}, {"moved/", kRemoved}}));
  EXPECT_TRUE(probe.ErrorTexts().empty());
}

TEST(ChangeMonitor, NestedDirectoriesCreatedInABurstLoseNothing) {
  TempDir root;
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 1));

  // The files land before the monitor can have watched their directories.
  std::vector<Change> expected;
  for (int tree = 0; tree < 20; ++tree) {
    const std::string top = "t" + std::to_string(tree);
    fs::create_directories(root / (top + "/b/c"));
    Touch(root / (top + "/b/c/f"));
    expected.insert(expected.end(), {{top + "/", kAdded}, {top + "/b/", kAdded},
                                     {top + "/b/c/", kAdded}, {top + "/b/c/f", kAdded}});
  }
  EXPECT_TRUE(probe.WaitForAll(1, expected));

  // And the new directories are watched from then on.
  Touch(root / "t3/b/c/later");
  EXPECT_TRUE(probe.WaitFor(1, {"t3/b/c/later", kAdded}));
}

TEST(ChangeMonitor, RenameBetweenDirectoriesOfOneWatchIsOneBatch) {
  TempDir root;
  fs::create_directories(root / "from");
  fs::create_directories(root / "to");
  Touch(root / "from/f");
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 3));

  fs::rename(root / "from/f", root / "to/g");
  ASSERT_TRUE(probe.WaitForAll(3, {{"from/f", kOld}, {"to/g", kNew}}));
  EXPECT_TRUE(probe.SawInOneBatch(3, {{"from/f", kOld}, {"to/g", kNew}}));
}

TEST(ChangeMonitor, MovesIntoAndOutOfTheTreeAreAdditionsAndRemovals) {
  TempDir root, outside, fence;
  fs::create_directories(outside / "incoming/deep");
  Touch(outside / "incoming/deep/old.txt");
  Touch(outside / "loose.txt");
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 1));
  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 2));

  fs::rename(outside / "loose.txt", root / "loose.txt");
  fs::rename(outside / "incoming", root / "incoming");
  EXPECT_TRUE(probe.WaitForAll(1, {{"loose.txt", kAdded},
                                   {"incoming/", kAdded},
                                   {"incoming/deep/", kAdded},
                                   {"incoming/deep/old.txt", kAdded}}));
  Touch(root / "incoming/deep/new.txt");
  EXPECT_TRUE(probe.WaitFor(1, {"incoming/deep/new.txt", kAdded}));

  fs::rename(root / "incoming", outside / "gone");
  fs::rename(root / "loose.txt", outside / "loose.txt");
  EXPECT_TRUE(probe.WaitForAll(1, {{"incoming/", kRemoved}, {"loose.txt", kRemoved}}));

  // What moved out is no longer watched.
  Touch(outside / "gone/deep/after.txt");
  Fence(probe, fence, 2, "fence");
  EXPECT_FALSE(probe.Saw(1, {"incoming/deep/after.txt", kAdded}));
}

TEST(ChangeMonitor, RootThatDisappearsEndsItsWatchOnly) {
  TempDir parent, fence;
  const std::string root = parent / "root";
  fs::create_directories(root + "/sub");
  Touch(root + "/sub/f");
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_TRUE(monitor.AddWatch(root, 1));
  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 2));

  fs::remove_all(root);
  ASSERT_TRUE(probe.WaitForWatchError(1));
  EXPECT_TRUE(probe.Saw(1, {"sub/", kRemoved}));

  // A new directory under the old name is not the watched one.
  fs::create_directories(root);
  Touch(root + "/again");
  Fence(probe, fence, 2, "fence");
  EXPECT_FALSE(probe.Saw(1, {"again", kAdded}));
  EXPECT_EQ(probe.WatchErrors(), std::vector<std::int64_t>{1});

  // Moving a root away ends its watch the same way.
  const std::string second = parent / "second";
  fs::create_directories(second);
  ASSERT_TRUE(monitor.AddWatch(second, 3));
  fs::rename(second, parent / "elsewhere");
  EXPECT_TRUE(probe.WaitForWatchError(3));
}

TEST(ChangeMonitor, BurstOfTenThousandFilesReportsEveryNameOrTheLoss) {
  TempDir root;
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 1));

  constexpr std::size_t kFiles = 10000;
  for (std::size_t i = 0; i < kFiles; ++i) Touch(root / ("f" + std::to_string(i)));
  ASSERT_TRUE(probe.WaitUntilSettled(1, kFiles));
  if (!probe.WatchErrors().empty()) return;  // the kernel dropped events and said so
  const std::set<std::string> names = probe.NamesFor(1);
  for (std::size_t i = 0; i < kFiles; ++i) ASSERT_EQ(names.count("f" + std::to_string(i)), 1u) << i;
}

TEST(ChangeMonitor, QueueOverflowSilencesTheWatchesAndSaysSo) {
  std::ifstream limitFile("/proc/sys/fs/inotify/max_queued_events");
  std::size_t limit = 0;
  if (!(limitFile >> limit) || limit > 100000) GTEST_SKIP() << "kernel queue too long to fill here";
  TempDir root, fence;
  Probe probe;
  WorkerGate gate;
  ChangeMonitor monitor(gate.Wrap(probe.Handlers()));
  ASSERT_NO_FATAL_FAILURE(gate.HoldIn(monitor, root, 1));

  for (std::size_t i = 0; i < limit + 500; ++i) Touch(root / ("f" + std::to_string(i)));
  gate.Release();
  ASSERT_TRUE(probe.WaitForWatchError(1));

  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 2));
  Touch(root / "after");
  Fence(probe, fence, 2, "fence");
  EXPECT_FALSE(probe.Saw(1, {"after", kAdded}));
  EXPECT_EQ(probe.WatchErrors(), std::vector<std::int64_t>{1});
}

TEST(ChangeMonitor, OverlappingRootsShareDirectoriesAndRemovalKeepsTheOther) {
  TempDir root, fence;
  fs::create_directories(root / "sub/deeper");
  Probe probe;
  WorkerGate gate;
  ChangeMonitor monitor(gate.Wrap(probe.Handlers()));
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 1));
  ASSERT_TRUE(monitor.AddWatch(root / "sub", 2));
  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 3));

  Touch(root / "sub/deeper/f");
  EXPECT_TRUE(probe.WaitFor(1, {"sub/deeper/f", kAdded}));
  EXPECT_TRUE(probe.WaitFor(2, {"deeper/f", kAdded}));

  fs::rename(root / "sub/deeper/f", root / "sub/g");
  EXPECT_TRUE(probe.WaitForAll(1, {{"sub/deeper/f", kOld}, {"sub/g", kNew}}));
  EXPECT_TRUE(probe.WaitForAll(2, {{"deeper/f", kOld}, {"g", kNew}}));

  // Into the inner root from the outer one: a rename for one, an arrival for the other.
  // The worker, woken by the new file, is held while it moves: both halves of the move
  // are then queued before its next read, however the machine schedules it.
  ASSERT_NO_FATAL_FAILURE(gate.HoldOn(root / "top"));
  fs::rename(root / "top", root / "sub/top");
  gate.Release();
  EXPECT_TRUE(probe.WaitForAll(1, {{"top", kOld}, {"sub/top", kNew}}));
  EXPECT_TRUE(probe.WaitFor(2, {"top", kAdded}));

  fs::create_directories(root / "sub/fresh/x");
  EXPECT_TRUE(probe.WaitForAll(1, {{"sub/fresh/", kAdded}, {"sub/fresh/x/", kAdded}}));
  EXPECT_TRUE(probe.WaitForAll(2, {{"fresh/", kAdded}, {"fresh/x/", kAdded}}));

  monitor.RemoveWatch(2);
  const std::size_t before = probe.EventsFor(2);
  Touch(root / "sub/fresh/x/h");
  EXPECT_TRUE(probe.WaitFor(1, {"sub/fresh/x/h", kAdded}));
  Fence(probe, fence, 3, "fence");
  EXPECT_EQ(probe.EventsFor(2), before);
}

}  // namespace
