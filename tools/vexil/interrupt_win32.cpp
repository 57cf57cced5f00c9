// The interrupt on Windows: the console's Ctrl-C and Ctrl-Break handler signals an
// event that the waiting thread sleeps on.
#include <windows.h>

#include "interrupt.h"

namespace cli {
namespace {

HANDLE interrupted = nullptr;

BOOL WINAPI OnControl(DWORD kind) {
  if (kind != CTRL_C_EVENT && kind != CTRL_BREAK_EVENT) return FALSE;
  SetEvent(interrupted);
  return TRUE;
}

}  // namespace

void PrepareForInterrupt() {
  interrupted = CreateEventA(nullptr, TRUE, FALSE, nullptr);
  SetConsoleCtrlHandler(OnControl, TRUE);
}

void WaitForInterrupt() { WaitForSingleObject(interrupted, INFINITE); }

}  // namespace cli
