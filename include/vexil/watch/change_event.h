// The record a host receives for one change of a watched project: what happened, the raw
// monitor action, and the name (old and new for a rename) relative to the project's root.
#pragma once

#include <cstdint>
#include <string>

#include "vexil/export.h"

class VEXIL_API xChangeEvent {
 public:
  xChangeEvent() = default;
  // `type` follows from `action`: 1 → 0 added, 2 → 1 removed, 3 → 3 modified, 4 and 5 → 2
  // renamed; any other action leaves it at -1.
  xChangeEvent(std::string name, unsigned action);

  // 0 added, 1 removed, 2 renamed, 3 modified; -1 when unknown.
  std::int32_t type = -1;
  // The monitor's action: 1 added, 2 removed, 3 modified, 4 renamed (old), 5 renamed (new).
  std::uint32_t action = 0xFFFFFFFF;
  // Relative to the project's root, UTF-8, directories with a trailing separator; for a
  // rename the old name.
  std::string name;
  // Only for a rename: the new name.
  std::string newName;
};
