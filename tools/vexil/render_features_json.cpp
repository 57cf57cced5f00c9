// The JSON forms of the newer answers: arrays of objects with the span of each place
// ("path", "line", "column", "endLine", "endColumn", from 1, columns in bytes) and the
// answer's own members, kinds by name as in the readable form.
#include <algorithm>
#include <climits>
#include <functional>

#include "render.h"
#include "render_features.h"
#include "vexil/client/uri.h"

namespace cli {
namespace {

// Members written by a function, for an object under a key.
class Members : public LSP::JsonObject {
 public:
  explicit Members(std::function<void(LSP::xWriter&)> write) : write_(std::move(write)) {}
  const char* Name() const override { return "result"; }
  void Read(const LSP::xObject&) override {}
  void Write(LSP::xWriter& writer) override { write_(writer); }

 private:
  std::function<void(LSP::xWriter&)> write_;
};

// An array "result" of one object per item, whose members `write` writes.
template <typename T, typename Write>
void Objects(LSP::xWriter& writer, const std::vector<T>& items, Write write) {
  writer.StartArray("result");
  for (const T& item : items) {
    writer.StartObject();
    write(item);
    writer.EndObject();
  }
  writer.EndArray();
}

void CodeActions(LSP::xWriter& writer, const Outcome& outcome) {
  Objects(writer, outcome.codeActions, [&](const LSP::CodeAction& action) {
    writer.RequiredString("title", action.title);
    writer.String("kind", action.kind);
    if (action.isPreferred) writer.Bool("preferred", true);
    if (action.HasEdit()) Edits(writer, "edits", FilesOf(action.edit));
    writer.String("command", action.command.command);
    if (&action - outcome.codeActions.data() == outcome.chosen) writer.Bool("applied", true);
  });
}

void Highlights(LSP::xWriter& writer, const std::string& path, const Outcome& outcome) {
  Objects(writer, outcome.highlights, [&](const LSP::DocumentHighlight& highlight) {
    Span(writer, path, highlight.range);
    writer.RequiredString("kind", HighlightKindName(highlight.kind));
  });
}

// A fold without characters takes its lines whole.
void Folds(LSP::xWriter& writer, const std::string& path, const Outcome& outcome) {
  Objects(writer, outcome.folds, [&](const LSP::FoldingRange& fold) {
    Span(writer, path, LSP::Range(LSP::Position(fold.startLine, std::max(fold.startCharacter, 0)),
                                  LSP::Position(fold.endLine, fold.endCharacter < 0 ? INT_MAX : fold.endCharacter)));
    writer.String("kind", fold.kind);
    writer.String("collapsedText", fold.collapsedText);
  });
}

void Selections(LSP::xWriter& writer, const std::string& path, const Outcome& outcome) {
  Objects(writer, SelectedRanges(outcome), [&](const LSP::Range& range) { Span(writer, path, range); });
}

void Tokens(LSP::xWriter& writer, const std::string& path, const Outcome& outcome) {
  Objects(writer, outcome.tokens, [&](const LSP::SemanticToken& token) {
    Span(writer, path, TokenRange(token));
    writer.RequiredString("type", token.type);
    writer.Strings("modifiers", token.modifiers);
  });
}

void Hints(LSP::xWriter& writer, const std::string& path, const Outcome& outcome) {
  Objects(writer, outcome.hints, [&](const LSP::InlayHint& hint) {
    Span(writer, path, LSP::Range(hint.position, hint.position));
    writer.RequiredString("kind", HintKindName(hint.kind));
    writer.RequiredString("label", hint.label);
  });
}

// The range to rename and the name to offer; {"defaultBehavior":true} when the server
// leaves the word to the client, null when no rename is possible.
void Prepared(LSP::xWriter& writer, const std::string& path, const LSP::PrepareRenameResult& prepared) {
  if (!prepared.CanRename()) return writer.Null("result");
  Members result([&](LSP::xWriter& members) {
    if (prepared.defaultBehavior) return members.Bool("defaultBehavior", true);
    bool more = false;
    Span(members, path, prepared.range);
    members.RequiredString("placeholder",
                           prepared.placeholder.empty() ? FirstLineOf(path, prepared.range, more) : prepared.placeholder);
  });
  writer.Object("result", result);
}

// The name, kind and detail of a function of a hierarchy, and the span of its name.
void Function(LSP::xWriter& writer, const LSP::CallHierarchyItem& item) {
  writer.RequiredString("name", item.name);
  writer.RequiredString("kind", SymbolKindName(item.kind));
  writer.String("detail", item.detail);
  Span(writer, UriToFile(item.uri.c_str()), item.selectionRange);
}

// The callers or callees of a function, each with the spans of the calls (in `callsUri`,
// or the caller's document when that is empty).
template <typename Call>
void Calls(LSP::xWriter& writer, const char* name, const std::vector<Call>& calls,
           const LSP::CallHierarchyItem& (*other)(const Call&), const std::string& callsUri) {
  writer.StartArray(name);
  for (const Call& call : calls) {
    writer.StartObject();
    Function(writer, other(call));
    writer.StartArray("calls");
    for (const LSP::Range& range : call.fromRanges) {
      writer.StartObject();
      Span(writer, UriToFile((callsUri.empty() ? other(call).uri : callsUri).c_str()), range);
      writer.EndObject();
    }
    writer.EndArray();
    writer.EndObject();
  }
  writer.EndArray();
}

const LSP::CallHierarchyItem& Caller(const LSP::CallHierarchyIncomingCall& call) { return call.from; }
const LSP::CallHierarchyItem& Callee(const LSP::CallHierarchyOutgoingCall& call) { return call.to; }

void CallTrees(LSP::xWriter& writer, const Outcome& outcome) {
  writer.StartArray("result");
  for (const CallTree& tree : outcome.calls) {
    writer.StartObject();
    Function(writer, tree.item);
    // A caller's calls are in its own document; the calls out of a function in the function's.
    // What the server does not offer is left out.
    if (tree.incomingOffered) Calls(writer, "incoming", tree.incoming, &Caller, "");
    if (tree.outgoingOffered) Calls(writer, "outgoing", tree.outgoing, &Callee, tree.item.uri);
    writer.EndObject();
  }
  writer.EndArray();
}

}  // namespace

void FeatureResult(LSP::xWriter& writer, const Action& action, const Outcome& outcome) {
  switch (action.kind) {
    case ActionKind::CodeActions: CodeActions(writer, outcome); break;
    case ActionKind::Highlight: Highlights(writer, action.path, outcome); break;
    case ActionKind::Folding: Folds(writer, action.path, outcome); break;
    case ActionKind::SelectionRange: Selections(writer, action.path, outcome); break;
    case ActionKind::SemanticTokens: Tokens(writer, action.path, outcome); break;
    case ActionKind::InlayHints: Hints(writer, action.path, outcome); break;
    case ActionKind::PrepareRename: Prepared(writer, action.path, outcome.prepared); break;
    case ActionKind::CallHierarchy: CallTrees(writer, outcome); break;
    default: RawResult(writer, outcome.json); break;
  }
}

}  // namespace cli
