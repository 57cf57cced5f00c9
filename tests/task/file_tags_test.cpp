// File-name tags: the split of a reported path as the tags show it, and the expansion
// table with its order, its two cases, and the rescanning of inserted text.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "task/file_tags.h"

using vexil::ExpandTags;
using vexil::xFileTags;

TEST(FileTags, TagsOfAReportedPathExpandInTableOrderInBothCases) {
  const struct Row {
    const char* text;
    const char* path;
    const char* expanded;
  } rows[] = {
      {"$FN|$F|$FB|$EXT|$FDD", "/work/src/shape.Test.CPP",
       "/work/src/shape.Test.CPP|shape.Test.CPP|shape.Test|.CPP|/work/src/"},
      {"$FN|$F|$FB|$EXT|$FDD", "/work/Makefile", "/work/Makefile|Makefile|Makefile||/work/"},
      {"$FDD|$FN|$FB|$F|$EXT", "/w/d/a.cpp", "/w/d/|/w/d/a.cpp|a|a.cpp|.cpp"},
      {"$fdd|$fn|$fb|$f|$ext", "/w/d/a.cpp", "/w/d/|/w/d/a.cpp|a|a.cpp|.cpp"},
      {"build $FN", "/w/d/a.cpp", "build /w/d/a.cpp"},
      {"$FB$EXT", "/w/d/a.cpp", "a.cpp"},  // two tags back to back
      {"$FDDx", "/w/d/a.cpp", "/w/d/x"},   // never "$F" followed by DD
      {"$FD", "/w/d/a.cpp", "a.cppD"},     // no longer tag matches, so "$F" does
      {"$Fn", "/w/d/a.cpp", "a.cppn"},     // no tag of its own
      {"$fN", "/w/d/a.cpp", "a.cppN"},
      {"$Ext $Fdd", "/w/d/a.cpp", "$Ext a.cppdd"},  // mixed case is no tag
      {"$$F$", "/w/d/a.cpp", "$a.cpp$"},
      {"no tags", "/w/d/a.cpp", "no tags"},
      // A file name holding a later tag is expanded again; one holding its own tag is not
      // (and cannot make the expansion loop).
      {"$F", "/w/$ext.cpp", ".cpp.cpp"},
      {"$F", "/w/$F.cpp", "$F.cpp"},
  };
  for (const Row& row : rows) EXPECT_EQ(ExpandTags(row.text, xFileTags(row.path)).text, row.expanded) << row.text;
  const auto expansion = ExpandTags("$F and $f in $FDD", xFileTags("/w/a.cpp"));
  EXPECT_EQ(expansion.inserted, (std::vector<std::string>{"/w/", "a.cpp", "a.cpp"}));
}
