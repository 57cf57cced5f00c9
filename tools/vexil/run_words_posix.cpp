// Running a task's words on POSIX: the program spawned with the host's streams and a
// clean signal mask, and waited for.
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>

#include "run_words.h"

extern char** environ;

namespace cli {

int RunProgram(const std::vector<std::string>& words) {
  std::vector<char*> argv;
  for (const std::string& word : words) argv.push_back(const_cast<char*>(word.c_str()));
  argv.push_back(nullptr);
  posix_spawnattr_t attributes;
  posix_spawnattr_init(&attributes);
  sigset_t none;
  sigemptyset(&none);
  posix_spawnattr_setsigmask(&attributes, &none);
  posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK);
  pid_t pid = -1;
  int failure = words.empty() ? ENOENT : posix_spawnp(&pid, argv[0], nullptr, &attributes, argv.data(), environ);
  posix_spawnattr_destroy(&attributes);
  if (failure != 0) {
    std::fprintf(stderr, "vexil: %s: %s\n", words.empty() ? "" : words[0].c_str(), std::strerror(failure));
    return 127;
  }
  int status = 0;
  while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
  }
  if (WIFSIGNALED(status)) {
    std::fprintf(stderr, "vexil: killed by signal %d\n", WTERMSIG(status));
    return 128 + WTERMSIG(status);
  }
  std::fprintf(stderr, "vexil: exit status %d\n", WEXITSTATUS(status));
  return WEXITSTATUS(status);
}

std::string SelfPath() {
  char path[PATH_MAX];
  ssize_t length = readlink("/proc/self/exe", path, sizeof path - 1);
  return length > 0 ? std::string(path, static_cast<std::size_t>(length)) : "vexil";
}

// The interpreter's own status, reported after the command line's last command.
std::string ReportingStatus(const std::string& text) { return text + "\necho \"vexil: exit status $?\" >&2"; }

}  // namespace cli
