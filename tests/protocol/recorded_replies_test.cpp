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

namespace {

using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;

// Reads tests/data/replies/<server>/<request>.json into `result`.
LSP::ResponseMessage ReadRecorded(const std::string& server, const std::string& request, LSP::Result& result) {
  return vexil_test::ReadReply(vexil_test::ReadDataFile("replies/" + server + "/" + request + ".json"), result);
}

std::vector<std::string> Names(const std::vector<LSP::SymbolInformation>& symbols) {
  std::vector<std::string> names;
  for (const LSP::SymbolInformation& symbol : symbols) names.push_back(symbol.name);
  return names;
}

TEST(RecordedClangd, InitializeAnnouncesItsProviders) {
  LSP::InitializeResult result;
  EXPECT_EQ(ReadRecorded("clangd", "initialize", result).id, 1);
  const LSP::ServerCapabilities& capabilities = result.capabilities;
  EXPECT_TRUE(capabilities.hoverProvider && capabilities.definitionProvider && capabilities.referencesProvider &&
              capabilities.renameProvider && capabilities.documentFormattingProvider &&
              capabilities.workspaceSymbolProvider && capabilities.implementationProvider);
  EXPECT_FALSE(capabilities.completionProvider.resolveProvider);
  EXPECT_EQ(capabilities.completionProvider.triggerCharacters.front(), ".");
  EXPECT_EQ(capabilities.signatureHelpProvider.triggerCharacters.front(), "(");
  EXPECT_EQ(capabilities.documentOnTypeFormattingProvider.firstTriggerCharacter, "\n");
  EXPECT_FALSE(capabilities.executeCommandProvider.commands.empty());
}

TEST(RecordedClangd, FeatureRepliesReadIntoTheirResults) {
  LSP::Hover hover;
  ReadRecorded("clangd", "hover", hover);
  EXPECT_EQ(hover.contents.kind, "plaintext");
  EXPECT_THAT(hover.contents.value, HasSubstr("int Clamp(int value, int low, int high)"));
  EXPECT_EQ(hover.range.start.line, 14);

  LSP::CompletionList completion;
  ReadRecorded("clangd", "completion", completion);
  ASSERT_FALSE(completion.items.empty());
  EXPECT_EQ(completion.items[0].label, " Area() const");
  EXPECT_EQ(completion.items[0].textEdit.range.start.line, 12);

  LSP::LocationsList definition;
  ReadRecorded("clangd", "definition", definition);
  ASSERT_EQ(definition.items.size(), 1u);
  EXPECT_THAT(definition.items[0].uri, EndsWith("/examples/cpp/shapes.cpp"));
  EXPECT_EQ(definition.items[0].range.start.line, 16);

  LSP::LocationsList references;
  ReadRecorded("clangd", "references", references);
  EXPECT_EQ(references.items.size(), 5u);

  LSP::SignatureHelp signature;
  ReadRecorded("clangd", "signatureHelp", signature);
  ASSERT_EQ(signature.signatures.size(), 1u);
  EXPECT_EQ(signature.signatures[0].label, "Clamp(int value, int low, int high) -> int");
  EXPECT_EQ(signature.activeParameter, 0);

  LSP::DocumentFormattingList formatting;
  ReadRecorded("clangd", "formatting", formatting);
  EXPECT_FALSE(formatting.items.empty());
}

TEST(RecordedClangd, SymbolsAndRenameFromChangesMap) {
  LSP::SymbolInformationList symbols;
  ReadRecorded("clangd", "documentSymbol", symbols);
  EXPECT_THAT(Names(symbols.items), testing::IsSupersetOf({"shapes", "Rectangle", "Area", "Clamp"}));
  EXPECT_THAT(symbols.items[0].location.uri, EndsWith("/examples/cpp/shapes.h"));

  LSP::SymbolInformationList workspace;
  ReadRecorded("clangd", "workspaceSymbol", workspace);
  EXPECT_THAT(Names(workspace.items), testing::Contains("Rectangle"));

  LSP::WorkspaceEdit rename;
  ReadRecorded("clangd", "rename", rename);
  ASSERT_EQ(rename.documentChanges.size(), 3u);
  EXPECT_THAT(rename.documentChanges[0].textDocument.uri, EndsWith("/main.cpp"));
  EXPECT_THAT(rename.documentChanges[2].textDocument.uri, EndsWith("/shapes.h"));
  EXPECT_EQ(rename.documentChanges[1].edits[0].newText, "Limit");
}

TEST(RecordedClangd, CodeActionsAsLiteralsAndAsBareCommands) {
  LSP::CodeActionList fixes;
  ReadRecorded("clangd", "codeAction", fixes);
  ASSERT_EQ(fixes.items.size(), 1u);
  const LSP::CodeAction& fix = fixes.items[0];
  EXPECT_EQ(fix.title + "|" + fix.kind, "insert ';'|quickfix");
  EXPECT_TRUE(fix.isPreferred && fix.HasEdit() && !fix.HasCommand());
  EXPECT_THAT(fix.edit.documentChanges[0].textDocument.uri, EndsWith("/broken.cpp"));
  EXPECT_EQ(fix.diagnostics[0].codeText, "expected_semi_after_stmt");

  LSP::CodeActionList refactorings;
  ReadRecorded("clangd", "codeActionRefactor", refactorings);
  ASSERT_EQ(refactorings.items.size(), 1u);
  const LSP::Command& tweak = refactorings.items[0].command;
  EXPECT_EQ(tweak.command, "clangd.applyTweak");
  EXPECT_THAT(tweak.arguments, HasSubstr(R"("tweakID":"ExtractVariable")"));
  LSP::ExecuteCommandParams execute(tweak);
  EXPECT_THAT(LSP::ToJsonText(execute), testing::StartsWith(R"({"command":"clangd.applyTweak","arguments":[{"file":)"));
  LSP::JsonResult executed;
  ReadRecorded("clangd", "executeCommand", executed);
  EXPECT_EQ(executed.json, R"("Tweak applied.")");

  // The edit that the command makes arrives as the server's own request.
  LSP::xReader request;
  ASSERT_TRUE(request.Parse(vexil_test::ReadDataFile("replies/clangd/applyEdit.json")));
  LSP::ApplyWorkspaceEditParams applyEdit;
  applyEdit.Read(request);
  ASSERT_EQ(applyEdit.edit.documentChanges.size(), 1u);
  EXPECT_EQ(applyEdit.edit.documentChanges[0].edits[1].newText, " placeholder");

  LSP::CodeActionList commands;
  ReadRecorded("clangd", "codeActionCommands", commands);
  ASSERT_EQ(commands.items.size(), 1u);
  EXPECT_EQ(commands.items[0].title, "Apply fix: insert ';'");
  EXPECT_EQ(commands.items[0].command.command, "clangd.applyFix");
  EXPECT_FALSE(commands.items[0].HasEdit());
}

TEST(RecordedClangd, DocumentFeatureRepliesReadIntoTheirResults) {
  LSP::DocumentHighlightList highlights;
  ReadRecorded("clangd", "documentHighlight", highlights);
  ASSERT_EQ(highlights.items.size(), 5u);
  EXPECT_EQ(highlights.items[2].kind, 1);

  LSP::SelectionRangeList selections;
  ReadRecorded("clangd", "selectionRange", selections);
  ASSERT_EQ(selections.items.size(), 2u);
  EXPECT_EQ(selections.items[0].range.start.character, 9);
  EXPECT_EQ(selections.items[0].parents.size(), 6u);
  EXPECT_EQ(selections.items[0].parents.back().start.line, 9);  // the whole function

  LSP::PrepareRenameResult rename;
  ReadRecorded("clangd", "prepareRename", rename);
  EXPECT_TRUE(rename.CanRename());
  EXPECT_EQ(rename.range.start.character, 17);

  // The legend comes with the capabilities; token 1 is "Report", declared at file scope.
  LSP::InitializeResult initialize;
  ReadRecorded("clangd", "initializeFeatures", initialize);
  const LSP::SemanticTokensOptions& provider = initialize.capabilities.semanticTokensProvider;
  EXPECT_TRUE(provider.full && provider.fullDelta && !provider.range);
  EXPECT_TRUE(initialize.capabilities.prepareRenameProvider && initialize.capabilities.callHierarchyProvider);
  LSP::SemanticTokens tokens;
  ReadRecorded("clangd", "semanticTokens", tokens);
  EXPECT_EQ(tokens.resultId, "1");
  const std::vector<LSP::SemanticToken> decoded = tokens.Decode(provider.legend);
  ASSERT_EQ(decoded.size(), tokens.data.size() / 5);
  EXPECT_EQ(decoded[0].line, 5);
  EXPECT_EQ(decoded[0].character, 12);
  EXPECT_EQ(decoded[0].type, "function");
  EXPECT_THAT(decoded[0].modifiers, ElementsAre("declaration", "fileScope"));
  EXPECT_EQ(decoded.back().line, 14);
}

TEST(RecordedClangd, CallHierarchyItemsGoBackWithTheServersData) {
  LSP::CallHierarchyItemList prepared;
  ReadRecorded("clangd", "prepareCallHierarchy", prepared);
  ASSERT_EQ(prepared.items.size(), 1u);
  EXPECT_EQ(prepared.items[0].name, "Clamp");
  EXPECT_THAT(prepared.items[0].uri, EndsWith("/shapes.h"));
  LSP::CallHierarchyCallsParams calls(prepared.items[0]);
  EXPECT_THAT(LSP::ToJsonText(calls), testing::StartsWith(R"({"item":{"data":"ECC0A59EB26A2A59","kind":12,)"));

  LSP::CallHierarchyIncomingCallList incoming;
  ReadRecorded("clangd", "incomingCalls", incoming);
  ASSERT_EQ(incoming.items.size(), 2u);
  EXPECT_EQ(incoming.items[0].from.name, "Scale");
  EXPECT_EQ(incoming.items[1].from.name, "main");
  EXPECT_EQ(incoming.items[1].fromRanges[0].start.line, 14);
}

TEST(RecordedPylsp, InitializeAnnouncesItsProviders) {
  LSP::InitializeResult result;
  ReadRecorded("pylsp", "initialize", result);
  const LSP::ServerCapabilities& capabilities = result.capabilities;
  EXPECT_TRUE(capabilities.hoverProvider && capabilities.definitionProvider && capabilities.renameProvider);
  EXPECT_FALSE(capabilities.workspaceSymbolProvider);
  EXPECT_TRUE(capabilities.completionProvider.resolveProvider);
  EXPECT_EQ(capabilities.signatureHelpProvider.triggerCharacters, (std::vector<std::string>{"(", ",", "="}));
  EXPECT_FALSE(capabilities.codeLensProvider.resolveProvider);
}

TEST(RecordedPylsp, FeatureRepliesReadIntoTheirResults) {
  LSP::Hover hover;
  ReadRecorded("pylsp", "hover", hover);
  EXPECT_THAT(hover.contents.value, testing::StartsWith("clamp(value, low, high)"));
  EXPECT_EQ(hover.range.start.line, -1);

  LSP::CompletionList completion;
  ReadRecorded("pylsp", "completion", completion);
  ASSERT_GE(completion.items.size(), 4u);
  EXPECT_EQ(completion.items[0].label, "area()");
  EXPECT_EQ(completion.items[0].kind, 3);

  LSP::LocationsList definition;
  ReadRecorded("pylsp", "definition", definition);
  ASSERT_EQ(definition.items.size(), 1u);
  EXPECT_THAT(definition.items[0].uri, EndsWith("/examples/python/geometry.py"));

  LSP::SymbolInformationList symbols;
  ReadRecorded("pylsp", "documentSymbol", symbols);
  EXPECT_THAT(Names(symbols.items), testing::IsSupersetOf({"clamp", "Rectangle", "area", "scale"}));

  LSP::SignatureHelp signature;
  ReadRecorded("pylsp", "signatureHelp", signature);
  ASSERT_EQ(signature.signatures.size(), 1u);
  EXPECT_EQ(signature.signatures[0].documentation.kind, "markdown");
  EXPECT_EQ(signature.signatures[0].parameters[2].label, "high");

  LSP::WorkspaceEdit rename;
  ReadRecorded("pylsp", "rename", rename);
  ASSERT_EQ(rename.documentChanges.size(), 2u);
  EXPECT_EQ(rename.documentChanges[0].textDocument.version, 1);
  EXPECT_THAT(rename.documentChanges[0].edits[0].newText, HasSubstr("def limit(value, low, high):"));
}

TEST(RecordedPylsp, NullAndErrorRepliesLeaveEmptyResults) {
  LSP::DocumentFormattingList formatting;
  EXPECT_FALSE(ReadRecorded("pylsp", "formatting", formatting).HaveError());
  EXPECT_TRUE(formatting.items.empty());

  LSP::SymbolInformationList workspace;
  const LSP::ResponseMessage response = ReadRecorded("pylsp", "workspaceSymbol", workspace);
  EXPECT_TRUE(response.MethodNotFound());
  EXPECT_STREQ(response.ErrorMessage(), "Method Not Found: workspace/symbol");
  EXPECT_TRUE(workspace.items.empty());
}

TEST(RecordedPylsp, DocumentFeatureRepliesReadIntoTheirResults) {
  LSP::DocumentHighlightList highlights;
  ReadRecorded("pylsp", "documentHighlight", highlights);
  ASSERT_EQ(highlights.items.size(), 4u);
  EXPECT_EQ(highlights.items[0].kind, 3);  // the assignment writes
  EXPECT_EQ(highlights.items[1].kind, 2);

  LSP::FoldingRangeList folding;
  ReadRecorded("pylsp", "foldingRange", folding);
  ASSERT_EQ(folding.items.size(), 5u);
  EXPECT_EQ(folding.items[1].startLine, 8);
  EXPECT_EQ(folding.items[1].startCharacter, -1);

  // pylsp resolves an item by the "data" it put in: the item goes back whole.
  LSP::CompletionList completion;
  ReadRecorded("pylsp", "completion", completion);
  LSP::CompletionItemResolveParams resolve(completion.items[0]);
  EXPECT_THAT(LSP::ToJsonText(resolve), HasSubstr(R"("data":{"doc_uri":")"));
  LSP::ResolvedCompletionItem resolved;
  ReadRecorded("pylsp", "completionResolve", resolved);
  EXPECT_EQ(resolved.item.detail, "geometry.Rectangle");
  EXPECT_THAT(resolved.item.documentation.value, HasSubstr("The rectangle's area."));
}

TEST(RecordedReplies, MethodsAServerLacksAreRefusedAndReadAsNothing) {
  const std::pair<const char*, const char*> refused[] = {
      {"clangd", "foldingRange"},       {"clangd", "inlayHint"},         {"clangd", "completionResolve"},
      {"clangd", "outgoingCalls"},      {"pylsp", "selectionRange"},     {"pylsp", "semanticTokens"},
      {"pylsp", "inlayHint"},           {"pylsp", "prepareRename"},      {"pylsp", "prepareCallHierarchy"},
      {"pylsp", "incomingCalls"},       {"pylsp", "outgoingCalls"}};
  for (const auto& [server, request] : refused) {
    LSP::JsonResult result;
    EXPECT_TRUE(ReadRecorded(server, request, result).MethodNotFound()) << server << " " << request;
    EXPECT_EQ(result.json, "") << server << " " << request;
  }
  LSP::CodeActionList none;
  ReadRecorded("pylsp", "codeAction", none);
  EXPECT_TRUE(none.items.empty());
}

}  // namespace
