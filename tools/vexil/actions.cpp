// Performing one action: its params built with zero-based positions in UTF-16 units, one
// call of the connection, and the reply kept with the failure state the library reports.
#include "actions.h"

#include "actions_features.h"
#include "columns.h"
#include "vexil/client/uri.h"

namespace cli {
namespace {

const std::vector<ActionInfo> kActions = {
    {ActionKind::Open, "--open", Operand::File, "textDocument/didOpen", false, "open the file (didOpen)"},
    {ActionKind::Hover, "--hover", Operand::Position, "textDocument/hover", true, "the hover text"},
    {ActionKind::Definition, "--definition", Operand::Position, "textDocument/definition", true,
     "where the symbol is defined"},
    {ActionKind::Declaration, "--declaration", Operand::Position, "textDocument/declaration", true,
     "where it is declared"},
    {ActionKind::TypeDefinition, "--type-definition", Operand::Position, "textDocument/typeDefinition", true,
     "where its type is defined"},
    {ActionKind::Implementation, "--implementation", Operand::Position, "textDocument/implementation", true,
     "its implementations"},
    {ActionKind::References, "--references", Operand::Position, "textDocument/references", true,
     "its uses, declaration included"},
    {ActionKind::Completion, "--completion", Operand::Position, "textDocument/completion", true,
     "completions, one a line"},
    {ActionKind::Signature, "--signature", Operand::Position, "textDocument/signatureHelp", true,
     "the signatures of the call"},
    {ActionKind::Symbols, "--symbols", Operand::File, "textDocument/documentSymbol", true, "the file's symbols"},
    {ActionKind::WorkspaceSymbols, "--workspace-symbols", Operand::Query, "workspace/symbol", true,
     "symbols of the workspace matching QUERY"},
    {ActionKind::Format, "--format", Operand::File, "textDocument/formatting", true, "formatting, as a diff"},
    {ActionKind::RangeFormat, "--range-format", Operand::Range, "textDocument/rangeFormatting", true,
     "formatting of the range, as a diff"},
    {ActionKind::Rename, "--rename", Operand::Rename, "textDocument/rename", true,
     "the edits of a rename, as a diff"},
    {ActionKind::Change, "--change", Operand::File, "textDocument/didChange", false, "send the file's current text"},
    {ActionKind::Save, "--save", Operand::File, "textDocument/didSave", false, "tell the server it was saved"},
    {ActionKind::Close, "--close", Operand::File, "textDocument/didClose", false, "close it"},
    {ActionKind::Diagnostics, "--diagnostics", Operand::File, "textDocument/diagnostic", true,
     "its errors and warnings: path:line:col: severity: message [source code]"},
    {ActionKind::Capabilities, "--capabilities", Operand::None, "initialize", true,
     "what the server announced it supports"},
    {ActionKind::Request, "--request", Operand::MethodParams, "", true,
     "any request; PARAMS a JSON object, the result printed as JSON"},
    {ActionKind::Notify, "--notify", Operand::MethodParams, "", false, "any notification"},
    {ActionKind::CodeActions, "--code-actions", Operand::PositionOrRange, "textDocument/codeAction", true,
     "quick fixes and refactorings there, each with its diff"},
    {ActionKind::Highlight, "--highlight", Operand::Position, "textDocument/documentHighlight", true,
     "the symbol's uses in the file, read or written"},
    {ActionKind::Folding, "--folding", Operand::File, "textDocument/foldingRange", true, "the lines that fold"},
    {ActionKind::SelectionRange, "--selection-range", Operand::Position, "textDocument/selectionRange", true,
     "the ranges a selection grows through, innermost first"},
    {ActionKind::SemanticTokens, "--semantic-tokens", Operand::File, "textDocument/semanticTokens/full", true,
     "every token with its type and modifiers"},
    {ActionKind::InlayHints, "--inlay-hints", Operand::File, "textDocument/inlayHint", true,
     "the hints shown inside the text (types, parameter names)"},
    {ActionKind::PrepareRename, "--prepare-rename", Operand::Position, "textDocument/prepareRename", true,
     "whether a rename is possible there, and of what"},
    {ActionKind::CallHierarchy, "--call-hierarchy", Operand::Position, "textDocument/prepareCallHierarchy", true,
     "the function there, its callers and what it calls"},
    {ActionKind::Execute, "--execute", Operand::CommandArguments, "workspace/executeCommand", true,
     "run a server command; ARGUMENTS a JSON array or null"},
};

std::vector<LSP::Location> Locations(Session& session, const Action& action) {
  auto params = Positioned<LSP::TextDocumentPositionParams>(session, action);
  xLanguageServer& server = session.Server();
  switch (action.kind) {
    case ActionKind::Definition: return server.TextDocument_Definition(&params);
    case ActionKind::Declaration: return server.TextDocument_Declaration(&params);
    case ActionKind::TypeDefinition: return server.TextDocument_TypeDefinition(&params);
    case ActionKind::Implementation: return server.TextDocument_Implementation(&params);
    default: return server.TextDocument_References(&params);
  }
}

std::vector<FileEdits> Formatting(Session& session, const Action& action) {
  std::string uri = session.Document(action.path);
  std::vector<LSP::TextEdit> edits;
  if (action.kind == ActionKind::Format) {
    LSP::DocumentFormattingParams params;
    params.textDocument.uri = uri;
    edits = session.Server().TextDocument_Formatting(&params);
  } else {
    LSP::DocumentRangeFormattingParams params;
    params.textDocument.uri = uri;
    params.range = LSP::Range(ProtocolPosition(TextOf(action.path), action.line, action.column),
                              ProtocolPosition(TextOf(action.path), action.endLine, action.endColumn));
    edits = session.Server().TextDocument_RangeFormatting(&params);
  }
  return {{action.path, edits}};
}

void Ask(Session& session, const Action& action, Outcome& outcome) {
  if (IsNewer(action.kind)) return AskFeature(session, action, outcome);
  xLanguageServer& server = session.Server();
  switch (action.kind) {
    case ActionKind::Open: session.Document(action.path); break;
    case ActionKind::Change: session.Change(action.path); break;
    case ActionKind::Save: session.Save(action.path); break;
    case ActionKind::Close: session.Close(action.path); break;
    case ActionKind::Hover: {
      auto params = Positioned<LSP::TextDocumentPositionParams>(session, action);
      outcome.hover = server.TextDocument_Hover(&params);
      break;
    }
    case ActionKind::Completion: {
      auto params = Positioned<LSP::CompletionParams>(session, action);
      outcome.completion = server.TextDocument_Completion(&params);
      break;
    }
    case ActionKind::Signature: {
      auto params = Positioned<LSP::TextDocumentPositionParams>(session, action);
      outcome.signature = server.TextDocument_Signature(&params);
      break;
    }
    case ActionKind::Symbols: {
      LSP::DocumentSymbolParams params;
      params.textDocument.uri = session.Document(action.path);
      outcome.symbols = server.TextDocument_DocumentSymbol(&params);
      break;
    }
    case ActionKind::WorkspaceSymbols: {
      LSP::WorkspaceSymbolParams params;
      params.query = action.text;
      outcome.symbols = server.TextDocument_WorkspaceSymbol(&params);
      break;
    }
    case ActionKind::Format:
    case ActionKind::RangeFormat: outcome.edits = Formatting(session, action); break;
    case ActionKind::Diagnostics: outcome.diagnostics = session.Diagnostics(action.path); break;
    case ActionKind::Capabilities:
      outcome.capabilities = server.ServerCapabilities();
      outcome.json = server.ServerCapabilitiesJson();
      break;
    case ActionKind::Request: outcome.json = server.Request(action.text.c_str(), action.params.c_str()); break;
    case ActionKind::Notify: server.Notify(action.text.c_str(), action.params.c_str()); break;
    case ActionKind::Rename: {
      auto params = Positioned<LSP::RenameParams>(session, action);
      params.newName = action.text;
      outcome.edits = FilesOf(server.TextDocument_Rename(&params));
      break;
    }
    default: outcome.locations = Locations(session, action); break;
  }
}

}  // namespace

const std::vector<ActionInfo>& Actions() { return kActions; }

const ActionInfo& InfoOf(ActionKind kind) {
  for (const ActionInfo& info : kActions)
    if (info.kind == kind) return info;
  return kActions.front();
}

const ActionInfo* ActionOfOption(const std::string& option) {
  for (const ActionInfo& info : kActions)
    if (option == info.option) return &info;
  return nullptr;
}

const char* OperandForm(Operand operand) {
  switch (operand) {
    case Operand::File: return "FILE";
    case Operand::Position: return "FILE:LINE:COL";
    case Operand::Range: return "FILE:L1:C1:L2:C2";
    case Operand::Rename: return "FILE:LINE:COL:NEWNAME";
    case Operand::None: return "";
    case Operand::MethodParams: return "METHOD PARAMS";
    case Operand::PositionOrRange: return "FILE:LINE:COL[:L2:C2]";
    case Operand::CommandArguments: return "COMMAND ARGUMENTS";
    default: return "QUERY";
  }
}

std::string Describe(const Action& action) {
  std::string name = std::string(InfoOf(action.kind).option).substr(2);
  if (action.kind == ActionKind::WorkspaceSymbols || action.kind == ActionKind::Request ||
      action.kind == ActionKind::Notify || action.kind == ActionKind::Execute) {
    return name + " " + action.text;
  }
  if (action.kind == ActionKind::Capabilities) return name;
  std::string where = action.file;
  if (action.line > 0) where += ":" + std::to_string(action.line) + ":" + std::to_string(action.column);
  if (action.endLine > 0) where += ":" + std::to_string(action.endLine) + ":" + std::to_string(action.endColumn);
  if (action.kind == ActionKind::Rename) where += " -> " + action.text;
  return name + " " + where;
}

std::string MethodOf(const Action& action) {
  return action.kind == ActionKind::Request || action.kind == ActionKind::Notify ? action.text
                                                                                : InfoOf(action.kind).method;
}

bool Writes(ActionKind kind) {
  return kind == ActionKind::Format || kind == ActionKind::RangeFormat || kind == ActionKind::Rename ||
         kind == ActionKind::CodeActions;
}

bool IsNewer(ActionKind kind) { return kind >= ActionKind::CodeActions; }

Outcome Perform(Session& session, const Action& action) {
  Outcome outcome;
  session.Mark();
  Ask(session, action, outcome);
  // An action of several requests judges each of them itself.
  if (action.kind != ActionKind::CallHierarchy) outcome.failed = session.Failed(MethodOf(action), outcome.why);
  if (!outcome.failed && session.Applies() && action.kind == ActionKind::CodeActions) {
    ApplyCodeAction(session, outcome);
  } else if (!outcome.failed && session.Applies() && Writes(action.kind)) {
    outcome.failed = !WriteEdits(outcome.edits, outcome.why);
    outcome.applied = !outcome.failed && HasEdits(outcome.edits);
  }
  bool written = false;
  std::string failure;
  outcome.requested = TakeRequestedEdits(written, failure);
  outcome.applied = outcome.applied || written;
  if (!failure.empty() && !outcome.failed) {
    outcome.failed = true;
    outcome.why = "the server asked for edits: " + failure;
  }
  return outcome;
}

}  // namespace cli
