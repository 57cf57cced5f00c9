// JSON layer throughput: reading a completion-sized reply through the typed accessors
// beside the JSON library's bare parse, and writing a request with nested structures.
#include <benchmark/benchmark.h>

#include <string>

#include "json/rapidjson.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace {

// A reply of `count` location-like items, about 150 bytes each.
std::string LocationsReply(int count) {
  std::string text = R"({"jsonrpc":"2.0","id":7,"result":[)";
  for (int i = 0; i < count; ++i) {
    if (i) text += ',';
    text += R"({"uri":"file:///home/user/project/src/module)" + std::to_string(i) +
            R"(.cpp","range":{"start":{"line":)" + std::to_string(i) +
            R"(,"character":4},"end":{"line":)" + std::to_string(i) + R"(,"character":12}}})";
  }
  return text + "]}";
}

class Locations : public LSP::Result {
 public:
  void Read(const LSP::xObject& value) override {
    for (const LSP::JsonValue& element : value.Value().GetArray()) {
      items.emplace_back();
      items.back().Read(LSP::xObject(element));
    }
  }
  using LSP::JsonObject::Read;
  void Write(LSP::xWriter&) override {}
  std::vector<LSP::Location> items;
};

void BM_BareParse(benchmark::State& state) {
  const std::string text = LocationsReply(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    LSP::JsonDocument document;
    document.Parse(text.c_str(), text.size());
    benchmark::DoNotOptimize(document.HasParseError());
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * text.size()));
}

void BM_ReadIntoModel(benchmark::State& state) {
  const std::string text = LocationsReply(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    LSP::xReader reader;
    reader.Parse(text);
    Locations result;
    LSP::ResponseMessage response(&result);
    response.Read(reader);
    benchmark::DoNotOptimize(result.items.data());
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * text.size()));
}

class Edit : public LSP::Params {
 public:
  void Write(LSP::xWriter& writer) override {
    writer.Object(document, true);
    writer.StartArray("contentChanges");
    writer.Object(change, false);
    writer.EndArray();
  }
  LSP::VersionedTextDocumentIdentifier document{"file:///home/user/project/src/main.cpp", 12};
  LSP::TextDocumentContentChangeEvent change;
};

void BM_WriteChange(benchmark::State& state) {
  Edit params;
  params.change.text = std::string(static_cast<size_t>(state.range(0)), 'x');
  for (auto _ : state) {
    LSP::NotificationMessage message("textDocument/didChange", &params);
    benchmark::DoNotOptimize(message.ToJSON());
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * state.range(0)));
}

}  // namespace

BENCHMARK(BM_BareParse)->Arg(100)->Arg(7000);
BENCHMARK(BM_ReadIntoModel)->Arg(100)->Arg(7000);
BENCHMARK(BM_WriteChange)->Arg(1024)->Arg(1 << 20);
