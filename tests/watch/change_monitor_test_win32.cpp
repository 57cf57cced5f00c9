// The completion-port monitor on real directories: how directory names are marked, and
// how much overflows a watch's buffer.
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

TEST_F(ChangeMonitorTest, DirectoriesThatStillExistEndInABackslash) {
  fs::create_directories(root / "old");
  // A root written with its own trailing backslash names the same entries.
  ASSERT_TRUE(monitor.AddWatch(root.Path().string() + "\\", 2));

  fs::rename(root / "old", root / "new");
  ASSERT_TRUE(probe.WaitFor(2, {{"new\\", kNew}}));
  fs::create_directories(root / "sub\\deeper");
  ASSERT_TRUE(probe.WaitFor(2, {{"sub\\deeper\\", kAdded}}));
  fs::remove(root / "sub\\deeper");
  if (HasExtendedRead()) return;  // the record itself says what the entry was
  EXPECT_TRUE(probe.WaitFor(2, {{"sub\\deeper", kRemoved}}));
  EXPECT_TRUE(probe.SawInOneBatch(2, {{"old", kOld}}));
}

}  // namespace

namespace watchtest {

// Each record takes 12 bytes and two per character of names like the overflow test's:
// 3000 of them need about 200 KiB, three times what a watch's buffer holds.
std::size_t OverflowingBurst() { return 3000; }

}  // namespace watchtest
