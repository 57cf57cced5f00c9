// Printing what an action got back: a readable form (locations with their source line,
// one completion per line, hover text as is, edits as a diff) or JSON Lines.
//
// JSON Lines: one object per query action, in order, and one per failure:
//   {"action":"hover","file":"main.cpp","line":15,"column":18,"failed":false,"result":...}
//   {"action":"start","failed":true,"error":"clangd exited with status 1: ..."}
// "file", "line", "column" and "text" (a query or new name) echo the operand; "result" is
// a text (hover), the server's JSON (capabilities, request), or an array of objects with "path" (absolute), "line", "column",
// "endLine", "endColumn" (from 1, columns in bytes) and the answer's own members. Every
// "kind" and "severity" is a name ("function", "error"), as in the readable form.
#pragma once

#include <ostream>
#include <string>

#include "actions.h"

namespace cli {

void PrintReadable(std::ostream& out, const Action& action, const Outcome& outcome);
void PrintJson(std::ostream& out, const Action& action, const Outcome& outcome);
// The object of a failure that belongs to no answer: "start", or an action whose file failed.
void PrintJsonError(std::ostream& out, const std::string& action, const std::string& why);

// A server's capabilities, one per line, and a request's result as JSON text.
void PrintCapabilities(std::ostream& out, const Outcome& outcome);
void PrintRequestResult(std::ostream& out, const Outcome& outcome);

// "path:line:col" of a location, the path relative to the current directory when below it
// and the column in bytes.
std::string Where(const LSP::Location& location);
// The name of a protocol symbol kind ("class", "function", ...), or "symbol".
const char* SymbolKindName(int kind);
// The name of a completion item kind ("method", "keyword", ...), or "text".
const char* CompletionKindName(int kind);
// "error", "warning", "info" or "hint"; a diagnostic without a severity counts as an error.
const char* SeverityName(int severity);
// The hover's text: its markup value, or else its marked strings one after the other.
std::string HoverText(const LSP::Hover& hover);
// The text of `path` after the edits, as a unified diff against the file.
std::string EditsAsDiff(const FileEdits& file);
// The diffs of the edits of every file; "(no changes)" when there are none.
void PrintEdits(std::ostream& out, const std::vector<FileEdits>& files);
// Line `line` (from 0) of the file at `path`, without its indentation.
std::string SourceLine(const std::string& path, int line);

}  // namespace cli
