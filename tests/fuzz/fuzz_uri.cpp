// UriToFile (and FileToUri) on arbitrary text: either gives a string, never a crash or a
// text longer than the 259 characters a path may have.
#include <cstdint>
#include <cstdlib>
#include <string>

#include "vexil/client/uri.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);  // cut at the first NUL, as a C string is
  if (UriToFile(text.c_str()).size() > 259) std::abort();
  if (FileToUri(text.c_str()).size() > 259) std::abort();
  return 0;
}
