// Reading and writing of the core document structures. Edits and diagnostics write
// their range flattened; change events write the protocol's "range" object.
#include "vexil/protocol/structures.h"

#include <string>

#include "json/json_depth.h"
#include "json/members.h"
#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {
namespace {

// clangd, pyright and pylsp's linters name their codes ("undeclared_var_use", "F821"),
// other servers number them: both are kept as text, and numbers also as numbers. Any
// other type still raises the type error.
void ReadCode(const xObject& diagnostic, int& code, std::string& codeText) {
  xObject member = diagnostic.Object("code");
  if (member.IsString()) {
    code = -1;
    codeText = member.GetString();
    return;
  }
  code = diagnostic.Int("code");
  codeText = member.IsInt() ? std::to_string(code) : "";
}

}  // namespace

void Position::Read(const xObject& value) {
  static const MemberNames names{"line", "character"};
  const Members position(value, names);
  line = position.Int("line");
  character = position.Int("character");
}

void Position::Write(xWriter& writer) {
  writer.Int("line", line);
  writer.Int("character", character);
}

void Range::Read(const xObject& value) {
  static const MemberNames names{"start", "end"};
  const Members range(value, names);
  start.Read(range.Object("start"));
  end.Read(range.Object("end"));
}

void Range::Write(xWriter& writer) {
  writer.Object("start", start);
  writer.Object("end", end);
}

void Location::Read(const xObject& value) {
  uri = value.String("uri");
  range.Read(value.Object("range"));
}

void Location::Write(xWriter& writer) {
  writer.String("uri", uri);
  writer.Object(range, true);
}

void TextDocumentIdentifier::Read(const xObject& value) { uri = value.String("uri"); }
void TextDocumentIdentifier::Write(xWriter& writer) { writer.String("uri", uri); }

void VersionedTextDocumentIdentifier::Read(const xObject& value) {
  TextDocumentIdentifier::Read(value);
  version = value.Int("version");
}

void VersionedTextDocumentIdentifier::Write(xWriter& writer) {
  TextDocumentIdentifier::Write(writer);
  writer.Int("version", version);
}

void TextDocumentItem::Read(const xObject& value) {
  TextDocumentIdentifier::Read(value);
  languageId = value.String("languageId");
  version = value.Int("version");
  text = value.String("text");
}

void TextDocumentItem::Write(xWriter& writer) {
  TextDocumentIdentifier::Write(writer);
  writer.String("languageId", languageId);
  writer.Int("version", version);
  writer.RequiredString("text", text);
}

void TextEdit::Read(const xObject& value) {
  static const MemberNames names{"range", "newText"};
  const Members edit(value, names);
  range.Read(edit.Object("range"));
  newText = edit.String("newText");
}

void TextEdit::Write(xWriter& writer) {
  range.Write(writer);  // "start" and "end" straight into the edit, without a "range" key
  writer.String("newText", newText);
}

void TextDocumentEdit::Read(const xObject& value) {
  textDocument.Read(value.Object("textDocument"));
  ReadArray(value, "edits", edits);
}

void TextDocumentEdit::Write(xWriter& writer) {
  writer.Object(textDocument, true);
  WriteArray(writer, "edits", edits);
}

// Most servers answer a rename with the "changes" map, since the client announces no
// support for "documentChanges": each entry becomes one edit of an unversioned document.
void WorkspaceEdit::Read(const xObject& value) {
  if (value.HasObject("documentChanges")) {
    ReadArray(value, "documentChanges", documentChanges);
    return;
  }
  xObject changes = value.Object("changes");
  if (changes.IsNull()) return;
  if (!changes.IsObject())
    ThrowFormatted("Expecting a %s JSON object but found %d JSON object .", "object",
                   static_cast<int>(changes.Value().GetType()));
  for (const auto& entry : changes.Value().GetObject()) {
    TextDocumentEdit edit;
    edit.textDocument.uri.assign(entry.name.GetString(), entry.name.GetStringLength());
    ReadArrayValue(entry.value, edit.edits);
    documentChanges.push_back(std::move(edit));
  }
}

