// Edits shown as unified diffs whose hunks carry the right line numbers; byte columns and
// UTF-16 units converted both ways.
#include <gtest/gtest.h>

#include "columns.h"
#include "text_edits.h"

namespace {

// Columns people give count bytes; the protocol's count UTF-16 units; a column past the
// end of its line means the line's end, and an invalid byte counts as one unit.
TEST(TextEdits, ByteColumnsAndUtf16UnitsConvertBothWays) {
  const std::string text = "x\r\na\xC3\xA9\xF0\x9F\x98\x80\xE9z\r\n";  // a é 😀 (Latin-1 é) z on line 2
  const std::vector<std::pair<int, int>> pairs = {{1, 0}, {2, 1}, {4, 2}, {8, 4}, {9, 5}, {10, 6}};
  for (const auto& [column, units] : pairs) {
    EXPECT_EQ(cli::ProtocolPosition(text, 2, column).character, units) << column;
    EXPECT_EQ(cli::ByteColumn(text, LSP::Position(1, units)), column) << units;
  }
  EXPECT_EQ(cli::ProtocolPosition(text, 2, 40).character, 6);
  EXPECT_EQ(cli::ProtocolPosition(text, 2, 40).line, 1);
  EXPECT_EQ(cli::ByteColumn(text, LSP::Position(1, 40)), 10);
  EXPECT_EQ(cli::NotUtf8At("ok\n\xC3\xA9\n"), "");
  EXPECT_EQ(cli::NotUtf8At("ok\nab\xE9z"), "line 2, column 3");
  EXPECT_EQ(cli::NotUtf8At("\xC3"), "line 1, column 1");       // cut short
  EXPECT_EQ(cli::NotUtf8At("\xC0\xAF"), "line 1, column 1");   // overlong
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
