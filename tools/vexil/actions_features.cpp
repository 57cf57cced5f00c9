// The actions beyond the classic requests: code actions (one of them applied with --apply),
// highlights, folding, selection ranges, semantic tokens, inlay hints, rename preparation,
// call hierarchies and server commands.
#include "actions_features.h"

#include <algorithm>

#include "vexil/client/text_edits.h"

namespace cli {
namespace {

// The operand's range; a position alone is an empty range there.
LSP::Range RangeOf(const Action& action) {
  const std::string& text = TextOf(action.path);
  LSP::Position start = ProtocolPosition(text, action.line, action.column);
  return LSP::Range(start, action.endLine > 0 ? ProtocolPosition(text, action.endLine, action.endColumn) : start);
}

// Quick fixes are for the server's diagnostics, which the connection adds to the request:
// so they are waited for first, as for --diagnostics.
void CodeActions(Session& session, const Action& action, Outcome& outcome) {
  LSP::CodeActionParams params;
  params.textDocument.uri = session.Document(action.path);
  params.range = RangeOf(action);
  session.Diagnostics(action.path);
  session.Mark();
  outcome.codeActions = session.Server().TextDocument_CodeAction(&params);
}

// After one request of several: whether the server answered it. A method it does not offer
// leaves that part out; any other failure fails the action.
bool Answered(Session& session, const std::string& method, Outcome& outcome) {
  if (session.Unsupported()) return false;
  outcome.failed = session.Failed(method, outcome.why);
  return !outcome.failed;
}

void CallHierarchy(Session& session, const Action& action, Outcome& outcome) {
  xLanguageServer& server = session.Server();
  auto prepare = Positioned<LSP::TextDocumentPositionParams>(session, action);
  std::vector<LSP::CallHierarchyItem> items = server.TextDocument_PrepareCallHierarchy(&prepare);
  if ((outcome.failed = session.Failed("textDocument/prepareCallHierarchy", outcome.why))) return;
  for (LSP::CallHierarchyItem& item : items) {
    CallTree tree;
    tree.item = item;
    session.Mark();
    tree.incoming = server.CallHierarchy_IncomingCalls(&item);
    tree.incomingOffered = Answered(session, "callHierarchy/incomingCalls", outcome);
    if (outcome.failed) return;
    session.Mark();
    tree.outgoing = server.CallHierarchy_OutgoingCalls(&item);
    tree.outgoingOffered = Answered(session, "callHierarchy/outgoingCalls", outcome);
    if (outcome.failed) return;
    outcome.calls.push_back(tree);
  }
}

// Whether code action `index` (from 0) is the one `choice` names: its number from 1 when
// the choice is a number, else words of its title.
bool Named(const std::vector<LSP::CodeAction>& actions, std::size_t index, const std::string& choice) {
  if (choice.find_first_not_of("0123456789") == std::string::npos) return choice == std::to_string(index + 1);
  return actions[index].title.find(choice) != std::string::npos;
}

// The code action --apply takes: the one CHOICE names, else the preferred one, else the only
// one; -1 with the reason when there is none to take.
int Chosen(const std::vector<LSP::CodeAction>& actions, const std::string& choice, std::string& why) {
  for (std::size_t i = 0; i < actions.size(); ++i) {
    if (choice.empty() ? actions[i].isPreferred : Named(actions, i, choice)) return static_cast<int>(i);
  }
  if (choice.empty() && actions.size() == 1) return 0;
  std::string offered;
  for (std::size_t i = 0; i < actions.size(); ++i) offered += (i ? "; " : "") + std::to_string(i + 1) + ". " + actions[i].title;
  if (actions.empty()) why = "no code action is offered there";
  else if (choice.empty()) why = "none of the code actions is preferred; choose one with --apply=N: " + offered;
  else why = "no code action matches '" + choice + "': " + offered;
  return -1;
}

}  // namespace

void AskFeature(Session& session, const Action& action, Outcome& outcome) {
  xLanguageServer& server = session.Server();
  switch (action.kind) {
    case ActionKind::CodeActions: CodeActions(session, action, outcome); break;
    case ActionKind::Highlight: {
      auto params = Positioned<LSP::TextDocumentPositionParams>(session, action);
      outcome.highlights = server.TextDocument_DocumentHighlight(&params);
      break;
    }
    case ActionKind::Folding: {
      LSP::FoldingRangeParams params;
      params.textDocument.uri = session.Document(action.path);
      outcome.folds = server.TextDocument_FoldingRange(&params);
      break;
    }
    case ActionKind::SelectionRange: {
      LSP::SelectionRangeParams params;
      params.textDocument.uri = session.Document(action.path);
      params.positions.push_back(ProtocolPosition(TextOf(action.path), action.line, action.column));
      outcome.selections = server.TextDocument_SelectionRange(&params);
      break;
    }
    case ActionKind::SemanticTokens: {
      LSP::SemanticTokensParams params;
      params.textDocument.uri = session.Document(action.path);
      LSP::SemanticTokens tokens = server.TextDocument_SemanticTokensFull(&params);
      outcome.tokens = tokens.Decode(server.ServerCapabilities().semanticTokensProvider.legend);
      break;
    }
    case ActionKind::InlayHints: {
      LSP::InlayHintParams params;
      params.textDocument.uri = session.Document(action.path);
      const std::string& text = TextOf(action.path);
      params.range = LSP::Range(LSP::Position(0, 0), LSP::OffsetToPosition(text, text.size()));
      outcome.hints = server.TextDocument_InlayHint(&params);
      break;
    }
    case ActionKind::PrepareRename: {
      auto params = Positioned<LSP::TextDocumentPositionParams>(session, action);
      outcome.prepared = server.TextDocument_PrepareRename(&params);
      break;
    }
    case ActionKind::CallHierarchy: CallHierarchy(session, action, outcome); break;
    default: {
      LSP::ExecuteCommandParams params;
      params.command = action.text;
      params.arguments = action.params == "null" ? "" : action.params;
      outcome.json = server.Workspace_ExecuteCommand(&params);
      break;
    }
  }
}

void ApplyCodeAction(Session& session, Outcome& outcome) {
  outcome.chosen = Chosen(outcome.codeActions, session.Choice(), outcome.why);
  if (outcome.chosen < 0) {
    outcome.failed = true;
    return;
  }
  LSP::CodeAction& chosen = outcome.codeActions[static_cast<std::size_t>(outcome.chosen)];
  // As the protocol orders them: the edit first, then the command.
  outcome.edits = FilesOf(chosen.edit);
  if (!WriteEdits(outcome.edits, outcome.why)) {
    outcome.failed = true;
    return;
  }
  outcome.applied = HasEdits(outcome.edits);
  if (!chosen.HasCommand()) return;
  session.Mark();
  LSP::ExecuteCommandParams params(chosen.command);
  outcome.json = session.Server().Workspace_ExecuteCommand(&params);
  outcome.failed = session.Failed("workspace/executeCommand", outcome.why);
}

}  // namespace cli
