// Watcher tasks over real temporary directories: changed files with watched extensions
// run the command, others are ignored, and the registry, disabling and release behave.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string>
#include <utility>
#include <vector>

#include "task_test_support.h"
#include "vexil/task/watcher_task.h"

namespace {

using namespace tasktest;

// Descriptors held open as an IDE holds them, numbered past select()'s limit of 1024, with
// the soft limit raised as far as the hard one allows. Held() is 0 when the hard limit is lower.
class ManyDescriptors {
 public:
  explicit ManyDescriptors(int count) {
    rlimit limit{};
    if (getrlimit(RLIMIT_NOFILE, &limit) != 0 || limit.rlim_max < static_cast<rlim_t>(count) + 64) return;
    limit.rlim_cur = std::max<rlim_t>(limit.rlim_cur, static_cast<rlim_t>(count) + 64);
    if (setrlimit(RLIMIT_NOFILE, &limit) != 0) return;
    while (static_cast<int>(held_.size()) < count) held_.push_back(open("/dev/null", O_RDONLY | O_CLOEXEC));
  }
  ~ManyDescriptors() {
    for (const int fd : held_) close(fd);
  }
  ManyDescriptors(const ManyDescriptors&) = delete;
  ManyDescriptors& operator=(const ManyDescriptors&) = delete;

  std::size_t Held() const { return held_.size(); }

 private:
  std::vector<int> held_;
};

class WatcherTaskTest : public ::testing::Test {
 protected:
  void SetUp() override { watchtest::ResetRecording(); }

  std::string Dir() const { return dir_.Path().string(); }
  std::string DirSlash() const { return Dir() + "/"; }

