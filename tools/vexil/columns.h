// Columns as people and compilers count them (bytes from 1) and as the protocol does
// (UTF-16 units from 0), converted through the text of the file they are in.
#pragma once

#include <string>

#include "vexil/protocol/structures.h"

namespace cli {

// The text of the file at `path` as this run first read it, "" when it cannot be read.
// Positions of an answer refer to the text the server was given, so a file is read once
// and kept until Reread, even after edits were written to it.
const std::string& TextOf(const std::string& path);
// Forgets the kept text of `path`: it is read again when next asked for.
void Reread(const std::string& path);

// Line `line` (from 0) of the file at `path`, without its line end; "" past the end.
std::string LineOf(const std::string& path, int line);
// The protocol position of one-based `line` and byte `column` in `text`: a column past
// the end of its line means the line's end, a line past the last the text's end.
LSP::Position ProtocolPosition(const std::string& text, int line, int column);
// The one-based byte column of a protocol position in `text`.
int ByteColumn(const std::string& text, const LSP::Position& position);

// The first place where `text` is not UTF-8, as "line L, column C"; "" when it all is.
std::string NotUtf8At(const std::string& text);

}  // namespace cli
