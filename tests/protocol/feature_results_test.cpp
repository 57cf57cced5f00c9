// Feature results in every shape a server may send: bare arrays and list objects, null,
// single locations, string / object / array hover contents, hierarchical symbols, code
// actions mixed with bare commands, selection chains, hint labels, rename answers, tokens.
#include <gtest/gtest.h>

#include <gmock/gmock.h>

#include "reply_helpers.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/semantic_tokens.h"

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
  // Each item keeps its text, for a resolve, unless the list is told it need not.
  EXPECT_EQ(bare.rawJson, R"({"label":"x"})");
  EXPECT_NE(full.rawJson.find(R"("commitCharacters":["("])"), std::string::npos);
  LSP::CompletionList lean;
  lean.keepItemJson = false;
  ReadResult(R"({"items":[{"label":"x","data":1}]})", lean);
  EXPECT_EQ(lean.items.at(0).rawJson, "");
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
  EXPECT_EQ(marked.contents.items[0].language + ":" + marked.contents.items[0].value, "c:int x");
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

TEST(CodeActionList, ActionsAndBareCommandsMixInOneList) {
  LSP::CodeActionList list;
  ReadResult(std::string(R"([{"title":"Run","command":"run","arguments":[1,{"a":null}]},)"
                         R"({"title":"Fix","kind":"quickfix","diagnostics":[{"range":)") +
                 kRange + R"(,"message":"m","code":"E1"}],"edit":{"documentChanges":[{"textDocument":)"
                          R"({"uri":"file:///a.c","version":3},"edits":[{"range":)" +
                 kRange + R"(,"newText":"x"}]}]},"command":{"title":"Then","command":"after"}},{"title":"Bare"}])",
             list);
  ASSERT_EQ(list.items.size(), 3u);
  const LSP::CodeAction& command = list.items[0];
  EXPECT_EQ(command.title, "Run");
  EXPECT_EQ(command.command.arguments, R"([1,{"a":null}])");
  EXPECT_FALSE(command.HasEdit());
  const LSP::CodeAction& fix = list.items[1];
  EXPECT_EQ(fix.diagnostics[0].codeText, "E1");
  EXPECT_EQ(fix.edit.documentChanges[0].textDocument.version, 3);
  EXPECT_EQ(fix.command.command, "after");
  EXPECT_FALSE(list.items[2].HasEdit() || list.items[2].HasCommand());
  EXPECT_EQ(ThrownText([&] { ReadResult("{}", list); }), "Expecting a array JSON object but found 3 JSON object .");
}

TEST(SelectionRange, ParentsAreReadInnermostFirstUpToAThousand) {
  LSP::SelectionRangeList list;
  ReadResult(R"([{"range":{"start":{"line":5,"character":2},"end":{"line":5,"character":4}},"parent":{"range":)"
             R"({"start":{"line":5,"character":0},"end":{"line":6,"character":0}},"parent":{"range":)"
             R"({"start":{"line":0,"character":0},"end":{"line":9,"character":0}}}}},{"range":{}}])",
             list);
  ASSERT_EQ(list.items.size(), 2u);
  EXPECT_EQ(list.items[0].range.start.character, 2);
  ASSERT_EQ(list.items[0].parents.size(), 2u);
  EXPECT_EQ(list.items[0].parents[0].end.line, 6);
  EXPECT_EQ(list.items[0].parents[1].end.line, 9);
  EXPECT_TRUE(list.items[1].parents.empty());

  // Each parent wraps the range before it; the last wrapped is the innermost.
  for (const int depth : {1000, 1001}) {
    std::string json = std::string(R"({"range":)") + kRange + "}";
    for (int k = 0; k < depth; ++k) json = std::string(R"({"range":)") + kRange + R"(,"parent":)" + json + "}";
    LSP::SelectionRangeList deep;
    const std::string thrown = ThrownText([&] { ReadResult("[" + json + "]", deep); });
    if (depth == 1000) EXPECT_EQ(deep.items.at(0).parents.size(), 1000u) << thrown;
    else EXPECT_THAT(thrown, testing::HasSubstr("parent\nFailed to read JSON object: nested deeper than 1000 levels"));
  }
}

TEST(InlayHint, LabelIsTextOrPartsJoined) {
  LSP::InlayHintList hints;
  ReadResult(R"([{"position":{"line":3,"character":8},"label":"value:","kind":2,"paddingRight":true},)"
             R"({"position":{"line":4,"character":1},"label":[{"value":": "},{"value":"Rectangle","location":)"
             R"({"uri":"file:///s.h","range":{"start":{"line":9,"character":6},"end":{"line":9,"character":15}}}}],)"
             R"("tooltip":"type","textEdits":[{"range":{"start":{"line":4,"character":1},"end":{"line":4,"character":1}},)"
             R"("newText":": Rectangle"}]}])",
             hints);
  ASSERT_EQ(hints.items.size(), 2u);
  EXPECT_EQ(hints.items[0].label, "value:");
  EXPECT_TRUE(hints.items[0].labelParts.empty());
  EXPECT_TRUE(hints.items[0].paddingRight && !hints.items[0].paddingLeft);
  const LSP::InlayHint& parts = hints.items[1];
  EXPECT_EQ(parts.label, ": Rectangle");
  ASSERT_EQ(parts.labelParts.size(), 2u);
  EXPECT_EQ(parts.labelParts[1].location.uri, "file:///s.h");
  EXPECT_EQ(parts.labelParts[0].location.uri, "");
  EXPECT_EQ(parts.kind, -1);
  EXPECT_EQ(parts.tooltip.value, "type");
  EXPECT_EQ(parts.textEdits.at(0).newText, ": Rectangle");
}

TEST(PrepareRenameResult, RangeRangeWithPlaceholderOrDefaultBehavior) {
  struct Row {
    const char* result;
    bool canRename;
    int startCharacter;
    const char* placeholder;
  } rows[] = {
      {kRange, true, 1, ""},
      {R"({"range":{"start":{"line":2,"character":3},"end":{"line":2,"character":5}},"placeholder":"x"})", true, 3, "x"},
      {R"({"defaultBehavior":true})", true, -1, ""},
      {R"({"defaultBehavior":false})", false, -1, ""},
      {"null", false, -1, ""},
  };
  for (const Row& row : rows) {
    LSP::PrepareRenameResult result;
    ReadResult(row.result, result);
    EXPECT_EQ(result.CanRename(), row.canRename) << row.result;
    EXPECT_EQ(result.range.start.character, row.startCharacter) << row.result;
    EXPECT_EQ(result.placeholder, row.placeholder) << row.result;
  }
}

TEST(SemanticTokens, DecodeMakesPositionsAbsoluteAndNamesWhatTheLegendKnows) {
  LSP::SemanticTokensLegend legend;
  legend.tokenTypes = {"variable", "function"};
  legend.tokenModifiers = {"declaration", "static"};
  LSP::SemanticTokens tokens;
  // Same line twice (starts add up), a new line (start from 0), an unknown type and
  // modifier bits beyond the legend (the 32nd included), and an incomplete last group.
  ReadResult(R"({"resultId":"7","data":[2,4,3,1,1, 0,6,2,0,2, 3,1,5,9,4294967295, 1,2]})", tokens);
  const std::vector<LSP::SemanticToken> decoded = tokens.Decode(legend);
  ASSERT_EQ(decoded.size(), 3u);
  EXPECT_EQ(decoded[0].line * 100 + decoded[0].character, 204);
  EXPECT_EQ(decoded[0].type, "function");
  EXPECT_THAT(decoded[0].modifiers, testing::ElementsAre("declaration"));
  EXPECT_EQ(decoded[1].line * 100 + decoded[1].character, 210);
  EXPECT_THAT(decoded[1].modifiers, testing::ElementsAre("static"));
  EXPECT_EQ(decoded[2].line * 100 + decoded[2].character, 501);
  EXPECT_EQ(decoded[2].length, 5);
  EXPECT_EQ(decoded[2].type, "");
  EXPECT_EQ(decoded[2].typeIndex, 9);
  EXPECT_EQ(decoded[2].modifierBits, 4294967295u);
  EXPECT_THAT(decoded[2].modifiers, testing::ElementsAre("declaration", "static"));
  LSP::SemanticTokens bad;
  EXPECT_EQ(ThrownText([&] { ReadResult(R"({"data":[1,-2]})", bad); }),
            "Expecting a uint JSON object but found 6 JSON object .");
}

}  // namespace
