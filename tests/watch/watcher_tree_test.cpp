// The workspace → project → folder tree: case-insensitive names and paths, refused
// duplicates and invalid directories, restarts, null callbacks, each with its trace lines.
#include "watch/watcher_tree.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <memory>

#include "watch_callbacks.h"

namespace {

using namespace watchtest;

std::string Upper(std::string text) {
  std::transform(text.begin(), text.end(), text.begin(), [](unsigned char c) { return std::toupper(c); });
  return text;
}

class WatcherTreeTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ResetRecording();
    fs::create_directory(dir / "a");
    fs::create_directory(dir / "b");
    fs::create_directory(dir / "dir");
    fs::create_directory(dir / "DIR");  // a different directory here, the same name to the tree
  }

  // The lines written since the last call (the tree traces on the caller's thread).
  static std::vector<TraceLine> Taken() {
    const std::vector<TraceLine> lines = TraceLog::Lines();
    TraceLog::Clear();
    return lines;
  }

  TempDir dir;
  const std::string a = dir / "a", b = dir / "b";
};

TEST_F(WatcherTreeTest, ProjectsAndDirectoriesMatchWithoutRegardToCase) {
  std::unique_ptr<xWatcherWorkspace> workspace(
      xWatcher_Workspace(RecordChange, RecordTrace, LSP::TraceLevel::Verbose));

  workspace->Start("App", a.c_str(), nullptr);
  workspace->Start("APP", b.c_str(), nullptr);
  EXPECT_EQ(Taken(), (std::vector<TraceLine>{
                         Verbose("Project: App Directory: " + a + "\n"),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("WatcherFolder::CreateWatcher: " + a + "\n"),
                         Verbose("Project: APP Directory: " + b + "\n"),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("WatcherFolder::CreateWatcher: " + b + "\n"),
                     }));

  workspace->AddDirectory("app", (dir / "dir").c_str());
  workspace->AddDirectory("app", (dir / "DIR").c_str());
  workspace->AddDirectory("app", (dir / "missing").c_str());
  workspace->AddDirectory("nobody", a.c_str());
  EXPECT_EQ(Taken(), (std::vector<TraceLine>{
                         Verbose("WatcherWorkspace::AddDirectory:\n"),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("WatcherFolder::CreateWatcher: " + (dir / "dir") + "\n"),
                         Verbose("WatcherWorkspace::AddDirectory:\n"),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("Ignoring duplicate directory: '" + (dir / "DIR") + "'\n"),
                         Verbose("WatcherWorkspace::AddDirectory:\n"),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("Ignoring Invalid Directory: '" + (dir / "missing") + "'\n"),
                         Verbose("WatcherWorkspace::AddDirectory:\n"),
                     }));

  // Removal finds the folder whatever the case; an unclaimed path changes nothing.
  workspace->RemoveDirectory("App", (dir / "elsewhere").c_str());
  workspace->RemoveDirectory("App", Upper(b).c_str());
  workspace->AddDirectory("App", b.c_str());
  EXPECT_EQ(Taken(), (std::vector<TraceLine>{
                         Verbose("WatcherWorkspace::RemoveDirectory:\n"),
                         Verbose("WatcherProject::RemoveDirectory: " + (dir / "elsewhere") + "\n"),
                         Verbose("WatcherWorkspace::RemoveDirectory:\n"),
                         Verbose("WatcherProject::RemoveDirectory: " + Upper(b) + "\n"),
                         Verbose("WatcherFolder::Stop: " + b + "\n"),
                         Verbose("WatcherWorkspace::AddDirectory:\n"),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("WatcherFolder::CreateWatcher: " + b + "\n"),
                     }));

  workspace->Start("Other", (dir / "missing").c_str(), nullptr);
  workspace.reset();
  EXPECT_EQ(Taken(), (std::vector<TraceLine>{
                         Verbose("Invalid Directory: '" + (dir / "missing") + "'\n"),
                         Verbose("WatcherProject::Stop:\n"),
                     }));
}

TEST_F(WatcherTreeTest, RestartKeepsOnlyTheRootFolder) {
  LSP::WatcherProject project("P", a.c_str(), RecordChange, RecordTrace, LSP::TraceLevel::Verbose);
  project.Start();
  project.AddDirectory(b.c_str());
  Taken();

  project.Restart();
  project.RemoveDirectory(b.c_str());
  project.RemoveDirectory(a.c_str());
  EXPECT_EQ(Taken(), (std::vector<TraceLine>{
                         Verbose("WatcherProject::Start:\n"),
                         Verbose("WatcherProject::Stop:\n"),
                         Verbose("Project: P Directory: " + a + "\n"),
                         Verbose("WatcherFolder::CreateWatcher: " + a + "\n"),
                         Verbose("WatcherProject::RemoveDirectory: " + b + "\n"),
                         Verbose("WatcherProject::RemoveDirectory: " + a + "\n"),
                         Verbose("WatcherFolder::Stop: " + a + "\n"),
                     }));
}

TEST_F(WatcherTreeTest, MissingCallbacksOrLowLevelsSilenceTheTree) {
  std::unique_ptr<xWatcherWorkspace> noChange(xWatcher_Workspace(nullptr, RecordTrace, LSP::TraceLevel::Verbose));
  noChange->Start("App", a.c_str(), nullptr);
  noChange->AddDirectory("App", b.c_str());
  LSP::WatcherProject project("P", a.c_str(), nullptr, RecordTrace, LSP::TraceLevel::Verbose);
  project.Start();
  project.AddDirectory(b.c_str());
  EXPECT_EQ(Taken(), (std::vector<TraceLine>{
                         Verbose("Invalid tracing."),
                         Verbose("WatcherWorkspace::AddDirectory:\n"),
                         Verbose("WatcherProject::Start:\n"),
                         Verbose("WatcherProject::Stop:\n"),
                         Verbose("Invalid tracing."),
                         Verbose("WatcherProject::AddDirectory:\n"),
                         Verbose("Invalid tracing."),
                     }));

  // Without a trace callback the tree does nothing; below level 2 it says nothing.
  std::unique_ptr<xWatcherWorkspace> noTrace(xWatcher_Workspace(RecordChange, nullptr, LSP::TraceLevel::Verbose));
  noTrace->Start("App", a.c_str(), nullptr);
  std::unique_ptr<xWatcherWorkspace> quiet(xWatcher_Workspace(RecordChange, RecordTrace, LSP::TraceLevel::Messages));
  quiet->Start("App", a.c_str(), nullptr);
  quiet->AddDirectory("App", b.c_str());
  EXPECT_TRUE(Taken().empty());
}

}  // namespace
