// The server requests that wait for the host's answer. Each is answered exactly once: by
// the host, from any thread, or with error -32803 "Request not answered" once its time is
// up or the connection ends, so that no server waits for ever on a host that forgot it.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <thread>

namespace vexil {

class HostAnswers {
 public:
  using Clock = std::chrono::steady_clock;
  // Queues `body`, the answer to a request of `method`, for writing; never blocks.
  using Send = std::function<void(std::string body, const std::string& method)>;

  static constexpr std::chrono::milliseconds kLimit{30000};
  // Requests waiting at once; a server that asks faster than the host answers gets the
  // time-out's answer at once beyond this.
  static constexpr std::size_t kPendingLimit = 1024;

  explicit HostAnswers(std::chrono::milliseconds limit = kLimit) : limit_(limit) {}
  HostAnswers(const HostAnswers&) = delete;
  HostAnswers& operator=(const HostAnswers&) = delete;
  ~HostAnswers();

  // Answers go to `send` from now on; requests of an earlier launch are forgotten, as its
  // server is gone. An empty `send` sends nothing more.
  void Attach(Send send);
  // Remembers the request `id` (its JSON text) of `method` until it is answered.
  void Expect(const std::string& id, const std::string& method);
  // Sends `body` as the answer to `id`; false when `id` does not wait (unknown, or
  // answered already). Any thread.
  bool Answer(const std::string& id, std::string body);
  // Answers `id` with the time-out's error now, if it waits.
  void Decline(const std::string& id);
  // Answers every waiting request with the time-out's error, as the connection ends.
  void DeclineAll();

 private:
  struct Request {
    std::string method;
    Clock::time_point deadline;
  };

  // Under the lock: sends the time-out's error for the request at `at` and forgets it.
  void DeclineLocked(std::map<std::string, Request>::iterator at);
  void RunTimer();

  const std::chrono::milliseconds limit_;
  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::map<std::string, Request> pending_;
  Send send_;
  bool stopping_ = false;
  std::thread timer_;  // started with the first request
};

// The JSON text of a response to the request `id` (JSON text) carrying `resultJson`.
std::string ResultResponse(const std::string& id, const std::string& resultJson);
// The JSON text of an error response to the request `id`.
std::string ErrorResponse(const std::string& id, int code, const std::string& message);

}  // namespace vexil