  watchtest::TempDir dir_;
};

TEST_F(WatcherTaskTest, ChangedFilesWithWatchedExtensionsRunTheCommandOnceEnabled) {
  // As IDEs do, the host holds descriptors numbered past what select() can wait on.
  const ManyDescriptors held(1100);
  if (held.Held() == 0) std::cerr << "[ NOTE     ] the descriptor limit is too low to hold 1100 descriptors\n";
  for (const char* file : {"a.cpp", "B.CPP", "notes.txt", "x.h", "saved.cpp"}) watchtest::Touch(dir_ / file);
  xWatcherOptions options = Options("echo ran $F $EXT in $FDD");
  options.disabled = true;
  xWatcherTask* task = xWatcher_Task("cpp", options, {Dir()});
  ASSERT_NE(task, nullptr);
  EXPECT_EQ(xWatcher_Have("cpp"), task);
  task->AddExtension(".cpp");
  task->AddExtension("h");  // without its dot
  task->AddExtension(nullptr);
  task->Start();  // disabled: it watches only once enabled
  EXPECT_TRUE(Traced(Verbose("Watcher Task: 'cpp' => Ignoring disabled watcher.\n")));
  EXPECT_FALSE(Traced(Verbose("Starting to watch directory: " + Dir() + "\n")));
  task->Enable();
  task->Start();

  ASSERT_TRUE(ModifyUntilTraced(dir_ / "a.cpp", "Message", "ran a.cpp .cpp in " + DirSlash() + "\n"));
  // The start, then the change.
  const std::vector<std::string> verbose = {"\nWatcher Task: 'cpp'\n",
                                            "Watching Extension: .cpp\n",
                                            "Watcher Task: 'cpp' => Starting watcher.....\n",
                                            "Starting to watch directory: " + Dir() + "\n",
                                            "      Event: Changed\n",
                                            "       Path: " + DirSlash() + "a.cpp\n",
                                            "  Full Name: " + DirSlash() + "a.cpp\n",
                                            "  Directory: " + DirSlash() + "\n",
                                            "  File Name: a.cpp\n",
                                            "  Base Name: a\n",
                                            "  Extension: .cpp\n",
                                            " UseCommand: 1\n",
                                            "  Arguments: echo ran $F $EXT in $FDD\n"};
  for (const std::string& text : verbose) EXPECT_TRUE(Traced(Verbose(text))) << text;
  EXPECT_TRUE(ModifyUntilTraced(dir_ / "B.CPP", "Message", "ran B.CPP .CPP"));  // compared in lower case
  EXPECT_TRUE(ModifyUntilTraced(dir_ / "x.h", "Message", "ran x.h .h"));
  EXPECT_TRUE(ModifyUntilTraced(dir_ / "notes.txt", "Verbose",
                                "Watcher Task: 'cpp' => Ignoring changes for File: " + DirSlash() +
                                    "notes.txt  Extension: .txt\n"));
  EXPECT_FALSE(WaitForText("Message", "ran notes.txt", std::chrono::milliseconds(0)));

  // An editor's atomic save: the new content under another name, renamed onto the file.
  std::ofstream(dir_ / "saved.cpp.swp") << "new content\n";
  std::filesystem::rename(dir_ / "saved.cpp.swp", dir_ / "saved.cpp");
  EXPECT_TRUE(WaitForText("Message", "ran saved.cpp .cpp"));

  watchtest::Touch(dir_ / "new.cpp");
  EXPECT_TRUE(WaitForTrace(Notice("cpp", "An onFileAdded event.\n")));
  EXPECT_TRUE(Traced(Verbose("      Path: " + DirSlash() + "new.cpp\n")));

  task->Release();
  EXPECT_EQ(xWatcher_Have("cpp"), nullptr);
}

// A task whose trace callback tries to release it on any notice (a plain function: global).
std::atomic<xWatcherTask*> releasing{nullptr};

void ReleaseOnNotice(TraceType type, const char* title, const char* text) {
  TraceLog::Callback(type, title, text);
  if (xWatcherTask* task = releasing.load(); task && type == TraceType::Notice) task->Release();
}

TEST_F(WatcherTaskTest, RegistryKnowsTasksByName) {
  xWatcherOptions options = Options("true");
  EXPECT_EQ(xWatcher_Task("none", options, {}), nullptr);
  EXPECT_EQ(xWatcher_Have("none"), nullptr);
  EXPECT_TRUE(Traced(Verbose(
      "Ignoring 'none' watcher as directories found did not contain file with watched extensions.\n")));

  xWatcherTask* first = xWatcher_Task("twice", options, {Dir()});
  EXPECT_EQ(xWatcher_Task("twice", options, {Dir()}), first);  // no second task under one name

  // A directory that cannot be watched is reported with the system's reason, not thrown to
  // the host, and the task's other directories are watched all the same.
  watchtest::Touch(dir_ / "file");
  std::vector<std::pair<std::string, std::string>> unwatchable = {{Dir() + "/gone", "No such file or directory"},
                                                                  {Dir() + "/file", "Not a directory"}};
  std::filesystem::create_directory(dir_ / "locked");
  std::filesystem::permissions(dir_ / "locked", std::filesystem::perms::none);
  if (geteuid() != 0) {
    unwatchable.emplace_back(Dir() + "/locked", "Permission denied");
  } else {
    std::cerr << "[ NOTE     ] run as root, whom permissions do not stop: no unreadable directory is tried\n";
  }
  std::vector<std::string> directories{Dir()};
  for (const auto& entry : unwatchable) directories.push_back(entry.first);
  xWatcherOptions releasingOptions = options;
  releasingOptions.trace = ReleaseOnNotice;
  xWatcherTask* missing = xWatcher_Task("missing", releasingOptions, directories);
  missing->AddExtension(".cpp");
  missing->Start();
  for (const auto& [directory, reason] : unwatchable) {
    EXPECT_TRUE(Traced(Error("Watcher Task: 'missing' => Cannot watch directory: " + directory + ": " + reason + "\n")))
        << directory;
  }
  // Its callback, on the watching thread, cannot release the task: that would wait for itself.
  releasing = missing;
  watchtest::Touch(dir_ / "new.cpp");
  EXPECT_TRUE(WaitForTrace(Error(
      "Watcher Task: 'missing' => Release refused: called from the task's own callback, it would wait for itself.\n")));
  EXPECT_EQ(xWatcher_Have("missing"), missing);
  releasing = nullptr;
  missing->Release();
  first->Release();
  EXPECT_EQ(xWatcher_Have("twice"), nullptr);
  EXPECT_EQ(xWatcher_Have("missing"), nullptr);
}

TEST_F(WatcherTaskTest, ReleaseWhileACommandRunsNeitherWaitsForItNorKillsIt) {
  watchtest::Touch(dir_ / "a.cpp");
  xWatcherTask* task = xWatcher_Task("long", Options("echo pid $$; exec sleep 30", 60000), {Dir()});
  task->AddExtension(".cpp");
  task->Start();
  ASSERT_TRUE(ModifyUntilTraced(dir_ / "a.cpp", "Message", "pid "));
  EXPECT_TRUE(ReturnsWithin(std::chrono::seconds(10), [&] { task->Release(); }));  // not the child's 30 s
  EXPECT_TRUE(Traced(Error("ERROR: The Watcher Command task is still running.\n")));
  // One save may be reported as several modifications, each starting a child.
  std::vector<int> pids;
  for (const TraceLine& line : TraceLog::Lines()) {
    const auto at = line.text.find("pid ");
    if (line.title == "Message" && at != std::string::npos) pids.push_back(std::stoi(line.text.substr(at + 4)));
  }
  for (const int pid : pids) {
    ASSERT_GT(pid, 0);  // kill(0) would signal the whole test run
    EXPECT_EQ(kill(pid, 0), 0) << "never killed by the library";
    kill(pid, SIGKILL);
    EXPECT_TRUE(WaitUntilGone(pid));
  }
}

}  // namespace
