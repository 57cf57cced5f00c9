// What a server tells about one document beyond the classic requests: highlights of a
// symbol, folding ranges, selection ranges, inlay hints, whether a rename is possible,
// and the details of a completion item resolved on demand.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/code_actions.h"

namespace LSP {

class VEXIL_API DocumentHighlight : public JsonObject {
 public:
  const char* Name() const override { return "documentHighlight"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  Range range;
  int kind = -1;  // 1 text, 2 read, 3 write; -1 when absent (the protocol then means text)
};

class VEXIL_API DocumentHighlightList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<DocumentHighlight> items;
};

class VEXIL_API FoldingRangeParams : public TextDocumentParams {};

// Lines are zero-based; characters are -1 when the server folds whole lines.
class VEXIL_API FoldingRange : public JsonObject {
 public:
  const char* Name() const override { return "foldingRange"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  int startLine = -1;
  int startCharacter = -1;
  int endLine = -1;
  int endCharacter = -1;
  std::string kind;  // "comment", "imports", "region" or "" for code
  std::string collapsedText;
};

class VEXIL_API FoldingRangeList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<FoldingRange> items;
};

class VEXIL_API SelectionRangeParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::vector<Position> positions;
};

// The range selected at one position and the ranges that enclose it. The protocol nests
// each enclosing range as the "parent" of the one inside; they are read into `parents`,
// innermost first. A chain deeper than 1,000 ranges is malformed and throws.
class VEXIL_API SelectionRange : public JsonObject {
 public:
  const char* Name() const override { return "selectionRange"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  Range range;
  std::vector<Range> parents;
};

// One entry per requested position, in the order of the positions.
class VEXIL_API SelectionRangeList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<SelectionRange> items;
};

class VEXIL_API InlayHintParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Range range;
};

// A piece of a hint's label that may point somewhere (a parameter's declaration, a type).
class VEXIL_API InlayHintLabelPart : public JsonObject {
 public:
  const char* Name() const override { return "inlayHintLabelPart"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::string value;
  MarkupContent tooltip;
  Location location;  // uri "" when the part points nowhere
  Command command;
};

// A hint shown inside the text ("x:" before an argument, ": int" after a name). The
// label is a string or a list of parts; either way `label` holds the whole text, and
// `labelParts` the parts when the server sent them.
class VEXIL_API InlayHint : public JsonObject {
 public:
  const char* Name() const override { return "inlayHint"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  Position position;
  std::string label;
  std::vector<InlayHintLabelPart> labelParts;
  int kind = -1;  // 1 type, 2 parameter; -1 when absent
  MarkupContent tooltip;
  bool paddingLeft = false;
  bool paddingRight = false;
  std::vector<TextEdit> textEdits;
};

class VEXIL_API InlayHintList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<InlayHint> items;
};

class VEXIL_API PrepareRenameParams : public TextDocumentPositionParams {};

// Whether a rename is possible at a position, in the three forms servers answer with: the
// range of the name, the range with the text to offer, or {"defaultBehavior": true} (the
// client picks the word itself). A null reply (no rename there) leaves the range at -1.
class VEXIL_API PrepareRenameResult : public Result {
 public:
  PrepareRenameResult() : range(Position(-1, -1), Position(-1, -1)) {}
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  bool CanRename() const { return defaultBehavior || range.start.line >= 0; }

  Range range;
  std::string placeholder;
  bool defaultBehavior = false;
};

// "completionItem/resolve" sends an item back exactly as the server sent it (its
// `rawJson`, with the server's "data"); an item the host built sends its label only.
class VEXIL_API CompletionItemResolveParams : public Params {
 public:
  CompletionItemResolveParams() = default;
  explicit CompletionItemResolveParams(const CompletionItem& item) : item(item) {}
  void Write(xWriter& writer) override;

  CompletionItem item;
};

// The resolved item, with the details the server left out of the completion list.
class VEXIL_API ResolvedCompletionItem : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  CompletionItem item;
};

}  // namespace LSP
