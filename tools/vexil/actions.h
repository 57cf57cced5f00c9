// What `vexil lsp` can be asked to do, one action per document notification or feature
// request, and what each action got back from the server.
#pragma once

#include <string>
#include <vector>

#include "session.h"

namespace cli {

enum class ActionKind {
  Open, Hover, Definition, Declaration, TypeDefinition, Implementation, References, Completion,
  Signature, Symbols, WorkspaceSymbols, Format, RangeFormat, Rename, Change, Save, Close, Diagnostics
};

// Lines and columns count from 1, as people do.
struct Action {
  ActionKind kind = ActionKind::Open;
  std::string file;
  int line = 0;
  int column = 0;
  int endLine = 0;
  int endColumn = 0;
  std::string text;  // the workspace-symbol query or the new name
};

// The edits the server proposes for one file.
struct FileEdits {
  std::string path;
  std::vector<LSP::TextEdit> edits;
};

struct Outcome {
  std::vector<LSP::Location> locations;
  LSP::Hover hover;
  LSP::CompletionList completion;
  LSP::SignatureHelp signature;
  std::vector<LSP::SymbolInformation> symbols;
  std::vector<FileEdits> edits;
  std::vector<LSP::Diagnostic> diagnostics;
  bool failed = false;
  std::string why;  // when failed
};

// The option that asks for `kind`, e.g. "--hover".
const char* OptionName(ActionKind kind);
// The kind `option` asks for; false when it names no action.
bool ActionOfOption(const std::string& option, ActionKind& kind);
// Whether the action sends a request whose answer is printed.
bool IsQuery(ActionKind kind);
// The action as a person would name it: "hover main.cpp:15:18".
std::string Describe(const Action& action);

Outcome Perform(Session& session, const Action& action);

}  // namespace cli
