// Reading of the per-document feature results and writing of their params. Label parts,
// rename answers and selection chains come in several shapes; each is read as sent.
#include "vexil/protocol/document_features.h"

#include "json/json_depth.h"
#include "json/json_errors.h"
#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {

void DocumentHighlight::Read(const xObject& value) {
  range.Read(value.Object("range"));
  kind = value.Int("kind");
}

void DocumentHighlightList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

void FoldingRange::Read(const xObject& value) {
  startLine = value.Int("startLine");
  startCharacter = value.Int("startCharacter");
  endLine = value.Int("endLine");
  endCharacter = value.Int("endCharacter");
  kind = value.String("kind");
  collapsedText = value.String("collapsedText");
}

void FoldingRangeList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

void SelectionRangeParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  ReadArray(value, "positions", positions);
}

void SelectionRangeParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  WriteArray(writer, "positions", positions);
}

// Walked as a loop, not by recursion, so the depth costs no stack.
void SelectionRange::Read(const xObject& value) {
  range.Read(value.Object("range"));
  for (xObject parent = value.Object("parent"); !parent.IsNull(); parent = parent.Object("parent")) {
    if (parents.size() == static_cast<std::size_t>(kNestingLimit))
      ThrowFormatted("parent\nFailed to read JSON object: nested deeper than %d levels", kNestingLimit);
    parents.emplace_back();
    parents.back().Read(parent.Object("range"));
  }
}

void SelectionRangeList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

void InlayHintParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  range.Read(value.Object("range"));
}

void InlayHintParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.Object(range, true);
}

void InlayHintLabelPart::Read(const xObject& value) {
  this->value = value.String("value");
  tooltip.Read(value.Object("tooltip"));
  location.Read(value.Object("location"));
  command.Read(value.Object("command"));
}

void InlayHint::Read(const xObject& value) {
  position.Read(value.Object("position"));
  if (value.Object("label").IsArray()) {
    ReadArray(value, "label", labelParts);
    for (const InlayHintLabelPart& part : labelParts) label += part.value;
  } else {
    label = value.String("label");
  }
  kind = value.Int("kind");
  tooltip.Read(value.Object("tooltip"));
  paddingLeft = value.Bool("paddingLeft");
  paddingRight = value.Bool("paddingRight");
  ReadArray(value, "textEdits", textEdits);
}

void InlayHintList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

void PrepareRenameResult::Read(const xObject& value) {
  if (value.HasObject("start")) {
    range.Read(value);
  } else if (value.HasObject("range")) {
    range.Read(value.Object("range"));
    placeholder = value.String("placeholder");
  } else {
    defaultBehavior = value.Bool("defaultBehavior");
  }
}

void CompletionItemResolveParams::Write(xWriter& writer) {
  if (item.rawJson.empty()) writer.RequiredString("label", item.label);
  else WriteRawMembers(writer, item.rawJson);
}

void ResolvedCompletionItem::Read(const xObject& value) {
  item.Read(value);
  item.rawJson = RawJsonText(value);
}

}  // namespace LSP
