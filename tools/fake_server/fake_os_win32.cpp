// Windows side of the fake server's operating-system needs.
// Standard streams are switched to binary so that CR LF in frames passes untouched.
#include "fake_os.h"

#include <direct.h>
#include <fcntl.h>
#include <io.h>
#include <windows.h>

#include <cstdlib>
#include <thread>

namespace fake {

void PrepareProcess(const char*, unsigned lifetimeSeconds) {
  _setmode(0, _O_BINARY);
  _setmode(1, _O_BINARY);
  _setmode(2, _O_BINARY);
  std::thread([lifetimeSeconds] {
    Sleep(lifetimeSeconds * 1000);
    std::_Exit(0);
  }).detach();
}

long ReadInput(char* buffer, unsigned size) { return _read(0, buffer, size); }

// The runtime's descriptor is left alone: the system's handle behind it is what the
// client writes to.
void CloseInput() { CloseHandle(reinterpret_cast<HANDLE>(_get_osfhandle(0))); }

long WriteOutput(int stream, const char* bytes, unsigned size) { return _write(stream, bytes, size); }

std::string CurrentDirectory() {
  char directory[4096];
  return _getcwd(directory, sizeof directory) ? directory : "";
}

void SleepUntilKilled() {
  for (;;) Sleep(INFINITE);
}

void SpawnSelf(const std::string& argument) {
  char path[MAX_PATH];
  if (!GetModuleFileNameA(nullptr, path, MAX_PATH)) return;
  std::string commandLine = std::string("\"") + path + "\" " + argument;
  STARTUPINFOA startup = {};
  startup.cb = sizeof startup;
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdInput = GetStdHandle(STD_INPUT_HANDLE);
  startup.hStdOutput = GetStdHandle(STD_OUTPUT_HANDLE);
  startup.hStdError = GetStdHandle(STD_ERROR_HANDLE);
  PROCESS_INFORMATION process = {};
  if (CreateProcessA(path, &commandLine[0], nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup, &process)) {
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
  }
}

unsigned long ProcessId() { return GetCurrentProcessId(); }

void WaitForProcessEnd(unsigned long id) {
  HANDLE process = OpenProcess(SYNCHRONIZE, FALSE, id);
  if (!process) return;
  WaitForSingleObject(process, INFINITE);
  CloseHandle(process);
}

}  // namespace fake
