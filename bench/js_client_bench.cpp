// The JavaScript client of bench/js (vscode-jsonrpc, replies read with JSON.parse) asking the
// fake server what the transport benchmarks ask, answered from the same result files. It runs
// from here, among the other benchmarks, so that a passing load weighs on both sides alike.
#include <benchmark/benchmark.h>

#include <Poco/Environment.h>
#include <Poco/Exception.h>
#include <Poco/Path.h>
#include <Poco/Pipe.h>
#include <Poco/PipeStream.h>
#include <Poco/Process.h>

#include <iterator>
#include <string>

#include "bench_replies.h"
#include "bench_requests.h"
#include "json/rapidjson.h"
#include "vexil/protocol/message.h"

namespace {

constexpr int kRepetitions = 10;
// Round trips timed by one run of the client, their median that repetition's figure: as many
// as fit in a few hundred milliseconds of a quiet machine.
constexpr int kHoverRoundTrips = 500;
constexpr int kCompletionRoundTrips = 20;

// One run of the client: its median round trip and what it ran on, or why it has none.
struct ClientRun {
  double seconds = 0;
  std::string versions;
  std::string failure;
};

std::string FindNode() {
  Poco::Path node;
  return Poco::Path::find(Poco::Environment::get("PATH", ""), "node", node) ? node.toString() : "";
}

// The client's figures come on its last line, and so does the reason it failed.
std::string LastLine(const std::string& text) {
  const std::size_t end = text.find_last_not_of("\r\n");
  if (end == std::string::npos) return "";
  const std::size_t newline = text.find_last_of('\n', end);
  const std::size_t begin = newline == std::string::npos ? 0 : newline + 1;
  return text.substr(begin, end + 1 - begin);
}

std::string Text(const LSP::JsonDocument& figures, const char* name) {
  const auto member = figures.FindMember(name);
  return member != figures.MemberEnd() && member->value.IsString() ? member->value.GetString() : "?";
}

ClientRun Read(const std::string& output, int status) {
  ClientRun run;
  const std::string line = LastLine(output);
  LSP::JsonDocument figures;
  figures.Parse(line.c_str(), line.size());
  const bool valid = !figures.HasParseError() && figures.IsObject() && figures.HasMember("median_us") &&
                     figures["median_us"].IsNumber();
  if (status != 0 || !valid) {
    run.failure = line.empty() ? "the JavaScript client exited with code " + std::to_string(status) : line;
    return run;
  }
  run.seconds = figures["median_us"].GetDouble() * 1e-6;
  run.versions = "vscode-jsonrpc " + Text(figures, "vscode_jsonrpc") + " on node " + Text(figures, "node");
  return run;
}

ClientRun RunClient(const std::string& node, const std::string& resultFile, const std::string& request,
                    int roundTrips) {
  try {
    // One pipe for stdout and stderr: the reason of a failure comes where the figures would.
    Poco::Pipe output;
    Poco::ProcessHandle client = Poco::Process::launch(
        node, {std::string(VEXIL_BENCH_JS) + "/client.js", VEXIL_FAKE_SERVER, resultFile, request, std::to_string(roundTrips)},
        nullptr, &output, &output);
    Poco::PipeInputStream stream(output);
    const std::string text{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    return Read(text, client.wait());
  } catch (const Poco::Exception& error) {
    ClientRun run;
    run.failure = "node did not run: " + error.displayText();
    return run;
  }
}

template <typename Params>
void ThroughJavaScript(benchmark::State& state, const char* method, const std::string& resultFile, int roundTrips) {
  const std::string node = FindNode();
  if (node.empty()) return state.SkipWithError("node is not on PATH");
  Params params = bench::AtPosition<Params>();
  LSP::RequestMessage request(method, &params);
  const std::string text = request.ToJSON();
  for (auto _ : state) {
    const ClientRun run = RunClient(node, resultFile, text, roundTrips);
    if (!run.failure.empty()) {
      state.SkipWithError(run.failure.c_str());
      break;
    }
    state.SetIterationTime(run.seconds);
    state.SetLabel(run.versions);
  }
}

void RoundTrip_hover_js(benchmark::State& state) {
  ThroughJavaScript<LSP::TextDocumentPositionParams>(state, "textDocument/hover", bench::HoverFile(), kHoverRoundTrips);
}

void RoundTrip_completion_js(benchmark::State& state) {
  ThroughJavaScript<LSP::CompletionParams>(state, "textDocument/completion", bench::CompletionFile(),
                                              kCompletionRoundTrips);
}

// Each repetition is one run of the client, its time the median the client measured.
void Figure(benchmark::internal::Benchmark* benchmark) {
  benchmark->UseManualTime()->Iterations(1)->Repetitions(kRepetitions)->ReportAggregatesOnly(true)->Unit(
      benchmark::kMicrosecond);
}

BENCHMARK(RoundTrip_hover_js)->Apply(Figure);
BENCHMARK(RoundTrip_completion_js)->Apply(Figure);

}  // namespace
