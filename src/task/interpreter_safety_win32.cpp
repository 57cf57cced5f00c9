// The characters cmd.exe gives a meaning to: command separators, pipes, redirections,
// its escape, variable expansion, quotes and the newline.
#include "task/interpreter_safety.h"

namespace vexil {

bool InterpreterWouldInterpret(const std::string& value) {
  return value.find_first_of("&|<>^%\"\n") != std::string::npos;
}

}  // namespace vexil
