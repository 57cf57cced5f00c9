// Round trips to the scripted fake server: xServer (framing, reader thread, reply
// matching, reading into the result) against a bare round trip over the same kind of
// pipes, framed by hand and never parsed. The fake server answers with a fixed result.
#include <benchmark/benchmark.h>

#include <Poco/Pipe.h>
#include <Poco/Process.h>

#include <memory>
#include <string>

#include "bare_splitter.h"
#include "bench_replies.h"
#include "bench_requests.h"
#include "fake_server.h"
#include "transport/pipe_io.h"
#include "vexil/host/language_server.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"

namespace {

constexpr int kRepetitions = 10;

template <typename Result, typename Params>
void ThroughServer(benchmark::State& state, const char* method, const std::string& resultFile) {
  std::unique_ptr<vexil::xServer> server = bench::StartFakeServer("result-file=" + resultFile, 5000);
  if (!server) return state.SkipWithError("the fake server did not start");
  Params params = bench::AtPosition<Params>();
  for (auto _ : state) {
    LSP::RequestMessage request(method, &params);
    Result result;
    LSP::ResponseMessage response(&result);
    server->Write(request);
    server->Read(request.id, response);
    if (response.id != request.id) state.SkipWithError("no reply");
  }
  bench::EndFakeServer(*server);
}

// The same request text, written and answered over bare pipes.
template <typename Params>
void Bare(benchmark::State& state, const char* method, const std::string& resultFile) {
  Poco::Pipe in;
  Poco::Pipe out;
  Poco::ProcessHandle server = Poco::Process::launch(VEXIL_FAKE_SERVER, {"result-file=" + resultFile}, &in, &out, nullptr);
  Params params = bench::AtPosition<Params>();
  LSP::RequestMessage request(method, &params);
  const std::string body = request.ToJSON();
  const std::string framed = "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
  bench::BareSplitter replies(out.readHandle());
  for (auto _ : state) {
    vexil::WriteAll(in, framed.data(), framed.size(), std::chrono::steady_clock::now() + std::chrono::minutes(1));
    benchmark::DoNotOptimize(replies.Next().data());
  }
  in.close();  // the fake server ends at the end of its input
  server.wait();
}

void RoundTrip_hover_vexil(benchmark::State& state) {
  ThroughServer<LSP::Hover, LSP::TextDocumentPositionParams>(state, "textDocument/hover", bench::HoverFile());
}

void RoundTrip_hover_floor(benchmark::State& state) {
  Bare<LSP::TextDocumentPositionParams>(state, "textDocument/hover", bench::HoverFile());
}

// The host's view: a registered connection at trace level 0, initialized, asked through its
// interface as an IDE asks (hovers while the user moves the mouse, completions as they type).
template <typename Ask>
void ThroughConnection(benchmark::State& state, const char* name, const std::string& resultFile, Ask ask) {
  xServerStart start;
  start.executable = VEXIL_FAKE_SERVER;
  start.argument1 = "result-file=" + resultFile;
  start.timeout = 5000;
  start.name = name;
  xLanguageServer* server = Vexil_Start(start);
  if (!server->Start(xServerInitialise())) return state.SkipWithError("the connection did not start");
  for (auto _ : state) ask(*server);
  server->Shutdown();
  if (!server->Exit()) state.SkipWithError("the connection did not exit");
}

void RoundTrip_hover_connection(benchmark::State& state) {
  auto params = bench::AtPosition<LSP::TextDocumentPositionParams>();
  ThroughConnection(state, "bench-hover", bench::HoverFile(), [&](xLanguageServer& server) {
    benchmark::DoNotOptimize(server.TextDocument_Hover(&params).contents.value.data());
  });
}

void RoundTrip_completion_connection(benchmark::State& state) {
  auto params = bench::AtPosition<LSP::CompletionParams>();
  ThroughConnection(state, "bench-completion", bench::CompletionFile(), [&](xLanguageServer& server) {
    if (server.TextDocument_Completion(&params).items.empty()) state.SkipWithError("no completion");
  });
}

void RoundTrip_completion_vexil(benchmark::State& state) {
  ThroughServer<LSP::CompletionList, LSP::CompletionParams>(state, "textDocument/completion", bench::CompletionFile());
}

void RoundTrip_completion_floor(benchmark::State& state) {
  Bare<LSP::CompletionParams>(state, "textDocument/completion", bench::CompletionFile());
}

void Figure(benchmark::internal::Benchmark* benchmark) {
  benchmark->UseRealTime()->Repetitions(kRepetitions)->ReportAggregatesOnly(true)->Unit(benchmark::kMicrosecond);
}

BENCHMARK(RoundTrip_hover_vexil)->Apply(Figure);
BENCHMARK(RoundTrip_hover_floor)->Apply(Figure);
BENCHMARK(RoundTrip_hover_connection)->Apply(Figure);
BENCHMARK(RoundTrip_completion_vexil)->Apply(Figure);
BENCHMARK(RoundTrip_completion_connection)->Apply(Figure);
BENCHMARK(RoundTrip_completion_floor)->Apply(Figure);

}  // namespace
