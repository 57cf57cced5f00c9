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

void LanguageServer::Request(const char* method, Params* params, Result& holder) {
  RequestMessage request(method, params);
  server.Write(request);
  ResponseMessage response(&holder);
  server.Read(request.id, response);
}

void LanguageServer::Notify(const char* method, Params* params) {
  NotificationMessage notification(method, params);
  server.Write(notification);
}

std::vector<Location> LanguageServer::Locations(const char* method, Params* params) {
  LocationsList holder;
  Request(method, params, holder);
  return holder.items;
}

std::vector<SymbolInformation> LanguageServer::Symbols(const char* method, Params* params, std::string documentUri) {
  SymbolInformationList holder(std::move(documentUri));
  Request(method, params, holder);
  return holder.items;
}

std::vector<TextEdit> LanguageServer::Edits(const char* method, Params* params) {
  DocumentFormattingList holder;
  Request(method, params, holder);
  return holder.items;
}

CompletionList LanguageServer::TextDocument_Completion(CompletionParams* params) {
  CompletionList list;
  Request("textDocument/completion", params, list);
  return list;
}

std::vector<Location> LanguageServer::TextDocument_Declaration(TextDocumentPositionParams* params) {
  return Locations("textDocument/declaration", params);
}

std::vector<Location> LanguageServer::TextDocument_Definition(TextDocumentPositionParams* params) {
  return Locations("textDocument/definition", params);
}

std::vector<Location> LanguageServer::TextDocument_TypeDefinition(TextDocumentPositionParams* params) {
  return Locations("textDocument/typeDefinition", params);
}

std::vector<Location> LanguageServer::TextDocument_Implementation(TextDocumentPositionParams* params) {
  return Locations("textDocument/implementation", params);
}

std::vector<Location> LanguageServer::TextDocument_References(TextDocumentPositionParams* params) {
  if (!params || dynamic_cast<ReferenceParams*>(params)) return Locations("textDocument/references", params);
  WithReferenceContext withContext(*params);
  return Locations("textDocument/references", &withContext);
}

std::vector<SymbolInformation> LanguageServer::TextDocument_DocumentSymbol(DocumentSymbolParams* params) {
  // Hierarchical symbols carry no URI of their own: they belong to the requested document.
  return Symbols("textDocument/documentSymbol", params, params ? params->textDocument.uri : "");
}

std::vector<SymbolInformation> LanguageServer::TextDocument_WorkspaceSymbol(WorkspaceSymbolParams* params) {
  return Symbols("workspace/symbol", params, "");
}

Hover LanguageServer::TextDocument_Hover(TextDocumentPositionParams* params) {
  Hover hover;
  Request("textDocument/hover", params, hover);
  return hover;
}

SignatureHelp LanguageServer::TextDocument_Signature(TextDocumentPositionParams* params) {
  SignatureHelp help;
  Request("textDocument/signatureHelp", params, help);
  return help;
}

std::vector<TextEdit> LanguageServer::TextDocument_Formatting(DocumentFormattingParams* params) {
  return Edits("textDocument/formatting", params);
}

std::vector<TextEdit> LanguageServer::TextDocument_RangeFormatting(DocumentRangeFormattingParams* params) {
  return Edits("textDocument/rangeFormatting", params);
}

WorkspaceEdit LanguageServer::TextDocument_Rename(RenameParams* params) {
  WorkspaceEdit edit;
  Request("textDocument/rename", params, edit);
  return edit;
}

void LanguageServer::TextDocument_DidChange(DidChangeTextDocumentParams* params) {
  Notify("textDocument/didChange", params);
}

void LanguageServer::TextDocument_DidClose(DidCloseTextDocumentParams* params) {
  Notify("textDocument/didClose", params);
}

void LanguageServer::TextDocument_DidOpen(DidOpenTextDocumentParams* params) { Notify("textDocument/didOpen", params); }

void LanguageServer::TextDocument_DidSave(DidSaveTextDocumentParams* params) { Notify("textDocument/didSave", params); }

}  // namespace LSP
