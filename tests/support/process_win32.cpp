// Windows process control for tests.
// A process exists while its handle has not been signalled.
#include <windows.h>

#include "vexil_test/support.h"

namespace vexil_test {

void KillProcess(int id) {
  HANDLE process = OpenProcess(PROCESS_TERMINATE, FALSE, static_cast<DWORD>(id));
  if (!process) return;
  TerminateProcess(process, 9);
  CloseHandle(process);
}

bool ProcessExists(int id) {
  HANDLE process = OpenProcess(SYNCHRONIZE, FALSE, static_cast<DWORD>(id));
  if (!process) return false;
  const bool running = WaitForSingleObject(process, 0) == WAIT_TIMEOUT;
  CloseHandle(process);
  return running;
}

}  // namespace vexil_test
