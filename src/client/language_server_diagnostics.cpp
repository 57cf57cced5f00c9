// The host's view of diagnostics: the stored lists, filled by publications on the reader's
// thread, and the pull request for servers that only answer when asked.
#include "client/language_server.h"

namespace LSP {

std::vector<Diagnostic> LanguageServer::TextDocument_Diagnostics(const char* uri) {
  return uri ? server.Diagnostics().Of(uri) : std::vector<Diagnostic>();
}

std::vector<Diagnostic> LanguageServer::TextDocument_PullDiagnostics(TextDocumentIdentifier* document) {
  if (!document) return {};
  vexil::DiagnosticsStore& store = server.Diagnostics();
  // Servers that publish would refuse the request, and an error would hide their lists.
  if (!result.capabilities.diagnosticProvider) return store.Of(document->uri);
  DocumentDiagnosticParams params;
  params.textDocument = *document;
  params.previousResultId = store.ResultId(document->uri);
  DocumentDiagnosticReport report = Ask<DocumentDiagnosticReport>("textDocument/diagnostic", &params);
  if (report.IsFull()) store.Replace(document->uri, report.items, report.resultId);
  // A time-out or an error reply leaves the report empty, like every other request.
  return report.IsUnchanged() ? store.Of(document->uri) : report.items;
}

}  // namespace LSP
