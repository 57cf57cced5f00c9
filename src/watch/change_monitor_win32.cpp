// The change monitor's Windows backend: one I/O completion port and one worker thread; each
// watch keeps one outstanding directory read into its own 64 KiB buffer.
#ifndef NOMINMAX
#  define NOMINMAX
#endif
#ifndef WIN32_LEAN_AND_MEAN
#  define WIN32_LEAN_AND_MEAN
#endif
#include <windows.h>

#include <atomic>
#include <cstdint>
#include <map>
#include <mutex>
#include <thread>
#include <utility>

#include "watch/monitor_backend.h"

namespace vexil {
namespace {

constexpr DWORD kBufferSize = 65536;
// Only names: creations, removals and renames of files and directories.
constexpr DWORD kNotifyFilter = FILE_NOTIFY_CHANGE_FILE_NAME | FILE_NOTIFY_CHANGE_DIR_NAME;
constexpr int kNotifyExtendedInformation = 2;  // ReadDirectoryNotifyExtendedInformation

// FILE_NOTIFY_EXTENDED_INFORMATION as the system writes it; not every SDK declares it.
struct ExtendedRecord {
  DWORD NextEntryOffset;
  DWORD Action;
  LARGE_INTEGER CreationTime;
  LARGE_INTEGER LastModificationTime;
  LARGE_INTEGER LastChangeTime;
  LARGE_INTEGER LastAccessTime;
  LARGE_INTEGER AllocatedLength;
  LARGE_INTEGER FileSize;
  DWORD FileAttributes;
  DWORD ReparsePointTag;
  LARGE_INTEGER FileId;
  LARGE_INTEGER ParentFileId;
  DWORD FileNameLength;
  WCHAR FileName[1];
};

using ReadChangesEx = BOOL(WINAPI*)(HANDLE, LPVOID, DWORD, BOOL, DWORD, LPDWORD, LPOVERLAPPED,
                                    LPOVERLAPPED_COMPLETION_ROUTINE, int);

// The extended directory read exists from Windows 10 1709 on (and not in wine 8), so it is
// looked up once, when the module is loaded.
class Kernel32 {
 public:
  Kernel32() : module_(LoadLibraryA("kernel32.dll")) {
    if (module_)
      readChangesEx_ = reinterpret_cast<ReadChangesEx>(
          reinterpret_cast<void*>(GetProcAddress(module_, "ReadDirectoryChangesExW")));
  }
  virtual ~Kernel32() {
    if (module_) FreeLibrary(module_);
  }
  Kernel32(const Kernel32&) = delete;
  Kernel32& operator=(const Kernel32&) = delete;

  ReadChangesEx ReadDirectoryChangesEx() const { return readChangesEx_; }

 private:
  HMODULE module_;
  ReadChangesEx readChangesEx_ = nullptr;
};

const Kernel32 kernel32;

class UniqueHandle {
 public:
  explicit UniqueHandle(HANDLE handle) : handle_(handle) {}
  UniqueHandle(UniqueHandle&& other) noexcept : handle_(std::exchange(other.handle_, nullptr)) {}
  ~UniqueHandle() { Close(); }
  UniqueHandle(const UniqueHandle&) = delete;
  UniqueHandle& operator=(const UniqueHandle&) = delete;

  HANDLE Get() const { return handle_; }
  bool Valid() const { return handle_ && handle_ != INVALID_HANDLE_VALUE; }
  // Closing a directory aborts its outstanding read, which then completes on the port.
  void Close() {
    if (Valid()) CloseHandle(handle_);
    handle_ = nullptr;
  }

 private:
  HANDLE handle_;
};

std::wstring Widen(const std::string& text) {
  if (text.empty()) return {};
  const int size = MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), nullptr, 0);
  std::wstring wide(static_cast<std::size_t>(size), L'\0');
  MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), wide.data(), size);
  return wide;
}

std::string Narrow(const std::wstring& text) {
  if (text.empty()) return {};
  const int size = WideCharToMultiByte(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), nullptr,
                                       0, nullptr, nullptr);
  std::string narrow(static_cast<std::size_t>(size), '\0');
  WideCharToMultiByte(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), narrow.data(), size,
                      nullptr, nullptr);
  return narrow;
}

// Removed and old names no longer exist, so they can be neither expanded nor inspected.
bool StillExists(DWORD action) { return action != kActionRemoved && action != kActionRenamedOld; }

// Short (8.3) components of `relative` in their long form, when the entry still exists.
std::wstring LongName(const std::wstring& root, const std::wstring& relative) {
  const std::wstring prefix = root + L"\\";
  const std::wstring full = prefix + relative;
  const DWORD needed = GetLongPathNameW(full.c_str(), nullptr, 0);
  if (needed == 0) return relative;
  std::wstring longPath(needed, L'\0');
  if (GetLongPathNameW(full.c_str(), longPath.data(), needed) == 0) return relative;
  while (!longPath.empty() && longPath.back() == L'\0') longPath.pop_back();
  if (longPath.compare(0, prefix.size(), prefix) != 0) return relative;
  return longPath.substr(prefix.size());
}

