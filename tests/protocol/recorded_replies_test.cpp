// Real replies of clangd and pylsp on the example projects, recorded by
// tests/data/record/record_replies.py, read back into the result classes; items that go
// back to the server are written as the server sent them.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/call_hierarchy.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"
#include "vexil/protocol/semantic_tokens.h"

namespace {

using namespace vexil_test;
using testing::HasSubstr;
using testing::StartsWith;

// tests/data/replies/<reply>.json read into a T.
template <typename T>
T Recorded(const std::string& reply) {
  T result;
  ReadReply(ReadDataFile("replies/" + reply + ".json"), result);
  return result;
}

std::string List(const std::vector<std::string>& texts) { return Items(texts, [](auto& t) { return t; }, " "); }
std::string Names(const LSP::SymbolInformationList& list) {
  return Fields(Local(list.items.at(0).location.uri), Items(list.items, [](auto& s) { return s.name; }, ","));
}
std::string Kinds(const LSP::DocumentHighlightList& list) {
  return Items(list.items, [](const LSP::DocumentHighlight& h) { return std::to_string(h.kind); }, ",");
}
std::string Providers(const LSP::ServerCapabilities& c) {
  return Fields(c.hoverProvider, c.definitionProvider, c.referencesProvider, c.renameProvider,
                c.documentFormattingProvider, c.workspaceSymbolProvider, c.implementationProvider,
                c.completionProvider.resolveProvider, List(c.completionProvider.triggerCharacters),
                List(c.signatureHelpProvider.triggerCharacters), c.documentOnTypeFormattingProvider.firstTriggerCharacter,
                List(c.executeCommandProvider.commands), c.codeLensProvider.resolveProvider);
}
std::string Last(const std::string& text) { return text.substr(text.rfind('\n') + 1); }
std::string First(const std::string& text) { return text.substr(0, text.find('\n')); }

TEST(RecordedClangd, RepliesReadIntoTheirResults) {
  EXPECT_EQ(Providers(Recorded<LSP::InitializeResult>("clangd/initialize").capabilities),
            "1|1|1|1|1|1|1|0|. < > : \" / *|( ) { } < > ,|\n|clangd.applyFix clangd.applyTweak|0");
  const auto hover = Recorded<LSP::Hover>("clangd/hover");
  EXPECT_EQ(Fields(hover.contents.kind, Last(hover.contents.value), hover.range),
            "plaintext|int Clamp(int value, int low, int high)|14:17-14:22");
  EXPECT_EQ(Item(Recorded<LSP::CompletionList>("clangd/completion").items.at(0)), " Area() const|||2|int||0|40902d60Area|Area|Area|1|12:12-12:12|Area");
  EXPECT_EQ(Locations(Recorded<LSP::LocationsList>("clangd/definition")), "1|/examples/cpp/shapes.cpp|16:4-16:9");
  EXPECT_EQ(Recorded<LSP::LocationsList>("clangd/references").items.size(), 5u);
  EXPECT_EQ(Signatures(Recorded<LSP::SignatureHelp>("clangd/signatureHelp")), "0|0|Clamp(int value, int low, int high) -> int|Limits value to the range from low to high.|int value;int low;int high");
  EXPECT_EQ(Names(Recorded<LSP::SymbolInformationList>("clangd/documentSymbol")), "/examples/cpp/shapes.h|shapes,Rectangle,Rectangle,Area,Perimeter,Scale,width_,height_,Clamp");
  EXPECT_EQ(Names(Recorded<LSP::SymbolInformationList>("clangd/workspaceSymbol")), "/examples/cpp/shapes.h|Rectangle,Rectangle,__LDOUBLE_REDIRECTS_TO_FLOAT128_ABI");
  EXPECT_EQ(Recorded<LSP::DocumentFormattingList>("clangd/formatting").items.size(), 6u);
  EXPECT_EQ(Changes(Recorded<LSP::WorkspaceEdit>("clangd/rename")), "/examples/cpp/main.cpp|-1|14:17-14:22|Limit;/examples/cpp/shapes.cpp|-1|12:11-12:16|Limit;13:12-13:17|Limit;"
            "16:4-16:9|Limit;/examples/cpp/shapes.h|-1|20:4-20:9|Limit");  // from a "changes" map
  EXPECT_EQ(Kinds(Recorded<LSP::DocumentHighlightList>("clangd/documentHighlight")), "1,1,1,1,1");
  const auto selections = Recorded<LSP::SelectionRangeList>("clangd/selectionRange");
  const LSP::SelectionRange& selection = selections.items.at(0);
  EXPECT_EQ(Fields(selections.items.size(), selection.range, selection.parents.size(), selection.parents.back()), "2|14:9-14:22|6|9:0-15:1");
  EXPECT_EQ(Renaming(Recorded<LSP::PrepareRenameResult>("clangd/prepareRename")), "1|14:17-14:22|");
  EXPECT_EQ(Items(Recorded<LSP::CallHierarchyIncomingCallList>("clangd/incomingCalls").items,
                  [](auto& call) { return Fields(call.from.name, call.fromRanges.at(0)); }),
            "Scale|12:11-12:16;main|14:17-14:22");
}

TEST(RecordedClangd, CodeActionsAsLiteralsAndAsBareCommandsAndWhatTheCommandsDo) {
  const auto fixes = Recorded<LSP::CodeActionList>("clangd/codeAction");
  EXPECT_EQ(Actions(fixes), "insert ';'|quickfix|1|0||||expected_semi_after_stmt|/examples/cpp/broken.cpp|-1|2:39-2:39|;");
  EXPECT_TRUE(fixes.items.at(0).isPreferred);
  const LSP::CodeAction command = Recorded<LSP::CodeActionList>("clangd/codeActionCommands").items.at(0);
  EXPECT_EQ(Fields(command.title, command.HasEdit(), command.HasCommand(), command.command.command),
            "Apply fix: insert ';'|0|1|clangd.applyFix");

  // A refactoring's arguments go back in the execute request; the edit that it makes
  // arrives as the server's own request.
  const auto refactorings = Recorded<LSP::CodeActionList>("clangd/codeActionRefactor");
  ASSERT_EQ(refactorings.items.size(), 1u);
  EXPECT_THAT(refactorings.items[0].command.arguments, HasSubstr(R"("tweakID":"ExtractVariable")"));
  LSP::ExecuteCommandParams execute(refactorings.items[0].command);
  EXPECT_THAT(LSP::ToJsonText(execute), StartsWith(R"({"command":"clangd.applyTweak","arguments":[{"file":)"));
  EXPECT_EQ(Recorded<LSP::JsonResult>("clangd/executeCommand").json, R"("Tweak applied.")");
  LSP::xReader request;
  ASSERT_TRUE(request.Parse(ReadDataFile("replies/clangd/applyEdit.json")));
  LSP::ApplyWorkspaceEditParams applyEdit;
  applyEdit.Read(request);
  EXPECT_EQ(Fields(applyEdit.edit.documentChanges.size(), applyEdit.edit.documentChanges.at(0).edits.at(1).newText),
            "1| placeholder");
}

TEST(RecordedClangd, SemanticTokensDecodeWithTheLegendAndCallItemsGoBackWithTheServersData) {
  const auto initialize = Recorded<LSP::InitializeResult>("clangd/initializeFeatures");
  const LSP::ServerCapabilities& capabilities = initialize.capabilities;
  const LSP::SemanticTokensOptions& provider = capabilities.semanticTokensProvider;
  EXPECT_EQ(Fields(provider.full, provider.fullDelta, provider.range, capabilities.prepareRenameProvider,
                   capabilities.callHierarchyProvider),
            "1|1|0|1|1");
  const auto tokens = Recorded<LSP::SemanticTokens>("clangd/semanticTokens");
  const std::vector<LSP::SemanticToken> decoded = tokens.Decode(provider.legend);
  ASSERT_EQ(decoded.size(), tokens.data.size() / 5);
  // Token 1 is "Report", declared at file scope.
  EXPECT_EQ(Fields(tokens.resultId, decoded[0].line, decoded[0].character, decoded[0].type,
                   List(decoded[0].modifiers), decoded.back().line),
            "1|5|12|function|declaration fileScope|14");

  const auto prepared = Recorded<LSP::CallHierarchyItemList>("clangd/prepareCallHierarchy");
  ASSERT_EQ(prepared.items.size(), 1u);
  EXPECT_EQ(Fields(prepared.items[0].name, Local(prepared.items[0].uri)), "Clamp|/examples/cpp/shapes.h");
  LSP::CallHierarchyCallsParams calls(prepared.items[0]);
  EXPECT_THAT(LSP::ToJsonText(calls), StartsWith(R"({"item":{"data":"ECC0A59EB26A2A59","kind":12,)"));
}

TEST(RecordedPylsp, RepliesReadIntoTheirResults) {
  EXPECT_EQ(Providers(Recorded<LSP::InitializeResult>("pylsp/initialize").capabilities), "1|1|1|1|1|0|0|1|.|( , =|||0");
  const auto hover = Recorded<LSP::Hover>("pylsp/hover");
  EXPECT_EQ(Fields(First(hover.contents.value), hover.range), "clamp(value, low, high)|" + kNoRange);
  const auto completion = Recorded<LSP::CompletionList>("pylsp/completion");
  EXPECT_EQ(Fields(completion.items.size(), First(Item(completion.items.at(0)))), "26|area()|||3|||0|aarea||area|-1|-1:-1--1:-1|");
  EXPECT_EQ(Locations(Recorded<LSP::LocationsList>("pylsp/definition")), "1|/examples/python/geometry.py|3:4-3:9");
  EXPECT_EQ(Names(Recorded<LSP::SymbolInformationList>("pylsp/documentSymbol")), "/examples/python/geometry.py|clamp,Rectangle,__init__,area,scale,width,height,width,height");
  const auto signature = Recorded<LSP::SignatureHelp>("pylsp/signatureHelp").signatures;
  EXPECT_EQ(Fields(signature.size(), signature.at(0).documentation.kind,
                   Items(signature.at(0).parameters, [](auto& p) { return p.label; }, ",")),
            "1|markdown|value,low,high");
  const auto rename = Recorded<LSP::WorkspaceEdit>("pylsp/rename").documentChanges;
  EXPECT_EQ(Fields(rename.size(), rename.at(0).textDocument.version), "2|1");
  EXPECT_THAT(rename.at(0).edits.at(0).newText, HasSubstr("def limit(value, low, high):"));
  EXPECT_EQ(Kinds(Recorded<LSP::DocumentHighlightList>("pylsp/documentHighlight")), "3,2,2,2");
  const auto folding = Recorded<LSP::FoldingRangeList>("pylsp/foldingRange").items;
  EXPECT_EQ(Fields(folding.size(), folding.at(1).startLine, folding.at(1).startCharacter), "5|8|-1");

  // pylsp resolves an item by the "data" it put in: the item goes back whole.
  LSP::CompletionItemResolveParams resolve(completion.items.at(0));
  EXPECT_THAT(LSP::ToJsonText(resolve), HasSubstr(R"("data":{"doc_uri":")"));
  const auto resolved = Recorded<LSP::ResolvedCompletionItem>("pylsp/completionResolve").item;
  EXPECT_EQ(resolved.detail, "geometry.Rectangle");
  EXPECT_THAT(resolved.documentation.value, HasSubstr("The rectangle's area."));
}

}  // namespace
