// The change monitor against a bare inotify loop (the floor) in the same run: events per
// second for a burst of file creations, the delay from a rename() to its callback, and the
// start-up of a watch over a large tree of directories.
#include <benchmark/benchmark.h>
#include <dirent.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <deque>

#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "vexil_test/support.h"
#include "watch/change_monitor.h"

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

class TempDir : public vexil_test::TempDirectory {
 public:
  TempDir() : TempDirectory(vexil_test::MemoryBackedBase()) {}
  std::string Path() const { return TempDirectory::Path().string(); }
};

// Counts what a watcher reported; the measuring thread waits for a total.
class Arrivals {
 public:
  void Add(std::size_t count) {
    {
      std::lock_guard<std::mutex> lock(mutex_);
      total_ += count;
    }
    changed_.notify_all();
  }
  void WaitFor(std::size_t total) {
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [&] { return total_ >= total; });
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  std::size_t total_ = 0;
};

// The floor: one watch, a reader thread and the same hand-over to the measuring thread as
// the monitor's callback has, but no tree, no batches and no names.
class BareLoop {
 public:
  BareLoop(const std::string& directory, Arrivals& arrivals, std::uint32_t counted)
      : fd_(inotify_init1(IN_CLOEXEC)), stopName_(".stop"), directory_(directory) {
    inotify_add_watch(fd_, directory.c_str(), IN_CREATE | IN_MOVED_TO);
    reader_ = std::thread([this, &arrivals, counted] { Read(arrivals, counted); });
  }
  ~BareLoop() {
    std::ofstream(directory_ + "/" + stopName_).put('x');
    reader_.join();
    close(fd_);
  }

 private:
  void Read(Arrivals& arrivals, std::uint32_t counted) {
    alignas(inotify_event) char buffer[65536];
    for (;;) {
      const ssize_t got = read(fd_, buffer, sizeof buffer);
      if (got <= 0) return;
      std::size_t count = 0;
      for (ssize_t offset = 0; offset < got;) {
        const auto* event = reinterpret_cast<const inotify_event*>(buffer + offset);
        if (event->len && stopName_ == event->name) return;
        if (event->mask & counted) ++count;
        offset += static_cast<ssize_t>(sizeof(inotify_event) + event->len);
      }
      arrivals.Add(count);
    }
  }

  int fd_;
  std::string stopName_;
  std::string directory_;
  std::thread reader_;
};

vexil::MonitorHandlers Counting(Arrivals& arrivals) {
  return {[&arrivals](std::int64_t, const vexil::ChangeBatch& batch) { arrivals.Add(batch.size()); },
          [](std::int64_t) { std::abort(); }, [](const std::string&) {}};
}

double Seconds(Clock::duration duration) { return std::chrono::duration<double>(duration).count(); }

struct Totals {
  double monitor = 0;
  double floor = 0;
};

// Each iteration measures the monitor, then the floor, on fresh directories; the monitor's
// figure is the benchmark's time.
template <typename Measure>
Totals MeasureBoth(benchmark::State& state, vexil::MonitorHandlers (*handlers)(Arrivals&),
                   std::uint32_t floorCounts, Measure measure) {
  Totals totals;
  for (auto _ : state) {
    {
      TempDir dir;
      Arrivals arrivals;
      vexil::ChangeMonitor monitor(handlers(arrivals));
      monitor.AddWatch(dir.Path(), 1);
      const double seconds = measure(dir, arrivals);
      totals.monitor += seconds;
      state.SetIterationTime(seconds);
    }
    TempDir dir;
    Arrivals arrivals;
    BareLoop floor(dir.Path(), arrivals, floorCounts);
    totals.floor += measure(dir, arrivals);
  }
  return totals;
}

constexpr std::size_t kBurst = 10000;

double TimeBurst(const TempDir& dir, Arrivals& arrivals) {
  const auto start = Clock::now();
  for (std::size_t i = 0; i < kBurst; ++i) std::ofstream(dir / ("f" + std::to_string(i))).put('x');
  arrivals.WaitFor(kBurst);
  return Seconds(Clock::now() - start);
}

void BM_CreationBurst(benchmark::State& state) {
  const Totals seconds = MeasureBoth(state, Counting, IN_CREATE, TimeBurst);
  const double events = static_cast<double>(kBurst * state.iterations());
  state.counters["burst"] = static_cast<double>(kBurst);
  state.counters["monitor_events_per_s"] = events / seconds.monitor;
  state.counters["floor_events_per_s"] = events / seconds.floor;
  state.counters["throughput_ratio"] = seconds.floor / seconds.monitor;
}

constexpr int kRenames = 200;

