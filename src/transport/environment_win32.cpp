// The host's environment on Windows: the process's environment block in UTF-16, turned
// into UTF-8; names compare without letter case, as the system compares them.
#include "transport/environment.h"

#include <windows.h>

#include <algorithm>
#include <cwchar>

namespace vexil {
namespace {

std::string Utf8(const wchar_t* text, std::size_t length) {
  if (length == 0) return {};
  const int size = WideCharToMultiByte(CP_UTF8, 0, text, static_cast<int>(length), nullptr, 0, nullptr, nullptr);
  std::string narrow(static_cast<std::size_t>(size), '\0');
  WideCharToMultiByte(CP_UTF8, 0, text, static_cast<int>(length), narrow.data(), size, nullptr, nullptr);
  return narrow;
}

// The block and its release, on every path.
class EnvironmentBlock {
 public:
  EnvironmentBlock() : block_(GetEnvironmentStringsW()) {}
  ~EnvironmentBlock() {
    if (block_) FreeEnvironmentStringsW(block_);
  }
  EnvironmentBlock(const EnvironmentBlock&) = delete;
  EnvironmentBlock& operator=(const EnvironmentBlock&) = delete;
  const wchar_t* Get() const { return block_; }

 private:
  wchar_t* block_;
};

}  // namespace

EnvironmentVariables HostEnvironment() {
  EnvironmentVariables variables;
  EnvironmentBlock block;
  for (const wchar_t* entry = block.Get(); entry && *entry; entry += std::wcslen(entry) + 1) {
    // Names of the hidden per-drive directories start with '=' ("=C:=C:\work").
    const wchar_t* equals = std::wcschr(entry + 1, L'=');
    if (!equals) continue;
    variables.emplace_back(Utf8(entry, static_cast<std::size_t>(equals - entry)), Utf8(equals + 1, std::wcslen(equals + 1)));
  }
  return variables;
}

bool SameVariable(const std::string& a, const std::string& b) {
  auto lower = [](unsigned char c) { return c >= 'A' && c <= 'Z' ? c + ('a' - 'A') : c; };
  return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                    [&](char x, char y) { return lower(static_cast<unsigned char>(x)) == lower(static_cast<unsigned char>(y)); });
}

}  // namespace vexil
