// Resident memory while the host is idle and a server floods it: 200 MB of stderr log
// lines, 50 MB of header-less stdout and 100,000 notifications, then one request that
// must still be answered; and while a watcher command floods its trace. Growth is sampled
// through each flood, so the peak is what counts.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <thread>

#include "bench_replies.h"
#include "fake_server.h"
#include "task/watcher_event.h"

namespace {

using Clock = std::chrono::steady_clock;

double ResidentMiB() {
  std::ifstream statm("/proc/self/statm");
  long pages = 0;
  long resident = 0;
  statm >> pages >> resident;
  return static_cast<double>(resident) * static_cast<double>(sysconf(_SC_PAGESIZE)) / (1 << 20);
}

// Samples resident memory on a thread of its own until destroyed; keeps the highest.
class PeakSampler {
 public:
  PeakSampler() : thread_([this] { Sample(); }) {}
  ~PeakSampler() {
    done_ = true;
    thread_.join();
  }
  double Peak() const { return peak_; }

 private:
  void Sample() {
    while (!done_) {
      const double now = ResidentMiB();
      if (now > peak_) peak_ = now;
      std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
  }

  std::atomic<bool> done_{false};
  std::atomic<double> peak_{0};
  std::thread thread_;
};

bool WaitForFile(const std::string& path, std::chrono::seconds limit) {
  const auto deadline = Clock::now() + limit;
  while (!std::filesystem::exists(path)) {
    if (Clock::now() > deadline) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return true;
}

void Memory_abusive_server(benchmark::State& state) {
  const std::string done = bench::TemporaryFile("flood-done", "");
  for (auto _ : state) {
    std::filesystem::remove(done);
    const double baseline = ResidentMiB();
    PeakSampler sampler;
    std::unique_ptr<vexil::xServer> server = bench::StartFakeServer(
        "flood-stderr=200000000;flood-stdout=50000000;flood-notifications=100000;flood-done=" + done, 10000);
    if (!server) return state.SkipWithError("the fake server did not start");
    if (!WaitForFile(done, std::chrono::seconds(100))) return state.SkipWithError("the flood did not end");
    // The last pipe-fulls are still on their way to the readers.
    std::this_thread::sleep_for(std::chrono::milliseconds(500));
    state.counters["idle_growth_MiB"] = ResidentMiB() - baseline;

    const auto asked = Clock::now();
    LSP::RequestMessage request("fake/echo", nullptr);
    LSP::ResponseMessage response(nullptr);
    server->Write(request);
    server->Read(request.id, response);
    state.counters["next_reply_ms"] = std::chrono::duration<double, std::milli>(Clock::now() - asked).count();
    state.counters["next_reply_ok"] = response.id == request.id ? 1 : 0;
    state.counters["peak_growth_MiB"] = sampler.Peak() - baseline;
    bench::EndFakeServer(*server);
  }
}

BENCHMARK(Memory_abusive_server)->Iterations(1)->UseRealTime()->Unit(benchmark::kSecond);

// A watcher command whose output promises a 900 MB frame, then writes a 1 MiB line and
// 200 MB of short lines while the host traces them: what the host holds for it must stay
// small, and every line must arrive.
std::atomic<long> commandLines{0};

void Memory_command_output(benchmark::State& state) {
  xWatcherOptions options;
  options.trace = [](TraceType, const char* title, const char*) {
    if (std::string(title) == "Message") ++commandLines;
  };
  options.level = LSP::TraceLevel::Messages;
  options.timeout = 600000;
  options.useCommand = true;
  options.arguments =
      "printf 'Content-Length: 900000000\\r\\n\\r\\n'; head -c 1048576 /dev/zero | tr '\\0' x; echo; "
      "yes 'a line of command output' | head -n 8000000";
  for (auto _ : state) {
    commandLines = 0;
    const double baseline = ResidentMiB();
    PeakSampler sampler;
    vexil::xWatcherEvent event("bench", vexil::xFileTags("/tmp/a.cpp"), options);
    event.Start();
    while (!event.Finished()) std::this_thread::sleep_for(std::chrono::milliseconds(20));
    state.counters["peak_growth_MiB"] = sampler.Peak() - baseline;
    state.counters["lines_traced"] = static_cast<double>(commandLines);
  }
}

BENCHMARK(Memory_command_output)->Iterations(1)->UseRealTime()->Unit(benchmark::kSecond);

}  // namespace
