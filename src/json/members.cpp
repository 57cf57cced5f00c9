// One pass over an object's members fills a slot per listed name; look-ups then take the
// slot. Names are matched by length first, so most members cost a few integer compares.
#include "json/members.h"

#include <algorithm>
#include <cstring>
#include <iterator>

#include "json/json_errors.h"
#include "json/member_values.h"
#include "json/short_names.h"

namespace LSP {

MemberNames::MemberNames(std::initializer_list<const char*> names) {
  if (names.size() > kMost) throw AssertException("names.size() <= kMost");
  std::fill(std::begin(buckets_), std::end(buckets_), kNone);
  for (const char* name : names) {
    RequireName(name);
    const std::uint32_t length = static_cast<std::uint32_t>(std::strlen(name));
    names_[count_] = name;
    lengths_[count_] = length;
    next_[count_] = buckets_[length % kBuckets];
    buckets_[length % kBuckets] = static_cast<std::uint8_t>(count_++);
  }
}

Members::Members(const xObject& value, const MemberNames& names) : value_(value), names_(names) {
  const JsonValue& object = value.Value();
  // A null value has no members, like an empty object; any other value goes to xObject.
  if (!object.IsObject() && !object.IsNull()) return;
  indexed_ = true;
  if (object.IsNull()) return;
  std::size_t left = names.count_;
  for (auto member = object.MemberBegin(); left > 0 && member != object.MemberEnd(); ++member) {
    const rapidjson::SizeType length = member->name.GetStringLength();
    const char* text = member->name.GetString();
    for (std::uint8_t slot = names.buckets_[length % MemberNames::kBuckets]; slot != MemberNames::kNone;
         slot = names.next_[slot]) {
      if (names.lengths_[slot] != length || !SameNameBytes(names.names_[slot], text, length)) continue;
      // A later duplicate finds its slot taken: the first one wins, as a search finds it.
      if (!Found(slot)) {
        members_[slot] = &member->value;
        found_ |= 1u << slot;
        --left;
      }
      break;
    }
  }
}

int Members::SearchSlot(const char* name) const {
  if (!indexed_ || !name) return -1;
  for (std::size_t slot = 0; slot < names_.count_; ++slot) {
    if (names_.names_[slot] != name && std::strcmp(names_.names_[slot], name) != 0) continue;
    next_ = slot + 1;
    return static_cast<int>(slot);
  }
  return -1;
}

}  // namespace LSP
