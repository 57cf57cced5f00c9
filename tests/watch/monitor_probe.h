// Records what a change monitor's three handlers were given and lets a test wait for a
// change, a set of changes or a watch's failure, on every platform's backend.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "watch/change_monitor.h"
#include "watch_fixture.h"

namespace watchtest {

using vexil::ChangeBatch;
using vexil::ChangeMonitor;
using Change = std::pair<std::string, unsigned>;

constexpr unsigned kAdded = 1, kRemoved = 2, kModified = 3, kOld = 4, kNew = 5;

// A directory's name in a batch ends in the platform's own separator.
#ifdef _WIN32
constexpr char kDirectoryMark = '\\';
#else
constexpr char kDirectoryMark = '/';
#endif
inline std::string DirectoryName(const std::string& name) { return name + kDirectoryMark; }

// Everything the monitor's three handlers were given.
class Probe {
 public:
  vexil::MonitorHandlers Handlers() {
    return {[this](std::int64_t id, const ChangeBatch& batch) {
              shared_.Update([&] { batches_.emplace_back(id, batch); });
            },
            [this](std::int64_t id) { shared_.Update([&] { watchErrors_.push_back(id); }); },
            [this](const std::string& text) { shared_.Update([&] { errorTexts_.push_back(text); }); }};
  }

  // Until every one of `changes` arrived for `id`, in whichever batches.
  bool WaitFor(std::int64_t id, const std::vector<Change>& changes) {
    return shared_.WaitUntil([&] {
      return std::all_of(changes.begin(), changes.end(),
                         [&](const Change& change) { return InOneBatchLocked(id, {change}); });
    });
  }
  bool WaitForWatchError(std::int64_t id) {
    return shared_.WaitUntil([&] { return FailedLocked(id); });
  }
  // Until `count` distinct names arrived for `id`, or `id` was declared broken.
  bool WaitUntilSettled(std::int64_t id, std::size_t count) {
    return shared_.WaitUntil([&] { return FailedLocked(id) || NamesLocked(id).size() >= count; });
  }
  // Did one batch carry all of `changes` (or, for one change, any batch)?
  bool SawInOneBatch(std::int64_t id, const std::vector<Change>& changes) {
    return shared_.Read([&] { return InOneBatchLocked(id, changes); });
  }
  // Did one batch carry exactly `expected`?
  bool SawBatch(std::int64_t id, const ChangeBatch& expected) {
    return shared_.Read([&] {
      return std::any_of(batches_.begin(), batches_.end(),
                         [&](const auto& entry) { return entry.first == id && entry.second == expected; });
    });
  }
  std::size_t EventsFor(std::int64_t id) {
    return shared_.Read([&] {
      std::size_t count = 0;
      for (const auto& entry : batches_) count += entry.first == id ? entry.second.size() : 0;
      return count;
    });
  }
  std::vector<std::string> ErrorTexts() { return shared_.Read([&] { return errorTexts_; }); }
  std::vector<std::int64_t> WatchErrors() { return shared_.Read([&] { return watchErrors_; }); }
  std::set<std::string> NamesFor(std::int64_t id) {
    return shared_.Read([&] { return NamesLocked(id); });
  }
 private:
  bool FailedLocked(std::int64_t id) const {
    return std::find(watchErrors_.begin(), watchErrors_.end(), id) != watchErrors_.end();
  }
  std::set<std::string> NamesLocked(std::int64_t id) const {
    std::set<std::string> names;
    for (const auto& [batchId, batch] : batches_)
      for (const Change& change : batch)
        if (batchId == id) names.insert(change.first);
    return names;
  }
  bool InOneBatchLocked(std::int64_t id, const std::vector<Change>& changes) const {
    return std::any_of(batches_.begin(), batches_.end(), [&](const auto& entry) {
      return entry.first == id && std::all_of(changes.begin(), changes.end(),
                                              [&](const Change& change) { return entry.second.count(change) > 0; });
    });
  }

  Shared shared_;
  std::vector<std::pair<std::int64_t, ChangeBatch>> batches_;
  std::vector<std::int64_t> watchErrors_;
  std::vector<std::string> errorTexts_;
};

// Holds the worker inside a batch until Release(), so that the changes made meanwhile
// pile up for the next read: they arrive together, or overflow it.
class WorkerGate {
 public:
  // `handlers` whose event handler waits at the gate before it passes a batch on.
  vexil::MonitorHandlers Wrap(vexil::MonitorHandlers handlers) {
    auto pass = handlers.event;
    handlers.event = [this, pass](std::int64_t id, const ChangeBatch& batch) {
      gate_.Update([&] { held_ = true; });
      gate_.WaitUntil([&] { return open_; });
      pass(id, batch);
    };
    return handlers;
  }
  // Watches `root` as `id` and returns once a first change there holds the worker.
  void HoldIn(ChangeMonitor& monitor, const TempDir& root, std::int64_t id) {
    ASSERT_TRUE(monitor.AddWatch(root.Path().string(), id));
    HoldOn(root / "first");
  }
  // Creates the watched file `path` and returns once the worker holds in a batch: the one
  // reporting `path` at the latest.
  void HoldOn(const std::string& path) {
    gate_.Update([&] { open_ = held_ = false; });
    Touch(path);
    ASSERT_TRUE(gate_.WaitUntil([&] { return held_; }));
  }
  void Release() {
    gate_.Update([&] { open_ = true; });
  }

 private:
  Shared gate_;
  bool held_ = false;
  bool open_ = true;
};

// A monitor whose handlers `probe` records through `gate`, a root for it to watch and a
// directory to fence with. Declared last, the monitor goes first.
class ChangeMonitorTest : public ::testing::Test {
 protected:
  bool Watch(std::int64_t id, vexil::WatchOptions options = {}) {
    return monitor.AddWatch(root.Path().string(), id, options);
  }

  TempDir root, fence;
  Probe probe;
  WorkerGate gate;
  ChangeMonitor monitor{gate.Wrap(probe.Handlers())};
};

// Changes that overflow what the platform holds for one watch until it is read; 0 when
// that is more than a test can make.
std::size_t OverflowingBurst();

// A change in another watch is queued behind everything before it, and a read's batches
// go out in id order: once the fence (with the highest id) has arrived, anything the other
// watches were going to report has been reported too.
inline void Fence(Probe& probe, const TempDir& fenceRoot, std::int64_t fenceId, const std::string& name) {
  Touch(fenceRoot / name);
  ASSERT_TRUE(probe.WaitFor(fenceId, {{name, kAdded}})) << name;
}

}  // namespace watchtest
