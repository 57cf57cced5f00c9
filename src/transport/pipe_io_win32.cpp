// Pipe traffic on Windows: anonymous pipes cannot be waited on, so readers peek in short
// steps until bytes arrive, the writer goes away, or their wait is over.
#include "transport/pipe_io.h"

#include <windows.h>

#include <algorithm>

#include <Poco/Exception.h>

namespace vexil {
namespace {

constexpr DWORD kPeekStepMs = 5;

}  // namespace

PipeWait WaitReadable(const Poco::Pipe& pipe, int milliseconds) {
  const ULONGLONG deadline = GetTickCount64() + static_cast<ULONGLONG>(std::max(milliseconds, 0));
  for (;;) {
    DWORD available = 0;
    if (!PeekNamedPipe(pipe.readHandle(), nullptr, 0, nullptr, &available, nullptr)) {
      // A broken pipe is end of file: let the read report it.
      return GetLastError() == ERROR_BROKEN_PIPE ? PipeWait::Readable : PipeWait::Closed;
    }
    if (available > 0) return PipeWait::Readable;
    if (GetTickCount64() >= deadline) return PipeWait::Quiet;
    Sleep(kPeekStepMs);
  }
}

std::size_t ReadSome(const Poco::Pipe& pipe, char* buffer, std::size_t size) {
  DWORD available = 0;
  if (!PeekNamedPipe(pipe.readHandle(), nullptr, 0, nullptr, &available, nullptr)) {
    if (GetLastError() == ERROR_BROKEN_PIPE) return 0;
    throw Poco::ReadFileException("anonymous pipe");
  }
  // Reading no more than is there keeps ReadFile from blocking.
  DWORD wanted = static_cast<DWORD>(std::min<std::size_t>(size, std::max<DWORD>(available, 1)));
  DWORD count = 0;
  if (ReadFile(pipe.readHandle(), buffer, wanted, &count, nullptr)) return count;
  if (GetLastError() == ERROR_BROKEN_PIPE) return 0;
  throw Poco::ReadFileException("anonymous pipe");
}

void WriteAll(const Poco::Pipe& pipe, const char* data, std::size_t size) {
  while (size > 0) {
    DWORD count = 0;
    DWORD chunk = static_cast<DWORD>(std::min<std::size_t>(size, 1u << 30));
    if (!WriteFile(pipe.writeHandle(), data, chunk, &count, nullptr)) {
      throw Poco::WriteFileException("anonymous pipe");
    }
    data += count;
    size -= count;
  }
}

}  // namespace vexil
