// Run-time loading with LoadLibraryA and GetProcAddress.
#include <windows.h>

#include "library_loader.h"

namespace exports_test {

void* LoadLibraryAt(const std::string& path, std::string& error) {
  HMODULE library = LoadLibraryA(path.c_str());
  if (!library) error = "LoadLibraryA failed with error " + std::to_string(GetLastError());
  return reinterpret_cast<void*>(library);
}

void* FindSymbol(void* library, const std::string& name) {
  return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(library), name.c_str()));
}

void UnloadLibrary(void* library) { FreeLibrary(static_cast<HMODULE>(library)); }

}  // namespace exports_test
