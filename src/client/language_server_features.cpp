// The document notifications and feature requests: each is one message through the
// shared request or notification pattern, with the reply read into an empty holder.
#include "client/language_server.h"

namespace LSP {
namespace {

// A plain position sent as a references request: most servers reject one without a
// context, so it goes out with the declaration included. The host's params are written
// as they are, followed by the context.
class WithReferenceContext : public Params {
 public:
  explicit WithReferenceContext(Params& position) : position_(position) {
    name = position.name;
    context_.includeDeclaration = true;
  }
  void Write(xWriter& writer) override {
    position_.Write(writer);
    writer.Object(context_.Name(), context_);
  }

 private:
  Params& position_;
  ReferenceContext context_;
};

}  // namespace

bool LanguageServer::Request(const char* method, Params* params, Result& holder) {
  RequestMessage request(method, params);
  server.Write(request);
  ResponseMessage response(&holder);
  server.Read(request.id, response);
  return response.id == request.id && !response.HaveError() && !server.HaveErrors();
}

bool LanguageServer::Send(const char* method, Params* params) {
  NotificationMessage notification(method, params);
  return server.Write(notification);
}

CompletionList LanguageServer::TextDocument_Completion(CompletionParams* params) {
  // Keeping each item's text costs time on big lists; only resolving needs it.
  CompletionList holder;
  holder.keepItemJson = result.capabilities.completionProvider.resolveProvider;
  return Ask("textDocument/completion", params, std::move(holder));
}

std::vector<Location> LanguageServer::TextDocument_Declaration(TextDocumentPositionParams* params) {
  return Ask<LocationsList>("textDocument/declaration", params).items;
}

std::vector<Location> LanguageServer::TextDocument_Definition(TextDocumentPositionParams* params) {
  return Ask<LocationsList>("textDocument/definition", params).items;
}

std::vector<Location> LanguageServer::TextDocument_TypeDefinition(TextDocumentPositionParams* params) {
  return Ask<LocationsList>("textDocument/typeDefinition", params).items;
}

std::vector<Location> LanguageServer::TextDocument_Implementation(TextDocumentPositionParams* params) {
  return Ask<LocationsList>("textDocument/implementation", params).items;
}

std::vector<Location> LanguageServer::TextDocument_References(TextDocumentPositionParams* params) {
  if (!params || dynamic_cast<ReferenceParams*>(params)) return Ask<LocationsList>("textDocument/references", params).items;
  WithReferenceContext withContext(*params);
  return Ask<LocationsList>("textDocument/references", &withContext).items;
}

std::vector<SymbolInformation> LanguageServer::TextDocument_DocumentSymbol(DocumentSymbolParams* params) {
  // Hierarchical symbols carry no URI of their own: they belong to the requested document.
  SymbolInformationList holder(params ? params->textDocument.uri : "");
  return Ask("textDocument/documentSymbol", params, std::move(holder)).items;
}

std::vector<SymbolInformation> LanguageServer::TextDocument_WorkspaceSymbol(WorkspaceSymbolParams* params) {
  return Ask<SymbolInformationList>("workspace/symbol", params).items;
}

Hover LanguageServer::TextDocument_Hover(TextDocumentPositionParams* params) {
  return Ask<Hover>("textDocument/hover", params);
}

SignatureHelp LanguageServer::TextDocument_Signature(TextDocumentPositionParams* params) {
  return Ask<SignatureHelp>("textDocument/signatureHelp", params);
}

std::vector<TextEdit> LanguageServer::TextDocument_Formatting(DocumentFormattingParams* params) {
  return Ask<DocumentFormattingList>("textDocument/formatting", params).items;
}

std::vector<TextEdit> LanguageServer::TextDocument_RangeFormatting(DocumentRangeFormattingParams* params) {
  return Ask<DocumentFormattingList>("textDocument/rangeFormatting", params).items;
}

WorkspaceEdit LanguageServer::TextDocument_Rename(RenameParams* params) {
  return Ask<WorkspaceEdit>("textDocument/rename", params);
}

void LanguageServer::TextDocument_DidChange(DidChangeTextDocumentParams* params) {
  Send("textDocument/didChange", params);
}

void LanguageServer::TextDocument_DidClose(DidCloseTextDocumentParams* params) {
  Send("textDocument/didClose", params);
}

void LanguageServer::TextDocument_DidOpen(DidOpenTextDocumentParams* params) { Send("textDocument/didOpen", params); }

void LanguageServer::TextDocument_DidSave(DidSaveTextDocumentParams* params) { Send("textDocument/didSave", params); }

}  // namespace LSP