// One record of either notification format.
struct Notice {
  DWORD next;
  DWORD action;
  std::wstring name;
  bool isDirectory;
};

Notice ReadExtended(const BYTE* at) {
  const auto* record = reinterpret_cast<const ExtendedRecord*>(at);
  return {record->NextEntryOffset, record->Action,
          std::wstring(record->FileName, record->FileNameLength / sizeof(WCHAR)),
          (record->FileAttributes & FILE_ATTRIBUTE_DIRECTORY) != 0};
}

// The plain format carries no attributes: an entry that still exists is asked for them.
Notice ReadPlain(const BYTE* at, const std::wstring& root) {
  const auto* record = reinterpret_cast<const FILE_NOTIFY_INFORMATION*>(at);
  Notice notice{record->NextEntryOffset, record->Action,
                std::wstring(record->FileName, record->FileNameLength / sizeof(WCHAR)), false};
  if (StillExists(notice.action)) {
    const DWORD attributes = GetFileAttributesW((root + L"\\" + notice.name).c_str());
    notice.isDirectory = attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY);
  }
  return notice;
}

enum class WatchState : std::uint8_t { Idle = 0, Reading = 1, Stopping = 2 };

struct WatchInfo {
  WatchInfo(std::string root, UniqueHandle directory, std::int64_t id)
      : root(std::move(root)), directory(std::move(directory)), id(id) {}

  std::unique_ptr<OVERLAPPED> overlapped = std::make_unique<OVERLAPPED>();  // zero-filled
  alignas(8) BYTE buffer[kBufferSize];
  std::string root;
  UniqueHandle directory;
  std::int64_t id;
  std::atomic<WatchState> state{WatchState::Idle};
};

class CompletionPortBackend final : public MonitorBackend {
 public:
  CompletionPortBackend(const MonitorHandlers& handlers, UniqueHandle port)
      : handlers_(handlers), port_(std::move(port)) {
    worker_ = std::thread([this] { Run(); });
  }
  ~CompletionPortBackend() override;

  bool Running() const override { return !stopped_; }
  bool Add(const std::string& root, std::int64_t id) override;
  void Remove(std::int64_t id) override;

 private:
  using Watches = std::map<OVERLAPPED*, std::unique_ptr<WatchInfo>>;

  void Run();
  void Drain();
  void HandleCompletion(DWORD bytes, OVERLAPPED* overlapped);
  bool IssueRead(WatchInfo& watch);
  ChangeBatch Parse(const WatchInfo& watch) const;
  bool AnyStopping() const;
  std::vector<std::int64_t> WatchIds() const;
  // Directory handles complete with key 0; only the wake-up carries this one.
  ULONG_PTR WakeKey() const { return reinterpret_cast<ULONG_PTR>(this); }

  const MonitorHandlers& handlers_;
  UniqueHandle port_;
  std::mutex mutex_;  // over watches_
  Watches watches_;
  std::atomic<bool> stopped_{false};
  std::thread worker_;
};

CompletionPortBackend::~CompletionPortBackend() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    for (auto& entry : watches_) {
      WatchInfo& watch = *entry.second;
      if (watch.state == WatchState::Reading) watch.state = WatchState::Stopping;
      watch.directory.Close();
    }
  }
  PostQueuedCompletionStatus(port_.Get(), 0, WakeKey(), nullptr);
  worker_.join();
}

bool CompletionPortBackend::Add(const std::string& root, std::int64_t id) {
  UniqueHandle directory(CreateFileA(root.c_str(), FILE_LIST_DIRECTORY,
                                     FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                     OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS | FILE_FLAG_OVERLAPPED,
                                     nullptr));
  if (!directory.Valid()) {
    handlers_.errorText(CannotOpenDirectory(GetLastError()));
    return false;
  }
  BY_HANDLE_FILE_INFORMATION information;
  if (!GetFileInformationByHandle(directory.Get(), &information)) return false;
  if (!(information.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY)) {
    handlers_.errorText(NotADirectory(root));
    return false;
  }
  if (!CreateIoCompletionPort(directory.Get(), port_.Get(), 0, 1)) {
    handlers_.errorText("Cannot create IOCP: " + std::to_string(GetLastError()) + "\n");
    return false;
  }
  auto watch = std::make_unique<WatchInfo>(root, std::move(directory), id);
  OVERLAPPED* key = watch->overlapped.get();
  std::lock_guard<std::mutex> lock(mutex_);
  const auto [entry, inserted] = watches_.emplace(key, std::move(watch));
  if (!inserted) return false;
  if (!stopped_ && IssueRead(*entry->second)) return true;
  watches_.erase(entry);
  return false;
}

