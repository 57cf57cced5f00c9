// Printing the answers of the newer requests, readable and as JSON, with the helpers they
// share with the classic ones.
#pragma once

#include <ostream>
#include <string>
#include <vector>

#include "actions.h"
#include "vexil/json/json.h"

namespace cli {

// The readable answer of one of the newer actions, below the line naming the action.
void PrintFeature(std::ostream& out, const Action& action, const Outcome& outcome);
// Its "result" member of the JSON form.
void FeatureResult(LSP::xWriter& writer, const Action& action, const Outcome& outcome);

// JSON text as it came, under "result"; null when there is none.
void RawResult(LSP::xWriter& writer, const std::string& json);
// Members "path", "line", "column", "endLine", "endColumn" of `range` in the file `path`.
void Span(LSP::xWriter& writer, const std::string& path, const LSP::Range& range);
// The edits as an array `name` of objects with their span and "newText".
void Edits(LSP::xWriter& writer, const char* name, const std::vector<FileEdits>& files);
// The text of `range` in the file at `path`, up to the end of its first line.
std::string FirstLineOf(const std::string& path, const LSP::Range& range, bool& more);
// The ranges of a selection, each followed by those around it, innermost first.
std::vector<LSP::Range> SelectedRanges(const Outcome& outcome);
// The place of a semantic token.
LSP::Range TokenRange(const LSP::SemanticToken& token);
// "text", "read" or "write" of a document highlight's kind.
const char* HighlightKindName(int kind);
// "type", "parameter" or "hint" of an inlay hint's kind.
const char* HintKindName(int kind);

}  // namespace cli
