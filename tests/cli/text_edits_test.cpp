// Edits applied at UTF-16 positions, in any order, and shown as unified diffs whose hunks
// carry the right line numbers.
#include <gtest/gtest.h>

#include "text_edits.h"

namespace {

LSP::TextEdit Edit(int line, int from, int endLine, int to, const std::string& text) {
  LSP::TextEdit edit;
  edit.range = LSP::Range(LSP::Position(line, from), LSP::Position(endLine, to));
  edit.newText = text;
  return edit;
}

TEST(TextEdits, EditsApplyAtUtf16PositionsWhateverTheirOrder) {
  // "é" is two bytes and one unit; "😀" four bytes and two units.
  std::string text = "int é = 1;\nint 😀x = 2;\nend\n";
  std::string edited = cli::ApplyEdits(text, {Edit(1, 6, 1, 7, "y"), Edit(0, 4, 0, 5, "e"), Edit(2, 0, 3, 0, "")});
  EXPECT_EQ(edited, "int e = 1;\nint 😀y = 2;\n");
}

TEST(TextEdits, DiffsShowRemovalsBeforeAdditionsInSeparateHunks) {
  std::string before;
  for (int line = 1; line <= 20; ++line) before += "line " + std::to_string(line) + "\n";
  std::string after = before;
  after.replace(after.find("line 2\n"), 7, "line two\n");
  after.replace(after.find("line 18\n"), 8, "");
  EXPECT_EQ(cli::UnifiedDiff("f.txt", before, after),
            "--- f.txt\n+++ f.txt\n"
            "@@ -1,5 +1,5 @@\n line 1\n-line 2\n+line two\n line 3\n line 4\n line 5\n"
            "@@ -15,6 +15,5 @@\n line 15\n line 16\n line 17\n-line 18\n line 19\n line 20\n");
  EXPECT_EQ(cli::UnifiedDiff("f.txt", before, before), "");
}

}  // namespace
