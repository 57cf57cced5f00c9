// Reading and writing of code actions, commands and applied edits. Server-owned values
// (command arguments, published diagnostics) travel as the JSON text the server sent.
#include "vexil/protocol/code_actions.h"

#include "json/json_depth.h"
#include "json/json_errors.h"
#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {
namespace {

// The protocol's shape, which servers match against their own diagnostics: a "range"
// object, the code as the server gave it, and the message, which is required.
void WriteDiagnostic(xWriter& writer, Diagnostic& diagnostic) {
  if (!diagnostic.rawJson.empty()) {
    WriteRawElement(writer, diagnostic.rawJson);
    return;
  }
  writer.StartObject();
  writer.Object(diagnostic.range, true);
  if (diagnostic.severity > 0) writer.Int("severity", diagnostic.severity);
  if (diagnostic.code >= 0) writer.Int("code", diagnostic.code);
  else writer.String("code", diagnostic.codeText);
  writer.String("source", diagnostic.source);
  writer.RequiredString("message", diagnostic.message);
  writer.EndObject();
}

}  // namespace

void Command::Read(const xObject& value) {
  title = value.String("title");
  command = value.String("command");
  arguments = RawJsonText(value.Object("arguments"));
}

void Command::Write(xWriter& writer) {
  writer.String("title", title);
  writer.String("command", command);
  WriteRawJson(writer, "arguments", arguments);
}

void CodeActionContext::Read(const xObject& value) {
  ReadArray(value, "diagnostics", diagnostics);
  only = value.Strings("only");
  triggerKind = value.Int("triggerKind");
}

void CodeActionContext::Write(xWriter& writer) {
  writer.StartArray("diagnostics");
  for (Diagnostic& diagnostic : diagnostics) WriteDiagnostic(writer, diagnostic);
  writer.EndArray();
  if (!only.empty()) writer.Strings("only", only);
  if (triggerKind > 0) writer.Int("triggerKind", triggerKind);
}

void CodeActionParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  range.Read(value.Object("range"));
  context.Read(value.Object("context"));
}

void CodeActionParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.Object(range, true);
  writer.Object(context, true);
}

void CodeAction::Read(const xObject& value) {
  if (value.Object("command").IsString()) {  // a bare command
    command.Read(value);
    title = command.title;
    return;
  }
  title = value.String("title");
  kind = value.String("kind");
  ReadArray(value, "diagnostics", diagnostics);
  isPreferred = value.Bool("isPreferred");
  edit.Read(value.Object("edit"));
  command.Read(value.Object("command"));
}

void CodeActionList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

void ExecuteCommandParams::Read(const xObject& value) {
  command = value.String("command");
  arguments = RawJsonText(value.Object("arguments"));
}

void ExecuteCommandParams::Write(xWriter& writer) {
  writer.RequiredString("command", command);
  WriteRawJson(writer, "arguments", arguments);
}

void JsonResult::Read(const xObject& value) {
  // Written out recursively: deeper nesting could exhaust a host thread's stack.
  if (!NestedWithin(value.Value(), kNestingLimit)) {
    ThrowFormatted("result\nFailed to read JSON value: nested deeper than %d levels", kNestingLimit);
  }
  json = RawJsonText(value);
}

void ApplyWorkspaceEditParams::Read(const xObject& value) {
  label = value.String("label");
  edit.Read(value.Object("edit"));
}

void ApplyWorkspaceEditResult::Read(const xObject& value) {
  applied = value.Bool("applied");
  failureReason = value.String("failureReason");
}

void ApplyWorkspaceEditResult::Write(xWriter& writer) {
  writer.Bool("applied", applied);
  writer.String("failureReason", failureReason);
}

}  // namespace LSP
