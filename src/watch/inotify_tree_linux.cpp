// Bookkeeping of inotify descriptors per project watch, and the translation of raw events
// into per-watch batches: created and moved-in directories are watched and scanned at once.
#include "watch/inotify_tree.h"

#include <dirent.h>
#include <sys/inotify.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <system_error>
#include <unordered_map>

namespace vexil {
namespace {

constexpr std::uint32_t kEntryEvents = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO |
                                       IN_DELETE_SELF | IN_MOVE_SELF | IN_EXCL_UNLINK | IN_ONLYDIR;
// Below the root a symbolic link is an entry of its own, never a directory to descend into.
constexpr std::uint32_t kSubdirectoryMask = kEntryEvents | IN_DONT_FOLLOW;
constexpr std::uint32_t kSelfEvents = IN_DELETE_SELF | IN_MOVE_SELF | IN_IGNORED | IN_UNMOUNT;

std::string JoinPath(const std::string& directory, const std::string& name) {
  if (directory.empty() || directory.back() == '/') return directory + name;
  return directory + "/" + name;
}

// The entries of `descriptors` at `prefix` and below: one key range, as prefixes end in '/'.
std::pair<std::map<std::string, int>::iterator, std::map<std::string, int>::iterator> SubtreeRange(
    std::map<std::string, int>& descriptors, const std::string& prefix) {
  const auto first = descriptors.lower_bound(prefix);
  auto last = first;
  while (last != descriptors.end() && last->first.compare(0, prefix.size(), prefix) == 0) ++last;
  return {first, last};
}

void Report(ReadOutcome& outcome, std::int64_t id, const std::string& relative, bool isDirectory,
            unsigned action) {
  outcome.batches[id].emplace(isDirectory ? relative + "/" : relative, action);
}

struct Entry {
  std::string name;
  bool isDirectory;
};

bool IsDirectoryEntry(const dirent& entry, const std::string& path) {
  if (entry.d_type != DT_UNKNOWN) return entry.d_type == DT_DIR;
  struct stat status;
  return lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

// Read whole before descending, so a deep tree does not hold one open stream per level.
std::vector<Entry> ListDirectory(const std::string& path) {
  std::vector<Entry> entries;
  std::unique_ptr<DIR, int (*)(DIR*)> stream(opendir(path.c_str()), &closedir);
  if (!stream) return entries;  // gone again: its parent reports the removal
  while (const dirent* entry = readdir(stream.get())) {
    if (std::strcmp(entry->d_name, ".") == 0 || std::strcmp(entry->d_name, "..") == 0) continue;
    entries.push_back({entry->d_name, IsDirectoryEntry(*entry, JoinPath(path, entry->d_name))});
  }
  return entries;
}

}  // namespace

struct InotifyTree::Event {
  int descriptor;
  std::uint32_t mask;
  std::uint32_t cookie;
  std::string name;

