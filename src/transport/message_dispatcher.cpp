// The dispatch thread: takes queued messages in order and calls the handler with no lock
// held; when idle with a handler set it looks every 100 ms whether the server has ended.
#include "transport/message_dispatcher.h"

#include <condition_variable>
#include <deque>
#include <optional>

namespace vexil {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kExitPoll{100};
// A server that ended while a process it started still holds its output open is reported
// ended this long after, without waiting for the end of its output.
constexpr std::chrono::milliseconds kOutputGrace{500};

std::size_t Footprint(const HostMessage& message) {
  return sizeof message + message.method.capacity() + message.id.capacity() + message.params.capacity();
}

}  // namespace

struct MessageDispatcher::State {
  State(const HandlerSlot& handler, ExitCheck ended, Unhandled unhandled)
      : handler(handler), ended(std::move(ended)), unhandled(std::move(unhandled)) {}

  // Under the lock: queues the exit event once the server has ended and its output has
  // been read (or the grace has passed, or the dispatcher stops); true when it did.
  bool QueueExit() {
    if (exitQueued || (!stopping && !handler.IsSet())) return false;
    int status = -1;
    if (!ended(status)) return false;
    Clock::time_point now = Clock::now();
    if (!endedSince) endedSince = now;
    if (!stopping && !outputEnded && now - *endedSince < kOutputGrace) return false;
    messages.push_back({"exit", "", "{\"status\":" + std::to_string(status) + "}"});
    exitQueued = true;
    return true;
  }

  // Under the lock: drops the oldest messages beyond the limit; a dropped request is
  // handed to `unhandled`.
  void Bound() {
    while (bytes > kByteLimit && messages.size() > 1) {
      if (!messages.front().id.empty()) unhandled(messages.front().id);
      bytes -= Footprint(messages.front());
      messages.pop_front();
    }
  }

  const HandlerSlot& handler;
  const ExitCheck ended;
  const Unhandled unhandled;
  std::mutex mutex;
  std::condition_variable wake;
  std::condition_variable finished;
  std::deque<HostMessage> messages;
  std::size_t bytes = 0;
  std::optional<Clock::time_point> endedSince;
  bool outputEnded = false;
  bool exitQueued = false;
  bool stopping = false;
  bool done = false;       // the thread has ended
  bool abandoned = false;  // Stop gave up waiting: nothing more is handed out
};

MessageDispatcher::MessageDispatcher(const HandlerSlot& handler, ExitCheck ended, Unhandled unhandled)
    : state_(std::make_shared<State>(handler, std::move(ended), std::move(unhandled))) {}

void MessageDispatcher::Start() {
  if (thread_.joinable()) return;
  std::shared_ptr<State> state = state_;
  thread_ = std::thread([state] { Run(state); });
}

void MessageDispatcher::Post(HostMessage message) {
  std::lock_guard<std::mutex> lock(state_->mutex);
  if (state_->stopping) {
    if (!message.id.empty()) state_->unhandled(message.id);
    return;
  }
  state_->bytes += Footprint(message);
  state_->messages.push_back(std::move(message));
  state_->Bound();
  state_->wake.notify_one();
}

void MessageDispatcher::OutputEnded() {
  std::lock_guard<std::mutex> lock(state_->mutex);
  state_->outputEnded = true;
  state_->wake.notify_one();
}

void MessageDispatcher::Wake() {
  std::lock_guard<std::mutex> lock(state_->mutex);
  state_->wake.notify_one();
}

void MessageDispatcher::Stop() {
  std::unique_lock<std::mutex> lock(state_->mutex);
  if (state_->stopping && !thread_.joinable()) return;
  state_->stopping = true;
  state_->wake.notify_one();
  if (!thread_.joinable()) return;
  bool done = state_->finished.wait_for(lock, kStopLimit, [this] { return state_->done; });
  state_->abandoned = !done;
  lock.unlock();
  // A handler that waits for the thread calling Stop (Exit on the host's UI thread) would
  // otherwise deadlock it; the thread keeps only the shared state from here on.
  if (done) {
    thread_.join();
  } else {
    thread_.detach();
  }
}

void MessageDispatcher::Run(const std::shared_ptr<State>& state) {
  State& s = *state;
  std::unique_lock<std::mutex> lock(s.mutex);
  while (!s.abandoned) {
    if (s.messages.empty() && !s.QueueExit()) {
      if (s.stopping) break;
      if (s.handler.IsSet()) {
        s.wake.wait_for(lock, kExitPoll);
      } else {
        s.wake.wait(lock);
      }
      continue;
    }
    HostMessage message = std::move(s.messages.front());
    s.messages.pop_front();
    s.bytes -= Footprint(message);
    auto [handler, userData] = s.handler.Get();
    if (!handler) {
      if (!message.id.empty()) s.unhandled(message.id);
      continue;
    }
    lock.unlock();
    handler(userData, message.method.c_str(), message.id.empty() ? nullptr : message.id.c_str(),
            message.params.c_str());
    lock.lock();
  }
  s.done = true;
  s.finished.notify_all();
}

}  // namespace vexil
