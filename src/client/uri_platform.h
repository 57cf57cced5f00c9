// The platform half of the path and URI conversion: each platform file converts one
// non-empty text within the platform's path limit.
#pragma once

#include <cstddef>
#include <string>

namespace vexil {

// Windows' path buffer (MAX_PATH), terminator included: longer results are refused there.
// POSIX systems allow PATH_MAX instead.
constexpr std::size_t kPathBufferSize = 260;

// Both return "" when the platform refuses the conversion.
std::string PlatformFileToUri(const std::string& path);
std::string PlatformUriToFile(const std::string& uri);

}  // namespace vexil
