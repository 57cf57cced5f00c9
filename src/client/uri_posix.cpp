// Path and URI conversion where the shell's URL functions do not exist: RFC 8089 file URIs
// with an empty authority, every byte but unreserved characters and '/' percent-encoded.
#include <climits>
#include <string>

#include "client/uri_platform.h"

namespace vexil {
namespace {

const char kScheme[] = "file://";
const char kLocalHost[] = "localhost";

// ASCII letters and digits, whatever locale the host has set.
bool IsUnreserved(unsigned char byte) {
  return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') || (byte >= '0' && byte <= '9') ||
         byte == '-' || byte == '.' || byte == '_' || byte == '~';
}

// Paths and URIs as long as the system's own paths may be, terminator included.
bool FitsBuffer(const std::string& text) { return text.size() < PATH_MAX; }

// The value of one hex digit, or -1.
int HexValue(char digit) {
  if (digit >= '0' && digit <= '9') return digit - '0';
  if (digit >= 'a' && digit <= 'f') return digit - 'a' + 10;
  if (digit >= 'A' && digit <= 'F') return digit - 'A' + 10;
  return -1;
}

char AsciiLower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

// Case-insensitive prefix test (`prefix` in lower case), as schemes and host names compare.
bool StartsWithNoCase(const std::string& text, std::string::size_type at, const char* prefix) {
  for (; *prefix; ++prefix, ++at) {
    if (at >= text.size() || AsciiLower(text[at]) != *prefix) return false;
  }
  return true;
}

// Where the path of a local file URI begins ("file:///..." or "file://localhost/..."),
// or npos for any other scheme or authority.
std::string::size_type PathStart(const std::string& uri) {
  if (!StartsWithNoCase(uri, 0, kScheme)) return std::string::npos;
  std::string::size_type at = sizeof kScheme - 1;
  if (StartsWithNoCase(uri, at, kLocalHost)) at += sizeof kLocalHost - 1;
  return at < uri.size() && uri[at] == '/' ? at : std::string::npos;
}

// Percent-decodes `text`; false for a malformed escape or an encoded NUL, which no
// path can hold.
bool PercentDecode(const std::string& text, std::string& decoded) {
  for (std::string::size_type i = 0; i < text.size(); ++i) {
    if (text[i] != '%') {
      decoded += text[i];
      continue;
    }
    const int high = i + 2 < text.size() ? HexValue(text[i + 1]) : -1;
    const int low = high >= 0 ? HexValue(text[i + 2]) : -1;
    if (low < 0 || (high | low) == 0) return false;
    decoded += static_cast<char>(high * 16 + low);
    i += 2;
  }
  return true;
}

}  // namespace

std::string PlatformFileToUri(const std::string& path) {
  static const char kHex[] = "0123456789ABCDEF";
  std::string uri = kScheme;
  for (char c : path) {
    const unsigned char byte = static_cast<unsigned char>(c == '\\' ? '/' : c);
    if (IsUnreserved(byte) || byte == '/') {
      uri += static_cast<char>(byte);
    } else {
      uri += '%';
      uri += kHex[byte >> 4];
      uri += kHex[byte & 15];
    }
  }
  // Only absolute paths have a file URI.
  const bool absolute = uri.size() > sizeof kScheme - 1 && uri[sizeof kScheme - 1] == '/';
  return absolute && FitsBuffer(uri) ? uri : "";
}

std::string PlatformUriToFile(const std::string& uri) {
  const std::string::size_type start = PathStart(uri);
  if (start == std::string::npos) return "";
  // A query or fragment is not part of the path; encoded '?' and '#' are.
  const std::string::size_type end = uri.find_first_of("?#", start);
  std::string path;
  if (!PercentDecode(uri.substr(start, end - start), path)) return "";
  return FitsBuffer(path) ? path : "";
}

}  // namespace vexil
