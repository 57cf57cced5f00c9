// The requests IDEs use beyond the classic ones (quick fixes, highlights, folding, semantic
// colouring, inlay hints, call hierarchies) and the workspace notifications, each one
// message through the shared request or notification pattern.
#include <exception>

#include "client/language_server.h"

namespace LSP {
namespace {

bool NotAfter(const Position& a, const Position& b) {
  return a.line < b.line || (a.line == b.line && a.character <= b.character);
}

// Whether two ranges overlap or touch: a diagnostic at the cursor belongs to an empty range.
bool Touch(const Range& a, const Range& b) { return NotAfter(a.start, b.end) && NotAfter(b.start, a.end); }

// Params written with a context of its own, the host's params left as they are.
class WithDiagnostics : public CodeActionParams {
 public:
  WithDiagnostics(const CodeActionParams& params, const std::vector<Diagnostic>& published)
      : CodeActionParams(params) {
    for (const Diagnostic& diagnostic : published) {
      if (Touch(diagnostic.range, range)) context.diagnostics.push_back(diagnostic);
    }
  }
};

}  // namespace

bool LanguageServer::Writable(Params& params) {
  // Host-given JSON text (command arguments, settings) fails only when written.
  try {
    ToJsonText(params);
    return true;
  } catch (const std::exception& error) {
    server.Refuse(error.what());
    return false;
  }
}

std::vector<CodeAction> LanguageServer::TextDocument_CodeAction(CodeActionParams* params) {
  if (!params || !params->context.diagnostics.empty()) return Ask<CodeActionList>("textDocument/codeAction", params).items;
  WithDiagnostics withDiagnostics(*params, server.Diagnostics().Of(params->textDocument.uri));
  return Ask<CodeActionList>("textDocument/codeAction", &withDiagnostics).items;
}

std::string LanguageServer::Workspace_ExecuteCommand(ExecuteCommandParams* params) {
  if (params && !Writable(*params)) return "";
  return RequestJson("workspace/executeCommand", params);
}

std::vector<DocumentHighlight> LanguageServer::TextDocument_DocumentHighlight(TextDocumentPositionParams* params) {
  return Ask<DocumentHighlightList>("textDocument/documentHighlight", params).items;
}

std::vector<FoldingRange> LanguageServer::TextDocument_FoldingRange(FoldingRangeParams* params) {
  return Ask<FoldingRangeList>("textDocument/foldingRange", params).items;
}

std::vector<SelectionRange> LanguageServer::TextDocument_SelectionRange(SelectionRangeParams* params) {
  return Ask<SelectionRangeList>("textDocument/selectionRange", params).items;
}

SemanticTokens LanguageServer::TextDocument_SemanticTokensFull(SemanticTokensParams* params) {
  return Ask<SemanticTokens>("textDocument/semanticTokens/full", params);
}

std::vector<InlayHint> LanguageServer::TextDocument_InlayHint(InlayHintParams* params) {
  return Ask<InlayHintList>("textDocument/inlayHint", params).items;
}

CompletionItem LanguageServer::CompletionItem_Resolve(CompletionItem* item) {
  if (!item) return {};
  CompletionItemResolveParams params(*item);
  return Ask<ResolvedCompletionItem>("completionItem/resolve", &params).item;
}

PrepareRenameResult LanguageServer::TextDocument_PrepareRename(TextDocumentPositionParams* params) {
  return Ask<PrepareRenameResult>("textDocument/prepareRename", params);
}

std::vector<CallHierarchyItem> LanguageServer::TextDocument_PrepareCallHierarchy(TextDocumentPositionParams* params) {
  return Ask<CallHierarchyItemList>("textDocument/prepareCallHierarchy", params).items;
}

std::vector<CallHierarchyIncomingCall> LanguageServer::CallHierarchy_IncomingCalls(CallHierarchyItem* item) {
  if (!item) return {};
  CallHierarchyCallsParams params(*item);
  return Ask<CallHierarchyIncomingCallList>("callHierarchy/incomingCalls", &params).items;
}

std::vector<CallHierarchyOutgoingCall> LanguageServer::CallHierarchy_OutgoingCalls(CallHierarchyItem* item) {
  if (!item) return {};
  CallHierarchyCallsParams params(*item);
  return Ask<CallHierarchyOutgoingCallList>("callHierarchy/outgoingCalls", &params).items;
}

void LanguageServer::Workspace_DidChangeConfiguration(DidChangeConfigurationParams* params) {
  if (!params || Writable(*params)) Send("workspace/didChangeConfiguration", params);
}

void LanguageServer::Workspace_DidChangeWorkspaceFolders(DidChangeWorkspaceFoldersParams* params) {
  Send("workspace/didChangeWorkspaceFolders", params);
}

void LanguageServer::TextDocument_WillSave(WillSaveTextDocumentParams* params) {
  Send("textDocument/willSave", params);
}

}  // namespace LSP
