// Running a task's words on Windows: one command line quoted as the C runtime splits it,
// the process created with the host's handles, and waited for.
#include <windows.h>

#include <cstdio>

#include "run_words.h"

namespace cli {
namespace {

// A word as the runtime's argument splitting gives it back: quoted when it holds a blank
// or a quote, backslashes doubled only before a quote.
std::string Quoted(const std::string& word) {
  if (!word.empty() && word.find_first_of(" \t\"") == std::string::npos) return word;
  std::string quoted = "\"";
  std::size_t backslashes = 0;
  for (char c : word) {
    if (c == '\\') {
      ++backslashes;
      continue;
    }
    quoted.append(c == '"' ? 2 * backslashes + 1 : backslashes, '\\');
    backslashes = 0;
    quoted += c;
  }
  quoted.append(2 * backslashes, '\\');
  return quoted + "\"";
}

}  // namespace

int RunProgram(const std::vector<std::string>& words) {
  std::string line;
  for (const std::string& word : words) line += (line.empty() ? "" : " ") + Quoted(word);
  STARTUPINFOA startup = {};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION process = {};
  if (words.empty() || !CreateProcessA(nullptr, &line[0], nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup, &process)) {
    std::fprintf(stderr, "vexil: %s: cannot run it (error %lu)\n", words.empty() ? "" : words[0].c_str(), GetLastError());
    return 127;
  }
  WaitForSingleObject(process.hProcess, INFINITE);
  DWORD code = 1;
  GetExitCodeProcess(process.hProcess, &code);
  CloseHandle(process.hThread);
  CloseHandle(process.hProcess);
  std::fprintf(stderr, "vexil: exit status %lu\n", code);
  return static_cast<int>(code);
}

std::string SelfPath() {
  char path[MAX_PATH];
  DWORD length = GetModuleFileNameA(nullptr, path, MAX_PATH);
  return length > 0 && length < MAX_PATH ? std::string(path, length) : "vexil.exe";
}

// cmd.exe expands %ERRORLEVEL% when it reads the line, before the command has run, so the
// interpreter's status cannot be reported there.
std::string ReportingStatus(const std::string& text) { return text; }

}  // namespace cli
