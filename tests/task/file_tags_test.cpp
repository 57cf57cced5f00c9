// File-name tags: the split of a reported path, and the expansion table with its order,
// its two cases, and the rescanning of inserted text.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "task/file_tags.h"

using vexil::ExpandTags;
using vexil::xFileTags;

TEST(FileTags, SplitAReportedPath) {
  const xFileTags tags("/work/src/shape.Test.CPP");
  EXPECT_EQ(tags.FN, "/work/src/shape.Test.CPP");
  EXPECT_EQ(tags.F, "shape.Test.CPP");
  EXPECT_EQ(tags.FB, "shape.Test");
  EXPECT_EQ(tags.EXT, ".CPP");
  EXPECT_EQ(tags.FDD, "/work/src/");
  EXPECT_TRUE(tags.isFile);
  EXPECT_FALSE(tags.isDirectory);

  const xFileTags bare("/work/Makefile");
  EXPECT_EQ(bare.FB, "Makefile");
  EXPECT_EQ(bare.EXT, "");
  EXPECT_EQ(bare.FDD, "/work/");
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
