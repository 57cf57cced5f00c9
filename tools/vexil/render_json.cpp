// The JSON form of an action's result, one object per line, written with the library's
// writer. Lines and columns count from 1 here, columns in bytes, as on the command line.
#include "render.h"

#include "columns.h"
#include "render_features.h"
#include "vexil/client/uri.h"
#include "vexil/json/json.h"

namespace cli {
namespace {

void Point(LSP::xWriter& writer, const char* line, const char* column, const std::string& path,
           const LSP::Position& position) {
  writer.Int(line, position.line + 1);
  writer.Int(column, ByteColumn(TextOf(path), position));
}

void Locations(LSP::xWriter& writer, const std::vector<LSP::Location>& locations) {
  writer.StartArray("result");
  for (const LSP::Location& location : locations) {
    writer.StartObject();
    Span(writer, UriToFile(location.uri.c_str()), location.range);
    writer.EndObject();
  }
  writer.EndArray();
}

void Symbols(LSP::xWriter& writer, const char* name, const std::vector<LSP::SymbolInformation>& symbols) {
  writer.StartArray(name);
  for (const LSP::SymbolInformation& symbol : symbols) {
    writer.StartObject();
    writer.RequiredString("name", symbol.name);
    writer.RequiredString("kind", SymbolKindName(symbol.kind));
    writer.String("container", symbol.containerName);
    Span(writer, UriToFile(symbol.location.uri.c_str()), symbol.location.range);
    if (!symbol.children.empty()) Symbols(writer, "children", symbol.children);
    writer.EndObject();
  }
  writer.EndArray();
}

void Completion(LSP::xWriter& writer, const LSP::CompletionList& list) {
  writer.StartArray("result");
  for (const LSP::CompletionItem& item : list.items) {
    writer.StartObject();
    writer.RequiredString("label", item.label);
    writer.RequiredString("kind", CompletionKindName(item.kind));
    writer.String("detail", item.detail);
    writer.String("insertText", item.insertText);
    writer.EndObject();
  }
  writer.EndArray();
}

void Signature(LSP::xWriter& writer, const LSP::SignatureHelp& help) {
  writer.StartArray("result");
  for (const LSP::SignatureInformation& signature : help.signatures) {
    writer.StartObject();
    writer.RequiredString("label", signature.label);
    writer.String("documentation", signature.documentation.value);
    writer.StartArray("parameters");
    for (const LSP::ParameterInformation& parameter : signature.parameters) writer.String(parameter.label);
    writer.EndArray();
    writer.EndObject();
  }
  writer.EndArray();
  writer.Int("activeSignature", help.activeSignature);
  writer.Int("activeParameter", help.activeParameter);
}

void Diagnostics(LSP::xWriter& writer, const std::string& path, const std::vector<LSP::Diagnostic>& diagnostics) {
  writer.StartArray("result");
  for (const LSP::Diagnostic& diagnostic : diagnostics) {
    writer.StartObject();
    Span(writer, path, diagnostic.range);
    writer.RequiredString("severity", SeverityName(diagnostic.severity));
    writer.RequiredString("message", diagnostic.message);
    writer.String("source", diagnostic.source);
    writer.String("code", diagnostic.codeText);
    writer.EndObject();
  }
  writer.EndArray();
}

void Result(LSP::xWriter& writer, const Action& action, const Outcome& outcome) {
  if (IsNewer(action.kind)) return FeatureResult(writer, action, outcome);
  switch (action.kind) {
    case ActionKind::Hover: writer.RequiredString("result", HoverText(outcome.hover)); break;
    case ActionKind::Completion: Completion(writer, outcome.completion); break;
    case ActionKind::Signature: Signature(writer, outcome.signature); break;
    case ActionKind::Symbols:
    case ActionKind::WorkspaceSymbols: Symbols(writer, "result", outcome.symbols); break;
    case ActionKind::Format:
    case ActionKind::RangeFormat:
    case ActionKind::Rename: Edits(writer, "result", outcome.edits); break;
    case ActionKind::Diagnostics: Diagnostics(writer, action.path, outcome.diagnostics); break;
    case ActionKind::Capabilities:
    case ActionKind::Request: RawResult(writer, outcome.json); break;
    default: Locations(writer, outcome.locations); break;
  }
}

}  // namespace

// JSON text as it came, under "result"; null when there is none.
void RawResult(LSP::xWriter& writer, const std::string& json) {
  LSP::xReader reader;
  if (reader.Parse(json.empty() ? "null" : json)) writer.Raw("result", reader.Root().Value());
}

void Span(LSP::xWriter& writer, const std::string& path, const LSP::Range& range) {
  writer.RequiredString("path", path);
  Point(writer, "line", "column", path, range.start);
  Point(writer, "endLine", "endColumn", path, range.end);
}

void Edits(LSP::xWriter& writer, const char* name, const std::vector<FileEdits>& files) {
  writer.StartArray(name);
  for (const FileEdits& file : files) {
    for (const LSP::TextEdit& edit : file.edits) {
      writer.StartObject();
      Span(writer, file.path, edit.range);
      writer.RequiredString("newText", edit.newText);
      writer.EndObject();
    }
  }
  writer.EndArray();
}

void PrintJson(std::ostream& out, const Action& action, const Outcome& outcome) {
  if (!InfoOf(action.kind).query && !outcome.failed) return;
  LSP::xWriter writer;
  writer.StartObject();
  writer.RequiredString("action", std::string(InfoOf(action.kind).option).substr(2));
  writer.String("file", action.file);
  if (action.line > 0) {
    writer.Int("line", action.line);
    writer.Int("column", action.column);
  }
  writer.String("text", action.text);
  writer.Bool("failed", outcome.failed);
  if (outcome.failed) writer.RequiredString("error", outcome.why);
  else Result(writer, action, outcome);
  if (!outcome.requested.empty()) Edits(writer, "requested", outcome.requested);
  if (outcome.applied) writer.Bool("applied", true);
  writer.EndObject();
  out << writer.GetString() << "\n";
}

void PrintJsonError(std::ostream& out, const std::string& action, const std::string& why) {
  LSP::xWriter writer;
  writer.StartObject();
  writer.RequiredString("action", action);
  writer.Bool("failed", true);
  writer.RequiredString("error", why);
  writer.EndObject();
  out << writer.GetString() << "\n";
}

}  // namespace cli
