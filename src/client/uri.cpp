// The rules of the path and URI conversion that hold on every platform: empty input gives
// an empty result, and a path never starts with a backslash (UNC prefixes are dropped).
#include "vexil/client/uri.h"

#include "client/uri_platform.h"

namespace {

bool IsEmpty(const char* text) { return !text || !*text; }

}  // namespace

std::string FileToUri(const char* path) {
  if (IsEmpty(path)) return "";
  return vexil::PlatformFileToUri(path);
}

std::string UriToFile(const char* uri) {
  if (IsEmpty(uri)) return "";
  std::string path = vexil::PlatformUriToFile(uri);
  path.erase(0, path.find_first_not_of('\\'));
  return path;
}
