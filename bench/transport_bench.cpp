// Round trips to the scripted fake server: a reply must be taken the moment it arrives,
// so the median round trip stays far below one 100 ms wait (aim: under 10 ms).
#include <benchmark/benchmark.h>

#include "transport/server.h"

namespace {

void RoundTrip(benchmark::State& state) {
  xServerStart start;
  start.executable = VEXIL_FAKE_SERVER;
  start.timeout = 5000;
  vexil::xServer server(start);
  if (!server.Start()) {
    state.SkipWithError("the fake server did not start");
    return;
  }
  for (auto _ : state) {
    LSP::RequestMessage request("fake/echo", nullptr);
    LSP::ResponseMessage response(nullptr);
    server.Write(request);
    server.Read(request.id, response);
    if (response.id != request.id) state.SkipWithError("no reply");
  }
  LSP::NotificationMessage exit("exit", nullptr);
  server.Write(exit);
}

// Each repetition is one round trip; the median of twenty is the figure that counts.
BENCHMARK(RoundTrip)->Iterations(1)->Repetitions(20)->ReportAggregatesOnly(true)->Unit(benchmark::kMillisecond);

}  // namespace
