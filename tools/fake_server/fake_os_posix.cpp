// POSIX side of the fake server's operating-system needs.
// The spawned copy of the server inherits the standard streams, as a real grandchild would.
#include "fake_os.h"

#include <signal.h>
#include <spawn.h>
#include <unistd.h>

#include <chrono>
#include <thread>
#include <vector>

extern char** environ;

namespace fake {
namespace {

std::string self;  // the path this program was started with

}  // namespace

void PrepareProcess(const char* path, unsigned lifetimeSeconds) {
  self = path;
  signal(SIGPIPE, SIG_IGN);
  alarm(lifetimeSeconds);
}

long ReadInput(char* buffer, unsigned size) { return static_cast<long>(read(STDIN_FILENO, buffer, size)); }

void CloseInput() { close(STDIN_FILENO); }

long WriteOutput(int stream, const char* bytes, unsigned size) { return static_cast<long>(write(stream, bytes, size)); }

std::string CurrentDirectory() {
  char directory[4096];
  return getcwd(directory, sizeof directory) ? directory : "";
}

void SleepUntilKilled() {
  for (;;) pause();
}

void SpawnSelf(const std::string& argument) {
  std::vector<char*> argv = {const_cast<char*>(self.c_str()), const_cast<char*>(argument.c_str()), nullptr};
  pid_t child;
  posix_spawn(&child, self.c_str(), nullptr, nullptr, argv.data(), environ);
}

unsigned long ProcessId() { return static_cast<unsigned long>(getpid()); }

void WaitForProcessEnd(unsigned long id) {
  // Our parent is the process to outlive; once it has gone we are re-parented.
  while (static_cast<unsigned long>(getppid()) == id) std::this_thread::sleep_for(std::chrono::milliseconds(20));
}

}  // namespace fake
