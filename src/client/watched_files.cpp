// The notifier's parts: the monitor's batches become file changes, gathered per path until
// the batch is due, then filtered by the registry and handed over as notification params.
#include "client/watched_files.h"

#include <Poco/File.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <system_error>
#include <unordered_map>
#include <utility>

#include "client/file_watchers.h"
#include "client/path_style.h"
#include "vexil/client/uri.h"
#include "vexil/json/json.h"

namespace vexil {

const char kWatchedFilesCapabilities[] =
    R"({"workspace":{"didChangeWatchedFiles":{"dynamicRegistration":true,"relativePatternSupport":true}}})";

namespace {

using Clock = std::chrono::steady_clock;
using PathChanges = std::vector<std::pair<std::string, FileChangeType>>;

struct FileChange {
  std::string path;
  std::size_t folder;
  int type;  // a FileChangeType, or 0 when the changes of the batch cancelled out
};

// What two changes of one path within a batch amount to: created then deleted is nothing,
// deleted then created a change, created then changed still a creation.
int Combine(int earlier, int later) {
  if (earlier == kFileCreated) return later == kFileDeleted ? 0 : kFileCreated;
  if (earlier == kFileChanged) return later == kFileDeleted ? kFileDeleted : kFileChanged;
  if (earlier == kFileDeleted && later == kFileCreated) return kFileChanged;
  return later;
}

// The changes of one batch, one per path, in the order the paths first changed.
class PendingChanges {
 public:
  bool Empty() const { return changes_.empty(); }
  void Add(std::string path, std::size_t folder, FileChangeType type) {
    const auto [entry, added] = index_.emplace(path, changes_.size());
    if (added) {
      changes_.push_back({std::move(path), folder, type});
    } else {
      int& combined = changes_[entry->second].type;
      combined = Combine(combined, type);
    }
  }
  std::vector<FileChange> Take() {
    index_.clear();
    return std::exchange(changes_, {});
  }

 private:
  std::vector<FileChange> changes_;
  std::unordered_map<std::string, std::size_t> index_;
};

bool IsDirectory(const std::string& path) {
  try {
    Poco::File file(path);
    return file.exists() && file.isDirectory();
  } catch (const std::exception&) {
    return false;
  }
}

bool Exists(const std::string& path) {
  try {
    return Poco::File(path).exists();
  } catch (const std::exception&) {
    return false;
  }
}

// The absolute path of a name the monitor reported under `root`, without the separator
// that marks a directory.
std::string PathOf(const std::string& root, std::string name) {
  const char separator = NativeSeparator();
  if (!name.empty() && name.back() == separator) name.pop_back();
  if (root.empty() || root.back() == separator || root.back() == '/') return root + name;
  return root + separator + name;
}

// The file changes of one monitor batch. A batch is ordered by name, not by time, so a name
// both removed and added (or written) within it is taken as the disk now shows it: replaced
// when it exists, deleted when it does not.
PathChanges Translate(const ChangeBatch& batch, const std::string& root) {
  PathChanges changes;
  for (auto at = batch.begin(); at != batch.end();) {
    const std::string& name = at->first;
    bool added = false, removed = false, written = false;
    for (; at != batch.end() && at->first == name; ++at) {
      added = added || at->second == kActionAdded || at->second == kActionRenamedNew;
      removed = removed || at->second == kActionRemoved || at->second == kActionRenamedOld;
      written = written || at->second == kActionModified;
    }
    std::string path = PathOf(root, name);
    if (removed) changes.emplace_back(path, kFileDeleted);
    if (removed && (added || written) && Exists(path)) changes.emplace_back(path, kFileCreated);
    if (!removed && added) changes.emplace_back(path, kFileCreated);
    if (!removed && written) changes.emplace_back(std::move(path), kFileChanged);
  }
  return changes;
}

}  // namespace

struct WatchedFilesNotifier::State {
  State(const std::vector<std::string>& folders, Callbacks callbacks)
      : folders(folders), callbacks(std::move(callbacks)) {}

  void Add(std::int64_t id, const ChangeBatch& batch);
  void Error(std::string text);
  void LimitReached(const std::string& path);
  // The notifier's thread: waits for errors and due batches and hands them over.
  void Run();
  std::string TakeParams();

