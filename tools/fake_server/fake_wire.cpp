// Byte-level helpers of the fake server: a small Content-Length reader over stdin and
// writers that give up quietly when the client has closed its end.
#include "fake_wire.h"

#include <cctype>
#include <cstdlib>

#include "fake_os.h"

namespace fake {
namespace {

std::string pending;  // bytes read from stdin but not yet used

bool Fill() {
  char buffer[65536];
  long count = ReadInput(buffer, sizeof buffer);
  if (count <= 0) return false;
  pending.append(buffer, static_cast<std::size_t>(count));
  return true;
}

// Reads header lines up to the blank one; the length is 0 when none was given.
bool ReadLength(std::size_t& length) {
  length = 0;
  for (;;) {
    std::size_t end;
    while ((end = pending.find("\r\n")) == std::string::npos) {
      if (!Fill()) return false;
    }
    std::string line = pending.substr(0, end);
    pending.erase(0, end + 2);
    if (line.empty()) return true;
    static const std::string header = "content-length:";
    std::string name = line.substr(0, header.size());
    for (char& c : name) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    if (name == header) length = std::strtoul(line.c_str() + header.size(), nullptr, 10);
  }
}

}  // namespace

bool ReadMessage(std::string& body) {
  std::size_t length = 0;
  if (!ReadLength(length)) return false;
  while (pending.size() < length) {
    if (!Fill()) return false;
  }
  body = pending.substr(0, length);
  pending.erase(0, length);
  return true;
}

void WriteRaw(int descriptor, const std::string& bytes) {
  std::size_t done = 0;
  while (done < bytes.size()) {
    long count = WriteOutput(descriptor, bytes.data() + done, static_cast<unsigned>(bytes.size() - done));
    if (count <= 0) std::_Exit(0);
    done += static_cast<std::size_t>(count);
  }
}

std::string Frame(const std::string& body) {
  return "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

std::string Unescape(const std::string& text) {
  std::string bytes;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '\\' || i + 1 == text.size()) {
      bytes += text[i];
      continue;
    }
    char code = text[++i];
    if (code == 'r') bytes += '\r';
    else if (code == 'n') bytes += '\n';
    else if (code == 't') bytes += '\t';
    else if (code == 'x' && i + 2 < text.size() && std::isxdigit(static_cast<unsigned char>(text[i + 1]))) {
      bytes += static_cast<char>(std::strtol(text.substr(i + 1, 2).c_str(), nullptr, 16));
      i += 2;
    } else bytes += code;
  }
  return bytes;
}

}  // namespace fake
