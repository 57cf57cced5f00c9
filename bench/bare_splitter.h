// The floor of the transport benchmarks: framed messages read the way a client with no
// threads, no queue and no JSON would, from one descriptor.
#pragma once

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>

namespace bench {

// One read() per chunk, memchr to find each header's end, the body copied once into a
// string sized from its length.
class BareSplitter {
 public:
  explicit BareSplitter(int descriptor) : descriptor_(descriptor) {}

  // The next body; aborts at end of file, which no benchmark expects.
  std::string Next() {
    const char* headerEnd;
    while (!(headerEnd = FindHeaderEnd())) Fill();
    const std::size_t length = std::strtoul(pending_.data() + begin_ + std::strlen("Content-Length: "), nullptr, 10);
    const std::size_t bodyBegin = static_cast<std::size_t>(headerEnd - pending_.data());
    std::string body;
    body.reserve(length);
    const std::size_t fromPending = std::min(length, pending_.size() - bodyBegin);
    body.append(pending_, bodyBegin, fromPending);
    begin_ = bodyBegin + fromPending;
    while (body.size() < length) ReadInto(body, length - body.size());
    return body;
  }

 private:
  const char* FindHeaderEnd() const {
    const char* end = pending_.data() + pending_.size();
    for (const char* at = pending_.data() + begin_; (at = static_cast<const char*>(std::memchr(at, '\r', end - at))); ++at) {
      if (end - at >= 4 && std::memcmp(at, "\r\n\r\n", 4) == 0) return at + 4;
    }
    return nullptr;
  }

  void Fill() {
    pending_.erase(0, begin_);
    begin_ = 0;
    ReadInto(pending_, kChunk);
  }

  // Reads at most `most` bytes: the rest of a body goes straight into it.
  void ReadInto(std::string& target, std::size_t most) {
    char buffer[kChunk];
    const ssize_t count = read(descriptor_, buffer, std::min(most, kChunk));
    if (count <= 0) std::abort();
    target.append(buffer, static_cast<std::size_t>(count));
  }

  static constexpr std::size_t kChunk = 65536;
  int descriptor_;
  std::string pending_;
  std::size_t begin_ = 0;  // where the unread bytes of pending_ start
};

}  // namespace bench
