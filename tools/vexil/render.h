// Printing what an action got back: a readable form (locations with their source line,
// one completion per line, hover text as is, edits as a diff) or one JSON object.
#pragma once

#include <ostream>
#include <string>

#include "actions.h"

namespace cli {

void PrintReadable(std::ostream& out, const Action& action, const Outcome& outcome);
// One line of JSON; lines and columns count from 1, as on the command line.
void PrintJson(std::ostream& out, const Action& action, const Outcome& outcome);

// "path:line:col" of a location, the path relative to the current directory when below it.
std::string Where(const LSP::Location& location);
// The name of a protocol symbol kind ("class", "function", ...), or "symbol".
const char* SymbolKindName(int kind);
// "error", "warning", "info" or "hint"; a diagnostic without a severity counts as an error.
const char* SeverityName(int severity);
// The hover's text: its markup value, or else its marked strings one after the other.
std::string HoverText(const LSP::Hover& hover);
// The text of `path` after the edits, as a unified diff against the file.
std::string EditsAsDiff(const FileEdits& file);

}  // namespace cli
