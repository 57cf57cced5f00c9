// Resident memory while the host is idle and a server floods it: 200 MB of stderr log
// lines, 50 MB of header-less stdout and 100,000 notifications, then one request that
// must still be answered. Growth is sampled through the flood, so the peak is what counts.
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

}  // namespace
