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
#include <mutex>
#include <optional>
#include <sstream>

#include <Poco/Exception.h>

#include "transport/child_reaper.h"

extern char** environ;

namespace vexil {

struct xProcess::Child {
  pid_t pid = -1;
  std::mutex mutex;  // the host's thread and the dispatch thread both look
  bool ended = false;
  int status = -1;

  // One look without waiting; an ended child is reaped so it leaves no zombie.
  bool Running() {
    std::lock_guard<std::mutex> lock(mutex);
    if (ended) return false;
    int raw = 0;
    pid_t answer;
    do {
      answer = waitpid(pid, &raw, WNOHANG);
    } while (answer < 0 && errno == EINTR);
    // An error (the child was reaped elsewhere, or children are not kept) counts as ended.
    ended = answer != 0;
    if (answer > 0) status = WIFSIGNALED(raw) ? 128 + WTERMSIG(raw) : WEXITSTATUS(raw);
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

// The file `name` names on the search list `path`; empty when there is none.
std::string FoundOnPath(const std::string& name, const char* path) {
  std::istringstream entries(path ? path : "/bin:/usr/bin");
  std::string entry;
  while (std::getline(entries, entry, ':')) {
    std::string file = (entry.empty() ? "." : entry) + "/" + name;
    if (IsExecutableFile(file)) return file;
  }
  return "";
}

// The launch itself reports these too, but only as a bare error code: checking first
// gives the host a text that names what is missing. Returns the file a bare name was
// found as on `path`.
std::string CheckLaunchable(const std::string& executable, const std::string& directory, const char* path) {
  struct stat status {};
  if (!directory.empty() && stat(directory.c_str(), &status) != 0) {
    Fail<Poco::FileNotFoundException>("Cannot change to directory: " + directory, errno);
  }
  if (!directory.empty() && !S_ISDIR(status.st_mode)) {
    Fail<Poco::FileNotFoundException>("Cannot change to directory: " + directory, ENOTDIR);
  }
  std::string file = executable;
  bool found = false;
  if (executable.find('/') == std::string::npos) {
    file = executable.empty() ? "" : FoundOnPath(executable, path);
    found = !file.empty();
    if (!found) errno = ENOENT;
  } else {
    bool relative = executable[0] != '/' && !directory.empty();
    found = IsExecutableFile(relative ? directory + "/" + executable : executable);
  }
  if (!found) Fail<Poco::FileNotFoundException>("Cannot find executable: " + executable, errno);
  return file;
}

// The child's environment: the host's own `environ` unless the host changed it.
class SpawnEnvironment {
 public:
  explicit SpawnEnvironment(const EnvironmentChanges& changes) {
    if (changes.empty()) return;
    for (const auto& [name, value] : ChildEnvironment(changes)) {
      if (name == "PATH") path_ = value;
      entries_.push_back(name + "=" + value);
    }
    for (std::string& entry : entries_) pointers_.push_back(entry.data());
    pointers_.push_back(nullptr);
  }
  bool Changed() const { return !pointers_.empty(); }
  char* const* Entries() const { return Changed() ? pointers_.data() : environ; }
  // The search list for a bare executable name, null for the default one.
  const char* Path() const {
    if (!Changed()) return std::getenv("PATH");
    return path_ ? path_->c_str() : nullptr;
  }

 private:
  std::vector<std::string> entries_;
  std::vector<char*> pointers_;
  std::optional<std::string> path_;
};

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
                      const std::string& directory, Poco::Pipe* in, Poco::Pipe* out, Poco::Pipe* err,
                      const EnvironmentChanges& environment) {
  SpawnEnvironment childEnvironment(environment);
  std::string file = CheckLaunchable(executable, directory, childEnvironment.Path());
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
  // The spawn would search the host's PATH: a PATH of the host's choosing was searched above.
  const std::string& program = childEnvironment.Changed() ? file : executable;
  int failure = posix_spawnp(&pid, program.c_str(), setup.Actions(), setup.Attributes(), argv.data(),
                             childEnvironment.Entries());
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

bool xProcess::Ended(int& status) {
  if (!child_ || child_->Running()) return false;
  std::lock_guard<std::mutex> lock(child_->mutex);
  status = child_->status;
  return true;
}

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
