// The change monitor on real directories: what each file-system change is reported as,
// that bursts lose nothing, and how the failures (bad root, vanished root) surface.
#include "watch/change_monitor.h"

#include <gtest/gtest.h>

#include <fstream>
#include <functional>
#include <set>
#include <vector>

#include "monitor_probe.h"

namespace {

using namespace watchtest;

TEST_F(ChangeMonitorTest, RenamedDirectoriesStayWatchedAndARenameAcrossThemIsOneBatch) {
  fs::create_directories(root / "sub/from");
  fs::create_directories(root / "to");
  Touch(root / "sub/from/f");
  ASSERT_TRUE(Watch(7));

  fs::rename(root / "sub/from/f", root / "to/g");
  ASSERT_TRUE(probe.WaitFor(7, {{"sub/from/f", kOld}, {"to/g", kNew}}));
  EXPECT_TRUE(probe.SawBatch(7, {{"sub/from/f", kOld}, {"to/g", kNew}}));
  // A renamed directory keeps being watched under its new name.
  fs::rename(root / "sub", root / "moved");
  EXPECT_TRUE(probe.WaitFor(7, {{"sub/", kOld}, {"moved/", kNew}}));
  Touch(root / "moved/inner.txt");
  EXPECT_TRUE(probe.WaitFor(7, {{"moved/inner.txt", kAdded}}));
  fs::remove_all(root / "moved");
  EXPECT_TRUE(probe.WaitFor(7, {{"moved/inner.txt", kRemoved}, {"moved/from/", kRemoved}, {"moved/", kRemoved}}));
  EXPECT_TRUE(probe.ErrorTexts().empty());
}

// One directory put in place the way programs do it: what it must be reported as, and the
// directory (relative to the root) that must be watched afterwards.
struct Published {
  std::vector<Change> expected;
  std::string directory;
};

TEST(ChangeMonitor, DirectoriesPublishedInABurstAreAllWatched) {
  // Built in place (deeper than the walk holds directories open), or built under a
  // temporary name and renamed into place (git, package managers and editors publish so),
  // the temporary name unique or the same every time.
  const std::vector<std::pair<const char*, std::function<Published(const TempDir&, const std::string&)>>>
      patterns = {
          {"renamed from a unique name",
           [](const TempDir& root, const std::string& n) {
             fs::create_directory(root / (".tmp" + n));
             Touch(root / (".tmp" + n + "/f"));
             fs::rename(root / (".tmp" + n), root / ("p" + n));
             return Published{{{".tmp" + n + "/", kOld}, {"p" + n + "/", kNew}}, "p" + n + "/"};
           }},
          {"deeper than the walk holds directories open",
           [](const TempDir& root, const std::string& n) {
             Published published{{{"t" + n + "/", kAdded}}, "t" + n + "/"};
             for (int level = 0; level < 40; ++level) {
               published.directory += "d/";
               published.expected.push_back({published.directory, kAdded});
             }
             fs::create_directories(root / published.directory);
             Touch(root / (published.directory + "f"));
             published.expected.push_back({published.directory + "f", kAdded});
             return published;
           }},
          {"renamed from one reused name",
           [](const TempDir& root, const std::string& n) {
             fs::create_directory(root / ".tmp");
             Touch(root / ".tmp/f");
             fs::rename(root / ".tmp", root / ("p" + n));
             return Published{{{".tmp/", kOld}, {"p" + n + "/", kNew}}, "p" + n + "/"};
           }},
      };
  // And a tree as deep that exists before the watch starts.
  std::string existing = "existing/";
  for (int level = 0; level < 40; ++level) existing += "d/";
  for (const auto& [pattern, publish] : patterns) {
    TempDir root;
    fs::create_directories(root / existing);
    Probe probe;
    ChangeMonitor monitor(probe.Handlers());
    ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 1));
    std::vector<Published> published;
    for (int i = 0; i < 30; ++i) published.push_back(publish(root, std::to_string(i)));
    // Whenever the monitor got to them, each is watched under its final name.
    Touch(root / (existing + "later"));
    EXPECT_TRUE(probe.WaitFor(1, {{existing + "later", kAdded}})) << pattern;
    for (const Published& one : published) Touch(root / (one.directory + "later"));
    for (const Published& one : published) {
      EXPECT_TRUE(probe.WaitFor(1, one.expected)) << pattern << ": " << one.directory;
      EXPECT_TRUE(probe.WaitFor(1, {{one.directory + "later", kAdded}})) << pattern << ": " << one.directory;
    }
    EXPECT_TRUE(probe.ErrorTexts().empty()) << pattern;
  }
}

