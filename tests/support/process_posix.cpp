// POSIX process control for tests.
// A signal 0 probe answers whether a process still exists.
#include <signal.h>

#include "vexil_test/support.h"

namespace vexil_test {

void KillProcess(int id) {
  if (id > 0) kill(id, SIGKILL);
}

bool ProcessExists(int id) { return id > 0 && kill(id, 0) == 0; }

}  // namespace vexil_test
