// The names derived from one changed file, and the expansion of their tags ($FN, $F,
// ...) in a command's argument text.
#pragma once

#include <string>
#include <vector>

namespace vexil {

struct xFileTags {
  // Splits `path` as the directory watcher reported it.
  explicit xFileTags(const std::string& path);

  std::string FN;   // the full name, as reported
  std::string F;    // the file name with its extension
  std::string FB;   // the base name, without the extension
  std::string EXT;  // the extension with its dot; empty when there is none
  std::string FDD;  // drive and directory: the full name without the file name
  bool isDirectory = false;
  bool isFile = false;
};

struct TagExpansion {
  std::string text;
  // Every tag value put into the text, once per insertion, for the caller to vet.
  std::vector<std::string> inserted;
};

// Replaces the tags in a fixed order, upper-case forms first: $FDD, $FN, $FB, $F, $EXT,
// then $fdd, $fn, $fb, $f, $ext. Text put in by one tag is scanned again by the tags
// after it.
TagExpansion ExpandTags(const std::string& text, const xFileTags& tags);

}  // namespace vexil
