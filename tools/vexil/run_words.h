// A command line split into words as a shell would, without any expansion, and run as a
// program with its arguments: what `vexil task` does without --shell.
#pragma once

#include <string>
#include <vector>

namespace cli {

// Words split at blanks; '...' keeps everything, "..." keeps all but \" and \\, and a
// backslash outside quotes keeps the next character. Throws UsageError for an open quote.
std::vector<std::string> SplitWords(const std::string& text);

// Runs words[0] with the rest as its arguments, waits for it and returns its exit status,
// writing "vexil: exit status N" (or how it ended otherwise) to standard error.
int RunProgram(const std::vector<std::string>& words);

// The path of this program, which a task starts to run a split command line.
std::string SelfPath();
// `text` for the command interpreter, made to report its exit status as RunProgram does
// where the interpreter allows that.
std::string ReportingStatus(const std::string& text);

}  // namespace cli
