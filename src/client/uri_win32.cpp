// Path and URI conversion on Windows, by the shell's own URL functions, so that URIs look
// exactly as other Windows programs write them. Result codes are not looked at: a refused
// conversion leaves the buffer empty.
#include <windows.h>
#include <shlwapi.h>

#include "client/uri_platform.h"

#if defined(_MSC_VER)
#  pragma comment(lib, "shlwapi.lib")
#endif

namespace vexil {

std::string PlatformFileToUri(const std::string& path) {
  char buffer[kPathBufferSize] = "";
  DWORD size = static_cast<DWORD>(kPathBufferSize);
  UrlCreateFromPathA(path.c_str(), buffer, &size, 0);
  return buffer;
}

std::string PlatformUriToFile(const std::string& uri) {
  char buffer[kPathBufferSize] = "";
  DWORD size = static_cast<DWORD>(kPathBufferSize);
  PathCreateFromUrlA(uri.c_str(), buffer, &size, 0);
  return buffer;
}

}  // namespace vexil
