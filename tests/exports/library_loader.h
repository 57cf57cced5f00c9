// Loading the library at run time and finding a symbol in it by name, the way a host
// that loads modules does (dlopen/dlsym, LoadLibrary/GetProcAddress).
#pragma once

#include <string>

namespace exports_test {

// Null when the library cannot be loaded; the text of the failure goes to `error`.
void* LoadLibraryAt(const std::string& path, std::string& error);
void* FindSymbol(void* library, const std::string& name);
void UnloadLibrary(void* library);

}  // namespace exports_test
