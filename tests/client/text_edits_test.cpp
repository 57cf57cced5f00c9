// The text helpers: positions and byte offsets in UTF-16 and UTF-8 across surrogate
// pairs, CRLF and invalid bytes; edits applied as the protocol defines them; workspace
// edits written to files all or nothing.
#include <gtest/gtest.h>

#include <filesystem>

#include "edit_helpers.h"
#include "vexil_test/support.h"

namespace {

using LSP::PositionEncoding;
using vexil_test::ReadFile;
using vexil_test::DocumentEdit;
using vexil_test::Edit;

// "a😀b" CRLF "cé" CR "d": bytes a 0, 😀 1-4, b 5, CR 6, LF 7, c 8, é 9-10, CR 11, d 12.
const std::string kMixed = "a\xF0\x9F\x98\x80" "b\r\nc\xC3\xA9\rd";

TEST(Positions, ConvertToOffsetsAndBackRoundingDownInsideCharacters) {
  const PositionEncoding u16 = PositionEncoding::Utf16;
  const PositionEncoding u8 = PositionEncoding::Utf8;
  struct Row {
    std::string text;
    int line, character;
    PositionEncoding encoding;
    std::size_t offset;
  } rows[] = {
      {kMixed, 0, 1, u16, 1},  {kMixed, 0, 2, u16, 1},   {kMixed, 0, 3, u16, 5},  {kMixed, 0, 4, u16, 6},
      {kMixed, 0, 99, u16, 6}, {kMixed, 1, 1, u16, 9},   {kMixed, 1, 2, u16, 11}, {kMixed, 2, 1, u16, 13},
      {kMixed, 7, 0, u16, 13}, {kMixed, -1, -5, u16, 0}, {kMixed, 0, 3, u8, 1},   {kMixed, 0, 5, u8, 5},
      {kMixed, 1, 2, u8, 9},   {kMixed, 1, 3, u8, 11},   {"x\xFFy", 0, 2, u16, 2}, {"\xE2\x82z", 0, 2, u16, 2},
      {"ab\n", 1, 0, u16, 3},  {"ab\n", 2, 4, u16, 3},
  };
  for (const Row& row : rows)
    EXPECT_EQ(LSP::PositionToOffset(row.text, LSP::Position(row.line, row.character), row.encoding), row.offset)
        << row.line << ":" << row.character << (row.encoding == u8 ? " utf-8" : "");

  struct Back {
    std::size_t offset;
    PositionEncoding encoding;
    int line, character;
  } backs[] = {{3, u16, 0, 1}, {5, u16, 0, 3}, {7, u16, 0, 4}, {10, u16, 1, 1},
               {13, u16, 2, 1}, {99, u16, 2, 1}, {3, u8, 0, 1}, {5, u8, 0, 5}};
  for (const Back& back : backs) {
    const LSP::Position position = LSP::OffsetToPosition(kMixed, back.offset, back.encoding);
    EXPECT_EQ(position.line * 100 + position.character, back.line * 100 + back.character) << back.offset;
  }
}

TEST(ApplyTextEdits, RangesReferToTheOriginalTextAndOverlapsAreRefused) {
  struct Row {
    std::string text;
    std::vector<LSP::TextEdit> edits;
    std::string expected;  // the edited text, or the error
    bool applied;
    PositionEncoding encoding = PositionEncoding::Utf16;
  } rows[] = {
      {"int \xC3\xA9 = 1;\nint \xF0\x9F\x98\x80x = 2;\nend\n",
       {Edit(1, 6, 1, 7, "y"), Edit(0, 4, 0, 5, "e"), Edit(2, 0, 3, 0, "")},
       "int e = 1;\nint \xF0\x9F\x98\x80y = 2;\n", true},
      // Inserts at one place keep their order, before a replacement there.
      {"abc", {Edit(0, 1, 0, 2, "X"), Edit(0, 1, 0, 1, "1"), Edit(0, 1, 0, 1, "2")}, "a12Xc", true},
      // Past the last line and past the line's end both mean the end.
      {"ab", {Edit(5, 0, 5, 0, "!"), Edit(0, 2, 0, 9, "?")}, "ab!?", true},
      {"a\r\nb\r\n", {Edit(0, 1, 1, 0, "\n"), Edit(1, 7, 1, 7, "X")}, "a\nbX\r\n", true},
      {"\xC3\xA9!", {Edit(0, 2, 0, 3, "?")}, "\xC3\xA9?", true, PositionEncoding::Utf8},
      {"abcdef", {Edit(0, 3, 0, 5, "y"), Edit(0, 1, 0, 4, "x")}, "Overlapping edits at 0:1-0:4 and 0:3-0:5", false},
      {"abcdef", {Edit(0, 1, 0, 4, "x"), Edit(0, 2, 0, 2, "in")}, "Overlapping edits at 0:1-0:4 and 0:2-0:2", false},
      {"abcdef", {Edit(0, 4, 0, 1, "x")}, "Edit range ends before it starts: 0:4-0:1", false},
  };
  for (const Row& row : rows) {
    std::string text = row.text;
    std::string error;
    EXPECT_EQ(LSP::ApplyTextEdits(text, row.edits, error, row.encoding), row.applied) << row.expected;
    EXPECT_EQ(row.applied ? text : error, row.expected);
    if (!row.applied) {
      EXPECT_EQ(text, row.text);
    }
  }
}

void Write(const std::string& path, const std::string& text) { std::ofstream(path, std::ios::binary) << text; }

std::size_t Entries(const std::filesystem::path& directory) {
  return static_cast<std::size_t>(std::distance(std::filesystem::directory_iterator(directory), {}));
}

TEST(ApplyWorkspaceEdit, EditsEveryFileOrLeavesEveryFileAsItWas) {
  vexil_test::TempDirectory directory;
  const std::string a = directory / "a.txt";
  const std::string b = directory / "b.txt";
  std::filesystem::create_directory(directory / "folder");
  Write(a, "one\ntwo\n");
  Write(b, "x\xF0\x9F\x98\x80y\n");
  const LSP::TextDocumentEdit editA = DocumentEdit(a, {Edit(0, 0, 0, 3, "ONE")});
  const struct Row {
    LSP::TextDocumentEdit second;
    std::string error;
  } failures[] = {
      {DocumentEdit(directory / "missing.txt", {Edit(0, 0, 0, 0, "x")}), "Cannot find " + (directory / "missing.txt")},
      {DocumentEdit(b, {Edit(0, 0, 0, 3, "x"), Edit(0, 1, 0, 1, "y")}), "Cannot edit "},
      {DocumentEdit("http://host/b.txt", {Edit(0, 0, 0, 0, "x")}), "Not a local file: http://host/b.txt"},
      {DocumentEdit(directory / "folder", {Edit(0, 0, 0, 0, "x")}), "Cannot read "},
  };
  for (const Row& row : failures) {
    LSP::WorkspaceEdit edit;
    edit.documentChanges = {editA, row.second};
    std::string error;
    EXPECT_FALSE(LSP::ApplyWorkspaceEdit(edit, error));
    EXPECT_EQ(error.rfind(row.error, 0), 0u) << error;
    EXPECT_EQ(ReadFile(a), "one\ntwo\n");
    EXPECT_EQ(ReadFile(b), "x\xF0\x9F\x98\x80y\n");
    EXPECT_EQ(Entries(directory.Path()), 3u) << "a temporary file was left behind";
  }

  // A document listed twice takes its edits in turn; one without edits is not even read.
  LSP::WorkspaceEdit edit;
  edit.documentChanges = {editA, DocumentEdit(b, {Edit(0, 3, 0, 4, "Y")}), DocumentEdit(a, {Edit(0, 0, 0, 3, "1")}),
                          DocumentEdit(directory / "missing.txt", {})};
  std::string error;
  EXPECT_TRUE(LSP::ApplyWorkspaceEdit(edit, error)) << error;
  EXPECT_EQ(ReadFile(a), "1\ntwo\n");
  EXPECT_EQ(ReadFile(b), "x\xF0\x9F\x98\x80Y\n");
  EXPECT_EQ(Entries(directory.Path()), 3u);
}

}  // namespace
