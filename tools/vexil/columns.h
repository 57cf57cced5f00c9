// Columns as people and compilers count them (bytes from 1) and as the protocol does
// (UTF-16 units from 0), converted through the text of the line they are on.
#pragma once

#include <string>

#include "vexil/protocol/structures.h"

namespace cli {

// The byte offset into `line` after `units` UTF-16 units; past its end, one byte a unit.
std::size_t BytesOf(const std::string& line, int units);
// The UTF-16 units in the first `bytes` bytes of `line`; past its end, one unit a byte.
int UnitsOf(const std::string& line, std::size_t bytes);

// Line `line` (from 0) of the file at `path`, without its line end; "" past the end or when
// the file cannot be read. Files are read once.
std::string LineOf(const std::string& path, int line);
// The protocol position of one-based `line` and byte `column` in the file at `path`.
LSP::Position ProtocolPosition(const std::string& path, int line, int column);
// The one-based byte column of a protocol position in the file at `path`.
int ByteColumn(const std::string& path, const LSP::Position& position);

// The first place where `text` is not UTF-8, as "line L, column C"; "" when it all is.
std::string NotUtf8At(const std::string& text);

}  // namespace cli
