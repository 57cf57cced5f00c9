// Case-insensitive comparison of names and paths, as the host's file system sees them.
// One definition per platform; logic elsewhere never asks which platform it runs on.
#pragma once

#include <string>

namespace vexil {

// Negative, zero or positive like strcmp, ignoring letter case.
int CompareNoCase(const char* left, const char* right);

// Orders map keys so that names differing only in case are one key.
struct NoCaseLess {
  bool operator()(const std::string& left, const std::string& right) const {
    return CompareNoCase(left.c_str(), right.c_str()) < 0;
  }
};

}  // namespace vexil
