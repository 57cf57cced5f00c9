// The environment a server is launched with: the host's own, changed by what the host set
// for that server. The host's environment is read at each launch and never modified.
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace vexil {

// One change: a value sets the variable, none removes it.
struct EnvironmentChange {
  std::string name;
  std::optional<std::string> value;
};
using EnvironmentChanges = std::vector<EnvironmentChange>;
using EnvironmentVariables = std::vector<std::pair<std::string, std::string>>;

// Whether `name` can name a variable: not empty, and without '=' or a NUL.
bool IsVariableName(const std::string& name);
// The host's environment with `changes` applied in order; a variable set keeps its place.
EnvironmentVariables ChildEnvironment(const EnvironmentChanges& changes);

// Platform parts: the host's variables as they are now, and whether two names are the
// same variable (Windows ignores letter case).
EnvironmentVariables HostEnvironment();
bool SameVariable(const std::string& a, const std::string& b);

}  // namespace vexil
