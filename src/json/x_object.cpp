// Typed, read-only access to the members of a parsed JSON value, with fixed defaults
// for missing or null members and a readable error for members of another type.
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <stdexcept>

#include "json/rapidjson.h"
#include "json/json_errors.h"
#include "json/member_values.h"

namespace LSP {
namespace {

const JsonValue& NullValue() {
  static const JsonValue null;
  return null;
}

const char* const kTypeNames[] = {"null", "false", "true", "object", "array ", "string", "number", "Unknown"};

const char* TypeName(const JsonValue& value) { return kTypeNames[static_cast<unsigned>(value.GetType()) & 7u]; }

// The standard string-to-int conversion, with the texts the protocol layer reports.
int DecimalToInt(const std::string& text) {
  const char* begin = text.c_str();
  char* end = nullptr;
  errno = 0;
  long value = std::strtol(begin, &end, 10);
  if (end == begin) throw std::invalid_argument("invalid stoi argument");
  if (errno == ERANGE || value < std::numeric_limits<int>::min() || value > std::numeric_limits<int>::max())
    throw std::out_of_range("stoi argument out of range");
  return static_cast<int>(value);
}

// The member when it has the expected type; null when it is missing or null.
const JsonValue* Expect(const JsonValue* member, const char* expected, bool (JsonValue::*isType)() const) {
  if (member && !(member->*isType)()) ThrowTypeMismatch(expected, *member);
  return member;
}

}  // namespace

xObject::xObject() : value_(&NullValue()) {}
xObject::xObject(const JsonValue& value) : value_(&value) {}

bool xObject::IsInt() const { return value_->IsInt(); }
bool xObject::IsNull() const { return value_->IsNull(); }
bool xObject::IsArray() const { return value_->IsArray(); }
bool xObject::IsObject() const { return value_->IsObject(); }
bool xObject::IsString() const { return value_->IsString(); }

std::string xObject::GetString() const {
  return value_->IsString() ? std::string(value_->GetString(), value_->GetStringLength()) : std::string();
}

int xObject::AsInt() const {
  if (value_->IsString()) return DecimalToInt(GetString());
  if (!value_->IsInt()) ThrowTypeMismatch("int", *value_);
  return value_->GetInt();
}

int xObject::AsInt(int defaultValue) const {
  if (value_->IsString()) return DecimalToInt(GetString());
  return value_->IsInt() ? value_->GetInt() : defaultValue;
}

bool xObject::HasObject(const char* name) const {
  RequireName(name);
  if (value_->IsNull()) return false;
  return value_->HasMember(name);
}

bool xObject::CheckValue(const char* name) const { return Present(name) != nullptr; }

xObject xObject::Object(const char* name) const {
  try {
    const JsonValue* member = Present(name);
    return member ? xObject(*member) : xObject();
  } catch (const std::exception& e) {
    ThrowObjectFailure(name, e);
  }
}

bool xObject::Bool(const char* name) const {
  const JsonValue* member = nullptr;
  try {
    member = Present(name);
  } catch (const std::exception& e) {
    ThrowBoolFailure(name, e);
  }
  return BoolMember(member, name);
}

// One member search serves the presence test and the access.
const JsonValue* xObject::Present(const char* name) const {
  RequireName(name);
  if (value_->IsNull()) return nullptr;
  JsonValue::ConstMemberIterator member = value_->FindMember(name);
  if (member == value_->MemberEnd() || member->value.IsNull()) return nullptr;
  return &member->value;
}

double xObject::Double(const char* name) const { return DoubleMember(Present(name)); }
int xObject::Int(const char* name) const { return IntMember(Present(name)); }
std::int64_t xObject::Int64(const char* name) const { return Int64Member(Present(name)); }
unsigned xObject::UInt(const char* name) const { return UIntMember(Present(name)); }
std::uint64_t xObject::UInt64(const char* name) const { return UInt64Member(Present(name)); }
std::string xObject::String(const char* name) const { return StringMember(Present(name)); }
std::vector<int> xObject::Integers(const char* name) const { return IntegersMember(Present(name)); }
std::vector<std::string> xObject::Strings(const char* name) const { return StringsMember(Present(name)); }

double DoubleMember(const JsonValue* member) {
  member = Expect(member, "double", &JsonValue::IsDouble);
  return member ? member->GetDouble() : 0.0;
}

std::int64_t Int64Member(const JsonValue* member) {
  member = Expect(member, "int64", &JsonValue::IsInt64);
  return member ? member->GetInt64() : -1;
}

unsigned UIntMember(const JsonValue* member) {
  member = Expect(member, "uint", &JsonValue::IsUint);
  return member ? member->GetUint() : 0;
}

std::uint64_t UInt64Member(const JsonValue* member) {
  member = Expect(member, "uint64", &JsonValue::IsUint64);
  return member ? member->GetUint64() : 0;
}

std::vector<int> IntegersMember(const JsonValue* member) {
  std::vector<int> values;
  if ((member = Expect(member, "array", &JsonValue::IsArray))) {
    values.reserve(member->Size());
    for (const JsonValue& element : member->GetArray()) values.push_back(element.GetInt());
  }
  return values;
}

std::vector<std::string> StringsMember(const JsonValue* member) {
  std::vector<std::string> values;
  if ((member = Expect(member, "array", &JsonValue::IsArray))) {
    values.reserve(member->Size());
    for (const JsonValue& element : member->GetArray())
      values.emplace_back(element.GetString(), element.GetStringLength());
  }
  return values;
}

bool BoolMember(const JsonValue* member, const char* name) {
  try {
    member = Expect(member, "bool", &JsonValue::IsBool);
  } catch (const std::exception& e) {
    ThrowBoolFailure(name, e);
  }
  return member && member->GetBool();
}

void ThrowTypeMismatch(const char* expected, const JsonValue& found) {
  ThrowFormatted("Expecting a '%s' JSON object but found '%s' JSON object.", expected, TypeName(found));
}

void ThrowBoolFailure(const char* name, const std::exception& e) {
  ThrowFormatted("%s\nFailed to read JSON bool: %s", name ? name : "", e.what());
}

void ThrowObjectFailure(const char* name, const std::exception& e) {
  ThrowFormatted("%s\nFailed to read JSON object: %s", name ? name : "", e.what());
}

}  // namespace LSP
