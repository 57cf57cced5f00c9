// Reading of published diagnostics and of pulled diagnostic reports, and writing of the
// pull request's params.
#include "vexil/protocol/diagnostics.h"

#include "protocol/json_arrays.h"

namespace LSP {

void PublishDiagnosticsParams::Read(const xObject& value) {
  uri = value.String("uri");
  version = value.Int("version");
  ReadArray(value, "diagnostics", diagnostics);
}

void DocumentDiagnosticParams::Read(const xObject& value) {
  TextDocumentParams::Read(value);
  previousResultId = value.String("previousResultId");
}

void DocumentDiagnosticParams::Write(xWriter& writer) {
  TextDocumentParams::Write(writer);
  writer.String("previousResultId", previousResultId);
}

void DocumentDiagnosticReport::Read(const xObject& value) {
  kind = value.String("kind");
  resultId = value.String("resultId");
  ReadArray(value, "items", items);
}

}  // namespace LSP
