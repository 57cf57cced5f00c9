// Pipe traffic on POSIX: poll() gives readers a wake-up to check their stop flag, writes
// go to a non-blocking descriptor so a deadline can end them, and SIGPIPE is blocked for
// the writing thread so a dead server cannot kill the host.
#include "transport/pipe_io.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

#include <Poco/Exception.h>

namespace vexil {
namespace {

// Blocks SIGPIPE on this thread for its lifetime. A SIGPIPE raised meanwhile by our own
// write (one that failed with EPIPE) stays pending; it is consumed before the old mask
// returns, unless one was already pending for someone else. Only a thread that blocked
// SIGPIPE already can have one pending (it would have been delivered otherwise), so only
// such a thread pays for looking: the host's thread writes its requests itself, and every
// system call counts there.
class SigpipeBlock {
 public:
  SigpipeBlock() {
    sigemptyset(&pipeOnly_);
    sigaddset(&pipeOnly_, SIGPIPE);
    pthread_sigmask(SIG_BLOCK, &pipeOnly_, &previous_);
    if (sigismember(&previous_, SIGPIPE) == 1) {
      sigset_t pending;
      sigpending(&pending);
      wasPending_ = sigismember(&pending, SIGPIPE) == 1;
    }
  }

  ~SigpipeBlock() {
    if (raised_ && !wasPending_) ConsumePending();
    pthread_sigmask(SIG_SETMASK, &previous_, nullptr);
  }

  // A write failed with EPIPE: the kernel raised SIGPIPE for it.
  void Raised() { raised_ = true; }

  SigpipeBlock(const SigpipeBlock&) = delete;
  SigpipeBlock& operator=(const SigpipeBlock&) = delete;

 private:
  void ConsumePending() {
    sigset_t pending;
    sigpending(&pending);
    if (sigismember(&pending, SIGPIPE) != 1) return;
    const timespec now{0, 0};
    int saved = errno;
    while (sigtimedwait(&pipeOnly_, nullptr, &now) == -1 && errno == EINTR) {
    }
    errno = saved;
  }

  sigset_t pipeOnly_;
  sigset_t previous_;
  bool wasPending_ = false;
  bool raised_ = false;
};

}  // namespace

PipeWait WaitReadable(const Poco::Pipe& pipe, int milliseconds) {
  pollfd watched{pipe.readHandle(), POLLIN, 0};
  int ready = poll(&watched, 1, milliseconds);
  if (ready == 0 || (ready < 0 && errno == EINTR)) return PipeWait::Quiet;
  if (ready < 0 || (watched.revents & POLLNVAL)) return PipeWait::Closed;
  return PipeWait::Readable;
}

std::size_t ReadSome(const Poco::Pipe& pipe, char* buffer, std::size_t size) {
  for (;;) {
    ssize_t count = read(pipe.readHandle(), buffer, size);
    if (count >= 0) return static_cast<std::size_t>(count);
    if (errno != EINTR) throw Poco::ReadFileException("anonymous pipe");
  }
}

PipeWrite WriteAll(const Poco::Pipe& pipe, const char* data, std::size_t size,
                   std::chrono::steady_clock::time_point deadline, const std::atomic<bool>* stop) {
  const int descriptor = pipe.writeHandle();
  if (descriptor < 0) return PipeWrite::Failed;
  // Only our end is made non-blocking: the server's end of the pipe is its own.
  int flags = fcntl(descriptor, F_GETFL);
  if (flags < 0 || (!(flags & O_NONBLOCK) && fcntl(descriptor, F_SETFL, flags | O_NONBLOCK) < 0)) {
    return PipeWrite::Failed;
  }
  SigpipeBlock block;
  while (size > 0) {
    ssize_t count = write(descriptor, data, size);
    if (count > 0) {
      data += count;
      size -= static_cast<std::size_t>(count);
      continue;
    }
    if (count < 0 && errno == EPIPE) block.Raised();
    if (count < 0 && errno != EINTR && errno != EAGAIN && errno != EWOULDBLOCK) return PipeWrite::Failed;
    if (stop && *stop) return PipeWrite::Stopped;
    auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    if (left.count() <= 0) return PipeWrite::TimedOut;
    pollfd watched{descriptor, POLLOUT, 0};
    poll(&watched, 1, static_cast<int>(std::min<long long>(left.count(), kWriteStepMs)));
  }
  return PipeWrite::Written;
}

}  // namespace vexil
