// The JSON layer beside the JSON library alone: a 1 MiB completion reply read into
// LSP::CompletionList against RapidJSON's bare parse of the same text, and an
// InitializeParams request written against RapidJSON writing the same document.
#include <benchmark/benchmark.h>

#include <string>

#include "bench_replies.h"
#include "json/rapidjson.h"
#include "protocol/completion_events.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"
#include "vexil/protocol/message.h"

namespace {

constexpr int kRepetitions = 10;

const std::string& CompletionReply() {
  static const std::string text = bench::Reply(1, bench::CompletionResult(1u << 20));
  return text;
}

void SetBytes(benchmark::State& state, const std::string& text) {
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(text.size()));
}

// As the connection reads a reply: straight into the list, or, for items that keep their
// JSON, through the document.
void ReadCompletion(benchmark::State& state, bool keepItemJson) {
  const std::string& text = CompletionReply();
  for (auto _ : state) {
    LSP::CompletionList list;
    list.keepItemJson = keepItemJson;
    LSP::ResponseMessage response(&list);
    if (!LSP::ReadCompletionReply(text, 1, response)) {
      LSP::xReader reader;
      reader.Parse(text);
      response.Read(reader);
    }
    benchmark::DoNotOptimize(list.items.data());
  }
  SetBytes(state, text);
}

void Json_completion_vexil(benchmark::State& state) { ReadCompletion(state, false); }
void Json_completion_items_json(benchmark::State& state) { ReadCompletion(state, true); }

// The same parse as the library's, with the same flags, of the text as a C string.
void Json_completion_floor(benchmark::State& state) {
  const std::string& text = CompletionReply();
  for (auto _ : state) {
    LSP::JsonDocument document;
    document.Parse<rapidjson::kParseIterativeFlag>(text.c_str());
    benchmark::DoNotOptimize(document.HasParseError());
  }
  SetBytes(state, text);
}

// An initialize request as a host sends it: capabilities, options and two folders.
LSP::InitializeParams Initialize() {
  LSP::InitializationOptions options(R"({"initializationOptions":{"clangdFileStatus":true,"fallbackFlags":["-std=c++17"]}})");
  LSP::InitializeParams params(4242, "file:///home/user/project", LSP::TraceLevel::Messages, options);
  params.workspaceFolders = {{"file:///home/user/project", "project"}, {"file:///home/user/library", "library"}};
  return params;
}

void Json_initialize_vexil(benchmark::State& state) {
  LSP::InitializeParams params = Initialize();
  std::string text;
  for (auto _ : state) {
    LSP::RequestMessage request("initialize", &params);
    text = request.ToJSON();
    benchmark::DoNotOptimize(text.data());
  }
  SetBytes(state, text);
}

void Json_initialize_floor(benchmark::State& state) {
  LSP::InitializeParams params = Initialize();
  LSP::RequestMessage request("initialize", &params);
  const std::string text = request.ToJSON();
  LSP::JsonDocument document;
  document.Parse(text.c_str(), text.size());
  for (auto _ : state) {
    rapidjson::StringBuffer buffer;
    rapidjson::Writer<rapidjson::StringBuffer> writer(buffer);
    document.Accept(writer);
    benchmark::DoNotOptimize(buffer.GetString());
  }
  SetBytes(state, text);
}

void Figure(benchmark::internal::Benchmark* benchmark) {
  benchmark->Repetitions(kRepetitions)->ReportAggregatesOnly(true)->Unit(benchmark::kMicrosecond);
}

BENCHMARK(Json_completion_vexil)->Apply(Figure);
BENCHMARK(Json_completion_items_json)->Apply(Figure);
BENCHMARK(Json_completion_floor)->Apply(Figure);
BENCHMARK(Json_initialize_vexil)->Apply(Figure);
BENCHMARK(Json_initialize_floor)->Apply(Figure);

}  // namespace
