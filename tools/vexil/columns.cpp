// Column conversion for the command-line host. Its runs are short and its files few, so
// every file it converts in is read once and kept.
#include "columns.h"

#include <algorithm>
#include <map>
#include <mutex>
#include <vector>

#include "session.h"
#include "text_edits.h"

namespace cli {
namespace {

// The length of the UTF-8 sequence led by `lead`; 0 for a byte that cannot lead one.
std::size_t SequenceLength(unsigned char lead) {
  if (lead < 0x80) return 1;
  if (lead >= 0xC2 && lead < 0xE0) return 2;
  if (lead >= 0xE0 && lead < 0xF0) return 3;
  if (lead >= 0xF0 && lead < 0xF5) return 4;
  return 0;
}

// The length of the whole UTF-8 sequence at `at`; 0 when it is cut short or malformed.
std::size_t SequenceAt(const std::string& text, std::size_t at) {
  std::size_t length = SequenceLength(static_cast<unsigned char>(text[at]));
  if (length == 0 || at + length > text.size()) return 0;
  for (std::size_t k = 1; k < length; ++k) {
    if ((static_cast<unsigned char>(text[at + k]) & 0xC0) != 0x80) return 0;
  }
  return length;
}

// Steps through `line` a character at a time, a malformed byte counting as one character.
template <typename Visit>
void EachCharacter(const std::string& line, Visit visit) {
  for (std::size_t at = 0; at < line.size();) {
    std::size_t length = std::max<std::size_t>(SequenceAt(line, at), 1);
    // Characters beyond the basic plane take two units.
    if (!visit(at, length == 4 ? 2 : 1)) return;
    at += length;
  }
}

const std::vector<std::string>& LinesOf(const std::string& path) {
  static std::mutex mutex;
  static std::map<std::string, std::vector<std::string>> files;
  std::lock_guard<std::mutex> lock(mutex);
  auto found = files.find(path);
  if (found == files.end()) found = files.emplace(path, SplitLines(ReadText(path))).first;
  return found->second;
}

}  // namespace

std::size_t BytesOf(const std::string& line, int units) {
  std::size_t bytes = 0;
  int counted = 0;
  EachCharacter(line, [&](std::size_t at, int width) {
    if (counted >= units) return false;
    counted += width;
    bytes = std::min(line.size(), at + std::max<std::size_t>(SequenceAt(line, at), 1));
    return true;
  });
  return bytes + static_cast<std::size_t>(std::max(units - counted, 0));
}

int UnitsOf(const std::string& line, std::size_t bytes) {
  int units = 0;
  std::size_t reached = 0;
  EachCharacter(line, [&](std::size_t at, int width) {
    if (at >= bytes) return false;
    units += width;
    reached = at + std::max<std::size_t>(SequenceAt(line, at), 1);
    return true;
  });
  return units + static_cast<int>(bytes > reached ? bytes - reached : 0);
}

std::string LineOf(const std::string& path, int line) {
  const std::vector<std::string>& lines = LinesOf(path);
  if (line < 0 || static_cast<std::size_t>(line) >= lines.size()) return "";
  std::string text = lines[static_cast<std::size_t>(line)];
  if (!text.empty() && text.back() == '\r') text.pop_back();
  return text;
}

LSP::Position ProtocolPosition(const std::string& path, int line, int column) {
  return LSP::Position(line - 1, UnitsOf(LineOf(path, line - 1), static_cast<std::size_t>(column - 1)));
}

int ByteColumn(const std::string& path, const LSP::Position& position) {
  return static_cast<int>(BytesOf(LineOf(path, position.line), position.character)) + 1;
}

std::string NotUtf8At(const std::string& text) {
  int line = 1;
  std::size_t lineStart = 0;
  for (std::size_t at = 0; at < text.size();) {
    std::size_t length = SequenceAt(text, at);
    if (length == 0) return "line " + std::to_string(line) + ", column " + std::to_string(at - lineStart + 1);
    if (text[at] == '\n') {
      ++line;
      lineStart = at + 1;
    }
    at += length;
  }
  return "";
}

}  // namespace cli
