// The host's process on Windows: the console's Ctrl-C and Ctrl-Break taken by a handler,
// children found through a process snapshot. Exit codes of children are not collected.
#include <windows.h>
#include <tlhelp32.h>
#include <io.h>

#include <thread>
#include <vector>

#include "host_process.h"

namespace cli {
namespace {

constexpr int kSigInt = 2;

std::vector<DWORD> Descendants() {
  std::vector<PROCESSENTRY32> processes;
  HANDLE snapshot = CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0);
  if (snapshot == INVALID_HANDLE_VALUE) return {};
  PROCESSENTRY32 entry{};
  entry.dwSize = sizeof entry;
  for (BOOL more = Process32First(snapshot, &entry); more; more = Process32Next(snapshot, &entry)) {
    processes.push_back(entry);
  }
  CloseHandle(snapshot);
  std::vector<DWORD> found;
  std::vector<DWORD> parents = {GetCurrentProcessId()};
  while (!parents.empty()) {
    DWORD parent = parents.back();
    parents.pop_back();
    for (const PROCESSENTRY32& process : processes) {
      if (process.th32ParentProcessID != parent || process.th32ProcessID == parent) continue;
      found.push_back(process.th32ProcessID);
      parents.push_back(process.th32ProcessID);
    }
  }
  return found;
}

BOOL WINAPI OnControl(DWORD kind) {
  if (kind != CTRL_C_EVENT && kind != CTRL_BREAK_EVENT) return FALSE;
  std::thread([] { EndAfterInterrupt(kSigInt); }).detach();
  return TRUE;
}

}  // namespace

void WatchProcess() { SetConsoleCtrlHandler(OnControl, TRUE); }

void EndChildren() {
  for (DWORD pid : Descendants()) {
    HANDLE process = OpenProcess(PROCESS_TERMINATE, FALSE, pid);
    if (!process) continue;
    TerminateProcess(process, 1);
    CloseHandle(process);
  }
}

std::string LastExit() { return ""; }

bool ErrorsToTerminal() { return _isatty(_fileno(stderr)) != 0; }

}  // namespace cli
