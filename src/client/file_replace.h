// The platform half of applying edits to files: finding the file a path names, reading
// it, and replacing it whole through a temporary file beside it. Each operation returns
// false with the system's reason in `error` when it fails.
#pragma once

#include <string>

namespace vexil {

// The file `path` names, through symbolic links, as an absolute path.
bool ResolveFile(const std::string& path, std::string& target, std::string& error);

// The whole content of the regular file `path`.
bool ReadWholeFile(const std::string& path, std::string& text, std::string& error);

// Checks that `target` may be replaced, then writes `text` to a new temporary file in its
// directory, with its permissions, flushed to disk; its path goes to `temporary`.
bool WriteBeside(const std::string& target, const std::string& text, std::string& temporary, std::string& error);

// Puts the temporary file in the place of `target` in one step.
bool ReplaceWith(const std::string& temporary, const std::string& target, std::string& error);

void RemoveFile(const std::string& path);

// Sets `error` to "<what> <path>: <the system's reason for the call that just failed>"
// and returns false.
bool SystemFailure(std::string& error, const char* what, const std::string& path);

}  // namespace vexil
