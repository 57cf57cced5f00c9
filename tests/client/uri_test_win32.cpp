// File paths and file URIs on Windows: drive letters, blanks and shares as the shell's
// own URL functions write and read them, with leading backslashes dropped from results.
#include <gtest/gtest.h>

#include <string>

#include "vexil/client/uri.h"

namespace {

TEST(WindowsUri, DriveLettersAndBlanks) {
  EXPECT_EQ(FileToUri(""), "");
  EXPECT_EQ(UriToFile(""), "");
  EXPECT_EQ(FileToUri("C:\\src\\main.cpp"), "file:///C:/src/main.cpp");
  EXPECT_EQ(FileToUri("C:\\src\\my file.cpp"), "file:///C:/src/my%20file.cpp");
  EXPECT_EQ(UriToFile("file:///C:/src/my%20file.cpp"), "C:\\src\\my file.cpp");
  EXPECT_EQ(UriToFile(FileToUri("D:\\work dir\\a b\\c.h").c_str()), "D:\\work dir\\a b\\c.h");
}

TEST(WindowsUri, SharesLoseTheirLeadingBackslashes) {
  EXPECT_EQ(FileToUri("\\\\server\\share\\a.c"), "file://server/share/a.c");
  EXPECT_EQ(UriToFile("file://server/share/a.c"), "server\\share\\a.c");
}

TEST(WindowsUri, ResultsBeyondThePathLimitAreRefused) {
  const std::string longPath = "C:\\" + std::string(300, 'a');
  EXPECT_EQ(FileToUri(longPath.c_str()), "");
  EXPECT_EQ(UriToFile(("file:///C:/" + std::string(300, 'a')).c_str()), "");
}

}  // namespace
