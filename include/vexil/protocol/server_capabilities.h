// What a server announces in its reply to "initialize": which features it provides, and
// the options of the features that take some. Read from the reply's "capabilities" object.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/semantic_tokens.h"

namespace LSP {

class VEXIL_API SaveOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  bool includeText = false;
};

class VEXIL_API TextDocumentSyncOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  bool openClose = false;
  int change = 0;
  bool willSave = false;
  bool willSaveWaitUntil = false;
  SaveOptions save;
};

// Reads the plural "triggerCharacters" but writes the singular "triggerCharacter".
class VEXIL_API CompletionOptions : public Params {
 public:
  CompletionOptions() { name = "completionOptions"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  bool resolveProvider = false;
  std::vector<std::string> triggerCharacters;
};

class VEXIL_API SignatureHelpOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::vector<std::string> triggerCharacters;
};

// Options that say only whether items are resolved in a second request.
class VEXIL_API ResolveOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  bool resolveProvider = false;
};

class VEXIL_API CodeLensOptions : public ResolveOptions {};
class VEXIL_API DocumentLinkOptions : public ResolveOptions {};

// Only the first trigger character is read; the list stays empty.
class VEXIL_API DocumentOnTypeFormattingOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string firstTriggerCharacter;
  std::vector<std::string> moreTriggerCharacter;
};

class VEXIL_API ColorProviderOptions : public Params {
 public:
  void Write(xWriter& writer) override {}
};

class VEXIL_API ExecuteCommandOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::vector<std::string> commands;
};

// A boolean provider is true for `true` and for an options object; anything else is false
// and never fails the reading. An option provider of the wrong type (a boolean where its
// options object belongs) makes the reading throw. The synchronisation member
// `textDocumentSync` is not read; `documentSync` at the end holds what the server said.
class VEXIL_API ServerCapabilities : public Params {
 public:
  ServerCapabilities() { name = "capabilities"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  // The client never sends a server's capabilities.
  void Write(xWriter& writer) override {}

  TextDocumentSyncOptions textDocumentSync;
  CompletionOptions completionProvider;
  bool hoverProvider = false;
  SignatureHelpOptions signatureHelpProvider;
  CodeLensOptions codeLensProvider;
  bool definitionProvider = false;
  bool typeDefinitionProvider = false;
  bool implementationProvider = false;
  bool referencesProvider = false;
  bool documentHighlightProvider = false;
  bool documentSymbolProvider = false;
  bool workspaceSymbolProvider = false;
  bool codeActionProvider = false;
  DocumentOnTypeFormattingOptions documentOnTypeFormattingProvider;
  bool documentFormattingProvider = false;
  bool documentRangeFormattingProvider = false;
  bool renameProvider = false;
  DocumentLinkOptions documentLinkProvider;
  ColorProviderOptions colorProvider;
  ExecuteCommandOptions executeCommandProvider;
  // Whether the server answers "textDocument/diagnostic" (pulled diagnostics).
  bool diagnosticProvider = false;
  // The legend that names the numbers of semantic tokens, and which requests take them.
  SemanticTokensOptions semanticTokensProvider;
  bool foldingRangeProvider = false;
  bool selectionRangeProvider = false;
  bool callHierarchyProvider = false;
  bool inlayHintProvider = false;
  // "renameProvider": {"prepareProvider": true}: the server answers "textDocument/prepareRename".
  bool prepareRenameProvider = false;
  // "textDocumentSync" in either form the protocol allows, never failing the reading. A
  // number is the change kind (0 none, 1 full text, 2 incremental), with open, close and
  // save notifications wanted unless it is 0; an options object gives each setting.
  TextDocumentSyncOptions documentSync;
  // Whether the server wants "textDocument/didSave" ("save": true or an options object).
  bool documentSyncSave = false;
  // How the server counts the columns of positions: "utf-16" unless it names another
  // ("utf-8", "utf-32"), which it does only for a client that offered it.
  std::string positionEncoding = "utf-16";
};

}  // namespace LSP
