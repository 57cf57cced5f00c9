// The results of the feature requests, read from the reply's "result" in every shape a
// server may send. Results are read-only: writing one writes nothing.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/structures.h"

namespace LSP {

class VEXIL_API Hover : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  MarkupContent contents;
  Range range;
};

// A parameter label given as a pair of offsets raises a type error: the client does not
// announce offset support, so servers send the text.
class VEXIL_API ParameterInformation : public JsonObject {
 public:
  const char* Name() const override { return "parameterInformation"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::string label;
  MarkupContent documentation;
};

class VEXIL_API SignatureInformation : public JsonObject {
 public:
  const char* Name() const override { return "signatureInformation"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::string label;
  MarkupContent documentation;
  std::vector<ParameterInformation> parameters;
};

class VEXIL_API SignatureHelp : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::vector<SignatureInformation> signatures;
  int activeSignature = -1;
  int activeParameter = -1;
};

class VEXIL_API CompletionItemLabelDetails : public JsonObject {
 public:
  const char* Name() const override { return "labelDetails"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::string detail;
  std::string description;
};

// Additional edits, commit characters and commands are not read, but `rawJson` keeps the
// item as the server sent it, so that "completionItem/resolve" can send it back whole. It
// is filled by the list that holds the item and by the resolved item.
class VEXIL_API CompletionItem : public JsonObject {
 public:
  const char* Name() const override { return "completionItem"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::string label;
  CompletionItemLabelDetails labelDetails;
  int kind = -1;
  std::string detail;
  MarkupContent documentation;
  bool deprecated = false;
  std::string sortText;
  std::string filterText;
  std::string insertText;
  int insertTextFormat = -1;
  TextEdit textEdit;
  std::string rawJson;  // "" for an item the host built
};

// A completion reply: a list object, a bare array of items, or null.
class VEXIL_API CompletionList : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  bool isIncomplete = false;
  std::vector<CompletionItem> items;
  // Whether each item keeps its JSON text (`rawJson`), which only a server that resolves
  // items needs: keeping it makes reading a large list half as fast again.
  bool keepItemJson = true;
};

// A result that arrives as a JSON array.
class VEXIL_API ListResult : public Result {
 public:
  bool IsObject() override { return false; }
  void Write(xWriter& writer) override {}
};

// Definition, declaration, type definition, implementation and references: an array
// of locations, a single location, or null.
class VEXIL_API LocationsList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<Location> items;
};

// Document and workspace symbols. Symbols in the hierarchical document form carry no
// location: they get `documentUri` (the requested document) and their "range".
class VEXIL_API SymbolInformationList : public ListResult {
 public:
  SymbolInformationList() = default;
  explicit SymbolInformationList(std::string documentUri) : documentUri(std::move(documentUri)) {}
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::string documentUri;
  std::vector<SymbolInformation> items;
};

class VEXIL_API DocumentFormattingList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<TextEdit> items;
};

}  // namespace LSP
