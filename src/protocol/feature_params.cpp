// Writing (and, for the requests, reading back) of the feature and notification params.
// Derived params write their base members first, then their own.
#include "vexil/protocol/feature_params.h"

#include "protocol/json_arrays.h"

namespace LSP {

void TextDocumentParams::Read(const xObject& value) { textDocument.Read(value.Object("textDocument")); }
void TextDocumentParams::Write(xWriter& writer) { writer.Object(textDocument, true); }

void TextDocumentPositionParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  position.Read(value.Object("position"));
}

void TextDocumentPositionParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.Object(position, true);
}

void CompletionContext::Read(const xObject& value) {
  triggerKind = value.Int("triggerKind");
  triggerCharacter = value.String("triggerCharacter");
}

void CompletionContext::Write(xWriter& writer) {
  writer.Int("triggerKind", triggerKind);
  writer.String("triggerCharacter", triggerCharacter);
}

void CompletionParams::Read(const xObject& value) {
  TextDocumentPositionParams::Read(value);
  context.Read(value.Object("context"));
}

void CompletionParams::Write(xWriter& writer) {
  TextDocumentPositionParams::Write(writer);
  writer.Object(context, true);
}

void ReferenceContext::Read(const xObject& value) { includeDeclaration = value.Bool("includeDeclaration"); }
void ReferenceContext::Write(xWriter& writer) { writer.Bool("includeDeclaration", includeDeclaration); }

void ReferenceParams::Read(const xObject& value) {
  TextDocumentPositionParams::Read(value);
  context.Read(value.Object("context"));
}

void ReferenceParams::Write(xWriter& writer) {
  TextDocumentPositionParams::Write(writer);
  writer.Object(context, true);
}

void RenameParams::Read(const xObject& value) {
  TextDocumentPositionParams::Read(value);
  newName = value.String("newName");
}

void RenameParams::Write(xWriter& writer) {
  TextDocumentPositionParams::Write(writer);
  writer.String("newName", newName);
}

void WorkspaceSymbolParams::Read(const xObject& value) { query = value.String("query"); }
void WorkspaceSymbolParams::Write(xWriter& writer) { writer.RequiredString("query", query); }

void FormattingOptions::Read(const xObject& value) {
  tabSize = value.Int("tabSize");
  insertSpaces = value.Bool("insertSpaces");
}

void FormattingOptions::Write(xWriter& writer) {
  writer.Int("tabSize", tabSize);
  writer.Bool("insertSpaces", insertSpaces);
}

void DocumentFormattingParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  options.Read(value.Object("options"));
}

void DocumentFormattingParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.Object(options, true);
}

void DocumentRangeFormattingParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  range.Read(value.Object("range"));
  options.Read(value.Object("options"));
}

void DocumentRangeFormattingParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.Object(range, true);
  writer.Object(options, true);
}

void DidOpenTextDocumentParams::Write(xWriter& writer) { writer.Object(textDocument, true); }

void DidChangeTextDocumentParams::Write(xWriter& writer) {
  writer.Object(textDocument, true);
  WriteArray(writer, "contentChanges", contentChanges);
}

}  // namespace LSP
