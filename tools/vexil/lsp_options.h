// The command line of `vexil lsp`: options, the server command after "--", and the
// actions that follow it, checked before anything is launched.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

#include "actions.h"
#include "session.h"

namespace cli {

// Bad usage; the text says what was wrong, the caller adds the usage text.
class UsageError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

struct LspOptions {
  SessionOptions session;
  bool json = false;
  std::vector<Action> actions;
};

// `text` as a number from 1 up; throws UsageError naming `what` otherwise.
int PositiveNumber(const std::string& text, const std::string& what);

// `arguments` are those after "lsp". Throws UsageError.
LspOptions ParseLspOptions(const std::vector<std::string>& arguments);

}  // namespace cli