TEST_F(ChangeMonitorTest, ContentChangesAndTheRootOnlyForWatchesThatAskAndMovesAsArrivalsAndRemovals) {
  fs::create_directory(root / "sub");
  fs::create_directory(root / "tmp");
  Touch(root / "saved.txt");
  vexil::WatchOptions rootOnly;
  rootOnly.recursive = false;
  rootOnly.modifications = true;
  ASSERT_TRUE(Watch(1, rootOnly));
  ASSERT_TRUE(Watch(2));  // the same directory, as a host watches it
  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 3));

  std::ofstream(root / "written.txt") << "text";
  // An editor's atomic save: the new content written elsewhere, renamed onto the file.
  std::ofstream(root / "tmp/saved.txt") << "new";
  fs::rename(root / "tmp/saved.txt", root / "saved.txt");
  Touch(root / "sub/deeper.txt");
  EXPECT_TRUE(probe.WaitFor(1, {{"written.txt", kAdded}, {"written.txt", kModified}, {"saved.txt", kModified}}));
  EXPECT_TRUE(probe.WaitFor(2, {{"sub/deeper.txt", kAdded}, {"tmp/saved.txt", kOld}, {"saved.txt", kNew}}));
  Fence(probe, fence, 3, "fence");
  EXPECT_FALSE(probe.SawInOneBatch(1, {{"sub/deeper.txt", kAdded}}));
  EXPECT_FALSE(probe.SawInOneBatch(1, {{"tmp/saved.txt", kModified}}));
  EXPECT_FALSE(probe.SawInOneBatch(2, {{"written.txt", kModified}}));
  EXPECT_FALSE(probe.SawInOneBatch(2, {{"saved.txt", kModified}}));

  // Moves into and out of the tree are additions and removals.
  TempDir outside;
  fs::create_directories(outside / "incoming/deep");
  Touch(outside / "incoming/deep/old.txt");
  Touch(outside / "loose.txt");

  fs::rename(outside / "loose.txt", root / "loose.txt");
  fs::rename(outside / "incoming", root / "incoming");
  EXPECT_TRUE(probe.WaitFor(
      2,
      {{"loose.txt", kAdded}, {"incoming/", kAdded}, {"incoming/deep/", kAdded}, {"incoming/deep/old.txt", kAdded}}));
  Touch(root / "incoming/deep/new.txt");
  EXPECT_TRUE(probe.WaitFor(2, {{"incoming/deep/new.txt", kAdded}}));

  fs::rename(root / "incoming", outside / "gone");
  fs::rename(root / "loose.txt", outside / "loose.txt");
  EXPECT_TRUE(probe.WaitFor(2, {{"incoming/", kRemoved}, {"loose.txt", kRemoved}}));

  // What moved out is no longer watched.
  Touch(outside / "gone/deep/after.txt");
  Fence(probe, fence, 3, "moved");
  EXPECT_FALSE(probe.SawInOneBatch(2, {{"incoming/deep/after.txt", kAdded}}));
}

