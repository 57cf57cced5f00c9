// The language table: lookups exactly as given, the odd rows kept as the host has them,
// deep copies, and how extension lists are split.
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "vexil/client/languages.h"

namespace {

TEST(Languages, LooksUpExtensionsExactlyAsGiven) {
  const xLanguages languages;
  const std::pair<const char*, const char*> found[] = {
      {"h", "c"},          {"c", "c"},       {"hpp", "cpp"},   {"c++", "cpp"},   {"h++", "cpp"},
      {"bat", "bat"},      {"cmd", "bat"},   {"cs", "csharp"}, {"py", "python"}, {"cshtml", "razor"},
      {"xls", "xsl"},      {"ts", "typescript"}, {"yaml", "yaml"}, {"r", "r"},   {"vb", "vb"}};
  for (const auto& row : found) EXPECT_STREQ(languages.LanguageId(row.first), row.second) << row.first;
  for (const char* missing : {"CPP", ".cpp", "js", "json", "md", "htm", "yml", "xsl", "css", "", "cpp;h"})
    EXPECT_STREQ(languages.LanguageId(missing), "") << missing;
  EXPECT_STREQ(languages.LanguageId(nullptr), "");
}

// Exposes the row-adding operation the way a host's own table would use it.
class CustomLanguages : public xLanguages {
 public:
  using xLanguages::AddLanguage;
};

TEST(Languages, ExtensionListsSkipEmptyPiecesAndKeepTheFirstRow) {
  CustomLanguages languages;
  languages.AddLanguage("Mine", "mine", ";;m1;;m2;");
  languages.AddLanguage("Other C", "other-c", "c;m3");
  EXPECT_STREQ(languages.LanguageId("m1"), "mine");
  EXPECT_STREQ(languages.LanguageId("m2"), "mine");
  EXPECT_STREQ(languages.LanguageId("m3"), "other-c");
  EXPECT_STREQ(languages.LanguageId("c"), "c");
  EXPECT_STREQ(languages.LanguageId(""), "");
}

TEST(Languages, CopiesOwnTheirRows) {
  auto original = std::make_unique<CustomLanguages>();
  original->AddLanguage("Mine", "mine", "m");
  xLanguages copied(*original);
  xLanguages assigned;
  assigned = *original;
  const char* id = copied.LanguageId("m");
  original.reset();
  EXPECT_STREQ(id, "mine");
  EXPECT_STREQ(assigned.LanguageId("m"), "mine");
  EXPECT_STREQ(assigned.LanguageId("cpp"), "cpp");
  xLanguages& self = assigned;
  assigned = self;
  EXPECT_STREQ(assigned.LanguageId("m"), "mine");
}

}  // namespace
