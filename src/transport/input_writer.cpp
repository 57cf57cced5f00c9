// Frames written in order by one thread, each bounded by its deadline; a failed or late
// write closes the input, and whatever was queued behind it fails at once.
#include "transport/input_writer.h"

#include "transport/pipe_io.h"

namespace vexil {
namespace {

const char* const kInputClosed = "the server's input is closed";

}  // namespace

InputWriter::InputWriter(Poco::Pipe pipe, DeferredTrace& trace) : pipe_(std::move(pipe)), trace_(trace) {}

void InputWriter::Start() {
  std::lock_guard<std::mutex> lock(mutex_);
  if (started_ || closed_) return;
  started_ = true;
  thread_ = std::thread([this] { Run(); });
}

InputWriter::Outcome InputWriter::Send(std::string bytes, int limitMs) {
  auto frame = std::make_shared<Frame>(Frame{std::move(bytes), Clock::now() + std::chrono::milliseconds(limitMs),
                                             limitMs, false, std::string()});
  std::unique_lock<std::mutex> lock(mutex_);
  if (!started_ || closed_) return Outcome::Failed;
  if (frames_.empty() && !writing_) {
    writing_ = true;
    lock.unlock();
    WriteClaimed(*frame);
    return frame->outcome;
  }
  frames_.push_back(frame);
  queued_.notify_one();
  // Bounded: every frame ahead of this one ends by its own deadline.
  finished_.wait(lock, [&] { return frame->done; });
  return frame->outcome;
}

void InputWriter::Answer(std::string bytes, int limitMs, const std::string& method) {
  const char* refusal = nullptr;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    if (!started_ || closed_) {
      refusal = kInputClosed;
    } else if (answers_ >= kAnswerLimit) {
      refusal = "1024 earlier answers are still unwritten";
    } else {
      frames_.push_back(std::make_shared<Frame>(
          Frame{std::move(bytes), Clock::now() + std::chrono::milliseconds(limitMs), limitMs, true, method}));
      ++answers_;
      queued_.notify_one();
    }
  }
  if (refusal) trace_.Error("Answer Failed: %s: %s\n", method.c_str(), refusal);
}

void InputWriter::Close() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stopping_ = true;
    queued_.notify_one();
  }
  if (thread_.joinable()) thread_.join();
  std::unique_lock<std::mutex> lock(mutex_);
  // A sender writing on its own thread sees the stop flag within one write step.
  finished_.wait(lock, [this] { return !writing_; });
  closed_ = true;
  // The connection is going away: its unwritten answers need no report.
  FailQueued(false);
  pipe_.close(Poco::Pipe::CLOSE_WRITE);
}

bool InputWriter::TimedOut() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return timedOut_;
}

void InputWriter::Run() {
  for (;;) {
    std::shared_ptr<Frame> frame;
    {
      std::unique_lock<std::mutex> lock(mutex_);
      queued_.wait(lock, [this] { return stopping_ || (!frames_.empty() && !writing_); });
      if (stopping_) return;
      frame = frames_.front();
      frames_.pop_front();
      if (frame->answer) --answers_;
      writing_ = true;
    }
    WriteClaimed(*frame);
  }
}

void InputWriter::WriteClaimed(Frame& frame) {
  Outcome outcome = Write(frame);
  if (outcome != Outcome::Written) Report(frame, outcome);
  std::lock_guard<std::mutex> lock(mutex_);
  writing_ = false;
  Finish(frame, outcome);
  // What was queued meanwhile is the writer thread's to write.
  if (!frames_.empty()) queued_.notify_one();
  if (outcome == Outcome::Written) return;
  closed_ = true;
  timedOut_ = timedOut_ || outcome == Outcome::TimedOut;
  FailQueued(true);
}

InputWriter::Outcome InputWriter::Write(Frame& frame) {
  switch (WriteAll(pipe_, frame.bytes.data(), frame.bytes.size(), frame.deadline, &stopping_)) {
    case PipeWrite::Written:
      return Outcome::Written;
    case PipeWrite::TimedOut:
      // Part of the frame may be in the pipe: nothing may follow it.
      pipe_.close(Poco::Pipe::CLOSE_WRITE);
      return Outcome::TimedOut;
    default:
      pipe_.close(Poco::Pipe::CLOSE_WRITE);
      return Outcome::Failed;
  }
}

void InputWriter::Report(const Frame& frame, Outcome outcome) {
  if (outcome == Outcome::TimedOut) {
    trace_.Error("Write Timeout: the server read nothing for %d ms; its input is closed.\n", frame.limitMs);
  }
  if (!frame.answer || stopping_) return;
  if (outcome == Outcome::TimedOut) {
    trace_.Error("Answer Failed: %s: the server read nothing for %d ms\n", frame.method.c_str(), frame.limitMs);
  } else {
    trace_.Error("Answer Failed: %s: %s\n", frame.method.c_str(), kInputClosed);
  }
}

void InputWriter::Finish(Frame& frame, Outcome outcome) {
  frame.outcome = outcome;
  frame.done = true;
  finished_.notify_all();
}

void InputWriter::FailQueued(bool report) {
  for (const std::shared_ptr<Frame>& frame : frames_) {
    if (report && frame->answer) {
      trace_.Error("Answer Failed: %s: %s\n", frame->method.c_str(), kInputClosed);
    }
    Finish(*frame, Outcome::Failed);
  }
  frames_.clear();
  answers_ = 0;
}

}  // namespace vexil