TEST_F(ChangeMonitorTest, RootThatDisappearsEndsItsWatchOnly) {
  const std::string first = root / "first";
  fs::create_directories(first + "/sub");
  Touch(first + "/sub/f");
  ASSERT_TRUE(monitor.AddWatch(first, 1));
  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 2));

  fs::remove_all(first);
  ASSERT_TRUE(probe.WaitForWatchError(1));
  EXPECT_TRUE(probe.SawInOneBatch(1, {{"sub/", kRemoved}}));

  // A new directory under the old name is not the watched one.
  fs::create_directories(first);
  Touch(first + "/again");
  Fence(probe, fence, 2, "fence");
  EXPECT_FALSE(probe.SawInOneBatch(1, {{"again", kAdded}}));
  EXPECT_EQ(probe.WatchErrors(), std::vector<std::int64_t>{1});

  // Moving a root away ends its watch the same way.
  const std::string second = root / "second";
  fs::create_directories(second);
  ASSERT_TRUE(monitor.AddWatch(second, 3));
  fs::rename(second, root / "elsewhere");
  EXPECT_TRUE(probe.WaitForWatchError(3));
}

TEST_F(ChangeMonitorTest, BurstOfTenThousandFilesReportsEveryNameOrTheLoss) {
  ASSERT_TRUE(Watch(1));

  constexpr std::size_t kFiles = 10000;
  for (std::size_t i = 0; i < kFiles; ++i) Touch(root / ("f" + std::to_string(i)));
  ASSERT_TRUE(probe.WaitUntilSettled(1, kFiles));
  if (!probe.WatchErrors().empty()) return;  // the kernel dropped events and said so
  const std::set<std::string> names = probe.NamesFor(1);
  for (std::size_t i = 0; i < kFiles; ++i) ASSERT_EQ(names.count("f" + std::to_string(i)), 1u) << i;
}

TEST_F(ChangeMonitorTest, OverlappingRootsShareDirectoriesAndRemovalKeepsTheOther) {
  fs::create_directories(root / "sub/deeper");
  ASSERT_TRUE(Watch(1));
  ASSERT_TRUE(monitor.AddWatch(root / "sub", 2));
  ASSERT_TRUE(monitor.AddWatch(fence.Path().string(), 3));

  Touch(root / "sub/deeper/f");
  EXPECT_TRUE(probe.WaitFor(1, {{"sub/deeper/f", kAdded}}));
  EXPECT_TRUE(probe.WaitFor(2, {{"deeper/f", kAdded}}));

  fs::rename(root / "sub/deeper/f", root / "sub/g");
  EXPECT_TRUE(probe.WaitFor(1, {{"sub/deeper/f", kOld}, {"sub/g", kNew}}));
  EXPECT_TRUE(probe.WaitFor(2, {{"deeper/f", kOld}, {"g", kNew}}));

  // Into the inner root from the outer one: a rename for one, an arrival for the other.
  // The worker, woken by the new file, is held while it moves: both halves of the move
  // are then queued before its next read, however the machine schedules it.
  ASSERT_NO_FATAL_FAILURE(gate.HoldOn(root / "top"));
  fs::rename(root / "top", root / "sub/top");
  gate.Release();
  EXPECT_TRUE(probe.WaitFor(1, {{"top", kOld}, {"sub/top", kNew}}));
  EXPECT_TRUE(probe.WaitFor(2, {{"top", kAdded}}));

  fs::create_directories(root / "sub/fresh/x");
  EXPECT_TRUE(probe.WaitFor(1, {{"sub/fresh/", kAdded}, {"sub/fresh/x/", kAdded}}));
  EXPECT_TRUE(probe.WaitFor(2, {{"fresh/", kAdded}, {"fresh/x/", kAdded}}));

  monitor.RemoveWatch(2);
  const std::size_t before = probe.EventsFor(2);
  Touch(root / "sub/fresh/x/h");
  EXPECT_TRUE(probe.WaitFor(1, {{"sub/fresh/x/h", kAdded}}));
  Fence(probe, fence, 3, "fence");
  EXPECT_EQ(probe.EventsFor(2), before);
}

}  // namespace

namespace watchtest {

// The kernel's queue for one reader and some more, unless that is more than is worth making.
std::size_t OverflowingBurst() {
  std::ifstream limitFile("/proc/sys/fs/inotify/max_queued_events");
  std::size_t limit = 0;
  return (limitFile >> limit) && limit <= 100000 ? limit + 500 : 0;
}

}  // namespace watchtest
