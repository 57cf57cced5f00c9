// Position and offset conversion over a UTF-8 text whose lines end in "\n", "\r\n" or
// "\r". Characters are counted in UTF-16 units or in bytes; invalid bytes count as one.
#include "client/line_index.h"

#include <algorithm>
#include <cstdint>

namespace vexil {
namespace {

bool IsContinuation(unsigned char byte) { return (byte & 0xC0) == 0x80; }

// The length of the UTF-8 sequence at `at`, which ends before `end`; 1 for a byte that
// does not start a complete sequence.
std::size_t SequenceLength(const std::string& text, std::size_t at, std::size_t end) {
  const unsigned char lead = static_cast<unsigned char>(text[at]);
  const std::size_t length = lead >= 0xF0 && lead < 0xF8 ? 4 : lead >= 0xE0 ? 3 : lead >= 0xC0 ? 2 : 1;
  if (lead >= 0xF8 || at + length > end) return 1;
  for (std::size_t next = at + 1; next < at + length; ++next)
    if (!IsContinuation(static_cast<unsigned char>(text[next]))) return 1;
  return length;
}

// How many units of the encoding a sequence of `length` bytes takes: characters beyond
// the basic plane (four bytes) are a surrogate pair in UTF-16.
std::int64_t Units(std::size_t length, LSP::PositionEncoding encoding) {
  if (encoding == LSP::PositionEncoding::Utf8) return static_cast<std::int64_t>(length);
  return length == 4 ? 2 : 1;
}

}  // namespace

LineIndex::LineIndex(const std::string& text) : text_(text), starts_{0} {
  for (std::size_t at = 0; at < text.size(); ++at) {
    if (text[at] == '\r' && at + 1 < text.size() && text[at + 1] == '\n') ++at;
    if (text[at] == '\n' || text[at] == '\r') starts_.push_back(at + 1);
  }
}

std::size_t LineIndex::LineEnd(std::size_t line) const {
  if (line + 1 >= starts_.size()) return text_.size();
  std::size_t end = starts_[line + 1] - 1;
  if (text_[end] == '\n' && end > starts_[line] && text_[end - 1] == '\r') --end;
  return end;
}

std::size_t LineIndex::Offset(const LSP::Position& position, LSP::PositionEncoding encoding) const {
  const std::size_t line = static_cast<std::size_t>(std::max(position.line, 0));
  if (line >= starts_.size()) return text_.size();
  const std::int64_t wanted = std::max(position.character, 0);
  const std::size_t end = LineEnd(line);
  std::size_t at = starts_[line];
  for (std::int64_t units = 0; at < end && units < wanted;) {
    const std::size_t length = SequenceLength(text_, at, end);
    units += Units(length, encoding);
    if (units > wanted) break;  // inside a surrogate pair: its start
    at += length;
  }
  return at;
}

LSP::Position LineIndex::PositionOf(std::size_t offset, LSP::PositionEncoding encoding) const {
  offset = std::min(offset, text_.size());
  const std::size_t line = static_cast<std::size_t>(std::upper_bound(starts_.begin(), starts_.end(), offset) -
                                                    starts_.begin()) - 1;
  const std::size_t end = LineEnd(line);
  offset = std::min(offset, end);  // inside "\r\n": the line's end
  std::int64_t units = 0;
  for (std::size_t at = starts_[line]; at < offset;) {
    const std::size_t length = SequenceLength(text_, at, end);
    if (at + length > offset) break;  // inside a sequence: its start
    units += Units(length, encoding);
    at += length;
  }
  return LSP::Position(static_cast<int>(line), static_cast<int>(units));
}

}  // namespace vexil
