// What each platform's notification backend provides to the change monitor, and the
// reports and deliveries that every backend words and performs the same way.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "watch/change_monitor.h"

namespace vexil {

class MonitorBackend {
 public:
  // Stops every watch, wakes the worker and joins it.
  virtual ~MonitorBackend() = default;
  // False once the worker's loop has ended.
  virtual bool Running() const = 0;
  // Opens and watches `root`; reports its own failures through the error-text handler.
  virtual bool Add(const std::string& root, std::int64_t id) = 0;
  virtual void Remove(std::int64_t id) = 0;
};

// This platform's backend, bound to handlers that outlive it. Null, with `errorText` set,
// when the notification channel cannot be created.
std::unique_ptr<MonitorBackend> CreateMonitorBackend(const MonitorHandlers& handlers,
                                                     std::string& errorText);

// Report texts shared by the backends; the host's tools match on them.
extern const char kChannelNotCreated[];
extern const char kWorkerNotRunning[];
std::string CannotOpenDirectory(unsigned long error);
std::string NotADirectory(const std::string& path);

// The worker's channel broke: says so, then tells every watch, in the order given, that it
// stopped working.
void ReportChannelFailure(const MonitorHandlers& handlers, unsigned long error,
                          const std::vector<std::int64_t>& ids);

}  // namespace vexil
