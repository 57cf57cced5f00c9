// What the fake server needs of the operating system, one small function each, so that
// the same scripted server runs on POSIX and on Windows.
#pragma once

#include <string>

namespace fake {

constexpr int kStdout = 1;
constexpr int kStderr = 2;

// Binary standard streams, no SIGPIPE, and a safety limit on the process's lifetime.
// `self` is the path the program was started with (argv[0]).
void PrepareProcess(const char* self, unsigned lifetimeSeconds);
// Reads up to `size` bytes of standard input; 0 or less at end of input.
long ReadInput(char* buffer, unsigned size);
// Closes standard input, so that the client's writes fail.
void CloseInput();
// Writes to standard output (kStdout) or error (kStderr); the count written, or 0 or less.
long WriteOutput(int stream, const char* bytes, unsigned size);
std::string CurrentDirectory();
[[noreturn]] void SleepUntilKilled();
// Starts this program again with `argument`, inheriting the standard streams.
void SpawnSelf(const std::string& argument);
unsigned long ProcessId();
// Returns once the process `id` has ended.
void WaitForProcessEnd(unsigned long id);

}  // namespace fake
