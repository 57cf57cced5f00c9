// Pipe traffic on Windows: anonymous pipes cannot be waited on, so readers peek in short
// steps until bytes arrive, the writer goes away, or their wait is over; a write blocks in
// WriteFile until a timer cancels it at its deadline.
#include "transport/pipe_io.h"

#include <windows.h>

#include <algorithm>

#include <Poco/Exception.h>

namespace vexil {
namespace {

constexpr DWORD kPeekStepMs = 5;

// Ends the calling thread's blocking WriteFile once the deadline has passed or the stop
// flag is set. Anonymous pipes have no non-blocking or overlapped writes, so a timer looks
// every step and cancels the thread's synchronous I/O; it keeps cancelling until the
// watch ends, so a cancel that came between two WriteFile calls cannot be lost.
class WriteWatch {
 public:
  WriteWatch(std::chrono::steady_clock::time_point deadline, const std::atomic<bool>* stop)
      : deadline_(deadline), stop_(stop) {
    thread_ = OpenThread(THREAD_TERMINATE, FALSE, GetCurrentThreadId());
    if (thread_ && !CreateTimerQueueTimer(&timer_, nullptr, &WriteWatch::OnTimer, this, kWriteStepMs, kWriteStepMs,
                                          WT_EXECUTEDEFAULT)) {
      timer_ = nullptr;
    }
  }
  ~WriteWatch() {
    // Waits for a running look to end, so none touches the watch after this.
    if (timer_) DeleteTimerQueueTimer(nullptr, timer_, INVALID_HANDLE_VALUE);
    if (thread_) CloseHandle(thread_);
  }
  WriteWatch(const WriteWatch&) = delete;
  WriteWatch& operator=(const WriteWatch&) = delete;

  bool Armed() const { return timer_ != nullptr; }
  // Written while the write may go on; TimedOut or Stopped once it has been ended.
  PipeWrite Verdict() const { return verdict_; }

 private:
  static void CALLBACK OnTimer(void* self, BOOLEAN) { static_cast<WriteWatch*>(self)->Look(); }

  void Look() {
    if (stop_ && *stop_) {
      verdict_ = PipeWrite::Stopped;
    } else if (std::chrono::steady_clock::now() >= deadline_) {
      verdict_ = PipeWrite::TimedOut;
    } else if (verdict_ == PipeWrite::Written) {
      return;
    }
    CancelSynchronousIo(thread_);
  }

  const std::chrono::steady_clock::time_point deadline_;
  const std::atomic<bool>* stop_;
  std::atomic<PipeWrite> verdict_{PipeWrite::Written};
  HANDLE thread_ = nullptr;
  HANDLE timer_ = nullptr;
};

}  // namespace

PipeWait WaitReadable(const Poco::Pipe& pipe, int milliseconds) {
  const ULONGLONG deadline = GetTickCount64() + static_cast<ULONGLONG>(std::max(milliseconds, 0));
  for (;;) {
    DWORD available = 0;
    if (!PeekNamedPipe(pipe.readHandle(), nullptr, 0, nullptr, &available, nullptr)) {
      // A broken pipe is end of file: let the read report it.
      return GetLastError() == ERROR_BROKEN_PIPE ? PipeWait::Readable : PipeWait::Closed;
    }
    if (available > 0) return PipeWait::Readable;
    if (GetTickCount64() >= deadline) return PipeWait::Quiet;
    Sleep(kPeekStepMs);
  }
}

std::size_t ReadSome(const Poco::Pipe& pipe, char* buffer, std::size_t size) {
  DWORD available = 0;
  if (!PeekNamedPipe(pipe.readHandle(), nullptr, 0, nullptr, &available, nullptr)) {
    if (GetLastError() == ERROR_BROKEN_PIPE) return 0;
    throw Poco::ReadFileException("anonymous pipe");
  }
  // Reading no more than is there keeps ReadFile from blocking.
  DWORD wanted = static_cast<DWORD>(std::min<std::size_t>(size, std::max<DWORD>(available, 1)));
  DWORD count = 0;
  if (ReadFile(pipe.readHandle(), buffer, wanted, &count, nullptr)) return count;
  if (GetLastError() == ERROR_BROKEN_PIPE) return 0;
  throw Poco::ReadFileException("anonymous pipe");
}

PipeWrite WriteAll(const Poco::Pipe& pipe, const char* data, std::size_t size,
                   std::chrono::steady_clock::time_point deadline, const std::atomic<bool>* stop) {
  HANDLE handle = pipe.writeHandle();
  if (handle == INVALID_HANDLE_VALUE) return PipeWrite::Failed;
  WriteWatch watch(deadline, stop);
  if (!watch.Armed()) return PipeWrite::Failed;
  while (size > 0) {
    if (watch.Verdict() != PipeWrite::Written) return watch.Verdict();
    DWORD count = 0;
    DWORD chunk = static_cast<DWORD>(std::min<std::size_t>(size, 1u << 30));
    if (!WriteFile(handle, data, chunk, &count, nullptr)) {
      bool ended = GetLastError() == ERROR_OPERATION_ABORTED && watch.Verdict() != PipeWrite::Written;
      return ended ? watch.Verdict() : PipeWrite::Failed;
    }
    data += count;
    size -= count;
  }
  return PipeWrite::Written;
}

}  // namespace vexil
