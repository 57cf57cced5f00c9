// The client capability tree sent in the "capabilities" member of "initialize": a modest
// client without dynamic registration, plain-text documentation only, written in a fixed order.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/message.h"

namespace LSP {

// Base of most nodes: whether the feature may be registered dynamically (never, here).
class VEXIL_API DynamicRegistrationCapabilities : public Params {
 public:
  explicit DynamicRegistrationCapabilities(bool dynamicRegistration = false)
      : dynamicRegistration(dynamicRegistration) {}
  void Write(xWriter& writer) override;

  bool dynamicRegistration;
};

// A node class fixed to its key. Most nodes say nothing but that they take no dynamic
// registration; they differ only in the key, so one template names them all.
template <const char* Key, typename Node = DynamicRegistrationCapabilities>
class VEXIL_API KeyedCapabilities : public Node {
 public:
  KeyedCapabilities() { this->name = Key; }
};

// The keys of the nodes that the template above names.
namespace CapabilityKey {
inline constexpr char didChangeConfiguration[] = "didChangeConfiguration";
inline constexpr char didChangeWatchedFiles[] = "didChangeWatchedFiles";
inline constexpr char symbol[] = "symbol";
inline constexpr char executeCommand[] = "executeCommand";
inline constexpr char inlineValue[] = "inlineValue";
inline constexpr char codeLens[] = "codeLens";
inline constexpr char semanticTokens[] = "semanticTokens";
inline constexpr char inlayHint[] = "inlayHint";
inline constexpr char diagnostics[] = "diagnostics";
inline constexpr char definition[] = "definition";
inline constexpr char references[] = "references";
inline constexpr char documentHighlight[] = "documentHighlight";
inline constexpr char documentSymbol[] = "documentSymbol";
inline constexpr char codeAction[] = "codeAction";
inline constexpr char formatting[] = "formatting";
inline constexpr char rangeFormatting[] = "rangeFormatting";
inline constexpr char onTypeFormatting[] = "onTypeFormatting";
inline constexpr char rename[] = "rename";
inline constexpr char documentLink[] = "documentLink";
inline constexpr char typeDefinition[] = "typeDefinition";
inline constexpr char implementation[] = "implementation";
inline constexpr char colorProvider[] = "colorProvider";
inline constexpr char foldingRange[] = "foldingRange";
inline constexpr char selectionRange[] = "selectionRange";
inline constexpr char linkedEditingRange[] = "linkedEditingRange";
inline constexpr char callHierarchy[] = "callHierarchy";
inline constexpr char moniker[] = "moniker";
inline constexpr char typeHierarchy[] = "typeHierarchy";
inline constexpr char diagnostic[] = "diagnostic";
}  // namespace CapabilityKey

// A list of protocol enumeration values, written as "valueSet" only when not empty.
class VEXIL_API ValueSetCapabilities : public Params {
 public:
  // The values 1 to `last`, ascending: every kind the protocol defines up to `last`.
  explicit ValueSetCapabilities(int last);
  void Write(xWriter& writer) override;

  std::vector<int> valueSet;
};

class VEXIL_API SymbolKindCapabilities : public ValueSetCapabilities {
 public:
  SymbolKindCapabilities() : ValueSetCapabilities(26) { name = "symbolKind"; }
};

class VEXIL_API CompletionItemKindCapabilities : public ValueSetCapabilities {
 public:
  CompletionItemKindCapabilities() : ValueSetCapabilities(25) { name = "completionItemKind"; }
};

// Refresh requests from server to client; none is supported.
class VEXIL_API RefreshCapabilities : public Params {
 public:
  void Write(xWriter& writer) override;

  bool refreshSupport = false;
};

// No dynamic registration, plus the symbol kinds the client understands.
class VEXIL_API SymbolClientCapabilities : public DynamicRegistrationCapabilities {
 public:
  void Write(xWriter& writer) override;

  SymbolKindCapabilities symbolKind;
};

class VEXIL_API WorkspaceEditCapabilities : public Params {
 public:
  WorkspaceEditCapabilities() { name = "workspaceEdit"; }
  void Write(xWriter& writer) override;

  bool documentChanges = false;
  bool resourceChanges = false;
};

class VEXIL_API FileOperations : public DynamicRegistrationCapabilities {
 public:
  FileOperations() { name = "fileOperations"; }
  void Write(xWriter& writer) override;

