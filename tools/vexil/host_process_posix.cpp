// The host's process on POSIX: SIGINT, SIGTERM and SIGCHLD blocked in every thread and
// taken by one thread with sigwaitinfo, so no handler ever runs inside the library's
// threads. Servers and commands are spawned with a clean signal mask.
#include <signal.h>
#include <unistd.h>

#include <mutex>
#include <string>
#include <thread>

#include "host_process.h"

namespace cli {
namespace {

struct ExitNews {
  std::mutex mutex;
  std::string last;
};

// Never destroyed: the signal thread may still note an exit while main returns.
ExitNews& News() {
  static ExitNews* news = new ExitNews;
  return *news;
}

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
  ExitNews& news = News();
  std::lock_guard<std::mutex> lock(news.mutex);
  if (info.si_code == CLD_EXITED) news.last = "status " + std::to_string(info.si_status);
  else if (info.si_code == CLD_KILLED || info.si_code == CLD_DUMPED) news.last = "signal " + std::to_string(info.si_status);
}

void Watch() {
  const sigset_t set = Watched();
  for (;;) {
    siginfo_t info{};
    if (sigwaitinfo(&set, &info) < 0) continue;
    if (info.si_signo == SIGCHLD) NoteExit(info);
    else EndAfterInterrupt(info.si_signo);
  }
}

}  // namespace

void WatchProcess() {
  const sigset_t set = Watched();
  pthread_sigmask(SIG_BLOCK, &set, nullptr);
  std::thread(Watch).detach();
}

std::string LastExit() {
  std::lock_guard<std::mutex> lock(News().mutex);
  return News().last;
}

bool ErrorsToTerminal() { return isatty(STDERR_FILENO) == 1; }

}  // namespace cli
