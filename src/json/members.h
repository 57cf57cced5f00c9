// The members a model class reads from one object, found in one pass over the object
// rather than by one search per member, which costs most in objects read by the thousand.
#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string>

#include "json/member_values.h"
#include "json/rapidjson.h"

namespace LSP {

// The names a class reads, listed once (a function-local static) with their lengths.
class MemberNames {
 public:
  static constexpr std::size_t kMost = 16;
  // Throws AssertException for more than kMost names or a null one.
  MemberNames(std::initializer_list<const char*> names);

 private:
  friend class Members;
  static constexpr std::uint8_t kNone = 0xFF;
  static constexpr std::size_t kBuckets = 32;  // by length, modulo: names are short

  const char* names_[kMost];
  std::uint32_t lengths_[kMost];
  std::uint8_t next_[kMost];  // the next slot in the same bucket
  std::uint8_t buckets_[kBuckets];
  std::size_t count_ = 0;
};

// Look-ups that give exactly what the same look-ups of xObject give: the first of
// duplicate members wins, a missing or null member yields the default, and a value that is
// not an object, or a name not listed, is handed to xObject itself. Both arguments must
// outlive this.
class Members {
 public:
  Members(const xObject& value, const MemberNames& names);
  Members(const Members&) = delete;
  Members& operator=(const Members&) = delete;

  bool HasObject(const char* name) const {
    const int slot = Slot(name);
    return slot < 0 ? value_.HasObject(name) : Found(slot);
  }
  xObject Object(const char* name) const {
    const int slot = Slot(name);
    if (slot < 0) return value_.Object(name);
    const JsonValue* member = Present(slot);
    return member ? xObject(*member) : xObject();
  }
  bool Bool(const char* name) const {
    const int slot = Slot(name);
    return slot < 0 ? value_.Bool(name) : BoolMember(Present(slot), name);
  }
  int Int(const char* name) const {
    const int slot = Slot(name);
    return slot < 0 ? value_.Int(name) : IntMember(Present(slot));
  }
  std::string String(const char* name) const {
    const int slot = Slot(name);
    return slot < 0 ? value_.String(name) : StringMember(Present(slot));
  }

 private:
  // The listed slot of `name`, or -1 when the look-up must go to xObject. Callers read in
  // the order they listed, passing the very literals they listed, as a rule: the slot
  // after the last one is tried first.
  int Slot(const char* name) const {
    if (indexed_ && next_ < names_.count_ && names_.names_[next_] == name) return static_cast<int>(next_++);
    return SearchSlot(name);
  }
  int SearchSlot(const char* name) const;
  bool Found(int slot) const { return (found_ >> slot & 1u) != 0; }
  // The member in `slot` unless it is missing or null.
  const JsonValue* Present(int slot) const {
    if (!Found(slot)) return nullptr;
    const JsonValue* member = members_[slot];
    return member->IsNull() ? nullptr : member;
  }

  const xObject& value_;
  const MemberNames& names_;
  bool indexed_ = false;
  mutable std::size_t next_ = 0;
  // A bit per slot that holds a member: the slots themselves are left unset, since clearing
  // them cost more than the whole pass over a small object.
  std::uint32_t found_ = 0;
  const JsonValue* members_[MemberNames::kMost];
};

}  // namespace LSP
