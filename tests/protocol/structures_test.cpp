// Edits and diagnostics write their range flattened into themselves, under the keys
// "start" and "end" that readers of the protocol's range expect.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/structures.h"

namespace {

TEST(FlattenedRange, EditsAndDiagnosticsWriteStartAndEndDirectly) {
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"textEdit":{"range":{"start":{"line":2,"character":0},"end":{"line":2,"character":3}},"newText":""}})"));
  LSP::TextEdit edit;
  edit.Read(reader);
  EXPECT_EQ(LSP::ToJsonText(edit), R"({"start":{"line":2,"character":0},"end":{"line":2,"character":3}})");

  LSP::Diagnostic diagnostic;
  diagnostic.range = LSP::Range(LSP::Position(1, 2), LSP::Position(3, 4));
  diagnostic.code = 7;
  diagnostic.message = "unused";
  EXPECT_EQ(LSP::ToJsonText(diagnostic),
            R"({"start":{"line":1,"character":2},"end":{"line":3,"character":4},"code":7,"message":"unused"})");
}

}  // namespace
