// The only way the library includes RapidJSON: its assertions throw AssertException
// instead of aborting. The build defines RAPIDJSON_ASSERT to an undeclared name, so a
// file that includes RapidJSON directly fails to compile.
#pragma once

#if defined(RAPIDJSON_RAPIDJSON_H_)
#error "RapidJSON was included before json/rapidjson.h; include only this header"
#endif

#include "vexil/json/json.h"

#undef RAPIDJSON_ASSERT
#define RAPIDJSON_ASSERT(x) ((x) ? static_cast<void>(0) : throw ::AssertException(#x))
#define RAPIDJSON_HAS_STDSTRING 1

#include <rapidjson/document.h>
#include <rapidjson/error/en.h>
#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

namespace LSP {
using JsonDocument = rapidjson::GenericDocument<rapidjson::UTF8<char>,
                                                rapidjson::MemoryPoolAllocator<rapidjson::CrtAllocator>>;
}  // namespace LSP
