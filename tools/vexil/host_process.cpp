// The platform-free half of the host's process: the interrupt as every thread sees it,
// and the way out after one.
#include "host_process.h"

#include <atomic>
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

struct InterruptState {
  std::mutex mutex;
  std::condition_variable arrived;
  int signal = 0;
  std::atomic<bool> windUpChildren{false};
};

// Never destroyed: the thread that ends the process may still hold it while main returns.
InterruptState& State() {
  static InterruptState* state = new InterruptState;
  return *state;
}

}  // namespace

void EndAfterInterrupt(int signal) {
  InterruptState& state = State();
  {
    std::lock_guard<std::mutex> lock(state.mutex);
    state.signal = signal;
  }
  state.arrived.notify_all();
  if (!state.windUpChildren) EndChildren();
  std::this_thread::sleep_for(kWindUp);
  if (state.windUpChildren) EndChildren();
  std::fflush(stdout);
  std::_Exit(128 + signal);
}

void WindUpChildren() { State().windUpChildren = true; }

int Interrupted() {
  std::lock_guard<std::mutex> lock(State().mutex);
  return State().signal;
}

int WaitForInterrupt() {
  InterruptState& state = State();
  std::unique_lock<std::mutex> lock(state.mutex);
  state.arrived.wait(lock, [&state] { return state.signal != 0; });
  return state.signal;
}

}  // namespace cli
