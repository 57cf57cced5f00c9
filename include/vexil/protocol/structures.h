// The small structures every request and result is built from: positions, ranges,
// document identifiers, edits, symbols, diagnostics, marked text and workspace folders.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "vexil/protocol/message.h"

namespace LSP {

// Zero-based line and character, as the protocol counts them.
class VEXIL_API Position : public JsonObject {
 public:
  Position() = default;
  Position(int line, int character) : line(line), character(character) {}
  const char* Name() const override { return "position"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int line = 0;
  int character = 0;
};

class VEXIL_API Range : public JsonObject {
 public:
  Range() = default;
  Range(const Position& start, const Position& end) : start(start), end(end) {}
  const char* Name() const override { return "range"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Position start;
  Position end;
};

class VEXIL_API Location : public JsonObject {
 public:
  const char* Name() const override { return "location"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string uri;
  Range range;
};

class VEXIL_API TextDocumentIdentifier : public JsonObject {
 public:
  TextDocumentIdentifier() = default;
  explicit TextDocumentIdentifier(std::string uri) : uri(std::move(uri)) {}
  const char* Name() const override { return "textDocument"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string uri;
};

class VEXIL_API VersionedTextDocumentIdentifier : public TextDocumentIdentifier {
 public:
  VersionedTextDocumentIdentifier() = default;
  VersionedTextDocumentIdentifier(std::string uri, int version)
      : TextDocumentIdentifier(std::move(uri)), version(version) {}
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int version = -1;
};

// A whole document as didOpen sends it; "text" is written even when empty (an empty file).
class VEXIL_API TextDocumentItem : public TextDocumentIdentifier {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string languageId;
  int version = -1;
  std::string text;
};

// Reads the protocol's "range" member; writes its start and end flattened into the edit.
class VEXIL_API TextEdit : public JsonObject {
 public:
  const char* Name() const override { return "textEdit"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Range range;
  std::string newText;
};

class VEXIL_API TextDocumentEdit : public JsonObject {
 public:
  const char* Name() const override { return "textDocumentEdit"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  VersionedTextDocumentIdentifier textDocument;
  std::vector<TextEdit> edits;
};

// Read from "documentChanges", or else from the "changes" map (one edit per document,
// version -1, in the map's order); written as "documentChanges".
class VEXIL_API WorkspaceEdit : public Result {
 public:
  const char* Name() const override { return "workspaceEdit"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::vector<TextDocumentEdit> documentChanges;
};

// One change of didChange: a range with its replacement text, or (without a range) the
// whole new text. The range is written as the protocol's "range" object; "text" always.
class VEXIL_API TextDocumentContentChangeEvent : public Params {
 public:
  TextDocumentContentChangeEvent() { name = "contentChanges"; }
  TextDocumentContentChangeEvent(const TextDocumentContentChangeEvent& other);
  TextDocumentContentChangeEvent& operator=(const TextDocumentContentChangeEvent& other);
  TextDocumentContentChangeEvent(TextDocumentContentChangeEvent&&) = default;
  TextDocumentContentChangeEvent& operator=(TextDocumentContentChangeEvent&&) = default;
  void Read(const xObject& value) override {}
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::unique_ptr<Range> range;
  std::unique_ptr<int> rangeLength;
  std::string text;
};

// A flat symbol with its location, or a hierarchical document symbol whose "range" is
// read into the location (its uri is left for the enclosing list to fill).
class VEXIL_API SymbolInformation : public JsonObject {
 public:
  const char* Name() const override { return "content"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string name;
  int kind = -1;
  bool deprecated = false;
  Location location;
  std::string containerName;
  std::vector<SymbolInformation> children;
};

// A server's error, warning or hint about a range of a document. The protocol allows a
// number or a string as "code": `codeText` holds either as text, `code` only a number.
// Tags and related information are not read, but `rawJson` keeps the diagnostic as the
// server sent it, to be given back in a code action's context. Writing leaves out
// severity, codeText and rawJson.
class VEXIL_API Diagnostic : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Range range;
  int code = -1;
  std::string source;
  std::string message;
  int severity = -1;  // 1 error, 2 warning, 3 information, 4 hint
  std::string codeText;
  std::string rawJson;  // "" for a diagnostic the host built
};

class VEXIL_API MarkedString : public JsonObject {
 public:
  const char* Name() const override { return "content"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string language;
  std::string value;
};

// Hover and documentation text: a markup object, a plain string, or an array of marked
// strings (kept in `items`; the first plain string of the array becomes `value`).
class VEXIL_API MarkupContent : public JsonObject {
 public:
  const char* Name() const override { return "content"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string kind;
  std::string value;
  std::vector<MarkedString> items;
};

class VEXIL_API WorkspaceFolder : public JsonObject {
 public:
  WorkspaceFolder() = default;
  WorkspaceFolder(std::string uri, std::string name) : uri(std::move(uri)), name(std::move(name)) {}
  const char* Name() const override { return "workspaceFolder"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string uri;
  std::string name;
};

}  // namespace LSP
