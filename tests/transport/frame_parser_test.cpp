// The two splitters on their own: frames cut at every byte, odd headers, the kept
// quirks (doubled first letter, length 0, byte 0xFF), error-stream line endings, and
// the bounds on what an abusive stream can make them hold.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "transport/frame_parser.h"

namespace {

using Bodies = std::vector<std::string>;

std::string Frame(const std::string& body) {
  return "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

Bodies FeedAll(vexil::FrameParser& parser, const std::string& bytes, std::size_t chunk) {
  Bodies bodies;
  for (std::size_t at = 0; at < bytes.size(); at += chunk) {
    parser.Feed(bytes.data() + at, std::min(chunk, bytes.size() - at), bodies);
  }
  return bodies;
}

std::vector<std::string> Lines(const std::string& bytes) {
  vexil::LineSplitter splitter;
  std::vector<std::string> lines;
  splitter.Feed(bytes.data(), bytes.size(), lines);
  return lines;
}

TEST(FrameParser, FramesSplitAtEveryBytePositionComeOutWhole) {
  const std::string stream = Frame(R"({"id":1})") + Frame(R"({"id":22,"result":"Content-Length: 3"})");
  const Bodies expected = {R"({"id":1})", R"({"id":22,"result":"Content-Length: 3"})"};
  for (std::size_t cut = 1; cut < stream.size(); ++cut) {
    vexil::FrameParser parser;
    Bodies bodies;
    parser.Feed(stream.data(), cut, bodies);
    parser.Feed(stream.data() + cut, stream.size() - cut, bodies);
    EXPECT_EQ(bodies, expected) << "cut at " << cut;
  }
  vexil::FrameParser parser;
  EXPECT_EQ(FeedAll(parser, stream, 1), expected);
}

// One stream fed whole: the bodies it yields and, where given, the stray output then held
// (taken once: a second take is empty).
TEST(FrameParser, HeadersQuirksAndStrayBytesOfAWholeStream) {
  const std::string broken = "Content-Length: 1073741825\r\n\r\nab";
  const struct Row {
    const char* why;
    std::string stream;
    Bodies bodies;
    const char* output;
  } rows[] = {
      {"header name in any case", "content-LENGTH: 2\r\n\r\nab", {"ab"}, ""},
      {"extra header lines",
       "Content-Length: 5\r\nContent-Type: application/vscode-jsonrpc; charset=utf-8\r\n\r\nhello", {"hello"}, ""},
      {"a banner is output", "server 1.0 ready\n", {}, "server 1.0 ready\n"},
      {"stray bytes are forgotten once a message completes", "noise " + Frame("{}"), {"{}"}, ""},
      {"no blank after the colon is no header", "Content-Length:2\r\n\r\nab", {}, "Content-Length:2\r\n\r\nab"},
      {"a doubled first letter hides the frame behind it", "CContent-Length: 2\r\n\r\nab" + Frame("cd"), {"cd"}, nullptr},
      {"length zero swallows the rest", "Content-Length: 0\r\n\r\n" + Frame("{}") + Frame("{}"), {}, nullptr},
      {"an empty length swallows the rest", "Content-Length: \r\n\r\n" + Frame("{}"), {}, nullptr},
      // The frame says 4 but only 3 bytes count: it completes with the next byte.
      {"byte FF is dropped and not counted", "Content-Length: 4\r\n\r\na\xFF" "bcd", {"abcd"}, nullptr},
      {"byte FF leaves the frame short", "Content-Length: 4\r\n\r\na\xFF" "bc", {}, nullptr},
      {"above one gibibyte the header is stray output", broken, {}, broken.c_str()},
      {"and the next frame is found", broken + Frame("{}"), {"{}"}, nullptr},
      {"a length that wraps a 32-bit count to 2 takes nothing", "Content-Length: 4294967298\r\n\r\nab" + Frame("{}"),
       {"{}"}, nullptr},
  };
  for (const Row& row : rows) {
    vexil::FrameParser parser;
    EXPECT_EQ(FeedAll(parser, row.stream, row.stream.size()), row.bodies) << row.why;
    const std::string output = parser.TakeOutput();
    EXPECT_TRUE(!row.output || output == row.output) << row.why << ": " << output;
    EXPECT_EQ(parser.TakeOutput(), "") << row.why;
  }
}

TEST(FrameParser, SixteenMebibyteBodyInPipeSizedChunks) {
  std::string body(16u << 20, 'x');
  body.front() = '{';
  body.back() = '}';
  vexil::FrameParser parser;
  Bodies bodies = FeedAll(parser, Frame(body) + Frame("{}"), 65536);
  ASSERT_EQ(bodies.size(), 2u);
  EXPECT_TRUE(bodies[0] == body);
  EXPECT_EQ(bodies[1], "{}");
}

TEST(FrameParser, StrayOutputKeepsItsNewestMebibyte) {
  vexil::FrameParser parser;
  const std::string tail = "the newest stray bytes";
  Bodies bodies = FeedAll(parser, std::string(3u << 20, 'n') + tail, 65536);
  EXPECT_TRUE(bodies.empty());
  EXPECT_LE(parser.HeldBytes(), 8 * vexil::FrameParser::kOutputLimit);
  std::string output = parser.TakeOutput();
  EXPECT_EQ(output.size(), vexil::FrameParser::kOutputLimit);
  EXPECT_EQ(output.substr(output.size() - tail.size()), tail);

  // Framing goes on as before.
  EXPECT_EQ(FeedAll(parser, std::string(5u << 20, 'n') + Frame("{}"), 65536), Bodies{"{}"});
  EXPECT_EQ(parser.TakeOutput(), "");
}

TEST(FrameParser, LengthsAboveOneGibibyteAreBrokenHeaders) {
  // Just below the bound the frame is believed and waits for its body.
  vexil::FrameParser believed;
  EXPECT_TRUE(FeedAll(believed, "Content-Length: 1073741824\r\n\r\nab", 1).empty());
  EXPECT_EQ(believed.TakeOutput(), "Content-Length: ");

  // Above it the header stays stray output, fed byte by byte as well as whole.
  const std::string broken = "Content-Length: 1073741825\r\n\r\nab";
  vexil::FrameParser parser;
  EXPECT_TRUE(FeedAll(parser, broken, 1).empty());
  EXPECT_EQ(parser.TakeOutput(), broken);
  // Leading zeros are digits like any other: they are kept, but only the newest of them.
  vexil::FrameParser zeros;
  FeedAll(zeros, "Content-Length: " + std::string(5u << 20, '0') + "2000000000", 65536);
  EXPECT_LE(zeros.HeldBytes(), 8 * vexil::FrameParser::kOutputLimit);
  std::string output = zeros.TakeOutput();
  EXPECT_EQ(output.size(), vexil::FrameParser::kOutputLimit);
  EXPECT_EQ(output.substr(output.size() - 10), "2000000000");
}

TEST(FrameParser, ALengthOfZeroKeepsNothingOfWhatItSwallows) {
  vexil::FrameParser parser;
  EXPECT_TRUE(FeedAll(parser, "Content-Length: 0\r\n\r\n" + std::string(32u << 20, 'x') + Frame("{}"), 65536).empty());
  EXPECT_LT(parser.HeldBytes(), 1024u);
}

TEST(LineSplitter, CarriageReturnLineFeedAndBoth) {
  EXPECT_EQ(Lines("w\r\nx\ny\rz\n"), (std::vector<std::string>{"w", "x", "y", "z"}));
  EXPECT_EQ(Lines("\n\r\n"), (std::vector<std::string>{"", ""}));
  EXPECT_EQ(Lines("a\xFF" "b\nunfinished"), std::vector<std::string>{"ab"});

  // A CR LF pair split across two reads is still one line end.
  vexil::LineSplitter splitter;
  std::vector<std::string> lines;
  splitter.Feed("one\r", 4, lines);
  splitter.Feed("\ntwo\n", 5, lines);
  EXPECT_EQ(lines, (std::vector<std::string>{"one", "two"}));
}

TEST(LineSplitter, LongLinesAreCutAtSixtyFourKibibytes) {
  std::string head(vexil::LineSplitter::kLineLimit, 'h');
  std::string stream = head + std::string(200000, 't') + "\nnext\r\n";
  vexil::LineSplitter splitter;
  std::vector<std::string> lines;
  for (std::size_t at = 0; at < stream.size(); at += 4096) {
    splitter.Feed(stream.data() + at, std::min<std::size_t>(4096, stream.size() - at), lines);
  }
  ASSERT_EQ(lines.size(), 2u);
  EXPECT_TRUE(lines[0] == head) << lines[0].size();
  EXPECT_EQ(lines[1], "next");
}

}  // namespace
