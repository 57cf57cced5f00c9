// The change monitor's Linux backend: one inotify descriptor and one worker thread that
// waits with poll() on it and on an eventfd through which destruction wakes the worker.
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <mutex>
#include <thread>
#include <utility>

#include "watch/inotify_tree.h"
#include "watch/monitor_backend.h"

namespace vexil {
namespace {

// One read takes as much as one Windows notification buffer: 64 KiB.
constexpr std::size_t kReadBufferSize = 65536;

class UniqueFd {
 public:
  explicit UniqueFd(int fd) : fd_(fd) {}
  UniqueFd(UniqueFd&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
  ~UniqueFd() {
    if (fd_ >= 0) close(fd_);
  }
  UniqueFd(const UniqueFd&) = delete;
  UniqueFd& operator=(const UniqueFd&) = delete;

  int Get() const { return fd_; }
  bool Valid() const { return fd_ >= 0; }

 private:
  int fd_;
};

// A watch stays listed after an overflow, silent, as the Windows backend keeps it.
enum class WatchState { Active, Silent };

class InotifyBackend final : public MonitorBackend {
 public:
  InotifyBackend(const MonitorHandlers& handlers, UniqueFd inotify, UniqueFd wake)
      : handlers_(handlers),
        inotify_(std::move(inotify)),
        wake_(std::move(wake)),
        tree_(inotify_.Get(), handlers) {
    worker_ = std::thread([this] { Run(); });
  }

  ~InotifyBackend() override {
    const std::uint64_t one = 1;
    // An eventfd write only fails when the counter would overflow, which one write cannot do.
    [[maybe_unused]] const ssize_t written = write(wake_.Get(), &one, sizeof one);
    worker_.join();
  }

  bool Running() const override { return !stopped_; }
  bool Add(const std::string& root, std::int64_t id) override;
  void Remove(std::int64_t id) override;

 private:
  void Run();
  // Waits for and reads one buffer of events; 0 or the errno that broke the channel.
  int ReadOnce(char* buffer, std::size_t& length);
  void Dispatch(const ReadOutcome& outcome);
  std::vector<std::int64_t> WatchIds() const;

  const MonitorHandlers& handlers_;
  UniqueFd inotify_;
  UniqueFd wake_;
  std::atomic<bool> stopped_{false};
  std::mutex mutex_;  // over tree_ and watches_
  InotifyTree tree_;
  std::map<std::int64_t, WatchState> watches_;
  std::thread worker_;
};

bool InotifyBackend::Add(const std::string& root, std::int64_t id) {
  struct stat status;
  if (stat(root.c_str(), &status) != 0) {
    handlers_.errorText(CannotOpenDirectory(errno));
    return false;
  }
  if (!S_ISDIR(status.st_mode)) {
    handlers_.errorText(NotADirectory(root));
    return false;
  }
  std::lock_guard<std::mutex> lock(mutex_);
  if (stopped_) return false;
  if (const int error = tree_.AddRoot(root, id)) {
    handlers_.errorText(CannotOpenDirectory(error));
    return false;
  }
  watches_[id] = WatchState::Active;
  return true;
}

void InotifyBackend::Remove(std::int64_t id) {
  std::lock_guard<std::mutex> lock(mutex_);
  tree_.Remove(id);
  watches_.erase(id);
}

void InotifyBackend::Run() {
  std::vector<char> buffer(kReadBufferSize);
  int error = 0;
  for (;;) {
    std::size_t length = 0;
    error = ReadOnce(buffer.data(), length);
    if (error || length == 0) break;
    std::lock_guard<std::mutex> lock(mutex_);
    Dispatch(tree_.Translate(buffer.data(), length));
  }
  stopped_ = true;
  if (!error) return;
  std::lock_guard<std::mutex> lock(mutex_);
  ReportChannelFailure(handlers_, static_cast<unsigned long>(error), WatchIds());
}

int InotifyBackend::ReadOnce(char* buffer, std::size_t& length) {
  for (;;) {
    pollfd waits[2] = {{wake_.Get(), POLLIN, 0}, {inotify_.Get(), POLLIN, 0}};
    if (poll(waits, 2, -1) < 0) {
      if (errno == EINTR) continue;
      return errno;
    }
    if (waits[0].revents) return 0;  // woken to stop: length stays 0
    const ssize_t got = read(inotify_.Get(), buffer, kReadBufferSize);
    if (got > 0) {
      length = static_cast<std::size_t>(got);
      return 0;
    }
    if (got < 0 && errno != EINTR && errno != EAGAIN) return errno;
  }
}

// Batches first, so that a watch's last changes reach the host before it is declared gone.
void InotifyBackend::Dispatch(const ReadOutcome& outcome) {
  for (const auto& [id, batch] : outcome.batches)
    if (!batch.empty()) handlers_.event(id, batch);
  for (std::int64_t id : outcome.rootsGone) {
    handlers_.watchError(id);
    watches_.erase(id);
  }
  if (!outcome.overflow) return;
  for (auto& [id, state] : watches_) {
    if (state == WatchState::Silent) continue;
    handlers_.watchError(id);
    tree_.Remove(id);
    state = WatchState::Silent;
  }
}

std::vector<std::int64_t> InotifyBackend::WatchIds() const {
  std::vector<std::int64_t> ids;
  for (const auto& entry : watches_) ids.push_back(entry.first);
  return ids;
}

}  // namespace

std::unique_ptr<MonitorBackend> CreateMonitorBackend(const MonitorHandlers& handlers,
                                                     std::string& errorText) {
  UniqueFd inotify(inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  UniqueFd wake(eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC));
  if (!inotify.Valid() || !wake.Valid()) {
    errorText = kChannelNotCreated;
    return nullptr;
  }
  return std::make_unique<InotifyBackend>(handlers, std::move(inotify), std::move(wake));
}

}  // namespace vexil
