// What `vexil lsp` can be asked to do, one action per document notification or feature
// request, and what each action got back from the server.
//
// Conventions every action keeps (new ones join the table in actions.cpp):
// - an action is one option, "--NAME OPERAND" or "--NAME=OPERAND", performed in order after
//   the server's command; FILE operands are resolved against --root, must exist and hold
//   UTF-8 text, and are opened (didOpen) before their first action;
// - lines and columns count from 1, columns in bytes as compilers print them, both ways;
// - readable output starts with the action as Describe() names it, then its answer indented,
//   "(none)" for an empty one; --json writes one object per line (see render.h);
// - a failure is one reason in Outcome::why: printed, and the exit status becomes 1; a
//   method the server does not offer reads "SERVER does not support METHOD";
// - edits are shown as a diff and written only with --apply, all files or none.
#pragma once

#include <string>
#include <vector>

#include "apply.h"
#include "session.h"
#include "vexil/protocol/call_hierarchy.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/semantic_tokens.h"

namespace cli {

enum class ActionKind {
  Open, Hover, Definition, Declaration, TypeDefinition, Implementation, References, Completion,
  Signature, Symbols, WorkspaceSymbols, Format, RangeFormat, Rename, Change, Save, Close, Diagnostics,
  Capabilities, Request, Notify, CodeActions, Highlight, Folding, SelectionRange, SemanticTokens, InlayHints,
  PrepareRename, CallHierarchy, Execute
};

// How an action's operand is written on the command line. A request takes two operands:
// the method and its params as JSON text; a command to execute, its name and arguments.
enum class Operand { File, Position, Range, Rename, Query, None, MethodParams, PositionOrRange, CommandArguments };

struct ActionInfo {
  ActionKind kind;
  const char* option;  // "--hover"
  Operand operand;
  const char* method;  // the protocol method it sends
  bool query;          // whether it prints an answer
  const char* help;    // one line for --help
};

struct Action {
  ActionKind kind = ActionKind::Open;
  std::string file;  // as given
  std::string path;  // absolute, resolved against the root
  int line = 0;
  int column = 0;
  int endLine = 0;
  int endColumn = 0;
  std::string text;  // the workspace-symbol query, the new name, or a request's method
  std::string params;  // a request's params as JSON text
};

// A function of a call hierarchy, its callers and what it calls; a server may offer only
// one of the two.
struct CallTree {
  LSP::CallHierarchyItem item;
  std::vector<LSP::CallHierarchyIncomingCall> incoming;
  std::vector<LSP::CallHierarchyOutgoingCall> outgoing;
  bool incomingOffered = true;
  bool outgoingOffered = true;
};

struct Outcome {
  std::vector<LSP::Location> locations;
  LSP::Hover hover;
  LSP::CompletionList completion;
  LSP::SignatureHelp signature;
  std::vector<LSP::SymbolInformation> symbols;
  std::vector<FileEdits> edits;
  std::vector<LSP::Diagnostic> diagnostics;
  LSP::ServerCapabilities capabilities;
  std::vector<LSP::CodeAction> codeActions;
  int chosen = -1;  // the code action applied, from 0
  std::vector<LSP::DocumentHighlight> highlights;
  std::vector<LSP::FoldingRange> folds;
  std::vector<LSP::SelectionRange> selections;
  std::vector<LSP::SemanticToken> tokens;
  std::vector<LSP::InlayHint> hints;
  LSP::PrepareRenameResult prepared;
  std::vector<CallTree> calls;
  std::string json;  // the capabilities, a request's or a command's result, as JSON text
  std::vector<FileEdits> requested;  // edits the server asked for meanwhile ("workspace/applyEdit")
  bool applied = false;  // whether the edits, or those asked for, were written to the files
  bool failed = false;
  std::string why;  // when failed
};

const std::vector<ActionInfo>& Actions();
const ActionInfo& InfoOf(ActionKind kind);
// The action `option` asks for (without any "=OPERAND"), or null.
const ActionInfo* ActionOfOption(const std::string& option);
// The method an action sends: its own, or the one a request names.
std::string MethodOf(const Action& action);
// The operand as the help text writes it: "FILE:LINE:COL".
const char* OperandForm(Operand operand);
// The action as a person would name it: "hover main.cpp:15:18".
std::string Describe(const Action& action);
// Whether --apply writes the edits the action proposes.
bool Writes(ActionKind kind);
// Whether the action is one of the newer requests (code actions and after), asked and
// printed apart from the classic ones.
bool IsNewer(ActionKind kind);

// Performs the action. When the session applies edits, those it proposes are written to
// the files (see apply.h); once its answer has been shown, AfterWriting tells the server.
Outcome Perform(Session& session, const Action& action);

}  // namespace cli
