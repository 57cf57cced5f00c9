// Workspace edits on POSIX files: written through a symbolic link to its target with the
// target's mode kept, and a write the system refuses (a file-size limit standing in for a
// full disk) leaves every file as it was.
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <csignal>
#include <filesystem>

#include "edit_helpers.h"
#include "vexil_test/support.h"

namespace {

using vexil_test::ReadFile;

LSP::TextDocumentEdit Replace(const std::string& path, const std::string& text) {
  return vexil_test::DocumentEdit(path, {vexil_test::Edit(0, 0, 9, 0, text)});
}

// Lowers the file-size limit of the process for one scope; going past it fails the
// write with EFBIG instead of killing the process.
class FileSizeLimit {
 public:
  explicit FileSizeLimit(rlim_t bytes) : signal_(std::signal(SIGXFSZ, SIG_IGN)) {
    getrlimit(RLIMIT_FSIZE, &saved_);
    rlimit lowered = saved_;
    lowered.rlim_cur = bytes;
    setrlimit(RLIMIT_FSIZE, &lowered);
  }
  ~FileSizeLimit() {
    setrlimit(RLIMIT_FSIZE, &saved_);
    std::signal(SIGXFSZ, signal_);
  }

 private:
  rlimit saved_;
  void (*signal_)(int);
};

TEST(ApplyWorkspaceEdit, WritesThroughLinksKeepingTheModeAndUndoesNothingHalfWritten) {
  vexil_test::TempDirectory directory;
  std::filesystem::create_directory(directory / "real");
  const std::string target = directory / "real/target.txt";
  const std::string link = directory / "link.txt";
  std::ofstream(target) << "old\n";
  chmod(target.c_str(), 0640);
  std::filesystem::create_symlink("real/target.txt", link);

  LSP::WorkspaceEdit edit;
  edit.documentChanges = {Replace(link, "new\n")};
  std::string error;
  ASSERT_TRUE(LSP::ApplyWorkspaceEdit(edit, error)) << error;
  EXPECT_TRUE(std::filesystem::is_symlink(link));
  EXPECT_EQ(ReadFile(target), "new\n");
  struct stat status;
  ASSERT_EQ(stat(target.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777, 0640u);

  const std::string big = directory / "big.txt";
  std::ofstream(big) << "small\n";
  edit.documentChanges = {Replace(target, "newer\n"), Replace(big, std::string(4096, 'x'))};
  {
    FileSizeLimit limit(1024);
    EXPECT_FALSE(LSP::ApplyWorkspaceEdit(edit, error));
  }
  EXPECT_EQ(error, "Cannot write " + big + ": File too large");
  EXPECT_EQ(ReadFile(target), "new\n");
  EXPECT_EQ(ReadFile(big), "small\n");
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(directory / "real"), {}), 1);
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(directory.Path()), {}), 3);
}

}  // namespace
