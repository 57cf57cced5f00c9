// The JSON layer of the protocol model: typed read access to parsed values, the reader
// that owns a parsed message, the writer that builds one, and the base of every model class.
#pragma once

#include <cstdint>
#include <exception>
#include <memory>
#include <string>
#include <vector>

#include "vexil/export.h"

// The JSON library is an implementation detail: hosts see only these declarations.
namespace rapidjson {
template <typename CharType> struct UTF8;
class CrtAllocator;
template <typename BaseAllocator> class MemoryPoolAllocator;
template <typename Encoding, typename Allocator> class GenericValue;
}  // namespace rapidjson

// A failed internal assertion of the JSON library, carrying the asserted expression.
class VEXIL_API AssertException : public std::exception {
 public:
  explicit AssertException(const char* text) : text_(text ? text : "") {}
  const char* what() const noexcept override { return text_.c_str(); }

 private:
  std::string text_;
};

namespace LSP {

using JsonValue = rapidjson::GenericValue<rapidjson::UTF8<char>,
                                          rapidjson::MemoryPoolAllocator<rapidjson::CrtAllocator>>;

// JSON value types, numbered as the JSON library numbers them.
enum class JsonType { Null = 0, False = 1, True = 2, Object = 3, Array = 4, String = 5, Number = 6 };

// Read-only view of one parsed value. A missing or null member yields a fixed default
// (-1 for signed numbers, 0 for unsigned and floating ones, false, ""); a member of
// another type throws a std::exception naming the expected and the found type.
class VEXIL_API xObject {
 public:
  xObject();  // views a process-wide null value
  xObject(const JsonValue& value);
  xObject(const xObject&) = default;
  xObject& operator=(const xObject&) = default;
  virtual ~xObject() = default;

  bool IsInt() const;
  bool IsNull() const;
  bool IsArray() const;
  bool IsObject() const;
  bool IsString() const;
  const JsonValue& Value() const { return *value_; }
  std::string GetString() const;
  // A number, or a decimal number given as a string (ids and codes may be either).
  int AsInt() const;
  int AsInt(int defaultValue) const;

  bool HasObject(const char* name) const;
  xObject Object(const char* name) const;
  bool Bool(const char* name) const;
  double Double(const char* name) const;
  int Int(const char* name) const;
  std::int64_t Int64(const char* name) const;
  unsigned UInt(const char* name) const;
  std::uint64_t UInt64(const char* name) const;
  std::string String(const char* name) const;
  std::vector<int> Integers(const char* name) const;
  std::vector<std::string> Strings(const char* name) const;

 protected:
  // True when this value is an object holding a non-null member `name`.
  bool CheckValue(const char* name) const;

 private:
  const JsonValue* Present(const char* name) const;  // the non-null member, or null

  const JsonValue* value_;
};

class xWriter;
class xReader;

// Base of every protocol class: named, read from a value or a document, written as members.
class VEXIL_API JsonObject {
 public:
  JsonObject() = default;
  JsonObject(const JsonObject&) = default;
  JsonObject(JsonObject&&) = default;
  JsonObject& operator=(const JsonObject&) = default;
  JsonObject& operator=(JsonObject&&) = default;

  // The key under which the object is written, or its display name.
  virtual const char* Name() const = 0;
  virtual void Read(const xObject& value) = 0;
  // Reads the member Name() of the document's root; throws when it is missing.
  virtual void Read(xReader& reader);
  // Writes the members only; the enclosing braces belong to the caller.
  virtual void Write(xWriter& writer) = 0;

 protected:
  ~JsonObject() = default;
};

// Owns one parsed document, built from the text of one message.
class VEXIL_API xReader {
 public:
  xReader();
  xReader(const xReader&) = delete;
  xReader& operator=(const xReader&) = delete;
  virtual ~xReader();

  // Replaces any earlier document; on failure Error() explains, with a caret under the offset.
  bool Parse(const std::string& text);
  const std::string& Error() const { return error_; }
  xObject Root();
  // The root's member `name`; throws "Document does not contain '<name>' JSON object." when absent.
  xObject Object(const char* name);

 private:
  struct Document;
  std::unique_ptr<Document> document_;
  std::string error_;
};

// Builds compact JSON text. Keyed operations write the key first; String() leaves out
// an empty value together with its key.
class VEXIL_API xWriter {
 public:
  xWriter();
  xWriter(const xWriter&) = delete;
  xWriter& operator=(const xWriter&) = delete;
  virtual ~xWriter();

  void Object(const char* name, JsonObject& value);
  // With `keyed`, value.Name() is the key; without, a bare object (a top-level message or array element).
  void Object(JsonObject& value, bool keyed);
  void String(const char* name, const std::string& value);
  // Writes the member even when `value` is empty.
  void RequiredString(const char* name, const std::string& value);
  void String(const std::string& value);
  void Bool(const char* name, bool value);
  void Int(const char* name, int value);
  void UInt(const char* name, unsigned value);
  void Int64(const char* name, std::int64_t value);
  void UInt64(const char* name, std::uint64_t value);
  void Null(const char* name);
  void StartArray(const char* name);
  void EndArray();
  void Integers(const char* name, const std::vector<int>& values);
  void Strings(const char* name, const std::vector<std::string>& values);
  void Raw(const char* name, const JsonValue& value);
  void RawValue(const std::string& json, JsonType type);
  void StartObject();
  void EndObject();
  std::string GetString() const;

 private:
  void Key(const char* name);

  struct Impl;
  std::unique_ptr<Impl> impl_;
};

// The text of one model object written as a top-level JSON object.
VEXIL_API std::string ToJsonText(JsonObject& value);

}  // namespace LSP
