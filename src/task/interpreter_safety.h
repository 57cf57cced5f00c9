// Whether a file name would be read as syntax by the command interpreter. Names come from
// the watched tree, which may be someone else's repository, so such a name is never run.
#pragma once

#include <string>

namespace vexil {

// True when `value` holds a character the platform's command interpreter treats
// specially (a separator, a redirection, a quote, an expansion, a wildcard or a newline).
bool InterpreterWouldInterpret(const std::string& value);

}  // namespace vexil
