// Cuts a server's standard output into message bodies: finds "Content-Length: " in any
// case, reads the digits, skips to the blank line and takes that many bytes as one body.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace vexil {

class FrameParser {
 public:
  // Stray output keeps only its newest bytes: a server that prints without framing
  // while nobody takes the output must not grow the host.
  static constexpr std::size_t kOutputLimit = std::size_t{1} << 20;
  // A longer frame is not believed: its header is stray output like any other text.
  static constexpr std::int64_t kLengthLimit = std::int64_t{1} << 30;
  // A body is sized from its length up to this; a longer one grows as it arrives.
  static constexpr std::size_t kReserveLimit = std::size_t{16} << 20;

  // Consumes `size` bytes and appends every body they complete to `bodies`, in order.
  void Feed(const char* data, std::size_t size, std::vector<std::string>& bodies);
  // The newest kOutputLimit bytes seen while looking for a header since the last
  // completed message; emptied.
  std::string TakeOutput();
  // Bytes held for frames and stray output not yet complete.
  std::size_t HeldBytes() const { return body_.capacity() + output_.capacity() + digits_.capacity(); }

 private:
  enum class State { Header, Length, Separator, Body };

  void Step(char byte, std::vector<std::string>& bodies);
  void StepHeader(char byte);
  void StepLength(char byte);
  void StepSeparator(char byte);
  void RejectLength();
  const char* FeedBody(const char* begin, const char* end, std::vector<std::string>& bodies);
  void Complete(std::vector<std::string>& bodies);

  State state_ = State::Header;
  std::size_t match_ = 0;
  std::int32_t remaining_ = 0;
  std::string body_;
  std::string output_;
  std::string digits_;  // the length as written, returned to the output if it is rejected
};

// Cuts a server's standard error into lines ended by CR, LF or CR LF (a lone CR ends
// a line too, and the byte after it starts the next one).
class LineSplitter {
 public:
  // A longer line keeps its start: one endless line must not grow the host.
  static constexpr std::size_t kLineLimit = std::size_t{64} << 10;

  explicit LineSplitter(std::size_t lineLimit = kLineLimit) : lineLimit_(lineLimit) {}

  void Feed(const char* data, std::size_t size, std::vector<std::string>& lines);
  // At the end of the stream: the last line too, when no line end followed it.
  void Finish(std::vector<std::string>& lines);

 private:
  void Append(const char* begin, const char* end);

  std::size_t lineLimit_;
  std::string line_;
  bool carriageReturn_ = false;
};

// A byte 0xFF is dropped without a trace by both splitters: it is neither stored nor
// counted, so a body holding one waits for one byte more than its length says.
constexpr char kDroppedByte = static_cast<char>(0xFF);

}  // namespace vexil
