// The change monitor on real directories, as every backend behaves: file and directory
// names created, removed and renamed, refused roots, and destruction while changes flow.
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

TEST(ChangeMonitor, ReportsFilesAndDirectoriesCreatedRemovedAndRenamed) {
  TempDir root;
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());
  ASSERT_EQ(monitor.ErrorText(), "");
  ASSERT_TRUE(monitor.AddWatch(root.Path().string(), 7));

  Touch(root / "a.txt");
  EXPECT_TRUE(probe.WaitFor(7, {"a.txt", kAdded}));
  fs::create_directory(root / "sub");
  EXPECT_TRUE(probe.WaitFor(7, {DirectoryName("sub"), kAdded}));
  fs::rename(root / "a.txt", root / "b.txt");
  EXPECT_TRUE(probe.WaitForAll(7, {{"a.txt", kOld}, {"b.txt", kNew}}));
  fs::remove(root / "b.txt");
  EXPECT_TRUE(probe.WaitFor(7, {"b.txt", kRemoved}));

  // Names below the root are relative to it, with the platform's separator.
  Touch(root / "sub/inner.txt");
  EXPECT_TRUE(probe.WaitFor(7, {DirectoryName("sub") + "inner.txt", kAdded}));
  EXPECT_TRUE(probe.ErrorTexts().empty());
  EXPECT_TRUE(probe.WatchErrors().empty());
}

TEST(ChangeMonitor, RefusesARootThatIsAFileOrMissing) {
  TempDir dir;
  Touch(dir / "plain.txt");
  Probe probe;
  ChangeMonitor monitor(probe.Handlers());

  EXPECT_FALSE(monitor.AddWatch(dir / "plain.txt", 1));
  EXPECT_FALSE(monitor.AddWatch(dir / "missing", 2));
  EXPECT_EQ(probe.ErrorTexts(),
            (std::vector<std::string>{"Path provided is not a directory: " + (dir / "plain.txt") + "\n",
                                      "Cannot create directory handle: 2\n"}));
  EXPECT_TRUE(probe.WatchErrors().empty());
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
