// The two splitters on their own: frames cut at every byte, odd headers, the kept
// quirks (doubled first letter, length 0, byte 0xFF), error-stream line endings, and
// the bounds on what an abusive stream can make them hold.
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "transport/frame_parser.h"
#include "vexil_test/support.h"

namespace {

using Bodies = std::vector<std::string>;
using vexil::FrameParser;
using vexil_test::Frame;

// `bytes` fed in pieces of `chunk` (whole when 0) through `feed`.
template <typename Feed>
void FeedAll(const std::string& bytes, std::size_t chunk, Feed feed) {
  if (chunk == 0) chunk = bytes.size();
  for (std::size_t at = 0; at < bytes.size(); at += chunk) feed(bytes.data() + at, std::min(chunk, bytes.size() - at));
}

// Sizes rather than megabytes of text when a big row fails.
std::string Shown(const Bodies& bodies) {
  std::string shown;
  for (const std::string& body : bodies) shown += std::to_string(body.size()) + ":" + body.substr(0, 40) + " ";
  return shown;
}

TEST(FrameParser, FramesSplitAtEveryBytePositionComeOutWhole) {
  const std::string stream = Frame(R"({"id":1})") + Frame(R"({"id":22,"result":"Content-Length: 3"})");
  const Bodies expected = {R"({"id":1})", R"({"id":22,"result":"Content-Length: 3"})"};
  for (std::size_t cut = 1; cut < stream.size(); ++cut) {
    FrameParser parser;
    Bodies bodies;
    parser.Feed(stream.data(), cut, bodies);
    parser.Feed(stream.data() + cut, stream.size() - cut, bodies);
    EXPECT_EQ(bodies, expected) << "cut at " << cut;
  }
}

// One stream fed whole or in pieces: the bodies it yields, the stray output then held
// (taken once: a second take is empty) or only its newest bytes when it outgrew its
// bound, and at most how much the parser held meanwhile.
TEST(FrameParser, HeadersQuirksStrayBytesAndBounds) {
  const std::string broken = "Content-Length: 1073741825\r\n\r\nab";
  std::string big(16u << 20, 'x');
  big.front() = '{';
  big.back() = '}';
  const std::size_t pipe = 65536, bound = 8 * FrameParser::kOutputLimit;
  const struct Row {
    const char* why;
    std::string stream;
    Bodies bodies;
    const char* output;        // exact; null: not checked
    std::size_t chunk = 0;     // whole when 0
    std::string newest = "";   // the output is the bound's worth ending with this
    std::size_t held = 0;      // the most the parser may hold; 0: not checked
  } rows[] = {
      {"frames fed byte by byte", Frame("{}") + Frame(R"({"id":1})"), {"{}", R"({"id":1})"}, "", 1},
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
      {"one gibibyte is believed and waits for its body", "Content-Length: 1073741824\r\n\r\nab", {},
       "Content-Length: ", 1},
      {"above one gibibyte the header is stray output", broken, {}, broken.c_str()},
      {"and so it is byte by byte", broken, {}, broken.c_str(), 1},
      {"and the next frame is found", broken + Frame("{}"), {"{}"}, nullptr},
      {"a length that wraps a 32-bit count to 2 takes nothing", "Content-Length: 4294967298\r\n\r\nab" + Frame("{}"),
       {"{}"}, nullptr},
      {"a 16 MiB body in pipe-sized chunks", Frame(big) + Frame("{}"), {big, "{}"}, "", pipe},
      {"stray output keeps its newest mebibyte", std::string(3u << 20, 'n') + "the newest", {}, nullptr, pipe,
       "the newest", bound},
      {"framing goes on after it", std::string(5u << 20, 'n') + Frame("{}"), {"{}"}, "", pipe},
      // Leading zeros are digits like any other: they are kept, but only the newest of them.
      {"leading zeros keep their newest digits", "Content-Length: " + std::string(5u << 20, '0') + "2000000000", {},
       nullptr, pipe, "2000000000", bound},
      {"a length of zero keeps nothing it swallows", "Content-Length: 0\r\n\r\n" + std::string(32u << 20, 'x') + Frame("{}"),
       {}, nullptr, pipe, "", 1024},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.why);
    FrameParser parser;
    Bodies bodies;
    FeedAll(row.stream, row.chunk, [&](const char* data, std::size_t size) { parser.Feed(data, size, bodies); });
    EXPECT_TRUE(bodies == row.bodies) << Shown(bodies);
    if (row.held) { EXPECT_LE(parser.HeldBytes(), row.held); }
    const std::string output = parser.TakeOutput();
    if (row.output) { EXPECT_EQ(output, row.output); }
    if (!row.newest.empty()) {
      EXPECT_EQ(output.size(), FrameParser::kOutputLimit);
      EXPECT_EQ(output.substr(output.size() - row.newest.size()), row.newest);
    }
    EXPECT_EQ(parser.TakeOutput(), "");
  }
}

// Line ends of every kind, a CR LF pair split between two reads, byte 0xFF dropped, an
// unfinished line held back, and lines cut at the bound.
TEST(LineSplitter, LineEndsAndLongLines) {
  const std::string head(vexil::LineSplitter::kLineLimit, 'h');
  const struct Row {
    const char* why;
    std::string stream;
    std::size_t chunk;
    std::vector<std::string> lines;
  } rows[] = {
      {"CR LF, LF and CR", "w\r\nx\ny\rz\n", 0, {"w", "x", "y", "z"}},
      {"empty lines", "\n\r\n", 0, {"", ""}},
      {"byte FF and an unfinished line", "a\xFF" "b\nunfinished", 0, {"ab"}},
      {"CR LF split between reads", "one\r\ntwo\n", 4, {"one", "two"}},
      {"cut at 64 KiB", head + std::string(200000, 't') + "\nnext\r\n", 4096, {head, "next"}},
  };
  for (const Row& row : rows) {
    vexil::LineSplitter splitter;
    std::vector<std::string> lines;
    FeedAll(row.stream, row.chunk, [&](const char* data, std::size_t size) { splitter.Feed(data, size, lines); });
    EXPECT_TRUE(lines == row.lines) << row.why << ": " << Shown(lines);
  }
}

}  // namespace
