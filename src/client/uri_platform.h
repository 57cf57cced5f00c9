// The platform half of the path and URI conversion: each platform file converts one
// non-empty text into a buffer of the platform's path size.
#pragma once

#include <cstddef>
#include <string>

namespace vexil {

// The platform's path buffer, terminator included: longer results are refused.
constexpr std::size_t kPathBufferSize = 260;

// Both return "" when the platform refuses the conversion.
std::string PlatformFileToUri(const std::string& path);
std::string PlatformUriToFile(const std::string& uri);

}  // namespace vexil
