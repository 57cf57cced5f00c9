// Text helpers for hosts: protocol positions converted to byte offsets in UTF-8 text and
// back, and text edits applied to a text the way the protocol defines them.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "vexil/protocol/structures.h"

namespace LSP {

// What a position's character counts: UTF-16 code units (the protocol's default) or
// bytes of UTF-8.
enum class PositionEncoding { Utf16 = 0, Utf8 = 1 };

// The byte offset in `text` of `position`. Lines end at "\n", "\r\n" or "\r". A character
// past the end of its line means the line's end (before its line break), a line past the
// last means the end of the text, a negative number means 0, and a position inside a
// surrogate pair or a UTF-8 sequence rounds down to its start. A byte that is not valid
// UTF-8 counts as one character.
VEXIL_API std::size_t PositionToOffset(const std::string& text, const Position& position,
                                       PositionEncoding encoding = PositionEncoding::Utf16);

// The position of the byte `offset` of `text`; an offset past the end means the end, one
// inside a UTF-8 sequence or a "\r\n" rounds down to its start.
VEXIL_API Position OffsetToPosition(const std::string& text, std::size_t offset,
                                    PositionEncoding encoding = PositionEncoding::Utf16);

// Applies `edits` to `text`. As the protocol defines them, every range refers to the
// original text and inserts at one place keep their order in the list. Edits whose
// ranges overlap, or a range that ends before it starts, are refused: `text` is left as
// it was, `error` says which, and the result is false.
VEXIL_API bool ApplyTextEdits(std::string& text, const std::vector<TextEdit>& edits, std::string& error,
                              PositionEncoding encoding = PositionEncoding::Utf16);

}  // namespace LSP
