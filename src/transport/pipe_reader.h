// xPipeReader and xPipeErrReader: thread bodies that turn a child's output pipe into a
// queue of message bodies (or of error lines), keeping stray bytes for the trace.
#pragma once

#include <atomic>
#include <cstddef>
#include <functional>
#include <mutex>
#include <string>

#include <Poco/Pipe.h>
#include <Poco/Runnable.h>

#include "transport/frame_parser.h"
#include "transport/message_queue.h"
#include "vexil/json/json.h"

namespace vexil {

// Reads framed messages. Bytes that arrive outside a frame (a banner, or everything a
// command prints when its stdout and stderr share the pipe) are kept for TakeOutput.
class xPipeReader : public Poco::Runnable {
 public:
  // Sees, on the reader's thread, every message that names a "method" (a server request
  // or notification) before it is queued.
  using Dispatch = std::function<void(LSP::xReader& message)>;

  // The pipe is shared with the caller, who must not close its reading end while run()
  // may still be reading.
  xPipeReader(const char* name, Poco::Pipe pipe);
  xPipeReader(const xPipeReader&) = delete;
  xPipeReader& operator=(const xPipeReader&) = delete;

  // Returns at end of file, or within about one poll interval of Stop(), even when the
  // writing end stays open and silent.
  void run() override;
  void Stop() { stop_ = true; }
  bool Stopping() const { return stop_; }

  const std::string& Name() const { return name_; }
  // Stray output since the last completed message; emptied by taking it.
  std::string TakeOutput();
  // One "Exception: <text>\n" line per read failure, never cleared: the newest lines up
  // to kErrorsLimit bytes.
  std::string Errors() const;
  MessageQueue& Messages() { return messages_; }
  // Must be set before the thread starts.
  void SetDispatch(Dispatch dispatch) { dispatch_ = std::move(dispatch); }

  // How long a read waits before it looks at the stop flag again.
  static constexpr int kStopPollMs = 50;
  // Only notifications and late replies pile up unread: a request's own reply is taken
  // while the host waits for it.
  static constexpr std::size_t kQueueLimit = std::size_t{64} << 20;
  static constexpr std::size_t kErrorsLimit = std::size_t{64} << 10;

 protected:
  xPipeReader(const char* name, Poco::Pipe pipe, std::size_t queueLimit);

  // Turns one chunk of bytes into queue entries.
  virtual void Consume(const char* data, std::size_t size);
  void Deliver(std::string unit);

 private:
  void RecordException(const std::string& text);
  void DispatchMessage(const std::string& body);

  const std::string name_;
  Poco::Pipe pipe_;
  std::atomic<bool> stop_{false};
  mutable std::mutex textMutex_;  // guards parser_ (its stray output) and errors_
  FrameParser parser_;
  std::string errors_;
  MessageQueue messages_;
  Dispatch dispatch_;
};

// Reads a server's standard error as lines; it keeps no stray output.
class xPipeErrReader : public xPipeReader {
 public:
  // Error lines are only drained when a request waits; a server that logs every
  // request (clangd does) would otherwise grow the host while it is idle.
  static constexpr std::size_t kQueueLimit = std::size_t{16} << 20;

  explicit xPipeErrReader(Poco::Pipe pipe);

 protected:
  void Consume(const char* data, std::size_t size) override;

 private:
  LineSplitter splitter_;
};

}  // namespace vexil
