// Child processes on POSIX through posix_spawn: the working directory is applied in the
// child, launch failures are seen here, and an ended child is reaped by the running test.
#include "transport/process.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <sstream>

#include <Poco/Exception.h>

#include "transport/child_reaper.h"

extern char** environ;

namespace vexil {

struct xProcess::Child {
  pid_t pid = -1;
  bool ended = false;

  // One look without waiting; an ended child is reaped so it leaves no zombie.
  bool Running() {
    if (ended) return false;
    int status = 0;
    pid_t answer;
    do {
      answer = waitpid(pid, &status, WNOHANG);
    } while (answer < 0 && errno == EINTR);
    // An error (the child was reaped elsewhere, or children are not kept) counts as ended.
    ended = answer != 0;
    return !ended;
  }
};

namespace {

// Throws `exception` with errno set to `cause`, so the caller can read the system's text.
template <typename ExceptionType>
[[noreturn]] void Fail(const std::string& text, int cause) {
  ExceptionType exception(text);
  errno = cause;
  throw exception;
}

// Whether `path` is a regular file we may execute; errno tells why not.
bool IsExecutableFile(const std::string& path) {
  struct stat status {};
  if (stat(path.c_str(), &status) != 0) return false;
  if (!S_ISREG(status.st_mode)) {
    errno = EACCES;
    return false;
  }
  return access(path.c_str(), X_OK) == 0;
}

bool FoundOnPath(const std::string& name) {
  const char* path = std::getenv("PATH");
  std::istringstream entries(path ? path : "/bin:/usr/bin");
  std::string entry;
  while (std::getline(entries, entry, ':')) {
    if (IsExecutableFile((entry.empty() ? "." : entry) + "/" + name)) return true;
  }
  return false;
}

// The launch itself reports these too, but only as a bare error code: checking first
// gives the host a text that names what is missing.
void CheckLaunchable(const std::string& executable, const std::string& directory) {
  struct stat status {};
  if (!directory.empty() && stat(directory.c_str(), &status) != 0) {
    Fail<Poco::FileNotFoundException>("Cannot change to directory: " + directory, errno);
  }
  if (!directory.empty() && !S_ISDIR(status.st_mode)) {
    Fail<Poco::FileNotFoundException>("Cannot change to directory: " + directory, ENOTDIR);
  }
  bool found = false;
  if (executable.find('/') == std::string::npos) {
    found = !executable.empty() && FoundOnPath(executable);
    if (!found) errno = ENOENT;
  } else {
    bool relative = executable[0] != '/' && !directory.empty();
    found = IsExecutableFile(relative ? directory + "/" + executable : executable);
  }
  if (!found) Fail<Poco::FileNotFoundException>("Cannot find executable: " + executable, errno);
}

// The spawn's file actions and attributes, released on every path.
class SpawnSetup {
 public:
  SpawnSetup() {
    posix_spawn_file_actions_init(&actions_);
    posix_spawnattr_init(&attributes_);
  }
  ~SpawnSetup() {
    posix_spawnattr_destroy(&attributes_);
    posix_spawn_file_actions_destroy(&actions_);
  }
  SpawnSetup(const SpawnSetup&) = delete;
  SpawnSetup& operator=(const SpawnSetup&) = delete;

  // A closed pipe would leave the child the host's own stream.
  void Redirect(int from, int to, const std::string& executable) {
    int failure = from < 0 ? EBADF : posix_spawn_file_actions_adddup2(&actions_, from, to);
    if (failure != 0) Fail<Poco::IOException>("Cannot redirect the standard streams of: " + executable, failure);
  }

  // The child gets only its three streams, starts in `directory`, and has the default
  // signal handling whatever the launching thread has blocked or ignored.
  void Finish(const std::string& directory) {
    posix_spawn_file_actions_addclosefrom_np(&actions_, 3);
    if (!directory.empty()) posix_spawn_file_actions_addchdir_np(&actions_, directory.c_str());
    sigset_t none;
    sigemptyset(&none);
    sigset_t defaults;
    sigemptyset(&defaults);
    sigaddset(&defaults, SIGPIPE);
    posix_spawnattr_setsigmask(&attributes_, &none);
    posix_spawnattr_setsigdefault(&attributes_, &defaults);
    posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
  }

  const posix_spawn_file_actions_t* Actions() const { return &actions_; }
  const posix_spawnattr_t* Attributes() const { return &attributes_; }

 private:
  posix_spawn_file_actions_t actions_;
  posix_spawnattr_t attributes_;
};

// Our ends of the pipes must not leak into other children the host starts.
void KeepFromChildren(int descriptor) { fcntl(descriptor, F_SETFD, fcntl(descriptor, F_GETFD) | FD_CLOEXEC); }

}  // namespace

xProcess::xProcess() = default;

xProcess::~xProcess() {
  if (child_) child_->Running();
}

void xProcess::Launch(const std::string& executable, const std::vector<std::string>& arguments,
                      const std::string& directory, Poco::Pipe* in, Poco::Pipe* out, Poco::Pipe* err) {
  CheckLaunchable(executable, directory);
  SpawnSetup setup;
  if (in) setup.Redirect(in->readHandle(), STDIN_FILENO, executable);
  if (out) setup.Redirect(out->writeHandle(), STDOUT_FILENO, executable);
  if (err) setup.Redirect(err->writeHandle(), STDERR_FILENO, executable);
  setup.Finish(directory);

  std::vector<char*> argv;
  argv.push_back(const_cast<char*>(executable.c_str()));
  for (const std::string& argument : arguments) argv.push_back(const_cast<char*>(argument.c_str()));
  argv.push_back(nullptr);

  pid_t pid = -1;
  int failure = posix_spawnp(&pid, executable.c_str(), setup.Actions(), setup.Attributes(), argv.data(), environ);
  if (failure != 0) Fail<Poco::SystemException>("Cannot launch process: " + executable, failure);

  if (in) KeepFromChildren(in->writeHandle());
  if (out) KeepFromChildren(out->readHandle());
  if (err) KeepFromChildren(err->readHandle());
  if (in) in->close(Poco::Pipe::CLOSE_READ);
  if (out) out->close(Poco::Pipe::CLOSE_WRITE);
  if (err) err->close(Poco::Pipe::CLOSE_WRITE);

  Abandon();
  child_ = std::make_unique<Child>();
  child_->pid = pid;
}

bool xProcess::IsRunning() { return child_ && child_->Running(); }

int xProcess::Id() const { return child_ ? static_cast<int>(child_->pid) : -1; }

void xProcess::Abandon() {
  if (child_ && child_->Running()) ReapInBackground(child_->pid);
  child_.reset();
}

CommandInterpreter SystemCommandInterpreter() { return {"/bin/sh", "-c"}; }

std::string LastSystemErrorText() {
  int cause = errno;
  if (cause == 0) return "";
  char buffer[256];
  // The GNU strerror_r may return a static text instead of filling the buffer.
  const char* text = strerror_r(cause, buffer, sizeof buffer);
  return text && *text ? std::string(text) + "\n" : std::string();
}

}  // namespace vexil
