// The readers' two splitters under arbitrary bytes cut at arbitrary places: the frame
// parser's bodies and stray output and the error reader's lines must not depend on how the
// stream was cut, lines hold no line end, and nothing either holds may outgrow its bounds.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "chunks.h"
#include "transport/frame_parser.h"

namespace {

struct Outcome {
  std::vector<std::string> bodies;
  std::string output;
  std::vector<std::string> lines;
};

Outcome Split(const fuzz::Chunks& chunks, bool whole) {
  vexil::FrameParser parser;
  vexil::LineSplitter splitter;
  Outcome outcome;
  for (const fuzz::Chunk& chunk : chunks.Pieces(whole)) {
    parser.Feed(chunk.data, chunk.size, outcome.bodies);
    splitter.Feed(chunk.data, chunk.size, outcome.lines);
  }
  // Stray output and digits keep their newest bytes, a body is sized up front at most to
  // kReserveLimit, and beyond that only what arrived can be held.
  if (parser.HeldBytes() >
      8 * vexil::FrameParser::kOutputLimit + vexil::FrameParser::kReserveLimit + 2 * chunks.Size()) {
    std::abort();
  }
  outcome.output = parser.TakeOutput();
  return outcome;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const fuzz::Chunks chunks(data, size);
  const Outcome cut = Split(chunks, false);
  const Outcome whole = Split(chunks, true);
  if (cut.bodies != whole.bodies || cut.output != whole.output || cut.lines != whole.lines) std::abort();
  if (cut.output.size() > vexil::FrameParser::kOutputLimit) std::abort();
  for (const std::string& line : cut.lines) {
    if (line.size() > vexil::LineSplitter::kLineLimit || line.find_first_of("\r\n") != std::string::npos) std::abort();
  }
  return 0;
}
