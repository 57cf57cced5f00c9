// Showing proposed edits as people read them: the edits applied to a file's text, and a
// unified diff between the text before and after.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/structures.h"

namespace cli {

// `text` with every edit applied; positions count UTF-16 units, as the protocol does.
std::string ApplyEdits(const std::string& text, std::vector<LSP::TextEdit> edits);

// A unified diff of two texts with three lines of context, under "--- name" and
// "+++ name"; empty when the texts are equal.
std::string UnifiedDiff(const std::string& name, const std::string& before, const std::string& after);

std::vector<std::string> SplitLines(const std::string& text);

}  // namespace cli