// Mean seconds from a rename() to the watcher's report of it.
double TimeRenames(const TempDir& dir, Arrivals& arrivals) {
  std::ofstream(dir / "a").put('x');
  arrivals.WaitFor(1);
  Clock::duration total{};
  for (int i = 0; i < kRenames; ++i) {
    const bool even = i % 2 == 0;
    const auto start = Clock::now();
    fs::rename(dir / (even ? "a" : "b"), dir / (even ? "b" : "a"));
    arrivals.WaitFor(static_cast<std::size_t>(i) + 2);
    total += Clock::now() - start;
  }
  return Seconds(total) / kRenames;
}

// One arrival per rename from both: the monitor's pair comes as one batch.
vexil::MonitorHandlers CountingBatches(Arrivals& arrivals) {
  auto handlers = Counting(arrivals);
  handlers.event = [&arrivals](std::int64_t, const vexil::ChangeBatch&) { arrivals.Add(1); };
  return handlers;
}

void BM_RenameLatency(benchmark::State& state) {
  const Totals seconds = MeasureBoth(state, CountingBatches, IN_CREATE | IN_MOVED_TO, TimeRenames);
  const double iterations = static_cast<double>(state.iterations());
  state.counters["monitor_latency_us"] = seconds.monitor / iterations * 1e6;
  state.counters["floor_latency_us"] = seconds.floor / iterations * 1e6;
  state.counters["latency_ratio"] = seconds.monitor / seconds.floor;
}

// A project tree of this many directories, fewer when the user's inotify watches are fewer:
// other watchers of the user hold some, so at most half of them are taken.
constexpr std::size_t kTreeDirectories = 50000;

std::size_t TreeSize() {
  std::size_t limit = 0;
  std::ifstream("/proc/sys/fs/inotify/max_user_watches") >> limit;
  return limit ? std::min(kTreeDirectories, limit / 2) : kTreeDirectories;
}

// Directories breadth first, 36 to a parent, as a source tree a few levels deep.
void MakeTree(const std::string& root, std::size_t count) {
  std::deque<std::string> parents{root};
  for (std::size_t made = 0; made < count; parents.pop_front()) {
    for (int child = 0; child < 36 && made < count; ++child, ++made) {
      const std::string path = parents.front() + "/d" + std::to_string(child);
      if (mkdir(path.c_str(), 0755) != 0) std::abort();
      parents.push_back(path);
    }
  }
}

// The floor's start-up: the tree walked with readdir(), each directory watched by path
// for the entry events the monitor asks for. Returns the watches added.
std::size_t WatchTree(int fd, std::string& path) {
  std::size_t added =
      inotify_add_watch(fd, path.c_str(), IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_DELETE_SELF |
                                              IN_MOVE_SELF | IN_EXCL_UNLINK | IN_ONLYDIR) >= 0;
  DIR* directory = opendir(path.c_str());
  if (!directory) return added;
  while (const dirent* entry = readdir(directory)) {
    if (entry->d_type != DT_DIR || entry->d_name[0] == '.') continue;
    const std::size_t length = path.size();
    path += '/';
    path += entry->d_name;
    added += WatchTree(fd, path);
    path.resize(length);
  }
  closedir(directory);
  return added;
}

double Median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  return values[values.size() / 2];
}

// Medians, not means: a start-up takes a second or more, and a burst of load on a shared
// machine would otherwise weigh on whichever side it fell.
void BM_StartupOverTree(benchmark::State& state) {
  const TempDir dir;
  const std::size_t directories = TreeSize();
  MakeTree(dir.Path(), directories);
  std::vector<double> monitor;
  std::vector<double> floor;
  for (auto _ : state) {
    {
      Arrivals arrivals;
      const auto start = Clock::now();
      vexil::ChangeMonitor watcher(Counting(arrivals));
      if (!watcher.AddWatch(dir.Path(), 1)) return state.SkipWithError("the monitor could not watch the tree");
      monitor.push_back(Seconds(Clock::now() - start));
      state.SetIterationTime(monitor.back());
    }
    const auto start = Clock::now();
    const int fd = inotify_init1(IN_CLOEXEC);
    std::string root = dir.Path();
    const std::size_t added = WatchTree(fd, root);
    floor.push_back(Seconds(Clock::now() - start));
    close(fd);
    if (added != directories + 1) return state.SkipWithError("the bare loop could not watch the tree");
  }
  state.counters["directories"] = static_cast<double>(directories);
  state.counters["monitor_ms"] = Median(monitor) * 1e3;
  state.counters["floor_ms"] = Median(floor) * 1e3;
  state.counters["startup_ratio"] = Median(monitor) / Median(floor);
}

BENCHMARK(BM_CreationBurst)->UseManualTime()->Iterations(10)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_RenameLatency)->UseManualTime()->Iterations(10)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_StartupOverTree)->UseManualTime()->Iterations(7)->Unit(benchmark::kMillisecond);

}  // namespace
