// Reading and writing arrays of model objects, shared by every structure and result
// that holds a list: one rule for a missing member, a non-array and a bad element.
#pragma once

#include <vector>

#include "json/json_errors.h"
#include "json/rapidjson.h"

namespace LSP {

// Appends every element of `array` read as a T. An element that cannot be read is
// reported with the caught text and the array's type number.
template <typename T>
void ReadArrayElements(const JsonValue& array, std::vector<T>& items) {
  items.reserve(items.size() + array.Size());  // a completion list can hold thousands of items
  for (const JsonValue& element : array.GetArray()) {
    // Read in place, not moved in: an item that fails to read is taken out again.
    items.emplace_back();
    try {
      items.back().Read(xObject(element));
    } catch (const std::exception& e) {
      items.pop_back();
      ThrowFormatted("Error:%s\n\nExpecting a %s JSON object but found %d JSON object.", e.what(), "array",
                     static_cast<int>(array.GetType()));
    }
  }
}

// Reads `value` as an array of T; a value of another type throws.
template <typename T>
void ReadArrayValue(const JsonValue& value, std::vector<T>& items) {
  if (!value.IsArray())
    ThrowFormatted("Expecting a %s JSON object but found %d JSON object .", "array", static_cast<int>(value.GetType()));
  ReadArrayElements(value, items);
}

// Reads the array member `name`: a missing member leaves `items` as it is, a member of
// another type throws.
template <typename T>
void ReadArray(const xObject& value, const char* name, std::vector<T>& items) {
  if (value.HasObject(name)) ReadArrayValue(value.Value()[name], items);
}

// Writes `items` as the array member `name`, each element as a bare object.
template <typename T>
void WriteArray(xWriter& writer, const char* name, std::vector<T>& items) {
  writer.StartArray(name);
  for (T& item : items) writer.Object(item, false);
  writer.EndArray();
}

}  // namespace LSP
