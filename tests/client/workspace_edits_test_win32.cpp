// Workspace edits on Windows files: a file another program holds open without sharing
// its deletion, or a read-only one, is refused before any file is replaced.
#include <gtest/gtest.h>
#include <windows.h>

#include <fstream>

#include "edit_helpers.h"
#include "vexil_test/support.h"

namespace {

using vexil_test::ReadFile;

LSP::TextDocumentEdit Append(const std::string& path, const std::string& text) {
  return vexil_test::DocumentEdit(path, {vexil_test::Edit(9, 0, 9, 0, text)});
}

TEST(ApplyWorkspaceEdit, FilesThatCannotBeReplacedAreRefusedBeforeAnyIsWritten) {
  vexil_test::TempDirectory directory;
  const std::string free = directory / "free.txt";
  const std::string held = directory / "held.txt";
  const std::string readOnly = directory / "read-only.txt";
  for (const std::string& path : {free, held, readOnly}) std::ofstream(path, std::ios::binary) << "text\n";
  SetFileAttributesA(readOnly.c_str(), FILE_ATTRIBUTE_READONLY);
  HANDLE holder = CreateFileA(held.c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE, nullptr, OPEN_EXISTING,
                              0, nullptr);
  ASSERT_NE(holder, INVALID_HANDLE_VALUE);

  for (const std::string& refused : {held, readOnly}) {
    LSP::WorkspaceEdit edit;
    edit.documentChanges = {Append(free, "more\n"), Append(refused, "more\n")};
    std::string error;
    EXPECT_FALSE(LSP::ApplyWorkspaceEdit(edit, error));
    EXPECT_EQ(error.rfind("Cannot write ", 0), 0u) << error;
    EXPECT_EQ(ReadFile(free), "text\n");
  }
  CloseHandle(holder);
  SetFileAttributesA(readOnly.c_str(), FILE_ATTRIBUTE_NORMAL);

  LSP::WorkspaceEdit edit;
  edit.documentChanges = {Append(free, "more\n"), Append(held, "more\n")};
  std::string error;
  EXPECT_TRUE(LSP::ApplyWorkspaceEdit(edit, error)) << error;
  EXPECT_EQ(ReadFile(held), "text\nmore\n");
}

}  // namespace
