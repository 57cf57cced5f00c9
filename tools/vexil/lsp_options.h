// The command line of `vexil lsp`: options, the server command after "--", and the
// actions that follow it, checked before anything is launched.
#pragma once

#include <string>
#include <vector>

#include "actions.h"
#include "options.h"
#include "session.h"

namespace cli {

struct LspOptions {
  SessionOptions session;
  bool json = false;
  std::vector<Action> actions;
};

// `arguments` are those after "lsp". Files are resolved against the root, not yet checked.
// Throws UsageError, or HelpRequested for "--help".
LspOptions ParseLspOptions(const std::vector<std::string>& arguments);

}  // namespace cli
