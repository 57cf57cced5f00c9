// Feature results in every shape a server may send: bare arrays and list objects, null,
// single locations, string / object / array hover contents, hierarchical symbols.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/feature_results.h"

namespace {

using vexil_test::ReadResult;
using vexil_test::ThrownText;

const char kRange[] = R"({"start":{"line":2,"character":1},"end":{"line":2,"character":5}})";

TEST(CompletionList, ReadsArraysListsAndNullAlike) {
  LSP::CompletionList array;
  ReadResult(R"([{"label":"a"},{"label":"b"}])", array);
  EXPECT_EQ(array.items.size(), 2u);
  EXPECT_FALSE(array.isIncomplete);

  LSP::CompletionList list;
  ReadResult(R"({"isIncomplete":true,"items":[{"label":"a"},{"label":"b"}]})", list);
  ASSERT_EQ(list.items.size(), 2u);
  EXPECT_TRUE(list.isIncomplete);
  EXPECT_EQ(list.items[1].label, "b");

  for (const char* nothing : {"null", R"("text")", "3"}) {
    LSP::CompletionList empty;
    ReadResult(nothing, empty);
    EXPECT_TRUE(empty.items.empty()) << nothing;
  }
  LSP::CompletionList bad;
  EXPECT_EQ(ThrownText([&] { ReadResult(R"({"items":{}})", bad); }),
            "Expecting a array JSON object but found 3 JSON object .");
  EXPECT_TRUE(LSP::CompletionList().IsObject());
}

TEST(CompletionItem, ReadsEveryKeptMemberAndDefaultsTheAbsentOnes) {
  LSP::CompletionList list;
  ReadResult(std::string(R"j([{"label":"push_back","labelDetails":{"detail":"(T)","description":"void"},"kind":2,)j"
                         R"("detail":"void","documentation":"Appends.","deprecated":true,"sortText":"1","filterText":"pb",)"
                         R"("insertText":"push_back","insertTextFormat":2,"textEdit":{"range":)") +
                 kRange + R"(,"newText":"push_back"},"commitCharacters":["("]},{"label":"x"}])",
             list);
  ASSERT_EQ(list.items.size(), 2u);
  const LSP::CompletionItem& full = list.items[0];
  EXPECT_EQ(full.labelDetails.detail, "(T)");
  EXPECT_EQ(full.labelDetails.description, "void");
  EXPECT_EQ(full.kind, 2);
  EXPECT_EQ(full.documentation.value, "Appends.");
  EXPECT_TRUE(full.deprecated);
  EXPECT_EQ(full.sortText + full.filterText + full.insertText, "1pbpush_back");
  EXPECT_EQ(full.insertTextFormat, 2);
  EXPECT_EQ(full.textEdit.range.end.character, 5);
  EXPECT_EQ(full.textEdit.newText, "push_back");
  const LSP::CompletionItem& bare = list.items[1];
  EXPECT_EQ(bare.kind, -1);
  EXPECT_EQ(bare.insertTextFormat, -1);
  EXPECT_EQ(bare.textEdit.range.start.line, -1);
}

TEST(LocationsList, ReadsNullASingleLocationOrAnArray) {
  LSP::LocationsList none;
  ReadResult("null", none);
  EXPECT_TRUE(none.items.empty());
  EXPECT_FALSE(none.IsObject());

  LSP::LocationsList single;
  ReadResult(std::string(R"({"uri":"file:///a.c","range":)") + kRange + "}", single);
  ASSERT_EQ(single.items.size(), 1u);
  EXPECT_EQ(single.items[0].uri, "file:///a.c");
  EXPECT_EQ(single.items[0].range.start.character, 1);

  LSP::LocationsList several;
  ReadResult(R"([{"uri":"file:///a.c"},{"uri":"file:///b.c"}])", several);
  ASSERT_EQ(several.items.size(), 2u);
  EXPECT_EQ(several.items[1].uri, "file:///b.c");
}

TEST(Hover, ContentsMayBeAStringAnObjectOrAnArray) {
  LSP::Hover text;
  ReadResult(R"({"contents":"int x"})", text);
  EXPECT_EQ(text.contents.value, "int x");
  EXPECT_EQ(text.contents.kind, "");
  EXPECT_EQ(text.range.start.line, -1);
  EXPECT_EQ(text.range.end.character, -1);

  LSP::Hover markup;
  ReadResult(std::string(R"({"contents":{"kind":"markdown","value":"**x**"},"range":)") + kRange + "}", markup);
  EXPECT_EQ(markup.contents.kind, "markdown");
  EXPECT_EQ(markup.contents.value, "**x**");
  EXPECT_EQ(markup.range.end.character, 5);

  LSP::Hover marked;
  ReadResult(R"({"contents":["first",{"language":"c","value":"int x"},"second"]})", marked);
  EXPECT_EQ(marked.contents.value, "first");
  ASSERT_EQ(marked.contents.items.size(), 1u);
  EXPECT_EQ(marked.contents.items[0].language, "c");
}

TEST(SignatureHelp, ReadsSignaturesAndRejectsOffsetLabels) {
  LSP::SignatureHelp help;
  ReadResult(R"j({"signatures":[{"label":"f(int a)","documentation":"Does f.","parameters":[{"label":"int a"}]}]})j", help);
  ASSERT_EQ(help.signatures.size(), 1u);
  EXPECT_EQ(help.signatures[0].documentation.value, "Does f.");
  EXPECT_EQ(help.signatures[0].parameters[0].label, "int a");
  EXPECT_EQ(help.activeSignature, -1);
  EXPECT_EQ(help.activeParameter, -1);

  LSP::SignatureHelp offsets;
  EXPECT_EQ(ThrownText([&] { ReadResult(R"j({"signatures":[{"label":"f(int a)","parameters":[{"label":[2,7]}]}]})j", offsets); }),
            "Error:Error:Expecting a 'string' JSON object but found 'array ' JSON object.\n\n"
            "Expecting a array JSON object but found 4 JSON object.\n\n"
            "Expecting a array JSON object but found 4 JSON object.");
}

TEST(SymbolInformationList, HierarchicalSymbolsTakeTheRequestedDocumentAndTheirRange) {
  LSP::SymbolInformationList symbols("file:///style.css");
  ReadResult(std::string(R"([{"name":"body","kind":5,"range":)") + kRange +
                 R"(,"selectionRange":{"start":{"line":2,"character":1},"end":{"line":2,"character":2}},)"
                 R"("children":[{"name":"color","kind":7,"range":{"start":{"line":3,"character":2},)"
                 R"("end":{"line":3,"character":9}},"selectionRange":{"start":{"line":3,"character":2},)"
                 R"("end":{"line":3,"character":7}}}]},)"
                 R"({"name":"flat","kind":12,"location":{"uri":"file:///other.css","range":)" +
                 kRange + "}}]",
             symbols);
  ASSERT_EQ(symbols.items.size(), 2u);
  const LSP::SymbolInformation& body = symbols.items[0];
  EXPECT_EQ(body.location.uri, "file:///style.css");
  EXPECT_EQ(body.location.range.end.character, 5);
  ASSERT_EQ(body.children.size(), 1u);
  EXPECT_EQ(body.children[0].location.uri, "file:///style.css");
  EXPECT_EQ(body.children[0].location.range.end.character, 9);
  EXPECT_EQ(symbols.items[1].location.uri, "file:///other.css");

  LSP::SymbolInformationList workspace;
  ReadResult(R"([{"name":"x","kind":13}])", workspace);
  EXPECT_EQ(workspace.items[0].location.uri, "");
  EXPECT_EQ(workspace.items[0].location.range.start.line, -1);
  EXPECT_EQ(ThrownText([&] { ReadResult("{}", workspace); }), "Expecting a array JSON object but found 3 JSON object .");

  // Reading nests as deep as the tree: 1,000 levels read, deeper ones are malformed.
  for (int depth : {1000, 1001, 300000}) {
    std::string tree;
    for (int level = 0; level < depth; ++level) tree += R"({"name":"s","kind":5,"children":[)";
    for (int level = 0; level < depth; ++level) tree += "]}";
    LSP::SymbolInformationList nested("file:///deep.css");
    std::string thrown = ThrownText([&] { ReadResult("[" + tree + "]", nested); });
    EXPECT_EQ(thrown.find("Failed to read JSON object: nested deeper than 1000 levels") != std::string::npos,
              depth > 1000)
        << depth << ": " << thrown;
  }
}

TEST(DocumentFormattingList, ReadsEditsAsAnArrayOnly) {
  LSP::DocumentFormattingList edits;
  ReadResult(std::string(R"([{"range":)") + kRange + R"(,"newText":"  "}])", edits);
  ASSERT_EQ(edits.items.size(), 1u);
  EXPECT_EQ(edits.items[0].newText, "  ");
  EXPECT_FALSE(edits.IsObject());
  LSP::DocumentFormattingList bad;
  EXPECT_EQ(ThrownText([&] { ReadResult(R"([{"range":{},"newText":1}])", bad); }),
            "Error:Expecting a 'string' JSON object but found 'number' JSON object.\n\n"
            "Expecting a array JSON object but found 4 JSON object.");
}

}  // namespace
