// Path style on POSIX systems: '/' already, and letter case matters. A backslash is an
// ordinary character of a file name here.
#include "client/path_style.h"

namespace vexil {

char NativeSeparator() { return '/'; }

std::string SlashSeparated(std::string path) { return path; }

bool PathsIgnoreCase() { return false; }

}  // namespace vexil
