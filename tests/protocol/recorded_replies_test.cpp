// Real replies of clangd and pylsp on the example projects, recorded by
// tests/data/record/record_replies.py, read back into the result classes.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"

namespace {

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
  EXPECT_EQ(completion.items[0].insertText, "Area");
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
  EXPECT_EQ(signature.signatures[0].parameters.size(), 3u);
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
  EXPECT_THAT(rename.documentChanges[1].textDocument.uri, EndsWith("/shapes.cpp"));
  EXPECT_THAT(rename.documentChanges[2].textDocument.uri, EndsWith("/shapes.h"));
  EXPECT_EQ(rename.documentChanges[1].edits.size(), 3u);
  EXPECT_EQ(rename.documentChanges[1].edits[0].newText, "Limit");
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

  LSP::LocationsList references;
  ReadRecorded("pylsp", "references", references);
  EXPECT_GE(references.items.size(), 5u);

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

}  // namespace
