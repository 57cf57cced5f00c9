// Path style on Windows: backslashes become '/', and letter case does not tell files apart.
#include <algorithm>

#include "client/path_style.h"

namespace vexil {

char NativeSeparator() { return '\\'; }

std::string SlashSeparated(std::string path) {
  std::replace(path.begin(), path.end(), '\\', '/');
  return path;
}

bool PathsIgnoreCase() { return true; }

}  // namespace vexil
