// Tells a language server about files changed on disk in its workspace folders, as
// "workspace/didChangeWatchedFiles" does: the folders are watched with the change monitor,
// changes are batched over 100 ms and filtered by the watchers the server registered.
//
// Wiring it into a connection:
//   - announce kWatchedFilesCapabilities in "initialize" (ClientCapabilities::additions);
//   - construct the notifier with the workspace folders before sending "initialized" (so
//     that no change and no registration that follows it is missed), and call
//     ServerInitialized() once "initialized" is sent;
//   - hand the params of "client/registerCapability" and "client/unregisterCapability" to
//     Register / Unregister and answer the request (null, or the error they give);
//   - send each `send` text as the params of a "workspace/didChangeWatchedFiles"
//     notification, and trace each `error` text under "Error";
//   - destroy the notifier before the connection's transport goes.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "watch/change_monitor.h"

namespace vexil {

// The client capabilities to merge into "initialize": servers register their watchers only
// with a client that says it takes them.
extern const char kWatchedFilesCapabilities[];

class WatchedFilesNotifier {
 public:
  // Both run on the notifier's own thread, one at a time, never under its lock. They may
  // take their time (the destructor then waits for the one running) and may even destroy
  // the notifier.
  struct Callbacks {
    // The params of one notification: {"changes":[{"uri":"file:///...","type":1},...]},
    // types 1 created, 2 changed, 3 deleted. A rename is its old name deleted and its new
    // name created; a directory is reported under its own URI like a file.
    std::function<void(const std::string& params)> send;
    // Watching is incomplete: a folder cannot be watched, changes were lost (the folder is
    // then watched again), or the system's limit on watched directories was reached (said
    // once). One line of text ending in a line feed.
    std::function<void(const std::string& message)> error;
  };

  // A batch goes out this long after its first change.
  static constexpr std::chrono::milliseconds kBatchDelay{100};

  // Starts watching `folders` (absolute paths) and their subdirectories at once. Changes
  // are dropped until ServerInitialized(): a server reads the disk as it starts. Throws
  // only when a thread cannot be started.
  WatchedFilesNotifier(const std::vector<std::string>& folders, Callbacks callbacks);
  // Stops watching; changes not yet sent are dropped. Waits for a callback that is running
  // on another thread; called from a callback, it returns at once and the notifier's thread
  // ends when that callback returns.
  ~WatchedFilesNotifier();
  WatchedFilesNotifier(const WatchedFilesNotifier&) = delete;
  WatchedFilesNotifier& operator=(const WatchedFilesNotifier&) = delete;

  // From here on, changes are gathered and sent. Any thread.
  void ServerInitialized();
  // The params of "client/registerCapability" / "client/unregisterCapability" (see
  // FileWatcherRegistry). False, with the reason in `error`, for malformed params: the
  // request is then to be answered with an error. Any thread.
  bool Register(const std::string& params, std::string& error);
  bool Unregister(const std::string& params, std::string& error);

 private:
  struct State;

  // Watches folder `id` (its index plus one); says why when it cannot.
  void Watch(std::int64_t id);
  // After a watch error: watches the folder again when it still exists.
  void Rewatch(std::int64_t id);

  // Shared with the notifier's thread, which may outlive the notifier by one callback.
  std::shared_ptr<State> state_;
  std::thread sender_;
  ChangeMonitor monitor_;  // last: its handlers use the members above until it has stopped
};

}  // namespace vexil
