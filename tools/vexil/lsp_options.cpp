// Parsing `vexil lsp [options] -- SERVER [ARGS...] ACTIONS...`. Server arguments run up to
// the first action option, so servers keep options of their own (--log=error).
#include "lsp_options.h"

#include "vexil/json/json.h"

namespace cli {
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

void ReadOperand(const std::string& text, Operand operand, Action& action) {
  switch (operand) {
    case Operand::Query: action.text = text; break;
    case Operand::File: action.file = text; break;
    case Operand::Position: ReadPosition(text, action); break;
    case Operand::Rename: {
      std::size_t colon = text.rfind(':');
      if (colon == std::string::npos || colon + 1 == text.size()) {
        throw UsageError("expected FILE:LINE:COL:NEWNAME, not '" + text + "'");
      }
      action.text = text.substr(colon + 1);
      ReadPosition(text.substr(0, colon), action);
      break;
    }
    case Operand::Range: {
      std::vector<std::string> pieces = SplitFromRight(text, 4, "FILE:L1:C1:L2:C2");
      action.file = pieces[0];
      action.line = PositiveNumber(pieces[1], "L1");
      action.column = PositiveNumber(pieces[2], "C1");
      action.endLine = PositiveNumber(pieces[3], "L2");
      action.endColumn = PositiveNumber(pieces[4], "C2");
      break;
    }
    case Operand::None:
    case Operand::MethodParams: break;  // read by ReadOperands
  }
}

// A request's params: checked here, so that a typing error costs no server launch.
std::string JsonParams(const std::string& option, const std::string& text) {
  LSP::xReader reader;
  if (text.empty() || text == "null") return text;
  if (!reader.Parse(text)) {
    std::string why = reader.Error();
    throw UsageError(option + ": PARAMS is not JSON: " + why.substr(0, why.find('\n')));
  }
  if (!reader.Root().IsObject()) throw UsageError(option + ": PARAMS must be a JSON object, not '" + text + "'");
  return text;
}

// Reads the operands of the action at hand.
void ReadOperands(OptionReader& reader, const ActionInfo& info, Action& action) {
  if (info.operand == Operand::None) return reader.Flag();
  if (info.operand != Operand::MethodParams) return ReadOperand(reader.Value(), info.operand, action);
  action.text = reader.Value();
  if (reader.Done()) throw UsageError(std::string(info.option) + " takes METHOD and PARAMS (e.g. {} or null)");
  action.params = JsonParams(info.option, reader.Take());
}

// "NAME=VALUE" of --env.
std::pair<std::string, std::string> Variable(const std::string& text) {
  std::size_t equals = text.find('=');
  if (equals == std::string::npos || equals == 0) throw UsageError("--env takes NAME=VALUE, not '" + text + "'");
  return {text.substr(0, equals), text.substr(equals + 1)};
}

LSP::TraceLevel TraceLevelOf(const std::string& text) {
  if (text == "off") return LSP::TraceLevel::Off;
  if (text == "messages") return LSP::TraceLevel::Messages;
  if (text == "verbose") return LSP::TraceLevel::Verbose;
  throw UsageError("--trace takes off, messages or verbose, not '" + text + "'");
}

const ActionInfo* ActionAt(const OptionReader& reader) {
  return reader.Done() ? nullptr : ActionOfOption(reader.Current().substr(0, reader.Current().find('=')));
}

// Reads the options up to "--".
void ReadOptions(OptionReader& reader, LspOptions& options) {
  while (!reader.Done() && reader.Current() != "--") {
    if (reader.Is("--trace")) options.session.trace = TraceLevelOf(reader.Value());
    else if (reader.Is("--timeout")) options.session.timeout = PositiveNumber(reader.Value(), "--timeout");
    else if (reader.Is("--root")) options.session.root = reader.Value();
    else if (reader.Is("--language")) options.session.language = reader.Value();
    else if (reader.Is("--json")) reader.Flag(), options.json = true;
    else if (reader.Is("--env")) options.session.environment.push_back(Variable(reader.Value()));
    else if (reader.Is("--progress")) reader.Flag(), options.session.progress = true;
    else if (reader.Is("--watch")) reader.Flag(), options.session.watch = true;
    else if (ActionAt(reader)) throw UsageError(reader.Current() + " is an action: it follows '-- SERVER [ARG]...'");
    else reader.Unknown();
  }
  if (reader.Done()) throw UsageError("the server command must follow '--'");
  reader.Take();
}

void CheckLanguages(const LspOptions& options) {
  if (!options.session.language.empty()) return;
  for (const Action& action : options.actions) {
    if (!action.file.empty() && KnownLanguageOf(action.file).empty()) {
      throw UsageError("no language id is known for '" + action.file + "'; give one with --language ID");
    }
  }
}

}  // namespace

LspOptions ParseLspOptions(const std::vector<std::string>& arguments) {
  LspOptions options;
  options.session.name = "vexil-lsp";
  OptionReader reader(arguments);
  ReadOptions(reader, options);
  if (reader.Done()) throw UsageError("the server command must follow '--'");
  options.session.program = reader.Take();
  while (!reader.Done() && !ActionAt(reader)) options.session.arguments.push_back(reader.Take());
  if (options.session.arguments.size() > kMaxServerArguments) throw UsageError("a server takes at most seven arguments");
  while (!reader.Done()) {
    const ActionInfo* info = ActionAt(reader);
    if (!info) throw UsageError("unknown action '" + reader.Current() + "'");
    Action action;
    action.kind = info->kind;
    ReadOperands(reader, *info, action);
    options.actions.push_back(action);
  }
  if (options.actions.empty() && !options.session.watch) throw UsageError("no action given");
  options.session.root = AbsolutePath(options.session.root.empty() ? "." : options.session.root);
  for (Action& action : options.actions) {
    if (!action.file.empty()) action.path = ResolvePath(options.session.root, action.file);
  }
  CheckLanguages(options);
  return options;
}

}  // namespace cli
