// Framing throughput over a real pipe: the output reader (its thread, parser and queue,
// bodies taken by this thread) against a bare read() + memchr splitter, for 1 KiB,
// 64 KiB and 16 MiB bodies.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdlib>
#include <string>
#include <thread>

#include "bare_splitter.h"
#include "transport/pipe_io.h"
#include "transport/pipe_reader.h"
#include "transport/reader_thread.h"

namespace {

constexpr std::size_t kStreamBytes = 32u << 20;
constexpr int kRepetitions = 10;

struct Stream {
  std::string bytes;
  int frames = 0;
};

// Frames of `bodySize` bytes, about kStreamBytes in all (at least two frames).
Stream Frames(std::size_t bodySize) {
  std::string body = "{\"jsonrpc\":\"2.0\",\"id\":1,\"result\":\"" + std::string(bodySize - 38, 'r') + "\"}";
  const std::string frame = "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
  Stream stream;
  while (stream.frames < 2 || stream.bytes.size() < kStreamBytes) {
    stream.bytes += frame;
    ++stream.frames;
  }
  return stream;
}

// Writes the stream from a thread of its own, as a server process would.
class Writer {
 public:
  Writer(const Poco::Pipe& pipe, const std::string& bytes)
      : thread_([&pipe, &bytes] {
          vexil::WriteAll(pipe, bytes.data(), bytes.size(), std::chrono::steady_clock::now() + std::chrono::minutes(1));
        }) {}
  ~Writer() { thread_.join(); }

 private:
  std::thread thread_;
};

void SetThroughput(benchmark::State& state, const Stream& stream) {
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(stream.bytes.size()));
}

void Framing_vexil(benchmark::State& state) {
  const Stream stream = Frames(static_cast<std::size_t>(state.range(0)));
  Poco::Pipe pipe;
  vexil::xPipeReader reader("stdout", pipe);
  vexil::ReaderThread thread;
  thread.Start(reader);
  for (auto _ : state) {
    Writer writer(pipe, stream.bytes);
    std::string body;
    for (int i = 0; i < stream.frames; ++i) {
      if (reader.Messages().WaitPop(body, std::chrono::seconds(10)) != vexil::MessageQueue::Wait::Taken) std::abort();
      benchmark::DoNotOptimize(body.data());
    }
  }
  reader.Stop();
  SetThroughput(state, stream);
}

void Framing_floor(benchmark::State& state) {
  const Stream stream = Frames(static_cast<std::size_t>(state.range(0)));
  Poco::Pipe pipe;
  bench::BareSplitter splitter(pipe.readHandle());
  for (auto _ : state) {
    Writer writer(pipe, stream.bytes);
    for (int i = 0; i < stream.frames; ++i) benchmark::DoNotOptimize(splitter.Next().data());
  }
  SetThroughput(state, stream);
}

void BodySizes(benchmark::internal::Benchmark* benchmark) {
  benchmark->Arg(1 << 10)->Arg(64 << 10)->Arg(16 << 20);
  benchmark->UseRealTime()->Repetitions(kRepetitions)->ReportAggregatesOnly(true)->Unit(benchmark::kMillisecond);
}

BENCHMARK(Framing_vexil)->Apply(BodySizes);
BENCHMARK(Framing_floor)->Apply(BodySizes);

}  // namespace
