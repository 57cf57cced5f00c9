// File-name tags: the split of a reported path, and the expansion table with its order,
// its two cases, and the rescanning of inserted text.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "task/file_tags.h"

using vexil::ExpandTags;
using vexil::xFileTags;

TEST(FileTags, SplitAReportedPath) {
  const std::pair<const char*, const char*> rows[] = {
      {"/work/src/shape.Test.CPP", "/work/src/shape.Test.CPP|shape.Test.CPP|shape.Test|.CPP|/work/src/|1|0"},
      {"/work/Makefile", "/work/Makefile|Makefile|Makefile||/work/|1|0"},
  };
  for (const auto& [path, expected] : rows) {
    const xFileTags t(path);
    EXPECT_EQ(t.FN + "|" + t.F + "|" + t.FB + "|" + t.EXT + "|" + t.FDD + "|" + std::to_string(t.isFile) + "|" +
                  std::to_string(t.isDirectory),
              expected);
  }
}

TEST(FileTags, ExpansionFollowsTheTableOrderInBothCases) {
  const xFileTags tags("/w/d/a.cpp");
  const std::vector<std::pair<std::string, std::string>> table = {
      {"$FDD|$FN|$FB|$F|$EXT", "/w/d/|/w/d/a.cpp|a|a.cpp|.cpp"},
      {"$fdd|$fn|$fb|$f|$ext", "/w/d/|/w/d/a.cpp|a|a.cpp|.cpp"},
      {"build $FN", "build /w/d/a.cpp"},
      {"$FB$EXT", "a.cpp"},              // two tags back to back
      {"$FDDx", "/w/d/x"},               // never "$F" followed by DD
      {"$FD", "a.cppD"},                 // no longer tag matches, so "$F" does
      {"$Fn", "a.cppn"},                 // no tag of its own
      {"$fN", "a.cppN"},
      {"$Ext $Fdd", "$Ext a.cppdd"},     // mixed case is no tag
      {"$$F$", "$a.cpp$"},
      {"no tags", "no tags"},
  };
  for (const auto& row : table) EXPECT_EQ(ExpandTags(row.first, tags).text, row.second) << row.first;
}

TEST(FileTags, InsertedTextIsScannedByLaterRowsOnly) {
  // A file name holding a later tag is expanded again; one holding its own tag is not
  // (and cannot make the expansion loop).
  EXPECT_EQ(ExpandTags("$F", xFileTags("/w/$ext.cpp")).text, ".cpp.cpp");
  EXPECT_EQ(ExpandTags("$F", xFileTags("/w/$F.cpp")).text, "$F.cpp");

  const auto expansion = ExpandTags("$F and $f in $FDD", xFileTags("/w/a.cpp"));
  EXPECT_EQ(expansion.inserted, (std::vector<std::string>{"/w/", "a.cpp", "a.cpp"}));
}
