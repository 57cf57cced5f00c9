// The host's environment on POSIX: the process's `environ`, names compared exactly.
#include "transport/environment.h"

#include <cstring>

extern char** environ;

namespace vexil {

EnvironmentVariables HostEnvironment() {
  EnvironmentVariables variables;
  for (char** entry = environ; entry && *entry; ++entry) {
    const char* equals = std::strchr(*entry, '=');
    if (!equals) continue;
    variables.emplace_back(std::string(*entry, static_cast<std::size_t>(equals - *entry)), std::string(equals + 1));
  }
  return variables;
}

bool SameVariable(const std::string& a, const std::string& b) { return a == b; }

}  // namespace vexil
