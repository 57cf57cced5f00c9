// Child processes on Windows through Poco, which hands the working directory to
// CreateProcess itself; error texts come from the system message table.
#include "transport/process.h"

#include <windows.h>

#include <Poco/Exception.h>
#include <Poco/Process.h>

namespace vexil {

struct xProcess::Child {
  explicit Child(const Poco::ProcessHandle& handle) : handle(handle) {}
  Poco::ProcessHandle handle;
};

xProcess::xProcess() = default;
xProcess::~xProcess() = default;

void xProcess::Launch(const std::string& executable, const std::vector<std::string>& arguments,
                      const std::string& directory, Poco::Pipe* in, Poco::Pipe* out, Poco::Pipe* err) {
  child_ = std::make_unique<Child>(Poco::Process::launch(executable, arguments, directory, in, out, err));
}

bool xProcess::IsRunning() {
  if (!child_) return false;
  try {
    return Poco::Process::isRunning(child_->handle);
  } catch (const std::exception&) {
    return false;
  }
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