void CompletionPortBackend::Remove(std::int64_t id) {
  std::lock_guard<std::mutex> lock(mutex_);
  for (auto entry = watches_.begin(); entry != watches_.end(); ++entry) {
    WatchInfo& watch = *entry->second;
    if (watch.id != id) continue;
    if (watch.state != WatchState::Reading) {  // no read to wait for: a silent watch
      watches_.erase(entry);
      return;
    }
    watch.state = WatchState::Stopping;
    watch.directory.Close();  // the worker frees it when the aborted read comes back
    return;
  }
}

bool CompletionPortBackend::IssueRead(WatchInfo& watch) {
  if (watch.state != WatchState::Idle) return false;
  const ReadChangesEx readEx = kernel32.ReadDirectoryChangesEx();
  const BOOL issued =
      readEx ? readEx(watch.directory.Get(), watch.buffer, kBufferSize, TRUE, kNotifyFilter, nullptr,
                      watch.overlapped.get(), nullptr, kNotifyExtendedInformation)
             : ReadDirectoryChangesW(watch.directory.Get(), watch.buffer, kBufferSize, TRUE,
                                     kNotifyFilter, nullptr, watch.overlapped.get(), nullptr);
  watch.state = issued ? WatchState::Reading : WatchState::Idle;
  return issued != FALSE;
}

void CompletionPortBackend::Run() {
  DWORD bytes = 0;
  ULONG_PTR key = 0;
  OVERLAPPED* overlapped = nullptr;
  bool woken = false;
  // A failed wait ends the worker even when it carries a packet (an aborted read): the
  // channel is then reported broken, strictly.
  while (GetQueuedCompletionStatus(port_.Get(), &bytes, &key, &overlapped, INFINITE)) {
    if (key == WakeKey()) {
      woken = true;
      break;
    }
    std::lock_guard<std::mutex> lock(mutex_);
    HandleCompletion(bytes, overlapped);
  }
  const DWORD error = woken ? 0 : GetLastError();
  stopped_ = true;
  std::lock_guard<std::mutex> lock(mutex_);
  if (woken)
    Drain();
  else
    ReportChannelFailure(handlers_, error, WatchIds());
}

// Waits for the aborted reads of the stopped watches, so that their buffers are not freed
// while the system may still write to them.
void CompletionPortBackend::Drain() {
  while (AnyStopping()) {
    DWORD bytes = 0;
    ULONG_PTR key = 0;
    OVERLAPPED* overlapped = nullptr;
    // An aborted read dequeues as a failed wait with its record; no record means the
    // wait itself failed.
    GetQueuedCompletionStatus(port_.Get(), &bytes, &key, &overlapped, INFINITE);
    if (!overlapped) return;
    const auto found = watches_.find(overlapped);
    if (found != watches_.end()) watches_.erase(found);
  }
}

void CompletionPortBackend::HandleCompletion(DWORD bytes, OVERLAPPED* overlapped) {
  const auto found = watches_.find(overlapped);
  if (found == watches_.end()) {
    handlers_.errorText("WatchInfo was not found for filesystem event.\n");
    return;
  }
  WatchInfo& watch = *found->second;
  if (watch.state == WatchState::Reading) watch.state = WatchState::Idle;
  if (watch.state == WatchState::Stopping) {
    watches_.erase(found);
    return;
  }
  if (bytes == 0) {  // the buffer overflowed: changes were lost, so the watch goes quiet
    handlers_.watchError(watch.id);
    return;
  }
  const ChangeBatch batch = Parse(watch);
  if (!batch.empty()) handlers_.event(watch.id, batch);
  if (IssueRead(watch)) return;
  handlers_.watchError(watch.id);
  watches_.erase(found);
}

ChangeBatch CompletionPortBackend::Parse(const WatchInfo& watch) const {
  ChangeBatch batch;
  const std::wstring root = Widen(watch.root);
  const bool extended = kernel32.ReadDirectoryChangesEx() != nullptr;
  for (const BYTE* at = watch.buffer;;) {
    Notice notice = extended ? ReadExtended(at) : ReadPlain(at, root);
    if (StillExists(notice.action)) notice.name = LongName(root, notice.name);
    std::string name = Narrow(notice.name);
    if (notice.isDirectory) name += '\\';
    batch.emplace(std::move(name), notice.action);
    if (notice.next == 0) break;
    at += notice.next;
  }
  return batch;
}

bool CompletionPortBackend::AnyStopping() const {
  for (const auto& entry : watches_)
    if (entry.second->state == WatchState::Stopping) return true;
  return false;
}

std::vector<std::int64_t> CompletionPortBackend::WatchIds() const {
  std::vector<std::int64_t> ids;
  for (const auto& entry : watches_) ids.push_back(entry.second->id);
  return ids;
}

}  // namespace

std::unique_ptr<MonitorBackend> CreateMonitorBackend(const MonitorHandlers& handlers,
                                                     std::string& errorText) {
  UniqueHandle port(CreateIoCompletionPort(INVALID_HANDLE_VALUE, nullptr, 0, 1));
  if (!port.Valid()) {
    errorText = kChannelNotCreated;
    return nullptr;
  }
  return std::make_unique<CompletionPortBackend>(handlers, std::move(port));
}

}  // namespace vexil
