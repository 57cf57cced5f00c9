// Showing proposed edits as people read them: a unified diff between a file's text
// before and after the edits.
#pragma once

#include <string>
#include <vector>

namespace cli {

// A unified diff of two texts with three lines of context, under "--- name" and
// "+++ name"; empty when the texts are equal.
std::string UnifiedDiff(const std::string& name, const std::string& before, const std::string& after);

std::vector<std::string> SplitLines(const std::string& text);

}  // namespace cli
