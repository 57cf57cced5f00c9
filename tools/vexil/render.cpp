// The readable forms of results, and the helpers the demo shares: where a location is,
// what a symbol kind is called, and a file's edits as a diff.
#include "render.h"

#include <algorithm>
#include <filesystem>

#include "columns.h"
#include "render_features.h"
#include "text_edits.h"
#include "vexil/client/text_edits.h"
#include "vexil/client/uri.h"

namespace cli {
namespace {

std::string Relative(const std::string& path) {
  std::error_code error;
  std::filesystem::path relative = std::filesystem::relative(path, std::filesystem::current_path(error), error);
  if (error || relative.empty() || relative.string().rfind("..", 0) == 0) return path;
  return relative.string();
}

void PrintLocations(std::ostream& out, const std::vector<LSP::Location>& locations) {
  if (locations.empty()) out << "  (none)\n";
  for (const LSP::Location& location : locations) {
    out << "  " << Where(location) << ": " << SourceLine(UriToFile(location.uri.c_str()), location.range.start.line)
        << "\n";
  }
}

void PrintSymbols(std::ostream& out, const std::vector<LSP::SymbolInformation>& symbols, int depth) {
  if (symbols.empty() && depth == 0) out << "  (none)\n";
  for (const LSP::SymbolInformation& symbol : symbols) {
    out << std::string(2 + 2 * static_cast<std::size_t>(depth), ' ') << SymbolKindName(symbol.kind) << " "
        << symbol.name << "  " << Where(symbol.location) << "\n";
    PrintSymbols(out, symbol.children, depth + 1);
  }
}

void PrintSignature(std::ostream& out, const LSP::SignatureHelp& help) {
  if (help.signatures.empty()) out << "  (none)\n";
  for (std::size_t i = 0; i < help.signatures.size(); ++i) {
    const LSP::SignatureInformation& signature = help.signatures[i];
    bool active = static_cast<int>(i) == help.activeSignature;
    out << (active ? "* " : "  ") << signature.label << "\n";
    if (active && help.activeParameter >= 0 &&
        static_cast<std::size_t>(help.activeParameter) < signature.parameters.size()) {
      out << "    parameter: " << signature.parameters[static_cast<std::size_t>(help.activeParameter)].label << "\n";
    }
    if (!signature.documentation.value.empty()) out << "    " << signature.documentation.value << "\n";
  }
}

// The compiler's format, which editors and terminals turn into links.
void PrintDiagnostics(std::ostream& out, const std::string& path, const std::vector<LSP::Diagnostic>& diagnostics) {
  if (diagnostics.empty()) out << "  (none)\n";
  for (const LSP::Diagnostic& diagnostic : diagnostics) {
    std::string origin = diagnostic.source + (diagnostic.source.empty() || diagnostic.codeText.empty() ? "" : " ") +
                         diagnostic.codeText;
    LSP::Location location;
    location.uri = FileToUri(path.c_str());
    location.range = diagnostic.range;
    out << Where(location) << ": "
        << SeverityName(diagnostic.severity) << ": " << diagnostic.message
        << (origin.empty() ? "" : " [" + origin + "]") << "\n";
  }
}

// The answer of one of the classic requests.
void PrintAnswer(std::ostream& out, const Action& action, const Outcome& outcome) {
  switch (action.kind) {
    case ActionKind::Hover: {
      std::string text = HoverText(outcome.hover);
      out << (text.empty() ? "  (none)" : text) << "\n";
      break;
    }
    case ActionKind::Completion:
      if (outcome.completion.items.empty()) out << "  (none)\n";
      for (const LSP::CompletionItem& item : outcome.completion.items) {
        // clangd pads labels with a blank where an include marker may go.
        out << "  " << item.label.substr(std::min(item.label.find_first_not_of(' '), item.label.size()))
            << (item.detail.empty() ? "" : "  : " + item.detail) << "\n";
      }
      break;
    case ActionKind::Signature: PrintSignature(out, outcome.signature); break;
    case ActionKind::Symbols:
    case ActionKind::WorkspaceSymbols: PrintSymbols(out, outcome.symbols, 0); break;
    case ActionKind::Format:
    case ActionKind::RangeFormat:
    case ActionKind::Rename: PrintEdits(out, outcome.edits); break;
    case ActionKind::Diagnostics: PrintDiagnostics(out, action.path, outcome.diagnostics); break;
    case ActionKind::Capabilities: PrintCapabilities(out, outcome); break;
    case ActionKind::Request: PrintRequestResult(out, outcome); break;
    default: PrintLocations(out, outcome.locations); break;
  }
}

// The files the edits went to, each named once.
void PrintWritten(std::ostream& out, const Outcome& outcome) {
  std::vector<std::string> paths;
  for (const std::vector<FileEdits>* files : {&outcome.edits, &outcome.requested}) {
    for (const FileEdits& file : *files) {
      std::string path = Relative(file.path);
      if (std::find(paths.begin(), paths.end(), path) == paths.end()) paths.push_back(path);
    }
  }
  out << "  written:";
  for (const std::string& path : paths) out << " " << path;
  out << "\n";
}

}  // namespace

std::string SourceLine(const std::string& path, int line) {
  std::string text = LineOf(path, line);
  text.erase(0, text.find_first_not_of(" \t"));
  return text;
}

void PrintEdits(std::ostream& out, const std::vector<FileEdits>& files) {
  std::string diff;
  for (const FileEdits& file : files) diff += EditsAsDiff(file);
  out << (diff.empty() ? "  (no changes)\n" : diff);
}

std::string Where(const LSP::Location& location) {
  std::string path = UriToFile(location.uri.c_str());
  return Relative(path) + ":" + std::to_string(location.range.start.line + 1) + ":" +
         std::to_string(ByteColumn(TextOf(path), location.range.start));
}

const char* SymbolKindName(int kind) {
  static const char* const names[] = {"file", "module", "namespace", "package", "class", "method", "property",
                                      "field", "constructor", "enum", "interface", "function", "variable",
                                      "constant", "string", "number", "boolean", "array", "object", "key",
                                      "null", "enum member", "struct", "event", "operator", "type parameter"};
  return kind >= 1 && kind <= 26 ? names[kind - 1] : "symbol";
}

const char* CompletionKindName(int kind) {
  static const char* const names[] = {"text", "method", "function", "constructor", "field", "variable", "class",
                                      "interface", "module", "property", "unit", "value", "enum", "keyword",
                                      "snippet", "color", "file", "reference", "folder", "enum member", "constant",
                                      "struct", "event", "operator", "type parameter"};
  return kind >= 1 && kind <= 25 ? names[kind - 1] : "text";
}

const char* SeverityName(int severity) {
  static const char* const names[] = {"error", "warning", "info", "hint"};
  return severity >= 1 && severity <= 4 ? names[severity - 1] : "error";
}

std::string HoverText(const LSP::Hover& hover) {
  if (!hover.contents.value.empty()) return hover.contents.value;
  std::string text;
  for (const LSP::MarkedString& item : hover.contents.items) text += (text.empty() ? "" : "\n") + item.value;
  return text;
}

std::string EditsAsDiff(const FileEdits& file) {
  const std::string& before = TextOf(file.path);
  std::string after = before;
  std::string error;
  if (!LSP::ApplyTextEdits(after, file.edits, error)) return "  " + Relative(file.path) + ": " + error + "\n";
  return UnifiedDiff(Relative(file.path), before, after);
}

void PrintReadable(std::ostream& out, const Action& action, const Outcome& outcome) {
  if (!InfoOf(action.kind).query) return;
  out << Describe(action) << "\n";
  if (IsNewer(action.kind)) PrintFeature(out, action, outcome);
  else PrintAnswer(out, action, outcome);
  if (!outcome.requested.empty()) {
    out << "  the server asked for edits:\n";
    PrintEdits(out, outcome.requested);
  }
  if (outcome.applied) PrintWritten(out, outcome);
}

}  // namespace cli
