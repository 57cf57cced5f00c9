// The platform-free half of the host's process: the interrupt as every thread sees it,
// and the way out after one.
#include "host_process.h"

#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <thread>

namespace cli {
namespace {

// How long a command may take to wind up after an interrupt before the process ends.
constexpr std::chrono::seconds kWindUp{3};

std::mutex interruptMutex;
std::condition_variable interruptArrived;
int interruptSignal = 0;

}  // namespace

void EndAfterInterrupt(int signal) {
  {
    std::lock_guard<std::mutex> lock(interruptMutex);
    interruptSignal = signal;
  }
  interruptArrived.notify_all();
  EndChildren();
  std::this_thread::sleep_for(kWindUp);
  std::fflush(stdout);
  std::_Exit(128 + signal);
}

int Interrupted() {
  std::lock_guard<std::mutex> lock(interruptMutex);
  return interruptSignal;
}

int WaitForInterrupt() {
  std::unique_lock<std::mutex> lock(interruptMutex);
  interruptArrived.wait(lock, [] { return interruptSignal != 0; });
  return interruptSignal;
}

}  // namespace cli
