// Reading of a server's capabilities and of the option objects of its providers.
// Boolean providers are read leniently; option providers throw on a value of the wrong type.
#include "vexil/protocol/server_capabilities.h"

#include <exception>

namespace LSP {
namespace {

// The protocol allows `boolean | Options` for every boolean provider, and some servers
// (pyright) send options objects for all of them: an object counts as provided. Anything
// else but `true` (missing, null, false, a number, a string) counts as not provided.
bool ReadProvider(const xObject& capabilities, const char* key) {
  try {
    if (capabilities.Object(key).IsObject()) return true;
    return capabilities.Bool(key);
  } catch (const std::exception&) {
    return false;
  }
}

// A member of an options object that is read like a boolean provider: true only for
// `true`, never failing the reading.
bool ReadOption(const xObject& capabilities, const char* provider, const char* option) {
  xObject options = capabilities.Object(provider);
  return options.IsObject() && ReadProvider(options, option);
}

// Options read after the ones of old: a malformed value leaves them at their defaults
// instead of failing the reading of capabilities that read fine before.
template <typename Options>
void ReadLeniently(const xObject& value, Options& options) {
  try {
    options.Read(value);
  } catch (const std::exception&) {
    options = Options();
  }
}

// Reads the synchronisation member leniently: a malformed setting stays at its default.
void ReadDocumentSync(const xObject& capabilities, TextDocumentSyncOptions& sync, bool& save) {
  xObject value = capabilities.Object("textDocumentSync");
  if (value.IsInt()) {
    sync.change = value.AsInt();
    sync.openClose = save = sync.change != 0;
    return;
  }
  if (!value.IsObject()) return;
  sync.openClose = ReadProvider(value, "openClose");
  sync.change = value.Object("change").IsInt() ? value.Object("change").AsInt() : 0;
  sync.willSave = ReadProvider(value, "willSave");
  sync.willSaveWaitUntil = ReadProvider(value, "willSaveWaitUntil");
  save = ReadProvider(value, "save");
  sync.save.includeText = ReadOption(value, "save", "includeText");
}

}  // namespace

void SaveOptions::Read(const xObject& value) { includeText = value.Bool("includeText"); }
void SaveOptions::Write(xWriter& writer) { writer.Bool("includeText", includeText); }

void TextDocumentSyncOptions::Read(const xObject& value) {
  openClose = value.Bool("openClose");
  change = value.Int("change");
  willSave = value.Bool("willSave");
  willSaveWaitUntil = value.Bool("willSaveWaitUntil");
  save.Read(value.Object("save"));
}

void TextDocumentSyncOptions::Write(xWriter& writer) {
  writer.Bool("openClose", openClose);
  writer.Int("change", change);
  writer.Bool("willSave", willSave);
  writer.Bool("willSaveWaitUntil", willSaveWaitUntil);
  writer.Object("save", save);
}

void CompletionOptions::Read(const xObject& value) {
  resolveProvider = value.Bool("resolveProvider");
  triggerCharacters = value.Strings("triggerCharacters");
}

void CompletionOptions::Write(xWriter& writer) {
  writer.Bool("resolveProvider", resolveProvider);
  if (!triggerCharacters.empty()) writer.Strings("triggerCharacter", triggerCharacters);
}

void SignatureHelpOptions::Read(const xObject& value) { triggerCharacters = value.Strings("triggerCharacters"); }
void SignatureHelpOptions::Write(xWriter& writer) { writer.Strings("triggerCharacters", triggerCharacters); }

void ResolveOptions::Read(const xObject& value) { resolveProvider = value.Bool("resolveProvider"); }
void ResolveOptions::Write(xWriter& writer) { writer.Bool("resolveProvider", resolveProvider); }

void DocumentOnTypeFormattingOptions::Read(const xObject& value) {
  firstTriggerCharacter = value.String("firstTriggerCharacter");
}

void DocumentOnTypeFormattingOptions::Write(xWriter& writer) {
  writer.String("firstTriggerCharacter", firstTriggerCharacter);
  writer.Strings("moreTriggerCharacter", moreTriggerCharacter);
}

void ExecuteCommandOptions::Read(const xObject& value) { commands = value.Strings("commands"); }
void ExecuteCommandOptions::Write(xWriter& writer) { writer.Strings("commands", commands); }

void ServerCapabilities::Read(const xObject& value) {
  completionProvider.Read(value.Object("completionProvider"));
  signatureHelpProvider.Read(value.Object("signatureHelpProvider"));
  codeLensProvider.Read(value.Object("codeLensProvider"));
  hoverProvider = ReadProvider(value, "hoverProvider");
  definitionProvider = ReadProvider(value, "definitionProvider");
  typeDefinitionProvider = ReadProvider(value, "typeDefinitionProvider");
  implementationProvider = ReadProvider(value, "implementationProvider");
  referencesProvider = ReadProvider(value, "referencesProvider");
  documentHighlightProvider = ReadProvider(value, "documentHighlightProvider");
  documentSymbolProvider = ReadProvider(value, "documentSymbolProvider");
  workspaceSymbolProvider = ReadProvider(value, "workspaceSymbolProvider");
  codeActionProvider = ReadProvider(value, "codeActionProvider");
  documentFormattingProvider = ReadProvider(value, "documentFormattingProvider");
  documentRangeFormattingProvider = ReadProvider(value, "documentRangeFormattingProvider");
  renameProvider = ReadProvider(value, "renameProvider");
  documentLinkProvider.Read(value.Object("documentLinkProvider"));
  colorProvider.Read(value.Object("colorProvider"));
  documentOnTypeFormattingProvider.Read(value.Object("documentOnTypeFormattingProvider"));
  executeCommandProvider.Read(value.Object("executeCommandProvider"));
  diagnosticProvider = ReadProvider(value, "diagnosticProvider");
  ReadLeniently(value.Object("semanticTokensProvider"), semanticTokensProvider);
  foldingRangeProvider = ReadProvider(value, "foldingRangeProvider");
  selectionRangeProvider = ReadProvider(value, "selectionRangeProvider");
  callHierarchyProvider = ReadProvider(value, "callHierarchyProvider");
  inlayHintProvider = ReadProvider(value, "inlayHintProvider");
  prepareRenameProvider = ReadOption(value, "renameProvider", "prepareProvider");
  ReadDocumentSync(value, documentSync, documentSyncSave);
  xObject encoding = value.Object("positionEncoding");
  positionEncoding = encoding.IsString() && !encoding.GetString().empty() ? encoding.GetString() : "utf-16";
}

}  // namespace LSP
