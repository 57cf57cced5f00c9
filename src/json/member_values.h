// What a typed member look-up makes of a member once it has been found: the fixed
// default, the value, or the type error. Shared by xObject and by Members.
#pragma once

#include <cstdint>
#include <exception>
#include <string>
#include <vector>

#include "json/rapidjson.h"

namespace LSP {

// "Expecting a '<expected>' JSON object but found '<type of found>' JSON object."
[[noreturn]] void ThrowTypeMismatch(const char* expected, const JsonValue& found);
// The texts with which Bool and Object report a failure of their look-up.
[[noreturn]] void ThrowBoolFailure(const char* name, const std::exception& e);
[[noreturn]] void ThrowObjectFailure(const char* name, const std::exception& e);

// In each, `member` is the member found, or null when it is missing or null.

inline int IntMember(const JsonValue* member) {
  if (!member) return -1;
  if (!member->IsInt()) ThrowTypeMismatch("int", *member);
  return member->GetInt();
}

inline std::string StringMember(const JsonValue* member) {
  if (!member) return std::string();
  if (!member->IsString()) ThrowTypeMismatch("string", *member);
  return std::string(member->GetString(), member->GetStringLength());
}

// A type error names the member: "<name>\nFailed to read JSON bool: <error>".
bool BoolMember(const JsonValue* member, const char* name);
double DoubleMember(const JsonValue* member);
std::int64_t Int64Member(const JsonValue* member);
unsigned UIntMember(const JsonValue* member);
std::uint64_t UInt64Member(const JsonValue* member);
std::vector<int> IntegersMember(const JsonValue* member);
std::vector<std::string> StringsMember(const JsonValue* member);

}  // namespace LSP
