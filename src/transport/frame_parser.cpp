// The byte-level state machines behind the two pipe readers. Malformed input is never
// reported here: unmatched bytes stay in the stray output for the trace to show.
#include "transport/frame_parser.h"

#include <algorithm>
#include <cctype>
#include <cstring>

namespace vexil {
namespace {

constexpr char kHeader[] = "Content-Length: ";
constexpr std::size_t kHeaderSize = sizeof kHeader - 1;
constexpr char kSeparator[] = "\r\n\r\n";
constexpr std::size_t kSeparatorSize = sizeof kSeparator - 1;

char Lower(char byte) { return static_cast<char>(std::tolower(static_cast<unsigned char>(byte))); }

// Appends `byte`, forgetting the oldest bytes once `text` holds twice `limit`, so the
// newest `limit` bytes are always there at the cost of an occasional move.
void AppendKeepingNewest(std::string& text, char byte, std::size_t limit) {
  text += byte;
  if (text.size() > 2 * limit) text.erase(0, text.size() - limit);
}

// The first line end or dropped byte in [begin, end), or `end`.
const char* LineRunEnd(const char* begin, const char* end) {
  while (begin < end && *begin != '\r' && *begin != '\n' && *begin != kDroppedByte) ++begin;
  return begin;
}

}  // namespace

void FrameParser::Feed(const char* data, std::size_t size, std::vector<std::string>& bodies) {
  const char* end = data + size;
  while (data < end) {
    if (*data == kDroppedByte) {
      ++data;
    } else if (state_ == State::Body) {
      data = FeedBody(data, end, bodies);
    } else {
      Step(*data++, bodies);
    }
  }
}

std::string FrameParser::TakeOutput() {
  std::string taken;
  taken.swap(output_);
  if (taken.size() > kOutputLimit) taken.erase(0, taken.size() - kOutputLimit);
  return taken;
}

void FrameParser::Step(char byte, std::vector<std::string>& bodies) {
  switch (state_) {
    case State::Header: StepHeader(byte); break;
    case State::Length: StepLength(byte); break;
    case State::Separator: StepSeparator(byte); break;
    case State::Body: break;  // bodies are taken in runs by FeedBody
  }
}

void FrameParser::StepHeader(char byte) {
  AppendKeepingNewest(output_, byte, kOutputLimit);
  // The byte that breaks a match is not tried as the start of a new one, so a
  // doubled first letter ("CContent-Length") hides the frame behind it.
  if (Lower(byte) != Lower(kHeader[match_])) {
    match_ = 0;
    return;
  }
  if (++match_ < kHeaderSize) return;
  state_ = State::Length;
  match_ = 0;
  remaining_ = 0;
  body_.clear();
  digits_.clear();
}

void FrameParser::StepLength(char byte) {
  if (std::isdigit(static_cast<unsigned char>(byte))) {
    std::int64_t length = std::int64_t{remaining_} * 10 + (byte - '0');
    // Leading zeros can run on forever; only the newest of them could reach the output.
    AppendKeepingNewest(digits_, byte, kOutputLimit);
    if (length > kLengthLimit) return RejectLength();
    remaining_ = static_cast<std::int32_t>(length);
    return;
  }
  state_ = State::Separator;
  match_ = 0;
  digits_.clear();
  StepSeparator(byte);
}

void FrameParser::RejectLength() {
  // The header and its digits stay stray output; the search goes on after them.
  for (char digit : digits_) AppendKeepingNewest(output_, digit, kOutputLimit);
  digits_.clear();
  state_ = State::Header;
  match_ = 0;
  remaining_ = 0;
}

void FrameParser::StepSeparator(char byte) {
  // Further header lines pass by here: only the blank line ends the search.
  if (byte != kSeparator[match_]) {
    match_ = 0;
    return;
  }
  if (++match_ < kSeparatorSize) return;
  state_ = State::Body;
  // Sized once rather than grown by doubling, which copies a big body twice over; only
  // up to a bound, since the length is the server's word and nothing has arrived yet.
  if (remaining_ > 0) body_.reserve(std::min(static_cast<std::size_t>(remaining_), kReserveLimit));
}

const char* FrameParser::FeedBody(const char* begin, const char* end, std::vector<std::string>& bodies) {
  // A length of 0 (or one that wrapped below) can never count down to the end of the
  // frame: the rest of the stream is swallowed, so there is no point keeping it.
  if (remaining_ <= 0) return end;
  std::size_t run = std::min(static_cast<std::size_t>(end - begin), static_cast<std::size_t>(remaining_));
  if (const void* dropped = std::memchr(begin, kDroppedByte, run)) {
    run = static_cast<std::size_t>(static_cast<const char*>(dropped) - begin);
  }
  body_.append(begin, run);
  remaining_ -= static_cast<std::int32_t>(run);
  if (remaining_ == 0) Complete(bodies);
  return begin + run;
}

void FrameParser::Complete(std::vector<std::string>& bodies) {
  bodies.push_back(std::move(body_));
  body_.clear();
  output_.clear();
  state_ = State::Header;
  match_ = 0;
  remaining_ = 0;
}

void LineSplitter::Feed(const char* data, std::size_t size, std::vector<std::string>& lines) {
  const char* end = data + size;
  while (data < end) {
    char byte = *data;
    if (byte == kDroppedByte) {
      ++data;
      continue;
    }
    if (byte == '\r') {
      carriageReturn_ = true;
      ++data;
      continue;
    }
    if (carriageReturn_ || byte == '\n') {
      lines.push_back(std::move(line_));
      line_.clear();
      carriageReturn_ = false;
      if (byte == '\n') {
        ++data;
        continue;
      }
    }
    const char* runEnd = LineRunEnd(data, end);
    Append(data, runEnd);
    data = runEnd;
  }
}

void LineSplitter::Finish(std::vector<std::string>& lines) {
  if (carriageReturn_ || !line_.empty()) lines.push_back(std::move(line_));
  line_.clear();
  carriageReturn_ = false;
}

void LineSplitter::Append(const char* begin, const char* end) {
  std::size_t room = lineLimit_ - line_.size();
  line_.append(begin, std::min(room, static_cast<std::size_t>(end - begin)));
}

}  // namespace vexil
