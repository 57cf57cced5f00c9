// The characters /bin/sh gives a meaning to: command separators, pipes, redirections,
// quotes, escapes, expansions, globbing and the newline.
#include "task/interpreter_safety.h"

namespace vexil {

bool InterpreterWouldInterpret(const std::string& value) {
  return value.find_first_of(";&|`$()<>\\\"'\n*?[") != std::string::npos;
}

}  // namespace vexil
