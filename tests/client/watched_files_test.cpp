// Files changed on disk told to a server, over a real temporary directory: batches once the
// server is initialized, renames and directories (registrations, kinds and unregistration
// through the connection: connection_lifecycle_test).
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "../watch/watch_fixture.h"
#include "client/watched_files.h"
#include "json/rapidjson.h"
#include "vexil/client/uri.h"
#include "vexil/json/json.h"

namespace {

using watchtest::Shared;
using watchtest::TempDir;
using watchtest::Touch;
using Change = std::pair<std::string, int>;  // URI, type

// Everything a notifier handed over: the changes in order, and how many sends they came in.
class Heard {
 public:
  vexil::WatchedFilesNotifier::Callbacks Callbacks() {
    return {[this](const std::string& params) {
              std::vector<Change> sent = Parse(params);
              shared_.Update([&] {
                changes_.insert(changes_.end(), sent.begin(), sent.end());
                ++sends_;
              });
            },
            [this](const std::string& text) { shared_.Update([&] { errors_.push_back(text); }); }};
  }
  // Until every change of `expected` was sent, in whatever batches.
  bool WaitFor(const std::vector<Change>& expected) {
    return shared_.WaitUntil([&] {
      return std::all_of(expected.begin(), expected.end(), [&](const Change& change) { return Has(change); });
    });
  }
  bool WaitForSend(std::chrono::milliseconds deadline) {
    return shared_.WaitUntil([&] { return sends_ > 0; }, deadline);
  }
  std::size_t Sends() {
    return shared_.Read([&] { return sends_; });
  }
  // The first type `uri` was sent with.
  int FirstType(const std::string& uri) {
    return shared_.Read([&] {
      for (const Change& change : changes_)
        if (change.first == uri) return change.second;
      return 0;
    });
  }
  std::vector<std::string> Errors() {
    return shared_.Read([&] { return errors_; });
  }

 private:
  static std::vector<Change> Parse(const std::string& params) {
    LSP::xReader reader;
    std::vector<Change> changes;
    EXPECT_TRUE(reader.Parse(params)) << params;
    for (const auto& change : reader.Root().Value()["changes"].GetArray())
      changes.emplace_back(change["uri"].GetString(), change["type"].GetInt());
    return changes;
  }
  bool Has(const Change& change) const { return std::find(changes_.begin(), changes_.end(), change) != changes_.end(); }

  Shared shared_;
  std::vector<Change> changes_;
  std::size_t sends_ = 0;
  std::vector<std::string> errors_;
};

// The folder a host gives: absolute, with its drive on Windows (unlike the temporary
// directory's path under wine).
std::string Folder(const TempDir& root) { return std::filesystem::absolute(root.Path()).make_preferred().string(); }
// `relative` below `root`, in this platform's separators, as the notifier names it.
std::string At(const TempDir& root, const std::string& relative) {
  return (std::filesystem::path(Folder(root)) / relative).make_preferred().string();
}
std::string Uri(const std::string& path) { return FileToUri(path.c_str()); }

TEST(WatchedFilesNotifier, SendsBatchesOfWhatTheServerRegistered) {
  TempDir root;
  for (const char* name : {"written.txt", "old.txt", "gone.txt"}) Touch(At(root, name));
  const std::string missing = At(root, "missing");
  Heard heard;
  vexil::WatchedFilesNotifier notifier({Folder(root), missing}, heard.Callbacks());
  notifier.ServerInitialized();

  // With nothing registered, every change; a rename is a deletion and a creation.
  Touch(At(root, "a.py"));
  std::ofstream(At(root, "written.txt"), std::ios::app) << "more";
  std::filesystem::rename(At(root, "old.txt"), At(root, "new.txt"));
  std::filesystem::remove(At(root, "gone.txt"));
  std::filesystem::create_directory(At(root, "sub"));
  ASSERT_TRUE(heard.WaitFor({{Uri(At(root, "a.py")), 1},
                             {Uri(At(root, "written.txt")), 2},
                             {Uri(At(root, "old.txt")), 3},
                             {Uri(At(root, "new.txt")), 1},
                             {Uri(At(root, "gone.txt")), 3},
                             {Uri(At(root, "sub")), 1}}));
  EXPECT_EQ(heard.FirstType(Uri(At(root, "a.py"))), 1);  // created and written: created
  EXPECT_EQ(heard.Errors(), std::vector<std::string>{"Cannot watch folder: " + missing + ": not a directory\n"});

  // A burst goes out in a few batches, not one notification per change.
  const std::size_t before = heard.Sends();
  std::vector<Change> burst;
  for (int i = 0; i < 100; ++i) {
    const std::string name = At(root, "sub/b" + std::to_string(i));
    Touch(name);
    burst.emplace_back(Uri(name), 1);
  }
  ASSERT_TRUE(heard.WaitFor(burst));
  EXPECT_LE(heard.Sends() - before, 10u);
}

TEST(WatchedFilesNotifier, SendsNothingBeforeInitializedAndMayBeDestroyedFromItsCallback) {
  TempDir root;
  Heard early;
  vexil::WatchedFilesNotifier waiting({Folder(root)}, early.Callbacks());
  // Shared with the callback, which finishes on the notifier's thread after the test saw it.
  struct Self {
    Shared shared;
    bool destroyed = false;
    std::unique_ptr<vexil::WatchedFilesNotifier> notifier;
  };
  auto self = std::make_shared<Self>();
  self->notifier = std::make_unique<vexil::WatchedFilesNotifier>(
      std::vector<std::string>{Folder(root)}, vexil::WatchedFilesNotifier::Callbacks{[self](const std::string&) {
        self->notifier.reset();
        self->shared.Update([&] { self->destroyed = true; });
      }, {}});
  self->notifier->ServerInitialized();
  Touch(At(root, "a.txt"));
  ASSERT_TRUE(self->shared.WaitUntil([&] { return self->destroyed; }));
  // Ten times the batch delay: the uninitialized one heard the same change meanwhile.
  EXPECT_FALSE(early.WaitForSend(10 * vexil::WatchedFilesNotifier::kBatchDelay));
}

}  // namespace
