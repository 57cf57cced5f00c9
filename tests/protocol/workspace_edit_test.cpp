// Rename results: the "changes" map most servers answer with, "documentChanges" when given,
// and the errors for maps and lists of the wrong type.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/structures.h"

namespace {

using vexil_test::ReadResult;
using vexil_test::ThrownText;

const char kEdit[] = R"({"range":{"start":{"line":1,"character":0},"end":{"line":1,"character":3}},"newText":"new"})";

TEST(WorkspaceEdit, ChangesMapBecomesOneUnversionedEditPerDocumentInMapOrder) {
  LSP::WorkspaceEdit edit;
  ReadResult(std::string(R"({"changes":{"file:///z.c":[)") + kEdit + "," + kEdit + R"(],"file:///a.c":[)" + kEdit +
                 R"(],"file:///m.c":[]}})",
             edit);
  ASSERT_EQ(edit.documentChanges.size(), 3u);
  EXPECT_EQ(edit.documentChanges[0].textDocument.uri, "file:///z.c");
  EXPECT_EQ(edit.documentChanges[0].textDocument.version, -1);
  EXPECT_EQ(edit.documentChanges[0].edits.size(), 2u);
  EXPECT_EQ(edit.documentChanges[1].textDocument.uri, "file:///a.c");
  EXPECT_EQ(edit.documentChanges[1].edits[0].newText, "new");
  EXPECT_EQ(edit.documentChanges[2].textDocument.uri, "file:///m.c");
  EXPECT_TRUE(edit.documentChanges[2].edits.empty());
  // Written back, it is "documentChanges" as always.
  EXPECT_EQ(LSP::ToJsonText(edit.documentChanges[1]),
            R"({"textDocument":{"uri":"file:///a.c","version":-1},"edits":[)"
            R"({"start":{"line":1,"character":0},"end":{"line":1,"character":3},"newText":"new"}]})");
}

TEST(WorkspaceEdit, DocumentChangesWinOverChangesWhenPresent) {
  LSP::WorkspaceEdit edit;
  ReadResult(std::string(R"({"changes":{"file:///a.c":[)") + kEdit +
                 R"(]},"documentChanges":[{"textDocument":{"uri":"file:///b.c","version":4},"edits":[)" + kEdit + "]}]}",
             edit);
  ASSERT_EQ(edit.documentChanges.size(), 1u);
  EXPECT_EQ(edit.documentChanges[0].textDocument.uri, "file:///b.c");
  EXPECT_EQ(edit.documentChanges[0].textDocument.version, 4);

  LSP::WorkspaceEdit none;
  ReadResult(R"({"changes":null})", none);
  ReadResult("{}", none);
  EXPECT_TRUE(none.documentChanges.empty());
}

TEST(WorkspaceEdit, MapsAndListsOfTheWrongTypeAreReported) {
  LSP::WorkspaceEdit edit;
  EXPECT_EQ(ThrownText([&] { ReadResult(R"({"documentChanges":{}})", edit); }),
            "Expecting a array JSON object but found 3 JSON object .");
  EXPECT_EQ(ThrownText([&] { ReadResult(R"({"changes":[]})", edit); }),
            "Expecting a object JSON object but found 4 JSON object .");
  EXPECT_EQ(ThrownText([&] { ReadResult(R"({"changes":{"file:///a.c":{}}})", edit); }),
            "Expecting a array JSON object but found 3 JSON object .");
}

}  // namespace
