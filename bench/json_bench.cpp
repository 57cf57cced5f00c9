// Throughput of the JSON layer on message-sized texts: parsing a reply and writing a request.
// Every request and reply of a connection passes through these two paths once.
#include <benchmark/benchmark.h>

#include <string>

#include "vexil/protocol/structures.h"

namespace {

std::string ReplyWithLocations(int count) {
  std::string text = R"({"jsonrpc":"2.0","id":7,"result":[)";
  for (int i = 0; i < count; ++i) {
    if (i) text += ',';
    text += R"({"uri":"file:///home/dev/project/src/module.cpp","range":{"start":{"line":12,"character":4},)"
            R"("end":{"line":12,"character":17}}})";
  }
  return text + "]}";
}

void ParseReply(benchmark::State& state) {
  const std::string text = ReplyWithLocations(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    LSP::xReader reader;
    benchmark::DoNotOptimize(reader.Parse(text));
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(text.size()));
}
BENCHMARK(ParseReply)->Arg(1)->Arg(100)->Arg(10000);

void WriteRequest(benchmark::State& state) {
  LSP::Location location;
  location.uri = "file:///home/dev/project/src/module.cpp";
  location.range = LSP::Range(LSP::Position(12, 4), LSP::Position(12, 17));
  for (auto _ : state) benchmark::DoNotOptimize(LSP::ToJsonText(location));
}
BENCHMARK(WriteRequest);

}  // namespace
