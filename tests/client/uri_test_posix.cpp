// File paths and file URIs: the escapes servers must be able to decode, the local
// authorities accepted, the PATH_MAX limit on both sides, and every byte's round trip.
#include <gtest/gtest.h>

#include <climits>
#include <string>

#include "vexil/client/uri.h"

namespace {

TEST(FileToUri, EncodesUnsafeBytesOneByOneAndKeepsSlashes) {
  EXPECT_EQ(FileToUri("/home/dev/main.cpp"), "file:///home/dev/main.cpp");
  EXPECT_EQ(FileToUri("/home/dev/my file#1%?.c"), "file:///home/dev/my%20file%231%25%3F.c");
  EXPECT_EQ(FileToUri("/tmp/gr\xC3\xBC\xC3\x9F" "e/a-b_c.d~"), "file:///tmp/gr%C3%BC%C3%9Fe/a-b_c.d~");
  EXPECT_EQ(FileToUri("/a:b@c+d&e=f;g"), "file:///a%3Ab%40c%2Bd%26e%3Df%3Bg");
  EXPECT_EQ(FileToUri("\\srv\\share\\x.c"), "file:///srv/share/x.c");
  // Only an absolute path names a file.
  for (const char* refused : {"", "src/main.cpp", "C:\\src\\main.cpp"}) EXPECT_EQ(FileToUri(refused), "") << refused;
}

TEST(UriToFile, DecodesLocalFileUrisOnly) {
  EXPECT_EQ(UriToFile("file:///home/dev/my%20file%231%25%3F.c"), "/home/dev/my file#1%?.c");
  EXPECT_EQ(UriToFile("file:///tmp/gr%c3%bc%C3%9Fe"), "/tmp/gr\xC3\xBC\xC3\x9F" "e");
  EXPECT_EQ(UriToFile("file://localhost/etc/hosts"), "/etc/hosts");
  EXPECT_EQ(UriToFile("FILE://LocalHost/etc/hosts"), "/etc/hosts");
  EXPECT_EQ(UriToFile("file:///a/b?query#fragment"), "/a/b");
  EXPECT_EQ(UriToFile("file:///a/%5C%5Cb"), "/a/\\\\b");
  for (const char* refused : {"file://server/share/a.c", "file://localhostx/a", "http://localhost/a", "file:/a/b",
                              "file://", "file:///a%2", "file:///a%zz", "file:///a%00b", "/home/dev/a.c", ""})
    EXPECT_EQ(UriToFile(refused), "") << refused;
}

TEST(Uri, ResultsBeyondThePathLimitAreRefusedOnBothSides) {
  constexpr std::size_t kLongest = PATH_MAX - 1;
  const std::string scheme = "file://";
  const std::string fits = "/" + std::string(kLongest - scheme.size() - 1, 'a');
  EXPECT_EQ(FileToUri(fits.c_str()).size(), kLongest);
  EXPECT_EQ(FileToUri((fits + "a").c_str()), "");
  EXPECT_EQ(FileToUri((fits.substr(0, fits.size() - 2) + " ").c_str()), "");

  const std::string longest = "/" + std::string(kLongest - 1, 'b');
  EXPECT_EQ(UriToFile((scheme + longest).c_str()), longest);
  EXPECT_EQ(UriToFile((scheme + longest + "b").c_str()), "");
  // The limit is on the path, not on the URI that encodes it.
  const std::string blanks = "/" + std::string(kLongest / 2, ' ');
  std::string encoded = scheme + "/";
  for (std::size_t i = 0; i < kLongest / 2; ++i) encoded += "%20";
  EXPECT_GT(encoded.size(), kLongest);
  EXPECT_EQ(UriToFile(encoded.c_str()), blanks);
}

// Every byte but NUL and the backslash, each once and in a run of all of them, comes back
// as it was: escapes are made and read one byte at a time.
TEST(Uri, EveryByteRoundTrips) {
  std::string all = "/";
  for (int byte = 1; byte < 256; ++byte) {
    if (byte == '\\') continue;
    const std::string one = "/a" + std::string(1, static_cast<char>(byte));
    EXPECT_EQ(UriToFile(FileToUri(one.c_str()).c_str()), one) << byte;
    all += static_cast<char>(byte);
  }
  EXPECT_EQ(UriToFile(FileToUri(all.c_str()).c_str()), all);
}

}  // namespace
