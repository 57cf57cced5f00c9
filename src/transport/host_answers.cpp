// Waiting server requests by id, answered by the host or declined by a timer thread that
// sleeps until the earliest deadline. Answers are only queued, so the lock is never held
// across a blocking call.
#include "transport/host_answers.h"

#include <algorithm>

#include "vexil/json/json.h"

namespace vexil {
namespace {

constexpr int kRequestNotAnswered = -32803;

}  // namespace

std::string ResultResponse(const std::string& id, const std::string& resultJson) {
  return R"({"jsonrpc":"2.0","id":)" + id + R"(,"result":)" + resultJson + "}";
}

std::string ErrorResponse(const std::string& id, int code, const std::string& message) {
  LSP::xWriter error;
  error.StartObject();
  error.Int("code", code);
  error.RequiredString("message", message);
  error.EndObject();
  return R"({"jsonrpc":"2.0","id":)" + id + R"(,"error":)" + error.GetString() + "}";
}

HostAnswers::~HostAnswers() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stopping_ = true;
    changed_.notify_all();
  }
  if (timer_.joinable()) timer_.join();
}

void HostAnswers::Attach(Send send) {
  std::lock_guard<std::mutex> lock(mutex_);
  pending_.clear();
  send_ = std::move(send);
}

void HostAnswers::Expect(const std::string& id, const std::string& method) {
  std::lock_guard<std::mutex> lock(mutex_);
  auto [at, added] = pending_.insert_or_assign(id, Request{method, Clock::now() + limit_});
  if (pending_.size() > kPendingLimit) return DeclineLocked(at);
  if (!timer_.joinable() && !stopping_) timer_ = std::thread([this] { RunTimer(); });
  changed_.notify_all();
}

bool HostAnswers::Answer(const std::string& id, std::string body) {
  std::lock_guard<std::mutex> lock(mutex_);
  auto at = pending_.find(id);
  if (at == pending_.end()) return false;
  if (send_) send_(std::move(body), at->second.method);
  pending_.erase(at);
  return true;
}

void HostAnswers::Decline(const std::string& id) {
  std::lock_guard<std::mutex> lock(mutex_);
  auto at = pending_.find(id);
  if (at != pending_.end()) DeclineLocked(at);
}

void HostAnswers::DeclineAll() {
  std::lock_guard<std::mutex> lock(mutex_);
  while (!pending_.empty()) DeclineLocked(pending_.begin());
}

void HostAnswers::DeclineLocked(std::map<std::string, Request>::iterator at) {
  if (send_) send_(ErrorResponse(at->first, kRequestNotAnswered, "Request not answered"), at->second.method);
  pending_.erase(at);
}

void HostAnswers::RunTimer() {
  std::unique_lock<std::mutex> lock(mutex_);
  while (!stopping_) {
    Clock::time_point now = Clock::now();
    Clock::time_point next = Clock::time_point::max();
    for (auto at = pending_.begin(); at != pending_.end();) {
      if (at->second.deadline <= now) {
        DeclineLocked(at++);
      } else {
        next = std::min(next, at->second.deadline);
        ++at;
      }
    }
    if (next == Clock::time_point::max()) {
      changed_.wait(lock);
    } else {
      changed_.wait_until(lock, next);
    }
  }
}

}  // namespace vexil
