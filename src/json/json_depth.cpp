// Measuring the nesting of a parsed value with a stack of our own, so a value nested
// a million levels deep is measured as safely as a flat one.
#include "json/json_depth.h"

#include <utility>
#include <vector>

namespace LSP {

bool NestedWithin(const JsonValue& value, int levels) {
  std::vector<std::pair<const JsonValue*, int>> pending{{&value, 1}};
  while (!pending.empty()) {
    auto [current, depth] = pending.back();
    pending.pop_back();
    if (!current->IsArray() && !current->IsObject()) continue;
    if (depth > levels) return false;
    if (current->IsArray()) {
      for (const JsonValue& element : current->GetArray()) pending.emplace_back(&element, depth + 1);
    } else {
      for (const auto& member : current->GetObject()) pending.emplace_back(&member.value, depth + 1);
    }
  }
  return true;
}

}  // namespace LSP
