// The thread that hands a server's own messages and its exit to the host's message
// handler, one at a time and in arrival order, so that neither the reader (which must
// keep draining the server) nor any lock of the library waits on the host's code.
#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <utility>

#include "vexil/host/server_messages.h"

namespace vexil {

// One notification or request of the server, or its exit, as the host's handler gets it.
struct HostMessage {
  std::string method;
  std::string id;  // a request's id as JSON text; empty for a notification
  std::string params;
};

// The handler a host set on its connection, with its user data; set and read from any thread.
class HandlerSlot {
 public:
  void Set(xMessageHandler handler, void* userData) {
    std::lock_guard<std::mutex> lock(mutex_);
    handler_ = handler;
    userData_ = userData;
  }
  bool IsSet() const { return Get().first != nullptr; }
  std::pair<xMessageHandler, void*> Get() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return {handler_, userData_};
  }

 private:
  mutable std::mutex mutex_;
  xMessageHandler handler_ = nullptr;
  void* userData_ = nullptr;
};

class MessageDispatcher {
 public:
  // Whether the server has ended, and its exit status when it has.
  using ExitCheck = std::function<bool(int& status)>;
  // A request that will never reach the host (no handler when its turn came, or dropped),
  // by its id, so that it can be answered otherwise.
  using Unhandled = std::function<void(const std::string& id)>;

  // A handler slower than the server must not grow the host without end: beyond this the
  // oldest messages give way.
  static constexpr std::size_t kByteLimit = std::size_t{16} << 20;
  // How long Stop waits for the handler.
  static constexpr std::chrono::milliseconds kStopLimit{1000};

  // `handler`, `ended` and `unhandled` are used only until Stop returns.
  MessageDispatcher(const HandlerSlot& handler, ExitCheck ended, Unhandled unhandled);
  MessageDispatcher(const MessageDispatcher&) = delete;
  MessageDispatcher& operator=(const MessageDispatcher&) = delete;
  ~MessageDispatcher() { Stop(); }

  void Start();
  // Queues a message for the handler; any thread. Nothing is queued after Stop.
  void Post(HostMessage message);
  // The server's output has ended: its exit is reported as soon as the process is gone.
  void OutputEnded();
  // The handler was set or cleared.
  void Wake();
  // Hands the handler what is queued and then the server's exit if it has ended, waiting
  // at most kStopLimit; a handler call still running then finishes on its own thread and
  // nothing follows it. Returns at once when stopped before.
  void Stop();

 private:
  struct State;
  static void Run(const std::shared_ptr<State>& state);

  // Shared with the thread, which outlives this object when the handler does not return.
  std::shared_ptr<State> state_;
  std::thread thread_;
};

}  // namespace vexil
