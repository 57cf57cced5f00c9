// The error reader's line splitter under arbitrary bytes cut at arbitrary places: the lines
// must not depend on the cuts, hold no line end and stay within the line bound.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "chunks.h"
#include "transport/frame_parser.h"

namespace {

std::vector<std::string> Split(const fuzz::Chunks& chunks, bool whole) {
  vexil::LineSplitter splitter;
  std::vector<std::string> lines;
  for (const fuzz::Chunk& chunk : chunks.Pieces(whole)) splitter.Feed(chunk.data, chunk.size, lines);
  return lines;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const fuzz::Chunks chunks(data, size);
  const std::vector<std::string> lines = Split(chunks, false);
  if (lines != Split(chunks, true)) std::abort();
  for (const std::string& line : lines) {
    if (line.size() > vexil::LineSplitter::kLineLimit) std::abort();
    if (line.find_first_of("\r\n") != std::string::npos) std::abort();
  }
  return 0;
}
