// JSON kept as text: what a server sent, stored to be sent back unchanged (completion items,
// call hierarchy items, diagnostics, command arguments), and free-form values from the host.
#pragma once

#include <string>

#include "json/rapidjson.h"

namespace LSP {

// Parses `json` (iteratively); false, with the parser's English text in `error`, when it is
// not JSON or nests deeper than the library may walk when writing it out.
bool ParseJsonText(const std::string& json, JsonDocument& document, std::string& error);

// The value as compact JSON text; "" for a null or missing value.
std::string RawJsonText(const xObject& value);

// RawJsonText for values taken by the thousand (the items of a completion list): one
// buffer and one writer serve them all.
class RawJsonTexts {
 public:
  RawJsonTexts() : writer_(buffer_) {}
  std::string Text(const xObject& value);

 private:
  rapidjson::StringBuffer buffer_;
  rapidjson::Writer<rapidjson::StringBuffer> writer_;
};

// Writes `json` as the member `name`; nothing when `json` is empty. Text that is not JSON
// throws "Invalid JSON for <name>: <parser's text>".
void WriteRawJson(xWriter& writer, const char* name, const std::string& json);

// Writes `json`, an object's text, as an element of the array being written.
void WriteRawElement(xWriter& writer, const std::string& json);

// Writes every member of the object `json` into the object being written.
void WriteRawMembers(xWriter& writer, const std::string& json);

}  // namespace LSP
