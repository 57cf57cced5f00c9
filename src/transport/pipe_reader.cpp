// The read loop shared by both readers: bounded waits so the stop flag is seen, chunked
// reads fed to the splitter, and read failures recorded without ending the loop.
#include "transport/pipe_reader.h"

#include <cctype>
#include <cstring>
#include <vector>

#include <Poco/Exception.h>

#include "transport/pipe_io.h"

namespace vexil {
namespace {

constexpr std::size_t kChunkSize = 64 * 1024;

constexpr char kMethodKey[] = "\"method\"";
constexpr std::size_t kMethodKeySize = sizeof kMethodKey - 1;
constexpr std::size_t kAnchor = 4;  // its 'h', the rarest of its bytes in JSON text

// Where the next "method" key starts in [at, end), or `end`. Looked for by its rarest byte,
// which memchr finds many bytes at a time: a megabyte's search is on the way of its reply.
const char* FindMethodKey(const char* at, const char* end) {
  if (end - at < static_cast<std::ptrdiff_t>(kMethodKeySize)) return end;
  for (const char* anchor = at + kAnchor; anchor < end; ++anchor) {
    anchor = static_cast<const char*>(std::memchr(anchor, kMethodKey[kAnchor], static_cast<std::size_t>(end - anchor)));
    if (!anchor) return end;
    const char* key = anchor - kAnchor;
    if (end - key < static_cast<std::ptrdiff_t>(kMethodKeySize)) return end;
    if (std::memcmp(key, kMethodKey, kMethodKeySize) == 0) return key;
  }
  return end;
}

// A cheap look that spares replies (most of the traffic) a parse on this thread: only a
// body with a "method" key can name one.
bool MayNameMethod(const std::string& body) {
  const char* end = body.data() + body.size();
  for (const char* at = body.data(); (at = FindMethodKey(at, end)) != end; at += kMethodKeySize) {
    const char* next = at + kMethodKeySize;
    while (next < end && std::isspace(static_cast<unsigned char>(*next))) ++next;
    if (next < end && *next == ':') return true;
  }
  return false;
}

}  // namespace

xPipeReader::xPipeReader(const char* name, Poco::Pipe pipe) : xPipeReader(name, std::move(pipe), kQueueLimit) {}

xPipeReader::xPipeReader(const char* name, Poco::Pipe pipe, std::size_t queueLimit)
    : name_(name), pipe_(std::move(pipe)), messages_(queueLimit) {}

void xPipeReader::run() {
  std::vector<char> buffer(kChunkSize);
  while (!stop_) {
    try {
      PipeWait wait = WaitReadable(pipe_, kStopPollMs);
      if (wait == PipeWait::Quiet) continue;
      if (wait == PipeWait::Closed) break;
      std::size_t count = ReadSome(pipe_, buffer.data(), buffer.size());
      if (count == 0) break;
      Consume(buffer.data(), count);
    } catch (const Poco::Exception& e) {
      RecordException(e.displayText());
    } catch (const std::exception& e) {
      RecordException(e.what());
    }
  }
  messages_.Finish();
}

std::string xPipeReader::TakeOutput() {
  std::lock_guard<std::mutex> lock(textMutex_);
  return parser_.TakeOutput();
}

std::string xPipeReader::Errors() const {
  std::lock_guard<std::mutex> lock(textMutex_);
  return errors_;
}

void xPipeReader::Consume(const char* data, std::size_t size) {
  std::vector<std::string> bodies;
  {
    std::lock_guard<std::mutex> lock(textMutex_);
    parser_.Feed(data, size, bodies);
  }
  for (std::string& body : bodies) {
    if (dispatch_ && MayNameMethod(body)) DispatchMessage(body);
    Deliver(std::move(body));
  }
}

void xPipeReader::Deliver(std::string unit) { messages_.Push(std::move(unit)); }

void xPipeReader::RecordException(const std::string& text) {
  std::lock_guard<std::mutex> lock(textMutex_);
  errors_ += "Exception: " + (text.empty() ? std::string("Unknown exception") : text) + "\n";
  if (errors_.size() <= kErrorsLimit) return;
  // The newest lines tell what goes wrong now; keep whole lines where there are any.
  std::size_t cut = errors_.size() - kErrorsLimit;
  std::size_t lineStart = errors_.find('\n', cut - 1);
  errors_.erase(0, lineStart < errors_.size() - 1 ? lineStart + 1 : cut);
}

void xPipeReader::DispatchMessage(const std::string& body) {
  // A failing hook must neither end the loop nor keep the message from the queue.
  try {
    LSP::xReader message;
    if (!message.Parse(body) || !message.Root().IsObject() || !message.Root().HasObject("method")) return;
    dispatch_(message);
  } catch (const std::exception& e) {
    RecordException(e.what());
  }
}

xPipeErrReader::xPipeErrReader(Poco::Pipe pipe) : xPipeReader("strderr", std::move(pipe), kQueueLimit) {}

void xPipeErrReader::Consume(const char* data, std::size_t size) {
  std::vector<std::string> lines;
  splitter_.Feed(data, size, lines);
  for (std::string& line : lines) Deliver(std::move(line));
}

}  // namespace vexil