  const std::vector<std::string> folders;  // watch id - 1 is the index
  const Callbacks callbacks;
  std::atomic<bool> stopping{false};
  std::atomic<bool> initialized{false};
  std::mutex mutex;  // over everything below
  std::condition_variable wake;
  FileWatcherRegistry registry;
  PendingChanges pending;
  Clock::time_point due;
  std::vector<std::string> errors;
  bool limitTold = false;
  // While a watch is added: the thread adding it, and what the monitor said meanwhile on it.
  std::thread::id adder;
  std::vector<std::string> addTexts;
};

void WatchedFilesNotifier::State::Add(std::int64_t id, const ChangeBatch& batch) {
  if (!initialized) return;
  const std::size_t folder = static_cast<std::size_t>(id - 1);
  PathChanges changes = Translate(batch, folders[folder]);
  {
    std::lock_guard<std::mutex> lock(mutex);
    if (pending.Empty()) due = Clock::now() + kBatchDelay;
    for (auto& [path, type] : changes) pending.Add(std::move(path), folder, type);
  }
  wake.notify_all();
}

void WatchedFilesNotifier::State::Error(std::string text) {
  {
    std::lock_guard<std::mutex> lock(mutex);
    if (adder == std::this_thread::get_id()) return addTexts.push_back(std::move(text));
    errors.push_back(std::move(text));
  }
  wake.notify_all();
}

void WatchedFilesNotifier::State::LimitReached(const std::string& path) {
  {
    std::lock_guard<std::mutex> lock(mutex);
    if (std::exchange(limitTold, true)) return;
  }
  Error("Watch limit reached: changes in " + path +
        " and other directories are not reported (the system's limit on watched directories, "
        "fs.inotify.max_user_watches, is too low for this workspace).\n");
}

void WatchedFilesNotifier::State::Run() {
  std::unique_lock<std::mutex> lock(mutex);
  while (!stopping) {
    const bool batchDue = !pending.Empty() && Clock::now() >= due;
    if (errors.empty() && !batchDue) {
      if (pending.Empty()) {
        wake.wait(lock);
      } else {
        wake.wait_until(lock, due);
      }
      continue;
    }
    const std::vector<std::string> told = std::exchange(errors, {});
    const std::string params = batchDue ? TakeParams() : std::string();
    lock.unlock();
    for (const std::string& text : told)
      if (!stopping && callbacks.error) callbacks.error(text);
    if (!params.empty() && !stopping && callbacks.send) callbacks.send(params);
    lock.lock();
  }
}

// The due batch as params; empty when the server wants none of it.
std::string WatchedFilesNotifier::State::TakeParams() {
  LSP::xWriter writer;
  writer.StartObject();
  writer.StartArray("changes");
  bool any = false;
  for (const FileChange& change : pending.Take()) {
    const auto type = static_cast<FileChangeType>(change.type);
    if (!change.type || !registry.Wants(change.path, folders[change.folder], type)) continue;
    const std::string uri = FileToUri(change.path.c_str());
    if (uri.empty()) continue;  // no URI can name it
    writer.StartObject();
    writer.String("uri", uri);
    writer.Int("type", change.type);
    writer.EndObject();
    any = true;
  }
  writer.EndArray();
  writer.EndObject();
  return any ? writer.GetString() : std::string();
}

WatchedFilesNotifier::WatchedFilesNotifier(const std::vector<std::string>& folders, Callbacks callbacks)
    : state_(std::make_shared<State>(folders, std::move(callbacks))),
      monitor_({[state = state_.get()](std::int64_t id, const ChangeBatch& batch) { state->Add(id, batch); },
                [this](std::int64_t id) { Rewatch(id); },
                [state = state_.get()](const std::string& text) { state->Error(text); },
                [state = state_.get()](std::int64_t, const std::string& path) { state->LimitReached(path); }}) {
  if (!monitor_.ErrorText().empty()) state_->Error(monitor_.ErrorText());
  for (std::size_t i = 0; i < folders.size(); ++i) Watch(static_cast<std::int64_t>(i + 1));
  sender_ = std::thread([state = state_] { state->Run(); });
}

WatchedFilesNotifier::~WatchedFilesNotifier() {
  {
    std::lock_guard<std::mutex> lock(state_->mutex);
    state_->stopping = true;
  }
  state_->wake.notify_all();
  if (sender_.get_id() == std::this_thread::get_id()) {
    sender_.detach();  // a callback is destroying us: the thread ends when it returns
  } else if (sender_.joinable()) {
    sender_.join();
  }
}

void WatchedFilesNotifier::ServerInitialized() { state_->initialized = true; }

bool WatchedFilesNotifier::Register(const std::string& params, std::string& error) {
  std::lock_guard<std::mutex> lock(state_->mutex);
  return state_->registry.Register(params, error);
}

bool WatchedFilesNotifier::Unregister(const std::string& params, std::string& error) {
  std::lock_guard<std::mutex> lock(state_->mutex);
  return state_->registry.Unregister(params, error);
}

void WatchedFilesNotifier::Watch(std::int64_t id) {
  const std::string& folder = state_->folders[static_cast<std::size_t>(id - 1)];
  if (!IsDirectory(folder)) return state_->Error("Cannot watch folder: " + folder + ": not a directory\n");
  WatchOptions options;
  options.modifications = true;
  {
    std::lock_guard<std::mutex> lock(state_->mutex);
    state_->adder = std::this_thread::get_id();
  }
  std::error_code failure;
  const bool watching = monitor_.AddWatch(folder, id, options, &failure);
  std::vector<std::string> texts;
  {
    std::lock_guard<std::mutex> lock(state_->mutex);
    state_->adder = std::thread::id();
    texts = std::exchange(state_->addTexts, {});
  }
  // A failed add's texts are about the folder itself, without its name: say it with the name.
  if (!watching) texts.assign(1, "Cannot watch folder: " + folder + ": " + failure.message() + "\n");
  if (failure == std::errc::no_space_on_device) texts.clear();  // told as the watch limit
  for (std::string& text : texts) state_->Error(std::move(text));
}

void WatchedFilesNotifier::Rewatch(std::int64_t id) {
  monitor_.RemoveWatch(id);
  if (state_->stopping) return;
  const std::string& folder = state_->folders[static_cast<std::size_t>(id - 1)];
  if (!IsDirectory(folder)) return state_->Error("Folder no longer watched: " + folder + ": it is gone\n");
  state_->Error("Changes were lost in folder: " + folder + ": watching it again\n");
  Watch(id);
}

}  // namespace vexil
