// Parsing `vexil lsp [options] -- SERVER [ARGS...] ACTIONS...`. Server arguments run up to
// the first action option, so servers keep options of their own (--log=error).
#include "lsp_options.h"

#include <cstdlib>

namespace cli {

int PositiveNumber(const std::string& text, const std::string& what) {
  char* end = nullptr;
  long value = std::strtol(text.c_str(), &end, 10);
  if (text.empty() || *end != '\0' || value < 1 || value > 1000000000) {
    throw UsageError(what + " must be a positive number, not '" + text + "'");
  }
  return static_cast<int>(value);
}

namespace {

constexpr std::size_t kMaxServerArguments = 7;  // the start record's argument slots

// Splits "FILE:A:B..." into the file and `count` numbers, taken from the right so that
// the file name may itself hold colons.
std::vector<std::string> SplitFromRight(const std::string& text, std::size_t count, const std::string& form) {
  std::vector<std::string> pieces(count + 1);
  std::string rest = text;
  for (std::size_t i = count; i > 0; --i) {
    std::size_t colon = rest.rfind(':');
    if (colon == std::string::npos || colon == 0) throw UsageError("expected " + form + ", not '" + text + "'");
    pieces[i] = rest.substr(colon + 1);
    rest = rest.substr(0, colon);
  }
  pieces[0] = rest;
  return pieces;
}

void ReadPosition(const std::string& text, Action& action) {
  std::vector<std::string> pieces = SplitFromRight(text, 2, "FILE:LINE:COL");
  action.file = pieces[0];
  action.line = PositiveNumber(pieces[1], "LINE");
  action.column = PositiveNumber(pieces[2], "COL");
}

void ReadOperand(const std::string& text, Action& action) {
  switch (action.kind) {
    case ActionKind::WorkspaceSymbols: action.text = text; break;
    case ActionKind::Rename: {
      std::size_t colon = text.rfind(':');
      if (colon == std::string::npos || colon + 1 == text.size()) {
        throw UsageError("expected FILE:LINE:COL:NEWNAME, not '" + text + "'");
      }
      action.text = text.substr(colon + 1);
      ReadPosition(text.substr(0, colon), action);
      break;
    }
    case ActionKind::RangeFormat: {
      std::vector<std::string> pieces = SplitFromRight(text, 4, "FILE:L1:C1:L2:C2");
      action.file = pieces[0];
      action.line = PositiveNumber(pieces[1], "L1");
      action.column = PositiveNumber(pieces[2], "C1");
      action.endLine = PositiveNumber(pieces[3], "L2");
      action.endColumn = PositiveNumber(pieces[4], "C2");
      break;
    }
    case ActionKind::Open: case ActionKind::Symbols: case ActionKind::Format: case ActionKind::Change:
    case ActionKind::Save: case ActionKind::Close: case ActionKind::Diagnostics: action.file = text; break;
    default: ReadPosition(text, action); break;
  }
}

LSP::TraceLevel TraceLevelOf(const std::string& text) {
  if (text == "off") return LSP::TraceLevel::Off;
  if (text == "messages") return LSP::TraceLevel::Messages;
  if (text == "verbose") return LSP::TraceLevel::Verbose;
  throw UsageError("--trace takes off, messages or verbose, not '" + text + "'");
}

// Reads the options before "--"; returns the index after "--".
std::size_t ReadOptions(const std::vector<std::string>& arguments, LspOptions& options) {
  std::size_t i = 0;
  auto value = [&](const std::string& option) -> const std::string& {
    if (i + 1 >= arguments.size()) throw UsageError(option + " needs a value");
    return arguments[++i];
  };
  for (; i < arguments.size() && arguments[i] != "--"; ++i) {
    const std::string& option = arguments[i];
    if (option == "--trace") options.session.trace = TraceLevelOf(value(option));
    else if (option == "--timeout") options.session.timeout = PositiveNumber(value(option), "--timeout");
    else if (option == "--root") options.session.root = value(option);
    else if (option == "--language") options.session.language = value(option);
    else if (option == "--json") options.json = true;
    else throw UsageError("unknown option '" + option + "'");
  }
  if (i == arguments.size()) throw UsageError("the server command must follow '--'");
  return i + 1;
}

void CheckLanguages(const LspOptions& options) {
  if (!options.session.language.empty()) return;
  for (const Action& action : options.actions) {
    if (!action.file.empty() && TableLanguageOf(action.file).empty()) {
      throw UsageError("no language id is known for '" + action.file + "'; give one with --language ID");
    }
  }
}

}  // namespace

LspOptions ParseLspOptions(const std::vector<std::string>& arguments) {
  LspOptions options;
  options.session.name = "vexil-lsp";
  std::size_t i = ReadOptions(arguments, options);
  if (i == arguments.size()) throw UsageError("the server command must follow '--'");
  options.session.program = arguments[i++];
  Action action;
  for (; i < arguments.size() && !ActionOfOption(arguments[i], action.kind); ++i) {
    options.session.arguments.push_back(arguments[i]);
  }
  if (options.session.arguments.size() > kMaxServerArguments) throw UsageError("a server takes at most seven arguments");
  for (; i < arguments.size(); ++i) {
    if (!ActionOfOption(arguments[i], action.kind)) throw UsageError("unknown action '" + arguments[i] + "'");
    if (++i == arguments.size()) throw UsageError(arguments[i - 1] + " needs a value");
    Action next;
    next.kind = action.kind;
    ReadOperand(arguments[i], next);
    options.actions.push_back(next);
  }
  if (options.actions.empty()) throw UsageError("no action given");
  options.session.root = AbsolutePath(options.session.root.empty() ? "." : options.session.root);
  CheckLanguages(options);
  return options;
}

}  // namespace cli
