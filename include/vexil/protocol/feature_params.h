// The params of the document notifications and feature requests, each written under
// "params" of its message. Structure members are written under their own keys.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/structures.h"

namespace LSP {

// Params that name one document; the base of the requests and notifications about it.
class VEXIL_API TextDocumentParams : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  TextDocumentIdentifier textDocument;
};

class VEXIL_API TextDocumentPositionParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Position position;
};

class VEXIL_API CompletionContext : public Params {
 public:
  CompletionContext() { name = "context"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int triggerKind = 1;
  std::string triggerCharacter;
};

class VEXIL_API CompletionParams : public TextDocumentPositionParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  CompletionContext context;
};

class VEXIL_API ReferenceContext : public Params {
 public:
  ReferenceContext() { name = "context"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  bool includeDeclaration = false;
};

class VEXIL_API ReferenceParams : public TextDocumentPositionParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  ReferenceContext context;
};

class VEXIL_API RenameParams : public TextDocumentPositionParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string newName;
};

class VEXIL_API DocumentSymbolParams : public TextDocumentParams {};

// "query" is written even when empty: an empty query asks for every symbol, and servers
// reject the request without it.
class VEXIL_API WorkspaceSymbolParams : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string query;
};

class VEXIL_API FormattingOptions : public Params {
 public:
  FormattingOptions() { name = "options"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int tabSize = 4;
  bool insertSpaces = true;
};

class VEXIL_API DocumentFormattingParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  FormattingOptions options;
};

class VEXIL_API DocumentRangeFormattingParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Range range;
  FormattingOptions options;
};

// The notifications below are only ever sent: they read nothing.
class VEXIL_API DidOpenTextDocumentParams : public Params {
 public:
  void Write(xWriter& writer) override;

  TextDocumentItem textDocument;
};

class VEXIL_API DidChangeTextDocumentParams : public Params {
 public:
  void Write(xWriter& writer) override;

  VersionedTextDocumentIdentifier textDocument;
  std::vector<TextDocumentContentChangeEvent> contentChanges;
};

class VEXIL_API DidSaveTextDocumentParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override {}
  using JsonObject::Read;
};

class VEXIL_API DidCloseTextDocumentParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override {}
  using JsonObject::Read;
};

}  // namespace LSP
