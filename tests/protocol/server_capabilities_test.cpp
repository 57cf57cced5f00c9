// Reading a server's capabilities: lenient boolean providers (an options object counts as
// provided), option providers that fail on a value of the wrong type, and the odd write key
// of completion options.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/initialize.h"

namespace {

using namespace vexil_test;

// The capabilities of an initialize result `{"capabilities":<capabilities>}` as `digest` tells them.
template <typename Digest>
std::string Read(const std::string& capabilities, Digest digest) {
  return ReadAs<LSP::InitializeResult>(R"({"capabilities":)" + capabilities + "}",
                                       [&](const LSP::InitializeResult& r) { return digest(r.capabilities); });
}

// Every boolean provider, in the order of the options-object row below.
std::string Booleans(const LSP::ServerCapabilities& c) {
  return Fields(c.hoverProvider, c.definitionProvider, c.typeDefinitionProvider, c.implementationProvider,
                c.referencesProvider, c.documentHighlightProvider, c.documentSymbolProvider, c.workspaceSymbolProvider,
                c.codeActionProvider, c.documentFormattingProvider, c.documentRangeFormattingProvider, c.renameProvider,
                c.prepareRenameProvider, c.foldingRangeProvider, c.selectionRangeProvider, c.callHierarchyProvider,
                c.inlayHintProvider);
}

std::string Options(const LSP::ServerCapabilities& c) {
  const auto list = [](const std::vector<std::string>& texts) { return Items(texts, [](auto& t) { return t; }, ","); };
  const LSP::SemanticTokensOptions& tokens = c.semanticTokensProvider;
  return Fields(c.textDocumentSync.change, c.textDocumentSync.openClose, c.completionProvider.resolveProvider,
                list(c.completionProvider.triggerCharacters), list(c.signatureHelpProvider.triggerCharacters),
                c.codeLensProvider.resolveProvider, c.documentOnTypeFormattingProvider.firstTriggerCharacter,
                list(c.documentOnTypeFormattingProvider.moreTriggerCharacter), c.documentLinkProvider.resolveProvider,
                list(c.executeCommandProvider.commands), tokens.IsProvided(), tokens.range, tokens.full,
                tokens.fullDelta, list(tokens.legend.tokenTypes), list(tokens.legend.tokenModifiers));
}

TEST(ServerCapabilities, ProvidersAreReadLenientlyOptionsStrictlyAndCompletionTriggersWrittenUnderTheirOldKey) {
  const std::string none = "0|0|0|0|0|0|0|0|0|0|0|0|0|0|0|0|0";
  const std::string noOptions = "0|0|0|||0|||0||0|0|0|0||";
  const auto tokens = [](const LSP::ServerCapabilities& c) {
    return Fields(c.hoverProvider, c.semanticTokensProvider.IsProvided());
  };
  LSP::CompletionOptions triggered, untriggered;
  triggered.resolveProvider = untriggered.resolveProvider = true;
  triggered.triggerCharacters = {".", ">"};
  CheckRows({
      // A boolean provider is true for true and for an options object only.
      {"booleans mixed",
       Read(R"({"hoverProvider":true,"definitionProvider":{},"renameProvider":{"prepareProvider":true},)"
            R"("referencesProvider":false,"typeDefinitionProvider":null,"implementationProvider":1,)"
            R"("documentSymbolProvider":"yes","workspaceSymbolProvider":[true]})",
            Booleans),
       "1|1|0|0|0|0|0|0|0|0|0|1|1|0|0|0|0"},
      {"booleans as options objects",
       Read(R"({"hoverProvider":{},"definitionProvider":{},"typeDefinitionProvider":{},"implementationProvider":{},)"
            R"("referencesProvider":{},"documentHighlightProvider":{},"documentSymbolProvider":{},)"
            R"("workspaceSymbolProvider":{},"codeActionProvider":{},"documentFormattingProvider":{},)"
            R"("documentRangeFormattingProvider":{},"renameProvider":{"prepareProvider":true},)"
            R"("foldingRangeProvider":{},"selectionRangeProvider":{},"callHierarchyProvider":{},"inlayHintProvider":{}})",
            Booleans),
       "1|1|1|1|1|1|1|1|1|1|1|1|1|1|1|1|1"},
      {"rename without prepare", Read(R"({"renameProvider":true})", Booleans), "0|0|0|0|0|0|0|0|0|0|0|1|0|0|0|0|0"},
      {"empty", Read("{}", Booleans) + Read("{}", Options), none + noOptions},
      {"null", Read("null", Booleans) + Read("null", Options), none + noOptions},
      {"absent", ReadAs<LSP::InitializeResult>("{}", [](auto& r) { return Booleans(r.capabilities) + Options(r.capabilities); }),
       none + noOptions},
      // Option providers fill their fields; the sync member is not read.
      {"options",
       Read(R"({"textDocumentSync":2,"completionProvider":{"triggerCharacters":[".",">"],"resolveProvider":true},)"
            R"("signatureHelpProvider":{"triggerCharacters":["("]},"codeLensProvider":{"resolveProvider":true},)"
            R"("documentOnTypeFormattingProvider":{"firstTriggerCharacter":"}","moreTriggerCharacter":[";"]},)"
            R"("documentLinkProvider":{"resolveProvider":true},"colorProvider":true,)"
            R"("executeCommandProvider":{"commands":["a","b"]},"semanticTokensProvider":{"legend":{"tokenTypes":)"
            R"(["type"],"tokenModifiers":["static"]},"range":true,"full":{"delta":false}}})",
            Options),
       "0|0|1|.,>|(|1|}||1|a,b|1|1|1|0|type|static"},
      // An option provider of the wrong type fails the whole reading; the color provider has
      // nothing to read, so nothing to fail.
      {"completion true", Read(R"({"completionProvider":true})", Options),
       "threw: resolveProvider\nFailed to read JSON bool: IsObject()"},
      {"code lens false", Read(R"({"codeLensProvider":false})", Options),
       "threw: resolveProvider\nFailed to read JSON bool: IsObject()"},
      {"signature help true", Read(R"({"signatureHelpProvider":true})", Options), "threw: IsObject()"},
      {"commands not an array", Read(R"({"executeCommandProvider":{"commands":"run"}})", Options),
       "threw: Expecting a 'array' JSON object but found 'string' JSON object."},
      {"color true", Read(R"({"colorProvider":true})", Options), noOptions},
      // Semantic tokens came later: a malformed provider is only left unread.
      {"semantic tokens true", Read(R"({"hoverProvider":true,"semanticTokensProvider":true})", tokens), "1|0"},
      {"semantic token types not an array",
       Read(R"({"hoverProvider":true,"semanticTokensProvider":{"legend":{"tokenTypes":"type"},"full":true}})", tokens),
       "1|0"},
      // Completion options write their triggers under their old key, when there are any.
      {"completion options written", LSP::ToJsonText(triggered) + LSP::ToJsonText(untriggered),
       R"({"resolveProvider":true,"triggerCharacter":[".",">"]}{"resolveProvider":true})"},
  });
}

}  // namespace
