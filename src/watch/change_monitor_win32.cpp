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
  WatchInfo(std::string root, UniqueHandle directory, std::int64_t id, const WatchOptions& options)
      : root(std::move(root)), directory(std::move(directory)), id(id), options(options) {}

  std::unique_ptr<OVERLAPPED> overlapped = std::make_unique<OVERLAPPED>();  // zero-filled
  alignas(8) BYTE buffer[kBufferSize];
  std::string root;
  UniqueHandle directory;
  std::int64_t id;
  WatchOptions options;
  std::atomic<WatchState> state{WatchState::Idle};
};

// The name a batch carries: long form, UTF-8, a directory's with a trailing backslash.
std::string EntryName(const std::wstring& root, Notice& notice) {
  if (StillExists(notice.action)) notice.name = LongName(root, notice.name);
  std::string name = Narrow(notice.name);
  if (notice.isDirectory) name += '\\';
  return name;
}

bool IsDirectoryName(const std::string& name) { return !name.empty() && name.back() == '\\'; }

// With modifications asked for, a file that arrives (moved in, or renamed onto its name)
// brings content that no write reported.
void AddNewContent(const WatchOptions& options, const std::string& name, BatchList& batches) {
  if (options.modifications && !IsDirectoryName(name)) batches.Add(name, kActionModified);
}

void AddChange(const WatchOptions& options, std::string name, DWORD action, BatchList& batches) {
  // A directory's own time stamps change with its entries: that is no change of content.
  if (action == kActionModified && IsDirectoryName(name)) return;
  if (action == kActionAdded) AddNewContent(options, name, batches);
  batches.Add(std::move(name), action);
}

class CompletionPortBackend final : public MonitorBackend {
 public:
  CompletionPortBackend(MonitorHandlers handlers, UniqueHandle port)
      : MonitorBackend(std::move(handlers)), port_(std::move(port)) {}

 protected:
  void Run() override;
  void Wake() override;
  std::error_code AddWatch(const std::string& root, std::int64_t id, const WatchOptions& options) override;
  void RemoveWatch(std::int64_t id) override;

 private:
  using Watches = std::map<OVERLAPPED*, std::unique_ptr<WatchInfo>>;

  void Drain(OVERLAPPED* aborted);
  // Parses a completion under the lock; true when the watch reads on once it is delivered.
  bool HandleCompletion(DWORD bytes, OVERLAPPED* overlapped, Deliveries& deliveries);
  void ReadAgain(OVERLAPPED* overlapped);
  bool IssueRead(WatchInfo& watch);
  void Parse(const WatchInfo& watch, Deliveries& deliveries) const;
  bool AnyStopping();
  std::vector<std::int64_t> WatchIds() const;
  // Directory handles complete with key 0; only the wake-up carries this one.
  ULONG_PTR WakeKey() const { return reinterpret_cast<ULONG_PTR>(this); }

  UniqueHandle port_;
  std::mutex mutex_;  // over watches_
  Watches watches_;
};

void CompletionPortBackend::Wake() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    for (auto& entry : watches_) {
      WatchInfo& watch = *entry.second;
      if (watch.state == WatchState::Reading) watch.state = WatchState::Stopping;
      watch.directory.Close();
    }
  }
  PostQueuedCompletionStatus(port_.Get(), 0, WakeKey(), nullptr);
}

std::error_code CompletionPortBackend::AddWatch(const std::string& root, std::int64_t id,
                                                const WatchOptions& options) {
  UniqueHandle directory(CreateFileA(root.c_str(), FILE_LIST_DIRECTORY,
                                     FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                     OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS | FILE_FLAG_OVERLAPPED,
                                     nullptr));
  const auto systemError = [] { return std::error_code(static_cast<int>(GetLastError()), std::system_category()); };
  if (!directory.Valid()) {
    const std::error_code error = systemError();
    ReportNow(CannotOpenDirectory(static_cast<unsigned long>(error.value())));
    return error;
  }
  BY_HANDLE_FILE_INFORMATION information;
  if (!GetFileInformationByHandle(directory.Get(), &information)) return systemError();
  if (!(information.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY)) {
    ReportNow(NotADirectory(root));
    return std::make_error_code(std::errc::not_a_directory);
  }
  if (!CreateIoCompletionPort(directory.Get(), port_.Get(), 0, 1)) {
    const std::error_code error = systemError();
    ReportNow("Cannot create IOCP: " + std::to_string(error.value()) + "\n");
    return error;
  }
  auto watch = std::make_unique<WatchInfo>(root, std::move(directory), id, options);
  OVERLAPPED* key = watch->overlapped.get();
  std::lock_guard<std::mutex> lock(mutex_);
  const auto [entry, inserted] = watches_.emplace(key, std::move(watch));
  if (!inserted) return std::make_error_code(std::errc::file_exists);
  if (Running() && IssueRead(*entry->second)) return {};
  const std::error_code error = Running() ? systemError() : std::make_error_code(std::errc::operation_canceled);
  watches_.erase(entry);
  return error;
}

void CompletionPortBackend::RemoveWatch(std::int64_t id) {
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
  const DWORD filter = kNotifyFilter | (watch.options.modifications ? FILE_NOTIFY_CHANGE_LAST_WRITE : 0);
  const BOOL subtree = watch.options.recursive ? TRUE : FALSE;
  const BOOL issued =
      readEx ? readEx(watch.directory.Get(), watch.buffer, kBufferSize, subtree, filter, nullptr,
                      watch.overlapped.get(), nullptr, kNotifyExtendedInformation)
             : ReadDirectoryChangesW(watch.directory.Get(), watch.buffer, kBufferSize, subtree, filter, nullptr,
                                     watch.overlapped.get(), nullptr);
  watch.state = issued ? WatchState::Reading : WatchState::Idle;
  return issued != FALSE;
}

