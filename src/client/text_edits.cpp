// Applying text edits as the protocol defines them: every range refers to the original
// text, so the edits are sorted, checked for overlaps and spliced in one pass.
#include "vexil/client/text_edits.h"

#include <algorithm>

#include "client/line_index.h"

namespace LSP {
namespace {

struct Span {
  std::size_t start;
  std::size_t end;
  const TextEdit* edit;
};

bool Before(const Position& a, const Position& b) {
  return a.line != b.line ? a.line < b.line : a.character < b.character;
}

// "3:4-3:9": zero-based, as the server sent it.
std::string Describe(const Range& range) {
  return std::to_string(range.start.line) + ":" + std::to_string(range.start.character) + "-" +
         std::to_string(range.end.line) + ":" + std::to_string(range.end.character);
}

}  // namespace

std::size_t PositionToOffset(const std::string& text, const Position& position, PositionEncoding encoding) {
  return vexil::LineIndex(text).Offset(position, encoding);
}

Position OffsetToPosition(const std::string& text, std::size_t offset, PositionEncoding encoding) {
  return vexil::LineIndex(text).PositionOf(offset, encoding);
}

bool ApplyTextEdits(std::string& text, const std::vector<TextEdit>& edits, std::string& error,
                    PositionEncoding encoding) {
  const vexil::LineIndex index(text);
  std::vector<Span> spans;
  spans.reserve(edits.size());
  for (const TextEdit& edit : edits) {
    if (Before(edit.range.end, edit.range.start)) {
      error = "Edit range ends before it starts: " + Describe(edit.range);
      return false;
    }
    spans.push_back({index.Offset(edit.range.start, encoding), index.Offset(edit.range.end, encoding), &edit});
  }
  // Inserts at one place keep their order; an insert comes before a replacement there.
  std::stable_sort(spans.begin(), spans.end(), [](const Span& a, const Span& b) {
    return a.start != b.start ? a.start < b.start : a.end < b.end;
  });
  for (std::size_t k = 1; k < spans.size(); ++k) {
    if (spans[k].start < spans[k - 1].end) {
      error = "Overlapping edits at " + Describe(spans[k - 1].edit->range) + " and " + Describe(spans[k].edit->range);
      return false;
    }
  }
  std::string result;
  result.reserve(text.size());
  std::size_t copied = 0;
  for (const Span& span : spans) {
    result.append(text, copied, span.start - copied);
    result += span.edit->newText;
    copied = span.end;
  }
  result.append(text, copied, std::string::npos);
  text = std::move(result);
  return true;
}

}  // namespace LSP
