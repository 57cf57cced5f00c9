// `vexil lsp`: starts one server, performs the actions in order, prints each answer, and
// ends the server. Any failed action makes the exit status 1.
#include <iostream>

#include "commands.h"
#include "lsp_options.h"
#include "render.h"
#include "trace_sink.h"

namespace cli {

int RunLsp(const Arguments& arguments) {
  LspOptions options = ParseLspOptions(arguments);
  Session session(options.session);
  std::string why;
  bool started = session.Start();
  if (session.Failed(why) || !started) {
    std::cerr << "vexil: " << options.session.program << " did not start: "
              << (why.empty() ? "the server is not running" : why) << "\n";
    return 1;
  }
  int status = 0;
  for (const Action& action : options.actions) {
    Outcome outcome = Perform(session, action);
    if (options.json) PrintJson(std::cout, action, outcome);
    else PrintReadable(std::cout, action, outcome);
    if (outcome.failed) {
      status = 1;
      if (!IsQuery(action.kind)) std::cerr << "vexil: " << Describe(action) << " failed: " << outcome.why << "\n";
    }
  }
  std::cout.flush();
  if (!session.Stop()) {
    std::cerr << "vexil: " << options.session.program << " did not end after exit\n";
    status = 1;
  }
  return status;
}

}  // namespace cli
