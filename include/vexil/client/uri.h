// Conversion between file paths and "file" URIs, as the protocol names documents and roots.
// Both give "" for empty input and for a conversion that fails or whose result exceeds the
// platform's path limit: 259 characters on Windows, PATH_MAX - 1 (4095 on Linux) on POSIX.
#pragma once

#include <string>

#include "vexil/export.h"

// An absolute path as a file URI, unsafe bytes percent-encoded.
VEXIL_API std::string FileToUri(const char* path);
// The path a file URI names, without leading backslashes.
VEXIL_API std::string UriToFile(const char* uri);
