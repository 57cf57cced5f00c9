// What a watcher command writes, as lines for the trace: each line cut at the trace's limit,
// and the memory the output holds bounded whatever the command writes.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <string>

#include <Poco/Pipe.h>

#include "host/trace_line.h"
#include "transport/frame_parser.h"
#include "transport/pipe_reader.h"

namespace vexil {

// An output reader named "stdout" that keeps lines instead of looking for framed messages,
// so a `Content-Length` header in a command's output is text like any other.
class CommandOutputReader : public xPipeReader {
 public:
  // The rest of a longer line is dropped, not split into further lines: a trace line is cut
  // there anyway.
  static constexpr std::size_t kLineLimit = kTraceBufferSize - 1;
  // Lines waiting to be traced; a command that writes faster than they are taken waits, as
  // it would on a full pipe. With the read buffer and one line in hand this stays below 1 MiB.
  static constexpr std::size_t kHeldLimit = std::size_t{768} << 10;

  explicit CommandOutputReader(Poco::Pipe pipe);

  // Called on the reader's thread whenever the backlog is full and the reader waits for
  // room. Must be set before the thread starts.
  void SetBacklogHandler(std::function<void()> handler) { backlog_ = std::move(handler); }

  // Reads to the end of the output, whose last line then counts even without a line end.
  void run() override;
  // Lines held now; taking that many never waits for a command that writes on.
  std::size_t LinesHeld();
  // The oldest line held, without its line end; false when there is none.
  bool TakeLine(std::string& line);
  // Bytes the held lines take.
  std::size_t HeldBytes();

 protected:
  void Consume(const char* data, std::size_t size) override;

 private:
  // Queues `line`, waiting for room; false when the reader was stopped meanwhile.
  bool Hold(std::string line);

  LineSplitter splitter_{kLineLimit};  // the reader's thread alone uses it
  std::mutex mutex_;                   // over lines_ and heldBytes_
  std::condition_variable taken_;
  std::deque<std::string> lines_;
  std::size_t heldBytes_ = 0;
  std::function<void()> backlog_;
};

}  // namespace vexil
