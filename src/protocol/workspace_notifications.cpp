// Writing of the workspace and will-save notifications.
#include "vexil/protocol/workspace_notifications.h"

#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {

void DidChangeConfigurationParams::Write(xWriter& writer) {
  if (settings.empty()) writer.Null("settings");
  else WriteRawJson(writer, "settings", settings);
}

void WorkspaceFoldersChangeEvent::Write(xWriter& writer) {
  WriteArray(writer, "added", added);
  WriteArray(writer, "removed", removed);
}

void DidChangeWorkspaceFoldersParams::Write(xWriter& writer) { writer.Object(event, true); }

void WillSaveTextDocumentParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  reason = value.Int("reason");
}

void WillSaveTextDocumentParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.Int("reason", reason);
}

}  // namespace LSP
