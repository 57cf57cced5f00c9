// Case-insensitive comparison through the Windows C runtime.
// Kept apart from the POSIX variant so callers need no conditional code.
#include <string.h>

#include "watch/no_case.h"

namespace vexil {

int CompareNoCase(const char* left, const char* right) { return _stricmp(left, right); }

}  // namespace vexil
