// Splitting a command's output into held lines, with a writer that outpaces the trace made
// to wait rather than to grow the host.
#include "task/command_output.h"

#include <algorithm>
#include <chrono>
#include <utility>
#include <vector>

namespace vexil {
namespace {

// Bytes are split this many at a time, so that a run of line ends cannot pile up more
// line objects than the limit allows before any is counted.
constexpr std::size_t kSliceSize = 1024;

std::size_t Cost(const std::string& line) { return sizeof(std::string) + line.capacity(); }

}  // namespace

CommandOutputReader::CommandOutputReader(Poco::Pipe pipe) : xPipeReader("stdout", std::move(pipe)) {}

void CommandOutputReader::run() {
  xPipeReader::run();
  std::vector<std::string> last;
  splitter_.Finish(last);
  for (std::string& line : last) Hold(std::move(line));
}

std::size_t CommandOutputReader::LinesHeld() {
  std::lock_guard<std::mutex> lock(mutex_);
  return lines_.size();
}

bool CommandOutputReader::TakeLine(std::string& line) {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    if (lines_.empty()) return false;
    heldBytes_ -= Cost(lines_.front());
    line = std::move(lines_.front());
    lines_.pop_front();
  }
  taken_.notify_all();
  return true;
}

std::size_t CommandOutputReader::HeldBytes() {
  std::lock_guard<std::mutex> lock(mutex_);
  return heldBytes_;
}

void CommandOutputReader::Consume(const char* data, std::size_t size) {
  std::vector<std::string> lines;
  for (std::size_t offset = 0; offset < size; offset += kSliceSize) {
    lines.clear();
    splitter_.Feed(data + offset, std::min(kSliceSize, size - offset), lines);
    for (std::string& line : lines)
      if (!Hold(std::move(line))) return;
  }
}

bool CommandOutputReader::Hold(std::string line) {
  std::unique_lock<std::mutex> lock(mutex_);
  while (!lines_.empty() && heldBytes_ + Cost(line) > kHeldLimit) {
    if (Stopping()) return false;
    if (backlog_) {
      lock.unlock();
      backlog_();
      lock.lock();
    }
    taken_.wait_for(lock, std::chrono::milliseconds(kStopPollMs));
  }
  lines_.push_back(std::move(line));
  heldBytes_ += Cost(lines_.back());
  return true;
}

}  // namespace vexil
