// The fake server's side of the wire: framed reads from stdin, raw and framed writes to
// stdout, and the escape rules its scripts use to spell bytes.
#pragma once

#include <string>

namespace fake {

// The next framed body from stdin; false at end of input.
bool ReadMessage(std::string& body);
// Writes every byte to `descriptor` (1 or 2); ends the process when the client is gone.
void WriteRaw(int descriptor, const std::string& bytes);
std::string Frame(const std::string& body);
// Turns \r, \n, \t, \\ and \xHH into the bytes they name.
std::string Unescape(const std::string& text);

}  // namespace fake