  bool didCreate = false;
  bool willCreate = false;
  bool didRename = false;
  bool willRename = false;
  bool didDelete = false;
  bool willDelete = false;
};

using DidChangeConfigurationCapabilities = KeyedCapabilities<CapabilityKey::didChangeConfiguration>;
using DidChangeWatchedFilesCapabilities = KeyedCapabilities<CapabilityKey::didChangeWatchedFiles>;
using WorkspaceSymbolClientCapabilities = KeyedCapabilities<CapabilityKey::symbol, SymbolClientCapabilities>;
using ExecuteCommandCapabilities = KeyedCapabilities<CapabilityKey::executeCommand>;
using InlineValueWorkspaceClientCapabilities = KeyedCapabilities<CapabilityKey::inlineValue, RefreshCapabilities>;
using CodeLensWorkspaceClientCapabilities = KeyedCapabilities<CapabilityKey::codeLens, RefreshCapabilities>;
// Declared for completeness; no node of the tree holds them.
using SemanticTokensWorkspaceClientCapabilities = KeyedCapabilities<CapabilityKey::semanticTokens, RefreshCapabilities>;
using InlayHintWorkspaceClientCapabilities = KeyedCapabilities<CapabilityKey::inlayHint, RefreshCapabilities>;
using DiagnosticWorkspaceClientCapabilities = KeyedCapabilities<CapabilityKey::diagnostics, RefreshCapabilities>;

class VEXIL_API WorkspaceClientCapabilities : public Params {
 public:
  WorkspaceClientCapabilities() { name = "workspace"; }
  void Write(xWriter& writer) override;

  bool applyEdit = false;
  WorkspaceEditCapabilities workspaceEdit;
  DidChangeConfigurationCapabilities didChangeConfiguration;
  DidChangeWatchedFilesCapabilities didChangeWatchedFiles;
  WorkspaceSymbolClientCapabilities symbol;
  ExecuteCommandCapabilities executeCommand;
  bool workspaceFolders = true;
  bool configuration = false;
  // Held but never written: servers then see a client without file-operation or
  // refresh support.
  InlineValueWorkspaceClientCapabilities inlineValue;
  CodeLensWorkspaceClientCapabilities codeLens;
  FileOperations fileOperations;
};

class VEXIL_API PublishDiagnosticsClientCapabilities : public Params {
 public:
  PublishDiagnosticsClientCapabilities() { name = "publishDiagnostics"; }
  void Write(xWriter& writer) override;

  bool relatedInformation = false;
};

class VEXIL_API SynchronizationClientCapabilities : public DynamicRegistrationCapabilities {
 public:
  SynchronizationClientCapabilities() { name = "synchronization"; }
  void Write(xWriter& writer) override;

  bool willSave = false;
  bool willSaveWaitUntil = false;
  bool didSave = true;
};

class VEXIL_API CompletionItemCapabilities : public Params {
 public:
  CompletionItemCapabilities() { name = "completionItem"; }
  void Write(xWriter& writer) override;

  bool snippetSupport = false;
  bool commitCharactersSupport = false;
  std::vector<std::string> documentationFormat{"plaintext"};
  bool deprecatedSupport = false;
};

class VEXIL_API CompletionClientCapabilities : public DynamicRegistrationCapabilities {
 public:
  CompletionClientCapabilities() { name = "completion"; }
  void Write(xWriter& writer) override;

  bool contextSupport = false;
  CompletionItemCapabilities completionItem;
  CompletionItemKindCapabilities completionItemKind;
};

class VEXIL_API HoverClientCapabilities : public DynamicRegistrationCapabilities {
 public:
  HoverClientCapabilities() { name = "hover"; }
  void Write(xWriter& writer) override;

  std::vector<std::string> contentFormat{"plaintext"};
};

class VEXIL_API SignatureClientInformation : public Params {
 public:
  SignatureClientInformation() { name = "signatureInformation"; }
  void Write(xWriter& writer) override;

  std::vector<std::string> documentationFormat{"plaintext"};
};

// Writes only its dynamic registration: the signature information it holds stays unsent.
class VEXIL_API SignatureHelpClientCapabilities : public DynamicRegistrationCapabilities {
 public:
  SignatureHelpClientCapabilities() { name = "signatureHelp"; }

  SignatureClientInformation signatureInformation;
};

class VEXIL_API DeclarationClientCapabilities : public DynamicRegistrationCapabilities {
 public:
  DeclarationClientCapabilities() { name = "declaration"; }
  void Write(xWriter& writer) override;

