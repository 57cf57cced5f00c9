// How this platform writes paths, so that changed files can be matched against the glob
// patterns of language servers, which always separate segments with '/'.
#pragma once

#include <string>

namespace vexil {

// The separator inside the names the change monitor reports ('\\' on Windows).
char NativeSeparator();
// `path` with '/' between its segments.
std::string SlashSeparated(std::string path);
// Whether two names differing only in letter case name one file.
bool PathsIgnoreCase();

}  // namespace vexil
