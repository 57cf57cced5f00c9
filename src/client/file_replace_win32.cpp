// Replacing files on Windows: the final path through links, a temporary file beside the
// target, flushed, then ReplaceFile, which keeps the target's attributes and security.
#include "client/file_replace.h"

#include <windows.h>

#include <algorithm>

namespace vexil {
namespace {

// A handle closed with the scope.
class Handle {
 public:
  explicit Handle(HANDLE handle) : handle_(handle) {}
  ~Handle() {
    if (Valid()) CloseHandle(handle_);
  }
  Handle(const Handle&) = delete;
  Handle& operator=(const Handle&) = delete;
  bool Valid() const { return handle_ != INVALID_HANDLE_VALUE; }
  HANDLE Get() const { return handle_; }

 private:
  HANDLE handle_;
};

constexpr DWORD kShareAll = FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE;

bool WriteAll(HANDLE file, const std::string& text) {
  for (std::size_t written = 0; written < text.size();) {
    const DWORD chunk = static_cast<DWORD>(std::min<std::size_t>(text.size() - written, 1u << 20));
    DWORD count = 0;
    if (!WriteFile(file, text.data() + written, chunk, &count, nullptr) || count == 0) return false;
    written += count;
  }
  return true;
}

// "\\?\C:\a" is "C:\a", "\\?\UNC\host\share" is "\\host\share".
std::string WithoutLongPrefix(std::string path) {
  if (path.rfind("\\\\?\\UNC\\", 0) == 0) return "\\\\" + path.substr(8);
  if (path.rfind("\\\\?\\", 0) == 0) return path.substr(4);
  return path;
}

}  // namespace

bool ResolveFile(const std::string& path, std::string& target, std::string& error) {
  Handle file(CreateFileA(path.c_str(), 0, kShareAll, nullptr, OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS, nullptr));
  if (!file.Valid()) return SystemFailure(error, "Cannot find", path);
  char buffer[MAX_PATH * 4];
  const DWORD length = GetFinalPathNameByHandleA(file.Get(), buffer, sizeof buffer, FILE_NAME_NORMALIZED);
  if (length == 0 || length >= sizeof buffer) return SystemFailure(error, "Cannot find", path);
  target = WithoutLongPrefix(std::string(buffer, length));
  return true;
}

bool ReadWholeFile(const std::string& path, std::string& text, std::string& error) {
  Handle file(CreateFileA(path.c_str(), GENERIC_READ, kShareAll, nullptr, OPEN_EXISTING, 0, nullptr));
  if (!file.Valid()) return SystemFailure(error, "Cannot read", path);
  text.clear();
  char buffer[65536];
  for (;;) {
    DWORD count = 0;
    if (!ReadFile(file.Get(), buffer, sizeof buffer, &count, nullptr)) return SystemFailure(error, "Cannot read", path);
    if (count == 0) return true;
    text.append(buffer, count);
  }
}

bool WriteBeside(const std::string& target, const std::string& text, std::string& temporary, std::string& error) {
  // A read-only file is refused even where the system would let a privileged user open
  // it (wine running as root does).
  const DWORD attributes = GetFileAttributesA(target.c_str());
  if (attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_READONLY)) {
    SetLastError(ERROR_ACCESS_DENIED);
    return SystemFailure(error, "Cannot write", target);
  }
  // The open that a replacement needs: it fails while another program holds the file
  // without sharing its deletion.
  {
    Handle probe(CreateFileA(target.c_str(), GENERIC_WRITE | DELETE, kShareAll, nullptr, OPEN_EXISTING, 0, nullptr));
    if (!probe.Valid()) return SystemFailure(error, "Cannot write", target);
  }
  const std::string::size_type slash = target.find_last_of("\\/");
  const std::string directory = slash == std::string::npos ? "." : target.substr(0, slash);
  char name[MAX_PATH];
  if (GetTempFileNameA(directory.c_str(), "vx", 0, name) == 0) return SystemFailure(error, "Cannot write", target);
  temporary = name;
  Handle file(CreateFileA(name, GENERIC_WRITE, 0, nullptr, TRUNCATE_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr));
  if (!file.Valid() || !WriteAll(file.Get(), text) || !FlushFileBuffers(file.Get()))
    return SystemFailure(error, "Cannot write", target);
  return true;
}

bool ReplaceWith(const std::string& temporary, const std::string& target, std::string& error) {
  if (!ReplaceFileA(target.c_str(), temporary.c_str(), nullptr, REPLACEFILE_IGNORE_MERGE_ERRORS, nullptr, nullptr))
    return SystemFailure(error, "Cannot replace", target);
  return true;
}

void RemoveFile(const std::string& path) { DeleteFileA(path.c_str()); }

}  // namespace vexil
