// The readable forms of the newer answers: code actions with their diffs, highlights,
// folds, selection ranges, tokens and hints with their place, rename preparation and call
// hierarchies. Places are "line:col", columns in bytes, as everywhere in the output.
#include <algorithm>
#include <climits>

#include "columns.h"
#include "render.h"
#include "render_features.h"
#include "vexil/client/text_edits.h"
#include "vexil/client/uri.h"

namespace cli {
namespace {

std::string Place(const std::string& path, const LSP::Position& position) {
  return std::to_string(position.line + 1) + ":" + std::to_string(ByteColumn(TextOf(path), position));
}

std::string Stretch(const std::string& path, const LSP::Range& range) {
  return Place(path, range.start) + "-" + Place(path, range.end);
}

// "text" of a range, "text ..." when it runs on beyond its first line.
std::string Excerpt(const std::string& path, const LSP::Range& range) {
  bool more = false;
  std::string text = FirstLineOf(path, range, more);
  return more ? text + " ..." : text;
}

void PrintCodeActions(std::ostream& out, const Outcome& outcome) {
  if (outcome.codeActions.empty()) out << "  (none)\n";
  for (std::size_t i = 0; i < outcome.codeActions.size(); ++i) {
    const LSP::CodeAction& action = outcome.codeActions[i];
    std::string tags = action.kind;
    if (action.isPreferred) tags += tags.empty() ? "preferred" : ", preferred";
    out << (static_cast<int>(i) == outcome.chosen ? "* " : "  ") << i + 1 << ". " << action.title
        << (tags.empty() ? "" : " [" + tags + "]") << (action.HasCommand() ? " (runs " + action.command.command + ")" : "")
        << "\n";
    if (action.HasEdit()) PrintEdits(out, FilesOf(action.edit));
  }
}

void PrintHighlights(std::ostream& out, const std::string& path, const Outcome& outcome) {
  if (outcome.highlights.empty()) out << "  (none)\n";
  for (const LSP::DocumentHighlight& highlight : outcome.highlights) {
    LSP::Location location;
    location.uri = FileToUri(path.c_str());
    location.range = highlight.range;
    out << "  " << Where(location) << ": " << HighlightKindName(highlight.kind) << ": "
        << SourceLine(path, highlight.range.start.line) << "\n";
  }
}

void PrintFolds(std::ostream& out, const std::string& path, const Outcome& outcome) {
  if (outcome.folds.empty()) out << "  (none)\n";
  for (const LSP::FoldingRange& fold : outcome.folds) {
    out << "  " << fold.startLine + 1 << "-" << fold.endLine + 1 << (fold.kind.empty() ? "" : " " + fold.kind) << ": "
        << SourceLine(path, fold.startLine) << "\n";
  }
}

void PrintSelections(std::ostream& out, const std::string& path, const Outcome& outcome) {
  if (outcome.selections.empty()) out << "  (none)\n";
  for (const LSP::Range& range : SelectedRanges(outcome)) {
    out << "  " << Stretch(path, range) << ": " << Excerpt(path, range) << "\n";
  }
}

void PrintTokens(std::ostream& out, const std::string& path, const Outcome& outcome) {
  if (outcome.tokens.empty()) out << "  (none)\n";
  for (const LSP::SemanticToken& token : outcome.tokens) {
    LSP::Range range = TokenRange(token);
    std::string modifiers;
    for (const std::string& modifier : token.modifiers) modifiers += (modifiers.empty() ? "" : ", ") + modifier;
    out << "  " << Place(path, range.start) << " " << (token.type.empty() ? "token" : token.type)
        << (modifiers.empty() ? "" : " [" + modifiers + "]") << ": " << Excerpt(path, range) << "\n";
  }
}

void PrintHints(std::ostream& out, const std::string& path, const Outcome& outcome) {
  if (outcome.hints.empty()) out << "  (none)\n";
  for (const LSP::InlayHint& hint : outcome.hints) {
    out << "  " << Place(path, hint.position) << " " << HintKindName(hint.kind) << ": " << hint.label << "\n";
  }
}

void PrintPrepared(std::ostream& out, const std::string& path, const LSP::PrepareRenameResult& prepared) {
  if (prepared.defaultBehavior) out << "  (the word there)\n";
  else if (!prepared.CanRename()) out << "  (none)\n";
  else out << "  " << Stretch(path, prepared.range) << ": "
           << (prepared.placeholder.empty() ? Excerpt(path, prepared.range) : prepared.placeholder) << "\n";
}

// "function main  main.cpp:15:18": a function of a hierarchy and a place that belongs to it.
std::string Function(const LSP::CallHierarchyItem& item, const std::string& uri, const LSP::Range& range) {
  LSP::Location location;
  location.uri = uri;
  location.range = range;
  return std::string(SymbolKindName(item.kind)) + " " + item.name + "  " + Where(location);
}

void PrintCalls(std::ostream& out, const Outcome& outcome) {
  if (outcome.calls.empty()) out << "  (none)\n";
  for (const CallTree& tree : outcome.calls) {
    out << "  " << Function(tree.item, tree.item.uri, tree.item.selectionRange) << "\n    called from:\n";
    if (!tree.incomingOffered) out << "      (not offered by the server)\n";
    else if (tree.incoming.empty()) out << "      (none)\n";
    // Each caller where it makes its first call.
    for (const LSP::CallHierarchyIncomingCall& call : tree.incoming) {
      out << "      " << Function(call.from, call.from.uri, call.fromRanges.empty() ? call.from.selectionRange : call.fromRanges[0])
          << (call.fromRanges.size() > 1 ? "  (" + std::to_string(call.fromRanges.size()) + " calls)" : "") << "\n";
    }
    out << "    calls:\n";
    if (!tree.outgoingOffered) out << "      (not offered by the server)\n";
    else if (tree.outgoing.empty()) out << "      (none)\n";
    for (const LSP::CallHierarchyOutgoingCall& call : tree.outgoing) {
      out << "      " << Function(call.to, call.to.uri, call.to.selectionRange) << "\n";
    }
  }
}

}  // namespace

std::string FirstLineOf(const std::string& path, const LSP::Range& range, bool& more) {
  const std::string& text = TextOf(path);
  std::size_t start = LSP::PositionToOffset(text, range.start);
  std::size_t end = std::max(start, LSP::PositionToOffset(text, range.end));
  std::size_t lineEnd = LSP::PositionToOffset(text, LSP::Position(range.start.line, INT_MAX));
  more = end > lineEnd;
  return text.substr(start, std::min(end, lineEnd) - start);
}

std::vector<LSP::Range> SelectedRanges(const Outcome& outcome) {
  std::vector<LSP::Range> ranges;
  for (const LSP::SelectionRange& selection : outcome.selections) {
    ranges.push_back(selection.range);
    ranges.insert(ranges.end(), selection.parents.begin(), selection.parents.end());
  }
  return ranges;
}

LSP::Range TokenRange(const LSP::SemanticToken& token) {
  return LSP::Range(LSP::Position(token.line, token.character), LSP::Position(token.line, token.character + token.length));
}

const char* HighlightKindName(int kind) { return kind == 2 ? "read" : kind == 3 ? "write" : "text"; }

const char* HintKindName(int kind) { return kind == 1 ? "type" : kind == 2 ? "parameter" : "hint"; }

void PrintFeature(std::ostream& out, const Action& action, const Outcome& outcome) {
  switch (action.kind) {
    case ActionKind::CodeActions: PrintCodeActions(out, outcome); break;
    case ActionKind::Highlight: PrintHighlights(out, action.path, outcome); break;
    case ActionKind::Folding: PrintFolds(out, action.path, outcome); break;
    case ActionKind::SelectionRange: PrintSelections(out, action.path, outcome); break;
    case ActionKind::SemanticTokens: PrintTokens(out, action.path, outcome); break;
    case ActionKind::InlayHints: PrintHints(out, action.path, outcome); break;
    case ActionKind::PrepareRename: PrintPrepared(out, action.path, outcome.prepared); break;
    case ActionKind::CallHierarchy: PrintCalls(out, outcome); break;
    default: PrintRequestResult(out, outcome); break;
  }
}

}  // namespace cli
