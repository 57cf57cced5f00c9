// Notifications that tell a server about the workspace and the editor: changed settings,
// folders added to or removed from the workspace, a document about to be saved.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/feature_params.h"

namespace LSP {

// "workspace/didChangeConfiguration". The settings are free-form JSON that each server
// defines (pylsp reads {"pylsp": {...}}); empty text sends null. Text that is not JSON
// makes the writing throw "Invalid JSON for settings: <parser's text>".
class VEXIL_API DidChangeConfigurationParams : public Params {
 public:
  void Write(xWriter& writer) override;

  std::string settings;
};

// Both lists are always written, empty or not, as the protocol requires.
class VEXIL_API WorkspaceFoldersChangeEvent : public Params {
 public:
  WorkspaceFoldersChangeEvent() { name = "event"; }
  void Write(xWriter& writer) override;

  std::vector<WorkspaceFolder> added;
  std::vector<WorkspaceFolder> removed;
};

// "workspace/didChangeWorkspaceFolders".
class VEXIL_API DidChangeWorkspaceFoldersParams : public Params {
 public:
  void Write(xWriter& writer) override;

  WorkspaceFoldersChangeEvent event;
};

// "textDocument/willSave", before the host writes the document to disk.
class VEXIL_API WillSaveTextDocumentParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int reason = 1;  // 1 manual, 2 after a delay, 3 focus lost
};

}  // namespace LSP
