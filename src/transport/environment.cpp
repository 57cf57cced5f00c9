// Applying the host's changes to its own environment for a child.
#include "transport/environment.h"

#include <algorithm>

namespace vexil {

bool IsVariableName(const std::string& name) {
  return !name.empty() && name.find('=') == std::string::npos && name.find('\0') == std::string::npos;
}

EnvironmentVariables ChildEnvironment(const EnvironmentChanges& changes) {
  EnvironmentVariables variables = HostEnvironment();
  for (const EnvironmentChange& change : changes) {
    auto same = [&](const std::pair<std::string, std::string>& variable) {
      return SameVariable(variable.first, change.name);
    };
    auto first = std::find_if(variables.begin(), variables.end(), same);
    if (!change.value) {
      variables.erase(std::remove_if(first, variables.end(), same), variables.end());
    } else if (first == variables.end()) {
      variables.emplace_back(change.name, *change.value);
    } else {
      // Set in place; any other spelling of the name goes, so the child sees one value.
      *first = {change.name, *change.value};
      variables.erase(std::remove_if(first + 1, variables.end(), same), variables.end());
    }
  }
  return variables;
}

}  // namespace vexil
