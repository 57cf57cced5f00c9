// Performing one action: its params built with zero-based positions, one call of the
// connection, and the reply kept with the failure state the library reports.
#include "actions.h"

#include <chrono>
#include <thread>

#include "vexil/client/uri.h"

namespace cli {
namespace {

struct ActionName {
  ActionKind kind;
  const char* option;
  bool query;
};

constexpr ActionName kActionNames[] = {
    {ActionKind::Open, "--open", false},
    {ActionKind::Hover, "--hover", true},
    {ActionKind::Definition, "--definition", true},
    {ActionKind::Declaration, "--declaration", true},
    {ActionKind::TypeDefinition, "--type-definition", true},
    {ActionKind::Implementation, "--implementation", true},
    {ActionKind::References, "--references", true},
    {ActionKind::Completion, "--completion", true},
    {ActionKind::Signature, "--signature", true},
    {ActionKind::Symbols, "--symbols", true},
    {ActionKind::WorkspaceSymbols, "--workspace-symbols", true},
    {ActionKind::Format, "--format", true},
    {ActionKind::RangeFormat, "--range-format", true},
    {ActionKind::Rename, "--rename", true},
    {ActionKind::Change, "--change", false},
    {ActionKind::Save, "--save", false},
    {ActionKind::Close, "--close", false},
    {ActionKind::Diagnostics, "--diagnostics", true},
};

const ActionName& NameOf(ActionKind kind) {
  for (const ActionName& name : kActionNames) {
    if (name.kind == kind) return name;
  }
  return kActionNames[0];
}

LSP::Position ZeroBased(int line, int column) { return LSP::Position(line - 1, column - 1); }

template <typename P>
P Positioned(Session& session, const Action& action) {
  P params;
  params.textDocument.uri = session.Document(action.file);
  params.position = ZeroBased(action.line, action.column);
  return params;
}

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

std::vector<FileEdits> Edits(const LSP::WorkspaceEdit& edit) {
  std::vector<FileEdits> files;
  for (const LSP::TextDocumentEdit& document : edit.documentChanges) {
    files.push_back({UriToFile(document.textDocument.uri.c_str()), document.edits});
  }
  return files;
}

std::vector<FileEdits> Formatting(Session& session, const Action& action) {
  std::string uri = session.Document(action.file);
  std::vector<LSP::TextEdit> edits;
  if (action.kind == ActionKind::Format) {
    LSP::DocumentFormattingParams params;
    params.textDocument.uri = uri;
    edits = session.Server().TextDocument_Formatting(&params);
  } else {
    LSP::DocumentRangeFormattingParams params;
    params.textDocument.uri = uri;
    params.range = LSP::Range(ZeroBased(action.line, action.column), ZeroBased(action.endLine, action.endColumn));
    edits = session.Server().TextDocument_RangeFormatting(&params);
  }
  return {{AbsolutePath(action.file), edits}};
}

// A server that announced a provider answers the pull, which stores its report; any other
// publishes by itself after didOpen, so the store is watched until the time-out.
std::vector<LSP::Diagnostic> Diagnostics(Session& session, const Action& action) {
  xLanguageServer& server = session.Server();
  int before = server.DiagnosticsVersion();
  LSP::TextDocumentIdentifier document;
  document.uri = session.Document(action.file);
  server.TextDocument_PullDiagnostics(&document);
  auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(session.Timeout());
  while (server.DiagnosticsVersion() == before && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return server.TextDocument_Diagnostics(document.uri.c_str());
}

void Ask(Session& session, const Action& action, Outcome& outcome) {
  xLanguageServer& server = session.Server();
  switch (action.kind) {
    case ActionKind::Open: session.Document(action.file); break;
    case ActionKind::Change: session.Change(action.file); break;
    case ActionKind::Save: session.Save(action.file); break;
    case ActionKind::Close: session.Close(action.file); break;
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
      params.textDocument.uri = session.Document(action.file);
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
    case ActionKind::Diagnostics: outcome.diagnostics = Diagnostics(session, action); break;
    case ActionKind::Rename: {
      auto params = Positioned<LSP::RenameParams>(session, action);
      params.newName = action.text;
      outcome.edits = Edits(server.TextDocument_Rename(&params));
      break;
    }
    default: outcome.locations = Locations(session, action); break;
  }
}

}  // namespace

const char* OptionName(ActionKind kind) { return NameOf(kind).option; }

bool ActionOfOption(const std::string& option, ActionKind& kind) {
  for (const ActionName& name : kActionNames) {
    if (option == name.option) {
      kind = name.kind;
      return true;
    }
  }
  return false;
}

bool IsQuery(ActionKind kind) { return NameOf(kind).query; }

std::string Describe(const Action& action) {
  std::string name = std::string(OptionName(action.kind)).substr(2);
  if (action.kind == ActionKind::WorkspaceSymbols) return name + " " + action.text;
  std::string where = action.file;
  if (action.line > 0) where += ":" + std::to_string(action.line) + ":" + std::to_string(action.column);
  if (action.endLine > 0) where += ":" + std::to_string(action.endLine) + ":" + std::to_string(action.endColumn);
  if (action.kind == ActionKind::Rename) where += " -> " + action.text;
  return name + " " + where;
}

Outcome Perform(Session& session, const Action& action) {
  Outcome outcome;
  session.Mark();
  Ask(session, action, outcome);
  outcome.failed = session.Failed(outcome.why);
  return outcome;
}

}  // namespace cli
