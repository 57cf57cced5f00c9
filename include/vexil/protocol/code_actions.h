// Quick fixes and refactorings: the code actions a server offers for a range, the commands
// it runs on request, and the edits it asks the client to apply ("workspace/applyEdit").
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"

namespace LSP {

// A command the server runs when asked ("workspace/executeCommand"). Its arguments are
// the server's own business: they are kept as JSON text and sent back as they came.
class VEXIL_API Command : public JsonObject {
 public:
  const char* Name() const override { return "command"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string title;
  std::string command;
  std::string arguments;  // a JSON array as text, "" when there are none
};

// The diagnostics a code action request is about, and the kinds of action wanted. Each
// diagnostic is written in the protocol's shape, as the server published it when it was
// read from a publication or a report (its `rawJson`), else from its members.
class VEXIL_API CodeActionContext : public Params {
 public:
  CodeActionContext() { name = "context"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::vector<Diagnostic> diagnostics;
  std::vector<std::string> only;  // e.g. "quickfix"; written only when not empty
  int triggerKind = -1;           // 1 invoked, 2 automatic; written only when set
};

class VEXIL_API CodeActionParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  Range range;
  CodeActionContext context;
};

// One entry of a code action reply. Servers answer with code actions (title, kind, the
// diagnostics they fix, an edit and/or a command) or, to clients that announce no
// code action literals, with bare commands: those read as an action whose only member is
// `command`, its title copied to `title`.
class VEXIL_API CodeAction : public JsonObject {
 public:
  const char* Name() const override { return "codeAction"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  bool HasEdit() const { return !edit.documentChanges.empty(); }
  bool HasCommand() const { return !command.command.empty(); }

  std::string title;
  std::string kind;
  std::vector<Diagnostic> diagnostics;
  bool isPreferred = false;
  WorkspaceEdit edit;
  Command command;
};

class VEXIL_API CodeActionList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<CodeAction> items;
};

class VEXIL_API ExecuteCommandParams : public Params {
 public:
  ExecuteCommandParams() = default;
  // The command of a code action or a code lens, with its arguments.
  explicit ExecuteCommandParams(const Command& command) : command(command.command), arguments(command.arguments) {}
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string command;
  std::string arguments;  // a JSON array as text; left out when empty
};

// A result of any shape, kept as JSON text ("" for null): what an executed command returns.
class VEXIL_API JsonResult : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  std::string json;
};

// The params of the server's "workspace/applyEdit" request.
class VEXIL_API ApplyWorkspaceEditParams : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  // Only servers send it.
  void Write(xWriter& writer) override {}

  std::string label;
  WorkspaceEdit edit;
};

// The client's answer to "workspace/applyEdit", written as the reply's result.
class VEXIL_API ApplyWorkspaceEditResult : public Params {
 public:
  ApplyWorkspaceEditResult() { name = "result"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  bool applied = false;
  std::string failureReason;  // left out when empty
};

}  // namespace LSP
