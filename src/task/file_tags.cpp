// File-name tags: the split of a reported path and the row-by-row replacement of the
// tags in an argument text.
#include "task/file_tags.h"

#include <Poco/Path.h>

namespace vexil {
namespace {

// Replaces every `tag` in `text`, continuing after each inserted value.
void ReplaceAll(const std::string& tag, const std::string& value, TagExpansion& expansion) {
  std::string& text = expansion.text;
  for (std::size_t at = text.find(tag); at != std::string::npos; at = text.find(tag, at + value.size())) {
    text.replace(at, tag.size(), value);
    expansion.inserted.push_back(value);
  }
}

}  // namespace

xFileTags::xFileTags(const std::string& path) : FN(path) {
  const Poco::Path parsed(path);
  F = parsed.getFileName();
  FB = parsed.getBaseName();
  const std::string extension = parsed.getExtension();
  EXT = extension.empty() ? extension : "." + extension;
  FDD = FN.substr(0, FN.size() - F.size());
  isDirectory = parsed.isDirectory();
  isFile = parsed.isFile();
}

TagExpansion ExpandTags(const std::string& text, const xFileTags& tags) {
  // The longer tags go before "$F", which would otherwise eat their start.
  const std::pair<const char*, const std::string*> rows[] = {
      {"$FDD", &tags.FDD}, {"$FN", &tags.FN}, {"$FB", &tags.FB}, {"$F", &tags.F}, {"$EXT", &tags.EXT},
      {"$fdd", &tags.FDD}, {"$fn", &tags.FN}, {"$fb", &tags.FB}, {"$f", &tags.F}, {"$ext", &tags.EXT},
  };
  TagExpansion expansion{text, {}};
  for (const auto& row : rows) ReplaceAll(row.first, *row.second, expansion);
  return expansion;
}

}  // namespace vexil
