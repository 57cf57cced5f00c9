// Run-time loading with dlopen and dlsym.
#include <dlfcn.h>

#include "library_loader.h"

namespace exports_test {

void* LoadLibraryAt(const std::string& path, std::string& error) {
  void* library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (!library) error = dlerror();
  return library;
}

void* FindSymbol(void* library, const std::string& name) { return dlsym(library, name.c_str()); }

void UnloadLibrary(void* library) { dlclose(library); }

}  // namespace exports_test
