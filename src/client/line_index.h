// Where each line of a text begins, for converting many protocol positions to byte
// offsets and back without walking the text from its start each time.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "vexil/client/text_edits.h"

namespace vexil {

class LineIndex {
 public:
  // `text` must outlive the index.
  explicit LineIndex(const std::string& text);

  std::size_t Offset(const LSP::Position& position, LSP::PositionEncoding encoding) const;
  LSP::Position PositionOf(std::size_t offset, LSP::PositionEncoding encoding) const;

 private:
  // The offset of the line break that ends `line`, or of the text's end.
  std::size_t LineEnd(std::size_t line) const;

  const std::string& text_;
  std::vector<std::size_t> starts_;  // the offset of each line's first byte
};

}  // namespace vexil
