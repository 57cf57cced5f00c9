// The two ways diagnostics reach the client: a server's "textDocument/publishDiagnostics"
// notification, and the report that answers a "textDocument/diagnostic" request.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/feature_params.h"

namespace LSP {

// Read from a notification's "params"; an empty list clears the document.
class VEXIL_API PublishDiagnosticsParams : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  // Only servers publish.
  void Write(xWriter& writer) override {}

  std::string uri;
  int version = -1;
  std::vector<Diagnostic> diagnostics;
};

// Asks for one document's diagnostics; `previousResultId`, when known, lets the server
// answer that nothing changed.
class VEXIL_API DocumentDiagnosticParams : public TextDocumentParams {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string previousResultId;
};

// A "full" report carries the document's items; an "unchanged" one only the result id of
// the report it confirms. Related documents' reports are not kept.
class VEXIL_API DocumentDiagnosticReport : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  bool IsFull() const { return kind == "full"; }
  bool IsUnchanged() const { return kind == "unchanged"; }

  std::string kind;
  std::string resultId;
  std::vector<Diagnostic> items;
};

}  // namespace LSP
