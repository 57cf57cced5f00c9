// Edits shown as unified diffs whose hunks carry the right line numbers.
#include <gtest/gtest.h>

#include "text_edits.h"

namespace {

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