  bool linkSupport = false;
};

using DefinitionClientCapabilities = KeyedCapabilities<CapabilityKey::definition>;
using ReferencesClientCapabilities = KeyedCapabilities<CapabilityKey::references>;
using DocumentHighlightClientCapabilities = KeyedCapabilities<CapabilityKey::documentHighlight>;
using DocumentSymbolClientCapabilities = KeyedCapabilities<CapabilityKey::documentSymbol, SymbolClientCapabilities>;
using CodeActionClientCapabilities = KeyedCapabilities<CapabilityKey::codeAction>;
using CodeLensClientCapabilities = KeyedCapabilities<CapabilityKey::codeLens>;
using DocumentFormattingClientCapabilities = KeyedCapabilities<CapabilityKey::formatting>;
using RangeFormattingClientCapabilities = KeyedCapabilities<CapabilityKey::rangeFormatting>;
using OnTypeFormattingClientCapabilities = KeyedCapabilities<CapabilityKey::onTypeFormatting>;
using RenameClientCapabilities = KeyedCapabilities<CapabilityKey::rename>;
using DocumentLinkCapabilities = KeyedCapabilities<CapabilityKey::documentLink>;
using TypeDefinitionClientCapabilities = KeyedCapabilities<CapabilityKey::typeDefinition>;
using ImplementationClientCapabilities = KeyedCapabilities<CapabilityKey::implementation>;
using ColorProviderCapabilities = KeyedCapabilities<CapabilityKey::colorProvider>;
using FoldingRangeClientCapabilities = KeyedCapabilities<CapabilityKey::foldingRange>;
using SelectionRangeClientCapabilities = KeyedCapabilities<CapabilityKey::selectionRange>;
using LinkedEditingRangeClientCapabilities = KeyedCapabilities<CapabilityKey::linkedEditingRange>;
using CallHierarchyClientCapabilities = KeyedCapabilities<CapabilityKey::callHierarchy>;
using MonikerClientCapabilities = KeyedCapabilities<CapabilityKey::moniker>;
using TypeHierarchyClientCapabilities = KeyedCapabilities<CapabilityKey::typeHierarchy>;
using InlineValueClientCapabilities = KeyedCapabilities<CapabilityKey::inlineValue>;
using InlayHintClientCapabilities = KeyedCapabilities<CapabilityKey::inlayHint>;
using DiagnosticClientCapabilities = KeyedCapabilities<CapabilityKey::diagnostic>;

// Members are declared in the order they are written; diagnostics come first.
class VEXIL_API TextDocumentClientCapabilities : public Params {
 public:
  TextDocumentClientCapabilities() { name = "textDocument"; }
  void Write(xWriter& writer) override;

  PublishDiagnosticsClientCapabilities publishDiagnostics;
  SynchronizationClientCapabilities synchronization;
  CompletionClientCapabilities completion;
  HoverClientCapabilities hover;
  SignatureHelpClientCapabilities signatureHelp;
  DefinitionClientCapabilities definition;
  ReferencesClientCapabilities references;
  DocumentHighlightClientCapabilities documentHighlight;
  DocumentSymbolClientCapabilities documentSymbol;
  CodeActionClientCapabilities codeAction;
  CodeLensClientCapabilities codeLens;
  DocumentFormattingClientCapabilities formatting;
  RangeFormattingClientCapabilities rangeFormatting;
  OnTypeFormattingClientCapabilities onTypeFormatting;
  RenameClientCapabilities rename;
  DocumentLinkCapabilities documentLink;
  TypeDefinitionClientCapabilities typeDefinition;
  ImplementationClientCapabilities implementation;
  DeclarationClientCapabilities declaration;
  ColorProviderCapabilities colorProvider;
  FoldingRangeClientCapabilities foldingRange;
  SelectionRangeClientCapabilities selectionRange;
  LinkedEditingRangeClientCapabilities linkedEditingRange;
  CallHierarchyClientCapabilities callHierarchy;
  MonikerClientCapabilities moniker;
  TypeHierarchyClientCapabilities typeHierarchy;
  InlineValueClientCapabilities inlineValue;
  InlayHintClientCapabilities inlayHint;
  DiagnosticClientCapabilities diagnostic;
};

class VEXIL_API ClientCapabilities : public Params {
 public:
  ClientCapabilities() { name = "capabilities"; }
  void Write(xWriter& writer) override;

  WorkspaceClientCapabilities workspace;
  TextDocumentClientCapabilities textDocument;
  // Opt-in capabilities (e.g. FeatureClientCapabilities written as text), each a JSON
  // object merged over the tree in turn: a member the tree has keeps its place (objects
  // merge member by member, anything else is replaced), a new member is appended. Text
  // that is not a JSON object is ignored. With none, the tree is written as always.
  std::vector<std::string> additions;
};

}  // namespace LSP
