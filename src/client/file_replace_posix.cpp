// Replacing files on POSIX: realpath through links, mkstemp beside the target with its
// mode and owner, fsync, then rename over it.
#include "client/file_replace.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdlib>

namespace vexil {
namespace {

// An open descriptor, closed with the scope.
class Descriptor {
 public:
  explicit Descriptor(int fd) : fd_(fd) {}
  ~Descriptor() {
    if (fd_ >= 0) close(fd_);
  }
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;
  int Get() const { return fd_; }
  // Closes now, reporting the failure a delayed write may only show here.
  bool Close() {
    const int fd = fd_;
    fd_ = -1;
    return close(fd) == 0;
  }

 private:
  int fd_;
};

bool WriteAll(int fd, const std::string& text) {
  for (std::size_t written = 0; written < text.size();) {
    const ssize_t count = write(fd, text.data() + written, text.size() - written);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return false;
    written += static_cast<std::size_t>(count);
  }
  return true;
}

}  // namespace

bool ResolveFile(const std::string& path, std::string& target, std::string& error) {
  char resolved[PATH_MAX];
  if (!realpath(path.c_str(), resolved)) return SystemFailure(error, "Cannot find", path);
  target = resolved;
  return true;
}

bool ReadWholeFile(const std::string& path, std::string& text, std::string& error) {
  Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
  struct stat status;
  if (file.Get() < 0 || fstat(file.Get(), &status) != 0) return SystemFailure(error, "Cannot read", path);
  if (!S_ISREG(status.st_mode)) {
    error = "Cannot read " + path + ": not a regular file";
    return false;
  }
  text.clear();
  char buffer[65536];
  for (;;) {
    const ssize_t count = read(file.Get(), buffer, sizeof buffer);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return SystemFailure(error, "Cannot read", path);
    if (count == 0) return true;
    text.append(buffer, static_cast<std::size_t>(count));
  }
}

bool WriteBeside(const std::string& target, const std::string& text, std::string& temporary, std::string& error) {
  struct stat status;
  // Renaming over a file needs only the directory's permission: a read-only file would
  // be replaced without a word.
  if (stat(target.c_str(), &status) != 0 || access(target.c_str(), W_OK) != 0)
    return SystemFailure(error, "Cannot write", target);
  std::string name = target + ".vexil-XXXXXX";
  Descriptor file(mkstemp(&name[0]));
  if (file.Get() < 0) return SystemFailure(error, "Cannot write", target);
  temporary = name;
  // The owner can be kept only by a privileged host; the mode always.
  if (fchown(file.Get(), status.st_uid, status.st_gid) != 0) errno = 0;
  if (fchmod(file.Get(), status.st_mode & 07777) != 0 || !WriteAll(file.Get(), text) || fsync(file.Get()) != 0 ||
      !file.Close())
    return SystemFailure(error, "Cannot write", target);
  return true;
}

bool ReplaceWith(const std::string& temporary, const std::string& target, std::string& error) {
  if (rename(temporary.c_str(), target.c_str()) != 0) return SystemFailure(error, "Cannot replace", target);
  return true;
}

void RemoveFile(const std::string& path) { unlink(path.c_str()); }

}  // namespace vexil
