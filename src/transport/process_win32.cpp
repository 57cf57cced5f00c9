// Child processes on Windows through Poco, which hands the working directory to
// CreateProcess itself; error texts come from the system message table.
#include "transport/process.h"

#include <windows.h>

#include <string>

#include <Poco/Exception.h>
#include <Poco/Process.h>

namespace vexil {
namespace {

std::wstring Utf16(const std::string& text) {
  if (text.empty()) return {};
  const int size = MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), nullptr, 0);
  std::wstring wide(static_cast<std::size_t>(size), L'\0');
  MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), wide.data(), size);
  return wide;
}

// Why the system refused to create the process. By the time the library's exception is
// caught the thread's last error is often overwritten (the first exception a thread throws
// sets up the unwinder, which resets it), so the creation is asked for again, suspended,
// and the system's answer taken at once. Should it succeed this time, the probe is ended.
DWORD RepeatedLaunchError(const std::string& executable, const std::string& directory) {
  std::wstring commandLine = L"\"" + Utf16(executable) + L"\"";
  const std::wstring where = Utf16(directory);
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION probe{};
  if (!CreateProcessW(nullptr, commandLine.data(), nullptr, nullptr, FALSE, CREATE_SUSPENDED | CREATE_NO_WINDOW,
                      nullptr, where.empty() ? nullptr : where.c_str(), &startup, &probe)) {
    return GetLastError();
  }
  TerminateProcess(probe.hProcess, 1);
  CloseHandle(probe.hThread);
  CloseHandle(probe.hProcess);
  return ERROR_SUCCESS;
}

// What the child's environment block is made of: nothing (the host's own block is
// inherited) unless the host changed something, and then every variable, since a block
// given to the system replaces the host's whole environment.
Poco::Process::Env ChildBlock(const EnvironmentChanges& changes) {
  Poco::Process::Env block;
  if (changes.empty()) return block;
  for (auto& [name, value] : ChildEnvironment(changes)) block[name] = value;
  return block;
}

}  // namespace

struct xProcess::Child {
  explicit Child(const Poco::ProcessHandle& handle) : handle(handle) {}
  Poco::ProcessHandle handle;
};

xProcess::xProcess() = default;
xProcess::~xProcess() = default;

void xProcess::Launch(const std::string& executable, const std::vector<std::string>& arguments,
                      const std::string& directory, Poco::Pipe* in, Poco::Pipe* out, Poco::Pipe* err,
                      const EnvironmentChanges& environment) {
  // A closed pipe would leave the child the host's own stream.
  if ((in && in->readHandle() == INVALID_HANDLE_VALUE) || (out && out->writeHandle() == INVALID_HANDLE_VALUE) ||
      (err && err->writeHandle() == INVALID_HANDLE_VALUE)) {
    SetLastError(ERROR_INVALID_HANDLE);
    throw Poco::IOException("Cannot redirect the standard streams of: " + executable);
  }
  try {
    child_ = std::make_unique<Child>(
        Poco::Process::launch(executable, arguments, directory, in, out, err, ChildBlock(environment)));
  } catch (const Poco::SystemException&) {
    // LastSystemErrorText() in the caller's handler then names the real cause.
    SetLastError(RepeatedLaunchError(executable, directory));
    throw;
  }
}

bool xProcess::IsRunning() {
  if (!child_) return false;
  try {
    return Poco::Process::isRunning(child_->handle);
  } catch (const std::exception&) {
    return false;
  }
}

bool xProcess::Ended(int& status) {
  if (!child_ || IsRunning()) return false;
  try {
    status = child_->handle.tryWait();
  } catch (const std::exception&) {
    status = -1;
  }
  return true;
}

int xProcess::Id() const { return child_ ? static_cast<int>(child_->handle.id()) : -1; }

// An ended Windows child leaves nothing to collect once its handle is closed.
void xProcess::Abandon() { child_.reset(); }

CommandInterpreter SystemCommandInterpreter() { return {"cmd.exe", "/C"}; }

std::string LastSystemErrorText() {
  DWORD code = GetLastError();
  LPSTR buffer = nullptr;
  DWORD size = FormatMessageA(
      FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS, nullptr, code,
      MAKELANGID(LANG_NEUTRAL, SUBLANG_DEFAULT), reinterpret_cast<LPSTR>(&buffer), 0, nullptr);
  std::string text = size > 0 && buffer ? std::string(buffer, size) : std::string();
  if (buffer) LocalFree(buffer);
  return text.empty() ? text : text + "\n";
}

}  // namespace vexil