void WorkspaceEdit::Write(xWriter& writer) { WriteArray(writer, "documentChanges", documentChanges); }

TextDocumentContentChangeEvent::TextDocumentContentChangeEvent(const TextDocumentContentChangeEvent& other)
    : Params(other),
      range(other.range ? new Range(*other.range) : nullptr),
      rangeLength(other.rangeLength ? new int(*other.rangeLength) : nullptr),
      text(other.text) {}

TextDocumentContentChangeEvent& TextDocumentContentChangeEvent::operator=(
    const TextDocumentContentChangeEvent& other) {
  if (this != &other) *this = TextDocumentContentChangeEvent(other);
  return *this;
}

void TextDocumentContentChangeEvent::Write(xWriter& writer) {
  if (range) writer.Object(*range, true);
  if (rangeLength) writer.Int("rangeLength", *rangeLength);
  writer.RequiredString("text", text);
}

namespace {

// Reads `symbol` and its children, the symbol being `depth` levels deep. Trees deeper
// than the nesting limit are malformed: reading one recursively could exhaust the stack.
void ReadSymbol(SymbolInformation& symbol, const xObject& value, int depth) {
  if (depth > kNestingLimit) {
    ThrowFormatted("children\nFailed to read JSON object: nested deeper than %d levels", kNestingLimit);
  }
  symbol.name = value.String("name");
  symbol.kind = value.Int("kind");
  symbol.deprecated = value.Bool("deprecated");
  symbol.containerName = value.String("containerName");
  symbol.location.Read(value.Object("location"));
  // The hierarchical document-symbol form has "range" instead of a location; its
  // document is the requested one, which the enclosing list fills in.
  if (!value.HasObject("location") && value.HasObject("range")) symbol.location.range.Read(value.Object("range"));
  // Children are read leniently: anything that is not an object is passed over.
  xObject list = value.Object("children");
  if (!list.IsArray()) return;
  for (const JsonValue& element : list.Value().GetArray()) {
    if (!element.IsObject()) continue;
    symbol.children.emplace_back();
    ReadSymbol(symbol.children.back(), xObject(element), depth + 1);
  }
}

}  // namespace

void SymbolInformation::Read(const xObject& value) { ReadSymbol(*this, value, 1); }

void SymbolInformation::Write(xWriter& writer) {
  writer.String("name", name);
  writer.Int("kind", kind);
  writer.Bool("deprecated", deprecated);
  writer.Object(location, true);
}

void Diagnostic::Read(const xObject& value) {
  range.Read(value.Object("range"));
  ReadCode(value, code, codeText);
  source = value.String("source");
  message = value.String("message");
  severity = value.Int("severity");
  rawJson = RawJsonText(value);
}

void Diagnostic::Write(xWriter& writer) {
  range.Write(writer);  // flattened like TextEdit
  writer.Int("code", code);
  writer.String("source", source);
  writer.String("message", message);
}

void MarkedString::Read(const xObject& value) {
  language = value.String("language");
  this->value = value.String("value");
}

void MarkedString::Write(xWriter& writer) {
  writer.String("language", language);
  writer.String("value", value);
}

void MarkupContent::Read(const xObject& content) {
  kind.clear();
  if (content.IsNull()) {
    value.clear();
  } else if (content.IsArray()) {
    value.clear();
    for (const JsonValue& element : content.Value().GetArray()) {
      xObject item(element);
      if (item.IsObject()) {
        items.emplace_back();
        items.back().Read(item);
      } else if (value.empty()) {
        value = item.GetString();
      }
    }
  } else if (content.IsString()) {
    value = content.GetString();
  } else {
    kind = content.String("kind");
    value = content.String("value");
  }
}

void MarkupContent::Write(xWriter& writer) {
  writer.String("kind", kind);
  writer.String("value", value);
}

void WorkspaceFolder::Read(const xObject& value) {
  uri = value.String("uri");
  name = value.String("name");
}

void WorkspaceFolder::Write(xWriter& writer) {
  writer.String("uri", uri);
  writer.String("name", name);
}

}  // namespace LSP
