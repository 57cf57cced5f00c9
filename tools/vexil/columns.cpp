// Column conversion for the command-line host, through the library's position helpers.
// Its runs are short and its files few, so every file it converts in is read once and kept.
#include "columns.h"

#include <algorithm>
#include <climits>
#include <map>
#include <mutex>

#include "session.h"
#include "vexil/client/text_edits.h"

namespace cli {
namespace {

std::mutex textsMutex;
std::map<std::string, std::string> texts;  // by path

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

}  // namespace

const std::string& TextOf(const std::string& path) {
  std::lock_guard<std::mutex> lock(textsMutex);
  auto found = texts.find(path);
  if (found == texts.end()) found = texts.emplace(path, ReadText(path)).first;
  // Map entries stay where they are until erased, and only Reread erases.
  return found->second;
}

void Reread(const std::string& path) {
  std::lock_guard<std::mutex> lock(textsMutex);
  texts.erase(path);
}

std::string LineOf(const std::string& path, int line) {
  const std::string& text = TextOf(path);
  std::size_t start = LSP::PositionToOffset(text, LSP::Position(line, 0));
  std::size_t end = LSP::PositionToOffset(text, LSP::Position(line, INT_MAX));
  return start < end ? text.substr(start, end - start) : "";
}

LSP::Position ProtocolPosition(const std::string& text, int line, int column) {
  std::size_t start = LSP::PositionToOffset(text, LSP::Position(line - 1, 0));
  std::size_t end = LSP::PositionToOffset(text, LSP::Position(line - 1, INT_MAX));
  return LSP::OffsetToPosition(text, std::min(start + static_cast<std::size_t>(column - 1), end));
}

int ByteColumn(const std::string& text, const LSP::Position& position) {
  std::size_t start = LSP::PositionToOffset(text, LSP::Position(position.line, 0));
  return static_cast<int>(LSP::PositionToOffset(text, position) - start) + 1;
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
