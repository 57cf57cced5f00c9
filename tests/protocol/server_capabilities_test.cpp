// Reading a server's capabilities: lenient boolean providers (an options object counts as
// provided), option providers that fail on a value of the wrong type, and the odd write key.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/initialize.h"

namespace {

using vexil_test::ReadResult;
using vexil_test::ThrownText;

LSP::ServerCapabilities Read(const std::string& capabilities) {
  LSP::InitializeResult result;
  ReadResult(R"({"capabilities":)" + capabilities + "}", result);
  return result.capabilities;
}

TEST(ServerCapabilities, BooleanProviderIsTrueForTrueAndForAnOptionsObjectOnly) {
  const LSP::ServerCapabilities read = Read(
      R"({"hoverProvider":true,"definitionProvider":{},"renameProvider":{"prepareProvider":true},)"
      R"("referencesProvider":false,"typeDefinitionProvider":null,"implementationProvider":1,)"
      R"("documentSymbolProvider":"yes","workspaceSymbolProvider":[true]})");
  for (bool provided : {read.hoverProvider, read.definitionProvider, read.renameProvider}) EXPECT_TRUE(provided);
  for (bool absent : {read.referencesProvider, read.typeDefinitionProvider, read.implementationProvider,
                      read.documentSymbolProvider, read.workspaceSymbolProvider, read.codeActionProvider,
                      read.documentFormattingProvider})
    EXPECT_FALSE(absent);

  // A server that sends options objects for all of them supports them all.
  const LSP::ServerCapabilities objects = Read(
      R"({"hoverProvider":{},"definitionProvider":{},"typeDefinitionProvider":{},"implementationProvider":{},)"
      R"("referencesProvider":{},"documentHighlightProvider":{},"documentSymbolProvider":{},)"
      R"("workspaceSymbolProvider":{},"codeActionProvider":{},"documentFormattingProvider":{},)"
      R"("documentRangeFormattingProvider":{},"renameProvider":{"prepareProvider":true},"foldingRangeProvider":{},)"
      R"("selectionRangeProvider":{},"callHierarchyProvider":{},"inlayHintProvider":{}})");
  for (bool provided : {objects.hoverProvider, objects.definitionProvider, objects.typeDefinitionProvider,
                        objects.implementationProvider, objects.referencesProvider, objects.documentHighlightProvider,
                        objects.documentSymbolProvider, objects.workspaceSymbolProvider, objects.codeActionProvider,
                        objects.documentFormattingProvider, objects.documentRangeFormattingProvider,
                        objects.renameProvider, objects.prepareRenameProvider, objects.foldingRangeProvider,
                        objects.selectionRangeProvider, objects.callHierarchyProvider, objects.inlayHintProvider})
    EXPECT_TRUE(provided);
  EXPECT_TRUE(read.prepareRenameProvider);
  EXPECT_FALSE(Read(R"({"renameProvider":true})").prepareRenameProvider);
}

TEST(ServerCapabilities, OptionProvidersFillTheirFieldsAndIgnoreTheSyncMember) {
  const LSP::ServerCapabilities read = Read(
      R"({"textDocumentSync":2,"completionProvider":{"triggerCharacters":[".",">"],"resolveProvider":true},)"
      R"("signatureHelpProvider":{"triggerCharacters":["("]},"codeLensProvider":{"resolveProvider":true},)"
      R"("documentOnTypeFormattingProvider":{"firstTriggerCharacter":"}","moreTriggerCharacter":[";"]},)"
      R"("documentLinkProvider":{"resolveProvider":true},"colorProvider":true,)"
      R"("executeCommandProvider":{"commands":["a","b"]},"semanticTokensProvider":{"legend":{"tokenTypes":["type"],)"
      R"("tokenModifiers":["static"]},"range":true,"full":{"delta":false}}})");
  EXPECT_EQ(read.textDocumentSync.change, 0);
  EXPECT_FALSE(read.textDocumentSync.openClose);
  EXPECT_TRUE(read.completionProvider.resolveProvider);
  EXPECT_EQ(read.completionProvider.triggerCharacters, (std::vector<std::string>{".", ">"}));
  EXPECT_EQ(read.signatureHelpProvider.triggerCharacters, std::vector<std::string>{"("});
  EXPECT_TRUE(read.codeLensProvider.resolveProvider);
  EXPECT_EQ(read.documentOnTypeFormattingProvider.firstTriggerCharacter, "}");
  EXPECT_TRUE(read.documentOnTypeFormattingProvider.moreTriggerCharacter.empty());
  EXPECT_TRUE(read.documentLinkProvider.resolveProvider);
  EXPECT_EQ(read.executeCommandProvider.commands, (std::vector<std::string>{"a", "b"}));
  const LSP::SemanticTokensOptions& tokens = read.semanticTokensProvider;
  EXPECT_TRUE(tokens.range && tokens.full && !tokens.fullDelta);
  EXPECT_EQ(tokens.legend.tokenTypes, std::vector<std::string>{"type"});
  EXPECT_EQ(tokens.legend.tokenModifiers, std::vector<std::string>{"static"});

  LSP::CompletionOptions options = read.completionProvider;
  EXPECT_EQ(LSP::ToJsonText(options), R"({"resolveProvider":true,"triggerCharacter":[".",">"]})");
  options.triggerCharacters.clear();
  EXPECT_EQ(LSP::ToJsonText(options), R"({"resolveProvider":true})");
}

TEST(ServerCapabilities, OptionProviderOfTheWrongTypeFailsTheWholeReading) {
  // The color provider has nothing to read, so nothing to fail.
  const std::pair<const char*, const char*> rows[] = {
      {R"({"completionProvider":true})", "resolveProvider\nFailed to read JSON bool: IsObject()"},
      {R"({"codeLensProvider":false})", "resolveProvider\nFailed to read JSON bool: IsObject()"},
      {R"({"signatureHelpProvider":true})", "IsObject()"},
      {R"({"executeCommandProvider":{"commands":"run"}})", "Expecting a 'array' JSON object but found 'string' JSON object."},
      {R"({"colorProvider":true})", ""}};
  for (const auto& [capabilities, thrown] : rows) EXPECT_EQ(ThrownText([&] { Read(capabilities); }), thrown) << capabilities;
  // Semantic tokens came later: a malformed provider is only left unread.
  for (const char* malformed : {R"(true)", R"({"legend":{"tokenTypes":"type"},"full":true})"}) {
    const LSP::ServerCapabilities read = Read(std::string(R"({"hoverProvider":true,"semanticTokensProvider":)") + malformed + "}");
    EXPECT_TRUE(read.hoverProvider) << malformed;
    EXPECT_FALSE(read.semanticTokensProvider.IsProvided()) << malformed;
  }
}

TEST(ServerCapabilities, MissingOrNullCapabilitiesLeaveEveryDefault) {
  for (const char* reply : {R"({})", R"({"capabilities":null})", R"({"capabilities":{}})"}) {
    LSP::InitializeResult result;
    vexil_test::ReadResult(reply, result);
    EXPECT_FALSE(result.capabilities.hoverProvider) << reply;
    EXPECT_FALSE(result.capabilities.completionProvider.resolveProvider) << reply;
    EXPECT_TRUE(result.capabilities.completionProvider.triggerCharacters.empty()) << reply;
  }
}

}  // namespace
