// The output reader's state machine under arbitrary bytes cut at arbitrary places: the
// bodies and the stray output must not depend on how the stream was cut, and nothing the
// parser holds may outgrow its bounds.
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
};

Outcome Parse(const fuzz::Chunks& chunks, bool whole) {
  vexil::FrameParser parser;
  Outcome outcome;
  for (const fuzz::Chunk& chunk : chunks.Pieces(whole)) parser.Feed(chunk.data, chunk.size, outcome.bodies);
  // Stray output and digits keep their newest bytes, a body is sized up front at most to
  // kReserveLimit, and beyond that only what arrived can be held.
  if (parser.HeldBytes() > 8 * vexil::FrameParser::kOutputLimit + vexil::FrameParser::kReserveLimit + 2 * chunks.Size()) {
    std::abort();
  }
  outcome.output = parser.TakeOutput();
  return outcome;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const fuzz::Chunks chunks(data, size);
  const Outcome cut = Parse(chunks, false);
  const Outcome whole = Parse(chunks, true);
  if (cut.bodies != whole.bodies || cut.output != whole.output) std::abort();
  if (cut.output.size() > vexil::FrameParser::kOutputLimit) std::abort();
  return 0;
}
