// The platform side of pipe traffic: a bounded wait for readable bytes (so a reader can
// look at its stop flag even when nobody writes or closes), a read, and a bounded write.
#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>

#include <Poco/Pipe.h>

namespace vexil {

enum class PipeWait { Readable, Quiet, Closed };

// How a bounded write ended. Failed: the reader has gone away or the pipe is closed.
enum class PipeWrite { Written, Failed, TimedOut, Stopped };

// How often a bounded write looks at its stop flag and its deadline.
constexpr int kWriteStepMs = 50;

// Waits up to `milliseconds` for the reading end of `pipe`. Readable also covers end of
// file, which the following read reports as 0 bytes.
PipeWait WaitReadable(const Poco::Pipe& pipe, int milliseconds);

// Reads what is there, at most `size` bytes; 0 at end of file. Throws
// Poco::ReadFileException on a read error.
std::size_t ReadSome(const Poco::Pipe& pipe, char* buffer, std::size_t size);

// Writes every byte to the writing end of `pipe` unless `deadline` passes, or `stop`
// turns true, first; what fits is always tried once, even past the deadline. The
// process is never signalled for a reader that has gone away. A write that did not end
// Written may have left part of the bytes in the pipe.
PipeWrite WriteAll(const Poco::Pipe& pipe, const char* data, std::size_t size,
                   std::chrono::steady_clock::time_point deadline, const std::atomic<bool>* stop = nullptr);

}  // namespace vexil
