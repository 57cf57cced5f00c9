// Ending the processes below ours on Linux, found through /proc: every process whose
// chain of parents leads to us, so that a shell's command goes with the shell.
#include <dirent.h>
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <fstream>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "host_process.h"

namespace cli {
namespace {

// How long the processes have to end after SIGTERM, before SIGKILL.
constexpr std::chrono::milliseconds kGrace{1000};

// "pid (name) state ppid ...": the state and the parent of `pid`; the name may hold blanks
// and parentheses. False when the process is gone.
bool ReadStat(const std::string& pid, char& state, pid_t& parent) {
  std::ifstream stat("/proc/" + pid + "/stat");
  std::string text((std::istreambuf_iterator<char>(stat)), std::istreambuf_iterator<char>());
  std::size_t close = text.rfind(')');
  if (close == std::string::npos || close + 4 >= text.size()) return false;
  state = text[close + 2];
  parent = static_cast<pid_t>(std::atoi(text.c_str() + close + 4));
  return true;
}

// A zombie has ended already; it only waits for its parent to collect it.
bool Alive(pid_t pid) {
  char state = 0;
  pid_t parent = 0;
  return ReadStat(std::to_string(pid), state, parent) && state != 'Z';
}

// Every live process by its parent.
std::multimap<pid_t, pid_t> ChildrenByParent() {
  std::multimap<pid_t, pid_t> children;
  DIR* proc = opendir("/proc");
  if (!proc) return children;
  while (dirent* entry = readdir(proc)) {
    char state = 0;
    pid_t parent = 0;
    pid_t pid = static_cast<pid_t>(std::atoi(entry->d_name));
    if (pid > 0 && ReadStat(entry->d_name, state, parent) && state != 'Z') children.emplace(parent, pid);
  }
  closedir(proc);
  return children;
}

std::vector<pid_t> Descendants() {
  std::multimap<pid_t, pid_t> children = ChildrenByParent();
  std::vector<pid_t> found;
  std::vector<pid_t> parents = {getpid()};
  while (!parents.empty()) {
    pid_t parent = parents.back();
    parents.pop_back();
    auto range = children.equal_range(parent);
    for (auto child = range.first; child != range.second; ++child) {
      found.push_back(child->second);
      parents.push_back(child->second);
    }
  }
  return found;
}

}  // namespace

// Asks first; whatever still lives after the grace is killed. The list is taken once, since
// a grandchild whose parent has ended is no longer found below us.
void EndChildren() {
  const std::vector<pid_t> pids = Descendants();
  for (pid_t pid : pids) kill(pid, SIGTERM);
  auto anyAlive = [&] {
    for (pid_t pid : pids)
      if (Alive(pid)) return true;
    return false;
  };
  auto deadline = std::chrono::steady_clock::now() + kGrace;
  while (anyAlive() && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  for (pid_t pid : pids)
    if (Alive(pid)) kill(pid, SIGKILL);
}

}  // namespace cli
