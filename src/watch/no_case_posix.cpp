// Case-insensitive comparison through the C library of POSIX systems.
// Kept apart from the Windows variant so callers need no conditional code.
#include <strings.h>

#include "watch/no_case.h"

namespace vexil {

int CompareNoCase(const char* left, const char* right) { return strcasecmp(left, right); }

}  // namespace vexil
