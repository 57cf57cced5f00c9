// The language table: lookups exactly as given, the odd rows kept as the host has them,
// deep copies, and how extension lists are split.
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "vexil/client/languages.h"

namespace {

// Every extension of the table, then what must not be found: other cases, a leading dot or a
// whole file name, an id that is not an extension, an extension list, nothing at all.
TEST(Languages, LooksUpEveryExtensionExactlyAsGiven) {
  const xLanguages languages;
  const std::pair<const char*, const char*> found[] = {
      {"cmd", "bat"},     {"bat", "bat"},   {"c", "c"},           {"h", "c"},
      {"cpp", "cpp"},     {"cxx", "cpp"},   {"c++", "cpp"},       {"hpp", "cpp"},
      {"hxx", "cpp"},     {"h++", "cpp"},   {"cs", "csharp"},     {"go", "go"},
      {"html", "html"},   {"java", "java"}, {"lua", "lua"},       {"py", "python"},
      {"r", "r"},         {"cshtml", "razor"}, {"rb", "ruby"},    {"rs", "rust"},
      {"sql", "sql"},     {"ts", "typescript"}, {"vb", "vb"},     {"xml", "xml"},
      {"xls", "xsl"},     {"yaml", "yaml"}};
  for (const auto& row : found) EXPECT_STREQ(languages.LanguageId(row.first), row.second) << row.first;
  const char* missing[] = {"CPP", "Py", "R", ".cpp", "main.cpp", "tar.gz", "d.ts", "cpp ", "js", "json",
                           "md", "htm", "yml", "xsl", "css", "python", "", "cpp;h", ";"};
  for (const char* extension : missing) EXPECT_STREQ(languages.LanguageId(extension), "") << extension;
  EXPECT_STREQ(languages.LanguageId(nullptr), "");
}

// Exposes the row-adding operation the way a host's own table would use it.
class CustomLanguages : public xLanguages {
 public:
  using xLanguages::AddLanguage;
};

// Added rows: lists split on ";" skipping empty pieces, the first row of an extension kept,
// and copies that own their rows.
TEST(Languages, AddedRowsSplitTheirListsAndCopiesOwnThem) {
  auto original = std::make_unique<CustomLanguages>();
  original->AddLanguage("Mine", "mine", ";;m1;;m2;");
  original->AddLanguage("Other C", "other-c", "c;m3");
  const std::pair<const char*, const char*> added[] = {
      {"m1", "mine"}, {"m2", "mine"}, {"m3", "other-c"}, {"c", "c"}, {"", ""}};
  for (const auto& row : added) EXPECT_STREQ(original->LanguageId(row.first), row.second) << row.first;

  xLanguages copied(*original);
  xLanguages assigned;
  assigned = *original;
  const char* id = copied.LanguageId("m1");
  original.reset();
  EXPECT_STREQ(id, "mine");
  EXPECT_STREQ(assigned.LanguageId("m1"), "mine");
  EXPECT_STREQ(assigned.LanguageId("cpp"), "cpp");
  xLanguages& self = assigned;
  assigned = self;
  EXPECT_STREQ(assigned.LanguageId("m3"), "other-c");
}

}  // namespace