void CompletionPortBackend::Run() {
  DWORD error = 0;
  OVERLAPPED* failed = nullptr;
  // A failed wait ends the worker even when it carries a packet (an aborted read): the
  // channel is then reported broken, strictly, unless the monitor is being destroyed.
  for (;;) {
    DWORD bytes = 0;
    ULONG_PTR key = 0;
    OVERLAPPED* overlapped = nullptr;
    if (!GetQueuedCompletionStatus(port_.Get(), &bytes, &key, &overlapped, INFINITE)) {
      error = GetLastError();
      failed = overlapped;
      break;
    }
    if (key == WakeKey()) break;
    Deliveries deliveries;
    bool readAgain = false;
    {
      std::lock_guard<std::mutex> lock(mutex_);
      readAgain = HandleCompletion(bytes, overlapped, deliveries);
    }
    Deliver(deliveries);
    if (readAgain) ReadAgain(overlapped);
  }
  LoopEnded();
  if (!error || (failed && StopRequested())) return Drain(failed);
  Deliveries deliveries;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    ReportChannelFailure(error, WatchIds(), deliveries);
  }
  Deliver(deliveries);
}

// Waits for the aborted reads of the stopped watches, so that their buffers are not freed
// while the system may still write to them. `aborted` already came back.
void CompletionPortBackend::Drain(OVERLAPPED* aborted) {
  for (OVERLAPPED* overlapped = aborted;;) {
    {
      std::lock_guard<std::mutex> lock(mutex_);
      const auto found = overlapped ? watches_.find(overlapped) : watches_.end();
      if (found != watches_.end()) watches_.erase(found);
      if (!AnyStopping()) return;
    }
    DWORD bytes = 0;
    ULONG_PTR key = 0;
    overlapped = nullptr;
    // An aborted read dequeues as a failed wait with its record; the wake-up carries none,
    // and a wait that fails without a record means the port itself failed.
    const BOOL woke = GetQueuedCompletionStatus(port_.Get(), &bytes, &key, &overlapped, INFINITE);
    if (!overlapped && !(woke && key == WakeKey())) return;
  }
}

bool CompletionPortBackend::HandleCompletion(DWORD bytes, OVERLAPPED* overlapped, Deliveries& deliveries) {
  const auto found = watches_.find(overlapped);
  if (found == watches_.end()) {
    deliveries.push_back({Delivery::Kind::Text, 0, {}, "WatchInfo was not found for filesystem event.\n"});
    return false;
  }
  WatchInfo& watch = *found->second;
  if (watch.state == WatchState::Reading) watch.state = WatchState::Idle;
  if (watch.state == WatchState::Stopping) {
    watches_.erase(found);
    return false;
  }
  if (bytes == 0) {  // the buffer overflowed: changes were lost, so the watch goes quiet
    deliveries.push_back({Delivery::Kind::WatchError, watch.id, {}, {}});
    return false;
  }
  Parse(watch, deliveries);
  return true;
}

// After the handler, as a read's changes were always handled before the next read: what
// happens meanwhile waits in the system's buffer and comes as one batch.
void CompletionPortBackend::ReadAgain(OVERLAPPED* overlapped) {
  Deliveries deliveries;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    const auto found = watches_.find(overlapped);
    // Removed meanwhile, or closed by a destruction that has begun.
    if (found == watches_.end() || StopRequested() || IssueRead(*found->second)) return;
    deliveries.push_back({Delivery::Kind::WatchError, found->second->id, {}, {}});
    watches_.erase(found);
  }
  Deliver(deliveries);
}

// The records of one buffer in order; an old name directly followed by its new name is one
// rename.
void CompletionPortBackend::Parse(const WatchInfo& watch, Deliveries& deliveries) const {
  BatchList batches;
  const std::wstring root = Widen(watch.root);
  const bool extended = kernel32.ReadDirectoryChangesEx() != nullptr;
  std::string oldName;  // an old name whose new name may come next
  bool haveOld = false;
  for (const BYTE* at = watch.buffer; at;) {
    Notice notice = extended ? ReadExtended(at) : ReadPlain(at, root);
    std::string name = EntryName(root, notice);
    if (haveOld && notice.action == kActionRenamedNew) {
      batches.AddRename(std::move(oldName), name);
      AddNewContent(watch.options, name, batches);
    } else {
      if (haveOld) batches.Add(std::move(oldName), kActionRenamedOld);
      if (notice.action == kActionRenamedOld) oldName = std::move(name);
      if (notice.action != kActionRenamedOld) AddChange(watch.options, std::move(name), notice.action, batches);
    }
    haveOld = notice.action == kActionRenamedOld;
    at = notice.next == 0 ? nullptr : at + notice.next;
  }
  if (haveOld) batches.Add(std::move(oldName), kActionRenamedOld);
  batches.MoveInto(watch.id, deliveries);
}

bool CompletionPortBackend::AnyStopping() {
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

std::shared_ptr<MonitorBackend> CreateMonitorBackend(MonitorHandlers handlers, std::string& errorText) {
  UniqueHandle port(CreateIoCompletionPort(INVALID_HANDLE_VALUE, nullptr, 0, 1));
  if (!port.Valid()) {
    errorText = kChannelNotCreated;
    return nullptr;
  }
  return std::make_shared<CompletionPortBackend>(std::move(handlers), std::move(port));
}

}  // namespace vexil
