// The bound on how deep the library walks a parsed value. Parsing is iterative and
// needs no stack, but writing a value out or reading a model that nests (document
// symbols) recurses, and the Windows DLL runs on host threads with 1 MiB stacks.
#pragma once

#include "json/rapidjson.h"

namespace LSP {

// Nesting levels a recursive walk follows; a deeper value reads as malformed.
constexpr int kNestingLimit = 1000;

// Whether `value` holds no arrays and objects nested deeper than `levels` (a scalar is
// 0 levels deep, [] and {} are 1). Looks without recursing.
bool NestedWithin(const JsonValue& value, int levels);

}  // namespace LSP
