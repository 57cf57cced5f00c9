// UriToFile (and FileToUri) on arbitrary text: either gives a string, never a crash or a
// text longer than the platform's path limit (259 characters on Windows).
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "vexil/client/uri.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);  // cut at the first NUL, as a C string is
  constexpr std::size_t kLimit = PATH_MAX - 1;
  if (UriToFile(text.c_str()).size() > kLimit) std::abort();
  if (FileToUri(text.c_str()).size() > kLimit) std::abort();
  return 0;
}
