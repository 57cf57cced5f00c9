// The interrupt on POSIX: SIGINT (and SIGTERM) blocked in every thread and taken
// synchronously with sigwait, so no handler runs inside the library's threads.
#include <signal.h>

#include "interrupt.h"

namespace cli {
namespace {

sigset_t Interrupts() {
  sigset_t set;
  sigemptyset(&set);
  sigaddset(&set, SIGINT);
  sigaddset(&set, SIGTERM);
  return set;
}

}  // namespace

void PrepareForInterrupt() {
  sigset_t set = Interrupts();
  pthread_sigmask(SIG_BLOCK, &set, nullptr);
}

void WaitForInterrupt() {
  sigset_t set = Interrupts();
  int signal = 0;
  sigwait(&set, &signal);
}

}  // namespace cli
