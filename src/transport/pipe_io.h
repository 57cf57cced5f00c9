// The platform side of pipe traffic: a bounded wait for readable bytes (so a reader can
// look at its stop flag even when nobody writes or closes), a read, and a whole write.
#pragma once

#include <cstddef>

#include <Poco/Pipe.h>

namespace vexil {

enum class PipeWait { Readable, Quiet, Closed };

// Waits up to `milliseconds` for the reading end of `pipe`. Readable also covers end of
// file, which the following read reports as 0 bytes.
PipeWait WaitReadable(const Poco::Pipe& pipe, int milliseconds);

// Reads what is there, at most `size` bytes; 0 at end of file. Throws
// Poco::ReadFileException on a read error.
std::size_t ReadSome(const Poco::Pipe& pipe, char* buffer, std::size_t size);

// Writes every byte to the writing end of `pipe`. A reader that has gone away makes it
// throw Poco::WriteFileException; the process is never signalled for it.
void WriteAll(const Poco::Pipe& pipe, const char* data, std::size_t size);

}  // namespace vexil
