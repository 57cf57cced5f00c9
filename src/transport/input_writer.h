// The one writer of a server's standard input: a thread that writes queued frames in
// order, each within its deadline, so no caller ever blocks on a server that stops reading.
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include <Poco/Pipe.h>

#include "transport/deferred_trace.h"

namespace vexil {

// The host's messages wait for their own write; answers to the server's requests are
// queued and not waited for, so the output reader that hands them in never stops
// draining the server's output. A frame that misses its deadline closes the input, so a
// half-written frame is never followed by another. A message sent while nothing is queued
// or being written is written by the sending thread itself, within the same deadline: the
// hand-over to the writer thread and back costs a short request more than its write.
class InputWriter {
 public:
  enum class Outcome { Written, Failed, TimedOut };
  // Answers waiting to be written; a server that asks faster than it reads gets no more.
  static constexpr std::size_t kAnswerLimit = 1024;

  // Writes to the writing end of `pipe`; failures of answers and time-outs go to `trace`.
  InputWriter(Poco::Pipe pipe, DeferredTrace& trace);
  InputWriter(const InputWriter&) = delete;
  InputWriter& operator=(const InputWriter&) = delete;
  ~InputWriter() { Close(); }

  void Start();
  // Writes `bytes` after everything queued before them and returns once they are written
  // or have failed; they get `limitMs` from now. Any thread.
  Outcome Send(std::string bytes, int limitMs);
  // Queues `bytes`, the answer to a request for `method`, and returns at once; a failed
  // answer is traced once, "Answer Failed". Any thread.
  void Answer(std::string bytes, int limitMs, const std::string& method);
  // Ends the thread within one write step, drops what is queued and closes the input.
  void Close();
  // Whether a write missed its deadline (and the input was closed for it).
  bool TimedOut() const;

 private:
  using Clock = std::chrono::steady_clock;

  struct Frame {
    std::string bytes;
    Clock::time_point deadline;
    int limitMs;
    bool answer;         // to a request of the server's, rather than the host's own message
    std::string method;  // of the request an answer is for
    bool done = false;
    Outcome outcome = Outcome::Failed;
  };

  void Run();
  // Writes `frame`, which the caller has claimed the pipe for (`writing_`), and settles
  // the outcome: a frame that was not written closes the input.
  void WriteClaimed(Frame& frame);
  Outcome Write(Frame& frame);
  void Report(const Frame& frame, Outcome outcome);
  // Under the lock: marks `frame` done and wakes its sender.
  void Finish(Frame& frame, Outcome outcome);
  // Under the lock: fails every queued frame.
  void FailQueued(bool report);

  Poco::Pipe pipe_;
  DeferredTrace& trace_;
  mutable std::mutex mutex_;
  std::condition_variable queued_;
  std::condition_variable finished_;
  std::deque<std::shared_ptr<Frame>> frames_;
  std::size_t answers_ = 0;  // answers among the queued frames
  bool started_ = false;
  bool closed_ = false;    // nothing more is written: a write failed, or Close
  bool timedOut_ = false;
  bool writing_ = false;   // a thread writes to the pipe: it is not the other one's turn
  std::atomic<bool> stopping_{false};
  std::thread thread_;
};

}  // namespace vexil
