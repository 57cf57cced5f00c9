// The host's process on POSIX: SIGINT, SIGTERM and SIGCHLD blocked in every thread and
// taken by one thread with sigwaitinfo, so no handler ever runs inside the library's
// threads. Servers and commands are spawned with a clean signal mask.
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <mutex>
#include <string>
#include <thread>

#include "host_process.h"

namespace cli {
namespace {

// How long a command may take to wind up after an interrupt before the process ends.
constexpr std::chrono::seconds kWindUp{3};

std::mutex stateMutex;
std::condition_variable interruptArrived;
int interruptSignal = 0;
std::string lastExit;

sigset_t Watched() {
  sigset_t set;
  sigemptyset(&set);
  sigaddset(&set, SIGINT);
  sigaddset(&set, SIGTERM);
  sigaddset(&set, SIGCHLD);
  return set;
}

// SIGCHLD says how a child ended even when the library reaps it first.
void NoteExit(const siginfo_t& info) {
  std::lock_guard<std::mutex> lock(stateMutex);
  if (info.si_code == CLD_EXITED) lastExit = "status " + std::to_string(info.si_status);
  else if (info.si_code == CLD_KILLED || info.si_code == CLD_DUMPED) lastExit = "signal " + std::to_string(info.si_status);
}

[[noreturn]] void OnInterrupt(int signal) {
  {
    std::lock_guard<std::mutex> lock(stateMutex);
    interruptSignal = signal;
  }
  interruptArrived.notify_all();
  EndChildren();
  std::this_thread::sleep_for(kWindUp);
  std::fflush(stdout);
  _exit(128 + signal);
}

void Watch() {
  const sigset_t set = Watched();
  for (;;) {
    siginfo_t info{};
    if (sigwaitinfo(&set, &info) < 0) continue;
    if (info.si_signo == SIGCHLD) NoteExit(info);
    else OnInterrupt(info.si_signo);
  }
}

}  // namespace

void WatchProcess() {
  const sigset_t set = Watched();
  pthread_sigmask(SIG_BLOCK, &set, nullptr);
  std::thread(Watch).detach();
}

int Interrupted() {
  std::lock_guard<std::mutex> lock(stateMutex);
  return interruptSignal;
}

int WaitForInterrupt() {
  std::unique_lock<std::mutex> lock(stateMutex);
  interruptArrived.wait(lock, [] { return interruptSignal != 0; });
  return interruptSignal;
}

std::string LastExit() {
  std::lock_guard<std::mutex> lock(stateMutex);
  return lastExit;
}

bool ErrorsToTerminal() { return isatty(STDERR_FILENO) == 1; }

}  // namespace cli