  bool IsDirectory() const { return (mask & IN_ISDIR) != 0; }
};

namespace {

using Event = InotifyTree::Event;

std::vector<Event> ParseEvents(const char* buffer, std::size_t length) {
  std::vector<Event> events;
  std::size_t offset = 0;
  while (offset + sizeof(inotify_event) <= length) {
    inotify_event header;
    std::memcpy(&header, buffer + offset, sizeof header);
    const char* name = buffer + offset + sizeof header;
    events.push_back({header.wd, header.mask, header.cookie, std::string(name, strnlen(name, header.len))});
    offset += sizeof header + header.len;
  }
  return events;
}

// Both halves of each move seen in this read, by cookie.
struct MoveHalves {
  const Event* from = nullptr;
  const Event* to = nullptr;
};

using Moves = std::unordered_map<std::uint32_t, MoveHalves>;

Moves PairMoves(const std::vector<Event>& events) {
  Moves moves;
  for (const Event& event : events) {
    if (event.mask & IN_MOVED_FROM) moves[event.cookie].from = &event;
    if (event.mask & IN_MOVED_TO) moves[event.cookie].to = &event;
  }
  return moves;
}

}  // namespace

InotifyTree::InotifyTree(int inotifyFd, const MonitorHandlers& handlers)
    : fd_(inotifyFd), handlers_(handlers) {}

int InotifyTree::AddRoot(const std::string& root, std::int64_t id) {
  const int descriptor = inotify_add_watch(fd_, root.c_str(), kEntryEvents);
  if (descriptor < 0) return errno;
  projects_[id].root = root;
  const Owners owners{{id, ""}};
  Adopt(descriptor, owners);
  // What exists already is not a change; only its directories need watching.
  Scan(root, owners, nullptr);
  return 0;
}

void InotifyTree::Remove(std::int64_t id) {
  DetachSubtree(id, "");
  projects_.erase(id);
}

ReadOutcome InotifyTree::Translate(const char* buffer, std::size_t length) {
  ReadOutcome outcome;
  const std::vector<Event> events = ParseEvents(buffer, length);
  const auto moves = PairMoves(events);
  for (const Event& event : events) {
    if (event.mask & IN_Q_OVERFLOW) {
      outcome.overflow = true;
      continue;
    }
    const auto found = owners_.find(event.descriptor);
    if (found == owners_.end()) continue;  // dropped by us while the kernel still queued it
    const Owners owners = found->second;   // a copy: handling may add or drop descriptors
    if (event.mask & kSelfEvents) {
      SelfChanged(event, owners, outcome);
    } else if (event.mask & IN_CREATE) {
      Created(event, owners, outcome);
    } else if (event.mask & IN_DELETE) {
      Removed(event, owners, outcome);
    } else if (event.mask & IN_MOVED_FROM) {
      MovedFrom(event, moves.at(event.cookie).to, owners, outcome);
    } else if (event.mask & IN_MOVED_TO) {
      MovedTo(event, moves.at(event.cookie).from, owners, outcome);
    }
  }
  return outcome;
}

void InotifyTree::Created(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  Owners below;
  for (const auto& [id, prefix] : owners) {
    Report(outcome, id, prefix + event.name, event.IsDirectory(), kActionAdded);
    below.emplace(id, prefix + event.name + "/");
  }
  if (event.IsDirectory()) AddSubtree(EntryPath(below), below, &outcome);
}

void InotifyTree::Removed(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  // A removed directory's own descriptor is released when the kernel ignores it.
  for (const auto& [id, prefix] : owners)
    Report(outcome, id, prefix + event.name, event.IsDirectory(), kActionRemoved);
}

void InotifyTree::MovedFrom(const Event& event, const Event* partner, const Owners& owners,
                            ReadOutcome& outcome) {
  const bool isDirectory = event.IsDirectory();
  for (const auto& [id, prefix] : owners) {
    const std::string from = prefix + event.name;
    const std::string* target = partner ? PrefixIn(partner->descriptor, id) : nullptr;
    if (!target) {  // left this watch's tree
      Report(outcome, id, from, isDirectory, kActionRemoved);
      if (isDirectory) DetachSubtree(id, from + "/");
      continue;
    }
    const std::string to = *target + partner->name;
    Report(outcome, id, from, isDirectory, kActionRenamedOld);
    Report(outcome, id, to, isDirectory, kActionRenamedNew);
    if (isDirectory) MoveSubtree(id, from + "/", to + "/");
  }
}

void InotifyTree::MovedTo(const Event& event, const Event* partner, const Owners& owners,
                          ReadOutcome& outcome) {
  Owners arrived;
  for (const auto& [id, prefix] : owners) {
    // A move within this watch's tree was reported whole by its first half.
    if (partner && PrefixIn(partner->descriptor, id)) continue;
    Report(outcome, id, prefix + event.name, event.IsDirectory(), kActionAdded);
    arrived.emplace(id, prefix + event.name + "/");
  }
  if (event.IsDirectory() && !arrived.empty()) AddSubtree(EntryPath(arrived), arrived, &outcome);
}

void InotifyTree::SelfChanged(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  // Below a root, a directory's own move or removal is reported by its parent.
  for (const auto& [id, prefix] : owners)
    if (prefix.empty()) RootGone(id, outcome);
  if (!(event.mask & IN_IGNORED)) return;
  const auto found = owners_.find(event.descriptor);
  if (found == owners_.end()) return;
  for (const auto& [id, prefix] : found->second) {
    auto& descriptors = projects_[id].descriptors;
    const auto entry = descriptors.find(prefix);
    if (entry != descriptors.end() && entry->second == event.descriptor) descriptors.erase(entry);
  }
  owners_.erase(found);
}

void InotifyTree::RootGone(std::int64_t id, ReadOutcome& outcome) {
  outcome.rootsGone.push_back(id);
  Remove(id);
}

void InotifyTree::AddSubtree(const std::string& path, const Owners& owners, ReadOutcome* outcome) {
  const int descriptor = inotify_add_watch(fd_, path.c_str(), kSubdirectoryMask);
  if (descriptor < 0) {
    // Gone or replaced again before we got to it: its parent reports that.
    if (errno == ENOENT || errno == ENOTDIR) return;
    handlers_.errorText("Cannot watch directory: " + path + ": " +
                        std::error_code(errno, std::generic_category()).message() + "\n");
    return;
  }
  Adopt(descriptor, owners);
  Scan(path, owners, outcome);
}

void InotifyTree::Scan(const std::string& path, const Owners& owners, ReadOutcome* outcome) {
  for (const Entry& entry : ListDirectory(path)) {
    Owners below;
    for (const auto& [id, prefix] : owners) {
      if (outcome) Report(*outcome, id, prefix + entry.name, entry.isDirectory, kActionAdded);
      below.emplace(id, prefix + entry.name + "/");
    }
    if (entry.isDirectory) AddSubtree(JoinPath(path, entry.name), below, outcome);
  }
}

void InotifyTree::Adopt(int descriptor, const Owners& owners) {
  Owners& current = owners_[descriptor];
  for (const auto& [id, prefix] : owners) {
    auto& descriptors = projects_[id].descriptors;
    const auto previous = current.find(id);
    if (previous != current.end() && previous->second != prefix) descriptors.erase(previous->second);
    current[id] = prefix;
    descriptors[prefix] = descriptor;
  }
}

void InotifyTree::Disown(int descriptor, std::int64_t id) {
  const auto found = owners_.find(descriptor);
  if (found == owners_.end()) return;
  found->second.erase(id);
  if (!found->second.empty()) return;  // another watch still needs it
  inotify_rm_watch(fd_, descriptor);
  owners_.erase(found);
}

void InotifyTree::DetachSubtree(std::int64_t id, const std::string& prefix) {
  const auto project = projects_.find(id);
  if (project == projects_.end()) return;
  auto& descriptors = project->second.descriptors;
  const auto [first, last] = SubtreeRange(descriptors, prefix);
  for (auto entry = first; entry != last; ++entry) Disown(entry->second, id);
  descriptors.erase(first, last);
}

void InotifyTree::MoveSubtree(std::int64_t id, const std::string& from, const std::string& to) {
  auto& descriptors = projects_[id].descriptors;
  const auto [first, last] = SubtreeRange(descriptors, from);
  const std::map<std::string, int> moved(first, last);
  descriptors.erase(first, last);
  for (const auto& [prefix, descriptor] : moved) {
    const std::string renamed = to + prefix.substr(from.size());
    descriptors[renamed] = descriptor;
    owners_[descriptor][id] = renamed;
  }
}

const std::string* InotifyTree::PrefixIn(int descriptor, std::int64_t id) const {
  const auto found = owners_.find(descriptor);
  if (found == owners_.end()) return nullptr;
  const auto owner = found->second.find(id);
  return owner == found->second.end() ? nullptr : &owner->second;
}

std::string InotifyTree::EntryPath(const Owners& below) const {
  const auto& [id, prefix] = *below.begin();
  return JoinPath(projects_.at(id).root, prefix.substr(0, prefix.size() - 1));
}

}  // namespace vexil
